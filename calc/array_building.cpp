// Making new host arrays from others.
#include "calc/array_building.hpp"

#include "calc/element_cast.hpp"
#include "calc/errors.hpp"
#include "calc/text_join.hpp"
#include "host/element_types.hpp"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <type_traits>
#include <vector>

namespace bitcalc {

namespace {

// Builds a new array of one class and known sizes from runs of elements of
// other arrays of that class, in column-major order.
class ElementWriter {
public:
    ElementWriter(zqClassID cls, Dims dims, bool complex)
        : cls_(cls), dims_(std::move(dims)), complex_(complex) {
        count_ = elementCountOf(dims_);
        if (holdsElements(cls_)) {
            checkArraySize(dims_, cls_);
            width_ = host::elementSize(cls_);
            array_ = host::makeArray(cls_, dims_);
            if (complex_) imaginary_.resize(count_ * width_);
        } else if (cls_ == zqStringClass) {
            strings_.reserve(count_);
        } else if (cls_ == zqCellClass) {
            cells_.reserve(count_);
        } else {
            throw CalcError(errorid::unsupported,
                            joinText("Arrays of class ", className(cls_), " can't be copied."));
        }
    }

    // Appends elements first ... first + count - 1 of `source`.
    void append(const zqArray_tag& source, std::size_t first, std::size_t count) {
        if (count == 0) return;  // empty arrays may have no storage at all
        if (array_) {
            auto* out = static_cast<std::byte*>(array_->data) + written_ * width_;
            std::memcpy(out, static_cast<const std::byte*>(source.data) + first * width_,
                        count * width_);
            if (const void* imaginary = host::imaginaryData(source); imaginary && complex_) {
                std::memcpy(imaginary_.data() + written_ * width_,
                            static_cast<const std::byte*>(imaginary) + first * width_,
                            count * width_);
            }
        } else if (cls_ == zqStringClass) {
            for (std::size_t i = first; i < first + count; ++i) {
                const auto text = host::stringElement(source, i);
                strings_.push_back(text ? std::optional<std::u16string>(*text) : std::nullopt);
            }
        } else {
            for (std::size_t i = first; i < first + count; ++i) {
                cells_.push_back(copyArray(*host::cellElement(source, i)));
            }
        }
        written_ += count;
    }

    // Negates the imaginary parts written so far.
    void conjugate() {
        if (!complex_) return;
        host::visitElementClass<host::NumericElements>(
            cls_,
            [&]<class Tag>(Tag) {
                using T = typename Tag::type;
                for (std::size_t i = 0; i < written_; ++i) {
                    T value;
                    std::memcpy(&value, imaginary_.data() + i * width_, sizeof value);
                    value = castElement<T>(-static_cast<long double>(value));
                    std::memcpy(imaginary_.data() + i * width_, &value, sizeof value);
                }
            },
            [] {});
    }

