// One call of a library function from Python: keyword parsing, operands,
// the call itself with the GIL released, the result or the error.
#pragma once

#include "library_functions.hpp"
#include "numpy_api.hpp"

namespace bitfcns::python {

// The body of bitfcns.<function>(*operands, overwrite_input=False) in
// CPython's fast calling convention: a new reference, or null with the
// Python error set.
PyObject* callLibrary(const LibraryFunction& function, PyObject* const* args, Py_ssize_t nargs,
                      PyObject* kwnames) noexcept;

// Nanoseconds per call of `function`'s entry point on `operands`, made into
// host arrays once and called `repeat` times with the GIL released: the
// library's own time on these operands, result included, for comparison with
// a call from Python.
double libraryCallNanoseconds(const LibraryFunction& function, PyObject* operands, long repeat);

}  // namespace bitfcns::python
