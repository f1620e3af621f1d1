// Debug printers of the diagram (see debug_print.hpp).
#include "voronoi/detail/debug_print.hpp"

#include <cstdio>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

void PrintEdge(const char* label, std::int32_t e) {
  const Engine& g = Vd();
  const EdgeRecord& r = g.edges[e];
  std::printf("%s, edge %d: n1=%d, n2=%d\n", label, e, r.n1, r.n2);
  const auto x = [&](std::int32_t n) { return g.nodes.Valid(n) ? g.nodes[n].x : 0.0; };
  const auto y = [&](std::int32_t n) { return g.nodes.Valid(n) ? g.nodes[n].y : 0.0; };
  std::printf("n1: (%f, %f);  n2: (%f, %f)\n", x(r.n1), y(r.n1), x(r.n2), y(r.n2));
  std::printf("     lft = %d, rgt = %d, ltype = %d, rtype = %d\n", r.lft, r.rgt, r.ltype, r.rtype);
  std::printf("     s_ccw = %d, s_cw = %d, e_ccw = %d, e_cw = %d", r.s_ccw, r.s_cw, r.e_ccw, r.e_cw);
  std::fputs(r.deleted ? ", deleted.\n" : ".\n", stdout);
  std::fflush(stdout);
}

void PrintNode(const char* label, std::int32_t n) {
  static const char* const kStatus[] = {"    status UNCHECKED, ", "    status CHECKED, ",
                                        "    status DELETED, ",   "    status VISITED, ",
                                        "    status DUMMY, ",     "    status MISC, "};
  const NodeRecord& r = Vd().nodes[n];
  std::printf("%s, node %d: (%24.20f,%24.20f), radius = %24.20f\n", label, n, r.x, r.y, r.r);
  std::fputs(r.status <= MISC ? kStatus[r.status] : "    status Unknown!, ", stdout);
  std::printf("edge: %d, site: %d, ", r.edge, r.site);
  std::fputs(r.degree2 ? "degree-2 node.\n" : "degree-3 node.\n", stdout);
  std::fflush(stdout);
}

void PrintSummary() {
  const Engine& g = Vd();
  std::printf("\nnum_free_nodes: %d\n", g.freeNodes.count);
  std::printf("num_free_edges: %d\n", g.freeEdges.count);
  std::printf("num_nodes:      %d\n", g.nodes.count);
  std::printf("num_edges:      %d\n", g.edges.count);
  std::printf("nodes used:     %d\n", g.nodes.count - g.freeNodes.count);
  std::printf("edges used:     %d\n", g.edges.count - g.freeEdges.count);
  std::fflush(stdout);
}

void PrintDiagram(const char* where) {
  const Engine& g = Vd();
  std::printf("\nVD data printed from within %s:\n", where);
  std::fflush(stdout);
  for (std::int32_t n = 0; n < g.nodes.count; ++n) PrintNode(where, n);
  for (std::int32_t e = 0; e < g.edges.count; ++e) PrintEdge(where, e);
  PrintSummary();
}

}  // namespace zt::vd
