// The public expansion operations: buffers, capacities, diagnostics, the
// existence-testing form and deletion by an expandable name.
#include "runtime/path_expansion.hpp"

#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <optional>

#include "runtime/detail/expand_log.hpp"
#include "runtime/detail/platform.hpp"
#include "runtime/detail/runtime_state.hpp"
#include "runtime/diagnostics.hpp"

namespace zt {
namespace {

constexpr std::int32_t kStringCapacity = 512;
constexpr std::int32_t kDeleteCapacity = 511;

bool usable(std::int32_t status) { return status == kExpandOk || status == kExpandUndefined; }

void report_error(const std::optional<std::string>& input, std::int32_t status,
                  std::int32_t capacity) {
  std::string text = "_Expand(";
  text += input ? "\"" + *input + "\"" : std::string("<nullptr>");
  text += ") = error " + std::to_string(status);
  if (status == kExpandInvalid) text += " - invalid argument";
  if (status == kExpandTooSmall) text += " - buffer size " + std::to_string(capacity) + " too small";
  if (status == kExpandSyntax) text += " - syntax error";
  diagnose_warning(text);
  if (status == kExpandTooSmall) detail::on_buffer_too_small();
}

// Expands `input` for a buffer of `capacity`, with the diagnostic of a failure.
std::int32_t expand_for(const std::string& input, std::int32_t capacity, bool in_place,
                        std::string& out) {
  detail::log_small_buffer(input, capacity, in_place);
  std::int32_t status = detail::expand_text(input, out);
  if (usable(status) && out.size() + 1 > static_cast<std::size_t>(capacity)) status = kExpandTooSmall;
  if (!usable(status)) report_error(input, status, capacity);
  return status;
}

// The name of a blank-padded buffer: up to its first zero, trailing blanks off.
std::string padded_name(const char* name, std::int32_t length) {
  const std::size_t n = strnlen(name, static_cast<std::size_t>(length));
  std::string_view view(name, n);
  while (!view.empty() && view.back() == ' ') view.remove_suffix(1);
  return std::string(view);
}

bool valid_arguments(const char* name, std::int32_t length, const char* out, std::int32_t capacity) {
  return name != nullptr && length >= 0 && out != nullptr && capacity > 0;
}

void store(const std::string& text, char* out) { std::memcpy(out, text.c_str(), text.size() + 1); }

bool is_name_char(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '_';
}

// "<prefix>?NAME/<rest>": the first path variable followed by a separator.
struct PathSearch {
  std::string prefix;
  std::string variable;
  std::string rest;
};

std::optional<PathSearch> find_path_search(const std::string& name) {
  for (std::size_t i = 0; i < name.size();) {
    const char c = name[i];
    if (c != '$' && c != '?') {
      ++i;
      continue;
    }
    if (i + 1 < name.size() && name[i + 1] == c) {
      i += 2;
      continue;
    }
    std::size_t j = i + 1;
    std::size_t name_begin = j, name_end;
    if (j < name.size() && (name[j] == '{' || name[j] == '(')) {
      const std::size_t end = name.find(name[j] == '{' ? '}' : ')', j + 1);
      if (end == std::string::npos) return std::nullopt;  // the expansion reports it
      name_begin = j + 1;
      name_end = end;
      j = end + 1;
    } else {
      while (j < name.size() && is_name_char(name[j])) ++j;
      name_end = j;
    }
    if (c == '?' && j < name.size() && (name[j] == '/' || name[j] == '\\'))
      return PathSearch{name.substr(0, i), name.substr(name_begin, name_end - name_begin),
                        name.substr(j + 1)};
    i = j;
  }
  return std::nullopt;
}

// Each directory of the path variable's list joined with the rest; the first
// candidate that exists wins. None when the variable is undefined.
std::optional<std::int32_t> search_directories(const PathSearch& search, std::int32_t capacity,
                                               std::string& result) {
  const detail::VariableValue v = detail::lookup_path_variable(search.variable);
  if (v.kind != detail::Lookup::kFound) return std::nullopt;
  std::string list, prefix, rest;
  std::int32_t status = detail::expand_text(v.value, list);
  for (auto [part, text] : {std::pair{&search.prefix, &prefix}, std::pair{&search.rest, &rest}}) {
    if (!usable(status)) break;
    const std::int32_t s = detail::expand_text(*part, *text);
    status = usable(s) ? (s == kExpandUndefined ? s : status) : s;
  }
  if (!usable(status)) {
    report_error(search.prefix + "?" + search.variable + "/" + search.rest, status, capacity);
    return status;
  }
  std::optional<std::string> first;
  std::size_t start = 0;
  for (std::size_t i = 0; i <= list.size(); ++i) {
    if (i < list.size() && list[i] != ';' && list[i] != ',') continue;
    const std::string_view dir = detail::trim_blanks(std::string_view(list).substr(start, i - start));
    start = i + 1;
    if (dir.empty()) continue;
    const std::string candidate = detail::normalise_path(prefix + std::string(dir) + "/" + rest);
    if (!first) first = candidate;
    if (detail::path_exists(candidate)) {
      result = candidate;
      return status;
    }
  }
  result = first.value_or(detail::normalise_path(prefix + "/" + rest));
  return kExpandNotFound;
}

}  // namespace

std::int32_t expand_path(char* buffer, std::int32_t capacity) {
  if (buffer == nullptr || capacity <= 0 ||
      strnlen(buffer, static_cast<std::size_t>(capacity)) == static_cast<std::size_t>(capacity)) {
    report_error(std::nullopt, kExpandInvalid, capacity);
    return kExpandInvalid;
  }
  std::string out;
  const std::int32_t status = expand_for(buffer, capacity, /*in_place=*/true, out);
  if (usable(status)) store(out, buffer);
  return status;
}

void expand_name(const char* name, const std::int32_t& length, char* out,
                 const std::int32_t& capacity, std::int32_t& status) {
  if (!valid_arguments(name, length, out, capacity)) {
    report_error(std::nullopt, kExpandInvalid, capacity);
    status = kExpandInvalid;
    return;
  }
  std::string result;
  status = expand_for(padded_name(name, length), capacity, /*in_place=*/false, result);
  if (usable(status)) store(result, out);
}

void expand_existing(const char* name, const std::int32_t& length, char* out,
                     const std::int32_t& capacity, std::int32_t& status) {
  if (!valid_arguments(name, length, out, capacity)) {
    report_error(std::nullopt, kExpandInvalid, capacity);
    status = kExpandInvalid;
    return;
  }
  const std::string text = padded_name(name, length);
  if (text.empty()) {
    out[0] = '\0';
    status = kExpandNotFound;
    return;
  }
  std::string result;
  std::optional<std::int32_t> searched;
  if (const std::optional<PathSearch> search = find_path_search(text))
    searched = search_directories(*search, capacity, result);
  if (searched) {
    status = *searched;
    if (!usable(status) && status != kExpandNotFound) return;
    if (result.size() + 1 > static_cast<std::size_t>(capacity)) {
      report_error(text, kExpandTooSmall, capacity);
      status = kExpandTooSmall;
      return;
    }
  } else {
    status = expand_for(text, capacity, /*in_place=*/false, result);
    if (!usable(status)) return;
    if (!detail::path_exists(result)) status = kExpandNotFound;
  }
  // The plain expansion is delivered even for a missing file: the callers
  // that create files need the name.
  store(result, out);
}

void delete_file(const char* name, const std::int32_t& length, std::int32_t& status) {
  char path[kDeleteCapacity];
  expand_name(name, length, path, kDeleteCapacity, status);
  if (!usable(status)) return;
  std::string target(detail::trim_trailing_controls(path));
  if (target.find(',') != std::string::npos) {
    expand_existing(name, length, path, kDeleteCapacity, status);
    if (status != kExpandOk) return;
    target = std::string(detail::trim_trailing_controls(path));
  }
  if (::unlink(target.c_str()) != 0) status = kExpandNotFound;
}

std::int32_t expand_to_string(const std::string& name, std::string& out) {
  std::string result;
  const std::int32_t status = expand_for(name, kStringCapacity, /*in_place=*/false, result);
  if (usable(status)) out = std::move(result);
  return status;
}

}  // namespace zt
