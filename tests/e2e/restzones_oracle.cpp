// Oracle: every level of the stock2.bin that the real program writes against
// the Clipper reference pipeline, on generated pockets with a rectangular
// and a round island, rest material in corners, around an island corner and
// along a wall, over two to five levels.
#include <gtest/gtest.h>

#include <random>

#include "e2e/clipper_reference.hpp"
#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

constexpr double kBoundaryDistance = 0.02;
constexpr double kOffsetDistance = 1.0;
constexpr double kMergeRadius = 2.0;
constexpr int kCases = 20;

RefPoly ref(const std::vector<Pt>& p) {
  RefPoly out;
  for (const Pt& q : p) out.push_back({q.x, q.y});
  return out;
}

std::vector<Pt> reversed(std::vector<Pt> p) {
  std::reverse(p.begin(), p.end());
  return p;
}

std::vector<Pt> polygon_circle(float cx, float cy, float r, int n) {
  std::vector<Pt> p;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * 3.14159265358979323846 * i / n;
    p.push_back({static_cast<float>(cx + r * std::cos(a)), static_cast<float>(cy + r * std::sin(a))});
  }
  p.push_back(p.front());
  return p;
}

struct Case {
  std::vector<Contour> finishing, rest;
  std::vector<RefLevel> levels;
};

Case make_case(std::mt19937& rng) {
  std::uniform_real_distribution<float> size(70, 110), fillet(2, 7), coin(0, 1);
  const float w = std::round(size(rng)), h = std::round(size(rng));
  const float ix = std::round(w * 0.55f), iy = std::round(h * 0.5f);
  const std::vector<Pt> outer = rectangle(0, 0, w, h);
  const std::vector<Pt> block = rectangle(ix, iy, ix + 15, iy + 12, true);
  const std::vector<Pt> boss = reversed(polygon_circle(w * 0.25f, h * 0.3f, 8, 48));
  Case c;
  const int count = 2 + static_cast<int>(coin(rng) * 4);
  for (int k = 0; k < count; ++k) {
    const float z = 10.0f - 5.0f * static_cast<float>(k);
    std::vector<std::vector<Pt>> rest;
    auto corner = [&](float cx, float cy, float sx, float sy) {
      if (coin(rng) < 0.4f) return;
      const float r = fillet(rng);
      std::vector<Pt> t = {{cx, cy}, {cx + sx * r, cy}, {cx, cy + sy * r}, {cx, cy}};
      rest.push_back(sx * sy < 0 ? reversed(t) : t);
    };
    corner(0, 0, 1, 1);
    corner(w, 0, -1, 1);
    corner(w, h, -1, -1);
    corner(0, h, 1, -1);
    if (coin(rng) < 0.5f) {  // around the block's lower left corner
      const float r = fillet(rng);
      rest.push_back({{ix - r, iy - r}, {ix + 4, iy - r}, {ix + 4, iy}, {ix, iy}, {ix, iy + 4}, {ix - r, iy + 4},
                      {ix - r, iy - r}});
    }
    if (coin(rng) < 0.4f) rest.push_back(rectangle(20, h - 0.3f, w - 20, h));  // along the top wall
    RefLevel level{z, {ref(outer), ref(block), ref(boss)}, {}};
    c.finishing.push_back({z, outer});
    c.finishing.push_back({z, block});
    c.finishing.push_back({z, boss});
    for (const auto& p : rest) {
      c.rest.push_back({z, p});
      level.rest.push_back(ref(p));
    }
    c.levels.push_back(level);
  }
  return c;
}

TEST(RestzonesOracle, EveryLevelOfTheResultAgreesWithClipper) {
  std::mt19937 rng(20261206);
  double worst = 0;
  int levels = 0;
  for (int k = 0; k < kCases; ++k) {
    SCOPED_TRACE("case " + std::to_string(k));
    const Case c = make_case(rng);
    ProgramRun r;
    r.put("zstock.ok", std::string("1.0\n"));
    r.put("grid.tmp", std::string("0 0\n0 0\n0.1 0\n2 0\n"));
    r.put("contour.bin", records(c.finishing));
    r.put("stock1.bin", records(c.rest));
    ASSERT_EQ(r.run(), 0) << r.err;
    ASSERT_FALSE(r.marker_left()) << r.out << r.messages();
    std::vector<Contour> written;
    ASSERT_TRUE(read_result(r.bytes("stock2.bin"), written));
    std::map<float, std::vector<RefPoly>> ours;
    for (const Contour& z : written) ours[z.z].push_back(ref(z.points));

    const auto want = reference_zones(c.levels, kOffsetDistance, kMergeRadius);
    for (const RefLevel& l : c.levels) {
      const auto w = want.find(l.z);
      const auto o = ours.find(l.z);
      const bool expected = w != want.end() && !w->second.empty();
      ASSERT_EQ(expected, o != ours.end()) << "level " << l.z;
      if (!expected) continue;
      EXPECT_EQ(o->second.size(), w->second.size()) << "level " << l.z;
      const double d = boundary_distance(o->second, w->second);
      EXPECT_LE(d, kBoundaryDistance) << "level " << l.z;
      worst = std::max(worst, d);
      ++levels;
    }
  }
  EXPECT_GT(levels, 2 * kCases);
  std::printf("%d levels compared; worst boundary distance %.6f\n", levels, worst);
}

}  // namespace
}  // namespace zt::e2e
