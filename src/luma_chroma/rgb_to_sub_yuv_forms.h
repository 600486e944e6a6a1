// RGB to subsampled full-range YUV: Y with no offset, U and V the scaled
// differences B - Y and R - Y of a block, taken from block sums of the
// samples and of a per-pixel luma term. The forms follow the shape of
// rgb_to_sub_forms.h: bodies with a scalar and a lane side, scalar tails.
//
//   p  = MulHighS16(R << 2, 9798) + MulHighS16(G << 2, 19235)
//        + MulHighS16(B << 2, 3736)               (twice the luma, 16-bit)
//   q  = M(R, 4899) + M(G, 9617) + M(B, 1868),    M(S, c) = MulHighRound(S << 7, c)
//                                                  (64 times the luma, 16-bit)
//   t  = 19595 R + 38470 G + 7471 B               (luma in 16.16)
//   t14, t15: the same in 2.14 and 1.15.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/rgb_to_sub_forms.h"
#include "luma_chroma/rgb_to_sub_rows.h"
#include "luma_chroma/vector_units.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc::sub {

// ---- per-pixel terms ----

inline int16_t yuvP(const Rgb& p) {
  return wrapAdd16(
      wrapAdd16(MulHighS16(static_cast<int16_t>(p.r << 2), 9798), MulHighS16(static_cast<int16_t>(p.g << 2), 19235)),
      MulHighS16(static_cast<int16_t>(p.b << 2), 3736));
}
inline int16_t yuvQ(const Rgb& p) {
  return wrapAdd16(wrapAdd16(lc::rounded(p.r, 4899), lc::rounded(p.g, 9617)), lc::rounded(p.b, 1868));
}
inline int yuvT(const Rgb& p) { return 19595 * p.r + 38470 * p.g + 7471 * p.b; }
inline int yuvT14(const Rgb& p) { return 4899 * p.r + 9617 * p.g + 1868 * p.b; }
inline int yuvT15(const Rgb& p) { return 9798 * p.r + 19235 * p.g + 3736 * p.b; }

template <class U>
ZEL_INLINE typename U::V yuvPLanes(typename U::V r, typename U::V g, typename U::V b) {
  auto l = [](typename U::V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighS16(U::template sll16<2>(s), U::set16(c)); };
  return U::add16(U::add16(l(r, 9798), l(g, 19235)), l(b, 3736));
}
template <class U>
ZEL_INLINE typename U::V yuvQLanes(typename U::V r, typename U::V g, typename U::V b) {
  auto m = [](typename U::V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighRound(U::template sll16<7>(s), U::set16(c)); };
  return U::add16(U::add16(m(r, 4899), m(g, 9617)), m(b, 1868));
}

struct TermSums {
  int r, g, b, t;
};
template <class Term>
inline TermSums termSumsOf(const Rgb* px, int n, Term term) {
  TermSums s{0, 0, 0, 0};
  for (int i = 0; i < n; ++i) {
    s.r += px[i].r;
    s.g += px[i].g;
    s.b += px[i].b;
    s.t += term(px[i]);
  }
  return s;
}

// ---- bodies ----

// Y = SaturateU8(p >> 1); chroma from the block sums of b = B << 2 and of p:
// over 2 by 2 pixels MulHighS16((sum b >> 3) - (sum p >> 2), k) + 128, over
// a pair (MulHighS16((sum b >> 1) - sum p, k) >> 1) + 128, k 16121 for U and
// 28737 for V (r = R << 2 in place of b).
template <int Pixels>
struct DifferenceBody {
  static constexpr bool kTerm = true;
  static constexpr bool kNarrow = false;
  uint8_t luma(const Rgb& p, int) const { return SaturateU8(yuvP(p) >> 1); }
  static uint8_t scaled(int sum4, int sumP, int k) {
    if constexpr (Pixels == 4)
      return SaturateU8(MulHighS16(wrapAdd16(sum4 >> 3, -(sumP >> 2)), static_cast<int16_t>(k)) + 128);
    return SaturateU8((MulHighS16(wrapAdd16(sum4 >> 1, -sumP), static_cast<int16_t>(k)) >> 1) + 128);
  }
  Chroma2 chroma(const Rgb* px, int n) const {
    const TermSums s = termSumsOf(px, n, yuvP);
    return {scaled(s.b << 2, s.t, 16121), scaled(s.r << 2, s.t, 28737)};
  }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V& term) const {
    term = yuvPLanes<U>(r, g, b);
    return U::template sra16<1>(term);
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V, typename U::V sb, typename U::V st, typename U::V& c1,
              typename U::V& c2) const {
    using V = typename U::V;
    auto scaledV = [&](V sum, int k) ZEL_LAMBDA_INLINE {
      const V four = U::template sll16<2>(sum);
      if constexpr (Pixels == 4)
        return U::add16(U::mulHighS16(U::sub16(U::template sra16<3>(four), U::template sra16<2>(st)), U::set16(k)),
                        U::set16(128));
      return U::add16(U::template sra16<1>(U::mulHighS16(U::sub16(U::template sra16<1>(four), st), U::set16(k))),
                      U::set16(128));
    };
    c1 = scaledV(sb, 16121);
    c2 = scaledV(sr, 28737);
  }
};

