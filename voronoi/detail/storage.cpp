// Allocation of the engine's arrays and its fatal-error path.
#include "voronoi/detail/storage.hpp"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#if defined(__linux__)
#include <sys/mman.h>
#endif

#include "core/fatal_gate.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/fatal.hpp"

namespace zt::vd {
namespace {

// Arrays of this size or more are backed by huge pages where the system
// offers them on request. The diagram's traversals jump between records
// spread over tens of megabytes; with small pages nearly every such jump
// also misses the address translation cache. Contents are unaffected.
constexpr std::int64_t kHugePageArrayBytes = std::int64_t{8} << 20;
constexpr std::uintptr_t kSmallPageBytes = 4096;

void AdviseHugePages(void* block, std::int64_t bytes) {
#if defined(__linux__) && defined(MADV_HUGEPAGE)
  if (bytes < kHugePageArrayBytes) return;
  // The advice covers whole small pages from the block's first to its last,
  // which for a block of this size is the allocator's own mapping: advising
  // only part of it would split the mapping, and a later growth could then
  // no longer remap it in place but would have to copy it.
  const auto begin = reinterpret_cast<std::uintptr_t>(block);
  const std::uintptr_t first = begin & ~(kSmallPageBytes - 1);
  const std::uintptr_t last = (begin + static_cast<std::uintptr_t>(bytes) + kSmallPageBytes - 1) & ~(kSmallPageBytes - 1);
  // Only advice: a refusal leaves ordinary pages, which work the same.
  (void)madvise(reinterpret_cast<void*>(first), last - first, MADV_HUGEPAGE);
#else
  (void)block;
  (void)bytes;
#endif
}

}  // namespace

void VdFatal(const char* message) {
  claim_fatal_end();  // one report and one status when threads fail at once
  Vd().errorFlag = true;
  std::fprintf(stdout, "\nerror in %s\n", message);
  std::fflush(stdout);
  std::fprintf(stderr, "\nerror in %s\n", message);
  std::fflush(stderr);
  std::exit(kFatalExitStatus);
}

void* ReallocateArray(void* ptr, std::int64_t count, std::int64_t size) {
  const bool fresh = ptr == nullptr;
  void* block = nullptr;
  const std::int64_t bytes = count * size;
  if (count >= 0 && size > 0 && count <= INT32_MAX && bytes > 0) {
    block = fresh ? std::calloc(static_cast<std::size_t>(count), static_cast<std::size_t>(size))
                  : std::realloc(ptr, static_cast<std::size_t>(bytes));
  }
  if (block) AdviseHugePages(block, bytes);
  if (!block) {
    std::fprintf(stderr, "ReallocateArray() - Cannot get %d elements of %d bytes...\n",
                 static_cast<int>(count), static_cast<int>(size));
    VdFatal(fresh ? "ReallocateArray() - memory allocation failed!\n"
                  : "ReallocateArray() - memory reallocation failed!\n");
  }
  return block;
}

void* AllocateArrayUncleared(std::int64_t count, std::int64_t size) {
  const std::int64_t bytes = count * size;
  void* block = nullptr;
  // Cleared memory costs a pass over the whole block when the allocator
  // recycles it; a fresh array whose records are all written before they
  // are read does not need it.
  if (count >= 0 && size > 0 && count <= INT32_MAX && bytes > 0) block = std::malloc(static_cast<std::size_t>(bytes));
  if (!block) {
    std::fprintf(stderr, "AllocateArrayUncleared() - Cannot get %d elements of %d bytes...\n",
                 static_cast<int>(count), static_cast<int>(size));
    VdFatal("AllocateArrayUncleared() - memory allocation failed!\n");
  }
  AdviseHugePages(block, bytes);
  return block;
}

void FreeArray(void*& ptr) {
  std::free(ptr);
  ptr = nullptr;
}

}  // namespace zt::vd
