// HLS pixel formulas in 32-bit float, every step rounded as written.
// Integer members have two recipes: the body (pixels that fill whole
// blocks; each function here is the exact meaning of one vector lane) and
// the tail (the last pixels of a row). The two differ in reciprocal,
// rounding and saturation on purpose. Integer levels run 0..255 or
// 0..65535; signed 16-bit samples are biased into that range around the
// arithmetic.
#pragma once

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"

namespace zel::hls {

// Stored constants (the bits matter, not the fractions they stand for).
constexpr float kHue8 = 0x1.6aaaaap-1f;     // 255/360, degrees to 8-bit hue
constexpr float kHue16 = 0x1.6c1556p+7f;    // 65535/360
constexpr float kInv8 = 0x1.010102p-8f;     // 1/255
constexpr float kDeg8 = 0x1.69696ap+0f;     // 360/255
constexpr float kInv16 = 0x1.0001p-16f;     // 1/65535
constexpr float kDeg16 = 0x1.680168p-8f;    // 360/65535
constexpr float kInv60 = 0x1.111112p-6f;    // 1/60
constexpr float kFlatLimit = 0x1.0p-23f;    // a float pixel this flat is grey

// Larger and smaller of two, as the vector max and min take them.
inline float maxOf(float a, float b) { return a > b ? a : b; }
inline float minOf(float a, float b) { return a < b ? a : b; }

struct Hls {
  int32_t h, l, s;
};

// ---- forward, integer samples ----

// Hue written as (rcp(spread) * 60) * difference + base, or as
// (difference * 60) * rcp(spread) + base.
enum class HueForm { RateFirst, DifferenceFirst };

template <int Max, bool Refined, HueForm Form, bool RoundBody, bool RoundTail, int Block>
struct ForwardRecipe {
  static constexpr int kMax = Max;
  static constexpr float kRange = float(Max);
  static constexpr float kHalf = Max == 255 ? 127.5f : 32767.5f;
  static constexpr float kFull = Max == 255 ? 510.0f : 131070.0f;
  static constexpr float kHue = Max == 255 ? kHue8 : kHue16;
  static constexpr bool kRefined = Refined;
  static constexpr HueForm kForm = Form;
  static constexpr bool kRoundBody = RoundBody;
  static constexpr bool kRoundTail = RoundTail;
  static constexpr int kBlock = Block;
};

// RGB members, by sample type and layout; the BGR family.
using RgbToHls8C3 = ForwardRecipe<255, false, HueForm::RateFirst, true, false, 8>;
using RgbToHls8AC4 = ForwardRecipe<255, false, HueForm::RateFirst, true, true, 4>;
using RgbToHls16 = ForwardRecipe<65535, true, HueForm::RateFirst, true, false, 4>;
using BgrToHls8 = ForwardRecipe<255, false, HueForm::DifferenceFirst, false, false, 4>;

template <bool Refined>
inline float reciprocal(float x) {
  return Refined ? RefinedRcp(x) : ApproxRcp(x);
}
inline int32_t convert(bool round, float x) { return round ? RoundEven(x) : TruncateToInt(x); }
inline int32_t saturate(int32_t v, int32_t max) { return v < 0 ? 0 : (v > max ? max : v); }

// One lane of a block: saturated H, L, S.
template <class R>
inline Hls forwardBody(float r, float g, float b) {
  const float mx = maxOf(maxOf(r, g), b), mn = minOf(minOf(r, g), b);
  const float sum = mx + mn, spread = mx - mn;
  const float light = sum * 0.5f;
  const bool flat = spread == 0.0f;
  // The guard keeps grey pixels away from a zero divisor; their H and S
  // are zero whatever it gives.
  const float d = flat ? 1.0f : (light <= R::kHalf ? sum : R::kFull - sum);
  const float rateBase = flat ? 1.0f : spread;
  float sat = (spread * reciprocal<R::kRefined>(d)) * R::kRange;
  float diff, base;
  if (mx == r) {
    diff = g - b;
    base = 0.0f;
  } else if (mx == g) {
    diff = b - r;
    base = 120.0f;
  } else {
    diff = r - g;
    base = 240.0f;
  }
  const float rate = reciprocal<R::kRefined>(rateBase);
  float hue = R::kForm == HueForm::RateFirst ? (rate * 60.0f) * diff + base : (diff * 60.0f) * rate + base;
  if (hue < 0.0f) hue += 360.0f;
  float h = hue * R::kHue;
  if (flat) h = sat = 0.0f;
  return {saturate(convert(R::kRoundBody, h), R::kMax), saturate(convert(R::kRoundBody, light), R::kMax),
          saturate(convert(R::kRoundBody, sat), R::kMax)};
}

// The last pixels of a row, one at a time: refined reciprocals, no
// saturation (the caller stores the low bits).
template <class R>
inline Hls forwardTail(float r, float g, float b) {
  const float mx = maxOf(maxOf(r, g), b), mn = minOf(minOf(r, g), b);
  const float sum = mx + mn, spread = mx - mn;
  const float light = sum * 0.5f;
  Hls out{0, convert(R::kRoundTail, light), 0};
  if (spread == 0.0f) return out;
  const float d = light > R::kHalf ? R::kFull - sum : sum;
  out.s = convert(R::kRoundTail, (spread * RefinedRcp(d)) * R::kRange);
  const float rate = RefinedRcp(spread);
  float hue;
  if (mx == r) hue = ((g - b) * 60.0f) * rate;
  else if (mx == g) hue = ((b - r) * 60.0f) * rate + 120.0f;
  else hue = ((r - g) * 60.0f) * rate + 240.0f;
  if (hue < 0.0f) hue += 360.0f;
  out.h = convert(R::kRoundTail, hue * R::kHue);
  return out;
}

// ---- forward, float samples: one form, true divisions ----

struct HlsF {
  float h, l, s;
};

inline HlsF forwardFloat(float r, float g, float b) {
  const float mx = maxOf(maxOf(r, g), b), mn = minOf(minOf(r, g), b);
  const float spread = mx - mn, sum = mx + mn;
  HlsF out{0.0f, sum * 0.5f, 0.0f};
  if (spread <= kFlatLimit) return out;
  out.s = sum * 0.5f <= 0.5f ? spread / sum : spread / (2.0f - sum);
  float hue;
  if (r == mx) hue = ((g - b) * 60.0f) / spread;
  else if (g == mx) hue = ((b - r) * 60.0f) / spread + 120.0f;
  else hue = ((r - g) * 60.0f) / spread + 240.0f;
  if (hue < 0.0f) hue += 360.0f;
  out.h = hue / 360.0f;
  return out;
}

// ---- inverse ----

// hslHigh: l + (l <= 0.5 ? l*s : s - l*s), l + l*s or (l + s) - l*s,
// l * (s + 1) or (l + s) - l*s.
enum class High { Split, Plain, Product };
// Rising and falling bands: low + (dm * h) * inv60; low + (h * inv60) * dm;
// low + (dm * h) / 60 (and the same with 240 - h).
enum class Band { ProductFirst, RateFirst, Divide };
// Hue, lightness and saturation to degrees and 0..1.
enum class Scale { Multiply8, Divide8, Multiply16, Float };
// Level to sample: round and saturate, truncate to the low bits, ...
enum class Output { RoundSaturate, TruncateLow, RoundLow, TruncateSaturate, Level };
// What s == 0 does: nothing special, level = l, or the L sample copied.
enum class Grey { General, Lightness, CopyL };

template <High Hi, Band Bd, Scale Sc, Output Out, Grey Gr, int Max>
struct InverseRecipe {
  static constexpr High kHigh = Hi;
  static constexpr Band kBand = Bd;
  static constexpr Scale kScale = Sc;
  static constexpr Output kOutput = Out;
  static constexpr Grey kGrey = Gr;
  static constexpr int kMax = Max;
  static constexpr float kRange = float(Max);
};

using HlsToRgb8Body = InverseRecipe<High::Split, Band::ProductFirst, Scale::Multiply8, Output::RoundSaturate,
                                    Grey::General, 255>;
using HlsToRgb8Tail = InverseRecipe<High::Product, Band::Divide, Scale::Divide8, Output::TruncateLow,
                                    Grey::Lightness, 255>;
using HlsToRgb16Body = InverseRecipe<High::Split, Band::ProductFirst, Scale::Multiply16, Output::RoundSaturate,
                                     Grey::General, 65535>;
using HlsToRgb16Tail = InverseRecipe<High::Plain, Band::RateFirst, Scale::Multiply16, Output::RoundLow,
                                     Grey::CopyL, 65535>;
using HlsToBgr8Body = InverseRecipe<High::Plain, Band::RateFirst, Scale::Multiply8, Output::TruncateSaturate,
                                    Grey::Lightness, 255>;
using HlsToBgr8Tail = InverseRecipe<High::Plain, Band::RateFirst, Scale::Multiply8, Output::TruncateSaturate,
                                    Grey::CopyL, 255>;
using HlsToRgbFloatBody = InverseRecipe<High::Plain, Band::RateFirst, Scale::Float, Output::Level, Grey::CopyL, 1>;
using HlsToRgbFloatTail = InverseRecipe<High::Product, Band::Divide, Scale::Float, Output::Level, Grey::CopyL, 1>;

template <class R>
inline void scaleInputs(float H, float L, float S, float& h, float& l, float& s) {
  switch (R::kScale) {
    case Scale::Multiply8:
      h = H * kDeg8, l = L * kInv8, s = S * kInv8;
      break;
    case Scale::Divide8:
      h = (H * 360.0f) / 255.0f, l = L / 255.0f, s = S / 255.0f;
      break;
    case Scale::Multiply16:
      h = H * kDeg16, l = L * kInv16, s = S * kInv16;
      break;
    case Scale::Float:
      h = H * 360.0f, l = L, s = S;
      break;
  }
}

template <class R>
inline float highOf(float l, float s) {
  switch (R::kHigh) {
    case High::Split: return l + (l <= 0.5f ? l * s : s - l * s);
    case High::Plain: return l <= 0.5f ? l + l * s : (l + s) - l * s;
    case High::Product: break;
  }
  return l <= 0.5f ? l * (s + 1.0f) : (l + s) - l * s;
}

template <class R>
inline float rise(float low, float dm, float h) {
  switch (R::kBand) {
    case Band::ProductFirst: return low + (dm * h) * kInv60;
    case Band::RateFirst: return low + (h * kInv60) * dm;
    case Band::Divide: break;
  }
  return low + (dm * h) / 60.0f;
}

template <class R>
inline float levelAt(float h, float low, float high, float dm) {
  if (h < 60.0f) return rise<R>(low, dm, h);
  if (h < 180.0f) return high;
  if (h < 240.0f) return rise<R>(low, dm, 240.0f - h);
  return low;
}

// Levels of R, G, B (0..1) from hue in degrees and l, s.
template <class R>
inline void levelsOf(float h, float l, float s, float* level) {
  const float high = highOf<R>(l, s);
  const float low = (l + l) - high;
  const float dm = high - low;
  float hr = h + 120.0f;
  if (hr > 360.0f) hr -= 360.0f;
  float hb = h - 120.0f;
  if (hb < 0.0f) hb += 360.0f;
  level[0] = levelAt<R>(hr, low, high, dm);
  level[1] = levelAt<R>(h, low, high, dm);
  level[2] = levelAt<R>(hb, low, high, dm);
}

template <class R>
inline int32_t outputOf(float level) {
  const float v = level * R::kRange;
  switch (R::kOutput) {
    case Output::RoundSaturate: return saturate(RoundEven(v), R::kMax);
    case Output::TruncateLow: return TruncateToInt(v) & R::kMax;
    case Output::RoundLow: return RoundEven(v) & R::kMax;
    case Output::TruncateSaturate: return saturate(TruncateToInt(v), R::kMax);
    case Output::Level: break;
  }
  return 0;
}

// Integer H, L, S levels to R, G, B levels (in `out`, order R, G, B).
template <class R>
inline void inversePixel(int32_t H, int32_t L, int32_t S, int32_t* out) {
  float h, l, s;
  scaleInputs<R>(float(H), float(L), float(S), h, l, s);
  if (s == 0.0f && R::kGrey == Grey::CopyL) {
    out[0] = out[1] = out[2] = L;
    return;
  }
  float level[3];
  if (s == 0.0f && R::kGrey == Grey::Lightness) level[0] = level[1] = level[2] = l;
  else levelsOf<R>(h, l, s, level);
  for (int c = 0; c < 3; ++c) out[c] = outputOf<R>(level[c]);
}

template <class R>
inline void inverseFloat(float H, float L, float S, float* out) {
  float h, l, s;
  scaleInputs<R>(H, L, S, h, l, s);
  if (s == 0.0f) {
    out[0] = out[1] = out[2] = L;
    return;
  }
  levelsOf<R>(h, l, s, out);
}

}  // namespace zel::hls
