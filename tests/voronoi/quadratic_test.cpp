// Quadratic solver: the root forms of data/quadratic.txt, and the
// normalisation by powers of 128.
#include "voronoi/detail/quadratic.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

#include "support/case_rows.hpp"

namespace zt::vd::geo {
namespace {

class Quadratic : public test::CaseRows {};

TEST_P(Quadratic, FindsItsRoots) {
  const std::vector<double> c = test::Nums(row().field(0));
  const std::vector<std::string> want = test::Split(row().field(1));
  const double tol = test::Num(row().field(2));
  const QuadRoots r = solve_quadratic({c.at(0), c.at(1), c.at(2)});
  ASSERT_EQ(r.count, std::stoi(want.at(0)));
  const double roots[] = {std::min(r.t1, r.t2), std::max(r.t1, r.t2)};
  for (std::size_t i = 1; i < want.size(); ++i) {
    const double root = r.count == 1 ? r.t1 : roots[i - 1];
    EXPECT_TRUE(want[i] == "*" || std::fabs(root - test::Num(want[i])) <= tol) << i << ": " << root;
  }
}

INSTANTIATE_TEST_SUITE_P(Data, Quadratic, test::RowsOf("quadratic.txt"), test::RowName);

TEST(QuadraticNormalisation, StopsAndCounts) {
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

}  // namespace
}  // namespace zt::vd::geo
