// Input preparation of a computation (see preprocess.hpp).
#include "voronoi/detail/preprocess.hpp"

#include <algorithm>
#include <cassert>
#include <cfloat>
#include <cmath>
#include <numeric>
#include <vector>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {

// Points within this of the frame's lower bounds count as inside it.
constexpr double kFrameSlack = 1e-11;
// Margin of the corner points beyond the box, in box extents beyond the
// bound factor.
constexpr double kCornerExtraFactor = 0.01;
// The maximal offset is this fraction of the corner margin's diagonal.
constexpr double kMaxOffsetFraction = 0.49;

}  // namespace

std::int32_t FirstCallerPoint() { return 2; }
std::int32_t EndCallerPoints() {
  const Engine& g = Vd();
  return g.dummiesAdded ? g.points.count - 2 : g.points.count;
}

void ComputeBoundingBox() {
  Engine& g = Vd();
  const std::int32_t end = EndCallerPoints();
  g.minX = g.maxX = g.points[2].x;
  g.minY = g.maxY = g.points[2].y;
  for (std::int32_t i = 3; i < end; ++i) {
    const PointRecord& p = g.points[i];
    g.minX = std::min(g.minX, p.x);
    g.maxX = std::max(g.maxX, p.x);
    g.minY = std::min(g.minY, p.y);
    g.maxY = std::max(g.maxY, p.y);
  }
  g.bboxSet = true;
}

void ApplyScaling() {
  Engine& g = Vd();
  g.shiftX = g.minX;
  g.shiftY = g.minY;
  double scale = 1.0;
  double extent = std::max(g.maxX - g.minX, g.maxY - g.minY);
  if (extent < kZeroLength) extent = kZeroLength;
  const bool alreadyUnit = extent >= kUnitExtentMin && extent <= kUnitExtentMax;
  // The caller refuses non-finite input, so both loops end (at most ~60
  // steps for magnitudes up to 1e15 and extents down to 1e-11).
  if (extent > kUnitExtentMax) {
    while (scale * extent > kUnitExtentMax) scale *= 0.5;
  } else if (extent < kUnitExtentMin) {
    while (scale * extent < kUnitExtentMin) scale *= 2.0;
  }
  if (alreadyUnit && g.maxX <= kUnitExtentMax && g.maxY <= kUnitExtentMax &&
      g.minX >= -kFrameSlack && g.minY >= -kFrameSlack && !g.scaled) {
    g.shiftX = g.shiftY = 0.0;
    g.scale = 1.0;
    return;
  }
  g.scale = scale;
  g.scaled = true;
  const auto mapX = [&](double x) { return (x - g.shiftX) * scale; };
  const auto mapY = [&](double y) { return (y - g.shiftY) * scale; };
  for (std::int32_t i = 0; i < EndCallerPoints(); ++i) {
    g.points[i].x = mapX(g.points[i].x);
    g.points[i].y = mapY(g.points[i].y);
  }
  for (std::int32_t i = 0; i < g.arcs.count; ++i) {
    ArcRecord& a = g.arcs[i];
    a.cx = mapX(a.cx);
    a.cy = mapY(a.cy);
    a.radius *= scale;
  }
  g.minX = mapX(g.minX);
  g.maxX = mapX(g.maxX);
  g.minY = mapY(g.minY);
  g.maxY = mapY(g.maxY);
}

void AddDummySlots() {
  Engine& g = Vd();
  PointRecord d{};
  d.vd = kNone;
  d.node = kNone;
  d.arc = kNone;
  d.tag = -1;
  d.x = -DBL_MAX;
  d.y = -DBL_MAX;
  g.points[0] = d;
  d.y = DBL_MAX;
  g.points[1] = d;
  d.x = DBL_MAX;
  d.y = -DBL_MAX;
  g.points.Append(d, kSiteGrowth);
  d.y = DBL_MAX;
  g.points.Append(d, kSiteGrowth);
  g.dummiesAdded = true;
}

