// Subsampled YCbCr and YUV to RGB: the arithmetic forms and constant sets
// beyond the full-resolution ones, and every form in the split shape the
// expanding kernels use.
//
// A chroma sample serves two or four pixels unchanged, so the vector forms
// work in two steps: `chroma<U>` turns the U and V samples of a block into
// three 16-bit term lanes (one a chroma sample), the kernel spreads the terms
// over the pixels, and `combine<U>` adds each pixel's luma term and shifts.
// Every sum is a wrapping 16-bit sum, whose order does not matter, and none
// comes near a limit with 8-bit samples: the split gives the bits of the
// scalar formula (`pixel`), which states each form as written.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/vector_units.h"
#include "luma_chroma/ycbcr_lanes.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc::expand {

// ---- constant sets ----

// The pair-lane sets: luma gain and the four chroma constants taken
// positive, with the offsets of the raw form (which works on the samples
// themselves and removes both biases at once).
struct PairSet {
  int16_t luma, vToR, vToG, uToG, uToB;
  int16_t offR, offG, offB;
};
inline constexpr PairSet pairLanesA{4769, 6537, 3330, 1605, 8263, 1779, 1089, 2211};
inline constexpr PairSet pairLanesB{4768, 6537, 3330, 1606, 8262, 1783, 1085, 2214};

// Wide sets of the 709 and 4:1:1 members, 16.16 on Y and the centred u, v.
// The 4:1:1 set carries a luma gain of 76294 and a U to G of -25625: they
// are its own constants, not those of the 601 set.
inline constexpr WideSet wide709{76284, 117506, -34996, -13959, 138609, -1220544};
inline constexpr WideSet wide411{76294, 104595, -53281, -25625, 132186, -1220704};
// The HDTV members keep the luma bias: gain one, no offset.
inline constexpr WideSet wideHDTV{65536, 100925, -30081, -11993, 119013, 0};

// Forms with luma in sixteenths: chroma constants in 3.13, green taken
// positive and subtracted.
struct SixteenthsSet {
  int16_t vToR, vToG, uToG, uToB;
};
inline constexpr SixteenthsSet lanesHDTV{12616, 3760, 1499, 14877};
// The YUV members with a four-byte destination.
inline constexpr SixteenthsSet lanesYuvQuad{9338, 4759, 3227, 16646};

// ---- scalar forms ----

// L(x, c): MulHighS16(x << 7, c), that is (x times c) >> 9.
inline int16_t termL(int x, int c) { return MulHighS16(static_cast<int16_t>(x * 128), static_cast<int16_t>(c)); }

// Pair lanes on the centred samples y = Y - 16, u, v; the sums shift by 3.
inline Rgb8 pairLanesCentred(const PairSet& s, int Y, int U, int V) {
  const int16_t ly = termL(Y - 16, s.luma);
  const int u = U - 128, v = V - 128;
  const int16_t r = wrapAdd16(ly, termL(v, s.vToR));
  const int16_t g = wrapAdd16(ly, -wrapAdd16(termL(u, s.uToG), termL(v, s.vToG)));
  const int16_t b = wrapAdd16(ly, termL(u, s.uToB));
  return {SaturateU8(r >> 3), SaturateU8(g >> 3), SaturateU8(b >> 3)};
}

// Pair lanes on the raw samples, the biases removed by the set's offsets.
inline Rgb8 pairLanesRaw(const PairSet& s, int Y, int U, int V) {
  const int16_t ly = termL(Y, s.luma);
  const int16_t r = wrapAdd16(ly, wrapAdd16(termL(V, s.vToR), -s.offR));
  const int16_t g = wrapAdd16(ly, -wrapAdd16(wrapAdd16(termL(U, s.uToG), termL(V, s.vToG)), -s.offG));
  const int16_t b = wrapAdd16(ly, wrapAdd16(termL(U, s.uToB), -s.offB));
  return {SaturateU8(r >> 3), SaturateU8(g >> 3), SaturateU8(b >> 3)};
}

// Luma in sixteenths, biased (Y << 4), chroma centred, a rounding term of 8
// and a shift by 4. The sums saturate as 16-bit lanes but never reach a
// limit with 8-bit samples.
inline Rgb8 lumaSixteenths(const SixteenthsSet& s, int Y, int U, int V) {
  const int16_t y4 = static_cast<int16_t>(Y << 4);
  const int u = U - 128, v = V - 128;
  const int16_t r = AddSaturateS16(AddSaturateS16(y4, termL(v, s.vToR)), 8);
  const int16_t g = AddSaturateS16(AddSaturateS16(AddSaturateS16(y4, static_cast<int16_t>(-termL(v, s.vToG))),
                                                  static_cast<int16_t>(-termL(u, s.uToG))),
                                   8);
  const int16_t b = AddSaturateS16(AddSaturateS16(y4, termL(u, s.uToB)), 8);
  return {SaturateU8(r >> 4), SaturateU8(g >> 4), SaturateU8(b >> 4)};
}

// The wide form on the samples themselves, with offsets 57, 14 and 13
// units short of the exact centring constants, and no rounding term.
inline Rgb8 wideRaw(int Y, int U, int V) {
  return {SaturateU8((76284 * Y + 104595 * V - 14608761) >> 16),
          SaturateU8((76284 * Y - 53281 * V - 25690 * U + 8887730) >> 16),
          SaturateU8((76284 * Y + 132186 * U - 18140365) >> 16)};
}

inline Rgb8 rgbOf(const Pixel8& p) { return {p.c0, p.c1, p.c2}; }

// ---- vector helpers ----

template <class U>
ZEL_INLINE typename U::V termL(typename U::V x, int c) {
  return U::mulHighS16(U::template sll16<7>(x), U::set16(c));
}

