// The runtime's cases kept as data: every case of data/*.cases runs as one
// named test in a fresh RuntimeTest, its commands in order (described at the
// top of data/expansion.cases).
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <sstream>

#include "runtime/detail/runtime_state.hpp"
#include "runtime/diagnostics.hpp"
#include "runtime/dynamic_storage.hpp"
#include "runtime/environment.hpp"
#include "runtime/error_report.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime/progress.hpp"
#include "runtime/record_readers.hpp"
#include "runtime/tracked_alloc.hpp"
#include "runtime_fixture.hpp"
#include "support/case_rows.hpp"
#include "support/record_bytes.hpp"

namespace zt {
namespace {

using test::ScriptCase;
using test::Words;

class RuntimeCases : public testing::RuntimeTest, public ::testing::WithParamInterface<ScriptCase> {
 protected:
  // "@" before "/" or at the end of a word is the test directory (a relative
  // path lies in it), "<pid>" this process's id, "<serial>" the serial of the
  // last tracked block, "<maximum>" the permanent maximum the case set,
  // "{N*TEXT}" TEXT N times.
  std::string at(const std::string& s) const {
    std::string out;
    for (std::size_t i = 0; i < s.size(); ++i)
      out += s[i] == '@' && (i + 1 == s.size() || s[i + 1] == '/') ? dir_ : s.substr(i, 1);
    const std::pair<const char*, std::string> named[] = {{"<pid>", std::to_string(::getpid())},
                                                         {"<serial>", std::to_string(tracked_counters().next_serial - 1)},
                                                         {"<maximum>", std::to_string(maximum_)}};
    for (const auto& [key, value] : named)
      for (std::size_t i; (i = out.find(key)) != std::string::npos;) out.replace(i, std::strlen(key), value);
    for (std::size_t b = out.find('{'); b != std::string::npos; b = out.find('{', b + 1)) {
      const std::size_t star = out.find_first_not_of("0123456789", b + 1), e = out.find('}', b);
      if (star == b + 1 || star == std::string::npos || out[star] != '*' || e == std::string::npos) continue;
      std::string text;
      for (int n = std::stoi(out.substr(b + 1, star - b - 1)); n > 0; --n) text += out.substr(star + 1, e - star - 1);
      out.replace(b, e - b + 1, text);
    }
    return out;
  }
  std::string in_dir(const std::string& s) const { return (std::filesystem::path(dir_) / at(s)).string(); }
  static std::string shown(const char* text) { return text ? text : "<none>"; }
  static std::string shown(const std::optional<std::string>& text) { return text.value_or("<none>"); }
  // The next unchecked diagnostic of a kind.
  void next(const std::vector<std::string>& list, std::size_t& seen, const std::string& expected) {
    ASSERT_LT(seen, list.size()) << "no more diagnostics";
    EXPECT_EQ(list[seen++], expected);
  }
  // "N": exactly N, "N+": at least N.
  static void count(std::size_t n, const std::string& expected) {
    if (expected.back() == '+') { EXPECT_GE(n, std::stoul(expected)); }
    else { EXPECT_EQ(n, std::stoul(expected)); }
  }
  void run(const Words& w);

  template <class T>  // as the files hold it: the test host is little-endian
  static std::string bytes_of(T v) { return std::string(reinterpret_cast<const char*>(&v), sizeof v); }

