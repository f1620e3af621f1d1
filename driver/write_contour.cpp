// Writing a closed contour as point records (kept apart from the name-based
// operations so that writers of already opened units need no path expansion).
#include <cmath>

#include "driver/logical_units.hpp"
#include "driver/record_files.hpp"
#include "driver/record_stream.hpp"

namespace zt {

void write_contour(const std::int32_t& n, const Point2f* points, const float& z,
                   const std::int32_t& unit, std::int32_t& ierr) {
  ierr = -1;
  if (n < 1 || points == nullptr) return;
  const float dx = points[0].x - points[n - 1].x;
  const float dy = points[0].y - points[n - 1].y;
  if (std::sqrt(dx * dx + dy * dy) > kClosedTolerance) return;
  write_point_record(unit, kSeparatorValue, kSeparatorValue, kSeparatorValue, kSeparatorCode,
                     kPointFlag);
  for (std::int32_t i = 0; i < n; ++i) {
    write_point_record(unit, points[i].x, points[i].y, z, kPointCode, kPointFlag);
  }
  ierr = 0;
}

}  // namespace zt
