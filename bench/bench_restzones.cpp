// The whole program on a large generated case beside the Clipper reference
// pipeline on the same input files, in one run: both wall times, their ratio
// and both peak resident memories (each side runs in its own process).
//
// The case: a pocket with a wavy wall and six round islands over 50 levels
// (drafted: the wall moves in and the islands grow with depth), the rest
// material a band along the wall and a ring around each island; about 10,000
// finishing points and 20,000 rest-material points per level.
//
//   bench_restzones                      runs the benchmark
//   bench_restzones --reference DIR      (internal) the Clipper side on DIR
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

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
#include "tests/e2e/clipper_reference.hpp"

extern char** environ;

namespace {

using zt::e2e::RefLevel;
using zt::e2e::RefPoly;

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

// The Clipper side, in its own process: reads the same files, computes every
// level's final zones; 0 when some level has zones.
int run_reference(const std::string& dir) {
  const auto finishing = read_levels(dir + "/contour.bin");
  const auto rest = read_levels(dir + "/stock1.bin");
  std::vector<RefLevel> levels;
  for (std::size_t i = 0; i < finishing.size() && i < rest.size(); ++i)
    levels.push_back({finishing[i].first, finishing[i].second, rest[i].second});
  const auto zones = zt::e2e::reference_zones(levels, kOffsetDistance, kMergeRadius);
  return zones.empty() ? 1 : 0;
}

struct ChildRun {
  bool ok = false;
  double seconds = 0;
  double peakMiB = 0;
};

ChildRun spawn(const std::vector<std::string>& args, const std::string& cwd, const std::string& outFile) {
  std::vector<char*> argv;
  for (const std::string& a : args) argv.push_back(const_cast<char*>(a.c_str()));
  argv.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, outFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  posix_spawn_file_actions_addopen(&actions, 2, (outFile + ".err").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  const std::string previous = std::filesystem::current_path();
  std::filesystem::current_path(cwd);
  const auto start = std::chrono::steady_clock::now();
  pid_t pid = 0;
  const int spawned = posix_spawn(&pid, argv[0], &actions, nullptr, argv.data(), environ);
  std::filesystem::current_path(previous);
  posix_spawn_file_actions_destroy(&actions);
  ChildRun r;
  if (spawned != 0) return r;
  int status = 0;
  struct rusage usage {};
  wait4(pid, &status, 0, &usage);
  r.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  r.peakMiB = static_cast<double>(usage.ru_maxrss) / 1024.0;  // kilobytes on Linux
  r.ok = WIFEXITED(status) && WEXITSTATUS(status) == 0;
  return r;
}

std::string g_self;

void BM_RestzonesBesideClipper(benchmark::State& state) {
  const std::filesystem::path dir = std::filesystem::temp_directory_path() / ("bench_restzones_" + std::to_string(getpid()));
  std::filesystem::create_directories(dir);
  const std::vector<RefLevel> levels = make_case();
  write_records((dir / "contour.bin").string(), levels, false);
  write_records((dir / "stock1.bin").string(), levels, true);
  std::ofstream(dir / "zstock.ok") << "1.0\n";
  std::ofstream(dir / "grid.tmp") << "0 0\n0 0\n0.1 0\n2 0\n";
  std::ofstream(dir / "textg.fr") << std::string(138, '\n') << "Zones de reprise\n";
  setenv("KVLTMPDIR", dir.c_str(), 1);
  setenv("TXTPATH", dir.c_str(), 1);
  setenv("KVLLANG", "fr", 1);

  ChildRun program, clipper;
  for (auto _ : state) {
    std::filesystem::remove(dir / "stock2.bin");
    program = spawn({std::string(ZT_BINARY_DIR) + "/driver/restzones"}, dir.string(), (dir / "console.txt").string());
    clipper = spawn({g_self, "--reference", dir.string()}, dir.string(), (dir / "reference.txt").string());
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

}  // namespace

int main(int argc, char** argv) {
  if (argc == 3 && std::strcmp(argv[1], "--reference") == 0) return run_reference(argv[2]);
  g_self = std::filesystem::canonical("/proc/self/exe").string();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
