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

std::vector<Pt> to_float(const RefPoly& p) {
  std::vector<Pt> out;
  for (const RefPt& q : p) out.push_back({static_cast<float>(q.x), static_cast<float>(q.y)});
  return out;
}

RefPoly ref(const std::vector<Pt>& p) {
  RefPoly out;
  for (const Pt& q : p) out.push_back({q.x, q.y});
  return out;
}

TEST(RestzonesOracle, EveryLevelOfTheResultAgreesWithClipper) {
  std::mt19937 rng(20261206);
  double worst = 0;
  int compared = 0;
  for (int k = 0; k < kCases; ++k) {
    SCOPED_TRACE("case " + std::to_string(k));
    const std::vector<RefLevel> levels = pocket_case(rng, {70, 0.55f, 0.5f, 3, true, true});
    std::vector<Contour> finishing, rest;
    for (const RefLevel& l : levels) {
      for (const RefPoly& p : l.finishing) finishing.push_back({l.z, to_float(p)});
      for (const RefPoly& p : l.rest) rest.push_back({l.z, to_float(p)});
    }
    ProgramRun r;
    r.put("zstock.ok", std::string("1.0\n"));
    r.put("grid.tmp", std::string("0 0\n0 0\n0.1 0\n2 0\n"));
    r.put("contour.bin", records(finishing));
    r.put("stock1.bin", records(rest));
    ASSERT_EQ(r.run(), 0) << r.err;
    ASSERT_FALSE(r.marker_left()) << r.out << r.messages();
    std::vector<Contour> written;
    ASSERT_TRUE(read_result(r.bytes("stock2.bin"), written));
    std::map<float, std::vector<RefPoly>> ours;
    for (const Contour& z : written) ours[z.z].push_back(ref(z.points));

    const auto want = reference_zones(levels, kOffsetDistance, kMergeRadius);
    for (const RefLevel& l : levels) {
      const auto w = want.find(l.z);
      const auto o = ours.find(l.z);
      const bool expected = w != want.end() && !w->second.empty();
      ASSERT_EQ(expected, o != ours.end()) << "level " << l.z;
      if (!expected) continue;
      EXPECT_EQ(o->second.size(), w->second.size()) << "level " << l.z;
      const double d = boundary_distance(o->second, w->second);
      EXPECT_LE(d, kBoundaryDistance) << "level " << l.z;
      worst = std::max(worst, d);
      ++compared;
    }
  }
  EXPECT_GT(compared, 2 * kCases);
  std::printf("%d levels compared; worst boundary distance %.6f\n", compared, worst);
}

}  // namespace
}  // namespace zt::e2e
