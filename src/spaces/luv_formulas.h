// RGB (or BGR) and CIE L*u*v*: scalar formulas. The same conversion exists
// in several forms that differ in the last bits on purpose: reciprocal or
// true division, cube-root table and series, white point, guards, rounding,
// and the order of sums. Each form below is one member's (or one zone's).
#pragma once

#include <immintrin.h>

#include <cmath>
#include <cstdint>
#include <type_traits>

#include "frame/float_ops.h"
#include "spaces/cube_root.h"
#include "spaces/space_frame.h"
#include "spaces/xyz_matrix.h"

namespace zel::spaces::luv {

struct Floats {
  float c[3];
};
struct Levels {
  int32_t c[3];
};

inline constexpr float kUn = 0.197839f;
inline constexpr float kVn = 0.468342f;
inline constexpr float kTailUn = 0.19783941f;  // the white point of the integer inverse tails
inline constexpr float kTailVn = 0.4683422f;
inline constexpr float kLimitY = 0.008856f;
inline constexpr float kLimitY16 = 580.378f;
inline constexpr float kLimitL = 7.9996247f;
inline constexpr float kSlope = 903.3f;
inline constexpr float kInvSlope = 0.001107052f;
inline constexpr float kScaleU8 = 0.720339f;
inline constexpr float kScaleV8 = 0.97328246f;
inline constexpr float kScaleU16 = 185.12712f;
inline constexpr float kScaleV16 = 250.13359f;
inline constexpr float kUnscaleU8 = 1.3882353f;
inline constexpr float kUnscaleV8 = 1.027451f;
inline constexpr float kUnscaleU16 = 0.0054016937f;
inline constexpr float kUnscaleV16 = 0.0039978637f;
inline constexpr float kUnscaleL8 = 0.39215687f;
inline constexpr float kUnscaleL16 = 0.0015259022f;
inline constexpr float kLowL = 9e-5f;
inline constexpr float kTinyV8 = 1.1920929e-5f;
inline constexpr float kTinyV32 = 1.1920929e-7f;
inline constexpr float kGuard = 9e-5f;
inline constexpr float kInv255 = 0.003921569f;
inline constexpr float kInv65535 = 1.5259022e-5f;
inline constexpr float kInv116 = 0.00862069f;
inline constexpr float kThird = 0.33333334f;

enum class Zone { Body, Tail };

// ---------------------------------------------------------------- forward

// u', v' by the refined reciprocal of D.
inline void chromaticity(float x, float y, float d, float& up, float& vp) {
  const float rd = RefinedRcp(d);
  up = (4.0f * x) * rd;
  vp = (9.0f * y) * rd;
}

// Float and 8u table forms: x, y, z from 0..1 samples. The body adds 3 to a
// zero D; the tail sets u' = v' = 0 when Z is zero and forms no D.
inline Floats forwardLuv(float r, float g, float b, const float (*table)[2], const CubeSeries& series, Zone zone) {
  const float x = matrixRow(kRgbToXyz[0], r, g, b), y = matrixRow(kRgbToXyz[1], r, g, b),
              z = matrixRow(kRgbToXyz[2], r, g, b);
  float l, up = 0.0f, vp = 0.0f;
  if (zone == Zone::Body) {
    const float root = cubeRoot(table, series, y);
    l = y <= kLimitY ? y * kSlope : root * 116.0f - 16.0f;
    float d = x + (3.0f * z + 15.0f * y);
    if (d == 0.0f) d = d + 3.0f;
    chromaticity(x, y, d, up, vp);
  } else {
    l = y > kLimitY ? cubeRoot(table, series, y) * 116.0f - 16.0f : y * kSlope;
    if (z != 0.0f) chromaticity(x, y, x + (3.0f * z + 15.0f * y), up, vp);
  }
  const float l13 = l * 13.0f;
  return {{l, (up - kUn) * l13, (vp - kVn) * l13}};
}

// 8u table form (C3): samples times 1/255, the 4-term series with 22/729 as
// its last coefficient; the body saturates, the tail keeps the low bits.
inline Levels forwardTable8u(int32_t r, int32_t g, int32_t b, Zone zone) {
  const Floats luv = forwardLuv(float(r) * kInv255, float(g) * kInv255, float(b) * kInv255, CubeRootTable,
                                kSeries4Luv, zone);
  Levels o = {{RoundEven(luv.c[0] * 2.55f), RoundEven((luv.c[1] + 134.0f) * kScaleU8),
               RoundEven((luv.c[2] + 140.0f) * kScaleV8)}};
  if (zone == Zone::Body)
    for (int32_t& c : o.c) c = c < 0 ? 0 : (c > 255 ? 255 : c);
  return o;
}

// Float form: the LUV table and the 8-term series; L, U, V as they come.
inline Floats forward32f(float r, float g, float b, Zone zone) {
  return forwardLuv(r, g, b, CubeRootTableLuv, kSeries8, zone);
}

// 8u power form (RGB AC4), one pixel at a time: true divisions, the
// run-time library's double power, truncating conversions.
inline Levels forwardPower8u(int32_t red, int32_t green, int32_t blue) {
  const float r = float(red), g = float(green), b = float(blue);
  const float x = matrixRow(kRgbToXyz[0], r, g, b) / 255.0f;
  const float y = matrixRow(kRgbToXyz[1], r, g, b) / 255.0f;
  const float l = y > kLimitY ? float(std::pow(double(y), 0.3333333432674408)) * 116.0f - 16.0f : y * 903.3f;
  float up = 0.0f, vp = 0.0f;
  if (y != 0.0f) {
    const float z = matrixRow(kRgbToXyz[2], r, g, b) / 255.0f;
    const float d = (z * 3.0f + x) + y * 15.0f;
    up = (x * 4.0f) / d;
    vp = (y * 9.0f) / d;
  }
  const float t = l * 13.0f;
  return {{TruncateToInt((255.0f * l) / 100.0f), TruncateToInt(0.5f + (255.0f * (t * (up - kUn) + 134.0f)) / 354.0f),
           TruncateToInt(0.5f + (255.0f * (t * (vp - kVn) + 140.0f)) / 262.0f)}};
}

// Conversions of the 16-bit forward forms: of the table index, of L, and of
// U and V, each rounding (nearest even) or truncating.
struct Conversions16 {
  bool roundIndex, roundL, roundChroma;
};
inline constexpr Conversions16 kForwardBody16 = {false, false, true};
inline constexpr Conversions16 kTailRounding16 = {true, true, true};     // 16u C3, 16s
inline constexpr Conversions16 kTailTruncating16 = {false, false, false};  // 16u AC4
inline int32_t convert(float v, bool round) { return round ? RoundEven(v) : TruncateToInt(v); }

// 16-bit forward: X, Y, Z stay in sample units; the cell is Y >> 9 and the
// series has 6 terms; V carries an extra 0.5. A zero D gets 3 added in the
// body and gives U = V = 0 in the tail. Results saturate to 0..65535.
inline Levels forward16(int32_t red, int32_t green, int32_t blue, const Conversions16& conv, Zone zone) {
  const float r = float(red), g = float(green), b = float(blue);
  const float x = matrixRow(kRgbToXyz[0], r, g, b), y = matrixRow(kRgbToXyz[1], r, g, b),
              z = matrixRow(kRgbToXyz[2], r, g, b);
  float l;
  if (y <= kLimitY16) {
    l = (y * kInv65535) * kSlope;
  } else {
    const int32_t cell = clampCell(convert(y, conv.roundIndex) >> 9);
    l = seriesRoot(CubeRootTableLuv, kSeries6, cell, y * kInv65535) * 116.0f - 16.0f;
  }
  float d = (z * 3.0f + y * 15.0f) + x;
  const bool blackTail = zone == Zone::Tail && d == 0.0f;
  if (d == 0.0f) d = d + 3.0f;
  float up, vp;
  chromaticity(x, y, d, up, vp);
  const float l13 = l * 13.0f;
  const float u = (up - kUn) * l13, v = (vp - kVn) * l13;
  Levels o = {{convert(l * 655.35f, conv.roundL), convert((u + 134.0f) * kScaleU16, conv.roundChroma),
               convert((v + 140.0f) * kScaleV16 + 0.5f, conv.roundChroma)}};
  if (blackTail) o.c[1] = o.c[2] = 0;
  for (int32_t& c : o.c) c = c < 0 ? 0 : (c > 65535 ? 65535 : c);
  return o;
}

// ---------------------------------------------------------------- inverse

// A double truncated toward zero (CVTTSD2SI).
inline int32_t truncateDouble(double v) { return _mm_cvttsd_si32(_mm_set_sd(v)); }
inline int32_t clampLevel(int32_t v, int32_t top) { return v < 0 ? 0 : (v > top ? top : v); }

// Integer inverse bodies (8u C3, 8u AC4, 16-bit): reciprocals instead of
// divisions, a guarded L and v'. `ac4` is the 8u AC4 form: the linear
// segment by L, Y scaled before t, truncation.
struct InverseBody {
  float unscaleL, unscaleU, unscaleV, range;
  bool refined;       // RefinedRcp, else ApproxRcp
  bool linearByL;     // the linear segment where Lv <= kLimitL, else only for a guarded L
  bool scaleYFirst;   // Y times range before t; the sum is then truncated as it is
};
inline constexpr InverseBody kBody8uC3 = {kUnscaleL8, kUnscaleU8, kUnscaleV8, 255.0f, false, false, false};
inline constexpr InverseBody kBody8uAC4 = {kUnscaleL8, kUnscaleU8, kUnscaleV8, 255.0f, false, true, true};
inline constexpr InverseBody kBody16 = {kUnscaleL16, kUnscaleU16, kUnscaleV16, 65535.0f, true, true, true};

inline Floats inverseBodyRgb(float lSample, float uSample, float vSample, const InverseBody& f) {
  auto rcp = [&](float v) { return f.refined ? RefinedRcp(v) : ApproxRcp(v); };
  float s = lSample;
  const bool guarded = s <= kLowL;
  if (guarded) s = s + kGuard;
  const float lv = s * f.unscaleL;
  const float r = rcp(lv * 13.0f);
  const float fy = (lv + 16.0f) * kInv116;
  const bool linear = f.linearByL ? lv <= kLimitL : guarded;
  float yv = linear ? lv * kInvSlope : fy * (fy * fy);
  if (f.scaleYFirst) yv = yv * f.range;
  float vp = r * (vSample * f.unscaleV - 140.0f) + kVn;
  if (std::fabs(vp) <= kTinyV8) vp = vp + kGuard;
  const float t = rcp(vp) * yv;
  const float x = (t * 2.25f) * (r * (uSample * f.unscaleU - 134.0f) + kUn);
  const float z = (t * 3.0f - yv * 5.0f) - x * kThird;
  return {{matrixRow(kXyzToRgb[0], x, yv, z), matrixRow(kXyzToRgb[1], x, yv, z), matrixRow(kXyzToRgb[2], x, yv, z)}};
}

// 8u C3 body: 255 * sum to nearest even; 8u AC4 and 16-bit: the sum
// truncated. Then SaturateS16, SaturateU8 (or SaturateU16).
inline Levels inverseBody8u(int32_t l, int32_t u, int32_t v, bool ac4) {
  const Floats rgb = inverseBodyRgb(float(l), float(u), float(v), ac4 ? kBody8uAC4 : kBody8uC3);
  Levels o;
  for (int k = 0; k < 3; ++k)
    o.c[k] = clampLevel(ac4 ? TruncateToInt(rgb.c[k]) : RoundEven(255.0f * rgb.c[k]), 255);
  return o;
}
inline Levels inverseBody16(int32_t l, int32_t u, int32_t v) {
  const Floats rgb = inverseBodyRgb(float(l), float(u), float(v), kBody16);
  Levels o;
  for (int k = 0; k < 3; ++k) o.c[k] = clampLevel(TruncateToInt(rgb.c[k]), 65535);
  return o;
}

// Integer inverse tails: true divisions, the tail white point, and the blue
// sum in 64-bit floats. `range` is 255 or 65535; the 16-bit tail guards v'
// and orders its sums differently.
inline Levels inverseTail(int32_t lLevel, int32_t uLevel, int32_t vLevel, bool wide) {
  const float range = wide ? 65535.0f : 255.0f;
  const float lv = (100.0f * float(lLevel)) / range;
  if (lv < kLowL) return {{0, 0, 0}};
  const float u = (float(uLevel) * 354.0f) / range, v = (float(vLevel) * 262.0f) / range;
  const float q = (lv + 16.0f) / 116.0f;
  const float yv = range * (lv >= kLimitL ? q * q * q : lv / 903.3f);
  const float l13 = lv * 13.0f;
  float vp = (v - 140.0f) / l13 + kTailVn;
  if (wide && std::fabs(vp) < kTinyV8) vp = vp + kGuard;
  const float t = yv / vp;
  const float x = (((u - 134.0f) / l13 + kTailUn) * 2.25f) * t;
  int32_t r, g;
  float z;
  if (wide) {
    z = (3.0f * t - yv * 5.0f) - x / 3.0f;
    r = TruncateToInt(((0.5f + yv * -1.53715f) + x * 3.240479f) - z * 0.498535f);
    g = TruncateToInt(((0.5f + yv * 1.875991f) + x * -0.969256f) + z * 0.041556f);
  } else {
    z = (3.0f * t - x / 3.0f) - yv * 5.0f;
    r = TruncateToInt(((0.5f + x * 3.240479f) - yv * 1.53715f) - z * 0.498535f);
    g = TruncateToInt(((0.5f + x * -0.969256f) + yv * 1.875991f) + z * 0.041556f);
  }
  const int32_t b = truncateDouble((double(x * 0.055648f - yv * 0.204043f) + 0.5) + double(z) * 1.057311);
  const int32_t top = wide ? 65535 : 255;
  return {{clampLevel(r, top), clampLevel(g, top), clampLevel(b, top)}};
}

// Float inverse, C3 body: refined reciprocals, guards, no clamp.
inline Floats inverseBody32f(float l, float u, float v) {
  if (l <= kLowL) l = l + kGuard;
  const float r = RefinedRcp(l * 13.0f);
  const float fy = (l + 16.0f) * kInv116;
  const float yv = l <= kLimitL ? l * kInvSlope : fy * (fy * fy);
  float vp = r * v + kVn;
  if (std::fabs(vp) <= kTinyV8) vp = vp + kGuard;
  const float t = RefinedRcp(vp) * yv;
  const float x = (t * 2.25f) * (r * u + kUn);
  const float z = (t * 3.0f - yv * 5.0f) - x * kThird;
  return {{matrixRow(kXyzToRgb[0], x, yv, z), matrixRow(kXyzToRgb[1], x, yv, z), matrixRow(kXyzToRgb[2], x, yv, z)}};
}

// Float inverse, C3 tail and all of AC4: true divisions, black below lowL,
// every output clamped to 0..1.
inline float clampUnit(float v) { return v < 0.0f ? 0.0f : (1.0f < v ? 1.0f : v); }
inline Floats inverseTail32f(float l, float u, float v) {
  if (l < kLowL) return {{0.0f, 0.0f, 0.0f}};
  const float yv = l < kLimitL ? l / 903.3f : [&] {
    const float q = (l + 16.0f) / 116.0f;
    return q * q * q;
  }();
  const float l13 = 13.0f * l;
  const float up = u / l13 + kUn;
  float vp = v / l13 + kVn;
  if (std::fabs(vp) < kTinyV32) vp = vp + kGuard;
  const float t = yv / vp;
  const float x = (2.25f * t) * up;
  const float z = (3.0f * t - 5.0f * yv) - x / 3.0f;
  return {{clampUnit(matrixRow(kXyzToRgb[0], x, yv, z)), clampUnit(matrixRow(kXyzToRgb[1], x, yv, z)),
           clampUnit(matrixRow(kXyzToRgb[2], x, yv, z))}};
}

// ---------------------------------------------------------------- members

// The members pixel by pixel, samples in memory order (B, G, R for Bgr).
// The destination's fourth sample is never written.

template <bool Bgr, Zone zone>
inline void forwardTablePixel(const uint8_t* in, uint8_t* out) {
  const Levels o = forwardTable8u(in[Bgr ? 2 : 0], in[1], in[Bgr ? 0 : 2], zone);
  for (int k = 0; k < 3; ++k) out[k] = uint8_t(o.c[k]);
}

inline void forwardPowerPixel(const uint8_t* in, uint8_t* out) {
  const Levels o = forwardPower8u(in[0], in[1], in[2]);
  for (int k = 0; k < 3; ++k) out[k] = uint8_t(o.c[k]);
}

template <bool Bgr, Zone zone>
inline void forward32fPixel(const float* in, float* out) {
  const float m0 = loadSample(in), g = loadSample(in + 1), m2 = loadSample(in + 2);
  const Floats o = forward32f(Bgr ? m2 : m0, g, Bgr ? m0 : m2, zone);
  for (int k = 0; k < 3; ++k) storeSample(out + k, o.c[k]);
}

// T is uint16_t or int16_t; `conv` the member's conversions in this zone.
template <typename T, Zone zone, bool TruncatingTail = false>
inline void forward16Pixel(const T* in, T* out) {
  const Conversions16& conv = zone == Zone::Body ? kForwardBody16 : (TruncatingTail ? kTailTruncating16 : kTailRounding16);
  const Levels o = forward16(level(in), level(in + 1), level(in + 2), conv, zone);
  for (int k = 0; k < 3; ++k) storeLevel(out + k, o.c[k]);
}

template <bool Bgr, bool Ac4, Zone zone>
inline void inverse8uPixel(const uint8_t* in, uint8_t* out) {
  const Levels o = zone == Zone::Body ? inverseBody8u(in[0], in[1], in[2], Ac4) : inverseTail(in[0], in[1], in[2], false);
  out[0] = uint8_t(o.c[Bgr ? 2 : 0]);
  out[1] = uint8_t(o.c[1]);
  out[2] = uint8_t(o.c[Bgr ? 0 : 2]);
}

template <typename T, Zone zone>
inline void inverse16Pixel(const T* in, T* out) {
  const int32_t l = level(in), u = level(in + 1), v = level(in + 2);
  const Levels o = zone == Zone::Body ? inverseBody16(l, u, v) : inverseTail(l, u, v, true);
  for (int k = 0; k < 3; ++k) storeLevel(out + k, o.c[k]);
}

template <bool Bgr, Zone zone>
inline void inverse32fPixel(const float* in, float* out) {
  const float l = loadSample(in), u = loadSample(in + 1), v = loadSample(in + 2);
  const Floats o = zone == Zone::Body ? inverseBody32f(l, u, v) : inverseTail32f(l, u, v);
  storeSample(out, o.c[Bgr ? 2 : 0]);
  storeSample(out + 1, o.c[1]);
  storeSample(out + 2, o.c[Bgr ? 0 : 2]);
}

}  // namespace zel::spaces::luv
