// Calls of the library's entry points from Python. The operands are made
// with the GIL held; the entry point runs with it released, touching no
// Python object; the GIL is back before any error is raised or any operand
// released.
#include "calls.hpp"

#include "errors.hpp"
#include "operands.hpp"
#include "results.hpp"

#include "host/array_factory.hpp"

#include <pybind11/pybind11.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <string>

namespace py = pybind11;

namespace bitfcns::python {

namespace {

class NotImplemented : public py::builtin_exception {
public:
    using py::builtin_exception::builtin_exception;
    void set_error() const override { PyErr_SetString(PyExc_NotImplementedError, what()); }
};

struct CallOptions {
    bool overwriteInput = false;
};

CallOptions parseKeywords(const LibraryFunction& function, PyObject* const* values,
                          PyObject* kwnames) {
    CallOptions options;
    const Py_ssize_t count = kwnames ? PyTuple_GET_SIZE(kwnames) : 0;
    for (Py_ssize_t i = 0; i < count; ++i) {
        PyObject* name = PyTuple_GET_ITEM(kwnames, i);
        if (PyUnicode_CompareWithASCIIString(name, "overwrite_input") != 0) {
            throw py::type_error(std::string(function.name) +
                                 "() got an unexpected keyword argument '" +
                                 py::str(name).cast<std::string>() + "'");
        }
        const int truth = PyObject_IsTrue(values[i]);
        if (truth < 0) throw py::error_already_set();
        options.overwriteInput = truth != 0;
    }
    return options;
}

void checkAvailable(const LibraryFunction& function) {
    if (!function.entry) {
        const std::string message = std::string(function.name) +
                                    " is not defined by the loaded libbitfcns.so; a build of the "
                                    "library that has it provides it";
        throw NotImplemented(message);
    }
}

void checkInputCount(const LibraryFunction& function, Py_ssize_t count) {
    if (count >= function.fewestInputs && count <= function.mostInputs) return;
    throw py::type_error(std::string(function.name) + "() takes " +
                         std::to_string(function.fewestInputs) + " to " +
                         std::to_string(function.mostInputs) + " positional arguments but " +
                         std::to_string(count) + (count == 1 ? " was" : " were") + " given");
}

struct Operands {
    std::array<Operand, kMostInputs> operands;
    std::array<const zqArray_tag*, kMostInputs> inputs{};
    int count = 0;
    int ndim = 0;  // the result's NumPy dimensions: the most of any value operand

    Operands(const LibraryFunction& function, PyObject* const* args, Py_ssize_t nargs)
        : count(static_cast<int>(nargs)) {
        for (int i = 0; i < count; ++i) {
            operands[i] = toOperand(args[i], function.name, i + 1);
            inputs[i] = operands[i].array.get();
            if (!operands[i].isText) ndim = std::max(ndim, operands[i].ndim);
        }
    }

    // Lets the result take over the first operand's storage where that is
    // safe: the library decides whether it does.
    void offerFirstForResult() {
        if (mayShareStorage(operands[0], operands.data() + 1,
                            static_cast<std::size_t>(count - 1))) {
            host::setWantsSharedResult(*operands[0].array, true);
        }
    }
};

// Runs the entry point with the GIL released; an exception is kept for the
// caller to translate with the GIL held.
std::exception_ptr runEntry(EntryPoint entry, zqArraySlot& result, const Operands& operands) {
    std::exception_ptr error;
    Py_BEGIN_ALLOW_THREADS;
    try {
        entry(1, &result, operands.count, const_cast<const zqArray_tag**>(operands.inputs.data()));
    } catch (...) {
        error = std::current_exception();
    }
    Py_END_ALLOW_THREADS;
    return error;
}

}  // namespace

PyObject* callLibrary(const LibraryFunction& function, PyObject* const* args, Py_ssize_t nargs,
                      PyObject* kwnames) noexcept {
    try {
        const CallOptions options = parseKeywords(function, args + nargs, kwnames);
        checkAvailable(function);
        checkInputCount(function, nargs);
        Operands operands(function, args, nargs);
        if (options.overwriteInput) operands.offerFirstForResult();
        zqArraySlot result;
        if (const std::exception_ptr error = runEntry(function.entry, result, operands)) {
            setPythonError(error, function.name);
            return nullptr;
        }
        return toNumPy(std::move(result), operands.ndim);
    } catch (...) {
        setPythonError(std::current_exception(), function.name);
        return nullptr;
    }
}

double libraryCallNanoseconds(const LibraryFunction& function, PyObject* operandTuple,
                              long repeat) {
    checkAvailable(function);
    if (!PyTuple_Check(operandTuple)) throw py::type_error("the operands must be a tuple");
    const Py_ssize_t count = PyTuple_GET_SIZE(operandTuple);
    checkInputCount(function, count);
    const Operands operands(function, reinterpret_cast<PyTupleObject*>(operandTuple)->ob_item,
                            count);
    std::exception_ptr error;
    std::chrono::steady_clock::duration elapsed{};
    Py_BEGIN_ALLOW_THREADS;
    try {
        const auto start = std::chrono::steady_clock::now();
        for (long i = 0; i < repeat; ++i) {
            zqArraySlot result;
            function.entry(1, &result, operands.count,
                           const_cast<const zqArray_tag**>(operands.inputs.data()));
        }
        elapsed = std::chrono::steady_clock::now() - start;
    } catch (...) {
        error = std::current_exception();
    }
    Py_END_ALLOW_THREADS;
    if (error) std::rethrow_exception(error);
    return std::chrono::duration<double, std::nano>(elapsed).count() / double(std::max(repeat, 1L));
}

}  // namespace bitfcns::python
