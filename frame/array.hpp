// The array layer: what the library reads of a host array (flags, class,
// sizes, data) and the two ways it makes a result (a new array, or a record
// sharing the first operand's storage).
#pragma once

#include "host/zq_array.hpp"

namespace bitfcns {

inline bool isSparse(const zqArray_tag* array) { return (array->flags & zqSparseFlag) != 0; }

// Double, single and the integer classes; logical and char are not numeric.
inline bool isNumeric(const zqArray_tag* array) { return (array->flags & zqNumericFlag) != 0; }

// The complex flag counts only together with the numeric flag.
inline bool isComplex(const zqArray_tag* array) {
    constexpr std::uint32_t complexNumeric = zqComplexFlag | zqNumericFlag;
    return (array->flags & complexNumeric) == complexNumeric;
}

// Reads the stored id: a logical array behind an opaque id is not logical here.
inline bool isLogical(const zqArray_tag* array) { return array->classId == zqLogicalClass; }

inline bool isTwoDimensional(const zqArray_tag* array) {
    return (array->flags & zqTwoDimensionalFlag) != 0;
}

// The host allows a result of this array's class and shape to take over its
// storage.
inline bool wantsSharedResult(const zqArray_tag* array) {
    return (array->flags & zqSharedResultFlag) != 0;
}

// The class, resolving a stored id above 16 through the host.
inline zqClassID classOf(const zqArray_tag* array) {
    return array->classId > 16 ? array->_get_class_id_non_trivial() : array->classId;
}

// Valid while the sizes are still incomplete.
inline unsigned long numberOfDimensions(const zqArray_tag* array) {
    return isTwoDimensional(array) ? 2 : array->sizesN.ndims;
}

// Has the host fill in the sizes of a record that holds placeholders.
inline void completeDimensions(const zqArray_tag* array) {
    if ((array->flags & zqIncompleteDimsFlag) != 0) array->_complete_opaque_dimensions();
}

// The sizes, numberOfDimensions of them, completed first.
inline const unsigned long* dimensionsOf(const zqArray_tag* array) {
    completeDimensions(array);
    return isTwoDimensional(array) ? array->sizes2 : array->sizesN.dims;
}

// The product of the sizes, completed first; a record with no sizes holds one
// element.
inline unsigned long numberOfElements(const zqArray_tag* array) {
    completeDimensions(array);
    if (isTwoDimensional(array)) return array->sizes2[0] * array->sizes2[1];
    unsigned long count = 1;
    for (unsigned long i = 0; i < array->sizesN.ndims; ++i) count *= array->sizesN.dims[i];
    return count;
}

// The real elements, read as T: the element type that goes with the class.
template <class T>
T* dataOf(const zqArray_tag* array) {
    return static_cast<T*>(array->data);
}

// Exactly one element in every dimension.
inline bool isScalar(const zqArray_tag* array) {
    return matrix::detail::noninlined::zq_array_api::zqIsScalar(array);
}

// The same number of dimensions and the same size in each; a row and a
// column of equal length differ.
bool sameDimensions(const zqArray_tag* x, const zqArray_tag* y);

// A new real array with undefined contents. Throws the host's allocation
// failure when the host can't make it.
zqArraySlot createResult(unsigned long ndims, const unsigned long* dims, zqClassID cls);

// A new record sharing the storage of `array`, for a result that overwrites
// it in place. Throws the host's allocation failure when the host can't make
// it.
zqArraySlot shareResult(const zqArray_tag* array);

}  // namespace bitfcns
