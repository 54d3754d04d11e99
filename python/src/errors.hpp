// How errors that leave the host or the library reach Python: a refusal as
// bitfcns.BitfcnsError with its identifier and the catalogue's sentence, the
// host's argument-count errors as TypeError, the allocation failure as
// MemoryError.
#pragma once

#include <Python.h>

#include <exception>
#include <string_view>

namespace bitfcns::python {

// The class BitfcnsError(message, identifier), set once when the module loads.
void setBitfcnsErrorClass(PyObject* errorClass);

// Sets the Python error for `error`, an exception that left `function` (or
// the making of its operands). Needs the GIL.
void setPythonError(const std::exception_ptr& error, std::string_view function);

}  // namespace bitfcns::python
