// The arithmetic forms of the full-range YUV matrix: Y with no offset, U and
// V centred on 128 as scaled differences B - Y and R - Y. Each form is one
// scalar function (one pixel) and one vector template over the units of
// vector_units.h (SSE4.1 or AVX2), identical lane by lane. The subsampled
// and packed-pixel families reuse these forms and constant sets.
//
// Vector forms take samples 0..255 in 16-bit lanes and return 16-bit lanes
// before the final SaturateU8, which the byte pack applies. Where a scalar
// form stores a low byte unclamped, the value always lies in 0..255, so the
// pack stores the same byte. Wide forms run exactly in 32-bit lanes.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc {

// Three 8-bit results of one pixel, in output order (Y, U, V or R, G, B).
struct Pixel8 {
  uint8_t c0, c1, c2;
};

inline Samples3 samplesOf(const Pixel8& p) { return {p.c0, p.c1, p.c2}; }

namespace yuv_detail {

// a * ca + b * cb in 32-bit lanes, for the low and the high four lanes of
// each 128-bit lane (pmaddwd); exact for signed 16-bit constants.
template <class U>
struct Dot32 {
  typename U::V lo, hi;
};
template <class U>
ZEL_INLINE Dot32<U> dot(typename U::V a, typename U::V b, int ca, int cb) {
  const typename U::V k = U::set32(int32_t(uint32_t(uint16_t(ca)) | (uint32_t(uint16_t(cb)) << 16)));
  return {U::madd16(U::unpackLo16(a, b), k), U::madd16(U::unpackHi16(a, b), k)};
}
template <class U>
ZEL_INLINE Dot32<U> operator+(const Dot32<U>& a, const Dot32<U>& b) {
  return {U::add32(a.lo, b.lo), U::add32(a.hi, b.hi)};
}
// (x + add) >> N in 32-bit lanes, packed back to 16-bit lanes.
template <int N, class U>
ZEL_INLINE typename U::V shiftPack(const Dot32<U>& x, int32_t add) {
  const typename U::V a = U::set32(add);
  return U::packS32(U::template sra32<N>(U::add32(x.lo, a)), U::template sra32<N>(U::add32(x.hi, a)));
}

}  // namespace yuv_detail

// ============================ RGB to YUV ============================

// The luma sum of the difference forms, 16.16.
inline int32_t yuvDifferenceSum(int R, int G, int B) { return 19595 * R + 38470 * G + 7471 * B; }

// Both difference forms: Y from the sum, U and V from the scaled differences
// with the addend Half (32768 rounds; 32767 is the truncating form's). V is
// clamped; U always fits and is stored as its low byte.
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

// With q = (Half - s) >> 16, the difference ((B << 16) - s + Half) >> 16 is
// B + q, and (d * 57475) >> 16 is d + MulHighS16(d, 57475 - 65536).
template <bool RoundedLuma, int Half, class U>
ZEL_INLINE Trio<U> yuvDifferenceWide(const Trio<U>& rgb) {
  using namespace yuv_detail;
  const typename U::V R = rgb.c0, G = rgb.c1, B = rgb.c2;
  // s = 19595 R + 19235 G + 7471 B + 19235 G
  const Dot32<U> s = dot<U>(R, G, 19595, 19235) + dot<U>(B, G, 7471, 19235);
  const typename U::V y = shiftPack<16>(s, RoundedLuma ? 32768 : 0);
  const Dot32<U> negative{U::sub32(U::zero(), s.lo), U::sub32(U::zero(), s.hi)};
  const typename U::V q = shiftPack<16>(negative, Half);
  const typename U::V db = U::add16(B, q), dr = U::add16(R, q);
  const typename U::V u = U::add16(U::mulHighS16(db, U::set16(32244)), U::set16(128));
  const typename U::V v = U::add16(U::add16(dr, U::mulHighS16(dr, U::set16(57475 - 65536))), U::set16(128));
  return {y, u, v};
}

