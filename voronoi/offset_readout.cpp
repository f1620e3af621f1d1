// Offset requests and the read-out of the offset store (see engine.hpp).
#include <cmath>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/fatal.hpp"
#include "voronoi/detail/offset_state.hpp"
#include "voronoi/detail/offset_sweep.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/engine.hpp"

namespace zt {

using namespace zt::vd;

namespace {

// Distances at or below this select the automatic offsets (t) or a single
// distance (d); user units.
constexpr double kAutoThreshold = 1e-11;
// The automatic offsets: t in internal units, d as a multiple of t,
// adjusted to the number of points.
constexpr double kAutoDistance = 0.001;
constexpr double kAutoStepFactor = 30.0;
constexpr double kAutoMinStepFactor = 10.0;
constexpr std::int32_t kAutoFewPoints = 30;
constexpr std::int32_t kAutoManyPoints = 250000;
constexpr double kAutoManyPointsFactor = 10.0;

// A distance the sweep can count with: finite, and for the step not negative.
bool UsableDistances(double t, double d) { return std::isfinite(t) && std::isfinite(d) && t >= 0.0 && d >= 0.0; }

}  // namespace

bool VD_ComputeOffsets(std::int32_t side, double t, double d) {
  if (!Vd().upToDate) return false;
  if (!UsableDistances(t, d)) return false;
  if (side == 0) return true;
  const bool left = side == 1 || side == 3;
  const bool right = side == 2 || side == 3;
  if (d <= kAutoThreshold) d = 0.0;
  return API_ComputeOff(false, nullptr, false, false, t, d, t <= kAutoThreshold, left, right);
}

bool API_ComputeOff(bool timing, const char* outputFile, bool write, bool dxfFormat, double t,
                    double d, bool autoOffset, bool left, bool right) {
  Engine& g = Vd();
  if (!UsableDistances(t, d)) return false;
  if (autoOffset) {
    t = g.scaled ? kAutoDistance / g.scale : kAutoDistance;
    d = kAutoStepFactor * t;
    const std::int32_t n = EndCallerPoints() - FirstCallerPoint();
    if (n > kAutoFewPoints) d /= std::log(std::log(static_cast<double>(n)));
    d = std::fmax(d, kAutoMinStepFactor * t);
    if (n > kAutoManyPoints) d *= kAutoManyPointsFactor;
  }
  if (t <= kAutoThreshold) return true;
  if (left && right) left = right = false;
  if (!g.upToDate) VdFatal("API_ComputeOff: VD not known or not up-to-date!");
  g.offsetNewRequest = true;
  bool finished = false;
  return ComputeOffsets(timing, outputFile, write, dxfFormat, t, d, finished, left, right);
}

std::int32_t GetNumOffsetCurves() { return Vd().offsetCurves.count; }

bool GetOffsetCurve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) {
  const Engine& g = Vd();
  if (!g.offsetCurves.Valid(i)) return false;
  const OffsetCurveRecord& c = g.offsetCurves[i];
  offset = c.offset;
  first = c.first;
  last = c.last;
  return true;
}

bool GetOffsetElement(std::int32_t k, std::int32_t& kind, std::int32_t& site, double& x, double& y,
                      std::int32_t& tag) {
  const Engine& g = Vd();
  if (!g.offsetElements.Valid(k)) return false;
  const OffsetElementRecord& e = g.offsetElements[k];
  kind = e.kind;
  site = e.site;
  x = e.x;
  y = e.y;
  tag = -1;
  return true;
}

void ToUserCoordinates(const Point2d& p, double& x, double& y) {
  x = ToUserX(p.x);
  y = ToUserY(p.y);
}

bool PointsCoincide(const Point2d& a, const Point2d& b) {
  return std::hypot(a.x - b.x, a.y - b.y) <= kCoincidenceDistance;
}

Point2d VD_GetPointCentre(std::int32_t point) {
  const Engine& g = Vd();
  if (!g.points.Valid(point)) return {};
  return {g.points[point].x, g.points[point].y};
}

Point2d VD_GetArcCentre(std::int32_t arc) {
  const Engine& g = Vd();
  if (!g.arcs.Valid(arc)) return {};
  return {g.arcs[arc].cx, g.arcs[arc].cy};
}

std::int32_t VD_GetArcTag(std::int32_t arc) { return Vd().arcs.Valid(arc) ? Vd().arcs[arc].tag : -1; }

}  // namespace zt
