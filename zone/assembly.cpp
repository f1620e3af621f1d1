// assemble_zones and merge_level_zones.
#include "zone/assembly.hpp"

#include <cassert>
#include <chrono>
#include <cstring>
#include <future>
#include <memory>

#include "regions/boolean.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime/progress.hpp"
#include "zone/offset_engine.hpp"
#include "zone/parameter_files.hpp"
#include "zone/simplify.hpp"
#include "zone/slope_domain.hpp"
#include "zone/worker_pool.hpp"

namespace zt {

namespace {

constexpr std::int32_t kNameCapacity = 512;
// The result range of a level not reached yet.
constexpr float kNoLevelZ = 99999.0f;
// Growth of the working lists and of the level output.
constexpr std::int32_t kListGrowth = 100;
constexpr std::size_t kLevelOutputCapacity = 10000;

bool expand_name(const char* name, char (&buffer)[kNameCapacity]) {
  std::strncpy(buffer, name, kNameCapacity - 1);
  buffer[kNameCapacity - 1] = '\0';
  return expand_path(buffer, kNameCapacity) == kExpandOk;
}

void append_all(const TaggedPointList& from, TaggedPointList& to) {
  make_room(to, from.count());
  for (const TaggedPoint& p : from) to.Add(p);
}

// Writes the level output and records its range; -1 when a write failed.
std::int32_t record_level(ZoneBuilderState& state, ScratchFile& zones,
                          const std::vector<Point2f>& output, std::int32_t& written, float z) {
  assert(state.resultCount < state.levelCount && "one result range per real level at most");
  const std::int32_t before = written;
  const std::int32_t r =
      write_points(zones, output.data(), static_cast<std::int32_t>(output.size()), written);
  state.resultRanges[state.resultCount++] = {before + 1, written, z};
  return r;
}

// Closes both scratch files and stops the calling thread's engine.
std::int32_t finish_assembly(ZoneBuilderState& state, ScratchFile& zones) {
  state.grownLevels.clear();
  const bool closed = zones.close() == 0;
  if (state.levelFile.close() != 0 || !closed) return -1;
  offset_engine().terminate();
  engineReady = false;
  return 0;
}

void ensure_engine() {
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
}

// One level of the assembly done at once with others: its grow and its
// shrink run on workers, the union on the calling thread in level order.
struct MergeJob {
  float z = 0.0f;
  bool hasPoints = false;
  std::vector<Point2f> points;  // the level's zones from temp1
  TaggedPointList grown{0, kListGrowth};
  std::unique_ptr<GrownLevel> pregrown;  // grown while the levels were computed
  std::int32_t grewStatus = -1;
  std::future<void> grew;
  TaggedPointList carried{0, kListGrowth};  // the union up to this level, shrunk in place
  std::vector<Point2f> output;
  std::int32_t shrankStatus = -1;
  std::future<void> shrank;
};

void grow_job(MergeJob& job) {
  ensure_engine();
  TaggedPointList B(0, kListGrowth);
  job.grewStatus = grow_level_zones(job.points.data(), static_cast<std::int32_t>(job.points.size()), B,
                                    job.grown);
  job.points = {};
}

void shrink_job(MergeJob& job) {
  ensure_engine();
  TaggedPointList B(0, kListGrowth);
  job.shrankStatus = shrink_level_zones(B, job.carried, job.output);
  job.carried.Free();
}

// The levels L down to 0 of assemble_zones on `threads` workers. Each level's
// grow starts as soon as its zones are read, up to one level per worker
// ahead of the union; each union's shrink starts as soon as the union is
// done; results are written and reported in level order, as the one-thread
// loop writes them (a level without zones of its own repeats the last
// result).
std::int32_t assemble_at_once(ZoneBuilderState& state, ScratchFile& zones, std::int32_t L,
                              std::int32_t threads, std::int32_t& written) {
  const std::int32_t total = L + 1;
  std::vector<std::unique_ptr<MergeJob>> jobs(static_cast<std::size_t>(total));  // outlive the pool
  WorkerPool pool(threads);
  const std::int32_t ahead = pool.size() < 1 ? 1 : pool.size();
  std::int32_t read = 0;  // levels read and their grows started: jobs[0..read)
  auto start_grow = [&](std::int32_t j) -> std::int32_t {
    const LevelRange range = state.levelRanges[L - j];
    auto job = std::make_unique<MergeJob>();
    job->z = range.z;
    job->hasPoints = range.hasPoints();
    std::unique_ptr<GrownLevel>* pregrown = static_cast<std::size_t>(L - j) < state.grownLevels.size()
                                                ? &state.grownLevels[static_cast<std::size_t>(L - j)]
                                                : nullptr;
    if (job->hasPoints && pregrown && *pregrown && (*pregrown)->radius == mergeRadius) {
      // Grown already, from the same zones and radius.
      job->pregrown = std::move(*pregrown);
      job->grewStatus = job->pregrown->status;
    } else if (job->hasPoints) {
      const std::int32_t n = range.last - range.first + 1;
      job->points.resize(static_cast<std::size_t>(n > 0 ? n : 0));
      if (read_points(state.levelFile, job->points.data(), n, std::int64_t{range.first} - 1) != 0) return -1;
      MergeJob* p = job.get();
      if (pool.size() > 0) {
        job->grew = pool.run([p] { grow_job(*p); });
      } else {
        grow_job(*p);
      }
    }
    jobs[static_cast<std::size_t>(j)] = std::move(job);
    return 0;
  };
  TaggedPointList A(0, kListGrowth);
  std::int32_t recorded = 0;      // levels written to temp2: jobs[0..recorded)
  std::int32_t lastWithZones = -1;  // the job whose output the levels after it repeat
  std::vector<std::int32_t> source(static_cast<std::size_t>(total), -1);
  std::int32_t previous = -1;       // the job whose output the last written level had
  // Writes level `recorded` once its result exists: 0, 1 when not ready
  // (only when not waiting), -1 on failure.
  auto record_next = [&](bool wait) -> std::int32_t {
    const std::int32_t from = source[static_cast<std::size_t>(recorded)];
    assert(from >= 0 && "the deepest level merged has zones");
    MergeJob& owner = *jobs[static_cast<std::size_t>(from)];
    if (owner.shrank.valid()) {
      if (!wait && owner.shrank.wait_for(std::chrono::seconds(0)) != std::future_status::ready) return 1;
      owner.shrank.get();
    }
    if (owner.shrankStatus != 0) return -1;
    if (record_level(state, zones, owner.output, written, jobs[static_cast<std::size_t>(recorded)]->z) != 0) {
      return -1;
    }
    // No later level repeats an earlier result.
    if (previous >= 0 && previous != from) jobs[static_cast<std::size_t>(previous)]->output = {};
    previous = from;
    ++recorded;
    progress(total, recorded);
    return 0;
  };
  for (std::int32_t j = 0; j < total; ++j) {
    while (read < total && read < j + ahead) {
      if (start_grow(read++) != 0) return -1;
    }
    MergeJob& job = *jobs[static_cast<std::size_t>(j)];
    if (job.hasPoints) {
      if (job.grew.valid()) job.grew.wait();
      TaggedPointList& grown = job.pregrown ? job.pregrown->points : job.grown;
      if (job.grewStatus != 0 || unite_level_zones(A, grown) != 0) return -1;
      job.grown.Free();
      job.pregrown.reset();
      append_all(A, job.carried);
      MergeJob* p = &job;
      if (pool.size() > 0) {
        job.shrank = pool.run([p] { shrink_job(*p); });
      } else {
        shrink_job(*p);
      }
      lastWithZones = j;
    }
    source[static_cast<std::size_t>(j)] = lastWithZones;
    // Results are written as they come, and at most one level per worker waits.
    for (;;) {
      const bool full = j + 1 - recorded > ahead;
      const std::int32_t r = record_next(full);
      if (r < 0) return -1;
      if (r > 0 || recorded > j) break;
    }
  }
  while (recorded < total) {
    if (record_next(true) != 0) return -1;
  }
  return 0;
}

}  // namespace

std::int32_t grow_level_zones(const Point2f* points, std::int32_t n, TaggedPointList& B,
                              TaggedPointList& C) {
  B.Clear();
  make_room(B, n);
  for (std::int32_t i = 0; i < n; ++i) {
    const std::int32_t tag = points[i].x >= kMergeSeparatorX ? kSeparatorTag : 0;
    B.Add({tag, double{points[i].x}, double{points[i].y}});
  }
  {
    SlopeDomain grow(double{mergeRadius} + kMergeGrowthMargin);
    if (grow.compute(B, kSideRight) != 0) return -1;
  }
  simplify_polylines(B, C, kGrownTolerance);
  return 0;
}

std::int32_t unite_level_zones(TaggedPointList& A, TaggedPointList& C) {
  if (A.count() > 0) {
    // Zones that grew into nothing leave the carried union as it is.
    if (C.count() > 0) {
      if (rg_boolean(A, C, "u", &C) != 0) return -1;
      simplify_polylines(C, A, kUnionTolerance);
    }
  } else {
    append_all(C, A);
  }
  return 0;
}

std::int32_t shrink_level_zones(TaggedPointList& B, TaggedPointList& C, std::vector<Point2f>& out) {
  out.clear();
  {
    SlopeDomain shrink(double{mergeRadius});
    if (shrink.compute(C, kSideLeft) != 0) return -1;
  }
  simplify_polylines(C, B, kShrunkTolerance);
  out.reserve(static_cast<std::size_t>(B.count()));
  for (const TaggedPoint& p : B) out.push_back({static_cast<float>(p.x), static_cast<float>(p.y)});
  return 0;
}

std::int32_t merge_level_zones(TaggedPointList& A, TaggedPointList& B, TaggedPointList& C,
                               const Point2f* points, std::int32_t n, std::vector<Point2f>& out) {
  out.clear();
  if (grow_level_zones(points, n, B, C) != 0 || unite_level_zones(A, C) != 0) return -1;
  C.Clear();
  append_all(A, C);
  return shrink_level_zones(B, C, out);
}

std::int32_t assemble_zones(std::vector<Point2f>& points) {
  ZoneBuilderState& state = zone_builder();
  char name[kNameCapacity];
  // A write the disk refused may only show when temp1 is flushed here.
  if (state.levelFile.close() != 0) return -1;
  if (!expand_name("$TMP/temp1", name) || state.levelFile.reopen(name) != 0) return -1;
  if (!expand_name("$TMP/grid.tmp", name) || read_merge_radius(name, mergeRadius) != 0) return -1;

  std::int32_t L = -1;
  for (std::int32_t k = 0; k < state.levelCount; ++k) {
    if (state.levelRanges[k].hasPoints()) L = k;
  }
  ScratchFile zones;
  if (!expand_name("$TMP/temp2", name) || zones.create(name) != 0) return -1;
  state.resultRanges.assign(static_cast<std::size_t>(state.levelCount) + 2,
                            LevelRange{-1, -1, kNoLevelZ});
  state.resultCount = 0;
  std::int32_t written = 0;

  const std::int32_t total = L + 1;
  progress(total, 0);
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
  const std::int32_t threads = zone_thread_count(total);
  if (threads > 1) {
    if (assemble_at_once(state, zones, L, threads, written) != 0) return -1;
    return finish_assembly(state, zones);
  }
  TaggedPointList A(0, kListGrowth), B(0, kListGrowth), C(0, kListGrowth);
  std::vector<Point2f> output;
  output.reserve(kLevelOutputCapacity);
  for (std::int32_t k = L, done = 1; k >= 0; --k, ++done) {
    const LevelRange range = state.levelRanges[k];
    if (range.hasPoints()) {
      const std::int32_t n = range.last - range.first + 1;
      if (n > 0 && points.size() < static_cast<std::size_t>(n)) points.resize(n);
      if (read_points(state.levelFile, points.data(), n, std::int64_t{range.first} - 1) != 0) {
        return -1;
      }
      if (merge_level_zones(A, B, C, points.data(), n, output) != 0) return -1;
    }
    if (record_level(state, zones, output, written, range.z) != 0) return -1;
    progress(total, done);
  }
  return finish_assembly(state, zones);
}

}  // namespace zt
