// Vector blocks of the packed writers: one 16-bit lane per pixel, one word
// of output per lane. A block is 8 pixels in SSE4.1 and 16 in AVX2; both
// compute the scalar forms of packed_write_forms.h lane by lane, and blocks
// start at multiples of 8 pixels from the row's first pixel, so a row of
// dither thresholds repeats every four lanes.
//
// Sources give Y, Cb, Cr (or Y, U, V) of a block as 16-bit lanes, reading
// exactly the bytes of the block's pixels; forms turn them into clamped
// R, G, B; a reduction assembles the words.
#pragma once

#include <immintrin.h>

#include <cstdint>
#include <cstring>

#include "luma_chroma/vector_units.h"
#include "luma_chroma/ycbcr_lanes.h"
#include "luma_chroma/yuv_lanes.h"
#include "packed16/packed_write_fields.h"
#include "packed16/packed_write_forms.h"

namespace zel::pack {

using lc::Samples3;
using lc::Trio;

// ---- byte patterns ----

// A pattern moving byte `at` of a 16-byte lane into 16-bit lane i.
struct WordPattern {
  int8_t b[16];
};

// Channel c of eight three-byte pixels whose first 16 bytes are in one
// register (piece 0) and the next 8 in another (piece 1).
constexpr WordPattern triplePattern(int c, int piece) {
  WordPattern p{};
  for (int i = 0; i < 8; ++i) {
    const int at = 3 * i + c - 16 * piece;
    p.b[2 * i] = static_cast<int8_t>(at >= 0 && at < 16 ? at : -1);
    p.b[2 * i + 1] = -1;
  }
  return p;
}

// Chroma byte `offset` (1: Cb, 3: Cr) of four Y0 Cb Y1 Cr groups, each
// repeated into the two lanes of its pixel pair.
constexpr WordPattern pairChromaPattern(int offset) {
  WordPattern p{};
  for (int i = 0; i < 8; ++i) {
    p.b[2 * i] = static_cast<int8_t>(4 * (i >> 1) + offset);
    p.b[2 * i + 1] = -1;
  }
  return p;
}

inline constexpr WordPattern kTriple[3][2] = {{triplePattern(0, 0), triplePattern(0, 1)},
                                              {triplePattern(1, 0), triplePattern(1, 1)},
                                              {triplePattern(2, 0), triplePattern(2, 1)}};
inline constexpr WordPattern kPairCb = pairChromaPattern(1), kPairCr = pairChromaPattern(3);

// Four 16-bit values repeated over 64 bits.
inline int64_t repeat4(const int16_t* t, int shift) {
  uint64_t v = 0;
  for (int i = 0; i < 4; ++i) v |= uint64_t(uint16_t(t[i] >> shift)) << (16 * i);
  return int64_t(v);
}

// ---- vector units ----

struct SseWords : lc::Sse {
  static constexpr int kWords = 8;
  static V pattern(const WordPattern& p) { return load128(p.b); }
  // kWords bytes, zero-extended.
  static V bytes(const uint8_t* p) { return _mm_cvtepu8_epi16(load64(p)); }
  // kWords / 2 bytes, each into two lanes.
  static V halves(const uint8_t* p) {
    const V t = _mm_cvtepu8_epi32(load32(p));
    return _mm_or_si128(t, _mm_slli_epi32(t, 16));
  }
  // kWords / 4 bytes, each into four lanes.
  static V quarters(const uint8_t* p) {
    uint16_t two;
    std::memcpy(&two, p, 2);
    const V t = _mm_cvtepu8_epi64(_mm_cvtsi32_si128(two));
    const V u = _mm_or_si128(t, _mm_slli_epi64(t, 16));
    return _mm_or_si128(u, _mm_slli_epi64(u, 32));
  }
  // kWords three-byte pixels: 24 bytes.
  static Trio<SseWords> triples(const uint8_t* p) {
    const V a = load128(p), b = load64(p + 16);
    V c[3];
    for (int k = 0; k < 3; ++k)
      c[k] = _mm_or_si128(_mm_shuffle_epi8(a, pattern(kTriple[k][0])), _mm_shuffle_epi8(b, pattern(kTriple[k][1])));
    return {c[0], c[1], c[2]};
  }
  // kWords pixels of Y0 Cb Y1 Cr groups: 16 bytes.
  static Trio<SseWords> pairs(const uint8_t* p) {
    const V v = load128(p);
    return {_mm_and_si128(v, set16(0xff)), _mm_shuffle_epi8(v, pattern(kPairCb)), _mm_shuffle_epi8(v, pattern(kPairCr))};
  }
  static V repeated(int64_t four) { return _mm_set1_epi64x(four); }
  static V clampU8(V v) { return _mm_min_epi16(_mm_max_epi16(v, zero()), set16(255)); }
  static V greater16(V a, V b) { return _mm_cmpgt_epi16(a, b); }
  static void storeWords(uint16_t* p, V v) { store128(p, v); }
};

struct AvxWords : lc::Avx {
  static constexpr int kWords = 16;
  ZEL_AVX2 static V pattern(const WordPattern& p) { return _mm256_broadcastsi128_si256(load128(p.b)); }
  ZEL_AVX2 static V bytes(const uint8_t* p) { return _mm256_cvtepu8_epi16(load128(p)); }
  ZEL_AVX2 static V halves(const uint8_t* p) {
    return _mm256_shuffle_epi8(_mm256_broadcastq_epi64(load64(p)), _mm256_setr_epi8(
        0, -1, 0, -1, 1, -1, 1, -1, 2, -1, 2, -1, 3, -1, 3, -1, 4, -1, 4, -1, 5, -1, 5, -1, 6, -1, 6, -1, 7, -1, 7, -1));
  }
  ZEL_AVX2 static V quarters(const uint8_t* p) {
    const V t = _mm256_cvtepu8_epi64(load32(p));
    const V u = _mm256_or_si256(t, _mm256_slli_epi64(t, 16));
    return _mm256_or_si256(u, _mm256_slli_epi64(u, 32));
  }
  // Pixels 0..7 in the low 128 bits, 8..15 in the high: 48 bytes.
  ZEL_AVX2 static Trio<AvxWords> triples(const uint8_t* p) {
    const V a = _mm256_inserti128_si256(_mm256_castsi128_si256(load128(p)), load128(p + 24), 1);
    const V b = _mm256_inserti128_si256(_mm256_castsi128_si256(load64(p + 16)), load64(p + 40), 1);
    V c[3];
    for (int k = 0; k < 3; ++k)
      c[k] = _mm256_or_si256(_mm256_shuffle_epi8(a, pattern(kTriple[k][0])),
                             _mm256_shuffle_epi8(b, pattern(kTriple[k][1])));
    return {c[0], c[1], c[2]};
  }
  ZEL_AVX2 static Trio<AvxWords> pairs(const uint8_t* p) {
    const V v = load256(p);
    return {_mm256_and_si256(v, set16(0xff)), _mm256_shuffle_epi8(v, pattern(kPairCb)),
            _mm256_shuffle_epi8(v, pattern(kPairCr))};
  }
  ZEL_AVX2 static V repeated(int64_t four) { return _mm256_set1_epi64x(four); }
  ZEL_AVX2 static V clampU8(V v) { return _mm256_min_epi16(_mm256_max_epi16(v, zero()), set16(255)); }
  ZEL_AVX2 static V greater16(V a, V b) { return _mm256_cmpgt_epi16(a, b); }
  ZEL_AVX2 static void storeWords(uint16_t* p, V v) { store256(p, v); }
};

// ---- sources: one row, pixels counted from the region's first ----

// Three planes at full resolution.
struct FullPlanes {
  const uint8_t *y, *cb, *cr;
  Samples3 pixel(int x) const { return {y[x], cb[x], cr[x]}; }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return {U::bytes(y + x), U::bytes(cb + x), U::bytes(cr + x)};
  }
};

