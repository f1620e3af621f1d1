// Diagrams of points and segments through the facade: invariants after the
// whole computation, restarts and recovery mode on clean and defective input.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/segment_checks.hpp"

namespace zt::vdtest {
namespace {

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

Contour Reversed(Contour c) {
  std::reverse(c.begin(), c.end());
  return c;
}

// A circle approximated by n chord points.
Contour Circle(int n, Pt centre, double r, double phase = 0.1) {
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double a = phase + 2 * M_PI * i / n;
    c.push_back({centre.x + r * std::cos(a), centre.y + r * std::sin(a)});
  }
  return c;
}

// A rectilinear staircase: axis-parallel edges only.
Contour Staircase(int steps, double size) {
  Contour c{{0, 0}};
  const double h = size / steps;
  for (int i = 0; i < steps; ++i) {
    c.push_back({(i + 1) * h, i * h});
    c.push_back({(i + 1) * h, (i + 1) * h});
  }
  c.push_back({0, size});
  return c;
}

// A square with k collinear points on each side.
Contour DenseSquare(int k, double size, double at = 0.0) {
  Contour c;
  for (int side = 0; side < 4; ++side) {
    for (int i = 0; i < k; ++i) {
      const double t = size * i / k;
      const Pt p = side == 0 ? Pt{t, 0} : side == 1 ? Pt{size, t} : side == 2 ? Pt{size - t, size} : Pt{0, size - t};
      c.push_back({p.x + at, p.y + at});
    }
  }
  return c;
}

// Computes with the checker after every `every`-th insertion; "" or the
// first error, of the diagram or of its segment edges.
std::string RunChecked(const std::vector<Contour>& contours, int every = 1, bool bruteForce = true) {
  StoreContours(contours);
  const std::string error = CheckedCompute(false, every, bruteForce);
  return error.empty() ? vd::CheckSegmentEdges() : error;
}

void ExpectClean(const std::vector<Contour>& contours, const std::string& what, int every = 1, bool bruteForce = true) {
  EXPECT_EQ(RunChecked(contours, every, bruteForce), "") << what;
  EXPECT_EQ(VD_GetRestartCount(), 0) << what;
  EXPECT_FALSE(VD_InRecoveryMode()) << what;
}

TEST(SegmentDiagram, StarPolygons) {
  for (int n : {4, 5, 10, 30, 100}) {
    for (std::uint32_t seed = 1; seed <= 6; ++seed) {
      ExpectClean({StarPolygon(n, seed * 7919 + n)}, "star " + std::to_string(n) + " seed " + std::to_string(seed));
    }
  }
  ExpectClean({StarPolygon(5000, 5)}, "star 5000", 2500, false);
}

bool Cross(Pt a, Pt b, Pt c, Pt d) {
  const auto o = [](Pt p, Pt q, Pt r) { return (q.x - p.x) * (r.y - p.y) - (q.y - p.y) * (r.x - p.x); };
  return o(a, b, c) * o(a, b, d) < 0 && o(c, d, a) * o(c, d, b) < 0;
}

// A random simple polygon: random points, crossings removed by 2-opt moves.
Contour RandomSimplePolygon(int n, std::uint32_t seed) {
  std::mt19937 rng(seed);
  std::uniform_real_distribution<double> u(0.0, 1.0);
  Contour c(n);
  for (Pt& p : c) p = {u(rng), u(rng)};
  for (bool changed = true; changed;) {
    changed = false;
    for (int i = 0; i < n; ++i) {
      for (int j = i + 2; j < n; ++j) {
        if (i == 0 && j == n - 1) continue;
        if (Cross(c[i], c[i + 1], c[j], c[(j + 1) % n])) {
          std::reverse(c.begin() + i + 1, c.begin() + j + 1);
          changed = true;
        }
      }
    }
  }
  return c;
}

TEST(SegmentDiagram, RandomSimplePolygons) {
  for (int n : {10, 40, 150}) {
    for (std::uint32_t seed = 1; seed <= 4; ++seed) {
      ExpectClean({RandomSimplePolygon(n, seed * 31 + n)}, "polygon " + std::to_string(n) + " seed " + std::to_string(seed));
    }
  }
}

TEST(SegmentDiagram, NestedContoursWithHoles) {
  for (std::uint32_t seed = 1; seed <= 5; ++seed) {
    ExpectClean({StarPolygon(40, seed, {0.5, 0.5}, 0.4, 0.48), Reversed(StarPolygon(12, seed + 100, {0.5, 0.5}, 0.1, 0.2)),
                 Reversed(Circle(16, {0.5, 0.5}, 0.3, 0.05 * seed))},
                "nested " + std::to_string(seed));
  }
}

TEST(SegmentDiagram, AxisAlignedAndCollinearContours) {
  ExpectClean({{{0, 0}, {1, 0}, {1, 1}, {0, 1}}}, "square");
  ExpectClean({Staircase(20, 1.0)}, "staircase");
  ExpectClean({DenseSquare(10, 1.0)}, "dense square");
  ExpectClean({DenseSquare(7, 3.0), Reversed(DenseSquare(3, 1.0, 1.0))}, "dense squares nested");
}

TEST(SegmentDiagram, ChordPointsOfArcs) {
  ExpectClean({Circle(64, {0, 0}, 10.0)}, "circle 64");
  ExpectClean({Circle(200, {5, 5}, 1.0), Reversed(Circle(50, {5, 5}, 0.5))}, "annulus");
}

// The orientation memory of the point-segment-segment construction is reset
// by every segment insertion: a memory left set by anything before gives
// the same diagram.
TEST(SegmentDiagram, OrientationMemoryDoesNotLeakIntoInsertions) {
  const std::vector<Contour> input{StarPolygon(60, 3), Reversed(Circle(9, {0.5, 0.5}, 0.1))};
  StoreContours(input);
  ASSERT_TRUE(ComputeSegments());
  std::vector<VD_NodeInfo> first;
  for (std::int32_t n = 0; n < VD_GetNodeCount(); ++n) first.push_back(VD_GetNode(n));
  StoreContours(input);
  vd::Vd().pssOrientByKeptNode = true;
  ASSERT_TRUE(ComputeSegments());
  EXPECT_FALSE(vd::Vd().pssOrientByKeptNode);
  ASSERT_EQ(VD_GetNodeCount(), static_cast<std::int32_t>(first.size()));
  for (std::int32_t n = 0; n < VD_GetNodeCount(); ++n) {
    const VD_NodeInfo b = VD_GetNode(n);
    EXPECT_EQ(first[n].live, b.live);
    EXPECT_EQ(first[n].x, b.x);
    EXPECT_EQ(first[n].y, b.y);
  }
}

}  // namespace
}  // namespace zt::vdtest