void BuildCrossReference() {
  Engine& g = Vd();
  const std::int32_t n = g.points.count;
  g.xrefStart.count = 0;
  g.xrefStart.Reserve(std::int64_t{n} + 1);
  g.xrefStart.count = n + 1;
  std::fill(g.xrefStart.data, g.xrefStart.data + n + 1, 0);
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    ++g.xrefStart[g.segments[s].i1 + 1];
    ++g.xrefStart[g.segments[s].i2 + 1];
  }
  for (std::int32_t i = 0; i < n; ++i) g.xrefStart[i + 1] += g.xrefStart[i];
  g.xrefEnds.count = 0;
  g.xrefEnds.Reserve(std::max<std::int64_t>(2 * std::int64_t{g.segments.count}, 1));
  g.xrefEnds.count = 2 * g.segments.count;
  std::vector<std::int32_t> fill(g.xrefStart.data, g.xrefStart.data + n);
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    g.xrefEnds[fill[g.segments[s].i1]++] = 2 * s;
    g.xrefEnds[fill[g.segments[s].i2]++] = 2 * s + 1;
  }
  g.xrefMerged.count = 0;
  g.xrefMerged.Reserve(std::max<std::int64_t>(n, 1));
  g.xrefMerged.count = n;
  std::fill(g.xrefMerged.data, g.xrefMerged.data + n, kNone);
  g.xrefBuilt = true;
}

void ReleaseCrossReference() {
  Engine& g = Vd();
  g.xrefStart.count = 0;
  g.xrefEnds.count = 0;
  g.xrefMerged.count = 0;
  g.xrefBuilt = false;
}

void RedirectSegmentEnds(std::int32_t from, std::int32_t to) {
  Engine& g = Vd();
  assert(g.xrefBuilt);
  if (from == to) return;
  const std::int32_t built = g.xrefMerged.count;
  if (from < 0 || from >= built || to < 0 || to >= built) {
    // A point appended after the list was built: its ends are not listed.
    // Only a repair appends points, and a repair ends the pass, so this is
    // a stale list: drop it (the next use rebuilds it).
    ReleaseCrossReference();
    BuildCrossReference();
    if (from >= g.xrefMerged.count || to >= g.xrefMerged.count) return;
  }
  // The ends listed under `from` and under every point merged into it
  // before move to `to`; `from`'s chain then joins `to`'s. The cost is the
  // size of `from`'s chain, not of the whole list.
  std::int32_t last = from;
  for (std::int32_t q = from; q != kNone; q = g.xrefMerged[q]) {
    for (std::int32_t k = g.xrefStart[q]; k < g.xrefStart[q + 1]; ++k) {
      const std::int32_t end = g.xrefEnds[k];
      SegmentRecord& s = g.segments[end / 2];
      (end % 2 == 0 ? s.i1 : s.i2) = to;
    }
    last = q;
  }
  g.xrefMerged[last] = g.xrefMerged[to];
  g.xrefMerged[to] = from;
}

namespace {

// Segments whose two ends are one point go; the last takes their place.
void RemovePointSegments(Engine& g) {
  for (std::int32_t s = 0; s < g.segments.count;) {
    if (g.segments[s].i1 == g.segments[s].i2) {
      g.segments[s] = g.segments[--g.segments.count];
      ++g.removedSegments;
    } else {
      ++s;
    }
  }
}

}  // namespace

