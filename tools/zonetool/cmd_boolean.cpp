// zonetool boolean A B OP: union (u), intersection (i) or difference (d) of
// the regions of two text files of contours, written to standard output.
#include <cstdio>
#include <fstream>
#include <iostream>
#include <string>
#include <vector>

#include "commands.hpp"
#include "regions/boolean.hpp"
#include "text_io.hpp"

namespace {

// Reads "x y [tag]" contours into a list, each contour ended by a separator.
bool read_operand(const char* path, zt::TaggedPointList& list, std::string& error) {
  std::ifstream in(path);
  if (!in) {
    error = std::string("cannot open ") + path;
    return false;
  }
  std::vector<zonetool::TextPolyline> polylines;
  if (!zonetool::read_polylines(in, polylines, error)) {
    error = std::string(path) + ": " + error;
    return false;
  }
  for (const zonetool::TextPolyline& pl : polylines) {
    for (const zonetool::TextPoint& p : pl) {
      if (p.size() < 2 || p.size() > 3) {
        error = std::string(path) + ": a point is \"x y [tag]\"";
        return false;
      }
      const double tag = p.size() == 3 ? p[2] : 0.0;
      if (tag != static_cast<double>(static_cast<std::int32_t>(tag)) || tag < -2147483648.0 ||
          tag > 2147483647.0) {
        error = std::string(path) + ": a tag is a 32-bit integer";
        return false;
      }
      list.AddDoubling(zt::TaggedPoint(static_cast<std::int32_t>(tag), p[0], p[1]));
    }
    list.AddDoubling(zt::TaggedPoint::separator());
  }
  return true;
}

}  // namespace

int zonetool::cmd_boolean(int argc, char** argv) {
  if (argc != 3) return usage_error("boolean", "usage: zonetool boolean A B u|i|d");
  const std::string op = argv[2];
  if (op != "u" && op != "i" && op != "d") return usage_error("boolean", "OP is u, i or d");
  zt::TaggedPointList a, b, result;
  std::string error;
  if (!read_operand(argv[0], a, error) || !read_operand(argv[1], b, error))
    return usage_error("boolean", error.c_str());
  if (zt::rg_boolean(a, b, op.c_str(), &result) != 0) {
    std::fputs("boolean operation failed\n", stderr);
    return 1;
  }
  std::string out;
  for (const zt::TaggedPoint& p : result) {
    if (p.tag == zt::kSeparatorTag) {
      out += '\n';
      continue;
    }
    out += format_number(p.x) + ' ' + format_number(p.y) + ' ' + std::to_string(p.tag) + '\n';
  }
  std::fwrite(out.data(), 1, out.size(), stdout);
  return 0;
}
