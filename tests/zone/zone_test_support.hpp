// Test support of the zone builder: stand-in offset engines, a fresh $TMP
// per test, record files written byte by byte.
#pragma once

#include <gtest/gtest.h>
#include <stdlib.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

#include "support/record_bytes.hpp"
#include "support/scratch_dir.hpp"
#include "zone/entry_points.hpp"
#include "zone/offset_engine.hpp"
#include "zone/zone_context.hpp"

namespace zt::testing {

struct FakeElement {
  std::int32_t kind, site;
  Point2d p;  // user coordinates; handed out as (p - shift) x scale
};
using FakeCurve = std::vector<FakeElement>;

// A successful offset request fills the store with trace() (the scripted
// curves unless overridden).
class FakeEngine : public OffsetEngine {
 public:
  struct Added {
    double x, y;
    std::int32_t tag;
  };
  std::vector<Added> points;
  std::vector<std::array<std::int32_t, 3>> segments;  // i1, i2, tag
  std::vector<FakeCurve> script;
  std::map<std::int32_t, Point2d> centres;  // of point sites (arcs: -1 - index)
  bool diagramOk = true, offsetsOk = true;
  double scale = 1.0;
  Point2d shift;
  double requestT = 0.0;

  bool initialize() override { return true; }
  void terminate() override {}
  void reset() override {
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
  bool computeDiagram(bool, std::int32_t, bool, bool, std::int32_t, std::int32_t, double, double, bool) override {
    return diagramOk;
  }
  bool computeOffsets(std::int32_t side, double t, double) override {
    requestT = t;
    if (offsetsOk) store_ = trace(side, t);
    return offsetsOk;
  }
  std::int32_t curveCount() override { return static_cast<std::int32_t>(store_.size()); }
  void curve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) override {
    first = 0;
    for (std::int32_t c = 0; c < i; ++c) first += static_cast<std::int32_t>(store_[c].size());
    last = first + static_cast<std::int32_t>(store_[i].size()) - 1;
    offset = 1.0;
  }
  void element(std::int32_t k, std::int32_t& kind, std::int32_t& site, Point2d& start) override {
    for (const FakeCurve& c : store_) {
      if (k < static_cast<std::int32_t>(c.size())) {
        kind = c[k].kind;
        site = c[k].site;
        start = internal(c[k].p);
        return;
      }
      k -= static_cast<std::int32_t>(c.size());
    }
  }
  Point2d toUser(const Point2d& p) override { return {p.x / scale + shift.x, p.y / scale + shift.y}; }
  bool coincide(const Point2d& a, const Point2d& b) override {
    return std::hypot(a.x - b.x, a.y - b.y) <= 1e-6;
  }
  std::int32_t siteTag(SiteRef site) override { return 1000 * site.kind + site.index; }
  Point2d pointCentre(std::int32_t point) override { return internal(centres[point]); }
  Point2d arcCentre(std::int32_t arc) override { return internal(centres[-1 - arc]); }

 protected:
  virtual std::vector<FakeCurve> trace(std::int32_t, double) { return script; }
  Point2d internal(const Point2d& u) const { return {(u.x - shift.x) * scale, (u.y - shift.y) * scale}; }

 private:
  std::vector<FakeCurve> store_;
};

// Offsets every fed polyline as its bounding box grown (side 2) or shrunk
// (side 1) by t, traced so that the collection hands back a
// counter-clockwise rectangle: exact for axis-parallel rectangles with
// mitred corners.
class BoxOffsetEngine : public FakeEngine {
 protected:
  std::vector<FakeCurve> trace(std::int32_t side, double t) override {
    std::map<std::int32_t, std::array<double, 4>> boxes;  // by polyline tag
    for (const auto& s : segments) {
      for (std::int32_t i : {s[0], s[1]}) {
        const Added& p = points[i - 2];
        auto& b = boxes.try_emplace(s[2], std::array<double, 4>{p.x, p.y, p.x, p.y}).first->second;
        b = {std::min(b[0], p.x), std::min(b[1], p.y), std::max(b[2], p.x), std::max(b[3], p.y)};
      }
    }
    std::vector<FakeCurve> curves;
    const double g = side == 1 ? -t : t;
    for (const auto& [tag, b] : boxes) {
      const double x0 = b[0] - g, y0 = b[1] - g, x1 = b[2] + g, y1 = b[3] + g;
      if (x1 > x0 && y1 > y0) {
        curves.push_back({{0, tag, {x0, y0}}, {0, tag, {x0, y1}}, {0, tag, {x1, y1}}, {0, tag, {x1, y0}}});
      }
    }
    return curves;
  }
};

// A fresh directory as $TMP (KVLTMPDIR) and a fresh zone builder per test.
class ZoneTmpTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ::setenv("KVLTMPDIR", dir_.c_str(), 1);
    reset_zone_builder();
  }
  void TearDown() override {
    reset_zone_builder();
    set_offset_engine(nullptr);
    ::unsetenv("KVLTMPDIR");
  }
  std::string path(const std::string& name) const { return dir_ + "/" + name; }
  void write_file(const std::string& name, const std::string& content) const {
    test::write_text(path(name), content);
  }
  std::string read_file(const std::string& name) const { return test::read_text(path(name)); }
  test::ScratchDir scratch_;
  const std::string dir_ = scratch_.path().string();
};