void CleanInput(bool sortSegments) {
  Engine& g = Vd();
  const std::int32_t n = g.points.count;
  // Sort (stable, so equal points keep their order) through a permutation,
  // so segment ends follow their points.
  std::vector<std::int32_t> order(n);
  std::iota(order.begin(), order.end(), 0);
  std::stable_sort(order.begin(), order.end(), [&](std::int32_t a, std::int32_t b) {
    const PointRecord& p = g.points[a];
    const PointRecord& q = g.points[b];
    return p.x < q.x || (p.x == q.x && p.y < q.y);
  });
  // Runs of equal coordinates collapse into one point: the first live one.
  // A point marked deleted coincides with the point it was merged into, so
  // it joins that point's run and goes too, unless a later repair moved
  // that point away: such a run of deleted points alone goes as a whole when
  // no segment ends there, and comes back to life when one does (it must
  // not reach the diagram as a deleted point, nor vanish under a segment).
  std::vector<std::uint8_t> isEnd(n, 0);
  for (std::int32_t s = 0; s < g.segments.count; ++s) isEnd[g.segments[s].i1] = isEnd[g.segments[s].i2] = 1;
  for (std::int32_t a = 0; a < g.arcs.count; ++a) isEnd[g.arcs[a].i1] = isEnd[g.arcs[a].i2] = 1;
  std::vector<PointRecord> sorted;
  sorted.reserve(n);
  std::vector<std::int32_t> newIndex(n, -1);
  std::int32_t duplicates = 0;
  for (std::int32_t k = 0; k < n;) {
    std::int32_t end = k + 1;
    const PointRecord& first = g.points[order[k]];
    while (end < n && g.points[order[end]].x == first.x && g.points[order[end]].y == first.y) ++end;
    std::int32_t keep = k;
    while (keep < end && g.points[order[keep]].deleted) ++keep;
    if (keep == end) {
      bool used = false;
      for (std::int32_t m = k; m < end; ++m) used = used || isEnd[order[m]];
      if (!used) {
        k = end;
        continue;
      }
      keep = k;
      g.points[order[keep]].deleted = 0;
    }
    const std::int32_t at = static_cast<std::int32_t>(sorted.size());
    sorted.push_back(g.points[order[keep]]);
    for (std::int32_t m = k; m < end; ++m) {
      newIndex[order[m]] = at;
      if (m != keep && !g.points[order[m]].deleted) ++duplicates;
    }
    k = end;
  }
  std::copy(sorted.begin(), sorted.end(), g.points.data);
  g.points.count = static_cast<std::int32_t>(sorted.size());
  g.duplicatePoints += duplicates;
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    g.segments[s].i1 = newIndex[g.segments[s].i1];
    g.segments[s].i2 = newIndex[g.segments[s].i2];
  }
  for (std::int32_t a = 0; a < g.arcs.count; ++a) {
    g.arcs[a].i1 = newIndex[g.arcs[a].i1];
    g.arcs[a].i2 = newIndex[g.arcs[a].i2];
  }
  g.inputSorted = true;

  RemovePointSegments(g);
  if (sortSegments && g.segments.count > 1) {
    SegmentRecord* b = g.segments.data;
    SegmentRecord* e = b + g.segments.count;
    const auto key = [](const SegmentRecord& s) {
      return std::pair{std::min(s.i1, s.i2), std::max(s.i1, s.i2)};
    };
    std::stable_sort(b, e, [&](const SegmentRecord& x, const SegmentRecord& y) { return key(x) < key(y); });
    SegmentRecord* out = b;
    for (SegmentRecord* it = b; it != e; ++it) {
      if (out != b && key(*(out - 1)) == key(*it)) {
        AbsorbRepeatedSegment(*(out - 1), *it);
        ++g.removedSegments;
        continue;
      }
      *out++ = *it;
    }
    g.segments.count = static_cast<std::int32_t>(out - b);
  }
  ReleaseCrossReference();
}

