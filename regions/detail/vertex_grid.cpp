// The vertex grid: merges points closer than the engine tolerance into one
// vertex and marks the vertices met by both operands (or by a crossing) as
// shared. Candidates are found through a hash of fine cells; the choice
// among several candidates follows the 1/1000 grid's scan order (see
// VertexGrid), so the result does not depend on the fine cells, which are
// made finer as the data asks (never by the joint box alone).
#include <algorithm>
#include <cmath>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

std::int32_t grid_bucket_count_for(std::int32_t pointCount) {
  std::int64_t n = kMinFineBuckets;
  while (n < pointCount && n < (std::int64_t{1} << 30)) n *= 2;
  return static_cast<std::int32_t>(n);
}

void clear_grid(VertexGrid& g) {
  for (std::int32_t i = 0; g.buckets && i <= g.bucketMask; ++i) g.buckets[i] = nullptr;
  g.sharedHead = nullptr;
  if (g.vertices) g.vertices->reset();
}

int size_grid(VertexGrid& g, std::int32_t pointCount) {
  g.cell = kGridCell;
  g.originX = g.originY = 0.0 - g.cell;
  g.fineShift = kCoarsestFineShift;
  g.fineScale = std::ldexp(1.0, g.fineShift);
  g.visits = 0;
  const std::int32_t wanted = grid_bucket_count_for(pointCount);
  if (!g.buckets || wanted > g.bucketMask + 1) {
    delete[] g.buckets;
    g.buckets = nullptr;
    g.bucketMask = 0;
    if (!allocationAllowed()) return -1;
    g.buckets = new (std::nothrow) Vertex*[static_cast<std::size_t>(wanted)];
    if (!g.buckets) return -1;
    g.bucketMask = wanted - 1;
  }
  if (!g.vertices) {
    if (!allocationAllowed()) return -1;
    g.vertices = new (std::nothrow) VertexPool();
    if (!g.vertices) return -1;
  }
  clear_grid(g);
  return 0;
}

std::int64_t grid_visit_count(const VertexGrid& g) { return g.visits; }

std::int64_t grid_cell_index(double v, double origin, double cell) {
  double c = std::trunc((v - origin) / cell);
  if (std::isnan(c)) c = 0.0;
  if (c > kIndexClamp) c = kIndexClamp;
  if (c < -kIndexClamp) c = -kIndexClamp;
  return static_cast<std::int64_t>(c);
}

std::int32_t grid_bucket_of(const VertexGrid& g, std::int64_t row, std::int64_t column) {
  // Square tiles of cells, each laid contiguously in the table at an offset
  // hashed from the tile; unsigned arithmetic, so negative cells (points read
  // outside the square) wrap like any other. The hash spreads every bit of
  // the tile, so tiles a table's length apart do not share buckets.
  const std::uint64_t tile = (std::uint64_t{1} << kFineTileBits) - 1;
  const std::uint64_t r = static_cast<std::uint64_t>(row), c = static_cast<std::uint64_t>(column);
  std::uint64_t h = (r >> kFineTileBits) * 0x9E3779B97F4A7C15u + (c >> kFineTileBits);
  h ^= h >> 31;
  h *= 0xBF58476D1CE4E5B9u;
  h ^= h >> 29;
  const std::uint64_t key = ((r & tile) << kFineTileBits | (c & tile)) + h;
  return static_cast<std::int32_t>(key & static_cast<std::uint64_t>(g.bucketMask));
}

