// The arithmetic forms of the full-range YUV matrix: Y with no offset, U and
// V centred on 128 as scaled differences B - Y and R - Y. Each form is one
// function with a scalar overload (one pixel) and vector overloads (eight
// pixels in 16-bit lanes, SSE4.1; sixteen in AVX2) of identical bits lane by
// lane. The subsampled and packed-pixel families reuse these forms and sets.
//
// Vector overloads take samples 0..255 zero-extended to 16-bit lanes and
// return 16-bit lanes before the final SaturateU8, which the byte pack of the
// store applies (packus). Where a scalar form stores a low byte unclamped,
// the value always lies in 0..255, so the pack stores the same byte.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/scalar_ops.h"
#include "frame/simd.h"

namespace zel {

// Three 8-bit results of one pixel, in output order (Y, U, V or R, G, B).
struct Pixel8 {
  uint8_t c0, c1, c2;
};

// Three channels of eight pixels in 16-bit lanes.
struct Lanes3 {
  __m128i c0, c1, c2;
};

// Three channels of sixteen pixels in 16-bit lanes.
struct Lanes3x16 {
  __m256i c0, c1, c2;
};

namespace yuv_detail {

inline __m128i k16(int v) { return _mm_set1_epi16(static_cast<int16_t>(v)); }
ZEL_AVX2 inline __m256i k16x(int v) { return _mm256_set1_epi16(static_cast<int16_t>(v)); }

// Widening dot product of two 16-bit channels with two 16-bit constants:
// a * ca + b * cb in 32-bit lanes, exact (pmaddwd).
inline __m128i pairOf(int ca, int cb) {
  return _mm_set1_epi32(int32_t(uint32_t(uint16_t(ca)) | (uint32_t(uint16_t(cb)) << 16)));
}
inline __m128i dotLo(__m128i a, __m128i b, int ca, int cb) {
  return _mm_madd_epi16(_mm_unpacklo_epi16(a, b), pairOf(ca, cb));
}
inline __m128i dotHi(__m128i a, __m128i b, int ca, int cb) {
  return _mm_madd_epi16(_mm_unpackhi_epi16(a, b), pairOf(ca, cb));
}

}  // namespace yuv_detail

// ============================ RGB to YUV ============================

// The luma sum of the difference forms, 16.16.
inline int32_t yuvDifferenceSum(int R, int G, int B) { return 19595 * R + 38470 * G + 7471 * B; }

// Both difference forms: Y from the sum, U and V from the scaled differences
// with the addend `half` (32768 rounds, 32767 is the truncating member's).
// V is clamped; U always fits and is stored as its low byte.
template <bool RoundedLuma, int Half>
inline Pixel8 yuvDifferenceWide(int R, int G, int B) {
  const int32_t s = yuvDifferenceSum(R, G, B);
  const int32_t y = RoundedLuma ? (s + 32768) >> 16 : s >> 16;
  const int32_t db = ((B << 16) - s + Half) >> 16;
  const int32_t dr = ((R << 16) - s + Half) >> 16;
  const int32_t u = ((db * 32244) >> 16) + 128;
  const int32_t v = ((dr * 57475) >> 16) + 128;
  return {uint8_t(y), uint8_t(u), SaturateU8(v)};
}

inline Pixel8 yuvDifferenceRounded(int R, int G, int B) { return yuvDifferenceWide<true, 32768>(R, G, B); }
inline Pixel8 yuvDifferenceTruncated(int R, int G, int B) { return yuvDifferenceWide<false, 32767>(R, G, B); }

// Vector form of the difference forms, exact in 32-bit lanes. With
// q = (Half - s) >> 16, the difference ((B << 16) - s + Half) >> 16 is B + q;
// (d * 57475) >> 16 is d + MulHighS16(d, 57475 - 65536).
template <bool RoundedLuma, int Half>
inline Lanes3 yuvDifferenceWide(__m128i R, __m128i G, __m128i B) {
  using namespace yuv_detail;
  // s = 19595 R + 19235 G + 7471 B + 19235 G
  const __m128i sLo = _mm_add_epi32(dotLo(R, G, 19595, 19235), dotLo(B, G, 7471, 19235));
  const __m128i sHi = _mm_add_epi32(dotHi(R, G, 19595, 19235), dotHi(B, G, 7471, 19235));
  const __m128i yAdd = _mm_set1_epi32(RoundedLuma ? 32768 : 0);
  const __m128i half = _mm_set1_epi32(Half);
  const __m128i y = _mm_packs_epi32(_mm_srai_epi32(_mm_add_epi32(sLo, yAdd), 16),
                                    _mm_srai_epi32(_mm_add_epi32(sHi, yAdd), 16));
  const __m128i q = _mm_packs_epi32(_mm_srai_epi32(_mm_sub_epi32(half, sLo), 16),
                                    _mm_srai_epi32(_mm_sub_epi32(half, sHi), 16));
  const __m128i db = _mm_add_epi16(B, q);
  const __m128i dr = _mm_add_epi16(R, q);
  const __m128i u = _mm_add_epi16(_mm_mulhi_epi16(db, k16(32244)), k16(128));
  const __m128i v = _mm_add_epi16(_mm_add_epi16(dr, _mm_mulhi_epi16(dr, k16(57475 - 65536))), k16(128));
  return {y, u, v};
}

inline Lanes3 yuvDifferenceRounded(__m128i R, __m128i G, __m128i B) {
  return yuvDifferenceWide<true, 32768>(R, G, B);
}
inline Lanes3 yuvDifferenceTruncated(__m128i R, __m128i G, __m128i B) {
  return yuvDifferenceWide<false, 32767>(R, G, B);
}

// The 16-bit form of the differences, on samples shifted left by 2. Black
// gives U = V = 127: 2B - t is -1 and the product floors.
inline Pixel8 yuvDifferenceLanes(int R, int G, int B) {
  const int16_t r = int16_t(R << 2), g = int16_t(G << 2), b = int16_t(B << 2);
  const int16_t t = AddSaturateS16(
      AddSaturateS16(AddSaturateS16(MulHighS16(r, 9798), MulHighS16(b, 3736)), MulHighS16(g, 19235)), 1);
  const int16_t u = MulHighS16(AddSaturateS16(int16_t(B << 1), int16_t(-t)), 16121);
  const int16_t v = MulHighS16(AddSaturateS16(int16_t(R << 1), int16_t(-t)), 28737);
  return {SaturateU8(t >> 1), SaturateU8(u + 128), SaturateU8(v + 128)};
}

inline Lanes3 yuvDifferenceLanes(__m128i R, __m128i G, __m128i B) {
  using namespace yuv_detail;
  const __m128i r = _mm_slli_epi16(R, 2), g = _mm_slli_epi16(G, 2), b = _mm_slli_epi16(B, 2);
  __m128i t = _mm_adds_epi16(_mm_mulhi_epi16(r, k16(9798)), _mm_mulhi_epi16(b, k16(3736)));
  t = _mm_adds_epi16(_mm_adds_epi16(t, _mm_mulhi_epi16(g, k16(19235))), k16(1));
  const __m128i u = _mm_mulhi_epi16(_mm_subs_epi16(_mm_slli_epi16(B, 1), t), k16(16121));
  const __m128i v = _mm_mulhi_epi16(_mm_subs_epi16(_mm_slli_epi16(R, 1), t), k16(28737));
  return {_mm_srai_epi16(t, 1), _mm_add_epi16(u, k16(128)), _mm_add_epi16(v, k16(128))};
}

ZEL_AVX2 inline Lanes3x16 yuvDifferenceLanes(__m256i R, __m256i G, __m256i B) {
  using namespace yuv_detail;
  const __m256i r = _mm256_slli_epi16(R, 2), g = _mm256_slli_epi16(G, 2), b = _mm256_slli_epi16(B, 2);
  __m256i t = _mm256_adds_epi16(_mm256_mulhi_epi16(r, k16x(9798)), _mm256_mulhi_epi16(b, k16x(3736)));
  t = _mm256_adds_epi16(_mm256_adds_epi16(t, _mm256_mulhi_epi16(g, k16x(19235))), k16x(1));
  const __m256i u = _mm256_mulhi_epi16(_mm256_subs_epi16(_mm256_slli_epi16(B, 1), t), k16x(16121));
  const __m256i v = _mm256_mulhi_epi16(_mm256_subs_epi16(_mm256_slli_epi16(R, 1), t), k16x(28737));
  return {_mm256_srai_epi16(t, 1), _mm256_add_epi16(u, k16x(128)), _mm256_add_epi16(v, k16x(128))};
}

// The matrix in 16-bit lanes, with no rounding term anywhere: luma from high
// words of unsigned products (green 38469), chroma from signed products of
// samples shifted by 7, then >> 6.
inline Pixel8 yuvMatrixLanes(int R, int G, int B) {
  auto h = [](int s, int c) { return MulHighU16(uint16_t(s << 8), uint16_t(c)); };
  auto l = [](int s, int c) { return MulHighS16(int16_t(s << 7), int16_t(c)); };
  const uint16_t y = AddSaturateU16(AddSaturateU16(h(R, 19595), h(G, 38469)), h(B, 7471));
  const int16_t u = AddSaturateS16(AddSaturateS16(l(R, -4816), l(G, -9469)), l(B, 14286));
  const int16_t v = AddSaturateS16(AddSaturateS16(l(R, 20152), l(G, -16875)), l(B, -3276));
  return {SaturateU8(y >> 8), SaturateU8((u >> 6) + 128), SaturateU8((v >> 6) + 128)};
}

inline Lanes3 yuvMatrixLanes(__m128i R, __m128i G, __m128i B) {
  using namespace yuv_detail;
  const __m128i r8 = _mm_slli_epi16(R, 8), g8 = _mm_slli_epi16(G, 8), b8 = _mm_slli_epi16(B, 8);
  const __m128i y = _mm_adds_epu16(_mm_adds_epu16(_mm_mulhi_epu16(r8, k16(19595)), _mm_mulhi_epu16(g8, k16(38469))),
                                   _mm_mulhi_epu16(b8, k16(7471)));
  const __m128i r7 = _mm_slli_epi16(R, 7), g7 = _mm_slli_epi16(G, 7), b7 = _mm_slli_epi16(B, 7);
  const __m128i u = _mm_adds_epi16(_mm_adds_epi16(_mm_mulhi_epi16(r7, k16(-4816)), _mm_mulhi_epi16(g7, k16(-9469))),
                                   _mm_mulhi_epi16(b7, k16(14286)));
  const __m128i v = _mm_adds_epi16(_mm_adds_epi16(_mm_mulhi_epi16(r7, k16(20152)), _mm_mulhi_epi16(g7, k16(-16875))),
                                   _mm_mulhi_epi16(b7, k16(-3276)));
  return {_mm_srli_epi16(y, 8), _mm_add_epi16(_mm_srai_epi16(u, 6), k16(128)),
          _mm_add_epi16(_mm_srai_epi16(v, 6), k16(128))};
}

ZEL_AVX2 inline Lanes3x16 yuvMatrixLanes(__m256i R, __m256i G, __m256i B) {
  using namespace yuv_detail;
  const __m256i r8 = _mm256_slli_epi16(R, 8), g8 = _mm256_slli_epi16(G, 8), b8 = _mm256_slli_epi16(B, 8);
  const __m256i y = _mm256_adds_epu16(
      _mm256_adds_epu16(_mm256_mulhi_epu16(r8, k16x(19595)), _mm256_mulhi_epu16(g8, k16x(38469))),
      _mm256_mulhi_epu16(b8, k16x(7471)));
  const __m256i r7 = _mm256_slli_epi16(R, 7), g7 = _mm256_slli_epi16(G, 7), b7 = _mm256_slli_epi16(B, 7);
  const __m256i u = _mm256_adds_epi16(
      _mm256_adds_epi16(_mm256_mulhi_epi16(r7, k16x(-4816)), _mm256_mulhi_epi16(g7, k16x(-9469))),
      _mm256_mulhi_epi16(b7, k16x(14286)));
  const __m256i v = _mm256_adds_epi16(
      _mm256_adds_epi16(_mm256_mulhi_epi16(r7, k16x(20152)), _mm256_mulhi_epi16(g7, k16x(-16875))),
      _mm256_mulhi_epi16(b7, k16x(-3276)));
  return {_mm256_srli_epi16(y, 8), _mm256_add_epi16(_mm256_srai_epi16(u, 6), k16x(128)),
          _mm256_add_epi16(_mm256_srai_epi16(v, 6), k16x(128))};
}

// The matrix in 32-bit arithmetic, truncating, green 38469. U always fits
// and is stored as its low byte; V is clamped.
inline Pixel8 yuvMatrixWide(int R, int G, int B) {
  const int32_t y = (19595 * R + 38469 * G + 7471 * B) >> 16;
  const int32_t u = ((-4816 * R - 9469 * G + 14286 * B) >> 15) + 128;
  const int32_t v = ((20152 * R - 16875 * G - 3276 * B) >> 15) + 128;
  return {uint8_t(y), uint8_t(u), SaturateU8(v)};
}

inline Lanes3 yuvMatrixWide(__m128i R, __m128i G, __m128i B) {
  using namespace yuv_detail;
  // 38469 G = 19234 G + 19235 G; 14286 B = 7143 B + 7143 B; -3276 B likewise.
  const __m128i yLo = _mm_srai_epi32(_mm_add_epi32(dotLo(R, G, 19595, 19234), dotLo(B, G, 7471, 19235)), 16);
  const __m128i yHi = _mm_srai_epi32(_mm_add_epi32(dotHi(R, G, 19595, 19234), dotHi(B, G, 7471, 19235)), 16);
  const __m128i uLo = _mm_srai_epi32(_mm_add_epi32(dotLo(R, G, -4816, -9469), dotLo(B, B, 7143, 7143)), 15);
  const __m128i uHi = _mm_srai_epi32(_mm_add_epi32(dotHi(R, G, -4816, -9469), dotHi(B, B, 7143, 7143)), 15);
  const __m128i vLo = _mm_srai_epi32(_mm_add_epi32(dotLo(R, G, 20152, -16875), dotLo(B, B, -1638, -1638)), 15);
  const __m128i vHi = _mm_srai_epi32(_mm_add_epi32(dotHi(R, G, 20152, -16875), dotHi(B, B, -1638, -1638)), 15);
  return {_mm_packs_epi32(yLo, yHi), _mm_add_epi16(_mm_packs_epi32(uLo, uHi), k16(128)),
          _mm_add_epi16(_mm_packs_epi32(vLo, vHi), k16(128))};
}

// ============================ YUV to RGB ============================

// Wide sets, 16.16, on u = U - 128 and v = V - 128.
struct RgbWideSet {
  int32_t vToR, vToG, uToG, uToB;
};
inline constexpr RgbWideSet rgbWideA{74711, -38076, -25821, 133169};
inline constexpr RgbWideSet rgbWideB{74710, -38075, -25820, 133168};

// Rounding terms of the wide forms, per channel: 32768 or 0.
struct RgbRounding {
  int32_t r, g, b;
};

// R = ((Y << 16) + VtoR v + rR) >> 16, and so on, clamped.
inline Pixel8 rgbWide(const RgbWideSet& k, const RgbRounding& rnd, int Y, int U, int V) {
  const int32_t u = U - 128, v = V - 128, y = Y << 16;
  return {SaturateU8((y + k.vToR * v + rnd.r) >> 16), SaturateU8((y + k.uToG * u + k.vToG * v + rnd.g) >> 16),
          SaturateU8((y + k.uToB * u + rnd.b) >> 16)};
}

namespace yuv_detail {

// A 16.16 constant c as k * 65536 + m with m a signed 16-bit value:
// (c x + r) >> 16 = k x + ((m x + r) >> 16), exactly.
constexpr int32_t wholePart(int32_t c) { return (c + 32768) >> 16; }
constexpr int32_t fractionPart(int32_t c) { return c - (wholePart(c) << 16); }

// ((m1 a + m2 b + r) >> 16) for eight lanes, m1 and m2 signed 16-bit, in
// 32-bit lanes and packed back to 16 bits.
inline __m128i wideHigh(__m128i a, __m128i b, int m1, int m2, int32_t r) {
  const __m128i rr = _mm_set1_epi32(r);
  const __m128i lo = _mm_srai_epi32(_mm_add_epi32(dotLo(a, b, m1, m2), rr), 16);
  const __m128i hi = _mm_srai_epi32(_mm_add_epi32(dotHi(a, b, m1, m2), rr), 16);
  return _mm_packs_epi32(lo, hi);
}

}  // namespace yuv_detail

inline Lanes3 rgbWide(const RgbWideSet& k, const RgbRounding& rnd, __m128i Y, __m128i U, __m128i V) {
  using namespace yuv_detail;
  const __m128i u = _mm_sub_epi16(U, k16(128)), v = _mm_sub_epi16(V, k16(128));
  const __m128i zero = _mm_setzero_si128();
  auto whole = [](__m128i x, int32_t c) { return _mm_mullo_epi16(x, k16(wholePart(c))); };
  const __m128i r =
      _mm_add_epi16(_mm_add_epi16(Y, whole(v, k.vToR)), wideHigh(v, zero, fractionPart(k.vToR), 0, rnd.r));
  const __m128i g = _mm_add_epi16(_mm_add_epi16(Y, _mm_add_epi16(whole(u, k.uToG), whole(v, k.vToG))),
                                  wideHigh(u, v, fractionPart(k.uToG), fractionPart(k.vToG), rnd.g));
  const __m128i b =
      _mm_add_epi16(_mm_add_epi16(Y, whole(u, k.uToB)), wideHigh(u, zero, fractionPart(k.uToB), 0, rnd.b));
  return {r, g, b};
}

// Lane sets: coefficients V to R, V to G, U to G, U to B for MulHighS16.
struct RgbLaneSet {
  int16_t vToR, vToG, uToG, uToB;
};
inline constexpr RgbLaneSet rgbLanes1Set{9339, -4760, -3228, 16646};
inline constexpr RgbLaneSet rgbLanes2Set{9338, -4759, -3227, 16645};
// Green constants of the third set are positive and subtracted.
inline constexpr RgbLaneSet rgbLanes3Set{4669, 2380, 1614, 8323};

// The shape of the lane forms: Y' = Y << YShift, u' = (U - 128) << CShift,
// v' likewise; each channel is (Y' + terms + Round) >> Shift, clamped. With
// SubtractGreen the green constants are positive and their products are
// subtracted, which floors differently from adding negative products.
template <int YShift, int CShift, int Round, int Shift, bool SubtractGreen>
inline Pixel8 rgbLanesShape(const RgbLaneSet& k, int Y, int U, int V) {
  const int16_t y = int16_t(Y << YShift);
  const int16_t u = int16_t((U - 128) * (1 << CShift)), v = int16_t((V - 128) * (1 << CShift));
  const int16_t r = AddSaturateS16(y, MulHighS16(v, k.vToR));
  int16_t g;
  if constexpr (SubtractGreen)
    g = AddSaturateS16(AddSaturateS16(y, int16_t(-MulHighS16(v, k.vToG))), int16_t(-MulHighS16(u, k.uToG)));
  else
    g = AddSaturateS16(AddSaturateS16(y, MulHighS16(u, k.uToG)), MulHighS16(v, k.vToG));
  const int16_t b = AddSaturateS16(y, MulHighS16(u, k.uToB));
  return {SaturateU8(AddSaturateS16(r, Round) >> Shift), SaturateU8(AddSaturateS16(g, Round) >> Shift),
          SaturateU8(AddSaturateS16(b, Round) >> Shift)};
}

template <int YShift, int CShift, int Round, int Shift, bool SubtractGreen>
inline Lanes3 rgbLanesShape(const RgbLaneSet& k, __m128i Y, __m128i U, __m128i V) {
  using namespace yuv_detail;
  const __m128i y = _mm_slli_epi16(Y, YShift);
  const __m128i u = _mm_slli_epi16(_mm_sub_epi16(U, k16(128)), CShift);
  const __m128i v = _mm_slli_epi16(_mm_sub_epi16(V, k16(128)), CShift);
  const __m128i r = _mm_adds_epi16(y, _mm_mulhi_epi16(v, k16(k.vToR)));
  __m128i g;
  if constexpr (SubtractGreen)
    g = _mm_subs_epi16(_mm_subs_epi16(y, _mm_mulhi_epi16(v, k16(k.vToG))), _mm_mulhi_epi16(u, k16(k.uToG)));
  else
    g = _mm_adds_epi16(_mm_adds_epi16(y, _mm_mulhi_epi16(u, k16(k.uToG))), _mm_mulhi_epi16(v, k16(k.vToG)));
  const __m128i b = _mm_adds_epi16(y, _mm_mulhi_epi16(u, k16(k.uToB)));
  const __m128i round = k16(Round);
  return {_mm_srai_epi16(_mm_adds_epi16(r, round), Shift), _mm_srai_epi16(_mm_adds_epi16(g, round), Shift),
          _mm_srai_epi16(_mm_adds_epi16(b, round), Shift)};
}

template <int YShift, int CShift, int Round, int Shift, bool SubtractGreen>
ZEL_AVX2 inline Lanes3x16 rgbLanesShape(const RgbLaneSet& k, __m256i Y, __m256i U, __m256i V) {
  using namespace yuv_detail;
  const __m256i y = _mm256_slli_epi16(Y, YShift);
  const __m256i u = _mm256_slli_epi16(_mm256_sub_epi16(U, k16x(128)), CShift);
  const __m256i v = _mm256_slli_epi16(_mm256_sub_epi16(V, k16x(128)), CShift);
  const __m256i r = _mm256_adds_epi16(y, _mm256_mulhi_epi16(v, k16x(k.vToR)));
  __m256i g;
  if constexpr (SubtractGreen)
    g = _mm256_subs_epi16(_mm256_subs_epi16(y, _mm256_mulhi_epi16(v, k16x(k.vToG))),
                          _mm256_mulhi_epi16(u, k16x(k.uToG)));
  else
    g = _mm256_adds_epi16(_mm256_adds_epi16(y, _mm256_mulhi_epi16(u, k16x(k.uToG))),
                          _mm256_mulhi_epi16(v, k16x(k.vToG)));
  const __m256i b = _mm256_adds_epi16(y, _mm256_mulhi_epi16(u, k16x(k.uToB)));
  const __m256i round = k16x(Round);
  return {_mm256_srai_epi16(_mm256_adds_epi16(r, round), Shift), _mm256_srai_epi16(_mm256_adds_epi16(g, round), Shift),
          _mm256_srai_epi16(_mm256_adds_epi16(b, round), Shift)};
}

// rgbLanes1: SaturateU8(Y + terms), chroma << 3.
inline Pixel8 rgbLanes1(int Y, int U, int V) { return rgbLanesShape<0, 3, 0, 0, false>(rgbLanes1Set, Y, U, V); }
inline Lanes3 rgbLanes1(__m128i Y, __m128i U, __m128i V) {
  return rgbLanesShape<0, 3, 0, 0, false>(rgbLanes1Set, Y, U, V);
}
ZEL_AVX2 inline Lanes3x16 rgbLanes1(__m256i Y, __m256i U, __m256i V) {
  return rgbLanesShape<0, 3, 0, 0, false>(rgbLanes1Set, Y, U, V);
}

// rgbLanes2: SaturateU8(((Y << 1) + terms) >> 1), chroma << 4.
inline Pixel8 rgbLanes2(int Y, int U, int V) { return rgbLanesShape<1, 4, 0, 1, false>(rgbLanes2Set, Y, U, V); }
inline Lanes3 rgbLanes2(__m128i Y, __m128i U, __m128i V) {
  return rgbLanesShape<1, 4, 0, 1, false>(rgbLanes2Set, Y, U, V);
}
ZEL_AVX2 inline Lanes3x16 rgbLanes2(__m256i Y, __m256i U, __m256i V) {
  return rgbLanesShape<1, 4, 0, 1, false>(rgbLanes2Set, Y, U, V);
}

// rgbLanes3: SaturateU8(((Y << 3) + terms + 4) >> 3), chroma << 7, green
// subtracted.
inline Pixel8 rgbLanes3(int Y, int U, int V) { return rgbLanesShape<3, 7, 4, 3, true>(rgbLanes3Set, Y, U, V); }
inline Lanes3 rgbLanes3(__m128i Y, __m128i U, __m128i V) {
  return rgbLanesShape<3, 7, 4, 3, true>(rgbLanes3Set, Y, U, V);
}
ZEL_AVX2 inline Lanes3x16 rgbLanes3(__m256i Y, __m256i U, __m256i V) {
  return rgbLanesShape<3, 7, 4, 3, true>(rgbLanes3Set, Y, U, V);
}

}  // namespace zel
