// Contour store: the level scan, the z lookup with its forward cursor and
// the level read.
#include "zone/contour_store.hpp"

#include <cmath>
#include <limits>
#include <new>

namespace zt {

namespace {

// z of the level before any point record is seen; no real level has it.
constexpr float kNoLevelZ = 99999.0f;
// Tag of a point whose record carries no flag: the flag every record this
// suite writes holds.
constexpr std::int32_t kDefaultPointTag = 1;
// Records of at least this size carry the 16-bit flag after x, y, z, code.
constexpr std::int64_t kRecordWithFlag = 18;

// The nearest single-precision value, without undefined conversions of
// doubles beyond the float range.
float to_float(double z) {
  constexpr double kMax = std::numeric_limits<float>::max();
  if (z > kMax) return std::numeric_limits<float>::infinity();
  if (z < -kMax) return -std::numeric_limits<float>::infinity();
  return static_cast<float>(z);
}

}  // namespace

std::int32_t read_contour_record(CKvlBinaryResFileReader& reader, float& x, float& y, float& z,
                                 std::int64_t& recordIndex) {
  recordIndex = reader.readPoint(x, y, z);
  return recordIndex > 0 ? 1 : 0;
}

void rewind_contours(ContourStore& store) {
  store.recordIndex = 0;
  if (store.reader) store.reader->seekToPoint(1);
}

std::int32_t load_contours(ContourStore& store, ContourRecordReader readRecord) {
  store.readRecord = readRecord;
  if (!store.reader || !readRecord) return -1;
  rewind_contours(store);
  if (!store.levels) {
    store.levels.reset(new (std::nothrow) ContourLevel[kMaxContourLevels]);
    if (!store.levels) return -1;
  }
  store.levelCount = 0;
  store.levelCursor = 0;
  CKvlBinaryResFileReader& reader = *store.reader;
  ContourLevel* levels = store.levels.get();

  float x = 0.0f, y = 0.0f, levelZ = kNoLevelZ;
  std::int32_t got = readRecord(reader, x, y, levelZ, store.recordIndex);
  while (got && x >= kScanSeparatorX) got = readRecord(reader, x, y, levelZ, store.recordIndex);

  std::int32_t i = store.levelCount++;
  levels[i] = {store.recordIndex, store.recordIndex, levelZ};
  float z = 0.0f;
  while (readRecord(reader, x, y, z, store.recordIndex)) {
    const float drop = levelZ - z;
    if (x < kScanSeparatorX && drop > kContourLevelDrop) {
      if (store.levelCount == kMaxContourLevels) return -1;
      levelZ = z;
      i = store.levelCount++;
      levels[i] = {store.recordIndex, store.recordIndex, levelZ};
    }
    levels[i].last = store.recordIndex;
  }
  rewind_contours(store);
  return 0;
}

std::int32_t find_contour_level(ContourStore& store, double z) {
  const float zf = to_float(z);
  if (std::isnan(zf)) return -1;
  for (std::int32_t c = store.levelCursor; c < store.levelCount;) {
    const float levelZ = store.levels[c].z;
    const float difference = levelZ - zf;
    if (std::fabs(difference) < kContourLevelMatch) return c;
    if (zf > levelZ) return -1;
    store.levelCursor = ++c;
  }
  return -1;
}

std::int32_t read_contour_level(ContourStore& store, std::int32_t index, TaggedPointList& list) {
  if (!store.levels || index < 0 || index >= store.levelCount) return -1;
  if (!store.reader) return 0;
  const ContourLevel& level = store.levels[index];
  // A level without point records (a file of separators only) reads empty.
  if (level.first < 1 || level.last < level.first) return 0;
  CKvlBinaryResFileReader& reader = *store.reader;
  if (reader.seekToPoint(level.first) != 0) return -1;
  // Records of 12 or 16 bytes carry no flag: their points get the tag every
  // record of this suite carries, never bytes left from another record.
  const bool withFlag = reader.recordSize() >= kRecordWithFlag;
  const std::int64_t records = level.last - level.first + 1;
  if (records < std::numeric_limits<std::int32_t>::max()) make_room(list, static_cast<std::int32_t>(records));
  for (std::int64_t r = level.first; r <= level.last; ++r) {
    float x = 0.0f, y = 0.0f, z = 0.0f;
    std::int32_t code = 0;
    std::int16_t flag = kDefaultPointTag;
    const std::int64_t got =
        withFlag ? reader.readPoint(x, y, z, &code, &flag) : reader.readPoint(x, y, z);
    if (got <= 0) return -1;
    const std::int32_t tag = x < kReadSeparatorX ? std::int32_t{flag} : kSeparatorTag;
    list.Add({tag, x, y});
  }
  return 0;
}

}  // namespace zt
