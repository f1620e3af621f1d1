// The overlay's numeric routines and small structures: segment intersection
// (each case, the retry with exchanged roles, the clamped crossing), ray
// crossing, split lists, pseudo-angles, snapping.
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <vector>

#include "regions/detail/engine.hpp"
#include "regions/detail/geometry.hpp"

namespace zt::detail {
namespace {

constexpr double kEps = kEngineEpsilon;

struct Case {
  Point2d p0, p1, q0, q1;
  int k;
  Point2d r1, r2;
};

TEST(SegmentIntersection, EveryCase) {
  const double d = 1.2 * kEps;  // Q1 off the first line; P0, P1 within eps of the second
  const Case cases[] = {
      {{0, 0}, {2, 2}, {0, 2}, {2, 0}, 1, {1, 1}, {}},             // proper crossing
      {{0, 0}, {1, 0}, {0, 1}, {1, 2}, 0, {}, {}},                 // same side
      {{0, 0}, {1, 0}, {2, -1}, {2, 1}, 0, {}, {}},                // crosses the line beyond
      {{0, 0}, {2, 0}, {1, 0}, {1, 1}, 1, {1, 0}, {}},             // Q0 inside the first
      {{0, 0}, {2, 0}, {1, 1}, {2, 0}, 1, {2, 0}, {}},             // Q1 at P1
      {{1, 0}, {1, 1}, {0, 0}, {2, 0}, 1, {1, 0}, {}},             // P0 on the second
      {{0, 0}, {4, 0}, {1, 0}, {6, 0}, 2, {1, 0}, {4, 0}},         // collinear overlap
      {{0, 0}, {4, 0}, {3, 0}, {-2, 0}, 2, {0, 0}, {3, 0}},        // reversed second
      {{0, 0}, {4, 0}, {4, 0}, {6, 0}, 2, {4, 0}, {4, 0}},         // touching ends
      {{0, 0}, {4, 0}, {5, 0}, {6, 0}, 0, {}, {}},                 // collinear, apart
      {{0, 0}, {1, 0}, {-1, 0}, {-2, 1}, kRetryReversed, {}, {}},  // Q0 on the line, beyond
      {{0, 0}, {1, 0}, {-2, 1}, {3, 0}, kRetryReversed, {}, {}},   // Q1 on the line, beyond
      {{0, 0}, {0.5, 0}, {0.75, 0}, {-0.25, d}, kRetryReversed, {}, {}},
      {{0.75, 0}, {-0.25, d}, {0, 0}, {0.5, 0}, 1, {0, 0}, {}},  // ... and exchanged
  };
  for (const Case& c : cases) {
    Point2d r1{-9, -9}, r2{-9, -9};
    SegmentDirection a, b;
    const int k = segment_intersection(c.p0, c.p1, c.q0, c.q1, r1, r2, a, b, kEps);
    SCOPED_TRACE(::testing::Message() << c.p0.x << "," << c.p0.y << " " << c.q0.x << "," << c.q0.y);
    ASSERT_EQ(k, c.k);
    if (k >= 1) {
      EXPECT_TRUE(r1.x == c.r1.x && r1.y == c.r1.y) << r1.x << " " << r1.y;
    }
    if (k == 2) {
      EXPECT_TRUE(r2.x == c.r2.x && r2.y == c.r2.y) << r2.x << " " << r2.y;
    }
  }
}

// Nearly parallel crossings near an end: the point found always lies on the
// first segment (its parameter held to 0..1), never off both edges.
TEST(SegmentIntersection, NearlyParallelCrossingStaysOnTheEdges) {
  std::mt19937_64 rng(7);
  std::uniform_real_distribution<double> u(0, 1);
  int crossings = 0;
  for (int it = 0; it < 100000; ++it) {
    const double ang = u(rng) * 6.283, len = 0.001 + 0.5 * u(rng), len2 = 0.001 + 0.5 * u(rng);
    const double th = std::pow(10.0, -14 + 4 * u(rng)) * (u(rng) < 0.5 ? -1 : 1);
    const double c = (u(rng) < 0.5 ? 0.0 : 1.0) + (u(rng) - 0.5) * 0.01, a = u(rng);
    const Point2d p0{u(rng), u(rng)}, p1{p0.x + len * std::cos(ang), p0.y + len * std::sin(ang)};
    const Point2d x{p0.x + c * (p1.x - p0.x), p0.y + c * (p1.y - p0.y)};
    const Point2d q0{x.x - a * len2 * std::cos(ang + th), x.y - a * len2 * std::sin(ang + th)};
    const Point2d q1{x.x + (1 - a) * len2 * std::cos(ang + th), x.y + (1 - a) * len2 * std::sin(ang + th)};
    Point2d r1, r2;
    SegmentDirection da, db;
    if (segment_intersection(p0, p1, q0, q1, r1, r2, da, db, kEps) != 1) continue;
    ++crossings;
    ASSERT_TRUE(r1.x >= std::fmin(p0.x, p1.x) - kEps && r1.x <= std::fmax(p0.x, p1.x) + kEps);
    ASSERT_TRUE(r1.y >= std::fmin(p0.y, p1.y) - kEps && r1.y <= std::fmax(p0.y, p1.y) + kEps);
  }
  EXPECT_GT(crossings, 1000);
}

TEST(RayCrossing, VerticesCountAsJustAboveTheRay) {
  EXPECT_EQ(ray_crossing(0, 0, 1, -1, 1, 1, kEps), 1);
  EXPECT_EQ(ray_crossing(0, 0, -1, -1, -1, 1, kEps), 0);  // left of the point
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 3, 0, kEps), 0);     // along the ray
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 1, 1, kEps), 0);     // from the ray upwards
  EXPECT_EQ(ray_crossing(0, 0, 1, 0, 1, -1, kEps), 1);    // from the ray downwards
  EXPECT_EQ(ray_crossing(0, 0, 1, -1, 1, 1e-16, kEps), 1);
}

