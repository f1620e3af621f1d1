// A reference of the program's whole computation built with Clipper, for the
// end-to-end oracle and the benchmark: per level the rest material grown by
// the offset distance (round joins at the same arc tolerance) and cut to the
// finishing region; then from the deepest level up each level's zones grown
// by the merge radius + 0.04, united with those carried from below, and the
// union shrunk by the merge radius. Levels follow the driver's rules: a
// level reaches the zone builder only with more than 4 records. Also the
// generated pockets that the zone builder's and the program's oracles share.
#pragma once

#include <algorithm>
#include <cmath>
#include <map>
#include <random>
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

// Rest material grown by `delta`: a contour of two distinct points (A, B, A)
// bounds no area and grows into its stroke, which Clipper gives only as an
// open path with round ends.
inline cl::Paths grow_rest(const std::vector<RefPoly>& rest, double delta) {
  cl::ClipperOffset co(2.0, kArcTolerance * kClipperScale);
  for (const RefPoly& p : rest) {
    const cl::Path path = to_path(p);
    const bool stroke = path.size() == 2;
    co.AddPath(path, cl::jtRound, stroke ? cl::etOpenRound : cl::etClosedPolygon);
  }
  cl::Paths out;
  co.Execute(out, delta * kClipperScale);
  return out;
}

// A level's own zones: its rest material grown and cut to its finishing region.
inline cl::Paths level_zones(const RefLevel& l, double offsetDistance) {
  return clip(to_paths(l.finishing), grow_rest(l.rest, offsetDistance), cl::ctIntersection);
}

// The bottom-up assembly of the zones with a pipeline's own steps:
// level_zones_of(level) gives a level's own zones, offset(paths, delta) grows
// (delta > 0) or shrinks them. Final zones per level z (levels below the
// deepest one with zones absent); a level counts from `minRecords` records on.
template <typename LevelZones, typename Offset>
std::map<float, cl::Paths> assemble_zones(const std::vector<RefLevel>& levels, double mergeRadius,
                                          std::size_t minRecords, LevelZones level_zones_of, Offset offset) {
  std::map<float, cl::Paths> finals;
  cl::Paths carried, last;
  bool any = false;
  for (auto it = levels.rbegin(); it != levels.rend(); ++it) {
    if (level_records(*it) >= minRecords) {
      const cl::Paths zones = level_zones_of(*it);
      if (!zones.empty()) {
        carried = clip(carried, offset(zones, mergeRadius + kMergeMargin), cl::ctUnion);
        last = offset(carried, -mergeRadius);
        any = true;
      }
    }
    if (any) finals[it->z] = last;
  }
  return finals;
}

// The reference pipeline's zones; minRecords is the driver's 5 (the zone
// builder, called directly, takes any).
inline std::map<float, cl::Paths> reference_zones(const std::vector<RefLevel>& levels, double offsetDistance,
                                                  double mergeRadius, std::size_t minRecords = 5) {
  return assemble_zones(
      levels, mergeRadius, minRecords, [&](const RefLevel& l) { return level_zones(l, offsetDistance); },
      [](const cl::Paths& in, double delta) { return round_offset(in, delta); });
}

inline RefPoly rectangle_poly(float x0, float y0, float x1, float y1, bool cw = false) {
  RefPoly p{{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}, {x0, y0}};
  if (cw) std::reverse(p.begin(), p.end());
  return p;
}

// The shape of a generated pocket: its smallest side, where its rectangular
// island sits (fractions of the sides), how many levels beyond two it may
// have, and whether it has a round island and material along its top wall.
struct PocketShape {
  float minSide, islandX, islandY;
  int extraLevels;
  bool roundIsland, wallBand;
};

// A pocket [0, w] x [0, h] with its islands, the same on levels 10, 5, 0...,
// and on each level rest material in some of its corners and around the
// island's lower left corner (float coordinates, as the record files hold).
inline std::vector<RefLevel> pocket_case(std::mt19937& rng, const PocketShape& s) {
  std::uniform_real_distribution<float> side(s.minSide, 110), fillet(2, 7), coin(0, 1);
  const float w = std::round(side(rng)), h = std::round(side(rng));
  const float ix = std::round(w * s.islandX), iy = std::round(h * s.islandY);
  std::vector<RefPoly> finishing{rectangle_poly(0, 0, w, h), rectangle_poly(ix, iy, ix + 15, iy + 12, true)};
  if (s.roundIsland) {
    RefPoly boss;  // clockwise, 48 sides
    const float cx = w * 0.25f, cy = h * 0.3f;
    for (int i = 0; i < 48; ++i) {
      const double a = 2 * 3.14159265358979323846 * i / 48;
      boss.push_back({static_cast<float>(cx + 8 * std::cos(a)), static_cast<float>(cy + 8 * std::sin(a))});
    }
    boss.push_back(boss.front());
    std::reverse(boss.begin(), boss.end());
    finishing.push_back(boss);
  }
  std::vector<RefLevel> levels;
  const int count = 2 + static_cast<int>(coin(rng) * static_cast<float>(s.extraLevels + 1));
  for (int k = 0; k < count; ++k) {
    RefLevel level{10.0f - 5.0f * static_cast<float>(k), finishing, {}};
    auto corner = [&](float cx, float cy, float sx, float sy) {
      if (coin(rng) < 0.4f) return;
      const float r = fillet(rng);
      RefPoly t = {{cx, cy}, {cx + sx * r, cy}, {cx, cy + sy * r}, {cx, cy}};
      if (sx * sy < 0) std::reverse(t.begin(), t.end());
      level.rest.push_back(t);
    };
    corner(0, 0, 1, 1);
    corner(w, 0, -1, 1);
    corner(w, h, -1, -1);
    corner(0, h, 1, -1);
    if (coin(rng) < 0.5f) {
      const float r = fillet(rng);
      level.rest.push_back({{ix - r, iy - r}, {ix + 4, iy - r}, {ix + 4, iy}, {ix, iy},
                            {ix, iy + 4}, {ix - r, iy + 4}, {ix - r, iy - r}});
    }
    if (s.wallBand && coin(rng) < 0.4f) level.rest.push_back(rectangle_poly(20, h - 0.3f, w - 20, h));
    levels.push_back(level);
  }
  return levels;
}

}  // namespace zt::e2e
