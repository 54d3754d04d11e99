// The array-wide element test: a serial scan with an early stop, one
// register loop per integer class.
#include "frame/floating.hpp"

#include "frame/array.hpp"
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"

namespace bitfcns {

bool fitsIntegerClass(const zqArray_tag* array, zqClassID workingClass) {
    const unsigned long count = numberOfElements(array);
    if (count == 0) return true;
    const double* data = dataOf<const double>(array);
    return visitClass<IntegerClasses>(
        workingClass,
        [&](auto tag) { return allFitInteger<typename decltype(tag)::type>(data, count); },
        [&] { return allFitInteger<long>(data, count); });
}

}  // namespace bitfcns
