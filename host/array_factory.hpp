// The host's own API for making and reading arrays: every kind of operand a
// library may be handed (numeric, logical, char, string, cell, complex,
// sparse-flagged, flagged for a shared result, opaque class ids, incomplete
// dimensions), and read access for displays and tests.
#pragma once

#include "zq_array.hpp"

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace host {

using Dims = std::vector<unsigned long>;

// Element size in bytes of a class that holds elements (logical, char,
// double, single, the integer classes); 0 for any other class.
std::size_t elementSize(zqClassID cls);

// Sizes are normalised the way the host shows them: fewer than two sizes are
// padded with 1 to two, trailing sizes of 1 beyond the second are dropped.
// Every maker raises the host's allocation failure when storage can't be
// had, and std::invalid_argument when the class or the count of the data
// given doesn't fit; the contents of numeric arrays are zero unless given.

// A numeric, logical or char array. `bytes`, when given, holds the elements
// in column-major order with the host's element type for the class.
zqArraySlot makeArray(zqClassID cls, const Dims& dims);
zqArraySlot makeArray(zqClassID cls, const Dims& dims, std::span<const std::byte> bytes);

template <class T>
zqArraySlot makeArray(zqClassID cls, const Dims& dims, std::span<const T> values) {
    return makeArray(cls, dims, std::as_bytes(values));
}

// Elements that stay another owner's, lent to arrays that read them in
// place: column-major, of the host's element type for the class, aligned to
// the element size. `returnLent(owner)` runs exactly once, when the last
// array reading them (shared copies included) is gone, on whichever thread
// drops it; it must not raise.
struct LentElements {
    void* data;
    void* owner;
    void (*returnLent)(void* owner) noexcept;
};

// A numeric or logical array over lent elements, with no copy. When it
// can't be made, the elements are given back before the error is raised.
zqArraySlot makeArrayOverLentElements(zqClassID cls, std::span<const unsigned long> dims,
                                      LentElements elements);

zqArraySlot makeDoubleScalar(double value);
zqArraySlot makeLogicalScalar(bool value);

// A char array of the given sizes, or a 1-by-n row when no sizes are given.
zqArraySlot makeCharArray(std::u16string_view text);
zqArraySlot makeCharArray(const Dims& dims, std::u16string_view units);

// A string array; an empty optional is the missing value.
zqArraySlot makeStringArray(const Dims& dims, std::vector<std::optional<std::u16string>> elements);

// A cell array that owns its elements.
zqArraySlot makeCellArray(const Dims& dims, std::vector<zqArraySlot> elements);

// Gives a numeric array an imaginary part (same class and count, column-major)
// and sets the complex flag.
void makeComplex(zqArray_tag& array, std::span<const std::byte> imaginaryBytes);

// Sets or clears a flag that the host may put on any array.
void setSparse(zqArray_tag& array, bool sparse);
void setWantsSharedResult(zqArray_tag& array, bool wanted);

// Stores the opaque id `storedId` (above 16) in place of the class id; the
// true class is answered by `_get_class_id_non_trivial()`.
void setOpaqueClassId(zqArray_tag& array, zqClassID storedId);

// Leaves the sizes incomplete: the record keeps its true number of
// dimensions but holds placeholder sizes, behind a pointer, with
// zqIncompleteDimsFlag set, until `_complete_opaque_dimensions()` restores
// the true ones.
void setIncompleteDimensions(zqArray_tag& array);

// Keeps the sizes behind a pointer with no zqTwoDimensionalFlag, also for two
// dimensions; with an empty `dims`, a record with no stored sizes at all.
zqArraySlot makeArrayWithSizePointer(zqClassID cls, const Dims& dims);

// Reading. `classOf` resolves opaque ids; `dimensions` completes sizes and
// shows them normalised (a record with no stored sizes as 1-by-1).
zqClassID classOf(const zqArray_tag& array);
Dims dimensions(const zqArray_tag& array);
unsigned long elementCount(const zqArray_tag& array);
bool isComplex(const zqArray_tag& array);
bool isSparse(const zqArray_tag& array);
const void* imaginaryData(const zqArray_tag& array);  // null for real arrays
// Element i of a string array; empty for the missing value.
std::optional<std::u16string_view> stringElement(const zqArray_tag& array, std::size_t i);
const zqArray_tag* cellElement(const zqArray_tag& array, std::size_t i);
// The storage block that `array` reads its real elements from: two records
// share storage exactly when these are equal.
const void* storageIdentity(const zqArray_tag& array);
// The number of live array records, for leak checks in tests.
std::size_t liveArrayCount();

}  // namespace host
