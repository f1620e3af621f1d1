// The main sequence of restzones.
#include "driver/main_flow.hpp"

#include <array>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include <unistd.h>

#include "driver/detail/result_guard.hpp"
#include "driver/level_tables.hpp"
#include "driver/logical_units.hpp"
#include "driver/message_text.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_files.hpp"
#include "runtime/error_report.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime/progress.hpp"
#include "zone/entry_points.hpp"

namespace zt {

namespace {

// Width of the driver's file name buffer.
constexpr std::int32_t kNameWidth = 512;
// Mode of open_unformatted: read an existing file / create a new one.
constexpr std::int32_t kOpenRead = 1;
constexpr std::int32_t kOpenCreate = 2;

constexpr const char* kContourFile = "$TMP/contour.bin";
constexpr const char* kStockFile = "$TMP/stock1.bin";
constexpr const char* kResultFile = "$TMP/stock2.bin";
// The result's name while it is written: kResultFile, this, the process id.
constexpr const char* kPartSuffix = ".tmp.";

// The driver's static data: level tables, point buffer, name buffer.
LevelTable g_contourLevels;
LevelTable g_stockLevels;
std::vector<Point2f> g_points;

// A blank-padded name of kNameWidth characters, as the record layer takes it.
class Name {
 public:
  explicit Name(const char* text) {
    buffer_.fill(' ');
    std::memcpy(buffer_.data(), text, std::strlen(text));
  }
  const char* data() const { return buffer_.data(); }
  const std::int32_t& length() const { return kNameWidth; }

 private:
  std::array<char, kNameWidth> buffer_;
};

// Shows a message on the console and in the message file; the run stops.
RunEnd stop_with(const char* message) {
  const std::int32_t length = static_cast<std::int32_t>(std::strlen(message));
  report_message(message, length);
  return RunEnd::kStopped;
}

bool exists(const Name& name) {
  bool found = false;
  file_exists(name.data(), name.length(), found);
  return found;
}

// Scans an existing record file into a level table on a fresh unit.
void scan_file(const Name& name, LevelTable& table) {
  const std::int32_t unit = free_unit();
  std::int32_t ierr = 0;
  open_unformatted(unit, name.data(), name.length(), kOpenRead, ierr);
  scan_levels(unit, table);
  close_unit(unit);
}

// Levels run from the top down: each z lower than the one before.
bool runs_top_down(const LevelTable& table) {
  for (std::size_t i = 1; i < table.z.size(); ++i) {
    if (!(table.z[i] < table.z[i - 1])) return false;
  }
  return true;
}

// Three list-directed lines: blanks, the banner text, blanks.
void show_banner() {
  char text[kMessageBufferWidth];
  std::int32_t length = 0;
  message_text(kBannerMessage, text, kMessageBufferWidth, length);
  std::string out = "        \n ";
  if (length > 0) out.append(text, static_cast<std::size_t>(length));
  out += "\n        \n";
  std::fwrite(out.data(), 1, out.size(), stdout);
  std::fflush(stdout);
}

// The stock levels, read from stock1.bin in level order: a level goes to the
// zone builder only with more than kMinLevelRecords records; each level done
// advances the progress bar.
struct StockLevels final : LevelSource {
  const std::int32_t unit = free_unit();
  std::int32_t count() const override { return g_stockLevels.count(); }
  RecordFaultInfo pending;  // the fault of the last level read
  LevelRead read(std::int32_t i, float& z, std::vector<Point2f>& points) override {
    z = g_stockLevels.z[static_cast<std::size_t>(i - 1)];
    std::int32_t first = 0, last = 0;
    if (!find_level(z, g_stockLevels, first, last)) return LevelRead::kNothing;
    // A fault stops the run only once the levels before are done, as when
    // the levels are read one at a time.
    if (!read_level_points(unit, first, last, points, pending)) return LevelRead::kFault;
    return static_cast<std::int32_t>(points.size()) > kMinLevelRecords ? LevelRead::kPoints : LevelRead::kNothing;
  }
  void done(std::int32_t i) override { progress(count(), i); }
  void fault(std::int32_t) override { record_stop(pending); }
};

}  // namespace

RunEnd restzones_main() {
  // Without its status marker the suite could take this run for a success
  // (or an old result for this run's): nothing else may happen.
  std::string reason;
  if (report_begin("", reason) != 0) {
    std::fprintf(stderr, "restzones: the status marker cannot be created in $TMP (%s)\n", reason.c_str());
    std::fflush(stderr);
    return RunEnd::kNoMarker;
  }

  const Name contourName(kContourFile);
  if (!exists(contourName)) return stop_with(kMsgNoContours);
  scan_file(contourName, g_contourLevels);
  if (!runs_top_down(g_contourLevels)) return stop_with(kMsgContoursUnordered);

  std::int32_t ierr = 0;
  wf_init_czone(g_contourLevels.z.data(), g_contourLevels.count(), ierr);
  if (ierr != 0) return stop_with(kMsgInitFailed);

  const Name stockName(kStockFile);
  if (!exists(stockName)) return stop_with(kMsgNoStock);
  scan_file(stockName, g_stockLevels);
  if (!runs_top_down(g_stockLevels)) return stop_with(kMsgStockUnordered);

  show_banner();
  const std::int32_t levels = g_stockLevels.count();
  progress(levels, 0);

  StockLevels stock;
  open_unformatted(stock.unit, stockName.data(), stockName.length(), kOpenRead, ierr);
  wf_add_levels(stock, ierr);
  if (ierr != 0) return stop_with(kMsgAddFailed);
  close_unit(stock.unit);

  // The result is written under a name of this process and takes its own
  // name only once complete: "$TMP/stock2.bin" is never a partial file, and
  // an older one is gone before this run writes anything.
  const std::int32_t resultUnit = free_unit();
  const Name resultName(kResultFile);
  const std::string partText = std::string(kResultFile) + kPartSuffix + std::to_string(::getpid());
  const Name partName(partText.c_str());
  std::int32_t status = 0;
  delete_file(resultName.data(), resultName.length(), status);
  open_unformatted(resultUnit, partName.data(), partName.length(), kOpenCreate, ierr);
  const std::string partPath = unit_path(resultUnit);
  detail::guard_result(partPath);
  wf_fin_czone(g_points, resultUnit, ierr, write_contour);
  close_unit(resultUnit);

  if (ierr != 0) {
    std::remove(partPath.c_str());
    detail::release_result();
    report_message(kMsgFinFailed, static_cast<std::int32_t>(std::strlen(kMsgFinFailed)));
    delete_file(resultName.data(), resultName.length(), status);
    return RunEnd::kStopped;
  }
  std::string resultPath;
  expand_to_string(kResultFile, resultPath);
  if (const int error = detail::commit_result(partPath, resultPath); error != 0) {
    record_stop({RecordFault::kUnwritable, resultPath, 0, std::strerror(error)});
  }
  detail::release_result();
  report_end();
  return RunEnd::kNormal;
}

}  // namespace zt
