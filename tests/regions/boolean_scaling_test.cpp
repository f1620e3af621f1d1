// The work of one operation must grow like n log n whatever the shape of the
// input, in particular when a tiny piece far away rules the joint box (a
// dense contour then sits in one 1/1000 cell of it). Work is counted, not
// timed: box pairs compared at the box trees' leaf pairs and vertices walked
// by the vertex grid's lookups.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "region_test_support.hpp"
#include "regions/detail/engine.hpp"

namespace zt::test {
namespace {

// A wavy n-vertex circle of radius 1 against a copy of itself plus a unit
// square `distance` away, towards -x (coordinates at 99990 and above end
// contours).
std::int64_t far_apart_work(int n, double distance) {
  Contour wavy;
  for (int k = 0; k < n; ++k) {
    const double t = 2 * M_PI * k / n, r = 1 + 0.01 * std::sin(50 * t);
    wavy.push_back({r * std::cos(t), r * std::sin(t)});
  }
  TaggedPointList a, b, r;
  fill_list(a, {wavy});
  fill_list(b, {wavy, rect(-distance - 1, 0, -distance, 1)});
  EXPECT_EQ(rg_boolean(a, b, "i", &r), 0);
  const detail::BooleanEngine* e = detail::last_thread_engine();
  return e->leafPairTests + detail::grid_visit_count(e->grid);
}

class BooleanScaling : public ::testing::TestWithParam<double> {};

TEST_P(BooleanScaling, FarApartWorkGrowsLikeNLogN) {
  constexpr int kSmall = 2000, kLarge = 32000;
  const double small = static_cast<double>(far_apart_work(kSmall, GetParam()));
  const double large = static_cast<double>(far_apart_work(kLarge, GetParam()));
  const double nLogN = (kLarge * std::log2(kLarge)) / (kSmall * std::log2(kSmall));
  // Slack for the trees' and the grid's constant factors; quadratic work
  // would be 256 times the small case, this bound is about 27.
  constexpr double kSlack = 1.25;
  EXPECT_LT(large / small, kSlack * nLogN) << small << " then " << large;
}

INSTANTIATE_TEST_SUITE_P(Distances, BooleanScaling, ::testing::Values(1e2, 1e5, 1e9));

}  // namespace
}  // namespace zt::test
