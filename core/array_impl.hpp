// Array<T>: the growable array of the zone builder and the engines.
//
// Promises, which the rest of the system relies on:
//  - count and capacity are 32-bit signed; each array has its own growth step
//    (elements, not a factor) used by Add;
//  - storage always holds `capacity` constructed elements; clearing (count = 0)
//    keeps the storage, which never shrinks while the array lives;
//  - every failure (no storage, a capacity beyond 32 bits, a bad index) ends
//    the process through FatalError's report with exit status 1; nothing is
//    returned or thrown.
// Add and AddDoubling accept an element of the same array as their value.
#pragma once

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <new>

#include "core/fatal_gate.hpp"

namespace zt {

// Line numbers the fatal report names for each operation; the calling suite's
// support staff recognise failures by them.
namespace array_lines {
inline constexpr int kConstruct = 35;
inline constexpr int kAt = 59;
inline constexpr int kAdd = 105;
inline constexpr int kSetCapacity = 119;
inline constexpr int kAddDoubling = 136;
}  // namespace array_lines

inline constexpr const char* kMemoryAllocationFailure = "Memory Allocation Failure";
inline constexpr const char* kInvalidArrayIndex = "Invalid Array Index";

// Writes the fatal report to standard output and ends the process with status 1.
[[noreturn]] inline void FatalError(const char* file, int line, const char* message) {
  claim_fatal_end();
  std::fputs("\n\a", stdout);
  std::fputs("*************************************\n", stdout);
  std::printf("*** ERROR : %s\n", message ? message : "");
  std::printf("*** FILE  : %s\n", file ? file : "");
  std::printf("*** LINE  : %d\n", line);
  std::fputs("*************************************\n\n", stdout);
  std::fflush(stdout);
  std::exit(1);
}

[[noreturn]] inline void ArrayFatal(int line, const char* message) {
  FatalError("array_impl", line, message);
}

template <typename T>
class Array {
 public:
  static constexpr std::int32_t kDefaultGrowBy = 100;

  explicit Array(std::int32_t initialCapacity = 0, std::int32_t growBy = kDefaultGrowBy)
      : growBy_(growBy < 1 ? kDefaultGrowBy : growBy) {
    if (initialCapacity >= 1) {
      data_ = allocate(initialCapacity, array_lines::kConstruct);
      capacity_ = initialCapacity;
    }
  }
  Array(const Array&) = delete;
  Array& operator=(const Array&) = delete;
  ~Array() { Free(); }

  std::int32_t count() const { return count_; }
  std::int32_t capacity() const { return capacity_; }
  std::int32_t growBy() const { return growBy_; }
  T* data() { return data_; }
  const T* data() const { return data_; }

  // Clearing keeps the storage so one list serves every level.
  void Clear() { count_ = 0; }

  void Add(const T& value) {
    if (data_ && count_ < capacity_) {
      data_[count_++] = value;
      return;
    }
    const std::int64_t grown = std::int64_t{capacity_} + growBy_;
    replaceStorage(checkedCapacity(grown, array_lines::kAdd), array_lines::kAdd, &value);
  }

  void AddDoubling(const T& value) {
    if (data_ && count_ < capacity_) {
      data_[count_++] = value;
      return;
    }
    const std::int64_t grown = capacity_ < 1 ? 1 : 2 * std::int64_t{capacity_};
    replaceStorage(checkedCapacity(grown, array_lines::kAddDoubling), array_lines::kAddDoubling,
                   &value);
  }

  void SetCapacity(std::int32_t n) {
    if (n > capacity_) replaceStorage(n, array_lines::kSetCapacity, nullptr);
  }

  T& At(std::int32_t i) {
    if (i < 0 || i >= count_) ArrayFatal(array_lines::kAt, kInvalidArrayIndex);
    return data_[i];
  }
  const T& At(std::int32_t i) const {
    if (i < 0 || i >= count_) ArrayFatal(array_lines::kAt, kInvalidArrayIndex);
    return data_[i];
  }
  // Unchecked access for loops already bounded by count().
  T& operator[](std::int32_t i) { return data_[i]; }
  const T& operator[](std::int32_t i) const { return data_[i]; }

  T* begin() { return data_; }
  T* end() { return data_ + count_; }
  const T* begin() const { return data_; }
  const T* end() const { return data_ + count_; }

  // Count may only be lowered or raised within the constructed storage.
  void SetCount(std::int32_t n) {
    if (n < 0 || n > capacity_) ArrayFatal(array_lines::kAt, kInvalidArrayIndex);
    count_ = n;
  }

  void Free() {
    delete[] data_;
    data_ = nullptr;
    count_ = 0;
    capacity_ = 0;
  }

 private:
  static std::int32_t checkedCapacity(std::int64_t n, int line) {
    if (n > std::numeric_limits<std::int32_t>::max()) ArrayFatal(line, kMemoryAllocationFailure);
    return static_cast<std::int32_t>(n);
  }

  static T* allocate(std::int32_t n, int line) {
    T* p = new (std::nothrow) T[static_cast<std::size_t>(n)];
    if (!p) ArrayFatal(line, kMemoryAllocationFailure);
    return p;
  }

  // New storage of newCapacity elements, the old elements copied, then the
  // appended value (read before the old storage goes: it may live there).
  void replaceStorage(std::int32_t newCapacity, int line, const T* appended) {
    T* fresh = allocate(newCapacity, line);
    for (std::int32_t i = 0; i < count_; ++i) fresh[i] = data_[i];
    if (appended) fresh[count_++] = *appended;
    delete[] data_;
    data_ = fresh;
    capacity_ = newCapacity;
  }

  std::int32_t count_ = 0;
  std::int32_t capacity_ = 0;
  std::int32_t growBy_ = kDefaultGrowBy;
  T* data_ = nullptr;
};

}  // namespace zt
