// Colour twist: an affine 3 by 4 matrix (4 by 4 without constants for
// four-channel floats) applied to every pixel in 32-bit floats. Integer
// samples are clamped in float before they are rounded, so nothing wraps.
#pragma once

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"

namespace zel::twist {

// Row i holds the weights of the three inputs and, in column 3, a constant
// in sample units; for four-channel floats row i weighs all four inputs.
struct Matrix {
  float t[4][4];
};

inline Matrix matrix3(const float twist[3][4]) {
  Matrix m{};
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 4; ++j) m.t[i][j] = twist[i][j];
  return m;
}
inline Matrix matrix4(const float twist[4][4]) {
  Matrix m{};
  for (int i = 0; i < 4; ++i)
    for (int j = 0; j < 4; ++j) m.t[i][j] = twist[i][j];
  return m;
}

// Output i of a pixel (a, b, c), the order of every float sum as written.
inline float output(const Matrix& m, int i, float a, float b, float c) {
  return (m.t[i][3] + a * m.t[i][0]) + (c * m.t[i][2] + b * m.t[i][1]);
}
// 8s adds its terms left to right instead.
inline float output8s(const Matrix& m, int i, float a, float b, float c) {
  return ((a * m.t[i][0] + b * m.t[i][1]) + c * m.t[i][2]) + m.t[i][3];
}
// Four-channel floats.
inline float output4(const Matrix& m, int i, float x, float y, float z, float w) {
  return m.t[i][3] * w + (m.t[i][2] * z + (m.t[i][0] * x + m.t[i][1] * y));
}

// min(v, hi) then max(v, lo) as the vector minimum and maximum do it: the
// second operand wins a failed comparison, so NaN becomes hi.
inline float clamp(float v, float lo, float hi) {
  v = v < hi ? v : hi;
  return v > lo ? v : lo;
}

// A sample type's limits and the whole per-sample formula.
template <typename T>
struct Sample;

template <>
struct Sample<uint8_t> {
  static constexpr float lo = 0.0f, hi = 255.0f;
  static uint8_t out(const Matrix& m, int i, float a, float b, float c) {
    return static_cast<uint8_t>(RoundEven(clamp(output(m, i, a, b, c), lo, hi)));
  }
};
template <>
struct Sample<uint16_t> {
  static constexpr float lo = 0.0f, hi = 65535.0f;
  static uint16_t out(const Matrix& m, int i, float a, float b, float c) {
    return static_cast<uint16_t>(RoundEven(clamp(output(m, i, a, b, c), lo, hi)));
  }
};
template <>
struct Sample<int16_t> {
  static constexpr float lo = -32768.0f, hi = 32767.0f;
  static int16_t out(const Matrix& m, int i, float a, float b, float c) {
    return static_cast<int16_t>(RoundEven(clamp(output(m, i, a, b, c), lo, hi)));
  }
};
// 8s: only an upper limit in float; the lower one comes from saturating
// to 16 bits and then to 8 bits.
template <>
struct Sample<int8_t> {
  static constexpr float hi = 127.0f;
  static int8_t out(const Matrix& m, int i, float a, float b, float c) {
    float v = output8s(m, i, a, b, c);
    v = v < hi ? v : hi;
    const int16_t s = SaturateS16(RoundEven(v));
    return static_cast<int8_t>(s < -128 ? -128 : (s > 127 ? 127 : s));
  }
};
// Floats: no clamp, no rounding.
template <>
struct Sample<float> {
  static float out(const Matrix& m, int i, float a, float b, float c) { return output(m, i, a, b, c); }
};

// Four-channel float images are merged into one run when both steps equal
// width * 4 bytes, a quarter of a true row (only such callers see it).
inline bool mergesC4(int srcStep, int dstStep, int width) {
  return srcStep == dstStep && int64_t(srcStep) == int64_t(width) * 4;
}
// Three-channel float rows are merged when both steps are width * 12.
inline bool mergesC3(int srcStep, int dstStep, int width) {
  return srcStep == dstStep && int64_t(srcStep) == int64_t(width) * 12;
}
// A merged three-channel float image of this many samples or more keeps
// its destination out of the caches.
constexpr int64_t kStreamingSamples = 34993;
inline bool streamsC3(int width, int height) { return int64_t(width) * 3 * height >= kStreamingSamples; }

}  // namespace zel::twist
