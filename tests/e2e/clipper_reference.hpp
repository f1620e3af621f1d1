// A reference of the program's whole computation built with Clipper, for the
// end-to-end oracle and the benchmark: per level the rest material grown by
// the offset distance (round joins at the same arc tolerance) and cut to the
// finishing region; then from the deepest level up each level's zones grown
// by the merge radius + 0.04, united with those carried from below, and the
// union shrunk by the merge radius. Levels follow the driver's rules: a
// level reaches the zone builder only with more than 4 records.
#pragma once

#include <map>
#include <vector>

#include "tests/support/clipper_paths.hpp"

namespace zt::e2e {

namespace cl = ClipperLib;
using test::boundary_distance;
using test::clip;
using test::kClipperScale;
using test::to_path;

inline constexpr double kArcTolerance = 0.005;
inline constexpr double kMergeMargin = 0.04;

struct RefPt {
  double x, y;
};
using RefPoly = std::vector<RefPt>;  // closed: first point repeated

struct RefLevel {
  float z;
  std::vector<RefPoly> finishing;  // outer counter-clockwise, islands clockwise
  std::vector<RefPoly> rest;       // outer counter-clockwise
};

inline cl::Paths to_paths(const std::vector<RefPoly>& polys) {
  cl::Paths out;
  for (const RefPoly& p : polys) out.push_back(to_path(p));
  return out;
}

inline cl::Paths round_offset(const cl::Paths& in, double delta) {
  return test::round_offset(in, delta, kArcTolerance);
}

// Records of a level's range in stock1.bin: its points and the separators
// between its contours.
inline std::size_t level_records(const RefLevel& l) {
  std::size_t n = 0;
  for (const RefPoly& p : l.rest) n += p.size();
  return l.rest.empty() ? 0 : n + l.rest.size() - 1;
}

// Final zones per level z (levels below the deepest one with zones absent).
inline std::map<float, cl::Paths> reference_zones(const std::vector<RefLevel>& levels, double offsetDistance,
                                                  double mergeRadius) {
  std::map<float, cl::Paths> finals;
  cl::Paths carried, last;
  bool any = false;
  for (auto it = levels.rbegin(); it != levels.rend(); ++it) {
    if (level_records(*it) > 4) {
      const cl::Paths zones =
          clip(to_paths(it->finishing), round_offset(to_paths(it->rest), offsetDistance), cl::ctIntersection);
      if (!zones.empty()) {
        carried = clip(carried, round_offset(zones, mergeRadius + kMergeMargin), cl::ctUnion);
        last = round_offset(carried, -mergeRadius);
        any = true;
      }
    }
    if (any) finals[it->z] = last;
  }
  return finals;
}

}  // namespace zt::e2e
