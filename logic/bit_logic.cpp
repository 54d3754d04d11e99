// bitand, bitor and bitxor: one body, parameterised by the host's element
// routine, the bit operation on registers and the group of identifiers,
// behind three exported entry points.
#include "bitfcns/entry_points.hpp"

#include "engine/parallel_driver.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/checked_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/double_lanes.hpp"
#include "frame/element_scan.hpp"
#include "frame/exception.hpp"
#include "frame/floating.hpp"
#include "frame/math_routines.hpp"
#include "frame/message_tags.hpp"

#include <boost/intrusive_ptr.hpp>

#include <algorithm>

namespace bitfcns {
namespace {

using ElementRoutine = zqArraySlot (*)(const zqArray_tag*, const zqArray_tag*);

// The bit operations on the patterns of two registers.
struct AndBits {
    static __m128i apply(__m128i a, __m128i b) noexcept { return _mm_and_si128(a, b); }
};
struct OrBits {
    static __m128i apply(__m128i a, __m128i b) noexcept { return _mm_or_si128(a, b); }
};
struct XorBits {
    static __m128i apply(__m128i a, __m128i b) noexcept { return _mm_xor_si128(a, b); }
};

// Doubles taken for integers of class T, combined bit by bit in T and given
// back as doubles, rounded to nearest for the 64-bit classes as the host's
// conversion of an integer result rounds. Goes parallel where the host's
// element loop does, at the same result size.
template <class T, class Combine>
struct CombineLanesBase {
    static constexpr unsigned long parallelLimit = host::parallelResultBytes / sizeof(double);

    scan_detail::LaneTest<T> fits;

    __m128d combined(__m128i x, __m128i y) const noexcept {
        return lanes::fromPattern<T>(Combine::apply(x, y));
    }
};

// Two arrays of the same sizes.
template <class T, class Combine>
struct CombineArrayLanes : CombineLanesBase<T, Combine> {
    static constexpr int arity = 2;

    __m128d check(__m128d x, __m128d y) const noexcept {
        return _mm_and_pd(this->fits(x), this->fits(y));
    }
    __m128d apply(__m128d x, __m128d y) const noexcept {
        return this->combined(lanes::patternOf<T>(x), lanes::patternOf<T>(y));
    }
};

// An array and one accepted partner, whose pattern is made once.
template <class T, class Combine>
struct CombineScalarLanes : CombineLanesBase<T, Combine> {
    static constexpr int arity = 1;

    __m128i partner;

    explicit CombineScalarLanes(double scalar) noexcept
        : partner(lanes::patternOf<T>(lanes::broadcast(scalar))) {}

    __m128d check(__m128d x) const noexcept { return this->fits(x); }
    __m128d apply(__m128d x) const noexcept {
        return this->combined(lanes::patternOf<T>(x), partner);
    }
};

// What the class-pair decision distinguishes. `other` is a class that passed
// the numeric test without being one of the classes known here; it goes the
// way of a logical.
enum class Kind { integer, real64, real32, logical, other };

Kind kindOf(const zqArray_tag* array) {
    const zqClassID cls = classOf(array);
    if (cls >= zqInt8Class && cls <= zqUInt64Class) return Kind::integer;
    switch (cls) {
        case zqDoubleClass: return Kind::real64;
        case zqSingleClass: return Kind::real32;
        case zqLogicalClass: return Kind::logical;
        default: return Kind::other;
    }
}

// In each dimension that both operands have, the sizes agree or one is 1.
bool sizesExpand(const zqArray_tag* first, const zqArray_tag* second) {
    const unsigned long common = std::min(numberOfDimensions(first), numberOfDimensions(second));
    const unsigned long* firstSizes = dimensionsOf(first);
    const unsigned long* secondSizes = dimensionsOf(second);
    for (unsigned long i = 0; i < common; ++i) {
        if (firstSizes[i] != 1 && secondSizes[i] != 1 && firstSizes[i] != secondSizes[i])
            return false;
    }
    return true;
}

template <class Group, ElementRoutine elementRoutine, class Combine>
class BitLogicCall {
public:
    BitLogicCall(int nrhs, const zqArray_tag** prhs)
        : first_(prhs[0]), second_(prhs[1]), assumedType_(nrhs == 3 ? prhs[2] : nullptr) {}

    // Runs the tests in their fixed order and computes the result; `plhs[0]`
    // is written last, so a refused call leaves it as it was.
    void run(zqArraySlot* plhs) {
        if (isSparse(first_) || isSparse(second_)) fail<typename Group::sparseArgs>();
        if (!isNumericOrLogical(first_) || !isNumericOrLogical(second_))
            fail<typename Group::operandsNotNumeric>();
        if (isComplex(first_) || isComplex(second_)) fail<typename Group::complexInputs>();
        const Kind firstKind = kindOf(first_);
        const Kind secondKind = kindOf(second_);
        if ((firstKind == Kind::real32 && secondKind != Kind::integer) ||
            (secondKind == Kind::real32 && firstKind != Kind::integer)) {
            fail<typename Group::firstArgsNotInt>();
        }
        const bool firstIsScalar = isScalar(first_);
        const bool secondIsScalar = isScalar(second_);
        if (!sizesExpand(first_, second_)) fail<typename Group::sizeMismatch>();

        if (firstKind == Kind::integer || secondKind == Kind::integer) {
            const bool allowed = firstKind == Kind::integer
                                     ? integerPartnerAllowed(secondKind, secondIsScalar)
                                     : integerPartnerAllowed(firstKind, firstIsScalar);
            if (!allowed) fail<typename Group::mixedClasses>();
            *plhs = onIntegers(firstKind == Kind::integer ? classOf(first_) : classOf(second_));
        } else {
            *plhs = onDoublesAndLogicals(firstKind, secondKind);
        }
    }

private:
    template <class Tag>
    [[noreturn]] static void fail() {
        raiseError<Tag>();
    }

