#include "text_io.hpp"

#include <charconv>
#include <cmath>
#include <istream>
#include <sstream>

namespace zonetool {

bool read_polylines(std::istream& in, std::vector<TextPolyline>& out, std::string& error) {
  std::string line;
  TextPolyline current;
  int lineNo = 0;
  auto flush = [&] {
    if (!current.empty()) out.push_back(std::move(current));
    current.clear();
  };
  while (std::getline(in, line)) {
    ++lineNo;
    if (!line.empty() && line.back() == '\r') line.pop_back();
    const auto first = line.find_first_not_of(" \t");
    if (first == std::string::npos) {
      flush();
      continue;
    }
    if (line[first] == '#') continue;
    TextPoint p;
    const char* s = line.data() + first;
    const char* end = line.data() + line.size();
    while (s < end) {
      while (s < end && (*s == ' ' || *s == '\t')) ++s;
      if (s == end) break;
      double v = 0;
      auto r = std::from_chars(s, end, v);
      if (r.ec != std::errc() || !std::isfinite(v)) {
        error = "line " + std::to_string(lineNo) + ": not a finite number: " + line;
        return false;
      }
      p.push_back(v);
      s = r.ptr;
    }
    current.push_back(std::move(p));
  }
  flush();
  return true;
}

template <typename F>
static std::string shortest(F v) {
  char buf[64];
  auto r = std::to_chars(buf, buf + sizeof buf, v);
  return std::string(buf, r.ptr);
}

std::string format_number(double v) { return shortest(v); }
std::string format_number(float v) { return shortest(v); }

}  // namespace zonetool
