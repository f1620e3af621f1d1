// Node constructions and their quadratic solver. Worked examples and
// degenerate inputs on hand-made edges (data/node_examples.txt), the root
// forms of data/quadratic.txt and the normalisation by powers of 128. Against
// brute force (data/node_random.txt): three sites tangent to a known circle
// (points on it, segments touching it), an edge of two of them cut around
// the circle's centre, and the third as the new site; the computed node must
// be the centre, with the radius as clearance, by true distances.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <random>
#include <sstream>

#include "support/case_rows.hpp"
#include "support/segment_distance.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"
#include "voronoi/detail/quadratic.hpp"

namespace zt::vd::geo {
namespace {

using test::Keys;
using test::Nums;

// The sites of a row by name: "p2", "s0", "arc".
std::map<std::string, SiteRef> ReadSites(const std::string& text) {
  std::map<std::string, SiteRef> sites;
  std::map<int, PointSite> points;
  for (const std::string& part : test::Parts(text, ';')) {
    const std::string name = test::Split(part).at(0);
    const std::vector<double> v = Nums(test::Trim(part).substr(name.size()));
    const std::int32_t index = std::stoi(name.substr(1));
    if (name[0] == 'p') {
      points[index] = {index, {v.at(0), v.at(1)}};
      sites[name] = SiteRef::point(points[index]);
    } else {
      const PointSite a = points.at(int(v.at(0))), b = points.at(int(v.at(1)));
      sites[name] = SiteRef::segment(SegSite::make(index, a.index, a.p, b.index, b.p));
    }
  }
  sites["arc"].kind = kKindArc;
  return sites;
}

EdgeEnd End(const std::string& text) {
  const std::vector<double> v = Nums(text);
  return {{v.at(0), v.at(1)}, v.at(2), v.at(3) != 0};
}

std::int32_t KindOf(const std::string& w) { return w == "pnt" ? kKindPnt : w == "seg" ? kKindSeg : -2; }

class NodeExamples : public test::CaseRows {};

TEST_P(NodeExamples, GiveTheirNodeOrNameTheirSuspects) {
  auto sites = ReadSites(row().field(0));
  const Keys edge(row().field(1)), want(row().field(2));
  const EdgeFrame e{End(edge.str("n1")), End(edge.str("n2")), sites.at(edge.str("left")), sites.at(edge.str("right"))};
  NodeMemory memory;
  SuspectPair suspect;
  NodeResult out;
  out.copied = true;  // compute_node must clear it
  out.on_point = 99;
  const bool ok = compute_node(e, sites.at(edge.str("fresh")), memory, suspect, out);
  ASSERT_EQ(ok, want.num("ok") != 0);
  const double tol = want.num("tol", 0);
  const std::pair<const char*, double> values[] = {
      {"copied", out.copied}, {"on", out.on_point}, {"x", out.n.x}, {"y", out.n.y}, {"r", out.r}};
  for (const auto& [key, value] : values) {
    if (want.has(key)) { EXPECT_NEAR(value, want.num(key), tol) << key; }
  }
  if (want.has("suspect")) {
    ASSERT_TRUE(suspect.set);
    const std::vector<std::string> p = test::List(want.str("suspect"));
    if (p.size() == 4) {
      EXPECT_EQ(suspect.site1, std::stoi(p[0]));
      EXPECT_EQ(suspect.kind1, KindOf(p[1]));
      EXPECT_EQ(suspect.site2, std::stoi(p[2]));
      EXPECT_EQ(suspect.kind2, KindOf(p[3]));
    }
  }
  if (want.has("memory")) {
    EXPECT_TRUE(memory.orient_by_kept);
    memory.reset();
    EXPECT_FALSE(memory.orient_by_kept);
  }
}

INSTANTIATE_TEST_SUITE_P(Data, NodeExamples, test::RowsOf("node_examples.txt"), test::RowName);

TEST(NodeExamples, TheSamePointTwiceIsNoConstruction) {
  const PointSite p{6, {0.5, 0.5}};
  const SegSite s = SegSite::make(1, 4, {0, 0}, 5, {1, 0});
  const EdgeFrame same{{{0, 1}, 1, false}, {{1, 0.5}, 1, true}, SiteRef::point(p), SiteRef::segment(s)};
  SuspectPair sp;
  NodeResult out;
  EXPECT_FALSE(node_pps(same, SiteRef::point(p), p, p, s, sp, out));
  EXPECT_FALSE(sp.set);
}

double site_dist(const SiteRef& s, Point2d q) {
  return s.kind == kKindPnt ? std::hypot(q.x - s.pnt.p.x, q.y - s.pnt.p.y) : test::segment_distance(q, s.seg.p1, s.seg.p2);
}
// A segment site claims only the points whose foot lies on it.
double claim_dist(const SiteRef& s, Point2d q) {
  if (s.kind == kKindPnt) return site_dist(s, q);
  const Point2d a = s.seg.p1, b = s.seg.p2;
  const double dx = b.x - a.x, dy = b.y - a.y;
  const double t = ((q.x - a.x) * dx + (q.y - a.y) * dy) / (dx * dx + dy * dy);
  return t < -1e-12 || t > 1 + 1e-12 ? HUGE_VAL : site_dist(s, q);
}

struct Builder {
  std::mt19937_64 rng;
  Point2d x;
  double r = 0;
  std::int32_t next_point = 2, next_seg = 0;

