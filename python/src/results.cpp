// Host results as NumPy arrays: sizes, dtype, and a capsule that owns the
// host record as the array's base.
#include "results.hpp"

#include "element_classes.hpp"

#include "host/array_factory.hpp"

#include <pybind11/pybind11.h>

#include <string>

namespace py = pybind11;

namespace bitfcns::python {

namespace {

constexpr const char* kCapsuleName = "bitfcns.host_array";

void destroyHostArray(PyObject* capsule) {
    auto* array = static_cast<zqArray_tag*>(PyCapsule_GetPointer(capsule, kCapsuleName));
    if (array) matrix::detail::zqDestroy_deleter{}(array);
}

// The sizes of a record as it stores them.
struct StoredSizes {
    const unsigned long* sizes;
    unsigned long count;
};

StoredSizes storedSizes(const zqArray_tag& array) {
    if (array.flags & zqIncompleteDimsFlag) array._complete_opaque_dimensions();
    if (array.flags & zqTwoDimensionalFlag) return {array.sizes2, 2};
    return {array.sizesN.dims, array.sizesN.ndims};
}

}  // namespace

PyObject* toNumPy(zqArraySlot result, int ndim) {
    const int type = numpyTypeOfClass(host::classOf(*result));
    if (type < 0) {
        throw py::type_error("the library returned an array of class " +
                             std::to_string(host::classOf(*result)) +
                             ", which NumPy has no dtype for");
    }
    const StoredSizes stored = storedSizes(*result);
    // Sizes beyond NumPy's dimensions are 1 (the host keeps at least two);
    // should one not be, all are kept.
    int count = ndim;
    for (unsigned long i = static_cast<unsigned long>(ndim); i < stored.count; ++i) {
        if (stored.sizes[i] != 1) count = static_cast<int>(stored.count);
    }
    if (count > NPY_MAXDIMS) throw py::value_error("the result has more dimensions than NumPy's");
    npy_intp shape[NPY_MAXDIMS];
    for (int i = 0; i < count; ++i) {
        const auto at = static_cast<unsigned long>(i);
        shape[count - 1 - i] = static_cast<npy_intp>(at < stored.count ? stored.sizes[at] : 1);
    }
    void* data = result->data;
    PyObject* owner = PyCapsule_New(result.get(), kCapsuleName, destroyHostArray);
    if (!owner) throw py::error_already_set();
    result.release();
    PyObject* array = PyArray_NewFromDescr(&PyArray_Type, PyArray_DescrFromType(type), count, shape,
                                           nullptr, data, NPY_ARRAY_CARRAY, nullptr);
    if (!array) {
        Py_DECREF(owner);
        throw py::error_already_set();
    }
    // Takes the reference to the capsule, also when it fails.
    if (PyArray_SetBaseObject(reinterpret_cast<PyArrayObject*>(array), owner) < 0) {
        Py_DECREF(array);
        throw py::error_already_set();
    }
    return array;
}

}  // namespace bitfcns::python
