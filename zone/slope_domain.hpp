// SlopeDomain: offsets a list of contours through the Voronoi engine and
// collects the offset curves back into the same list as closed polylines.
//
// compute(list, side) feeds the list's polylines to the engine as points and
// segments, has it compute the diagram and one offset family at
// offsetDistance (or half the problem's size when that is smaller) on the
// given side (1 left, 2 right, 3 both), and refills the list through the
// handler slots: a separator first, then each curve (last traced first, its
// points in the reverse of the traced order, its start point first, second
// and last) followed by a separator; arcs are replaced by chord points within
// arcTolerance. When the engine cannot compute, the list is left as it was.
#pragma once

#include <cstdint>

#include "core/points.hpp"
#include "zone/offset_engine.hpp"
#include "zone/offset_handler.hpp"
#include "zone/simplify.hpp"

namespace zt {

// Sagitta tolerance of the arc approximation wherever the zone builder
// offsets.
inline constexpr double kArcTolerance = 0.005;
// Polylines are thinned with this tolerance before they are fed.
inline constexpr double kFeedTolerance = 0.001;
// A polyline whose extent is below this in x and in y is not fed.
inline constexpr double kMinFeedExtent = 0.001;
// Element x at or above this never starts a polyline; above it ends one.
inline constexpr double kFeedSeparatorX = 90000.0;
// The half diagonal factor of the fed contours' box that bounds the offset.
inline constexpr double kDiagonalFactor = 0.49;
// Polylines whose boxes lie farther apart than twice the offset distance
// and this are offset as separate groups (compute_in_groups).
inline constexpr double kGroupGapMargin = 0.01;
// compute_in_groups feeds coordinates rounded to multiples of 2^-this (about
// a nanometre in millimetres): inputs a last bit apart feed alike.
inline constexpr int kFeedGridExponent = 30;
// Offset sides as the engine takes them.
inline constexpr std::int32_t kSideLeft = 1;
inline constexpr std::int32_t kSideRight = 2;
inline constexpr std::int32_t kSideBoth = 3;

// Forgets the groups compute_in_groups remembers, and the offsets this
// thread remembers (tests and benchmarks only: a fresh start).
void forget_offset_groups();
void forget_remembered_offsets();

struct FeedBox {
  double xmin = kSeparatorCoord;
  double xmax = -kSeparatorCoord;
  double ymin = kSeparatorCoord;
  double ymax = -kSeparatorCoord;
};

// What compute asks the engine for, from the wanted distance and the box of
// the fed contours: h = 0.49 x diagonal; t = the distance when h exceeds it,
// else h / 2; N = ceil(distance / h), 1 when that is below 1, not finite or
// beyond the 32-bit range.
struct OffsetRequest {
  double h = 0.0;
  double t = 0.0;
  std::int32_t boundFactor = 1;
};
OffsetRequest offset_request(double offsetDistance, const FeedBox& box);

class SlopeDomain : public VD_OffsetHandler {
 public:
  explicit SlopeDomain(double offsetDistance);
  SlopeDomain(double offsetDistance, OffsetEngine& engine);
  ~SlopeDomain() override;

  // 0: the list holds the offset curves (possibly none), or nothing could
  // be fed and the list is emptied; -1: the engine could not compute the
  // diagram or the offsets, the list unchanged.
  // An input equal in its coordinates to one of the last few the thread
  // offset at the same distance and side gets that result again without the
  // engine; any other goes through compute_in_groups (the Voronoi engine
  // only: a stand-in is asked every time, through compute_offsets).
  std::int32_t compute(TaggedPointList& list, std::int32_t side);
  // compute without looking at what was computed before.
  std::int32_t compute_offsets(TaggedPointList& list, std::int32_t side);
  // compute_offsets with the fed coordinates rounded to the feed grid and
  // the polylines split into groups that lie too far apart for their curves
  // to meet, each offset in a diagram of its own at the distance the whole
  // list asks for, or taken from the groups remembered for all threads
  // (offset_groups.cpp). The curves are those of the groups, one after
  // another; -1 and the list unchanged when a group cannot be computed.
  std::int32_t compute_in_groups(TaggedPointList& list, std::int32_t side);

  // Feeds every polyline of two or more points and of extent at least
  // kMinFeedExtent, thinned, widening `box` with the fed points; returns the
  // number of polylines fed.
  std::int32_t feed_contours(const TaggedPointList& list, FeedBox& box);
  // The next polyline to feed from list[i..], thinned, into the buffer;
  // false when none is left.
  bool next_fed_polyline(const TaggedPointList& list, std::int32_t& i);

  // Appends to the output list the chord points of the arc from s to e
  // around c (counter-clockwise when ccw), with s and e when asked.
  void approximate_arc(const Point2d& s, const Point2d& e, const Point2d& c, bool ccw,
                       bool withStart, bool withEnd);

  void initOutput(std::int32_t curves) override;
  void initCurve(double offset, double startX, double startY, std::int32_t nMaxElts) override;
  void writeLineSegment(double startX, double startY, double endX, double endY,
                        SiteRef site) override;
  void writeCircularArc(double startX, double startY, double endX, double endY, double centreX,
                        double centreY, bool ccw, SiteRef site) override;
  void endCurve(std::int32_t nLines, std::int32_t nArcs) override;
  void endOutput(std::int32_t curves) override;

  // The list the slots write to (set by compute).
  void setOutput(TaggedPointList* list) { out_ = list; }

  std::int32_t curveStart = -1;
  double offsetDistance;
  double arcTolerance = kArcTolerance;

 private:
  TaggedPointList* out_ = nullptr;
  Array<Point2d> polyline_{0, 100};
  PolylineSimplifier simplifier_{kRadialFactor};
  OffsetEngine& engine_;
};

}  // namespace zt
