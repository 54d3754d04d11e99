// Translation of the exceptions of the host's exception library, the
// library's errors without identifier and the module's own pybind11 errors
// into Python errors.
#include "errors.hpp"

#include "host/exceptions.hpp"

#include <pybind11/pybind11.h>

#include <new>
#include <string>

namespace py = pybind11;

namespace bitfcns::python {

namespace {

PyObject* bitfcnsErrorClass = nullptr;

void raiseBitfcnsError(const char* message, const std::string* identifier) {
    py::object id = identifier ? py::object(py::str(*identifier)) : py::object(py::none());
    PyObject* error =
        PyObject_CallFunctionObjArgs(bitfcnsErrorClass, py::str(message).ptr(), id.ptr(), nullptr);
    if (!error) return;  // the call has set its own error
    PyErr_SetObject(bitfcnsErrorClass, error);
    Py_DECREF(error);
}

bool isArgumentCount(const std::string& identifier) {
    return identifier == "VESPRA:maxlhs" || identifier == "VESPRA:maxrhs" ||
           identifier == "VESPRA:minrhs";
}

}  // namespace

void setBitfcnsErrorClass(PyObject* errorClass) {
    Py_XINCREF(errorClass);
    Py_XSETREF(bitfcnsErrorClass, errorClass);
}

void setPythonError(const std::exception_ptr& error, std::string_view function) {
    try {
        std::rethrow_exception(error);
    } catch (py::error_already_set& pythonError) {
        pythonError.restore();
    } catch (const py::builtin_exception& moduleError) {
        moduleError.set_error();
    } catch (const foundation::core::except::IMsgIDException& refusal) {
        const std::string identifier = refusal.GetID();
        if (isArgumentCount(identifier)) {
            const std::string message = std::string(function) + "(): " + refusal.what();
            PyErr_SetString(PyExc_TypeError, message.c_str());
        } else {
            raiseBitfcnsError(refusal.what(), &identifier);
        }
    } catch (const std::bad_alloc& failure) {
        PyErr_SetString(PyExc_MemoryError, failure.what());
    } catch (const std::exception& failure) {
        // An error with no identifier: the invalid character of a type text.
        raiseBitfcnsError(failure.what(), nullptr);
    } catch (...) {
        PyErr_SetString(PyExc_SystemError, "an unknown C++ exception left the bit function");
    }
}

}  // namespace bitfcns::python
