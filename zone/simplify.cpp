// Polyline simplification: the two storage forms and the list-level driver.
#include "zone/simplify.hpp"

#include <algorithm>
#include <cassert>
#include <limits>
#include <new>

#include "zone/detail/simplify_passes.hpp"

namespace zt {

namespace {

// Sizes of the simplifier's own buffers: a little headroom over the run, and
// never less than a typical contour so most levels allocate once.
constexpr std::int64_t kBufferHeadroom = 10;
constexpr std::int64_t kMinBuffer = 5000;
constexpr std::int32_t kResultGrowBy = 1000;

std::int64_t buffer_size(std::int64_t n) { return std::max(n + kBufferHeadroom, kMinBuffer); }

std::int32_t* default_flag_allocator(std::int64_t n) {
  if (n > std::numeric_limits<std::int32_t>::max()) return nullptr;
  return new (std::nothrow) std::int32_t[static_cast<std::size_t>(n)];
}

}  // namespace

PolylineSimplifier::PolylineSimplifier(double factor)
    : factor_(factor), allocateFlags_(default_flag_allocator) {}

PolylineSimplifier::~PolylineSimplifier() { delete[] flags_; }

Array<Point2d>* PolylineSimplifier::resultList(std::int32_t n) {
  if (!result_) {
    const std::int64_t capacity = buffer_size(n);
    if (capacity > std::numeric_limits<std::int32_t>::max()) return nullptr;
    result_.reset(new (std::nothrow)
                      Array<Point2d>(static_cast<std::int32_t>(capacity), kResultGrowBy));
  }
  return result_.get();
}

std::int32_t PolylineSimplifier::simplify(const Point2d* points, std::int32_t n, double tolerance,
                                          Array<Point2d>& result, bool clear) {
  if (clear) result.Clear();
  if (!points || n < 1) return 0;
  if (n == 1) {
    result.Add(points[0]);
    return 0;
  }

  // The run is everything the radial pass appends after what result held.
  const std::int32_t base = result.count();
  const double rho = tolerance * factor_;
  detail::radial_pass(
      points, n, rho, [&](const Point2d& p) { result.Add(p); },
      [&]() { return result[result.count() - 1]; },
      [&](const Point2d& p) { result[result.count() - 1] = p; });

  const std::int32_t m = result.count() - base;
  if (m < 3) return 0;

  if (flagCapacity_ < m) {
    delete[] flags_;
    flagCapacity_ = 0;
    const std::int64_t wanted = buffer_size(m);
    flags_ = allocateFlags_(wanted);
    if (!flags_) {
      // Without flags the run cannot be thinned: hand the input back whole.
      result.SetCount(base);
      for (std::int32_t i = 0; i < n; ++i) result.Add(points[i]);
      return 0;
    }
    flagCapacity_ = static_cast<std::int32_t>(wanted);
  }

  const double tau = tolerance - rho;
  squaredTolerance_ = tau * tau;
  Point2d* run = result.data() + base;
  points_ = run;
  std::fill(flags_, flags_ + m, 0);
  detail::douglas_peucker(
      points_, m, squaredTolerance_, [&](std::int32_t k) { flags_[k] = 1; }, stack_);

  std::int32_t kept = 0;
  for (std::int32_t k = 0; k < m; ++k) {
    if (flags_[k]) run[kept++] = run[k];
  }
  result.SetCount(base + kept);
  return 0;
}

std::int32_t VectorSimplifier::simplify(Point2d* points, std::int32_t n, double eps, double tol) {
  if (!points || n <= 0) return 0;
  if (n == 1) return 1;

  run_.clear();
  detail::radial_pass(
      points, n, eps, [&](const Point2d& p) { run_.push_back(p); }, [&]() { return run_.back(); },
      [&](const Point2d& p) { run_.back() = p; });

  const auto m = static_cast<std::int32_t>(run_.size());
  keep_.assign(run_.size(), false);
  if (m < 3) {
    keep_[0] = true;
    keep_[m - 1] = true;
  } else {
    squaredTolerance_ = tol * tol;
    detail::douglas_peucker(
        run_.data(), m, squaredTolerance_, [&](std::int32_t k) { keep_[k] = true; }, stack_);
  }

  std::int32_t kept = 0;
  for (std::int32_t k = 0; k < m; ++k) {
    if (keep_[k]) points[kept++] = run_[k];
  }
  return kept;
}

void simplify_polylines(const TaggedPointList& in, TaggedPointList& out, double tolerance) {
  assert(&in != &out && "out is emptied before in is read");
  out.Clear();
  VectorSimplifier simplifier;
  std::vector<Point2d> work;
  const std::int32_t total = in.count();
  std::int32_t i = 0;
  for (;;) {
    while (i < total && in.At(i).x >= kPolylineSeparatorX) ++i;
    if (i == total) return;
    // A polyline runs on while x is at most the threshold: the one element
    // exactly at it counts as a point here, though it would not start one.
    const std::int32_t start = i++;
    while (i < total && in.At(i).x <= kPolylineSeparatorX) ++i;
    if (i - start < 2) continue;

    work.clear();
    for (std::int32_t k = start; k < i; ++k) work.push_back({in[k].x, in[k].y});
    const std::int32_t kept = simplifier.simplify(work.data(), static_cast<std::int32_t>(work.size()),
                                                  kPolylineRadialEps, tolerance);
    make_room(out, kept + 1);
    out.Add(TaggedPoint::separator());
    for (std::int32_t k = 0; k < kept; ++k) out.Add({1, work[k].x, work[k].y});
  }
}

}  // namespace zt
