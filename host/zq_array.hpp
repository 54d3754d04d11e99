// The host's array record, its class ids and flags, and the array operations
// that a loaded library may call: creation, shared copies, conversion,
// destruction and the errors for argument counts.
#pragma once

#include <boost/intrusive_ptr.hpp>

#include <cstdint>
#include <memory>

namespace host {
struct ArrayBody;  // the host's private part of a record
}

// Class ids. Only the values below have a meaning; a stored id above 16 is an
// opaque id whose true class `_get_class_id_non_trivial()` answers.
enum zqClassID : std::int32_t {
    zqNoClass = 0,
    zqCellClass = 1,
    zqStructClass = 2,
    zqLogicalClass = 3,
    zqCharClass = 4,
    zqStringClass = 5,
    zqDoubleClass = 6,
    zqSingleClass = 7,
    zqInt8Class = 8,
    zqUInt8Class = 9,
    zqInt16Class = 10,
    zqUInt16Class = 11,
    zqInt32Class = 12,
    zqUInt32Class = 13,
    zqInt64Class = 14,
    zqUInt64Class = 15,
    zqOpaqueClass = 17,  // lowest stored id that must be resolved
};

// Real or complex, as asked of array creation.
enum zqComplexity : std::int32_t { zqReal = 0, zqComplex = 1 };

// Bits of the flag word.
inline constexpr std::uint32_t zqSparseFlag = 0x10;
inline constexpr std::uint32_t zqNumericFlag = 0x80;
inline constexpr std::uint32_t zqIncompleteDimsFlag = 0x100;
inline constexpr std::uint32_t zqSharedResultFlag = 0x200;
inline constexpr std::uint32_t zqComplexFlag = 0x800;
inline constexpr std::uint32_t zqTwoDimensionalFlag = 0x40000;

// The array record. The first members are read by libraries directly, in
// this order; everything from `body` on is the host's own.
struct zqArray_tag {
    // Sizes of any count, held behind a pointer.
    struct SizeList {
        unsigned long* dims;  // the sizes
        unsigned long ndims;  // and their count
    };

    zqClassID classId;
    std::uint32_t flags;
    union {
        unsigned long sizes2[2];  // with zqTwoDimensionalFlag: rows, columns
        SizeList sizesN;          // otherwise
    };
    void* data;  // the real elements

    host::ArrayBody* body;

    // The true class of a record whose stored id is above 16.
    zqClassID _get_class_id_non_trivial() const;
    // Makes the sizes valid and clears zqIncompleteDimsFlag; the flag word and
    // the dimension members must be read again afterwards.
    void _complete_opaque_dimensions() const;
};

// Reference counting of records, for boost::intrusive_ptr. Neither raises.
void intrusive_ptr_add_ref(const zqArray_tag* array) noexcept;
void intrusive_ptr_release(const zqArray_tag* array) noexcept;

namespace matrix {
namespace detail {

// Destroys an array that an owning slot held (drops the slot's reference).
struct zqDestroy_deleter {
    void operator()(const zqArray_tag* array) const noexcept;
};

// Raise the host's errors for too many outputs, too many inputs and too few
// inputs ("VESPRA:maxlhs", "VESPRA:maxrhs", "VESPRA:minrhs"). Callers treat
// them as ordinary calls; it is the host's promise that they don't return.
void error_maxlhs();
void error_maxrhs();
void error_minrhs();

// A new array with undefined contents, or null when storage can't be had.
// Any class that holds elements (numeric, logical, char); zqComplex adds an
// imaginary part to a numeric class. Sizes are normalised as the host shows
// them: fewer than two padded with 1, trailing 1s beyond the second dropped.
// Element storage is at least 16-byte aligned.
zqArray_tag* create_uninitnumeric(unsigned long ndims, const unsigned long* dims, zqClassID cls,
                                  zqComplexity complexity, int, const zqArray_tag**);

// A new record of the same class and dimensions sharing the storage of
// `array`, or null when it can't be made.
zqArray_tag* shared_copy(const zqArray_tag* array);

namespace noninlined::zq_array_api {
// True for exactly one element in all dimensions.
bool zqIsScalar(const zqArray_tag* array);
// The 1-byte elements of a logical array.
bool* zqGetLogicals(const zqArray_tag* array);
}  // namespace noninlined::zq_array_api

}  // namespace detail

// `array` itself (one more reference) when it has class `cls` already,
// otherwise a converted copy. Raises the host's allocation failure when
// storage can't be had. Floating to integer rounds half away from zero and
// saturates, NaN giving 0; integer to floating rounds to nearest; to logical,
// anything non-zero (NaN included) is true. A complex array keeps its
// imaginary part, converted too. Raises "VESPRA:bsxfun:badOperands" for a
// class that holds no elements and for a complex array to logical or char.
boost::intrusive_ptr<zqArray_tag> convert_if_needed(const zqArray_tag* array, zqClassID cls);

}  // namespace matrix

// The owning slot type of the built-in calling shape.
using zqArraySlot = std::unique_ptr<zqArray_tag, matrix::detail::zqDestroy_deleter>;