// ---- the forms ----
//
// pixel(Y, U, V): the scalar formula.
// chroma<U>(u, v): samples 0..255 in 16-bit lanes to three term lanes.
// combine<U>(y, t): luma samples and their spread terms to the three
// channels before SaturateU8.

// The lane form, added, of the full-resolution members (k = 8).
struct LanesForm {
  LaneSet set;
  Rgb8 pixel(int Y, int U, int V) const { return laneAdded(set, Y, U, V, 8); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    const typename U::V ul = chromaLanes<U>(u), vl = chromaLanes<U>(v), k = U::set16(8);
    return {U::add16(U::mulHighS16(vl, U::set16(set.vToR)), k),
            U::add16(U::add16(U::mulHighS16(ul, U::set16(set.uToG)), U::mulHighS16(vl, U::set16(set.vToG))), k),
            U::add16(U::mulHighS16(ul, U::set16(set.uToB)), k)};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    const typename U::V ly = U::mulHighS16(lumaLanes<U>(y), U::set16(set.luma));
    return {U::template sra16<4>(U::add16(ly, t.c0)), U::template sra16<4>(U::add16(ly, t.c1)),
            U::template sra16<4>(U::add16(ly, t.c2))};
  }
};

struct PairCentredForm {
  PairSet set;
  Rgb8 pixel(int Y, int U, int V) const { return pairLanesCentred(set, Y, U, V); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    const typename U::V half = U::set16(128);
    const typename U::V uc = U::sub16(u, half), vc = U::sub16(v, half);
    return {termL<U>(vc, set.vToR), U::sub16(U::zero(), U::add16(termL<U>(uc, set.uToG), termL<U>(vc, set.vToG))),
            termL<U>(uc, set.uToB)};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    const typename U::V ly = termL<U>(U::sub16(y, U::set16(16)), set.luma);
    return {U::template sra16<3>(U::add16(ly, t.c0)), U::template sra16<3>(U::add16(ly, t.c1)),
            U::template sra16<3>(U::add16(ly, t.c2))};
  }
};

struct PairRawForm {
  PairSet set;
  Rgb8 pixel(int Y, int U, int V) const { return pairLanesRaw(set, Y, U, V); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    return {U::sub16(termL<U>(v, set.vToR), U::set16(set.offR)),
            U::sub16(U::set16(set.offG), U::add16(termL<U>(u, set.uToG), termL<U>(v, set.vToG))),
            U::sub16(termL<U>(u, set.uToB), U::set16(set.offB))};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    const typename U::V ly = termL<U>(y, set.luma);
    return {U::template sra16<3>(U::add16(ly, t.c0)), U::template sra16<3>(U::add16(ly, t.c1)),
            U::template sra16<3>(U::add16(ly, t.c2))};
  }
};

struct SixteenthsForm {
  SixteenthsSet set;
  Rgb8 pixel(int Y, int U, int V) const { return lumaSixteenths(set, Y, U, V); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    const typename U::V half = U::set16(128), round = U::set16(8);
    const typename U::V uc = U::sub16(u, half), vc = U::sub16(v, half);
    return {U::add16(termL<U>(vc, set.vToR), round),
            U::sub16(round, U::add16(termL<U>(vc, set.vToG), termL<U>(uc, set.uToG))),
            U::add16(termL<U>(uc, set.uToB), round)};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    const typename U::V y4 = U::template sll16<4>(y);
    return {U::template sra16<4>(U::add16(y4, t.c0)), U::template sra16<4>(U::add16(y4, t.c1)),
            U::template sra16<4>(U::add16(y4, t.c2))};
  }
};

// The YUV lane shape Y << 1, chroma (sample << 4) - 2048, result >> 1, with
// either YUV lane set.
struct YuvHalvesForm {
  RgbLaneSet set;
  Rgb8 pixel(int Y, int U, int V) const { return rgbOf(rgbLanesShape<1, 4, 0, 1, false>(set, Y, U, V)); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    const typename U::V half = U::set16(128);
    const typename U::V ul = U::template sll16<4>(U::sub16(u, half)), vl = U::template sll16<4>(U::sub16(v, half));
    return {U::mulHighS16(vl, U::set16(set.vToR)),
            U::add16(U::mulHighS16(ul, U::set16(set.uToG)), U::mulHighS16(vl, U::set16(set.vToG))),
            U::mulHighS16(ul, U::set16(set.uToB))};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    const typename U::V y2 = U::template sll16<1>(y);
    return {U::template sra16<1>(U::add16(y2, t.c0)), U::template sra16<1>(U::add16(y2, t.c1)),
            U::template sra16<1>(U::add16(y2, t.c2))};
  }
};

// The exact YUV wide form in 32-bit lanes: the chroma samples themselves are
// spread, and the whole form runs per pixel.
struct YuvWideForm {
  RgbWideSet set;
  RgbRounding rounding;
  Rgb8 pixel(int Y, int U, int V) const { return rgbOf(rgbWide(set, rounding, Y, U, V)); }
  template <class U>
  ZEL_INLINE Trio<U> chroma(typename U::V u, typename U::V v) const {
    return {u, v, U::zero()};
  }
  template <class U>
  ZEL_INLINE Trio<U> combine(typename U::V y, const Trio<U>& t) const {
    return rgbWide<U>(set, rounding, Trio<U>{y, t.c0, t.c1});
  }
};

// ---- scalar tails ----

// The 16.16 wide form; `round` 0 truncates, 32768 rounds.
struct WideTail {
  WideSet set;
  int32_t round;
  Rgb8 pixel(int Y, int U, int V) const { return wideForm(set, Y, U, V, round); }
};

struct RawTail {
  Rgb8 pixel(int Y, int U, int V) const { return wideRaw(Y, U, V); }
};

}  // namespace zel::lc::expand
