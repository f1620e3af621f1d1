// Nearest-point search over the points inserted so far: a uniform grid of
// buckets, replaced by a point quadtree when a sample of the input shows it
// too clustered for a grid.
//
// Promise: FindAndInsert returns the inserted point nearest to the query
// (exact squared distance in double precision; ties go to the first found
// on the grid, to the lowest point index in the quadtree); a query within
// kCoincidentDist2 of an inserted point is not inserted.
#pragma once

#include <cstdint>

namespace zt::vd {

// Squared distance at or below which two points are the same point.
inline constexpr double kCoincidentDist2 = 1e-22;

// Builds the structure over the bounding box of the engine's points for
// `totalPoints` points (dummies included). Replaces any previous one.
void BuildNearestSearch(std::int32_t totalPoints, double minX, double minY, double maxX,
                        double maxY);
// Enters point p (an index of the engine's point array) without a query.
void InsertNearest(std::int32_t p);
// The nearest inserted point to p and its squared distance; p is entered
// unless it coincides with the result. Point -1 when nothing is inserted
// yet, and for a point merged away (deleted), which is not searched.
struct Nearest {
  std::int32_t point = -1;
  double dist2 = 0.0;
};
Nearest FindAndInsertNearest(std::int32_t p);
// Hints that a search near (x, y) comes soon: the heads of the cells a
// search looks at first, then (once those have arrived) their first
// entries. No effect on results.
void PrefetchNearestCells(double x, double y);
void PrefetchNearestEntries(double x, double y);
// With the point quadtree, the cells are nodes on a path from the root:
// NearestPathStart gives the root (-1 on a grid), and each NearestPathStep
// reads one node of the path a search near (x, y) descends, requests its
// children, and gives the next node (-1 at the end).
std::int32_t NearestPathStart();
std::int32_t NearestPathStep(std::int32_t node, double x, double y);
void ReleaseNearestSearch();

}  // namespace zt::vd
