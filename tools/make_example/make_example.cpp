// make_example OUTDIR: writes the bundled example run into OUTDIR.
//
// A pocket of a mould part, 120 x 80 at the top, cut down in 20 levels of
// 1 mm (z = -1 to -20). Its walls have a draft: each millimetre of depth
// moves them 0.1 mm inwards, and the islands grow by as much. The pocket has
// rounded corners, a round boss that runs the full depth and a rounded block
// whose top lies at z = -6.
//
// The rest material is what a roughing tool of radius 8 mm, stepping down
// 4 mm at a time, left behind: in the corners of the pocket (their radius is
// below the tool's) and, between its steps, the thin staircase along the
// drafted walls and around the islands, plus the block's footprint above its
// top, which the tool below avoided.
//
// Files: contour.bin (finishing contours: the wall counter-clockwise, the
// islands clockwise), stock1.bin (rest material, outer boundaries
// counter-clockwise, holes clockwise), zstock.ok, grid.tmp, and the message
// files textg.fr and textg.en whose line 139 is the program's banner.
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <numbers>
#include <string>
#include <vector>

#include "driver/logical_units.hpp"
#include "driver/record_files.hpp"
#include "core/points.hpp"

namespace {

using zt::Point2f;
using Contour = std::vector<Point2f>;

constexpr double kPi = std::numbers::pi;
// Largest distance between an arc and its chords.
constexpr double kChordTolerance = 0.01;

constexpr int kLevels = 20;
constexpr double kLevelStep = 1.0;
constexpr double kDraft = 0.1;           // wall offset per mm of depth
constexpr double kRoughStep = 4.0;       // step-down of the roughing tool
constexpr double kRoughRadius = 8.0;     // radius of the roughing tool
// Below this thickness the staircase along a wall is no rest material.
constexpr double kMinStrip = 1e-6;

// The pocket at depth 0.
constexpr double kCx = 60, kCy = 40, kHalfW = 60, kHalfH = 40, kCornerR = 5;
// The round boss.
constexpr double kBossX = 32, kBossY = 44, kBossR = 9;
// The rounded block, its top at depth kBlockTop.
constexpr double kBlockX = 84, kBlockY = 32, kBlockHalfW = 12, kBlockHalfH = 7, kBlockR = 3;
constexpr double kBlockTop = 6;

int arc_steps(double radius, double sweep) {
  if (radius <= 0) return 1;
  const double step = 2 * std::acos(1 - kChordTolerance / radius);
  return std::max(1, static_cast<int>(std::ceil(std::fabs(sweep) / step)));
}

// Appends the arc's points after its start point (the start is already there).
void add_arc(Contour& c, double cx, double cy, double r, double from, double to) {
  const int n = arc_steps(r, to - from);
  for (int i = 1; i <= n; ++i) {
    const double a = from + (to - from) * i / n;
    c.push_back({static_cast<float>(cx + r * std::cos(a)), static_cast<float>(cy + r * std::sin(a))});
  }
}

// A rounded rectangle, counter-clockwise, starting at the middle of its right
// side; closed (first point repeated).
Contour rounded_rect(double cx, double cy, double hw, double hh, double r) {
  Contour c;
  c.push_back({static_cast<float>(cx + hw), static_cast<float>(cy)});
  const double corners[4][2] = {{cx + hw - r, cy + hh - r}, {cx - hw + r, cy + hh - r},
                                {cx - hw + r, cy - hh + r}, {cx + hw - r, cy - hh + r}};
  for (int k = 0; k < 4; ++k) {
    const double a0 = k * kPi / 2;
    const double x0 = corners[k][0] + r * std::cos(a0), y0 = corners[k][1] + r * std::sin(a0);
    c.push_back({static_cast<float>(x0), static_cast<float>(y0)});
    add_arc(c, corners[k][0], corners[k][1], r, a0, a0 + kPi / 2);
  }
  c.push_back(c.front());
  return c;
}

Contour circle(double cx, double cy, double r) {
  Contour c;
  c.push_back({static_cast<float>(cx + r), static_cast<float>(cy)});
  add_arc(c, cx, cy, r, 0, 2 * kPi);
  c.back() = c.front();
  return c;
}

Contour reversed(Contour c) { return Contour(c.rbegin(), c.rend()); }

// The material a tool of radius rt leaves in the four corners (radius r) of a
// rounded rectangle: between the wall and the arc of the tool, counter-clockwise.
std::vector<Contour> corner_slivers(double cx, double cy, double hw, double hh, double r, double rt) {
  std::vector<Contour> out;
  const double sx[4] = {1, -1, -1, 1}, sy[4] = {1, 1, -1, -1};
  for (int k = 0; k < 4; ++k) {
    const double a0 = k * kPi / 2, a1 = a0 + kPi / 2;
    const double wx = cx + sx[k] * (hw - r), wy = cy + sy[k] * (hh - r);     // wall arc centre
    const double tx = cx + sx[k] * (hw - rt), ty = cy + sy[k] * (hh - rt);   // tool arc centre
    Contour c;
    c.push_back({static_cast<float>(tx + rt * std::cos(a0)), static_cast<float>(ty + rt * std::sin(a0))});
    c.push_back({static_cast<float>(wx + r * std::cos(a0)), static_cast<float>(wy + r * std::sin(a0))});
    add_arc(c, wx, wy, r, a0, a1);
    c.push_back({static_cast<float>(tx + rt * std::cos(a1)), static_cast<float>(ty + rt * std::sin(a1))});
    add_arc(c, tx, ty, rt, a1, a0);
    c.back() = c.front();
    out.push_back(c);
  }
  return out;
}

struct Level {
  float z;
  std::vector<Contour> finishing;
  std::vector<Contour> rest;
};

Level make_level(int i) {
  const double depth = i * kLevelStep;
  const double rough = std::ceil(depth / kRoughStep - 1e-9) * kRoughStep;  // the tool's level below
  const double strip = kDraft * (rough - depth);
  Level L;
  L.z = static_cast<float>(-depth);

  const double hw = kHalfW - kDraft * depth, hh = kHalfH - kDraft * depth;
  const double r = kCornerR - kDraft * depth;
  L.finishing.push_back(rounded_rect(kCx, kCy, hw, hh, r));
  const double bossR = kBossR + kDraft * depth;
  L.finishing.push_back(reversed(circle(kBossX, kBossY, bossR)));
  const bool block = depth >= kBlockTop;
  const double bw = kBlockHalfW + kDraft * (depth - kBlockTop);
  const double bh = kBlockHalfH + kDraft * (depth - kBlockTop);
  if (block) L.finishing.push_back(reversed(rounded_rect(kBlockX, kBlockY, bw, bh, kBlockR)));

  if (strip > kMinStrip) {
    // The tool ran along the narrower wall of its own level, with its radius
    // in the corners: one band along the whole wall.
    L.rest.push_back(rounded_rect(kCx, kCy, hw, hh, r));
    L.rest.push_back(reversed(rounded_rect(kCx, kCy, hw - strip, hh - strip, kRoughRadius)));
    L.rest.push_back(circle(kBossX, kBossY, bossR + strip));
    L.rest.push_back(reversed(circle(kBossX, kBossY, bossR)));
  } else {
    for (Contour& c : corner_slivers(kCx, kCy, hw, hh, r, kRoughRadius)) L.rest.push_back(c);
  }
  if (rough >= kBlockTop) {
    const double rw = kBlockHalfW + kDraft * (rough - kBlockTop);
    const double rh = kBlockHalfH + kDraft * (rough - kBlockTop);
    if (!block) {
      L.rest.push_back(rounded_rect(kBlockX, kBlockY, rw, rh, kBlockR));
    } else if (strip > kMinStrip) {
      L.rest.push_back(rounded_rect(kBlockX, kBlockY, rw, rh, kBlockR));
      L.rest.push_back(reversed(rounded_rect(kBlockX, kBlockY, bw, bh, kBlockR)));
    }
  }
  return L;
}

bool write_records(const std::string& path, const std::vector<Level>& levels, bool rest) {
  const std::int32_t unit = zt::free_unit();
  zt::attach_record_output(unit, path);
  for (const Level& L : levels) {
    for (const Contour& c : rest ? L.rest : L.finishing) {
      std::int32_t ierr = 0;
      const std::int32_t n = static_cast<std::int32_t>(c.size());
      zt::write_contour(n, c.data(), L.z, unit, ierr);
      if (ierr != 0) {
        std::fprintf(stderr, "make_example: contour not closed at z %g\n", double{L.z});
        return false;
      }
    }
  }
  zt::close_unit(unit);
  return true;
}

bool write_text(const std::string& path, const std::string& text) {
  std::ofstream out(path, std::ios::binary);
  out << text;
  return static_cast<bool>(out);
}

// A message file of the suite: one text a line; line 139 is the banner.
std::string message_file(const char* const* texts, const char* banner) {
  std::string out;
  for (int n = 1; n <= 140; ++n) {
    if (n == 139) {
      out += banner;
    } else if (n <= 5) {
      out += texts[n - 1];
    }
    out += '\n';
  }
  return out;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fputs("usage: make_example OUTDIR\n", stderr);
    return 2;
  }
  const std::filesystem::path dir = argv[1];
  std::error_code ec;
  std::filesystem::create_directories(dir, ec);

  std::vector<Level> levels;
  for (int i = 1; i <= kLevels; ++i) levels.push_back(make_level(i));

  const char* const fr[] = {"Oui", "Non", "Annuler", "Fichier introuvable", "Calcul en cours"};
  const char* const en[] = {"Yes", "No", "Cancel", "File not found", "Computing"};
  const bool ok = write_records((dir / "contour.bin").string(), levels, false) &&
                  write_records((dir / "stock1.bin").string(), levels, true) &&
                  // Offset of the rest material: the second number (1.5 mm).
                  write_text((dir / "zstock.ok").string(), "0.8\n1.5\n") &&
                  // Grid: origin, extent, cell (its first number caps at 0.5),
                  // merge radius.
                  write_text((dir / "grid.tmp").string(), "0 0\n120 80\n0.5 0.5\n3 3\n") &&
                  write_text((dir / "textg.fr").string(),
                             message_file(fr, "Calcul des zones de reprise par niveau")) &&
                  write_text((dir / "textg.en").string(),
                             message_file(en, "Computing the rest-machining zones level by level"));
  if (!ok) {
    std::fprintf(stderr, "make_example: cannot write into %s\n", argv[1]);
    return 1;
  }
  return 0;
}
