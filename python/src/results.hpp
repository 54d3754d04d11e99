// A host result as a NumPy array over the host's own storage: no copy, the
// array's base object holds the host record, and so its storage, alive.
#pragma once

#include "numpy_api.hpp"

#include "host/zq_array.hpp"

namespace bitfcns::python {

// The NumPy array of `result` (a numeric or logical host array) with `ndim`
// dimensions: the host's column-major sizes reversed into C order, with the
// leading 1s that NumPy broadcasting would give. A new reference; raises
// (pybind11) when the array can't be made, destroying the result.
PyObject* toNumPy(zqArraySlot result, int ndim);

}  // namespace bitfcns::python
