// The process-wide table of logical units.
#include "driver/logical_units.hpp"


#include <cassert>
#include <cerrno>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>
#include <map>
#include <memory>
#include <utility>

#include "driver/detail/unit_cleanup.hpp"
#include "driver/record_stream.hpp"
#include "runtime/text_file.hpp"

namespace zt {

namespace {

struct Unit {
  enum class Kind { kRecordIn, kRecordOut, kText } kind = Kind::kRecordIn;
  std::string path;
  RecordReader in;
  RecordWriter out;
  std::FILE* text = nullptr;
};

std::map<std::int32_t, std::unique_ptr<Unit>>& units() {
  static std::map<std::int32_t, std::unique_ptr<Unit>> table;
  return table;
}

Unit* find(std::int32_t unit) {
  auto it = units().find(unit);
  return it == units().end() ? nullptr : it->second.get();
}

// A unit used for something it was not opened for is a reading or writing
// fault of whatever it names.
[[noreturn]] void misuse(std::int32_t unit, RecordFault fault, const char* what) {
  Unit* u = find(unit);
  record_stop({fault, u != nullptr ? u->path : "unit " + std::to_string(unit), 0, what});
}

Unit& reader_unit(std::int32_t unit) {
  Unit* u = find(unit);
  if (u == nullptr || u->kind != Unit::Kind::kRecordIn)
    misuse(unit, RecordFault::kUnreadable, "unit not open for reading records");
  return *u;
}

Unit& fresh_unit(std::int32_t unit, Unit::Kind kind, const std::string& path) {
  assert(unit >= kFirstUnit);
  close_unit(unit);
  auto u = std::make_unique<Unit>();
  u->kind = kind;
  u->path = path;
  Unit& ref = *u;
  units()[unit] = std::move(u);
  return ref;
}

}  // namespace

std::int32_t free_unit() {
  std::int32_t unit = kFirstUnit;
  for (const auto& [number, u] : units()) {
    if (number < unit) continue;
    if (number != unit) break;
    if (unit == std::numeric_limits<std::int32_t>::max()) return -1;
    ++unit;
  }
  return unit;
}

void get_free_unit(std::int32_t& unit) { unit = free_unit(); }

bool unit_attached(const std::int32_t& unit) { return find(unit) != nullptr; }

std::string unit_path(const std::int32_t& unit) {
  Unit* u = find(unit);
  return u != nullptr ? u->path : std::string();
}

void attach_record_input(const std::int32_t& unit, const std::string& path) {
  Unit& u = fresh_unit(unit, Unit::Kind::kRecordIn, path);
  if (!u.in.open(path)) {
    const RecordFaultInfo info = u.in.fault();
    units().erase(unit);
    record_stop(info);
  }
}

void attach_record_output(const std::int32_t& unit, const std::string& path) {
  Unit& u = fresh_unit(unit, Unit::Kind::kRecordOut, path);
  if (!u.out.create(path)) {
    const RecordFaultInfo info = u.out.fault();
    units().erase(unit);
    record_stop(info);
  }
}

namespace {

// The next record's x, y, z; false at the end of the file or after handing
// a fault to `faulted` (which may not return).
template <typename Faulted>
bool read_xyz(std::int32_t unit, float& x, float& y, float& z, Faulted faulted) {
  Unit& u = reader_unit(unit);
  std::uint8_t head[kPointXyzBytes];
  std::size_t length = 0;
  const std::uint8_t* data = u.in.read_in_place(length);
  if (!data) {
    switch (u.in.read(head, length)) {
      case ReadStatus::kEnd: return false;
      case ReadStatus::kFault: faulted(u.in.fault()); return false;
      case ReadStatus::kRecord: break;
    }
    data = head;
  }
  const std::int64_t record = u.in.next_record() - 1;
  if (length < kPointXyzBytes) {
    faulted({RecordFault::kShortRecord, u.path, record, std::to_string(length) + " bytes"});
    return false;
  }
  decode_xyz(data, x, y, z);
  if (!std::isfinite(x) || !std::isfinite(y) || !std::isfinite(z)) {
    faulted({RecordFault::kNonFinite, u.path, record, {}});
    return false;
  }
  return true;
}

}  // namespace

bool read_record_xyz(const std::int32_t& unit, float& x, float& y, float& z, RecordFaultInfo& fault) {
  fault.fault = RecordFault::kNone;
  return read_xyz(unit, x, y, z, [&fault](const RecordFaultInfo& info) { fault = info; });
}

bool read_record_xyz(const std::int32_t& unit, float& x, float& y, float& z) {
  return read_xyz(unit, x, y, z, [](const RecordFaultInfo& info) { record_stop(info); });
}

std::int32_t record_position(const std::int32_t& unit) {
  const std::int64_t next = reader_unit(unit).in.next_record();
  // Record numbers are 32-bit throughout the driver; a longer file is refused
  // where it is scanned, so this never truncates.
  assert(next <= std::numeric_limits<std::int32_t>::max());
  return static_cast<std::int32_t>(next);
}

bool rewind_unit(const std::int32_t& unit, RecordFaultInfo& fault) {
  Unit& u = reader_unit(unit);
  fault = {};
  if (u.in.rewind()) return true;
  fault = u.in.fault();
  return false;
}

void rewind_unit(const std::int32_t& unit) {
  RecordFaultInfo fault;
  if (!rewind_unit(unit, fault)) record_stop(fault);
}

void write_point_record(const std::int32_t& unit, float x, float y, float z, std::int32_t code,
                        std::int16_t flag) {
  Unit* u = find(unit);
  if (u == nullptr || u->kind != Unit::Kind::kRecordOut)
    misuse(unit, RecordFault::kUnwritable, "unit not open for writing records");
  const PointRecord r = encode_point_record(x, y, z, code, flag);
  if (!u->out.write(r)) record_stop(u->out.fault());
}

void close_unit(const std::int32_t& unit) {
  auto it = units().find(unit);
  if (it == units().end()) return;
  std::unique_ptr<Unit> u = std::move(it->second);
  units().erase(it);
  switch (u->kind) {
    case Unit::Kind::kRecordIn: u->in.close(); break;
    case Unit::Kind::kRecordOut:
      if (!u->out.close()) record_stop(u->out.fault());
      break;
    case Unit::Kind::kText:
      if (u->text != nullptr) std::fclose(u->text);
      break;
  }
}

bool attach_text(const std::int32_t& unit, const std::string& path, TextOpen how) {
  std::FILE* f = how == TextOpen::kRead ? open_regular_for_reading(path.c_str())
                                        : std::fopen(path.c_str(), how == TextOpen::kCreate ? "w" : "a");
  if (f == nullptr) return false;
  Unit& u = fresh_unit(unit, Unit::Kind::kText, path);
  u.text = f;
  return true;
}

bool read_text_line(const std::int32_t& unit, std::string& line) {
  Unit* u = find(unit);
  if (u == nullptr || u->kind != Unit::Kind::kText) return false;
  line.clear();
  int c = 0;
  bool any = false;
  while ((c = std::fgetc(u->text)) != EOF) {
    any = true;
    if (c == '\n') break;
    line.push_back(static_cast<char>(c));
  }
  if (std::ferror(u->text)) return false;
  if (!line.empty() && line.back() == '\r') line.pop_back();
  return any;
}

bool write_text_line(const std::int32_t& unit, const std::string& line) {
  Unit* u = find(unit);
  if (u == nullptr || u->kind != Unit::Kind::kText) return false;
  return std::fputs(line.c_str(), u->text) != EOF && std::fputc('\n', u->text) != EOF &&
         std::fflush(u->text) == 0;
}

void detail::abandon_record_outputs() {
  for (auto& [number, u] : units()) {
    if (u->kind == Unit::Kind::kRecordOut) u->out.abandon();
  }
}

}  // namespace zt
