// The evaluator's own functions.
#include "calc/builtins.hpp"

#include "calc/array_building.hpp"
#include "calc/conversion.hpp"
#include "calc/errors.hpp"
#include "calc/number_text.hpp"
#include "calc/text_join.hpp"
#include "calc/unicode_text.hpp"
#include "host/element_types.hpp"

#include <array>
#include <cmath>
#include <cstring>
#include <limits>
#include <optional>
#include <vector>

namespace bitcalc {

namespace {

[[noreturn]] void invalid(const Builtin& self, const std::string& problem) {
    throw CalcError(errorid::invalidArgument, joinText(self.name, ": ", problem));
}

void requireCount(std::span<Value> arguments, std::size_t fewest, std::size_t most) {
    if (arguments.size() > most) raiseTooManyInputs();
    if (arguments.size() < fewest) raiseTooFewInputs();
}

bool isText(const zqArray_tag& array) {
    const zqClassID cls = host::classOf(array);
    return cls == zqCharClass || cls == zqStringClass;
}

std::u16string requireText(const Builtin& self, const zqArray_tag& array) {
    std::optional<std::u16string> text = textOf(array);
    if (!text) invalid(self, "expected a class name as text.");
    return *text;
}

bool isRealNumber(const zqArray_tag& array) {
    const zqClassID cls = host::classOf(array);
    return (host::isNumericClass(cls) || cls == zqLogicalClass) && !host::isComplex(array);
}

// One size: a real, whole, finite, non-negative number.
unsigned long sizeFrom(const Builtin& self, double value) {
    if (!(value >= 0) || value != std::floor(value) || value >= 0x1p63) {
        invalid(self,
                joinText("sizes must be whole numbers from 0 up, not ", canonicalText(value), "."));
    }
    return static_cast<unsigned long>(value);
}

// Sizes as a filler or reshape takes them: none (1-by-1), one scalar n
// (n-by-n), one vector of sizes, or several scalars. `placeholder`, when
// given, receives the position of the one empty [] among several scalars.
Dims sizesFrom(const Builtin& self, std::span<Value> arguments,
               std::optional<std::size_t>* placeholder = nullptr) {
    if (arguments.empty()) return {1, 1};
    if (arguments.size() == 1) {
        const zqArray_tag& sizes = arguments[0].array();
        if (!isRealNumber(sizes)) invalid(self, "sizes must be real numbers.");
        const std::size_t count = host::elementCount(sizes);
        if (count == 0) invalid(self, "expected at least one size.");
        Dims dims;
        for (std::size_t i = 0; i < count; ++i)
            dims.push_back(sizeFrom(self, elementAsDouble(sizes, i)));
        if (dims.size() == 1) dims.push_back(dims[0]);
        return dims;
    }
    Dims dims;
    for (std::size_t i = 0; i < arguments.size(); ++i) {
        const zqArray_tag& size = arguments[i].array();
        if (placeholder && isEmpty(size) && !placeholder->has_value()) {
            *placeholder = i;
            dims.push_back(1);
            continue;
        }
        if (!isRealNumber(size) || !isScalar(size))
            invalid(self, "each size must be a real scalar.");
        dims.push_back(sizeFrom(self, elementAsDouble(size, 0)));
    }
    return dims;
}

// The class named by a trailing text argument, which is then dropped.
zqClassID trailingClass(const Builtin& self, std::span<Value>& arguments) {
    if (arguments.empty() || !isText(arguments.back().array())) return self.cls;
    const std::u16string name = requireText(self, arguments.back().array());
    const std::optional<zqClassID> cls = numberClassNamed(name);
    if (!cls)
        invalid(self,
                joinText("'", toUtf8(name), "' isn't the name of a numeric class or logical."));
    arguments = arguments.first(arguments.size() - 1);
    return *cls;
}

zqArraySlot convertBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 1, 1);
    return convertArray(arguments[0].array(), self.cls);
}

