// Invariant checker of the diagram, for debug builds and tests.
//
// Topology: edges and nodes referenced by live records are live; the
// neighbour fields of an edge name edges of the same node; rotating around a
// node returns after its degree (2 or 3); every region boundary is one cycle
// of a single site, every site with a region has exactly one; V - E + F = 2
// counting the outer face. Geometry: every node (but the four far nodes) is
// equidistant from its sites within kCheckTolerance*(1 + r), and no site is
// closer: checked across each edge (local emptiness, which for a valid
// diagram is equivalent) or, optionally, against every site (brute force).
#pragma once

#include <string>

namespace zt::vd {

inline constexpr double kCheckTolerance = 1e-9;

struct CheckOptions {
  bool geometry = true;
  bool bruteForce = false;  // every node against every site
  bool complete = false;    // every live caller point must have a region
};

// Empty string when the diagram is sound, else a description of the first
// violation found.
std::string CheckDiagram(const CheckOptions& options = {});

}  // namespace zt::vd
