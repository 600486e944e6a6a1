// Vector forms of the readers of packed words, over the units of
// luma_chroma/vector_units.h: Sse (one 128-bit register) or Avx (two
// 128-bit lanes). A block is 16 pixels a lane: two registers of eight words,
// `a` with pixels 0..7 and `b` with pixels 8..15 of each lane, so that a
// byte pack of a and b yields the lane's 16 results in pixel order and a
// horizontal add of a and b the lane's eight pair sums in order. Every
// operation stays inside a 128-bit lane: both widths compute the same bits.
//
// Forms give, per pixel, the luma lanes and three quantities that are summed
// over the pixels of a chroma sample, and per sample the two chroma lanes;
// all lanes are 16-bit values before SaturateU8 (the byte pack).
#pragma once

#include <cstdint>
#include <cstring>

#include "luma_chroma/vector_units.h"
#include "packed16/packed_fields.h"
#include "packed16/packed_read_formulas.h"

namespace zel::unpack {

// The units, with the few operations the readers add.
struct SseUnit : lc::Sse {
  static V hadd16(V a, V b) { return _mm_hadd_epi16(a, b); }
  // Chroma bytes: `v` holds a lane's eight Cb bytes, then its eight Cr
  // bytes.
  static void storeHalves(uint8_t* cb, uint8_t* cr, V v) {
    store64(cb, v);
    store64(cr, _mm_srli_si128(v, 8));
  }
  // A lane's four Cb bytes at 0 and four Cr bytes at 8.
  static void storeQuarters(uint8_t* cb, uint8_t* cr, V v) {
    const int32_t c = _mm_cvtsi128_si32(v), d = _mm_extract_epi32(v, 2);
    std::memcpy(cb, &c, 4);
    std::memcpy(cr, &d, 4);
  }
};

struct AvxUnit : lc::Avx {
  ZEL_AVX2 static V hadd16(V a, V b) { return _mm256_hadd_epi16(a, b); }
  ZEL_AVX2 static void storeHalves(uint8_t* cb, uint8_t* cr, V v) {
    const V q = _mm256_permute4x64_epi64(v, _MM_SHUFFLE(3, 1, 2, 0));  // Cb of both lanes | Cr of both
    store128(cb, _mm256_castsi256_si128(q));
    store128(cr, _mm256_extracti128_si256(q, 1));
  }
  ZEL_AVX2 static void storeQuarters(uint8_t* cb, uint8_t* cr, V v) {
    const V q = _mm256_permutevar8x32_epi32(v, _mm256_setr_epi32(0, 4, 2, 6, 1, 3, 5, 7));
    const __m128i lo = _mm256_castsi256_si128(q);
    store64(cb, lo);
    store64(cr, _mm_srli_si128(lo, 8));
  }
};

template <class U>
using V = typename U::V;

// ---- words to expansions ----

// Layout L with red in the top field when RedHigh (BGR names).
template <class L, bool RedHigh>
struct Words {
  using Layout = L;
  static constexpr bool kRedHigh = RedHigh;
};

// The 8-bit expansions of the fields in 16-bit lanes. Results leave the
// helpers through references: aggregates of 256-bit values would go
// through memory.
template <class U, class W>
ZEL_INLINE void expand(V<U> w, V<U>& r, V<U>& g, V<U>& b) {
  using L = typename W::Layout;
  const V<U> lo = U::and_(U::template sll16<8 - L::kLowBits>(w), U::set16(L::kLowMask << (8 - L::kLowBits)));
  g = U::and_(U::template srl16<L::kMidShift - (8 - L::kMidBits)>(w), U::set16(L::kMidMask << (8 - L::kMidBits)));
  const V<U> top =
      U::and_(U::template srl16<L::kTopShift - (8 - L::kTopBits)>(w), U::set16(L::kTopMask << (8 - L::kTopBits)));
  r = W::kRedHigh ? top : lo;
  b = W::kRedHigh ? lo : top;
}

// ---- forms ----
//
// pixel(r, g, b -> y, q0, q1, q2): luma lanes and the three quantities that
// are summed over the pixels of a chroma sample; chroma(sums -> c1, c2).

// MulHighU16(c << N, k) and MulHighS16(c, k).
template <class U, int N>
ZEL_INLINE V<U> highU(V<U> c, int k) {
  return U::mulHighU16(U::template sll16<N>(c), U::set16(k));
}
template <class U>
ZEL_INLINE V<U> highS(V<U> c, int k) {
  return U::mulHighS16(c, U::set16(k));
}

// Studio-range YCbCr; Pixels is the count of a chroma sample (2 or 4).
template <int Pixels>
struct StudioLanes {
  template <class U>
  ZEL_INLINE static void pixel(V<U> r, V<U> g, V<U> b, V<U>& y, V<U>& q0, V<U>& q1, V<U>& q2) {
    const V<U> s =
        U::add16(U::add16(U::add16(highU<U, 8>(r, kStudioYR), highU<U, 8>(g, kStudioYG)), highU<U, 8>(b, kStudioYB)),
                 U::set16(kStudioYAdd));
    y = U::template sra16<7>(s);
    q0 = r;
    q1 = g;
    q2 = b;
  }
  template <class U>
  ZEL_INLINE static void chroma(V<U> rs, V<U> gs, V<U> bs, V<U>& cb, V<U>& cr) {
    using C = StudioChromaBody<Pixels>;
    const V<U> add = U::set16(C::kAdd);
    cb = U::template sra16<C::kShift>(U::add16(
        U::sub16(U::sub16(highU<U, 5>(bs, kStudioBlue), highU<U, 5>(rs, kStudioCbR)), highU<U, 5>(gs, kStudioCbG)),
        add));
    cr = U::template sra16<C::kShift>(U::add16(
        U::sub16(U::sub16(highU<U, 5>(rs, kStudioBlue), highU<U, 5>(gs, kStudioCrG)), highU<U, 5>(bs, kStudioCrB)),
        add));
  }
};

// Full-range YUV of 2 x 2 blocks, blue-low words: y summed with the
// expansions of blue and red.
struct YuvLanes {
  template <class U>
  ZEL_INLINE static void pixel(V<U> r, V<U> g, V<U> b, V<U>& y, V<U>& q0, V<U>& q1, V<U>& q2) {
    const V<U> s = U::add16(U::add16(U::add16(highU<U, 8>(r, kYuvYR), highU<U, 8>(g, kYuvYG)), highU<U, 8>(b, kYuvYB)),
                            U::set16(64));
    y = U::template sra16<7>(s);
    q0 = y;
    q1 = b;
    q2 = r;
  }
  // (MulHighS16((sum << 5) - (Ys << 5), gain) + 8224) >> 6
  template <class U>
  ZEL_INLINE static V<U> difference(V<U> sum, V<U> ys32, int gain) {
    const V<U> d = U::sub16(U::template sll16<5>(sum), ys32);
    return U::template sra16<6>(U::add16(highS<U>(d, gain), U::set16(8224)));
  }
  template <class U>
  ZEL_INLINE static void chroma(V<U> ys, V<U> bs, V<U> rs, V<U>& u, V<U>& v) {
    const V<U> ys32 = U::template sll16<5>(ys);
    u = difference<U>(bs, ys32, kYuvUGain);
    v = difference<U>(rs, ys32, kYuvVGain);
  }
};

// Full-range YUV of red-low 565 words: twice the luma summed with the
// expansions times four; Pixels is the count of a chroma sample.
template <int Pixels>
struct YuvTwiceLanes {
  static constexpr int kMeanShift = Pixels == 4 ? 2 : 1;  // mean of y2
  static constexpr int kSumShift = Pixels == 4 ? 3 : 2;   // sums of B', R'
  template <class U>
  ZEL_INLINE static void pixel(V<U> r, V<U> g, V<U> b, V<U>& y, V<U>& q0, V<U>& q1, V<U>& q2) {
    q1 = U::template sll16<2>(b);
    q2 = U::template sll16<2>(r);
    q0 = U::add16(U::add16(highS<U>(q2, kYuvYR), highS<U>(q1, kYuvYB)), highS<U>(U::template sll16<2>(g), kYuvYG));
    y = U::template sra16<1>(U::add16(q0, U::set16(1)));
  }
  // MulHighS16(mean - m, gain) + 128
  template <class U>
  ZEL_INLINE static V<U> difference(V<U> sum, V<U> m, int gain) {
    return U::add16(highS<U>(U::sub16(U::template sra16<kSumShift>(sum), m), gain), U::set16(128));
  }
  template <class U>
  ZEL_INLINE static void chroma(V<U> y2s, V<U> bs, V<U> rs, V<U>& u, V<U>& v) {
    const V<U> m = U::template sra16<kMeanShift>(y2s);
    u = difference<U>(bs, m, kYuvUGainRedLow);
    v = difference<U>(rs, m, kYuvVGain);
  }
};

// ---- blocks ----
//
// Words of a block: wa holds pixels 0..7 and wb pixels 8..15 of each lane
// (U::loadUnits(p, 32) and U::loadUnits(p + 8, 32)).

template <class U>
ZEL_INLINE V<U> loadLanes(const uint16_t* p) {
  return U::loadUnits(p, 32);
}

// Eight pixels a lane: luma lanes and the quantities to sum.
template <class U, class W, class Form>
ZEL_INLINE void halfBlock(V<U> w, V<U>& y, V<U>& q0, V<U>& q1, V<U>& q2) {
  V<U> r, g, b;
  expand<U, W>(w, r, g, b);
  Form::template pixel<U>(r, g, b, y, q0, q1, q2);
}

// Chroma bytes of a lane from its sums: eight first-chroma bytes, then
// eight second.
template <class U, class Form>
ZEL_INLINE V<U> chromaBytes(V<U> s0, V<U> s1, V<U> s2) {
  V<U> c1, c2;
  Form::template chroma<U>(s0, s1, s2, c1, c2);
  return U::packU8(c1, c2);
}

// A block of a 4:2:0 row pair: luma bytes of both rows, chroma of the
// 2 x 2 groups (horizontal adds give eight pair sums a lane in order).
template <class U, class W, class Form>
ZEL_INLINE void block420(V<U> wa0, V<U> wb0, V<U> wa1, V<U> wb1, V<U>& y0, V<U>& y1, V<U>& chroma) {
  V<U> ya, yb, a0, a1, a2, b0, b1, b2, c0, c1, c2, d0, d1, d2;
  halfBlock<U, W, Form>(wa0, ya, a0, a1, a2);
  halfBlock<U, W, Form>(wb0, yb, b0, b1, b2);
  y0 = U::packU8(ya, yb);
  halfBlock<U, W, Form>(wa1, ya, c0, c1, c2);
  halfBlock<U, W, Form>(wb1, yb, d0, d1, d2);
  y1 = U::packU8(ya, yb);
  chroma =
      chromaBytes<U, Form>(U::hadd16(U::add16(a0, c0), U::add16(b0, d0)), U::hadd16(U::add16(a1, c1), U::add16(b1, d1)),
                           U::hadd16(U::add16(a2, c2), U::add16(b2, d2)));
}

// A block of one row: luma bytes, chroma of pairs (Group 2) or of groups
// of four (Group 4: four bytes of each chroma a lane, at bytes 0 and 8).
template <int Group, class U, class W, class Form>
ZEL_INLINE void blockRow(V<U> wa, V<U> wb, V<U>& y, V<U>& chroma) {
  V<U> ya, yb, a0, a1, a2, b0, b1, b2;
  halfBlock<U, W, Form>(wa, ya, a0, a1, a2);
  halfBlock<U, W, Form>(wb, yb, b0, b1, b2);
  y = U::packU8(ya, yb);
  V<U> s0 = U::hadd16(a0, b0), s1 = U::hadd16(a1, b1), s2 = U::hadd16(a2, b2);
  if constexpr (Group == 4) {
    s0 = U::hadd16(s0, s0);
    s1 = U::hadd16(s1, s1);
    s2 = U::hadd16(s2, s2);
  }
  chroma = chromaBytes<U, Form>(s0, s1, s2);
}

// Eight or four words of a short block (SSE), in both halves: the
// results of its pixels come first in every output.
ZEL_INLINE __m128i loadShort(const uint16_t* p, int n) { return n == 8 ? load128(p) : load64(p); }

// Y0 Cb Y1 Cr order of a lane's 16 pixels: 32 bytes, two registers.
template <class U>
ZEL_INLINE void storePairStream(uint8_t* q, V<U> y, V<U> chroma) {
  // Cb0 Cr0 Cb1 Cr1 ... from Cb0..7 Cr0..7.
  static constexpr lc::Shuffle16 kZip = {{0, 8, 1, 9, 2, 10, 3, 11, 4, 12, 5, 13, 6, 14, 7, 15}};
  const V<U> c = U::shuffle8(chroma, U::shuffleOf(kZip));
  U::storeUnits(q, 32, U::unpackLo8(y, c));
  U::storeUnits(q + 16, 32, U::unpackHi8(y, c));
}

// ---- words to interleaved bytes ----

// 16 pixels a lane: the bytes of the low field, green, the top field.
template <class U, class L>
ZEL_INLINE void byteChannels(V<U> wa, V<U> wb, V<U>& c0, V<U>& c1, V<U>& c2) {
  V<U> ra, ga, ba, rb, gb, bb;
  expand<U, Words<L, false>>(wa, ra, ga, ba);
  expand<U, Words<L, false>>(wb, rb, gb, bb);
  c0 = U::packU8(ra, rb);
  c1 = U::packU8(ga, gb);
  c2 = U::packU8(ba, bb);
}

}  // namespace zel::unpack
