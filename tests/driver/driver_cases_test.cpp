// The driver's cases kept as data: every case of data/*.cases runs as one
// named test in a fresh suite environment, its commands in order (described
// at the top of data/names.cases).
#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <cstdio>

#include "driver/detail/message_tables.hpp"
#include "driver/level_tables.hpp"
#include "driver/logical_units.hpp"
#include "driver/message_text.hpp"
#include "driver/record_files.hpp"
#include "driver/record_stream.hpp"
#include "suite_env.hpp"
#include "support/case_rows.hpp"
#include "support/subprocess.hpp"

namespace zt {
namespace {

using test::Words;

class DriverCases : public test::SuiteEnv, public ::testing::WithParamInterface<test::ScriptCase> {
 protected:
  // "@tmp" and "@txt" are the suite's two directories.
  std::string at(std::string s) const {
    for (const auto& [key, value] : {std::pair{"@tmp", tmp.path().string()}, std::pair{"@txt", txt_dir()}})
      for (std::size_t i; (i = s.find(key)) != std::string::npos;) s.replace(i, 4, value);
    return s;
  }
  static std::string numbered(int lines) {
    std::string s;
    for (int i = 1; i <= lines; ++i) s += "line " + std::to_string(i) + "\n";
    return s;
  }
  void TearDown() override {
    for (std::int32_t unit = 3; unit < 10; ++unit) close_unit(unit);
  }
  // A float as the shortest text that reads back as the same float.
  static std::string f(float v) {
    char text[32];
    std::snprintf(text, sizeof text, "%.9g", v);
    return text;
  }
  void run(const Words& w);

