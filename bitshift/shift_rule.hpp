// The shift rule of bitshift as element functors: BitshiftFtor<T> for doubles
// taken for integers of class T (BitshiftLanes<T, kind> two at a time by one
// count, BitshiftCountsLanes<T> by an array of counts), bitshiftVVFtor<T, U>
// for an integer value and a count of any
// numeric class. A positive count shifts left, a negative
// one right; counts at or beyond the width are answered without a shift, so
// no shift by the width or more is ever made.
#pragma once

#include "bitshift/count_validation.hpp"
#include "engine/lane_operands.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/simd_functors.hpp"
#include "frame/class_types.hpp"
#include "frame/double_lanes.hpp"
#include "frame/element_scan.hpp"
#include "frame/integer_conversion.hpp"

#include <cassert>
#include <cmath>
#include <cstdint>
#include <type_traits>

namespace bitfcns {

// x shifted left by k (0 < k < width), the bits past the top lost; signed x
// wraps through its sign bit. Computed on x widened to 32 bits (64-bit x as
// it is) and read as unsigned, so no shift overflows.
template <class T>
T shiftLeftWithin(T x, int k) noexcept {
    const auto bits = static_cast<WidenedBits<T>>(static_cast<Widened<T>>(x));
    return static_cast<T>(bits << k);
}

// x shifted right by k (0 <= k < width): arithmetically for signed T,
// logically for unsigned T.
template <class T>
T shiftRightWithin(T x, int k) noexcept {
    return static_cast<T>(static_cast<Widened<T>>(x) >> k);
}

// The element of a value of width `nbits` and a count at or beyond it: a
// right shift of a negative value ends at -1, everything else at 0. Only
// signed values and signed counts can give -1.
template <class T, class U>
T shiftedOut(T x, U c) noexcept {
    if constexpr (std::is_signed_v<T> && std::is_signed_v<U>) {
        if (x < 0 && c < 0) return T(-1);
    }
    return T(0);
}

// The shift rule for a value x of class T and a count c of class U (a
// floating count is whole and finite, tested before). Whether the count lies
// within the width is asked once: of an integer count exactly, as one
// unsigned compare; of a floating count as a double, which holds every count
// near the width exactly.
template <class T, class U>
struct bitshiftVVFtor {
    static constexpr unsigned long parallelLimit = limits::bitshiftCountArray;
    static constexpr lanes::Reading secondOperand = lanes::Reading::count;

    int nbits;  // the width of T

    T operator()(T x, U c) const noexcept {
        if (!withinWidth(c)) return shiftedOut(x, c);
        const int k = static_cast<int>(c);
        return k > 0 ? shiftLeftWithin(x, k) : shiftRightWithin(x, -k);
    }

