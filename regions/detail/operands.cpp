// Operand preparation: the bounding box of both operands, the normalisation
// into the unit square, snapping, and the reading of each operand's contours
// into its polygon set.
#include <cmath>
#include <initializer_list>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

bool is_separator_record(const TaggedPoint& p) {
  return p.tag == kSeparatorTag || p.x > kSeparatorThreshold || p.y > kSeparatorThreshold;
}

bool operand_is_sane(const TaggedPointList& list) {
  for (const TaggedPoint& p : list) {
    if (!std::isfinite(p.x) || !std::isfinite(p.y)) return false;
    if (std::fabs(p.x) > kMaxInputMagnitude || std::fabs(p.y) > kMaxInputMagnitude) return false;
  }
  return true;
}

BoundingBox scan_bounding_box(const TaggedPointList& a, const TaggedPointList& b) {
  BoundingBox box;
  for (const TaggedPointList* list : {&a, &b}) {
    for (const TaggedPoint& p : *list) {
      if (is_separator_record(p)) continue;
      if (p.x < box.minX) box.minX = p.x;
      if (p.x > box.maxX) box.maxX = p.x;
      if (p.y < box.minY) box.minY = p.y;
      if (p.y > box.maxY) box.maxY = p.y;
      ++box.count;
    }
  }
  return box;
}

void set_normalisation(BooleanEngine& e, const BoundingBox& box) {
  const double w = box.maxX - box.minX, h = box.maxY - box.minY;
  const double size = w > h ? w : h;
  // The margins keep every counted point strictly inside the unit square.
  e.offsetX = box.minX - 1.0;
  e.offsetY = box.minY - 1.0;
  e.scaleX = e.scaleY = size + 4.0;
}

double snap_coordinate(double v) {
  // Integer and fractional parts, both with the sign of v (inputs are at
  // most kMaxInputMagnitude, so the conversions are exact); the quantum is a
  // power of two, so the scaled fraction is exact too.
  const double whole = static_cast<double>(static_cast<std::int64_t>(v));
  const double steps = (v - whole) * (1.0 / kSnapQuantum);
  std::int64_t k = static_cast<std::int64_t>(steps);
  if (static_cast<double>(k) > steps) --k;  // floor
  return whole + static_cast<double>(k) * kSnapQuantum;
}

bool contour_append(BooleanEngine& e, InputContour& c, const TaggedPoint& p) {
  if (c.pointCount == c.capacity) {
    PointBlock* blk = e.freeBlocks;
    if (blk) {
      e.freeBlocks = blk->next;
    } else {
      if (!allocationAllowed()) return false;
      blk = new (std::nothrow) PointBlock;
      if (!blk) return false;
      blk->points = new (std::nothrow) TaggedPoint[kPointBlockSize];
      if (!blk->points) {
        delete blk;
        return false;
      }
    }
    blk->next = nullptr;
    blk->end = c.capacity + kPointBlockSize;
    if (c.currentBlock) {
      c.currentBlock->next = blk;
    } else {
      c.firstBlock = blk;
    }
    c.currentBlock = blk;
    c.capacity = blk->end;
  }
  c.currentBlock->points[c.pointCount - (c.capacity - kPointBlockSize)] = p;
  ++c.pointCount;
  return true;
}

int read_operand(BooleanEngine& e, PolygonSet& set, const TaggedPointList& list, std::int32_t owner) {
  reset_set(e, set);
  set.owner = owner;
  const std::int32_t n = list.count();
  std::int32_t i = 0;
  while (i < n) {
    // Only x tells contours apart here: a record with x at or above the
    // threshold cannot start a contour, one above it ends the contour.
    while (i < n && !(list[i].x < kSeparatorThreshold)) ++i;
    if (i >= n) break;
    const std::int32_t begin = i;
    while (i < n && !(list[i].x > kSeparatorThreshold)) ++i;
    std::int32_t end = i;
    if (i < n) ++i;

    // Trailing repetitions of the first point (within the tolerance, in
    // input units) close the contour and are dropped.
    bool closed = false;
    while (end > begin && std::fmax(std::fabs(list[end - 1].x - list[begin].x),
                                    std::fabs(list[end - 1].y - list[begin].y)) < kEngineEpsilon) {
      --end;
      closed = true;
    }
    if (end - begin < 2) continue;

    InputContour* c = set.contours.take();
    if (!c) return -1;
    *c = InputContour{};
    c->closed = closed ? 1 : 0;
    for (std::int32_t k = begin; k < end; ++k) {
      const TaggedPoint& p = list[k];
      const TaggedPoint stored(p.tag, (snap_coordinate(p.x) - e.offsetX) / e.scaleX,
                               (snap_coordinate(p.y) - e.offsetY) / e.scaleY);
      if (!contour_append(e, *c, stored)) return -1;
    }
  }
  return finish_set(e, set);
}

}  // namespace zt::detail
