// Operand preparation: the bounding box of both operands, the normalisation
// into the unit square, snapping, and the reading of each operand's contours
// into its polygon set.
#include <algorithm>
#include <climits>
#include <cmath>
#include <initializer_list>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

bool is_separator_record(const TaggedPoint& p) {
  return p.tag == kSeparatorTag || p.x > kSeparatorThreshold || p.y > kSeparatorThreshold;
}

bool operand_is_sane(const TaggedPointList& list) {
  for (const TaggedPoint& p : list) {
    if (!std::isfinite(p.x) || !std::isfinite(p.y)) return false;
    if (std::fabs(p.x) > kMaxInputMagnitude || std::fabs(p.y) > kMaxInputMagnitude) return false;
  }
  return true;
}

BoundingBox scan_bounding_box(const TaggedPointList& a, const TaggedPointList& b) {
  BoundingBox box;
  for (const TaggedPointList* list : {&a, &b}) {
    for (const TaggedPoint& p : *list) {
      if (is_separator_record(p)) continue;
      if (p.x < box.minX) box.minX = p.x;
      if (p.x > box.maxX) box.maxX = p.x;
      if (p.y < box.minY) box.minY = p.y;
      if (p.y > box.maxY) box.maxY = p.y;
      ++box.count;
    }
  }
  return box;
}

void set_normalisation(BooleanEngine& e, const BoundingBox& box) {
  const double w = box.maxX - box.minX, h = box.maxY - box.minY;
  const double size = w > h ? w : h;
  // The margins keep every counted point strictly inside the unit square.
  e.offsetX = box.minX - 1.0;
  e.offsetY = box.minY - 1.0;
  e.scaleX = e.scaleY = size + 4.0;
}

double snap_coordinate(double v) {
  // Integer and fractional parts, both with the sign of v (inputs are at
  // most kMaxInputMagnitude, so the conversions are exact); the quantum is a
  // power of two, so the scaled fraction is exact too.
  const double whole = static_cast<double>(static_cast<std::int64_t>(v));
  const double steps = (v - whole) * (1.0 / kSnapQuantum);
  std::int64_t k = static_cast<std::int64_t>(steps);
  if (static_cast<double>(k) > steps) --k;  // floor
  return whole + static_cast<double>(k) * kSnapQuantum;
}

bool contour_store(BooleanEngine& e, InputContour& c, const TaggedPoint* pts, std::int32_t n) {
  const std::int64_t need = std::int64_t{e.pointCount} + n;
  if (need > e.pointCapacity) {
    if (need > INT32_MAX / 2 || !allocationAllowed()) return false;
    const std::int32_t capacity = static_cast<std::int32_t>(std::max<std::int64_t>(need, 2 * std::int64_t{e.pointCapacity}));
    TaggedPoint* grown = new (std::nothrow) TaggedPoint[static_cast<std::size_t>(capacity)];
    if (!grown) return false;
    std::copy(e.points, e.points + e.pointCount, grown);
    delete[] e.points;
    e.points = grown;
    e.pointCapacity = capacity;
  }
  c.firstPoint = e.pointCount;
  c.pointCount = n;
  std::copy(pts, pts + n, e.points + e.pointCount);
  e.pointCount += n;
  return true;
}

