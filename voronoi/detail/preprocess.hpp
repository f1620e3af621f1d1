// Preparation of the input for a computation: bounding box, the exact
// power-of-two scaling into the internal frame, cleaning (dummy slots,
// sorting, duplicate points and degenerate segments), segment line data and
// the corner dummy points that enclose everything.
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

// Bounds of the internal frame the scaling aims at.
inline constexpr double kUnitExtentMax = 1.00000000001;
inline constexpr double kUnitExtentMin = 0.5;
// Extents and lengths at or below this are treated as zero (internal units).
inline constexpr double kZeroLength = 1e-11;

// Over the caller's points (slot 2 to the last caller point).
void ComputeBoundingBox();
void ApplyScaling();

// First call after a reset: the four dummy slots. Returns false when the
// cleaning stops there (first call without `clean`).
void AddDummySlots();
// Sorts the points, removes exact duplicates and degenerate (and, with
// `sortSegments`, duplicate) segments.
void CleanInput(bool sortSegments);
// Computes a, b, c and the length of every segment; may request a restart.
void ComputeSegmentLineData();
void PlaceCornerDummies(std::int32_t boundFactor);

// Cross-reference of segment ends by point, built on demand.
void BuildCrossReference();
void ReleaseCrossReference();
// Points every segment end at `from` to `to` (needs the cross-reference).
void RedirectSegmentEnds(std::int32_t from, std::int32_t to);

// Calls f(segment) for every segment with an end at point p, through the
// cross-reference (which must be built and cover p).
template <class F>
void ForEachSegmentAt(std::int32_t p, F&& f) {
  Engine& g = Vd();
  if (p < 0 || p >= g.xrefMerged.count) return;
  for (std::int32_t q = p; q != kNone; q = g.xrefMerged[q])
    for (std::int32_t k = g.xrefStart[q]; k < g.xrefStart[q + 1]; ++k) f(g.xrefEnds[k] / 2);
}

// Index of the first and one past the last caller point once the dummies
// are in place.
std::int32_t FirstCallerPoint();
std::int32_t EndCallerPoints();

}  // namespace zt::vd
