// Offsets and the offset store: the request cases of data/offsets.txt;
// refusals; random points and polygons against brute force; broken
// diagrams that must end the request instead of looping; the store written
// to a file.
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <sstream>

#include "support/case_rows.hpp"
#include "offset_check.hpp"
#include "support/scratch_dir.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::test {
namespace {

constexpr double kTol = 1e-9;

// Whether the kinds of c are `pattern` repeated, from some rotation on.
bool KindsFollow(const Curve& c, const std::string& pattern) {
  for (std::size_t r = 0; r < pattern.size(); ++r) {
    bool all = true;
    for (std::size_t k = 0; k < c.elements.size(); ++k) all &= c.elements[k].kind == pattern[(k + r) % pattern.size()] - '0';
    if (all) return true;
  }
  return false;
}

class OffsetCases : public CaseRows {};

TEST_P(OffsetCases, TraceAtTheirDistanceOnTheirSide) {
  const std::vector<std::string> request = Split(row().field(1));
  const Keys want(row().field(2));
  const Sites in = ParseSites(row().field(0));
  Store(in);
  ASSERT_TRUE(in.segs.empty() ? ComputePoints() : ComputeSegments());
  const int side = std::stoi(request.at(0));
  const double maxUser = vd::Vd().maxOffset / vd::Vd().scale, step = Num(request.at(2));
  const double t = Num(request.at(1)) * (request[1].ends_with("max") ? maxUser : 1.0);
  ASSERT_EQ(VD_ComputeOffsets(side, t, step), want.num("ok", 1) != 0);
  if (want.has("api")) {
    EXPECT_EQ(API_ComputeOff(false, nullptr, false, false, t, step, false, false, false), want.num("ok", 1) != 0);
  }
  std::vector<Curve> curves = ReadStore();
  std::erase_if(curves, [&](const Curve& c) { return want.has("below") && c.offset >= want.num("below"); });
  if (want.has("curves")) {
    const std::string n = want.str("curves");
    EXPECT_TRUE(n.ends_with("+") ? curves.size() >= Num(n) : curves.size() == Num(n)) << curves.size();
  }
  const double tol = want.has("reltol") ? want.num("reltol") * Extent(in.pts) : want.num("tol", kTol);
  for (const Curve& c : curves) {
    // A multiple of the step within 1e-9 of a step (and of 1e-9 for steps above 1).
    EXPECT_NEAR(step > 0 ? std::remainder(c.offset - t, step) : 0.0, 0.0, 1e-9 * std::min(step, 1.0)) << c.offset;
    EXPECT_EQ(CheckAtDistance(in, {c}, step > 0 ? c.offset : t, tol), "");
    EXPECT_TRUE(!want.has("elements") || c.elements.size() == want.num("elements")) << c.elements.size();
    EXPECT_TRUE(!want.has("kinds") || KindsFollow(c, want.str("kinds")));
    for (std::size_t k = 0; k < c.elements.size(); ++k) {
      const Element& e = c.elements[k];
      EXPECT_TRUE(e.kind != 2 || !want.has("sweep") || std::fabs(Sweep(c, k) - want.num("sweep")) <= 1e-9) << k;
      EXPECT_TRUE(e.kind != 0 || !want.has("segtag") || VD_GetSegmentTag(e.site) == want.num("segtag")) << k;
    }
  }
  for (const double d : Nums(want.str("at"))) {
    EXPECT_TRUE(std::any_of(curves.begin(), curves.end(), [&](const Curve& c) { return std::fabs(c.offset - d) < 1e-9; }))
        << d;
  }
  EXPECT_TRUE(in.contours.empty() || side == 3 || CheckSide(in.contours, curves, side == 1).empty());
}

INSTANTIATE_TEST_SUITE_P(Data, OffsetCases, RowsOf("offsets.txt"), RowName);

TEST(OffsetRequest, SideZeroSucceedsAndLeavesTheStoreAlone) {
  Store({{0, 0}, {1, 0}, {0, 1}});
  ASSERT_TRUE(ComputePoints());
  EXPECT_TRUE(VD_ComputeOffsets(3, 0.1, 0.0));
  const std::int32_t n = GetNumOffsetCurves();
  EXPECT_GT(n, 0);
  EXPECT_TRUE(VD_ComputeOffsets(0, 0.2, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), n);
  // Every request appends: the same request again doubles the store.
  EXPECT_TRUE(VD_ComputeOffsets(3, 0.1, 0.0));
  EXPECT_EQ(GetNumOffsetCurves(), 2 * n);
  VD_Reset();
  EXPECT_EQ(GetNumOffsetCurves(), 0);
}

TEST(OffsetRequest, StaleDiagramIsRefusedByTheFacadeAndFatalBelowIt) {
  Store({{0, 0}, {1, 0}});
  for (int side = 0; side <= 3; ++side) EXPECT_FALSE(VD_ComputeOffsets(side, 0.1, 0.0));
  EXPECT_EXIT(API_ComputeOff(false, nullptr, false, false, 0.1, 0.0, false, false, false),
              ::testing::ExitedWithCode(2), "error in API_ComputeOff: VD not known or not up-to-date!");
}

TEST(OffsetRequest, ZeroDistanceSelectsTheAutomaticOffsets) {
  Store({{0, 0}, {10, 0}});
  ASSERT_TRUE(ComputePoints());
  const double scale = vd::Vd().scale;
  ASSERT_TRUE(VD_ComputeOffsets(3, 0.0, 0.0));
  ASSERT_GT(GetNumOffsetCurves(), 0);
  double offset, second;
  std::int32_t first, last;
  ASSERT_TRUE(GetOffsetCurve(0, offset, first, last));
  EXPECT_NEAR(offset, 0.001 / scale, 1e-15);
  // The family steps by at least ten times t.
  ASSERT_TRUE(GetOffsetCurve(2, second, first, last));
  EXPECT_GE(second - offset, 10 * offset - 1e-12);
}

TEST(OffsetReadOut, IndicesOutsideTheStoreAreRefused) {
  Store({{0, 0}});
  ASSERT_TRUE(ComputePoints());
  double offset = 7, x = 7, y = 7;
  std::int32_t first = 7, last = 7, kind = 7, site = 7, tag = 7;
  EXPECT_FALSE(GetOffsetCurve(0, offset, first, last));
  EXPECT_FALSE(GetOffsetCurve(-1, offset, first, last));
  EXPECT_FALSE(GetOffsetElement(0, kind, site, x, y, tag));
  EXPECT_EQ(first, 7);
  EXPECT_TRUE(PointsCoincide({0, 0}, {1e-6, 0}));
  EXPECT_FALSE(PointsCoincide({0, 0}, {1e-6, 1e-7}));
}

// The edges that a request at distance 1.5 crosses on a diagram of 40
// random points, after one good request.
std::vector<std::int32_t> CrossedEdgesOfAGoodRequest() {
  Store(UniformPoints(40, 5, 10.0));
  EXPECT_TRUE(ComputePoints());
  EXPECT_TRUE(VD_ComputeOffsets(3, 1.5, 0.0));
  EXPECT_GT(GetNumOffsetCurves(), 0);
  const vd::Engine& g = vd::Vd();
  std::vector<std::int32_t> crossed;
  for (std::int32_t e = 4; e < g.edges.count; ++e) {
    const auto& r = g.edges[e];
    const double r1 = g.nodes[r.n1].r, r2 = g.nodes[r.n2].r, t = 1.5 * g.scale;
    if (!r.deleted && std::fmin(r1, r2) <= t && t < std::fmax(r1, r2)) crossed.push_back(e);
  }
  return crossed;
}

// A diagram whose neighbour fields lead the walk astray: an edge crossed at
// this distance becomes everybody's neighbour, and the request fails
// instead of tracing forever.
TEST(TracedOffsets, BrokenDiagramEndsTheRequestWithFailure) {
  const std::vector<std::int32_t> crossed = CrossedEdgesOfAGoodRequest();
  ASSERT_FALSE(crossed.empty());
  vd::Engine& g = vd::Vd();
  for (std::int32_t e = 4; e < g.edges.count; ++e) g.edges[e].s_ccw = g.edges[e].e_ccw = crossed[0];
  EXPECT_FALSE(VD_ComputeOffsets(3, 1.5, 0.0));
}

// Every crossed edge but the first (where the sweep starts) turns back onto
// itself: the walk comes back to an edge it has already crossed.
TEST(TracedOffsets, WalkBackOntoACrossedEdgeEndsTheRequestWithFailure) {
  const std::vector<std::int32_t> crossed = CrossedEdgesOfAGoodRequest();
  const std::int32_t before = GetNumOffsetCurves();
  for (std::size_t i = 1; i < crossed.size(); ++i) vd::Vd().edges[crossed[i]].s_ccw = vd::Vd().edges[crossed[i]].e_ccw = crossed[i];
  EXPECT_FALSE(VD_ComputeOffsets(3, 1.5, 0.0));
  // The failed curve leaves nothing behind; the circles of the request stay.
  std::int32_t kind, site, tag, f, l;
  double x, y, offset;
  for (std::int32_t i = before; i < GetNumOffsetCurves(); ++i) {
    ASSERT_TRUE(GetOffsetCurve(i, offset, f, l));
    EXPECT_TRUE(GetOffsetElement(l, kind, site, x, y, tag));
  }
  EXPECT_FALSE(GetOffsetElement(vd::Vd().offsetElements.count, kind, site, x, y, tag));
}

// Stores the sites, computes, requests and checks the curves against brute
// force; inside and outside requests of contours alone also keep their side.
void ExpectOffsetsOf(const Sites& in, int side, double t, bool someCurve, const std::string& what) {
  Store(in);
  ASSERT_TRUE(in.segs.empty() ? ComputePoints() : ComputeSegments()) << what;
  ASSERT_TRUE(VD_ComputeOffsets(side, t, 0.0)) << what;
  const auto curves = ReadStore();
  ASSERT_TRUE(!someCurve || !curves.empty()) << what;
  ASSERT_EQ(CheckAtDistance(in, curves, t, 1e-9 * Extent(in.pts)), "") << what;
  ASSERT_TRUE(side == 3 || in.pts.size() != in.segs.size() || CheckSide(in.contours, curves, side == 1).empty()) << what;
}

// Random points at distances where the circles overlap: arcs at distance t
// from their nearest point.
TEST(TracedOffsets, RandomPointsAgainstBruteForce) {
  for (std::uint32_t seed = 1; seed <= 12; ++seed)
    for (const double t : {2.0, 5.0, 9.0, 20.0})
      ExpectOffsetsOf(Sites{UniformPoints(60, seed, 100.0), {}, {}}, 3, t, true, "seed " + std::to_string(seed) + " t " + std::to_string(t));
}

// Necks at random places and depths, with distances below, near and above
// half the neck's width.
TEST(PolygonOffsets, RandomNecksAgainstBruteForce) {
  std::mt19937 rng(17);
  std::uniform_real_distribution<double> ux(-5, 10), uy(0.3, 3.6), ut(0.2, 2.2), uw(0.3, 3);
  for (int trial = 0; trial < 60; ++trial) {
    const double x = ux(rng), y = uy(rng), w = uw(rng), t = ut(rng);
    Sites in;
    in.AddContour({{-10, 0}, {14, 0}, {14, 4}, {x + w, 4}, {x, y}, {x - w, 4}, {-10, 4}});
    ExpectOffsetsOf(in, 1, t, t < 2.0, "trial " + std::to_string(trial));
  }
}

// Random outer contours with star-shaped holes, inside, outside and both;
// loose points inside a pocket: their circles (both sides) and the curves
// where circles meet the walls' offsets.
TEST(PolygonOffsets, RandomPocketsWithIslandsOrLoosePointsAgainstBruteForce) {
  std::mt19937 rng(11);
  for (int trial = 0; trial < 230; ++trial) {
    Sites in;
    const bool loose = trial >= 200;
    for (const Contour& c : PocketWithIslands(rng, loose ? 12 + trial % 30 : 8 + trial % 40, loose ? 0 : trial % 4, 5 + trial % 9))
      in.AddContour(c);
    std::uniform_real_distribution<double> td(0.5, 12.0), u(-40, 40);
    for (int k = 0; loose && k < 1 + trial % 6; ++k) {
      const double x = u(rng);
      in.Add(x, u(rng));
    }
    const int side = 1 + trial % 3;
    ExpectOffsetsOf(in, side, loose ? 2.0 + trial % 7 * 1.5 : td(rng), !loose && side != 3,
                    "trial " + std::to_string(trial) + " side " + std::to_string(side));
  }
}

// A request that asks for a file writes the whole store there.
TEST(PolygonOffsets, RequestedFileHoldsTheStore) {
  StoreContours({{{0, 0}, {1, 0}, {1, 1}, {0, 1}}});
  ASSERT_TRUE(ComputeSegments());
  const test::ScratchDir dir;
  ASSERT_TRUE(API_ComputeOff(false, dir.file("o.txt").c_str(), true, false, 0.1, 0.0, false, true, false));
  std::istringstream in(test::read_text(dir.file("o.txt")));
  std::string line;
  std::getline(in, line);
  EXPECT_EQ(line, "curve 0.10000000000000001");
  int elements = 0;
  while (std::getline(in, line)) ++elements;
  EXPECT_EQ(elements, 4);
  ASSERT_TRUE(API_ComputeOff(false, dir.file("o.dxf").c_str(), true, true, 0.1, 0.0, false, false, true));
  const std::string all = test::read_text(dir.file("o.dxf"));
  EXPECT_NE(all.find("ARC"), std::string::npos);
  EXPECT_NE(all.find("EOF"), std::string::npos);
  // A file that cannot be written fails the request.
  EXPECT_FALSE(API_ComputeOff(false, "/nonexistent/dir/x.txt", true, false, 0.1, 0.0, false, true, false));
}

}  // namespace
}  // namespace zt::test
