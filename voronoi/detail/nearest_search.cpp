// Grid and point-quadtree nearest-point search (see nearest_search.hpp).
#include "voronoi/detail/nearest_search.hpp"

#include <algorithm>
#include <cassert>
#include <cmath>
#include <limits>
#include <queue>
#include <vector>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {

// The grid bounds leave this fraction of the box on every side ...
constexpr double kGridMarginFraction = 0.01;
// ... and at least this much.
constexpr double kGridMinMargin = 1e-8;
constexpr double kMinAspect = 0.001;
constexpr double kMaxAspect = 1000.0;
// Sampling: a fraction of the points, raised to at least kMinSample.
constexpr double kSampleFraction = 0.03;
constexpr std::int32_t kMinSample = 1500;
constexpr int kMaxSampleDoublings = 3;
// Points per non-empty cell above which the input is too clustered for a grid.
constexpr double kClusteredDensity = 10.0;
constexpr double kMinCellFactor = 2.0;
constexpr double kMaxCellFactor = 4.0;
constexpr std::int32_t kEntryGrowth = 32768;
// A grid search compares every entry while there are at most this many.
constexpr std::int32_t kScanAllEntries = 32;
constexpr std::int64_t kMaxCells = std::int64_t{1} << 30;
// Prefetch hints cover the cells within this many rings of a query's cell
// (two rings measured no faster: the first ring mostly holds the answer).
constexpr std::int32_t kPrefetchRing = 1;

// A bucket entry carries its point's coordinates, so scanning a cell never
// leaves the entry array.
struct Entry {
  double x;
  double y;
  std::int32_t point;
  std::int32_t next;
};

// A quadtree node carries its point's coordinates for the same reason.
struct QuadNode {
  double x;
  double y;
  std::int32_t point;
  std::int32_t child[4];
};

struct Box {
  double x0, y0, x1, y1;
};

double Dist2ToBox(double x, double y, const Box& b) {
  const double dx = x < b.x0 ? b.x0 - x : (x > b.x1 ? x - b.x1 : 0.0);
  const double dy = y < b.y0 ? b.y0 - y : (y > b.y1 ? y - b.y1 : 0.0);
  return dx * dx + dy * dy;
}

}  // namespace

class NearestPointSearch {
 public:
  void Build(std::int32_t total, double minX, double minY, double maxX, double maxY);
  void Insert(std::int32_t p);
  std::int32_t FindAndInsert(std::int32_t p, double& dist2);
  void PrefetchCells(double x, double y, bool entries) const;
  std::int32_t PathStart() const { return quadtree_ && !quad_.empty() ? 0 : -1; }
  std::int32_t PathStep(std::int32_t node, double x, double y) const;

 private:
  void BuildGrid(std::int64_t cells);
  std::int32_t Column(double x) const;
  std::int32_t Row(double y) const;
  void GridLink(std::int32_t p);
  void ScanCell(std::int32_t cell, double x, double y, std::int32_t& best, double& bestD2) const;
  std::int32_t GridNearest(double x, double y, double& bestD2) const;
  void Record(std::int32_t p);
  void SwitchToQuadtree();
  // Enters p below node `from` (the root, or the end of the path a search
  // for p just took: the tree has not changed since).
  void QuadInsert(std::int32_t p, std::int32_t from = 0);
  std::int32_t QuadNearest(double x, double y, double& bestD2);

  std::int32_t total_ = 0;
  Box box_{};
  double aspect_ = 1.0;
  // Grid.
  std::int32_t cols_ = 0, rows_ = 0;
  std::vector<double> xb_, yb_;  // cols_+1 and rows_+1 cell boundaries
  // Engine storage, not a vector: a grid of millions of cells then gets
  // the large pages the engine's arrays get, and its random reads do not
  // each miss the address translation cache.
  RecordArray<std::int32_t> heads_;
  RecordArray<Entry> entries_;
  std::int64_t nonEmpty_ = 0;
  // Sampling.
  bool sampling_ = false;
  std::int32_t sampleSize_ = 0;
  std::vector<std::int32_t> sample_;
  // Quadtree.
  bool quadtree_ = false;
  std::vector<QuadNode> quad_;
  struct Candidate {
    double d2;
    std::int32_t node;
    Box box;
  };
  std::vector<Candidate> heap_;
  std::vector<std::int32_t> path_;  // of the last search, root first

