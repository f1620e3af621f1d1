// The zone builder's entry points, called from the driver in the order
// wf_init_czone once, wf_add_level once per stock level with more than 4
// points (from the top down), wf_fin_czone once. Every argument is passed by
// reference; ierr is 0 on success and -1 on failure, and nothing is printed.
//
// Between the calls the zone builder keeps the scratch level file
// "$TMP/temp1" (each level's zone points, contours separated by points of
// x = 99999) and the level range table saying which points belong to which
// contour level.
#pragma once

#include <cstdint>
#include <vector>

#include "core/points.hpp"
#include "zone/zone_context.hpp"

namespace zt {

// Writes one closed contour of n points at height z on a logical unit of the
// driver; ierr 0 when written. The driver's write_contour has this form: it
// is handed to wf_fin_czone so that the zone builder needs none of the
// driver's record layer.
using ContourWriter = void (*)(const std::int32_t& n, const Point2f* points, const float& z,
                               const std::int32_t& unit, std::int32_t& ierr);

// Stock levels within this (single precision) of a contour level belong to it.
inline constexpr float kLevelPlacementTolerance = 0.0001f;
// A level result with fewer points than this is not stored.
inline constexpr std::int32_t kMinStoredPoints = 4;

// levels: the z of each contour level, from the top down. Creates "$TMP/temp1"
// empty and a level range table of count levels without points.
void wf_init_czone(const float* levels, const std::int32_t& count, std::int32_t& ierr);

// Computes the zones of one stock level (points: its rest-material pairs,
// separators x = 99999 between contours) and appends them to "$TMP/temp1" on
// the contour level they belong to.
void wf_add_level(const float& z, const Point2f* points, const std::int32_t& count,
                  std::int32_t& ierr);

// The stock levels as the driver hands them to wf_add_levels.
// What reading a level gave.
enum class LevelRead { kNothing, kPoints, kFault };

class LevelSource {
 public:
  virtual ~LevelSource() = default;
  // Number of stock levels.
  virtual std::int32_t count() const = 0;
  // Level i (from 1, top down): its z and rest-material pairs (kPoints), or
  // nothing to add (kNothing), or a fault of the source that must end the
  // run (kFault). Called in level order on one thread, possibly ahead of
  // the levels being computed.
  virtual LevelRead read(std::int32_t i, float& z, std::vector<Point2f>& points) = 0;
  // Level i is done: its zones are in "$TMP/temp1". Called in level order.
  virtual void done(std::int32_t i) = 0;
  // Ends the run on the fault that reading level i gave (the driver's stop
  // does not return). Called once every level before i is done and none of
  // them failed: a level read ahead ends the run as it would have ended had
  // it been read in turn. When it returns, the run ends with ierr -1.
  virtual void fault(std::int32_t i) = 0;
};

// wf_add_level for every level of `source`, several levels at once on
// worker threads (see zone/worker_pool.hpp). temp1 and the level range table
// come out as from one wf_add_level per level in order; a level that fails
// ends the run there (ierr -1) with every level before it stored and done;
// so does a level whose reading faulted, after source.fault.
void wf_add_levels(LevelSource& source, std::int32_t& ierr);

// Assembles the final zones over all levels and writes them, as closed
// contours, on the unit where the driver opened "$TMP/stock2.bin", through
// writeContour. points: the driver's point buffer, lent as scratch space (it
// grows to the largest level when needed).
void wf_fin_czone(std::vector<Point2f>& points, const std::int32_t& unit, std::int32_t& ierr,
                  ContourWriter writeContour);

// The level range that receives a stock level at z: moves `cursor` past every
// range whose z lies above z + kLevelPlacementTolerance and returns it, or -1
// when the cursor reaches `count` (the level lies below every remaining
// contour level).
std::int32_t place_level(const LevelRange* ranges, std::int32_t count, std::int32_t& cursor,
                         float z);

}  // namespace zt
