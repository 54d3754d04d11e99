// Text of single elements for the displays.
#include "calc/element_text.hpp"

#include "calc/array_access.hpp"
#include "calc/number_text.hpp"
#include "calc/text_join.hpp"
#include "calc/unicode_text.hpp"
#include "host/element_types.hpp"

#include <cmath>
#include <cstdint>
#include <cstdio>

namespace bitcalc {

namespace {

template <class T>
std::string realText(T value, NumberStyle style) {
    if constexpr (std::is_floating_point_v<T>) {
        if (style == NumberStyle::Human &&
            !(std::isfinite(value) && value == std::trunc(value) && std::fabs(value) <= 0x1p64)) {
            return shortestText(value);
        }
    }
    return canonicalText(value);
}

// "re+imi" and "re-imi": the sign of the imaginary part, negative zero
// included, goes between the two.
template <class T>
std::string complexText(T real, T imaginary, NumberStyle style) {
    std::string text = realText(real, style);
    if constexpr (std::is_floating_point_v<T>) {
        const bool negative = std::signbit(imaginary) && !std::isnan(imaginary);
        text += negative ? "-" : "+";
        text += realText(negative ? -imaginary : imaginary, style);
    } else if constexpr (std::is_signed_v<T>) {
        text += imaginary < 0 ? "-" : "+";
        // The magnitude of the most negative value needs the unsigned type.
        const auto wide = static_cast<std::uint64_t>(static_cast<std::int64_t>(imaginary));
        const std::uint64_t magnitude = imaginary < 0 ? 0 - wide : wide;
        text += canonicalText(magnitude);
    } else {
        text += '+';
        text += canonicalText(imaginary);
    }
    return text += 'i';
}

}  // namespace

std::string numberText(const zqArray_tag& array, std::size_t index, NumberStyle style) {
    return host::visitElementClass<host::ValueElements>(
        host::classOf(array),
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            const T real = elementsOf<T>(array)[index];
            if (const void* imaginary = host::imaginaryData(array)) {
                return complexText(real, static_cast<const T*>(imaginary)[index], style);
            }
            return realText(real, style);
        },
        [] { return std::string("?"); });
}

std::string canonicalQuoted(std::u16string_view units, char quote) {
    std::string text(1, quote);
    for (char16_t unit : units) {
        if (unit == static_cast<char16_t>(quote)) {
            text += quote;
            text += quote;
        } else if (unit == u'\\') {
            text += "\\\\";
        } else if (unit >= 0x20 && unit < 0x7F) {
            text += static_cast<char>(unit);
        } else {
            char escape[8];
            std::snprintf(escape, sizeof escape, "\\u%04X", static_cast<unsigned>(unit));
            text += escape;
        }
    }
    return text + quote;
}

std::string humanQuoted(std::u16string_view units, char quote) {
    std::string text(1, quote);
    for (char c : toUtf8(units)) {
        text += c;
        if (c == quote) text += quote;
    }
    return text + quote;
}

}  // namespace bitcalc