 public:
  ~NearestPointSearch() {
    heads_.Free();
    entries_.Free();
  }
};

void NearestPointSearch::Build(std::int32_t total, double minX, double minY, double maxX,
                               double maxY) {
  total_ = total;
  const double w = maxX - minX, h = maxY - minY;
  const double mx = std::max(w * kGridMarginFraction, kGridMinMargin);
  const double my = std::max(h * kGridMarginFraction, kGridMinMargin);
  box_ = {minX - mx, minY - my, maxX + mx, maxY + my};
  aspect_ = std::clamp((box_.x1 - box_.x0) / (box_.y1 - box_.y0), kMinAspect, kMaxAspect);
  std::int32_t k = static_cast<std::int32_t>(kSampleFraction * total);
  for (int i = 0; i < kMaxSampleDoublings && k < kMinSample; ++i) k *= 2;
  sampling_ = k >= kMinSample;
  sampleSize_ = sampling_ ? k : total;
  sample_.clear();
  quadtree_ = false;
  quad_.clear();
  BuildGrid(2 * std::int64_t{sampleSize_});
}

void NearestPointSearch::BuildGrid(std::int64_t cells) {
  // Columns times rows never exceed the cells asked for, and the cells are
  // counted in 32 bits.
  cells = std::clamp<std::int64_t>(cells, 1, kMaxCells);
  const double root = std::sqrt(static_cast<double>(cells));
  cols_ = static_cast<std::int32_t>(std::clamp(aspect_ * root, 1.0, 1e8));
  rows_ = static_cast<std::int32_t>(std::clamp(root / aspect_, 1.0, 1e8));
  xb_.resize(cols_ + 1);
  yb_.resize(rows_ + 1);
  for (std::int32_t i = 0; i <= cols_; ++i) xb_[i] = box_.x0 + (box_.x1 - box_.x0) * i / cols_;
  for (std::int32_t j = 0; j <= rows_; ++j) yb_[j] = box_.y0 + (box_.y1 - box_.y0) * j / rows_;
  xb_[cols_] = box_.x1;
  yb_[rows_] = box_.y1;
  const std::int64_t gridCells = std::int64_t{cols_} * rows_;
  heads_.count = 0;
  heads_.Reserve(gridCells);
  std::fill_n(heads_.data, gridCells, -1);
  heads_.count = static_cast<std::int32_t>(gridCells);
  entries_.count = 0;
  // Every point is entered once at most, so the entries never outgrow the
  // points: a fixed growth step instead cleared a block of that step's size
  // for each of the many small diagrams (a tenth of a run's instructions).
  entries_.Reserve(std::max(total_, 1));
  nonEmpty_ = 0;
}

std::int32_t NearestPointSearch::Column(double x) const {
  std::int32_t c = static_cast<std::int32_t>(
      std::clamp((x - box_.x0) / (box_.x1 - box_.x0) * cols_, 0.0, cols_ - 1.0));
  if (c > 0 && x < xb_[c]) --c;
  else if (c < cols_ - 1 && x >= xb_[c + 1]) ++c;
  return c;
}

std::int32_t NearestPointSearch::Row(double y) const {
  std::int32_t r = static_cast<std::int32_t>(
      std::clamp((y - box_.y0) / (box_.y1 - box_.y0) * rows_, 0.0, rows_ - 1.0));
  if (r > 0 && y < yb_[r]) --r;
  else if (r < rows_ - 1 && y >= yb_[r + 1]) ++r;
  return r;
}

