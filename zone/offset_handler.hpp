// The receiver of offset curves read out of the Voronoi engine.
//
// emit_offsets (offset_readout.hpp) hands every curve of the engine's offset
// store to a VD_OffsetHandler, curve by curve and element by element, in
// user coordinates. The base class's slots only trace each call on standard
// error (the exact texts are relied on by the suite's support tools); the
// zone builder's SlopeDomain overrides them to collect the curves.
#pragma once

#include <cstdint>

namespace zt {

// Kinds of engine sites as offset elements name them.
inline constexpr std::int32_t kSiteSegment = 0;
inline constexpr std::int32_t kSiteArc = 1;
inline constexpr std::int32_t kSitePoint = 2;

// The engine site an offset element belongs to.
struct SiteRef {
  std::int32_t index = 0;
  std::int32_t kind = 0;
};

// "SEG", "ARC", "PNT", or "UNKNOWN" for any other kind.
const char* site_kind_name(std::int32_t kind);

class VD_OffsetHandler {
 public:
  VD_OffsetHandler() = default;
  virtual ~VD_OffsetHandler() = default;
  VD_OffsetHandler(const VD_OffsetHandler&) = delete;
  VD_OffsetHandler& operator=(const VD_OffsetHandler&) = delete;

  virtual void initOutput(std::int32_t nCurves);
  virtual void initCurve(double offset, double startX, double startY, std::int32_t nMaxElts);
  virtual void writeLineSegment(double startX, double startY, double endX, double endY,
                                SiteRef site);
  virtual void writeCircularArc(double startX, double startY, double endX, double endY,
                                double centreX, double centreY, bool ccw, SiteRef site);
  // Running totals of the whole read-out, not the counts of this curve.
  virtual void endCurve(std::int32_t nLines, std::int32_t nArcs);
  virtual void endOutput(std::int32_t nCurves);

  // Set by emit_offsets before its first call.
  std::int32_t nCurves = 0;
};

}  // namespace zt
