// Offsets of polygons: the documented square, the neck where the clearance
// between a corner and a wall dips inside an edge, and random polygons with
// holes checked against brute force (distance, closure, side).
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <iterator>
#include <numbers>
#include <random>

#include "offset_check.hpp"
#include "vd_test_util.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt {
namespace {

using Contour = std::vector<vdtest::Site2>;

// Stores closed contours (each point once, the closing segment back to the
// first) and returns the sites for brute force.
vdtest::InputSites StoreContours(const std::vector<Contour>& contours) {
  VD_Initialize();
  VD_Reset();
  vdtest::InputSites in;
  std::int32_t tag = 0;
  for (const Contour& c : contours) {
    std::vector<std::int32_t> idx;
    for (const auto& p : c) {
      idx.push_back(API_AddPoint(p.x, p.y, -1));
      in.points.push_back(p);
    }
    for (std::size_t i = 0; i < c.size(); ++i) {
      API_AddSegment(idx[i], idx[(i + 1) % c.size()], tag);
      in.segments.push_back({c[i], c[(i + 1) % c.size()]});
    }
    ++tag;
  }
  return in;
}

bool Compute() { return VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true); }

double Extent(const vdtest::InputSites& in) {
  double x0 = INFINITY, x1 = -INFINITY, y0 = INFINITY, y1 = -INFINITY;
  for (const auto& p : in.points) {
    x0 = std::min(x0, p.x), x1 = std::max(x1, p.x);
    y0 = std::min(y0, p.y), y1 = std::max(y1, p.y);
  }
  return std::max(x1 - x0, y1 - y0);
}

// Even-odd inside test over all contours.
bool Inside(const std::vector<Contour>& contours, const vdtest::Site2& p) {
  bool in = false;
  for (const Contour& c : contours)
    for (std::size_t i = 0, j = c.size() - 1; i < c.size(); j = i++)
      if ((c[i].y > p.y) != (c[j].y > p.y) &&
          p.x < (c[j].x - c[i].x) * (p.y - c[i].y) / (c[j].y - c[i].y) + c[i].x)
        in = !in;
  return in;
}

// Every element start is on the wanted side of the material (the left of
// counter-clockwise outer contours and clockwise holes is the inside).
std::string CheckSide(const std::vector<Contour>& contours, const std::vector<vdtest::Curve>& curves, bool inside) {
  for (std::size_t ci = 0; ci < curves.size(); ++ci)
    for (std::size_t k = 0; k < curves[ci].elements.size(); ++k)
      for (const auto& p : vdtest::Samples(curves[ci], k, 4))
        if (Inside(contours, p) != inside) return "curve " + std::to_string(ci) + " leaves its side";
  return {};
}

TEST(PolygonOffsets, UnitSquareInsideIsASmallerSquare) {
  const std::vector<Contour> sq{{{0, 0}, {1, 0}, {1, 1}, {0, 1}}};
  const auto in = StoreContours(sq);
  ASSERT_TRUE(Compute());
  ASSERT_TRUE(VD_ComputeOffsets(1, 0.1, 0.0));
  const auto curves = vdtest::ReadStore();
  ASSERT_EQ(curves.size(), 1u);
  ASSERT_EQ(curves[0].elements.size(), 4u);
  for (const auto& e : curves[0].elements) {
    EXPECT_EQ(e.kind, 0);
    EXPECT_NEAR(std::fabs(e.start.x - 0.5), 0.4, 1e-12);
    EXPECT_NEAR(std::fabs(e.start.y - 0.5), 0.4, 1e-12);
    EXPECT_EQ(VD_GetSegmentTag(e.site), 0);
  }
  EXPECT_EQ(vdtest::CheckAtDistance(in, curves, 0.1, 1e-12), "");
  EXPECT_EQ(CheckSide(sq, curves, true), "");
}

