// Making new host arrays from others: copies, reshapes, transposes,
// concatenation, cell arrays, filled arrays, ranges and string scalars.
// Every result is a new array that no variable holds.
#pragma once

#include "calc/array_access.hpp"

#include <optional>
#include <span>
#include <string>

namespace bitcalc {

// A copy with the class, sizes, complex part and sparse flag of `source`;
// the elements of a cell are copied in turn.
zqArraySlot copyArray(const zqArray_tag& source);

// A copy with other sizes of the same element count.
zqArraySlot reshapeArray(const zqArray_tag& source, const Dims& dims);

// The transpose of a two-dimensional array; `conjugate` negates the
// imaginary part of a complex one as well.
zqArraySlot transposeArray(const zqArray_tag& source, bool conjugate);

// Concatenation along dimension `dimension` (0 for rows, [a; b], 1 for
// columns, [a b]) of arrays of one class. 0-by-0 arrays are passed over;
// all other sizes but the concatenated one must agree.
zqArraySlot concatenate(std::size_t dimension, std::span<const zqArray_tag* const> pieces);

// Cells inside cells inside cells: the deepest nesting the evaluator makes,
// which keeps copying and showing them within the stack.
inline constexpr std::size_t maxCellDepth = 100;

// How deep cells are nested in `array`: 0 for an array that is no cell.
std::size_t cellDepth(const zqArray_tag& array);

// A cell array of the given sizes holding copies of `elements`, column-major.
zqArraySlot makeCell(const Dims& dims, std::span<const zqArray_tag* const> elements);

// An array of class `cls` (numeric or logical) with every element `value`.
zqArraySlot filledArray(zqClassID cls, const Dims& dims, double value);

// The row vector first, first + step, ... up to last, of class `cls`
// (double, single or an integer class). An integer range is computed in
// long double, exact for 64-bit integers, and stored rounded and saturated;
// others are computed in double.
zqArraySlot rangeArray(zqClassID cls, long double first, long double step, long double last);

// A 1-by-1 string array; an empty optional is the missing value.
zqArraySlot stringScalar(std::optional<std::u16string> text);

}  // namespace bitcalc
