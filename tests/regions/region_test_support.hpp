// Helpers shared by the region tests: building operands, splitting results
// into contours, areas.
#pragma once

#include <cmath>
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

inline bool same_list(const TaggedPointList& a, const TaggedPointList& b) {
  if (a.count() != b.count()) return false;
  for (int i = 0; i < a.count(); ++i)
    if (a[i].tag != b[i].tag || a[i].x != b[i].x || a[i].y != b[i].y) return false;
  return true;
}

}  // namespace zt::test
