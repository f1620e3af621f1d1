// Writers of the offset store for requests that ask for a file (see
// offset_sweep.hpp). Plain text: per curve "curve OFFSET", per element
// "KIND SITE x y" (user coordinates). DXF: LINE entities for straight
// elements, ARC entities (clockwise arcs written as counter-clockwise from
// their end) for elements about a point site.
#include <cmath>
#include <cstdio>
#include <numbers>

#include "voronoi/detail/offset_sweep.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {

struct UserPoint {
  double x, y;
};

UserPoint User(const OffsetElementRecord& e) { return {ToUserX(e.x), ToUserY(e.y)}; }

void WriteText(std::FILE* f) {
  const Engine& g = Vd();
  for (std::int32_t c = 0; c < g.offsetCurves.count; ++c) {
    const OffsetCurveRecord& cr = g.offsetCurves[c];
    std::fprintf(f, "curve %.17g\n", cr.offset);
    for (std::int32_t k = cr.first; k <= cr.last; ++k) {
      const UserPoint p = User(g.offsetElements[k]);
      std::fprintf(f, "%d %d %.17g %.17g\n", g.offsetElements[k].kind, g.offsetElements[k].site, p.x, p.y);
    }
  }
}

double Degrees(double dy, double dx) {
  double a = std::atan2(dy, dx) * 180.0 / std::numbers::pi;
  if (a < 0.0) a += 360.0;
  return a;
}

void WriteDxf(std::FILE* f) {
  const Engine& g = Vd();
  std::fputs("0\nSECTION\n2\nENTITIES\n", f);
  for (std::int32_t c = 0; c < g.offsetCurves.count; ++c) {
    const OffsetCurveRecord& cr = g.offsetCurves[c];
    for (std::int32_t k = cr.first; k <= cr.last; ++k) {
      const OffsetElementRecord& el = g.offsetElements[k];
      const UserPoint p = User(el);
      const UserPoint q = User(g.offsetElements[k == cr.last ? cr.first : k + 1]);
      if (el.kind == PNT && g.points.Valid(el.site)) {
        const double cx = ToUserX(g.points[el.site].x), cy = ToUserY(g.points[el.site].y);
        const double r = std::hypot(p.x - cx, p.y - cy);
        // Offsets about a point run clockwise: from q to p counter-clockwise.
        std::fprintf(f, "0\nARC\n8\n0\n10\n%.17g\n20\n%.17g\n40\n%.17g\n50\n%.17g\n51\n%.17g\n", cx, cy, r,
                     Degrees(q.y - cy, q.x - cx), Degrees(p.y - cy, p.x - cx));
      } else {
        std::fprintf(f, "0\nLINE\n8\n0\n10\n%.17g\n20\n%.17g\n11\n%.17g\n21\n%.17g\n", p.x, p.y, q.x, q.y);
      }
    }
  }
  std::fputs("0\nENDSEC\n0\nEOF\n", f);
}

}  // namespace

bool WriteOffsetStore(const char* path, bool dxfFormat) {
  std::FILE* f = std::fopen(path, "w");
  if (!f) return false;
  if (dxfFormat) WriteDxf(f);
  else WriteText(f);
  const bool ok = std::ferror(f) == 0;
  return std::fclose(f) == 0 && ok;
}

}  // namespace zt::vd
