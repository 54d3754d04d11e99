// The math utility library's element-wise AND, OR and XOR with implicit
// expansion. The sizes of the two operands are merged into groups of
// dimensions in which each operand either runs through its elements or stays
// on one; the innermost group gives contiguous runs, combined byte-wise
// (bitwise_kernels.hpp), and the outer groups are walked like an odometer.
// The same range body serves the serial path and the parallel one.
#include "host/math_utils.hpp"
#include "host/array_body.hpp"
#include "host/bitwise_kernels.hpp"
#include "host/element_conversion.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"
#include "host/parallel_limits.hpp"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>

#include <algorithm>
#include <cstring>
#include <memory>

namespace host {

namespace {

constexpr std::size_t kGrainBytes = std::size_t{64} << 10;

[[noreturn]] void badOperands() { raiseHostError("VESPRA:bsxfun", "badOperands"); }

// Dimensions merged by what each operand does along them: its element stride
// there, 0 where it is expanded.
struct MergedDims {
    unsigned long size;
    unsigned long strideFirst;
    unsigned long strideSecond;

    bool sameKind(const MergedDims& other) const {
        return (strideFirst == 0) == (other.strideFirst == 0) &&
               (strideSecond == 0) == (other.strideSecond == 0);
    }
};

// A run of `length` values fixed at construction, held in place for the
// usual numbers of dimensions so that a call costs no heap allocation.
template <class T>
class DimsArray {
public:
    explicit DimsArray(std::size_t length)
        : heap_(length > kInline ? std::make_unique<T[]>(length) : nullptr),
          data_(heap_ ? heap_.get() : local_) {}
    DimsArray(const DimsArray&) = delete;
    DimsArray& operator=(const DimsArray&) = delete;

    T& operator[](std::size_t i) { return data_[i]; }
    const T& operator[](std::size_t i) const { return data_[i]; }
    T* data() { return data_; }

private:
    static constexpr std::size_t kInline = 8;
    T local_[kInline] = {};
    std::unique_ptr<T[]> heap_;
    T* data_;
};

struct Expansion {
    explicit Expansion(std::size_t dims)
        : resultDims(dims), groups(std::max<std::size_t>(dims, 1)) {}

