// The per-thread engine: created on the first operation of a thread, reset at
// the start of every later one, its storage kept until the thread ends.
#include <memory>
#include <new>

#include "regions/detail/engine.hpp"
#include "regions/detail/geometry.hpp"

namespace zt::detail {

BooleanEngine::BooleanEngine() {
  a.owner = 1;
  b.owner = 2;
  probe.intersect = &segment_intersection;
  probe.cross = &ray_crossing;
  probe.grid = &grid;
  probe.splits = &splits;
  probe.eps = eps;
  grid.eps = eps;
}

BooleanEngine::~BooleanEngine() {
  delete[] points;
  delete grid.vertices;
  delete[] grid.buckets;
  delete[] treeBoxes;
  delete[] splitScratch;
  delete[] pointScratch;
  delete[] pending;
  delete[] overlaps;
}

void reset_set(BooleanEngine&, PolygonSet& set) {
  set.contours.reset();
  set.root = nullptr;
  set.firstBox = 0;
  set.lastBox = -1;
  set.rows.built = set.rows.refused = false;
  set.rows.treeRays = 0;
}

namespace {

// Frees the engine when its thread ends; the engine itself lives as long as
// the thread, as every operation of the thread reuses its storage.
struct ThreadEngineHolder {
  std::unique_ptr<BooleanEngine> engine;
};
thread_local ThreadEngineHolder tl_engine;

}  // namespace

BooleanEngine* last_thread_engine() { return tl_engine.engine.get(); }

BooleanEngine* thread_engine() {
  if (!tl_engine.engine) {
    if (!allocationAllowed()) return nullptr;
    tl_engine.engine.reset(new (std::nothrow) BooleanEngine());
  }
  return tl_engine.engine.get();
}

BooleanEngine* prepare_thread_engine() {
  if (!tl_engine.engine) return thread_engine();
  BooleanEngine& e = *tl_engine.engine;
  reset_set(e, e.a);
  reset_set(e, e.b);
  e.pointCount = 0;
  e.runCount = 0;
  e.edges.reset();
  e.boxes.reset();
  e.nodes.reset();
  e.halves.reset();
  e.splits.reset();
  e.stars.reset();
  clear_grid(e.grid);
  return &e;
}

}  // namespace zt::detail
