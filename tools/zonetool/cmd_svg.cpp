// zonetool svg IN... -o OUT.svg [--level Z]: draws record files and text
// polygon files as one SVG picture.
//
// Each input gets one colour and a line in the legend. The contours are
// grouped by level (z within kDrawingLevelTolerance, as the program groups them),
// one panel per level from the top down, or only the panel of --level Z.
// Every panel has the same scale, equal in x and y, and its z in its title.
// The contours of one input on one level form one path filled with the
// even-odd rule, so islands and holes show as holes.
// Contours without a level (text points "x y") are drawn in every panel;
// the inputs are read as drawing_input.hpp says.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "commands.hpp"
#include "drawing_input.hpp"
#include "text_io.hpp"

namespace {

// Drawing size of the widest extent of the drawing, in pixels.
constexpr double kPanelWidth = 420;
constexpr double kPanelMargin = 12;
constexpr double kTitleHeight = 22;
constexpr double kLegendLine = 20;
constexpr int kMaxColumns = 4;
const char* const kPalette[] = {"#1f77b4", "#ff7f0e", "#2ca02c", "#d62728",
                                "#9467bd", "#8c564b", "#e377c2", "#7f7f7f"};

using zonetool::DrawingContour;
using zonetool::DrawingInput;
using zonetool::DrawingPoint;
using zonetool::on_level;

std::string escape_xml(const std::string& s) {
  std::string out;
  for (char ch : s) {
    switch (ch) {
      case '&': out += "&amp;"; break;
      case '<': out += "&lt;"; break;
      case '>': out += "&gt;"; break;
      case '"': out += "&quot;"; break;
      default: out += ch;
    }
  }
  return out;
}

std::string px(double v) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%.2f", v);
  return buf;
}

struct Box {
  double x0 = std::numeric_limits<double>::infinity(), y0 = x0;
  double x1 = -std::numeric_limits<double>::infinity(), y1 = x1;
  bool empty() const { return !(x0 <= x1); }
  void add(const DrawingPoint& p) {
    x0 = std::min(x0, p.x), y0 = std::min(y0, p.y);
    x1 = std::max(x1, p.x), y1 = std::max(y1, p.y);
  }
};

// Drawing coordinates of one panel: the same scale for every panel.
struct Frame {
  Box box;
  double scale = 1, width = kPanelWidth, height = kPanelWidth;

  explicit Frame(const Box& b) : box(b) {
    if (box.empty()) box = Box{0, 0, 1, 1};
    const double w = std::max(box.x1 - box.x0, 1e-9), h = std::max(box.y1 - box.y0, 1e-9);
    scale = kPanelWidth / std::max(w, h);
    width = w * scale;
    height = h * scale;
  }
  double X(double x) const { return (x - box.x0) * scale; }
  double Y(double y) const { return (box.y1 - y) * scale; }
};

std::string panel_title(bool hasLevel, double z) {
  if (!hasLevel) return "no z";
  return "z = " + zonetool::format_number(z);
}

