#include "drawing_input.hpp"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <functional>

#include "driver/level_tables.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_stream.hpp"
#include "text_io.hpp"

namespace zonetool {
namespace {

bool read_record_input(const std::string& path, DrawingInput& input) {
  input.single = true;
  zt::RecordReader reader;
  if (!reader.open(path)) zt::record_stop(reader.fault());
  std::uint8_t head[zt::kPointXyzBytes];
  std::size_t length = 0;
  DrawingContour* open = nullptr;
  for (;;) {
    const zt::ReadStatus s = reader.read(head, length);
    if (s == zt::ReadStatus::kEnd) break;
    if (s == zt::ReadStatus::kFault) zt::record_stop(reader.fault());
    const std::int64_t record = reader.next_record() - 1;
    if (length < zt::kPointXyzBytes) {
      zt::record_stop({zt::RecordFault::kShortRecord, path, record, std::to_string(length) + " bytes"});
    }
    float x = 0, y = 0, z = 0;
    zt::decode_xyz(head, x, y, z);
    if (!std::isfinite(x) || !std::isfinite(y) || !std::isfinite(z)) {
      zt::record_stop({zt::RecordFault::kNonFinite, path, record, "x, y or z"});
    }
    if (x > zt::kDriverSeparatorX) {
      open = nullptr;
      continue;
    }
    if (open == nullptr) {
      input.contours.push_back({true, z, true, {}});
      open = &input.contours.back();
    }
    open->points.push_back({x, y});
  }
  return true;
}

bool read_text_input(const std::string& path, DrawingInput& input, std::string& error) {
  std::ifstream in(path);
  std::vector<TextPolyline> lines;
  if (!read_polylines(in, lines, error)) {
    error = path + ": " + error;
    return false;
  }
  for (std::size_t k = 0; k < lines.size(); ++k) {
    DrawingContour c;
    for (const TextPoint& p : lines[k]) {
      if (p.size() != 2 && p.size() != 3) {
        error = path + ": polyline " + std::to_string(k + 1) + ": a point is not \"x y\" or \"x y z\"";
        return false;
      }
      if (c.points.empty()) {
        c.hasZ = p.size() == 3;
        c.z = c.hasZ ? p[2] : 0;
      }
      c.points.push_back({p[0], p[1]});
    }
    // Exact repetition: the text forms of the system write a closed
    // polyline's first point again, digit for digit.
    const TextPolyline& l = lines[k];
    c.closed = l.size() > 2 && l.front() == l.back();
    input.contours.push_back(std::move(c));
  }
  return true;
}

}  // namespace

bool read_drawing_input(const std::string& path, DrawingInput& input, std::string& error) {
  input.name = path;
  std::FILE* f = std::fopen(path.c_str(), "rb");
  if (f == nullptr) {
    error = "cannot open " + path;
    return false;
  }
  const int first = std::fgetc(f);
  std::fclose(f);
  if (first == zt::kRecordFileMarker) return read_record_input(path, input);
  return read_text_input(path, input, error);
}

std::vector<double> collect_levels(const std::vector<DrawingInput>& inputs) {
  std::vector<double> zs;
  for (const DrawingInput& in : inputs)
    for (const DrawingContour& c : in.contours)
      if (c.hasZ) zs.push_back(c.z);
  std::sort(zs.begin(), zs.end(), std::greater<>());
  std::vector<double> levels;
  for (double z : zs)
    if (levels.empty() || levels.back() - z > kDrawingLevelTolerance) levels.push_back(z);
  return levels;
}

bool on_level(const DrawingContour& c, double level) {
  return !c.hasZ || std::fabs(c.z - level) <= kDrawingLevelTolerance;
}

}  // namespace zonetool
