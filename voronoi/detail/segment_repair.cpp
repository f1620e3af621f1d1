// Input repair tests with segments (see segment_repair.hpp).
#include "voronoi/detail/segment_repair.hpp"

#include <cmath>

#include "voronoi/detail/input_repair.hpp"

namespace zt::vd {
namespace {

std::int32_t PointsEnd() {
  const Engine& g = Vd();
  return g.dummiesAdded ? g.points.count - 2 : g.points.count;
}

double LineValue(const SegmentRecord& s, double x, double y) { return s.a * x + s.b * y + s.c; }
double Along(const SegmentRecord& s, const PointRecord& p1, double x, double y) {
  return (x - p1.x) * s.b - (y - p1.y) * s.a;
}

void Modified() {
  Engine& g = Vd();
  g.dataModified = true;
  g.restartPending = true;
}

// s now ends at p; a new segment from p to s's old end keeps its tag.
void SplitSegmentAt(std::int32_t s, std::int32_t p) {
  Engine& g = Vd();
  SegmentRecord tail = g.segments[s];
  g.segments[s].i2 = p;
  tail.i1 = p;
  tail.vd = kNone;
  tail.flag = 0;
  g.segments.Append(tail, kSiteGrowth);
  Modified();
}

void RemoveSegment(std::int32_t s) {
  Engine& g = Vd();
  g.segments[s] = g.segments[g.segments.count - 1];
  --g.segments.count;
  ++g.removedSegments;
  Modified();
}

int SignBand(double v) { return v > kCrossBand ? 1 : (v < -kCrossBand ? -1 : 0); }

}  // namespace

bool RepairSegmentPoint(std::int32_t s, std::int32_t p) {
  Engine& g = Vd();
  const SegmentRecord& seg = g.segments[s];
  if (p == seg.i1 || p == seg.i2 || g.points[p].deleted || !(seg.length > 0.0)) return false;
  const PointRecord& q = g.points[p];
  const PointRecord& p1 = g.points[seg.i1];
  const PointRecord& p2 = g.points[seg.i2];
  if (!(std::fabs(LineValue(seg, q.x, q.y)) <= kRepairPointDistance)) return false;
  const double lam = Along(seg, p1, q.x, q.y);
  if (!(lam >= -kExtentBand && lam <= seg.length + kExtentBand)) return false;
  if (std::hypot(q.x - p1.x, q.y - p1.y) <= kRepairPointDistance) {
    MergePointsToMidpoint(seg.i1, p);
  } else if (std::hypot(q.x - p2.x, q.y - p2.y) <= kRepairPointDistance) {
    MergePointsToMidpoint(seg.i2, p);
  } else {
    SplitSegmentAt(s, p);
  }
  return true;
}

bool RepairSegmentSegment(std::int32_t a, std::int32_t b) {
  Engine& g = Vd();
  if (a == b) return false;
  const std::int32_t s1 = a < b ? a : b;
  const std::int32_t s2 = a < b ? b : a;
  const SegmentRecord r1 = g.segments[s1];
  const SegmentRecord r2 = g.segments[s2];
  const bool shared21 = r2.i1 == r1.i1 || r2.i1 == r1.i2;
  const bool shared22 = r2.i2 == r1.i1 || r2.i2 == r1.i2;
  if (shared21 && shared22) {
    const bool dropFirst = r2.arc >= 0 && r1.arc < 0;
    AbsorbRepeatedSegment(g.segments[dropFirst ? s2 : s1], dropFirst ? r1 : r2);
    RemoveSegment(dropFirst ? s1 : s2);
    return true;
  }
  if (shared21 || shared22 || !(r1.length > 0.0) || !(r2.length > 0.0)) return false;
  const PointRecord& a1 = g.points[r1.i1];
  const PointRecord& a2 = g.points[r1.i2];
  const PointRecord& b1 = g.points[r2.i1];
  const PointRecord& b2 = g.points[r2.i2];
  if (SignBand(LineValue(r1, b1.x, b1.y)) * SignBand(LineValue(r1, b2.x, b2.y)) >= 0) return false;
  const double d1 = LineValue(r2, a1.x, a1.y);
  const double d2 = LineValue(r2, a2.x, a2.y);
  if (SignBand(d1) * SignBand(d2) >= 0) return false;
  const double f = std::fabs(d1) / (std::fabs(d1) + std::fabs(d2));
  double x = a1.x + f * r1.length * r1.b;
  double y = a1.y - f * r1.length * r1.a;
  if (std::fabs(LineValue(r2, x, y)) > kCrossBand) {
    // General line intersection of the two supporting lines.
    const double det = r1.a * r2.b - r1.b * r2.a;
    if (det != 0.0) {
      const double xi = (r1.b * r2.c - r2.b * r1.c) / det;
      const double yi = (r2.a * r1.c - r1.a * r2.c) / det;
      if (std::isfinite(xi) && std::isfinite(yi)) {
        x = xi;
        y = yi;
      }
    }
  }
  const std::int32_t p = AppendRepairPoint(x, y);
  SplitSegmentAt(s1, p);
  SplitSegmentAt(s2, p);
  return true;
}

bool RepairSuspectWithSegment(const SuspectPair& pair) {
  if (pair.kind1 == SEG && pair.kind2 == SEG) return RepairSegmentSegment(pair.site1, pair.site2);
  if (pair.kind1 == SEG && pair.kind2 == PNT) return RepairSegmentPoint(pair.site1, pair.site2);
  if (pair.kind1 == PNT && pair.kind2 == SEG) return RepairSegmentPoint(pair.site2, pair.site1);
  return false;
}

bool RepairPointAgainstSegments(std::int32_t p) {
  const Engine& g = Vd();
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    if (RepairSegmentPoint(s, p)) return true;
  }
  return false;
}

bool RepairSegmentAgainstAll(std::int32_t s) {
  const Engine& g = Vd();
  if (s < 0 || s >= g.segments.count) return false;
  const std::int32_t end = PointsEnd();
  for (std::int32_t p = 2; p < end; ++p) {
    if (RepairSegmentPoint(s, p)) return true;
  }
  // Near-coincident points at the segment's own ends.
  for (const std::int32_t e : {g.segments[s].i1, g.segments[s].i2}) {
    const PointRecord& q = g.points[e];
    for (std::int32_t p = 2; p < end; ++p) {
      const PointRecord& r = g.points[p];
      if (p == e || r.deleted || q.deleted) continue;
      // The distance is at least the larger coordinate difference: most
      // points are ruled out without the costly hypot, with the same result.
      if (std::fabs(r.x - q.x) > kRepairPointDistance || std::fabs(r.y - q.y) > kRepairPointDistance) continue;
      if (std::hypot(r.x - q.x, r.y - q.y) <= kRepairPointDistance) {
        MergePointsToMidpoint(e, p);
        return true;
      }
    }
  }
  for (std::int32_t t = 0; t < g.segments.count; ++t) {
    if (RepairSegmentSegment(s, t)) return true;
  }
  return false;
}

bool RepairAllSegmentPairs() {
  const Engine& g = Vd();
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    if (RepairSegmentAgainstAll(s)) return true;
  }
  return false;
}

}  // namespace zt::vd
