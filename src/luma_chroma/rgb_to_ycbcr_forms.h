// RGB to video-range YCbCr: one matrix in three forms that differ in the
// last bit. Y lies in 16..235, Cb and Cr in 16..240 around 128.
//
//   wide       exact 32-bit sums in 16.16 with a rounding half;
//   high-word  unsigned high products for Y, signed (floored) ones for
//              Cb and Cr, each rounded once at the end;
//   rounded    the matrix divided by 4 in Q15, every product rounded.
//
// Each form has a scalar function and a vector template over the units of
// vector_units.h (16-bit lanes of samples in, 16-bit lanes ready for
// SaturateU8 out), identical lane by lane.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc {

struct YCbCr8 {
  uint8_t y, cb, cr;
};

// Matrix rows in 16.16 (Y; Cb; Cr) and the offsets 16 and 128 plus a half.
inline constexpr int32_t kYR = 16843, kYG = 33030, kYB = 6423;
inline constexpr int32_t kCbR = -9699, kCbG = -19071, kCbB = 28770;
inline constexpr int32_t kCrR = 28770, kCrG = -24117, kCrB = -4653;
inline constexpr int32_t kLumaAddend = (16 << 16) + 32768;     // 1081344
inline constexpr int32_t kChromaAddend = (128 << 16) + 32768;  // 8421376

// The results always lie in 16..240; the low byte of the sum is stored.
inline YCbCr8 ycbcrWide(int r, int g, int b) {
  return {static_cast<uint8_t>((kYR * r + kYG * g + kYB * b + kLumaAddend) >> 16),
          static_cast<uint8_t>((kCbR * r + kCbG * g + kCbB * b + kChromaAddend) >> 16),
          static_cast<uint8_t>((kCrR * r + kCrG * g + kCrB * b + kChromaAddend) >> 16)};
}

// H(S, c) = MulHighU16(S << 8, c) = (S c) >> 8; L(S, c) = MulHighS16(S << 7, c)
// = (S c) >> 9, floored.
inline uint16_t highU(int s, int c) { return MulHighU16(static_cast<uint16_t>(s << 8), static_cast<uint16_t>(c)); }
inline int16_t highS(int s, int c) { return MulHighS16(static_cast<int16_t>(s << 7), static_cast<int16_t>(c)); }

inline YCbCr8 ycbcrHighWord(int r, int g, int b) {
  const uint16_t y = AddSaturateU16(AddSaturateU16(AddSaturateU16(highU(r, kYR), highU(g, kYG)), highU(b, kYB)), 128);
  const int16_t cb = AddSaturateS16(AddSaturateS16(AddSaturateS16(highS(r, kCbR), highS(g, kCbG)), highS(b, kCbB)), 64);
  const int16_t cr = AddSaturateS16(AddSaturateS16(AddSaturateS16(highS(r, kCrR), highS(g, kCrG)), highS(b, kCrB)), 64);
  return {SaturateU8((y >> 8) + 16), SaturateU8((cb >> 7) + 128), SaturateU8((cr >> 7) + 128)};
}

// M(S, c) = MulHighRound(S << 7, c) = (S c + 128) >> 8, with the Q15 constants
// of the matrix divided by 4; offsets 16 << 6 and 128 << 6, each plus 2.
inline int16_t rounded(int s, int c) { return MulHighRound(static_cast<int16_t>(s << 7), static_cast<int16_t>(c)); }

inline YCbCr8 ycbcrRounded(int r, int g, int b) {
  const int16_t y = wrapAdd16(wrapAdd16(wrapAdd16(rounded(r, 4211), rounded(g, 8258)), rounded(b, 1606)), 1026);
  const int16_t cb = wrapAdd16(wrapAdd16(wrapAdd16(rounded(b, 7193), -rounded(g, 4768)), -rounded(r, 2425)), 8194);
  const int16_t cr = wrapAdd16(wrapAdd16(wrapAdd16(rounded(r, 7193), -rounded(g, 6029)), -rounded(b, 1163)), 8194);
  return {SaturateU8(y >> 6), SaturateU8(cb >> 6), SaturateU8(cr >> 6)};
}

// ---- vector forms ----

// The wide form on four pixels of R, G, B, x bytes, as exact 32-bit dot
// products; the results lie in 16..240, so the merge stores the low bytes.
inline __m128i ycbcrWide4(__m128i px) {
  const __m128i lo = _mm_cvtepu8_epi16(px), hi = _mm_unpackhi_epi8(px, _mm_setzero_si128());
  auto dot = [&](int r, int g, int b) {
    const __m128i c = _mm_setr_epi16(int16_t(r), int16_t(g), int16_t(b), 0, int16_t(r), int16_t(g), int16_t(b), 0);
    return _mm_hadd_epi32(_mm_madd_epi16(lo, c), _mm_madd_epi16(hi, c));
  };
  // 33030 does not fit a signed lane: G 33030 = G (33030 - 65536) + (G << 16).
  const __m128i g16 = _mm_slli_epi32(_mm_and_si128(px, _mm_set1_epi32(0xff00)), 8);
  const __m128i y = _mm_add_epi32(_mm_add_epi32(dot(kYR, kYG - 65536, kYB), g16), _mm_set1_epi32(kLumaAddend));
  const __m128i chroma = _mm_set1_epi32(kChromaAddend);
  const __m128i cb = _mm_add_epi32(dot(kCbR, kCbG, kCbB), chroma);
  const __m128i cr = _mm_add_epi32(dot(kCrR, kCrG, kCrB), chroma);
  return mergeDwords(_mm_srai_epi32(y, 16), _mm_srai_epi32(cb, 16), _mm_srai_epi32(cr, 16));
}

