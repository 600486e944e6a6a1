// Photo YCC: luma, C1 from blue minus luma and C2 from red minus luma, with
// chroma zero levels at 156/255 and 137/255. Each form is one function: the
// 8-bit ones in 16-bit lanes (body) and 32-bit integers (tail), the 16-bit
// and float ones in single precision, one operation per step as written.
// Vector overloads give the scalar bits lane by lane.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"
#include "frame/simd.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc {

// ============================ 8 bits ============================

// Body: luma weights in Q14 on samples << 8, gains in Q12 of that format.
inline Pixel8 rgbToYccLanes(int R, int G, int B) {
  const uint16_t r = uint16_t(R << 8), g = uint16_t(G << 8), b = uint16_t(B << 8);
  const int16_t l = int16_t(MulHighU16(r, 4898) + MulHighU16(g, 9617) + MulHighU16(b, 1867));
  const int16_t y = MulHighS16(l, 2921);
  const int16_t c1 = MulHighS16(int16_t((b >> 2) - l), 1789);
  const int16_t c2 = MulHighS16(int16_t((r >> 2) - l), 2178);
  return {SaturateU8(y >> 2), SaturateU8((c1 + 624) >> 2), SaturateU8((c2 + 548) >> 2)};
}

template <class U>
ZEL_INLINE Trio<U> rgbToYccLanes(const Trio<U>& rgb) {
  using V = typename U::V;
  const V r = U::template sll16<8>(rgb.c0), g = U::template sll16<8>(rgb.c1), b = U::template sll16<8>(rgb.c2);
  const V l = U::add16(U::add16(U::mulHighU16(r, U::set16(4898)), U::mulHighU16(g, U::set16(9617))),
                       U::mulHighU16(b, U::set16(1867)));
  const V y = U::template sra16<2>(U::mulHighS16(l, U::set16(2921)));
  const V c1 = U::mulHighS16(U::sub16(U::template srl16<2>(b), l), U::set16(1789));
  const V c2 = U::mulHighS16(U::sub16(U::template srl16<2>(r), l), U::set16(2178));
  return {y, U::template sra16<2>(U::add16(c1, U::set16(624))), U::template sra16<2>(U::add16(c2, U::set16(548)))};
}

// Tail: 32-bit integers; C1 and C2 always fit and are stored as low bytes.
inline Pixel8 rgbToYccWide(int R, int G, int B) {
  const int32_t l = R * 4898 + G * 9617 + B * 1867;
  const int32_t y = ((l >> 10) * 2921) >> 16;
  const int32_t c1 = (((((B << 14) - l) >> 10) * 1789) >> 16) + 156;
  const int32_t c2 = (((((R << 14) - l) >> 10) * 2178) >> 16) + 137;
  return {uint8_t(y), uint8_t(c1), uint8_t(c2)};
}

// Body of the inverse: luma constant 5563.
inline Pixel8 yccToRgbLanes(int Y, int C1, int C2) {
  const int16_t y = int16_t(MulHighU16(uint16_t(Y << 8), 5563));
  const int16_t c1 = MulHighS16(int16_t((C1 - 156) * 128), 18168);
  const int16_t c2 = MulHighS16(int16_t((C2 - 137) * 128), 14921);
  const int16_t g = int16_t((y >> 1) + MulHighS16(c1, -6357) + MulHighS16(c2, -16679));
  return {SaturateU8(int16_t(y + c2) >> 4), SaturateU8(g >> 3), SaturateU8(int16_t(y + c1) >> 4)};
}

template <class U>
ZEL_INLINE Trio<U> yccToRgbLanes(const Trio<U>& ycc) {
  using V = typename U::V;
  const V y = U::mulHighU16(U::template sll16<8>(ycc.c0), U::set16(5563));
  const V c1 = U::mulHighS16(U::template sll16<7>(U::sub16(ycc.c1, U::set16(156))), U::set16(18168));
  const V c2 = U::mulHighS16(U::template sll16<7>(U::sub16(ycc.c2, U::set16(137))), U::set16(14921));
  const V g = U::add16(U::add16(U::template sra16<1>(y), U::mulHighS16(c1, U::set16(-6357))),
                       U::mulHighS16(c2, U::set16(-16679)));
  return {U::template sra16<4>(U::add16(y, c2)), U::template sra16<3>(g), U::template sra16<4>(U::add16(y, c1))};
}

