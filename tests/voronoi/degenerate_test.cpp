// Nearly degenerate point sets: large cocircular groups, points just above
// and below the merge distance, grids with jitter at the rounding level.
#include <gtest/gtest.h>

#include <cmath>

#include "vd_test_util.hpp"

namespace zt {
namespace {

using namespace vdtest;

void Checked(const std::vector<Pt>& pts) {
  Store(pts);
  CheckingObserver obs;
  obs.Attach();
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(obs.firstError, "");
  EXPECT_EQ(FinalCheck(), "");
}

TEST(DegeneratePoints, PointsOnOneCircle) {
  std::vector<Pt> pts;
  for (int i = 0; i < 720; ++i) pts.push_back({10 * std::cos(i * M_PI / 360), 10 * std::sin(i * M_PI / 360)});
  pts.push_back({0.0, 0.0});  // the centre, equidistant from all of them
  Checked(pts);
}

TEST(DegeneratePoints, ConcentricCirclesAndTheirCentre) {
  std::vector<Pt> pts{{0, 0}};
  for (int ring = 1; ring <= 8; ++ring)
    for (int i = 0; i < 64; ++i) pts.push_back({ring * std::cos(i * M_PI / 32), ring * std::sin(i * M_PI / 32)});
  Checked(pts);
}

TEST(DegeneratePoints, JitteredLatticeAtTheRoundingLevel) {
  std::vector<Pt> pts = LatticePoints(30, 0.1);
  std::mt19937 rng(4);
  std::uniform_int_distribution<int> ulp(-3, 3);
  for (Pt& p : pts) {
    for (int k = ulp(rng); k != 0; k += k > 0 ? -1 : 1) p.x = std::nextafter(p.x, k > 0 ? 10.0 : -10.0);
    for (int k = ulp(rng); k != 0; k += k > 0 ? -1 : 1) p.y = std::nextafter(p.y, k > 0 ? 10.0 : -10.0);
  }
  Checked(pts);
}

TEST(DegeneratePoints, PairsJustAboveAndBelowTheMergeDistance) {
  // Extent 1: internal units are user units. Pairs 2e-11 apart stay apart;
  // pairs 5e-12 apart merge, one restart each at most.
  std::vector<Pt> pts{{0, 0}, {1, 1}};
  for (int i = 1; i < 20; ++i) {
    const double x = i / 20.0, y = std::fmod(i * 0.37, 1.0);
    pts.push_back({x, y});
    pts.push_back({x + (i % 2 ? 2e-11 : 5e-12), y});
  }
  Checked(pts);
  EXPECT_GE(VD_GetRestartCount(), 1);
  EXPECT_LE(VD_GetRestartCount(), 10);
  EXPECT_EQ(VD_GetDuplicateCount(), 9);  // the even i
  EXPECT_EQ(vd::Vd().points.count, 2 + 2 + 19 + 10 + 2);  // slots, corners, points kept
}

TEST(DegeneratePoints, WideRangeOfMagnitudes) {
  std::vector<Pt> pts{{-1e14, -1e14}, {1e14, 1e14}};
  std::vector<Pt> local = UniformPoints(300, 8, 1e6);
  pts.insert(pts.end(), local.begin(), local.end());
  Checked(pts);
}

TEST(DegeneratePoints, ManyDuplicates) {
  std::vector<Pt> pts;
  std::mt19937 rng(6);
  std::uniform_int_distribution<int> u(0, 9);
  for (int i = 0; i < 1000; ++i) pts.push_back({double(u(rng)), double(u(rng))});
  Checked(pts);
  EXPECT_EQ(VD_GetDuplicateCount(), 1000 - 100);
  EXPECT_EQ(VD_GetRestartCount(), 0);
}

}  // namespace
}  // namespace zt
