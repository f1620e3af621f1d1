// Dispatch of the node constructions by site kinds.
#include "voronoi/detail/node_constructions.hpp"

namespace zt::vd::geo {

bool compute_node(const EdgeFrame& e, const SiteRef& fresh, NodeMemory& memory, SuspectPair& suspect,
                  NodeResult& out) {
  out.copied = false;
  out.on_point = -1;
  const std::int32_t l = e.left.kind;
  const std::int32_t r = e.right.kind;
  const std::int32_t n = fresh.kind;
  if (l == kKindPnt && r == kKindPnt && n == kKindSeg)
    return node_pps(e, fresh, e.left.pnt, e.right.pnt, fresh.seg, suspect, out);
  if (l == kKindPnt && r == kKindSeg && n == kKindPnt)
    return node_pps(e, fresh, e.left.pnt, fresh.pnt, e.right.seg, suspect, out);
  if (l == kKindPnt && r == kKindSeg && n == kKindSeg)
    return node_pss(e, fresh, e.left.pnt, e.right.seg, fresh.seg, memory, suspect, out);
  if (l == kKindSeg && r == kKindPnt && n == kKindPnt)
    return node_pps(e, fresh, e.right.pnt, fresh.pnt, e.left.seg, suspect, out);
  if (l == kKindSeg && r == kKindPnt && n == kKindSeg)
    return node_pss(e, fresh, e.right.pnt, e.left.seg, fresh.seg, memory, suspect, out);
  if (l == kKindSeg && r == kKindSeg && n == kKindPnt)
    return node_pss(e, fresh, fresh.pnt, e.left.seg, e.right.seg, memory, suspect, out);
  if (l == kKindSeg && r == kKindSeg && n == kKindSeg)
    return node_sss(e, fresh, e.left.seg, e.right.seg, fresh.seg, suspect, out);
  return false;
}

}  // namespace zt::vd::geo
