// write_zones: the final zones, top level first, as closed contours.
#include <cassert>
#include <vector>

#include "zone/assembly.hpp"
#include "zone/scratch_file.hpp"

namespace zt {

std::vector<std::pair<std::int32_t, std::int32_t>> split_runs(const Point2f* points,
                                                               std::int32_t n) {
  std::vector<std::pair<std::int32_t, std::int32_t>> runs;
  std::int32_t i = 0;
  for (;;) {
    while (i < n && points[i].x >= kWriteSeparatorX) ++i;
    if (i == n) return runs;
    const std::int32_t begin = i++;
    while (i < n && points[i].x <= kWriteSeparatorX) ++i;
    assert(i - begin >= 1 && points[begin].x < kWriteSeparatorX);
    runs.emplace_back(begin, i);
  }
}

std::int32_t write_zones(const std::int32_t& unit, const char* name, std::int32_t count,
                         const LevelRange* ranges, ContourWriter writeContour) {
  ScratchFile file;
  if (!writeContour || file.reopen(name) != 0) return -1;
  std::vector<Point2f> buffer;
  for (std::int32_t k = count - 1; k >= 0; --k) {
    const LevelRange& range = ranges[k];
    const std::int32_t n = range.last - range.first + 1;
    if (!range.hasPoints() || n <= 0) continue;
    buffer.assign(static_cast<std::size_t>(n) + 2, Point2f{});
    if (read_points(file, buffer.data(), n, std::int64_t{range.first} - 1) != 0) return -1;
    const float z = range.z;
    for (const auto& [begin, end] : split_runs(buffer.data(), n)) {
      const std::int32_t length = end - begin;
      if (length < kMinContourPoints) continue;
      Point2f* run = buffer.data() + begin;
      run[length - 1] = run[0];
      std::int32_t ierr = 0;
      writeContour(length, run, z, unit, ierr);
      if (ierr != 0) return -1;
    }
  }
  return file.close();
}

}  // namespace zt