    zqArraySlot finish() {
        if (cls_ == zqStringClass) return host::makeStringArray(dims_, std::move(strings_));
        if (cls_ == zqCellClass) return host::makeCellArray(dims_, std::move(cells_));
        if (complex_) host::makeComplex(*array_, imaginary_);
        return std::move(array_);
    }

private:
    zqClassID cls_;
    Dims dims_;
    bool complex_;
    std::size_t count_ = 0;
    std::size_t width_ = 0;
    std::size_t written_ = 0;
    zqArraySlot array_;
    std::vector<std::byte> imaginary_;
    std::vector<std::optional<std::u16string>> strings_;
    std::vector<zqArraySlot> cells_;
};

bool isWhole(long double value) { return value == std::floor(value); }

bool isZeroByZero(const Dims& dims) { return dims.size() == 2 && dims[0] == 0 && dims[1] == 0; }

Dims paddedTo(Dims dims, std::size_t count) {
    if (dims.size() < count) dims.resize(count, 1);
    return dims;
}

}  // namespace

zqArraySlot copyArray(const zqArray_tag& source) {
    zqArraySlot copy = reshapeArray(source, host::dimensions(source));
    if (host::isSparse(source)) host::setSparse(*copy, true);
    return copy;
}

zqArraySlot reshapeArray(const zqArray_tag& source, const Dims& dims) {
    const std::size_t count = host::elementCount(source);
    if (elementCountOf(dims) != count) {
        throw CalcError(errorid::invalidArgument,
                        joinText("reshape: an array of ", std::to_string(count),
                                 " elements can't have the size ", dimsText(dims), "."));
    }
    ElementWriter writer(host::classOf(source), dims, host::isComplex(source));
    writer.append(source, 0, count);
    return writer.finish();
}

zqArraySlot transposeArray(const zqArray_tag& source, bool conjugate) {
    const Dims dims = host::dimensions(source);
    if (dims.size() != 2) {
        throw CalcError(
            errorid::unsupported,
            joinText("Transpose is defined for two-dimensional arrays, not for one of size ",
                     dimsText(dims), "."));
    }
    const std::size_t rows = dims[0];
    const std::size_t columns = dims[1];
    const bool complex = host::isComplex(source);
    ElementWriter writer(host::classOf(source), {columns, rows}, complex);
    for (std::size_t row = 0; row < rows && columns != 0; ++row) {
        for (std::size_t column = 0; column < columns; ++column)
            writer.append(source, row + column * rows, 1);
    }
    if (conjugate) writer.conjugate();
    zqArraySlot result = writer.finish();
    if (host::isSparse(source)) host::setSparse(*result, true);
    return result;
}

zqArraySlot concatenate(std::size_t dimension, std::span<const zqArray_tag* const> pieces) {
    std::vector<const zqArray_tag*> kept;
    for (const zqArray_tag* piece : pieces) {
        if (!isZeroByZero(host::dimensions(*piece))) kept.push_back(piece);
    }
    if (kept.empty())
        return pieces.empty() ? filledArray(zqDoubleClass, {0, 0}, 0) : copyArray(*pieces.front());

    const zqClassID cls = host::classOf(*kept.front());
    std::size_t rank = dimension + 1;
    for (const zqArray_tag* piece : kept) {
        if (host::classOf(*piece) != cls) {
            throw CalcError(
                errorid::classMismatch,
                joinText("Concatenation needs arrays of one class, not ", className(cls), " and ",
                         className(host::classOf(*piece)), "."));
        }
        rank = std::max(rank, host::dimensions(*piece).size());
    }

    Dims result = paddedTo(host::dimensions(*kept.front()), rank);
    result[dimension] = 0;
    bool complex = false;
    bool sparse = false;
    for (const zqArray_tag* piece : kept) {
        const Dims dims = paddedTo(host::dimensions(*piece), rank);
        for (std::size_t d = 0; d < rank; ++d) {
            if (d != dimension && dims[d] != result[d]) {
                throw CalcError(
                    errorid::sizeMismatch,
                    joinText("Arrays of sizes ", dimsText(host::dimensions(*kept.front())), " and ",
                             dimsText(host::dimensions(*piece)), " can't be concatenated ",
                             dimension == 0 ? "vertically." : "horizontally."));
            }
        }
        if (__builtin_add_overflow(result[dimension], dims[dimension], &result[dimension])) {
            throw CalcError(errorid::tooLarge, "The concatenated array is too large.");
        }
        complex = complex || host::isComplex(*piece);
        sparse = sparse || host::isSparse(*piece);
    }

    // The writer refuses sizes whose product overflows; with none of them 0,
    // the products below are then exact. With one, nothing is copied.
    ElementWriter writer(cls, result, complex);
    std::size_t inner = 1;
    for (std::size_t d = 0; d < dimension; ++d) inner *= result[d];
    std::size_t outer = 1;
    for (std::size_t d = dimension + 1; d < rank; ++d) outer *= result[d];
    if (elementCountOf(result) == 0) outer = 0;
    for (std::size_t o = 0; o < outer; ++o) {
        for (const zqArray_tag* piece : kept) {
            const std::size_t block = inner * paddedTo(host::dimensions(*piece), rank)[dimension];
            writer.append(*piece, o * block, block);
        }
    }
    zqArraySlot array = writer.finish();
    if (sparse) host::setSparse(*array, true);
    return array;
}

std::size_t cellDepth(const zqArray_tag& array) {
    if (host::classOf(array) != zqCellClass) return 0;
    std::size_t deepest = 0;
    for (std::size_t i = 0, count = host::elementCount(array); i < count; ++i) {
        deepest = std::max(deepest, cellDepth(*host::cellElement(array, i)));
    }
    return deepest + 1;
}

zqArraySlot makeCell(const Dims& dims, std::span<const zqArray_tag* const> elements) {
    for (const zqArray_tag* element : elements) {
        if (cellDepth(*element) >= maxCellDepth) {
            throw CalcError(
                errorid::tooLarge,
                joinText("Cells can be nested ", std::to_string(maxCellDepth), " deep at most."));
        }
    }
    std::vector<zqArraySlot> copies;
    copies.reserve(elements.size());
    for (const zqArray_tag* element : elements) copies.push_back(copyArray(*element));
    return host::makeCellArray(dims, std::move(copies));
}

zqArraySlot filledArray(zqClassID cls, const Dims& dims, double value) {
    checkArraySize(dims, cls);
    zqArraySlot array = host::makeArray(cls, dims);
    const std::size_t count = host::elementCount(*array);
    host::visitElementClass<host::ValueElements>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            std::fill_n(mutableElementsOf<T>(*array), count, castElement<T>(value));
        },
        [&] {
            throw CalcError(errorid::invalidArgument, joinText("Arrays of class ", className(cls),
                                                               " can't be filled with numbers."));
        });
    return array;
}

