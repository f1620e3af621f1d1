// Checks of traced offsets against brute force: every sampled point of every
// element lies at distance t from the nearest input site, and every curve
// closes. Sites are kept here in user coordinates, independent of the engine.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numbers>
#include <string>
#include <vector>

#include "voronoi/engine.hpp"

namespace zt::vdtest {

struct Site2 {
  double x, y;
};
struct Seg2 {
  Site2 a, b;
};

struct InputSites {
  std::vector<Site2> points;
  std::vector<Seg2> segments;
};

inline double DistToSegment(const Site2& p, const Seg2& s) {
  const double dx = s.b.x - s.a.x, dy = s.b.y - s.a.y;
  const double l2 = dx * dx + dy * dy;
  double u = l2 > 0 ? ((p.x - s.a.x) * dx + (p.y - s.a.y) * dy) / l2 : 0.0;
  u = std::clamp(u, 0.0, 1.0);
  return std::hypot(p.x - (s.a.x + u * dx), p.y - (s.a.y + u * dy));
}

inline double Clearance(const InputSites& in, const Site2& p) {
  double m = INFINITY;
  for (const Site2& q : in.points) m = std::min(m, std::hypot(p.x - q.x, p.y - q.y));
  for (const Seg2& s : in.segments) m = std::min(m, DistToSegment(p, s));
  return m;
}

struct Element {
  std::int32_t kind, site;
  Site2 start;   // user coordinates
  Site2 centre;  // point sites
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

// Samples along element k of c: a straight piece, or a clockwise arc about
// its point site (a full turn when both ends coincide).
inline std::vector<Site2> Samples(const Curve& c, std::size_t k, int n = 16) {
  const Element& e = c.elements[k];
  const Site2 p = e.start, q = c.elements[(k + 1) % c.elements.size()].start;
  std::vector<Site2> s;
  if (e.kind == 2) {
    const double a0 = std::atan2(p.y - e.centre.y, p.x - e.centre.x);
    const double a1 = std::atan2(q.y - e.centre.y, q.x - e.centre.x);
    double sweep = a0 - a1;  // clockwise
    while (sweep < 0) sweep += 2 * std::numbers::pi;
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
inline std::string CheckAtDistance(const InputSites& in, const std::vector<Curve>& curves, double t, double tol) {
  for (std::size_t ci = 0; ci < curves.size(); ++ci) {
    const Curve& c = curves[ci];
    if (c.elements.empty()) return "curve " + std::to_string(ci) + " is empty";
    if (std::fabs(c.offset - t) > tol) return "curve " + std::to_string(ci) + " has offset " + std::to_string(c.offset);
    for (std::size_t k = 0; k < c.elements.size(); ++k) {
      for (const Site2& p : Samples(c, k)) {
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

}  // namespace zt::vdtest
