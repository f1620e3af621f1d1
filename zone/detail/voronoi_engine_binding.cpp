// The calling thread's Voronoi engine behind OffsetEngine, and the stand-in
// switch for tests.
#include "voronoi/engine.hpp"
#include "zone/offset_engine.hpp"

namespace zt {

thread_local bool engineReady = false;

namespace {

class VoronoiOffsetEngine final : public OffsetEngine {
 public:
  bool initialize() override { return VD_Initialize(); }
  void terminate() override { VD_Terminate(); }
  void reset() override { VD_Reset(); }
  std::int32_t addPoint(double x, double y, std::int32_t tag) override {
    return API_AddPoint(x, y, tag);
  }
  std::int32_t addSegment(std::int32_t i1, std::int32_t i2, std::int32_t tag) override {
    return API_AddSegment(i1, i2, tag);
  }
  bool computeDiagram(bool clean, std::int32_t boundFactor, bool pointsOnly, bool keepArcLinks,
                      std::int32_t sampleDensity, std::int32_t arcPieces, double arcTolerance,
                      double arcTolerance2, bool autoArcTolerance) override {
    return VD_ComputeDiagram(clean, boundFactor, pointsOnly, keepArcLinks, sampleDensity,
                             arcPieces, arcTolerance, arcTolerance2, autoArcTolerance);
  }
  bool computeOffsets(std::int32_t side, double t, double d) override {
    return VD_ComputeOffsets(side, t, d);
  }
  std::int32_t curveCount() override { return GetNumOffsetCurves(); }
  void curve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) override {
    GetOffsetCurve(i, offset, first, last);
  }
  void element(std::int32_t k, std::int32_t& kind, std::int32_t& site, Point2d& start) override {
    std::int32_t tag = -1;
    GetOffsetElement(k, kind, site, start.x, start.y, tag);
  }
  Point2d toUser(const Point2d& p) override {
    Point2d u;
    ToUserCoordinates(p, u.x, u.y);
    return u;
  }
  bool coincide(const Point2d& a, const Point2d& b) override { return PointsCoincide(a, b); }
  std::int32_t siteTag(SiteRef site) override {
    switch (site.kind) {
      case kSitePoint: return VD_GetPointTag(site.index);
      case kSiteSegment: return VD_GetSegmentTag(site.index);
      case kSiteArc: return VD_GetArcTag(site.index);
      default: return -1;
    }
  }
  Point2d pointCentre(std::int32_t point) override { return VD_GetPointCentre(point); }
  Point2d arcCentre(std::int32_t arc) override { return VD_GetArcCentre(arc); }
};

VoronoiOffsetEngine g_voronoi;
OffsetEngine* g_standIn = nullptr;

}  // namespace

OffsetEngine& offset_engine() { return g_standIn ? *g_standIn : g_voronoi; }

OffsetEngine& voronoi_offset_engine() { return g_voronoi; }

OffsetEngine* set_offset_engine(OffsetEngine* engine) {
  OffsetEngine* previous = g_standIn;
  g_standIn = engine;
  return previous;
}

}  // namespace zt
