// zonetool dxf IN... -o OUT.dxf: record files and text polylines as a DXF
// drawing (ASCII, the R12 form that CAD programs of every age read).
//
// One layer per input and level, named after the input and the level's z;
// each contour a POLYLINE at the elevation of its level's contours, closed
// (flag 1, its repeated first point left out) when the contour is closed,
// a single point as a POINT. Numbers are written in the shortest form that
// reads back to the same value, a record file's in single precision, so a
// reader gets the coordinates `dump` prints. The drawing is made in memory
// and written only when every input has been read; a failed write leaves no
// file behind.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <limits>
#include <set>
#include <string>
#include <vector>

#include "commands.hpp"
#include "drawing_input.hpp"
#include "text_io.hpp"

namespace {

using zonetool::DrawingContour;
using zonetool::DrawingInput;
using zonetool::DrawingPoint;

// CAD colour numbers of the inputs in turn: blue, orange, green, red,
// magenta, brown, pink, grey (as svg colours them, as near as they go).
const int kLayerColours[] = {5, 30, 3, 1, 6, 34, 221, 8};

struct Layer {
  std::string name;
  int colour;
  std::vector<const DrawingContour*> contours;
  bool single;
};

// A layer name of letters, digits, "_" and "-" only (what every DXF reader takes).
std::string layer_word(const std::string& text) {
  std::string out;
  for (char c : text) {
    const bool plain = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '-';
    out += plain ? c : (c == '.' ? 'p' : '_');
  }
  return out;
}

std::string stem_of(const std::string& path) {
  std::string name = path.substr(path.find_last_of('/') + 1);
  const std::size_t dot = name.find_last_of('.');
  if (dot != std::string::npos && dot > 0) name.resize(dot);
  return name;
}

class DxfText {
 public:
  void group(int code, const std::string& value) {
    char head[8];
    std::snprintf(head, sizeof head, "%3d\n", code);
    text_ += head;
    text_ += value;
    text_ += '\n';
  }
  void number(int code, double v, bool single) {
    group(code, single ? zonetool::format_number(static_cast<float>(v)) : zonetool::format_number(v));
  }
  const std::string& text() const { return text_; }

