// The tracing default slots of VD_OffsetHandler.
#include "zone/offset_handler.hpp"

#include <cstdio>

#include "zone/offset_engine.hpp"

namespace zt {

namespace {

constexpr const char* kTraceRule = "***********************************\n";

void trace_site(SiteRef site) {
  std::fprintf(stderr, "   .site(%s,VD(%d),TAG(%d))\n", site_kind_name(site.kind), site.index,
               offset_engine().siteTag(site));
}

}  // namespace

const char* site_kind_name(std::int32_t kind) {
  switch (kind) {
    case kSiteSegment: return "SEG";
    case kSiteArc: return "ARC";
    case kSitePoint: return "PNT";
    default: return "UNKNOWN";
  }
}

void VD_OffsetHandler::initOutput(std::int32_t curves) {
  std::fputs(kTraceRule, stderr);
  std::fputs("initOutput :\n", stderr);
  std::fprintf(stderr, "   .nCurves(%d)\n", curves);
}

void VD_OffsetHandler::initCurve(double offset, double startX, double startY,
                                 std::int32_t nMaxElts) {
  std::fputs("initCurve : \n", stderr);
  std::fprintf(stderr, "   .offset (%lf)\n", offset);
  std::fprintf(stderr, "   .start(%lf,%lf)\n", startX, startY);
  std::fprintf(stderr, "   .nMaxElts(%d)\n", nMaxElts);
}

void VD_OffsetHandler::writeLineSegment(double startX, double startY, double endX, double endY,
                                        SiteRef site) {
  std::fputs("writeLineSegment :\n", stderr);
  std::fprintf(stderr, "   .start(%lf,%lf)\n", startX, startY);
  std::fprintf(stderr, "   .end(%lf,%lf)\n", endX, endY);
  trace_site(site);
}

void VD_OffsetHandler::writeCircularArc(double startX, double startY, double endX, double endY,
                                        double centreX, double centreY, bool ccw, SiteRef site) {
  std::fputs("writeCircularArc :\n", stderr);
  std::fprintf(stderr, "   .orientation(%s)\n", ccw ? "CCW" : "CW");
  std::fprintf(stderr, "   .start(%lf,%lf)\n", startX, startY);
  std::fprintf(stderr, "   .end(%lf,%lf)\n", endX, endY);
  std::fprintf(stderr, "   .center(%lf,%lf)\n", centreX, centreY);
  trace_site(site);
}

void VD_OffsetHandler::endCurve(std::int32_t nLines, std::int32_t nArcs) {
  std::fputs("endCurve :\n", stderr);
  std::fprintf(stderr, "   .nLines(%d)\n", nLines);
  std::fprintf(stderr, "   .nArcs(%d)\n", nArcs);
}

void VD_OffsetHandler::endOutput(std::int32_t curves) {
  std::fputs("endOutput :\n", stderr);
  std::fprintf(stderr, "   .nCurves(%d)\n", curves);
  std::fputs(kTraceRule, stderr);
}

}  // namespace zt
