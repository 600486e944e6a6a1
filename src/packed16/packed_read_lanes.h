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
  static V and_(V a, V b) { return _mm_and_si128(a, b); }
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
  ZEL_AVX2 static V and_(V a, V b) { return _mm256_and_si256(a, b); }
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

template <class U>
struct Expanded {
  V<U> r, g, b;  // 8-bit expansions in 16-bit lanes
};

template <class U, class W>
inline Expanded<U> expand(V<U> w) {
  using L = typename W::Layout;
  const V<U> lo = U::and_(U::template sll16<8 - L::kLowBits>(w), U::set16(L::kLowMask << (8 - L::kLowBits)));
  const V<U> mid = U::and_(U::template srl16<L::kMidShift - (8 - L::kMidBits)>(w),
                           U::set16(L::kMidMask << (8 - L::kMidBits)));
  const V<U> top = U::and_(U::template srl16<L::kTopShift - (8 - L::kTopBits)>(w),
                           U::set16(L::kTopMask << (8 - L::kTopBits)));
  return W::kRedHigh ? Expanded<U>{top, mid, lo} : Expanded<U>{lo, mid, top};
}

// ---- forms ----

// Per pixel: luma lanes and the quantities summed for chroma.
template <class U>
struct PixelLanes {
  V<U> y;
  lc::Trio<U> q;
};
template <class U>
struct ChromaLanes {
  V<U> c1, c2;  // Cb and Cr, or U and V
};

// Studio-range YCbCr; Pixels is the count of a chroma sample (2 or 4).
template <int Pixels>
struct StudioLanes {
  template <class U>
  static PixelLanes<U> pixel(const Expanded<U>& e) {
    auto h = [](V<U> c, int w) { return U::mulHighU16(U::template sll16<8>(c), U::set16(w)); };
    const V<U> s = U::add16(U::add16(U::add16(h(e.r, kStudioYR), h(e.g, kStudioYG)), h(e.b, kStudioYB)),
                            U::set16(kStudioYAdd));
    return {U::template sra16<7>(s), {e.r, e.g, e.b}};
  }
  template <class U>
  static ChromaLanes<U> chroma(const lc::Trio<U>& sums) {
    using C = StudioChromaBody<Pixels>;
    auto h = [](V<U> c, int w) { return U::mulHighU16(U::template sll16<5>(c), U::set16(w)); };
    const V<U> add = U::set16(C::kAdd);
    const V<U> cb = U::add16(U::sub16(U::sub16(h(sums.c2, kStudioBlue), h(sums.c0, kStudioCbR)),
                                      h(sums.c1, kStudioCbG)),
                             add);
    const V<U> cr = U::add16(U::sub16(U::sub16(h(sums.c0, kStudioBlue), h(sums.c1, kStudioCrG)),
                                      h(sums.c2, kStudioCrB)),
                             add);
    return {U::template sra16<C::kShift>(cb), U::template sra16<C::kShift>(cr)};
  }
};

// Full-range YUV of 2 x 2 blocks, blue-low words: y summed with the
// expansions of red and blue.
struct YuvLanes {
  template <class U>
  static PixelLanes<U> pixel(const Expanded<U>& e) {
    auto h = [](V<U> c, int w) { return U::mulHighU16(U::template sll16<8>(c), U::set16(w)); };
    const V<U> s =
        U::add16(U::add16(U::add16(h(e.r, kYuvYR), h(e.g, kYuvYG)), h(e.b, kYuvYB)), U::set16(64));
    const V<U> y = U::template sra16<7>(s);
    return {y, {y, e.r, e.b}};
  }
  template <class U>
  static ChromaLanes<U> chroma(const lc::Trio<U>& sums) {
    const V<U> ys = U::template sll16<5>(sums.c0);
    auto c = [&](V<U> sum, int gain) {
      const V<U> d = U::sub16(U::template sll16<5>(sum), ys);
      return U::template sra16<6>(U::add16(U::mulHighS16(d, U::set16(gain)), U::set16(8224)));
    };
    return {c(sums.c2, kYuvUGain), c(sums.c1, kYuvVGain)};
  }
};

// Full-range YUV of red-low 565 words: twice the luma summed with the
// expansions times four; Pixels is the count of a chroma sample.
template <int Pixels>
struct YuvTwiceLanes {
  static constexpr int kMeanShift = Pixels == 4 ? 2 : 1;   // mean of y2
  static constexpr int kSumShift = Pixels == 4 ? 3 : 2;    // sums of R', B'
  template <class U>
  static PixelLanes<U> pixel(const Expanded<U>& e) {
    const V<U> r4 = U::template sll16<2>(e.r), g4 = U::template sll16<2>(e.g), b4 = U::template sll16<2>(e.b);
    auto h = [](V<U> c, int w) { return U::mulHighS16(c, U::set16(w)); };
    const V<U> y2 = U::add16(U::add16(h(r4, kYuvYR), h(b4, kYuvYB)), h(g4, kYuvYG));
    return {U::template sra16<1>(U::add16(y2, U::set16(1))), {y2, r4, b4}};
  }
  template <class U>
  static ChromaLanes<U> chroma(const lc::Trio<U>& sums) {
    const V<U> m = U::template sra16<kMeanShift>(sums.c0);
    auto c = [&](V<U> sum, int gain) {
      const V<U> d = U::sub16(U::template sra16<kSumShift>(sum), m);
      return U::add16(U::mulHighS16(d, U::set16(gain)), U::set16(128));
    };
    return {c(sums.c2, kYuvUGainRedLow), c(sums.c1, kYuvVGain)};
  }
};

