// The array-wide element test: a serial scan with an early stop, one loop
// per integer class.
#include "frame/floating.hpp"

#include "frame/array.hpp"
#include "frame/class_types.hpp"

#include <algorithm>

namespace bitfcns {

namespace {
template <class T>
bool allFit(const double* data, unsigned long count) {
    return std::all_of(data, data + count, [](double x) { return fitsInteger<T>(x); });
}
}  // namespace

bool fitsIntegerClass(const zqArray_tag* array, zqClassID workingClass) {
    const unsigned long count = numberOfElements(array);
    if (count == 0) return true;
    const double* data = dataOf<const double>(array);
    return visitClass<IntegerClasses>(
        workingClass, [&](auto tag) { return allFit<typename decltype(tag)::type>(data, count); },
        [&] { return allFit<long>(data, count); });
}

}  // namespace bitfcns
