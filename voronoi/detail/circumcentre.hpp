// Circumcentre of three point sites.
//
// Promise: the result does not depend on the order of the three indices.
// Fails (false) for equal indices, for two of the points within
// kSuspectDistance of each other (then the pair is recorded as the suspect
// pair for the input repair), and for three collinear points.
#pragma once

#include <cstdint>

namespace zt::vd {

// Two points this close (internal units) are a defect of the input.
inline constexpr double kSuspectDistance = 1e-11;

// (x, y) and the squared radius r2.
bool Circumcentre(std::int32_t i, std::int32_t j, std::int32_t k, double& x, double& y, double& r2);

}  // namespace zt::vd