  std::string out_, err_;
  LevelTable table_;
};

std::int32_t num(const std::string& s) { return static_cast<std::int32_t>(std::stol(s)); }
// The three floats from word i on.
std::array<float, 3> xyz(const Words& w, std::size_t i) {
  return {std::stof(w.at(i)), std::stof(w.at(i + 1)), std::stof(w.at(i + 2))};
}

void DriverCases::run(const Words& raw) {
  Words w;
  for (const std::string& s : raw) w.push_back(at(s));
  const std::string& op = w[0];
  std::string name = w.size() > 1 ? w[1] : "";  // blank-padded, as the driver passes names
  name.resize(80, ' ');
  const auto length = static_cast<std::int32_t>(name.size());
  std::int32_t ierr = -99;
  bool yes = false;
  if (op == "exits") {  // the rest of the line, commands parted by ";", ends the process
    const auto rest = [&] {
      ::dup2(2, 1);  // standard output shown as errors
      Words command;
      for (auto it = raw.begin() + 3;; ++it) {
        if (it != raw.end() && *it != ";") { command.push_back(*it); continue; }
        run(command);
        command.clear();
        if (it == raw.end()) break;
      }
    };
    EXPECT_EXIT(rest(), ::testing::ExitedWithCode(num(w.at(1))), w.at(2));
  } else if (op == "env") ::setenv(w.at(1).c_str(), w.at(2).c_str(), 1);
  else if (op == "text") test::write_text(w.at(1), w.at(2));
  else if (op == "numbered") test::write_text(w.at(1), numbered(num(w.at(2))) + (w.size() > 3 ? w[3] : ""));
  else if (op == "fill") {
    const auto byte = static_cast<std::uint8_t>(std::stoul(w.at(3), nullptr, 16));
    test::write_bytes(w.at(1), test::Bytes(std::stoul(w.at(2)), byte));
  }
  else if (op == "floats") {
    test::Bytes b;
    for (std::size_t i = 2; i < w.size(); ++i) {
      const float f = std::stof(w[i]);
      b.insert(b.end(), reinterpret_cast<const std::uint8_t*>(&f), reinterpret_cast<const std::uint8_t*>(&f) + 4);
    }
    test::write_bytes(w.at(1), b);
  } else if (op == "points") {  // PATH SIZE then "sep", "zeros:N", "size:N" or x y z
    std::vector<test::Bytes> records;
    std::size_t size = std::stoul(w.at(2));
    for (std::size_t i = 3; i < w.size(); ++i) {
      if (w[i].rfind("size:", 0) == 0) size = std::stoul(w[i].substr(5));
      else if (w[i] == "sep") records.push_back(test::separator(size));
      else if (w[i].rfind("zeros:", 0) == 0) records.emplace_back(std::stoul(w[i].substr(6)), 0);
      else {
        const auto p = xyz(w, i);
        records.push_back(test::point(p[0], p[1], p[2], size));
        i += 2;
      }
    }
    test::write_bytes(w[1], test::record_file(records));
  } else if (op == "chop") {
    test::Bytes b = test::read_bytes(w.at(1));
    b.resize(b.size() - (w.size() > 2 ? std::stoul(w[2]) : 1));
    test::write_bytes(w[1], b);
  } else if (op == "poke") {  // PATH OFFSET HEX: the bytes from OFFSET on, the file grown if need be
    test::Bytes b = test::read_bytes(w.at(1));
    for (std::size_t at = std::stoul(w.at(2)), i = 0; i + 1 < w.at(3).size(); i += 2, ++at) {
      b.resize(std::max(b.size(), at + 1));
      b[at] = static_cast<std::uint8_t>(std::stoul(w[3].substr(i, 2), nullptr, 16));
    }
    test::write_bytes(w[1], b);
  } else if (op == "write-records") {  // PATH then each record's length (bytes 1, 8, 15, ...)
    RecordWriter writer;
    EXPECT_TRUE(writer.create(w.at(1)));
    for (std::size_t i = 2; i < w.size(); ++i) {
      test::Bytes r(std::stoul(w[i]));
      for (std::size_t k = 0; k < r.size(); ++k) r[k] = static_cast<std::uint8_t>(k * 7 + 1);
      EXPECT_TRUE(writer.write(r));
    }
    EXPECT_TRUE(writer.close());
  } else if (op == "read-records") {  // PATH then "end N" (records), or [open-]fault KIND RECORD
    const char* const kinds[] = {"none",    "unreadable",   "unwritable", "disk-full", "not-record-file",
                                 "damaged", "short-record", "non-finite"};
    RecordReader reader;
    const bool opened = reader.open(w.at(1));
    test::Bytes head(12);
    std::size_t length = 0, records = 0;
    ReadStatus s = ReadStatus::kFault;
    while (opened && (s = reader.read(head, length)) == ReadStatus::kRecord) ++records;
    const RecordFaultInfo& f = reader.fault();
    EXPECT_EQ(s == ReadStatus::kEnd ? "end " + std::to_string(records)
                                    : (opened ? "fault " : "open-fault ") + std::string(kinds[static_cast<int>(f.fault)]) +
                                          " " + std::to_string(f.record) + " " + f.path,
              w.at(2) + " " + w.at(3) + (w.size() > 4 ? " " + w[4] + " " + w[1] : ""));
  } else if (op == "remove") std::filesystem::remove(w.at(1));
  else if (op == "mkdir") std::filesystem::create_directories(w.at(1));
  else if (op == "present") EXPECT_EQ(std::filesystem::exists(w.at(1)) ? "yes" : "no", w.at(2));
  else if (op == "same") EXPECT_EQ(test::read_bytes(w.at(1)), test::read_bytes(w.at(2)));
  else if (op == "size") EXPECT_EQ(test::read_bytes(w.at(1)).size(), std::stoul(w.at(2)));
  else if (op == "hex" || op == "head" || op == "at") {  // the whole file, its first bytes, or those from OFFSET
    std::string hex;
    for (std::uint8_t b : test::read_bytes(w.at(1))) hex += {"0123456789abcdef"[b >> 4], "0123456789abcdef"[b & 15]};
    const std::string& want = w.at(op == "at" ? 3 : 2);
    EXPECT_EQ(op == "hex" ? hex : hex.substr(op == "at" ? 2 * std::stoul(w[2]) : 0, want.size()), want);
  } else if (op == "file-exists") {
    file_exists(name.data(), length, yes);
    EXPECT_EQ(yes ? "yes" : "no", w.at(2));
  } else if (op == "open" || op == "opensq") {  // NAME UNIT MODE IERR
    (op == "open" ? open_unformatted : opensq)(num(w.at(2)), name.data(), length, num(w.at(3)), ierr);
    EXPECT_EQ(ierr, num(w.at(4)));
  } else if (op == "attach-in") attach_record_input(num(w.at(1)), w.at(2));
  else if (op == "attach-out") attach_record_output(num(w.at(1)), w.at(2));
  else if (op == "write-point") write_point_record(num(w.at(1)), 0, 0, 0, kPointCode, kPointFlag);
  else if (op == "free-unit") EXPECT_EQ(free_unit(), num(w.at(1)));
  else if (op == "get-free-unit") {
    std::int32_t unit = 0;
    get_free_unit(unit);
    EXPECT_EQ(unit, num(w.at(1)));
  } else if (op == "attached") EXPECT_EQ(unit_attached(num(w.at(1))) ? "yes" : "no", w.at(2));
  else if (op == "close") close_unit(num(w.at(1)));
  else if (op == "xyz") {  // UNIT then x y z, or "end"
    std::array<float, 3> p;
    if (!read_record_xyz(num(w.at(1)), p[0], p[1], p[2])) { EXPECT_EQ(w.at(2), "end"); }
    else { EXPECT_EQ(p, xyz(w, 2)); }
  } else if (op == "read-all") {  // the record file on unit 3, to its end
    attach_record_input(3, w.at(1));
    float x, y, z;
    while (read_record_xyz(3, x, y, z)) {
    }
  } else if (op == "lines") {
    std::vector<std::string> lines;
    for (std::string line; read_text_line(num(w.at(1)), line);) lines.push_back(line);
    EXPECT_EQ(lines, Words(w.begin() + 2, w.end()));
  } else if (op == "writeline") EXPECT_TRUE(write_text_line(num(w.at(1)), w.at(2)));
  else if (op == "contour") {  // UNIT Z IERR then x y of each point
    std::vector<Point2f> pts;
    for (std::size_t i = 4; i + 1 < w.size(); i += 2) pts.push_back({std::stof(w[i]), std::stof(w[i + 1])});
    write_contour(static_cast<std::int32_t>(pts.size()), pts.data(), std::stof(w.at(2)), num(w.at(1)), ierr);
    EXPECT_EQ(ierr, num(w.at(3)));
  } else if (op == "chtext") {  // NAME N [TEXT]
    const std::string text = chtext(w.at(1), num(w.at(2)));
    if (w.size() > 3) { EXPECT_EQ(text, w[3]); }
  } else if (op == "message" || op == "message-e") {  // N TEXT, through an 80-byte buffer
    char buffer[80];
    std::int32_t n = 0;
    (op == "message" ? message_text : message_text_e)(num(w.at(1)), buffer, 80, n);
    EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(n)), w.at(2));
  } else if (op == "scan") {  // PATH then Z:FIRST-LAST of each level, on unit 3
    close_unit(3);
    attach_record_input(3, w.at(1));
    scan_levels(3, table_);
    rewind_unit(3);
    Words levels, expected;
    for (std::int32_t i = 0; i < table_.count(); ++i)
      levels.push_back(f(table_.z[i]) + ":" + std::to_string(table_.range[i].first) + "-" +
                       std::to_string(table_.range[i].last));
    for (std::size_t i = 2; i < w.size(); ++i) expected.push_back(f(std::stof(w[i])) + w[i].substr(w[i].find(':')));
    EXPECT_EQ(levels, expected);
  } else if (op == "find") {  // Z then the first record, or "none" (and nothing changed)
    std::int32_t first = -7, last = -7;
    const bool found = find_level(std::stof(w.at(1)), table_, first, last);
    EXPECT_EQ(found ? std::to_string(first) : first == -7 ? "none" : "changed", w.at(2));
  } else if (op == "level-points") {  // FIRST LAST then the x of each point read
    std::vector<Point2f> points;
    read_level_points(3, num(w.at(1)), num(w.at(2)), points);
    Words xs, expected;
    for (const Point2f& p : points) xs.push_back(f(p.x));
    for (std::size_t i = 3; i < w.size(); ++i) expected.push_back(f(std::stof(w[i])));
    EXPECT_EQ(xs, expected);
  } else if (op == "position") EXPECT_EQ(record_position(3), num(w.at(1)));
  else if (op == "reset-messages") detail::reset_message_tables();
  else if (op == "zonetool") {  // STATUS STDIN ARGS...: the built zonetool
    test::write_text(tmp.file("stdin"), w.at(2));
    std::string cmd = test::zonetool_path();
    for (std::size_t i = 3; i < w.size(); ++i) cmd += " " + w[i];
    const test::CommandRun r = test::run_command(cmd + " <" + tmp.file("stdin") + " 2>" + tmp.file("stderr"));
    EXPECT_EQ(r.status, num(w.at(1)));
    out_ = r.out;
    err_ = test::read_text(tmp.file("stderr"));
  } else if (op == "out") EXPECT_EQ(out_, w.at(1));
  else if (op == "err") EXPECT_NE(err_.find(w.at(1)), std::string::npos) << err_;
  else ADD_FAILURE() << "unknown command " << op;
}

TEST_P(DriverCases, Run) { test::run_script(GetParam(), [this](const Words& w) { run(w); }); }

INSTANTIATE_TEST_SUITE_P(Data, DriverCases,
                         ::testing::ValuesIn(test::load_script_cases({"names", "messages", "zonetool", "levels", "records"})),
                         test::case_name);

}  // namespace
}  // namespace zt
