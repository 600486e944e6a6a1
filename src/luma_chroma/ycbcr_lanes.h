// Video-range YCbCr to RGB: the coefficient sets and the arithmetic forms
// shared by every family that expands YCbCr (full resolution, subsampled,
// 16-bit packed). One matrix, several forms that differ in the last bit;
// which pixel takes which form is the member's business.
//
// Lane forms work on 16-bit lanes: the centred samples carry a shift by 7
// (Y' = (Y - 16) << 7, U' = (Cb - 128) << 7, V' = (Cr - 128) << 7) and the
// coefficients are 3.13 fixed point, so each product term is
// MulHighS16(x', c), a floor. Wide forms are exact 32-bit arithmetic in
// 16.16 fixed point. Each form has a scalar function and a vector template
// over the units of vector_units.h, identical lane by lane.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc {

// ---- coefficient sets ----

// 3.13 fixed point: luma gain, V to R, V to G, U to G, U to B.
struct LaneSet {
  int16_t luma, vToR, vToG, uToG, uToB;
};
inline constexpr LaneSet lanes601a{9536, 13074, -6660, -3203, 16523};
inline constexpr LaneSet lanes601b{9535, 13074, -6660, -3211, 16523};
inline constexpr LaneSet lanes709{9535, 14688, -4375, -1745, 17326};

// 16.16 fixed point, applied to Y itself and to the centred u, v; the
// offset removes the luma bias (16 times the luma gain).
struct WideSet {
  int32_t luma, vToR, vToG, uToG, uToB, offset;
};
inline constexpr WideSet wide601a{76284, 104595, -53281, -25690, 132186, -1220544};
inline constexpr WideSet wide601b{76282, 104593, -53279, -25689, 132184, -1220512};

struct Rgb8 {
  uint8_t r, g, b;
};

// ---- scalar forms ----

inline int16_t lumaLane(int y) { return static_cast<int16_t>((y - 16) * 128); }
inline int16_t chromaLane(int c) { return static_cast<int16_t>((c - 128) * 128); }

// Lane form, added: every term is added with its signed constant, then
// k (8 or 0) and an arithmetic shift by 4. The sums before SaturateU8.
struct LaneSums {
  int16_t r, g, b;
};
inline LaneSums laneAddedSums(const LaneSet& s, int16_t yl, int16_t ul, int16_t vl, int k) {
  const int16_t luma = MulHighS16(yl, s.luma);
  return {static_cast<int16_t>(wrapAdd16(wrapAdd16(luma, MulHighS16(vl, s.vToR)), k) >> 4),
          static_cast<int16_t>(wrapAdd16(wrapAdd16(wrapAdd16(luma, MulHighS16(ul, s.uToG)), MulHighS16(vl, s.vToG)), k) >> 4),
          static_cast<int16_t>(wrapAdd16(wrapAdd16(luma, MulHighS16(ul, s.uToB)), k) >> 4)};
}

// Lane form, subtracted: green takes the positive constants and subtracts
// the floored products, which can differ by one from the added form.
inline LaneSums laneSubtractedSums(const LaneSet& s, int16_t yl, int16_t ul, int16_t vl, int k) {
  const int16_t luma = MulHighS16(yl, s.luma);
  const int16_t vg = MulHighS16(vl, static_cast<int16_t>(-s.vToG));
  const int16_t ug = MulHighS16(ul, static_cast<int16_t>(-s.uToG));
  return {static_cast<int16_t>(wrapAdd16(wrapAdd16(luma, MulHighS16(vl, s.vToR)), k) >> 4),
          static_cast<int16_t>(wrapAdd16(wrapAdd16(wrapAdd16(luma, -vg), -ug), k) >> 4),
          static_cast<int16_t>(wrapAdd16(wrapAdd16(luma, MulHighS16(ul, s.uToB)), k) >> 4)};
}

inline Rgb8 saturate(const LaneSums& s) { return {SaturateU8(s.r), SaturateU8(s.g), SaturateU8(s.b)}; }

inline Rgb8 laneAdded(const LaneSet& s, int y, int cb, int cr, int k) {
  return saturate(laneAddedSums(s, lumaLane(y), chromaLane(cb), chromaLane(cr), k));
}
inline Rgb8 laneSubtracted(const LaneSet& s, int y, int cb, int cr, int k = 8) {
  return saturate(laneSubtractedSums(s, lumaLane(y), chromaLane(cb), chromaLane(cr), k));
}

