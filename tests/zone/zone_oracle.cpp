// Oracle: the zone builder's zones, per level and final, against the Clipper
// reference (round offsets at the same arc tolerance, intersection, then the
// grow / unite / shrink over the levels), on generated pockets with an
// island and rest material in their corners, on the real engines.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <random>

#include "zone/entry_points.hpp"
#include "e2e/clipper_reference.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

using e2e::RefLevel;
using e2e::RefPoly;

constexpr double kBoundaryDistance = 0.02;
constexpr double kMergeRadius = 2.0;
constexpr double kOffsetDistance = 1.0;

using Poly = std::vector<Point2f>;  // closed: first point repeated

std::vector<Poly> to_float(const std::vector<RefPoly>& polys) {
  std::vector<Poly> out;
  for (const RefPoly& p : polys) {
    out.emplace_back();
    for (const auto& q : p) out.back().push_back({static_cast<float>(q.x), static_cast<float>(q.y)});
  }
  return out;
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
    const std::vector<RefLevel> levels = e2e::pocket_case(rng, {60, 0.4f, 0.4f, 2, false, false});
    std::vector<LevelContours> file;
    std::vector<float> zs;
    for (const RefLevel& l : levels) {
      file.push_back({l.z, to_float(l.finishing)});
      zs.push_back(l.z);
    }
    write_file("contour.bin", record_file(file));
    write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");
    std::int32_t ierr = -1;
    wf_init_czone(zs.data(), static_cast<std::int32_t>(zs.size()), ierr);
    ASSERT_EQ(ierr, 0);
    for (const RefLevel& l : levels) {
      const std::vector<Point2f> pts = stock_points(to_float(l.rest));
      if (pts.size() <= 4) continue;  // the driver's rule
      wf_add_level(l.z, pts.data(), static_cast<std::int32_t>(pts.size()), ierr);
      ASSERT_EQ(ierr, 0) << "level " << l.z;
      // The level's own zones before the merge.
      const auto want = e2e::level_zones(l, kOffsetDistance);
      std::vector<Poly> got(1);
      for (const Point2f& p : zone_builder().context->levelResult) {
        if (p.x < 99990.0f) got.back().push_back(p);
        else if (!got.back().empty()) got.emplace_back();
      }
      if (got.back().empty()) got.pop_back();
      EXPECT_EQ(got.size(), want.size()) << "level " << l.z;
      const double d = test::boundary_distance(got, want);
      EXPECT_LE(d, kBoundaryDistance) << "zones of level " << l.z;
      worstLevel = std::max(worstLevel, d);
      ++compared;
    }
    const WrittenZones written = finish_zones(3, ierr);
    ASSERT_EQ(ierr, 0);
    const auto ref = e2e::reference_zones(levels, kOffsetDistance, kMergeRadius, 1);
    for (const RefLevel& l : levels) {
      const auto r = ref.find(l.z);
      const auto o = written.find(l.z);
      ASSERT_EQ(r != ref.end() && !r->second.empty(), o != written.end()) << "level " << l.z;
      if (o == written.end()) continue;
      EXPECT_EQ(o->second.size(), r->second.size()) << "level " << l.z;
      const double d = test::boundary_distance(o->second, r->second);
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
