// emit_offsets: the offset store, element by element, into a handler.
#include "zone/offset_readout.hpp"

namespace zt {

void emit_offsets(VD_OffsetHandler& handler) { emit_offsets(offset_engine(), handler); }

void emit_offsets(OffsetEngine& engine, VD_OffsetHandler& handler) {
  const std::int32_t n = engine.curveCount();
  handler.nCurves = n;
  handler.initOutput(n);
  std::int32_t nLines = 0;
  std::int32_t nArcs = 0;
  for (std::int32_t i = 0; i < n; ++i) {
    double offset = 0.0;
    std::int32_t first = 0;
    std::int32_t last = -1;
    engine.curve(i, offset, first, last);
    std::int32_t kind = 0;
    std::int32_t site = 0;
    Point2d firstStart;
    if (first <= last) engine.element(first, kind, site, firstStart);
    const Point2d userFirst = engine.toUser(firstStart);
    handler.initCurve(offset, userFirst.x, userFirst.y, last - first + 1);
    for (std::int32_t k = first; k <= last; ++k) {
      Point2d p;
      engine.element(k, kind, site, p);
      std::int32_t nextKind = 0;
      std::int32_t nextSite = 0;
      Point2d q = firstStart;
      if (k < last) engine.element(k + 1, nextKind, nextSite, q);
      const Point2d up = engine.toUser(p);
      const Point2d uq = engine.toUser(q);
      if (kind == kElementLine) {
        handler.writeLineSegment(up.x, up.y, uq.x, uq.y, {site, kSiteSegment});
        ++nLines;
      } else if (kind == kElementPointArc || kind == kElementArcInside ||
                 kind == kElementArcOutside) {
        const bool ofPoint = kind == kElementPointArc;
        const SiteRef ref{site, ofPoint ? kSitePoint : kSiteArc};
        if (engine.coincide(p, q)) {
          handler.writeLineSegment(up.x, up.y, uq.x, uq.y, ref);
          ++nLines;
        } else {
          const Point2d c = engine.toUser(ofPoint ? engine.pointCentre(site) : engine.arcCentre(site));
          const bool ccw = kind == kElementArcInside;
          handler.writeCircularArc(up.x, up.y, uq.x, uq.y, c.x, c.y, ccw, ref);
          ++nArcs;
        }
      }
    }
    handler.endCurve(nLines, nArcs);
  }
  handler.endOutput(handler.nCurves);
}

}  // namespace zt