// Y = SaturateU8(q >> 6); chroma from sums of samples and of q, rounded
// products: over 2 by 2 pixels MulHighRound((SB << 5) - (sum q >> 1), k),
// over a pair MulHighRound(((B0 + B1) << 6) - (q0 + q1), k), then >> 6 and
// 128; k 8061 for U, 14369 for V. The 2 by 2 sum of q can pass 32767: it is
// taken unsigned, halved by a logical shift.
template <int Pixels>
struct RoundedDifferenceBody {
  static constexpr bool kTerm = true;
  static constexpr bool kNarrow = false;
  uint8_t luma(const Rgb& p, int) const { return SaturateU8(yuvQ(p) >> 6); }
  static uint8_t scaled(int sum, int sumQ, int k) {
    const int x = Pixels == 4 ? (sum << 5) - (sumQ >> 1) : (sum << 6) - sumQ;
    return SaturateU8((MulHighRound(static_cast<int16_t>(x), static_cast<int16_t>(k)) >> 6) + 128);
  }
  Chroma2 chroma(const Rgb* px, int n) const {
    const TermSums s = termSumsOf(px, n, yuvQ);
    return {scaled(s.b, s.t, 8061), scaled(s.r, s.t, 14369)};
  }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V& term) const {
    term = yuvQLanes<U>(r, g, b);
    return U::template sra16<6>(term);
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V, typename U::V sb, typename U::V st, typename U::V& c1,
              typename U::V& c2) const {
    using V = typename U::V;
    auto scaledV = [&](V sum, int k) ZEL_LAMBDA_INLINE {
      const V x = Pixels == 4 ? U::sub16(U::template sll16<5>(sum), U::template srl16<1>(st))
                              : U::sub16(U::template sll16<6>(sum), st);
      return U::add16(U::template sra16<6>(U::mulHighRound(x, U::set16(k))), U::set16(128));
    };
    c1 = scaledV(sb, 8061);
    c2 = scaledV(sr, 14369);
  }
};

// ---- tails ----

// The 15-bit form of a last odd pixel; Rounding adds 16383 to U's and
// 32767 to V's difference (the interleaved-source members).
template <bool Rounding>
inline OddPixel yuvOdd15(const Rgb& p) {
  const int t = yuvT15(p);
  const int du = ((p.b << 15) - t + (Rounding ? 16383 : 0)) >> 15;
  const int dv = ((p.r << 15) - t + (Rounding ? 32767 : 0)) >> 15;
  return {static_cast<uint8_t>(t >> 15), static_cast<uint8_t>(((du * 16121) >> 15) + 128),
          SaturateU8(((dv * 28737) >> 15) + 128)};
}

// Wide differences in 16.16: (((S << 16) - T + Half) >> 16) times k,
// >> Shift, plus 128; U stored as its low byte, V clamped. 4:2:0 blocks take
// Half 131071 and Shift 18, pairs Shift 17.
template <int Half, int Shift>
inline Chroma2 wideDifference(const TermSums& s) {
  const int du = ((s.b << 16) - s.t + Half) >> 16;
  const int dv = ((s.r << 16) - s.t + Half) >> 16;
  return {static_cast<uint8_t>(((du * 32244) >> Shift) + 128), SaturateU8(((dv * 57475) >> Shift) + 128)};
}

// 4:2:0 blocks: Y = t >> 16.
struct WideDifference420Tail {
  uint8_t luma(const Rgb& p, int) const { return static_cast<uint8_t>(yuvT(p) >> 16); }
  Chroma2 chroma(const Rgb* px, int n) const { return wideDifference<131071, 18>(termSumsOf(px, n, yuvT)); }
};

// 4:2:0 blocks in 2.14: Y = t14 >> 14; ((((S << 14) - T14) >> 14) k) >> 16.
struct Wide14Difference420Tail {
  uint8_t luma(const Rgb& p, int) const { return static_cast<uint8_t>(yuvT14(p) >> 14); }
  Chroma2 chroma(const Rgb* px, int n) const {
    const TermSums s = termSumsOf(px, n, yuvT14);
    const int du = ((s.b << 14) - s.t) >> 14, dv = ((s.r << 14) - s.t) >> 14;
    return {static_cast<uint8_t>(((du * 8061) >> 16) + 128), SaturateU8(((dv * 14369) >> 16) + 128)};
  }
};