// Wide forms: 32-bit sums, arithmetic shift by 16. `round` is 0 for the
// truncated form and 32768 for the rounded one.
inline Rgb8 wideForm(const WideSet& s, int y, int cb, int cr, int32_t round) {
  const int32_t luma = s.luma * y + s.offset + round;
  const int32_t u = cb - 128, v = cr - 128;
  return {SaturateU8((luma + s.vToR * v) >> 16), SaturateU8((luma + s.uToG * u + s.vToG * v) >> 16),
          SaturateU8((luma + s.uToB * u) >> 16)};
}
inline Rgb8 wideTruncated(const WideSet& s, int y, int cb, int cr) { return wideForm(s, y, cb, cr, 0); }
inline Rgb8 wideRounded(const WideSet& s, int y, int cb, int cr) { return wideForm(s, y, cb, cr, 32768); }

// ---- vector forms (16-bit lanes) ----

template <class U>
struct LaneRgb {
  typename U::V r, g, b;  // sums before SaturateU8
};

// Y' and U', V' from samples widened to 16-bit lanes.
template <class U>
ZEL_INLINE typename U::V lumaLanes(typename U::V samples) {
  return U::sub16(U::template sll16<7>(samples), U::set16(16 << 7));
}
template <class U>
ZEL_INLINE typename U::V chromaLanes(typename U::V samples) {
  return U::sub16(U::template sll16<7>(samples), U::set16(128 << 7));
}

template <class U>
ZEL_INLINE LaneRgb<U> laneAdded(const LaneSet& s, typename U::V yl, typename U::V ul, typename U::V vl, int k) {
  const typename U::V kk = U::set16(k);
  const typename U::V luma = U::mulHighS16(yl, U::set16(s.luma));
  const typename U::V r = U::add16(U::add16(luma, U::mulHighS16(vl, U::set16(s.vToR))), kk);
  const typename U::V g = U::add16(
      U::add16(U::add16(luma, U::mulHighS16(ul, U::set16(s.uToG))), U::mulHighS16(vl, U::set16(s.vToG))), kk);
  const typename U::V b = U::add16(U::add16(luma, U::mulHighS16(ul, U::set16(s.uToB))), kk);
  return {U::template sra16<4>(r), U::template sra16<4>(g), U::template sra16<4>(b)};
}

template <class U>
ZEL_INLINE LaneRgb<U> laneSubtracted(const LaneSet& s, typename U::V yl, typename U::V ul, typename U::V vl,
                                 int k = 8) {
  const typename U::V kk = U::set16(k);
  const typename U::V luma = U::mulHighS16(yl, U::set16(s.luma));
  const typename U::V r = U::add16(U::add16(luma, U::mulHighS16(vl, U::set16(s.vToR))), kk);
  const typename U::V vg = U::mulHighS16(vl, U::set16(-s.vToG));
  const typename U::V ug = U::mulHighS16(ul, U::set16(-s.uToG));
  const typename U::V g = U::add16(U::sub16(U::sub16(luma, vg), ug), kk);
  const typename U::V b = U::add16(U::add16(luma, U::mulHighS16(ul, U::set16(s.uToB))), kk);
  return {U::template sra16<4>(r), U::template sra16<4>(g), U::template sra16<4>(b)};
}

// The wide form on four pixels of Y, Cb, Cr, x bytes in 32-bit lanes; the
// result holds R, G, B, 0 bytes for each pixel.
inline __m128i wideForm4(const WideSet& s, __m128i px, int32_t round) {
  const __m128i mask = _mm_set1_epi32(0xff), centre = _mm_set1_epi32(128);
  const __m128i y = _mm_and_si128(px, mask);
  const __m128i u = _mm_sub_epi32(_mm_and_si128(_mm_srli_epi32(px, 8), mask), centre);
  const __m128i v = _mm_sub_epi32(_mm_and_si128(_mm_srli_epi32(px, 16), mask), centre);
  const __m128i luma = _mm_add_epi32(_mm_mullo_epi32(y, _mm_set1_epi32(s.luma)), _mm_set1_epi32(s.offset + round));
  const __m128i r = _mm_add_epi32(luma, _mm_mullo_epi32(v, _mm_set1_epi32(s.vToR)));
  const __m128i g = _mm_add_epi32(_mm_add_epi32(luma, _mm_mullo_epi32(u, _mm_set1_epi32(s.uToG))),
                                  _mm_mullo_epi32(v, _mm_set1_epi32(s.vToG)));
  const __m128i b = _mm_add_epi32(luma, _mm_mullo_epi32(u, _mm_set1_epi32(s.uToB)));
  return mergeDwords(_mm_srai_epi32(r, 16), _mm_srai_epi32(g, 16), _mm_srai_epi32(b, 16));
}

// ---- the forms as row forms: samples Y, Cb, Cr in, R, G, B out ----

inline Samples3 samplesOf(const Rgb8& p) { return {p.r, p.g, p.b}; }

