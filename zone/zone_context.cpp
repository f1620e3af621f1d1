// The zone builder's process-wide state.
#include "zone/zone_context.hpp"

#include "zone/offset_engine.hpp"
#include "zone/parameter_files.hpp"

namespace zt {

ZoneBuilderState& zone_builder() {
  static ZoneBuilderState state;
  return state;
}

void reset_zone_builder() {
  ZoneBuilderState& state = zone_builder();
  state.levelFile.close();
  state.context.reset();
  state.levelCount = 0;
  state.levelRanges.clear();
  state.rangeCursor = 0;
  state.pointsWritten = 0;
  state.resultRanges.clear();
  state.resultCount = 0;
  if (engineReady) offset_engine().terminate();
  engineReady = false;
  mergeRadius = kDefaultMergeRadius;
}

}  // namespace zt
