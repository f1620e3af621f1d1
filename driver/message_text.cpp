// Loading of message files into the shared text table and lookup by number.
#include "driver/message_text.hpp"

#include <algorithm>
#include <cstring>
#include <string_view>
#include <vector>

#include "driver/detail/message_tables.hpp"
#include "driver/fatal_stop.hpp"
#include "driver/logical_units.hpp"
#include "runtime/path_expansion.hpp"

namespace zt {

namespace {

// Expanded names of message files (the name itself may be long; the table key is the given name).
constexpr std::int32_t kExpandedPathCapacity = 512;
constexpr const char* kLoaderRoutine = "chtext ($RCSfile: chtexg,v $)";

struct MessageFile {
  std::string name;
  std::int32_t first = 0;   // index of its first line in the shared table
  std::int32_t count = 0;
  bool found = false;
};

struct MessageTables {
  std::vector<MessageFile> files;
  std::vector<std::string> lines;  // never more than kMaxMessageLines
};

MessageTables& tables() {
  static MessageTables t;
  return t;
}

struct FixedFile {
  const char* source;
  bool expanded = false;
  std::string name;
};

FixedFile& general_file() {
  static FixedFile f{kGeneralMessageFile, false, {}};
  return f;
}

FixedFile& twin_file() {
  static FixedFile f{kTwinMessageFile, false, {}};
  return f;
}

std::string trim_right(std::string_view s) {
  while (!s.empty() && (s.back() == ' ' || s.back() == '\0')) s.remove_suffix(1);
  return std::string(s);
}

std::string cut(std::string s, std::size_t width) {
  if (s.size() > width) s.resize(width);
  return s;
}

void load(MessageFile& file) {
  MessageTables& t = tables();
  const std::int32_t capacity = kMaxMessageLines - file.first;
  char path[kExpandedPathCapacity] = {};
  std::int32_t status = kExpandInvalid;
  expand_existing(file.name.data(), static_cast<std::int32_t>(file.name.size()), path,
                  kExpandedPathCapacity, status);
  if (status != kExpandOk) return;
  const std::int32_t unit = free_unit();
  if (unit < kFirstUnit || !attach_text(unit, path, TextOpen::kRead)) return;
  file.found = true;
  bool exceeded = false;
  std::string line;
  while (read_text_line(unit, line)) {
    if (file.count + 1 > capacity) {
      exceeded = true;
      break;
    }
    ++file.count;
    t.lines.push_back(cut(std::move(line), kMessageWidth));
  }
  close_unit(unit);
  if (exceeded) {
    const std::int32_t values[] = {kMaxMessageLines};
    fatal_stop(kLoaderRoutine,
               {stop_template("Internal array \"texte\" too small (%) to load file \""),
                stop_inserted(file.name), stop_template("\".")},
               values);
  }
}

const MessageFile& lookup(const std::string& name) {
  MessageTables& t = tables();
  for (const MessageFile& f : t.files) {
    if (f.name == name) return f;
  }
  if (static_cast<std::int32_t>(t.files.size()) >= kMaxMessageFiles) {
    const std::int32_t values[] = {kMaxMessageFiles};
    fatal_stop(kLoaderRoutine,
               {stop_template("Cannot load \""), stop_inserted(name),
                stop_template("\" - maximum of % files only.")},
               values);
  }
  MessageFile file;
  file.name = name;
  file.first = static_cast<std::int32_t>(t.lines.size());
  load(file);
  t.files.push_back(std::move(file));
  return t.files.back();
}

std::string text_of(const std::string& name, std::int32_t n) {
  const MessageFile& f = lookup(name);
  if (n >= 1 && n <= f.count) return tables().lines[static_cast<std::size_t>(f.first + n - 1)];
  std::string text = "No text in file \"" + name + "\" at line " + std::to_string(n);
  if (!f.found) text += "(file not found)";
  return cut(std::move(text), kMessageWidth);
}

void deliver(const std::string& text, char* buffer, std::int32_t buffer_length, std::int32_t& length) {
  const std::size_t width = buffer_length > 0 ? static_cast<std::size_t>(buffer_length) : 0;
  const std::size_t n = std::min(text.size(), width);
  if (buffer != nullptr && width > 0) {
    std::memcpy(buffer, text.data(), n);
    std::memset(buffer + n, ' ', width - n);
  }
  length = static_cast<std::int32_t>(trim_right(std::string_view(text).substr(0, n)).size());
}

void fixed_text(FixedFile& file, std::int32_t n, char* buffer, std::int32_t buffer_length,
                std::int32_t& length) {
  if (!file.expanded) {
    char out[kMessageNameWidth] = {};
    std::int32_t status = kExpandInvalid;
    const auto source_length = static_cast<std::int32_t>(std::strlen(file.source));
    expand_existing(file.source, source_length, out, kMessageNameWidth, status);
    const bool usable = status == kExpandOk || status == kExpandNotFound || status == kExpandUndefined;
    file.name = usable && out[0] != '\0' ? std::string(out) : std::string(file.source);
    file.expanded = true;
  }
  deliver(text_of(file.name, n), buffer, buffer_length, length);
}

}  // namespace

void chtext(const char* name, const std::int32_t& name_length, const std::int32_t& n, char* buffer,
            const std::int32_t& buffer_length, std::int32_t& length) {
  const std::string key =
      name != nullptr && name_length > 0 ? trim_right(std::string_view(name, static_cast<std::size_t>(name_length)))
                                         : std::string();
  deliver(text_of(key, n), buffer, buffer_length, length);
}

std::string chtext(const std::string& name, std::int32_t n) {
  return trim_right(text_of(trim_right(name), n));
}

void message_text(const std::int32_t& n, char* buffer, const std::int32_t& buffer_length,
                  std::int32_t& length) {
  fixed_text(general_file(), n, buffer, buffer_length, length);
}

void message_text_e(const std::int32_t& n, char* buffer, const std::int32_t& buffer_length,
                    std::int32_t& length) {
  fixed_text(twin_file(), n, buffer, buffer_length, length);
}

void detail::reset_message_tables() {
  tables() = MessageTables{};
  general_file().expanded = false;
  twin_file().expanded = false;
}

}  // namespace zt
