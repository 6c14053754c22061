// How the pixels of the frames the host uploads and reads back are stored: 8 bits a channel,
// or half floats when a source or the output holds more than 8 bits, so that their precision
// lasts from the decoder to the writer. One place knows each format's GL names and sizes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace refhost {

enum class PixelFormat { Rgba8, RgbaHalf };

constexpr std::size_t bytesPerPixel(PixelFormat format) {
  return format == PixelFormat::Rgba8 ? 4 : 8;
}

// GL_RGBA (unsized, 8 bits here) or GL_RGBA16F as a texture's internal format; the upload and
// read-back data type GL_UNSIGNED_BYTE or GL_HALF_FLOAT (always with the pixel format GL_RGBA).
constexpr uint32_t glInternalFormat(PixelFormat format) {
  return format == PixelFormat::Rgba8 ? 0x1908u : 0x881Au;
}
constexpr uint32_t glDataType(PixelFormat format) {
  return format == PixelFormat::Rgba8 ? 0x1401u : 0x140Bu;
}

// IEEE 754 half floats, rounded to nearest even; the range a picture uses (0 to 1 and a little
// around it) is far from the half's limits, which are clamped to infinity all the same.
inline uint16_t halfFromFloat(float value) {
  uint32_t bits;
  std::memcpy(&bits, &value, sizeof bits);
  const uint32_t sign = (bits >> 16) & 0x8000u;
  const int32_t exponent = static_cast<int32_t>((bits >> 23) & 0xFFu) - 127 + 15;
  uint32_t mantissa = bits & 0x7FFFFFu;
  if (((bits >> 23) & 0xFFu) == 0xFFu)  // infinity or NaN
    return static_cast<uint16_t>(sign | 0x7C00u | (mantissa ? 0x200u : 0u));
  if (exponent >= 31) return static_cast<uint16_t>(sign | 0x7C00u);
  if (exponent <= 0) {
    if (exponent < -10) return static_cast<uint16_t>(sign);
    mantissa |= 0x800000u;
    const uint32_t shift = static_cast<uint32_t>(14 - exponent);
    uint32_t half = mantissa >> shift;
    const uint32_t rest = mantissa & ((1u << shift) - 1u), middle = 1u << (shift - 1);
    if (rest > middle || (rest == middle && (half & 1u))) ++half;
    return static_cast<uint16_t>(sign | half);
  }
  uint32_t half = (static_cast<uint32_t>(exponent) << 10) | (mantissa >> 13);
  const uint32_t rest = mantissa & 0x1FFFu;
  if (rest > 0x1000u || (rest == 0x1000u && (half & 1u))) ++half;  // may carry into the exponent
  return static_cast<uint16_t>(sign | half);
}

inline float floatFromHalf(uint16_t half) {
  const uint32_t sign = static_cast<uint32_t>(half & 0x8000u) << 16;
  uint32_t exponent = (half >> 10) & 0x1Fu;
  uint32_t mantissa = half & 0x3FFu;
  uint32_t bits;
  if (exponent == 0x1Fu) {
    bits = sign | 0x7F800000u | (mantissa << 13);
  } else if (exponent != 0) {
    bits = sign | ((exponent + 112u) << 23) | (mantissa << 13);
  } else if (mantissa == 0) {
    bits = sign;
  } else {  // subnormal: normalise
    exponent = 113;
    while (!(mantissa & 0x400u)) {
      mantissa <<= 1;
      --exponent;
    }
    bits = sign | (exponent << 23) | ((mantissa & 0x3FFu) << 13);
  }
  float value;
  std::memcpy(&value, &bits, sizeof value);
  return value;
}

}  // namespace refhost
