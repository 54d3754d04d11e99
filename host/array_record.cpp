// Array records: making them with their storage, reference counts and
// destruction, shared copies, sizes (incomplete ones included), opaque class
// ids, and the host operations on records that libraries call.
//
// A record and its host part live in one heap chunk. Small storage shares that
// chunk too, so a small array costs one allocation; the chunk then belongs to
// the storage block and goes back when the last record sharing the storage
// does.
#include "host/array_body.hpp"
#include "host/array_factory.hpp"
#include "host/element_types.hpp"

#include <algorithm>
#include <new>

namespace host {

namespace {

std::atomic<std::size_t> liveRecords{0};

constexpr std::size_t roundUp16(std::size_t value) { return (value + 15) / 16 * 16; }

// Layout of a record chunk: the record, its body, then (for small arrays) the
// storage header and the elements.
constexpr std::size_t kBodyOffset = roundUp16(sizeof(zqArray_tag));
constexpr std::size_t kRecordBytes = roundUp16(kBodyOffset + sizeof(ArrayBody));
static_assert(alignof(ArrayBody) <= 16 && alignof(zqArray_tag) <= 16);

ArrayBody& bodyOf(const zqArray_tag& array) { return *array.body; }

// Places a record and its body at the start of `chunk`.
zqArray_tag* placeRecord(void* chunk) {
    auto* array = new (chunk) zqArray_tag{};
    array->body = new (static_cast<std::byte*>(chunk) + kBodyOffset) ArrayBody;
    liveRecords.fetch_add(1, std::memory_order_relaxed);
    return array;
}

void destroyRecord(zqArray_tag* array) noexcept {
    ArrayBody* body = array->body;
    StorageBlock* real = body->real;
    StorageBlock* imaginary = body->imaginary;
    void* recordChunk = body->recordChunk;
    body->~ArrayBody();
    array->~zqArray_tag();
    liveRecords.fetch_sub(1, std::memory_order_relaxed);
    if (imaginary) releaseStorage(imaginary);
    if (recordChunk) freeChunk(recordChunk, kRecordBytes);
    // Last: the record's own memory may belong to this block.
    if (real) releaseStorage(real);
}

bool multiplyChecked(unsigned long a, unsigned long b, unsigned long& product) {
    return !__builtin_mul_overflow(a, b, &product);
}

}  // namespace

std::size_t liveArrayCount() { return liveRecords.load(); }

DimsView normaliseDims(unsigned long given, const unsigned long* sizes) {
    unsigned long count = given;
    while (count > 2 && sizes[count - 1] == 1) --count;
    return {sizes, given, std::max(count, 2UL)};
}

bool storeDimensions(zqArray_tag& array, DimsView dims, bool keepPointer) noexcept {
    ArrayBody& body = bodyOf(array);
    if (dims.count > ArrayBody::kInlineDims) {
        body.heapDims.reset(new (std::nothrow) unsigned long[dims.count]);
        if (!body.heapDims) return false;
    } else {
        body.heapDims.reset();
    }
    body.ndims = dims.count;
    for (unsigned long i = 0; i < dims.count; ++i) body.dims()[i] = dims[i];
    if (dims.count == 2 && !keepPointer) {
        array.flags |= zqTwoDimensionalFlag;
        array.sizes2[0] = dims[0];
        array.sizes2[1] = dims[1];
    } else {
        array.flags &= ~zqTwoDimensionalFlag;
        array.sizesN.dims = dims.count ? body.dims() : nullptr;
        array.sizesN.ndims = dims.count;
    }
    return true;
}

DimsView trueDimensions(const zqArray_tag& array) {
    const ArrayBody& body = bodyOf(array);
    if (array.flags & zqIncompleteDimsFlag) return {body.dims(), body.ndims, body.ndims};
    if (array.flags & zqTwoDimensionalFlag) return {array.sizes2, 2, 2};
    return {array.sizesN.dims, array.sizesN.ndims, array.sizesN.ndims};
}

unsigned long trueElementCount(const zqArray_tag& array) {
    // Wrapping can't change the product: with a 0 among the sizes it is 0
    // modulo 2^64 too, and without one the record couldn't have been made.
    const DimsView dims = trueDimensions(array);
    unsigned long count = 1;
    for (unsigned long i = 0; i < dims.count; ++i) count *= dims[i];
    return count;
}

zqClassID trueClassOf(const zqArray_tag& array) {
    return array.classId >= zqOpaqueClass ? bodyOf(array).trueClass : array.classId;
}

void completeDimensions(const zqArray_tag& constArray) {
    if (!(constArray.flags & zqIncompleteDimsFlag)) return;
    // The record is the host's own and never const in memory.
    auto& array = const_cast<zqArray_tag&>(constArray);
    ArrayBody& body = bodyOf(array);
    if (body.ndims == 2) {
        const unsigned long rows = body.dims()[0], columns = body.dims()[1];
        array.sizes2[0] = rows;
        array.sizes2[1] = columns;
        array.flags |= zqTwoDimensionalFlag;
    } else {
        array.sizesN.dims = body.ndims ? body.dims() : nullptr;
        array.sizesN.ndims = body.ndims;
    }
    array.flags &= ~zqIncompleteDimsFlag;
    body.placeholderDims.reset();
}

zqArray_tag* newArray(zqClassID cls, DimsView dims, bool complex) noexcept {
    const std::size_t elementBytes = elementSizeIn(StoredElements{}, cls);
    // A size of 0 makes an empty array whatever the other sizes: only a
    // product of sizes none of which is 0 can overflow.
    unsigned long count = 1, bytes = 0;
    for (unsigned long i = 0; i < dims.count; ++i) {
        if (dims[i] == 0) count = 0;
    }
    for (unsigned long i = 0; i < dims.count && count != 0; ++i) {
        if (!multiplyChecked(count, dims[i], count)) return nullptr;
    }
    if (!multiplyChecked(count, elementBytes, bytes)) return nullptr;

    if (!allocationPermitted()) return nullptr;
    const bool inChunk = elementBytes != 0 && bytes < kLargeBlockBytes;
    const std::size_t chunkBytes = kRecordBytes + (inChunk ? sizeof(StorageBlock) + bytes : 0);
    void* chunk = allocateChunk(chunkBytes);
    if (!chunk) return nullptr;
    zqArray_tag* array = placeRecord(chunk);
    ArrayBody& body = bodyOf(*array);
    if (inChunk) {
        body.real = placeStorageInChunk(static_cast<std::byte*>(chunk) + kRecordBytes, bytes, chunk,
                                        chunkBytes);
    } else {
        body.recordChunk = chunk;
        if (elementBytes != 0 && !(body.real = allocateStorage(bytes))) {
            destroyRecord(array);
            return nullptr;
        }
    }
    if (complex && !(body.imaginary = allocateStorage(bytes))) {
        destroyRecord(array);
        return nullptr;
    }
    array->classId = cls;
    array->flags = (isNumericClass(cls) ? zqNumericFlag : 0) | (complex ? zqComplexFlag : 0);
    array->data = body.real ? body.real->data() : nullptr;
    if (!storeDimensions(*array, dims, false)) {
        destroyRecord(array);
        return nullptr;
    }
    return array;
}

zqArray_tag* newArrayOverLent(zqClassID cls, DimsView dims, void* data,
                              void (*returnLent)(void*) noexcept, void* owner) noexcept {
    if (!allocationPermitted()) return nullptr;
    // Record and lent block share one chunk, which the block frees last.
    const std::size_t chunkBytes = kRecordBytes + sizeof(StorageBlock);
    void* chunk = allocateChunk(chunkBytes);
    if (!chunk) return nullptr;
    zqArray_tag* array = placeRecord(chunk);
    array->classId = cls;
    array->flags = isNumericClass(cls) ? zqNumericFlag : 0;
    array->data = data;
    if (!storeDimensions(*array, dims, false)) {
        // No lent block yet: the record owns the chunk.
        array->body->recordChunk = chunk;
        destroyRecord(array);
        return nullptr;
    }
    array->body->real = placeLentStorageInChunk(static_cast<std::byte*>(chunk) + kRecordBytes,
                                                chunk, chunkBytes, returnLent, owner);
    return array;
}

zqArray_tag* newSharingRecord(const zqArray_tag& source) noexcept {
    completeDimensions(source);
    if (!allocationPermitted()) return nullptr;
    void* chunk = allocateChunk(kRecordBytes);
    if (!chunk) return nullptr;
    zqArray_tag* array = placeRecord(chunk);
    ArrayBody& body = bodyOf(*array);
    const ArrayBody& sourceBody = bodyOf(source);
    body.recordChunk = chunk;
    array->classId = source.classId;
    // The permission to take over storage was given for the source only.
    array->flags = source.flags & ~zqSharedResultFlag;
    if (!storeDimensions(*array, trueDimensions(source), !(source.flags & zqTwoDimensionalFlag))) {
        destroyRecord(array);
        return nullptr;
    }
    body.trueClass = sourceBody.trueClass;
    if ((body.real = sourceBody.real)) retainStorage(body.real);
    if ((body.imaginary = sourceBody.imaginary)) retainStorage(body.imaginary);
    body.strings = sourceBody.strings;
    body.cells = sourceBody.cells;
    array->data = source.data;
    return array;
}

}  // namespace host

