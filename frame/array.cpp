// The array layer's non-inline part: the size comparison and the two result
// makers, which turn the host's null into its allocation failure.
#include "frame/array.hpp"

#include "host/exceptions.hpp"

#include <algorithm>

namespace bitfcns {

bool sameDimensions(const zqArray_tag* x, const zqArray_tag* y) {
    const unsigned long ndims = numberOfDimensions(x);
    if (ndims != numberOfDimensions(y)) return false;
    const unsigned long* xDims = dimensionsOf(x);
    const unsigned long* yDims = dimensionsOf(y);
    return std::equal(xDims, xDims + ndims, yDims);
}

zqArraySlot createResult(unsigned long ndims, const unsigned long* dims, zqClassID cls) {
    zqArraySlot result(matrix::detail::create_uninitnumeric(ndims, dims, cls, zqReal, 0, nullptr));
    if (!result) throw foundation::core::except::bad_alloc();
    return result;
}

zqArraySlot shareResult(const zqArray_tag* array) {
    zqArraySlot result(matrix::detail::shared_copy(array));
    // A null input has nothing to share; only a failed copy of a real array
    // is an allocation failure.
    if (!result && array != nullptr) throw foundation::core::except::bad_alloc();
    return result;
}

}  // namespace bitfcns
