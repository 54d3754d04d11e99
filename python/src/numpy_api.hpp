// NumPy's C API for the module's sources. One source (the module's) imports
// the API table; the others refer to it.
#pragma once

#define NPY_NO_DEPRECATED_API NPY_1_7_API_VERSION
#define PY_ARRAY_UNIQUE_SYMBOL bitfcns_python_ARRAY_API
#ifndef BITFCNS_PYTHON_IMPORTS_NUMPY
#define NO_IMPORT_ARRAY
#endif

#include <Python.h>
#include <numpy/arrayobject.h>