  double uni(double a, double b) { return std::uniform_real_distribution<double>(a, b)(rng); }
  Point2d on_circle(double th) const { return {x.x + r * std::cos(th), x.y + r * std::sin(th)}; }
  Point2d tangent(double th) const { return {-std::sin(th), std::cos(th)}; }

  PointSite point(double th) { return {next_point++, on_circle(th)}; }
  SegSite segment(PointSite a, PointSite b) {
    if (rng() & 1) std::swap(a, b);
    return SegSite::make(next_seg++, a.index, a.p, b.index, b.p);
  }
  // Touches the circle at th inside its extent.
  SegSite tangent_seg(double th) {
    const Point2d t = on_circle(th), d = tangent(th);
    const double l1 = uni(0.1, 0.5) * r + 0.01, l2 = uni(0.1, 0.5) * r + 0.01;
    return segment({next_point++, sub(t, mul(d, l1))}, {next_point++, add(t, mul(d, l2))});
  }
  // Touches the circle at p, which is one of its end points.
  SegSite tangent_from(const PointSite& p, double th) {
    const double l = (uni(0.3, 1.0) * r + 0.01) * ((rng() & 1) ? 1.0 : -1.0);
    return segment(p, {next_point++, add(p.p, mul(tangent(th), l))});
  }
};

// A point of the bisector of a and b near the centre, about h away from it.
bool bisector_point(const SiteRef& a, const SiteRef& b, Point2d x, double h, Point2d& out) {
  const auto g = [&](Point2d q) { return site_dist(a, q) - site_dist(b, q); };
  // Between a segment and its own end point the bisector is the normal there.
  for (const auto& [s, p] : {std::pair{&a, &b}, std::pair{&b, &a}}) {
    if (s->kind == kKindSeg && p->kind == kKindPnt && s->seg.has_end(p->pnt.index)) {
      const Point2d u = sub(x, p->pnt.p);
      out = add(x, mul(u, h / std::sqrt(norm2(u))));
      return true;
    }
  }
  const double eps = 1e-7;
  Point2d grad{(g({x.x + eps, x.y}) - g({x.x - eps, x.y})) / (2 * eps),
               (g({x.x, x.y + eps}) - g({x.x, x.y - eps})) / (2 * eps)};
  grad = mul(grad, 1.0 / std::sqrt(norm2(grad)));
  const Point2d y0 = add(x, mul(Point2d{-grad.y, grad.x}, h));
  double lo = -std::fabs(h), hi = std::fabs(h);
  double glo = g(add(y0, mul(grad, lo)));
  if ((glo > 0) == (g(add(y0, mul(grad, hi))) > 0)) return false;
  for (int i = 0; i < 200; ++i) {
    const double mid = 0.5 * (lo + hi);
    const double gm = g(add(y0, mul(grad, mid)));
    if ((gm > 0) == (glo > 0)) {
      lo = mid;
      glo = gm;
    } else {
      hi = mid;
    }
  }
  out = add(y0, mul(grad, 0.5 * (lo + hi)));
  return true;
}

// Sites a and b of the edge and the new site for a configuration of
// data/node_random.txt.
void make_sites(Builder& B, const std::string& sites, SiteRef& a, SiteRef& b, SiteRef& fresh) {
  const double base = B.uni(0, 2 * M_PI);
  const double th[3] = {base, base + B.uni(0.8, 2.0), base + B.uni(0.8, 2.0) + 2.2};
  if (sites == "corner") {
    const double t1 = th[0], t2 = th[0] + B.uni(0.6, 2.4);
    const double mid = 0.5 * (t1 + t2), half = 0.5 * (t2 - t1);
    const PointSite v{B.next_point++, add(B.x, mul(Point2d{std::cos(mid), std::sin(mid)}, B.r / std::cos(half)))};
    const auto leg = [&](double t) {
      const Point2d tp = B.on_circle(t);
      const Point2d far = add(v.p, mul(sub(tp, v.p), 1.0 + B.uni(0.2, 1.0)));
      return B.segment(v, {B.next_point++, far});
    };
    a = SiteRef::segment(leg(t1));
    b = SiteRef::segment(leg(t2));
    fresh = SiteRef::segment(B.tangent_seg(t2 + B.uni(1.0, 2 * M_PI - (t2 - t1) - 1.0)));
    return;
  }
  std::istringstream words(sites);
  PointSite first{-1, {}};
  for (SiteRef* s : {&a, &b, &fresh}) {
    std::string w;
    words >> w;
    const double t = w.size() > 1 ? th[w[1] - '0'] : th[0];
    if (w[0] == 'P') {
      const PointSite p = B.point(t);
      if (first.index < 0) first = p;
      *s = SiteRef::point(p);
    } else {
      *s = SiteRef::segment(w[0] == 'T' ? B.tangent_seg(t) : B.tangent_from(first, t));
    }
  }
}

class NodeRandom : public test::CaseRows {};

TEST_P(NodeRandom, FindsTheCentreOfTheTangentCircle) {
  Builder B{std::mt19937_64(1234 + std::stoi(row().field(0))), {}, 0};
  int used = 0;
  for (int trial = 0; trial < 3000; ++trial) {
    B.x = {B.uni(0.25, 0.75), B.uni(0.25, 0.75)};
    // Radii over five decades, so tiny configurations pass through the
    // coefficient scaling of the solver.
    B.r = 0.2 * std::pow(10.0, -B.uni(0, 5));
    SiteRef a, b, fresh;
    make_sites(B, row().field(1), a, b, fresh);
    const double h1 = B.r * B.uni(1e-3, 0.25), h2 = -B.r * B.uni(1e-3, 0.25);
    Point2d y1, y2;
    if (!bisector_point(a, b, B.x, h1, y1) || !bisector_point(a, b, B.x, h2, y2)) continue;
    // A segment's region is the strip over it: an edge of it ends inside.
    bool inside = true;
    for (Point2d y : {y1, y2}) inside = inside && std::isfinite(claim_dist(a, y) + claim_dist(b, y));
    if (!inside) continue;
    const double f1 = claim_dist(fresh, y1) - site_dist(a, y1);
    const double f2 = claim_dist(fresh, y2) - site_dist(a, y2);
    if (!((f1 > 0 && f2 < 0) || (f1 < 0 && f2 > 0))) continue;
    EdgeFrame e;
    const bool swap_ends = B.rng() & 1;
    e.n1 = {swap_ends ? y2 : y1, 0, false};
    e.n2 = {swap_ends ? y1 : y2, 0, false};
    e.n1.r = site_dist(a, e.n1.p);
    e.n2.r = site_dist(a, e.n2.p);
    const double fn1 = swap_ends ? f2 : f1;
    (fn1 < 0 ? e.n1 : e.n2).deleted = true;
    // Left and right as seen from n1 towards n2.
    const Point2d ta = a.kind == kKindPnt ? a.pnt.p : mul(add(a.seg.p1, a.seg.p2), 0.5);
    const bool a_left = cross(sub(e.n2.p, e.n1.p), sub(ta, e.n1.p)) > 0;
    e.left = a_left ? a : b;
    e.right = a_left ? b : a;

    NodeMemory memory;
    SuspectPair suspect;
    NodeResult out;
    const bool ok = compute_node(e, fresh, memory, suspect, out);
    ++used;
    const double tol = 1e-9;
    SCOPED_TRACE("trial " + std::to_string(trial) + " r " + std::to_string(B.r));
    ASSERT_TRUE(ok);
    ASSERT_FALSE(out.copied);
    EXPECT_EQ(out.on_point, -1);
    const double da = site_dist(a, out.n), db = site_dist(b, out.n), df = site_dist(fresh, out.n);
    ASSERT_NEAR(da, db, tol);
    ASSERT_NEAR(da, df, tol);
    // The bisection that stands in for a failed closed form finds it too.
    NodeResult searched;
    ASSERT_TRUE(bisect_on_edge(e, fresh, searched));
    for (const NodeResult& n : {out, searched}) {
      ASSERT_NEAR(n.n.x, B.x.x, tol);
      ASSERT_NEAR(n.n.y, B.x.y, tol);
      ASSERT_NEAR(n.r, B.r, tol);
    }
  }
  EXPECT_GT(used, 1500);
}

INSTANTIATE_TEST_SUITE_P(Configurations, NodeRandom, test::RowsOf("node_random.txt"), test::RowName);

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