    DimsArray<unsigned long> resultDims;
    DimsArray<MergedDims> groups;  // innermost first
    std::size_t groupCount = 0;    // never 0 once planned
    unsigned long elementCount = 1;
};

// Plans the expansion of two operands' sizes into `plan`, made for the larger
// of their numbers of dimensions; false when a size differs from its
// partner's and neither is 1.
bool planExpansion(DimsView first, DimsView second, Expansion& plan) {
    const unsigned long count = std::max(first.count, second.count);
    unsigned long strideFirst = 1, strideSecond = 1;
    for (unsigned long i = 0; i < count; ++i) {
        const unsigned long a = i < first.count ? first[i] : 1;
        const unsigned long b = i < second.count ? second[i] : 1;
        if (a != b && a != 1 && b != 1) return false;
        const unsigned long size = a == 1 ? b : a;
        plan.resultDims[i] = size;
        // Modulo 2^64: right with a 0 among the sizes; without one, an
        // overflowing result is refused when it is made.
        plan.elementCount *= size;
        if (size != 1) {
            const MergedDims dims{size, a == 1 ? 0 : strideFirst, b == 1 ? 0 : strideSecond};
            if (plan.groupCount != 0 && plan.groups[plan.groupCount - 1].sameKind(dims)) {
                plan.groups[plan.groupCount - 1].size *= size;
            } else {
                plan.groups[plan.groupCount++] = dims;
            }
        }
        strideFirst *= a;
        strideSecond *= b;
    }
    if (plan.groupCount == 0) plan.groups[plan.groupCount++] = {1, 1, 1};
    return true;
}

struct CombineJob {
    const Expansion* plan;
    std::byte* out;
    const std::byte* first;
    const std::byte* second;
    std::size_t elementBytes;
};

// Combines the result elements [begin, end) of `job`.
template <class Op>
void combineRange(const CombineJob& job, unsigned long begin, unsigned long end) {
    const DimsArray<MergedDims>& groups = job.plan->groups;
    const std::size_t groupCount = job.plan->groupCount;
    const MergedDims& inner = groups[0];
    const std::size_t width = job.elementBytes;

    // Where `begin` lies: its place in the run and the digits of the outer groups.
    unsigned long within = begin % inner.size;
    unsigned long outer = begin / inner.size;
    DimsArray<unsigned long> digits(groupCount);
    unsigned long offsetFirst = 0, offsetSecond = 0;
    for (std::size_t k = 1; k < groupCount; ++k) {
        digits[k] = outer % groups[k].size;
        outer /= groups[k].size;
        offsetFirst += digits[k] * groups[k].strideFirst;
        offsetSecond += digits[k] * groups[k].strideSecond;
    }

    for (unsigned long position = begin; position < end;) {
        const unsigned long length = std::min(inner.size - within, end - position);
        std::byte* out = job.out + position * width;
        const std::byte* first = job.first + (offsetFirst + within * inner.strideFirst) * width;
        const std::byte* second = job.second + (offsetSecond + within * inner.strideSecond) * width;
        if (inner.strideFirst != 0 && inner.strideSecond != 0) {
            combineBytes<Op>(out, first, second, length * width);
        } else if (inner.strideFirst != 0) {
            combineBytesWithPattern<Op>(out, first, repeatElement(second, width), length * width);
        } else {
            // The operations are commutative: the first operand is the pattern.
            combineBytesWithPattern<Op>(out, second, repeatElement(first, width), length * width);
        }
        position += length;
        within = 0;
        for (std::size_t k = 1; k < groupCount; ++k) {
            offsetFirst += groups[k].strideFirst;
            offsetSecond += groups[k].strideSecond;
            if (++digits[k] < groups[k].size) break;
            offsetFirst -= groups[k].size * groups[k].strideFirst;
            offsetSecond -= groups[k].size * groups[k].strideSecond;
            digits[k] = 0;
        }
    }
}

template <class Op>
void combine(const CombineJob& job) {
    const unsigned long count = job.plan->elementCount;
    if (count * job.elementBytes < parallelResultBytes) {
        combineRange<Op>(job, 0, count);
        return;
    }
    const unsigned long grain = std::max<unsigned long>(1, kGrainBytes / job.elementBytes);
    tbb::parallel_for(tbb::blocked_range<unsigned long>(0, count, grain),
                      [&job](const tbb::blocked_range<unsigned long>& range) {
                          combineRange<Op>(job, range.begin(), range.end());
                      });
}

bool isScalar(const zqArray_tag& array) { return trueElementCount(array) == 1; }

// The double `value` as an element of integer class `cls`, in `element`;
// false when it is no whole number that the class holds.
bool integerElementOf(double value, zqClassID cls, std::byte* element) {
    bool held = false;
    visitElementClass<IntegerElements>(
        cls,
        [&](auto tag) {
            using T = typename decltype(tag)::type;
            T converted{};
            held = doubleHoldsInteger(value, converted);
            std::memcpy(element, &converted, sizeof converted);
        },
        [] {});
    return held;
}

template <class Op>
zqArraySlot bitwiseWithExpansion(const zqArray_tag* first, const zqArray_tag* second) {
    if (!first || !second) badOperands();
    completeDimensions(*first);
    completeDimensions(*second);
    const auto isComplex = [](const zqArray_tag& a) {
        return (a.flags & (zqComplexFlag | zqNumericFlag)) == (zqComplexFlag | zqNumericFlag);
    };
    if (isComplex(*first) || isComplex(*second)) badOperands();

    const zqClassID firstClass = trueClassOf(*first), secondClass = trueClassOf(*second);
    DimsView firstDims = trueDimensions(*first), secondDims = trueDimensions(*second);
    const std::byte* firstData = static_cast<const std::byte*>(first->data);
    const std::byte* secondData = static_cast<const std::byte*>(second->data);
    // A double scalar partner, converted once to the integer class.
    alignas(8) std::byte scalarElement[8];
    const DimsView scalarDims{nullptr, 0, 0};

    zqClassID resultClass = zqNoClass;
    if (firstClass == secondClass && (isIntegerClass(firstClass) || firstClass == zqLogicalClass)) {
        resultClass = firstClass;
    } else if (isIntegerClass(firstClass) && secondClass == zqDoubleClass && isScalar(*second)) {
        resultClass = firstClass;
        if (!integerElementOf(*static_cast<const double*>(second->data), resultClass,
                              scalarElement)) {
            badOperands();
        }
        secondData = scalarElement;
        secondDims = scalarDims;
    } else if (firstClass == zqDoubleClass && isScalar(*first) && isIntegerClass(secondClass)) {
        resultClass = secondClass;
        if (!integerElementOf(*static_cast<const double*>(first->data), resultClass,
                              scalarElement)) {
            badOperands();
        }
        firstData = scalarElement;
        firstDims = scalarDims;
    } else {
        badOperands();
    }

    const std::size_t dimsCount = std::max(firstDims.count, secondDims.count);
    Expansion plan(dimsCount);
    if (!planExpansion(firstDims, secondDims, plan)) badOperands();
    const DimsView resultDims = normaliseDims(dimsCount, plan.resultDims.data());
    zqArraySlot result(newArray(resultClass, resultDims, false));
    if (!result) throw foundation::core::except::bad_alloc();
    if (plan.elementCount != 0) {
        const CombineJob job{&plan, static_cast<std::byte*>(result->data), firstData, secondData,
                             elementSizeIn(StoredElements{}, resultClass)};
        combine<Op>(job);
    }
    return result;
}

}  // namespace

}  // namespace host

zqArraySlot bitandBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second) {
    return host::bitwiseWithExpansion<host::BitandBytes>(first, second);
}

zqArraySlot bitorBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second) {
    return host::bitwiseWithExpansion<host::BitorBytes>(first, second);
}

zqArraySlot bitxorBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second) {
    return host::bitwiseWithExpansion<host::BitxorBytes>(first, second);
}