// Chroma planes of half width: pixel x takes chroma sample x >> 1.
struct HalfPlanes {
  const uint8_t *y, *cb, *cr;
  Samples3 pixel(int x) const { return {y[x], cb[x >> 1], cr[x >> 1]}; }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return {U::bytes(y + x), U::halves(cb + (x >> 1)), U::halves(cr + (x >> 1))};
  }
};

// Chroma planes of quarter width: pixel x takes chroma sample x >> 2.
struct QuarterPlanes {
  const uint8_t *y, *cb, *cr;
  Samples3 pixel(int x) const { return {y[x], cb[x >> 2], cr[x >> 2]}; }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return {U::bytes(y + x), U::quarters(cb + (x >> 2)), U::quarters(cr + (x >> 2))};
  }
};

// Interleaved three-byte pixels (Y, Cb, Cr, or B, G, R bytes).
struct Triples {
  const uint8_t* p;
  Samples3 pixel(int x) const { return {p[3 * x], p[3 * x + 1], p[3 * x + 2]}; }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return U::triples(p + 3 * x);
  }
};

// Y0 Cb Y1 Cr groups: pixel x of pair x >> 1.
struct Pairs {
  const uint8_t* p;
  Samples3 pixel(int x) const { return {p[2 * x], p[4 * (x >> 1) + 1], p[4 * (x >> 1) + 3]}; }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return U::pairs(p + 2 * x);
  }
};

