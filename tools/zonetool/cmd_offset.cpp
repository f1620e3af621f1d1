// zonetool offset FILE --distance T --side 1|2|3 [--raw]: offsets the
// contours of a text file through SlopeDomain::compute, exactly as the zone
// builder does, and prints the collected curves (or, with --raw, the
// engine's offset store).
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>

#include "commands.hpp"
#include "text_io.hpp"
#include "voronoi/engine.hpp"
#include "zone/level_zone.hpp"
#include "zone/slope_domain.hpp"

namespace {

constexpr const char* kName = "offset";
constexpr const char* kUsage = "usage: zonetool offset FILE --distance T --side 1|2|3 [--raw]";
// The curves come back in the list that held the contours, one Add a point:
// a small growth step would copy the whole list every few points of a large
// output.
constexpr std::int32_t kListGrowth = 1 << 16;

bool parse_distance(const char* text, double& value) {
  char* end = nullptr;
  value = std::strtod(text, &end);
  return end != text && *end == '\0' && std::isfinite(value) && value > 0.0;
}

// The offset store as the engine holds it, in user coordinates.
std::string raw_store() {
  using zonetool::format_number;
  std::string text;
  for (std::int32_t i = 0; i < zt::GetNumOffsetCurves(); ++i) {
    double offset = 0.0;
    std::int32_t first = 0, last = -1;
    zt::GetOffsetCurve(i, offset, first, last);
    text += "curve " + format_number(offset) + '\n';
    for (std::int32_t k = first; k <= last; ++k) {
      std::int32_t kind = 0, site = 0, tag = 0;
      double x = 0.0, y = 0.0, ux = 0.0, uy = 0.0;
      zt::GetOffsetElement(k, kind, site, x, y, tag);
      zt::ToUserCoordinates({x, y}, ux, uy);
      text += std::to_string(kind) + ' ' + std::to_string(site) + ' ' + format_number(ux) + ' ' +
              format_number(uy) + '\n';
    }
  }
  return text;
}

// The collected list: curves between separators, one blank line between.
std::string curves(const zt::TaggedPointList& list) {
  using zonetool::format_number;
  std::string text;
  bool open = false, any = false;
  for (const zt::TaggedPoint& p : list) {
    if (p.tag == zt::kSeparatorTag) {
      open = false;
      continue;
    }
    if (!open && any) text += '\n';
    open = any = true;
    text += format_number(p.x) + ' ' + format_number(p.y) + '\n';
  }
  return text;
}

}  // namespace

int zonetool::cmd_offset(int argc, char** argv) {
  const char* path = nullptr;
  double distance = -1.0;
  long side = 0;
  bool raw = false;
  for (int i = 0; i < argc; ++i) {
    if (std::strcmp(argv[i], "--distance") == 0 && i + 1 < argc) {
      if (!parse_distance(argv[++i], distance)) return usage_error(kName, "the distance must be a finite number > 0");
    } else if (std::strcmp(argv[i], "--side") == 0 && i + 1 < argc) {
      const char* s = argv[++i];
      if (std::strlen(s) != 1 || s[0] < '1' || s[0] > '3') return usage_error(kName, "the side is 1, 2 or 3");
      side = s[0] - '0';
    } else if (std::strcmp(argv[i], "--raw") == 0) {
      raw = true;
    } else if (argv[i][0] != '-' && !path) {
      path = argv[i];
    } else {
      return usage_error(kName, kUsage);
    }
  }
  if (!path || distance < 0.0 || side == 0) return usage_error(kName, kUsage);

  std::ifstream file(path);
  if (!file) return usage_error(kName, (std::string("cannot read ") + path).c_str());
  std::vector<TextPolyline> polylines;
  std::string error;
  if (!read_polylines(file, polylines, error)) return usage_error(kName, (std::string(path) + ": " + error).c_str());

  zt::TaggedPointList list{0, kListGrowth};
  for (std::size_t k = 0; k < polylines.size(); ++k) {
    for (std::size_t j = 0; j < polylines[k].size(); ++j) {
      const TextPoint& p = polylines[k][j];
      if (p.size() != 2) {
        const std::string msg = std::string(path) + ": contour " + std::to_string(k + 1) + " point " +
                                std::to_string(j + 1) + ": expected two numbers \"x y\"";
        return usage_error(kName, msg.c_str());
      }
      list.AddDoubling({zt::kRestPointTag, p[0], p[1]});
    }
    list.AddDoubling(zt::TaggedPoint::separator());
  }

  zt::VD_Initialize();
  zt::SlopeDomain domain(distance);
  if (domain.compute(list, static_cast<std::int32_t>(side)) != 0) {
    std::fputs("zonetool offset: the engine could not compute the diagram or the offsets\n", stderr);
    return 1;
  }
  const std::string text = raw ? raw_store() : curves(list);
  std::fwrite(text.data(), 1, text.size(), stdout);
  return std::fflush(stdout) == 0 ? 0 : 1;
}