zqArraySlot rangeArray(zqClassID cls, long double first, long double step, long double last) {
    if (!std::isfinite(first) || !std::isfinite(step) || !std::isfinite(last)) {
        throw CalcError(errorid::invalidArgument,
                        "The limits and the step of a range must be finite.");
    }
    // Whole numbers give an exact quotient. With fractions it may fall a few
    // units in the last place short of the whole number it stands for, and
    // still reaches the last value: 0:0.1:0.3 has 4 elements.
    const long double quotient = (last - first) / step;
    const bool whole = isWhole(first) && isWhole(step) && isWhole(last);
    const bool empty = step == 0 || !(quotient >= 0);
    const long double steps =
        empty ? -1
              : std::floor(whole ? quotient
                                 : quotient * (1 + 4 * std::numeric_limits<double>::epsilon()));
    if (steps + 1 > static_cast<long double>(std::numeric_limits<unsigned long>::max() / 8)) {
        throw CalcError(errorid::tooLarge, "The range has too many elements.");
    }
    const auto count = static_cast<unsigned long>(steps + 1);
    checkArraySize({1, count}, cls);
    zqArraySlot array = host::makeArray(cls, {1, count});
    host::visitElementClass<host::NumericElements>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            using C = std::conditional_t<host::isIntegerElement<Tag>, long double, double>;
            const C from = static_cast<C>(first), by = static_cast<C>(step),
                    to = static_cast<C>(last);
            T* values = mutableElementsOf<T>(*array);
            for (unsigned long k = 0; k < count; ++k) {
                const C value = from + static_cast<C>(k) * by;
                values[k] = castElement<T>(by > 0 ? std::min(value, to) : std::max(value, to));
            }
        },
        [] {});
    return array;
}

zqArraySlot stringScalar(std::optional<std::u16string> text) {
    std::vector<std::optional<std::u16string>> elements;
    elements.push_back(std::move(text));
    return host::makeStringArray({1, 1}, std::move(elements));
}

}  // namespace bitcalc