zqArraySlot integerLimitBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 0, 1);
    zqClassID cls = zqInt32Class;
    if (!arguments.empty()) {
        const std::u16string name = requireText(self, arguments[0].array());
        cls = numberClassNamed(name).value_or(zqNoClass);
        if (!host::isIntegerClass(cls))
            invalid(self, joinText("'", toUtf8(name), "' isn't the name of an integer class."));
    }
    return integerLimit(cls, self.fill != 0);
}

// zeros, ones, Inf, NaN: sizes and an optional class name.
zqArraySlot filledBody(const Builtin& self, std::span<Value> arguments) {
    const zqClassID cls = trailingClass(self, arguments);
    if (!std::isfinite(self.fill) && !isFloatClass(cls)) {
        invalid(self, joinText("the class must be double or single, not ", className(cls), "."));
    }
    return filledArray(cls, sizesFrom(self, arguments), self.fill);
}

// true, false: sizes only.
zqArraySlot logicalFilledBody(const Builtin& self, std::span<Value> arguments) {
    return filledArray(zqLogicalClass, sizesFrom(self, arguments), self.fill);
}

zqArraySlot reshapeBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 2, std::numeric_limits<std::size_t>::max());
    const zqArray_tag& source = arguments[0].array();
    std::optional<std::size_t> placeholder;
    Dims dims = sizesFrom(self, arguments.subspan(1), &placeholder);
    if (arguments.size() == 2 && host::elementCount(arguments[1].array()) < 2) {
        invalid(self, "give at least two sizes.");
    }
    const std::size_t count = host::elementCount(source);
    if (placeholder) {
        const std::size_t known = elementCountOf(dims);
        if (known == 0 || count % known != 0) {
            invalid(self, joinText("an array of ", std::to_string(count),
                                   " elements can't be divided into the sizes given."));
        }
        dims[*placeholder] = count / known;
    }
    if (elementCountOf(dims) != count) {
        invalid(self, joinText("an array of ", std::to_string(count),
                               " elements can't have the size ", dimsText(dims), "."));
    }
    zqArraySlot result = reshapeArray(source, dims);
    if (host::isSparse(source)) host::setSparse(*result, true);
    return result;
}

zqArraySlot sparseBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 1, 1);
    const zqArray_tag& source = arguments[0].array();
    const zqClassID cls = host::classOf(source);
    if (cls != zqDoubleClass && cls != zqLogicalClass) {
        invalid(self, joinText("takes a double or logical array, not ", className(cls), "."));
    }
    if (host::dimensions(source).size() != 2) invalid(self, "takes a two-dimensional array.");
    zqArraySlot result = copyArray(source);
    host::setSparse(*result, true);
    return result;
}

// Repeats the one element of a scalar to the given sizes; copies an array.
zqArraySlot expandTo(const zqArray_tag& array, const Dims& dims) {
    if (!isScalar(array)) return copyArray(array);
    const zqClassID cls = host::classOf(array);
    const std::size_t width = host::elementSize(cls);
    zqArraySlot result = host::makeArray(cls, dims);
    auto* out = static_cast<std::byte*>(result->data);
    for (std::size_t i = 0, count = host::elementCount(*result); i < count; ++i) {
        std::memcpy(out + i * width, array.data, width);
    }
    return result;
}

