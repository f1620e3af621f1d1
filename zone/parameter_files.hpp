// The zone builder's two parameter files.
//
// "$TMP/zstock.ok": the offset distance of the rest material, the second
// number of the file (or the first when there is only one); it only ever
// raises the distance.
// "$TMP/grid.tmp": four pairs of numbers; the first of the third pair (s, a
// grid step) and the first of the fourth pair (the merge radius) are used.
// Values that are not finite or not positive change nothing.
#pragma once

#include <cstdint>

namespace zt {

// The merge radius starts at this.
inline constexpr float kDefaultMergeRadius = 10.0f;
// The grid step s counts at most this.
inline constexpr float kMaxGridStep = 0.5f;

// The process-wide merge radius of the final assembly.
extern float mergeRadius;

// Raises `offsetDistance` to the file's value when that is larger. A file
// that cannot be opened or holds no number changes nothing.
void read_offset_distance(const char* path, double& offsetDistance);

// Reads the four pairs and updates `radius`: the fourth pair's first number
// replaces it; then, when s was read, radius = max(radius, 2 x min(s, 0.5)).
// -1 when the file cannot be opened or read (radius unchanged), else 0.
std::int32_t read_merge_radius(const char* path, float& radius);

}  // namespace zt
