// SlopeDomain::compute_in_groups: the offsets of a list as independent
// groups of polylines, each remembered for every thread.
//
// Polylines whose boxes lie farther apart than twice the offset distance
// (and a margin) cannot meet in their offset curves: every curve point lies
// at the offset distance from its own polylines and farther from all others.
// Each group is therefore offset in a diagram of its own, and a group equal
// in its fed coordinates to one offset before at the same distance, side and
// tolerance takes the curves remembered for it. Between levels of a part
// most features repeat while a few change (a drafted wall beside vertical
// bosses; the union carried up the assembly, whose untouched components
// come back from the Boolean engine a last bit apart, hence the grid the fed
// coordinates are rounded to), and only the groups that changed cost a
// diagram.
//
// What a group gives depends only on its fed coordinates, the distances,
// the side and the arc tolerance (the engine resets all it reads, its random
// draws included), so the result is the same whichever thread computed it
// and whatever was remembered before: the files stay the same for every
// thread count. The groups are remembered once for all threads (a level
// four levels down may have been offset on another thread), behind a lock
// taken only to look a group up and to add one.
#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <mutex>
#include <numeric>
#include <vector>

#include "zone/offset_readout.hpp"
#include "zone/slope_domain.hpp"

namespace zt {

namespace {

// Groups and points remembered; the least recently used group goes first.
constexpr std::size_t kRememberedGroups = 256;
constexpr std::size_t kRememberedGroupPoints = std::size_t{1} << 18;
// More polylines than this are offset as one group (the grouping compares
// boxes pairwise within a sweep).
constexpr std::size_t kMaxGroupedPolylines = 4096;
// Room the lists of a group's curves start with.
constexpr std::int32_t kGroupListCapacity = 4096;

struct FedRun {
  std::int32_t begin = 0;  // into the fed points
  std::int32_t end = 0;
  FeedBox box;
};

struct RememberedGroup {
  std::uint64_t hash = 0;
  std::uint64_t distanceBits = 0;
  std::uint64_t tBits = 0;
  std::uint64_t arcBits = 0;
  std::int32_t side = 0;
  std::vector<Point2d> input;
  std::vector<std::int32_t> lengths;
  std::vector<TaggedPoint> output;
  std::uint64_t used = 0;
};

struct GroupMemory {
  std::mutex mutex;
  std::vector<RememberedGroup> groups;
  std::uint64_t clock = 0;
};

// Never destroyed: a worker may still offset while the process ends.
GroupMemory& group_memory() {
  static GroupMemory* const memory = new GroupMemory;
  return *memory;
}

std::uint64_t mix(std::uint64_t z) {
  z += 0x9e3779b97f4a7c15ULL;
  z = (z ^ (z >> 30)) * 0xbf58476d1ce4e5b9ULL;
  z = (z ^ (z >> 27)) * 0x94d049bb133111ebULL;
  return z ^ (z >> 31);
}

double on_grid(double v) { return std::ldexp(std::nearbyint(std::ldexp(v, kFeedGridExponent)), -kFeedGridExponent); }

void widen(FeedBox& box, const Point2d& p) {
  box.xmin = std::min(box.xmin, p.x);
  box.xmax = std::max(box.xmax, p.x);
  box.ymin = std::min(box.ymin, p.y);
  box.ymax = std::max(box.ymax, p.y);
}

void widen(FeedBox& box, const FeedBox& other) {
  box.xmin = std::min(box.xmin, other.xmin);
  box.xmax = std::max(box.xmax, other.xmax);
  box.ymin = std::min(box.ymin, other.ymin);
  box.ymax = std::max(box.ymax, other.ymax);
}

std::int32_t root(std::vector<std::int32_t>& parent, std::int32_t a) {
  while (parent[static_cast<std::size_t>(a)] != a) {
    parent[static_cast<std::size_t>(a)] = parent[static_cast<std::size_t>(parent[static_cast<std::size_t>(a)])];
    a = parent[static_cast<std::size_t>(a)];
  }
  return a;
}

// Group number of each run (groups numbered by their first run), runs whose
// boxes lie within `gap` of each other in both directions joined.
std::vector<std::int32_t> group_runs(const std::vector<FedRun>& runs, double gap, std::int32_t& groups) {
  const auto n = static_cast<std::int32_t>(runs.size());
  std::vector<std::int32_t> parent(runs.size());
  std::iota(parent.begin(), parent.end(), 0);
  if (runs.size() <= kMaxGroupedPolylines) {
    std::vector<std::int32_t> order(runs.size());
    std::iota(order.begin(), order.end(), 0);
    std::sort(order.begin(), order.end(), [&](std::int32_t a, std::int32_t b) {
      return runs[static_cast<std::size_t>(a)].box.xmin < runs[static_cast<std::size_t>(b)].box.xmin;
    });
    for (std::size_t i = 0; i < order.size(); ++i) {
      const FeedBox& a = runs[static_cast<std::size_t>(order[i])].box;
      for (std::size_t j = i + 1; j < order.size(); ++j) {
        const FeedBox& b = runs[static_cast<std::size_t>(order[j])].box;
        if (b.xmin - a.xmax > gap) break;
        if (b.ymin - a.ymax > gap || a.ymin - b.ymax > gap) continue;
        const std::int32_t ra = root(parent, order[i]), rb = root(parent, order[j]);
        parent[static_cast<std::size_t>(std::max(ra, rb))] = std::min(ra, rb);
      }
    }
  } else {
    std::fill(parent.begin(), parent.end(), 0);
  }
  std::vector<std::int32_t> group(runs.size(), -1);
  groups = 0;
  std::vector<std::int32_t> number(runs.size(), -1);
  for (std::int32_t i = 0; i < n; ++i) {
    const std::int32_t r = root(parent, i);
    if (number[static_cast<std::size_t>(r)] < 0) number[static_cast<std::size_t>(r)] = groups++;
    group[static_cast<std::size_t>(i)] = number[static_cast<std::size_t>(r)];
  }
  return group;
}

// The remembered group equal to `key`, or nullptr; the caller holds the lock.
RememberedGroup* find_group(std::vector<RememberedGroup>& groups, const RememberedGroup& key) {
  for (RememberedGroup& g : groups) {
    if (g.hash == key.hash && g.distanceBits == key.distanceBits && g.tBits == key.tBits &&
        g.arcBits == key.arcBits && g.side == key.side && g.lengths == key.lengths &&
        g.input.size() == key.input.size() &&
        std::equal(g.input.begin(), g.input.end(), key.input.begin(), [](const Point2d& a, const Point2d& b) {
          return std::bit_cast<std::uint64_t>(a.x) == std::bit_cast<std::uint64_t>(b.x) &&
                 std::bit_cast<std::uint64_t>(a.y) == std::bit_cast<std::uint64_t>(b.y);
        })) {
      return &g;
    }
  }
  return nullptr;
}

// Copies the curves of the remembered group equal to `key` into `curves`;
// false when none is remembered.
bool recall_group(const RememberedGroup& key, TaggedPointList& curves) {
  GroupMemory& memory = group_memory();
  std::lock_guard<std::mutex> lock(memory.mutex);
  RememberedGroup* known = find_group(memory.groups, key);
  if (!known) return false;
  known->used = ++memory.clock;
  make_room(curves, static_cast<std::int32_t>(known->output.size()));
  for (const TaggedPoint& p : known->output) curves.Add(p);
  return true;
}

void remember_group(RememberedGroup&& group) {
  const std::size_t size = group.input.size() + group.output.size();
  if (size > kRememberedGroupPoints / 4) return;  // a group that large rarely repeats
  GroupMemory& memory = group_memory();
  std::lock_guard<std::mutex> lock(memory.mutex);
  if (find_group(memory.groups, group)) return;  // another thread offset it meanwhile
  std::vector<RememberedGroup>& groups = memory.groups;
  std::size_t held = 0;
  for (const RememberedGroup& g : groups) held += g.input.size() + g.output.size();
  while (!groups.empty() && (groups.size() >= kRememberedGroups || held + size > kRememberedGroupPoints)) {
    auto oldest = std::min_element(groups.begin(), groups.end(),
                                   [](const RememberedGroup& a, const RememberedGroup& b) { return a.used < b.used; });
    held -= oldest->input.size() + oldest->output.size();
    groups.erase(oldest);
  }
  group.used = ++memory.clock;
  groups.push_back(std::move(group));
}

}  // namespace

void forget_offset_groups() {
  forget_remembered_offsets();
  GroupMemory& memory = group_memory();
  std::lock_guard<std::mutex> lock(memory.mutex);
  memory.groups.clear();
}

std::int32_t SlopeDomain::compute_in_groups(TaggedPointList& list, std::int32_t side) {
  // The fed polylines, thinned as feed_contours thins them and put on the grid.
  std::vector<Point2d> fed;
  std::vector<FedRun> runs;
  FeedBox whole;
  if (list.count() > polyline_.capacity()) polyline_.SetCapacity(list.count());
  for (std::int32_t i = 0; next_fed_polyline(list, i);) {
    const Point2d* points = polyline_.data();
    const std::int32_t n = polyline_.count();
    FedRun run;
    run.begin = static_cast<std::int32_t>(fed.size());
    for (std::int32_t k = 0; k < n; ++k) {
      const Point2d p{on_grid(points[k].x), on_grid(points[k].y)};
      if (k > 0 && p.x == fed.back().x && p.y == fed.back().y) continue;
      fed.push_back(p);
      widen(run.box, p);
    }
    run.end = static_cast<std::int32_t>(fed.size());
    widen(whole, run.box);
    runs.push_back(run);
  }
  if (runs.empty()) {
    list.Clear();
    return 0;
  }
  const OffsetRequest request = offset_request(offsetDistance, whole);
  std::int32_t groups = 0;
  const std::vector<std::int32_t> group = group_runs(runs, 2.0 * request.t + kGroupGapMargin, groups);

  TaggedPointList result(0, kGroupListCapacity);
  TaggedPointList curves(0, kGroupListCapacity);
  for (std::int32_t g = 0; g < groups; ++g) {
    RememberedGroup key;
    key.distanceBits = std::bit_cast<std::uint64_t>(offsetDistance);
    key.tBits = std::bit_cast<std::uint64_t>(request.t);
    key.arcBits = std::bit_cast<std::uint64_t>(arcTolerance);
    key.side = side;
    FeedBox box;
    std::uint64_t hash = mix(static_cast<std::uint64_t>(side));
    for (std::size_t r = 0; r < runs.size(); ++r) {
      if (group[r] != g) continue;
      key.lengths.push_back(runs[r].end - runs[r].begin);
      hash = mix(hash ^ static_cast<std::uint64_t>(key.lengths.back()));
      for (std::int32_t k = runs[r].begin; k < runs[r].end; ++k) {
        const Point2d& p = fed[static_cast<std::size_t>(k)];
        key.input.push_back(p);
        hash = mix(hash ^ std::bit_cast<std::uint64_t>(p.x));
        hash = mix(hash ^ std::bit_cast<std::uint64_t>(p.y));
      }
      widen(box, runs[r].box);
    }
    key.hash = hash;
    curves.Clear();
    if (!recall_group(key, curves)) {
      engine_.reset();
      std::int32_t tag = 0;  // the polyline's number within the group
      for (std::size_t r = 0; r < runs.size(); ++r) {
        if (group[r] != g) continue;
        const Point2d* q = fed.data() + runs[r].begin;
        const std::int32_t n = runs[r].end - runs[r].begin;
        std::int32_t previous = engine_.addPoint(q[0].x, q[0].y, -1);
        for (std::int32_t k = 1; k < n; ++k) {
          const std::int32_t index = engine_.addPoint(q[k].x, q[k].y, k == n - 1 ? -1 : tag);
          engine_.addSegment(previous, index, tag);
          previous = index;
        }
        ++tag;
      }
      const OffsetRequest own = offset_request(offsetDistance, box);
      if (!engine_.computeDiagram(false, own.boundFactor, false, false, 0, 0, 0.0, 0.0, true)) return -1;
      if (!engine_.computeOffsets(side, request.t, 0.0)) return -1;
      out_ = &curves;
      emit_offsets(engine_, *this);
      out_ = &list;
      key.output.assign(curves.begin(), curves.end());
      remember_group(std::move(key));
    }
    // One separator between groups: each group's curves start with one.
    const std::int32_t skip = result.count() > 0 && curves.count() > 0 && curves[0].tag == kSeparatorTag ? 1 : 0;
    make_room(result, curves.count());
    for (std::int32_t i = skip; i < curves.count(); ++i) result.Add(curves[i]);
  }
  list.Clear();
  make_room(list, result.count());
  for (const TaggedPoint& p : result) list.Add(p);
  return 0;
}

}  // namespace zt
