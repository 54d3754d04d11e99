// The extension module bitfcns._core: the seven functions in CPython's fast
// calling convention (a call costs no tuple or dict of arguments), with
// their docstrings, and two helpers.
#define BITFCNS_PYTHON_IMPORTS_NUMPY
#include "numpy_api.hpp"

#include "calls.hpp"
#include "docstrings.hpp"
#include "errors.hpp"
#include "library_functions.hpp"
#include "operands.hpp"

#include <pybind11/pybind11.h>

#include <string>
#include <utility>

namespace py = pybind11;

namespace bitfcns::python {

namespace {

template <std::size_t Index>
PyObject* callFunction(PyObject*, PyObject* const* args, Py_ssize_t nargs, PyObject* kwnames) {
    return callLibrary(libraryFunctions()[Index], args, nargs, kwnames);
}

constexpr const char* kDocstrings[kFunctionCount] = {
    docstrings::kBitand, docstrings::kBitor,  docstrings::kBitxor,   docstrings::kBitcmp,
    docstrings::kBitget, docstrings::kBitset, docstrings::kBitshift,
};

template <std::size_t... Index>
std::array<PyMethodDef, kFunctionCount + 1> methodTable(std::index_sequence<Index...>) {
    return {{{libraryFunctions()[Index].name.data(),
              reinterpret_cast<PyCFunction>(reinterpret_cast<void (*)()>(&callFunction<Index>)),
              METH_FASTCALL | METH_KEYWORDS, kDocstrings[Index]}...,
             {nullptr, nullptr, 0, nullptr}}};
}

const LibraryFunction& functionNamed(const std::string& name) {
    for (const LibraryFunction& function : libraryFunctions()) {
        if (function.name == name) return function;
    }
    throw py::value_error("no bit function is called '" + name + "'");
}

}  // namespace

}  // namespace bitfcns::python

PYBIND11_MODULE(_core, module) {
    using namespace bitfcns::python;
    if (_import_array() < 0) throw py::error_already_set();
    setBitfcnsErrorClass(py::module_::import("bitfcns._errors").attr("BitfcnsError").ptr());
    prepareOperands();

    static std::array<PyMethodDef, kFunctionCount + 1> methods =
        methodTable(std::make_index_sequence<kFunctionCount>());
    if (PyModule_AddFunctions(module.ptr(), methods.data()) < 0) throw py::error_already_set();
    // The functions are bitfcns.<name> to pickle and to help().
    for (const LibraryFunction& function : libraryFunctions()) {
        module.attr(py::str(std::string(function.name))).attr("__module__") = "bitfcns";
    }

    module.def(
        "available_functions",
        [] {
            py::list names;
            for (const LibraryFunction& function : libraryFunctions()) {
                if (function.entry) names.append(py::str(std::string(function.name)));
            }
            return py::tuple(names);
        },
        "available_functions()\n\nThe names of the functions that the loaded libbitfcns.so "
        "defines, in the order bitand, bitor, bitxor, bitcmp, bitget, bitset, bitshift. The "
        "others raise NotImplementedError.\n\n"
        "Examples\n--------\n>>> 'bitand' in bitfcns.available_functions()\nTrue\n");

    module.def(
        "_library_call_ns",
        [](const std::string& name, py::tuple operands, long repeat) {
            try {
                return libraryCallNanoseconds(functionNamed(name), operands.ptr(), repeat);
            } catch (...) {
                setPythonError(std::current_exception(), name);
                throw py::error_already_set();
            }
        },
        py::arg("name"), py::arg("operands"), py::arg("repeat"),
        "Nanoseconds per call of the entry point of `name` on `operands` (a tuple), converted "
        "once and called `repeat` times with the GIL released: the baseline of the call-overhead "
        "benchmark.");
}
