// Small reading helpers over host arrays for the evaluator.
#include "calc/array_access.hpp"

#include "calc/errors.hpp"
#include "calc/text_join.hpp"
#include "host/element_types.hpp"

#include <array>
#include <limits>

namespace bitcalc {

namespace {

constexpr std::size_t arraySizeLimit = std::size_t{1} << 30;

std::string bytesText(std::size_t bytes) {
    if (bytes % (std::size_t{1} << 30) == 0) return joinText(std::to_string(bytes >> 30), " GiB");
    if (bytes % (std::size_t{1} << 20) == 0) return joinText(std::to_string(bytes >> 20), " MiB");
    return joinText(std::to_string(bytes), " bytes");
}

struct NamedClass {
    std::u16string_view name;
    zqClassID cls;
};

constexpr std::array<NamedClass, 11> numberClasses{{
    {u"double", zqDoubleClass},
    {u"single", zqSingleClass},
    {u"int8", zqInt8Class},
    {u"uint8", zqUInt8Class},
    {u"int16", zqInt16Class},
    {u"uint16", zqUInt16Class},
    {u"int32", zqInt32Class},
    {u"uint32", zqUInt32Class},
    {u"int64", zqInt64Class},
    {u"uint64", zqUInt64Class},
    {u"logical", zqLogicalClass},
}};

}  // namespace

std::string className(zqClassID cls) {
    switch (cls) {
        case zqCellClass: return "cell";
        case zqStructClass: return "struct";
        case zqCharClass: return "char";
        case zqStringClass: return "string";
        default: break;
    }
    for (const NamedClass& named : numberClasses) {
        if (named.cls == cls) return std::string(named.name.begin(), named.name.end());
    }
    return joinText("class ", std::to_string(static_cast<int>(cls)));
}

std::optional<zqClassID> numberClassNamed(std::u16string_view name) {
    for (const NamedClass& named : numberClasses) {
        if (named.name == name) return named.cls;
    }
    return std::nullopt;
}

bool isFloatClass(zqClassID cls) { return cls == zqDoubleClass || cls == zqSingleClass; }
bool holdsElements(zqClassID cls) {
    return host::isNumericClass(cls) || cls == zqLogicalClass || cls == zqCharClass;
}

std::string dimsText(const Dims& dims) {
    std::string text;
    for (std::size_t i = 0; i < dims.size(); ++i) {
        if (i != 0) text += 'x';
        text += std::to_string(dims[i]);
    }
    return text;
}

std::size_t elementCountOf(const Dims& dims) {
    std::size_t count = 1;
    for (unsigned long size : dims) {
        if (size == 0) return 0;
    }
    for (unsigned long size : dims) {
        if (__builtin_mul_overflow(count, size, &count)) {
            throw CalcError(errorid::tooLarge,
                            joinText("An array of size ", dimsText(dims), " is too large."));
        }
    }
    return count;
}

void checkArraySize(const Dims& dims, zqClassID cls) {
    const std::size_t count = elementCountOf(dims);
    const std::size_t width = std::max<std::size_t>(host::elementSize(cls), sizeof(void*));
    if (count > arraySizeLimit / width) {
        throw CalcError(
            errorid::tooLarge,
            joinText("An array of size ", dimsText(dims), " and class ", className(cls),
                     " exceeds bitcalc's limit of ", bytesText(arraySizeLimit), " per array."));
    }
}

bool isScalar(const zqArray_tag& array) { return host::elementCount(array) == 1; }
bool isEmpty(const zqArray_tag& array) { return host::elementCount(array) == 0; }

std::optional<std::u16string> textOf(const zqArray_tag& array) {
    const zqClassID cls = host::classOf(array);
    const Dims dims = host::dimensions(array);
    if (cls == zqCharClass) {
        const bool row = dims.size() == 2 && dims[0] == 1;
        const bool empty = dims.size() == 2 && dims[0] == 0 && dims[1] == 0;
        if (!row && !empty) return std::nullopt;
        const auto* units = elementsOf<char16_t>(array);
        return std::u16string(units, units + host::elementCount(array));
    }
    if (cls == zqStringClass && host::elementCount(array) == 1) {
        const auto text = host::stringElement(array, 0);
        if (text) return std::u16string(*text);
    }
    return std::nullopt;
}

long double elementValue(const zqArray_tag& array, std::size_t index) {
    return host::visitElementClass<host::StoredElements>(
        host::classOf(array),
        [&]<class Tag>(Tag) {
            return static_cast<long double>(elementsOf<typename Tag::type>(array)[index]);
        },
        [] { return std::numeric_limits<long double>::quiet_NaN(); });
}

}  // namespace bitcalc
