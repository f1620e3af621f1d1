// The offset sweep (see offset_sweep.hpp).
#include "voronoi/detail/offset_sweep.hpp"

#include <cmath>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/offset_prepare.hpp"
#include "voronoi/detail/offset_state.hpp"
#include "voronoi/detail/offset_trace.hpp"

namespace zt::vd {

namespace {

// One pass over the work list at the current distance.
bool SweepOnce() {
  Engine& g = Vd();
  OffsetState& o = Offs();
  const double t = o.distance;
  ++o.pass;
  std::int32_t i = 0;
  while (i < o.workList.count) {
    const std::int32_t e = o.workList[i];
    if (!o.candidate[e]) {
      o.candidate[e] = 1;
      ++i;
      continue;
    }
    const double r1 = g.nodes[g.edges[e].n1].r, r2 = g.nodes[g.edges[e].n2].r;
    if (t < std::fmin(r1, r2)) {
      ++i;
      continue;
    }
    if (t >= std::fmax(r1, r2)) {
      // No later distance of this sequence crosses it either.
      o.workList[i] = o.workList[--o.workList.count];
      continue;
    }
    if (!TraceCurve(e, t)) return false;
    o.candidate[e] = 1;
    ++i;
  }
  return true;
}

}  // namespace

bool ComputeOffsets(bool, const char* outputFile, bool write, bool dxfFormat, double t, double d,
                    bool& finished, bool left, bool right) {
  Engine& g = Vd();
  OffsetState& o = Offs();
  PrepareDiagramForOffsets();
  bool newRequest = g.offsetNewRequest;
  if (o.lastGeneration != g.generation) {
    o.lastGeneration = g.generation;
    newRequest = true;
  }
  g.offsetNewRequest = false;
  bool ok = true;
  if (!newRequest) {
    if (!o.finished) {
      o.distance += o.step;
      if (o.distance >= g.maxOffset) o.finished = true;
    }
  } else {
    o.distance = t * g.scale;
    o.step = d * g.scale;
    o.failed = false;
    o.written = false;
    if (o.step <= kOffsetZero) o.step = g.maxOffset;
    if (o.distance >= g.maxOffset || o.distance <= kOffsetZero) {
      o.finished = true;
    } else if ((g.maxOffset - o.distance) / o.step > kMaxOffsetDistances) {
      // A step tiny beside the maximal offset would run for hours and fill
      // memory with curves: refuse the request rather than appear to hang.
      o.finished = true;
      ok = false;
    } else {
      o.finished = false;
      const bool both = !left && !right;
      InitializeEdgeData(left, right);
      if (both && g.isolatedPoints) AddIsolatedPointCircles(o.distance, o.step);
    }
  }
  while (!o.finished) {
    if (!SweepOnce()) {
      ok = false;
      o.finished = true;
      break;
    }
    o.distance += o.step;
    // With no edge left in the list, later distances would trace nothing.
    if (o.distance >= g.maxOffset || o.workList.count == 0) o.finished = true;
  }
  if (o.finished && !o.written) {
    o.written = true;
    if (write && outputFile && !WriteOffsetStore(outputFile, dxfFormat)) ok = false;
  }
  finished = o.finished;
  return ok;
}

}  // namespace zt::vd