std::string draw(const std::vector<DrawingInput>& inputs, const std::vector<double>& panels, bool levelled) {
  Box box;
  for (const DrawingInput& in : inputs)
    for (const DrawingContour& c : in.contours) {
      bool shown = !levelled || !c.hasZ;
      for (double z : panels) shown = shown || on_level(c, z);
      if (shown)
        for (const DrawingPoint& p : c.points) box.add(p);
    }
  const Frame frame(box);
  const std::size_t count = std::max<std::size_t>(panels.size(), 1);
  const int columns = static_cast<int>(std::min<std::size_t>(count, kMaxColumns));
  const int rows = static_cast<int>((count + columns - 1) / columns);
  const double cellW = frame.width + 2 * kPanelMargin;
  const double cellH = frame.height + 2 * kPanelMargin + kTitleHeight;
  const double legendH = kLegendLine * static_cast<double>(inputs.size()) + kPanelMargin;
  const double totalW = std::max(cellW * columns, 300.0);
  const double totalH = legendH + cellH * rows;

  std::string svg = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";
  svg += "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" + px(totalW) + "\" height=\"" + px(totalH) +
         "\" viewBox=\"0 0 " + px(totalW) + " " + px(totalH) + "\" font-family=\"sans-serif\" font-size=\"13\">\n";
  svg += "<rect width=\"100%\" height=\"100%\" fill=\"white\"/>\n";
  for (std::size_t i = 0; i < inputs.size(); ++i) {
    const double y = kPanelMargin + kLegendLine * static_cast<double>(i);
    const char* colour = kPalette[i % std::size(kPalette)];
    svg += "<rect x=\"" + px(kPanelMargin) + "\" y=\"" + px(y) + "\" width=\"14\" height=\"14\" fill=\"" + colour +
           "\" fill-opacity=\"0.45\" stroke=\"" + colour + "\"/>";
    svg += "<text x=\"" + px(kPanelMargin + 22) + "\" y=\"" + px(y + 12) + "\">" + escape_xml(inputs[i].name) +
           "</text>\n";
  }
  for (std::size_t p = 0; p < count; ++p) {
    const double ox = cellW * static_cast<double>(p % columns) + kPanelMargin;
    const double oy = legendH + cellH * static_cast<double>(p / columns);
    const bool hasLevel = levelled && p < panels.size();
    const double z = hasLevel ? panels[p] : 0;
    svg += "<g transform=\"translate(" + px(ox) + "," + px(oy) + ")\">\n";
    svg += "<text x=\"0\" y=\"15\" font-weight=\"bold\">" + escape_xml(panel_title(hasLevel, z)) + "</text>\n";
    svg += "<rect x=\"0\" y=\"" + px(kTitleHeight) + "\" width=\"" + px(frame.width) + "\" height=\"" +
           px(frame.height) + "\" fill=\"none\" stroke=\"#cccccc\"/>\n";
    for (std::size_t i = 0; i < inputs.size(); ++i) {
      std::string d;
      for (const DrawingContour& c : inputs[i].contours) {
        if (c.points.empty() || (hasLevel && !on_level(c, z))) continue;
        for (std::size_t k = 0; k < c.points.size(); ++k) {
          d += k == 0 ? "M" : "L";
          d += px(frame.X(c.points[k].x)) + " " + px(frame.Y(c.points[k].y) + kTitleHeight);
        }
        d += "Z";
      }
      if (d.empty()) continue;
      const char* colour = kPalette[i % std::size(kPalette)];
      svg += "<path fill-rule=\"evenodd\" fill=\"" + std::string(colour) + "\" fill-opacity=\"0.3\" stroke=\"" +
             colour + "\" stroke-width=\"1\" d=\"" + d + "\"/>\n";
    }
    svg += "</g>\n";
  }
  svg += "</svg>\n";
  return svg;
}

int fail(const std::string& message) { return zonetool::usage_error("svg", message.c_str()); }

}  // namespace

int zonetool::cmd_svg(int argc, char** argv) {
  std::vector<std::string> paths;
  std::string out;
  bool oneLevel = false;
  double wanted = 0;
  for (int i = 0; i < argc; ++i) {
    const std::string a = argv[i];
    if (a == "-o" && i + 1 < argc) {
      out = argv[++i];
    } else if (a == "--level" && i + 1 < argc) {
      char* end = nullptr;
      wanted = std::strtod(argv[++i], &end);
      if (end == argv[i] || *end != '\0' || !std::isfinite(wanted)) return fail("--level needs a finite number");
      oneLevel = true;
    } else if (!a.empty() && a[0] == '-' && a != "-") {
      return fail("unknown option " + a);
    } else {
      paths.push_back(a);
    }
  }
  if (paths.empty() || out.empty()) return fail("usage: zonetool svg IN... -o OUT.svg [--level Z]");

  std::vector<DrawingInput> inputs(paths.size());
  std::string error;
  for (std::size_t i = 0; i < paths.size(); ++i)
    if (!zonetool::read_drawing_input(paths[i], inputs[i], error)) return fail(error);

  std::vector<double> panels = zonetool::collect_levels(inputs);
  const bool levelled = !panels.empty();
  if (oneLevel) {
    const auto it = std::find_if(panels.begin(), panels.end(),
                                 [&](double z) { return std::fabs(z - wanted) <= zonetool::kDrawingLevelTolerance; });
    if (it == panels.end()) return fail("no level at z " + zonetool::format_number(wanted));
    panels = {*it};
  }
  const std::string svg = draw(inputs, panels, levelled);
  std::ofstream file(out, std::ios::binary);
  file << svg;
  file.close();
  if (!file) return fail("cannot write " + out);
  return 0;
}
