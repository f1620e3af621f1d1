// wf_init_czone, wf_add_level, wf_fin_czone and the placement of stock
// levels on contour levels.
#include "zone/entry_points.hpp"

#include <cstring>
#include <deque>
#include <future>
#include <memory>

#include "runtime/path_expansion.hpp"
#include "zone/assembly.hpp"
#include "zone/level_zone.hpp"
#include "zone/parameter_files.hpp"
#include "zone/worker_pool.hpp"

namespace zt {

namespace {

// Capacity of the buffers names are expanded in.
constexpr std::int32_t kNameCapacity = 512;

// Expands a "$TMP/..." name into `buffer`; false on an expansion error.
bool expand_name(const char* name, char (&buffer)[kNameCapacity]) {
  std::strncpy(buffer, name, kNameCapacity - 1);
  buffer[kNameCapacity - 1] = '\0';
  return expand_path(buffer, kNameCapacity) == kExpandOk;
}

// The first call's set-up: parameters, the reader of contour.bin and the
// index of its levels.
std::int32_t set_up_context(ZoneContext& context) {
  char contourName[kNameCapacity];
  const bool contourNamed = expand_name("$TMP/contour.bin", contourName);
  char zstockName[kNameCapacity];
  if (expand_name("$TMP/zstock.ok", zstockName)) {
    read_offset_distance(zstockName, context.offsetDistance);
  }
  ContourStore& store = context.store;
  if (!store.reader) store.reader = std::make_unique<CKvlBinaryResFileReader>();
  if (!contourNamed || store.reader->openPoints(contourName) != 0) return -1;
  return load_contours(store, read_contour_record);
}

// The context of the calling thread's first level, set up on first use; null
// when the set-up failed.
ZoneContext* level_context(ZoneBuilderState& state) {
  if (!state.context) {
    state.context = std::make_unique<ZoneContext>();
    if (set_up_context(*state.context) != 0) return nullptr;
  }
  return state.context.get();
}

// Appends a level's zones to temp1 on the contour level of z (none stored
// when the result is too small), with their grown form when there is one;
// -1 when z lies below every remaining contour level or the write failed.
std::int32_t store_level_zone(ZoneBuilderState& state, float z, const std::vector<Point2f>& result,
                              std::unique_ptr<GrownLevel> grown = nullptr) {
  const std::int32_t n = static_cast<std::int32_t>(result.size());
  if (n < kMinStoredPoints) return 0;
  const std::int32_t at =
      place_level(state.levelRanges.data(), state.levelCount, state.rangeCursor, z);
  if (at < 0) return -1;
  const std::int32_t first = state.pointsWritten + 1;
  const std::int32_t wrote = write_points(state.levelFile, result.data(), n, state.pointsWritten);
  state.levelRanges[at] = {first, state.pointsWritten, z};
  // A later level stored on the same entry replaces this one's zones, and
  // so its grown zones too.
  if (static_cast<std::size_t>(at) < state.grownLevels.size()) {
    state.grownLevels[static_cast<std::size_t>(at)] = std::move(grown);
  }
  return wrote == 0 ? 0 : -1;
}

// One level computed on a worker: its input, read on the calling thread in
// level order, and its result, stored in level order.
struct LevelJob {
  std::int32_t index = 0;
  bool active = false;  // the source gave points to add
  bool faulted = false;  // the source could not read the level
  bool failed = false;  // the context or the finishing contours could not be read
  float z = 0.0f;
  double offsetDistance = kMinOffsetDistance;
  std::vector<Point2f> points;
  TaggedPointList contour{0, kContextListGrowth};
  std::vector<Point2f> result;
  std::int32_t status = -1;
  float growRadius = -1.0f;  // at least 0: the zones are grown here too, by this
  std::unique_ptr<GrownLevel> grown;
  std::future<void> done;
};

// A worker's lists, kept from level to level.
thread_local std::unique_ptr<ZoneContext> tl_work;

void compute_job(LevelJob& job) {
  if (!tl_work) tl_work = std::make_unique<ZoneContext>();
  tl_work->offsetDistance = job.offsetDistance;
  job.status = zone_from_contours(*tl_work, job.contour, job.points.data(),
                                  static_cast<std::int32_t>(job.points.size()), job.result);
  job.points = {};
  job.contour.Free();
  const auto n = static_cast<std::int32_t>(job.result.size());
  if (job.status == 0 && job.growRadius >= 0.0f && n >= kMinStoredPoints) {
    // The assembly's grow of these zones, done now on this worker: in the
    // assembly only the unions wait for the level below.
    job.grown = std::make_unique<GrownLevel>();
    job.grown->radius = job.growRadius;
    TaggedPointList scratch(0, kContextListGrowth);
    job.grown->status = grow_level_zones(job.result.data(), n, scratch, job.grown->points);
  }
}

void add_levels_in_turn(LevelSource& source, std::int32_t& ierr) {
  std::vector<Point2f> points;
  for (std::int32_t i = 1; i <= source.count(); ++i) {
    float z = 0.0f;
    const LevelRead got = source.read(i, z, points);
    if (got == LevelRead::kFault) {
      source.fault(i);
      ierr = -1;
      return;
    }
    if (got == LevelRead::kPoints) {
      wf_add_level(z, points.data(), static_cast<std::int32_t>(points.size()), ierr);
      if (ierr != 0) return;
    }
    source.done(i);
  }
}

}  // namespace

std::int32_t place_level(const LevelRange* ranges, std::int32_t count, std::int32_t& cursor,
                         float z) {
  const float above = z + kLevelPlacementTolerance;
  while (cursor < count && ranges[cursor].z > above) ++cursor;
  return cursor < count ? cursor : -1;
}

void wf_init_czone(const float* levels, const std::int32_t& count, std::int32_t& ierr) {
  ierr = -1;
  ZoneBuilderState& state = zone_builder();
  state.pointsWritten = 0;
  state.rangeCursor = 0;
  if (count < 0 || (count > 0 && !levels)) return;
  char name[kNameCapacity];
  if (!expand_name("$TMP/temp1", name)) return;
  if (state.levelFile.create(name) != 0) return;
  state.levelCount = count;
  state.levelRanges.assign(static_cast<std::size_t>(count) + 2, LevelRange{});
  state.grownLevels.clear();
  for (std::int32_t i = 0; i < count; ++i) state.levelRanges[i].z = levels[i];
  ierr = 0;
}

void wf_add_level(const float& z, const Point2f* points, const std::int32_t& count,
                  std::int32_t& ierr) {
  ierr = -1;
  ZoneBuilderState& state = zone_builder();
  ZoneContext* context = level_context(state);
  if (!context || compute_level_zone(*context, double{z}, points, count) != 0) return;
  ierr = store_level_zone(state, z, context->levelResult);
}

void wf_add_levels(LevelSource& source, std::int32_t& ierr) {
  ierr = 0;
  const std::int32_t threads = zone_thread_count(source.count());
  if (threads <= 1) return add_levels_in_turn(source, ierr);
  std::deque<std::unique_ptr<LevelJob>> running;  // in level order; outlives the pool
  WorkerPool pool(threads);
  if (pool.size() < 1) return add_levels_in_turn(source, ierr);

  ZoneBuilderState& state = zone_builder();
  // The merge radius now, so that the workers grow each level's zones for the
  // assembly as they go; without it the assembly grows them (and reports a
  // missing or bad grid.tmp).
  float growRadius = -1.0f;
  state.grownLevels.clear();
  {
    char name[kNameCapacity];
    float radius = 0.0f;
    if (expand_name("$TMP/grid.tmp", name) && read_merge_radius(name, radius) == 0) {
      mergeRadius = radius;
      growRadius = radius;
      state.grownLevels.resize(state.levelRanges.size());
    }
  }
  // Stores the oldest level and reports it done; false when it failed.
  auto finish_oldest = [&]() {
    LevelJob& job = *running.front();
    if (job.faulted) {
      source.fault(job.index);
      return false;
    }
    if (job.active) {
      if (job.done.valid()) job.done.wait();
      if (job.failed || job.status != 0 ||
          store_level_zone(state, job.z, job.result, std::move(job.grown)) != 0) {
        return false;
      }
    }
    source.done(job.index);
    running.pop_front();
    return true;
  };
  bool reading = true;
  for (std::int32_t i = 1; i <= source.count() && reading; ++i) {
    // At most one level per worker is held at once.
    while (static_cast<std::int32_t>(running.size()) >= pool.size()) {
      if (!finish_oldest()) {
        ierr = -1;
        return;  // the pool waits for the levels under way
      }
    }
    auto job = std::make_unique<LevelJob>();
    job->index = i;
    const LevelRead got = source.read(i, job->z, job->points);
    job->active = got == LevelRead::kPoints;
    if (got == LevelRead::kFault) {
      job->faulted = true;
      reading = false;  // the levels before it end first, in order
    } else if (job->active) {
      ZoneContext* context = level_context(state);
      if (!context || read_level_contours(*context, double{job->z}, job->contour) != 0) {
        job->failed = true;
        reading = false;  // the levels before it still end in order
      } else {
        job->offsetDistance = context->offsetDistance;
        job->growRadius = growRadius;
        LevelJob* j = job.get();
        job->done = pool.run([j] { compute_job(*j); });
      }
    }
    running.push_back(std::move(job));
  }
  while (!running.empty()) {
    if (!finish_oldest()) {
      ierr = -1;
      return;
    }
  }
}

void wf_fin_czone(std::vector<Point2f>& points, const std::int32_t& unit, std::int32_t& ierr,
                  ContourWriter writeContour) {
  std::int32_t r = assemble_zones(points);
  if (r == 0) {
    char name[kNameCapacity];
    ZoneBuilderState& state = zone_builder();
    r = expand_name("$TMP/temp2", name)
            ? write_zones(unit, name, state.resultCount, state.resultRanges.data(), writeContour)
            : -1;
  }
  ierr = r;
}

}  // namespace zt
