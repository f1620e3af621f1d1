// Warms the cache for the next point insertion while the current one runs.
//
// Point insertion is bound by memory latency: its first steps walk the
// region of the nearest inserted point q (edges, nodes, the neighbouring
// sites), records created at random times and so scattered over the
// arrays. Once the next point's q is known, this walker follows q's region
// one edge at a time from checkpoints inside the current insertion; each
// step reads a record an earlier step requested and requests the records
// the next steps and the next insertion will read.
//
// Promise: it only reads indices and issues prefetch hints. Results never
// depend on it; a region changed under it by the current insertion only
// makes the hints less useful, and every index is checked before use, so
// a stale one ends the walk instead of reading outside the arrays.
#pragma once

#include <cstdint>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

class RegionPrefetch {
 public:
  // Starts a walk of the region of point q (no walk for q < 0).
  void Start(Engine& g, std::int32_t q) {
    site_ = q;
    steps_ = 0;
    outwardCount_ = 0;
    edge_ = kReadStart;
    if (q < 0) edge_ = kNone;
    else g.points.Prefetch(q);
  }

  // One step of the walk; cheap when the walk is over.
  void Step(Engine& g) {
    if (edge_ == kNone) return;
    if (edge_ == kOutward) {
      StepOutward(g);
      return;
    }
    if (edge_ == kReadStart) {
      start_ = edge_ = g.points.Valid(site_) ? g.points[site_].vd : kNone;
      if (g.edges.Valid(edge_)) g.edges.Prefetch(edge_);
      else edge_ = kNone;
      return;
    }
    if (!g.edges.Valid(edge_) || ++steps_ > kMaxSteps) {
      edge_ = kNone;
      return;
    }
    const EdgeRecord& r = g.edges[edge_];
    std::int32_t node, across, acrossKind, next, outward;
    if (r.lft == site_ && r.ltype == PNT) {
      node = r.n2, across = r.rgt, acrossKind = r.rtype, next = r.e_cw, outward = r.e_ccw;
    } else if (r.rgt == site_ && r.rtype == PNT) {
      node = r.n1, across = r.lft, acrossKind = r.ltype, next = r.s_cw, outward = r.s_ccw;
    } else {
      edge_ = kNone;
      return;
    }
    g.nodes.Prefetch(node);
    if (acrossKind == PNT) g.points.Prefetch(across);
    g.edges.Prefetch(outward);
    if (outwardCount_ < kMaxOutward) outward_[outwardCount_++] = Outward{outward, node};
    edge_ = next == start_ ? kOutward : next;
    if (edge_ != kOutward) g.edges.Prefetch(edge_);
  }

 private:
  // Second round: the far ends of the edges leaving the region's nodes, the
  // nodes a growing tree tests next, and their edges.
  void StepOutward(Engine& g) {
    if (outwardCount_ == 0) {
      edge_ = kNone;
      return;
    }
    const Outward o = outward_[--outwardCount_];
    if (!g.edges.Valid(o.edge)) return;
    const EdgeRecord& e = g.edges[o.edge];
    const std::int32_t far = OtherNode(e, o.node);
    g.nodes.Prefetch(far);
    // A tree that takes the far node reads its other two edges next; their
    // indices are in this record already.
    g.edges.Prefetch(CcwAt(e, far));
    g.edges.Prefetch(CwAt(e, far));
  }

  static constexpr std::int32_t kReadStart = -2;
  static constexpr std::int32_t kOutward = -3;
  static constexpr int kMaxOutward = 12;
  struct Outward {
    std::int32_t edge;
    std::int32_t node;  // its end on the region
  };
  // A region of a diagram of points has a handful of edges; a walk longer
  // than this has lost its way in a changed region.
  static constexpr std::int32_t kMaxSteps = 32;

  std::int32_t site_ = kNone;
  std::int32_t start_ = kNone;
  std::int32_t edge_ = kNone;
  std::int32_t steps_ = 0;
  Outward outward_[kMaxOutward];
  int outwardCount_ = 0;
};

}  // namespace zt::vd
