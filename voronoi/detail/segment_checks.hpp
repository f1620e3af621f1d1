// Checks of the edges that touch segments, beside the diagram checker, for
// debug builds and tests: every edge's midpoint is equidistant from its two
// sites (by true distances), and the clearance is monotone along every edge
// between a segment and one of its own end points and along every edge
// between two segments.
#pragma once

#include <string>

namespace zt::vd {

// Relative tolerance of both checks, as the diagram checker's.
inline constexpr double kEdgeCheckTolerance = 1e-9;

// Empty when sound, else the first violation found.
std::string CheckSegmentEdges();

}  // namespace zt::vd
