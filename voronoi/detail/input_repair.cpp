// Input repair (see input_repair.hpp).
#include "voronoi/detail/input_repair.hpp"

#include <cmath>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/segment_repair.hpp"

namespace zt::vd {

namespace {

bool RepairPointPoint(std::int32_t a, std::int32_t b) {
  Engine& g = Vd();
  if (a == b) return false;
  const PointRecord& p = g.points[a];
  const PointRecord& q = g.points[b];
  if (p.deleted || q.deleted) return false;
  const double dx = p.x - q.x, dy = p.y - q.y;
  if (dx * dx + dy * dy > kRepairPointDistance * kRepairPointDistance) return false;
  MergePointsToMidpoint(a, b);
  return true;
}

bool TestPair(const SuspectPair& s) {
  if (s.kind1 == PNT && s.kind2 == PNT) return RepairPointPoint(s.site1, s.site2);
  return RepairSuspectWithSegment(s);
}

}  // namespace

void MergePointsToMidpoint(std::int32_t a, std::int32_t b) {
  Engine& g = Vd();
  PointRecord& p = g.points[a];
  PointRecord& q = g.points[b];
  const double mx = 0.5 * (p.x + q.x), my = 0.5 * (p.y + q.y);
  p.x = q.x = mx;
  p.y = q.y = my;
  g.lineDataInexact = true;
  g.dataModified = true;
  g.restartPending = true;
}

std::int32_t AppendRepairPoint(double x, double y) {
  Engine& g = Vd();
  PointRecord p{};
  p.x = x;
  p.y = y;
  p.vd = kNone;
  p.node = kNone;
  p.arc = kNone;
  p.tag = -1;
  // The corner points keep the last two slots: the new point goes before
  // them. Nothing refers to the corners but the diagram, which the restart
  // rebuilds.
  std::int32_t index = g.points.Append(p, kSiteGrowth);
  if (g.dummiesAdded) {
    const PointRecord c2 = g.points[index - 2];
    const PointRecord c3 = g.points[index - 1];
    g.points[index - 2] = p;
    g.points[index - 1] = c2;
    g.points[index] = c3;
    index -= 2;
  }
  g.dataModified = true;
  g.restartPending = true;
  return index;
}

bool RepairSuspectPair() {
  Engine& g = Vd();
  if (!g.suspect.set) return false;
  const SuspectPair s = g.suspect;
  g.suspect.set = false;
  return TestPair(s);
}

bool RepairInput(std::int32_t site, std::int32_t kind, bool checkAllAllowed) {
  Engine& g = Vd();
  if (RepairSuspectPair()) return true;
  if (kind == PNT) {
    const std::int32_t end = g.dummiesAdded ? g.points.count - 2 : g.points.count;
    for (std::int32_t q = 2; q < end; ++q) {
      if (RepairPointPoint(site, q)) return true;
    }
    if (RepairPointAgainstSegments(site)) return true;
  }
  if (kind == SEG && RepairSegmentAgainstAll(site)) return true;
  if (checkAllAllowed && g.checkAllRepair) {
    const std::int32_t end = g.dummiesAdded ? g.points.count - 2 : g.points.count;
    for (std::int32_t a = 2; a < end; ++a)
      for (std::int32_t b = a + 1; b < end; ++b)
        if (RepairPointPoint(a, b)) return true;
    if (RepairAllSegmentPairs()) return true;
  }
  return false;
}

}  // namespace zt::vd
