// rg_boolean: the order of the stages of one Boolean operation, the check of
// its result and the one retry on coarser coordinates.
#include "regions/boolean.hpp"

#include <cassert>
#include <cmath>
#include <initializer_list>

#include "regions/detail/engine.hpp"
#include "regions/detail/output_collector.hpp"

namespace zt {

namespace {

using namespace detail;

// Relative to the operands' extent, the collector's duplicate tolerance
// never exceeds this: 1e-7 would merge every point of a part a millionth of
// a millimetre wide.
inline constexpr double kRelativeDuplicateTolerance = 0x1p-24;

// Outcome of one attempt: done (0), failed for good (-1), or inconsistent
// and worth a retry on coarser coordinates.
inline constexpr int kInconsistent = -2;

struct KeepFlags {
  std::int32_t aInsideB;
  std::int32_t bInsideA;
};

bool keep_flags_for(const char* op, KeepFlags& flags) {
  switch (op ? op[0] : '\0') {
    case 'u':
    case 'U':
      flags = {0, 0};
      return true;
    case 'i':
    case 'I':
      flags = {1, 1};
      return true;
    case 'd':
    case 'D':
      flags = {0, 1};
      return true;
    default:
      return false;
  }
}

bool all_closed(const BooleanEngine& e) {
  for (const PolygonSet* set : {&e.a, &e.b})
    for (std::int32_t i = 0; i < set->contours.count(); ++i)
      if (!set->contours[i].closed) return false;
  return true;
}

// The cheap check of a result when both operands are closed contours only:
// every result contour must close on its first point (a chain that stops
// short means the overlay's pieces did not fit together). Contours of fewer
// than three distinct points bound nothing (two sides of a sliver the
// collector merged into one) and are dropped.
bool close_result(TaggedPointList& out) {
  std::int32_t write = 0, first = -1, distinct = 0;
  for (std::int32_t i = 0; i < out.count(); ++i) {
    const TaggedPoint p = out[i];
    if (p.tag != kSeparatorTag) {
      if (first < 0) {
        first = write;
        distinct = 1;
      } else if (p.x != out[write - 1].x || p.y != out[write - 1].y) {
        ++distinct;
      }
      out[write++] = p;
      continue;
    }
    if (first < 0) continue;
    const TaggedPoint& q = out[first];
    const TaggedPoint& r = out[write - 1];
    if (q.x != r.x || q.y != r.y) return false;
    if (distinct < 4) {
      write = first;  // a closed contour of at most two distinct points
    } else {
      out[write++] = p;
    }
    first = -1;
  }
  if (first >= 0) return false;
  out.SetCount(write);
  return true;
}

// Union and intersection contours have the result on their left, so their
// signed areas add up to the result's area, which is never negative; a sum
// below minus this fraction of the operands' squared extent means a chain
// ran the wrong way round (a misread status at some vertex).
inline constexpr double kNegativeAreaTolerance = 0x1p-30;

double signed_area_sum(const TaggedPointList& out) {
  double sum = 0.0;
  std::int32_t first = -1;
  for (std::int32_t i = 0; i < out.count(); ++i) {
    if (out[i].tag == kSeparatorTag) {
      first = -1;
      continue;
    }
    if (first < 0) {
      first = i;
      continue;
    }
    const TaggedPoint& o = out[first];
    const TaggedPoint& p = out[i - 1];
    const TaggedPoint& q = out[i];
    sum += 0.5 * ((p.x - o.x) * (q.y - o.y) - (q.x - o.x) * (p.y - o.y));
  }
  return sum;
}

// An operand that is an empty region: the result is the other operand's
// contours as read, or nothing.
void emit_with_empty_operand(BooleanEngine& e, bool aEmpty, bool bEmpty, const KeepFlags& keep) {
  const bool keepA = !aEmpty && keep.aInsideB == 0;                 // union, difference
  const bool keepB = !bEmpty && keep.aInsideB == 0 && keep.bInsideA == 0;  // union
  if (keepA) emit_whole_contours(e, e.a);
  if (keepB) emit_whole_contours(e, e.b);
}

int attempt(const TaggedPointList& a, const TaggedPointList& b, const char* op, TaggedPointList& out,
            const BoundingBox& box, bool coarseGrid) {
  BooleanEngine* engine = prepare_thread_engine();
  if (!engine) return -1;
  BooleanEngine& e = *engine;
  set_normalisation(e, box);
  const double size = e.scaleX - 4.0;
  collector_set_tolerance(std::fmin(kDuplicateTolerance, size * kRelativeDuplicateTolerance));
  if (size_grid(e.grid, box.count) != 0) return -1;
  const int readA = read_operand(e, e.a, a, 1, coarseGrid);
  if (readA < 0) return -1;
  const int readB = read_operand(e, e.b, b, 2, coarseGrid);
  if (readB < 0) return -1;
  KeepFlags keep{};
  if (readA == kEmptyOperand || readB == kEmptyOperand) {
    if (!keep_flags_for(op, keep)) return -1;
    out.Clear();
    collector_reset(&out, e.offsetX, e.offsetY, e.scaleX, e.scaleY);
    emit_with_empty_operand(e, readA == kEmptyOperand, readB == kEmptyOperand, keep);
    return 0;
  }

  if (find_intersections(e) != 0) return -1;
  if (build_half_edges(e, e.a) != 0 || build_half_edges(e, e.b) != 0) return -1;
  assert(overlay_is_consistent(e, false));

  if (!keep_flags_for(op, keep)) return -1;

  out.Clear();
  collector_reset(&out, e.offsetX, e.offsetY, e.scaleX, e.scaleY);

  if (classify_stars(e, keep.aInsideB, keep.bInsideA) != 0) return kInconsistent;
  const bool resultOnLeft = keep.aInsideB == keep.bInsideA;
  classify_whole_contours(e, e.a, e.b, keep.aInsideB, resultOnLeft);
  classify_whole_contours(e, e.b, e.a, keep.bInsideA, resultOnLeft);
  assert(overlay_is_consistent(e, true));
  // A difference's contours follow the pieces they start from; union and
  // intersection start each contour where the result lies on its left.
  if (emit_result(e, resultOnLeft) != 0) return kInconsistent;
  if (!all_closed(e)) return 0;
  if (!close_result(out)) return kInconsistent;
  const double extent = std::fmax(box.maxX - box.minX, box.maxY - box.minY);
  if (resultOnLeft && signed_area_sum(out) < -kNegativeAreaTolerance * extent * extent) return kInconsistent;
  return 0;
}

}  // namespace

int rg_boolean(const TaggedPointList& a, const TaggedPointList& b, const char* op, TaggedPointList* result) {
  if (!result) return -1;
  if (!operand_is_sane(a) || !operand_is_sane(b)) return -1;
  const BoundingBox box = scan_bounding_box(a, b);
  // Without a counted point there is no normalisation, and nothing but
  // separators to read.
  if (box.count == 0) return -1;
  // The operands are read again by the retry, so a result written over one
  // of them goes through the engine's own list.
  const bool aliased = result == &a || result == &b;
  BooleanEngine* engine = thread_engine();
  if (!engine) return -1;
  TaggedPointList& out = aliased ? engine->output : *result;
  int rc = attempt(a, b, op, out, box, false);
  const bool touched = rc != -1;
  if (rc == 0 && tl_firstAttemptInconsistent) rc = kInconsistent;
  if (rc == kInconsistent) rc = attempt(a, b, op, out, box, true);
  if (rc != 0) {
    // Never a partial result: once the result was cleared, a failure leaves
    // it empty.
    if (touched) result->Clear();
    return -1;
  }
  if (aliased) {
    result->Clear();
    for (const TaggedPoint& p : engine->output) result->AddDoubling(p);
  }
  return 0;
}

}  // namespace zt
