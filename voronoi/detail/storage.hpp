// Raw storage of the engine's record arrays.
//
// ReallocateArray never returns on failure: it reports and ends the process
// (see fatal.hpp). RecordArray<T> is an index-addressed array of plain
// records with an explicit count, capacity and growth step; growing it may
// move the records, so the engine keeps indices, never pointers, across any
// operation that can append. Growth by one record adds the step or half the
// capacity, whichever is more: a fixed step would copy a large array once
// per step (when the allocator cannot grow it in place), quadratic in its
// size.
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace zt::vd {

// ptr null: count*size zeroed bytes; else resized to count*size bytes (new
// bytes not cleared). Sizes are computed in 64 bits.
void* ReallocateArray(void* ptr, std::int64_t count, std::int64_t size);
// count*size bytes, not cleared (as the bytes a growth adds).
void* AllocateArrayUncleared(std::int64_t count, std::int64_t size);
void FreeArray(void*& ptr);

template <typename T>
struct RecordArray {
  static_assert(std::is_trivially_copyable_v<T>);

  T* data = nullptr;
  std::int32_t count = 0;
  std::int32_t capacity = 0;

  T& operator[](std::int32_t i) { return data[i]; }
  const T& operator[](std::int32_t i) const { return data[i]; }

  // 0 <= i < count and count <= capacity.
  bool Valid(std::int32_t i) const { return i >= 0 && i < count && count <= capacity; }

  void Reserve(std::int64_t n) {
    if (n <= capacity) return;
    if (n > INT32_MAX) n = INT32_MAX;  // ReallocateArray reports what cannot be had
    data = static_cast<T*>(ReallocateArray(data, n, sizeof(T)));
    capacity = static_cast<std::int32_t>(n);
  }
  // Room for n records whose present contents are not wanted: an array
  // too small is given up and taken afresh, not cleared, rather than grown,
  // which would copy what was there (the records from count on are
  // undefined, as after any growth).
  void ReserveEmpty(std::int64_t n) {
    if (n <= capacity) return;
    Free();
    if (n > INT32_MAX) n = INT32_MAX;  // AllocateArrayUncleared reports what cannot be had
    data = static_cast<T*>(AllocateArrayUncleared(n, sizeof(T)));
    capacity = static_cast<std::int32_t>(n);
  }
  // The capacity after growing from a full array by at least `step`.
  std::int64_t GrownCapacity(std::int32_t step) const {
    return std::int64_t{capacity} + (capacity / 2 > step ? capacity / 2 : step);
  }
  // Makes room for one more record (see GrownCapacity).
  void EnsureOneMore(std::int32_t step) {
    if (count >= capacity) Reserve(GrownCapacity(step));
  }
  // A hint that record i is wanted soon: a traversal of the diagram hops
  // between records far apart in memory, and starting the next loads while
  // the current record is worked on hides most of their latency. Both cache
  // lines a record may straddle are requested, unconditionally: a test for
  // straddling is a branch mispredicted half the time, dearer than the
  // redundant hint. No effect on results.
  void Prefetch(std::int32_t i) const {
    if (i < 0 || i >= capacity) return;
    const char* p = reinterpret_cast<const char*>(data + i);
    __builtin_prefetch(p);
    __builtin_prefetch(p + sizeof(T) - 1);
  }
  std::int32_t Append(const T& value, std::int32_t step) {
    EnsureOneMore(step);
    data[count] = value;
    return count++;
  }
  void Free() {
    void* p = data;
    FreeArray(p);
    data = nullptr;
    count = 0;
    capacity = 0;
  }
};

// A scratch array of one thread (declared thread_local): its storage is
// freed when the thread ends.
template <typename T>
struct ThreadScratch : RecordArray<T> {
  ~ThreadScratch() { this->Free(); }
};

}  // namespace zt::vd
