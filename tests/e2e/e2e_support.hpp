// Support of the end-to-end tests: a fresh temporary directory per run, the
// real restzones started in it as a subprocess, and what it left behind.
#pragma once

#include <gtest/gtest.h>

#include <sys/wait.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "driver/test_files.hpp"
#include "support/subprocess.hpp"

namespace zt::e2e {

using test::Bytes;

// Wall-clock limit of one run; a run that takes longer counts as a hang.
inline constexpr int kRunTimeoutSeconds = 120;
// Exit status of `timeout` when it had to stop the program.
inline constexpr int kTimedOut = 124;
// The console scale line of the progress bar.
inline constexpr const char* kScaleLine = "\r 10-20-30-40-50-60-70-80-90-100%\n\n";
inline constexpr const char* kBanner = "Calcul des zones de reprise";

struct Pt {
  float x, y;
};
struct Contour {
  float z;
  std::vector<Pt> points;
};

// A record file of 18-byte point records: a separator before each contour.
inline Bytes records(const std::vector<Contour>& contours) {
  std::vector<Bytes> r;
  for (const Contour& c : contours) {
    r.push_back(test::separator());
    for (const Pt& p : c.points) r.push_back(test::point(p.x, p.y, c.z));
  }
  return test::record_file(r);
}

// The closed counter-clockwise square lo..hi on each of the given levels:
// the pocket 0..100, and a square of rest material 40..60.
inline Bytes squares(const std::vector<float>& levels, float lo, float hi) {
  std::vector<Contour> c;
  for (float z : levels) c.push_back({z, {{lo, lo}, {hi, lo}, {hi, hi}, {lo, hi}, {lo, lo}}});
  return records(c);
}
inline Bytes pocket(const std::vector<float>& levels) { return squares(levels, 0, 100); }
inline Bytes rest(const std::vector<float>& levels) { return squares(levels, 40, 60); }

// The closed contours of a result file, as read back byte by byte; false
// when the file is not a complete record file of 18-byte point records.
inline bool read_result(const Bytes& file, std::vector<Contour>& out) {
  if (file.size() < 2 || file.front() != kRecordFileMarker || file.back() != kRecordEndMarker) return false;
  std::size_t at = 1;
  while (at + 1 < file.size()) {
    if (file[at] != kPointRecordBytes || at + kPointRecordBytes + 2 > file.size() ||
        file[at + kPointRecordBytes + 1] != kPointRecordBytes)
      return false;
    float x = 0, y = 0, z = 0;
    decode_xyz(&file[at + 1], x, y, z);
    if (x > 99998.0f) {
      out.push_back({0, {}});
    } else {
      if (out.empty()) return false;
      out.back().z = z;
      out.back().points.push_back({x, y});
    }
    at += kPointRecordBytes + 2;
  }
  return at + 1 == file.size();
}

// One run of the program in a fresh directory: $TMP is dir/tmp, the message
// file of the banner lies in it too.
class ProgramRun {
 public:
  ProgramRun() {
    std::filesystem::create_directories(tmp());
    put("textg.fr", message_file());
  }

  static std::string binary() { return std::string(ZT_BINARY_DIR) + "/driver/restzones"; }

  std::string tmp() const { return dir_.file("tmp"); }
  // A file of the run's directory outside $TMP.
  std::string scratch(const std::string& name) const { return dir_.file(name); }
  std::string path(const std::string& name) const { return tmp() + "/" + name; }
  void put(const std::string& name, const Bytes& bytes) const { test::write_bytes(path(name), bytes); }
  void put(const std::string& name, const std::string& text) const { test::write_text(path(name), text); }
  bool has(const std::string& name) const { return std::filesystem::exists(path(name)); }
  Bytes bytes(const std::string& name) const { return test::read_bytes(path(name)); }
  std::string text(const std::string& name) const { return test::read_text(path(name)); }

  // The usual parameter files of a run.
  void parameters() const {
    put("zstock.ok", std::string("1.0\n"));
    put("grid.tmp", std::string("0 0\n100 100\n0.5 0.5\n2 2\n"));
  }

  // Runs the program; `setup` is shell text run before it (e.g. a trap),
  // `wrapper` a command that starts it (e.g. prlimit with its options, or
  // env with other variables), `tracer` one that starts it under the time
  // limit (e.g. strace). Returns the exit status; kTimedOut for a hang,
  // 128 + n for signal n.
  int run(const std::string& setup = "", const std::string& wrapper = "", const std::string& tracer = "") {
    const std::string cmd = "cd '" + tmp() + "' && " + setup + (setup.empty() ? "" : " && ") +
                            "KVLTMPDIR='" + tmp() + "' TXTPATH='" + tmp() + "' KVLLANG=fr " + wrapper + " timeout " +
                            std::to_string(kRunTimeoutSeconds) + " " + tracer + " '" + binary() + "' >'" + dir_.file("out.txt") +
                            "' 2>'" + dir_.file("err.txt") + "' </dev/null";
    const int status = std::system(cmd.c_str());
    out = test::read_text(dir_.file("out.txt"));
    err = test::read_text(dir_.file("err.txt"));
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
  }

  // The status marker of the run is still there.
  bool marker_left() const {
    for (const auto& e : std::filesystem::directory_iterator(tmp()))
      if (e.path().filename().string().rfind("erreur.tmp", 0) == 0) return true;
    return false;
  }
  std::string messages() const { return has("kvlerror.prg") ? text("kvlerror.prg") : ""; }

  std::string out, err;

 private:
  static std::string message_file() {
    std::string s;
    for (int n = 1; n < 139; ++n) s += "texte " + std::to_string(n) + "\n";
    return s + kBanner + "\n";
  }

  test::ScratchDir dir_;
};

// The console of a run up to the start of its level loop.
inline std::string banner_and_scale() {
  return std::string("        \n ") + kBanner + "\n        \n" + kScaleLine;
}

// The bundled example's files, copied into the run's $TMP.
inline void copy_example(const ProgramRun& r) {
  for (const auto& e : std::filesystem::directory_iterator(std::string(ZT_SOURCE_DIR) + "/examples/pocket"))
    std::filesystem::copy_file(e.path(), r.path(e.path().filename().string()),
                               std::filesystem::copy_options::overwrite_existing);
}

}  // namespace zt::e2e
