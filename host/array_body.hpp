// The host's private part of an array record (host::ArrayBody) and the
// record operations the rest of the host builds on: making records with
// storage, sharing storage, sizes, and the elements of string and cell
// arrays. Private to the host.
#pragma once

#include "host/storage.hpp"
#include "host/string_helpers.hpp"
#include "host/zq_array.hpp"

#include <atomic>
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace host {

// The elements of a string array, with the view that readers get.
struct StringElements {
    std::vector<std::u16string> texts;
    std::vector<Kestrelon::String::TextRecord> records;
    std::vector<const Kestrelon::String::TextRecord*> slots;  // null: missing
    std::vector<std::uint64_t> dims;
    Kestrelon::String::StringArray view{};
};

// The elements of a cell array, owned by the array.
struct CellElements {
    std::vector<zqArraySlot> cells;
};

struct ArrayBody {
    static constexpr std::size_t kInlineDims = 4;

    std::atomic<std::size_t> references{1};
    StorageBlock* real = nullptr;       // storage of the real elements
    StorageBlock* imaginary = nullptr;  // storage of the imaginary part, if complex
    void* recordChunk = nullptr;        // heap chunk of the record, unless it lives in real's
    zqClassID trueClass = zqNoClass;    // the class behind a stored opaque id

    // The true sizes, for records that keep them behind a pointer and for
    // records whose sizes are incomplete. Up to kInlineDims held in place.
    unsigned long ndims = 0;
    unsigned long inlineDims[kInlineDims] = {};
    std::unique_ptr<unsigned long[]> heapDims;
    // The sizes shown while the dimensions are incomplete.
    std::unique_ptr<unsigned long[]> placeholderDims;

    // String or cell elements, shared by shared copies.
    std::shared_ptr<const StringElements> strings;
    std::shared_ptr<const CellElements> cells;

    unsigned long* dims() { return heapDims ? heapDims.get() : inlineDims; }
    const unsigned long* dims() const { return heapDims ? heapDims.get() : inlineDims; }
};

// The sizes of a record as the host shows them: `given` sizes read from
// `sizes`, padded with 1s up to `count`.
struct DimsView {
    const unsigned long* sizes;
    unsigned long given;
    unsigned long count;

    unsigned long operator[](unsigned long i) const { return i < given ? sizes[i] : 1; }
};

// `count` for `given` sizes normalised: fewer than 2 padded to 2, trailing 1s
// beyond the second dropped.
DimsView normaliseDims(unsigned long given, const unsigned long* sizes);

// A new record of class `cls` with the sizes `dims` (normalised) and
// uninitialised storage for its elements, plus an imaginary part when
// `complex`; flags as the host sets them. Null when memory can't be had or
// the size overflows. Any class may be asked for; classes that hold no
// elements get no storage.
zqArray_tag* newArray(zqClassID cls, DimsView dims, bool complex) noexcept;

// A new record of class `cls` (numeric or logical) with the sizes `dims`
// (normalised) reading the elements at `data`, which stay their owner's: a
// lent block stands for them and calls `returnLent(owner)` when the last
// record reading them is gone. Null when memory can't be had; `returnLent`
// has not run then.
zqArray_tag* newArrayOverLent(zqClassID cls, DimsView dims, void* data,
                              void (*returnLent)(void*) noexcept, void* owner) noexcept;

// A new record with the class, flags and sizes of `source` that shares its
// storage and elements; null when memory can't be had.
zqArray_tag* newSharingRecord(const zqArray_tag& source) noexcept;

// Stores `dims` in the record: in place with the two-dimensional flag for two
// sizes (unless `keepPointer`), otherwise behind the pointer. False when the
// sizes can't be held (memory).
bool storeDimensions(zqArray_tag& array, DimsView dims, bool keepPointer) noexcept;

// The true sizes of a record whatever its state (incomplete included), and
// their product.
DimsView trueDimensions(const zqArray_tag& array);
unsigned long trueElementCount(const zqArray_tag& array);

// The true class of a record: the stored id, or the class behind an opaque id.
zqClassID trueClassOf(const zqArray_tag& array);

// Completes incomplete sizes, if they are.
void completeDimensions(const zqArray_tag& array);

}  // namespace host
