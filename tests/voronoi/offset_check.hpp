// Checks of traced offsets against brute force: every sampled point of every
// element lies at distance t from the nearest input site, every curve
// closes, and curves of contours stay on their side of the material. Sites
// are kept here in user coordinates, independent of the engine.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numbers>
#include <random>
#include <string>
#include <vector>

#include "support/segment_distance.hpp"
#include "vd_test_util.hpp"

namespace zt::test {

inline double Clearance(const Sites& in, const Pt& p) {
  double m = INFINITY;
  for (const Pt& q : in.pts) m = std::min(m, std::hypot(p.x - q.x, p.y - q.y));
  for (const auto& [a, b, tag] : in.segs) m = std::min(m, test::segment_distance(p, in.pts[a], in.pts[b]));
  return m;
}

// Even-odd inside test over all contours.
inline bool Inside(const std::vector<Contour>& contours, const Pt& p) {
  bool in = false;
  for (const Contour& c : contours)
    for (std::size_t i = 0, j = c.size() - 1; i < c.size(); j = i++)
      if ((c[i].y > p.y) != (c[j].y > p.y) && p.x < (c[j].x - c[i].x) * (p.y - c[i].y) / (c[j].y - c[i].y) + c[i].x)
        in = !in;
  return in;
}

struct Element {
  std::int32_t kind, site;
  Pt start;   // user coordinates
  Pt centre;  // point sites
};
struct Curve {
  double offset;
  std::vector<Element> elements;
};

inline std::vector<Curve> ReadStore() {
  std::vector<Curve> out;
  for (std::int32_t i = 0; i < GetNumOffsetCurves(); ++i) {
    Curve c;
    std::int32_t first = 0, last = -1;
    GetOffsetCurve(i, c.offset, first, last);
    for (std::int32_t k = first; k <= last; ++k) {
      Element e{};
      double x, y;
      std::int32_t tag;
      GetOffsetElement(k, e.kind, e.site, x, y, tag);
      ToUserCoordinates({x, y}, e.start.x, e.start.y);
      if (e.kind == 2) ToUserCoordinates(VD_GetPointCentre(e.site), e.centre.x, e.centre.y);
      c.elements.push_back(e);
    }
    out.push_back(c);
  }
  return out;
}

// The clockwise turn of arc element k of c (a full turn when its ends meet).
inline double Sweep(const Curve& c, std::size_t k) {
  const Element& e = c.elements[k];
  const Pt q = c.elements[(k + 1) % c.elements.size()].start;
  double sweep = std::atan2(e.start.y - e.centre.y, e.start.x - e.centre.x) - std::atan2(q.y - e.centre.y, q.x - e.centre.x);
  while (sweep < 0) sweep += 2 * std::numbers::pi;
  return sweep;
}

// Samples along element k of c: a straight piece, or a clockwise arc about
// its point site.
inline std::vector<Pt> Samples(const Curve& c, std::size_t k, int n = 16) {
  const Element& e = c.elements[k];
  const Pt p = e.start, q = c.elements[(k + 1) % c.elements.size()].start;
  std::vector<Pt> s;
  if (e.kind == 2) {
    const double a0 = std::atan2(p.y - e.centre.y, p.x - e.centre.x), sweep = Sweep(c, k);
    const double r = std::hypot(p.x - e.centre.x, p.y - e.centre.y);
    for (int i = 0; i <= n; ++i) {
      const double a = a0 - sweep * i / n;
      s.push_back({e.centre.x + r * std::cos(a), e.centre.y + r * std::sin(a)});
    }
  } else {
    for (int i = 0; i <= n; ++i) s.push_back({p.x + (q.x - p.x) * i / n, p.y + (q.y - p.y) * i / n});
  }
  return s;
}

// Empty when every sample of every curve lies at distance t within tol.
inline std::string CheckAtDistance(const Sites& in, const std::vector<Curve>& curves, double t, double tol) {
  for (std::size_t ci = 0; ci < curves.size(); ++ci) {
    const Curve& c = curves[ci];
    if (c.elements.empty()) return "curve " + std::to_string(ci) + " is empty";
    if (std::fabs(c.offset - t) > tol) return "curve " + std::to_string(ci) + " has offset " + std::to_string(c.offset);
    for (std::size_t k = 0; k < c.elements.size(); ++k) {
      for (const Pt& p : Samples(c, k)) {
        const double d = Clearance(in, p);
        if (std::fabs(d - t) > tol)
          return "curve " + std::to_string(ci) + " element " + std::to_string(k) + " kind " +
                 std::to_string(c.elements[k].kind) + ": point (" + std::to_string(p.x) + ", " +
                 std::to_string(p.y) + ") off by " + std::to_string((d - t) * 1e9) + "e-9";
      }
    }
  }
  return {};
}

// Empty when every sample of every curve is on the wanted side of the
// material (the left of counter-clockwise outer contours and clockwise holes
// is the inside).
inline std::string CheckSide(const std::vector<Contour>& contours, const std::vector<Curve>& curves, bool inside) {
  for (std::size_t ci = 0; ci < curves.size(); ++ci)
    for (std::size_t k = 0; k < curves[ci].elements.size(); ++k)
      for (const Pt& p : Samples(curves[ci], k, 4))
        if (Inside(contours, p) != inside) return "curve " + std::to_string(ci) + " leaves its side";
  return {};
}

// A star-shaped pocket of radius 70 to 100 about the origin with `vertices`
// corners (counter-clockwise) and `islands` clockwise star-shaped islands
// of radius 8 to 18 and `islandVertices` corners: one at the centre, or
// several on a circle of radius 35.
inline std::vector<Contour> PocketWithIslands(std::mt19937& rng, int vertices, int islands, int islandVertices) {
  std::vector<Contour> cs{Star(rng, 0, 0, 70, 100, vertices, false)};
  for (int h = 0; h < islands; ++h) {
    const double a = 2 * std::numbers::pi * h / islands, off = islands == 1 ? 0.0 : 35.0;
    cs.push_back(Star(rng, off * std::cos(a), off * std::sin(a), 8, 18, islandVertices, true));
  }
  return cs;
}

}  // namespace zt::test