void NearestPointSearch::GridLink(std::int32_t p) {
  const PointRecord& pt = Vd().points[p];
  const std::int32_t cell = Row(pt.y) * cols_ + Column(pt.x);
  if (heads_[cell] < 0) ++nonEmpty_;
  heads_[cell] = entries_.Append(Entry{pt.x, pt.y, p, heads_[cell]}, kEntryGrowth);
}

void NearestPointSearch::ScanCell(std::int32_t cell, double x, double y, std::int32_t& best,
                                  double& bestD2) const {
  for (std::int32_t e = heads_[cell]; e >= 0; e = entries_[e].next) {
    const Entry& q = entries_[e];
    const double dx = q.x - x, dy = q.y - y;
    const double d2 = dx * dx + dy * dy;
    if (d2 < bestD2) {
      bestD2 = d2;
      best = entries_[e].point;
    }
  }
}

std::int32_t NearestPointSearch::GridNearest(double x, double y, double& bestD2) const {
  // While the grid holds few points, nearly every cell is empty and a ring
  // search scans most of the grid to find one: comparing every entry is far
  // cheaper. Its answer is the ring search's when the nearest point is
  // unique and not coincident (the ring search stops at a coincident point
  // of the first cell, and of equal distances keeps the first it scans);
  // otherwise the ring search answers.
  if (entries_.count <= kScanAllEntries) {
    double nearest = std::numeric_limits<double>::infinity();
    std::int32_t found = -1;
    bool tie = false;
    for (std::int32_t e = 0; e < entries_.count; ++e) {
      const Entry& q = entries_[e];
      const double dx = q.x - x, dy = q.y - y;
      const double d2 = dx * dx + dy * dy;
      if (d2 < nearest) {
        nearest = d2;
        found = q.point;
        tie = false;
      } else if (d2 == nearest) {
        tie = true;
      }
    }
    if (found < 0 || (!tie && nearest > kCoincidentDist2)) {
      bestD2 = nearest;
      return found;
    }
  }
  const std::int32_t cx = Column(x), cy = Row(y);
  std::int32_t best = -1;
  bestD2 = std::numeric_limits<double>::infinity();
  ScanCell(cy * cols_ + cx, x, y, best, bestD2);
  if (bestD2 <= kCoincidentDist2) return best;
  const double inf = std::numeric_limits<double>::infinity();
  for (std::int32_t k = 1;; ++k) {
    // Nothing outside the block of cells within k-1 of (cx, cy) is nearer
    // than the block's boundary.
    const std::int32_t lo = cx - k + 1, hi = cx + k - 1, bo = cy - k + 1, to = cy + k - 1;
    if (lo <= 0 && hi >= cols_ - 1 && bo <= 0 && to >= rows_ - 1) break;
    double bound = inf;
    if (lo > 0) bound = std::min(bound, x - xb_[lo]);
    if (hi < cols_ - 1) bound = std::min(bound, xb_[hi + 1] - x);
    if (bo > 0) bound = std::min(bound, y - yb_[bo]);
    if (to < rows_ - 1) bound = std::min(bound, yb_[to + 1] - y);
    if (bound > 0 && bestD2 <= bound * bound) break;
    const std::int32_t i0 = std::max(cx - k, 0), i1 = std::min(cx + k, cols_ - 1);
    const std::int32_t j0 = std::max(cy - k, 0), j1 = std::min(cy + k, rows_ - 1);
    for (std::int32_t j = j0; j <= j1; ++j) {
      const bool edgeRow = j == cy - k || j == cy + k;
      if (edgeRow) {
        for (std::int32_t i = i0; i <= i1; ++i) ScanCell(j * cols_ + i, x, y, best, bestD2);
      } else {
        if (cx - k >= 0) ScanCell(j * cols_ + cx - k, x, y, best, bestD2);
        if (cx + k < cols_) ScanCell(j * cols_ + cx + k, x, y, best, bestD2);
      }
    }
  }
  return best;
}

