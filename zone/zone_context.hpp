// The zone builder's process-wide state: the zone context (index of the
// finishing contours and the per-level working lists), the level range
// tables and the two scratch files.
//
// The state is created on first use and lives to the end of the process;
// reset_zone_builder exists only so that tests can start from a fresh one.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "zone/contour_store.hpp"
#include "core/points.hpp"
#include "zone/scratch_file.hpp"

namespace zt {

// The rest material is grown by at least this much.
inline constexpr double kMinOffsetDistance = 1.0;
// Growth step of the context's point lists.
inline constexpr std::int32_t kContextListGrowth = 100;

// A range of point numbers (from 1) of a scratch file holding one level:
// -1, -1 while the level has none; last = first - 1 when it is empty.
struct LevelRange {
  std::int32_t first = -1;
  std::int32_t last = -1;
  float z = 0.0f;

  bool hasPoints() const { return first != -1; }
};

struct ZoneContext {
  ContourStore store;  // levelCount, levelCursor, levels, readRecord, reader, recordIndex
  TaggedPointList contourPoints{0, kContextListGrowth};
  TaggedPointList zonePoints{0, kContextListGrowth};
  std::vector<Point2f> levelResult;
  TaggedPointList restPoints{0, kContextListGrowth};
  TaggedPointList finishingPoints{0, kContextListGrowth};  // thinned for the intersection
  double offsetDistance = kMinOffsetDistance;
};

// A level's zones grown for the assembly while the levels were computed
// at once (the grow needs only the level's own zones).
struct GrownLevel {
  float radius = 0.0f;  // the merge radius they were grown by
  std::int32_t status = -1;
  TaggedPointList points{0, kContextListGrowth};
};

struct ZoneBuilderState {
  std::unique_ptr<ZoneContext> context;  // created by the first wf_add_level
  ScratchFile levelFile;                 // "$TMP/temp1"
  std::int32_t levelCount = 0;
  // levelCount real entries and two spare ones.
  std::vector<LevelRange> levelRanges;
  std::int32_t rangeCursor = 0;
  std::int32_t pointsWritten = 0;
  std::vector<LevelRange> resultRanges;
  std::int32_t resultCount = 0;
  // By entry of levelRanges: the zones stored there, grown (null: grown in
  // the assembly). Filled only when the levels are computed at once.
  std::vector<std::unique_ptr<GrownLevel>> grownLevels;
};

ZoneBuilderState& zone_builder();
// Drops the context and the tables and closes the scratch files, as in a
// new process; also forgets engineReady and the merge radius (tests only).
void reset_zone_builder();

}  // namespace zt
