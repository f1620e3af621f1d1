// The console progress bar.
#include "runtime/progress.hpp"

#include <cstdio>
#include <limits>

namespace zt {
namespace {

constexpr std::int32_t kBarLength = 30;
constexpr const char kStars[] = "******************************";
static_assert(sizeof kStars == kBarLength + 1);

std::int32_t g_shown = 0;

}  // namespace

int progress_value(std::int32_t total, std::int32_t current) {
  const std::int32_t d = total < 1 ? 1 : total;
  // The product wraps like a 32-bit integer, as the suite's bar always did.
  const auto product = static_cast<std::int32_t>(static_cast<std::uint32_t>(current) *
                                                 static_cast<std::uint32_t>(kBarLength));
  std::int32_t k = product / d;
  k = k == std::numeric_limits<std::int32_t>::min() ? kBarLength : (k < 0 ? -k : k);
  if (k > kBarLength) k = kBarLength;
  int result = 0;
  if (current == 0) {
    result = std::printf("\r 10-20-30-40-50-60-70-80-90-100%%\n\n");
    g_shown = 0;
  }
  if (k > g_shown) {
    result = std::printf("\r %s\r", kStars + (kBarLength - k));
    if (k == kBarLength) {
      result = std::printf("\n\n");
      g_shown = kBarLength;
      return result;
    }
    result = std::fflush(stdout);
  }
  g_shown = k;
  return result;
}

void progress(const std::int32_t& total, const std::int32_t& current) {
  progress_value(total, current);
}

int progress_finish() {
  const int result = std::printf("\n");
  std::fflush(stdout);
  return result;
}

}  // namespace zt