    static bool isNumericOrLogical(const zqArray_tag* array) {
        return isNumeric(array) || isLogical(array);
    }

    // The partner of an integer operand may be of the same integer class, or
    // a double scalar; any other class, and a double of any other shape, an
    // empty one among them, is refused.
    bool integerPartnerAllowed(Kind partnerKind, bool partnerIsScalar) const {
        if (partnerKind == Kind::integer) return classOf(first_) == classOf(second_);
        return partnerKind == Kind::real64 && partnerIsScalar;
    }

    // The integer class decides. An assumed type may only confirm it; a
    // double scalar partner must hold an integer of that class. The operands
    // go to the element routine as they came.
    zqArraySlot onIntegers(zqClassID integerClass) const {
        if (assumedType_ != nullptr) {
            const zqClassID assumed = parseAssumedType(assumedType_);
            if (assumed == zqNoClass) fail<typename Group::unknownTypeString>();
            if (assumed != integerClass) fail<typename Group::invalidTypeString>();
        }
        for (const zqArray_tag* operand : {first_, second_}) {
            if (kindOf(operand) == Kind::real64 && !fitsIntegerClass(operand, integerClass)) {
                fail<typename Group::outOfRangeMixedType>();
            }
        }
        return elementRoutine(first_, second_);
    }

    // Doubles and logicals are taken for integers of the working class, uint64
    // or the assumed type, and the answer comes back as double. Two logicals
    // with no assumed type go to the element routine as they are.
    zqArraySlot onDoublesAndLogicals(Kind firstKind, Kind secondKind) const {
        zqClassID workClass = zqUInt64Class;
        if (assumedType_ == nullptr) {
            if (firstKind == Kind::logical && secondKind == Kind::logical) {
                return elementRoutine(first_, second_);
            }
        } else {
            workClass = parseAssumedType(assumedType_);
            if (workClass == zqNoClass) fail<typename Group::unknownTypeString>();
        }
        if (firstKind == Kind::real64 && secondKind == Kind::real64) {
            if (zqArraySlot result = onTwoDoubles(workClass)) return result;
        }
        const auto convertedFirst = validatedConversion(first_, firstKind, workClass);
        const auto convertedSecond = validatedConversion(second_, secondKind, workClass);
        const zqArraySlot result = elementRoutine(convertedFirst.get(), convertedSecond.get());
        return zqArraySlot(matrix::convert_if_needed(result.get(), zqDoubleClass).detach());
    }

    // Two doubles of the same sizes, or one of them scalar, straight into a
    // double result with the test of every element in the same pass. Null
    // when the sizes need implicit expansion or an element is refused: the
    // conversions through the working class then take over and report it.
    zqArraySlot onTwoDoubles(zqClassID workClass) const {
        const bool firstIsScalar = isScalar(first_);
        const bool secondIsScalar = isScalar(second_);
        if (!firstIsScalar && !secondIsScalar && !sameDimensions(first_, second_)) return nullptr;
        const zqArray_tag* shape = firstIsScalar ? second_ : first_;
        zqArraySlot result =
            createResult(numberOfDimensions(shape), dimensionsOf(shape), zqDoubleClass);
        const unsigned long n = numberOfElements(result.get());
        const double* first = dataOf<double>(first_);
        const double* second = dataOf<double>(second_);
        double* out = dataOf<double>(result.get());
        const bool accepted = visitClass<IntegerClasses>(
            workClass,
            [&]<class Tag>(Tag) {
                using T = typename Tag::type;
                if (firstIsScalar == secondIsScalar) {
                    return runCheckedLanes(CombineArrayLanes<T, Combine>{}, first, second, out, n,
                                           &runInRanges);
                }
                const double scalar = firstIsScalar ? *first : *second;
                if (!fitsInteger<T>(scalar)) return false;
                return runCheckedLanes(CombineScalarLanes<T, Combine>(scalar),
                                       firstIsScalar ? second : first, nullptr, out, n,
                                       &runInRanges);
            },
            [] { return false; });
        return accepted ? std::move(result) : nullptr;
    }

    static boost::intrusive_ptr<zqArray_tag> validatedConversion(const zqArray_tag* operand,
                                                                 Kind kind, zqClassID workClass) {
        if (kind == Kind::real64 && !fitsIntegerClass(operand, workClass))
            fail<typename Group::outOfRange>();
        return matrix::convert_if_needed(operand, workClass);
    }

    const zqArray_tag* first_;
    const zqArray_tag* second_;
    const zqArray_tag* assumedType_;
};

template <class Group, ElementRoutine elementRoutine, class Combine>
void bitLogicFunction(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    if (nlhs > 1) matrix::detail::error_maxlhs();
    if (nrhs > 3) matrix::detail::error_maxrhs();
    if (nrhs < 2) matrix::detail::error_minrhs();
    BitLogicCall<Group, elementRoutine, Combine>(nrhs, prhs).run(plhs);
}

}  // namespace
}  // namespace bitfcns

void ondelBitAndFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    bitfcns::bitLogicFunction<VESPRA::Bitand, bitandBsxfunHelper, bitfcns::AndBits>(nlhs, plhs,
                                                                                    nrhs, prhs);
}

void ondelBitOrFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    bitfcns::bitLogicFunction<VESPRA::Bitor, bitorBsxfunHelper, bitfcns::OrBits>(nlhs, plhs, nrhs,
                                                                                 prhs);
}

void ondelBitXorFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    bitfcns::bitLogicFunction<VESPRA::bitxor, bitxorBsxfunHelper, bitfcns::XorBits>(nlhs, plhs,
                                                                                    nrhs, prhs);
}
