// The surface of the Voronoi engine that the zone builder uses, as one
// replaceable object.
//
// In the program it is always the calling thread's Voronoi engine (its facade
// and the read-out of its offset store); the zone builder never talks to
// the engine any other way, so the order of the engine calls is visible in
// one place and a test can stand in a recording or scripted engine.
#pragma once

#include <cstdint>

#include "core/points.hpp"
#include "zone/offset_handler.hpp"

namespace zt {

class OffsetEngine {
 public:
  virtual ~OffsetEngine() = default;

  // VD_Initialize, VD_Terminate, VD_Reset.
  virtual bool initialize() = 0;
  virtual void terminate() = 0;
  virtual void reset() = 0;
  // API_AddPoint, API_AddSegment.
  virtual std::int32_t addPoint(double x, double y, std::int32_t tag) = 0;
  virtual std::int32_t addSegment(std::int32_t i1, std::int32_t i2, std::int32_t tag) = 0;
  // VD_ComputeDiagram with every argument.
  virtual bool computeDiagram(bool clean, std::int32_t boundFactor, bool pointsOnly,
                              bool keepArcLinks, std::int32_t sampleDensity,
                              std::int32_t arcPieces, double arcTolerance, double arcTolerance2,
                              bool autoArcTolerance) = 0;
  // VD_ComputeOffsets.
  virtual bool computeOffsets(std::int32_t side, double t, double d) = 0;

  // Read-out of the offset store. Element points and centres are in the
  // engine's internal coordinates.
  virtual std::int32_t curveCount() = 0;
  virtual void curve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) = 0;
  virtual void element(std::int32_t k, std::int32_t& kind, std::int32_t& site, Point2d& start) = 0;
  virtual Point2d toUser(const Point2d& p) = 0;
  virtual bool coincide(const Point2d& a, const Point2d& b) = 0;
  // The tag the site was stored with; -1 for a kind other than the three.
  virtual std::int32_t siteTag(SiteRef site) = 0;
  virtual Point2d pointCentre(std::int32_t point) = 0;
  virtual Point2d arcCentre(std::int32_t arc) = 0;
};

// The engine in use: the calling thread's Voronoi engine unless a test stood
// another in.
OffsetEngine& offset_engine();
// The calling thread's Voronoi engine, whatever stands in.
OffsetEngine& voronoi_offset_engine();
// Stands `engine` in (nullptr: the Voronoi engine again); returns the
// previous stand-in or nullptr.
OffsetEngine* set_offset_engine(OffsetEngine* engine);

// Set when the zone builder first starts the calling thread's Voronoi
// engine; cleared when it terminates it.
extern thread_local bool engineReady;

}  // namespace zt
