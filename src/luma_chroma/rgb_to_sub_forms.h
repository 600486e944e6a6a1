// RGB to subsampled video-range YCbCr: the constant sets and the forms of
// luma (one pixel) and chroma (one block of pixels). A chroma sample is
// computed from the plain sums SR, SG, SB of its block (2 pixels for 4:2:2,
// 2 by 2 for 4:2:0, 4 in a row for 4:1:1): the matrix meets summed samples,
// never per-pixel chroma.
//
// Lane forms are 16-bit arithmetic; wide forms exact 32-bit. A body form
// has a scalar side and a vector side over the units of vector_units.h,
// identical lane by lane; a tail form is scalar. Every form is a small
// struct with
//   uint8_t luma(const Rgb&, int k)      k: the pixel's place in its pair
//   Chroma2 chroma(const Rgb* px, int n) n pixels of one block
// and, for bodies, the lane versions
//   V luma<U>(r, g, b, V& term)          16-bit lanes before SaturateU8
//   void chroma<U>(sr, sg, sb, st, c1, c2)
// where st is the block sum of the per-pixel `term` (used by the YUV forms).
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/rgb_to_sub_units.h"
#include "luma_chroma/rgb_to_ycbcr_forms.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc::sub {

struct Rgb {
  int r, g, b;
};

// The two chroma samples of a block: Cb then Cr (U then V).
struct Chroma2 {
  uint8_t c1, c2;
};

struct BlockSums {
  int r, g, b;
};
inline BlockSums sumsOf(const Rgb* px, int n) {
  BlockSums s{0, 0, 0};
  for (int i = 0; i < n; ++i) {
    s.r += px[i].r;
    s.g += px[i].g;
    s.b += px[i].b;
  }
  return s;
}

// ---- constant sets ----

struct MatrixSet {
  int lumaR, lumaG, lumaB, k;              // luma lanes, (S c) >> 8 each, k before >> 7
  int cbR, cbG, cbB, crR, crG, crB;        // chroma lanes, all positive
  int wideR, wideG, wideB;                 // luma in 16.16
  int wcbR, wcbG, wcbB, wcrR, wcrG, wcrB;  // chroma in 16.16, signed
  bool narrow;                             // every result clamped to 1..254
};

inline constexpr MatrixSet set601{8422,  16515, 3212, 2112,  9699,   19071, 28770, 28770,  24117, 4653,
                                  16843, 33030, 6423, -9699, -19071, 28770, 28770, -24117, -4653, false};
inline constexpr MatrixSet set709Csc{5997,  20120, 2032, 2112,  6619,   22151, 28770, 28770,  26149, 2621,
                                     11993, 40239, 4063, -6619, -22151, 28770, 28770, -26149, -2621, false};
inline constexpr MatrixSet set709Hdtv{6980,  23429, 2359, 64,    3834,   12911, 16744, 16744,  15204, 1540,
                                      13959, 46858, 4719, -7668, -25821, 33489, 33489, -30409, -3080, true};

// The store of a result: SaturateU8, or the 1..254 clamp of the narrow set.
// Wide results of the other sets always fit, and their low byte is stored.
template <const MatrixSet& S>
inline uint8_t store(int v) {
  if constexpr (S.narrow) return static_cast<uint8_t>(v < 1 ? 1 : (v > 254 ? 254 : v));
  return SaturateU8(v);
}
template <const MatrixSet& S>
inline uint8_t storeWide(int v) {
  if constexpr (S.narrow) return store<S>(v);
  return static_cast<uint8_t>(v);
}

// ---- scalar pieces in 16-bit lane meanings ----

// (X c) >> (16 - Shift), the high word of X << Shift times unsigned c.
template <int Shift>
inline int highSum(int x, int c) {
  return MulHighU16(static_cast<uint16_t>(x << Shift), static_cast<uint16_t>(c));
}
// MulHighRound(X << 5, c) = (X c + 512) >> 10.
inline int rounded5(int x, int c) { return MulHighRound(static_cast<int16_t>(x << 5), static_cast<int16_t>(c)); }