inline Pixel8 yuvDifferenceRounded(int R, int G, int B) { return yuvDifferenceWide<true, 32768>(R, G, B); }
template <class U>
ZEL_INLINE Trio<U> yuvDifferenceRounded(const Trio<U>& rgb) {
  return yuvDifferenceWide<true, 32768, U>(rgb);
}

inline Pixel8 yuvDifferenceTruncated(int R, int G, int B) { return yuvDifferenceWide<false, 32767>(R, G, B); }
template <class U>
ZEL_INLINE Trio<U> yuvDifferenceTruncated(const Trio<U>& rgb) {
  return yuvDifferenceWide<false, 32767, U>(rgb);
}

// The 16-bit form of the differences, on samples shifted left by 2. Black
// gives U = V = 127: 2B - t is -1 and the product floors.
inline Pixel8 yuvDifferenceLanes(int R, int G, int B) {
  const int16_t r = int16_t(R << 2), g = int16_t(G << 2), b = int16_t(B << 2);
  const int16_t t = AddSaturateS16(
      AddSaturateS16(AddSaturateS16(MulHighS16(r, 9798), MulHighS16(b, 3736)), MulHighS16(g, 19235)), 1);
  const int16_t u = MulHighS16(wrapAdd16(B << 1, -t), 16121);
  const int16_t v = MulHighS16(wrapAdd16(R << 1, -t), 28737);
  return {SaturateU8(t >> 1), SaturateU8(u + 128), SaturateU8(v + 128)};
}

template <class U>
ZEL_INLINE Trio<U> yuvDifferenceLanes(const Trio<U>& rgb) {
  const typename U::V r = U::template sll16<2>(rgb.c0), g = U::template sll16<2>(rgb.c1);
  const typename U::V b = U::template sll16<2>(rgb.c2);
  typename U::V t = U::addSatS16(U::mulHighS16(r, U::set16(9798)), U::mulHighS16(b, U::set16(3736)));
  t = U::addSatS16(U::addSatS16(t, U::mulHighS16(g, U::set16(19235))), U::set16(1));
  const typename U::V u = U::mulHighS16(U::sub16(U::template sll16<1>(rgb.c2), t), U::set16(16121));
  const typename U::V v = U::mulHighS16(U::sub16(U::template sll16<1>(rgb.c0), t), U::set16(28737));
  return {U::template sra16<1>(t), U::add16(u, U::set16(128)), U::add16(v, U::set16(128))};
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

template <class U>
ZEL_INLINE Trio<U> yuvMatrixLanes(const Trio<U>& rgb) {
  using V = typename U::V;
  const V r8 = U::template sll16<8>(rgb.c0), g8 = U::template sll16<8>(rgb.c1), b8 = U::template sll16<8>(rgb.c2);
  const V y = U::addSatU16(U::addSatU16(U::mulHighU16(r8, U::set16(19595)), U::mulHighU16(g8, U::set16(38469))),
                           U::mulHighU16(b8, U::set16(7471)));
  const V r7 = U::template sll16<7>(rgb.c0), g7 = U::template sll16<7>(rgb.c1), b7 = U::template sll16<7>(rgb.c2);
  const V u = U::addSatS16(U::addSatS16(U::mulHighS16(r7, U::set16(-4816)), U::mulHighS16(g7, U::set16(-9469))),
                           U::mulHighS16(b7, U::set16(14286)));
  const V v = U::addSatS16(U::addSatS16(U::mulHighS16(r7, U::set16(20152)), U::mulHighS16(g7, U::set16(-16875))),
                           U::mulHighS16(b7, U::set16(-3276)));
  return {U::template srl16<8>(y), U::add16(U::template sra16<6>(u), U::set16(128)),
          U::add16(U::template sra16<6>(v), U::set16(128))};
}

// The matrix in 32-bit arithmetic, truncating, green 38469. U always fits
// and is stored as its low byte; V is clamped.
inline Pixel8 yuvMatrixWide(int R, int G, int B) {
  const int32_t y = (19595 * R + 38469 * G + 7471 * B) >> 16;
  const int32_t u = ((-4816 * R - 9469 * G + 14286 * B) >> 15) + 128;
  const int32_t v = ((20152 * R - 16875 * G - 3276 * B) >> 15) + 128;
  return {uint8_t(y), uint8_t(u), SaturateU8(v)};
}

template <class U>
ZEL_INLINE Trio<U> yuvMatrixWide(const Trio<U>& rgb) {
  using namespace yuv_detail;
  const typename U::V R = rgb.c0, G = rgb.c1, B = rgb.c2;
  // 38469 G = 19234 G + 19235 G; 14286 B = 7143 B + 7143 B; -3276 B likewise.
  const typename U::V y = shiftPack<16>(dot<U>(R, G, 19595, 19234) + dot<U>(B, G, 7471, 19235), 0);
  const typename U::V u = shiftPack<15>(dot<U>(R, G, -4816, -9469) + dot<U>(B, B, 7143, 7143), 0);
  const typename U::V v = shiftPack<15>(dot<U>(R, G, 20152, -16875) + dot<U>(B, B, -1638, -1638), 0);
  return {y, U::add16(u, U::set16(128)), U::add16(v, U::set16(128))};
}

// ============================ YUV to RGB ============================

// Wide sets, 16.16, on u = U - 128 and v = V - 128.
struct RgbWideSet {
  int32_t vToR, vToG, uToG, uToB;
};
inline constexpr RgbWideSet rgbWideA{74711, -38076, -25821, 133169};
inline constexpr RgbWideSet rgbWideB{74710, -38075, -25820, 133168};

// Rounding terms of a wide form, per channel: 32768 or 0.
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

// A 16.16 constant c as w * 65536 + f with f a signed 16-bit value:
// (c x + r) >> 16 = w x + ((f x + r) >> 16), exactly.
constexpr int32_t wholePart(int32_t c) { return (c + 32768) >> 16; }
constexpr int32_t fractionPart(int32_t c) { return c - wholePart(c) * 65536; }

}  // namespace yuv_detail

