// zonetool dump [--points] FILE: a record file, or a bare file of float pairs
// (the scratch files), as text.
//
// Record files: each contour as lines "x y z" (the first three floats of each
// record, shortest round-trip form), contours separated by one blank line; a
// separator record (x above 99998) starts a new contour. Records of 12, 16 or
// 18 bytes (or longer) are read alike.
// --points: one line "x y" per pair; a pair with x >= 90000 prints as a blank
// line.
// A fault of the file ends the program as the record layer does (message on
// standard error naming file and record, exit status by kind).
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

#include "commands.hpp"
#include "driver/level_tables.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_stream.hpp"
#include "text_io.hpp"

namespace {

// Scratch files mark the boundary between two contours by x at or above this.
constexpr float kScratchSeparatorX = 90000.0f;

int dump_records(const char* path) {
  zt::RecordReader reader;
  if (!reader.open(path)) zt::record_stop(reader.fault());
  std::uint8_t head[zt::kPointXyzBytes];
  std::size_t length = 0;
  bool pending_blank = false;  // a contour ended; a blank line before the next point
  bool any = false;
  std::string out;
  for (;;) {
    const zt::ReadStatus s = reader.read(head, length);
    if (s == zt::ReadStatus::kEnd) break;
    if (s == zt::ReadStatus::kFault) {
      std::fwrite(out.data(), 1, out.size(), stdout);
      zt::record_stop(reader.fault());
    }
    if (length < zt::kPointXyzBytes) {
      std::fwrite(out.data(), 1, out.size(), stdout);
      zt::record_stop({zt::RecordFault::kShortRecord, path, reader.next_record() - 1,
                       std::to_string(length) + " bytes"});
    }
    float x = 0, y = 0, z = 0;
    zt::decode_xyz(head, x, y, z);
    if (x > zt::kDriverSeparatorX) {
      pending_blank = any;
      continue;
    }
    if (pending_blank) out += '\n';
    pending_blank = false;
    any = true;
    out += zonetool::format_number(x) + ' ' + zonetool::format_number(y) + ' ' +
           zonetool::format_number(z) + '\n';
    if (out.size() > (1u << 16)) {
      std::fwrite(out.data(), 1, out.size(), stdout);
      out.clear();
    }
  }
  std::fwrite(out.data(), 1, out.size(), stdout);
  return 0;
}

int dump_points(const char* path) {
  std::FILE* f = std::fopen(path, "rb");
  if (f == nullptr) {
    zt::record_stop({zt::RecordFault::kUnreadable, path, 0, std::strerror(errno)});
  }
  std::string out;
  std::int64_t pair = 0;
  float xy[2];
  std::size_t got = 0;
  while ((got = std::fread(xy, 1, sizeof xy, f)) == sizeof xy) {
    ++pair;
    if (xy[0] >= kScratchSeparatorX) {
      out += '\n';
    } else {
      out += zonetool::format_number(xy[0]) + ' ' + zonetool::format_number(xy[1]) + '\n';
    }
  }
  const bool error = std::ferror(f) != 0;
  std::fclose(f);
  std::fwrite(out.data(), 1, out.size(), stdout);
  if (error) zt::record_stop({zt::RecordFault::kUnreadable, path, pair + 1, "read error"});
  if (got != 0) {
    zt::record_stop({zt::RecordFault::kDamaged, path, pair + 1,
                     "file ends inside a pair (" + std::to_string(got) + " bytes)"});
  }
  return 0;
}

}  // namespace

int zonetool::cmd_dump(int argc, char** argv) {
  if (argc == 1 && std::strcmp(argv[0], "--points") != 0) return dump_records(argv[0]);
  if (argc == 2 && std::strcmp(argv[0], "--points") == 0) return dump_points(argv[1]);
  return usage_error("dump", "usage: zonetool dump [--points] FILE");
}
