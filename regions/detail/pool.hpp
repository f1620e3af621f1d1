// ChunkPool<T>: fixed-size records handed out by index from chunks that
// never move, so records may point at one another for the whole operation.
//
// Promises: record i lives in chunk i / chunkSize at slot i % chunkSize; a
// chunk is allocated (and its records default-constructed) when its first
// record is taken; reset() only sets the count to 0 and keeps every chunk, so
// a reused record holds whatever its last user left there and the taker must
// fill every field. take() returns null when storage cannot be had.
#pragma once

#include <cassert>
#include <cstdint>
#include <new>

namespace zt::detail {

// Test hook: when positive, the n-th chunk or table allocation from now on
// fails (counting down across all pools of the thread). Lets the tests prove
// that storage failure is an orderly -1 and never a crash.
inline thread_local std::int64_t tl_failAllocationAfter = 0;

inline bool allocationAllowed() {
  if (tl_failAllocationAfter <= 0) return true;
  return --tl_failAllocationAfter != 0;
}

template <typename T, std::int32_t kChunk = 512, std::int32_t kInitialTable = 512>
class ChunkPool {
 public:
  static constexpr std::int32_t kChunkSize = kChunk;
  ChunkPool() = default;
  ChunkPool(const ChunkPool&) = delete;
  ChunkPool& operator=(const ChunkPool&) = delete;
  ~ChunkPool() {
    for (std::int32_t i = 0; i < tableLength_; ++i) delete[] table_[i];
    delete[] table_;
  }

  std::int32_t count() const { return count_; }
  std::int32_t capacity() const { return capacity_; }
  void reset() { count_ = 0; }

  // The next record, or null on storage failure (the count is then unchanged).
  T* take() {
    const std::int32_t chunk = count_ / kChunk;
    if (chunk >= tableLength_ && !growTable()) return nullptr;
    if (!table_[chunk]) {
      if (!allocationAllowed()) return nullptr;
      table_[chunk] = new (std::nothrow) T[static_cast<std::size_t>(kChunk)];
      if (!table_[chunk]) return nullptr;
    }
    T* r = &table_[chunk][count_ % kChunk];
    ++count_;
    return r;
  }

  T& operator[](std::int32_t i) {
    assert(i >= 0 && i < count_);
    return table_[i / kChunk][i % kChunk];
  }
  const T& operator[](std::int32_t i) const {
    assert(i >= 0 && i < count_);
    return table_[i / kChunk][i % kChunk];
  }

 private:
  bool growTable() {
    const std::int32_t grown = tableLength_ == 0 ? kInitialTable : tableLength_ + kChunk;
    if (!allocationAllowed()) return false;
    T** fresh = new (std::nothrow) T*[static_cast<std::size_t>(grown)];
    if (!fresh) return false;
    for (std::int32_t i = 0; i < grown; ++i) fresh[i] = i < tableLength_ ? table_[i] : nullptr;
    delete[] table_;
    table_ = fresh;
    tableLength_ = grown;
    capacity_ = tableLength_ * kChunk;
    return true;
  }

  std::int32_t tableLength_ = 0;
  std::int32_t capacity_ = 0;
  std::int32_t count_ = 0;
  T** table_ = nullptr;
};

}  // namespace zt::detail
