// Tests kept as data: rows of '|'-separated fields in a text file of the
// suite's data folder ('#' starts a comment line; blank lines are skipped),
// each row one named case of a parameterised test.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace zt::test {

using Row = std::vector<std::string>;  // the case's name first

// The parts of `s` between `sep`, without surrounding spaces.
inline std::vector<std::string> split_fields(const std::string& s, char sep) {
  std::vector<std::string> out;
  std::istringstream in(s);
  for (std::string part; std::getline(in, part, sep);) {
    const auto b = part.find_first_not_of(' '), e = part.find_last_not_of(' ');
    out.push_back(b == std::string::npos ? "" : part.substr(b, e - b + 1));
  }
  return out;
}

// \n, \r, \t and \s (a space) in a field.
inline std::string unescape(const std::string& s) {
  std::string out;
  for (std::size_t i = 0; i < s.size(); ++i) {
    if (s[i] != '\\' || i + 1 == s.size()) out += s[i];
    else ++i, out += s[i] == 'n' ? '\n' : s[i] == 'r' ? '\r' : s[i] == 't' ? '\t' : s[i] == 's' ? ' ' : s[i];
  }
  return out;
}

// The rows of data file `name`, each padded to `fields` fields.
inline std::vector<Row> read_table(const std::string& name, std::size_t fields) {
  std::vector<Row> rows;
  std::ifstream in(std::string(ZT_TEST_DATA_DIR) + "/" + name);
  for (std::string line; std::getline(in, line);) {
    if (line.find_first_not_of(' ') == std::string::npos || line[0] == '#') continue;
    rows.push_back(split_fields(line, '|'));
    rows.back().resize(fields);
  }
  return rows;
}

inline std::string row_name(const ::testing::TestParamInfo<Row>& i) { return i.param[0]; }

// A number, or a sum of numbers written without spaces ("1+1e-8"); "nan",
// "inf" and hexadecimal included.
inline double number(const std::string& text) {
  double sum = 0;
  char* end = nullptr;
  for (const char* s = text.c_str(); *s; s = end) {
    sum += std::strtod(s, &end);
    if (end == s) break;
  }
  return sum;
}

inline std::vector<double> numbers(const std::string& field, char sep = ' ') {
  std::vector<double> out;
  for (const std::string& n : split_fields(field, sep))
    if (!n.empty()) out.push_back(number(n));
  return out;
}

}  // namespace zt::test