// ---- forms: three samples to clamped R, G, B ----

// `sums` gives R, G, B before the clamp to 0..255, for reductions that
// saturate on their own; `lanes` clamps them.
struct YCbCrLanes {
  Rgb pixel(const Samples3& s) const { return ycbcrLaneForm(s.c0, s.c1, s.c2); }
  template <class U>
  ZEL_INLINE Trio<U> sums(const Trio<U>& s) const {
    const lc::LaneRgb<U> r = lc::laneSubtracted<U>(lc::lanes601b, lc::lumaLanes<U>(s.c0), lc::chromaLanes<U>(s.c1),
                                                   lc::chromaLanes<U>(s.c2), 0);
    return {r.r, r.g, r.b};
  }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const Trio<U> r = sums<U>(s);
    return {U::clampU8(r.c0), U::clampU8(r.c1), U::clampU8(r.c2)};
  }
};

struct YuvLanes {
  Rgb pixel(const Samples3& s) const { return yuvLaneForm(s.c0, s.c1, s.c2); }
  template <class U>
  ZEL_INLINE Trio<U> sums(const Trio<U>& s) const {
    return lc::rgbLanesShape<4, 7, 0, 4, true, U>(kYuvPackedLanes, s);
  }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    const Trio<U> r = sums<U>(s);
    return {U::clampU8(r.c0), U::clampU8(r.c1), U::clampU8(r.c2)};
  }
};

// Bytes taken as they are: the first one goes to the low field.
struct SameBytes {
  Rgb pixel(const Samples3& s) const { return {s.c0, s.c1, s.c2}; }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return s;
  }
};

// ---- reductions of a vector block ----

template <class U, int Bits>
ZEL_INLINE typename U::V truncateLanes(typename U::V c) {
  return U::template srl16<8 - Bits>(c);
}

// A field width's multiplier M and level size S in all lanes. They are
// hidden from the optimiser, which would otherwise spell some products out
// in shifts and adds, longer than the one multiplication.
template <class U, int Bits>
struct DitherConstants {
  typename U::V multiplier = U::set16(DitherLevel<Bits>::kMultiplier), size = U::set16(DitherLevel<Bits>::kSize);
  ZEL_INLINE DitherConstants() { __asm__("" : "+x"(multiplier), "+x"(size)); }
};

// q + 1 where c * 256 - q * S exceeds the threshold, from c * 256 in the
// lane: q = (c * M) >> 8 is the high half of c * 256 * M. The difference
// always fits a signed 16-bit lane, so wrapping products give it exactly.
template <class U, int Bits>
ZEL_INLINE typename U::V ditherLanes(typename U::V c256, typename U::V threshold, const DitherConstants<U, Bits>& k) {
  const typename U::V q = U::mulHighU16(c256, k.multiplier);
  const typename U::V distance = U::sub16(c256, U::mulLo16(q, k.size));
  return U::sub16(q, U::greater16(distance, threshold));
}

template <class U, class L>
ZEL_INLINE typename U::V assembleLanes(typename U::V low, typename U::V mid, typename U::V top) {
  return U::or_(U::or_(low, U::template sll16<L::kMidShift>(mid)), U::template sll16<L::kTopShift>(top));
}

// The thresholds of a row's dither: of the low and top fields, and of green.
template <class U>
struct Thresholds {
  typename U::V outer, mid;
};

// The word writer of one row: Truncating or Dithering, for unit U. A call
// may name the thresholds of another row (the other row of a 4:2:0 pair).
template <class U, class Writer>
struct RowWords;

template <class U, class L>
struct RowWords<U, Truncating<L>> {
  RowWords(const Truncating<L>&, int) {}
  static Thresholds<U> thresholds(int) { return {U::zero(), U::zero()}; }
  ZEL_INLINE typename U::V operator()(typename U::V low, typename U::V mid, typename U::V top) const {
    return assembleLanes<U, L>(truncateLanes<U, L::kLowBits>(low), truncateLanes<U, L::kMidBits>(mid),
                               truncateLanes<U, L::kTopBits>(top));
  }
  ZEL_INLINE typename U::V operator()(typename U::V low, typename U::V mid, typename U::V top,
                                      const Thresholds<U>&) const {
    return (*this)(low, mid, top);
  }
};

