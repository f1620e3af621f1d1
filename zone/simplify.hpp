// Polyline simplification: a radial-distance pass followed by an iterative
// Douglas-Peucker pass.
//
// Offset curves arrive with many chord points and contours are fed to the
// Voronoi engine point by point, so the zone builder thins polylines before
// feeding them, after collecting the offsets of a level and in the final
// assembly. All three places use the one algorithm in two storage forms:
//  - PolylineSimplifier reads a plain array and writes an Array<Point2d>; its
//    radial distance is tolerance x factor and its Douglas-Peucker tolerance
//    the rest of the tolerance, so a dropped point stays within `tolerance`
//    of the kept chain;
//  - VectorSimplifier thins in place with both distances given.
// simplify_polylines thins every polyline of a TaggedPointList on top of
// VectorSimplifier.
//
// Promises of both forms: the kept points are a subsequence of the input in
// order; the last input point is always kept (possibly in place of a close
// predecessor, even of the first point); comparisons are strict (a point at
// exactly the tolerance is dropped); of equal largest distances the first is
// kept. Tolerances are expected finite and non-negative.
#pragma once

#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

#include "core/points.hpp"

namespace zt {

// Radial distance of PolylineSimplifier as a fraction of its tolerance.
inline constexpr double kRadialFactor = 0.5;
// Radial distance simplify_polylines uses: the single-precision machine
// epsilon, so only points that coincide in the files' precision merge.
inline constexpr double kPolylineRadialEps = 1.1920928955078125e-7;
// simplify_polylines: an element whose x is at least this starts no polyline.
inline constexpr double kPolylineSeparatorX = 99990.0;

class PolylineSimplifier {
 public:
  // Obtains `n` keep flags or returns nullptr. Replaceable so that the
  // fallback for a failed allocation can be exercised.
  using FlagAllocator = std::int32_t* (*)(std::int64_t n);

  explicit PolylineSimplifier(double factor = kRadialFactor);
  ~PolylineSimplifier();
  PolylineSimplifier(const PolylineSimplifier&) = delete;
  PolylineSimplifier& operator=(const PolylineSimplifier&) = delete;

  // Thins points[0..n) into `result` (emptied first when `clear`); the input
  // is not changed. Without `clear` the thinned run is appended after what
  // `result` already holds. Always returns 0.
  std::int32_t simplify(const Point2d* points, std::int32_t n, double tolerance,
                        Array<Point2d>& result, bool clear);

  // The result array owned by the simplifier, created on first use with
  // capacity max(n + 10, 5000) and growth step 1000; nullptr when it cannot
  // be created.
  Array<Point2d>* resultList(std::int32_t n);

  double factor() const { return factor_; }
  void setFlagAllocator(FlagAllocator allocator) { allocateFlags_ = allocator; }

 private:
  std::int32_t* flags_ = nullptr;
  const Point2d* points_ = nullptr;
  std::int32_t flagCapacity_ = 0;
  double squaredTolerance_ = 0.0;
  double factor_;
  std::unique_ptr<Array<Point2d>> result_;
  FlagAllocator allocateFlags_;
  std::vector<std::pair<std::int32_t, std::int32_t>> stack_;  // scratch, keeps its storage
};

class VectorSimplifier {
 public:
  // Thins points[0..n) in place with radial distance `eps` and Douglas-Peucker
  // tolerance `tol`; returns the number of points kept at the front (0 for
  // no points, 1 for one point).
  std::int32_t simplify(Point2d* points, std::int32_t n, double eps, double tol);

 private:
  std::vector<bool> keep_;
  std::vector<Point2d> run_;
  double squaredTolerance_ = 0.0;
  std::vector<std::pair<std::int32_t, std::int32_t>> stack_;
};

// Thins every polyline of `in` into `out` (emptied first): each polyline of
// two or more points comes out behind one separator record with its kept
// points tagged 1; input tags are not carried over; no separator at the end.
// `in` and `out` must be different lists.
void simplify_polylines(const TaggedPointList& in, TaggedPointList& out, double tolerance);

}  // namespace zt
