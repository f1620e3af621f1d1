// Preparation of the input for a computation: bounding box, the exact
// power-of-two scaling into the internal frame, cleaning (dummy slots,
// sorting, duplicate points and degenerate segments), segment line data and
// the corner dummy points that enclose everything.
#pragma once

#include <cstdint>

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

// Index of the first and one past the last caller point once the dummies
// are in place.
std::int32_t FirstCallerPoint();
std::int32_t EndCallerPoints();

}  // namespace zt::vd
