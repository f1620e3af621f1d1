// Diagrams of points and segments through the facade: invariants after the
// whole computation, restarts and recovery mode on clean and defective input.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "tests/voronoi/vd_test_util.hpp"

namespace zt::vdtest {
namespace {

using Contour = std::vector<Pt>;

// Stores closed contours as points and segments between consecutive points.
void StoreContours(const std::vector<Contour>& contours) {
  VD_Initialize();
  VD_Reset();
  std::int32_t tag = 0;
  for (const Contour& c : contours) {
    std::vector<std::int32_t> idx;
    for (const Pt& p : c) idx.push_back(API_AddPoint(p.x, p.y, tag++));
    for (std::size_t i = 0; i < idx.size(); ++i) API_AddSegment(idx[i], idx[(i + 1) % idx.size()], tag++);
  }
}

bool ComputeSegments() { return VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true); }

TEST(SegmentDiagram, Square) {
  StoreContours({{{0, 0}, {1, 0}, {1, 1}, {0, 1}}});
  ASSERT_TRUE(ComputeSegments());
  EXPECT_EQ(FinalCheck(), "");
  EXPECT_EQ(VD_GetRestartCount(), 0);
  EXPECT_FALSE(VD_InRecoveryMode());
}

// A star-shaped simple polygon: sorted random angles, random radii.
Contour StarPolygon(int n, std::uint32_t seed, Pt centre = {0.5, 0.5}, double rmin = 0.2, double rmax = 0.45) {
  std::mt19937 rng(seed);
  // Jittered even angles: every gap stays below half a turn (n >= 4).
  std::uniform_real_distribution<double> ua(0.0, 0.8), ur(rmin, rmax);
  std::vector<double> ang(n);
  for (int i = 0; i < n; ++i) ang[i] = 2 * M_PI * (i + ua(rng)) / n;
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double r = ur(rng);
    c.push_back({centre.x + r * std::cos(ang[i]), centre.y + r * std::sin(ang[i])});
  }
  return c;
}

TEST(SegmentDiagram, StarPolygons) {
  for (int n : {4, 5, 10, 30, 100, 400}) {
    for (std::uint32_t seed = 1; seed <= 6; ++seed) {
      StoreContours({StarPolygon(n, seed * 7919 + n)});
      ASSERT_TRUE(ComputeSegments()) << n << " " << seed;
      ASSERT_EQ(FinalCheck(), "") << n << " " << seed;
      EXPECT_EQ(VD_GetRestartCount(), 0) << n << " " << seed;
      EXPECT_FALSE(VD_InRecoveryMode()) << n << " " << seed;
    }
  }
}

}  // namespace
}  // namespace zt::vdtest
