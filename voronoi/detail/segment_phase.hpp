// The segment phase of a computation: insertion of the segments into the
// diagram of their end points, and the final splitting of edges at segment
// end points. Each insertion returns early with a restart pending when it
// had to repair the input.
#pragma once

#include <cstdint>

namespace zt::vd {

// The segment phase's insertion order, drawn front to back. Polygon input
// comes in contour order, and a segment inserted next to the one before it
// finds the records its insertion touches in cache: the order is the index
// order. That order pays only while each insertion deletes few nodes. A
// segment long against the spacing of the points around it crosses many
// regions of the points' diagram, and in index order its neighbours, inserted
// just before it, leave the nodes along all its length for it to delete
// again; such input gets a partly sorted random order instead (random rounds
// doubling in size, each in index order), under which a new segment mostly
// meets segments inserted near it in an earlier round.
void BuildSegmentOrder();
void InsertSegment(std::int32_t s);
// Splits every edge between a segment and one of its end points that passes
// through that point (see SplitRegionAtEndPoints); returns how many it split.
// An insertion splits its own new edges so, and later insertions only cut
// edges shorter, so after insertions that all built their regions this pass
// finds nothing; only a fallback's region may need it.
std::int32_t SplitAtSegmentEndPoints();

}  // namespace zt::vd
