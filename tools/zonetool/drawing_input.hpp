// The inputs of the drawing subcommands (svg, dxf): record files and text
// polyline files read into contours, and their grouping by level.
//
// A record file is recognised by its first byte ("K"); its contours start at
// each separator record (x above the driver's separator limit), take the z of
// their first point and are closed. A text file holds polylines in the common
// text form: points "x y z" give the polyline the z of its first point,
// points "x y" no level; a text polyline is closed when its last point
// repeats its first exactly. A damaged record file ends the process as it
// ends `dump` (record_stop); a text file's faults are reported as a message.
#pragma once

#include <string>
#include <vector>

namespace zonetool {

// Contours whose z differ by no more than this share a level, as the
// program groups the levels of its files.
inline constexpr double kDrawingLevelTolerance = 0.0001;

struct DrawingPoint {
  double x, y;
};

struct DrawingContour {
  bool hasZ = false;
  double z = 0;
  bool closed = false;
  std::vector<DrawingPoint> points;  // as read: a closed contour may repeat its first point at its end
};

struct DrawingInput {
  std::string name;     // the path as given
  bool single = false;  // a record file: its numbers are single precision
  std::vector<DrawingContour> contours;
};

// Reads the file at path into input; false with a message in error when it
// cannot be opened or a text line is malformed.
bool read_drawing_input(const std::string& path, DrawingInput& input, std::string& error);

// The levels of all inputs, from the top down, one per run of z values
// within kDrawingLevelTolerance of the run's highest z.
std::vector<double> collect_levels(const std::vector<DrawingInput>& inputs);

// True when the contour belongs to the level (a contour without z belongs to every level).
bool on_level(const DrawingContour& c, double level);

}  // namespace zonetool
