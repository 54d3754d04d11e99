// Conversion between classes with the host's rules.
#include "calc/conversion.hpp"

#include "calc/array_building.hpp"
#include "calc/errors.hpp"
#include "calc/text_join.hpp"
#include "host/element_types.hpp"

#include <limits>
#include <span>
#include <vector>

namespace bitcalc {

namespace {

// The host converts numeric and logical arrays; char code units become
// doubles first.
zqArraySlot charsAsDoubles(const zqArray_tag& source) {
    const std::size_t count = host::elementCount(source);
    const char16_t* units = elementsOf<char16_t>(source);
    std::vector<double> values(units, units + count);
    return host::makeArray(zqDoubleClass, host::dimensions(source),
                           std::span<const double>(values));
}

zqArraySlot convertReal(const zqArray_tag& source, zqClassID cls) {
    if (host::classOf(source) == cls) return reshapeArray(source, host::dimensions(source));
    boost::intrusive_ptr<zqArray_tag> converted = matrix::convert_if_needed(&source, cls);
    // The converted copy is ours alone; its one reference passes to the slot.
    return zqArraySlot(converted.detach());
}

std::span<const std::byte> realBytes(const zqArray_tag& array) {
    return {static_cast<const std::byte*>(array.data),
            host::elementCount(array) * host::elementSize(host::classOf(array))};
}

}  // namespace

zqArraySlot convertArray(const zqArray_tag& source, zqClassID cls) {
    const zqClassID from = host::classOf(source);
    if (!holdsElements(from)) {
        throw CalcError(errorid::invalidArgument,
                        joinText("Conversion to ", className(cls), " from ", className(from),
                                 " is not possible."));
    }
    const bool complex = host::isComplex(source);
    if (complex && cls == zqLogicalClass) {
        throw CalcError(errorid::invalidArgument, "Complex values can't be converted to logical.");
    }
    if (from == zqCharClass) return convertArray(*charsAsDoubles(source), cls);

    zqArraySlot result;
    if (complex) {
        // The real and the imaginary part are converted apart, each as a
        // real array of the source's class.
        const Dims dims = host::dimensions(source);
        zqArraySlot realPart = host::makeArray(from, dims, realBytes(source));
        const std::span<const std::byte> imaginaryBytes{
            static_cast<const std::byte*>(host::imaginaryData(source)), realBytes(source).size()};
        zqArraySlot imaginaryPart = host::makeArray(from, dims, imaginaryBytes);
        result = convertReal(*realPart, cls);
        const zqArraySlot convertedImaginary = convertReal(*imaginaryPart, cls);
        host::makeComplex(*result, realBytes(*convertedImaginary));
    } else {
        result = convertReal(source, cls);
    }
    host::setWantsSharedResult(*result, false);
    host::setSparse(*result,
                    host::isSparse(source) && (cls == zqDoubleClass || cls == zqLogicalClass));
    return result;
}

zqArraySlot integerLimit(zqClassID cls, bool largest) {
    return host::visitElementClass<host::IntegerElements>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            const T value = largest ? std::numeric_limits<T>::max() : std::numeric_limits<T>::min();
            return host::makeArray(cls, {1, 1}, std::span<const T>(&value, 1));
        },
        [&]() -> zqArraySlot {
            throw CalcError(
                errorid::invalidArgument,
                joinText(largest ? "intmax" : "intmin", " takes the name of an integer class, not ",
                         className(cls), "."));
        });
}

}  // namespace bitcalc
