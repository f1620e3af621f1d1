// Helpers shared by the region tests: building operands, splitting results
// into contours, areas.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstring>
#include <utility>
#include <vector>

#include "regions/boolean.hpp"
#include "core/points.hpp"

namespace zt::test {

struct Pt {
  double x, y;
  int tag = 0;
};
using Contour = std::vector<Pt>;

// Appends a contour as the engine reads it: the first point repeated at the
// end when closed, then a separator.
inline void add_contour(TaggedPointList& list, const Contour& c, bool closed = true) {
  for (const Pt& p : c) list.AddDoubling(TaggedPoint(p.tag, p.x, p.y));
  if (closed && !c.empty()) list.AddDoubling(TaggedPoint(c.front().tag, c.front().x, c.front().y));
  list.AddDoubling(TaggedPoint::separator());
}

inline Contour rect(double x0, double y0, double x1, double y1, int tag = 0, bool ccw = true) {
  Contour c{{x0, y0, tag}, {x1, y0, tag}, {x1, y1, tag}, {x0, y1, tag}};
  if (!ccw) c = {{x0, y0, tag}, {x0, y1, tag}, {x1, y1, tag}, {x1, y0, tag}};
  return c;
}

inline bool is_separator(const TaggedPoint& p) { return p.tag == kSeparatorTag; }

// The result's contours (separators removed), records as written.
inline std::vector<std::vector<TaggedPoint>> contours_of(const TaggedPointList& list) {
  std::vector<std::vector<TaggedPoint>> out;
  std::vector<TaggedPoint> cur;
  for (const TaggedPoint& p : list) {
    if (is_separator(p)) {
      out.push_back(cur);
      cur.clear();
    } else {
      cur.push_back(p);
    }
  }
  if (!cur.empty()) out.push_back(cur);
  return out;
}

inline double signed_area(const std::vector<TaggedPoint>& c) {
  double a = 0;
  for (std::size_t i = 0; i < c.size(); ++i) {
    const TaggedPoint& p = c[i];
    const TaggedPoint& q = c[(i + 1) % c.size()];
    a += p.x * q.y - q.x * p.y;
  }
  return a / 2;
}

inline double total_area(const TaggedPointList& list) {
  double a = 0;
  for (const auto& c : contours_of(list)) a += signed_area(c);
  return a;
}

inline void fill_list(TaggedPointList& l, const std::vector<Contour>& cs) {
  l.Clear();
  for (const Contour& c : cs) add_contour(l, c);
}

// Bit for bit, so that NaN and the sign of zero count too.
inline bool same_list(const TaggedPointList& a, const TaggedPointList& b) {
  if (a.count() != b.count()) return false;
  for (int i = 0; i < a.count(); ++i)
    if (a[i].tag != b[i].tag || std::memcmp(&a[i].x, &b[i].x, sizeof(double)) != 0 ||
        std::memcmp(&a[i].y, &b[i].y, sizeof(double)) != 0)
      return false;
  return true;
}

// Even-odd area of an operation on two regions (op u, i or d) by vertical
// slabs, written apart from the engine: between consecutive x of vertices and crossings no two
// edges cross, so each slab is a stack of trapezoids, each inside or
// outside both operands as a whole. Quadratic in the edges: small cases only.
inline double slab_area(const std::vector<Contour>& ra, const std::vector<Contour>& rb, char op) {
  struct Seg {
    Pt a, b;
    int owner;
  };
  std::vector<Seg> segs;
  for (int k = 0; k < 2; ++k)
    for (const Contour& c : k == 0 ? ra : rb)
      for (std::size_t i = 0; i < c.size(); ++i) {
        const Pt& p = c[i];
        const Pt& q = c[(i + 1) % c.size()];
        if (p.x != q.x) segs.push_back({p.x < q.x ? p : q, p.x < q.x ? q : p, k});
      }
  std::vector<double> xs;
  for (const Seg& s : segs) xs.push_back(s.a.x), xs.push_back(s.b.x);
  for (std::size_t i = 0; i < segs.size(); ++i)
    for (std::size_t j = i + 1; j < segs.size(); ++j) {
      const Seg &s = segs[i], &t = segs[j];
      const double dx = s.b.x - s.a.x, dy = s.b.y - s.a.y, ex = t.b.x - t.a.x, ey = t.b.y - t.a.y;
      const double d = dx * ey - dy * ex;
      if (d == 0) continue;
      const double u = ((t.a.x - s.a.x) * ey - (t.a.y - s.a.y) * ex) / d;
      const double v = ((t.a.x - s.a.x) * dy - (t.a.y - s.a.y) * dx) / d;
      if (u >= 0 && u <= 1 && v >= 0 && v <= 1) xs.push_back(s.a.x + u * dx);
    }
  std::sort(xs.begin(), xs.end());
  double total = 0;
  for (std::size_t i = 0; i + 1 < xs.size(); ++i) {
    const double x0 = xs[i], x1 = xs[i + 1], xm = 0.5 * (x0 + x1);
    if (!(x1 > x0)) continue;
    std::vector<std::pair<double, int>> ys;
    for (const Seg& s : segs)
      if (s.a.x <= x0 && x1 <= s.b.x) ys.push_back({s.a.y + (xm - s.a.x) * (s.b.y - s.a.y) / (s.b.x - s.a.x), s.owner});
    std::sort(ys.begin(), ys.end());
    int pa = 0, pb = 0;
    for (std::size_t k = 0; k + 1 < ys.size(); ++k) {
      (ys[k].second == 0 ? pa : pb) ^= 1;
      const bool in = op == 'u' ? (pa || pb) : op == 'i' ? (pa && pb) : (pa && !pb);
      if (in) total += (x1 - x0) * (ys[k + 1].first - ys[k].first);
    }
  }
  return total;
}

// The result's contours as a region (closing points kept: a zero-length
// edge adds nothing).
inline std::vector<Contour> region_of(const TaggedPointList& list) {
  std::vector<Contour> out;
  for (const auto& c : contours_of(list)) {
    Contour r;
    for (const TaggedPoint& p : c) r.push_back({p.x, p.y, p.tag});
    out.push_back(r);
  }
  return out;
}

}  // namespace zt::test