    // The rule on a register of T of up to 32 bits (nbits being its width),
    // the counts saturated into its lanes (signed, but for an unsigned U).
    // With k the low bits of the count, a count from 0 to width - 1 shifts
    // left by k; one from -width to -1 right by -c, that is by width - k;
    // one below -width shifts out. A register whose counts all point one
    // way (left, as an unsigned U's always do) takes that shift alone.
    __m128i lanes(__m128i x, __m128i c) const noexcept requires lanes::RegisterLanes<T> {
        assert(nbits == static_cast<int>(lanes::bitsOf<T>));
        const __m128i k = _mm_and_si128(c, lanes::repeat<T>(lanes::bitsOf<T> - 1));
        const __m128i belowWidth = lanes::isBelowWidth<T>(c);
        const auto leftOnly = [&] {
            return _mm_and_si128(belowWidth, lanes::shiftLeftEach<T>(x, k));
        };
        if constexpr (std::is_unsigned_v<U>) {
            return leftOnly();
        } else {
            const __m128i negativeCount = lanes::isNegative<T>(c);
            const int negatives = _mm_movemask_epi8(negativeCount);
            if (negatives == 0) return leftOnly();
            const lanes::ShiftedBothWays shifted = lanes::shiftBothWaysEach<T>(x, k);
            const __m128i out = lanes::isLess<T>(c, lanes::repeat<T>(0u - lanes::bitsOf<T>));
            const __m128i right = std::is_signed_v<T>
                                      ? lanes::select(out, lanes::isNegative<T>(x), shifted.right)
                                      : _mm_andnot_si128(out, shifted.right);
            if (negatives == 0xFFFF) return right;
            const __m128i left = _mm_and_si128(belowWidth, shifted.left);
            return lanes::select(negativeCount, right, left);
        }
    }

private:
    // -nbits < c < nbits. For a signed count, c + nbits - 1 read as unsigned
    // 64-bit (wrapping) is at most 2 nbits - 2 exactly then.
    bool withinWidth(U c) const noexcept {
        const auto w = static_cast<std::uint64_t>(nbits);
        if constexpr (std::is_floating_point_v<U>) {
            const double d = c;
            return d < nbits && d > -nbits;
        } else if constexpr (std::is_signed_v<U>) {
            return static_cast<std::uint64_t>(static_cast<std::int64_t>(c)) + (w - 1) <= 2 * w - 2;
        } else {
            return static_cast<std::uint64_t>(c) < w;
        }
    }
};

// The shift rule on doubles: x, a whole number that class T holds, and c, a
// whole finite count, both tested before. The shifted value goes back to a
// double exactly, as it holds no more significant bits than x did.
template <class T>
struct BitshiftFtor {
    static constexpr unsigned long parallelLimit = limits::bitshiftOnDouble;

    double operator()(double x, double c) const noexcept {
        constexpr double w = bitWidth<T>;
        if (!(std::fabs(c) < w)) return x < 0 && c < 0 ? -1.0 : 0.0;
        const int k = static_cast<int>(c);
        const T value = wholeDoubleTo<T>(x);
        return integerToDouble(k > 0 ? shiftLeftWithin(value, k) : shiftRightWithin(value, -k));
    }
};

// What one count does to every double: shift left within the width, shift
// right, or shift everything out (a count at or beyond the width).
enum class DoubleShift { left, right, out };

// BitshiftFtor<T> by one whole count, as a lane kernel of the double path's
// checked loop. Left: x * 2^k wrapped into T, for 64-bit T in doubles, for
// narrower T as the shifted pattern read back as T. Right: the floor of
// x / 2^k, which is the shift of either kind of T and a double already.
// Out: -1 for a negative x shifted right, 0 otherwise (the fill is the
// pattern of -1.0 for a negative count).
template <class T, DoubleShift kind>
struct BitshiftLanes {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitshiftOnDouble;

    scan_detail::LaneTest<T> fits;
    __m128i leftCount;  // in the low 64 bits
    __m128d scale;      // 2^count
    __m128d fill;       // -1.0 or 0.0, kept where x is negative

    // `count` as the shift rule takes it: k > 0 shifts left, k <= 0 right by
    // -k; for `out` any count at or beyond the width.
    explicit BitshiftLanes(double count) noexcept
        : leftCount(_mm_cvtsi32_si128(kind == DoubleShift::left ? static_cast<int>(count) : 0)),
          scale(lanes::broadcast(kind == DoubleShift::out ? 1.0
                                                          : std::ldexp(1.0, static_cast<int>(count)))),
          fill(lanes::broadcast(count < 0 ? -1.0 : 0.0)) {}

    __m128d check(__m128d x) const noexcept { return fits(x); }