// A record file of `width`-byte point records (12, 16 or 18: x, y, z, then
// the code, then the flag), optionally behind an 8-byte header record.
struct Rec {
  float x, y, z;
  std::int16_t flag = 1;
};
inline constexpr Rec kSep{99999.0f, 99999.0f, 99999.0f, 1};
inline std::string record_bytes(const std::vector<Rec>& recs, int width = 18, bool header = false) {
  auto bytes = [](const auto&... v) {
    std::string s;
    (s.append(reinterpret_cast<const char*>(&v), sizeof v), ...);
    return s;
  };
  std::vector<std::string> records;
  if (header) records.push_back(bytes(1.0f, std::int32_t{2}));
  for (const Rec& r : recs) {
    const std::int32_t code = r.x >= 90000 ? -1001 : -1003;
    records.push_back(bytes(r.x, r.y, r.z, code, r.flag).substr(0, static_cast<std::size_t>(width)));
  }
  return test::segmented_record_file(records);
}

// Per level its contours, each behind a separator record.
struct LevelContours {
  float z;
  std::vector<std::vector<Point2f>> contours;
};
inline std::string record_file(const std::vector<LevelContours>& levels) {
  std::vector<Rec> recs;
  for (const LevelContours& level : levels) {
    for (const auto& contour : level.contours) {
      recs.push_back(kSep);
      for (const Point2f& p : contour) recs.push_back({p.x, p.y, level.z});
    }
  }
  return record_bytes(recs);
}

// A closed counter-clockwise axis-parallel rectangle.
inline std::vector<Point2f> rectangle(float x0, float y0, float x1, float y1) {
  return {{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}, {x0, y0}};
}

// Driver-style point pairs: each contour behind a (99999, 99999) pair.
inline std::vector<Point2f> stock_points(const std::vector<std::vector<Point2f>>& contours) {
  std::vector<Point2f> out;
  for (const auto& c : contours) {
    out.push_back({99999.0f, 99999.0f});
    out.insert(out.end(), c.begin(), c.end());
  }
  return out;
}

// Bounding box {xmin, ymin, xmax, ymax} of the non-separator points.
inline std::array<float, 4> box_of(const std::vector<Point2f>& pts) {
  std::array<float, 4> b{1e9f, 1e9f, -1e9f, -1e9f};
  for (const Point2f& p : pts) {
    if (p.x < 99990.0f) b = {std::min(b[0], p.x), std::min(b[1], p.y), std::max(b[2], p.x), std::max(b[3], p.y)};
  }
  return b;
}

// The zones wf_fin_czone writes (handed `buffer`), by z in the order written,
// its console output dropped; ierr as it leaves it.
using WrittenZones = std::map<float, std::vector<std::vector<Point2f>>>;
inline WrittenZones finish_zones(std::int32_t unit, std::int32_t& ierr, std::vector<Point2f> buffer = {}) {
  static WrittenZones written;
  written.clear();
  ::testing::internal::CaptureStdout();
  wf_fin_czone(buffer, unit, ierr, [](const std::int32_t& n, const Point2f* p, const float& z, const std::int32_t&,
                                      std::int32_t& e) {
    written[z].emplace_back(p, p + n);
    e = 0;
  });
  ::testing::internal::GetCapturedStdout();
  return written;
}

}  // namespace zt::testing
