// The overlay's numeric routines and small structures: segment intersection,
// ray crossing, snapping and the output collector case by case (the rows of
// data/overlay.txt), the clamped crossing, split lists, pseudo-angles; the
// vertex grid against brute force: a lookup gives an existing vertex within
// the tolerance (in both coordinates) whenever there is one, and a new one
// only when there is none; a vertex looked up by a second owner becomes
// shared (dense and ambiguous point sets, cell borders).
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <map>
#include <random>
#include <vector>

#include "regions/detail/engine.hpp"
#include "regions/detail/geometry.hpp"
#include "regions/detail/output_collector.hpp"
#include "support/case_rows.hpp"

namespace zt::detail {
namespace {

constexpr double kEps = kEngineEpsilon;

// A sum of numbers; a term ending in "eps" is a multiple of kEps.
double value(const std::string& t) {
  double sum = 0;
  for (const char* s = t.c_str(); *s;) {
    char* end = nullptr;
    double v = std::strtod(s, &end);
    if (end == s) break;
    if (std::string(end).starts_with("eps")) v *= kEps, end += 3;
    sum += v, s = end;
  }
  return sum;
}
Point2d point(const std::string& t) { return {value(t.substr(0, t.find(','))), value(t.substr(t.find(',') + 1))}; }
// "x,y,tag", or S for a separator.
TaggedPoint record(const std::string& t) {
  if (t == "S") return TaggedPoint::separator();
  return {std::stoi(t.substr(t.rfind(',') + 1)), point(t).x, point(t).y};
}

class OverlayRoutines : public test::CaseRows {};

TEST_P(OverlayRoutines, AsListed) {
  const std::vector<std::string> call = test::Split(row().field(0)), want = test::Split(row().field(1));
  if (call[0] == "segment") {
    Point2d r1{-9, -9}, r2{-9, -9};
    SegmentDirection a, b;
    const int k = segment_intersection(point(call[1]), point(call[2]), point(call[3]), point(call[4]), r1, r2, a, b, kEps);
    ASSERT_EQ(k, want[0] == "retry" ? kRetryReversed : std::stoi(want[0]));
    for (int i = 1; i <= k; ++i) {
      const Point2d got = i == 1 ? r1 : r2, w = point(want.at(i));
      EXPECT_TRUE(got.x == w.x && got.y == w.y) << got.x << " " << got.y;
    }
  } else if (call[0] == "ray") {
    const Point2d p = point(call[1]), a = point(call[2]), b = point(call[3]);
    EXPECT_EQ(ray_crossing(p.x, p.y, a.x, a.y, b.x, b.y, kEps), std::stoi(want[0]));
  } else if (call[0] == "collect") {
    TaggedPointList out;
    collector_set_tolerance(kDuplicateTolerance);
    collector_reset(&out, 10.0, 20.0, 2.0, 4.0);
    for (std::size_t i = 1; i < call.size(); ++i) emit_point(record(call[i]).x, record(call[i]).y, record(call[i]).tag);
    ASSERT_EQ(out.count(), static_cast<int>(want.size()));
    for (int k = 0; k < out.count(); ++k) {
      const TaggedPoint w = record(want[k]);
      EXPECT_TRUE(out[k].x == w.x && out[k].y == w.y && out[k].tag == w.tag) << k;
    }
  } else {
    ASSERT_EQ(call[0], "snap");
    EXPECT_EQ(snap_coordinate(value(call[1])), value(want[0]));
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, OverlayRoutines, test::RowsOf("overlay.txt"), test::RowName);

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

// Settled split lists: sorted, no two kept crossings within eps of each
// other, every crossing kept or within eps of a kept one, each kept one with
// the vertex it was recorded with.
TEST(SplitList, SettledListsAreSortedAndEpsApart) {
  std::mt19937_64 rng(11);
  std::uniform_real_distribution<double> u(0, 1), near(-2, 2);
  std::uniform_int_distribution<int> count(1, 60);
  BooleanEngine e;
  static Vertex v[64];
  for (int round = 0; round < 2000; ++round) {
    Edge edge;
    std::vector<double> ts;
    const int n = count(rng);
    double base = u(rng);
    for (int i = 0; i < n; ++i) {
      // Clusters of crossings a few eps apart, and scattered ones.
      ts.push_back(u(rng) < 0.7 ? base + near(rng) * kEps : (base = u(rng)));
      ASSERT_EQ(record_split(e.splits, edge, ts.back(), &v[i]), 0);
    }
    ASSERT_EQ(settle_splits(e, edge, kEps), 0);
    std::vector<double> kept;
    for (const SplitPoint* s = edge.splits; s; s = s->next) {
      ASSERT_TRUE(kept.empty() || s->t - kept.back() >= kEps) << "round " << round;
      ASSERT_EQ(ts.at(s->vertex - v), s->t);
      kept.push_back(s->t);
    }
    for (double t : ts)
      ASSERT_TRUE(std::any_of(kept.begin(), kept.end(), [&](double k) { return std::fabs(k - t) < kEps || k == t; }));
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

struct GridHolder {
  VertexGrid g;
  ~GridHolder() {
    delete[] g.buckets;
    delete g.vertices;
  }
};

void compare_on(const std::vector<std::pair<double, double>>& pts, std::mt19937_64& rng) {
  GridHolder h;
  ASSERT_EQ(size_grid(h.g, static_cast<std::int32_t>(pts.size())), 0);
  std::multimap<double, int> byX;  // the vertices so far by x, with their serial
  std::vector<std::pair<double, double>> at;
  std::vector<int> ownerOf;
  std::uniform_int_distribution<int> pick(0, 2);
  const int owners[] = {1, 2, kSharedOwner};
  const double e = kEngineEpsilon;
  for (std::size_t i = 0; i < pts.size(); ++i) {
    const auto [x, y] = pts[i];
    const int owner = owners[pick(rng)];
    bool near = false;
    for (auto it = byX.lower_bound(x - e); it != byX.end() && it->first < x + e && !near; ++it)
      near = std::fabs(x - it->first) < e && std::fabs(y - at[it->second].second) < e;
    const Vertex* v = grid_lookup(h.g, x, y, owner);
    ASSERT_NE(v, nullptr);
    if (!near) {
      ASSERT_EQ(v->serial, static_cast<int>(at.size())) << "point " << i << ": no vertex near, a new one";
      byX.insert({x, v->serial});
      at.push_back({x, y});
      ownerOf.push_back(owner);
      ASSERT_EQ(v->owner, owner);
      continue;
    }
    ASSERT_LT(v->serial, static_cast<int>(at.size())) << "point " << i << ": a vertex near, none new";
    ASSERT_TRUE(std::fabs(x - at[v->serial].first) < e && std::fabs(y - at[v->serial].second) < e) << "point " << i;
    int& o = ownerOf[v->serial];
    if (o != owner) o = kSharedOwner;
    ASSERT_EQ(v->owner, o) << "point " << i;
  }
}

TEST(VertexGrid, AgreesWithBruteForceOnAmbiguousClusters) {
  std::mt19937_64 rng(99);
  std::uniform_real_distribution<double> u(0, 1), j(-2.5, 2.5);
  for (int round = 0; round < 40; ++round) {
    std::vector<std::pair<double, double>> pts;
    // Clusters straddling 1/1000 cell borders, points a few tolerances apart.
    for (int c = 0; c < 30; ++c) {
      const double bx = std::round(u(rng) * 1000) / 1000 - 0.001 + (u(rng) < 0.5 ? 0 : 1e-13);
      const double by = std::round(u(rng) * 1000) / 1000 - 0.001;
      for (int k = 0; k < 40; ++k)
        pts.push_back({bx + j(rng) * kEngineEpsilon, by + j(rng) * kEngineEpsilon});
    }
    compare_on(pts, rng);
  }
}

TEST(VertexGrid, AgreesWithBruteForceOnDenseContours) {
  std::mt19937_64 rng(5);
  std::vector<std::pair<double, double>> pts;
  for (int k = 0; k < 20000; ++k) {
    const double t = k * 2 * M_PI / 20000;
    pts.push_back({0.5 + 0.3 * std::cos(t), 0.5 + 0.3 * std::sin(t)});
  }
  for (int k = 0; k < 20000; k += 7) pts.push_back({pts[k].first + 1e-15, pts[k].second});
  compare_on(pts, rng);
}

// A record with x below the separator threshold but y above it is read as a
// point far outside the normalised square; any cell must find a bucket.
TEST(VertexGrid, CellsFarOutsideTheSquareFindABucket) {
  GridHolder h;
  ASSERT_EQ(size_grid(h.g, 100), 0);
  const std::int64_t extremes[] = {-1073741824, -5, -1, 0, 1, 1073741824};
  for (std::int64_t row : extremes) {
    for (std::int64_t col : extremes) {
      const std::int32_t k = grid_bucket_of(h.g, row, col);
      EXPECT_GE(k, 0);
      EXPECT_LE(k, h.g.bucketMask);
    }
  }
  EXPECT_EQ(grid_cell_index(-1e300, 0, 0.001), -1073741824);
  EXPECT_EQ(grid_cell_index(1e300, 0, 0.001), 1073741824);
  const Vertex* far = grid_lookup(h.g, -3e14, 2.5e14, 1);
  ASSERT_NE(far, nullptr);
  EXPECT_EQ(grid_lookup(h.g, -3e14, 2.5e14, 2), far);
  EXPECT_EQ(far->owner, kSharedOwner);
}

}  // namespace
}  // namespace zt::detail
