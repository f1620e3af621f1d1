// Oracle: the zone builder's final zones against a reference built with
// Clipper (round offsets at the same arc tolerance, intersection, then the
// grow / unite / shrink over the levels), on generated pockets with islands
// and rest material in their corners, on the real engines.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <random>

#include "zone/entry_points.hpp"
#include "support/clipper_paths.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

namespace cl = ClipperLib;
using test::boundary_distance;
using test::to_path;

constexpr double kArcTolerance = 0.005;
constexpr double kBoundaryDistance = 0.02;
constexpr double kMergeRadius = 2.0;
constexpr double kOffsetDistance = 1.0;

using Poly = std::vector<Point2f>;  // closed: first point repeated

cl::Paths offset(const cl::Paths& in, double delta) { return test::round_offset(in, delta, kArcTolerance); }

struct Level {
  float z;
  std::vector<Poly> pocket;  // outer counter-clockwise, islands clockwise
  std::vector<Poly> rest;    // counter-clockwise
};

Poly reversed(Poly p) {
  std::reverse(p.begin(), p.end());
  return p;
}

// A pocket [0, w] x [0, h] with a rectangular island, the same on every
// level, and rest material in some of its corners and the island's.
std::vector<Level> make_case(std::mt19937& rng) {
  std::uniform_real_distribution<float> size(60, 110), fillet(2, 7), coin(0, 1);
  const float w = std::round(size(rng)), h = std::round(size(rng));
  const Poly outer = rectangle(0, 0, w, h);
  const float ix = std::round(w * 0.4f), iy = std::round(h * 0.4f);
  const Poly island = reversed(rectangle(ix, iy, ix + 15, iy + 12));
  std::vector<Level> levels;
  const int count = 2 + static_cast<int>(coin(rng) * 3);
  for (int k = 0; k < count; ++k) {
    Level level{10.0f - 5.0f * k, {outer, island}, {}};
    auto fill = [&](float cx, float cy, float sx, float sy) {
      if (coin(rng) < 0.4f) return;
      const float r = fillet(rng);
      Poly t = {{cx, cy}, {cx + sx * r, cy}, {cx, cy + sy * r}, {cx, cy}};
      if (sx * sy < 0) t = reversed(t);
      level.rest.push_back(t);
    };
    fill(0, 0, 1, 1);
    fill(w, 0, -1, 1);
    fill(w, h, -1, -1);
    fill(0, h, 1, -1);
    // A ring of material around the island's lower left corner.
    if (coin(rng) < 0.5f) {
      const float r = fillet(rng);
      level.rest.push_back({{ix - r, iy - r}, {ix + 4, iy - r}, {ix + 4, iy}, {ix, iy},
                            {ix, iy + 4}, {ix - r, iy + 4}, {ix - r, iy - r}});
    }
    levels.push_back(level);
  }
  return levels;
}

// Final zones per level, from the bottom up, as the zone builder means them.
std::map<float, cl::Paths> reference(const std::vector<Level>& levels) {
  std::map<float, cl::Paths> finals;
  cl::Paths carried, last;
  bool any = false;
  for (auto it = levels.rbegin(); it != levels.rend(); ++it) {
    cl::Paths pocket, rest;
    for (const Poly& p : it->pocket) pocket.push_back(to_path(p));
    for (const Poly& p : it->rest) rest.push_back(to_path(p));
    const bool hasRest = !rest.empty();
    if (hasRest) {
      const cl::Paths zones = test::clip(pocket, offset(rest, kOffsetDistance), cl::ctIntersection);
      if (!zones.empty()) {
        carried = test::clip(carried, offset(zones, kMergeRadius + 0.04), cl::ctUnion);
        last = offset(carried, -kMergeRadius);
        any = true;
      }
    }
    if (any) finals[it->z] = last;
  }
  return finals;
}

std::map<float, std::vector<Poly>> g_written;
void keep_contour(const std::int32_t& n, const Point2f* p, const float& z, const std::int32_t&,
                  std::int32_t& ierr) {
  g_written[z].emplace_back(p, p + n);
  ierr = 0;
}

class ZoneOracle : public ZoneTmpTest {};

TEST_F(ZoneOracle, FinalZonesAgreeWithClipper) {
  std::mt19937 rng(20240611);
  double worst = 0.0, worstLevel = 0.0;
  int compared = 0, finals = 0;
  for (int c = 0; c < 25; ++c) {
    SCOPED_TRACE("case " + std::to_string(c));
    TearDown();
    SetUp();
    g_written.clear();
    const std::vector<Level> levels = make_case(rng);
    std::vector<LevelContours> file;
    std::vector<float> zs;
    for (const Level& l : levels) {
      file.push_back({l.z, l.pocket});
      zs.push_back(l.z);
    }
    write_file("contour.bin", record_file(file));
    write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");
    std::int32_t ierr = -1;
    wf_init_czone(zs.data(), static_cast<std::int32_t>(zs.size()), ierr);
    ASSERT_EQ(ierr, 0);
    for (const Level& l : levels) {
      const std::vector<Point2f> pts = stock_points(l.rest);
      if (pts.size() <= 4) continue;  // the driver's rule
      wf_add_level(l.z, pts.data(), static_cast<std::int32_t>(pts.size()), ierr);
      ASSERT_EQ(ierr, 0) << "level " << l.z;
      // The level's own zones before the merge.
      cl::Paths pocket, rest;
      for (const Poly& p : l.pocket) pocket.push_back(to_path(p));
      for (const Poly& p : l.rest) rest.push_back(to_path(p));
      const cl::Paths want = test::clip(pocket, offset(rest, kOffsetDistance), cl::ctIntersection);
      std::vector<Poly> got(1);
      for (const Point2f& p : zone_builder().context->levelResult) {
        if (p.x < 99990.0f) got.back().push_back(p);
        else if (!got.back().empty()) got.emplace_back();
      }
      if (got.back().empty()) got.pop_back();
      EXPECT_EQ(got.size(), want.size()) << "level " << l.z;
      const double d = boundary_distance(got, want);
      EXPECT_LE(d, kBoundaryDistance) << "zones of level " << l.z;
      worstLevel = std::max(worstLevel, d);
      ++compared;
    }
    std::vector<Point2f> buffer;
    ::testing::internal::CaptureStdout();
    wf_fin_czone(buffer, 3, ierr, keep_contour);
    ::testing::internal::GetCapturedStdout();
    ASSERT_EQ(ierr, 0);
    const auto ref = reference(levels);
    for (const Level& l : levels) {
      const auto r = ref.find(l.z);
      const auto o = g_written.find(l.z);
      ASSERT_EQ(r != ref.end() && !r->second.empty(), o != g_written.end()) << "level " << l.z;
      if (o == g_written.end()) continue;
      EXPECT_EQ(o->second.size(), r->second.size()) << "level " << l.z;
      const double d = boundary_distance(o->second, r->second);
      EXPECT_LE(d, kBoundaryDistance) << "level " << l.z;
      worst = std::max(worst, d);
      ++finals;
    }
  }
  EXPECT_GT(compared, 40);
  EXPECT_GT(finals, 40);
  RecordProperty("worst_boundary_distance", std::to_string(worst));
  std::printf("%d levels, %d final levels; worst boundary distance %.6f (level zones %.6f)\n",
              compared, finals, worst, worstLevel);
}

}  // namespace
}  // namespace zt::testing