template <class U>
struct LaneYCbCr {
  typename U::V y, cb, cr;  // 16-bit lanes before SaturateU8
};

// From the samples shifted left by 8 (r8) and by 7 (r7).
template <class U>
ZEL_INLINE LaneYCbCr<U> ycbcrHighWord(typename U::V r8, typename U::V g8, typename U::V b8, typename U::V r7,
                                      typename U::V g7, typename U::V b7) {
  using V = typename U::V;
  const V ys = U::addSatU16(U::addSatU16(U::addSatU16(U::mulHighU16(r8, U::set16(kYR)), U::mulHighU16(g8, U::set16(kYG))),
                                         U::mulHighU16(b8, U::set16(kYB))),
                            U::set16(128));
  auto chroma = [&](int cr, int cg, int cb) ZEL_LAMBDA_INLINE {
    const V s = U::addSatS16(U::addSatS16(U::addSatS16(U::mulHighS16(r7, U::set16(cr)), U::mulHighS16(g7, U::set16(cg))),
                                          U::mulHighS16(b7, U::set16(cb))),
                             U::set16(64));
    return U::add16(U::template sra16<7>(s), U::set16(128));
  };
  return {U::add16(U::template srl16<8>(ys), U::set16(16)), chroma(kCbR, kCbG, kCbB), chroma(kCrR, kCrG, kCrB)};
}

template <class U>
ZEL_INLINE LaneYCbCr<U> ycbcrHighWord(typename U::V r, typename U::V g, typename U::V b) {
  return ycbcrHighWord<U>(U::template sll16<8>(r), U::template sll16<8>(g), U::template sll16<8>(b),
                          U::template sll16<7>(r), U::template sll16<7>(g), U::template sll16<7>(b));
}

// From the samples shifted left by 7.
template <class U>
ZEL_INLINE LaneYCbCr<U> ycbcrRounded7(typename U::V r7, typename U::V g7, typename U::V b7) {
  using V = typename U::V;
  auto m = [&](V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighRound(s, U::set16(c)); };
  const V y = U::add16(U::add16(U::add16(m(r7, 4211), m(g7, 8258)), m(b7, 1606)), U::set16(1026));
  const V cb = U::add16(U::sub16(U::sub16(m(b7, 7193), m(g7, 4768)), m(r7, 2425)), U::set16(8194));
  const V cr = U::add16(U::sub16(U::sub16(m(r7, 7193), m(g7, 6029)), m(b7, 1163)), U::set16(8194));
  return {U::template sra16<6>(y), U::template sra16<6>(cb), U::template sra16<6>(cr)};
}

template <class U>
ZEL_INLINE LaneYCbCr<U> ycbcrRounded(typename U::V r, typename U::V g, typename U::V b) {
  return ycbcrRounded7<U>(U::template sll16<7>(r), U::template sll16<7>(g), U::template sll16<7>(b));
}

// ---- the forms as row forms: samples R, G, B in, Y, Cb, Cr out ----

inline Samples3 samplesOf(const YCbCr8& p) { return {p.y, p.cb, p.cr}; }

struct WideFwd {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(ycbcrWide(s.c0, s.c1, s.c2)); }
  __m128i pixels4(__m128i px) const { return ycbcrWide4(px); }
};

// `highLanes` takes the samples shifted left by 8 (see pixel_rows.h).
struct HighWordFwd {
  static constexpr bool kVector = true;
  static constexpr bool kHighLanes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(ycbcrHighWord(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const LaneYCbCr<U> r = ycbcrHighWord<U>(s.c0, s.c1, s.c2);
    return {r.y, r.cb, r.cr};
  }
  template <class U>
  ZEL_INLINE Trio<U> highLanes(const Trio<U>& s8) const {
    const LaneYCbCr<U> r = ycbcrHighWord<U>(s8.c0, s8.c1, s8.c2, U::template srl16<1>(s8.c0),
                                            U::template srl16<1>(s8.c1), U::template srl16<1>(s8.c2));
    return {r.y, r.cb, r.cr};
  }
};

struct RoundedFwd {
  static constexpr bool kVector = true;
  static constexpr bool kHighLanes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(ycbcrRounded(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const LaneYCbCr<U> r = ycbcrRounded<U>(s.c0, s.c1, s.c2);
    return {r.y, r.cb, r.cr};
  }
  template <class U>
  ZEL_INLINE Trio<U> highLanes(const Trio<U>& s8) const {
    const LaneYCbCr<U> r = ycbcrRounded7<U>(U::template srl16<1>(s8.c0), U::template srl16<1>(s8.c1),
                                            U::template srl16<1>(s8.c2));
    return {r.y, r.cb, r.cr};
  }
};

}  // namespace zel::lc
