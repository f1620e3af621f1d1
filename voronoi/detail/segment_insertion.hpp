// Insertion of one segment into the diagram of its end points (and of the
// segments inserted before it), in stages:
//   start   find a node of the diagram in conflict with the segment at each
//           end point's region (or make one where the segment leaves it);
//   grow    collect the connected set of nodes in conflict (the deleted tree)
//           and protect the regions of points that would vanish;
//   cycles  make sure the collected set is a tree;
//   rebuild compute the new node on every edge leaving the tree, link them
//           into the boundary of the segment's region by a tour around the
//           tree, free the tree, and mark the segment's end points.
// Every stage either succeeds, or runs the input repair (a restart is then
// pending and the insertion returns), or takes its fallback and sets
// recovery mode.
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd {

// The tolerance ladder: a failed step is retried with a wider tolerance
// while it is at most kLadderTop.
inline constexpr double kLadderTop = 1e-7;
double NextTolerance(double tol);

// Start tolerances of the stages.
inline constexpr double kStartTolFirst = -1e-11;
inline constexpr double kStartTolSecond = 1e-14;
inline constexpr double kGrowthTol = -1e-14;
inline constexpr double kProtectTol = 1e-11;
// Band for "strictly on opposite sides" and for radii that count as zero.
inline constexpr double kSideBand = 1e-11;
inline constexpr double kZeroRadius = 1e-11;
// A point within this of a segment's line (and extent) lies on it.
inline constexpr double kOnSegmentTol = 1e-11;

struct SegmentInsertion {
  std::int32_t s = kNone;
  std::int32_t i1 = kNone;
  std::int32_t i2 = kNone;
  geo::SegSite line;
  std::int32_t start = kNone;
  std::int32_t end = kNone;
  // The growth found the collected nodes to be a tree, and nothing split
  // their edges since.
  bool grownTree = false;
};

// dist(N) − r(N): the node's distance to the segment's line while its foot
// lies on the segment within tol, LARGE beyond; negative in conflict.
double ConflictValue(const SegmentInsertion& si, std::int32_t node, double tol);

// The four far nodes that close the outer face.
inline bool IsFarNode(std::int32_t n) { return n >= 0 && n < 4; }

// Stage 1. False when the insertion must return (restart pending).
bool FindStartNodes(SegmentInsertion& si);
// Stage 2 with the protection of point regions. False: return.
bool GrowDeletedTree(SegmentInsertion& si);
// Stage 3 (tree check and cycle breaking); marks the tree DELETED. False: return.
bool MakeTree(SegmentInsertion& si);
// Stage 4. False: return (restart pending, nothing changed).
bool RebuildRegion(SegmentInsertion& si);

// Splits every edge between segment s and one of its end points that passes
// through that point, with a permanent node of radius 0 on it; returns how
// many it split.
std::int32_t SplitRegionAtEndPoints(std::int32_t s);

// Statuses and marks of the stages back to their resting values.
void ResetInsertionMarks();
// Nodes whose status an insertion changed; reset at its end.
void TouchNode(std::int32_t n, std::uint32_t status);

// Places a temporary degree-2 node on edge e where the ray from point p
// along the unit direction u meets it, equidistant from p and e's other
// site, when e's end nodes lie strictly on opposite sides of the ray's line
// and the node lies on e within tol. True when placed.
bool PlaceOnRay(std::int32_t e, std::int32_t p, Point2d u, double tol);
// The direction of the ray that protects point p's region: away from the
// segment, along its normal, or along the segment beyond its end points.
Point2d ProtectDirection(const SegmentInsertion& si, std::int32_t p);
// Copies node n into a new temporary degree-2 node splitting edge e next to
// it (the fallback of the protection stages); sets the error flag and
// recovery mode.
void CopyIntoDegree2(std::int32_t e, std::int32_t n);

}  // namespace zt::vd