template <class U>
ZEL_INLINE Trio<U> rgbWide(const RgbWideSet& k, const RgbRounding& rnd, const Trio<U>& yuv) {
  using namespace yuv_detail;
  using V = typename U::V;
  const V y = yuv.c0, u = U::sub16(yuv.c1, U::set16(128)), v = U::sub16(yuv.c2, U::set16(128)), zero = U::zero();
  auto whole = [](V x, int32_t c) ZEL_LAMBDA_INLINE { return U::mulLo16(x, U::set16(wholePart(c))); };
  const V r = U::add16(U::add16(y, whole(v, k.vToR)), shiftPack<16>(dot<U>(v, zero, fractionPart(k.vToR), 0), rnd.r));
  const V g = U::add16(U::add16(y, U::add16(whole(u, k.uToG), whole(v, k.vToG))),
                       shiftPack<16>(dot<U>(u, v, fractionPart(k.uToG), fractionPart(k.vToG)), rnd.g));
  const V b = U::add16(U::add16(y, whole(u, k.uToB)), shiftPack<16>(dot<U>(u, zero, fractionPart(k.uToB), 0), rnd.b));
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

// From Y' and the shifted u', v'.
template <int Round, int Shift, bool SubtractGreen, class U>
ZEL_INLINE Trio<U> rgbLanesShifted(const RgbLaneSet& k, typename U::V y, typename U::V u, typename U::V v) {
  using V = typename U::V;
  const V r = U::addSatS16(y, U::mulHighS16(v, U::set16(k.vToR)));
  V g;
  if constexpr (SubtractGreen)
    g = U::sub16(U::sub16(y, U::mulHighS16(v, U::set16(k.vToG))), U::mulHighS16(u, U::set16(k.uToG)));
  else
    g = U::addSatS16(U::addSatS16(y, U::mulHighS16(u, U::set16(k.uToG))), U::mulHighS16(v, U::set16(k.vToG)));
  const V b = U::addSatS16(y, U::mulHighS16(u, U::set16(k.uToB)));
  const V round = U::set16(Round);
  return {U::template sra16<Shift>(U::addSatS16(r, round)), U::template sra16<Shift>(U::addSatS16(g, round)),
          U::template sra16<Shift>(U::addSatS16(b, round))};
}

template <int YShift, int CShift, int Round, int Shift, bool SubtractGreen, class U>
ZEL_INLINE Trio<U> rgbLanesShape(const RgbLaneSet& k, const Trio<U>& yuv) {
  return rgbLanesShifted<Round, Shift, SubtractGreen, U>(
      k, U::template sll16<YShift>(yuv.c0), U::template sll16<CShift>(U::sub16(yuv.c1, U::set16(128))),
      U::template sll16<CShift>(U::sub16(yuv.c2, U::set16(128))));
}

// The same from samples in the high bytes of the lanes (S << 8): Y' is a
// logical shift down, and the top bit flipped makes (C - 128) << 8, whose
// arithmetic shift down is exact.
template <int YShift, int CShift, int Round, int Shift, bool SubtractGreen, class U>
ZEL_INLINE Trio<U> rgbLanesShapeHigh(const RgbLaneSet& k, const Trio<U>& yuv8) {
  static_assert(YShift <= 8 && CShift <= 8, "the shifts stay within the high byte");
  const typename U::V top = U::set16(-32768);
  return rgbLanesShifted<Round, Shift, SubtractGreen, U>(k, U::template srl16<8 - YShift>(yuv8.c0),
                                                         U::template sra16<8 - CShift>(U::xor_(yuv8.c1, top)),
                                                         U::template sra16<8 - CShift>(U::xor_(yuv8.c2, top)));
}

// rgbLanes1: SaturateU8(Y + terms), chroma << 3.
inline Pixel8 rgbLanes1(int Y, int U, int V) { return rgbLanesShape<0, 3, 0, 0, false>(rgbLanes1Set, Y, U, V); }
template <class U>
ZEL_INLINE Trio<U> rgbLanes1(const Trio<U>& yuv) {
  return rgbLanesShape<0, 3, 0, 0, false, U>(rgbLanes1Set, yuv);
}
template <class U>
ZEL_INLINE Trio<U> rgbLanes1High(const Trio<U>& yuv8) {
  return rgbLanesShapeHigh<0, 3, 0, 0, false, U>(rgbLanes1Set, yuv8);
}

// rgbLanes2: SaturateU8(((Y << 1) + terms) >> 1), chroma << 4.
inline Pixel8 rgbLanes2(int Y, int U, int V) { return rgbLanesShape<1, 4, 0, 1, false>(rgbLanes2Set, Y, U, V); }
template <class U>
ZEL_INLINE Trio<U> rgbLanes2(const Trio<U>& yuv) {
  return rgbLanesShape<1, 4, 0, 1, false, U>(rgbLanes2Set, yuv);
}
template <class U>
ZEL_INLINE Trio<U> rgbLanes2High(const Trio<U>& yuv8) {
  return rgbLanesShapeHigh<1, 4, 0, 1, false, U>(rgbLanes2Set, yuv8);
}

// rgbLanes3: SaturateU8(((Y << 3) + terms + 4) >> 3), chroma << 7, green
// subtracted.
inline Pixel8 rgbLanes3(int Y, int U, int V) { return rgbLanesShape<3, 7, 4, 3, true>(rgbLanes3Set, Y, U, V); }
template <class U>
ZEL_INLINE Trio<U> rgbLanes3(const Trio<U>& yuv) {
  return rgbLanesShape<3, 7, 4, 3, true, U>(rgbLanes3Set, yuv);
}
template <class U>
ZEL_INLINE Trio<U> rgbLanes3High(const Trio<U>& yuv8) {
  return rgbLanesShapeHigh<3, 7, 4, 3, true, U>(rgbLanes3Set, yuv8);
}

}  // namespace zel::lc
