// RGB and CIE Lab: scalar formulas. The RGB side is linear: samples go
// through the float XYZ matrix, are scaled by the reference white and take
// the Lab non-linearity, with the tabled cube root.
#pragma once

#include <cstdint>
#include <type_traits>

#include "frame/float_ops.h"
#include "spaces/cube_root.h"
#include "spaces/space_frame.h"
#include "spaces/xyz_matrix.h"

namespace zel::spaces::lab {

struct Floats {
  float c[3];
};

inline constexpr float kLinearLimit = 0.008856f;
inline constexpr float kSlope = 7.787f;
inline constexpr float kOffset = 0.137931034f;  // 16 / 116
inline constexpr float kLinearL = 903.3f;
inline constexpr float kInv116 = 0.00862069f;
inline constexpr float kInvA = 0.002f;
inline constexpr float kInvB = 0.005f;
inline constexpr float kL8ToUnit = 0.39215687f;
inline constexpr float kL16ToUnit = 0.0015259022f;
inline constexpr float kInv255 = 0.003921569f;

// White scaling of X, Y, Z: 8-bit samples carry 1/255 in it; floats have
// no Y scale at all (no multiplication), flagged by a zero.
struct White {
  float x, y, z;
};
inline constexpr White kWhite8 = {0.0041259914f, 0.003921569f, 0.0036018905f};
inline constexpr White kWhite32f = {1.0521265f, 0.0f, 0.9184812f};
// And back: the white in sample units for integer outputs, in 0..1 for floats.
inline constexpr White kWhiteBack8 = {242.366f, 255.0f, 277.632f};
inline constexpr White kWhiteBack32f = {0.950456f, 0.0f, 1.0887539f};

// f(t): the linear segment at or below the limit, else the cube root.
inline float labF(float t, const CubeSeries& s) {
  const float root = cubeRoot(CubeRootTable, s, t);  // the table is read either way
  return t <= kLinearLimit ? kOffset + kSlope * t : root;
}

// Forward to L, a, b in float. r, g, b by meaning (not memory order).
inline Floats rgbToLab(float r, float g, float b, const White& white, const CubeSeries& s) {
  const float x = matrixRow(kRgbToXyz[0], r, g, b) * white.x;
  float y = matrixRow(kRgbToXyz[1], r, g, b);
  if (white.y != 0.0f) y = y * white.y;
  const float z = matrixRow(kRgbToXyz[2], r, g, b) * white.z;
  const float fx = labF(x, s), fy = labF(y, s), fz = labF(z, s);
  const float l = y <= kLinearLimit ? y * kLinearL : fy * 116.0f - 16.0f;
  return {{l, (fx - fy) * 500.0f, (fy - fz) * 200.0f}};
}

// The integer codings of Lab: 8u (L * 2.55, a + 128, b + 128) and 16u
// (L * 655.35, (a + 128) * 255, (b + 128) * 255), rounded to nearest even.
inline void encode8u(const Floats& lab, int32_t out[3]) {
  out[0] = RoundEven(lab.c[0] * 2.55f);
  out[1] = RoundEven(lab.c[1] + 128.0f);
  out[2] = RoundEven(lab.c[2] + 128.0f);
}
inline void encode16u(const Floats& lab, int32_t out[3]) {
  out[0] = RoundEven(lab.c[0] * 655.35f);
  out[1] = RoundEven((lab.c[1] + 128.0f) * 255.0f);
  out[2] = RoundEven((lab.c[2] + 128.0f) * 255.0f);
}

// Decoding to Lv, av, bv.
inline Floats decode8u(int32_t l, int32_t a, int32_t b) {
  return {{float(l) * kL8ToUnit, float(a) - 128.0f, float(b) - 128.0f}};
}
inline Floats decode16u(int32_t l, int32_t a, int32_t b) {
  return {{float(l) * kL16ToUnit, float(a) * kInv255 - 128.0f, float(b) * kInv255 - 128.0f}};
}

// Inverse: no linear segment, the three f values are simply cubed; R, G, B
// by meaning, without clamping.
inline Floats labToRgb(const Floats& lab, const White& white) {
  const float fy = (lab.c[0] + 16.0f) * kInv116;
  const float fx = fy + lab.c[1] * kInvA;
  const float fz = fy - lab.c[2] * kInvB;
  const float x = fx * (fx * fx) * white.x;
  float y = fy * (fy * fy);
  if (white.y != 0.0f) y = y * white.y;
  const float z = fz * (fz * fz) * white.z;
  return {{matrixRow(kXyzToRgb[0], x, y, z), matrixRow(kXyzToRgb[1], x, y, z), matrixRow(kXyzToRgb[2], x, y, z)}};
}

// Integer RGB: nearest even, SaturateS16 then SaturateU8, in both zones.
inline int32_t rgbLevel8u(float v) {
  const int32_t i = RoundEven(v);
  return i < 0 ? 0 : (i > 255 ? 255 : i);
}

// ---- the members, pixel by pixel ----

// Which zone of a row a pixel is in: the body saturates integer outputs, the
// tail stores their low bits. Float outputs are the same in both.
enum class Zone { Body, Tail };

// Forward of one pixel, samples in memory order (B, G, R for Bgr). S is
// uint8_t or float, D uint8_t, uint16_t (from 8u) or float.
template <typename S, typename D, bool Bgr, Zone zone>
inline void forwardPixel(const S* in, D* out) {
  const float m0 = float(loadSample(in)), g = float(loadSample(in + 1)), m2 = float(loadSample(in + 2));
  const float r = Bgr ? m2 : m0, b = Bgr ? m0 : m2;
  if constexpr (std::is_same_v<D, float>) {
    const Floats lab = rgbToLab(r, g, b, kWhite32f, kSeries8);
    for (int k = 0; k < 3; ++k) storeSample(out + k, lab.c[k]);
  } else {
    constexpr bool wide = sizeof(D) == 2;
    const Floats lab = rgbToLab(r, g, b, kWhite8, wide ? kSeries8Lab16 : kSeries4);
    int32_t v[3];
    if (wide)
      encode16u(lab, v);
    else
      encode8u(lab, v);
    const int32_t top = wide ? 65535 : 255;
    for (int k = 0; k < 3; ++k) {
      if (zone == Zone::Body) v[k] = v[k] < 0 ? 0 : (v[k] > top ? top : v[k]);
      storeLevel(out + k, v[k]);
    }
  }
}

// Inverse of one pixel: S is uint8_t, uint16_t (to 8u) or float.
template <typename S, typename D, bool Bgr>
inline void inversePixel(const S* in, D* out) {
  Floats rgb;
  if constexpr (std::is_same_v<S, float>) {
    rgb = labToRgb({{loadSample(in), loadSample(in + 1), loadSample(in + 2)}}, kWhiteBack32f);
  } else {
    const int32_t l = level(in), a = level(in + 1), b = level(in + 2);
    rgb = labToRgb(sizeof(S) == 2 ? decode16u(l, a, b) : decode8u(l, a, b), kWhiteBack8);
  }
  const float ordered[3] = {Bgr ? rgb.c[2] : rgb.c[0], rgb.c[1], Bgr ? rgb.c[0] : rgb.c[2]};
  for (int k = 0; k < 3; ++k) {
    if constexpr (std::is_same_v<D, float>)
      storeSample(out + k, ordered[k]);
    else
      storeLevel(out + k, rgbLevel8u(ordered[k]));
  }
}

}  // namespace zel::spaces::lab
