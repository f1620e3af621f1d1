// Polyline simplification: a brute-force bound on random polylines and the
// exact boundary cases (the rows of data/simplify.txt).
#include "zone/simplify.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "support/case_rows.hpp"
#include "support/segment_distance.hpp"

namespace zt {
namespace {

// Slack for the triangle-inequality bound: sqrt and the projection round.
constexpr double kBoundSlack = 1e-12;

// Points as pairs, which gtest compares exactly and prints.
template <class Points>
std::vector<std::pair<double, double>> xy(const Points& points) {
  std::vector<std::pair<double, double>> out;
  for (const Point2d& p : points) out.emplace_back(p.x, p.y);
  return out;
}

// Every dropped point lies within `bound` of the kept chain between the kept
// points around it; kept points are an ordered subsequence ending in the last.
void check_bound(const std::vector<Point2d>& in, const std::vector<Point2d>& kept, double bound) {
  ASSERT_FALSE(kept.empty());
  std::vector<int> index;
  size_t cursor = 0;
  for (const Point2d& k : kept) {
    while (cursor < in.size() && (in[cursor].x != k.x || in[cursor].y != k.y)) ++cursor;
    ASSERT_LT(cursor, in.size()) << "kept point is not an ordered input point";
    index.push_back(static_cast<int>(cursor++));
  }
  ASSERT_EQ(index.back(), static_cast<int>(in.size()) - 1) << "last point not kept";
  size_t next = 0;
  for (int i = 0; i < static_cast<int>(in.size()); ++i) {
    while (next < index.size() && index[next] < i) ++next;
    if (next < index.size() && index[next] == i) continue;
    const double d = next == 0 ? std::hypot(in[i].x - kept[0].x, in[i].y - kept[0].y)
                               : test::segment_distance(in[i], kept[next - 1], kept[next]);
    ASSERT_LE(d, bound * (1 + kBoundSlack) + kBoundSlack) << "dropped point " << i;
  }
}

std::vector<Point2d> random_polyline(std::mt19937_64& rng, double scale) {
  std::uniform_int_distribution<int> len(1, 60);
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  std::uniform_int_distribution<int> kind(0, 3);
  std::vector<Point2d> p;
  Point2d at{u(rng), u(rng)};
  const int n = len(rng);
  for (int i = 0; i < n; ++i) {
    p.push_back(at);
    switch (kind(rng)) {
      case 0: at = {at.x + scale * 0.3 * u(rng), at.y + scale * 0.3 * u(rng)}; break;  // within rho
      case 1: at = {at.x + scale * u(rng), at.y + scale * u(rng)}; break;              // near tol
      case 2: at = {at.x + scale * 10 * u(rng), at.y}; break;                          // collinear
      default: at = {at.x + scale * 20 * u(rng), at.y + scale * 20 * u(rng)};
    }
  }
  return p;
}

TEST(SimplifyRandom, BothFormsStayWithinTolerance) {
  std::mt19937_64 rng(12345);
  PolylineSimplifier ps;
  VectorSimplifier vs;
  Array<Point2d> result;
  for (int round = 0; round < 3000; ++round) {
    const double tol = round % 2 ? 0.005 : 0.1;
    const std::vector<Point2d> in = random_polyline(rng, tol);
    const int n = static_cast<int>(in.size());

    ps.simplify(in.data(), n, tol, result, true);
    check_bound(in, std::vector<Point2d>(result.begin(), result.end()), tol);

    const double eps = round % 3 ? tol * 0.2 : kPolylineRadialEps;
    std::vector<Point2d> b = in;
    b.resize(vs.simplify(b.data(), n, eps, tol));
    check_bound(in, b, std::max(eps + tol, 2 * eps));
  }
}

std::vector<Point2d> run_vector(std::vector<Point2d> p, double eps, double tol) {
  VectorSimplifier vs;
  p.resize(vs.simplify(p.data(), static_cast<int>(p.size()), eps, tol));
  return p;
}

std::vector<Point2d> run_polyline(const std::vector<Point2d>& p, double tol) {
  PolylineSimplifier ps;
  Array<Point2d> out;
  ps.simplify(p.data(), static_cast<int>(p.size()), tol, out, true);
  return {out.begin(), out.end()};
}

// "x,y x,y ..."; a number ending in '+' is the next double above it.
std::vector<Point2d> points(const std::string& field) {
  auto num = [](std::string s) {
    const bool up = s.ends_with('+');
    if (up) s.pop_back();
    const double v = std::strtod(s.c_str(), nullptr);
    return up ? std::nextafter(v, INFINITY) : v;
  };
  std::vector<Point2d> out;
  for (const std::string& p : test::Split(field))
    out.push_back({num(p.substr(0, p.find(','))), num(p.substr(p.find(',') + 1))});
  return out;
}

class SimplifyExact : public test::CaseRows {};

// "x,y,tag ..." with S for a separator.
void tagged(const std::string& field, TaggedPointList& l) {
  for (const std::string& p : test::Split(field)) {
    const std::vector<double> v = test::Nums(p);
    l.Add(p == "S" ? TaggedPoint::separator() : TaggedPoint(static_cast<std::int32_t>(v.at(2)), v.at(0), v.at(1)));
  }
}

TEST_P(SimplifyExact, KeepsTheListedPoints) {
  const std::string form = row().field(0), input = row().field(1), kept = row().field(2);
  if (form == "lists") {
    TaggedPointList in, out, want;
    tagged(input, in);
    tagged(kept, want);
    out.Add({5, 1, 1});
    simplify_polylines(in, out, 0.005);
    ASSERT_EQ(out.count(), want.count());
    for (int k = 0; k < out.count(); ++k)
      EXPECT_TRUE(out[k].tag == want[k].tag && out[k].x == want[k].x && out[k].y == want[k].y) << k;
    return;
  }
  const std::vector<double> a = test::Nums(form.substr(form.find(' ')));
  const std::vector<Point2d> in = points(input);
  const bool vector = form.rfind("vector", 0) == 0;
  EXPECT_EQ(xy(vector ? run_vector(in, a.at(0), a.at(1)) : run_polyline(in, a.at(0))), xy(points(kept)));
}

INSTANTIATE_TEST_SUITE_P(Rows, SimplifyExact, test::RowsOf("simplify.txt"), test::RowName);

TEST(PolylineSimplifier, AppendsWithoutClear) {
  PolylineSimplifier ps;
  Array<Point2d> out;
  out.Add({-7, -7});
  const std::vector<Point2d> line{{0, 0}, {1, 0}, {2, 0}, {3, 0}};
  ps.simplify(line.data(), 4, 0.01, out, false);
  EXPECT_EQ(xy(out), xy(std::vector<Point2d>{{-7, -7}, {0, 0}, {3, 0}}));
  ps.simplify(line.data(), 0, 0.01, out, true);
  EXPECT_EQ(out.count(), 0);
  VectorSimplifier vs;
  EXPECT_EQ(vs.simplify(nullptr, 3, 1, 1), 0);
}

TEST(PolylineSimplifier, WithoutFlagsReturnsInputUnthinned) {
  PolylineSimplifier ps;
  ps.setFlagAllocator([](std::int64_t) -> std::int32_t* { return nullptr; });
  std::vector<Point2d> line{{0, 0}, {0, 0}, {1, 0}, {2, 0}, {3, 0}};
  Array<Point2d> out;
  ps.simplify(line.data(), 5, 0.01, out, true);
  EXPECT_EQ(xy(out), xy(line));
}

}  // namespace
}  // namespace zt