// Settled split lists against the plain rule: each crossing, in the order
// found, walks the sorted list from its head and stops before the first
// entry more than eps beyond it; it is dropped if it met one within eps.
// (A crossing exactly eps before a kept one goes in sorted order, where the
// plain walk would pass that one first.)
TEST(SplitList, SettledListsFollowTheInsertionRule) {
  std::mt19937_64 rng(11);
  std::uniform_real_distribution<double> u(0, 1), near(-2, 2);
  std::uniform_int_distribution<int> count(1, 60);
  BooleanEngine e;
  static Vertex v[64];
  for (int round = 0; round < 2000; ++round) {
    Edge edge;
    std::vector<std::pair<double, Vertex*>> model;  // the plain rule's list
    const int n = count(rng);
    double base = u(rng);
    for (int i = 0; i < n; ++i) {
      // Clusters of crossings a few eps apart, and scattered ones.
      const double t = u(rng) < 0.7 ? base + near(rng) * kEps : (base = u(rng));
      ASSERT_EQ(record_split(e.splits, edge, t, &v[i]), 0);
      bool clash = false;
      for (auto it = model.begin(); it != model.end() && !(it->first - kEps > t); ++it)
        clash = clash || std::fabs(it->first - t) < kEps;
      auto at = model.begin();
      while (at != model.end() && at->first <= t) ++at;
      if (!clash) model.insert(at, {t, &v[i]});
    }
    ASSERT_EQ(settle_splits(e, edge, kEps), 0);
    std::size_t i = 0;
    for (const SplitPoint* s = edge.splits; s; s = s->next, ++i) {
      ASSERT_LT(i, model.size());
      ASSERT_EQ(s->t, model[i].first);
      ASSERT_EQ(s->vertex, model[i].second);
    }
    ASSERT_EQ(i, model.size());
  }
}

TEST(PseudoAngle, IncreasesCounterClockwiseFromZeroToEight) {
  double prev = -1;
  for (int k = 1; k < 3600; ++k) {
    const double a = pseudo_angle(std::cos(k * M_PI / 1800), std::sin(k * M_PI / 1800));
    ASSERT_GT(a, prev) << k;
    ASSERT_LT(a, 8.0);
    prev = a;
  }
  EXPECT_EQ(pseudo_angle(1, 0), 8.0);
  EXPECT_EQ(pseudo_angle(-1, 0), 4.0);
}

TEST(Snapping, FractionFlooredToTheQuantumWithTheSignOfTheValue) {
  EXPECT_EQ(snap_coordinate(1.5), 1.5);
  EXPECT_EQ(snap_coordinate(3.0 + 0x1p-50), 3.0);
  EXPECT_EQ(snap_coordinate(-3.0 - 0x1p-50), -3.0 - 0x1p-48);
  EXPECT_EQ(snap_coordinate(-1e15 + 0.25), -1e15 + 0.25);
}

}  // namespace
}  // namespace zt::detail
