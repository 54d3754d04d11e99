// Python objects as host arrays: NumPy arrays lent in place or copied once,
// complex arrays copied with their imaginary parts, scalars and text.
#include "operands.hpp"

#include "element_classes.hpp"

#include "host/array_factory.hpp"
#include "host/exceptions.hpp"

#include <pybind11/pybind11.h>

#include <array>
#include <span>
#include <string>
#include <vector>

namespace py = pybind11;

namespace bitfcns::python {

namespace {

// Gives back the reference that a lent array held on its NumPy array, on
// whichever thread the host drops the last record reading it.
void returnLentArray(void* owner) noexcept {
    const PyGILState_STATE state = PyGILState_Ensure();
    Py_DECREF(static_cast<PyObject*>(owner));
    PyGILState_Release(state);
}

// NumPy's shape reversed: the host's column-major sizes of a C-ordered array.
struct HostDims {
    std::array<unsigned long, NPY_MAXDIMS> sizes;  // the first `count` set, no more
    int count = 0;

    explicit HostDims(PyArrayObject* array) : count(PyArray_NDIM(array)) {
        const npy_intp* shape = PyArray_SHAPE(array);
        for (int i = 0; i < count; ++i) sizes[i] = static_cast<unsigned long>(shape[count - 1 - i]);
    }
    std::span<const unsigned long> span() const { return {sizes.data(), std::size_t(count)}; }
};

PyObject* maskedArrayType = nullptr;

// A masked array would lose its mask on the way: refused rather than read
// as its bare data. Other subclasses of ndarray are read as arrays.
bool isMaskedArray(PyObject* object) {
    return !PyArray_CheckExact(object) && PyObject_IsInstance(object, maskedArrayType) == 1;
}

std::string describe(PyObject* object) {
    if (isMaskedArray(object)) return "a masked array";
    if (PyArray_Check(object)) {
        const py::str dtype(reinterpret_cast<PyObject*>(PyArray_DESCR((PyArrayObject*)object)));
        return "an array of dtype " + dtype.cast<std::string>();
    }
    return "an object of type " + std::string(Py_TYPE(object)->tp_name);
}

[[noreturn]] void refuseType(PyObject* object, std::string_view function, int position) {
    throw py::type_error(
        std::string(function) + "(): argument " + std::to_string(position) + " is " +
        describe(object) +
        "; accepted are NumPy arrays and scalars of bool, int8 to int64, uint8 to uint64, "
        "float32, float64, complex64 and complex128, and Python bool, int, float and str");
}

// The array in the layout the host reads: `array` itself, or a C-ordered,
// aligned, native copy of it.
py::object hostLayout(PyArrayObject* array, bool& copied) {
    copied = !(PyArray_IS_C_CONTIGUOUS(array) && PyArray_ISALIGNED(array) &&
               PyArray_ISNOTSWAPPED(array));
    if (!copied) return py::reinterpret_borrow<py::object>(reinterpret_cast<PyObject*>(array));
    PyArray_Descr* native = PyArray_DescrFromType(PyArray_DESCR(array)->type_num);
    PyObject* copy = PyArray_FromArray(array, native, NPY_ARRAY_C_CONTIGUOUS | NPY_ARRAY_ALIGNED);
    if (!copy) throw py::error_already_set();
    return py::reinterpret_steal<py::object>(copy);
}

// A complex array reaches the host as a copy with its imaginary part, for
// the library to refuse.
template <class T>
zqArraySlot complexHostArray(PyArrayObject* array, zqClassID cls) {
    bool copied = false;
    const py::object held = hostLayout(array, copied);
    auto* layout = reinterpret_cast<PyArrayObject*>(held.ptr());
    const auto count = static_cast<std::size_t>(PyArray_SIZE(layout));
    const auto* pairs = static_cast<const T*>(PyArray_DATA(layout));
    std::vector<T> real(count), imaginary(count);
    for (std::size_t i = 0; i < count; ++i) {
        real[i] = pairs[2 * i];
        imaginary[i] = pairs[2 * i + 1];
    }
    const HostDims dims(layout);
    zqArraySlot result = host::makeArray(cls, host::Dims(dims.span().begin(), dims.span().end()),
                                         std::span<const T>(real));
    host::makeComplex(*result, std::as_bytes(std::span<const T>(imaginary)));
    return result;
}

Operand arrayOperand(PyArrayObject* array, std::string_view function, int position) {
    const DtypeClass dtype = classOfDtype(PyArray_DESCR(array));
    if (dtype.cls == zqNoClass) refuseType(reinterpret_cast<PyObject*>(array), function, position);
    Operand operand;
    operand.ndim = PyArray_NDIM(array);
    if (dtype.complex) {
        operand.array = dtype.cls == zqSingleClass ? complexHostArray<float>(array, dtype.cls)
                                                   : complexHostArray<double>(array, dtype.cls);
        return operand;
    }
    bool copied = false;
    py::object held = hostLayout(array, copied);
    auto* layout = reinterpret_cast<PyArrayObject*>(held.ptr());
    operand.itemSize = static_cast<std::size_t>(PyArray_ITEMSIZE(layout));
    operand.mayTakeOver = copied || PyArray_ISWRITEABLE(array);
    if (!copied) {
        operand.lentBegin = static_cast<const std::byte*>(PyArray_DATA(array));
        operand.lentEnd = operand.lentBegin + PyArray_NBYTES(array);
    }
    void* data = PyArray_DATA(layout);
    // The host's array holds the reference from here on.
    operand.array = host::makeArrayOverLentElements(dtype.cls, HostDims(layout).span(),
                                                    {data, held.release().ptr(), returnLentArray});
    return operand;
}

// A Python int as a double, refused unless the double holds it exactly.
double exactDouble(PyObject* integer, std::string_view function, int position) {
    int overflow = 0;
    const long long value = PyLong_AsLongLongAndOverflow(integer, &overflow);
    if (value == -1 && PyErr_Occurred()) throw py::error_already_set();
    if (!overflow) {
        const auto converted = static_cast<double>(value);
        // 2^63 is the one double that rounding may reach and no long long holds.
        if (converted < 9223372036854775808.0 && static_cast<long long>(converted) == value) {
            return converted;
        }
    } else {
        const double converted = PyLong_AsDouble(integer);
        if (converted == -1.0 && PyErr_Occurred()) {
            PyErr_Clear();  // beyond the doubles: refused below like any inexact int
        } else {
            const py::object back = py::reinterpret_steal<py::object>(PyLong_FromDouble(converted));
            if (back && PyObject_RichCompareBool(back.ptr(), integer, Py_EQ) == 1) {
                return converted;
            }
        }
    }
    const py::str text(integer);
    throw py::value_error(std::string(function) + "(): argument " + std::to_string(position) +
                          ", the int " + text.cast<std::string>() +
                          ", has no exact double value and would be rounded; pass it as a NumPy "
                          "integer scalar or array (np.uint64, np.int64) to keep every bit");
}

zqArraySlot textArray(PyObject* text) {
    if (PyUnicode_READY(text) < 0) throw py::error_already_set();
    const Py_ssize_t length = PyUnicode_GET_LENGTH(text);
    const int kind = PyUnicode_KIND(text);
    const void* data = PyUnicode_DATA(text);
    std::u16string units;
    units.reserve(static_cast<std::size_t>(length));
    for (Py_ssize_t i = 0; i < length; ++i) {
        const Py_UCS4 point = PyUnicode_READ(kind, data, i);
        if (point < 0x10000) {
            units.push_back(static_cast<char16_t>(point));
        } else {  // a surrogate pair
            units.push_back(static_cast<char16_t>(0xD800 + ((point - 0x10000) >> 10)));
            units.push_back(static_cast<char16_t>(0xDC00 + ((point - 0x10000) & 0x3FF)));
        }
    }
    return host::makeCharArray(units);
}

// A 1-by-1 array holding `value`, made the way the library makes its results:
// the host's makers for scalars cost a vector of sizes a call.
template <class T>
zqArraySlot scalarArray(zqClassID cls, T value) {
    static constexpr unsigned long kOneByOne[] = {1, 1};
    zqArraySlot array(matrix::detail::create_uninitnumeric(2, kOneByOne, cls, zqReal, 0, nullptr));
    if (!array) throw foundation::core::except::bad_alloc();
    *static_cast<T*>(array->data) = value;
    return array;
}

bool overlaps(const Operand& a, const Operand& b) {
    return a.lentBegin < b.lentEnd && b.lentBegin < a.lentEnd;
}

}  // namespace

void prepareOperands() {
    // Imported here, once, with the GIL held: never inside a call.
    maskedArrayType =
        py::object(py::module_::import("numpy.ma").attr("MaskedArray")).release().ptr();
}

Operand toOperand(PyObject* object, std::string_view function, int position) {
    Operand operand;
    if (PyBool_Check(object)) {
        operand.array = scalarArray(zqLogicalClass, object == Py_True);
    } else if (PyUnicode_Check(object)) {
        operand.array = textArray(object);
        operand.isText = true;
    } else if (PyFloat_Check(object)) {
        operand.array = scalarArray(zqDoubleClass, PyFloat_AS_DOUBLE(object));
    } else if (PyLong_Check(object)) {
        operand.array = scalarArray(zqDoubleClass, exactDouble(object, function, position));
    } else if (PyArray_Check(object) && !isMaskedArray(object)) {
        return arrayOperand(reinterpret_cast<PyArrayObject*>(object), function, position);
    } else if (PyArray_IsScalar(object, Generic)) {
        const py::object array =
            py::reinterpret_steal<py::object>(PyArray_FromScalar(object, nullptr));
        if (!array) throw py::error_already_set();
        Operand scalar =
            arrayOperand(reinterpret_cast<PyArrayObject*>(array.ptr()), function, position);
        scalar.lentBegin = scalar.lentEnd = nullptr;  // a private 0-d array
        return scalar;
    } else {
        refuseType(object, function, position);
    }
    return operand;
}

bool mayShareStorage(const Operand& first, const Operand* others, std::size_t otherCount) {
    if (!first.mayTakeOver) return false;
    for (std::size_t i = 0; i < otherCount; ++i) {
        const Operand& other = others[i];
        if (!first.lentBegin || !other.lentBegin || !overlaps(first, other)) continue;
        // Reading the very elements that are overwritten, each before it is
        // written, is safe; reading them shifted or by another size is not.
        const bool sameElements = other.lentBegin == first.lentBegin &&
                                  other.lentEnd == first.lentEnd &&
                                  other.itemSize == first.itemSize;
        if (!sameElements) return false;
    }
    return true;
}

}  // namespace bitfcns::python
