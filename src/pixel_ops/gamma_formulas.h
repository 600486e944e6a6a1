// Gamma: the video transfer function and its inverse, in 64-bit floats.
//   F(x) = 4.5 x below 0.018, else 1.099 x^0.45 - 0.099
//   G(x) = x / 4.5 below 0.0812, else ((x + 0.099) / 1.099)^(1 / 0.45)
// The thresholds are not exact images of each other (4.5 * 0.018 = 0.081).
// 8u reads constant tables, 16u evaluates each sample (or a table of all
// 65536 values for large images), 32f maps vMin..vMax onto 0..1.
#pragma once

#include <cmath>
#include <cstdint>

#include "frame/float_ops.h"

namespace zel::gamma {

extern const uint8_t kForward8[256];
extern const uint8_t kInverse8[256];

constexpr double kInv65535 = 1.5259021896696422e-5;
constexpr double kInvSlope = 0.2222222222222222;      // 1 / 4.5
constexpr double kInvScale = 0.9099181073703366;      // 1 / 1.099
constexpr double kInvPower = 2.2222222222222223;      // 1 / 0.45

// The power branches.
inline double forwardCurve(double x) { return std::pow(x, 0.45) * 1.099 - 0.099; }
inline double inverseCurve(double x) { return std::pow((x + 0.099) * kInvScale, kInvPower); }

// 16u result: 0.5 + y rounded to a 32-bit float, truncated, and an odd
// integer taken one down when the float was exactly it (half to even by
// hand); the low 16 bits are kept.
inline uint16_t roundHalfEven16(double y) {
  const float t = static_cast<float>(0.5 + y);
  int32_t k = TruncateToInt(t);
  if ((k & 1) && t == static_cast<float>(k)) k -= 1;
  return static_cast<uint16_t>(k);
}

inline uint16_t forward16(uint16_t s) {
  const double x = kInv65535 * double(s);
  return roundHalfEven16(x < 0.018 ? double(s) * 4.5 : forwardCurve(x) * 65535.0);
}
inline uint16_t inverse16(uint16_t s) {
  const double x = kInv65535 * double(s);
  return roundHalfEven16(x < 0.0812 ? double(s) * kInvSlope : inverseCurve(x) * 65535.0);
}

// 32f over vMin..vMax. Differences are taken in 32 bits, then widened.
struct Range {
  double low, range, inv;
  float vMin;
  Range(float vMin_, float vMax) : low(double(vMin_)), range(double(vMax - vMin_)), inv(1.0 / range), vMin(vMin_) {}
};

inline float forward32f(float s, const Range& r) {
  const double d = double(s - r.vMin), x = r.inv * d;
  return static_cast<float>(x < 0.018 ? r.low + d * 4.5 : r.low + forwardCurve(x) * r.range);
}
inline float inverse32f(float s, const Range& r) {
  const double d = double(s - r.vMin), x = r.inv * d;
  return static_cast<float>(x < 0.0812 ? r.low + d * kInvSlope : r.low + inverseCurve(x) * r.range);
}

// 16u images of more samples than this (width * 3 * height, 32-bit)
// first build a table of all 65536 values.
constexpr int32_t kDirectSamples16 = 65536;
inline bool tabulates16(int width, int height) {
  const int32_t n = static_cast<int32_t>(uint32_t(width) * 3u * uint32_t(height));
  return n > kDirectSamples16;
}

}  // namespace zel::gamma