// Tail of the inverse: luma constant 5564.
inline Pixel8 yccToRgbWide(int Y, int C1, int C2) {
  const int32_t p = Y * 5564, q = C1 * 9084 - 1417104, s = C2 * 7460 - 1022020;
  return {SaturateU8((p + s) >> 12), SaturateU8((p * 16 - (q >> 8) * 794 - (s >> 8) * 2084) >> 16),
          SaturateU8((p + q) >> 12)};
}

// ====================== 16 bits and float ======================

struct Float3 {
  float c0, c1, c2;
};

// Float lanes at three widths, one operation per intrinsic, so the same form
// gives the same bits lane by lane: Ps4 four lanes (SSE), Ps8 eight (AVX2,
// lane k + 4 of a block is pixel k + 4), Ps16 sixteen (512-bit, in pixel
// order).
struct Ps4 {
  using V = __m128;
  static V set(float v) { return _mm_set1_ps(v); }
  static V zero() { return _mm_setzero_ps(); }
  static V add(V a, V b) { return _mm_add_ps(a, b); }
  static V sub(V a, V b) { return _mm_sub_ps(a, b); }
  static V mul(V a, V b) { return _mm_mul_ps(a, b); }
  // MINPS and MAXPS return their second operand when either is NaN.
  static V min(V a, V b) { return _mm_min_ps(a, b); }
  static V max(V a, V b) { return _mm_max_ps(a, b); }
};
struct Ps8 {
  using V = __m256;
  ZEL_AVX2 static V set(float v) { return _mm256_set1_ps(v); }
  ZEL_AVX2 static V zero() { return _mm256_setzero_ps(); }
  ZEL_AVX2 static V add(V a, V b) { return _mm256_add_ps(a, b); }
  ZEL_AVX2 static V sub(V a, V b) { return _mm256_sub_ps(a, b); }
  ZEL_AVX2 static V mul(V a, V b) { return _mm256_mul_ps(a, b); }
  ZEL_AVX2 static V min(V a, V b) { return _mm256_min_ps(a, b); }
  ZEL_AVX2 static V max(V a, V b) { return _mm256_max_ps(a, b); }
};
struct Ps16 {
  using V = __m512;
  ZEL_AVX512 static V set(float v) { return _mm512_set1_ps(v); }
  ZEL_AVX512 static V zero() { return _mm512_setzero_ps(); }
  ZEL_AVX512 static V add(V a, V b) { return _mm512_add_ps(a, b); }
  ZEL_AVX512 static V sub(V a, V b) { return _mm512_sub_ps(a, b); }
  ZEL_AVX512 static V mul(V a, V b) { return _mm512_mul_ps(a, b); }
  // The all-ones zero mask is the plain instruction (without the undefined
  // merge source that the unmasked form hands the compiler).
  ZEL_AVX512 static V min(V a, V b) { return _mm512_maskz_min_ps(__mmask16(~0u), a, b); }
  ZEL_AVX512 static V max(V a, V b) { return _mm512_maskz_max_ps(__mmask16(~0u), a, b); }
};

template <class P>
struct FloatTrio {
  typename P::V c0, c1, c2;
};
using Floats3 = FloatTrio<Ps4>;
// Three 16-bit results as stored: unsigned samples, or the bits of signed
// ones.
struct Word3 {
  uint16_t c0, c1, c2;
};

// 16-bit body, forward: on unsigned samples (signed ones plus 32768). The
// results are then rounded, ties to even, and clamped to 0..65535.
inline Float3 rgbToYccBody16(float R, float G, float B) {
  const float l = R * 0.299f + G * 0.587f + B * 0.114f;
  return {l * 0.7132668f, (B - l) * 0.4368627f + 40092.0f, (R - l) * 0.5319216f + 35209.0f};
}
template <class P>
ZEL_INLINE FloatTrio<P> rgbToYccBody16(typename P::V R, typename P::V G, typename P::V B) {
  const typename P::V l = P::add(P::add(P::mul(R, P::set(0.299f)), P::mul(G, P::set(0.587f))), P::mul(B, P::set(0.114f)));
  return {P::mul(l, P::set(0.7132668f)), P::add(P::mul(P::sub(B, l), P::set(0.4368627f)), P::set(40092.0f)),
          P::add(P::mul(P::sub(R, l), P::set(0.5319216f)), P::set(35209.0f))};
}

