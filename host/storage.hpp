// Element storage of host arrays: reference-counted blocks that several
// records may share, the allocator behind them (small chunks from the heap,
// large blocks mapped with transparent huge pages and kept for reuse), blocks
// over elements lent by another owner, and the allocation failures that tests
// ask for. Private to the host.
#pragma once

#include <atomic>
#include <cstddef>

namespace host {

// A block of element storage, shared by every record that reads its
// elements from it. The elements follow the header, 16-byte aligned (64 for
// large blocks), except in a lent block: there they are another owner's, and
// the records read them through their own data pointers.
struct alignas(16) StorageBlock {
    std::atomic<std::size_t> references{1};
    std::size_t capacity = 0;         // usable bytes at data()
    void* allocation = nullptr;       // the heap chunk or mapping holding the block
    std::size_t allocationBytes = 0;  // its size
    bool mapped = false;              // from the large-block allocator
    // A lent block: given back by `returnLent(lentOwner)` with the last reference.
    void (*returnLent)(void* owner) noexcept = nullptr;
    void* lentOwner = nullptr;

    std::byte* data() { return reinterpret_cast<std::byte*>(this + 1); }
};

// Storage blocks of at least this many bytes are mapped and recycled; smaller
// ones come from the heap and may share one chunk with their record.
inline constexpr std::size_t kLargeBlockBytes = std::size_t{32} << 10;

// Takes one allocation from the budget that failNextAllocations() set up;
// false when this allocation is to fail.
bool allocationPermitted() noexcept;

// A heap chunk of `bytes`, 16-byte aligned, or null. Small chunks are
// recycled per thread, so a record and its storage cost no trip to malloc in
// a steady state.
void* allocateChunk(std::size_t bytes) noexcept;
void freeChunk(void* chunk, std::size_t bytes) noexcept;

// A free-standing block of at least `bytes` usable bytes with one reference,
// or null. Counts as one allocation.
StorageBlock* allocateStorage(std::size_t bytes) noexcept;

// Places a block header at `where` inside a heap chunk of `chunkBytes` at
// `chunk`; the block's memory is the chunk's.
StorageBlock* placeStorageInChunk(void* where, std::size_t capacity, void* chunk,
                                  std::size_t chunkBytes) noexcept;

// Makes the block at `where` inside a heap chunk a lent block: it holds no
// elements, and its last release calls `returnLent(owner)` and frees the chunk.
StorageBlock* placeLentStorageInChunk(void* where, void* chunk, std::size_t chunkBytes,
                                      void (*returnLent)(void*) noexcept, void* owner) noexcept;

void retainStorage(StorageBlock* block) noexcept;
// Drops one reference; the last one gives the memory back (to the
// large-block cache for mapped blocks).
void releaseStorage(StorageBlock* block) noexcept;

}  // namespace host
