// The segment phase of a computation: insertion of the segments into the
// diagram of their end points, and the final splitting of edges at segment
// end points. Each insertion returns early with a restart pending when it
// had to repair the input.
#pragma once

#include <cstdint>

namespace zt::vd {

void InsertSegment(std::int32_t s);
void SplitAtSegmentEndPoints();

}  // namespace zt::vd
