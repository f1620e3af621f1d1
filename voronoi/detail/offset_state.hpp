// State of the offset machinery: per-edge flags and tracing data, the work
// list of edges that may carry offsets, and the running distance sequence.
//
// The per-edge arrays are indexed like the diagram's edges and are valid for
// the diagram generation recorded in `preparedGeneration`; VD_Reset empties
// them (memory kept) and VD_Terminate frees them.
#pragma once

#include <cstdint>

#include "core/per_thread.hpp"
#include "voronoi/detail/storage.hpp"

namespace zt::vd {

// Radii, clearance differences and lengths at or below this are zero
// (internal units).
inline constexpr double kOffsetZero = 1e-11;
// Growth of the side-classification stack, in records.
inline constexpr std::int32_t kTraversalGrowth = 32768;

// How the clearance varies along an edge, from its two sites.
enum class OffsetEdgeKind : std::uint8_t {
  kLine,        // two segments, or a segment and one of its own end points
  kParabola,    // a point and a segment that does not end at it
  kPointPoint,  // two points
  kOther,       // an arc or an absent site: traced through fallback points
};

struct OffsetEdgeData {
  std::uint8_t needsComputing;
  std::uint8_t degenerate;  // constant clearance or no usable direction
  OffsetEdgeKind kind;
  std::uint8_t branch;  // parabola: 1 when the far node lies along +tau
  // line: D (vector from the smaller- to the larger-radius node), unused;
  // point-point: unit direction u, h^2;
  // parabola: foot F of the point on the segment's line, signed distance d.
  double v0, v1, v2;
};

struct TraversalEntry {
  std::int32_t edge;
  std::int32_t node;  // the node to cross from
};

// One part of the diagram in the side classification: its edges start at
// component[firstEdge]; parts that face each other across segments given
// both ways form one group (union-find through `parent`), which lies on
// the side its one-sided segments say, by length.
struct PartRecord {
  std::int32_t firstEdge;
  std::int32_t parent;
  double leftLength;
  double rightLength;
};

struct OffsetState {
  RecordArray<std::uint8_t> candidate;  // 1: may start a curve at this distance
  RecordArray<std::int32_t> crossedPass;  // pass in which the edge was last crossed
  RecordArray<OffsetEdgeData> data;
  RecordArray<std::int32_t> workList;
  RecordArray<TraversalEntry> stack;
  // Side classification: the edges of every part, one part after another;
  // the parts; the segments the current part borders and, per segment, the
  // sides it lies on (kOnLeft|kOnRight); per segment given both ways, the
  // first part seen beside it (-1 before).
  RecordArray<std::int32_t> component;
  RecordArray<PartRecord> parts;
  RecordArray<std::int32_t> bordered;
  RecordArray<std::uint8_t> segmentSides;
  RecordArray<std::int32_t> segmentPart;
  double distance = 0.0;  // internal units
  double step = 0.0;
  bool finished = true;
  bool written = false;
  bool failed = false;  // a curve of the running sequence could not be traced
  std::int32_t pass = 0;
  std::int32_t lastGeneration = -1;      // generation of the running sequence
  std::int32_t preparedGeneration = -1;  // generation whose edges are split for tracing
  std::int32_t dataGeneration = -1;      // generation of the per-edge data
};

// The calling thread's offset state, beside its engine (see Vd()).
inline OffsetState& Offs() { return PerThread<OffsetState>::mine(); }

// Empties the lists (memory kept) and forgets the prepared generation.
void ResetOffsetState();
// Frees the arrays.
void FreeOffsetState();

}  // namespace zt::vd
