// Plain geometry of the node constructions of the segment phase.
//
// When a segment is inserted, every edge leaving the deleted tree gets a new
// node: the point of the edge equidistant from the edge's two sites and the
// new site. The constructions work on the plain records below, copied out of
// the diagram by the engine (voronoi/detail/node_computation.hpp), so that
// they can be exercised and checked without a diagram.
//
// All coordinates are internal (extent between 0.5 and 1), so the absolute
// tolerances here are relative to the input's size.
#pragma once

#include <cstdint>

#include "voronoi/detail/records.hpp"
#include "core/points.hpp"

namespace zt::vd::geo {

// Site kinds as the diagram codes them.
inline constexpr std::int32_t kKindSeg = SEG;
inline constexpr std::int32_t kKindArc = ARC;
inline constexpr std::int32_t kKindPnt = PNT;
inline constexpr std::int32_t kKindNone = kNoSiteKind;

// A point, or the line through a segment, at or within this distance of
// another site counts as lying on it (degenerate input).
inline constexpr double kOnSiteTol = 1e-11;
// Two points at squared distance at or below this coincide.
inline constexpr double kCoincideSq = 1e-22;
// Denominators at or below this in magnitude are treated as zero.
inline constexpr double kDenomTol = 1e-11;
// Lines whose normals n1, n2 have |1 + n1·n2| at or below this face each other.
inline constexpr double kFacingTol = 1.0 / 128.0;
// Line intersections by the determinant are used only above this magnitude.
inline constexpr double kDetTol = 1.0 / 128.0;
// |n1 − n2|² at or below this: the lines are parallel with one orientation and
// no line of equal oriented distances exists.
inline constexpr double kSameDirSq = 1e-22;
// An end node within this of a line does not decide the line's orientation.
inline constexpr double kOrientTol = 1e-14;
// A closed-form node is accepted when it lies on the edge within this (C1, as
// a length) and is equidistant from the three sites within this·(1 + r).
inline constexpr double kNodeCheckTol = 1e-9;
// The oriented-distance solution of three lines is taken directly when it
// lies on the edge within this.
inline constexpr double kSssOnEdgeTol = 1e-11;
// The bisection along an edge counts an excess at or below this·(1 + r) as
// conflict (rounding of the two distances).
inline constexpr double kBisectNoise = 1e-14;
// The bisection along an edge stops after this many halvings.
inline constexpr int kBisectSteps = 200;

inline double cross(Point2d u, Point2d v) { return u.x * v.y - u.y * v.x; }
inline double dot(Point2d u, Point2d v) { return u.x * v.x + u.y * v.y; }
inline Point2d sub(Point2d u, Point2d v) { return {u.x - v.x, u.y - v.y}; }
inline Point2d add(Point2d u, Point2d v) { return {u.x + v.x, u.y + v.y}; }
inline Point2d mul(Point2d u, double s) { return {u.x * s, u.y * s}; }
inline double norm2(Point2d u) { return u.x * u.x + u.y * u.y; }
double distance(Point2d u, Point2d v);

// A point site: its index among the input points and its position.
struct PointSite {
  std::int32_t index = -1;
  Point2d p;
};

// A segment site with its line data: (a, b) the unit normal to the left,
// a·x + b·y + c the signed distance, len its length.
struct SegSite {
  std::int32_t index = -1;
  std::int32_t i1 = -1;  // start and end point indices
  std::int32_t i2 = -1;
  Point2d p1, p2;
  double a = 0.0, b = 0.0, c = 0.0, len = 0.0;
  std::int32_t arc = -1;  // arc approximated by the segment, -1 if none
  Point2d arc_center;
  double arc_radius = 0.0;

  // Builds the line data from the two end points (len > 0 expected).
  static SegSite make(std::int32_t index, std::int32_t i1, Point2d p1, std::int32_t i2, Point2d p2);

  double D(Point2d q) const { return a * q.x + b * q.y + c; }
  double lambda(Point2d q) const { return (q.x - p1.x) * b - (q.y - p1.y) * a; }
  bool has_end(std::int32_t point) const { return point == i1 || point == i2; }
  // True distance from q to the closed segment.
  double dist(Point2d q) const;
  // How far q's foot point lies beyond the segment (criterion C2).
  double beyond(Point2d q) const;
  // True when q lies on the segment itself within kOnSiteTol.
  bool contains(Point2d q) const;
};

// One site of an edge, or the new site: a kind and the record of that kind.
struct SiteRef {
  std::int32_t kind = kKindNone;
  PointSite pnt;
  SegSite seg;

  static SiteRef point(PointSite p) { return {kKindPnt, p, {}}; }
  static SiteRef segment(const SegSite& s) { return {kKindSeg, {}, s}; }
  std::int32_t index() const { return kind == kKindPnt ? pnt.index : seg.index; }
  // True distance from q to the site (points and segments only).
  double dist(Point2d q) const;
  // Distance as the diagram sees a segment site, whose region is the strip
  // over the open segment: the line distance while q's foot lies on the
  // segment within `band`, infinite beyond. Points: the Euclidean distance.
  double strip_dist(Point2d q, double band) const;
};

// An end node of the edge that receives the new node.
struct EdgeEnd {
  Point2d p;
  double r = 0.0;        // plain clearance
  bool deleted = false;  // status DELETED: on the side of the new site
};

// The edge e: its end nodes and its sites (left and right seen from n1).
struct EdgeFrame {
  EdgeEnd n1, n2;
  SiteRef left, right;

  // The kept end node: n1, or n2 when n1 is DELETED.
  const EdgeEnd& kept() const { return n1.deleted ? n2 : n1; }
  // The deleted end node: n1 if DELETED, otherwise n2.
  const EdgeEnd& gone() const { return n1.deleted ? n1 : n2; }
};

// Result of one node computation.
struct NodeResult {
  Point2d n;
  double r = 0.0;
  bool copied = false;         // a copy of an end node, not a computed point
  std::int32_t on_point = -1;  // input point on which the node lies, or -1
};

// A pair of sites that a construction found degenerate (coincident points, a
// point on a segment, duplicate segments); the input repair tests it first.
struct SuspectPair {
  bool set = false;
  std::int32_t site1 = -1, kind1 = kKindNone, site2 = -1, kind2 = kKindNone;
  void record(std::int32_t s1, std::int32_t k1, std::int32_t s2, std::int32_t k2) {
    set = true;
    site1 = s1;
    kind1 = k1;
    site2 = s2;
    kind2 = k2;
  }
  void clear() { *this = SuspectPair{}; }
};

// Memory of the point-segment-segment construction: once it met a point on a
// segment's line, later constructions orient the lines by the kept end node.
// The segment insertion resets it at its start, so that no result depends on
// what earlier insertions met.
struct NodeMemory {
  bool orient_by_kept = false;
  void reset() { orient_by_kept = false; }
};

}  // namespace zt::vd::geo
