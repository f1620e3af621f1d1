// Test cases kept as data: a .cases file holds "case NAME" lines, each
// followed by its commands, one a line; "#" lines are comments. Words are
// blank-separated; a quoted word may hold blanks and \n \r \t \" \\ \xHH.
// A suite runs each case as one named TEST_P, its commands in order.
#pragma once

#include <gtest/gtest.h>

#include <fstream>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

namespace zt::test {

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
    } else {
      for (++i; i < line.size() && line[i] != '"'; ++i) {
        if (line[i] != '\\' || i + 1 == line.size()) { w += line[i]; continue; }
        const char e = line[++i];
        if (e == 'x') w += static_cast<char>(std::stoi(line.substr(i + 1, 2), nullptr, 16)), i += 2;
        else w += e == 'n' ? '\n' : e == 'r' ? '\r' : e == 't' ? '\t' : e;
      }
      ++i;
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
