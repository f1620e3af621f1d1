// The rows that count the anchoring rays of many shared vertices must give
// the tree's counts: every operation's output is the same, byte for byte,
// with the rows as with the tree alone. The shapes make the rows matter:
// boundaries running along each other everywhere (a ray at every vertex),
// a boundary run along on one half and crossed at every edge on the other,
// small pieces over a large box, and a dense piece tiny
// beside its own set's extent (rows too full, left to the tree).
#include <gtest/gtest.h>

#include <cmath>
#include <ostream>
#include <random>
#include <vector>

#include "region_test_support.hpp"
#include "regions/detail/engine.hpp"

namespace zt::test {
namespace {

Contour circle(double cx, double cy, double r, int n, double wobble, std::uint64_t seed) {
  std::mt19937_64 rng(seed);
  std::normal_distribution<double> noise(0.0, 1.0);
  Contour c;
  for (int k = 0; k < n; ++k) {
    const double t = 2 * M_PI * k / n, rk = r * (1 + 0.01 * std::sin(50 * t) + wobble * noise(rng));
    c.push_back({cx + rk * std::cos(t), cy + rk * std::sin(t)});
  }
  return c;
}

struct Shape {
  const char* name;
  std::vector<Contour> a, b;
};
void PrintTo(const Shape& s, std::ostream* os) { *os << s.name; }

std::vector<Shape> shapes() {
  std::vector<Shape> s;
  const Contour wavy = circle(0, 0, 1, 3000, 0, 1);
  s.push_back({"CopyWithFarSquare", {wavy}, {wavy, rect(-1001, 0, -1000, 1)}});
  // Half of it run along, the other half crossed at every edge.
  const Contour noisy = circle(0, 0, 1, 3000, 1e-4, 3);
  Contour zigzag = noisy;
  for (std::size_t k = zigzag.size() / 2; k < zigzag.size(); ++k) {
    const double f = 1 + (k % 2 ? 3e-4 : -3e-4);
    zigzag[k].x *= f;
    zigzag[k].y *= f;
  }
  s.push_back({"HalfAlongHalfCrossing", {noisy}, {zigzag}});
  Shape scattered{"ScatteredPieces", {}, {}};
  std::mt19937_64 rng(11);
  std::uniform_real_distribution<double> u(0, 1e3);
  for (int k = 0; k < 200; ++k) {
    const double cx = u(rng), cy = u(rng);
    scattered.a.push_back(circle(cx, cy, 1, 20, 0, 0));
    scattered.b.push_back(circle(cx + 0.3, cy + 0.2, 1, 20, 0, 0));
  }
  s.push_back(scattered);
  const Contour tiny = circle(5, 5, 1e-3, 3000, 0, 5);
  s.push_back({"DenseTinyBesideHuge", {tiny, circle(5 + 2e-4, 5, 1e-3, 3000, 0, 6)}, {rect(0, 0, 1e6, 1e6, 0, false), tiny}});
  return s;
}

class RayRows : public ::testing::TestWithParam<Shape> {};

TEST_P(RayRows, OutputIsTheTreesByteForByte) {
  TaggedPointList a, b;
  fill_list(a, GetParam().a);
  fill_list(b, GetParam().b);
  bool rowsBuilt = false;
  for (const char* op : {"u", "i", "d"}) {
    TaggedPointList byTree, byRows;
    detail::tl_rayRowsOff = true;
    ASSERT_EQ(rg_boolean(a, b, op, &byTree), 0) << op;
    detail::tl_rayRowsOff = false;
    ASSERT_EQ(rg_boolean(a, b, op, &byRows), 0) << op;
    const detail::BooleanEngine* e = detail::last_thread_engine();
    rowsBuilt = rowsBuilt || e->a.rows.built || e->b.rows.built;
    EXPECT_TRUE(same_list(byTree, byRows)) << op;
  }
  EXPECT_TRUE(rowsBuilt);
}

INSTANTIATE_TEST_SUITE_P(Shapes, RayRows, ::testing::ValuesIn(shapes()),
                         [](const ::testing::TestParamInfo<Shape>& info) { return std::string(info.param.name); });

}  // namespace
}  // namespace zt::test
