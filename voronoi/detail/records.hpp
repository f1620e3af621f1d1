// Fixed-size records of the Voronoi engine: input sites (points, segments,
// arcs), diagram nodes and edges, and the small records of the bookkeeping
// lists.
//
// Records are plain data, stored by value in contiguous arrays and addressed
// by 32-bit indices; -1 means "no index" everywhere. Their sizes are part of
// the engine's memory budget and are checked at compile time.
#pragma once

#include <cstdint>

namespace zt::vd {

// Site kinds, as stored in edge records (ltype, rtype) and offset elements.
inline constexpr std::int32_t SEG = 0;
inline constexpr std::int32_t ARC = 1;
inline constexpr std::int32_t PNT = 2;
// No site: the outside of the four outer edges of the initial diagram.
inline constexpr std::int32_t kNoSiteKind = 8;

inline constexpr std::int32_t kNone = -1;

// Node status values.
enum NodeStatus : std::uint32_t {
  UNCHECKED = 0,
  CHECKED = 1,
  DELETED = 2,
  VISITED = 3,
  DUMMY = 4,
  MISC = 5,
};

struct PointRecord {
  double x;
  double y;
  std::int32_t vd;      // an edge of the point's region; -1 until inserted
  std::int32_t node;    // degree-2 node placed on this point as a segment end
  std::uint8_t marked;  // scratch mark of one insertion
  std::uint8_t hasNode;
  std::uint8_t deleted;  // merged into another point
  std::int32_t arc;      // arc this point approximates, -1 if none
  std::int32_t tag;
};

struct SegmentRecord {
  std::int32_t i1;
  std::int32_t i2;
  std::uint8_t flag;
  // Copies of this segment given from i1 to i2, less those given from i2 to
  // i1: the cleaning keeps one record of a repeated segment. 0 for an edge
  // given both ways (an edge two touching contours share, a spike), which
  // bounds no area and has the same material on both of its sides.
  std::int16_t directions;
  // Supporting line a*x + b*y + c = 0, (a, b) the unit normal to the left;
  // a*x + b*y + c > 0 on the left of the directed segment.
  double a;
  double b;
  double c;
  double length;
  std::int32_t vd;
  std::int32_t tag;
  std::int32_t arc;
};

// Folds the directions of `removed`, a repeated copy of `kept` (the same
// two end points) that the cleaning drops, into `kept`.
inline void AbsorbRepeatedSegment(SegmentRecord& kept, const SegmentRecord& removed) {
  const int sum = kept.directions + (removed.i1 == kept.i1 ? removed.directions : -removed.directions);
  kept.directions = static_cast<std::int16_t>(sum < INT16_MIN ? INT16_MIN : (sum > INT16_MAX ? INT16_MAX : sum));
}

// Arcs are stored and transformed but never inserted into the diagram.
struct ArcRecord {
  std::int32_t i1;
  std::int32_t i2;
  double cx;
  double cy;
  double startAngle;
  double endAngle;
  double sweep;
  double chordLength;
  double startDir[2];
  double bulge;
  double radius;  // mean distance from the centre to the two end points
  std::uint8_t orientation;
  std::int32_t vd;
  std::int32_t tag;
};

struct NodeRecord {
  double x;
  double y;
  // Clearance; its square while the diagram of points is built (see the
  // engine's nodeRadiiSquared flag).
  double r;
  std::uint32_t status;
  std::int32_t edge;  // one incident edge
  std::int32_t site;  // input point under a degree-2 node, else -1
  std::uint8_t degree2;
  std::int32_t spare;
};

struct EdgeRecord {
  std::int32_t n1;
  std::int32_t n2;
  std::int32_t lft;  // sites left and right, seen from n1 towards n2
  std::int32_t rgt;
  std::int32_t ltype;
  std::int32_t rtype;
  std::int32_t s_ccw;  // neighbours counter-clockwise / clockwise around n1
  std::int32_t s_cw;
  std::int32_t e_ccw;  // ... and around n2
  std::int32_t e_cw;
  std::uint8_t deleted;  // on the free list
  std::uint8_t maMark;   // medial-axis mark, reset by the offset preparation
  std::int32_t spare;
};

// A temporary degree-2 node and the two edges it separates; the clean-up
// folds `merged` back into `kept` and frees the node.
struct Degree2Record {
  std::int32_t kept;
  std::int32_t merged;
  std::int32_t node;
};

// Offset store (filled by the offset tracing).
struct OffsetCurveRecord {
  std::int32_t first;
  std::int32_t last;  // inclusive
  double offset;      // user units
};

struct OffsetElementRecord {
  std::int32_t site;
  std::int32_t kind;  // 0 segment, 2 point, 6/7 arc inside/outside its circle
  double x;           // start point, internal coordinates
  double y;
};

static_assert(sizeof(PointRecord) == 40);
static_assert(sizeof(SegmentRecord) == 64);
static_assert(sizeof(ArcRecord) == 104);
static_assert(sizeof(NodeRecord) == 48);
static_assert(sizeof(EdgeRecord) == 48);
static_assert(sizeof(Degree2Record) == 12);
static_assert(sizeof(OffsetCurveRecord) == 16);
static_assert(sizeof(OffsetElementRecord) == 24);

}  // namespace zt::vd
