// The environ.cfg reader: comments, sections, entries and the /if /else
// /endif conditions.
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "runtime/detail/platform.hpp"
#include "runtime/diagnostics.hpp"
#include "runtime/environment.hpp"

namespace zt {
namespace {

using detail::trim_blanks;

struct FileCloser {
  void operator()(std::FILE* f) const { std::fclose(f); }
};

// One open /if: whether its lines are taken, and its own state.
struct Condition {
  bool enclosing_active;  // every /if around it takes its lines
  bool holds;
  bool in_else;
  bool active() const { return enclosing_active && (in_else ? !holds : holds); }
};

class FileReader {
 public:
  FileReader(const std::string& file, ConfigTable& table) : file_(file), table_(table) {}

  bool read(std::FILE* stream);

 private:
  bool process(std::string_view line);
  bool keyword(std::string_view word, std::string_view rest, std::string_view line);
  std::optional<bool> evaluate(std::string_view condition);
  bool active() const { return conditions_.empty() || conditions_.back().active(); }

  void fatal(int line, const std::string& text) {
    diagnose_fatal(format_text("load_messages: file '%s', line %d : %s", file_.c_str(), line,
                               text.c_str()));
  }

  const std::string& file_;
  ConfigTable& table_;
  std::string section_;
  bool section_valid_ = true;
  std::vector<Condition> conditions_;
  int line_number_ = 0;
};

// Strips the comment: "#" starts one, "##" is a literal "#".
std::string without_comment(std::string_view line) {
  std::string out;
  for (std::size_t i = 0; i < line.size(); ++i) {
    if (line[i] != '#') {
      out.push_back(line[i]);
    } else if (i + 1 < line.size() && line[i + 1] == '#') {
      out.push_back('#');
      ++i;
    } else {
      break;
    }
  }
  return out;
}

bool is_name_char(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '_';
}

// A condition's variable: the process environment, then what is loaded so far.
std::optional<std::string> condition_variable(const std::string& name, const ConfigTable& table) {
  if (const char* v = std::getenv(name.c_str())) return std::string(v);
  if (auto v = table.value("var", name)) {
    return std::string(detail::trim_trailing_controls(*v));
  }
  return std::nullopt;
}

std::optional<bool> FileReader::evaluate(std::string_view condition) {
  condition = trim_blanks(condition);
  if (!condition.empty() && (condition.front() == '(' || condition.front() == '{')) {
    const char close = condition.front() == '(' ? ')' : '}';
    if (condition.size() < 2 || condition.back() != close) return std::nullopt;
    condition = trim_blanks(condition.substr(1, condition.size() - 2));
  }
  std::size_t op = condition.find("==");
  bool equal = true;
  if (const std::size_t ne = condition.find("!="); ne != std::string_view::npos &&
                                                   (op == std::string_view::npos || ne < op)) {
    op = ne;
    equal = false;
  }
  const std::string name(trim_blanks(condition.substr(0, op)));
  if (name.empty()) return std::nullopt;
  for (char c : name)
    if (!is_name_char(c)) return std::nullopt;
  const std::optional<std::string> value = condition_variable(name, table_);
  if (op == std::string_view::npos) return value.has_value();
  if (!value) {
    diagnose_warning(format_text("load_messages: file '%s' line %d, unknown variable : '%s'\n",
                                 file_.c_str(), line_number_, name.c_str()));
    return false;
  }
  const std::string_view expected = trim_blanks(condition.substr(op + 2));
  return (trim_blanks(*value) == expected) == equal;
}

bool FileReader::keyword(std::string_view word, std::string_view rest, std::string_view line) {
  if (word == "if") {
    if (conditions_.size() >= static_cast<std::size_t>(kMaxNestedConditions)) {
      fatal(line_number_, format_text("too many nested conditions: %.*s",
                                      static_cast<int>(line.size()), line.data()));
      return false;
    }
    const bool enclosing = active();
    bool holds = false;
    if (enclosing) {
      const std::optional<bool> result = evaluate(rest);
      if (!result) {
        fatal(line_number_, format_text("invalid condition: %.*s", static_cast<int>(line.size()),
                                        line.data()));
        return false;
      }
      holds = *result;
    }
    conditions_.push_back({enclosing, holds, false});
    return true;
  }
  if (word == "else") {
    if (conditions_.empty() || conditions_.back().in_else) {
      fatal(line_number_, "'/else' without '/if'");
      return false;
    }
    conditions_.back().in_else = true;
    return true;
  }
  if (word == "endif") {
    if (conditions_.empty()) {
      fatal(line_number_, "'/endif' without '/if'");
      return false;
    }
    conditions_.pop_back();
    return true;
  }
  fatal(line_number_, format_text("Unknown keyword : '/%.*s'", static_cast<int>(word.size()),
                                  word.data()));
  return false;
}

bool FileReader::process(std::string_view raw) {
  const std::string stripped = without_comment(raw);
  const std::string_view line = trim_blanks(stripped);
  if (line.empty()) return true;
  if (line.front() == '/') {
    std::size_t end = 1;
    while (end < line.size() && is_name_char(line[end])) ++end;
    return keyword(line.substr(1, end - 1), line.substr(end), line);
  }
  if (!active()) return true;
  if (line.front() == '[') {
    const std::size_t close = line.find(']');
    const std::string_view name = line.substr(1, close == std::string_view::npos ? line.npos : close - 1);
    section_valid_ = name.size() <= kMaxSectionName;
    if (!section_valid_) {
      // Its entries would land in another section: they are skipped instead.
      diagnose_warning(format_text("load_messages: file '%s', line %d : %s", file_.c_str(),
                                   line_number_, "Section name too long"));
      return true;
    }
    section_ = std::string(name);
    return true;
  }
  if (!section_valid_) return true;
  const std::size_t eq = line.find('=');
  if (eq == std::string_view::npos) {
    diagnose_warning(format_text(
        "load_messages: [file '%s' line %d] Warning - incorrect format (missing '='): [%s] %.*s\n",
        file_.c_str(), line_number_, section_.c_str(), static_cast<int>(line.size()), line.data()));
    return true;
  }
  std::string_view value = line.substr(eq + 1);
  while (!value.empty() && (value.front() == ' ' || value.front() == '\t')) value.remove_prefix(1);
  return table_.add_entry(section_, trim_blanks(line.substr(0, eq)), value, file_, line_number_);
}

bool FileReader::read(std::FILE* stream) {
  std::string line;
  bool too_long = false;
  bool more = true;
  while (more) {
    const int c = std::fgetc(stream);
    if (c != EOF && c != '\n') {
      if (line.size() < kMaxConfigLine + 1) line.push_back(static_cast<char>(c));
      else too_long = true;
      continue;
    }
    more = c != EOF;
    if (!more && line.empty()) break;
    ++line_number_;
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (too_long || line.size() > kMaxConfigLine) {
      diagnose_warning(format_text("load_messages: file '%s', line %d : %s", file_.c_str(),
                                   line_number_, "Input line too long"));
    } else if (!process(line)) {
      return false;
    }
    line.clear();
    too_long = false;
  }
  if (std::ferror(stream)) {
    fatal(0, "Error loading file.");
    return false;
  }
  if (!conditions_.empty()) {
    fatal(-1, "'/if' without '/endif' at end of file.");
    return false;
  }
  return true;
}

}  // namespace

bool load_messages(const std::string& file, ConfigTable& table) {
  std::unique_ptr<std::FILE, FileCloser> stream(std::fopen(file.c_str(), "rb"));
  if (!stream) {
    diagnose_fatal(format_text("load_messages: file '%s', line %d : %s%s", file.c_str(), 0,
                               "Error opening file - ", std::strerror(errno)));
    return false;
  }
  FileReader reader(file, table);
  return reader.read(stream.get());
}

}  // namespace zt
