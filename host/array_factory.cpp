// The host's own API for making and reading arrays of every kind.
#include "host/array_factory.hpp"

#include "host/array_body.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"

#include <cstring>
#include <memory>
#include <stdexcept>

namespace host {

namespace {

zqArraySlot checkedArray(zqArray_tag* array) {
    if (!array) throw foundation::core::except::bad_alloc();
    return zqArraySlot(array);
}

zqArraySlot newElementArray(zqClassID cls, const Dims& dims) {
    if (elementSize(cls) == 0) {
        throw std::invalid_argument("host::makeArray: the class holds no elements");
    }
    return checkedArray(newArray(cls, normaliseDims(dims.size(), dims.data()), false));
}

std::size_t byteCount(const zqArray_tag& array) {
    return trueElementCount(array) * elementSize(trueClassOf(array));
}

}  // namespace

std::size_t elementSize(zqClassID cls) { return elementSizeIn(StoredElements{}, cls); }

zqArraySlot makeArray(zqClassID cls, const Dims& dims) {
    zqArraySlot array = newElementArray(cls, dims);
    std::memset(array->data, 0, byteCount(*array));
    return array;
}

zqArraySlot makeArray(zqClassID cls, const Dims& dims, std::span<const std::byte> bytes) {
    zqArraySlot array = newElementArray(cls, dims);
    const std::size_t size = byteCount(*array);
    if (bytes.size() != size) {
        throw std::invalid_argument("host::makeArray: the data don't match the sizes");
    }
    if (size != 0) std::memcpy(array->data, bytes.data(), size);
    if (cls == zqLogicalClass) {
        // Logical elements are the bytes 0 and 1.
        auto* elements = static_cast<unsigned char*>(array->data);
        for (std::size_t i = 0; i < size; ++i) elements[i] = elements[i] != 0;
    }
    return array;
}

zqArraySlot makeArrayOverLentElements(zqClassID cls, std::span<const unsigned long> dims,
                                      LentElements elements) {
    if (cls != zqLogicalClass && !isNumericClass(cls)) {
        elements.returnLent(elements.owner);
        throw std::invalid_argument(
            "host::makeArrayOverLentElements: not a numeric or logical class");
    }
    zqArray_tag* array = newArrayOverLent(cls, normaliseDims(dims.size(), dims.data()),
                                          elements.data, elements.returnLent, elements.owner);
    if (!array) elements.returnLent(elements.owner);
    return checkedArray(array);
}

zqArraySlot makeDoubleScalar(double value) {
    return makeArray(zqDoubleClass, {1, 1}, std::span<const double>(&value, 1));
}

zqArraySlot makeLogicalScalar(bool value) {
    return makeArray(zqLogicalClass, {1, 1}, std::span<const bool>(&value, 1));
}

zqArraySlot makeCharArray(std::u16string_view text) {
    return makeCharArray({1, text.size()}, text);
}

zqArraySlot makeCharArray(const Dims& dims, std::u16string_view units) {
    return makeArray(zqCharClass, dims, std::span<const char16_t>(units.data(), units.size()));
}

zqArraySlot makeStringArray(const Dims& dims, std::vector<std::optional<std::u16string>> elements) {
    zqArraySlot array =
        checkedArray(newArray(zqStringClass, normaliseDims(dims.size(), dims.data()), false));
    if (elements.size() != trueElementCount(*array)) {
        throw std::invalid_argument("host::makeStringArray: the elements don't match the sizes");
    }
    auto strings = std::make_shared<StringElements>();
    strings->texts.reserve(elements.size());
    strings->records.reserve(elements.size());
    for (auto& element : elements) {
        if (!element) {
            strings->slots.push_back(nullptr);
            continue;
        }
        const std::u16string& text = strings->texts.emplace_back(std::move(*element));
        strings->slots.push_back(&strings->records.emplace_back(
            Kestrelon::String::TextRecord{text.data(), text.size()}));
    }
    const DimsView shown = trueDimensions(*array);
    for (unsigned long i = 0; i < shown.count; ++i) strings->dims.push_back(shown[i]);
    strings->view = {strings->dims.size(), strings->dims.data(), strings->slots.data()};
    array->body->strings = std::move(strings);
    return array;
}

zqArraySlot makeCellArray(const Dims& dims, std::vector<zqArraySlot> elements) {
    zqArraySlot array =
        checkedArray(newArray(zqCellClass, normaliseDims(dims.size(), dims.data()), false));
    if (elements.size() != trueElementCount(*array)) {
        throw std::invalid_argument("host::makeCellArray: the elements don't match the sizes");
    }
    auto cells = std::make_shared<CellElements>();
    cells->cells = std::move(elements);
    array->body->cells = std::move(cells);
    return array;
}

void makeComplex(zqArray_tag& array, std::span<const std::byte> imaginaryBytes) {
    if (!isNumericClass(trueClassOf(array))) {
        throw std::invalid_argument("host::makeComplex: only numeric arrays can be complex");
    }
    completeDimensions(array);
    const std::size_t size = byteCount(array);
    if (imaginaryBytes.size() != size) {
        throw std::invalid_argument("host::makeComplex: the data don't match the sizes");
    }
    StorageBlock* imaginary = allocateStorage(size);
    if (!imaginary) throw foundation::core::except::bad_alloc();
    if (size != 0) std::memcpy(imaginary->data(), imaginaryBytes.data(), size);
    if (array.body->imaginary) releaseStorage(array.body->imaginary);
    array.body->imaginary = imaginary;
    array.flags |= zqComplexFlag;
}

void setSparse(zqArray_tag& array, bool sparse) {
    array.flags = sparse ? array.flags | zqSparseFlag : array.flags & ~zqSparseFlag;
}

void setWantsSharedResult(zqArray_tag& array, bool wanted) {
    array.flags = wanted ? array.flags | zqSharedResultFlag : array.flags & ~zqSharedResultFlag;
}

void setOpaqueClassId(zqArray_tag& array, zqClassID storedId) {
    if (storedId < zqOpaqueClass) {
        throw std::invalid_argument("host::setOpaqueClassId: an opaque id is above 16");
    }
    array.body->trueClass = trueClassOf(array);
    array.classId = storedId;
}

void setIncompleteDimensions(zqArray_tag& array) {
    if (array.flags & zqIncompleteDimsFlag) return;
    const Dims sizes = [&] {
        const DimsView view = trueDimensions(array);
        return Dims(view.sizes, view.sizes + view.count);
    }();
    if (!storeDimensions(array, {sizes.data(), sizes.size(), sizes.size()}, true)) {
        throw foundation::core::except::bad_alloc();
    }
    array.body->placeholderDims =
        std::make_unique<unsigned long[]>(std::max<std::size_t>(sizes.size(), 1));
    array.sizesN.dims = array.body->placeholderDims.get();
    array.flags |= zqIncompleteDimsFlag;
}

zqArraySlot makeArrayWithSizePointer(zqClassID cls, const Dims& dims) {
    zqArraySlot array = makeArray(cls, dims);
    const DimsView shown = trueDimensions(*array);
    const Dims sizes = dims.empty() ? Dims{} : Dims(shown.sizes, shown.sizes + shown.count);
    if (!storeDimensions(*array, {sizes.data(), sizes.size(), sizes.size()}, true)) {
        throw foundation::core::except::bad_alloc();
    }
    return array;
}

zqClassID classOf(const zqArray_tag& array) { return trueClassOf(array); }

Dims dimensions(const zqArray_tag& array) {
    completeDimensions(array);
    const DimsView view = normaliseDims(trueDimensions(array).count, trueDimensions(array).sizes);
    Dims sizes(view.count);
    for (unsigned long i = 0; i < view.count; ++i) sizes[i] = view[i];
    return sizes;
}

unsigned long elementCount(const zqArray_tag& array) {
    completeDimensions(array);
    return trueElementCount(array);
}

bool isComplex(const zqArray_tag& array) {
    return (array.flags & (zqComplexFlag | zqNumericFlag)) == (zqComplexFlag | zqNumericFlag);
}

bool isSparse(const zqArray_tag& array) { return (array.flags & zqSparseFlag) != 0; }

const void* imaginaryData(const zqArray_tag& array) {
    return isComplex(array) && array.body->imaginary ? array.body->imaginary->data() : nullptr;
}

std::optional<std::u16string_view> stringElement(const zqArray_tag& array, std::size_t i) {
    const auto& strings = array.body->strings;
    if (!strings || i >= strings->slots.size()) {
        throw std::out_of_range("host::stringElement: no such element");
    }
    const Kestrelon::String::TextRecord* record = strings->slots[i];
    if (!record) return std::nullopt;
    return std::u16string_view(record->units, record->length);
}

const zqArray_tag* cellElement(const zqArray_tag& array, std::size_t i) {
    const auto& cells = array.body->cells;
    if (!cells || i >= cells->cells.size()) {
        throw std::out_of_range("host::cellElement: no such element");
    }
    return cells->cells[i].get();
}

const void* storageIdentity(const zqArray_tag& array) {
    const ArrayBody& body = *array.body;
    if (body.real) return body.real;
    if (body.strings) return body.strings.get();
    if (body.cells) return body.cells.get();
    return nullptr;
}

}  // namespace host
