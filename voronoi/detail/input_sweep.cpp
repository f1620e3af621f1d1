// Whole-input repair (see input_sweep.hpp).
#include "voronoi/detail/input_sweep.hpp"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numeric>
#include <vector>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/input_repair.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::vd {
namespace {

// Passes over the input: a merge or a split may bring sites within the
// tolerances of others, which the next pass mends.
constexpr int kSweepRounds = 4;
// Cells per side of the grid at most, and their least size in units of the
// repair distance (a point's neighbours within it lie in adjacent cells).
constexpr std::int32_t kMaxCellsPerSide = 2048;
constexpr double kMinCellInRepairDistances = 4.0;

using Index = std::int32_t;

struct Geometry {
  double x1, y1, x2, y2, a, b, c, len;
  double D(double x, double y) const { return a * x + b * y + c; }
  double Along(double x, double y) const { return (x - x1) * b - (y - y1) * a; }
};

Geometry GeometryOf(Index s) {
  const Engine& g = Vd();
  const SegmentRecord& r = g.segments[s];
  const PointRecord& p = g.points[r.i1];
  const PointRecord& q = g.points[r.i2];
  Geometry m{p.x, p.y, q.x, q.y, 0, 0, 0, std::hypot(q.x - p.x, q.y - p.y)};
  if (m.len > 0.0) {
    m.a = -(q.y - p.y) / m.len;
    m.b = (q.x - p.x) / m.len;
    m.c = -(m.a * p.x + m.b * p.y);
  }
  return m;
}

struct Grid {
  double x0 = 0, y0 = 0, hx = 1, hy = 1;
  Index nx = 1, ny = 1;
  Index Col(double x) const { return std::clamp(static_cast<Index>((x - x0) / hx), Index{0}, nx - 1); }
  Index Row(double y) const { return std::clamp(static_cast<Index>((y - y0) / hy), Index{0}, ny - 1); }
  Index Cell(double x, double y) const { return Row(y) * nx + Col(x); }
  // Every cell that a point within `margin` of the segment may lie in: per
  // column, the segment's y range over the column widened by the margin.
  template <class F>
  void ForCells(const Geometry& m, double margin, F&& f) const {
    const double xl = std::min(m.x1, m.x2), xr = std::max(m.x1, m.x2);
    for (Index c = Col(xl - margin); c <= Col(xr + margin); ++c) {
      // The part of the segment over the column widened by the margin.
      const double ca = std::max(xl, x0 + c * hx - margin), cb = std::min(xr, x0 + (c + 1) * hx + margin);
      double ylo = std::min(m.y1, m.y2), yhi = std::max(m.y1, m.y2);
      if (m.x1 != m.x2 && ca <= cb) {
        const double ya = m.y1 + (ca - m.x1) / (m.x2 - m.x1) * (m.y2 - m.y1);
        const double yb = m.y1 + (cb - m.x1) / (m.x2 - m.x1) * (m.y2 - m.y1);
        ylo = std::min(ya, yb);
        yhi = std::max(ya, yb);
      }
      for (Index r = Row(ylo - margin); r <= Row(yhi + margin); ++r) f(r * nx + c);
    }
  }
};

// Cell lists in compressed form: the items of cell k are
// items[start[k] .. start[k+1]).
struct CellLists {
  std::vector<Index> start, items;
  template <class Each>
  void Build(Index cells, Each&& each) {  // each(emit) calls emit(cell, item)
    start.assign(static_cast<std::size_t>(cells) + 1, 0);
    each([&](Index cell, Index) { ++start[cell + 1]; });
    for (Index k = 0; k < cells; ++k) start[k + 1] += start[k];
    items.assign(start[cells], 0);
    std::vector<Index> fill(start.begin(), start.end() - 1);
    each([&](Index cell, Index item) { items[fill[cell]++] = item; });
  }
};

Index Root(std::vector<Index>& parent, Index i) {
  while (parent[i] != i) i = parent[i] = parent[parent[i]];
  return i;
}

Index PointsEnd() {
  const Engine& g = Vd();
  return g.dummiesAdded ? g.points.count - 2 : g.points.count;
}

// Groups of points joined in `parent` go to their mean (a pair to its
// midpoint). The restart's cleaning then merges the copies, counting them
// as duplicates, and redirects their segment ends. True when a point moved.
bool ApplyMerges(std::vector<Index>& parent) {
  Engine& g = Vd();
  const Index n = static_cast<Index>(parent.size());
  std::vector<double> sx(n, 0.0), sy(n, 0.0), cnt(n, 0.0);
  for (Index i = 0; i < n; ++i) {
    const Index r = Root(parent, i);
    sx[r] += g.points[i].x;
    sy[r] += g.points[i].y;
    cnt[r] += 1.0;
  }
  bool moved = false;
  for (Index i = 0; i < n; ++i) {
    const Index r = Root(parent, i);
    if (cnt[r] < 2.0) continue;
    const double x = sx[r] / cnt[r], y = sy[r] / cnt[r];
    moved |= g.points[i].x != x || g.points[i].y != y;
    g.points[i].x = x;
    g.points[i].y = y;
  }
  if (moved) g.lineDataInexact = true;
  return moved;
}

struct Split {
  Index segment;
  double along;
  Index point;
};

// Every segment with split points becomes a chain through them, in order
// along it; the pieces keep the segment's tag.
void ApplySplits(std::vector<Split>& splits) {
  Engine& g = Vd();
  std::sort(splits.begin(), splits.end(), [](const Split& p, const Split& q) {
    return p.segment != q.segment ? p.segment < q.segment : p.along < q.along;
  });
  for (std::size_t k = 0; k < splits.size();) {
    const Index s = splits[k].segment;
    const SegmentRecord original = g.segments[s];
    Index from = original.i1;
    bool first = true;
    for (; k < splits.size() && splits[k].segment == s; ++k) {
      const Index p = splits[k].point;
      if (p == from || p == original.i2) continue;
      if (first) {
        g.segments[s].i2 = p;
        first = false;
      } else {
        SegmentRecord piece = original;
        piece.i1 = from;
        piece.i2 = p;
        piece.vd = kNone;
        piece.flag = 0;
        g.segments.Append(piece, kSiteGrowth);
      }
      from = p;
    }
    if (!first) {
      SegmentRecord piece = original;
      piece.i1 = from;
      piece.vd = kNone;
      piece.flag = 0;
      g.segments.Append(piece, kSiteGrowth);
    }
  }
}

int SignBand(double v) { return v > kCrossBand ? 1 : (v < -kCrossBand ? -1 : 0); }

// One pass; true when the input changed.
bool SweepOnce() {
  Engine& g = Vd();
  const Index end = PointsEnd();
  const double tol = kRepairPointDistance;
  // Grid over the live caller points.
  double x0 = HUGE_VAL, y0 = HUGE_VAL, x1 = -HUGE_VAL, y1 = -HUGE_VAL;
  Index live = 0;
  for (Index i = 2; i < end; ++i) {
    if (g.points[i].deleted) continue;
    ++live;
    x0 = std::min(x0, g.points[i].x), x1 = std::max(x1, g.points[i].x);
    y0 = std::min(y0, g.points[i].y), y1 = std::max(y1, g.points[i].y);
  }
  if (live == 0) return false;
  Grid grid;
  const double minCell = kMinCellInRepairDistances * tol;
  const Index side = std::clamp(static_cast<Index>(std::sqrt(double(live) + g.segments.count)), Index{1}, kMaxCellsPerSide);
  grid.x0 = x0 - 2 * tol;
  grid.y0 = y0 - 2 * tol;
  grid.nx = std::max<Index>(1, std::min<Index>(side, static_cast<Index>((x1 - x0 + 4 * tol) / minCell)));
  grid.ny = std::max<Index>(1, std::min<Index>(side, static_cast<Index>((y1 - y0 + 4 * tol) / minCell)));
  grid.hx = (x1 - x0 + 4 * tol) / grid.nx;
  grid.hy = (y1 - y0 + 4 * tol) / grid.ny;
  const Index cells = grid.nx * grid.ny;

  CellLists pointCells;
  pointCells.Build(cells, [&](auto&& emit) {
    for (Index i = 2; i < end; ++i)
      if (!g.points[i].deleted) emit(grid.Cell(g.points[i].x, g.points[i].y), i);
  });

  // Points closer than the repair distance merge.
  std::vector<Index> parent(end);
  std::iota(parent.begin(), parent.end(), 0);
  bool merged = false;
  for (Index i = 2; i < end; ++i) {
    const PointRecord& p = g.points[i];
    if (p.deleted) continue;
    const Index c = grid.Col(p.x), r = grid.Row(p.y);
    for (Index rr = std::max(r - 1, Index{0}); rr <= std::min(r + 1, grid.ny - 1); ++rr)
      for (Index cc = std::max(c - 1, Index{0}); cc <= std::min(c + 1, grid.nx - 1); ++cc) {
        const Index k = rr * grid.nx + cc;
        for (Index m = pointCells.start[k]; m < pointCells.start[k + 1]; ++m) {
          const Index j = pointCells.items[m];
          if (j <= i) continue;
          const PointRecord& q = g.points[j];
          if (std::fabs(q.x - p.x) > tol || std::fabs(q.y - p.y) > tol) continue;
          if (q.x == p.x && q.y == p.y) continue;  // copies: the cleaning merges them
          if (std::hypot(q.x - p.x, q.y - p.y) > tol) continue;
          const Index a = Root(parent, i), b = Root(parent, j);
          if (a != b) parent[std::max(a, b)] = std::min(a, b), merged = true;
        }
      }
  }
  if (merged && ApplyMerges(parent)) return true;

  // Segments by cell, within the repair distance.
  const Index segCount = g.segments.count;
  std::vector<Geometry> geo(segCount);
  for (Index s = 0; s < segCount; ++s) geo[s] = GeometryOf(s);
  CellLists segCells;
  segCells.Build(cells, [&](auto&& emit) {
    for (Index s = 0; s < segCount; ++s)
      if (geo[s].len > 0.0) grid.ForCells(geo[s], tol, [&](Index k) { emit(k, s); });
  });

  // A point on a segment: merged with a near end, else the segment splits.
  std::vector<Split> splits;
  bool changed = false;
  for (Index i = 2; i < end; ++i) {
    const PointRecord& p = g.points[i];
    if (p.deleted) continue;
    const Index k = grid.Cell(p.x, p.y);
    for (Index m = segCells.start[k]; m < segCells.start[k + 1]; ++m) {
      const Index s = segCells.items[m];
      const SegmentRecord& r = g.segments[s];
      const Geometry& sg = geo[s];
      if (i == r.i1 || i == r.i2) continue;
      if ((p.x == sg.x1 && p.y == sg.y1) || (p.x == sg.x2 && p.y == sg.y2)) continue;  // a copy of an end
      if (!(std::fabs(sg.D(p.x, p.y)) <= tol)) continue;
      const double lam = sg.Along(p.x, p.y);
      if (!(lam >= -kExtentBand && lam <= sg.len + kExtentBand)) continue;
      if (std::hypot(p.x - sg.x1, p.y - sg.y1) <= tol || std::hypot(p.x - sg.x2, p.y - sg.y2) <= tol) {
        const Index near = std::hypot(p.x - sg.x1, p.y - sg.y1) <= tol ? r.i1 : r.i2;
        const Index a = Root(parent, i), b = Root(parent, near);
        if (a != b) parent[std::max(a, b)] = std::min(a, b), merged = true;
      } else {
        splits.push_back({s, lam, i});
      }
    }
  }
  if (merged && ApplyMerges(parent)) return true;

  // Repeated and crossing segments; a pair is tested once, in the first
  // cell the two share (seen in the lower segment's walk).
  std::vector<Index> testedBy(segCount, kNone);
  std::vector<char> removed(segCount, 0);
  const auto endNear = [&](const Geometry& sg, double x, double y) {
    if (!(std::fabs(sg.D(x, y)) <= tol)) return false;
    const double lam = sg.Along(x, y);
    return lam >= -tol && lam <= sg.len + tol;
  };
  for (Index s = 0; s < segCount; ++s) {
    if (!(geo[s].len > 0.0)) continue;
    grid.ForCells(geo[s], tol, [&](Index k) {
      for (Index m = segCells.start[k]; m < segCells.start[k + 1]; ++m) {
        const Index t = segCells.items[m];
        if (t <= s || testedBy[t] == s || removed[s] || removed[t]) continue;
        testedBy[t] = s;
        const SegmentRecord r1 = g.segments[s], r2 = g.segments[t];
        const bool shared1 = r2.i1 == r1.i1 || r2.i1 == r1.i2, shared2 = r2.i2 == r1.i1 || r2.i2 == r1.i2;
        if (shared1 && shared2) {
          const bool dropFirst = r2.arc >= 0 && r1.arc < 0;
          AbsorbRepeatedSegment(g.segments[dropFirst ? t : s], dropFirst ? r1 : r2);
          removed[dropFirst ? s : t] = 1;
          changed = true;
          continue;
        }
        if (shared1 || shared2) continue;
        const Geometry &a = geo[s], &b = geo[t];
        // An end on the other segment is the point-segment test's case.
        if (endNear(a, b.x1, b.y1) || endNear(a, b.x2, b.y2) || endNear(b, a.x1, a.y1) || endNear(b, a.x2, a.y2))
          continue;
        if (SignBand(a.D(b.x1, b.y1)) * SignBand(a.D(b.x2, b.y2)) >= 0) continue;
        const double d1 = b.D(a.x1, a.y1), d2 = b.D(a.x2, a.y2);
        if (SignBand(d1) * SignBand(d2) >= 0) continue;
        const double f = std::fabs(d1) / (std::fabs(d1) + std::fabs(d2));
        double x = a.x1 + f * a.len * a.b, y = a.y1 - f * a.len * a.a;
        if (std::fabs(b.D(x, y)) > kCrossBand) {
          const double det = a.a * b.b - a.b * b.a;
          if (det != 0.0) {
            const double xi = (a.b * b.c - b.b * a.c) / det, yi = (b.a * a.c - a.a * b.c) / det;
            if (std::isfinite(xi) && std::isfinite(yi)) x = xi, y = yi;
          }
        }
        const Index p = AppendRepairPoint(x, y);
        splits.push_back({s, a.Along(x, y), p});
        splits.push_back({t, b.Along(x, y), p});
      }
    });
  }
  if (!splits.empty()) {
    ApplySplits(splits);
    changed = true;
  }
  if (std::find(removed.begin(), removed.end(), 1) != removed.end()) {
    Index out = 0;
    for (Index s = 0; s < g.segments.count; ++s) {
      if (s < segCount && removed[s]) {
        ++g.removedSegments;
        continue;
      }
      g.segments[out++] = g.segments[s];
    }
    g.segments.count = out;
  }
  return changed;
}

}  // namespace

bool RepairWholeInput() {
  Engine& g = Vd();
  bool changed = false;
  for (int round = 0; round < kSweepRounds; ++round) {
    if (!SweepOnce()) break;
    changed = true;
  }
  if (changed) g.dataModified = true;
  return changed;
}

}  // namespace zt::vd
