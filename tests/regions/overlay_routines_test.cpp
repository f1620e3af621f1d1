// The overlay's numeric routines and small structures: segment intersection
// (every case, the retry with exchanged roles, the clamped crossing), ray
// crossing, split-list insertion, pseudo-angles.
#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "regions/detail/engine.hpp"
#include "regions/detail/geometry.hpp"

namespace zt::detail {
namespace {

constexpr double kEps = kEngineEpsilon;

struct Hit {
  int k;
  Point2d r1, r2;
};

Hit intersect(Point2d p0, Point2d p1, Point2d q0, Point2d q1) {
  Hit h{};
  SegmentDirection a, b;
  h.k = segment_intersection(p0, p1, q0, q1, h.r1, h.r2, a, b, kEps);
  return h;
}

TEST(SegmentIntersection, ProperCrossingAndMisses) {
  Hit h = intersect({0, 0}, {2, 2}, {0, 2}, {2, 0});
  ASSERT_EQ(h.k, 1);
  EXPECT_DOUBLE_EQ(h.r1.x, 1.0);
  EXPECT_DOUBLE_EQ(h.r1.y, 1.0);
  EXPECT_EQ(intersect({0, 0}, {1, 0}, {0, 1}, {1, 2}).k, 0);      // same side
  EXPECT_EQ(intersect({0, 0}, {1, 0}, {2, -1}, {2, 1}).k, 0);     // crosses the line beyond
  EXPECT_EQ(intersect({0, 0}, {1, 0}, {0, 1}, {1, 1}).k, 0);      // parallel
}

TEST(SegmentIntersection, EndpointsOnTheOtherSegment) {
  Hit h = intersect({0, 0}, {2, 0}, {1, 0}, {1, 1});  // Q0 inside the first
  ASSERT_EQ(h.k, 1);
  EXPECT_EQ(h.r1.x, 1.0);
  h = intersect({0, 0}, {2, 0}, {1, 1}, {2, 0});  // Q1 at P1
  ASSERT_EQ(h.k, 1);
  EXPECT_EQ(h.r1.x, 2.0);
  h = intersect({1, -1}, {1, 1}, {0, 0}, {3, 0.5});  // nothing on the line: proper
  EXPECT_EQ(h.k, 1);
  h = intersect({1, 0}, {1, 1}, {0, 0}, {2, 0});  // P0 on the second
  ASSERT_EQ(h.k, 1);
  EXPECT_EQ(h.r1.x, 1.0);
  EXPECT_EQ(h.r1.y, 0.0);
}

TEST(SegmentIntersection, CollinearOverlaps) {
  Hit h = intersect({0, 0}, {4, 0}, {1, 0}, {6, 0});
  ASSERT_EQ(h.k, 2);
  EXPECT_EQ(h.r1.x, 1.0);
  EXPECT_EQ(h.r2.x, 4.0);
  h = intersect({0, 0}, {4, 0}, {3, 0}, {-2, 0});  // reversed second
  ASSERT_EQ(h.k, 2);
  EXPECT_EQ(h.r1.x, 0.0);
  EXPECT_EQ(h.r2.x, 3.0);
  h = intersect({0, 0}, {4, 0}, {4, 0}, {6, 0});  // touching ends
  ASSERT_EQ(h.k, 2);
  EXPECT_EQ(h.r1.x, 4.0);
  EXPECT_EQ(h.r2.x, 4.0);
  EXPECT_EQ(intersect({0, 0}, {4, 0}, {5, 0}, {6, 0}).k, 0);
  EXPECT_EQ(intersect({0, 0}, {4, 0}, {-3, 0}, {-1, 0}).k, 0);
}

// An end of the second segment on the first line but beyond the first
// segment asks for the test with exchanged roles, which finds the first
// segment's end lying on the second.
TEST(SegmentIntersection, RetryWithExchangedRoles) {
  const double d = 1.2 * kEps;  // Q1 off the first line, P0 and P1 within eps of the second
  const Point2d p0{0, 0}, p1{0.5, 0}, q0{0.75, 0}, q1{-0.25, d};
  EXPECT_EQ(intersect(p0, p1, q0, q1).k, kRetryReversed);
  const Hit h = intersect(q0, q1, p0, p1);
  ASSERT_EQ(h.k, 1);
  EXPECT_EQ(h.r1.x, 0.0);
  EXPECT_EQ(h.r1.y, 0.0);
  EXPECT_EQ(intersect({0, 0}, {1, 0}, {-1, 0}, {-2, 1}).k, kRetryReversed);
  EXPECT_EQ(intersect({0, 0}, {1, 0}, {-2, 1}, {3, 0}).k, kRetryReversed);
}

// Nearly parallel crossings: the point found always lies on the first
// segment (its parameter held to 0..1), never off both edges.
TEST(SegmentIntersection, NearlyParallelCrossingStaysOnTheEdges) {
  std::mt19937_64 rng(7);
  std::uniform_real_distribution<double> u(0, 1);
  int crossings = 0;
  for (int it = 0; it < 200000; ++it) {
    const double ang = u(rng) * 6.283, len = 0.001 + 0.5 * u(rng);
    const Point2d p0{u(rng), u(rng)};
    const Point2d p1{p0.x + len * std::cos(ang), p0.y + len * std::sin(ang)};
    const double th = std::pow(10.0, -14 + 4 * u(rng)) * (u(rng) < 0.5 ? -1 : 1);
    const double c = (u(rng) < 0.5 ? 0.0 : 1.0) + (u(rng) - 0.5) * 0.01, a = u(rng);
    const Point2d x{p0.x + c * (p1.x - p0.x), p0.y + c * (p1.y - p0.y)};
    const double len2 = 0.001 + 0.5 * u(rng);
    const Point2d q0{x.x - a * len2 * std::cos(ang + th), x.y - a * len2 * std::sin(ang + th)};
    const Point2d q1{x.x + (1 - a) * len2 * std::cos(ang + th), x.y + (1 - a) * len2 * std::sin(ang + th)};
    const Hit h = intersect(p0, p1, q0, q1);
    if (h.k != 1) continue;
    ++crossings;
    ASSERT_GE(h.r1.x, std::fmin(p0.x, p1.x) - kEps);
    ASSERT_LE(h.r1.x, std::fmax(p0.x, p1.x) + kEps);
    ASSERT_GE(h.r1.y, std::fmin(p0.y, p1.y) - kEps);
    ASSERT_LE(h.r1.y, std::fmax(p0.y, p1.y) + kEps);
  }
  EXPECT_GT(crossings, 1000);
}

TEST(RayCrossing, VerticesCountAsJustAboveTheRay) {
  EXPECT_EQ(ray_crossing(0, 0, 1, -1, 1, 1, kEps), 1);
  EXPECT_EQ(ray_crossing(0, 0, -1, -1, -1, 1, kEps), 0);  // left of the point
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 3, 0, kEps), 0);     // along the ray
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 1, 1, kEps), 0);     // starts on the ray, goes up
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 1, -1, kEps), 1);    // starts on the ray, goes down
  EXPECT_EQ(ray_crossing(0, 0, 1, -1, 1, 1e-16, kEps), 1);
}

