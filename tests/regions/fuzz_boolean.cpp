// libFuzzer target: arbitrary contours into rg_boolean. Any input must end in
// 0 or -1, without a crash, a hang or a sanitizer report, and the same
// operation run twice must give the same output.
//
// Input bytes: the first picks the operation; then records of one control
// byte each, followed by their data:
//   bit 7 set     a separator into the operand of bit 6
//   bit 5 set     a point of 16 raw bytes (two doubles: NaN, huge, anything)
//   otherwise     a point on a 16 x 16 lattice from the next byte (two
//                 nibbles), which gives shared edges and touching vertices
// bit 6 chooses the operand (A or B), bits 0..4 are the point's tag.
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "region_test_support.hpp"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 1) return 0;
  static const char* const kOps[] = {"u", "i", "d", "x"};
  const char* op = kOps[data[0] % 4];
  zt::TaggedPointList lists[2];
  std::size_t i = 1;
  while (i < size) {
    const std::uint8_t c = data[i++];
    zt::TaggedPointList& l = lists[(c >> 6) & 1];
    const int tag = c & 0x1f;
    if (c & 0x80) {
      l.AddDoubling(zt::TaggedPoint::separator());
    } else if (c & 0x20) {
      if (size - i < 16) break;
      double x, y;
      std::memcpy(&x, data + i, 8);
      std::memcpy(&y, data + i + 8, 8);
      i += 16;
      l.AddDoubling(zt::TaggedPoint(tag, x, y));
    } else {
      if (i >= size) break;
      const std::uint8_t p = data[i++];
      l.AddDoubling(zt::TaggedPoint(tag, p >> 4, p & 0xf));
    }
  }
  zt::TaggedPointList r1, r2;
  const int rc1 = zt::rg_boolean(lists[0], lists[1], op, &r1);
  const int rc2 = zt::rg_boolean(lists[0], lists[1], op, &r2);
  if ((rc1 != 0 && rc1 != -1) || rc1 != rc2 || !zt::test::same_list(r1, r2)) std::abort();
  return 0;
}
