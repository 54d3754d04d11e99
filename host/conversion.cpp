// matrix::convert_if_needed: an array of another class with the same sizes,
// its real and imaginary parts converted element by element, in parallel on
// large arrays.
#include "host/array_body.hpp"
#include "host/element_conversion.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"
#include "host/parallel_limits.hpp"

#include <emmintrin.h>
#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>

#include <algorithm>
#include <cstddef>
#include <limits>
#include <type_traits>

namespace host {

namespace {

constexpr std::size_t kConversionGrain = std::size_t{1} << 14;

// Doubles to an integer class, two at a time where both are whole numbers in
// a range where adding a magic power of two leaves the integer in the low
// mantissa bits: 2^52 for uint64 ([0, 2^52)), 1.5 * 2^52 for the others
// ((-2^51, 2^51), cut to the class's range). Other pairs take the scalar path.
template <class To>
void convertDoublesToInteger(const double* in, To* out, std::size_t begin, std::size_t end) {
    constexpr bool unsigned64 = std::is_same_v<To, unsigned long>;
    constexpr double magic =
        unsigned64 ? powerOfTwo<double>(52) : powerOfTwo<double>(52) + powerOfTwo<double>(51);
    constexpr double fastLowest =
        std::is_signed_v<To> ? std::max(-powerOfTwo<double>(51) + 1,
                                        static_cast<double>(std::numeric_limits<To>::min()))
                             : 0.0;
    constexpr double fastHighest =
        std::min((unsigned64 ? powerOfTwo<double>(52) : powerOfTwo<double>(51)) - 1,
                 static_cast<double>(std::numeric_limits<To>::max()));
    const __m128d magicVector = _mm_set1_pd(magic);
    const __m128i magicBits = _mm_castpd_si128(magicVector);
    const __m128d lowest = _mm_set1_pd(fastLowest), highest = _mm_set1_pd(fastHighest);
    std::size_t i = begin;
    // Pairs: the fast path when both are whole and in range.
    for (; i + 2 <= end; i += 2) {
        const __m128d x = _mm_loadu_pd(in + i);
        const __m128d shifted = _mm_add_pd(x, magicVector);
        const __m128d whole =
            _mm_and_pd(_mm_cmpeq_pd(_mm_sub_pd(shifted, magicVector), x),
                       _mm_and_pd(_mm_cmpge_pd(x, lowest), _mm_cmple_pd(x, highest)));
        if (_mm_movemask_pd(whole) != 3) {
            out[i] = convertElement<To>(in[i]);
            out[i + 1] = convertElement<To>(in[i + 1]);
            continue;
        }
        const __m128i integers = _mm_sub_epi64(_mm_castpd_si128(shifted), magicBits);
        if constexpr (sizeof(To) == 8) {
            _mm_storeu_si128(reinterpret_cast<__m128i*>(out + i), integers);
        } else {
            out[i] = static_cast<To>(_mm_cvtsi128_si64(integers));
            out[i + 1] = static_cast<To>(_mm_cvtsi128_si64(_mm_unpackhi_epi64(integers, integers)));
        }
    }
    // Tail: the last odd element.
    for (; i < end; ++i) out[i] = convertElement<To>(in[i]);
}

template <class To, class From>
void convertRun(const From* in, To* out, std::size_t begin, std::size_t end) {
    if constexpr (std::is_same_v<From, double> && std::is_integral_v<To> &&
                  !std::is_same_v<To, bool> && !std::is_same_v<To, char16_t>) {
        convertDoublesToInteger(in, out, begin, end);
    } else {
        for (std::size_t i = begin; i < end; ++i) out[i] = convertElement<To>(in[i]);
    }
}

template <class To, class From>
void convertElements(const From* in, To* out, std::size_t count) {
    if (count < parallelConversionElements) {
        convertRun(in, out, 0, count);
        return;
    }
    tbb::parallel_for(tbb::blocked_range<std::size_t>(0, count, kConversionGrain),
                      [=](const tbb::blocked_range<std::size_t>& range) {
                          convertRun(in, out, range.begin(), range.end());
                      });
}

// Converts `count` elements of class `from` at `in` to class `to` at `out`.
void convertStorage(zqClassID from, const void* in, zqClassID to, void* out, std::size_t count) {
    visitElementClass<StoredElements>(
        from,
        [&](auto fromTag) {
            using From = typename decltype(fromTag)::type;
            visitElementClass<StoredElements>(
                to,
                [&](auto toTag) {
                    using To = typename decltype(toTag)::type;
                    convertElements(static_cast<const From*>(in), static_cast<To*>(out), count);
                },
                [] {});
        },
        [] {});
}

}  // namespace

}  // namespace host

namespace matrix {

boost::intrusive_ptr<zqArray_tag> convert_if_needed(const zqArray_tag* array, zqClassID cls) {
    auto* source = const_cast<zqArray_tag*>(array);
    const zqClassID from = host::trueClassOf(*source);
    if (from == cls) return boost::intrusive_ptr<zqArray_tag>(source);  // one more reference

    const bool complex =
        (source->flags & (zqComplexFlag | zqNumericFlag)) == (zqComplexFlag | zqNumericFlag);
    const bool convertible = host::elementSizeIn(host::StoredElements{}, from) != 0 &&
                             host::elementSizeIn(host::StoredElements{}, cls) != 0;
    // A complex array has no logical or char counterpart.
    if (!convertible || (complex && !host::isNumericClass(cls))) {
        host::raiseHostError("VESPRA:bsxfun", "badOperands");
    }

    host::completeDimensions(*source);
    const host::DimsView dims = host::trueDimensions(*source);
    zqArray_tag* result = host::newArray(cls, host::normaliseDims(dims.count, dims.sizes), complex);
    if (!result) throw foundation::core::except::bad_alloc();
    boost::intrusive_ptr<zqArray_tag> converted(result, false);  // adopts the new reference
    result->flags |= source->flags & zqSparseFlag;

    const std::size_t count = host::trueElementCount(*source);
    host::convertStorage(from, source->data, cls, result->data, count);
    if (complex) {
        host::convertStorage(from, source->body->imaginary->data(), cls,
                             result->body->imaginary->data(), count);
    }
    return converted;
}

}  // namespace matrix