    __m128d apply(__m128d x) const noexcept {
        if constexpr (kind == DoubleShift::left && sizeof(T) == 8) {
            return lanes::wrapShiftedLeft64<T>(_mm_mul_pd(x, scale));
        } else if constexpr (kind == DoubleShift::left) {
            return lanes::fromPattern<T>(_mm_sll_epi64(lanes::patternOf<T>(x), leftCount));
        } else if constexpr (kind == DoubleShift::right) {
            const __m128d scaled = _mm_mul_pd(x, scale);
            return sizeof(T) == 8 ? lanes::floorFinite(scaled) : lanes::floorBelow2To51(scaled);
        } else {
            return _mm_and_pd(_mm_cmplt_pd(x, _mm_setzero_pd()), fill);
        }
    }
};

// BitshiftFtor<T> with an array of double counts, as a lane kernel of the
// double path's checked loop: each lane shifted by its own count, to the
// left as BitshiftLanes<T, left> does, to the right as a floor of x / 2^k,
// and shifted out at or beyond the width. A register whose counts all point
// the same way computes that way only. 64-bit T take the element functor
// in each lane.
template <class T>
struct BitshiftCountsLanes {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitshiftOnDouble;

    scan_detail::LaneTest<T> fits;
    WholeCountLanes wholeCount;

    __m128d check(__m128d x, __m128d c) const noexcept {
        return _mm_and_pd(fits(x), wholeCount(c));
    }

    __m128d apply(__m128d x, __m128d c) const noexcept {
        // For 64-bit T the element functor, lane by lane, runs faster than
        // any lane arithmetic tried (the pattern's shifts, or x * 2^k
        // wrapped in doubles), at every size measured. A lane that check
        // refuses reaches it too, so x is first held within T's range
        // (NaN going to the top), where its conversion is defined; a
        // count needs nothing, the functor converts only those within the
        // width.
        if constexpr (sizeof(T) == 8) {
            using Bounds = IntegerBounds<T>;
            constexpr double top = Bounds::highest * (1.0 - 0x1p-53);  // the double below
            const __m128d held = _mm_max_pd(_mm_min_pd(x, lanes::broadcast(top)),
                                            lanes::broadcast(Bounds::lowest));
            const BitshiftFtor<T> shift;
            return _mm_setr_pd(shift(_mm_cvtsd_f64(held), _mm_cvtsd_f64(c)),
                               shift(_mm_cvtsd_f64(_mm_unpackhi_pd(held, held)),
                                     _mm_cvtsd_f64(_mm_unpackhi_pd(c, c))));
        } else {
            return applyWithin32(x, c);
        }
    }

private:
    __m128d applyWithin32(__m128d x, __m128d c) const noexcept {
        const __m128d zero = _mm_setzero_pd();
        const __m128d width = lanes::broadcast(bitWidth<T>);
        const __m128d within = _mm_cmplt_pd(_mm_andnot_pd(lanes::broadcast(-0.0), c), width);
        // Within the width, so 32 bits hold every count below.
        const __m128d count = _mm_min_pd(_mm_max_pd(c, _mm_sub_pd(zero, width)), width);
        const __m128d leftward = _mm_cmpgt_pd(c, zero);
        __m128d shifted;
        switch (_mm_movemask_pd(leftward)) {
            case 0: shifted = shiftRight(x, count); break;
            case 3: shifted = shiftLeft(x, count); break;
            default: shifted = lanes::select(leftward, shiftLeft(x, count), shiftRight(x, count));
        }
        // Shifted out: -1 for a negative x shifted right, 0 otherwise.
        const __m128d out = _mm_and_pd(_mm_and_pd(_mm_cmplt_pd(x, zero), _mm_cmplt_pd(c, zero)),
                                       lanes::broadcast(-1.0));
        return lanes::select(within, shifted, out);
    }

    static __m128d shiftLeft(__m128d x, __m128d count) noexcept {
        return lanes::fromPattern<T>(
            lanes::shiftLeftEach64(lanes::patternOf<T>(x), lanes::countLanes(count)));
    }

    // count <= 0: the floor of x * 2^count.
    static __m128d shiftRight(__m128d x, __m128d count) noexcept {
        return lanes::floorBelow2To51(_mm_mul_pd(x, lanes::powerOfTwo(count)));
    }
};

}  // namespace bitfcns
