// RGB and XYZ: the scalar formulas of every member, one per zone where the
// zones differ. Levels are integer samples (16s biased into 0..65535).
#pragma once

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"
#include "spaces/xyz_matrix.h"

namespace zel::spaces::xyz {

struct Levels {
  int32_t c[3];
};
struct Floats {
  float c[3];
};

// 8u fixed point. The vector body works in 16-bit lanes (a pair
// multiply-add), the last pixels of a row in 32-bit products of other
// precision: the two tables do not agree in the last bit.
inline constexpr int32_t kForwardBody[3][3] = {{13515, 11717, 5912}, {6969, 23434, 2365}, {634, 3906, 31137}};
inline constexpr int32_t kForwardTail[3][3] = {{27030, 23434, 11824}, {13937, 46868, 4729}, {1267, 7811, 62274}};
inline constexpr int32_t kInverseBody[3][3] = {{26546, -12591, -4083}, {-7939, 15368, 340}, {456, -1671, 8661}};
inline constexpr int32_t kInverseTail[3][3] = {
    {212368, -100738, -32671}, {-63521, 122944, 2723}, {3646, -13372, 69291}};

inline int32_t fixedRow(const int32_t (&m)[3], int32_t a, int32_t b, int32_t c) { return m[0] * a + m[1] * b + m[2] * c; }

// Body: shift by 15 without a rounding term, then SaturateS16, SaturateU8.
inline Levels rgbToXyzBody8u(int32_t r, int32_t g, int32_t b) {
  Levels o;
  for (int k = 0; k < 3; ++k) o.c[k] = SaturateU8(SaturateS16(fixedRow(kForwardBody[k], r, g, b) >> 15));
  return o;
}

// Tail: shift by 16; X and Y cannot pass 255, Z is limited to 255.
inline Levels rgbToXyzTail8u(int32_t r, int32_t g, int32_t b) {
  const int32_t z = fixedRow(kForwardTail[2], r, g, b) >> 16;
  return {{fixedRow(kForwardTail[0], r, g, b) >> 16, fixedRow(kForwardTail[1], r, g, b) >> 16, z > 255 ? 255 : z}};
}

inline Levels xyzToRgbBody8u(int32_t x, int32_t y, int32_t z) {
  Levels o;
  for (int k = 0; k < 3; ++k) o.c[k] = SaturateU8(SaturateS16(fixedRow(kInverseBody[k], x, y, z) >> 13));
  return o;
}

inline Levels xyzToRgbTail8u(int32_t x, int32_t y, int32_t z) {
  Levels o;
  for (int k = 0; k < 3; ++k) o.c[k] = SaturateU8(fixedRow(kInverseTail[k], x, y, z) >> 16);
  return o;
}

// 16-bit levels, both directions, body and tail alike: the float sum,
// truncated, saturated to 0..65535.
inline Levels matrix16(const float (&m)[3][3], int32_t a, int32_t b, int32_t c) {
  Levels o;
  for (int k = 0; k < 3; ++k) o.c[k] = SaturateU16(TruncateToInt(matrixRow(m[k], float(a), float(b), float(c))));
  return o;
}
inline Levels rgbToXyz16(int32_t r, int32_t g, int32_t b) { return matrix16(kRgbToXyz, r, g, b); }
inline Levels xyzToRgb16(int32_t x, int32_t y, int32_t z) { return matrix16(kXyzToRgb, x, y, z); }

// 32f forward: only Z is clamped, first below, then above.
inline Floats rgbToXyz32f(float r, float g, float b) {
  return {{matrixRow(kRgbToXyz[0], r, g, b), matrixRow(kRgbToXyz[1], r, g, b),
           minOf(maxOf(matrixRow(kRgbToXyz[2], r, g, b), 0.0f), 1.0f)}};
}

// 32f inverse, one pixel at a time: every output clamped to 0..1.
inline float clampUnit(float v) { return v < 0.0f ? 0.0f : (1.0f < v ? 1.0f : v); }
inline Floats xyzToRgb32f(float x, float y, float z) {
  return {{clampUnit(matrixRow(kXyzToRgb[0], x, y, z)), clampUnit(matrixRow(kXyzToRgb[1], x, y, z)),
           clampUnit(matrixRow(kXyzToRgb[2], x, y, z))}};
}

}  // namespace zel::spaces::xyz
