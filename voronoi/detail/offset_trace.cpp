// Curve tracing and isolated point circles (see offset_trace.hpp).
#include "voronoi/detail/offset_trace.hpp"

#include <cassert>
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/offset_edge.hpp"
#include "voronoi/detail/offset_state.hpp"

namespace zt::vd {

namespace {

bool Crossed(const EdgeRecord& r, double t) {
  const double r1 = Vd().nodes[r.n1].r, r2 = Vd().nodes[r.n2].r;
  return std::fmin(r1, r2) <= t && t < std::fmax(r1, r2);
}

void AppendElement(std::int32_t site, std::int32_t kind, OffsetPoint x) {
  Engine& g = Vd();
  OffsetElementRecord el{site, kind, x.x, x.y};
  std::int32_t arc = kNone;
  if (kind == PNT && g.points.Valid(site)) arc = g.points[site].arc;
  if (kind == SEG && g.segments.Valid(site)) arc = g.segments[site].arc;
  if (arc >= 0 && g.arcs.Valid(arc)) {
    const ArcRecord& a = g.arcs[arc];
    const double dx = x.x - a.cx, dy = x.y - a.cy;
    el = OffsetElementRecord{arc, a.radius * a.radius > dx * dx + dy * dy ? 6 : 7, x.x, x.y};
  }
  g.offsetElements.Append(el, kOffsetElementGrowth);
}

void AppendCurve(std::int32_t first, std::int32_t last, double t) {
  Engine& g = Vd();
  g.offsetCurves.Append(OffsetCurveRecord{first, last, t / g.scale}, kOffsetCurveGrowth);
}

}  // namespace

bool TraceCurve(std::int32_t e0, double t) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  const std::int32_t first = g.offsetElements.count;
  // Each element ends on a distinct edge, and each step of the search for
  // the next crossing passes one edge end: a longer walk is a broken diagram.
  const std::int64_t maxElements = g.edges.count;
  const std::int64_t maxSteps = 2 * std::int64_t{g.edges.count} + 2;
  std::int64_t elements = 0;
  std::int32_t e = e0;
  const auto fail = [&] {
    g.offsetElements.count = first;
    o.failed = true;
    return false;
  };
  do {
    if (++elements > maxElements) return fail();
    EnsureEdgeData(e);
    o.candidate[e] = 0;
    o.crossedPass[e] = o.pass;
    const OffsetPoint x = CrossingPoint(e, t);
    const EdgeRecord& r = g.edges[e];
    std::int32_t pivot, site, kind;
    if (g.nodes[r.n2].r > t) {
      site = r.rgt, kind = r.rtype, pivot = r.n2;
    } else {
      site = r.lft, kind = r.ltype, pivot = r.n1;
    }
    AppendElement(site, kind, x);
    std::int32_t cur = e, next = kNone;
    for (std::int64_t steps = 0;; ++steps) {
      if (steps > maxSteps) return fail();
      const std::int32_t f = CcwAt(g.edges[cur], pivot);
      if (!ValidEdge(f) || g.edges[f].deleted) return fail();
      const EdgeRecord& fr = g.edges[f];
      if (fr.n1 != pivot && fr.n2 != pivot) return fail();
      if (Crossed(fr, t)) {
        next = f;
        break;
      }
      pivot = OtherNode(fr, pivot);
      cur = f;
    }
    if (next != e0 && o.crossedPass[next] == o.pass) return fail();
    e = next;
  } while (e != e0);
  AppendCurve(first, g.offsetElements.count - 1, t);
  return true;
}

void AddIsolatedPointCircles(double t, double step) {
  Engine& g = Vd();
  const std::int32_t maxWalk = g.edges.count + 1;
  for (std::int32_t i = 2; i < g.points.count - 2; ++i) {
    const PointRecord& p = g.points[i];
    if (p.deleted || p.hasNode || p.vd < 0 || !ValidEdge(p.vd)) continue;
    // Smallest clearance on the boundary of the point's region.
    double m = INFINITY;
    std::int32_t e = p.vd, walked = 0;
    do {
      const EdgeRecord& r = g.edges[e];
      m = std::fmin(m, std::fmin(g.nodes[r.n1].r, g.nodes[r.n2].r));
      e = NextRegionEdge(e, i, PNT);
    } while (e >= 0 && e != p.vd && ++walked < maxWalk);
    if (e != p.vd) continue;  // not a closed region: no circle can be vouched for
    for (double s = t; s <= m && s < g.maxOffset; s += step) {
      const std::int32_t first = g.offsetElements.count;
      g.offsetElements.Append(OffsetElementRecord{i, PNT, p.x + s, p.y}, kOffsetElementGrowth);
      g.offsetElements.Append(OffsetElementRecord{i, PNT, p.x - s, p.y}, kOffsetElementGrowth);
      AppendCurve(first, first + 1, s);
      if (!(step > 0.0)) break;
    }
  }
}

}  // namespace zt::vd
