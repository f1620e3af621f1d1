// Test support of the zone builder: stand-in offset engines, a fresh $TMP
// per test, and record files written byte by byte.
#pragma once

#include <gtest/gtest.h>
#include <stdlib.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "zone/offset_engine.hpp"
#include "zone/zone_context.hpp"

namespace zt::testing {

struct FakeElement {
  std::int32_t kind = 0;
  std::int32_t site = 0;
  Point2d p;  // user coordinates; stored scaled
};
struct FakeCurve {
  double offset = 0.0;
  std::vector<FakeElement> elements;
};

// A scripted engine: records every call, and on a successful offset request
// fills its store with trace() (by default the scripted curves). Internal
// coordinates are (user - shift) x scale.
class FakeEngine : public OffsetEngine {
 public:
  struct Added {
    double x, y;
    std::int32_t tag;
  };
  struct Segment {
    std::int32_t i1, i2, tag;
  };

  std::vector<std::string> calls;
  std::vector<Added> points;
  std::vector<Segment> segments;
  std::vector<FakeCurve> script;
  std::map<std::int32_t, Point2d> pointCentres, arcCentres;  // user coordinates
  bool diagramOk = true;
  bool offsetsOk = true;
  double scale = 1.0;
  Point2d shift;
  std::int32_t boundFactor = 0;
  double requestT = 0.0;
  std::int32_t requestSide = 0;

  bool initialize() override {
    calls.push_back("initialize");
    return true;
  }
  void terminate() override { calls.push_back("terminate"); }
  void reset() override {
    calls.push_back("reset");
    points.clear();
    segments.clear();
    store_.clear();
  }
  std::int32_t addPoint(double x, double y, std::int32_t tag) override {
    points.push_back({x, y, tag});
    return static_cast<std::int32_t>(points.size()) + 1;
  }
  std::int32_t addSegment(std::int32_t i1, std::int32_t i2, std::int32_t tag) override {
    segments.push_back({i1, i2, tag});
    return static_cast<std::int32_t>(segments.size()) - 1;
  }
  bool computeDiagram(bool clean, std::int32_t bound, bool pointsOnly, bool keepArcLinks,
                      std::int32_t sampleDensity, std::int32_t arcPieces, double tol, double tol2,
                      bool autoTol) override {
    std::ostringstream s;
    s << "diagram " << clean << ' ' << bound << ' ' << pointsOnly << ' ' << keepArcLinks << ' '
      << sampleDensity << ' ' << arcPieces << ' ' << tol << ' ' << tol2 << ' ' << autoTol;
    calls.push_back(s.str());
    boundFactor = bound;
    return diagramOk;
  }
  bool computeOffsets(std::int32_t side, double t, double d) override {
    std::ostringstream s;
    s << "offsets " << side << ' ' << t << ' ' << d;
    calls.push_back(s.str());
    requestSide = side;
    requestT = t;
    if (offsetsOk) store_ = trace(side, t);
    return offsetsOk;
  }
  std::int32_t curveCount() override { return static_cast<std::int32_t>(store_.size()); }
  void curve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) override {
    std::int32_t k = 0;
    for (std::int32_t c = 0; c < i; ++c) k += static_cast<std::int32_t>(store_[c].elements.size());
    offset = store_[i].offset;
    first = k;
    last = k + static_cast<std::int32_t>(store_[i].elements.size()) - 1;
  }
  void element(std::int32_t k, std::int32_t& kind, std::int32_t& site, Point2d& start) override {
    for (const FakeCurve& c : store_) {
      if (k < static_cast<std::int32_t>(c.elements.size())) {
        kind = c.elements[k].kind;
        site = c.elements[k].site;
        start = internal(c.elements[k].p);
        return;
      }
      k -= static_cast<std::int32_t>(c.elements.size());
    }
    ADD_FAILURE() << "element index out of the store";
  }
  Point2d toUser(const Point2d& p) override {
    return {p.x / scale + shift.x, p.y / scale + shift.y};
  }
  bool coincide(const Point2d& a, const Point2d& b) override {
    return std::hypot(a.x - b.x, a.y - b.y) <= 1e-6;
  }
  std::int32_t siteTag(SiteRef site) override { return 1000 * site.kind + site.index; }
  Point2d pointCentre(std::int32_t point) override { return internal(pointCentres[point]); }
  Point2d arcCentre(std::int32_t arc) override { return internal(arcCentres[arc]); }

  Point2d internal(const Point2d& u) const { return {(u.x - shift.x) * scale, (u.y - shift.y) * scale}; }

