// The initial diagram: the four corner points and the first caller point
// (slot 2), with four far nodes closing the outer face.
//
// Promise: a valid diagram of five sites (see checker.hpp); the outer face is
// the left side of edges 8-11 (site -1, kind 8), and edges 0-3 (between two
// corner points, ending at a far node) never carry anything of interest.
#pragma once

#include <cstdint>

namespace zt::vd {

// How far the far nodes are moved out from their circumcentres: their
// squared distances stay finite.
inline constexpr double kFarNodeDistanceDivisor = 10.0;

// The caller point the initial diagram holds.
inline constexpr std::int32_t kInitialDiagramPoint = 2;

void BuildInitialDiagram();

}  // namespace zt::vd