struct LaneAddedForm {
  static constexpr bool kVector = true;
  LaneSet set;
  int k;
  Samples3 pixel(const Samples3& s) const { return samplesOf(laneAdded(set, s.c0, s.c1, s.c2, k)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const LaneRgb<U> r = laneAdded<U>(set, lumaLanes<U>(s.c0), chromaLanes<U>(s.c1), chromaLanes<U>(s.c2), k);
    return {r.r, r.g, r.b};
  }
};

struct LaneSubtractedForm {
  static constexpr bool kVector = true;
  LaneSet set;
  Samples3 pixel(const Samples3& s) const { return samplesOf(laneSubtracted(set, s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const LaneRgb<U> r = laneSubtracted<U>(set, lumaLanes<U>(s.c0), chromaLanes<U>(s.c1), chromaLanes<U>(s.c2));
    return {r.r, r.g, r.b};
  }
};

// The added lane form straight from bytes, for sets whose luma gain is a
// multiple of 32. With Y8 = Y << 8 and C8 = (C - 128) << 8 (the high bytes
// of the lanes):
//   MulHighS16((Y - 16) << 7, L) = floor((Y - 16) L / 512)
//                                = MulHighU16(Y8, L / 2) - 16 L / 512,
// exactly, as 16 L is a multiple of 512; a chroma term with an even
// constant is MulHighS16(C8, c / 2), with an odd one MulHighS16(C8 >> 1, c).
// The sums wrap, so their order does not matter.
template <const LaneSet& S, int K>
struct LaneAddedBytes {
  static_assert(S.luma % 32 == 0, "the luma offset must leave no fraction");
  static constexpr bool kVector = true;
  static constexpr bool kBytes = true;
  static constexpr bool kHighBytes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(laneAdded(S, s.c0, s.c1, s.c2, K)); }

  template <class U>
  ZEL_INLINE LaneRgb<U> half(typename U::V y8, typename U::V u8, typename U::V v8) const {
    using V = typename U::V;
    auto term = [](V c8, int c) ZEL_LAMBDA_INLINE {
      return c % 2 == 0 ? U::mulHighS16(c8, U::set16(c / 2)) : U::mulHighS16(U::template sra16<1>(c8), U::set16(c));
    };
    const V luma = U::add16(U::mulHighU16(y8, U::set16(S.luma / 2)), U::set16(K - 16 * S.luma / 512));
    const V uOdd = U::template sra16<1>(u8);
    auto uTerm = [&](int c) ZEL_LAMBDA_INLINE {
      return c % 2 == 0 ? U::mulHighS16(u8, U::set16(c / 2)) : U::mulHighS16(uOdd, U::set16(c));
    };
    const V r = U::add16(luma, term(v8, S.vToR));
    const V g = U::add16(U::add16(luma, uTerm(S.uToG)), term(v8, S.vToG));
    const V b = U::add16(luma, uTerm(S.uToB));
    return {U::template sra16<4>(r), U::template sra16<4>(g), U::template sra16<4>(b)};
  }

  template <class U>
  ZEL_INLINE Trio<U> bytes(const Trio<U>& ycc) const {
    const Wide16<U> y = widenHigh<U>(ycc.c0), u = widenCentred<U>(ycc.c1), v = widenCentred<U>(ycc.c2);
    const LaneRgb<U> lo = half<U>(y.lo, u.lo, v.lo), hi = half<U>(y.hi, u.hi, v.hi);
    return {U::packU8(lo.r, hi.r), U::packU8(lo.g, hi.g), U::packU8(lo.b, hi.b)};
  }

  // Two halves of samples in the high bytes of the lanes; the chroma's top
  // bit flipped centres it.
  template <class U>
  ZEL_INLINE Trio<U> highBytes(const Trio<U>& lo8, const Trio<U>& hi8) const {
    const typename U::V top = U::set16(-32768);
    const LaneRgb<U> lo = half<U>(lo8.c0, U::xor_(lo8.c1, top), U::xor_(lo8.c2, top));
    const LaneRgb<U> hi = half<U>(hi8.c0, U::xor_(hi8.c1, top), U::xor_(hi8.c2, top));
    return {U::packU8(lo.r, hi.r), U::packU8(lo.g, hi.g), U::packU8(lo.b, hi.b)};
  }
};

// `round` 0: truncated; 32768: rounded.
struct WideRgbForm {
  static constexpr bool kVector = false;
  WideSet set;
  int32_t round;
  Samples3 pixel(const Samples3& s) const { return samplesOf(wideForm(set, s.c0, s.c1, s.c2, round)); }
  __m128i pixels4(__m128i px) const { return wideForm4(set, px, round); }
};

}  // namespace zel::lc
