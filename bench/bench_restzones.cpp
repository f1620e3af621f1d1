// The whole program on large generated cases beside Clipper pipelines on the
// same input files, in one run: wall times, their ratios and peak resident
// memories (each side runs in its own process).
//
// BM_RestzonesBesideClipper: a pocket with a wavy wall and six round islands
// over 50 levels (drafted: the wall moves in and the islands grow with
// depth), the rest material a band along the wall and a ring around each
// island; about 10,000 finishing points and 20,000 rest-material points per
// level; the peer is the plain Clipper pipeline (ClipperOffset, round joins).
//
// BM_MoldBesideTunedClipper: a dense mold of 50 levels, 20,000 finishing
// points a level (a cavity and a boss, both rounded rectangles with finely
// sampled fillets) and about 4,000 rest-material points a level in corner
// crescents, wall strips and floor blobs; the peer is the tuned Clipper
// pipeline (bench/tuned_clipper.hpp). Each round runs the program on one
// thread, on every hardware thread, and the peer, in turn; the ratios are the
// medians of the ratios within rounds (the figure to quote on a shared
// machine).
//
// BM_MoldTopBesidePlainClipper: the mold's first four levels, the program on
// one thread beside the plain Clipper pipeline (which takes many minutes on
// the whole mold).
//
//   bench_restzones                              runs the benchmarks
//   bench_restzones --write-mold DIR [straight]  writes the mold's input files to
//                                                DIR (to profile the program on it);
//                                                straight: vertical walls, every
//                                                level alike
//   bench_restzones --reference DIR plain|tuned  (internal) a Clipper side on DIR
//   bench_restzones --exec USAGE PROGRAM ARGS... (internal) runs PROGRAM, its figures to USAGE
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "driver/level_tables.hpp"
#include "driver/logical_units.hpp"
#include "driver/record_files.hpp"
#include "driver/record_stream.hpp"
#include "bench/tuned_clipper.hpp"
#include "tests/e2e/clipper_reference.hpp"

extern char** environ;