TEST(PolygonOffsets, UnitSquareOutsideAlternatesLinesAndQuarterArcs) {
  const std::vector<Contour> sq{{{0, 0}, {1, 0}, {1, 1}, {0, 1}}};
  const auto in = StoreContours(sq);
  ASSERT_TRUE(Compute());
  ASSERT_TRUE(VD_ComputeOffsets(2, 0.1, 0.0));
  const auto curves = vdtest::ReadStore();
  ASSERT_EQ(curves.size(), 1u);
  const auto& els = curves[0].elements;
  ASSERT_EQ(els.size(), 8u);
  for (std::size_t k = 0; k < els.size(); ++k) EXPECT_EQ(els[k].kind, els[0].kind == 0 ? (k % 2 ? 2 : 0) : (k % 2 ? 0 : 2));
  for (std::size_t k = 0; k < els.size(); ++k) {
    if (els[k].kind != 2) continue;
    const auto& q = els[(k + 1) % els.size()].start;
    const double a0 = std::atan2(els[k].start.y - els[k].centre.y, els[k].start.x - els[k].centre.x);
    const double a1 = std::atan2(q.y - els[k].centre.y, q.x - els[k].centre.x);
    double sweep = a0 - a1;
    while (sweep < 0) sweep += 2 * std::numbers::pi;
    EXPECT_NEAR(sweep, std::numbers::pi / 2, 1e-9);  // a quarter turn, clockwise
  }
  EXPECT_EQ(vdtest::CheckAtDistance(in, curves, 0.1, 1e-12), "");
  EXPECT_EQ(CheckSide(sq, curves, false), "");
}

TEST(PolygonOffsets, BothSidesAndFamilies) {
  const std::vector<Contour> sq{{{0, 0}, {1, 0}, {1, 1}, {0, 1}}};
  const auto in = StoreContours(sq);
  ASSERT_TRUE(Compute());
  ASSERT_TRUE(VD_ComputeOffsets(3, 0.1, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), 2);
  // Inside, the family stops where the square's clearance ends (0.5).
  VD_Reset();
  StoreContours(sq);
  ASSERT_TRUE(Compute());
  ASSERT_TRUE(VD_ComputeOffsets(1, 0.1, 0.1));
  const auto curves = vdtest::ReadStore();
  EXPECT_EQ(curves.size(), 4u);
  for (const auto& c : curves) EXPECT_EQ(vdtest::CheckAtDistance(in, {c}, c.offset, 1e-12), "");
}

// A reflex corner (2,2) facing the wall y = 0 across a neck: the clearance
// between the corner and the wall falls to 1 at (2,1) inside their edge.
TEST(PolygonOffsets, NeckBetweenACornerAndAWallIsNotCutThrough) {
  const std::vector<Contour> neck{{{-10, 0}, {14, 0}, {14, 4}, {3, 4}, {2, 2}, {1, 4}, {-10, 4}}};
  const auto in = StoreContours(neck);
  ASSERT_TRUE(Compute());
  ASSERT_TRUE(VD_ComputeOffsets(1, 1.2, 0.0));
  const auto curves = vdtest::ReadStore();
  EXPECT_EQ(curves.size(), 2u);
  EXPECT_EQ(vdtest::CheckAtDistance(in, curves, 1.2, 1e-9 * Extent(in)), "");
  EXPECT_EQ(CheckSide(neck, curves, true), "");
}

// Necks at random places and depths, with distances below, near and above
// half the neck's width.
TEST(PolygonOffsets, RandomNecksAgainstBruteForce) {
  std::mt19937 rng(17);
  std::uniform_real_distribution<double> ux(-5, 10), uy(0.3, 3.6), ut(0.2, 2.2), uw(0.3, 3);
  for (int trial = 0; trial < 60; ++trial) {
    const double x = ux(rng), y = uy(rng), w = uw(rng), t = ut(rng);
    const std::vector<Contour> neck{{{-10, 0}, {14, 0}, {14, 4}, {x + w, 4}, {x, y}, {x - w, 4}, {-10, 4}}};
    const auto in = StoreContours(neck);
    ASSERT_TRUE(Compute());
    ASSERT_TRUE(VD_ComputeOffsets(1, t, 0.0));
    const auto curves = vdtest::ReadStore();
    if (t < 2.0) {
      ASSERT_FALSE(curves.empty()) << trial;
    }
    ASSERT_EQ(vdtest::CheckAtDistance(in, curves, t, 1e-9 * Extent(in)), "") << "trial " << trial;
    ASSERT_EQ(CheckSide(neck, curves, true), "") << trial;
  }
}

// A star-shaped polygon around (cx, cy) with n vertices, counter-clockwise
// unless `clockwise`.
Contour Star(std::mt19937& rng, double cx, double cy, double rmin, double rmax, int n, bool clockwise) {
  std::uniform_real_distribution<double> radius(rmin, rmax), jitter(-0.3, 0.3);
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * std::numbers::pi * (i + 0.5 + jitter(rng)) / n;
    const double r = radius(rng);
    c.push_back({cx + r * std::cos(a), cy + r * std::sin(a)});
  }
  if (clockwise) std::reverse(c.begin(), c.end());
  return c;
}