 private:
  std::string text_;
};

struct Extent {
  double lo[3] = {std::numeric_limits<double>::infinity(), std::numeric_limits<double>::infinity(),
                  std::numeric_limits<double>::infinity()};
  double hi[3] = {-lo[0], -lo[1], -lo[2]};
  void add(double x, double y, double z) {
    const double v[3] = {x, y, z};
    for (int k = 0; k < 3; ++k) lo[k] = std::min(lo[k], v[k]), hi[k] = std::max(hi[k], v[k]);
  }
};

// The layers in drawing order: per input, its levels from the top down,
// then its contours without a level.
std::vector<Layer> make_layers(const std::vector<DrawingInput>& inputs) {
  const std::vector<double> levels = zonetool::collect_levels(inputs);
  std::vector<Layer> layers;
  std::set<std::string> stems;
  for (std::size_t i = 0; i < inputs.size(); ++i) {
    const DrawingInput& in = inputs[i];
    std::string stem = layer_word(stem_of(in.name));
    if (stem.empty() || !stems.insert(stem).second) {
      stem.push_back('_');
      stem.append(std::to_string(i + 1));
    }
    stems.insert(stem);
    const int colour = kLayerColours[i % std::size(kLayerColours)];
    for (double z : levels) {
      Layer layer{stem + "_z" + layer_word(in.single ? zonetool::format_number(static_cast<float>(z))
                                                     : zonetool::format_number(z)),
                  colour, {}, in.single};
      for (const DrawingContour& c : in.contours)
        if (c.hasZ && zonetool::on_level(c, z)) layer.contours.push_back(&c);
      if (!layer.contours.empty()) layers.push_back(std::move(layer));
    }
    Layer flat{stem, colour, {}, in.single};
    for (const DrawingContour& c : in.contours)
      if (!c.hasZ) flat.contours.push_back(&c);
    if (!flat.contours.empty()) layers.push_back(std::move(flat));
  }
  return layers;
}

// The points to write: a closed contour's repeated first point left out.
std::size_t drawn_count(const DrawingContour& c) {
  std::size_t n = c.points.size();
  if (c.closed && n > 1 && c.points.front().x == c.points.back().x && c.points.front().y == c.points.back().y) --n;
  return n;
}

void write_entities(DxfText& dxf, const Layer& layer) {
  for (const DrawingContour* c : layer.contours) {
    const std::size_t n = drawn_count(*c);
    if (n == 0) continue;
    if (n == 1) {
      dxf.group(0, "POINT");
      dxf.group(8, layer.name);
      dxf.number(10, c->points[0].x, layer.single);
      dxf.number(20, c->points[0].y, layer.single);
      dxf.number(30, c->z, layer.single);
      continue;
    }
    dxf.group(0, "POLYLINE");
    dxf.group(8, layer.name);
    dxf.group(66, "1");
    dxf.group(10, "0");
    dxf.group(20, "0");
    dxf.number(30, c->z, layer.single);
    dxf.group(70, c->closed ? "1" : "0");
    for (std::size_t k = 0; k < n; ++k) {
      dxf.group(0, "VERTEX");
      dxf.group(8, layer.name);
      dxf.number(10, c->points[k].x, layer.single);
      dxf.number(20, c->points[k].y, layer.single);
      dxf.number(30, c->z, layer.single);
    }
    dxf.group(0, "SEQEND");
    dxf.group(8, layer.name);
  }
}

// single: every input is a record file, so the extent is written in single precision too.
std::string drawing(const std::vector<Layer>& layers, bool single) {
  Extent extent;
  for (const Layer& layer : layers)
    for (const DrawingContour* c : layer.contours)
      for (const DrawingPoint& p : c->points) extent.add(p.x, p.y, c->z);
  if (!(extent.lo[0] <= extent.hi[0])) extent = Extent{{0, 0, 0}, {0, 0, 0}};

  DxfText dxf;
  dxf.group(0, "SECTION");
  dxf.group(2, "HEADER");
  dxf.group(9, "$ACADVER");
  dxf.group(1, "AC1009");
  dxf.group(9, "$EXTMIN");
  for (int k = 0; k < 3; ++k) dxf.number(10 * (k + 1), extent.lo[k], single);
  dxf.group(9, "$EXTMAX");
  for (int k = 0; k < 3; ++k) dxf.number(10 * (k + 1), extent.hi[k], single);
  dxf.group(0, "ENDSEC");

  dxf.group(0, "SECTION");
  dxf.group(2, "TABLES");
  dxf.group(0, "TABLE");
  dxf.group(2, "LTYPE");
  dxf.group(70, "1");
  dxf.group(0, "LTYPE");
  dxf.group(2, "CONTINUOUS");
  dxf.group(70, "0");
  dxf.group(3, "Solid line");
  dxf.group(72, "65");
  dxf.group(73, "0");
  dxf.group(40, "0");
  dxf.group(0, "ENDTAB");
  dxf.group(0, "TABLE");
  dxf.group(2, "LAYER");
  dxf.group(70, std::to_string(layers.size() + 1));
  auto layer_entry = [&](const std::string& name, int colour) {
    dxf.group(0, "LAYER");
    dxf.group(2, name);
    dxf.group(70, "0");
    dxf.group(62, std::to_string(colour));
    dxf.group(6, "CONTINUOUS");
  };
  layer_entry("0", 7);
  for (const Layer& layer : layers) layer_entry(layer.name, layer.colour);
  dxf.group(0, "ENDTAB");
  dxf.group(0, "ENDSEC");

  dxf.group(0, "SECTION");
  dxf.group(2, "ENTITIES");
  for (const Layer& layer : layers) write_entities(dxf, layer);
  dxf.group(0, "ENDSEC");
  dxf.group(0, "EOF");
  return dxf.text();
}

int fail(const std::string& message) { return zonetool::usage_error("dxf", message.c_str()); }

}  // namespace

int zonetool::cmd_dxf(int argc, char** argv) {
  std::vector<std::string> paths;
  std::string out;
  for (int i = 0; i < argc; ++i) {
    const std::string a = argv[i];
    if (a == "-o" && i + 1 < argc) {
      out = argv[++i];
    } else if (!a.empty() && a[0] == '-' && a != "-") {
      return fail("unknown option " + a);
    } else {
      paths.push_back(a);
    }
  }
  if (paths.empty() || out.empty()) return fail("usage: zonetool dxf IN... -o OUT.dxf");

  std::vector<DrawingInput> inputs(paths.size());
  std::string error;
  for (std::size_t i = 0; i < paths.size(); ++i)
    if (!read_drawing_input(paths[i], inputs[i], error)) return fail(error);

  const bool single = std::all_of(inputs.begin(), inputs.end(), [](const DrawingInput& in) { return in.single; });
  const std::string text = drawing(make_layers(inputs), single);
  std::ofstream file(out, std::ios::binary);
  file << text;
  file.close();
  if (!file) {
    // Only a plain file of ours goes; never what a link such as /dev/stdout names.
    std::error_code ec;
    if (std::filesystem::is_regular_file(std::filesystem::symlink_status(out, ec))) std::filesystem::remove(out, ec);
    return fail("cannot write " + out);
  }
  return 0;
}
