// wf_init_czone, wf_add_level, wf_fin_czone and the placement of stock
// levels on contour levels.
#include "zone/entry_points.hpp"

#include <cstring>

#include "runtime/path_expansion.hpp"
#include "zone/assembly.hpp"
#include "zone/level_zone.hpp"
#include "zone/parameter_files.hpp"

namespace zt {

namespace {

// Capacity of the buffers names are expanded in.
constexpr std::int32_t kNameCapacity = 512;

// Expands a "$TMP/..." name into `buffer`; false on an expansion error.
bool expand_name(const char* name, char (&buffer)[kNameCapacity]) {
  std::strncpy(buffer, name, kNameCapacity - 1);
  buffer[kNameCapacity - 1] = '\0';
  return expand_path(buffer, kNameCapacity) == kExpandOk;
}

// The first call's set-up: parameters, the reader of contour.bin and the
// index of its levels.
std::int32_t set_up_context(ZoneContext& context) {
  char contourName[kNameCapacity];
  const bool contourNamed = expand_name("$TMP/contour.bin", contourName);
  char zstockName[kNameCapacity];
  if (expand_name("$TMP/zstock.ok", zstockName)) {
    read_offset_distance(zstockName, context.offsetDistance);
  }
  ContourStore& store = context.store;
  if (!store.reader) store.reader = std::make_unique<CKvlBinaryResFileReader>();
  if (!contourNamed || store.reader->openPoints(contourName) != 0) return -1;
  return load_contours(store, read_contour_record);
}

}  // namespace

std::int32_t place_level(const LevelRange* ranges, std::int32_t count, std::int32_t& cursor,
                         float z) {
  const float above = z + kLevelPlacementTolerance;
  while (cursor < count && ranges[cursor].z > above) ++cursor;
  return cursor < count ? cursor : -1;
}

void wf_init_czone(const float* levels, const std::int32_t& count, std::int32_t& ierr) {
  ierr = -1;
  ZoneBuilderState& state = zone_builder();
  state.pointsWritten = 0;
  state.rangeCursor = 0;
  if (count < 0 || (count > 0 && !levels)) return;
  char name[kNameCapacity];
  if (!expand_name("$TMP/temp1", name)) return;
  if (state.levelFile.create(name) != 0) return;
  state.levelCount = count;
  state.levelRanges.assign(static_cast<std::size_t>(count) + 2, LevelRange{});
  for (std::int32_t i = 0; i < count; ++i) state.levelRanges[i].z = levels[i];
  ierr = 0;
}

void wf_add_level(const float& z, const Point2f* points, const std::int32_t& count,
                  std::int32_t& ierr) {
  ierr = -1;
  ZoneBuilderState& state = zone_builder();
  if (!state.context) {
    state.context = std::make_unique<ZoneContext>();
    if (set_up_context(*state.context) != 0) return;
  }
  ZoneContext& context = *state.context;
  if (compute_level_zone(context, double{z}, points, count) != 0) return;

  const std::int32_t n = static_cast<std::int32_t>(context.levelResult.size());
  if (n < kMinStoredPoints) {
    ierr = 0;
    return;
  }
  const std::int32_t at =
      place_level(state.levelRanges.data(), state.levelCount, state.rangeCursor, z);
  if (at < 0) return;
  const std::int32_t first = state.pointsWritten + 1;
  const std::int32_t wrote =
      write_points(state.levelFile, context.levelResult.data(), n, state.pointsWritten);
  state.levelRanges[at] = {first, state.pointsWritten, z};
  ierr = wrote == 0 ? 0 : -1;
}

void wf_fin_czone(std::vector<Point2f>& points, const std::int32_t& unit, std::int32_t& ierr,
                  ContourWriter writeContour) {
  std::int32_t r = assemble_zones(points);
  if (r == 0) {
    char name[kNameCapacity];
    ZoneBuilderState& state = zone_builder();
    r = expand_name("$TMP/temp2", name)
            ? write_zones(unit, name, state.resultCount, state.resultRanges.data(), writeContour)
            : -1;
  }
  ierr = r;
}

}  // namespace zt
