// The cube root of the Lab and LUV families: a table of 128 anchors (c, w)
// followed by a truncated binomial series around the anchor. The tables are
// stored data, read as they are; each member names its series.
#pragma once

#include <cstdint>

#include "frame/float_ops.h"

namespace zel::spaces {

// c is close to the cube root of the upper end of cell i, w to 1 / c^3.
extern const float (&CubeRootTable)[128][2];
// The same rows but for 124..127: the table of the float and 16-bit forward
// forms of LUV.
extern const float (&CubeRootTableLuv)[128][2];

// t in 0..1 to its cell.
inline constexpr float kCubeIndexScale = 127.998047f;  // 0x42FFFF00

// Coefficients of the series s = 1 + e c1 - e^2 c2 + e^3 c3 - ..., summed
// left to right with e^k = e * e^(k-1).
struct CubeSeries {
  int terms;
  float c[8];
};
inline constexpr CubeSeries kSeries4 = {4, {0.33333334f, 0.11111111f, 0.061728396f, 0.041152265f}};
// The 8u forward LUV form ends on 22/729, the fifth coefficient, as its fourth.
inline constexpr CubeSeries kSeries4Luv = {4, {0.33333334f, 0.11111111f, 0.061728396f, 0.030178327f}};
inline constexpr CubeSeries kSeries6 = {
    6, {0.33333334f, 0.11111111f, 0.061728396f, 0.041152265f, 0.030178327f, 0.023472032f}};
// Two stored variants of the last two coefficients of the 8-term series.
inline constexpr CubeSeries kSeries8Lab16 = {8,
                                             {0.33333334f, 0.11111111f, 0.061728396f, 0.041152265f, 0.030178327f,
                                              0.023472032f, 0.0190012008f, 0.0158342998f}};
inline constexpr CubeSeries kSeries8 = {8,
                                        {0.33333334f, 0.11111111f, 0.061728396f, 0.041152265f, 0.030178327f,
                                         0.023472032f, 0.0190011691f, 0.0158343073f}};

inline float seriesSum(const CubeSeries& s, float e) {
  float sum = e * s.c[0] + 1.0f;
  float power = e;
  for (int k = 1; k < s.terms; ++k) {
    power = e * power;
    const float term = power * s.c[k];
    sum = (k & 1) ? sum - term : sum + term;
  }
  return sum;
}

// The table is not guarded in the original arithmetic; here a cell outside
// 0..127 (a sample beyond the valid range) is clamped to the table.
inline int32_t clampCell(int32_t i) { return i < 0 ? 0 : (i > 127 ? 127 : i); }

// The root of u (0..1) from the anchor of `cell`: c * s with
// e = (u - c^3) * w.
inline float seriesRoot(const float (*table)[2], const CubeSeries& s, int32_t cell, float u) {
  const float c = table[cell][0], w = table[cell][1];
  const float e = (u - c * (c * c)) * w;
  return c * seriesSum(s, e);
}

// CubeRoot of t in 0..1, the cell from t itself.
inline float cubeRoot(const float (*table)[2], const CubeSeries& s, float t) {
  return seriesRoot(table, s, clampCell(TruncateToInt(t * kCubeIndexScale)), t);
}

}  // namespace zel::spaces