 protected:
  virtual std::vector<FakeCurve> trace(std::int32_t, double) { return script; }

 private:
  std::vector<FakeCurve> store_;
};

// Offsets every fed polyline as its bounding box grown (side 2) or shrunk
// (side 1) by t: a counter-clockwise rectangle of straight elements, traced
// so that the collection hands it back counter-clockwise from its lower
// left corner. Exact for axis-parallel rectangles with mitred corners.
class BoxOffsetEngine : public FakeEngine {
 protected:
  std::vector<FakeCurve> trace(std::int32_t side, double t) override {
    std::map<std::int32_t, std::array<double, 4>> boxes;  // by polyline tag
    for (const Segment& s : segments) {
      for (std::int32_t i : {s.i1, s.i2}) {
        const Added& p = points[i - 2];
        auto [it, fresh] = boxes.try_emplace(s.tag, std::array<double, 4>{p.x, p.y, p.x, p.y});
        auto& b = it->second;
        b = {std::min(b[0], p.x), std::min(b[1], p.y), std::max(b[2], p.x), std::max(b[3], p.y)};
      }
    }
    std::vector<FakeCurve> curves;
    const double g = side == 1 ? -t : t;
    for (const auto& [tag, b] : boxes) {
      const double x0 = b[0] - g, y0 = b[1] - g, x1 = b[2] + g, y1 = b[3] + g;
      if (x1 - x0 <= 0 || y1 - y0 <= 0) continue;
      curves.push_back({t, {{0, tag, {x0, y0}}, {0, tag, {x0, y1}}, {0, tag, {x1, y1}},
                            {0, tag, {x1, y0}}}});
    }
    return curves;
  }
};

// Per test: a fresh directory as $TMP (KVLTMPDIR), a fresh zone builder, and
// an optional stand-in engine.
class ZoneTmpTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char pattern[] = "/tmp/zt_zone_XXXXXX";
    ASSERT_NE(::mkdtemp(pattern), nullptr);
    dir_ = pattern;
    if (const char* old = std::getenv("KVLTMPDIR")) savedTmp_ = old;
    ::setenv("KVLTMPDIR", dir_.c_str(), 1);
    reset_zone_builder();
  }
  void TearDown() override {
    reset_zone_builder();
    set_offset_engine(nullptr);
    if (savedTmp_.empty()) ::unsetenv("KVLTMPDIR");
    else ::setenv("KVLTMPDIR", savedTmp_.c_str(), 1);
    std::filesystem::remove_all(dir_);
  }

  std::string path(const std::string& name) const { return dir_ + "/" + name; }
  void write_file(const std::string& name, const std::string& content) const {
    std::ofstream(path(name), std::ios::binary) << content;
  }
  std::string read_file(const std::string& name) const {
    std::ifstream in(path(name), std::ios::binary);
    std::ostringstream s;
    s << in.rdbuf();
    return s.str();
  }

  std::string dir_;

 private:
  std::string savedTmp_;
};

// One 18-byte point record file: contours (lists of x, y) at z, each behind
// a separator record, levels in the order given.
struct LevelContours {
  float z;
  std::vector<std::vector<Point2f>> contours;
};
inline std::string record_file(const std::vector<LevelContours>& levels) {
  auto put = [](std::string& s, const void* p, size_t n) { s.append(static_cast<const char*>(p), n); };
  auto record = [&](std::string& s, float x, float y, float z, std::int32_t code) {
    const std::int16_t flag = 1;
    s += '\x12';
    put(s, &x, 4);
    put(s, &y, 4);
    put(s, &z, 4);
    put(s, &code, 4);
    put(s, &flag, 2);
    s += '\x12';
  };
  std::string out = "K";
  for (const LevelContours& level : levels) {
    for (const auto& contour : level.contours) {
      record(out, 99999.0f, 99999.0f, 99999.0f, -1001);
      for (const Point2f& p : contour) record(out, p.x, p.y, level.z, -1003);
    }
  }
  return out + '\x82';
}

// A closed counter-clockwise axis-parallel rectangle (first point repeated).
inline std::vector<Point2f> rectangle(float x0, float y0, float x1, float y1) {
  return {{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}, {x0, y0}};
}

// Driver-style point pairs: contours separated by (99999, 99999).
inline std::vector<Point2f> stock_points(const std::vector<std::vector<Point2f>>& contours) {
  std::vector<Point2f> out;
  for (const auto& c : contours) {
    out.push_back({99999.0f, 99999.0f});
    out.insert(out.end(), c.begin(), c.end());
  }
  return out;
}

}  // namespace zt::testing
