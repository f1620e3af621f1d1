// Quadratic solver: normalisation by powers of 128 and root forms.
#include "voronoi/detail/quadratic.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

namespace zt::vd::geo {
namespace {

TEST(Quadratic, RootsDoNotDependOnScale) {
  // (t − 1)(t − 2) scaled down by powers of 128: the scaling is exact, so the
  // roots must come out bit-identical.
  double scale = 1.0;
  for (int k = 0; k < 12; ++k, scale /= 128.0) {
    QuadCoefs q{1.0 * scale, -3.0 * scale, 2.0 * scale};
    const QuadRoots r = solve_quadratic(q);
    ASSERT_EQ(r.count, 2) << k;
    EXPECT_EQ(std::min(r.t1, r.t2), 1.0) << k;
    EXPECT_EQ(std::max(r.t1, r.t2), 2.0) << k;
  }
}

TEST(Quadratic, NormalisationStopsAndCounts) {
  QuadCoefs q{1.0 / (128.0 * 128.0 * 128.0), 0.0, 0.0};
  EXPECT_EQ(normalize_quadratic(q), 3);
  EXPECT_EQ(q.a, 1.0);
  QuadCoefs zero{0.0, 0.0, 0.0};
  EXPECT_EQ(normalize_quadratic(zero), 0);
  QuadCoefs nan{std::nan(""), 0.0, 0.0};
  EXPECT_EQ(normalize_quadratic(nan), 0);
  // The smallest subnormal reaches the threshold in finitely many steps.
  QuadCoefs tiny{0.0, 4.9406564584124654e-324, 0.0};
  EXPECT_GT(normalize_quadratic(tiny), 100);
  EXPECT_GT(std::fabs(tiny.b), kQuadSmall);
  // A large A stops the scaling even when B and C are tiny.
  QuadCoefs big{1.0, 1e-30, 1e-30};
  EXPECT_EQ(normalize_quadratic(big), 0);
}

TEST(Quadratic, DegenerateForms) {
  // Linear: A = 0.
  QuadRoots r = solve_quadratic({0.0, 2.0, -4.0});
  ASSERT_EQ(r.count, 1);
  EXPECT_EQ(r.t1, 2.0);
  // Neither A nor B: no root.
  EXPECT_EQ(solve_quadratic({0.0, 0.0, 1.0}).count, 0);
  // Double root.
  r = solve_quadratic({1.0, -2.0, 1.0});
  ASSERT_EQ(r.count, 1);
  EXPECT_EQ(r.t1, 1.0);
  // Negative discriminant: no root.
  EXPECT_EQ(solve_quadratic({1.0, 0.0, 1.0}).count, 0);
  // q = 0 (B = C = 0 after the disc): one root.
  r = solve_quadratic({1.0, 0.0, -0.0});
  EXPECT_EQ(r.count, 1);
  // Non-finite coefficients give no root.
  EXPECT_EQ(solve_quadratic({std::nan(""), 1.0, 1.0}).count, 0);
  EXPECT_EQ(solve_quadratic({1.0, HUGE_VAL, 1.0}).count, 0);
}

TEST(Quadratic, CancellationFreeSmallRoot) {
  // t² − 1e8·t + 1: the small root 1e-8 is lost by the textbook formula.
  const QuadRoots r = solve_quadratic({1.0, -1e8, 1.0});
  ASSERT_EQ(r.count, 2);
  const double small = std::min(r.t1, r.t2);
  EXPECT_NEAR(small, 1e-8, 1e-22);
}

}  // namespace
}  // namespace zt::vd::geo
