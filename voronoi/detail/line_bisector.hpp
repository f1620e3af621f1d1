// Oriented segment lines and the line along which two of them are at equal
// oriented distance (the bisector used by the point-segment-segment and
// segment-segment-segment constructions).
#pragma once

#include "voronoi/detail/node_geometry.hpp"

namespace zt::vd::geo {

// A segment's line, possibly negated so that the node sought lies on its
// positive side.
struct OrientedLine {
  double a = 0.0, b = 0.0, c = 0.0;
  OrientedLine() = default;
  OrientedLine(const SegSite& s, bool negate)
      : a(negate ? -s.a : s.a), b(negate ? -s.b : s.b), c(negate ? -s.c : s.c) {}
  double D(Point2d q) const { return a * q.x + b * q.y + c; }
  Point2d normal() const { return {a, b}; }
};

// N(t) = p0 + t·v: both oriented distances change by the same amount along it.
struct LineBisector {
  Point2d p0;
  Point2d v;
};

// The bisector of l1 (of segment s1) and l2 (of s2). p0 is the shared end
// point when there is one, else the arc centre when both approximate the same
// arc and it lies on the bisector, else the lines' intersection when they are
// clearly not parallel, else the point of the bisector nearest `ref`.
// False when the lines are parallel with one orientation (no such line).
bool line_bisector(const OrientedLine& l1, const SegSite& s1, const OrientedLine& l2, const SegSite& s2,
                   Point2d ref, LineBisector& out);

}  // namespace zt::vd::geo
