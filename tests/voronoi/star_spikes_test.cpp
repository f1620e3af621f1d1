// Regular and uneven stars of 100 to 1,000 spikes, their contours given in
// either direction, from any start, points and segments stored in shuffled
// orders, built in the point phase's fully random order and in its partly
// sorted one. A star of 300 spikes once gave a node of clearance -1.09e156:
// every live node must lie at a finite place with a finite clearance of at
// least zero, and the diagram must pass the checker (by brute force up to
// 300 spikes).
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include "vd_test_util.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::test {
namespace {

struct StarShape {
  const char* name;
  int spikes;
  double inner, outer, wobble;  // radii; wobble: amplitude of an uneven term
};

class StarSpikes : public ::testing::TestWithParam<StarShape> {};

TEST_P(StarSpikes, EveryNodeFiniteAndTheDiagramChecked) {
  constexpr int kOrders = 3;
  // Larger stars get the checker's local tests only: brute force is
  // quadratic.
  constexpr int kBruteForceSpikes = 300;
  const StarShape& s = GetParam();
  std::vector<Pt> star;
  for (int k = 0; k < 2 * s.spikes; ++k) {
    const double a = M_PI * k / s.spikes, r = (k % 2 ? s.inner : s.outer) + s.wobble * std::sin(7.3 * k);
    star.push_back({r * std::cos(a), r * std::sin(a)});
  }
  std::mt19937 rng(300);
  for (int order = 0; order < kOrders; ++order) {
    if (order % 2) std::reverse(star.begin(), star.end());
    std::rotate(star.begin(), star.begin() + rng() % star.size(), star.end());
    std::vector<int> points(star.size()), segments(star.size());
    std::iota(points.begin(), points.end(), 0);
    std::iota(segments.begin(), segments.end(), 0);
    if (order > 0) {
      std::shuffle(points.begin(), points.end(), rng);
      std::shuffle(segments.begin(), segments.end(), rng);
    }
    for (const bool presorted : {false, true}) {
      SCOPED_TRACE("order " + std::to_string(order) + (presorted ? " presorted" : " random"));
      VD_Initialize();
      VD_Reset();
      std::vector<std::int32_t> index(star.size());
      for (int i : points) index[i] = API_AddPoint(star[i].x, star[i].y, -1);
      for (int i : segments) API_AddSegment(index[i], index[(i + 1) % star.size()], 0);
      vd::Vd().presortPointOrder = presorted;
      const bool computed = ComputeSegments();
      vd::Vd().presortPointOrder = true;
      ASSERT_TRUE(computed);
      const vd::Engine& g = vd::Vd();
      for (std::int32_t n = 0; n < g.nodes.count; ++n) {
        const vd::NodeRecord& r = g.nodes[n];
        if (r.status == vd::DELETED) continue;
        ASSERT_TRUE(std::isfinite(r.x) && std::isfinite(r.y) && std::isfinite(r.r) && r.r >= 0.0)
            << "node " << n << " r " << r.r;
      }
      EXPECT_EQ(FinalCheck(s.spikes <= kBruteForceSpikes), "");
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Stars, StarSpikes,
                         ::testing::Values(StarShape{"Regular100", 100, 40, 100, 0},
                                           StarShape{"Regular300", 300, 40, 100, 0},
                                           StarShape{"Uneven300", 300, 40, 100, 1},
                                           StarShape{"Needles300", 300, 5, 100, 0},
                                           StarShape{"Shallow300", 300, 97, 100, 0},
                                           StarShape{"Regular1000", 1000, 40, 100, 0}),
                         [](const ::testing::TestParamInfo<StarShape>& i) { return std::string(i.param.name); });

}  // namespace
}  // namespace zt::test
