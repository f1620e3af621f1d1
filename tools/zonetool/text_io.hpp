// Text form of polylines shared by the zonetool subcommands.
//
// One point a line, its numbers separated by blanks ("x y", "x y tag",
// "x y z"); a blank line ends a polyline; a line starting with "#" is a
// comment. Numbers are written in the shortest form that reads back to the
// same value.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

namespace zonetool {

using TextPoint = std::vector<double>;         // the numbers of one line
using TextPolyline = std::vector<TextPoint>;

// Reads every polyline; false with a message naming the line on a malformed
// number or a non-finite value.
bool read_polylines(std::istream& in, std::vector<TextPolyline>& out, std::string& error);

// Shortest decimal text that reads back to the same double (or float).
std::string format_number(double v);
std::string format_number(float v);

}  // namespace zonetool