template <class U, class L>
struct RowWords<U, Dithering<L>> {
  Thresholds<U> own;
  DitherConstants<U, L::kLowBits> outerLevel;
  DitherConstants<U, L::kMidBits> midLevel;
  ZEL_INLINE static Thresholds<U> thresholds(int y) {
    const int16_t* row = L::kLowBits == 4 ? kDitherMatrix4[y & 3] : kDitherMatrix5[y & 3];
    return {U::repeated(repeat4(row, 0)), U::repeated(repeat4(row, L::kMidBits == 6 ? 1 : 0))};
  }
  ZEL_INLINE RowWords(const Dithering<L>&, int y) : own(thresholds(y)) {}
  ZEL_INLINE typename U::V operator()(typename U::V low, typename U::V g, typename U::V top) const {
    return (*this)(low, g, top, own);
  }
  // Colours before or after their clamp: the unsigned packs saturate them
  // to bytes, and unpacking the bytes above zeros gives each as c * 256.
  ZEL_INLINE typename U::V operator()(typename U::V low, typename U::V g, typename U::V top,
                                      const Thresholds<U>& t) const {
    const typename U::V outerBytes = U::packU8(low, top), greenBytes = U::packU8(g, g);
    static_assert(L::kLowBits == L::kTopBits, "the low and top fields share their width");
    return assembleLanes<U, L>(ditherLanes<U, L::kLowBits>(U::unpackLo8(U::zero(), outerBytes), t.outer, outerLevel),
                               ditherLanes<U, L::kMidBits>(U::unpackLo8(U::zero(), greenBytes), t.mid, midLevel),
                               ditherLanes<U, L::kTopBits>(U::unpackHi8(U::zero(), outerBytes), t.outer, outerLevel));
  }
};

// One block's words from its samples: dithering reductions saturate the
// form's sums themselves, truncating ones take the clamped colours.
template <class U, class Form, class Writer>
ZEL_INLINE typename U::V wordsOfBlock(const Trio<U>& samples, const Form& form, const Writer& writer,
                                const RowWords<U, Writer>& words) {
  Trio<U> c;
  if constexpr (Writer::kDither) c = form.template sums<U>(samples);
  else c = form.template lanes<U>(samples);
  const typename U::V low = writer.redHigh ? c.c2 : c.c0, top = writer.redHigh ? c.c0 : c.c2;
  return words(low, c.c1, top);
}

// ---- the block loop ----

// Blocks of U::kWords pixels from x while they fit below `end`; returns
// where it stopped.
template <class U, class Src, class Form, class Writer>
ZEL_INLINE int wordBlocks(const Src& src, const Form& form, const Writer& writer, int y, uint16_t* dst, int x, int end) {
  const RowWords<U, Writer> words(writer, y);
  // Copies that no store into the row can reach.
  const Src row = src;
  const Writer target = writer;
  for (; x + U::kWords <= end; x += U::kWords)
    U::storeWords(dst + x, wordsOfBlock<U>(row.template block<U>(x), form, target, words));
  return x;
}

template <class Src, class Form, class Writer>
ZEL_AVX2 __attribute__((flatten)) int wordBlocksAvx(const Src& src, const Form& form, const Writer& writer, int y,
                                                    uint16_t* dst, int end) {
  return wordBlocks<AvxWords>(src, form, writer, y, dst, 0, end);
}

// ---- 4:2:0 row pairs ----

// The chroma part of the YCbCr lane form, shared by the two rows of a pair:
// the R and B products, and the two green products added, which 16-bit
// wrapping makes the same as subtracting them one after the other.
template <class U>
struct ChromaTerms {
  typename U::V r, g, b;
};

template <class U>
ZEL_INLINE ChromaTerms<U> ycbcrChromaTerms(typename U::V cb, typename U::V cr) {
  const lc::LaneSet& s = lc::lanes601b;
  const typename U::V ul = lc::chromaLanes<U>(cb), vl = lc::chromaLanes<U>(cr);
  return {U::mulHighS16(vl, U::set16(s.vToR)),
          U::add16(U::mulHighS16(vl, U::set16(int16_t(-s.vToG))), U::mulHighS16(ul, U::set16(int16_t(-s.uToG)))),
          U::mulHighS16(ul, U::set16(s.uToB))};
}

