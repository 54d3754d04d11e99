// Python objects as host arrays. A NumPy array is lent to the host in place
// when it is C-ordered, aligned and in native byte order: its shape reversed
// is the same memory read column-major. Any other layout is copied once into
// that form. Python bool, int and float become the host's logical and double
// scalars, NumPy scalars 0-d arrays of their dtype, and a str a char row.
#pragma once

#include "numpy_api.hpp"

#include "host/zq_array.hpp"

#include <cstddef>
#include <string_view>

namespace bitfcns::python {

struct Operand {
    zqArraySlot array;
    bool isText = false;
    int ndim = 0;  // NumPy's number of dimensions (0 for a Python scalar)
    // The caller's elements that the host reads in place, [lentBegin,
    // lentEnd), and their item size; null when the host reads elements of its
    // own or a private copy.
    const std::byte* lentBegin = nullptr;
    const std::byte* lentEnd = nullptr;
    std::size_t itemSize = 0;
    // The elements may become the result's: a writeable array of the caller,
    // or a private copy.
    bool mayTakeOver = false;
};

// Looks up what the conversions need of NumPy; once, when the module loads.
void prepareOperands();

// The host array for `object`, the `position`th operand (from 1) of
// `function`. Raises a pybind11 TypeError naming what was given and what is
// accepted, or a ValueError for an int that no double holds exactly; the
// host's allocation failure passes through.
Operand toOperand(PyObject* object, std::string_view function, int position);

// Whether the result may take over the storage of `first` without another
// operand reading memory that the loop overwrites: true unless an operand
// reads part of it, or all of it by another element size.
bool mayShareStorage(const Operand& first, const Operand* others, std::size_t otherCount);

}  // namespace bitfcns::python
