// Union, intersection and difference of planar regions bounded by polygons.
//
// Input: two TaggedPointLists of contours, each contour ended by a separator
// (a record with x above 99990; x at or above 99990 never starts one). A
// contour whose last point repeats its first (within 2^-47) is closed, any
// other is an open polyline. The closed contours of an operand bound its
// region by the even-odd rule, so contours may cross themselves or touch
// each other; parts that bound no area (spikes, segments run along there and
// back, two-point contours, slivers thinner than the tolerance) add nothing
// and flip nothing, and an operand made only of them is an empty region.
// Open polylines bound nothing. Every coordinate must be finite and at most
// 1e15 in magnitude.
//
// Output: the result contours, each followed by one separator (tag
// -100000000, x = y = 99999): first the contours that cross or touch no other
// contour (of either operand) and are kept whole (A's, then B's), then the
// contours chained from cut pieces. Union and intersection give
// counter-clockwise outer boundaries and clockwise holes, contours kept whole
// included (written reversed, from the same first point, when their input
// runs the other way); a contour crossing itself is cut at the crossing, so
// each lobe is oriented by itself. A difference contour runs in the
// direction of the piece its chain starts from: clockwise when that is a
// piece of B (the two overlapping squares), counter-clockwise when it is one
// of A; contours kept whole keep their input orientation. When an operand
// is an empty region, the other's contours come as read. Every point
// carries the tag of the input edge it lies on; where the tag changes, the
// point is written once with each tag. Consecutive points closer than 1e-7 with one tag are merged.
//
// Contours of fewer than three distinct points are left out.
//
// Returns 0, or -1 on failure: a null result, an unknown operation, an operand
// without any edge, bad coordinates, exhausted storage, or an overlay found
// inconsistent twice (an inconsistent overlay is retried once on coordinates
// rounded to a coarser grid). A failure before the classification leaves the
// result untouched; a later one leaves it empty. The operands are read
// completely before the result is touched, so the result may be either
// operand.
// One operation per thread at a time; each thread keeps its own engine.
#pragma once

#include "core/points.hpp"

namespace zt {

// op: its first character, in either case, selects U union, I intersection,
// D difference a minus b.
int rg_boolean(const TaggedPointList& a, const TaggedPointList& b, const char* op, TaggedPointList* result);

}  // namespace zt
