// SlopeDomain: feeding the contours, the engine request, and the offset
// collection slots.
#include "zone/slope_domain.hpp"

#include <algorithm>
#include <cassert>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>

#include "zone/offset_readout.hpp"

namespace zt {

OffsetRequest offset_request(double offsetDistance, const FeedBox& box) {
  OffsetRequest r;
  const double dx = box.xmax - box.xmin;
  const double dy = box.ymax - box.ymin;
  r.h = kDiagonalFactor * std::sqrt(dx * dx + dy * dy);
  r.t = r.h > offsetDistance ? offsetDistance : 0.5 * r.h;
  // The quotient may be anything (h tiny, NaN): only a value that fits the
  // engine's 32-bit bound factor is converted.
  const double n = std::ceil(offsetDistance / r.h);
  if (std::isfinite(n) && n >= 1.0 && n <= std::numeric_limits<std::int32_t>::max()) {
    r.boundFactor = static_cast<std::int32_t>(n);
  }
  return r;
}

SlopeDomain::SlopeDomain(double distance) : SlopeDomain(distance, offset_engine()) {}

SlopeDomain::SlopeDomain(double distance, OffsetEngine& engine)
    : offsetDistance(distance), engine_(engine) {}

SlopeDomain::~SlopeDomain() = default;

namespace {

// The last offsets computed on this thread for each of a few distances: the
// list they were computed from and the list they gave. The result depends
// only on the coordinates fed (tags are not fed), the distance, the side and
// the arc tolerance, so an input equal bit for bit to the remembered one gets
// the remembered result without a diagram: the levels of a part with
// vertical walls repeat their rest material, zones and unions.
constexpr std::int32_t kRememberedGrowth = 100;
struct RememberedOffset {
  std::uint64_t distanceBits = 0;
  std::uint64_t arcToleranceBits = 0;
  std::int32_t side = -1;
  TaggedPointList input{0, kRememberedGrowth};
  TaggedPointList output{0, kRememberedGrowth};
};
// Distances remembered per thread: the level offset, the grow and the shrink.
constexpr int kRememberedDistances = 3;
thread_local RememberedOffset tl_remembered[kRememberedDistances];
thread_local int tl_nextSlot = 0;

bool same_coordinates(const TaggedPointList& a, const TaggedPointList& b) {
  if (a.count() != b.count()) return false;
  for (std::int32_t i = 0; i < a.count(); ++i) {
    if (std::bit_cast<std::uint64_t>(a[i].x) != std::bit_cast<std::uint64_t>(b[i].x) ||
        std::bit_cast<std::uint64_t>(a[i].y) != std::bit_cast<std::uint64_t>(b[i].y)) {
      return false;
    }
  }
  return true;
}

void copy_list(const TaggedPointList& from, TaggedPointList& to) {
  to.Clear();
  to.SetCapacity(from.count());
  for (const TaggedPoint& p : from) to.Add(p);
}

}  // namespace

void forget_remembered_offsets() {
  for (RememberedOffset& r : tl_remembered) r.side = -1;
}

std::int32_t SlopeDomain::compute(TaggedPointList& list, std::int32_t side) {
  // Only the Voronoi engine computes purely from its input; a stand-in is
  // asked every time.
  if (&engine_ != &voronoi_offset_engine()) return compute_offsets(list, side);
  const std::uint64_t bits = std::bit_cast<std::uint64_t>(offsetDistance);
  const std::uint64_t arcBits = std::bit_cast<std::uint64_t>(arcTolerance);
  RememberedOffset* slot = nullptr;
  for (RememberedOffset& r : tl_remembered) {
    if (r.distanceBits == bits && r.arcToleranceBits == arcBits && r.side == side) slot = &r;
  }
  if (slot && same_coordinates(list, slot->input)) {
    copy_list(slot->output, list);
    return 0;
  }
  if (!slot) {
    slot = &tl_remembered[tl_nextSlot];
    tl_nextSlot = (tl_nextSlot + 1) % kRememberedDistances;
    slot->distanceBits = bits;
    slot->arcToleranceBits = arcBits;
    slot->side = side;
  }
  copy_list(list, slot->input);
  const std::int32_t r = compute_in_groups(list, side);
  if (r == 0) {
    copy_list(list, slot->output);
  } else {
    slot->side = -1;  // nothing remembered
  }
  return r;
}

std::int32_t SlopeDomain::compute_offsets(TaggedPointList& list, std::int32_t side) {
  out_ = &list;
  engine_.reset();
  FeedBox box;
  if (feed_contours(list, box) == 0) {
    list.Clear();
    return 0;
  }
  const OffsetRequest request = offset_request(offsetDistance, box);
  if (!engine_.computeDiagram(false, request.boundFactor, false, false, 0, 0, 0.0, 0.0, true)) {
    return -1;
  }
  if (!engine_.computeOffsets(side, request.t, 0.0)) return -1;
  emit_offsets(engine_, *this);
  return 0;
}

bool SlopeDomain::next_fed_polyline(const TaggedPointList& list, std::int32_t& i) {
  const std::int32_t count = list.count();
  for (;;) {
    polyline_.Clear();
    while (i < count && list[i].x >= kFeedSeparatorX) ++i;
    if (i == count) return false;
    double xmin = list[i].x, xmax = list[i].x, ymin = list[i].y, ymax = list[i].y;
    for (; i < count && list[i].x <= kFeedSeparatorX; ++i) {
      const TaggedPoint& p = list[i];
      polyline_.AddDoubling({p.x, p.y});
      xmin = std::min(xmin, p.x);
      xmax = std::max(xmax, p.x);
      ymin = std::min(ymin, p.y);
      ymax = std::max(ymax, p.y);
    }
    if (polyline_.count() < 2 || (xmax - xmin < kMinFeedExtent && ymax - ymin < kMinFeedExtent)) {
      continue;
    }
    if (Array<Point2d>* thinned = simplifier_.resultList(polyline_.count())) {
      thinned->Clear();
      simplifier_.simplify(polyline_.data(), polyline_.count(), kFeedTolerance, *thinned, true);
      polyline_.Clear();
      for (const Point2d& p : *thinned) polyline_.Add(p);
    }
    return true;
  }
}

std::int32_t SlopeDomain::feed_contours(const TaggedPointList& list, FeedBox& box) {
  const std::int32_t count = list.count();
  if (count > polyline_.capacity()) polyline_.SetCapacity(count);
  std::int32_t fed = 0;
  for (std::int32_t i = 0; next_fed_polyline(list, i);) {
    const std::int32_t n = polyline_.count();
    auto widen = [&box](const Point2d& p) {
      box.xmin = std::min(box.xmin, p.x);
      box.xmax = std::max(box.xmax, p.x);
      box.ymin = std::min(box.ymin, p.y);
      box.ymax = std::max(box.ymax, p.y);
    };
    std::int32_t previous = engine_.addPoint(polyline_[0].x, polyline_[0].y, -1);
    widen(polyline_[0]);
    for (std::int32_t k = 1; k < n; ++k) {
      const Point2d& p = polyline_[k];
      const Point2d& before = polyline_[k - 1];
      if (p.x == before.x && p.y == before.y) continue;
      const std::int32_t index = engine_.addPoint(p.x, p.y, k == n - 1 ? -1 : fed);
      engine_.addSegment(previous, index, fed);
      previous = index;
      widen(p);
    }
    ++fed;
  }
  return fed;
}

void SlopeDomain::initOutput(std::int32_t curves) {
  curveStart = -1;
  out_->Clear();
  if (curves >= 1) out_->Add(TaggedPoint::separator());
}

void SlopeDomain::initCurve(double, double startX, double startY, std::int32_t) {
  assert(curveStart == -1 && "curves do not nest");
  curveStart = out_->count();
  make_room(*out_, 1);
  out_->Add({0, startX, startY});
}

void SlopeDomain::writeLineSegment(double, double, double endX, double endY, SiteRef) {
  make_room(*out_, 1);
  out_->Add({0, endX, endY});
}

void SlopeDomain::writeCircularArc(double startX, double startY, double endX, double endY,
                                   double centreX, double centreY, bool ccw, SiteRef) {
  approximate_arc({startX, startY}, {endX, endY}, {centreX, centreY}, ccw, false, true);
}

void SlopeDomain::endCurve(std::int32_t, std::int32_t) {
  if (curveStart != -1) {
    make_room(*out_, 2);
    out_->Add(out_->At(curveStart));
    curveStart = -1;
  }
  out_->Add(TaggedPoint::separator());
}

void SlopeDomain::endOutput(std::int32_t) {
  TaggedPointList& list = *out_;
  for (std::int32_t j = 0, k = list.count() - 1; j < k; ++j, --k) std::swap(list[j], list[k]);
}

}  // namespace zt
