// rg_boolean: the order of the stages of one Boolean operation.
#include "regions/boolean.hpp"

#include <cassert>

#include "regions/detail/engine.hpp"
#include "regions/detail/output_collector.hpp"

namespace zt {

namespace {

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

}  // namespace

int rg_boolean(const TaggedPointList& a, const TaggedPointList& b, const char* op, TaggedPointList* result) {
  using namespace detail;
  if (!result) return -1;
  if (!operand_is_sane(a) || !operand_is_sane(b)) return -1;
  const BoundingBox box = scan_bounding_box(a, b);
  // Without a counted point there is no normalisation, and nothing but
  // separators to read.
  if (box.count == 0) return -1;

  collector_set_tolerance(kDuplicateTolerance);
  BooleanEngine* engine = prepare_thread_engine();
  if (!engine) return -1;
  BooleanEngine& e = *engine;
  set_normalisation(e, box);
  if (size_grid(e.grid, box.count) != 0) return -1;
  if (read_operand(e, e.a, a, 1) != 0) return -1;
  if (read_operand(e, e.b, b, 2) != 0) return -1;

  if (find_intersections(e) != 0) return -1;
  if (build_half_edges(e, e.a) != 0 || build_half_edges(e, e.b) != 0) return -1;
  assert(overlay_is_consistent(e, false));

  KeepFlags keep{};
  if (!keep_flags_for(op, keep)) return -1;

  result->Clear();
  collector_reset(result, e.offsetX, e.offsetY, e.scaleX, e.scaleY);

  if (classify_stars(e, keep.aInsideB, keep.bInsideA) != 0) return -1;
  classify_whole_contours(e, e.a, e.b, keep.aInsideB);
  classify_whole_contours(e, e.b, e.a, keep.bInsideA);
  assert(overlay_is_consistent(e, true));
  return emit_result(e);
}

}  // namespace zt