// The 4:2:0 wide form in exact 32-bit lanes, 16 pixels of a row pair at a
// time: the same bytes as WideDifference420Tail, for the members that take
// it at every pixel. Returns the first pixel not converted.
template <class Src, class Out>
inline int wideDifference420Blocks(const Src& top, const Src& bottom, const Out& out, int x, int end) {
  const __m128i kRG = More<Sse>::pair16(19595, 19235), kBG = More<Sse>::pair16(7471, 19235);
  for (; x + 16 <= end; x += 16) {
    const Trio<Sse> s[2] = {top.template block<Sse>(x), bottom.template block<Sse>(x)};
    __m128i y[2], st[2] = {_mm_setzero_si128(), _mm_setzero_si128()};
    for (int k = 0; k < 2; ++k) {
      const Wide16<Sse> r = widen<Sse>(s[k].c0), g = widen<Sse>(s[k].c1), b = widen<Sse>(s[k].c2);
      __m128i half[2];
      for (int h = 0; h < 2; ++h) {
        const __m128i R = h ? r.hi : r.lo, G = h ? g.hi : g.lo, B = h ? b.hi : b.lo;
        // t = 19595 R + 19235 G + 7471 B + 19235 G, pixels 0..3 and 4..7.
        const __m128i t0 =
            _mm_add_epi32(_mm_madd_epi16(_mm_unpacklo_epi16(R, G), kRG), _mm_madd_epi16(_mm_unpacklo_epi16(B, G), kBG));
        const __m128i t1 =
            _mm_add_epi32(_mm_madd_epi16(_mm_unpackhi_epi16(R, G), kRG), _mm_madd_epi16(_mm_unpackhi_epi16(B, G), kBG));
        half[h] = _mm_packs_epi32(_mm_srai_epi32(t0, 16), _mm_srai_epi32(t1, 16));
        st[h] = _mm_add_epi32(st[h], _mm_hadd_epi32(t0, t1));
      }
      y[k] = _mm_packus_epi16(half[0], half[1]);
    }
    const __m128i sb = _mm_add_epi16(More<Sse>::pairSums(s[0].c2), More<Sse>::pairSums(s[1].c2));
    const __m128i sr = _mm_add_epi16(More<Sse>::pairSums(s[0].c0), More<Sse>::pairSums(s[1].c0));
    // (((S << 16) - T + 131071) >> 16) k >> 18, plus 128.
    auto scaled = [&](__m128i sums, int h, int k) {
      const __m128i s32 = _mm_cvtepi16_epi32(h ? _mm_srli_si128(sums, 8) : sums);
      const __m128i d =
          _mm_srai_epi32(_mm_add_epi32(_mm_sub_epi32(_mm_slli_epi32(s32, 16), st[h]), _mm_set1_epi32(131071)), 16);
      return _mm_add_epi32(_mm_srai_epi32(_mm_mullo_epi32(d, _mm_set1_epi32(k)), 18), _mm_set1_epi32(128));
    };
    const __m128i u = _mm_packs_epi32(scaled(sb, 0, 32244), scaled(sb, 1, 32244));
    const __m128i v = _mm_packs_epi32(scaled(sr, 0, 57475), scaled(sr, 1, 57475));
    out.template block<Sse>(x, y[0], y[1], _mm_packus_epi16(u, v));
  }
  return x;
}

// Pairs: Y = (t + LumaAddend) >> 16 and the wide differences with Half;
// the odd pixel is Odd.
template <int LumaAddend, int Half, class Odd>
struct WideDifference422Tail {
  uint8_t luma(const Rgb& p, int) const { return static_cast<uint8_t>((yuvT(p) + LumaAddend) >> 16); }
  Chroma2 chroma(const Rgb* px, int n) const { return wideDifference<Half, 17>(termSumsOf(px, n, yuvT)); }
  OddPixel odd(const Rgb& p) const { return Odd{}(p); }
};

template <bool Rounding>
struct Odd15 {
  OddPixel operator()(const Rgb& p) const { return yuvOdd15<Rounding>(p); }
};

// The rounded difference form of the full-resolution family, for a last odd
// pixel of the interleaved stream.
struct OddDifferenceRounded {
  OddPixel operator()(const Rgb& p) const {
    const lc::Pixel8 d = lc::yuvDifferenceRounded(p.r, p.g, p.b);
    return {d.c0, d.c1, d.c2};
  }
};

// The pairs after the aligned kernel's blocks: per pixel
// y = ((9798 R + 19235 G) >> 14) + ((3736 B) >> 14), Y = SaturateU8(y >> 1);
// m = (y0 + y1) >> 1, U = SaturateU8(MulHighS16(B0 + B1 - m, 16121) + 128),
// V the same with R and 28737.
struct SplitLumaPairTail {
  static int y(const Rgb& p) { return ((9798 * p.r + 19235 * p.g) >> 14) + ((3736 * p.b) >> 14); }
  uint8_t luma(const Rgb& p, int) const { return SaturateU8(y(p) >> 1); }
  Chroma2 chroma(const Rgb* px, int) const {
    const int m = (y(px[0]) + y(px[1])) >> 1;
    return {SaturateU8(MulHighS16(static_cast<int16_t>(px[0].b + px[1].b - m), 16121) + 128),
            SaturateU8(MulHighS16(static_cast<int16_t>(px[0].r + px[1].r - m), 28737) + 128)};
  }
  OddPixel odd(const Rgb& p) const { return yuvOdd15<true>(p); }
};

}  // namespace zel::lc::sub
