// The OutputCollector's tag and duplicate rules.
#include "regions/detail/output_collector.hpp"

#include <cmath>

namespace zt::detail {

namespace {
thread_local OutputCollector tl_collector;
}

OutputCollector& thread_collector() { return tl_collector; }

void collector_reset(TaggedPointList* target, double offsetX, double offsetY, double scaleX, double scaleY) {
  OutputCollector& c = tl_collector;
  c.lastTag = kSeparatorTag;
  c.lastX = c.lastY = 0.0;
  c.target = target;
  c.offsetX = offsetX;
  c.offsetY = offsetY;
  c.scaleX = scaleX;
  c.scaleY = scaleY;
}

void collector_set_tolerance(double tolerance) { tl_collector.tolerance = tolerance; }

void emit_point(double x, double y, std::int32_t tag) {
  OutputCollector& c = tl_collector;
  TaggedPointList& out = *c.target;
  if (x < kMapBackLimit) {
    x = x * c.scaleX + c.offsetX;
    y = y * c.scaleY + c.offsetY;
  }
  const std::int32_t n = out.count();
  if (n > 0) {
    TaggedPoint& stored = out[n - 1];
    if (stored.tag != tag) {
      stored = TaggedPoint(c.lastTag, c.lastX, c.lastY);
      out.AddDoubling(TaggedPoint(tag, x, y));
      c.lastTag = tag, c.lastX = x, c.lastY = y;
      return;
    }
    c.lastTag = tag, c.lastX = x, c.lastY = y;
    if (std::fabs(x - stored.x) <= c.tolerance && std::fabs(y - stored.y) <= c.tolerance) return;
  }
  out.AddDoubling(TaggedPoint(tag, x, y));
  c.lastTag = tag, c.lastX = x, c.lastY = y;
}

}  // namespace zt::detail
