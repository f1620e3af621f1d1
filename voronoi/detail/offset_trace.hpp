// Tracing of offset curves into the offset store.
#pragma once

#include <cstdint>

namespace zt::vd {

// Traces the closed curve at distance t (internal units) through edge e0,
// whose radii satisfy min <= t < max, and appends it to the offset store.
// Every crossed edge loses its candidate flag. Returns false, removing the
// partial curve, when the walk meets an edge it already crossed in this
// pass (other than e0) or runs longer than the diagram allows: a broken
// diagram ends the request instead of looping.
bool TraceCurve(std::int32_t e0, double t);

// Full circles about every isolated point, at s = t, t + step, ... while s
// stays within the point's region; each a curve of two half-circle elements.
void AddIsolatedPointCircles(double t, double step);

}  // namespace zt::vd