TEST(SplitList, SortedAndCrossingsCloserThanEpsAreDroppedAfterTheFirst) {
  SplitPool pool;
  Edge edge;
  Vertex v[5];
  ASSERT_EQ(insert_split(pool, edge, 0.5, &v[0], kEps), 0);
  ASSERT_EQ(insert_split(pool, edge, 0.25, &v[1], kEps), 0);
  ASSERT_EQ(insert_split(pool, edge, 0.75, &v[2], kEps), 0);
  ASSERT_EQ(insert_split(pool, edge, 0.5 + 0.5 * kEps, &v[3], kEps), 0);  // too close: ignored
  ASSERT_EQ(insert_split(pool, edge, 0.0, &v[4], kEps), 0);
  const double expected[] = {0.0, 0.25, 0.5, 0.75};
  const Vertex* vs[] = {&v[4], &v[1], &v[0], &v[2]};
  int i = 0;
  for (const SplitPoint* s = edge.splits; s; s = s->next, ++i) {
    ASSERT_LT(i, 4);
    EXPECT_EQ(s->t, expected[i]);
    EXPECT_EQ(s->vertex, vs[i]);
  }
  EXPECT_EQ(i, 4);
}

TEST(PseudoAngle, IncreasesCounterClockwiseFromZeroToEight) {
  double prev = -1;
  for (int k = 1; k < 3600; ++k) {
    const double t = k * 2 * M_PI / 3600;
    const double a = pseudo_angle(std::cos(t), std::sin(t));
    EXPECT_GT(a, prev) << k;
    EXPECT_LT(a, 8.0);
    prev = a;
  }
  EXPECT_EQ(pseudo_angle(1, 0), 8.0);
  EXPECT_EQ(pseudo_angle(0, 1), 2.0);
  EXPECT_EQ(pseudo_angle(-1, 0), 4.0);
  EXPECT_EQ(pseudo_angle(0, -1), 6.0);
}

TEST(Snapping, DropsBitsBelowTheQuantumTowardsMinusInfinityInTheFraction) {
  EXPECT_EQ(snap_coordinate(1.5), 1.5);
  EXPECT_EQ(snap_coordinate(3.0 + 0x1p-50), 3.0);
  EXPECT_EQ(snap_coordinate(-3.0 - 0x1p-50), -3.0 - 0x1p-48);
  EXPECT_EQ(snap_coordinate(0x1p-47 + 0x1p-49), 0x1p-47);
}

}  // namespace
}  // namespace zt::detail
