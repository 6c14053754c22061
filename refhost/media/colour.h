// A picture's colour description, as video streams carry it and video files are tagged with it:
// the matrix from RGB to YUV, the range of its code values, its primaries and its transfer,
// numbered as ITU-T H.273 numbers them (the numbers FFmpeg and the container tags use).
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace refhost {

struct ColourDescription {
  enum Matrix : int32_t {
    kMatrixRgb = 0,
    kMatrixBt709 = 1,
    kMatrixFcc = 4,
    kMatrixBt470bg = 5,
    kMatrixSmpte170m = 6,
    kMatrixSmpte240m = 7,
    kMatrixBt2020 = 9,
    kMatrixBt2020Constant = 10
  };
  enum Primaries : int32_t {
    kPrimariesBt709 = 1,
    kPrimariesBt470m = 4,
    kPrimariesBt470bg = 5,
    kPrimariesSmpte170m = 6,
    kPrimariesSmpte240m = 7,
    kPrimariesBt2020 = 9
  };
  enum Transfer : int32_t {
    kTransferBt709 = 1,
    kTransferGamma22 = 4,
    kTransferGamma28 = 5,
    kTransferSmpte170m = 6,
    kTransferLinear = 8,
    kTransferSrgb = 13,
    kTransferBt2020_10 = 14,
    kTransferBt2020_12 = 15,
    kTransferPq = 16,
    kTransferHlg = 18
  };

  int32_t matrix = kMatrixBt709;
  int32_t primaries = kPrimariesBt709;
  int32_t transfer = kTransferBt709;
  bool fullRange = false;

  // BT.709 with limited range: HD video's, and the composition's when nothing says otherwise.
  static ColourDescription bt709() { return {}; }
  // BT.601 (SMPTE 170M) with limited range: standard-definition video's.
  static ColourDescription bt601() {
    return {kMatrixSmpte170m, kPrimariesSmpte170m, kTransferSmpte170m, false};
  }
  // What an untagged stream of the height is taken to be: BT.601 below 720 lines, BT.709 from
  // 720 up, as players guess.
  static ColourDescription guessedFor(int32_t height) { return height < 720 ? bt601() : bt709(); }

  bool operator==(const ColourDescription& other) const {
    return matrix == other.matrix && primaries == other.primaries && transfer == other.transfer &&
           fullRange == other.fullRange;
  }
  bool operator!=(const ColourDescription& other) const { return !(*this == other); }
  // A transfer for high dynamic range (PQ, HLG).
  bool isHdr() const { return transfer == kTransferPq || transfer == kTransferHlg; }
  // BT.2020's primaries or matrix: colours wider than BT.709's, which SDR output cannot hold.
  bool isWideGamut() const {
    return primaries == kPrimariesBt2020 || matrix == kMatrixBt2020 ||
           matrix == kMatrixBt2020Constant;
  }
};

// The names ffprobe shows ("bt709", "smpte170m", "bt470bg", "bt2020nc", ...); the number in
// decimal for one without a name here.
std::string matrixName(int32_t matrix);
std::string primariesName(int32_t primaries);
std::string transferName(int32_t transfer);
// The number of a name above (also "bt601").
std::optional<int32_t> matrixFromName(const std::string& name);
std::optional<int32_t> primariesFromName(const std::string& name);
std::optional<int32_t> transferFromName(const std::string& name);

}  // namespace refhost
