// The expansion proper: references, recursion into values, undefined
// variables and path normalisation.
#include <cstdlib>
#include <cstring>

#include "runtime/detail/runtime_state.hpp"
#include "runtime/path_expansion.hpp"

namespace zt::detail {
namespace {

// A value that refers to itself would otherwise recurse without end.
constexpr int kMaxExpansionDepth = 32;
// Values that each refer to the next several times multiply the work at every
// level; one expansion resolves at most this many references.
constexpr long kMaxReferences = 100000;

bool is_name_char(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '_';
}

std::string undefined_replacement(const std::string& name) {
  const char* null_text = std::getenv("KVLNULL");
  if (null_text == nullptr) return {};
  std::string text = null_text;
  if (const std::size_t dollar = text.find('$'); dollar != std::string::npos)
    text.replace(dollar, 1, name);
  return text;
}

std::int32_t expand_into(std::string_view in, std::string& out, int depth, long& references) {
  if (depth > kMaxExpansionDepth) return kExpandSyntax;
  std::int32_t status = kExpandOk;
  std::size_t i = 0;
  while (i < in.size()) {
    const char sigil = in[i];
    if (sigil != '$' && sigil != '?') {
      out.push_back(sigil);
      ++i;
      continue;
    }
    if (i + 1 < in.size() && in[i + 1] == sigil) {
      out.push_back(sigil);
      i += 2;
      continue;
    }
    std::string name;
    std::size_t j = i + 1;
    if (j < in.size() && (in[j] == '{' || in[j] == '(')) {
      const char close = in[j] == '{' ? '}' : ')';
      const std::size_t end = in.find(close, j + 1);
      if (end == std::string_view::npos) return kExpandSyntax;
      name = std::string(in.substr(j + 1, end - j - 1));
      i = end + 1;
    } else {
      while (j < in.size() && is_name_char(in[j])) ++j;
      name = std::string(in.substr(i + 1, j - i - 1));
      i = j;
    }
    if (++references > kMaxReferences) return kExpandSyntax;
    const VariableValue v = sigil == '$' ? lookup_variable(name) : lookup_path_variable(name);
    if (v.kind == Lookup::kFailed) return kExpandInvalid;
    if (v.kind == Lookup::kUndefined) {
      out += undefined_replacement(name);
      status = kExpandUndefined;
      continue;
    }
    if (v.value.find_first_of("$?") == std::string::npos) {
      out += v.value;
      continue;
    }
    const std::int32_t inner = expand_into(v.value, out, depth + 1, references);
    if (inner != kExpandOk && inner != kExpandUndefined) return inner;
    if (inner == kExpandUndefined) status = kExpandUndefined;
  }
  return status;
}

}  // namespace

std::string normalise_path(const std::string& path) {
  std::string out;
  out.reserve(path.size());
  for (char c : path) {
    const bool separator = c == '/' || c == '\\';
    if (separator && !out.empty() && out.back() == '/') continue;
    out.push_back(separator ? '/' : c);
  }
  return out;
}

std::int32_t expand_text(std::string_view input, std::string& out) {
  std::string raw;
  long references = 0;
  const std::int32_t status = expand_into(input, raw, 0, references);
  if (status != kExpandOk && status != kExpandUndefined) {
    out.clear();
    return status;
  }
  out = normalise_path(raw);
  return status;
}

}  // namespace zt::detail