  char out_[600] = "stale";
  std::unique_ptr<CKvlBinaryResFileReader> reader_;
  std::vector<std::string> messages_;
  std::size_t messages_seen_ = 0;
  ConfigTable table_;
  std::size_t warnings_seen_ = 0, fatals_seen_ = 0;
  std::unique_ptr<DynamicStorage, void (*)(DynamicStorage*)> arena_{nullptr, ds_destroy};
  TrackedCounters counted_{};
  std::uint64_t maximum_ = 0;  // as the case set it
  std::map<std::string, void*> blocks_;  // tracked blocks by name; "local" is no block
  int local_ = 0;
  void* block(const std::string& name) { return name == "local" ? &local_ : blocks_[name]; }
};

void RuntimeCases::run(const Words& raw) {
  Words w;
  for (const std::string& s : raw) w.push_back(at(s));
  const std::string& op = w[0];
  const auto status = [&](std::size_t i) { return static_cast<std::int32_t>(std::stol(w.at(i))); };
  std::int32_t s = 0;
  if (op == "env") set_env(w.at(1), w.at(2));
  else if (op == "unenv") unset_env(w.at(1));
  else if (op == "file") write_file(w.at(1), w.at(2));
  else if (op == "config") write_file("home/config/environ.cfg", w.at(1));  // the installation's own
  else if (op == "mkdir") std::filesystem::create_directories(in_dir(w.at(1)));
  else if (op == "remove") std::filesystem::remove(in_dir(w.at(1)));
  else if (op == "exists") {
    const std::string p = in_dir(w.at(1));
    EXPECT_EQ(std::filesystem::is_directory(p) ? "dir" : std::filesystem::exists(p) ? "yes" : "no", w.at(2));
  } else if (op == "read") EXPECT_EQ(shown(read_file(w.at(1))), w.at(2));
  else if (op == "expand") {  // in place, in a buffer of the given capacity
    const std::int32_t capacity = status(2);
    std::string buffer(static_cast<std::size_t>(capacity), '\0');
    std::memcpy(buffer.data(), w[1].c_str(), std::min(w[1].size() + 1, buffer.size()));
    EXPECT_EQ(expand_path(buffer.data(), capacity), status(3));
    EXPECT_EQ(std::string(buffer.c_str()), w.at(4));
  } else if (op == "name") {  // the name's first LEN bytes into the case's buffer, said to hold CAP
    expand_name(w[1].c_str(), status(2), out_, status(3), s);
    EXPECT_EQ(s, status(4));
    if (w.size() > 5) { EXPECT_EQ(std::string(out_), w[5]); }
  } else if (op == "existing") {
    expand_existing(w[1].c_str(), static_cast<std::int32_t>(w[1].size()), out_, sizeof out_, s);
    EXPECT_EQ(s, status(2));
    if (w.size() > 3) { EXPECT_EQ(std::string(out_), w[3]); }
  } else if (op == "string") {
    std::string converted = "untouched";
    EXPECT_EQ(expand_to_string(w.at(1), converted), status(2));
    EXPECT_EQ(converted, w.at(3));
  } else if (op == "delete") {
    delete_file(w.at(1).c_str(), static_cast<std::int32_t>(w[1].size()), s);
    EXPECT_EQ(s, status(2));
  } else if (op == "load") {  // the files, in order, into a fresh table
    table_.clear();
    for (std::size_t i = 1; i + 1 < w.size(); ++i)
      EXPECT_EQ(load_messages(in_dir(w[i]), table_) ? "yes" : "no", w.back());
  } else if (op == "value") EXPECT_EQ(shown(table_.value(w.at(1), w.at(2))), w.at(3));
  else if (op == "value-cut") EXPECT_LE(table_.value(w.at(1), w.at(2)).value_or("").size(), kMaxResolvedValue);
  else if (op == "origin") EXPECT_EQ(table_.origin(w.at(1), w.at(2)), w.at(3));
  else if (op == "installed-origin") EXPECT_EQ(configuration().origin(w.at(1), w.at(2)), w.at(3));
  else if (op == "environment") load_environment();
  else if (op == "reset") detail::reset_runtime_state();
  else if (op == "trace") {
    ASSERT_FALSE(traces.empty());
    EXPECT_EQ(w.at(1) == "first" ? traces.front() : traces.back(), w.at(2));
  } else if (op == "traces") {  // how many start with PREFIX
    const auto starts = [&](const std::string& t) { return t.rfind(w.at(1), 0) == 0; };
    count(std::count_if(traces.begin(), traces.end(), starts), w.at(2));
  } else if (op == "variable") EXPECT_EQ(shown(get_variable(w.at(1).c_str())), w.at(2));
  else if (op == "getenv") EXPECT_EQ(shown(std::getenv(w.at(1).c_str())), w.at(2));
  else if (op == "installdir") EXPECT_EQ(detail::installation_directory_from(w.at(1)), w.at(2));
  else if (op == "tempdir") EXPECT_EQ(shown(temp_directory()), w.at(1));
  else if (op == "records") {  // PATH then each record: floats, "iN" int32, "sN" int16
    std::vector<std::string> records;
    for (std::size_t i = 2; i < w.size(); ++i) {
      std::string r, v;
      for (std::stringstream values(w[i] == "-" ? "" : w[i]); std::getline(values, v, ',');)
        r += v[0] == 'i' ? bytes_of(static_cast<std::int32_t>(std::stol(v.substr(1))))
             : v[0] == 's' ? bytes_of(static_cast<std::int16_t>(std::stoi(v.substr(1)))) : bytes_of(std::stof(v));
      records.push_back(r);
    }
    write_file(w.at(1), test::segmented_record_file(records));
  } else if (op == "poke") {  // PATH OFFSET BYTE
    std::string bytes = *read_file(w.at(1));
    bytes.at(std::stoul(w.at(2))) = static_cast<char>(std::stoi(w.at(3)));
    write_file(w[1], bytes);
  } else if (op == "cut") write_file(w.at(1), read_file(w.at(1))->substr(0, std::stoul(w.at(2))));
  else if (op == "reader") {  // PATH STATUS [unlocked]: a new points reader, opened
    reader_ = std::make_unique<CKvlBinaryResFileReader>(w.size() > 3);
    const auto collect = [](void* self, const char* text) {
      static_cast<RuntimeCases*>(self)->messages_.emplace_back(text);
    };
    reader_->setMessageHandler(collect, this);
    EXPECT_EQ(reader_->openPoints(in_dir(w.at(1)).c_str()), status(2));
  } else if (op == "get") {  // the reader's NAME is VALUE
    const std::map<std::string, std::function<double()>> get = {
        {"isOpen", [&] { return reader_->isOpen(); }},
        {"recordSize", [&] { return reader_->recordSize(); }},
        {"recordCount", [&] { return reader_->recordCount(); }},
        {"hasCode", [&] { return reader_->hasCode(); }},
        {"hasFlag", [&] { return reader_->hasFlag(); }},
        {"headerValue", [&] { return reader_->headerValue(); }},
        {"headerCount", [&] { return reader_->headerCount(); }},
        {"recordsRead", [&] { return reader_->recordsRead(); }},
        {"tell", [&] { return reader_->tell(); }},
        {"pendingLength", [&] { return reader_->pendingLength(); }}};
    EXPECT_EQ(get.at(w.at(1))(), std::stod(w.at(2)));
  } else if (op == "seek") EXPECT_EQ(reader_->seekToPoint(std::stol(w.at(1))), status(2));
  else if (op == "point") {  // N [X Y Z [CODE|- FLAG]] from (5, 6, 7), code 9, flag 9
    float p[3] = {5, 6, 7};
    std::int32_t code = 9;
    std::int16_t flag = 9;
    const bool with_flag = w.size() > 6, with_code = with_flag && w[5] != "-";
    const std::int64_t n =
        reader_->readPoint(p[0], p[1], p[2], with_code ? &code : nullptr, with_flag ? &flag : nullptr);
    EXPECT_EQ(n, std::stol(w.at(1)));
    for (std::size_t i = 2; i < w.size() && i < 5; ++i) {
      EXPECT_EQ(p[i - 2], std::stof(w[i])) << "coordinate " << i - 2;
    }
    if (with_code) { EXPECT_EQ(code, status(5)); }
    if (with_flag) { EXPECT_EQ(flag, status(6)); }
  } else if (op == "reader-message") {  // the next message of the reader starts with TEXT
    ASSERT_LT(messages_seen_, messages_.size());
    EXPECT_EQ(messages_[messages_seen_++].rfind(w.at(1), 0), 0u) << messages_[messages_seen_ - 1];
  } else if (op == "reader-messages") EXPECT_EQ(messages_.size(), std::stoul(w.at(1)));
  else if (op == "progress") {  // TOTAL CURRENT then the bytes written to standard output
    ::testing::internal::CaptureStdout();
    progress(status(1), status(2));
    EXPECT_EQ(::testing::internal::GetCapturedStdout(), w.at(3));
  } else if (op == "report") {  // begin|status|message TEXT|- STATUS, or end|mark-empty STATUS
    const char* text = w.size() > 3 && w[2] != "-" ? w[2].c_str() : nullptr;
    const auto n = static_cast<std::int32_t>(text ? w[2].size() : 0);
    const std::string& call = w.at(1);
    EXPECT_EQ(call == "begin" ? report_begin(text) : call == "status" ? report_status(text, n)
              : call == "message" ? report_message(text, n) : call == "end" ? report_end() : report_mark_empty(),
              status(w.size() - 1));
  } else if (op == "progress-value") EXPECT_GT(progress_value(status(1), status(2)), -1);
  else if (op == "progress-finish") EXPECT_EQ(progress_finish(), status(1));
  else if (op == "capture") ::testing::internal::CaptureStdout(), ::testing::internal::CaptureStderr();
  else if (op == "stdout") {  // TEXT [STDERR]
    EXPECT_EQ(::testing::internal::GetCapturedStdout(), w.at(1));
    const std::string err = ::testing::internal::GetCapturedStderr();
    if (w.size() > 2) { EXPECT_EQ(err, w[2]); }
  } else if (op == "default-handlers") set_warning_handler(nullptr), set_trace_handler(nullptr);
  else if (op == "diagnose") (w.at(1) == "warning" ? diagnose_warning : diagnose_trace)(w.at(2));
  else if (op == "quiet") set_diagnostics_quiet(w.at(1) == "on");
  else if (op == "to-stdout") set_diagnostics_to_stdout(w.at(1) == "on");
  else if (op == "counters") counted_ = tracked_counters();
  else if (op == "counted") {  // BYTES PERMANENT SERIALS since "counters" ("*": not checked)
    const TrackedCounters now = tracked_counters();
    const std::uint64_t change[] = {now.bytes_in_use - counted_.bytes_in_use,
                                    now.permanent_bytes - counted_.permanent_bytes, now.next_serial - counted_.next_serial};
    for (std::size_t i = 1; i < 4; ++i) {
      if (w.at(i) != "*") { EXPECT_EQ(change[i - 1], std::stoull(w[i])) << "counter " << i; }
    }
  } else if (op == "alloc" || op == "realloc") {  // NAME temporary|permanent SIZE yes|no
    const bool permanent = w.at(2) == "permanent";
    const std::uint64_t n = std::stoull(w.at(3));
    void* p = op == "alloc" ? (permanent ? permanent_alloc(n) : _Wmalloc(n))
                            : _Wrealloc(permanent ? kBlockPermanent : kBlockTemporary, block(w[1]), n);
    EXPECT_EQ(p ? "yes" : "no", w.at(4));
    if (p) blocks_[w[1]] = p;
  } else if (op == "free") EXPECT_EQ(tracked_free(block(w.at(1))), status(2));
  else if (op == "fill") std::memset(block(w.at(1)), std::stoi(w.at(2)), std::stoul(w.at(3)));
  else if (op == "byte") EXPECT_EQ(static_cast<unsigned char*>(block(w.at(1)))[std::stoul(w.at(2))], std::stoi(w.at(3)));
  else if (op == "maximum") {  // N, or +N above the permanent bytes now
    const std::uint64_t above = w.at(1)[0] == '+' ? tracked_counters().permanent_bytes : 0;
    set_permanent_maximum(maximum_ = above + std::stoull(w[1].substr(above ? 1 : 0)));
  } else if (op == "arena") {  // SIZE yes|no: the case's new arena, or none made
    arena_.reset(ds_create(std::stoll(w.at(1))));
    EXPECT_EQ(arena_ ? "yes" : "no", w.at(2));
  } else if (op == "arena-string") EXPECT_EQ(ds_store_string(arena_.get(), w.at(1)), status(2));
  else if (op == "arena-reserve") EXPECT_EQ(ds_reserve(arena_.get(), std::stoll(w.at(1))), status(2));
  else if (op == "arena-growth") arena_->growth = status(1);
  else if (op == "arena-trim") ds_trim(arena_.get());
  else if (op == "arena-size") {  // USED|* CAPACITY
    if (w.at(1) != "*") { EXPECT_EQ(arena_->used, status(1)); }
    count(static_cast<std::size_t>(arena_->capacity), w.at(2));
  } else if (op == "arena-at") {  // HANDLE then <none>, "?" (something) or the string there
    const auto* p = static_cast<const char*>(ds_deref(arena_.get(), status(1)));
    EXPECT_EQ(!p ? "<none>" : w.at(2) == "?" ? "?" : std::string(p), w.at(2));
  } else if (op == "warning-start") {
    ASSERT_FALSE(warnings.empty());
    EXPECT_EQ(warnings.back().rfind(w.at(1), 0), 0u) << warnings.back();
  } else if (op == "warning") next(warnings, warnings_seen_, w.at(1));
  else if (op == "fatal") next(fatals, fatals_seen_, w.at(1));
  else if (op == "warnings") count(warnings.size(), w.at(1));
  else if (op == "fatals") count(fatals.size(), w.at(1));
  else if (op == "clear") warnings.clear(), fatals.clear(), warnings_seen_ = fatals_seen_ = 0;
  else ADD_FAILURE() << "unknown command " << op;
}

TEST_P(RuntimeCases, Run) { test::run_script(GetParam(), [this](const Words& w) { run(w); }); }

INSTANTIATE_TEST_SUITE_P(Data, RuntimeCases,
                         ::testing::ValuesIn(test::load_script_cases(
                             {"expansion", "configuration", "workzone", "progress", "readers", "report", "storage", "tracked"})),
                         test::case_name);

}  // namespace
}  // namespace zt