// 16-bit body, inverse, on unsigned samples (signed ones plus 32768).
inline Float3 yccToRgbBody16(float Y, float C1, float C2) {
  const float c1 = (C1 - 40092.0f) * 2.2179f, c2 = (C2 - 35209.0f) * 1.8215f, y = Y * 1.3584f;
  return {y + c2, y - c1 * 0.194f - c2 * 0.509f, y + c1};
}
template <class P>
ZEL_INLINE FloatTrio<P> yccToRgbBody16(typename P::V Y, typename P::V C1, typename P::V C2) {
  using V = typename P::V;
  const V c1 = P::mul(P::sub(C1, P::set(40092.0f)), P::set(2.2179f));
  const V c2 = P::mul(P::sub(C2, P::set(35209.0f)), P::set(1.8215f));
  const V y = P::mul(Y, P::set(1.3584f));
  const V g = P::sub(P::sub(y, P::mul(c1, P::set(0.194f))), P::mul(c2, P::set(0.509f)));
  return {P::add(y, c2), g, P::add(y, c1)};
}

// The body's rounding: nearest, ties to even, clamped to 0..65535; a signed
// member then takes 32768 off, which flips the top bit.
inline uint16_t roundToWord(float x) { return SaturateU16(RoundEven(x)); }
inline uint16_t roundToSignedWord(float x) { return uint16_t(roundToWord(x) ^ 0x8000); }

// 16u tail, forward: the weights folded together; the low 16 bits of the
// truncated values are stored, without a clamp.
inline Word3 rgbToYccTail16u(int R, int G, int B) {
  const float r = float(R), g = float(G), b = float(B);
  const float y = 0.213267f * r + 0.49999f + g * 0.418688f + b * 0.0813124f;
  const float c1 = 40092.5f + r * -0.130621f - g * 0.256437f + b * 0.387058f;
  const float c2 = 35209.5f + r * 0.372876f - g * 0.312237f - b * 0.0606389f;
  return {uint16_t(TruncateToInt(y)), uint16_t(TruncateToInt(c1)), uint16_t(TruncateToInt(c2))};
}

// 16s tail, forward: the weights apart, on samples plus 32768; low 16 bits.
inline Word3 rgbToYccTail16s(int R, int G, int B) {
  const float r = float(R + 32768), g = float(G + 32768), b = float(B + 32768);
  const float l = r * 0.299f + g * 0.587f + 0.114f * b;
  return {uint16_t(TruncateToInt(0.7132668f * l + 0.49999f) - 32768),
          uint16_t(TruncateToInt(40092.5f + 0.4368627f * (b - l)) - 32768),
          uint16_t(TruncateToInt((r - l) * 0.5319216f + 35209.5f) - 32768)};
}

// 16u tail, inverse: truncated and clamped to 0..65535.
inline Word3 yccToRgbTail16u(int Y, int C1, int C2) {
  const float v = 0.49999f + 1.3584f * float(Y);
  const float d1 = float(C1 - 40092), d2 = float(C2 - 35209);
  return {SaturateU16(TruncateToInt(v + 1.8215f * d2)),
          SaturateU16(TruncateToInt(v - 0.4302726f * d1 - d2 * 0.92714345f)),
          SaturateU16(TruncateToInt(v + d1 * 2.2179f))};
}

// 16s tail, inverse: no half added; truncated, less 32768, saturated.
inline Word3 yccToRgbTail16s(int Y, int C1, int C2) {
  const float y = float(Y + 32768) * 1.3584f;
  const float c1 = float(C1 - 7324) * 2.2179f, c2 = float(C2 - 2441) * 1.8215f;
  return {uint16_t(SaturateS16(TruncateToInt(y + c2) - 32768)),
          uint16_t(SaturateS16(TruncateToInt(y - c1 * 0.194f - c2 * 0.509f) - 32768)),
          uint16_t(SaturateS16(TruncateToInt(y + c1) - 32768))};
}

