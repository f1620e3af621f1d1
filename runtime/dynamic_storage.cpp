// Dynamic storage arenas.
#include "runtime/dynamic_storage.hpp"

#include <cstring>
#include <limits>

#include "runtime/diagnostics.hpp"
#include "runtime/tracked_alloc.hpp"

namespace zt {
namespace {

constexpr std::int64_t kArenaLimit = std::numeric_limits<std::int32_t>::max();
constexpr std::int64_t kReserveAlignment = 4;

}  // namespace

DynamicStorage* ds_create(std::int64_t n) {
  if (n < 0 || n > kArenaLimit) {
    diagnose_warning("Dynamic storage: no more memory\n");
    return nullptr;
  }
  auto* ds = static_cast<DynamicStorage*>(permanent_alloc(sizeof(DynamicStorage)));
  if (ds == nullptr) return nullptr;
  void* data = permanent_alloc(static_cast<std::uint64_t>(n));
  if (data == nullptr) {
    tracked_free(ds);
    diagnose_warning("Dynamic storage: no more memory\n");
    return nullptr;
  }
  ds->data = static_cast<char*>(data);
  ds->used = 0;
  ds->capacity = static_cast<std::int32_t>(n);
  ds->growth = static_cast<std::int32_t>(n);
  return ds;
}

void ds_destroy(DynamicStorage* ds) {
  if (ds == nullptr) return;
  tracked_free(ds->data);
  tracked_free(ds);
}

std::int32_t ds_reserve(DynamicStorage* ds, std::int64_t n) {
  if (ds == nullptr || n < 0 || n > kArenaLimit) return kDsNoHandle;
  n = (n + kReserveAlignment - 1) / kReserveAlignment * kReserveAlignment;
  const std::int64_t needed = std::int64_t{ds->used} + n;
  if (needed > ds->capacity) {
    // All the growth steps the loop of single steps would take, at once.
    const std::int64_t step = ds->growth > 0 ? ds->growth : kMinimumGrowth;
    const std::int64_t steps = (needed - ds->capacity + step - 1) / step;
    const std::int64_t new_capacity = ds->capacity + steps * step;
    void* grown = new_capacity > kArenaLimit
                      ? nullptr
                      : _Wrealloc(kBlockPermanent, ds->data, static_cast<std::uint64_t>(new_capacity));
    if (grown == nullptr) {
      diagnose_warning(format_text(
          "Dynamic storage: no more memory, could not expand from %d to %lld bytes\n",
          ds->capacity, static_cast<long long>(new_capacity)));
      return kDsNoHandle;
    }
    ds->data = static_cast<char*>(grown);
    ds->capacity = static_cast<std::int32_t>(new_capacity);
  }
  const std::int32_t handle = ds->used;
  ds->used = static_cast<std::int32_t>(needed);
  return handle;
}

std::int32_t ds_store_string(DynamicStorage* ds, std::string_view text) {
  const std::int32_t handle = ds_reserve(ds, static_cast<std::int64_t>(text.size()) + 1);
  if (handle < 0) return kDsNoHandle;
  char* p = ds->data + handle;
  if (!text.empty()) std::memcpy(p, text.data(), text.size());
  p[text.size()] = '\0';
  return handle;
}

void* ds_deref(DynamicStorage* ds, std::int32_t handle) {
  if (ds == nullptr || handle < 0) return nullptr;
  if (handle < ds->used) return ds->data + handle;
  diagnose_warning("Dynamic storage: trying to access unallocated memory\n");
  return nullptr;
}

void ds_trim(DynamicStorage* ds) {
  if (ds == nullptr || ds->used == ds->capacity) return;
  void* trimmed = _Wrealloc(kBlockPermanent, ds->data, static_cast<std::uint64_t>(ds->used));
  if (trimmed == nullptr) return;  // keeping the larger block is harmless
  ds->data = static_cast<char*>(trimmed);
  ds->capacity = ds->used;
}

}  // namespace zt
