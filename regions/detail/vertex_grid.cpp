// The vertex grid: a spatial hash on a 1/1000 grid of the normalised square
// that merges points closer than the engine tolerance into one vertex and
// marks the vertices met by both operands (or by a crossing) as shared.
#include <cmath>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

std::int32_t grid_bucket_count_for(std::int32_t pointCount) {
  std::int64_t m = pointCount / 10;
  if (m % 2 == 0) ++m;
  // The smallest odd number from there without an odd divisor up to its root.
  for (;; m += 2) {
    bool prime = true;
    for (std::int64_t d = 3; d * d <= m; d += 2) {
      if (m % d == 0) {
        prime = false;
        break;
      }
    }
    if (prime) break;
  }
  return m > kMinBuckets ? static_cast<std::int32_t>(m) : kMinBuckets;
}

int size_grid(VertexGrid& g, std::int32_t pointCount) {
  g.cell = kGridCell;
  g.originX = g.originY = 0.0 - g.cell;
  g.rowWidth = kGridRowWidth;
  const std::int32_t wanted = grid_bucket_count_for(pointCount);
  if (wanted > g.bucketCount) {
    delete[] g.buckets;
    g.buckets = nullptr;
    g.bucketCount = 0;
    if (!allocationAllowed()) return -1;
    g.buckets = new (std::nothrow) Vertex*[static_cast<std::size_t>(wanted)];
    if (!g.buckets) return -1;
    g.bucketCount = wanted;
  }
  for (std::int32_t i = 0; i < g.bucketCount; ++i) g.buckets[i] = nullptr;
  g.sharedHead = nullptr;
  if (!g.vertices) {
    if (!allocationAllowed()) return -1;
    g.vertices = new (std::nothrow) VertexPool();
    if (!g.vertices) return -1;
  } else {
    g.vertices->reset();
  }
  return 0;
}

std::int64_t grid_cell_index(double v, double origin, double cell) {
  double c = std::trunc((v - origin) / cell);
  if (std::isnan(c)) c = 0.0;
  if (c > kIndexClamp) c = kIndexClamp;
  if (c < -kIndexClamp) c = -kIndexClamp;
  return static_cast<std::int64_t>(c);
}

std::int32_t grid_bucket_of(const VertexGrid& g, std::int64_t row, std::int64_t column) {
  const std::int64_t key = row * g.rowWidth + column;
  std::int64_t r = key % g.bucketCount;
  if (r < 0) r += g.bucketCount;
  return static_cast<std::int32_t>(r);
}

Vertex* grid_lookup(VertexGrid& g, double x, double y, std::int32_t owner) {
  const std::int64_t c0 = grid_cell_index(x - g.eps, g.originX, g.cell);
  const std::int64_t c1 = grid_cell_index(x + g.eps, g.originX, g.cell);
  const std::int64_t r0 = grid_cell_index(y - g.eps, g.originY, g.cell);
  const std::int64_t r1 = grid_cell_index(y + g.eps, g.originY, g.cell);
  for (std::int64_t col = c0; col <= c1; ++col) {
    for (std::int64_t row = r0; row <= r1; ++row) {
      for (Vertex* v = g.buckets[grid_bucket_of(g, row, col)]; v; v = v->nextInBucket) {
        if (std::fabs(x - v->x) < g.eps && std::fabs(y - v->y) < g.eps) {
          if (v->owner != kSharedOwner && v->owner != owner) {
            v->owner = kSharedOwner;
            v->nextShared = g.sharedHead;
            g.sharedHead = v;
          }
          return v;
        }
      }
    }
  }
  Vertex* v = g.vertices->take();
  if (!v) return nullptr;
  *v = Vertex{};
  v->owner = owner;
  v->x = x;
  v->y = y;
  Vertex*& head = g.buckets[grid_bucket_of(g, grid_cell_index(y, g.originY, g.cell),
                                           grid_cell_index(x, g.originX, g.cell))];
  v->nextInBucket = head;
  head = v;
  if (owner == kSharedOwner) {
    v->nextShared = g.sharedHead;
    g.sharedHead = v;
  }
  return v;
}

}  // namespace zt::detail