// The block of cells around (x, y) that a grid search scans first: each of
// its rows is contiguous in heads_.
void NearestPointSearch::PrefetchCells(double x, double y, bool entries) const {
  if (quadtree_ || !(x >= box_.x0 && x <= box_.x1 && y >= box_.y0 && y <= box_.y1)) return;
  const std::int32_t cx = Column(x), cy = Row(y);
  const std::int32_t i0 = std::max(cx - kPrefetchRing, 0), i1 = std::min(cx + kPrefetchRing, cols_ - 1);
  for (std::int32_t j = std::max(cy - kPrefetchRing, 0); j <= std::min(cy + kPrefetchRing, rows_ - 1); ++j) {
    const std::int32_t* row = heads_.data + static_cast<std::size_t>(j) * cols_;
    if (!entries) {
      __builtin_prefetch(row + i0);
      __builtin_prefetch(row + i1);
      continue;
    }
    for (std::int32_t i = i0; i <= i1; ++i) entries_.Prefetch(row[i]);
  }
}

std::int32_t NearestPointSearch::PathStep(std::int32_t node, double x, double y) const {
  if (node < 0 || node >= static_cast<std::int32_t>(quad_.size())) return -1;
  const QuadNode& qn = quad_[node];
  for (const std::int32_t ch : qn.child) {
    if (ch >= 0) __builtin_prefetch(quad_.data() + ch);
  }
  return qn.child[(x >= qn.x ? 1 : 0) + (y >= qn.y ? 2 : 0)];
}

void NearestPointSearch::Record(std::int32_t p) {
  if (!sampling_) return;
  sample_.push_back(p);
  if (static_cast<std::int32_t>(sample_.size()) < sampleSize_) return;
  sampling_ = false;
  const double density = static_cast<double>(sample_.size()) / std::max<std::int64_t>(nonEmpty_, 1);
  if (density > kClusteredDensity) {
    SwitchToQuadtree();
  } else {
    const double f = std::clamp(density, kMinCellFactor, kMaxCellFactor);
    BuildGrid(static_cast<std::int64_t>(total_ * f));
    for (std::int32_t q : sample_) GridLink(q);
  }
  sample_.clear();
  sample_.shrink_to_fit();
}

void NearestPointSearch::SwitchToQuadtree() {
  quadtree_ = true;
  Vd().usedQuadtree = true;
  heads_.Free();
  entries_.Free();
  quad_.clear();
  quad_.reserve(static_cast<std::size_t>(total_));
  for (std::int32_t q : sample_) QuadInsert(q);
}

void NearestPointSearch::QuadInsert(std::int32_t p, std::int32_t from) {
  const PointRecord& pt = Vd().points[p];
  const std::int32_t fresh = static_cast<std::int32_t>(quad_.size());
  quad_.push_back(QuadNode{pt.x, pt.y, p, {-1, -1, -1, -1}});
  if (fresh == 0) return;
  std::int32_t n = from;
  for (;;) {
    const QuadNode& at = quad_[n];
    const int quadrant = (pt.x >= at.x ? 1 : 0) + (pt.y >= at.y ? 2 : 0);
    if (quad_[n].child[quadrant] < 0) {
      quad_[n].child[quadrant] = fresh;
      return;
    }
    n = quad_[n].child[quadrant];
  }
}

