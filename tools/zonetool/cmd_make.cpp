// zonetool make OUT: writes the text read on standard input (contours of
// lines "x y z", a blank line between contours) as a record file of 18-byte
// point records, a separator record in front of every contour. Read back with
// zonetool dump, the text comes out unchanged (in its canonical form).
#include <cmath>
#include <iostream>
#include <string>
#include <vector>

#include "commands.hpp"
#include "driver/level_tables.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_stream.hpp"
#include "text_io.hpp"

int zonetool::cmd_make(int argc, char** argv) {
  if (argc != 1) return usage_error("make", "usage: zonetool make OUT < TEXT");
  std::vector<TextPolyline> contours;
  std::string error;
  if (!read_polylines(std::cin, contours, error)) return usage_error("make", error.c_str());

  // Check everything before the file is created, so bad text leaves no file.
  for (std::size_t c = 0; c < contours.size(); ++c) {
    for (std::size_t i = 0; i < contours[c].size(); ++i) {
      const TextPoint& p = contours[c][i];
      const std::string where = "contour " + std::to_string(c + 1) + ", point " + std::to_string(i + 1);
      if (p.size() != 3) return usage_error("make", (where + ": expected the three numbers x y z").c_str());
      for (double v : p) {
        if (!std::isfinite(static_cast<float>(v)))
          return usage_error("make", (where + ": value beyond single precision").c_str());
      }
      if (static_cast<float>(p[0]) > zt::kDriverSeparatorX)
        return usage_error("make", (where + ": x above 99998 would read as a separator").c_str());
    }
  }

  zt::RecordWriter writer;
  auto stop = [&writer] {
    const zt::RecordFaultInfo info = writer.fault();
    writer.abandon();
    zt::record_stop(info);
  };
  if (!writer.create(argv[0])) stop();
  const zt::PointRecord separator =
      zt::encode_point_record(zt::kSeparatorValue, zt::kSeparatorValue, zt::kSeparatorValue,
                              zt::kSeparatorCode, zt::kPointFlag);
  for (const TextPolyline& contour : contours) {
    if (!writer.write(separator)) stop();
    for (const TextPoint& p : contour) {
      const zt::PointRecord r =
          zt::encode_point_record(static_cast<float>(p[0]), static_cast<float>(p[1]),
                                  static_cast<float>(p[2]), zt::kPointCode, zt::kPointFlag);
      if (!writer.write(r)) stop();
    }
  }
  if (!writer.close()) stop();
  return 0;
}