namespace {

// Rounds of merging the ends of zero-length segments: a merge moves points
// by less than kZeroLength, which may make a neighbouring segment that
// short in turn.
constexpr int kShortSegmentRounds = 8;

std::int32_t Root(std::vector<std::int32_t>& parent, std::int32_t i) {
  while (parent[i] != i) i = parent[i] = parent[parent[i]];
  return i;
}

// Merges the two ends of every segment no longer than kZeroLength, all in
// one pass: each group of ends joined by such segments goes to the mean of
// its points (the midpoint for a pair), kept at its lowest index; the other
// points are marked deleted and every segment end is redirected to the kept
// point. Segments left with one point for both ends are removed. True when
// anything changed.
bool MergeShortSegments() {
  Engine& g = Vd();
  std::vector<std::int32_t> parent;
  bool changed = false;
  for (int round = 0; round < kShortSegmentRounds; ++round) {
    bool found = false;
    for (std::int32_t s = 0; s < g.segments.count; ++s) {
      const SegmentRecord& r = g.segments[s];
      if (r.i1 == r.i2) continue;
      const PointRecord& p1 = g.points[r.i1];
      const PointRecord& p2 = g.points[r.i2];
      if (std::hypot(p2.x - p1.x, p2.y - p1.y) > kZeroLength) continue;
      if (!found) {
        parent.resize(g.points.count);
        std::iota(parent.begin(), parent.end(), 0);
        found = true;
      }
      const std::int32_t a = Root(parent, r.i1), b = Root(parent, r.i2);
      if (a != b) parent[std::max(a, b)] = std::min(a, b);
    }
    if (!found) break;
    changed = true;
    // Sums of the groups, then every member at its group's mean.
    std::vector<double> sx(g.points.count, 0.0), sy(g.points.count, 0.0), cnt(g.points.count, 0.0);
    for (std::int32_t i = 0; i < g.points.count; ++i) {
      const std::int32_t root = Root(parent, i);
      sx[root] += g.points[i].x;
      sy[root] += g.points[i].y;
      cnt[root] += 1.0;
    }
    for (std::int32_t i = 0; i < g.points.count; ++i) {
      const std::int32_t root = Root(parent, i);
      if (cnt[root] < 2.0) continue;
      g.points[i].x = sx[root] / cnt[root];
      g.points[i].y = sy[root] / cnt[root];
      if (root != i) g.points[i].deleted = 1;
    }
    for (std::int32_t s = 0; s < g.segments.count; ++s) {
      g.segments[s].i1 = Root(parent, g.segments[s].i1);
      g.segments[s].i2 = Root(parent, g.segments[s].i2);
    }
    for (std::int32_t a = 0; a < g.arcs.count; ++a) {
      g.arcs[a].i1 = Root(parent, g.arcs[a].i1);
      g.arcs[a].i2 = Root(parent, g.arcs[a].i2);
    }
  }
  if (!changed) return false;
  RemovePointSegments(g);
  // The cross-reference, if any, lists ends that have moved.
  ReleaseCrossReference();
  g.lineDataInexact = true;
  g.dataModified = true;
  return true;
}

}  // namespace

void ComputeSegmentLineData() {
  Engine& g = Vd();
  // Zero-length segments: their ends merge here, all at once, and the
  // computation restarts with the cleaned input (the restart's cleaning
  // drops the merged points). Asking the restart to build a cross-reference
  // first, as the engine once did, could loop: the cleaning releases it
  // again before it is used.
  if (MergeShortSegments()) g.restartPending = true;
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    SegmentRecord& r = g.segments[s];
    const PointRecord& p1 = g.points[r.i1];
    const PointRecord& p2 = g.points[r.i2];
    const double dx = p2.x - p1.x, dy = p2.y - p1.y;
    const double len = std::sqrt(dx * dx + dy * dy);
    if (len <= kZeroLength) {
      // Only two copies of one point are left this short; the restart's
      // cleaning merges them and drops the segment.
      g.restartPending = true;
      continue;
    }
    r.a = -dy / len;
    r.b = dx / len;
    r.c = dy / len * p1.x - dx / len * p1.y;
    r.length = len;
    if (std::fabs(r.a * p2.x + r.b * p2.y + r.c) > kZeroLength) {
      const double c2 = -(r.a * p2.x + r.b * p2.y);
      r.c = 0.5 * (r.c + c2);
      g.lineDataInexact = true;
    }
  }
}

void PlaceCornerDummies(std::int32_t boundFactor) {
  Engine& g = Vd();
  const double f = boundFactor + kCornerExtraFactor;
  const double w = g.maxX - g.minX, h = g.maxY - g.minY;
  double wx = std::fabs(w) <= kZeroLength ? f : w * f;
  double wy = std::fabs(h) <= kZeroLength ? f : h * f;
  if (wy / 2 > wx) wx = wy / 2;
  else if (wx / 2 > wy) wy = wx / 2;
  const std::int32_t n = g.points.count;
  g.points[0].x = g.minX - wx;
  g.points[0].y = g.minY - wy;
  g.points[1].x = g.minX - wx;
  g.points[1].y = g.maxY + wy;
  g.points[n - 2].x = g.maxX + wx;
  g.points[n - 2].y = g.minY - wy;
  g.points[n - 1].x = g.maxX + wx;
  g.points[n - 1].y = g.maxY + wy;
  g.maxOffset = kMaxOffsetFraction * std::sqrt(wx * wx + wy * wy);
  g.frameSet = true;
}

}  // namespace zt::vd