// 32f, forward, no clamp. The C2 gain is 0.53192 here, not 0.5319216.
inline Float3 rgbToYcc32f(float R, float G, float B) {
  const float l = 0.299f * R + 0.587f * G + 0.114f * B;
  return {0.7132668f * l, 0.4368627f * (B - l) + 0.6117647f, (R - l) * 0.53192f + 0.5372549f};
}
template <class P>
ZEL_INLINE FloatTrio<P> rgbToYcc32f(typename P::V R, typename P::V G, typename P::V B) {
  const typename P::V l = P::add(P::add(P::mul(P::set(0.299f), R), P::mul(P::set(0.587f), G)), P::mul(P::set(0.114f), B));
  return {P::mul(P::set(0.7132668f), l), P::add(P::mul(P::set(0.4368627f), P::sub(B, l)), P::set(0.6117647f)),
          P::add(P::mul(P::sub(R, l), P::set(0.53192f)), P::set(0.5372549f))};
}

// Below 0 gives 0, above 1 gives 1; anything else (NaN too) stays.
inline float clampUnit(float x) { return x < 0.0f ? 0.0f : (x > 1.0f ? 1.0f : x); }
template <class P>
ZEL_INLINE typename P::V clampUnit(typename P::V x) {
  // MINPS and MAXPS return their second operand when either is NaN.
  return P::min(P::set(1.0f), P::max(P::zero(), x));
}
inline __m128 clampUnit(__m128 x) { return clampUnit<Ps4>(x); }

// 32f, inverse, clamped to 0..1.
inline Float3 yccToRgb32f(float Y, float C1, float C2) {
  const float y = 1.3584f * Y, c1 = (C1 - 0.6117647f) * 2.2179f, c2 = 1.8215f * (C2 - 0.5372549f);
  return {clampUnit(y + c2), clampUnit(y - c1 * 0.194f - c2 * 0.509f), clampUnit(y + c1)};
}
template <class P>
ZEL_INLINE FloatTrio<P> yccToRgb32f(typename P::V Y, typename P::V C1, typename P::V C2) {
  using V = typename P::V;
  const V y = P::mul(P::set(1.3584f), Y);
  const V c1 = P::mul(P::sub(C1, P::set(0.6117647f)), P::set(2.2179f));
  const V c2 = P::mul(P::set(1.8215f), P::sub(C2, P::set(0.5372549f)));
  const V g = P::sub(P::sub(y, P::mul(c1, P::set(0.194f))), P::mul(c2, P::set(0.509f)));
  return {clampUnit<P>(P::add(y, c2)), clampUnit<P>(g), clampUnit<P>(P::add(y, c1))};
}

// The four float forms as row forms, at every width.
#define ZEL_PHOTO_YCC_FORM(Name, form)                                                                         \
  struct Name {                                                                                                \
    Float3 operator()(float a, float b, float c) const { return form(a, b, c); }                              \
    Floats3 operator()(__m128 a, __m128 b, __m128 c) const { return form<Ps4>(a, b, c); }                     \
    ZEL_AVX2 ZEL_INLINE FloatTrio<Ps8> operator()(__m256 a, __m256 b, __m256 c) const { return form<Ps8>(a, b, c); } \
    ZEL_AVX512 ZEL_INLINE FloatTrio<Ps16> operator()(__m512 a, __m512 b, __m512 c) const {                     \
      return form<Ps16>(a, b, c);                                                                              \
    }                                                                                                          \
  };
ZEL_PHOTO_YCC_FORM(RgbToYccBody16Form, rgbToYccBody16)
ZEL_PHOTO_YCC_FORM(YccToRgbBody16Form, yccToRgbBody16)
ZEL_PHOTO_YCC_FORM(RgbToYcc32fForm, rgbToYcc32f)
ZEL_PHOTO_YCC_FORM(YccToRgb32fForm, yccToRgb32f)
#undef ZEL_PHOTO_YCC_FORM

}  // namespace zel::lc
