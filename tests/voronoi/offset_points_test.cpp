// Offsets and the offset store on diagrams of points: requests, refusals,
// isolated point circles, traced curves against brute force, and a broken
// diagram that must end the request instead of looping.
#include <gtest/gtest.h>

#include <cmath>

#include "offset_check.hpp"
#include "vd_test_util.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt {
namespace {

using vdtest::Pt;

constexpr double kTol = 1e-9;

vdtest::InputSites AsSites(const std::vector<Pt>& pts) {
  vdtest::InputSites in;
  for (const Pt& p : pts) in.points.push_back({p.x, p.y});
  return in;
}

TEST(OffsetRequest, SideZeroSucceedsAndLeavesTheStoreAlone) {
  vdtest::Store({{0, 0}, {1, 0}, {0, 1}});
  ASSERT_TRUE(vdtest::ComputePoints());
  EXPECT_TRUE(VD_ComputeOffsets(3, 0.1, 0.0));
  const std::int32_t n = GetNumOffsetCurves();
  EXPECT_GT(n, 0);
  EXPECT_TRUE(VD_ComputeOffsets(0, 0.2, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), n);
  // Every request appends: the same request again doubles the store.
  EXPECT_TRUE(VD_ComputeOffsets(3, 0.1, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), 2 * n);
  VD_Reset();
  EXPECT_EQ(GetNumOffsetCurves(), 0);
}

TEST(OffsetRequest, StaleDiagramIsRefusedByTheFacadeAndFatalBelowIt) {
  vdtest::Store({{0, 0}, {1, 0}});
  for (int side = 0; side <= 3; ++side) EXPECT_FALSE(VD_ComputeOffsets(side, 0.1, 0.0));
  EXPECT_EXIT(API_ComputeOff(false, nullptr, false, false, 0.1, 0.0, false, false, false),
              ::testing::ExitedWithCode(2), "error in API_ComputeOff: VD not known or not up-to-date!");
}

TEST(OffsetRequest, NonFiniteOrNegativeDistancesAreRefused) {
  vdtest::Store({{0, 0}, {1, 0}});
  ASSERT_TRUE(vdtest::ComputePoints());
  const double bad[] = {NAN, INFINITY, -INFINITY};
  for (double v : bad) {
    EXPECT_FALSE(VD_ComputeOffsets(3, v, 0.0));
    EXPECT_FALSE(VD_ComputeOffsets(3, 0.1, v));
    EXPECT_FALSE(API_ComputeOff(false, nullptr, false, false, v, 0.0, false, false, false));
    EXPECT_FALSE(API_ComputeOff(false, nullptr, false, false, 0.1, v, false, false, false));
  }
  EXPECT_FALSE(VD_ComputeOffsets(3, 0.1, -0.01));
  EXPECT_FALSE(VD_ComputeOffsets(3, -0.1, 0.0));
  EXPECT_FALSE(API_ComputeOff(false, nullptr, false, false, 0.1, -0.01, false, false, false));
  EXPECT_EQ(GetNumOffsetCurves(), 0);
}

// A step of 1e-10 on a problem of size 1 would mean billions of distances.
TEST(OffsetRequest, StepTooSmallForTheFamilyIsRefused) {
  vdtest::Store({{0, 0}, {1, 0}, {0, 1}});
  ASSERT_TRUE(vdtest::ComputePoints());
  EXPECT_FALSE(VD_ComputeOffsets(3, 0.1, 1e-10));
  EXPECT_EQ(GetNumOffsetCurves(), 0);
  EXPECT_TRUE(VD_ComputeOffsets(3, 0.1, 0.01));
  EXPECT_GT(GetNumOffsetCurves(), 0);
}

TEST(OffsetRequest, ZeroDistanceSelectsTheAutomaticOffsets) {
  vdtest::Store({{0, 0}, {10, 0}});
  ASSERT_TRUE(vdtest::ComputePoints());
  const double scale = vd::Vd().scale;
  ASSERT_TRUE(VD_ComputeOffsets(3, 0.0, 0.0));
  ASSERT_GT(GetNumOffsetCurves(), 0);
  double offset;
  std::int32_t first, last;
  ASSERT_TRUE(GetOffsetCurve(0, offset, first, last));
  EXPECT_NEAR(offset, 0.001 / scale, 1e-15);
  // The family steps by at least ten times t.
  double second;
  ASSERT_TRUE(GetOffsetCurve(2, second, first, last));
  EXPECT_GE(second - offset, 10 * offset - 1e-12);
}

TEST(OffsetRequest, MaximalOffsetGivesNoCurve) {
  vdtest::Store({{0, 0}, {1, 0}, {0, 1}});
  ASSERT_TRUE(vdtest::ComputePoints());
  const double maxUser = vd::Vd().maxOffset / vd::Vd().scale;
  EXPECT_TRUE(VD_ComputeOffsets(3, maxUser, 0.0));
  EXPECT_TRUE(VD_ComputeOffsets(3, 2 * maxUser, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), 0);
}

TEST(OffsetRequest, OneSidedRequestWithoutSegmentsGivesNoCurve) {
  vdtest::Store(vdtest::UniformPoints(40, 3));
  ASSERT_TRUE(vdtest::ComputePoints());
  EXPECT_TRUE(VD_ComputeOffsets(1, 0.05, 0.0));
  EXPECT_TRUE(VD_ComputeOffsets(2, 0.05, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), 0);
}

TEST(OffsetReadOut, IndicesOutsideTheStoreAreRefused) {
  vdtest::Store({{0, 0}});
  ASSERT_TRUE(vdtest::ComputePoints());
  double offset = 7, x = 7, y = 7;
  std::int32_t first = 7, last = 7, kind = 7, site = 7, tag = 7;
  EXPECT_FALSE(GetOffsetCurve(0, offset, first, last));
  EXPECT_FALSE(GetOffsetCurve(-1, offset, first, last));
  EXPECT_FALSE(GetOffsetElement(0, kind, site, x, y, tag));
  EXPECT_EQ(first, 7);
  EXPECT_TRUE(PointsCoincide({0, 0}, {1e-6, 0}));
  EXPECT_FALSE(PointsCoincide({0, 0}, {1e-6, 1e-7}));
}

// A lone point has no extent: the frame around it, and with it the maximal
// offset, is tiny in user units.
TEST(IsolatedPoints, SinglePointGivesCirclesOfTwoHalves) {
  vdtest::Store({{3, 4}});
  ASSERT_TRUE(vdtest::ComputePoints());
  const double maxUser = vd::Vd().maxOffset / vd::Vd().scale;
  const double t = maxUser / 4;
  ASSERT_TRUE(VD_ComputeOffsets(3, t, 0.0));
  const auto curves = vdtest::ReadStore();
  ASSERT_EQ(curves.size(), 1u);
  for (std::size_t i = 0; i < curves.size(); ++i) {
    const auto& c = curves[i];
    EXPECT_NEAR(c.offset, t, 1e-12 * t);
    ASSERT_EQ(c.elements.size(), 2u);
    for (const auto& e : c.elements) {
      EXPECT_EQ(e.kind, 2);
      EXPECT_EQ(e.site, 2);
      EXPECT_EQ(VD_GetPointTag(e.site), 0);
    }
    EXPECT_NEAR(c.elements[0].start.x, 3 + c.offset, 1e-12);
    EXPECT_NEAR(c.elements[1].start.x, 3 - c.offset, 1e-12);
    EXPECT_NEAR(c.elements[0].start.y, 4, 1e-12);
    // The tag read-out of the element is always -1.
    std::int32_t kind, site, tag = 0;
    double x, y;
    GetOffsetElement(0, kind, site, x, y, tag);
    EXPECT_EQ(tag, -1);
  }
}

TEST(IsolatedPoints, FarApartPointsGiveOneCircleEachPerDistance) {
  const std::vector<Pt> pts{{0, 0}, {10, 0}, {0, 10}, {10, 10}};
  vdtest::Store(pts);
  ASSERT_TRUE(vdtest::ComputePoints());
  ASSERT_TRUE(VD_ComputeOffsets(3, 1.0, 0.0));
  auto curves = vdtest::ReadStore();
  ASSERT_EQ(curves.size(), 4u);
  EXPECT_EQ(vdtest::CheckAtDistance(AsSites(pts), curves, 1.0, kTol), "");
  // 1, 2, 3, 4 stay inside the regions (half the spacing is 5); 5 touches
  // the bisectors and is traced there as well.
  VD_Reset();
  for (const Pt& p : pts) API_AddPoint(p.x, p.y, 0);
  ASSERT_TRUE(vdtest::ComputePoints());
  ASSERT_TRUE(VD_ComputeOffsets(3, 1.0, 1.0));
  curves = vdtest::ReadStore();
  int circles = 0;
  for (const auto& c : curves) {
    if (c.offset < 4.5) {
      ++circles;
      EXPECT_EQ(c.elements.size(), 2u);
      EXPECT_EQ(vdtest::CheckAtDistance(AsSites(pts), {c}, c.offset, kTol), "");
    }
  }
  EXPECT_EQ(circles, 16);
}

// Random points at distances where the circles overlap: the traced curves
// are made of arcs at distance t from their nearest point.
TEST(TracedOffsets, RandomPointsAgainstBruteForce) {
  for (std::uint32_t seed = 1; seed <= 12; ++seed) {
    const auto pts = vdtest::UniformPoints(60, seed, 100.0);
    vdtest::Store(pts);
    ASSERT_TRUE(vdtest::ComputePoints());
    for (const double t : {2.0, 5.0, 9.0, 20.0}) {
      VD_Reset();
      for (std::size_t i = 0; i < pts.size(); ++i) API_AddPoint(pts[i].x, pts[i].y, static_cast<std::int32_t>(i));
      ASSERT_TRUE(vdtest::ComputePoints());
      ASSERT_TRUE(VD_ComputeOffsets(3, t, 0.0)) << "seed " << seed << " t " << t;
      const auto curves = vdtest::ReadStore();
      ASSERT_FALSE(curves.empty());
      EXPECT_EQ(vdtest::CheckAtDistance(AsSites(pts), curves, t, kTol * 100.0), "") << "seed " << seed << " t " << t;
    }
  }
}

// Every distance of a family is traced: the curve count never drops to zero
// before the points' circles have all merged, and offsets rise by d.
TEST(TracedOffsets, FamilyOfDistances) {
  const auto pts = vdtest::UniformPoints(30, 7, 10.0);
  vdtest::Store(pts);
  ASSERT_TRUE(vdtest::ComputePoints());
  ASSERT_TRUE(VD_ComputeOffsets(3, 0.5, 0.5));
  const auto curves = vdtest::ReadStore();
  for (const auto& c : curves) {
    const double k = c.offset / 0.5;
    EXPECT_NEAR(k, std::round(k), 1e-9);
  }
  for (const double t : {0.5, 1.0, 3.0}) {
    std::vector<vdtest::Curve> at;
    for (const auto& c : curves)
      if (std::fabs(c.offset - t) < 1e-9) at.push_back(c);
    EXPECT_FALSE(at.empty()) << t;
    EXPECT_EQ(vdtest::CheckAtDistance(AsSites(pts), at, t, 1e-7), "") << t;
  }
}

// A diagram whose neighbour fields lead the walk astray: the request fails
// instead of tracing forever.
TEST(TracedOffsets, BrokenDiagramEndsTheRequestWithFailure) {
  const auto pts = vdtest::UniformPoints(40, 5, 10.0);
  vdtest::Store(pts);
  ASSERT_TRUE(vdtest::ComputePoints());
  ASSERT_TRUE(VD_ComputeOffsets(3, 1.5, 0.0));
  ASSERT_GT(GetNumOffsetCurves(), 0);
  vd::Engine& g = vd::Vd();
  // An edge crossed at this distance becomes everybody's neighbour.
  std::int32_t crossed = -1;
  for (std::int32_t e = 4; e < g.edges.count && crossed < 0; ++e) {
    const auto& r = g.edges[e];
    const double r1 = g.nodes[r.n1].r, r2 = g.nodes[r.n2].r, t = 1.5 * g.scale;
    if (!r.deleted && std::fmin(r1, r2) <= t && t < std::fmax(r1, r2)) crossed = e;
  }
  ASSERT_GE(crossed, 0);
  for (std::int32_t e = 4; e < g.edges.count; ++e) g.edges[e].s_ccw = g.edges[e].e_ccw = crossed;
  EXPECT_FALSE(VD_ComputeOffsets(3, 1.5, 0.0));
}

// Every crossed edge but the first turns back onto itself: the walk comes
// back to an edge it has already crossed at this distance.
TEST(TracedOffsets, WalkBackOntoACrossedEdgeEndsTheRequestWithFailure) {
  const auto pts = vdtest::UniformPoints(40, 5, 10.0);
  vdtest::Store(pts);
  ASSERT_TRUE(vdtest::ComputePoints());
  ASSERT_TRUE(VD_ComputeOffsets(3, 1.5, 0.0));
  const std::int32_t before = GetNumOffsetCurves();
  vd::Engine& g = vd::Vd();
  const double t = 1.5 * g.scale;
  bool first = true;
  for (std::int32_t e = 4; e < g.edges.count; ++e) {
    auto& r = g.edges[e];
    const double r1 = g.nodes[r.n1].r, r2 = g.nodes[r.n2].r;
    if (r.deleted || !(std::fmin(r1, r2) <= t && t < std::fmax(r1, r2))) continue;
    if (first) {
      first = false;  // the edge the sweep starts from
      continue;
    }
    r.s_ccw = r.e_ccw = e;
  }
  EXPECT_FALSE(VD_ComputeOffsets(3, 1.5, 0.0));
  // The failed curve leaves nothing behind; the circles of the request stay.
  std::int32_t kind, site, tag;
  double x, y, offset;
  std::int32_t f, l;
  for (std::int32_t i = before; i < GetNumOffsetCurves(); ++i) {
    ASSERT_TRUE(GetOffsetCurve(i, offset, f, l));
    EXPECT_TRUE(GetOffsetElement(l, kind, site, x, y, tag));
  }
  EXPECT_FALSE(GetOffsetElement(vd::Vd().offsetElements.count, kind, site, x, y, tag));
}

}  // namespace
}  // namespace zt
