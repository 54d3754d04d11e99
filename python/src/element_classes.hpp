// The host classes that NumPy dtypes stand for, both ways: a dtype's kind and
// item size give a class, and a host element type gives a NumPy type number.
#pragma once

#include "host/element_types.hpp"
#include "numpy_api.hpp"

#include <type_traits>

namespace bitfcns::python {

// The host's element type T as NumPy knows it (the C type, so `long` is
// int64 here).
template <class T>
constexpr int numpyTypeOf() {
    if constexpr (std::is_same_v<T, bool>)
        return NPY_BOOL;
    else if constexpr (std::is_same_v<T, signed char>)
        return NPY_BYTE;
    else if constexpr (std::is_same_v<T, unsigned char>)
        return NPY_UBYTE;
    else if constexpr (std::is_same_v<T, short>)
        return NPY_SHORT;
    else if constexpr (std::is_same_v<T, unsigned short>)
        return NPY_USHORT;
    else if constexpr (std::is_same_v<T, int>)
        return NPY_INT;
    else if constexpr (std::is_same_v<T, unsigned int>)
        return NPY_UINT;
    else if constexpr (std::is_same_v<T, long>)
        return NPY_LONG;
    else if constexpr (std::is_same_v<T, unsigned long>)
        return NPY_ULONG;
    else if constexpr (std::is_same_v<T, float>)
        return NPY_FLOAT;
    else if constexpr (std::is_same_v<T, double>)
        return NPY_DOUBLE;
    else
        static_assert(!sizeof(T), "no NumPy type for this element type");
}

// The NumPy type number of a class of the host's value elements (numeric
// classes and logical), or -1.
inline int numpyTypeOfClass(zqClassID cls) {
    return host::visitElementClass<host::ValueElements>(
        cls, [](auto tag) { return numpyTypeOf<typename decltype(tag)::type>(); },
        [] { return -1; });
}

// What a dtype stands for in the host: a class, and whether the elements are
// complex (pairs of that class). No class for dtypes the host has none for.
struct DtypeClass {
    zqClassID cls = zqNoClass;
    bool complex = false;
};

inline DtypeClass classOfDtype(const PyArray_Descr* descr) {
    const int size = static_cast<int>(descr->elsize);
    const auto integer = [size](zqClassID int8Class) {
        switch (size) {
            case 1: return int8Class;
            case 2: return static_cast<zqClassID>(int8Class + 2);
            case 4: return static_cast<zqClassID>(int8Class + 4);
            case 8: return static_cast<zqClassID>(int8Class + 6);
            default: return zqNoClass;
        }
    };
    const auto floating = [](int bytes) {
        return bytes == 4 ? zqSingleClass : bytes == 8 ? zqDoubleClass : zqNoClass;
    };
    switch (descr->kind) {
        case 'b': return {zqLogicalClass, false};
        case 'i': return {integer(zqInt8Class), false};
        case 'u': return {integer(zqUInt8Class), false};
        case 'f': return {floating(size), false};
        case 'c': return {floating(size / 2), true};
        default: return {};
    }
}

}  // namespace bitfcns::python