zqClassID zqArray_tag::_get_class_id_non_trivial() const { return host::trueClassOf(*this); }

void zqArray_tag::_complete_opaque_dimensions() const { host::completeDimensions(*this); }

void intrusive_ptr_add_ref(const zqArray_tag* array) noexcept {
    array->body->references.fetch_add(1, std::memory_order_relaxed);
}

void intrusive_ptr_release(const zqArray_tag* array) noexcept {
    auto& references = array->body->references;
    // A sole owner needs no atomic decrement: nobody else can take a reference.
    if (references.load(std::memory_order_acquire) == 1 ||
        references.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        host::destroyRecord(const_cast<zqArray_tag*>(array));
    }
}

namespace matrix::detail {

void zqDestroy_deleter::operator()(const zqArray_tag* array) const noexcept {
    intrusive_ptr_release(array);
}

zqArray_tag* create_uninitnumeric(unsigned long ndims, const unsigned long* dims, zqClassID cls,
                                  zqComplexity complexity, int, const zqArray_tag**) {
    if (host::elementSizeIn(host::StoredElements{}, cls) == 0) return nullptr;
    if (ndims != 0 && !dims) return nullptr;
    const bool complex = complexity == zqComplex;
    if (complex && !host::isNumericClass(cls)) return nullptr;
    return host::newArray(cls, host::normaliseDims(ndims, dims), complex);
}

zqArray_tag* shared_copy(const zqArray_tag* array) {
    return array ? host::newSharingRecord(*array) : nullptr;
}

namespace noninlined::zq_array_api {

bool zqIsScalar(const zqArray_tag* array) {
    host::completeDimensions(*array);
    return host::trueElementCount(*array) == 1;
}

bool* zqGetLogicals(const zqArray_tag* array) { return static_cast<bool*>(array->data); }

}  // namespace noninlined::zq_array_api

}  // namespace matrix::detail
