// The table of limits: for each operator family and element width, the
// element count from which runVectorOp goes parallel. Signed and unsigned
// classes of one width share a limit; nothing else (processor count,
// broadcast operands, a second operand's class) changes it.
#pragma once

namespace bitfcns::limits {

// Plain operators on double operands.
inline constexpr unsigned long bitcmpOnDouble = 12000;   // BitcmpFtor<T>
inline constexpr unsigned long bitgetOnDouble = 8000;    // BitgetFtor<T>
inline constexpr unsigned long bitshiftOnDouble = 8000;  // BitshiftFtor<T>
inline constexpr unsigned long bitsetOnDouble = 8000;    // BitsetFtor<T>

// Plain operators on integer values, the same for every width.
inline constexpr unsigned long bitgetPositionArray = 30000;        // bitgetVVFtor<T, U>
inline constexpr unsigned long bitshiftCountArray = 12000;         // bitshiftVVFtor<T, U>
inline constexpr unsigned long bitsetPositionArrayTrue = 40000;    // bitsetVVTFtor<T, U>
inline constexpr unsigned long bitsetPositionArrayFalse = 40000;   // bitsetVVFFtor<T, U>
inline constexpr unsigned long bitsetPositionValueArrays = 30000;  // bitsetVVVFtor<T, W>
inline constexpr unsigned long bitsetScalarPosition = 3000;        // IntBitsetFtor<T, W>, plain

namespace detail {
// Marks a width that has no operator in its family.
inline constexpr unsigned long noOperator = 0;
void noOperatorForThisWidth();  // never defined: naming it makes the constant ill-formed

// The limit of the width of T among the four of a SIMD family.
template <class T>
consteval unsigned long byWidth(unsigned long bits8, unsigned long bits16, unsigned long bits32,
                                unsigned long bits64) {
    const unsigned long limit = sizeof(T) == 1   ? bits8
                                : sizeof(T) == 2 ? bits16
                                : sizeof(T) == 4 ? bits32
                                                 : bits64;
    if (limit == noOperator) noOperatorForThisWidth();
    return limit;
}
}  // namespace detail

// SIMD operators, by the element type's width: 8, 16, 32, 64 bits.
template <class T>  // mu::IntBitorSSE2Ftor<T>: set one bit in all elements
inline constexpr unsigned long setOneBit = detail::byWidth<T>(7000000, 4000000, 1800000, 800000);
template <class T>  // mu::IntBitandSSE2Ftor<T>: clear one bit in all elements
inline constexpr unsigned long clearOneBit = detail::byWidth<T>(7000000, 4000000, 1800000, 800000);
template <class T>  // IntRightShiftAndSSE2Ftor: bitget at one position
inline constexpr unsigned long getOneBit = detail::byWidth<T>(4500000, 3500000, 2000000, 1000000);
template <class T>  // IntBitsetSSE2Ftor: one position, new bit values of class T
inline constexpr unsigned long setBitFromValues = detail::byWidth<T>(3500000, 1500000, 800000,
                                                                     detail::noOperator);
// The step down from 16 to 8 bits in the two shifts is wanted.
template <class T>  // IntLeftShiftSSE2Ftor: one shift count to the left
inline constexpr unsigned long leftShift = detail::byWidth<T>(400000, 3500000, 2000000, 1000000);
template <
    class T>  // IntRightShiftSSE2Ftor: one shift count to the right (unsigned only at 64 bits)
inline constexpr unsigned long rightShift = detail::byWidth<T>(400000, 3500000, 2000000, 1000000);

}  // namespace bitfcns::limits
