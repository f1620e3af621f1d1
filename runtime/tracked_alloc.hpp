// Tracked allocation: every block carries a 16-byte header with its size, its
// kind (temporary, permanent, freed) and a serial number; the process counts
// the bytes in use and catches double frees and reallocations of the wrong
// kind through the fatal handler.
//
// Promises: sizes are 64-bit; a failure to allocate is a warning and a null
// result; a block handed to free or realloc is first looked up among the live
// blocks, so a stray or already released pointer is diagnosed without its
// memory being read.
#pragma once

#include <cstdint>

namespace zt {

inline constexpr std::uint32_t kBlockTemporary = 0x7C0DCAB4u;
inline constexpr std::uint32_t kBlockPermanent = 0x75A5A5A5u;
inline constexpr std::uint32_t kBlockFreed = 0x7D0ECBB5u;

// Below this size a permanent allocation is never refused by the maximum.
inline constexpr std::uint64_t kPermanentCheckThreshold = 1025;

void* _Wmalloc(std::uint64_t n);
void* permanent_alloc(std::uint64_t n);
// Resizes a block of `kind`; a null block is allocated afresh.
void* _Wrealloc(std::uint32_t kind, void* block, std::uint64_t n);
// 0, or -1 after a fatal diagnostic (when the fatal handler returns).
std::int32_t tracked_free(void* block);

struct TrackedCounters {
  std::uint64_t bytes_in_use;
  std::uint64_t permanent_bytes;
  std::uint32_t next_serial;
  std::uint64_t permanent_maximum;
};
TrackedCounters tracked_counters();
// The program keeps the default (4294967295); tests lower it.
void set_permanent_maximum(std::uint64_t maximum);

}  // namespace zt
