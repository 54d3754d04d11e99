// Doubles that hold whole numbers of an integer class T, for tests of the
// double paths: the edges of T (zero of both signs, one, the extremes, the
// largest double below 2^63 and 2^64), powers of two near the top, and
// pseudo-random values spread over T's range; and the check of a double
// path, through its entry point, against its scalar functor on all of them.
#pragma once

#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

namespace testing_support {

template <class T>
std::vector<double> wholeValuesOf() {
    constexpr int width = sizeof(T) * 8;
    const double lowest = static_cast<double>(std::numeric_limits<T>::min());
    // The largest double T holds: below 2^63 and 2^64 the doubles are 2^10
    // and 2^11 apart.
    const double highest = width < 64 ? static_cast<double>(std::numeric_limits<T>::max())
                                      : std::ldexp(1.0, width - std::is_signed_v<T>) -
                                            std::ldexp(1.0, width - std::is_signed_v<T> - 53);
    std::vector<double> values{0.0, -0.0, 1.0, 2.0, 3.0, lowest, highest, highest - 1};
    if (lowest < 0) values.insert(values.end(), {-1.0, -2.0, lowest + 1});
    for (int k = width - 12; k < width - std::is_signed_v<T>; ++k)
        if (k >= 0) values.push_back(std::ldexp(1.0, k));
    std::uint64_t state = 0x9E3779B97F4A7C15u;
    for (int i = 0; i < 200; ++i) {
        state = state * 6364136223846793005u + 1442695040888963407u;
        // Up to as many significant bits as T has for its magnitudes.
        const double fraction = static_cast<double>(state >> 11) / 9007199254740992.0;
        const int bits = static_cast<int>(state % (width - std::is_signed_v<T> + 1));
        const double magnitude = std::floor(std::ldexp(fraction, bits));
        values.push_back(lowest < 0 && (state & 0x400) ? -magnitude : magnitude);
    }
    return values;
}

// The name of T's class as the assumed type of a call.
template <class T>
zqArraySlot classNameOf() {
    constexpr const char16_t* names[] = {u"int8",  u"uint8",  u"int16", u"uint16",
                                         u"int32", u"uint32", u"int64", u"uint64"};
    return host::makeCharArray(names[classIdOf<T> - zqInt8Class]);
}

// One double for each whole value of T: `pick(i)` for the element at index i.
template <class T, class Pick>
std::vector<double> alongsideWholeValues(Pick pick) {
    std::vector<double> values(wholeValuesOf<T>().size());
    for (std::size_t i = 0; i < values.size(); ++i) values[i] = pick(i);
    return values;
}

// `entry` on the whole values of T, then `operands`, then the name of T's
// class: each element of the result has the bits of `expected(x)`, or of
// `expected(x, i)` for the element at index i.
template <class T, class Expected>
void expectElementsAgree(EntryPoint entry, std::vector<const zqArray_tag*> operands,
                         Expected expected) {
    const std::vector<double> values = wholeValuesOf<T>();
    const auto array = makeOf(values);
    const auto name = classNameOf<T>();
    operands.insert(operands.begin(), array.get());
    operands.push_back(name.get());
    const auto outcome = callEntry(entry, operands);
    ASSERT_EQ(outcome.error, "");
    const auto result = elementsOf<double>(outcome.result.get());
    for (std::size_t i = 0; i < values.size(); ++i)
        if constexpr (std::is_invocable_v<Expected, double, std::size_t>) {
            ASSERT_EQ(std::bit_cast<std::uint64_t>(result[i]),
                      std::bit_cast<std::uint64_t>(expected(values[i], i)))
                << values[i] << " at " << i << " gave " << result[i];
        } else {
            ASSERT_EQ(std::bit_cast<std::uint64_t>(result[i]),
                      std::bit_cast<std::uint64_t>(expected(values[i])))
                << values[i] << " gave " << result[i];
        }
}

}  // namespace testing_support
