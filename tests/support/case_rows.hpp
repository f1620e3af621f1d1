// Tests kept as data in the suite's data folder (ZT_TEST_DATA_DIR), in two
// forms. Rows: one case a line, fields split by '|', blank lines and lines
// starting with '#' skipped; the first field names the case (letters,
// digits, '_'), which gtest shows when the row fails; a file that cannot be
// read gives one failing row. Scripts: a .cases file holds "case NAME"
// lines, each followed by its commands, one a line; "#" lines are comments;
// words are blank-separated, and a quoted word may hold blanks and \n \r \t
// \" \\ \xHH. A suite runs each case as one named TEST_P, its commands in
// order.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <map>
#include <ostream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace zt::test {

struct Row {
  std::string name, error;
  std::vector<std::string> fields;  // after the name, trimmed
  std::string field(std::size_t i) const { return i < fields.size() ? fields[i] : ""; }
};

inline std::string Trim(const std::string& s) {
  const auto b = s.find_first_not_of(" \t\r"), e = s.find_last_not_of(" \t\r");
  return b == std::string::npos ? "" : s.substr(b, e - b + 1);
}

// The trimmed parts of a text between separators.
inline std::vector<std::string> Parts(const std::string& text, char sep) {
  std::istringstream s(text);
  std::vector<std::string> out;
  for (std::string part; std::getline(s, part, sep);) out.push_back(Trim(part));
  return out;
}

inline std::vector<Row> ReadRows(const std::string& file) {
  std::ifstream in(std::string(ZT_TEST_DATA_DIR) + "/" + file);
  if (!in) return {Row{"UnreadableCaseFile", "cannot read " + file, {}}};
  std::vector<Row> rows;
  for (std::string line; std::getline(in, line);) {
    if (Trim(line).empty() || Trim(line)[0] == '#') continue;
    Row r{"", "", Parts(line, '|')};
    r.name = r.fields.front();
    r.fields.erase(r.fields.begin());
    rows.push_back(r);
  }
  return rows;
}

// A number as strtod reads it (nan, inf, hexadecimal), a sum of such
// numbers written without blanks ("1+1e-8"), or "sqrt(v)".
inline double Num(const std::string& word) {
  if (word.rfind("sqrt(", 0) == 0) return std::sqrt(std::strtod(word.c_str() + 5, nullptr));
  double sum = 0;
  char* end = nullptr;
  for (const char* s = word.c_str(); *s; s = end) {
    sum += std::strtod(s, &end);
    if (end == s) break;
  }
  return sum;
}

// The blank-separated words of a text.
inline std::vector<std::string> Split(const std::string& text) {
  std::istringstream s(text);
  std::vector<std::string> w;
  for (std::string x; s >> x;) w.push_back(x);
  return w;
}

// The words of a text separated by blanks or commas.
inline std::vector<std::string> List(std::string text) {
  std::replace(text.begin(), text.end(), ',', ' ');
  return Split(text);
}

inline std::vector<double> Nums(const std::string& text) {
  std::vector<double> v;
  for (const std::string& w : List(text)) v.push_back(Num(w));
  return v;
}

// A field with \n, \r, \t, \s (a space) and \xHH escapes; any other
// escaped character stands for itself.
inline std::string Unescape(const std::string& s) {
  std::string out;
  for (std::size_t i = 0; i < s.size(); ++i) {
    if (s[i] != '\\' || i + 1 == s.size()) out += s[i];
    else if (s[++i] == 'x') out += static_cast<char>(std::stoi(s.substr(i + 1, 2), nullptr, 16)), i += 2;
    else out += s[i] == 'n' ? '\n' : s[i] == 'r' ? '\r' : s[i] == 't' ? '\t' : s[i] == 's' ? ' ' : s[i];
  }
  return out;
}

// The key=value words of a field.
struct Keys {
  std::map<std::string, std::string> kv;
  explicit Keys(const std::string& text) {
    for (const std::string& w : Split(text)) {
      const auto eq = w.find('=');
      kv[w.substr(0, eq)] = eq == std::string::npos ? "" : w.substr(eq + 1);
    }
  }
  bool has(const std::string& k) const { return kv.count(k) != 0; }
  double num(const std::string& k, double fallback = 0) const { return has(k) ? Num(kv.at(k)) : fallback; }
  std::string str(const std::string& k) const { return has(k) ? kv.at(k) : ""; }
};

// gtest names a failing row by this.
inline void PrintTo(const Row& r, std::ostream* os) { *os << r.name; }

// The fixture of a row-driven suite: an unreadable file fails its row.
class CaseRows : public ::testing::TestWithParam<Row> {
 protected:
  void SetUp() override { ASSERT_EQ(GetParam().error, ""); }
  const Row& row() const { return GetParam(); }
};

inline auto RowsOf(const std::string& file) { return ::testing::ValuesIn(ReadRows(file)); }
inline std::string RowName(const ::testing::TestParamInfo<Row>& info) { return info.param.name; }

// ---- Scripts

using Words = std::vector<std::string>;

struct ScriptCase {
  std::string name, where;                  // "<file>_<case>", "<file>:<line>"
  std::vector<std::pair<int, Words>> lines;  // commands with their line numbers
};

inline void PrintTo(const ScriptCase& c, std::ostream* os) { *os << c.where; }

inline Words split_words(const std::string& line) {
  Words out;
  for (std::size_t i = 0; i < line.size();) {
    if (line[i] == ' ') { ++i; continue; }
    std::string w;
    if (line[i] != '"') {
      while (i < line.size() && line[i] != ' ') w += line[i++];
    } else {  // up to the closing quote, escapes skipped
      std::size_t end = ++i;
      while (end < line.size() && line[end] != '"') end += line[end] == '\\' ? 2 : 1;
      w = Unescape(line.substr(i, end - i)), i = end + 1;
    }
    out.push_back(w);
  }
  return out;
}

// The cases of ZT_TEST_DATA_DIR/<file>.cases for each file.
inline std::vector<ScriptCase> load_script_cases(const std::vector<std::string>& files) {
  std::vector<ScriptCase> cases;
  for (const std::string& file : files) {
    std::ifstream in(std::string(ZT_TEST_DATA_DIR) + "/" + file + ".cases");
    std::string line;
    for (int n = 1; std::getline(in, line); ++n) {
      const Words w = split_words(line);
      if (w.empty() || w[0][0] == '#') continue;
      if (w[0] != "case") {
        if (!cases.empty()) cases.back().lines.emplace_back(n, w);
        continue;
      }
      std::string name = file, where = file;
      cases.push_back({name.append("_").append(w.at(1)), where.append(":").append(std::to_string(n)), {}});
    }
  }
  return cases;
}

// Runs a case's commands in order, each failure naming the case and line.
template <class Run>
void run_script(const ScriptCase& c, Run run) {
  SCOPED_TRACE(c.where);
  for (const auto& [line, words] : c.lines) {
    SCOPED_TRACE("line " + std::to_string(line));
    run(words);
  }
}

inline std::string case_name(const ::testing::TestParamInfo<ScriptCase>& info) { return info.param.name; }

}  // namespace zt::test