// ---- luma forms ----

// lumaLanes: (H(R, cR) + H(G, cG) + H(B, cB) + k) >> 7.
template <const MatrixSet& S>
inline uint8_t lumaLanes(const Rgb& p) {
  const uint16_t sum =
      static_cast<uint16_t>(lc::highU(p.r, S.lumaR) + lc::highU(p.g, S.lumaG) + lc::highU(p.b, S.lumaB) + S.k);
  return store<S>(sum >> 7);
}

// lumaWide: exact 16.16 with the set's addend (16 and a half, or a half for
// the narrow set).
template <const MatrixSet& S>
inline int lumaWideSum(const Rgb& p) {
  return S.wideR * p.r + S.wideG * p.g + S.wideB * p.b;
}
template <const MatrixSet& S>
inline uint8_t lumaWide(const Rgb& p) {
  return storeWide<S>((lumaWideSum<S>(p) + (S.narrow ? 32768 : 1081344)) >> 16);
}

// lumaExactLow: high words without rounding, one shift by 8, then 16.
inline uint8_t lumaExactLow(const Rgb& p) {
  const uint16_t sum = static_cast<uint16_t>(lc::highU(p.r, 16843) + lc::highU(p.g, 33030) + lc::highU(p.b, 6423));
  return static_cast<uint8_t>((sum >> 8) + 16);
}

// lumaRounded411: the rounded products, >> 6, then 16.
inline uint8_t lumaRounded411(const Rgb& p) {
  const int16_t sum = wrapAdd16(wrapAdd16(lc::rounded(p.r, 4211), lc::rounded(p.g, 8258)), lc::rounded(p.b, 1606));
  return SaturateU8((sum >> 6) + 16);
}

// ---- chroma forms ----

// chromaLanes on block sums: the positive term minus the sum of the two
// negative ones, plus the addend, arithmetic shift. Shift is 5 (or 6 for
// pairs of the narrow set); addend and shift: 16400 >> 7 for four-pixel
// sums, 8200 >> 6 for pairs, 8224 >> 6 for the narrow set.
template <const MatrixSet& S, int Pixels>
struct ChromaLaneShape {
  static constexpr int kInShift = (S.narrow && Pixels == 2) ? 6 : 5;
  static constexpr int kAddend = S.narrow ? 8224 : (Pixels == 4 ? 16400 : 8200);
  static constexpr int kOutShift = (!S.narrow && Pixels == 4) ? 7 : 6;
};

template <const MatrixSet& S, int Pixels>
inline Chroma2 chromaLanes(const BlockSums& s) {
  using Shape = ChromaLaneShape<S, Pixels>;
  auto g = [](int x, int c) { return highSum<Shape::kInShift>(x, c); };
  const int16_t cb = wrapAdd16(wrapAdd16(g(s.b, S.cbB), -wrapAdd16(g(s.r, S.cbR), g(s.g, S.cbG))), Shape::kAddend);
  const int16_t cr = wrapAdd16(wrapAdd16(g(s.r, S.crR), -wrapAdd16(g(s.g, S.crG), g(s.b, S.crB))), Shape::kAddend);
  return {store<S>(cb >> Shape::kOutShift), store<S>(cr >> Shape::kOutShift)};
}

