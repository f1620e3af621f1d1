// Reading "$TMP/zstock.ok" and "$TMP/grid.tmp".
#include "zone/parameter_files.hpp"

#include <cmath>
#include <cstdio>

#include "runtime/text_file.hpp"

namespace zt {

float mergeRadius = kDefaultMergeRadius;

namespace {

bool usable(float v) { return std::isfinite(v) && v > 0.0f; }

}  // namespace

void read_offset_distance(const char* path, double& offsetDistance) {
  std::FILE* f = open_regular_for_reading(path);
  if (!f) return;
  float value = 0.0f;
  bool read = std::fscanf(f, "%f", &value) == 1;
  // The second number, when there is one, is the distance.
  read = (std::fscanf(f, "%f", &value) == 1) || read;
  std::fclose(f);
  if (read && usable(value) && double{value} > offsetDistance) offsetDistance = value;
}

std::int32_t read_merge_radius(const char* path, float& radius) {
  std::FILE* f = open_regular_for_reading(path);
  if (!f) return -1;
  constexpr int kPairs = 4;
  float first[kPairs] = {};
  float second[kPairs] = {};
  bool read[kPairs] = {};
  for (int p = 0; p < kPairs; ++p) {
    const int got = std::fscanf(f, "%f %f", &first[p], &second[p]);
    read[p] = got >= 1;
  }
  // A name that opens but cannot be read (a directory) is unreadable.
  const bool unreadable = std::ferror(f) != 0;
  std::fclose(f);
  if (unreadable) return -1;
  if (read[3] && usable(first[3])) radius = first[3];
  if (read[2] && usable(first[2])) {
    const float s = std::fmin(first[2], kMaxGridStep);
    if (2.0f * s > radius) radius = 2.0f * s;
  }
  return 0;
}

}  // namespace zt
