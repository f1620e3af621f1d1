// zonetool simplify --tolerance T: thins polylines read on standard input with
// simplify_polylines and writes them in the same text form.
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <string>

#include "commands.hpp"
#include "text_io.hpp"
#include "zone/simplify.hpp"

namespace {

constexpr const char* kName = "simplify";

bool parse_tolerance(const char* text, double& value) {
  char* end = nullptr;
  value = std::strtod(text, &end);
  return end != text && *end == '\0' && std::isfinite(value) && value >= 0.0;
}

}  // namespace

int zonetool::cmd_simplify(int argc, char** argv) {
  double tolerance = -1.0;
  for (int i = 0; i < argc; ++i) {
    if (std::strcmp(argv[i], "--tolerance") == 0 && i + 1 < argc) {
      if (!parse_tolerance(argv[++i], tolerance))
        return usage_error(kName, "the tolerance must be a finite number >= 0");
    } else {
      return usage_error(kName, "usage: zonetool simplify --tolerance T < polylines");
    }
  }
  if (tolerance < 0.0) return usage_error(kName, "usage: zonetool simplify --tolerance T < polylines");

  std::vector<TextPolyline> polylines;
  std::string error;
  if (!read_polylines(std::cin, polylines, error)) return usage_error(kName, error.c_str());

  zt::TaggedPointList in;
  for (size_t k = 0; k < polylines.size(); ++k) {
    in.Add(zt::TaggedPoint::separator());
    for (size_t j = 0; j < polylines[k].size(); ++j) {
      const TextPoint& p = polylines[k][j];
      if (p.size() != 2) {
        const std::string msg = "polyline " + std::to_string(k + 1) + " point " +
                                std::to_string(j + 1) + ": expected two numbers \"x y\"";
        return usage_error(kName, msg.c_str());
      }
      in.Add({1, p[0], p[1]});
    }
  }

  zt::TaggedPointList out;
  zt::simplify_polylines(in, out, tolerance);

  std::string text;
  bool first = true;
  for (const zt::TaggedPoint& p : out) {
    if (p.tag == zt::kSeparatorTag) {
      if (!first) text += '\n';
      first = false;
      continue;
    }
    text += format_number(p.x) + ' ' + format_number(p.y) + '\n';
  }
  std::fwrite(text.data(), 1, text.size(), stdout);
  return std::fflush(stdout) == 0 ? 0 : 1;
}
