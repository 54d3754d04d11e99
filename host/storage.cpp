// Element storage: the allocation-failure budget, per-thread recycling of
// small heap chunks, and the large-block allocator (mappings with
// transparent huge pages and a bounded cache of freed blocks).
//
// Why: the first touch of a fresh page is expensive on these machines, so a
// large result written into fresh memory runs far below memcpy speed. Freed
// large blocks are therefore kept (up to a bound) and handed out again with
// their pages already resident, and fresh large mappings ask for huge pages,
// which cost one fault per 2 MiB instead of per 4 KiB.
#include "host/storage.hpp"
#include "host/host_control.hpp"

#include <sanitizer/asan_interface.h>
#include <sys/mman.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <mutex>
#include <new>
#include <vector>

namespace host {

namespace {

#ifdef __SANITIZE_ADDRESS__
// Under AddressSanitizer every chunk goes straight to malloc and free, so a
// use after free is caught rather than hidden by recycling.
constexpr bool kRecycleChunks = false;
#else
constexpr bool kRecycleChunks = true;
#endif

std::atomic<std::size_t> pendingSuccesses{0};
std::atomic<std::size_t> pendingFailures{0};
std::atomic<std::size_t> storageLimit{0};  // 0: none

// ---------------------------------------------------------------------------
// Small heap chunks, recycled per thread in power-of-two size classes.

constexpr std::size_t kSmallestChunkClass = 128;
constexpr std::size_t kChunkClassCount = 10;  // 128 B .. 64 KiB
constexpr std::size_t kLargestRecycledChunk = kSmallestChunkClass << (kChunkClassCount - 1);
constexpr std::size_t kChunksKeptPerClass = 16;

// The class index of a chunk of `bytes`, and that class's size.
std::size_t chunkClass(std::size_t bytes) {
    const std::size_t rounded = std::bit_ceil(std::max(bytes, kSmallestChunkClass));
    return static_cast<std::size_t>(std::countr_zero(rounded) -
                                    std::countr_zero(kSmallestChunkClass));
}
std::size_t chunkClassBytes(std::size_t index) { return kSmallestChunkClass << index; }

struct FreeChunk {
    FreeChunk* next;
};

class ChunkRecycler {
public:
    ChunkRecycler() = default;
    ChunkRecycler(const ChunkRecycler&) = delete;
    ChunkRecycler& operator=(const ChunkRecycler&) = delete;
    // Frees the kept chunks and keeps no more: arrays destroyed later on this
    // thread (static ones at exit) give their chunks straight back to free.
    ~ChunkRecycler() {
        for (std::size_t index = 0; index < kChunkClassCount; ++index) {
            while (FreeChunk* head = heads_[index]) {
                heads_[index] = head->next;
                std::free(head);
            }
            counts_[index] = kChunksKeptPerClass;
        }
    }

    void* take(std::size_t index) {
        FreeChunk* chunk = heads_[index];
        if (!chunk) return nullptr;
        heads_[index] = chunk->next;
        --counts_[index];
        return chunk;
    }

