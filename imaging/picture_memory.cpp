#include "imaging/picture_memory.h"

#include <sys/mman.h>

#include <algorithm>
#include <cstdint>
#include <mutex>
#include <new>
#include <vector>

#ifdef __GLIBC__
#include <malloc.h>
#endif

#include "imaging/memory_budget.h"

// Under AddressSanitizer every block comes from the heap, so that the sanitizer sees each
// picture's bounds and every use after free.
#if defined(__SANITIZE_ADDRESS__)
#define QUILLANE_PLAIN_PICTURE_MEMORY 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define QUILLANE_PLAIN_PICTURE_MEMORY 1
#endif
#endif

namespace quillane {
namespace {

constexpr std::size_t kHugePage = std::size_t{2} << 20;
constexpr std::size_t kPage = 4096;
constexpr std::align_val_t kHeapAlignment{64};
constexpr std::size_t kMostKeptBytes = std::size_t{1} << 30;

// The size a block of bytes really takes: whole pages, and whole huge pages from two of them
// on. Blocks are reused only for the same capacity, so pictures of nearly the same size share.
std::size_t Capacity(std::size_t bytes) {
  const std::size_t unit = bytes >= 2 * kHugePage ? kHugePage : kPage;
  return (bytes + unit - 1) / unit * unit;
}

struct Block {
  void* memory = nullptr;
  std::size_t capacity = 0;
};

struct Pool {
  std::mutex mutex;
  std::vector<Block> kept;  // most recently freed last
  std::size_t keptBytes = 0;
  std::size_t keepLimit = 0;  // 0 until the program sets itself up
};

Pool& ThePool() {
  static Pool* pool = new Pool;  // never destroyed: blocks may be freed during exit
  return *pool;
}

void Unmap(const Block& b) {
  ::munmap(b.memory, b.capacity);
}

[[maybe_unused]] void* Map(std::size_t capacity) {
  const bool huge = capacity % kHugePage == 0;
  const std::size_t length = capacity + (huge ? kHugePage : 0);
  void* p = ::mmap(nullptr, length, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (p == MAP_FAILED && huge) {
    // Under a tight address-space limit the room for aligning may be what is missing.
    p = ::mmap(nullptr, capacity, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    return p == MAP_FAILED ? nullptr : p;
  }
  if (p == MAP_FAILED) return nullptr;
  if (!huge) return p;
  // Cut the mapping to huge-page boundaries so that the whole block can use them.
  const auto start = reinterpret_cast<std::uintptr_t>(p);
  const std::uintptr_t aligned = (start + kHugePage - 1) & ~(kHugePage - 1);
  if (aligned > start) ::munmap(p, aligned - start);
  const std::uintptr_t end = aligned + capacity;
  if (start + length > end) ::munmap(reinterpret_cast<void*>(end), start + length - end);
  ::madvise(reinterpret_cast<void*>(aligned), capacity, MADV_HUGEPAGE);
  return reinterpret_cast<void*>(aligned);
}

// Unmaps kept blocks that `drop` selects; the caller holds the mutex.
template <typename Drop>
void DropKept(Pool& pool, Drop&& drop) {
  auto keep = pool.kept.begin();
  for (const Block& b : pool.kept) {
    if (drop(b)) {
      Unmap(b);
      pool.keptBytes -= b.capacity;
    } else {
      *keep++ = b;
    }
  }
  pool.kept.erase(keep, pool.kept.end());
}

}  // namespace

void* AllocatePictureBytes(std::size_t bytes) {
#ifndef QUILLANE_PLAIN_PICTURE_MEMORY
  if (bytes >= kPictureBlockBytes) {
    const std::size_t capacity = Capacity(bytes);
    Pool& pool = ThePool();
    {
      const std::lock_guard lock(pool.mutex);
      for (auto b = pool.kept.rbegin(); b != pool.kept.rend(); ++b) {
        if (b->capacity != capacity) continue;
        void* memory = b->memory;
        pool.keptBytes -= capacity;
        pool.kept.erase(std::next(b).base());
        return memory;
      }
    }
    if (void* memory = Map(capacity)) return memory;
    // Kept blocks of other sizes may be what stands in the way.
    ReleasePictureMemory();
    if (void* memory = Map(capacity)) return memory;
    throw std::bad_alloc();
  }
#endif
  return ::operator new(bytes, kHeapAlignment);
}

void FreePictureBytes(void* memory, [[maybe_unused]] std::size_t bytes) noexcept {
  if (memory == nullptr) return;
#ifndef QUILLANE_PLAIN_PICTURE_MEMORY
  if (bytes >= kPictureBlockBytes) {
    const Block block{memory, Capacity(bytes)};
    Pool& pool = ThePool();
    const std::lock_guard lock(pool.mutex);
    if (block.capacity > pool.keepLimit) {
      Unmap(block);
      return;
    }
    pool.kept.push_back(block);
    pool.keptBytes += block.capacity;
    // The oldest go first.
    while (pool.keptBytes > pool.keepLimit ||
           pool.kept.size() > static_cast<std::size_t>(kKeptPictureBlocks)) {
      Unmap(pool.kept.front());
      pool.keptBytes -= pool.kept.front().capacity;
      pool.kept.erase(pool.kept.begin());
    }
    return;
  }
#endif
  ::operator delete(memory, kHeapAlignment);
}

void SetUpPictureMemory() {
  const std::int64_t available = AvailableMemory();
  Pool& pool = ThePool();
  const std::lock_guard lock(pool.mutex);
  pool.keepLimit = static_cast<std::size_t>(
      std::clamp<std::int64_t>(available / 4, 0, static_cast<std::int64_t>(kMostKeptBytes)));
}

void ReleasePictureMemory(std::size_t fittingBytes) {
  const std::size_t fitting = fittingBytes == 0 ? 0 : Capacity(fittingBytes);
  {
    Pool& pool = ThePool();
    const std::lock_guard lock(pool.mutex);
    DropKept(pool, [&](const Block& b) { return b.capacity != fitting; });
  }
#ifdef __GLIBC__
  ::malloc_trim(0);
#endif
}

std::size_t KeptPictureBytes() {
  Pool& pool = ThePool();
  const std::lock_guard lock(pool.mutex);
  return pool.keptBytes;
}

}  // namespace quillane