namespace {

// Fine cell of a coordinate (the scale is a power of two, so the product is
// exact), clamped to kFineIndexClamp; truncation by the conversion.
std::int64_t fine_index(double v, double scale) {
  double c = v * scale;
  if (!(c > -kFineIndexClamp)) c = std::isnan(c) ? 0.0 : -kFineIndexClamp;
  if (c > kFineIndexClamp) c = kFineIndexClamp;
  return static_cast<std::int64_t>(c);
}

void link_into_bucket(VertexGrid& g, Vertex* v) {
  Vertex*& head = g.buckets[grid_bucket_of(g, fine_index(v->y, g.fineScale), fine_index(v->x, g.fineScale))];
  v->nextInBucket = head;
  head = v;
}

// After a lookup that walked `visited` vertices: finer cells when that was
// too many, a larger table when the vertices (crossings included) outgrow
// it; then every vertex is linked anew, oldest first, so that each chain
// still runs from its most recent vertex.
void adapt_grid(VertexGrid& g, std::int32_t visited) {
  bool changed = false;
  if (visited > kMaxLookupVisits && g.fineShift < kFinestFineShift) {
    g.fineShift = std::min(g.fineShift + kFineShiftStep, kFinestFineShift);
    g.fineScale = std::ldexp(1.0, g.fineShift);
    changed = true;
  }
  const std::int32_t n = g.vertices->count();
  if (n / 2 > g.bucketMask && allocationAllowed()) {
    const std::int32_t wanted = grid_bucket_count_for(n);
    if (Vertex** table = new (std::nothrow) Vertex*[static_cast<std::size_t>(wanted)]) {
      delete[] g.buckets;
      g.buckets = table;
      g.bucketMask = wanted - 1;
      changed = true;
    }
  }
  if (!changed) return;
  for (std::int32_t i = 0; i <= g.bucketMask; ++i) g.buckets[i] = nullptr;
  for (std::int32_t i = 0; i < n; ++i) link_into_bucket(g, &(*g.vertices)[i]);
}

void make_shared(VertexGrid& g, Vertex* v) {
  v->owner = kSharedOwner;
  v->nextShared = g.sharedHead;
  g.sharedHead = v;
}

}  // namespace

void grid_share(VertexGrid& g, Vertex* v) {
  if (v->owner != kSharedOwner) make_shared(g, v);
}

void grid_prefetch(const VertexGrid& g, double x, double y, bool head) {
  Vertex* const* bucket = &g.buckets[grid_bucket_of(g, fine_index(y, g.fineScale), fine_index(x, g.fineScale))];
  if (!head) {
    __builtin_prefetch(bucket);
  } else if (const Vertex* v = *bucket) {
    __builtin_prefetch(v);
  }
}

Vertex* grid_lookup(VertexGrid& g, double x, double y, std::int32_t owner) {
  const double s = g.fineScale;
  const std::int64_t f0 = fine_index(x - g.eps, s), f1 = fine_index(x + g.eps, s);
  const std::int64_t q0 = fine_index(y - g.eps, s), q1 = fine_index(y + g.eps, s);
  Vertex* best = nullptr;
  std::int64_t bestRank = 0;
  std::int64_t c0 = 0, r0 = 0, rows = 0;
  std::int32_t visited = 0;
  for (std::int64_t col = f0; col <= f1; ++col) {
    for (std::int64_t row = q0; row <= q1; ++row) {
      for (Vertex* v = g.buckets[grid_bucket_of(g, row, col)]; v; v = v->nextInBucket) {
        ++visited;
        if (!(std::fabs(x - v->x) < g.eps && std::fabs(y - v->y) < g.eps)) continue;
        if (!best) {
          c0 = grid_cell_index(x - g.eps, g.originX, g.cell);
          r0 = grid_cell_index(y - g.eps, g.originY, g.cell);
          rows = grid_cell_index(y + g.eps, g.originY, g.cell) - r0 + 1;
        }
        // Position of the vertex's 1/1000 cell in the scan, column-major.
        const std::int64_t rank = (grid_cell_index(v->x, g.originX, g.cell) - c0) * rows +
                                  (grid_cell_index(v->y, g.originY, g.cell) - r0);
        if (!best || rank < bestRank || (rank == bestRank && v->serial > best->serial)) {
          best = v;
          bestRank = rank;
        }
      }
    }
  }
  g.visits += visited;
  if (best) {
    if (best->owner != kSharedOwner && best->owner != owner) make_shared(g, best);
    if (visited > kMaxLookupVisits) adapt_grid(g, visited);
    return best;
  }
  const std::int32_t serial = g.vertices->count();
  Vertex* v = g.vertices->take();
  if (!v) return nullptr;
  *v = Vertex{};
  v->owner = owner;
  v->x = x;
  v->y = y;
  v->serial = serial;
  link_into_bucket(g, v);
  if (owner == kSharedOwner) {
    v->nextShared = g.sharedHead;
    g.sharedHead = v;
  }
  if (visited > kMaxLookupVisits || serial / 2 >= g.bucketMask) adapt_grid(g, visited);
  return v;
}

}  // namespace zt::detail
