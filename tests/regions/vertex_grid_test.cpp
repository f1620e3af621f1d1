// The vertex grid against brute force: a lookup gives an existing vertex
// within the tolerance (in both coordinates) whenever there is one, and a new
// vertex only when there is none; a vertex looked up by a second owner
// becomes shared. Dense and ambiguous point sets: vertices between one and
// two tolerances apart, cell borders.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <random>
#include <vector>

#include "regions/detail/engine.hpp"

namespace zt::detail {
namespace {

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
