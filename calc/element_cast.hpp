// The host's rule for turning a computed value into an element of a class:
// integers round half away from zero and saturate, NaN giving 0; logical is
// true for anything non-zero; floating values round to nearest.
#pragma once

#include <cmath>
#include <limits>
#include <type_traits>

namespace bitcalc {

// `C` is the type the value was computed in: double, or long double, which
// holds every 64-bit integer exactly.
template <class T, class C>
T castElement(C value) {
    if constexpr (std::is_same_v<T, bool>) {
        return value != 0;
    } else if constexpr (std::is_floating_point_v<T>) {
        if constexpr (sizeof(T) < sizeof(C)) {
            // From the largest finite value plus half a unit in the last
            // place on, the value rounds to infinity.
            constexpr T largest = std::numeric_limits<T>::max();
            const C overflow =
                static_cast<C>(largest) +
                (static_cast<C>(largest) - static_cast<C>(std::nextafter(largest, T{0}))) / 2;
            if (std::isfinite(value) && std::fabs(value) >= overflow) {
                return value < 0 ? -std::numeric_limits<T>::infinity()
                                 : std::numeric_limits<T>::infinity();
            }
        }
        return static_cast<T>(value);
    } else {
        if (std::isnan(value)) return 0;
        const C rounded = std::round(value);
        if (rounded <= static_cast<C>(std::numeric_limits<T>::min()))
            return std::numeric_limits<T>::min();
        if (rounded >= static_cast<C>(std::numeric_limits<T>::max()))
            return std::numeric_limits<T>::max();
        return static_cast<T>(rounded);
    }
}

}  // namespace bitcalc