// One row's words of a block from its luma samples and the pair's terms:
// R, G, B sums as YCbCrLanes gives them (no rounding term), clamped for the
// truncating writers.
template <class U, class Writer>
ZEL_INLINE typename U::V pairRowWords(typename U::V y, const ChromaTerms<U>& t, const Writer& writer,
                                      const RowWords<U, Writer>& words, const Thresholds<U>& thresholds) {
  const typename U::V luma = U::mulHighS16(lc::lumaLanes<U>(y), U::set16(lc::lanes601b.luma));
  typename U::V r = U::template sra16<4>(U::add16(luma, t.r)), g = U::template sra16<4>(U::sub16(luma, t.g)),
                b = U::template sra16<4>(U::add16(luma, t.b));
  if constexpr (!Writer::kDither) {
    r = U::clampU8(r);
    g = U::clampU8(g);
    b = U::clampU8(b);
  }
  return writer.redHigh ? words(b, g, r, thresholds) : words(r, g, b, thresholds);
}

// Blocks of both rows of a pair (rows y and y + 1, one chroma row) from x
// while they fit below `end`; returns where it stopped.
template <class U, class Writer>
ZEL_INLINE int pairBlocks(const HalfPlanes& upper, const HalfPlanes& lower, const Writer& writer, int y,
                          uint16_t* dstTop, uint16_t* dstBottom, int x, int end) {
  // One set of level constants; each row its thresholds.
  const RowWords<U, Writer> words(writer, y);
  const Thresholds<U> top = RowWords<U, Writer>::thresholds(y), bottom = RowWords<U, Writer>::thresholds(y + 1);
  const HalfPlanes a = upper, b = lower;
  const Writer target = writer;
  for (; x + U::kWords <= end; x += U::kWords) {
    const ChromaTerms<U> t = ycbcrChromaTerms<U>(U::halves(a.cb + (x >> 1)), U::halves(a.cr + (x >> 1)));
    U::storeWords(dstTop + x, pairRowWords<U>(U::bytes(a.y + x), t, target, words, top));
    U::storeWords(dstBottom + x, pairRowWords<U>(U::bytes(b.y + x), t, target, words, bottom));
  }
  return x;
}

template <class Writer>
ZEL_AVX2 __attribute__((flatten)) int pairBlocksAvx(const HalfPlanes& top, const HalfPlanes& bottom,
                                                    const Writer& writer, int y, uint16_t* dstTop,
                                                    uint16_t* dstBottom, int end) {
  return pairBlocks<AvxWords>(top, bottom, writer, y, dstTop, dstBottom, 0, end);
}

// Pixels [x, end) one at a time through a scalar form.
template <class Src, class FormFn, class Writer>
inline void wordPixels(const Src& src, FormFn form, const Writer& writer, int y, uint16_t* dst, int x, int end) {
  for (; x < end; ++x) dst[x] = writer.word(form(src.pixel(x)), x, y);
}

// Pixels [0, end) of row y by one form: AVX2 blocks when `avx2`, SSE4.1
// blocks, then the last pixels one by one.
template <class Src, class Form, class Writer>
inline void formRun(const Src& src, const Form& form, const Writer& writer, int y, uint16_t* dst, int end, bool avx2) {
  int x = 0;
  if (avx2) x = wordBlocksAvx(src, form, writer, y, dst, end);
  x = wordBlocks<SseWords>(src, form, writer, y, dst, x, end);
  wordPixels(src, [&](const Samples3& s) { return form.pixel(s); }, writer, y, dst, x, end);
}

// Pixels [0, end) of rows y and y + 1 of a 4:2:0 YCbCr pair by the lane
// form: AVX2 blocks when `avx2`, SSE4.1 blocks, then the last pixels of each
// row one by one.
template <class Writer>
inline void ycbcrPairRun(const HalfPlanes& top, const HalfPlanes& bottom, const Writer& writer, int y,
                         uint16_t* dstTop, uint16_t* dstBottom, int end, bool avx2) {
  int x = 0;
  if (avx2) x = pairBlocksAvx(top, bottom, writer, y, dstTop, dstBottom, end);
  x = pairBlocks<SseWords>(top, bottom, writer, y, dstTop, dstBottom, x, end);
  const YCbCrLanes form;
  wordPixels(top, [&](const Samples3& s) { return form.pixel(s); }, writer, y, dstTop, x, end);
  wordPixels(bottom, [&](const Samples3& s) { return form.pixel(s); }, writer, y + 1, dstBottom, x, end);
}

}  // namespace zel::pack
