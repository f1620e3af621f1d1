// Dynamic storage: a growable arena of bytes addressed by handles (byte
// offsets), on top of permanent tracked blocks. Handles stay valid when the
// arena grows and moves; a pointer from ds_deref is valid only until the
// arena's next growth.
//
// Promises: every reservation is rounded up to a multiple of 4 bytes; sizes are
// computed in 64 bits and an arena never exceeds 2^31 - 1 bytes (a larger
// request fails with -1); an arena created with 0 bytes or whose growth step
// is 0 still grows, by kMinimumGrowth bytes at a time, so no reservation loops.
#pragma once

#include <cstdint>
#include <string_view>

namespace zt {

inline constexpr std::int32_t kDsNoHandle = -1;
inline constexpr std::int64_t kMinimumGrowth = 256;

struct DynamicStorage {
  char* data;             // permanent tracked block
  std::int32_t used;      // bytes handed out; the next handle
  std::int32_t capacity;  // size of data
  std::int32_t growth;    // bytes added at each growth (the initial size)
};

DynamicStorage* ds_create(std::int64_t n);
void ds_destroy(DynamicStorage* ds);
std::int32_t ds_reserve(DynamicStorage* ds, std::int64_t n);
// Reserves the text's length plus its terminating zero and copies both.
std::int32_t ds_store_string(DynamicStorage* ds, std::string_view text);
void* ds_deref(DynamicStorage* ds, std::int32_t handle);
void ds_trim(DynamicStorage* ds);

}  // namespace zt