namespace {

bool grow_point_scratch(BooleanEngine& e, std::int32_t n) {
  if (n <= e.pointScratchCapacity) return true;
  delete[] e.pointScratch;
  e.pointScratch = nullptr;
  e.pointScratchCapacity = 0;
  if (!allocationAllowed()) return false;
  e.pointScratch = new (std::nothrow) TaggedPoint[static_cast<std::size_t>(n)];
  if (!e.pointScratch) return false;
  e.pointScratchCapacity = n;
  return true;
}

bool same_point(const TaggedPoint& p, const TaggedPoint& q) {
  return std::fmax(std::fabs(p.x - q.x), std::fabs(p.y - q.y)) < kEngineEpsilon;
}

// The path p -> q -> r turns straight back at q: the shorter leg's far end
// lies within the tolerance of the longer leg's line.
bool turns_back(const TaggedPoint& p, const TaggedPoint& q, const TaggedPoint& r) {
  const double ux = q.x - p.x, uy = q.y - p.y, vx = r.x - q.x, vy = r.y - q.y;
  if (ux * vx + uy * vy >= 0.0) return false;
  const double longer = std::fmax(std::sqrt(ux * ux + uy * uy), std::sqrt(vx * vx + vy * vy));
  return std::fabs(ux * vy - uy * vx) <= kEngineEpsilon * longer;
}

// Drops q of p -> q -> r where the path turns straight back: p -> r covers
// what is left once the overlap, run along in both directions, cancels out.
// When r lies beyond p, p -> r runs along q -> r and takes its tag.
void drop_turn(TaggedPoint* pts, std::int32_t at) {
  const TaggedPoint& p = pts[at - 1];
  const TaggedPoint& q = pts[at];
  const TaggedPoint& r = pts[at + 1];
  if ((r.x - p.x) * (q.x - p.x) + (r.y - p.y) * (q.y - p.y) < 0.0) pts[at - 1].tag = q.tag;
}

// Removes from pts[0..n) the points where the contour turns straight back
// (spikes, there-and-back pieces, slivers thinner than the tolerance) and
// merges consecutive points within the tolerance (the later tag stays, as
// it is the tag of the edge that leaves the point). Closed contours are
// treated cyclically; one left with fewer than three points bounds nothing
// and comes back empty. Returns the new count.
std::int32_t drop_turnbacks(TaggedPoint* pts, std::int32_t n, bool closed) {
  std::int32_t m = 0;
  for (std::int32_t i = 0; i < n; ++i) {
    const TaggedPoint q = pts[i];
    bool merged = false;
    for (;;) {
      if (m > 0 && same_point(pts[m - 1], q)) {
        merged = true;
        break;
      }
      if (m < 2 || !turns_back(pts[m - 2], pts[m - 1], q)) break;
      pts[m] = q;
      drop_turn(pts, m - 1);
      --m;
    }
    if (merged) {
      pts[m - 1].tag = q.tag;
    } else {
      pts[m++] = q;
    }
  }
  if (!closed) return m;
  // The seam: the last point against the first two, until nothing changes.
  bool changed = true;
  while (changed && m >= 3) {
    changed = false;
    if (same_point(pts[m - 1], pts[0])) {
      --m;
      changed = true;
    } else if (turns_back(pts[m - 2], pts[m - 1], pts[0])) {
      pts[m] = pts[0];
      drop_turn(pts, m - 1);
      --m;
      changed = true;
    } else if (turns_back(pts[m - 1], pts[0], pts[1])) {
      if ((pts[1].x - pts[m - 1].x) * (pts[0].x - pts[m - 1].x) + (pts[1].y - pts[m - 1].y) * (pts[0].y - pts[m - 1].y) < 0.0)
        pts[m - 1].tag = pts[0].tag;
      for (std::int32_t k = 1; k < m; ++k) pts[k - 1] = pts[k];
      --m;
      changed = true;
    }
  }
  return m >= 3 ? m : 0;
}

// Coordinates of the retry, rounded to multiples of this (normalised).
inline constexpr double kCoarseGrid = 0x1p-36;

double coarse(double v) { return std::round(v / kCoarseGrid) * kCoarseGrid; }

}  // namespace

int read_operand(BooleanEngine& e, PolygonSet& set, const TaggedPointList& list, std::int32_t owner, bool coarseGrid) {
  reset_set(e, set);
  set.owner = owner;
  set.cancelled = false;
  const std::int32_t n = list.count();
  std::int32_t i = 0;
  while (i < n) {
    // Only x tells contours apart here: a record with x at or above the
    // threshold cannot start a contour, one above it ends the contour.
    while (i < n && !(list[i].x < kSeparatorThreshold)) ++i;
    if (i >= n) break;
    const std::int32_t begin = i;
    while (i < n && !(list[i].x > kSeparatorThreshold)) ++i;
    std::int32_t end = i;
    if (i < n) ++i;

    // Trailing repetitions of the first point (within the tolerance, in
    // input units) close the contour and are dropped.
    bool closed = false;
    while (end > begin && std::fmax(std::fabs(list[end - 1].x - list[begin].x),
                                    std::fabs(list[end - 1].y - list[begin].y)) < kEngineEpsilon) {
      --end;
      closed = true;
    }
    if (end - begin < 2) continue;

    // One spare slot: drop_turnbacks looks one point ahead.
    if (!grow_point_scratch(e, end - begin + 1)) return -1;
    TaggedPoint* pts = e.pointScratch;
    for (std::int32_t k = begin; k < end; ++k) {
      const TaggedPoint& p = list[k];
      double x = (snap_coordinate(p.x) - e.offsetX) / e.scaleX;
      double y = (snap_coordinate(p.y) - e.offsetY) / e.scaleY;
      if (coarseGrid) x = coarse(x), y = coarse(y);
      pts[k - begin] = TaggedPoint(p.tag, x, y);
    }
    const TaggedPoint first = pts[0];
    const std::int32_t kept = drop_turnbacks(pts, end - begin, closed);
    if (kept < 2) {
      // A contour of two distinct points or more that bounds nothing.
      for (std::int32_t k = begin + 1; k < end && !set.cancelled; ++k) {
        const double x = (snap_coordinate(list[k].x) - e.offsetX) / e.scaleX;
        const double y = (snap_coordinate(list[k].y) - e.offsetY) / e.scaleY;
        set.cancelled = !same_point(first, TaggedPoint(0, coarseGrid ? coarse(x) : x, coarseGrid ? coarse(y) : y));
      }
      continue;
    }

    InputContour* c = set.contours.take();
    if (!c) return -1;
    *c = InputContour{};
    c->closed = closed ? 1 : 0;
    if (!contour_store(e, *c, pts, kept)) return -1;
  }
  // An operand made only of parts that bound nothing is an empty region.
  if (set.contours.count() == 0 && set.cancelled) return kEmptyOperand;
  if (finish_set(e, set) != 0) return -1;
  for (std::int32_t ci = 0; ci < set.contours.count(); ++ci) {
    const InputContour& c = set.contours[ci];
    if (!c.closed)
      for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) e.edges[k].open = 1;
  }
  return 0;
}

}  // namespace zt::detail
