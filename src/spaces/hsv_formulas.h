// RGB and HSV: scalar formulas. Hue runs in sextants (0..6) inside the
// arithmetic. Outputs are H, S, V (forward) or R, G, B (inverse) as levels;
// the callers store their low bits, or saturate where a body does.
#pragma once

#include <cstdint>

#include "frame/float_ops.h"
#include "spaces/xyz_matrix.h"

namespace zel::spaces::hsv {

struct Levels {
  int32_t c[3];
};

inline constexpr float kHueScale8 = 42.5f;  // 255 / 6
inline constexpr float kInv60 = 0.016666668f;
inline constexpr float kDegree8 = 1.4117647f;     // 360 / 255
inline constexpr float kDegree16 = 0.005493248f;  // 360 / 65535
inline constexpr float kInv8 = 0.003921569f;
inline constexpr float kInv16 = 1.5259022e-5f;
inline constexpr float kHueEps = 1.1920929e-7f;

// Which branch of the hue wins when two channels share the largest value.
// The blocks take the green branch where G is the largest and R is not, the
// blue branch where B is the largest and the green one was not taken, and
// the red branch otherwise. The last pixels of a row test R, G, B in order
// and the last test that holds wins.
enum class Ties { Block, Tail };

// 8u forward with unrefined reciprocals; V is the largest sample.
inline Levels rgbToHsv8u(int32_t red, int32_t green, int32_t blue, Ties ties) {
  const float r = float(red), g = float(green), b = float(blue);
  const float mx = maxOf(maxOf(r, g), b), mn = minOf(minOf(r, g), b), delta = mx - mn;
  const int32_t v = RoundEven(mx);
  if (mx == 0.0f || delta == 0.0f) return {{0, 0, v}};
  const int32_t s = RoundEven((ApproxRcp(mx) * delta) * 255.0f);
  const float rd = ApproxRcp(delta);
  const float ar = (mx - r) * rd, ag = (mx - g) * rd, ab = (mx - b) * rd;
  const float fromR = ab - ag, fromG = (ar - ab) + 2.0f, fromB = (ag - ar) + 4.0f;
  float h;
  if (ties == Ties::Block) {
    const bool green = mx == g && mx != r;
    const bool blue = mx == b && !green;
    h = green ? fromG : (blue ? fromB : fromR);
  } else {
    h = fromR;
    if (mx == g) h = fromG;
    if (mx == b) h = fromB;
  }
  float t = h * kHueScale8;
  if (t < 0.0f) t += 255.0f;
  return {{RoundEven(t), s, v}};
}
// The block saturates to 8 bits, the tail keeps the low bits.
inline Levels rgbToHsvBody8u(int32_t r, int32_t g, int32_t b) {
  Levels o = rgbToHsv8u(r, g, b, Ties::Block);
  for (int32_t& c : o.c) c = c < 0 ? 0 : (c > 255 ? 255 : c);
  return o;
}
inline Levels rgbToHsvTail8u(int32_t r, int32_t g, int32_t b) { return rgbToHsv8u(r, g, b, Ties::Tail); }

// 16u forward, one pixel at a time: integer max and min, true divisions,
// the last test that holds wins a tie, and a hue only just below 0 stays
// negative (it truncates to 0).
inline Levels rgbToHsv16u(int32_t r, int32_t g, int32_t b) {
  const int32_t mx = r > g ? (r > b ? r : b) : (g > b ? g : b);
  const int32_t mn = r < g ? (r < b ? r : b) : (g < b ? g : b);
  const int32_t delta = mx - mn;
  if (mx == 0 || delta == 0) return {{0, 0, mx}};
  const float d = float(delta);
  const float s = d / float(mx), inv = 1.0f / d;
  const float ar = float(mx - r) * inv, ag = float(mx - g) * inv, ab = float(mx - b) * inv;
  float h = 0.0f;
  if (mx == r) h = ab - ag;
  if (mx == g) h = (ar + 2.0f) - ab;
  if (mx == b) h = (4.0f - ar) + ag;
  if (h + kHueEps < 0.0f) h += 6.0f;
  return {{TruncateToInt(0.5f + (h * 65535.0f) / 6.0f), TruncateToInt(0.5f + 65535.0f * s), mx}};
}

// Inverse of 8u and 16u: `top` is the largest hue (the same as 0), `degree`
// the hue-to-degrees factor, `inverse` the reciprocal of the range.
inline Levels hsvToRgb(int32_t hue, int32_t sat, int32_t v, int32_t top, float degree, float inverse) {
  if (sat == 0) return {{v, v, v}};
  const float hd = (hue == top ? 0.0f : float(hue) * kInv60) * degree;
  const int32_t i = TruncateToInt(hd);
  const float f = hd - float(i);
  const float vf = float(v);
  const float vs = vf * (float(sat) * inverse);
  const float fr = f * vs;
  const int32_t p = RoundEven(vf - vs), q = RoundEven(vf - fr), t = RoundEven((vf - vs) + fr);
  switch (i) {
    case 0: return {{v, t, p}};
    case 1: return {{q, v, p}};
    case 2: return {{p, v, t}};
    case 3: return {{p, q, v}};
    case 4: return {{t, p, v}};
    case 5: return {{v, p, q}};
    default: return {{0, 0, 0}};
  }
}
inline Levels hsvToRgb8u(int32_t h, int32_t s, int32_t v) { return hsvToRgb(h, s, v, 255, kDegree8, kInv8); }
inline Levels hsvToRgb16u(int32_t h, int32_t s, int32_t v) { return hsvToRgb(h, s, v, 65535, kDegree16, kInv16); }

}  // namespace zel::spaces::hsv
