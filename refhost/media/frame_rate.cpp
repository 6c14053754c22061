// Frame rates as fractions: reducing, snapping to the common rates and reading them from text.
#include "refhost/media/frame_rate.h"

#include <cmath>
#include <cstdlib>
#include <numeric>

namespace refhost {
namespace {

// The rates cameras and editors use; measured rates within 0.1 % are taken to be these.
constexpr FrameRate kCommonRates[] = {{24000, 1001}, {24, 1}, {25, 1},       {30000, 1001},
                                      {30, 1},       {50, 1}, {60000, 1001}, {60, 1}};
// The whole rates whose drop-frame twins (n * 1000 / 1001) decimals name.
constexpr int64_t kDropFrameBases[] = {24, 30, 48, 60, 120};
// Digits a decimal rate may have after its point: more are no rate anyone labels.
constexpr std::size_t kMostDecimals = 6;

}  // namespace

std::string FrameRate::text() const {
  const FrameRate lowest = reduced(*this);
  if (lowest.denominator == 1) return std::to_string(lowest.numerator);
  return std::to_string(lowest.numerator) + "/" + std::to_string(lowest.denominator);
}

FrameRate reduced(FrameRate rate) {
  if (!rate.valid()) return {0, 1};
  const int64_t divisor = std::gcd(rate.numerator, rate.denominator);
  return {rate.numerator / divisor, rate.denominator / divisor};
}

FrameRate snappedToCommonRate(FrameRate rate) {
  if (!rate.valid()) return {0, 1};
  for (const FrameRate& common : kCommonRates)
    if (std::fabs(rate.perSecond() / common.perSecond() - 1) <= 0.001) return common;
  return reduced(rate);
}

std::optional<FrameRate> frameRateFromText(const std::string& text) {
  auto digitsOnly = [](const std::string& part, std::size_t most) {
    return !part.empty() && part.size() <= most &&
           part.find_first_not_of("0123456789") == std::string::npos;
  };
  auto positive = [](FrameRate rate) -> std::optional<FrameRate> {
    if (!rate.valid()) return std::nullopt;
    return reduced(rate);
  };
  const std::string::size_type slash = text.find('/');
  if (slash != std::string::npos) {
    const std::string top = text.substr(0, slash), bottom = text.substr(slash + 1);
    if (!digitsOnly(top, 9) || !digitsOnly(bottom, 9)) return std::nullopt;
    return positive({std::stoll(top), std::stoll(bottom)});
  }
  const std::string::size_type point = text.find('.');
  const std::string whole = text.substr(0, point);
  const std::string fraction = point == std::string::npos ? "" : text.substr(point + 1);
  if (!digitsOnly(whole, 9) || (point != std::string::npos && !digitsOnly(fraction, kMostDecimals)))
    return std::nullopt;
  int64_t scale = 1;
  for (std::size_t i = 0; i < fraction.size(); ++i) scale *= 10;
  const FrameRate written{std::stoll(whole) * scale + (fraction.empty() ? 0 : std::stoll(fraction)),
                          scale};
  if (fraction.size() >= 2 && written.numerator % scale != 0) {
    for (int64_t base : kDropFrameBases) {
      const FrameRate dropFrame{base * 1000, 1001};
      if (std::llround(dropFrame.perSecond() * static_cast<double>(scale)) == written.numerator)
        return dropFrame;
    }
  }
  return positive(written);
}

}  // namespace refhost
