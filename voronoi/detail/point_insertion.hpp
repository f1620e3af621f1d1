// Insertion of one point into the diagram of the points inserted so far.
//
// The nodes whose circles contain the new point are deleted as a tree grown
// from a seed node; the tree never closes a cycle and never takes the whole
// boundary of an old region, so every region stays connected and non-empty
// whatever the rounding of the conflict tests. The new region is bounded by
// new nodes cut into the edges that leave the tree, joined in a
// counter-clockwise tour around the tree.
//
// Node radii are squared during this phase.
#pragma once

#include <cstdint>

#include "voronoi/detail/nearest_search.hpp"

namespace zt::vd {

class PointLookahead;

// Inserts p, whose nearest inserted point the search gave (see
// point_lookahead.hpp). Returns with the diagram extended, with the point
// merged as a duplicate, or with a restart pending after an input repair.
// `ahead` is stepped at checkpoints along the way (hints only).
void InsertPoint(std::int32_t p, const Nearest& nearest, PointLookahead& ahead);

// Frees the scratch lists of the insertions (they are otherwise reused).
void ReleaseInsertionScratch();

}  // namespace zt::vd
