// matrix::convert_if_needed: an array of another class with the same sizes,
// its real and imaginary parts converted element by element, in parallel on
// large arrays.
#include "host/array_body.hpp"
#include "host/element_conversion.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>

#include <cstddef>

namespace host {

namespace {

// From this many elements a conversion is split over TBB workers. A
// conversion takes about a nanosecond per element, so 64 Ki elements take
// some 50 us alone; starting a parallel_for on two workers costs a few
// microseconds, well below that.
constexpr std::size_t kParallelConversionElements = std::size_t{1} << 16;
constexpr std::size_t kConversionGrain = std::size_t{1} << 14;

template <class To, class From>
void convertRun(const From* in, To* out, std::size_t begin, std::size_t end) {
    for (std::size_t i = begin; i < end; ++i) out[i] = convertElement<To>(in[i]);
}

template <class To, class From>
void convertElements(const From* in, To* out, std::size_t count) {
    if (count < kParallelConversionElements) {
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
    visitElementClass(StoredElements{}, from, [&](auto fromTag) {
        using From = typename decltype(fromTag)::type;
        visitElementClass(StoredElements{}, to, [&](auto toTag) {
            using To = typename decltype(toTag)::type;
            convertElements(static_cast<const From*>(in), static_cast<To*>(out), count);
        });
    });
}

}  // namespace

}  // namespace host

namespace matrix {

boost::intrusive_ptr<zqArray_tag> convert_if_needed(const zqArray_tag* array, zqClassID cls) {
    auto* source = const_cast<zqArray_tag*>(array);
    const zqClassID from = host::trueClassOf(*source);
    if (from == cls) return boost::intrusive_ptr<zqArray_tag>(source);  // one more reference

    const bool complex = (source->flags & (zqComplexFlag | zqNumericFlag)) == (zqComplexFlag | zqNumericFlag);
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