// The path the query would be inserted along gives a close first bound;
// then the subtrees off the path are searched nearest first. Subtrees at
// exactly the bound's distance are kept, so that ties go to the lowest
// point index whatever the order of the visits.
std::int32_t NearestPointSearch::QuadNearest(double x, double y, double& bestD2) {
  const double inf = std::numeric_limits<double>::infinity();
  bestD2 = inf;
  std::int32_t best = -1;
  const auto visit = [&](const QuadNode& qn) {
    const double dx = qn.x - x, dy = qn.y - y;
    const double d2 = dx * dx + dy * dy;
    if (d2 < bestD2 || (d2 == bestD2 && qn.point < best)) {
      bestD2 = d2;
      best = qn.point;
    }
  };
  const auto farther = [](const Candidate& a, const Candidate& b) { return a.d2 > b.d2; };
  // Queues the children of qn within box, but the one in quadrant skip.
  const auto queue = [&](const QuadNode& qn, const Box& box, int skip) {
    for (int q = 0; q < 4; ++q) {
      const std::int32_t ch = qn.child[q];
      if (ch < 0 || q == skip) continue;
      Box b = box;
      if (q & 1) b.x0 = qn.x; else b.x1 = qn.x;
      if (q & 2) b.y0 = qn.y; else b.y1 = qn.y;
      const double cd2 = Dist2ToBox(x, y, b);
      if (cd2 > bestD2) continue;
      __builtin_prefetch(quad_.data() + ch);
      heap_.push_back(Candidate{cd2, ch, b});
      std::push_heap(heap_.begin(), heap_.end(), farther);
    }
  };
  path_.clear();
  for (std::int32_t n = quad_.empty() ? -1 : 0; n >= 0;) {
    const QuadNode& qn = quad_[n];
    visit(qn);
    path_.push_back(n);
    n = qn.child[(x >= qn.x ? 1 : 0) + (y >= qn.y ? 2 : 0)];
  }
  heap_.clear();
  Box box{-inf, -inf, inf, inf};
  for (const std::int32_t n : path_) {
    const QuadNode& qn = quad_[n];
    const int q = (x >= qn.x ? 1 : 0) + (y >= qn.y ? 2 : 0);
    queue(qn, box, q);
    if (q & 1) box.x0 = qn.x; else box.x1 = qn.x;
    if (q & 2) box.y0 = qn.y; else box.y1 = qn.y;
  }
  while (!heap_.empty()) {
    std::pop_heap(heap_.begin(), heap_.end(), farther);
    const Candidate c = heap_.back();
    heap_.pop_back();
    if (c.d2 > bestD2) break;
    const QuadNode& qn = quad_[c.node];
    visit(qn);
    queue(qn, c.box, -1);
  }
  return best;
}

void NearestPointSearch::Insert(std::int32_t p) {
  if (quadtree_) {
    QuadInsert(p);
    return;
  }
  GridLink(p);
  Record(p);
}

std::int32_t NearestPointSearch::FindAndInsert(std::int32_t p, double& dist2) {
  const PointRecord& pt = Vd().points[p];
  const std::int32_t best = quadtree_ ? QuadNearest(pt.x, pt.y, dist2) : GridNearest(pt.x, pt.y, dist2);
  // A coincident point is never entered, wherever its twin was found: the
  // caller merges it, and a merged point must not be found later.
  if (best >= 0 && dist2 <= kCoincidentDist2) return best;
  if (quadtree_) QuadInsert(p, path_.empty() ? 0 : path_.back());
  else Insert(p);
  return best;
}

void BuildNearestSearch(std::int32_t totalPoints, double minX, double minY, double maxX,
                        double maxY) {
  Engine& g = Vd();
  if (!g.search) g.search = new NearestPointSearch;
  g.search->Build(totalPoints, minX, minY, maxX, maxY);
}

void InsertNearest(std::int32_t p) { Vd().search->Insert(p); }

Nearest FindAndInsertNearest(std::int32_t p) {
  Engine& g = Vd();
  Nearest found;
  if (!g.points[p].deleted) found.point = g.search->FindAndInsert(p, found.dist2);
  return found;
}

void PrefetchNearestCells(double x, double y) { Vd().search->PrefetchCells(x, y, false); }

void PrefetchNearestEntries(double x, double y) { Vd().search->PrefetchCells(x, y, true); }

std::int32_t NearestPathStart() { return Vd().search->PathStart(); }

std::int32_t NearestPathStep(std::int32_t node, double x, double y) {
  return Vd().search->PathStep(node, x, y);
}

void ReleaseNearestSearch() {
  Engine& g = Vd();
  delete g.search;
  g.search = nullptr;
}

}  // namespace zt::vd
