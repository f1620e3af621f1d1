// The runs of data/runs.txt, each through the real program: every stop of
// the main sequence, the stock levels that reach the zone builder, and a
// corpus of malformed inputs. Every run ends by itself (no signal, no hang,
// no sanitizer report) in one of the ways the suite understands; where the
// way is known it is checked exactly. The file's header gives the format.
#include <gtest/gtest.h>

#include <sys/stat.h>

#include <map>

#include "driver/main_flow.hpp"
#include "e2e/e2e_support.hpp"
#include "support/case_rows.hpp"

namespace zt::e2e {
namespace {

using test::Unescape;
using test::Parts;

std::vector<float> numbers(const std::string& list, char sep) {
  std::vector<float> out;
  for (const std::string& n : Parts(list, sep)) out.push_back(std::strtof(n.c_str(), nullptr));
  return out;
}

// The bytes of FILE=RECIPE; `old` is the file as it stands.
Bytes recipe(const std::string& r, Bytes old) {
  const std::string kind = r.substr(0, r.find(':')), arg = r.substr(r.find(':') + 1);
  if (kind == "pocket") return pocket(numbers(arg, ','));
  if (kind == "rest") return rest(numbers(arg, ','));
  if (kind == "none") return {};
  if (kind == "text") {
    const std::string t = Unescape(arg);
    return Bytes(t.begin(), t.end());
  }
  if (kind == "raw") {
    std::vector<Bytes> recs;
    for (const std::string& x : Parts(arg, ','))
      recs.push_back(x == "sep" ? test::separator() : Bytes(std::stoul(x), 0));
    return test::record_file(recs);
  }
  if (kind == "byte") {
    const std::vector<float> iv = numbers(arg, ':');
    old.at(static_cast<std::size_t>(iv[0])) = static_cast<std::uint8_t>(iv[1]);
    return old;
  }
  if (kind == "cut") {
    const long n = std::stol(arg);
    old.resize(n < 0 ? old.size() - static_cast<std::size_t>(-n) : static_cast<std::size_t>(n));
    return old;
  }
  std::vector<Contour> contours;  // Z@X,Y;X,Y/...
  for (const std::string& c : Parts(r, '/')) {
    contours.push_back({std::strtof(c.c_str(), nullptr), {}});
    for (const std::string& p : Parts(c.substr(c.find('@') + 1), ';')) {
      const std::vector<float> xy = numbers(p, ',');
      contours.back().points.push_back({xy.at(0), xy.at(1)});
    }
  }
  return records(contours);
}

// `tmpdir` is the $TMP of a "tmpdir:NAME" step, left empty without one.
void set_up(ProgramRun& r, const std::string& setup, std::string& tmpdir) {
  for (const std::string& step : Parts(setup, ' ')) {
    if (step.rfind("tmpdir:", 0) == 0) tmpdir = r.path(step.substr(7));
    if (step == "params" || step == "usual") r.parameters();
    if (step == "usual") {
      r.put("contour.bin", pocket({10, 5, 0}));
      r.put("stock1.bin", rest({10, 5, 0}));
    }
    const auto eq = step.find('=');
    if (eq == std::string::npos) continue;
    const std::string file = step.substr(0, eq), what = step.substr(eq + 1);
    if (what == "dir") {
      std::filesystem::remove(r.path(file));
      std::filesystem::create_directory(r.path(file));
    } else if (what == "fifo") {
      std::filesystem::remove(r.path(file));
      EXPECT_EQ(::mkfifo(r.path(file).c_str(), 0600), 0);
    } else if (what.rfind("link:", 0) == 0) {
      std::filesystem::remove(r.path(file));
      std::filesystem::create_symlink(what.substr(5), r.path(file));
    } else {
      r.put(file, recipe(what, r.has(file) ? r.bytes(file) : Bytes{}));
    }
  }
}

void check(const ProgramRun& r, const std::vector<Contour>& zones, const std::string& c) {
  SCOPED_TRACE(c);
  const std::string arg = c.substr(c.find(' ') + 1);
  if (c.rfind("out=", 0) == 0) EXPECT_EQ(r.out, Unescape(c.substr(4)));
  else if (c.rfind("out~", 0) == 0) EXPECT_NE(r.out.find(Unescape(c.substr(4))), std::string::npos) << r.out;
  else if (c.rfind("err~", 0) == 0) EXPECT_NE(r.err.find(c.substr(4)), std::string::npos) << r.err;
  else if (c == "banner") EXPECT_EQ(r.out.rfind(banner_and_scale(), 0), 0u) << r.out;
  else if (c == "no stars") EXPECT_EQ(r.out.find('*'), std::string::npos) << r.out;
  else if (c == "result empty") EXPECT_EQ(r.bytes("stock2.bin"), (Bytes{kRecordFileMarker, kRecordEndMarker}));
  else if (c.rfind("has ", 0) == 0) EXPECT_TRUE(r.has(arg));
  else if (c.rfind("no ", 0) == 0) EXPECT_FALSE(r.has(arg));
  else if (c.ends_with(" empty")) EXPECT_EQ(r.bytes(c.substr(0, c.find(' '))).size(), 0u);
  else if (c.ends_with(" filled")) EXPECT_GT(r.bytes(c.substr(0, c.find(' '))).size(), 0u);
  else if (c.rfind("zones ", 0) == 0) {
    std::vector<float> z;
    for (const Contour& k : zones) z.push_back(k.z);
    EXPECT_EQ(z, numbers(arg, ','));
  } else if (c.rfind("inside ", 0) == 0) {
    const std::vector<float> b = numbers(arg, ',');
    for (const Contour& k : zones)
      for (const Pt& p : k.points) EXPECT_TRUE(p.x >= b[0] && p.y >= b[1] && p.x <= b[2] && p.y <= b[3]);
  } else {
    ADD_FAILURE() << "unknown check";
  }
}

std::map<std::string, Bytes> files_in(const ProgramRun& r) {
  std::map<std::string, Bytes> files;
  for (const auto& e : std::filesystem::directory_iterator(r.tmp()))
    files[e.path().filename().string()] = e.is_regular_file() ? r.bytes(e.path().filename().string()) : Bytes{};
  return files;
}

// NAME | SETUP | END | CHECKS
class RunTable : public test::CaseRows {};

TEST_P(RunTable, EndsAsListed) {
  ProgramRun r;
  std::string tmpdir;
  set_up(r, row().field(0), tmpdir);
  const std::map<std::string, Bytes> before = files_in(r);
  const int status = r.run("", tmpdir.empty() ? "" : "env KVLTMPDIR='" + tmpdir + "'");
  ASSERT_NE(status, kTimedOut) << "hang";
  ASSERT_LT(status, 128) << "killed by signal " << status - 128;
  EXPECT_EQ(r.err.find("Sanitizer"), std::string::npos) << r.err;
  EXPECT_EQ(r.err.find("runtime error"), std::string::npos) << r.err;
  const std::string end = row().field(1), how = end.substr(0, end.find(' ')), detail = end.substr(end.find(' ') + 1);
  if (how == "nomarker") {  // one line on standard error, and nothing done
    EXPECT_EQ(status, kNoMarkerExitStatus) << r.err;
    EXPECT_EQ(r.out, "");
    EXPECT_EQ(std::count(r.err.begin(), r.err.end(), '\n'), 1) << r.err;
    for (const std::string& said : {std::string("status marker cannot be created in $TMP"), tmpdir, detail})
      EXPECT_NE(r.err.find(said), std::string::npos) << r.err;
    EXPECT_EQ(files_in(r), before);
    return;
  }

  const bool normal = !r.marker_left();
  std::vector<Contour> zones;
  if (normal) {
    EXPECT_EQ(status, 0);
    EXPECT_EQ(r.messages(), "");
    EXPECT_TRUE(read_result(r.bytes("stock2.bin"), zones)) << "incomplete result";
    for (const Contour& k : zones) {  // closed contours
      ASSERT_GE(k.points.size(), 4u);
      EXPECT_TRUE(k.points.front().x == k.points.back().x && k.points.front().y == k.points.back().y);
    }
  } else {
    EXPECT_FALSE(r.has("stock2.bin"));
    EXPECT_TRUE(!r.messages().empty() || !r.err.empty()) << "stopped without a message";
  }
  if (how == "fault") {
    EXPECT_EQ(status, std::stoi(detail)) << r.err;
    EXPECT_FALSE(normal);
    EXPECT_NE(r.err.find(detail.substr(detail.find(' ') + 1)), std::string::npos) << r.err;
  } else if (how == "stop") {
    EXPECT_EQ(status, 0) << r.err;
    EXPECT_FALSE(normal);
    EXPECT_EQ(r.messages(), detail);
    EXPECT_NE(r.out.find(detail + "\n"), std::string::npos) << r.out;
  } else if (how == "normal") {
    EXPECT_TRUE(normal) << r.out << r.messages();
  } else {
    ASSERT_EQ(how, "either");
    EXPECT_TRUE(status == 0 || (status >= 1 && status <= 2) || status == 255) << status;
  }
  for (const std::string& one : Parts(row().field(2), ';'))
    if (!one.empty()) check(r, zones, one);
}

INSTANTIATE_TEST_SUITE_P(Runs, RunTable, test::RowsOf("runs.txt"), test::RowName);

}  // namespace
}  // namespace zt::e2e
