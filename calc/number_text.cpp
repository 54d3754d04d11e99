// Exact text of numbers.
#include "calc/number_text.hpp"
#include "calc/text_join.hpp"

#include <charconv>
#include <cmath>
#include <cstdint>
#include <vector>

namespace bitcalc {

namespace {

// A decimal integer as base-10^9 limbs, least significant first.
class DecimalInteger {
public:
    explicit DecimalInteger(std::uint64_t value) {
        do {
            limbs_.push_back(static_cast<std::uint32_t>(value % base));
            value /= base;
        } while (value != 0);
    }

    void doubleIt() {
        std::uint32_t carry = 0;
        for (std::uint32_t& limb : limbs_) {
            const std::uint64_t twice = std::uint64_t{limb} * 2 + carry;
            limb = static_cast<std::uint32_t>(twice % base);
            carry = static_cast<std::uint32_t>(twice / base);
        }
        if (carry != 0) limbs_.push_back(carry);
    }

    std::string text() const {
        std::string out = std::to_string(limbs_.back());
        for (auto limb = limbs_.rbegin() + 1; limb != limbs_.rend(); ++limb) {
            const std::string digits = std::to_string(*limb);
            out.append(9 - digits.size(), '0');
            out += digits;
        }
        return out;
    }

private:
    static constexpr std::uint32_t base = 1'000'000'000;
    std::vector<std::uint32_t> limbs_;
};

// The shortest digits of a value and its decimal exponent, from the
// scientific form of std::to_chars: value = d.ddd x 10^exponent.
template <class F>
std::string nonFiniteText(F value) {
    if (std::isnan(value)) return "NaN";
    return value < 0 ? "-Inf" : "Inf";
}

template <class F>
std::string shortestOf(F value) {
    if (!std::isfinite(value)) return nonFiniteText(value);
    char buffer[64];
    const auto written =
        std::to_chars(buffer, buffer + sizeof buffer, value, std::chars_format::scientific);
    const std::string_view scientific(buffer, static_cast<std::size_t>(written.ptr - buffer));

    const std::size_t e = scientific.find('e');
    std::string_view mantissa = scientific.substr(0, e);
    std::string_view exponentText = scientific.substr(e + 1);
    if (exponentText.front() == '+') exponentText.remove_prefix(1);
    int exponent = 0;
    std::from_chars(exponentText.data(), exponentText.data() + exponentText.size(), exponent);
    const bool negative = mantissa.front() == '-';
    if (negative) mantissa.remove_prefix(1);
    std::string digits;
    for (char c : mantissa) {
        if (c != '.') digits.push_back(c);
    }
    const int count = static_cast<int>(digits.size());

    std::string plain;
    if (exponent < 0) {
        plain = joinText("0.", std::string(static_cast<std::size_t>(-exponent - 1), '0'), digits);
    } else if (exponent + 1 >= count) {
        plain = digits + std::string(static_cast<std::size_t>(exponent + 1 - count), '0');
    } else {
        const auto point = static_cast<std::size_t>(exponent + 1);
        plain = joinText(digits.substr(0, point), ".", digits.substr(point));
    }
    const std::string exponential = joinText(digits.substr(0, 1), count > 1 ? "." : "",
                                             digits.substr(1), "e", std::to_string(exponent));

    const std::string& shorter = exponential.size() < plain.size() ? exponential : plain;
    return joinText(negative ? "-" : "", shorter);
}

template <class F>
std::string canonicalOf(F value) {
    if (!std::isfinite(value)) return nonFiniteText(value);
    if (value == std::trunc(value)) return exactIntegerText(static_cast<double>(value));
    return shortestOf(value);
}

}  // namespace

std::string exactIntegerText(double wholeValue) {
    if (wholeValue == 0) return std::signbit(wholeValue) ? "-0" : "0";
    const bool negative = wholeValue < 0;
    int exponent = 0;
    // |value| = mantissa * 2^(exponent - 53), mantissa a 53-bit integer.
    const double fraction = std::frexp(std::fabs(wholeValue), &exponent);
    auto mantissa = static_cast<std::uint64_t>(std::ldexp(fraction, 53));
    int shift = exponent - 53;
    while (shift < 0 && mantissa % 2 == 0) {
        mantissa /= 2;
        ++shift;
    }
    DecimalInteger decimal(shift < 0 ? mantissa >> -shift : mantissa);
    for (int i = 0; i < shift; ++i) decimal.doubleIt();
    return joinText(negative ? "-" : "", decimal.text());
}

std::string shortestText(double value) { return shortestOf(value); }
std::string shortestText(float value) { return shortestOf(value); }
std::string canonicalText(double value) { return canonicalOf(value); }
std::string canonicalText(float value) { return canonicalOf(value); }

}  // namespace bitcalc