// Wide chroma: the 16.16 chroma rows on block sums with an addend of 128
// and one eighth of the last place, arithmetic shift; the narrow set clamps.
template <const MatrixSet& S>
inline Chroma2 chromaWide(const BlockSums& s, int cbAddend, int crAddend, int shift) {
  return {storeWide<S>((S.wcbB * s.b + S.wcbG * s.g + S.wcbR * s.r + cbAddend) >> shift),
          storeWide<S>((S.wcrR * s.r + S.wcrG * s.g + S.wcrB * s.b + crAddend) >> shift)};
}
template <const MatrixSet& S>
inline Chroma2 chromaWide420(const BlockSums& s) {
  return chromaWide<S>(s, 33587200, 33587200, 18);
}
template <const MatrixSet& S>
inline Chroma2 chromaWide422(const BlockSums& s) {
  return chromaWide<S>(s, 16793600, 16793600, 17);
}
// One pixel alone: the last of an odd width.
template <const MatrixSet& S>
inline Chroma2 chromaWideSingle(const Rgb& p) {
  return chromaWide<S>(BlockSums{p.r, p.g, p.b}, 8396800, 8396800, 16);
}
// Pairs in exact 32-bit arithmetic with a rounding half.
inline Chroma2 chromaExact422(const BlockSums& s) { return chromaWide<set601>(s, 16842752, 16842752, 17); }

// chromaRounded on four-pixel sums: rounded products of sums shifted by 5,
// combined left to right; 4:2:0 adds 128 << 6 plus 2 before the shift,
// 4:1:1 adds 128 after it.
template <bool After>
inline Chroma2 chromaRounded(const BlockSums& s) {
  const int16_t cb = wrapAdd16(wrapAdd16(rounded5(s.b, 7193), -rounded5(s.g, 4768)), -rounded5(s.r, 2425));
  const int16_t cr = wrapAdd16(wrapAdd16(rounded5(s.r, 7193), -rounded5(s.g, 6029)), -rounded5(s.b, 1163));
  if constexpr (After) return {SaturateU8((cb >> 6) + 128), SaturateU8((cr >> 6) + 128)};
  return {SaturateU8(wrapAdd16(cb, 8194) >> 6), SaturateU8(wrapAdd16(cr, 8194) >> 6)};
}

// Signed products of pair sums shifted by 6, plus 16448, >> 7.
inline Chroma2 chromaSigned422(const BlockSums& s) {
  auto l = [](int x, int c) { return MulHighS16(static_cast<int16_t>(x << 6), static_cast<int16_t>(c)); };
  const int16_t cb = wrapAdd16(wrapAdd16(wrapAdd16(l(s.b, 28770), l(s.g, -19071)), l(s.r, -9699)), 16448);
  const int16_t cr = wrapAdd16(wrapAdd16(wrapAdd16(l(s.r, 28770), l(s.g, -24117)), l(s.b, -4653)), 16448);
  return {SaturateU8(cb >> 7), SaturateU8(cr >> 7)};
}

// ---- vector pieces ----

template <class U>
ZEL_INLINE typename U::V lumaLanesV(const MatrixSet& s, typename U::V r, typename U::V g, typename U::V b) {
  using V = typename U::V;
  const V sum = U::add16(U::add16(U::add16(U::mulHighU16(U::template sll16<8>(r), U::set16(s.lumaR)),
                                           U::mulHighU16(U::template sll16<8>(g), U::set16(s.lumaG))),
                                  U::mulHighU16(U::template sll16<8>(b), U::set16(s.lumaB))),
                         U::set16(s.k));
  return U::template srl16<7>(sum);
}

template <const MatrixSet& S, int Pixels, class U>
ZEL_INLINE void chromaLanesV(typename U::V sr, typename U::V sg, typename U::V sb, typename U::V& c1, typename U::V& c2) {
  using V = typename U::V;
  using Shape = ChromaLaneShape<S, Pixels>;
  const V xr = U::template sll16<Shape::kInShift>(sr), xg = U::template sll16<Shape::kInShift>(sg),
          xb = U::template sll16<Shape::kInShift>(sb);
  auto g = [](V x, int c) ZEL_LAMBDA_INLINE { return U::mulHighU16(x, U::set16(c)); };
  const V add = U::set16(Shape::kAddend);
  c1 = U::template sra16<Shape::kOutShift>(U::add16(U::sub16(g(xb, S.cbB), U::add16(g(xr, S.cbR), g(xg, S.cbG))), add));
  c2 = U::template sra16<Shape::kOutShift>(U::add16(U::sub16(g(xr, S.crR), U::add16(g(xg, S.crG), g(xb, S.crB))), add));
}

