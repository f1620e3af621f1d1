// The vertex grid against a plain model of the 1/1000 grid it must agree
// with: cells scanned column by column and row by row, each cell's bucket
// (row * 1003 + column modulo a prime of at least 997) walked from its most
// recent vertex, the first vertex within the tolerance taken. Dense and
// ambiguous point sets (vertices between one and two tolerances apart, cell
// borders) must give the same vertex, the same sharing, in the same order.
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <vector>

#include "regions/detail/engine.hpp"

namespace zt::detail {
namespace {

class ModelGrid {
 public:
  explicit ModelGrid(int pointCount) {
    std::int64_t m = pointCount / 10;
    if (m % 2 == 0) ++m;
    for (;; m += 2) {
      bool prime = true;
      for (std::int64_t d = 3; d * d <= m; d += 2) prime = prime && m % d != 0;
      if (prime) break;
    }
    buckets_.resize(m > 997 ? m : 997);
  }

  // Returns the vertex number and its owner after the lookup.
  std::pair<int, int> lookup(double x, double y, int owner) {
    const double e = kEngineEpsilon, o = -kGridCell;
    for (std::int64_t c = cell(x - e, o); c <= cell(x + e, o); ++c) {
      for (std::int64_t r = cell(y - e, o); r <= cell(y + e, o); ++r) {
        const auto& chain = buckets_[bucket(r, c)];
        for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
          V& v = verts_[*it];
          if (std::fabs(x - v.x) < e && std::fabs(y - v.y) < e) {
            if (v.owner != owner) v.owner = kSharedOwner;
            return {*it, v.owner};
          }
        }
      }
    }
    verts_.push_back({x, y, owner});
    buckets_[bucket(cell(y, o), cell(x, o))].push_back(int(verts_.size()) - 1);
    return {int(verts_.size()) - 1, owner};
  }

 private:
  struct V {
    double x, y;
    int owner;
  };
  static std::int64_t cell(double v, double origin) { return grid_cell_index(v, origin, kGridCell); }
  std::size_t bucket(std::int64_t r, std::int64_t c) const {
    const std::int64_t n = static_cast<std::int64_t>(buckets_.size());
    return static_cast<std::size_t>(((r * 1003 + c) % n + n) % n);
  }
  std::vector<std::vector<int>> buckets_;
  std::vector<V> verts_;
};

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
  ModelGrid model(static_cast<int>(pts.size()));
  std::uniform_int_distribution<int> ownerOf(0, 2);
  const int owners[] = {1, 2, kSharedOwner};
  for (std::size_t i = 0; i < pts.size(); ++i) {
    const int owner = owners[ownerOf(rng)];
    const Vertex* v = grid_lookup(h.g, pts[i].first, pts[i].second, owner);
    ASSERT_NE(v, nullptr);
    const auto expected = model.lookup(pts[i].first, pts[i].second, owner);
    ASSERT_EQ(v->serial, expected.first) << "point " << i;
    ASSERT_EQ(v->owner, expected.second) << "point " << i;
  }
}

TEST(VertexGrid, AgreesWithTheModelOnAmbiguousClusters) {
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

TEST(VertexGrid, AgreesWithTheModelOnDenseContours) {
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
