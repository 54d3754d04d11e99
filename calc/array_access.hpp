// Small reading helpers over host arrays for the evaluator: class names,
// sizes and their text, typed element access, the text an array holds, and
// the evaluator's limit on the size of the arrays it makes.
#pragma once

#include "host/array_factory.hpp"

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace bitcalc {

using host::Dims;

// The host's name of a class: "uint8", "double", "char", "cell"; "class N"
// for an id with no name.
std::string className(zqClassID cls);

// The class of numbers named by `name` ("double", "single", "int8" ...
// "uint64", "logical"), or nothing.
std::optional<zqClassID> numberClassNamed(std::u16string_view name);

bool isFloatClass(zqClassID cls);  // double or single
// Classes whose elements are plain numbers: numeric, logical, char.
bool holdsElements(zqClassID cls);

// "1x3", "0x0", "2x3x4".
std::string dimsText(const Dims& dims);

// The number of elements of arrays of these sizes; raises the evaluator's
// "too large" error when the product doesn't fit in memory's address range.
std::size_t elementCountOf(const Dims& dims);

// Raises the evaluator's "too large" error for arrays beyond the size limit,
// 1 GiB: the most that bitcalc makes of its own.
void checkArraySize(const Dims& dims, zqClassID cls);

bool isScalar(const zqArray_tag& array);
bool isEmpty(const zqArray_tag& array);

template <class T>
const T* elementsOf(const zqArray_tag& array) {
    return static_cast<const T*>(array.data);
}

template <class T>
T* mutableElementsOf(zqArray_tag& array) {
    return static_cast<T*>(array.data);
}

// The text that a char row vector, a 0-by-0 char array or a string scalar
// holds; nothing for any other array, a missing string included.
std::optional<std::u16string> textOf(const zqArray_tag& array);

// A real element of an element-holding array, exactly: long double holds
// every 64-bit integer. NaN for arrays of other classes.
long double elementValue(const zqArray_tag& array, std::size_t index);

// The same element rounded to double.
inline double elementAsDouble(const zqArray_tag& array, std::size_t index) {
    return static_cast<double>(elementValue(array, index));
}

}  // namespace bitcalc
