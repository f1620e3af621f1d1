// Tracked allocator: header layout, counters and the registry of blocks.
#include "runtime/tracked_alloc.hpp"

#include <cstdlib>
#include <cstring>
#include <limits>
#include <unordered_map>

#include "runtime/diagnostics.hpp"

namespace zt {
namespace {

struct BlockHeader {
  std::uint64_t size;
  std::uint32_t kind;
  std::uint32_t serial;
};
static_assert(sizeof(BlockHeader) == 16);

constexpr std::uint64_t kDefaultPermanentMaximum = 4294967295ull;

struct Registry {
  std::uint64_t bytes_in_use = 0;
  std::uint64_t permanent_bytes = 0;
  std::uint32_t next_serial = 0;
  std::uint64_t permanent_maximum = kDefaultPermanentMaximum;
  // Block address -> true while live, false once released. A released
  // address is forgotten again when the system hands it out anew.
  std::unordered_map<const void*, bool> blocks;
};

Registry& registry() {
  static Registry* r = new Registry;  // never destroyed: blocks may outlive statics
  return *r;
}

BlockHeader* header_of(void* block) {
  return reinterpret_cast<BlockHeader*>(static_cast<char*>(block) - sizeof(BlockHeader));
}

bool exceeds_permanent_maximum(std::uint64_t permanent_after, std::uint64_t n) {
  return n >= kPermanentCheckThreshold && permanent_after >= registry().permanent_maximum;
}

void count(std::uint32_t kind, std::uint64_t added, std::uint64_t removed) {
  Registry& r = registry();
  r.bytes_in_use = r.bytes_in_use + added - removed;
  if (kind == kBlockPermanent) r.permanent_bytes = r.permanent_bytes + added - removed;
}

void* allocate(std::uint32_t kind, std::uint64_t n) {
  Registry& r = registry();
  if (kind == kBlockPermanent && exceeds_permanent_maximum(r.permanent_bytes + n, n)) {
    diagnose_warning(format_text("_Wmalloc: allocating %llu bytes would exceed maximum of %llu",
                                 static_cast<unsigned long long>(n),
                                 static_cast<unsigned long long>(r.permanent_maximum)));
    return nullptr;
  }
  void* raw = n > std::numeric_limits<std::size_t>::max() - sizeof(BlockHeader)
                  ? nullptr
                  : std::malloc(static_cast<std::size_t>(n) + sizeof(BlockHeader));
  if (raw == nullptr) {
    diagnose_warning(format_text("_Wmalloc: unable to allocate %llu bytes",
                                 static_cast<unsigned long long>(n)));
    return nullptr;
  }
  auto* h = static_cast<BlockHeader*>(raw);
  *h = BlockHeader{n, kind, r.next_serial++};
  count(kind, n, 0);
  void* block = h + 1;
  r.blocks[block] = true;
  return block;
}

// Kind of a block as far as it can be known without reading freed memory.
std::uint32_t known_kind(void* block) {
  const auto it = registry().blocks.find(block);
  if (it == registry().blocks.end()) return 0;
  if (!it->second) return kBlockFreed;
  return header_of(block)->kind;
}

}  // namespace

void* _Wmalloc(std::uint64_t n) { return allocate(kBlockTemporary, n); }
void* permanent_alloc(std::uint64_t n) { return allocate(kBlockPermanent, n); }

std::int32_t tracked_free(void* block) {
  if (block == nullptr) return 0;
  const std::uint32_t kind = known_kind(block);
  if (kind == kBlockFreed) {
    diagnose_fatal("Trying to free previously freed memory");
    return -1;
  }
  if (kind != kBlockTemporary && kind != kBlockPermanent) {
    diagnose_fatal("Trying to free unallocated or corrupt memory");
    return -1;
  }
  BlockHeader* h = header_of(block);
  count(kind, 0, h->size);
  h->kind = kBlockFreed;
  registry().blocks[block] = false;
  std::free(h);
  return 0;
}

void* _Wrealloc(std::uint32_t kind, void* block, std::uint64_t n) {
  if (block == nullptr) return allocate(kind, n);
  const std::uint32_t found = known_kind(block);
  if (found != kind) {
    const std::uint32_t serial =
        (found == kBlockTemporary || found == kBlockPermanent) ? header_of(block)->serial : 0;
    const char* text = found == kBlockPermanent   ? "Trying to reallocp permanent allocated memory#%u"
                       : found == kBlockTemporary ? "Trying to reallocp temporary allocated memory#%u"
                       : found == kBlockFreed     ? "Trying to reallocp previously freed memory #%u"
                                                  : "Trying to reallocp unallocated or corrupt memory #%u";
    diagnose_fatal(format_text(text, serial));
    return nullptr;
  }
  Registry& r = registry();
  BlockHeader* h = header_of(block);
  const std::uint64_t old_size = h->size;
  if (kind == kBlockPermanent &&
      exceeds_permanent_maximum(r.permanent_bytes - old_size + n, n))
    return nullptr;
  const BlockHeader saved = *h;
  void* raw = n > std::numeric_limits<std::size_t>::max() - sizeof(BlockHeader)
                  ? nullptr
                  : std::realloc(h, static_cast<std::size_t>(n) + sizeof(BlockHeader));
  if (raw == nullptr) {
    // realloc failed and left the block alone; a fresh block may still be had.
    raw = n > std::numeric_limits<std::size_t>::max() - sizeof(BlockHeader)
              ? nullptr
              : std::malloc(static_cast<std::size_t>(n) + sizeof(BlockHeader));
    if (raw == nullptr) {
      diagnose_warning(format_text("_Wrealloc: unable to increase size from %llu to %llu.",
                                   static_cast<unsigned long long>(old_size),
                                   static_cast<unsigned long long>(n)));
      return nullptr;
    }
    std::memcpy(raw, h, sizeof(BlockHeader) + static_cast<std::size_t>(old_size < n ? old_size : n));
    std::free(h);
  }
  auto* moved = static_cast<BlockHeader*>(raw);
  *moved = BlockHeader{n, kind, saved.serial};
  count(kind, n, old_size);
  void* result = moved + 1;
  if (result != block) {
    r.blocks[block] = false;
    r.blocks[result] = true;
  }
  return result;
}

TrackedCounters tracked_counters() {
  const Registry& r = registry();
  return {r.bytes_in_use, r.permanent_bytes, r.next_serial, r.permanent_maximum};
}

void set_permanent_maximum(std::uint64_t maximum) { registry().permanent_maximum = maximum; }

}  // namespace zt