// ---- body forms ----

// lumaLanes and chromaLanes of a set; Pixels is the block size of the sums
// (4 for 4:2:0 and 4:1:1, 2 for 4:2:2).
template <const MatrixSet& S, int Pixels>
struct LanesBody {
  static constexpr bool kTerm = false;
  static constexpr bool kNarrow = S.narrow;
  uint8_t luma(const Rgb& p, int) const { return lumaLanes<S>(p); }
  Chroma2 chroma(const Rgb* px, int n) const { return chromaLanes<S, Pixels>(sumsOf(px, n)); }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V&) const {
    return lumaLanesV<U>(S, r, g, b);
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V sg, typename U::V sb, typename U::V, typename U::V& c1,
              typename U::V& c2) const {
    chromaLanesV<S, Pixels, U>(sr, sg, sb, c1, c2);
  }
};

// lumaRounded (the rounded form at full resolution) and chromaRounded on
// four-pixel sums; After: the 4:1:1 forms, which add their offsets after
// the shift.
template <bool After>
struct RoundedBody {
  static constexpr bool kTerm = false;
  static constexpr bool kNarrow = false;
  uint8_t luma(const Rgb& p, int) const { return After ? lumaRounded411(p) : lc::ycbcrRounded(p.r, p.g, p.b).y; }
  Chroma2 chroma(const Rgb* px, int n) const { return chromaRounded<After>(sumsOf(px, n)); }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V&) const {
    using V = typename U::V;
    if constexpr (!After) return lc::ycbcrRounded<U>(r, g, b).y;
    auto m = [](V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighRound(U::template sll16<7>(s), U::set16(c)); };
    const V sum = U::add16(U::add16(m(r, 4211), m(g, 8258)), m(b, 1606));
    return U::add16(U::template sra16<6>(sum), U::set16(16));
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V sg, typename U::V sb, typename U::V, typename U::V& c1,
              typename U::V& c2) const {
    using V = typename U::V;
    auto m = [](V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighRound(U::template sll16<5>(s), U::set16(c)); };
    const V cb = U::sub16(U::sub16(m(sb, 7193), m(sg, 4768)), m(sr, 2425));
    const V cr = U::sub16(U::sub16(m(sr, 7193), m(sg, 6029)), m(sb, 1163));
    if constexpr (After) {
      c1 = U::add16(U::template sra16<6>(cb), U::set16(128));
      c2 = U::add16(U::template sra16<6>(cr), U::set16(128));
    } else {
      c1 = U::template sra16<6>(U::add16(cb, U::set16(8194)));
      c2 = U::template sra16<6>(U::add16(cr, U::set16(8194)));
    }
  }
};

// lumaExactLow and chromaExact422: the pair members with exact chroma.
struct ExactPairBody {
  static constexpr bool kTerm = false;
  static constexpr bool kNarrow = false;
  uint8_t luma(const Rgb& p, int) const { return lumaExactLow(p); }
  Chroma2 chroma(const Rgb* px, int n) const { return chromaExact422(sumsOf(px, n)); }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V&) const {
    auto h = [](typename U::V s, int c) ZEL_LAMBDA_INLINE { return U::mulHighU16(U::template sll16<8>(s), U::set16(c)); };
    const typename U::V sum = U::add16(U::add16(h(r, 16843), h(g, 33030)), h(b, 6423));
    return U::add16(U::template srl16<8>(sum), U::set16(16));
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V sg, typename U::V sb, typename U::V, typename U::V& c1,
              typename U::V& c2) const {
    c1 = dot3Shift<U, 17>(sb, sg, sr, 28770, -19071, -9699, 16842752);
    c2 = dot3Shift<U, 17>(sr, sg, sb, 28770, -24117, -4653, 16842752);
  }
};