// Random outer contours with star-shaped holes; inside, outside and both.
TEST(PolygonOffsets, RandomPolygonsWithHolesAgainstBruteForce) {
  std::mt19937 rng(11);
  for (int trial = 0; trial < 200; ++trial) {
    std::vector<Contour> cs;
    const int n = 8 + trial % 40;
    cs.push_back(Star(rng, 0, 0, 70, 100, n, false));
    const int holes = trial % 4;
    for (int h = 0; h < holes; ++h) {
      const double a = 2 * std::numbers::pi * h / std::max(holes, 1);
      const double off = holes == 1 ? 0.0 : 35.0;
      cs.push_back(Star(rng, off * std::cos(a), off * std::sin(a), 8, 18, 5 + trial % 9, true));
    }
    const int side = 1 + trial % 3;
    std::uniform_real_distribution<double> td(0.5, 12.0);
    const double t = td(rng);
    const auto in = StoreContours(cs);
    ASSERT_TRUE(Compute()) << trial;
    ASSERT_TRUE(VD_ComputeOffsets(side, t, 0.0)) << trial;
    const auto curves = vdtest::ReadStore();
    if (side != 3) {
      ASSERT_FALSE(curves.empty()) << trial;
    }
    ASSERT_EQ(vdtest::CheckAtDistance(in, curves, t, 1e-9 * Extent(in)), "") << "trial " << trial << " side " << side << " t " << t;
    if (side != 3) {
      ASSERT_EQ(CheckSide(cs, curves, side == 1), "") << trial;
    }
  }
}

// Loose points inside a pocket: their circles (both sides) and the curves
// where circles meet the walls' offsets, against brute force.
TEST(PolygonOffsets, PocketWithLoosePointsAgainstBruteForce) {
  std::mt19937 rng(5);
  for (int trial = 0; trial < 30; ++trial) {
    const std::vector<Contour> cs{Star(rng, 0, 0, 70, 100, 12 + trial, false)};
    auto in = StoreContours(cs);
    std::uniform_real_distribution<double> u(-40, 40);
    for (int k = 0; k < 1 + trial % 6; ++k) {
      const vdtest::Site2 p{u(rng), u(rng)};
      API_AddPoint(p.x, p.y, 100 + k);
      in.points.push_back(p);
    }
    ASSERT_TRUE(Compute()) << trial;
    const double t = 2.0 + trial % 7 * 1.5;
    ASSERT_TRUE(VD_ComputeOffsets(1 + trial % 3, t, 0.0)) << trial;
    ASSERT_EQ(vdtest::CheckAtDistance(in, vdtest::ReadStore(), t, 1e-9 * Extent(in)), "") << "trial " << trial;
  }
}

}  // namespace
}  // namespace zt

namespace zt {
namespace {

// A request that asks for a file writes the whole store there.
TEST(PolygonOffsets, RequestedFileHoldsTheStore) {
  VD_Initialize();
  VD_Reset();
  const std::int32_t a = API_AddPoint(0, 0, -1), b = API_AddPoint(1, 0, -1), c = API_AddPoint(1, 1, -1),
                     d = API_AddPoint(0, 1, -1);
  API_AddSegment(a, b, 0), API_AddSegment(b, c, 0), API_AddSegment(c, d, 0), API_AddSegment(d, a, 0);
  ASSERT_TRUE(VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true));
  const std::string text = testing::TempDir() + "zt_offsets.txt";
  ASSERT_TRUE(API_ComputeOff(false, text.c_str(), true, false, 0.1, 0.0, false, true, false));
  std::ifstream in(text);
  std::string line;
  std::getline(in, line);
  EXPECT_EQ(line, "curve 0.10000000000000001");
  int elements = 0;
  while (std::getline(in, line)) ++elements;
  EXPECT_EQ(elements, 4);
  const std::string dxf = testing::TempDir() + "zt_offsets.dxf";
  ASSERT_TRUE(API_ComputeOff(false, dxf.c_str(), true, true, 0.1, 0.0, false, false, true));
  std::ifstream din(dxf);
  const std::string all((std::istreambuf_iterator<char>(din)), std::istreambuf_iterator<char>());
  EXPECT_NE(all.find("ARC"), std::string::npos);
  EXPECT_NE(all.find("EOF"), std::string::npos);
  // A file that cannot be written fails the request.
  EXPECT_FALSE(API_ComputeOff(false, "/nonexistent/dir/x.txt", true, false, 0.1, 0.0, false, true, false));
}

}  // namespace
}  // namespace zt
