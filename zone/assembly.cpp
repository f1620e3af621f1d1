// assemble_zones and merge_level_zones.
#include "zone/assembly.hpp"

#include <cassert>
#include <cstring>

#include "regions/boolean.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime/progress.hpp"
#include "zone/offset_engine.hpp"
#include "zone/parameter_files.hpp"
#include "zone/simplify.hpp"
#include "zone/slope_domain.hpp"

namespace zt {

namespace {

constexpr std::int32_t kNameCapacity = 512;
// The result range of a level not reached yet.
constexpr float kNoLevelZ = 99999.0f;
// Growth of the working lists and of the level output.
constexpr std::int32_t kListGrowth = 100;
constexpr std::size_t kLevelOutputCapacity = 10000;

bool expand_name(const char* name, char (&buffer)[kNameCapacity]) {
  std::strncpy(buffer, name, kNameCapacity - 1);
  buffer[kNameCapacity - 1] = '\0';
  return expand_path(buffer, kNameCapacity) == kExpandOk;
}

void append_all(const TaggedPointList& from, TaggedPointList& to) {
  for (const TaggedPoint& p : from) to.Add(p);
}

// Writes the level output and records its range; -1 when a write failed.
std::int32_t record_level(ZoneBuilderState& state, ScratchFile& zones,
                          const std::vector<Point2f>& output, std::int32_t& written, float z) {
  assert(state.resultCount < state.levelCount && "one result range per real level at most");
  const std::int32_t before = written;
  const std::int32_t r =
      write_points(zones, output.data(), static_cast<std::int32_t>(output.size()), written);
  state.resultRanges[state.resultCount++] = {before + 1, written, z};
  return r;
}

}  // namespace

std::int32_t merge_level_zones(TaggedPointList& A, TaggedPointList& B, TaggedPointList& C,
                               const Point2f* points, std::int32_t n, std::vector<Point2f>& out) {
  const double R = double{mergeRadius};
  B.Clear();
  out.clear();
  for (std::int32_t i = 0; i < n; ++i) {
    const std::int32_t tag = points[i].x >= kMergeSeparatorX ? kSeparatorTag : 0;
    B.Add({tag, double{points[i].x}, double{points[i].y}});
  }
  {
    SlopeDomain grow(R + kMergeGrowthMargin);
    if (grow.compute(B, kSideRight) != 0) return -1;
  }
  simplify_polylines(B, C, kGrownTolerance);
  if (A.count() > 0) {
    // Zones that grew into nothing leave the carried union as it is.
    if (C.count() > 0) {
      if (rg_boolean(A, C, "u", &C) != 0) return -1;
      simplify_polylines(C, A, kUnionTolerance);
    }
  } else {
    append_all(C, A);
  }
  C.Clear();
  append_all(A, C);
  {
    SlopeDomain shrink(R);
    if (shrink.compute(C, kSideLeft) != 0) return -1;
  }
  simplify_polylines(C, B, kShrunkTolerance);
  out.reserve(static_cast<std::size_t>(B.count()));
  for (const TaggedPoint& p : B) out.push_back({static_cast<float>(p.x), static_cast<float>(p.y)});
  return 0;
}

std::int32_t assemble_zones(std::vector<Point2f>& points) {
  ZoneBuilderState& state = zone_builder();
  char name[kNameCapacity];
  // A write the disk refused may only show when temp1 is flushed here.
  if (state.levelFile.close() != 0) return -1;
  if (!expand_name("$TMP/temp1", name) || state.levelFile.reopen(name) != 0) return -1;
  if (!expand_name("$TMP/grid.tmp", name) || read_merge_radius(name, mergeRadius) != 0) return -1;

  std::int32_t L = -1;
  for (std::int32_t k = 0; k < state.levelCount; ++k) {
    if (state.levelRanges[k].hasPoints()) L = k;
  }
  ScratchFile zones;
  if (!expand_name("$TMP/temp2", name) || zones.create(name) != 0) return -1;
  state.resultRanges.assign(static_cast<std::size_t>(state.levelCount) + 2,
                            LevelRange{-1, -1, kNoLevelZ});
  state.resultCount = 0;
  std::int32_t written = 0;

  const std::int32_t total = L + 1;
  progress(total, 0);
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
  TaggedPointList A(0, kListGrowth), B(0, kListGrowth), C(0, kListGrowth);
  std::vector<Point2f> output;
  output.reserve(kLevelOutputCapacity);
  for (std::int32_t k = L, done = 1; k >= 0; --k, ++done) {
    const LevelRange range = state.levelRanges[k];
    if (range.hasPoints()) {
      const std::int32_t n = range.last - range.first + 1;
      if (n > 0 && points.size() < static_cast<std::size_t>(n)) points.resize(n);
      if (read_points(state.levelFile, points.data(), n, std::int64_t{range.first} - 1) != 0) {
        return -1;
      }
      if (merge_level_zones(A, B, C, points.data(), n, output) != 0) return -1;
    }
    if (record_level(state, zones, output, written, range.z) != 0) return -1;
    progress(total, done);
  }
  const bool closed = zones.close() == 0;
  if (state.levelFile.close() != 0 || !closed) return -1;
  offset_engine().terminate();
  engineReady = false;
  return 0;
}

}  // namespace zt
