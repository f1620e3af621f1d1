// ComputeNodeOnEdge over the engine's records (see node_on_edge.hpp).
#include "voronoi/detail/node_on_edge.hpp"

#include <cmath>

#include "voronoi/detail/circumcentre.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/node_constructions.hpp"

namespace zt::vd {

geo::SiteRef SiteFromRecords(std::int32_t site, std::int32_t kind) {
  Engine& vd = Vd();
  geo::SiteRef ref;
  ref.kind = kind;
  if (kind == PNT) {
    const PointRecord& p = vd.points[site];
    ref.pnt = {site, {p.x, p.y}};
  } else if (kind == SEG) {
    const SegmentRecord& s = vd.segments[site];
    geo::SegSite& g = ref.seg;
    g.index = site;
    g.i1 = s.i1;
    g.i2 = s.i2;
    g.p1 = {vd.points[s.i1].x, vd.points[s.i1].y};
    g.p2 = {vd.points[s.i2].x, vd.points[s.i2].y};
    g.a = s.a;
    g.b = s.b;
    g.c = s.c;
    g.len = s.length;
    g.arc = s.arc;
    if (s.arc >= 0 && s.arc < vd.arcs.count) {
      g.arc_center = {vd.arcs[s.arc].cx, vd.arcs[s.arc].cy};
      g.arc_radius = vd.arcs[s.arc].radius;
    } else {
      g.arc = -1;
    }
  }
  return ref;
}

geo::EdgeFrame EdgeFromRecords(std::int32_t e) {
  Engine& vd = Vd();
  const EdgeRecord& rec = vd.edges[e];
  const NodeRecord& a = vd.nodes[rec.n1];
  const NodeRecord& b = vd.nodes[rec.n2];
  geo::EdgeFrame f;
  f.n1 = {{a.x, a.y}, a.r, a.status == DELETED};
  f.n2 = {{b.x, b.y}, b.r, b.status == DELETED};
  f.left = SiteFromRecords(rec.lft, rec.ltype);
  f.right = SiteFromRecords(rec.rgt, rec.rtype);
  return f;
}

bool ComputeNodeOnEdge(std::int32_t e, std::int32_t s, std::int32_t kind, double& x, double& y, double& r,
                       bool& copied, std::int32_t& onPoint) {
  return ComputeNodeOnEdge(e, SiteFromRecords(s, kind), x, y, r, copied, onPoint);
}

bool ComputeNodeOnEdge(std::int32_t e, const geo::SiteRef& fresh, double& x, double& y, double& r, bool& copied,
                       std::int32_t& onPoint) {
  Engine& vd = Vd();
  copied = false;
  onPoint = -1;
  const EdgeRecord& rec = vd.edges[e];
  if (rec.ltype == PNT && rec.rtype == PNT && fresh.kind == PNT) {
    double r2 = 0.0;
    if (!Circumcentre(rec.lft, rec.rgt, fresh.pnt.index, x, y, r2)) return false;
    r = std::sqrt(r2);
    return true;
  }
  const geo::EdgeFrame frame = EdgeFromRecords(e);
  geo::NodeMemory memory{vd.pssOrientByKeptNode};
  geo::SuspectPair suspect;
  geo::NodeResult out;
  const bool ok = geo::compute_node(frame, fresh, memory, suspect, out);
  vd.pssOrientByKeptNode = memory.orient_by_kept;
  if (suspect.set) {
    vd.suspect.set = true;
    vd.suspect.site1 = suspect.site1;
    vd.suspect.kind1 = suspect.kind1;
    vd.suspect.site2 = suspect.site2;
    vd.suspect.kind2 = suspect.kind2;
  }
  if (!ok) return false;
  x = out.n.x;
  y = out.n.y;
  r = out.r;
  copied = out.copied;
  onPoint = out.on_point;
  return true;
}

}  // namespace zt::vd
