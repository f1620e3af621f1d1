// The fixed-size records of the overlay graph. They come from the engine's
// pools, are addressed by pointer, and never move while an operation runs.
#pragma once

#include <cstdint>

#include "core/points.hpp"

namespace zt::detail {

struct HalfEdge;
struct SplitPoint;

// Owner of a vertex met by both operands, or created at a crossing.
inline constexpr std::int32_t kSharedOwner = 300;
// Edge ends at a vertex are counted up to this: more than two is what matters.
inline constexpr std::int16_t kManyEnds = 3;
// Keep marks of half-edges and star entries.
inline constexpr std::int32_t kUndecided = -1;
// Emission mark of a written half-edge, and direction mark of a paired star entry.
inline constexpr std::int32_t kDoneMark = 400;

struct Vertex {
  std::int32_t owner = 0;  // 1, 2, or kSharedOwner
  std::int32_t sweepMark = 0;  // star classification: 0 not met, 1 waiting or swept
  double x = 0.0;          // normalised coordinates
  double y = 0.0;
  std::int32_t serial = 0;  // creation order within the operation
  // Ends of closed contours' edges at the vertex, of A's and of B's
  // (counted up to kManyEnds): more than two where contours of one operand
  // touch, or one passes twice.
  std::int16_t ends[2] = {0, 0};
  Vertex* nextInBucket = nullptr;
  Vertex* nextShared = nullptr;
  HalfEdge* firstOut = nullptr;
};

struct Edge {
  Vertex* start = nullptr;
  Vertex* end = nullptr;
  SplitPoint* splits = nullptr;  // ascending t
  std::uint32_t tag = 0;
  // An edge of an open polyline bounds nothing: it never changes its
  // operand's inside status and no ray counts it.
  std::uint16_t open = 0;
  // Split points recorded at the edge's own start (bit 0) or end (bit 1)
  // from a meeting point exactly there, whose t is always the same: a
  // second one would be dropped by the settling, so it is not recorded.
  std::uint16_t endsSplit = 0;
  // The monotone run of its contour the edge belongs to (box_tree.cpp).
  std::int32_t run = -1;
};

// Exact extent of an edge (normalised coordinates). Boxes are compared with
// a margin (boxes_near), so no rounding of theirs can lose a meeting.
struct EdgeBox {
  double xmin = 0.0, ymin = 0.0, xmax = 0.0, ymax = 0.0;
  Edge* edge = nullptr;
};

struct BoxTreeNode {
  double xmin = 0.0, ymin = 0.0, xmax = 0.0, ymax = 0.0;
  BoxTreeNode* low = nullptr;  // both null in a leaf
  BoxTreeNode* high = nullptr;
  std::int32_t first = 0;  // inclusive range of box indexes
  std::int32_t last = -1;
  // The run all its boxes' edges belong to, or -1 (they belong to several).
  std::int32_t run = -1;
};

struct SplitPoint {
  double t = 0.0;
  Vertex* vertex = nullptr;
  SplitPoint* next = nullptr;
};

struct HalfEdge {
  std::int32_t side = 0;  // +owner along its contour, -owner against it
  std::int32_t keep = kUndecided;
  std::int32_t emitted = -1;
  // Set by the star classification along the whole chain: the inside status
  // of each operand on the half-edge's left (bit 0 A, bit 1 B), or -1 before
  // a sweep reached the chain.
  std::int32_t leftStates = -1;
  Vertex* origin = nullptr;
  HalfEdge* twin = nullptr;
  HalfEdge* nextOut = nullptr;
  HalfEdge* link = nullptr;  // contour continuation, or output partner at a shared vertex
  Edge* edge = nullptr;
  // Set by the star classification along the whole chain: the other
  // operand's inside status along the piece (-1 unknown, or where both
  // operands' boundaries run along it), and whether the result lies on the
  // half-edge's left (-1 unknown).
  std::int32_t otherState = -1;
  std::int32_t resultLeft = -1;
};

struct StarEntry {
  std::int32_t direction = 0;  // +1 / -1 kept, 0 dropped, kDoneMark once paired
  std::int32_t keep = 0;
  double angle = 0.0;
  HalfEdge* half = nullptr;
  Vertex* to = nullptr;        // the half-edge's far end
  std::int32_t operand = 0;    // 1 or 2
  std::int32_t open = 0;       // of an open polyline
};

struct InputContour {
  std::int32_t firstEdge = -1;
  std::int32_t endEdge = -1;  // exclusive
  std::int32_t hasSplits = -1;
  std::int32_t keepWhole = 0;
  std::int32_t reversed = 0;  // kept whole, written against its input direction
  std::int32_t closed = 1;
  // The contour's points as read, contiguous in the engine's point store.
  std::int32_t firstPoint = 0;
  std::int32_t pointCount = 0;
  HalfEdge* firstHalf = nullptr;
  HalfEdge* lastHalf = nullptr;
};

}  // namespace zt::detail