zqArraySlot complexBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 1, 2);
    const zqArray_tag& real = arguments[0].array();
    const zqClassID cls = host::classOf(real);
    if (!host::isNumericClass(cls) || host::isComplex(real))
        invalid(self, "the real part must be a real numeric array.");
    zqArraySlot imaginary;
    if (arguments.size() == 2) {
        const zqArray_tag& given = arguments[1].array();
        if (!host::isNumericClass(host::classOf(given)) || host::isComplex(given)) {
            invalid(self, "the imaginary part must be a real numeric array.");
        }
        imaginary = convertArray(given, cls);
    } else {
        imaginary = filledArray(cls, host::dimensions(real), 0);
    }
    const Dims realDims = host::dimensions(real);
    const Dims imaginaryDims = host::dimensions(*imaginary);
    Dims dims = realDims;
    if (isScalar(real)) {
        dims = imaginaryDims;
    } else if (!isScalar(*imaginary) && realDims != imaginaryDims) {
        invalid(self, "the parts must have one size, or one of them must be a scalar.");
    }
    zqArraySlot result = expandTo(real, dims);
    const zqArraySlot imaginaryExpanded = expandTo(*imaginary, dims);
    const std::size_t bytes = host::elementCount(*result) * host::elementSize(cls);
    host::makeComplex(*result, {static_cast<const std::byte*>(imaginaryExpanded->data), bytes});
    return result;
}

zqArraySlot stringBody(const Builtin& self, std::span<Value> arguments) {
    requireCount(arguments, 1, 1);
    const zqArray_tag& source = arguments[0].array();
    const zqClassID cls = host::classOf(source);
    if (cls == zqStringClass) return copyArray(source);
    if (cls != zqCharClass)
        invalid(self, joinText("takes text or missing, not ", className(cls), "."));
    const Dims dims = host::dimensions(source);
    if (dims.size() != 2) invalid(self, "takes a two-dimensional char array.");
    if (dims[0] == 0 && dims[1] == 0) return stringScalar(std::u16string());
    // Each row of the char array becomes one string.
    checkArraySize({dims[0], 1}, zqStringClass);
    const char16_t* units = elementsOf<char16_t>(source);
    std::vector<std::optional<std::u16string>> rows;
    for (std::size_t row = 0; row < dims[0]; ++row) {
        std::u16string text;
        for (std::size_t column = 0; column < dims[1]; ++column)
            text.push_back(units[row + column * dims[0]]);
        rows.emplace_back(std::move(text));
    }
    return host::makeStringArray({dims[0], 1}, std::move(rows));
}

zqArraySlot missingBody(const Builtin&, std::span<Value> arguments) {
    requireCount(arguments, 0, 0);
    return stringScalar(std::nullopt);
}

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double notANumber = std::numeric_limits<double>::quiet_NaN();

constexpr auto builtins = std::to_array<Builtin>({
    {"double", convertBody, zqDoubleClass},
    {"single", convertBody, zqSingleClass},
    {"int8", convertBody, zqInt8Class},
    {"uint8", convertBody, zqUInt8Class},
    {"int16", convertBody, zqInt16Class},
    {"uint16", convertBody, zqUInt16Class},
    {"int32", convertBody, zqInt32Class},
    {"uint32", convertBody, zqUInt32Class},
    {"int64", convertBody, zqInt64Class},
    {"uint64", convertBody, zqUInt64Class},
    {"logical", convertBody, zqLogicalClass},
    {"intmax", integerLimitBody, zqNoClass, 1},
    {"intmin", integerLimitBody, zqNoClass, 0},
    {"zeros", filledBody, zqDoubleClass, 0},
    {"ones", filledBody, zqDoubleClass, 1},
    {"Inf", filledBody, zqDoubleClass, infinity},
    {"inf", filledBody, zqDoubleClass, infinity},
    {"NaN", filledBody, zqDoubleClass, notANumber},
    {"nan", filledBody, zqDoubleClass, notANumber},
    {"true", logicalFilledBody, zqLogicalClass, 1},
    {"false", logicalFilledBody, zqLogicalClass, 0},
    {"reshape", reshapeBody},
    {"sparse", sparseBody},
    {"complex", complexBody},
    {"string", stringBody},
    {"missing", missingBody},
});

}  // namespace

const Builtin* findBuiltin(std::string_view name) {
    for (const Builtin& builtin : builtins) {
        if (builtin.name == name) return &builtin;
    }
    return nullptr;
}

zqArraySlot callBuiltin(const Builtin& builtin, std::span<Value> arguments) {
    return builtin.body(builtin, arguments);
}

}  // namespace bitcalc