// The CbYCr stream of the BGR members: luma lanes of the set; chroma from
// signed products of pair sums (set601) or as chromaLanes (narrow set).
template <const MatrixSet& S>
struct CbYCrBody {
  static constexpr bool kTerm = false;
  static constexpr bool kNarrow = S.narrow;
  uint8_t luma(const Rgb& p, int) const { return lumaLanes<S>(p); }
  Chroma2 chroma(const Rgb* px, int n) const {
    if constexpr (S.narrow) return chromaLanes<S, 2>(sumsOf(px, n));
    return chromaSigned422(sumsOf(px, n));
  }
  template <class U>
  ZEL_INLINE typename U::V luma(typename U::V r, typename U::V g, typename U::V b, typename U::V&) const {
    return lumaLanesV<U>(S, r, g, b);
  }
  template <class U>
  ZEL_INLINE void chroma(typename U::V sr, typename U::V sg, typename U::V sb, typename U::V, typename U::V& c1,
              typename U::V& c2) const {
    using V = typename U::V;
    if constexpr (S.narrow) {
      chromaLanesV<S, 2, U>(sr, sg, sb, c1, c2);
    } else {
      const V xr = U::template sll16<6>(sr), xg = U::template sll16<6>(sg), xb = U::template sll16<6>(sb);
      auto l = [](V x, int c) ZEL_LAMBDA_INLINE { return U::mulHighS16(x, U::set16(c)); };
      const V add = U::set16(16448);
      c1 = U::template sra16<7>(U::add16(U::add16(U::add16(l(xb, 28770), l(xg, -19071)), l(xr, -9699)), add));
      c2 = U::template sra16<7>(U::add16(U::add16(U::add16(l(xr, 28770), l(xg, -24117)), l(xb, -4653)), add));
    }
  }
};

// ---- tail forms ----

// The last pixel of an odd width: Y and both chroma values of the pixel
// alone (the destination decides which of them it stores).
struct OddPixel {
  uint8_t y, c1, c2;
};

// lumaWide and the wide chroma of a set; Pixels as in LanesBody.
template <const MatrixSet& S, int Pixels>
struct WideTail {
  uint8_t luma(const Rgb& p, int) const { return lumaWide<S>(p); }
  Chroma2 chroma(const Rgb* px, int n) const {
    return Pixels == 4 ? chromaWide420<S>(sumsOf(px, n)) : chromaWide422<S>(sumsOf(px, n));
  }
  OddPixel odd(const Rgb& p) const {
    const Chroma2 c = chromaWideSingle<S>(p);
    return {lumaWide<S>(p), c.c1, c.c2};
  }
};

// The pair members' tail: the second pixel of a pair drops the rounding
// half of lumaWide; chroma stays exact.
struct ExactPairTail {
  uint8_t luma(const Rgb& p, int k) const {
    return static_cast<uint8_t>((lumaWideSum<set601>(p) + (k ? 1048576 : 1081344)) >> 16);
  }
  Chroma2 chroma(const Rgb* px, int n) const { return chromaExact422(sumsOf(px, n)); }
  OddPixel odd(const Rgb& p) const { return WideTail<set601, 2>{}.odd(p); }
};

// The CbYCr members' tail: Cr carries an addend two units below Cb's.
template <const MatrixSet& S>
struct CbYCrTail {
  uint8_t luma(const Rgb& p, int) const { return lumaWide<S>(p); }
  Chroma2 chroma(const Rgb* px, int n) const { return chromaWide<S>(sumsOf(px, n), 16842752, 16842750, 17); }
  OddPixel odd(const Rgb& p) const { return WideTail<S, 2>{}.odd(p); }
};

}  // namespace zel::lc::sub
