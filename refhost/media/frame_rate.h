// A frame rate as an exact fraction (30000/1001, 25/1), as video streams and time bases keep
// it: composition times, a video output's time base and the frame each time shows are
// computed from it without rounding.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace refhost {

struct FrameRate {
  int64_t numerator = 0;    // frames ...
  int64_t denominator = 1;  // ... a second per this many seconds

  // Neither part 0 or less: 0/1 stands for "no rate" (a still, a generated picture).
  bool valid() const { return numerator > 0 && denominator > 0; }
  double perSecond() const { return valid() ? static_cast<double>(numerator) / denominator : 0; }
  // "25", "30000/1001": a whole rate as its number, any other as its fraction.
  std::string text() const;
  bool operator==(const FrameRate& other) const {
    return numerator * other.denominator == other.numerator * denominator;
  }
  bool operator!=(const FrameRate& other) const { return !(*this == other); }
};

// The fraction in lowest terms; 0/1 when it is no rate.
FrameRate reduced(FrameRate rate);

// The common rate (24000/1001, 24, 25, 30000/1001, 30, 50, 60000/1001, 60) within 0.1 % of
// the rate, as a stream's rate measured from its timestamps is rounded to what it was shot at;
// any other rate in lowest terms.
FrameRate snappedToCommonRate(FrameRate rate);

// The rate a person writes: a whole number ("30"), a fraction ("30000/1001") or a decimal
// ("12.5"). Decimals of two places or more that round the drop-frame rates (23.976 or 23.98,
// 29.97, 47.952, 59.94, 119.88) name those rates (24000/1001, ...), as editors and cameras
// label them. Nothing for any other text, or a rate not above 0.
std::optional<FrameRate> frameRateFromText(const std::string& text);

}  // namespace refhost
