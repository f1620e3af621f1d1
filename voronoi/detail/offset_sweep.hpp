// ComputeOffsets: the family of offsets t, t + d, t + 2d, ... below the
// maximal offset, traced on the current diagram into the offset store.
#pragma once

#include <cstdio>

namespace zt::vd {

// Most distances one request may trace; a request whose step would give
// more is refused.
inline constexpr double kMaxOffsetDistances = 100000.0;

// t and d in user units; left and right both false mean both sides. Returns
// false when a curve could not be traced (the store keeps the curves traced
// before it) or the step would give more than kMaxOffsetDistances distances.
// `finished` tells whether the sequence has ended.
bool ComputeOffsets(bool timing, const char* outputFile, bool write, bool dxfFormat, double t,
                    double d, bool& finished, bool left, bool right);

// Writes the whole offset store, in user coordinates, as plain text or DXF;
// false when the file cannot be written.
bool WriteOffsetStore(const char* path, bool dxfFormat);

}  // namespace zt::vd
