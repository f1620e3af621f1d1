// Point types shared by the zone builder and the geometry engines.
//
// Contours travel between stages as a TaggedPointList: polylines one after
// another, each ended by a separator record. Writers put kSeparatorCoord in
// both coordinates of a separator and kSeparatorTag in its tag; readers
// recognise one by x alone, each with its own threshold (stated where used).
#pragma once

#include <cstdint>
#include <limits>

#include "core/array_impl.hpp"

namespace zt {

// Tag of a separator record in a TaggedPointList.
inline constexpr std::int32_t kSeparatorTag = -100000000;
// Coordinates written into separator records (files, buffers, lists).
inline constexpr double kSeparatorCoord = 99999.0;

struct TaggedPoint {
  std::int32_t tag = -1;
  double x = 0.0;
  double y = 0.0;

  TaggedPoint() = default;
  TaggedPoint(std::int32_t t, double px, double py) : tag(t), x(px), y(py) {}
  TaggedPoint(const TaggedPoint&) = default;
  TaggedPoint& operator=(const TaggedPoint&) = default;
  // A destroyed point reads as a fresh one: stale storage never looks like data.
  ~TaggedPoint() {
    tag = -1;
    x = 0.0;
    y = 0.0;
  }

  static TaggedPoint separator() { return {kSeparatorTag, kSeparatorCoord, kSeparatorCoord}; }
};

struct Point2d {
  double x = 0.0;
  double y = 0.0;
};

struct Point2f {
  float x = 0.0f;
  float y = 0.0f;
};

using TaggedPointList = Array<TaggedPoint>;

// Makes room for `extra` more elements, at least doubling the storage when
// it grows: lists filled element by element (growth steps of a hundred)
// would otherwise copy themselves over and over on large levels.
template <typename T>
void make_room(Array<T>& list, std::int32_t extra) {
  const std::int64_t wanted = std::int64_t{list.count()} + extra;
  if (wanted <= list.capacity()) return;
  const std::int64_t doubled = 2 * std::int64_t{list.capacity()};
  const std::int64_t size = wanted > doubled ? wanted : doubled;
  list.SetCapacity(size > std::numeric_limits<std::int32_t>::max() ? std::numeric_limits<std::int32_t>::max()
                                                                   : static_cast<std::int32_t>(size));
}

}  // namespace zt