    bool keep(void* memory, std::size_t index) {
        if (counts_[index] == kChunksKeptPerClass) return false;
        auto* chunk = static_cast<FreeChunk*>(memory);
        chunk->next = heads_[index];
        heads_[index] = chunk;
        ++counts_[index];
        return true;
    }

private:
    std::array<FreeChunk*, kChunkClassCount> heads_{};
    std::array<std::size_t, kChunkClassCount> counts_{};
};

// The host library is loaded with the program, so its thread-local state can
// use the initial-exec model: no __tls_get_addr call per access.
[[gnu::tls_model("initial-exec")]] thread_local ChunkRecycler perThreadRecycler;

ChunkRecycler& recycler() { return perThreadRecycler; }

// ---------------------------------------------------------------------------
// Large blocks: mappings, huge pages, and the cache of freed blocks.

constexpr std::size_t kPageBytes = std::size_t{4} << 10;
constexpr std::size_t kHugePageBytes = std::size_t{2} << 20;
// The header sits just below a 64-byte boundary of the mapping, so the
// elements start cache-line aligned.
constexpr std::size_t kMappedDataOffset = 64;
static_assert(sizeof(StorageBlock) <= kMappedDataOffset);

// Bounds of the cache: enough for the arrays of a few large calls in flight
// (operands converted, a result, its conversion back), small against the
// machine's memory.
constexpr std::size_t kCachedBytesLimit = std::size_t{512} << 20;
constexpr std::size_t kCachedBlocksLimit = 32;

std::size_t roundUp(std::size_t value, std::size_t granule) {
    return (value + granule - 1) / granule * granule;
}

void unmapBlock(StorageBlock* block) {
    void* mapping = block->allocation;
    const std::size_t length = block->allocationBytes;
    ASAN_UNPOISON_MEMORY_REGION(mapping, length);
    munmap(mapping, length);
}

// A fresh mapping holding at least `bytes` usable bytes. Mappings of 2 MiB
// and more are aligned to 2 MiB and advised to use huge pages.
StorageBlock* mapBlock(std::size_t bytes) {
    if (bytes > (std::size_t{1} << 46)) return nullptr;
    const bool huge = bytes + kMappedDataOffset >= kHugePageBytes;
    const std::size_t length =
        roundUp(bytes + kMappedDataOffset, huge ? kHugePageBytes : kPageBytes);
    const std::size_t request = huge ? length + kHugePageBytes : length;
    void* raw = mmap(nullptr, request, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (raw == MAP_FAILED) return nullptr;
    auto* start = static_cast<std::byte*>(raw);
    if (huge) {
        const auto address = reinterpret_cast<std::uintptr_t>(raw);
        const std::size_t head = roundUp(address, kHugePageBytes) - address;
        if (head != 0) munmap(start, head);
        if (kHugePageBytes - head != 0) munmap(start + head + length, kHugePageBytes - head);
        start += head;
        madvise(start, length, MADV_HUGEPAGE);
    }
    auto* block = new (start + kMappedDataOffset - sizeof(StorageBlock)) StorageBlock;
    block->capacity = length - kMappedDataOffset;
    block->allocation = start;
    block->allocationBytes = length;
    block->mapped = true;
    return block;
}

class LargeBlockCache {
public:
    // The smallest cached block that holds `bytes` without wasting more than
    // half of itself, or null.
    StorageBlock* take(std::size_t bytes) {
        std::lock_guard lock(mutex_);
        auto best = blocks_.end();
        for (auto it = blocks_.begin(); it != blocks_.end(); ++it) {
            const std::size_t capacity = (*it)->capacity;
            if (capacity >= bytes && capacity / 2 <= bytes &&
                (best == blocks_.end() || capacity < (*best)->capacity)) {
                best = it;
            }
        }
        if (best == blocks_.end()) return nullptr;
        StorageBlock* block = *best;
        blocks_.erase(best);
        cachedBytes_ -= block->allocationBytes;
        return block;
    }

    // Keeps `block` for reuse, giving back the oldest blocks beyond the bounds.
    void give(StorageBlock* block) {
        std::vector<StorageBlock*> evicted;
        {
            std::lock_guard lock(mutex_);
            blocks_.push_back(block);
            cachedBytes_ += block->allocationBytes;
            while (cachedBytes_ > kCachedBytesLimit || blocks_.size() > kCachedBlocksLimit) {
                evicted.push_back(blocks_.front());
                cachedBytes_ -= blocks_.front()->allocationBytes;
                blocks_.erase(blocks_.begin());
            }
        }
        for (StorageBlock* old : evicted) unmapBlock(old);
    }

private:
    std::mutex mutex_;
    std::vector<StorageBlock*> blocks_;  // oldest first
    std::size_t cachedBytes_ = 0;
};

// Never destroyed: arrays may be released during static destruction.
LargeBlockCache& largeBlocks() {
    static LargeBlockCache* cache = new LargeBlockCache;
    return *cache;
}

StorageBlock* acquireLargeBlock(std::size_t bytes) {
    StorageBlock* block = largeBlocks().take(bytes);
    if (!block) block = mapBlock(bytes);
    if (!block) return nullptr;
    ASAN_UNPOISON_MEMORY_REGION(block->allocation, block->allocationBytes);
    // Bytes past the request are not the caller's to touch.
    ASAN_POISON_MEMORY_REGION(block->data() + bytes, block->capacity - bytes);
    block->references.store(1, std::memory_order_relaxed);
    return block;
}

}  // namespace

void failNextAllocations(std::size_t count, std::size_t after) {
    pendingSuccesses.store(count == 0 ? 0 : after);
    pendingFailures.store(count);
}

void limitStorageBytes(std::size_t bytes) { storageLimit.store(bytes); }

bool allocationPermitted() noexcept {
    std::size_t successes = pendingSuccesses.load(std::memory_order_relaxed);
    while (successes != 0) {
        if (pendingSuccesses.compare_exchange_weak(successes, successes - 1)) return true;
    }
    std::size_t pending = pendingFailures.load(std::memory_order_relaxed);
    while (pending != 0) {
        if (pendingFailures.compare_exchange_weak(pending, pending - 1)) return false;
    }
    return true;
}

void* allocateChunk(std::size_t bytes) noexcept {
    if (kRecycleChunks && bytes <= kLargestRecycledChunk) {
        const std::size_t index = chunkClass(bytes);
        if (void* chunk = recycler().take(index)) return chunk;
        return std::malloc(chunkClassBytes(index));
    }
    return std::malloc(bytes);
}

void freeChunk(void* chunk, std::size_t bytes) noexcept {
    if (kRecycleChunks && bytes <= kLargestRecycledChunk &&
        recycler().keep(chunk, chunkClass(bytes))) {
        return;
    }
    std::free(chunk);
}

StorageBlock* placeStorageInChunk(void* where, std::size_t capacity, void* chunk,
                                  std::size_t chunkBytes) noexcept {
    auto* block = new (where) StorageBlock;
    block->capacity = capacity;
    block->allocation = chunk;
    block->allocationBytes = chunkBytes;
    return block;
}

StorageBlock* placeLentStorageInChunk(void* where, void* chunk, std::size_t chunkBytes,
                                      void (*returnLent)(void*) noexcept, void* owner) noexcept {
    StorageBlock* block = placeStorageInChunk(where, 0, chunk, chunkBytes);
    block->returnLent = returnLent;
    block->lentOwner = owner;
    return block;
}

StorageBlock* allocateStorage(std::size_t bytes) noexcept {
    if (!allocationPermitted()) return nullptr;
    const std::size_t limit = storageLimit.load(std::memory_order_relaxed);
    if (limit != 0 && bytes > limit) return nullptr;
    if (bytes >= kLargeBlockBytes) return acquireLargeBlock(bytes);
    const std::size_t chunkBytes = sizeof(StorageBlock) + bytes;
    void* chunk = allocateChunk(chunkBytes);
    if (!chunk) return nullptr;
    return placeStorageInChunk(chunk, bytes, chunk, chunkBytes);
}

void retainStorage(StorageBlock* block) noexcept {
    block->references.fetch_add(1, std::memory_order_relaxed);
}

void releaseStorage(StorageBlock* block) noexcept {
    // A sole owner needs no atomic decrement: nobody else can take a reference.
    if (block->references.load(std::memory_order_acquire) != 1 &&
        block->references.fetch_sub(1, std::memory_order_acq_rel) != 1) {
        return;
    }
    if (block->mapped) {
        ASAN_POISON_MEMORY_REGION(block->data(), block->capacity);
        largeBlocks().give(block);
    } else {
        if (block->returnLent) block->returnLent(block->lentOwner);
        void* chunk = block->allocation;
        const std::size_t chunkBytes = block->allocationBytes;
        block->~StorageBlock();
        freeChunk(chunk, chunkBytes);
    }
}

}  // namespace host