namespace {

using zt::e2e::RefLevel;
using zt::e2e::RefPoly;
using zt::e2e::RefPt;

constexpr int kLevels = 50;
constexpr int kWallPoints = 4000;
constexpr int kIslands = 6;
constexpr int kIslandPoints = 1000;
constexpr double kPi = 3.14159265358979323846;
constexpr double kOffsetDistance = 1.0;  // zstock.ok
constexpr double kMergeRadius = 2.0;     // grid.tmp
// Levels of a file: z within this of the level's first z.
constexpr float kLevelTolerance = 0.0001f;

RefPoly ring(double cx, double cy, int n, bool clockwise, double (*radius)(double, double), double param) {
  RefPoly p;
  for (int i = 0; i < n; ++i) {
    const double a = 2 * kPi * (clockwise ? n - i : i) / n;
    const double r = radius(a, param);
    p.push_back({static_cast<float>(cx + r * std::cos(a)), static_cast<float>(cy + r * std::sin(a))});
  }
  p.push_back(p.front());
  return p;
}
double wall_radius(double a, double inset) { return 200 - inset + 6 * std::sin(9 * a); }
double island_radius(double, double r) { return r; }

std::vector<RefLevel> make_case() {
  std::vector<RefLevel> levels;
  for (int k = 0; k < kLevels; ++k) {
    const double depth = k + 1, draft = 0.02 * depth, band = 0.3 + 0.1 * (k % 3);
    RefLevel l{static_cast<float>(-depth), {}, {}};
    l.finishing.push_back(ring(0, 0, kWallPoints, false, wall_radius, draft));
    l.rest.push_back(ring(0, 0, kWallPoints, false, wall_radius, draft));
    l.rest.push_back(ring(0, 0, kWallPoints, true, wall_radius, draft + band));
    for (int i = 0; i < kIslands; ++i) {
      const double a = 2 * kPi * i / kIslands, cx = 110 * std::cos(a), cy = 110 * std::sin(a);
      const double r = 20 + draft;
      l.finishing.push_back(ring(cx, cy, kIslandPoints, true, island_radius, r));
      l.rest.push_back(ring(cx, cy, kIslandPoints, false, island_radius, r + band));
      l.rest.push_back(ring(cx, cy, kIslandPoints, true, island_radius, r));
    }
    levels.push_back(std::move(l));
  }
  return levels;
}

// The dense mold: a cavity and a boss, rounded rectangles whose fillets are
// sampled finely (drafted: the cavity narrows and the boss widens with
// depth); rest material in the cavity's corners (crescents between the
// fillet and a larger tool's path), along two walls and in floor blobs.
constexpr int kMoldLevels = 50;
constexpr int kCavityFilletPoints = 3000, kCavitySidePoints = 1000;
constexpr int kBossFilletPoints = 500, kBossSidePoints = 500;
constexpr int kCrescentPoints = 400, kStripPoints = 200, kBlobPoints = 300;

// A closed rounded rectangle, counter-clockwise unless `clockwise`.
RefPoly rounded_rectangle(double cx, double cy, double hx, double hy, double r, int filletPoints, int sidePoints,
                          bool clockwise) {
  RefPoly p;
  const double corners[4][2] = {{1, -1}, {1, 1}, {-1, 1}, {-1, -1}};  // start angles -90, 0, 90, 180
  for (int c = 0; c < 4; ++c) {
    const double fx = cx + corners[c][0] * (hx - r), fy = cy + corners[c][1] * (hy - r);
    const double a0 = (c - 1) * kPi / 2;
    // The straight side before this fillet.
    const double sx = cx + corners[(c + 3) % 4][0] * (hx - r), sy = cy + corners[(c + 3) % 4][1] * (hy - r);
    const double bx = sx + r * std::cos(a0), by = sy + r * std::sin(a0);
    const double ex = fx + r * std::cos(a0), ey = fy + r * std::sin(a0);
    for (int i = 0; i < sidePoints; ++i) {
      const double t = static_cast<double>(i) / sidePoints;
      p.push_back({bx + t * (ex - bx), by + t * (ey - by)});
    }
    for (int i = 0; i < filletPoints; ++i) {
      const double a = a0 + kPi / 2 * i / filletPoints;
      p.push_back({fx + r * std::cos(a), fy + r * std::sin(a)});
    }
  }
  for (RefPt& q : p) q = {static_cast<float>(q.x), static_cast<float>(q.y)};
  if (clockwise) std::reverse(p.begin(), p.end());
  p.push_back(p.front());
  return p;
}

// Straight: vertical walls, the same rest material on every level.
std::vector<RefLevel> make_mold(bool straight = false) {
  std::vector<RefLevel> levels;
  for (int k = 0; k < kMoldLevels; ++k) {
    const double draft = straight ? 0.0 : 0.02 * (k + 1), band = straight ? 2.0 : 1.5 + 0.5 * (k % 3);
    const double hx = 100 - draft, hy = 70 - draft, r = 8;
    RefLevel l{static_cast<float>(-(k + 1)), {}, {}};
    l.finishing.push_back(rounded_rectangle(0, 0, hx, hy, r, kCavityFilletPoints, kCavitySidePoints, false));
    l.finishing.push_back(rounded_rectangle(20, -10, 25 + draft, 15 + draft, 5, kBossFilletPoints, kBossSidePoints, true));
    auto add = [&](RefPoly p) {
      for (RefPt& q : p) q = {static_cast<float>(q.x), static_cast<float>(q.y)};
      p.push_back(p.front());
      l.rest.push_back(std::move(p));
    };
    const double signs[4][2] = {{1, -1}, {1, 1}, {-1, 1}, {-1, -1}};
    for (int c = 0; c < 4; ++c) {  // crescents: the fillet out, the larger tool's path back
      const double fx = signs[c][0] * (hx - r), fy = signs[c][1] * (hy - r), a0 = (c - 1) * kPi / 2;
      RefPoly p;
      for (int i = 0; i <= kCrescentPoints; ++i) {
        const double a = a0 + kPi / 2 * i / kCrescentPoints;
        p.push_back({fx + r * std::cos(a), fy + r * std::sin(a)});
      }
      for (int i = kCrescentPoints - 1; i > 0; --i) {
        const double f = static_cast<double>(i) / kCrescentPoints, a = a0 + kPi / 2 * f;
        const double rr = r - band * std::sin(kPi * f);
        p.push_back({fx + rr * std::cos(a), fy + rr * std::sin(a)});
      }
      add(p);
    }
    const double w = straight ? 0.3 : 0.3 + 0.1 * (k % 2);
    {  // strip along the bottom wall
      RefPoly p;
      for (int i = 0; i <= kStripPoints; ++i) p.push_back({-60 + 100.0 * i / kStripPoints, -hy});
      for (int i = kStripPoints; i >= 0; --i) p.push_back({-60 + 100.0 * i / kStripPoints, -hy + w});
      add(p);
    }
    {  // strip along the left wall
      RefPoly p;
      for (int i = 0; i <= kStripPoints; ++i) p.push_back({-hx + w, -40 + 80.0 * i / kStripPoints});
      for (int i = kStripPoints; i >= 0; --i) p.push_back({-hx, -40 + 80.0 * i / kStripPoints});
      add(p);
    }
    const double blobs[3][2] = {{-50, 30}, {60, 40}, {-20, -45}};
    for (const auto& b : blobs) {
      RefPoly p;
      for (int i = 0; i < kBlobPoints; ++i) {
        const double a = 2 * kPi * i / kBlobPoints, rr = 4 + (straight ? 0 : 0.3 * (k % 4)) + 1.5 * std::sin(5 * a);
        p.push_back({b[0] + rr * std::cos(a), b[1] + rr * std::sin(a)});
      }
      add(p);
    }
    levels.push_back(std::move(l));
  }
  return levels;
}

void write_records(const std::string& path, const std::vector<RefLevel>& levels, bool rest) {
  const std::int32_t unit = zt::free_unit();
  zt::attach_record_output(unit, path);
  std::vector<zt::Point2f> pts;
  for (const RefLevel& l : levels)
    for (const RefPoly& p : rest ? l.rest : l.finishing) {
      pts.clear();
      for (const auto& q : p) pts.push_back({static_cast<float>(q.x), static_cast<float>(q.y)});
      std::int32_t ierr = 0;
      zt::write_contour(static_cast<std::int32_t>(pts.size()), pts.data(), l.z, unit, ierr);
    }
  zt::close_unit(unit);
}

// The contours of a record file grouped into levels as the driver groups them.
std::vector<std::pair<float, std::vector<RefPoly>>> read_levels(const std::string& path) {
  std::vector<std::pair<float, std::vector<RefPoly>>> out;
  zt::RecordReader reader;
  if (!reader.open(path)) return out;
  std::uint8_t head[zt::kPointXyzBytes];
  std::size_t length = 0;
  bool fresh = true;
  while (reader.read(head, length) == zt::ReadStatus::kRecord && length >= zt::kPointXyzBytes) {
    float x = 0, y = 0, z = 0;
    zt::decode_xyz(head, x, y, z);
    if (x > zt::kDriverSeparatorX) {
      fresh = true;
      continue;
    }
    if (out.empty() || std::fabs(z - out.back().first) > kLevelTolerance) {
      out.push_back({z, {}});
      fresh = true;
    }
    if (fresh) out.back().second.emplace_back();
    fresh = false;
    out.back().second.back().push_back({x, y});
  }
  return out;
}

// The zone area of a set of levels: per level the absolute value of the
// sum of its contours' signed areas (both sides' orientations alike).
double zone_area(const std::vector<std::vector<RefPoly>>& levels) {
  double total = 0;
  for (const auto& level : levels) {
    double a = 0;
    for (const RefPoly& p : level)
      for (std::size_t i = 0; i + 1 < p.size(); ++i) a += p[i].x * p[i + 1].y - p[i + 1].x * p[i].y;
    total += std::fabs(a / 2);
  }
  return total;
}

// A Clipper side, in its own process: reads the same files, computes every
// level's final zones, prints their area; 0 when some level has zones.
int run_reference(const std::string& dir, const std::string& mode) {
  const auto finishing = read_levels(dir + "/contour.bin");
  const auto rest = read_levels(dir + "/stock1.bin");
  std::vector<RefLevel> levels;
  for (std::size_t i = 0; i < finishing.size() && i < rest.size(); ++i)
    levels.push_back({finishing[i].first, finishing[i].second, rest[i].second});
  const auto zones = mode == "tuned" ? zt::bench::tuned_zones(levels, kOffsetDistance, kMergeRadius)
                                     : zt::e2e::reference_zones(levels, kOffsetDistance, kMergeRadius);
  std::vector<std::vector<RefPoly>> polys;
  for (const auto& [z, paths] : zones) {
    polys.emplace_back();
    for (const auto& path : paths) {
      RefPoly p;
      for (const auto& q : path) p.push_back({q.X / zt::test::kClipperScale, q.Y / zt::test::kClipperScale});
      if (!p.empty()) p.push_back(p.front());
      polys.back().push_back(p);
    }
  }
  std::printf("area %.17g\n", zone_area(polys));
  return zones.empty() ? 1 : 0;
}

double printed_area(const std::string& file) {
  std::ifstream in(file);
  std::string word;
  double area = 0;
  in >> word >> area;
  return area;
}

struct ChildRun {
  bool ok = false;
  double seconds = 0;
  double peakMiB = 0;
  double cpuSeconds = 0;
};

std::string g_self;

double cpu_seconds(const struct rusage& usage) {
  return static_cast<double>(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) +
         1e-6 * static_cast<double>(usage.ru_utime.tv_usec + usage.ru_stime.tv_usec);
}

// --exec USAGE PROGRAM ARGS...: runs PROGRAM and writes its wall seconds,
// CPU seconds and peak resident KiB to USAGE; exits with its status. The
// sides run under this fresh, small process: a process started straight
// from the benchmark shares the benchmark's memory until it runs its
// program, and the system counts that in the program's peak.
int run_measured(char** argv) {
  const char* usageFile = argv[0];
  const auto start = std::chrono::steady_clock::now();
  pid_t pid = 0;
  if (posix_spawn(&pid, argv[1], nullptr, nullptr, argv + 1, environ) != 0) return 127;
  int status = 0;
  struct rusage usage {};
  wait4(pid, &status, 0, &usage);
  const double wall = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  std::ofstream(usageFile) << wall << ' ' << cpu_seconds(usage) << ' ' << usage.ru_maxrss << '\n';
  return WIFEXITED(status) ? WEXITSTATUS(status) : 1;
}

ChildRun spawn(const std::vector<std::string>& args, const std::string& cwd, const std::string& outFile) {
  const std::string usageFile = outFile + ".usage";
  std::vector<char*> argv;
  argv.push_back(const_cast<char*>(g_self.c_str()));
  argv.push_back(const_cast<char*>("--exec"));
  argv.push_back(const_cast<char*>(usageFile.c_str()));
  for (const std::string& a : args) argv.push_back(const_cast<char*>(a.c_str()));
  argv.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, outFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  posix_spawn_file_actions_addopen(&actions, 2, (outFile + ".err").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  const std::string previous = std::filesystem::current_path();
  std::filesystem::current_path(cwd);
  pid_t pid = 0;
  const int spawned = posix_spawn(&pid, g_self.c_str(), &actions, nullptr, argv.data(), environ);
  std::filesystem::current_path(previous);
  posix_spawn_file_actions_destroy(&actions);
  ChildRun r;
  if (spawned != 0) return r;
  int status = 0;
  waitpid(pid, &status, 0);
  double kib = 0;
  std::ifstream(usageFile) >> r.seconds >> r.cpuSeconds >> kib;
  r.peakMiB = kib / 1024.0;
  r.ok = WIFEXITED(status) && WEXITSTATUS(status) == 0 && r.seconds > 0;
  return r;
}

// A fresh directory holding a case's input files; the environment points
// the program at it.
std::filesystem::path prepare_case(const char* name, const std::vector<RefLevel>& levels) {
  const std::filesystem::path dir =
      std::filesystem::temp_directory_path() / (std::string(name) + "_" + std::to_string(getpid()));
  std::filesystem::create_directories(dir);
  write_records((dir / "contour.bin").string(), levels, false);
  write_records((dir / "stock1.bin").string(), levels, true);
  std::ofstream(dir / "zstock.ok") << "1.0\n";
  std::ofstream(dir / "grid.tmp") << "0 0\n0 0\n0.1 0\n2 0\n";
  std::ofstream(dir / "textg.fr") << std::string(138, '\n') << "Zones de reprise\n";
  setenv("KVLTMPDIR", dir.c_str(), 1);
  setenv("TXTPATH", dir.c_str(), 1);
  setenv("KVLLANG", "fr", 1);
  return dir;
}

void BM_RestzonesBesideClipper(benchmark::State& state) {
  const std::filesystem::path dir = prepare_case("bench_restzones", make_case());
  unsetenv("RESTZONES_THREADS");

  ChildRun program, clipper;
  for (auto _ : state) {
    std::filesystem::remove(dir / "stock2.bin");
    program = spawn({std::string(ZT_BINARY_DIR) + "/driver/restzones"}, dir.string(), (dir / "console.txt").string());
    clipper = spawn({g_self, "--reference", dir.string(), "plain"}, dir.string(), (dir / "reference.txt").string());
    state.SetIterationTime(program.seconds);
  }
  if (!program.ok || !std::filesystem::exists(dir / "stock2.bin")) state.SkipWithError("restzones failed");
  if (!clipper.ok) state.SkipWithError("reference failed");
  state.counters["restzones_s"] = program.seconds;
  state.counters["clipper_s"] = clipper.seconds;
  state.counters["ratio"] = program.seconds / clipper.seconds;
  state.counters["restzones_MiB"] = program.peakMiB;
  const auto zones = read_levels((dir / "stock2.bin").string());
  double points = 0;
  for (const auto& level : zones)
    for (const RefPoly& p : level.second) points += static_cast<double>(p.size());
  state.counters["zone_levels"] = static_cast<double>(zones.size());
  state.counters["zone_points"] = points;
  state.counters["clipper_MiB"] = clipper.peakMiB;
  std::error_code ec;
  std::filesystem::remove_all(dir, ec);
}
BENCHMARK(BM_RestzonesBesideClipper)->Iterations(1)->UseManualTime()->Unit(benchmark::kSecond);

// Rounds of the mold benchmark (each runs all three sides).
constexpr int kMoldRounds = 3;

double median(std::vector<double> v) {
  std::sort(v.begin(), v.end());
  return v.empty() ? 0 : v[v.size() / 2];
}

void BM_MoldBesideTunedClipper(benchmark::State& state) {
  const std::filesystem::path dir = prepare_case("bench_mold", make_mold());
  const std::string program = std::string(ZT_BINARY_DIR) + "/driver/restzones";
  std::vector<double> oneRatio, allRatio, one, all, tuned;
  ChildRun a, b, c;
  for (auto _ : state) {
    for (int round = 0; round < kMoldRounds; ++round) {
      setenv("RESTZONES_THREADS", "1", 1);
      a = spawn({program}, dir.string(), (dir / "console1.txt").string());
      unsetenv("RESTZONES_THREADS");
      b = spawn({program}, dir.string(), (dir / "console.txt").string());
      c = spawn({g_self, "--reference", dir.string(), "tuned"}, dir.string(), (dir / "reference.txt").string());
      if (!a.ok || !b.ok || !c.ok) break;
      one.push_back(a.seconds), all.push_back(b.seconds), tuned.push_back(c.seconds);
      oneRatio.push_back(a.seconds / c.seconds), allRatio.push_back(b.seconds / c.seconds);
    }
    state.SetIterationTime(median(all));
  }
  if (!a.ok || !b.ok) state.SkipWithError("restzones failed");
  if (!c.ok) state.SkipWithError("tuned reference failed");
  state.counters["one_thread_s"] = median(one);
  state.counters["all_threads_s"] = median(all);
  state.counters["tuned_s"] = median(tuned);
  state.counters["ratio_one_thread"] = median(oneRatio);
  state.counters["ratio_all_threads"] = median(allRatio);
  // CPU seconds of the last round: on a loaded machine wall times stretch.
  state.counters["one_thread_cpu_s"] = a.cpuSeconds;
  state.counters["all_threads_cpu_s"] = b.cpuSeconds;
  state.counters["tuned_cpu_s"] = c.cpuSeconds;
  state.counters["one_thread_MiB"] = a.peakMiB;
  state.counters["all_threads_MiB"] = b.peakMiB;
  state.counters["tuned_MiB"] = c.peakMiB;
  std::vector<std::vector<RefPoly>> ours;
  for (auto& level : read_levels((dir / "stock2.bin").string())) ours.push_back(std::move(level.second));
  // Both sides' zone areas agree to a fraction of a percent when both are sound.
  state.counters["area_over_tuned"] = zone_area(ours) / printed_area((dir / "reference.txt").string());
  std::error_code ec;
  std::filesystem::remove_all(dir, ec);
}
BENCHMARK(BM_MoldBesideTunedClipper)->Iterations(1)->UseManualTime()->Unit(benchmark::kSecond);

// Levels of the mold the plain pipeline gets: on all 50 it runs for many
// minutes (its round joins on 20,000 finely sampled points a level).
constexpr int kPlainMoldLevels = 4;

void BM_MoldTopBesidePlainClipper(benchmark::State& state) {
  std::vector<RefLevel> levels = make_mold();
  levels.resize(kPlainMoldLevels);
  const std::filesystem::path dir = prepare_case("bench_mold_top", levels);
  const std::string program = std::string(ZT_BINARY_DIR) + "/driver/restzones";
  ChildRun a, c;
  for (auto _ : state) {
    setenv("RESTZONES_THREADS", "1", 1);
    a = spawn({program}, dir.string(), (dir / "console1.txt").string());
    unsetenv("RESTZONES_THREADS");
    c = spawn({g_self, "--reference", dir.string(), "plain"}, dir.string(), (dir / "reference.txt").string());
    state.SetIterationTime(a.seconds);
  }
  if (!a.ok) state.SkipWithError("restzones failed");
  if (!c.ok) state.SkipWithError("plain reference failed");
  state.counters["one_thread_s"] = a.seconds;
  state.counters["plain_s"] = c.seconds;
  state.counters["ratio_one_thread"] = a.seconds / c.seconds;
  state.counters["one_thread_cpu_s"] = a.cpuSeconds;
  state.counters["plain_cpu_s"] = c.cpuSeconds;
  state.counters["cpu_ratio"] = a.cpuSeconds / c.cpuSeconds;
  state.counters["one_thread_MiB"] = a.peakMiB;
  state.counters["plain_MiB"] = c.peakMiB;
  std::error_code ec;
  std::filesystem::remove_all(dir, ec);
}
BENCHMARK(BM_MoldTopBesidePlainClipper)->Iterations(1)->UseManualTime()->Unit(benchmark::kSecond);

}  // namespace

int main(int argc, char** argv) {
  if (argc >= 4 && std::strcmp(argv[1], "--exec") == 0) return run_measured(argv + 2);
  if (argc == 4 && std::strcmp(argv[1], "--reference") == 0) return run_reference(argv[2], argv[3]);
  if ((argc == 3 || argc == 4) && std::strcmp(argv[1], "--write-mold") == 0) {
    const std::filesystem::path dir = prepare_case("bench_mold", make_mold(argc == 4 && std::strcmp(argv[3], "straight") == 0));
    std::filesystem::create_directories(argv[2]);
    std::filesystem::copy(dir, argv[2], std::filesystem::copy_options::overwrite_existing | std::filesystem::copy_options::recursive);
    std::filesystem::remove_all(dir);
    return 0;
  }
  g_self = std::filesystem::canonical("/proc/self/exe").string();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