// ---- blocks ----

// The words of one block: a = pixels 0..7, b = pixels 8..15 of each lane
// (lanes 32 bytes apart).
template <class U>
struct WordPair {
  V<U> a, b;
};
template <class U>
inline WordPair<U> loadWords(const uint16_t* p) {
  return {U::loadUnits(p, 32), U::loadUnits(p + 8, 32)};
}

template <class U>
inline lc::Trio<U> sum(const lc::Trio<U>& x, const lc::Trio<U>& y) {
  return {U::add16(x.c0, y.c0), U::add16(x.c1, y.c1), U::add16(x.c2, y.c2)};
}
// Sums of neighbouring pixels: eight pairs a lane, pixel order.
template <class U>
inline lc::Trio<U> pairSums(const lc::Trio<U>& a, const lc::Trio<U>& b) {
  return {U::hadd16(a.c0, b.c0), U::hadd16(a.c1, b.c1), U::hadd16(a.c2, b.c2)};
}

template <class U>
struct RowLanes {
  V<U> yBytes;  // 16 luma bytes a lane
  lc::Trio<U> qa, qb;
};

template <class U, class W, class Form>
inline RowLanes<U> rowLanes(const WordPair<U>& w) {
  const PixelLanes<U> a = Form::pixel(expand<U, W>(w.a)), b = Form::pixel(expand<U, W>(w.b));
  return {U::packU8(a.y, b.y), a.q, b.q};
}

// Chroma bytes of a lane: eight first-chroma bytes, then eight second.
template <class U, class Form>
inline V<U> chromaBytes(const lc::Trio<U>& sums) {
  const ChromaLanes<U> c = Form::template chroma<U>(sums);
  return U::packU8(c.c1, c.c2);
}

// One block of a row pair in 4:2:0: two luma rows, one chroma row.
template <class U>
struct Block420 {
  V<U> y0, y1, chroma;
};
template <class U, class W, class Form>
inline Block420<U> block420(const WordPair<U>& w0, const WordPair<U>& w1) {
  const RowLanes<U> t = rowLanes<U, W, Form>(w0), d = rowLanes<U, W, Form>(w1);
  return {t.yBytes, d.yBytes, chromaBytes<U, Form>(pairSums<U>(sum<U>(t.qa, d.qa), sum<U>(t.qb, d.qb)))};
}

// One block of a row: luma, and chroma of pairs (4:2:2) or of groups of
// four (4:1:1, four bytes of each chroma a lane at bytes 0 and 8).
template <class U>
struct BlockRow {
  V<U> y, chroma;
};
template <class U, class W, class Form>
inline BlockRow<U> block422(const WordPair<U>& w) {
  const RowLanes<U> t = rowLanes<U, W, Form>(w);
  return {t.yBytes, chromaBytes<U, Form>(pairSums<U>(t.qa, t.qb))};
}
template <class U, class W, class Form>
inline BlockRow<U> block411(const WordPair<U>& w) {
  const RowLanes<U> t = rowLanes<U, W, Form>(w);
  const lc::Trio<U> pairs = pairSums<U>(t.qa, t.qb);
  return {t.yBytes, chromaBytes<U, Form>(pairSums<U>(pairs, pairs))};
}

// Eight or four words in both registers of a short block (SSE): the
// results of its pixels come first in every output.
inline WordPair<SseUnit> loadShort(const uint16_t* p, int n) {
  const __m128i a = n == 8 ? load128(p) : load64(p);
  return {a, a};
}

// Y0 Cb Y1 Cr order of a lane's 16 pixels: 32 bytes, two registers.
template <class U>
inline void storePairStream(uint8_t* q, V<U> y, V<U> chroma) {
  // Cb0 Cr0 Cb1 Cr1 ... from Cb0..7 Cr0..7.
  static constexpr lc::Shuffle16 kZip = {{0, 8, 1, 9, 2, 10, 3, 11, 4, 12, 5, 13, 6, 14, 7, 15}};
  const V<U> c = U::shuffle8(chroma, U::shuffleOf(kZip));
  U::storeUnits(q, 32, U::unpackLo8(y, c));
  U::storeUnits(q + 16, 32, U::unpackHi8(y, c));
}

// ---- words to interleaved bytes ----

// 16 pixels a lane to 48 bytes: low field, green, top field.
template <class U, class L>
inline lc::Trio<U> byteChannels(const WordPair<U>& w) {
  const Expanded<U> a = expand<U, Words<L, false>>(w.a), b = expand<U, Words<L, false>>(w.b);
  return {U::packU8(a.r, b.r), U::packU8(a.g, b.g), U::packU8(a.b, b.b)};
}

}  // namespace zel::unpack
