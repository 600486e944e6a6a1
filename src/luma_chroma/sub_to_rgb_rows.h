// Rows of subsampled YCbCr and YUV, and the kernel that expands them to RGB.
//
// A luma view gives the Y sample of a pixel and, for a block of 16 pixels
// a unit, their samples in 16-bit lanes. A chroma view gives the U and V
// of a pixel's block and, for a block of pixels, the chroma samples of the
// block in 16-bit lanes, one lane a chroma sample (kSpread pixels share one).
// A 4:2:2 pair stream is both views at once. Destinations are the
// interleaved and planar writers of the full-resolution family.
//
// The kernel converts one row, or the two rows of a 4:2:0 pair that share a
// chroma row, in two zones counted from the first pixel: the body [0,
// bodyEnd) takes the body form, in vector blocks and then pixel by pixel,
// and [bodyEnd, end) takes the tail form.
#pragma once

#include <cstdint>
#include <type_traits>

#include "frame/simd.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/repack_rows.h"
#include "luma_chroma/sub_to_rgb_forms.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc::expand {

// ---- partial loads of the two vector widths ----

template <class U>
struct PartLoads;

template <>
struct PartLoads<Sse> {
  static __m128i eight(const uint8_t* p, int) { return load64(p); }
  static __m128i four(const uint8_t* p, int) { return load32(p); }
};

ZEL_TIER512_BEGIN
template <>
struct PartLoads<Avx512> {
  // Units that follow each other: one load, each unit's part moved to the
  // low bytes of its lane.
  ZEL_AVX512_VBMI static __m512i eight(const uint8_t* p, int unitStride) {
    if (unitStride == 8)
      return qwordsAt(_mm512_castsi256_si512(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(p))),
                      _mm512_setr_epi64(0, 0, 1, 1, 2, 2, 3, 3));
    const __m512i v = _mm512_inserti32x4(_mm512_castsi128_si512(load64(p)), load64(p + unitStride), 1);
    return _mm512_inserti32x4(_mm512_inserti32x4(v, load64(p + 2 * unitStride), 2), load64(p + 3 * unitStride), 3);
  }
  ZEL_AVX512_VBMI static __m512i four(const uint8_t* p, int unitStride) {
    if (unitStride == 4)
      return dwordsAt(_mm512_castsi128_si512(load128(p)),
                      _mm512_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1, 2, 2, 2, 2, 3, 3, 3, 3));
    const __m512i v = _mm512_inserti32x4(_mm512_castsi128_si512(load32(p)), load32(p + unitStride), 1);
    return _mm512_inserti32x4(_mm512_inserti32x4(v, load32(p + 2 * unitStride), 2), load32(p + 3 * unitStride), 3);
  }
};

ZEL_TIER512_END

template <>
struct PartLoads<Avx> {
  ZEL_AVX2 static __m256i eight(const uint8_t* p, int unitStride) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(load64(p)), load64(p + unitStride), 1);
  }
  ZEL_AVX2 static __m256i four(const uint8_t* p, int unitStride) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(load32(p)), load32(p + unitStride), 1);
  }
};

// Chroma samples of a block in 16-bit lanes.
template <class U>
struct ChromaLanes {
  typename U::V u, v;
};

// ---- luma ----

struct LumaRow {
  const uint8_t* p;
  int sample(int x) const { return p[x]; }
  template <class U>
  ZEL_INLINE Wide16<U> lumaBlock(int x) const {
    return widen<U>(U::loadUnits(p + x, 16));
  }
};

// ---- chroma ----

// One plane for each chroma channel; Spread pixels to a sample (2 or 4).
template <int Spread>
struct ChromaPlanes {
  static constexpr int kSpread = Spread;
  const uint8_t* cb;
  const uint8_t* cr;
  void pair(int x, int& u, int& v) const {
    u = cb[x / Spread];
    v = cr[x / Spread];
  }
  template <class U>
  ZEL_INLINE ChromaLanes<U> chromaBlock(int x) const {
    const typename U::V z = U::zero();
    const int at = x / Spread, n = 16 / Spread;
    if constexpr (Spread == 2)
      return {U::unpackLo8(PartLoads<U>::eight(cb + at, n), z), U::unpackLo8(PartLoads<U>::eight(cr + at, n), z)};
    else
      return {U::unpackLo8(PartLoads<U>::four(cb + at, n), z), U::unpackLo8(PartLoads<U>::four(cr + at, n), z)};
  }
};

// One plane of chroma pairs, Cb first or (CrFirst) Cr first.
template <bool CrFirst>
struct ChromaPairs {
  static constexpr int kSpread = 2;
  const uint8_t* p;
  void pair(int x, int& u, int& v) const {
    const uint8_t* q = p + 2 * (x >> 1);
    u = q[CrFirst ? 1 : 0];
    v = q[CrFirst ? 0 : 1];
  }
  template <class U>
  ZEL_INLINE ChromaLanes<U> chromaBlock(int x) const {
    const typename U::V b = U::loadUnits(p + x, 16);
    const typename U::V first = U::template srl16<8>(U::template sll16<8>(b)), second = U::template srl16<8>(b);
    return CrFirst ? ChromaLanes<U>{second, first} : ChromaLanes<U>{first, second};
  }
};

// ---- 4:2:2 pair streams: luma and chroma in one row ----

// Shuffles of a stream's 16 bytes (8 pixels) into 16-bit lanes: luma of
// the 8 pixels, and the 4 chroma samples of each channel into lanes 0..3
// (from the first 16 bytes) or 4..7 (from the second).
struct StreamPatterns {
  Shuffle16 luma, cbLow, cbHigh, crLow, crHigh;
  // The 4 Cb samples of 16 bytes into lanes 0..3, the 4 Cr into 4..7.
  Shuffle16 chroma;
};
constexpr StreamPatterns makeStreamPatterns(repack::PairOrder order) {
  const repack::PairSlots s = repack::slotsOf(order);
  StreamPatterns p{};
  for (int i = 0; i < 8; ++i) {
    p.luma.b[2 * i] = static_cast<int8_t>(4 * (i >> 1) + ((i & 1) ? s.y1 : s.y0));
    p.luma.b[2 * i + 1] = -1;
  }
  for (int i = 0; i < 16; ++i) p.cbLow.b[i] = p.cbHigh.b[i] = p.crLow.b[i] = p.crHigh.b[i] = -1;
  for (int j = 0; j < 4; ++j) {
    p.cbLow.b[2 * j] = static_cast<int8_t>(4 * j + s.cb);
    p.crLow.b[2 * j] = static_cast<int8_t>(4 * j + s.cr);
    p.cbHigh.b[8 + 2 * j] = static_cast<int8_t>(4 * j + s.cb);
    p.crHigh.b[8 + 2 * j] = static_cast<int8_t>(4 * j + s.cr);
    p.chroma.b[2 * j] = static_cast<int8_t>(4 * j + s.cb);
    p.chroma.b[2 * j + 1] = -1;
    p.chroma.b[8 + 2 * j] = static_cast<int8_t>(4 * j + s.cr);
    p.chroma.b[8 + 2 * j + 1] = -1;
  }
  return p;
}
template <repack::PairOrder Order>
inline constexpr StreamPatterns kStreamPatterns = makeStreamPatterns(Order);

// A pair stream row. The last pixel of an odd width takes the chroma at its
// pair's place, past the row's luma.
template <repack::PairOrder Order>
struct PairStream {
  static constexpr int kSpread = 2;
  const uint8_t* p;
  int sample(int x) const {
    const repack::PairSlots s = repack::slotsOf(Order);
    return p[4 * (x >> 1) + ((x & 1) ? s.y1 : s.y0)];
  }
  void pair(int x, int& u, int& v) const {
    const repack::PairSlots s = repack::slotsOf(Order);
    u = p[4 * (x >> 1) + s.cb];
    v = p[4 * (x >> 1) + s.cr];
  }
  template <class U>
  ZEL_INLINE Wide16<U> lumaBlock(int x) const {
    const StreamPatterns& k = kStreamPatterns<Order>;
    const uint8_t* q = p + 2 * x;
    return {U::shuffle8(U::loadUnits(q, 32), U::shuffleOf(k.luma)),
            U::shuffle8(U::loadUnits(q + 16, 32), U::shuffleOf(k.luma))};
  }
  template <class U>
  ZEL_INLINE ChromaLanes<U> chromaBlock(int x) const {
    const StreamPatterns& k = kStreamPatterns<Order>;
    const uint8_t* q = p + 2 * x;
    const typename U::V a = U::loadUnits(q, 32), b = U::loadUnits(q + 16, 32);
    return {U::or_(U::shuffle8(a, U::shuffleOf(k.cbLow)), U::shuffle8(b, U::shuffleOf(k.cbHigh))),
            U::or_(U::shuffle8(a, U::shuffleOf(k.crLow)), U::shuffle8(b, U::shuffleOf(k.crHigh)))};
  }
};

// ---- the kernel ----

// The rows of one kernel call: Rows luma rows (1, or 2 for a 4:2:0 pair)
// sharing one chroma row, and as many destination rows.
template <int Rows, class Luma, class Chroma, class Out>
struct RowSet {
  Luma luma[Rows];
  Chroma chroma;
  Out out[Rows];
};

// Terms of chroma lanes spread over the pixels: lo for pixels 0..7 of each
// unit, hi for pixels 8..15.
template <class U>
struct Spread {
  Trio<U> lo, hi;
};
template <int By, class U>
ZEL_INLINE Spread<U> spread(const Trio<U>& t) {
  auto lo = [](typename U::V v) ZEL_LAMBDA_INLINE { return U::unpackLo16(v, v); };
  auto hi = [](typename U::V v) ZEL_LAMBDA_INLINE { return U::unpackHi16(v, v); };
  if constexpr (By == 2) {
    return {{lo(t.c0), lo(t.c1), lo(t.c2)}, {hi(t.c0), hi(t.c1), hi(t.c2)}};
  } else {
    const Trio<U> d{lo(t.c0), lo(t.c1), lo(t.c2)};
    return {{lo(d.c0), lo(d.c1), lo(d.c2)}, {hi(d.c0), hi(d.c1), hi(d.c2)}};
  }
}

// ---- pair streams in one pass ----
//
// A pair stream is read once for its luma and its chroma. With AVX2 and a
// four-byte destination a block is 32 contiguous pixels whose 64 source
// bytes are loaded as two vectors with their qwords spread 0, 2 | 1, 3: the
// low lanes then hold pixels 0-3, 8-11, 16-19, 24-27 and the high lanes
// 4-7, 12-15, 20-23, 28-31, and the merged pixels come out in memory order,
// 8 to a register. Otherwise the units are those of the other blocks.

template <class U, bool Flat>
struct StreamLoad;

template <>
struct StreamLoad<Sse, false> {
  static __m128i first(const uint8_t* q) { return load128(q); }
  static __m128i second(const uint8_t* q) { return load128(q + 16); }
  static __m128i lowHalves(__m128i a, __m128i b) { return _mm_unpacklo_epi64(a, b); }
  static __m128i highHalves(__m128i a, __m128i b) { return _mm_unpackhi_epi64(a, b); }
};

template <>
struct StreamLoad<Avx, false> {
  ZEL_AVX2 static __m256i first(const uint8_t* q) { return Avx::loadUnits(q, 32); }
  ZEL_AVX2 static __m256i second(const uint8_t* q) { return Avx::loadUnits(q + 16, 32); }
  ZEL_AVX2 static __m256i lowHalves(__m256i a, __m256i b) { return _mm256_unpacklo_epi64(a, b); }
  ZEL_AVX2 static __m256i highHalves(__m256i a, __m256i b) { return _mm256_unpackhi_epi64(a, b); }
};

template <>
struct StreamLoad<Avx, true> : StreamLoad<Avx, false> {
  ZEL_AVX2 static __m256i first(const uint8_t* q) { return _mm256_permute4x64_epi64(load256(q), 0xD8); }
  ZEL_AVX2 static __m256i second(const uint8_t* q) { return _mm256_permute4x64_epi64(load256(q + 32), 0xD8); }
};

ZEL_TIER512_BEGIN
// 512-bit blocks of 64 pixels from two 64-byte loads. For the unit layout
// lane L holds pixels 16L..16L+7 of the first vector and 16L+8..16L+15 of
// the second (qwords 4L, 4L + 1 and 4L + 2, 4L + 3 of the 128 bytes). Flat:
// lane L holds pixels 4L..4L+3 and 16+4L..19+4L of each 64 bytes, and the
// four-byte pixels of a lane come out as the pixels of one 64-byte store.
template <>
struct StreamLoad<Avx512, false> {
  ZEL_AVX512_VBMI static __m512i pick(const uint8_t* q, __m512i qwords) {
    return _mm512_permutex2var_epi64(_mm512_loadu_si512(q), qwords, _mm512_loadu_si512(q + 64));
  }
  ZEL_AVX512_VBMI static __m512i first(const uint8_t* q) {
    return pick(q, _mm512_setr_epi64(0, 1, 4, 5, 8, 9, 12, 13));
  }
  ZEL_AVX512_VBMI static __m512i second(const uint8_t* q) {
    return pick(q, _mm512_setr_epi64(2, 3, 6, 7, 10, 11, 14, 15));
  }
  ZEL_AVX512_VBMI static __m512i lowHalves(__m512i a, __m512i b) { return _mm512_unpacklo_epi64(a, b); }
  ZEL_AVX512_VBMI static __m512i highHalves(__m512i a, __m512i b) { return _mm512_unpackhi_epi64(a, b); }
};

template <>
struct StreamLoad<Avx512, true> : StreamLoad<Avx512, false> {
  ZEL_AVX512_VBMI static __m512i spread(const uint8_t* q) {
    return qwordsAt(_mm512_loadu_si512(q), _mm512_setr_epi64(0, 4, 1, 5, 2, 6, 3, 7));
  }
  ZEL_AVX512_VBMI static __m512i first(const uint8_t* q) { return spread(q); }
  ZEL_AVX512_VBMI static __m512i second(const uint8_t* q) { return spread(q + 64); }
};

ZEL_TIER512_END

// Four-byte pixels of a flat block: registers of 8 pixels in memory order.
template <bool Reverse>
ZEL_AVX2 inline void storeFlat(const PackedOutAlpha<Reverse>& out, int x, const Trio<Avx>& v) {
  const __m256i first = Reverse ? v.c2 : v.c0, third = Reverse ? v.c0 : v.c2;
  const __m256i a = _mm256_set1_epi8(static_cast<char>(out.alpha));
  const __m256i lo01 = _mm256_unpacklo_epi8(first, v.c1), hi01 = _mm256_unpackhi_epi8(first, v.c1);
  const __m256i lo23 = _mm256_unpacklo_epi8(third, a), hi23 = _mm256_unpackhi_epi8(third, a);
  uint8_t* q = out.p + 4 * x;
  store256(q, _mm256_unpacklo_epi16(lo01, lo23));
  store256(q + 32, _mm256_unpackhi_epi16(lo01, lo23));
  store256(q + 64, _mm256_unpacklo_epi16(hi01, hi23));
  store256(q + 96, _mm256_unpackhi_epi16(hi01, hi23));
}

ZEL_TIER512_BEGIN
template <bool Reverse>
ZEL_AVX512_VBMI inline void storeFlat(const PackedOutAlpha<Reverse>& out, int x, const Trio<Avx512>& v) {
  const __m512i first = Reverse ? v.c2 : v.c0, third = Reverse ? v.c0 : v.c2;
  const __m512i a = _mm512_set1_epi8(static_cast<char>(out.alpha));
  const __m512i lo01 = _mm512_unpacklo_epi8(first, v.c1), hi01 = _mm512_unpackhi_epi8(first, v.c1);
  const __m512i lo23 = _mm512_unpacklo_epi8(third, a), hi23 = _mm512_unpackhi_epi8(third, a);
  uint8_t* q = out.p + 4 * x;
  _mm512_storeu_si512(q, _mm512_unpacklo_epi16(lo01, lo23));
  _mm512_storeu_si512(q + 64, _mm512_unpackhi_epi16(lo01, lo23));
  _mm512_storeu_si512(q + 128, _mm512_unpacklo_epi16(hi01, hi23));
  _mm512_storeu_si512(q + 192, _mm512_unpackhi_epi16(hi01, hi23));
}

ZEL_TIER512_END

template <class Out>
struct FlatOut : std::false_type {};
template <bool Reverse>
struct FlatOut<PackedOutAlpha<Reverse>> : std::true_type {};

template <class U, bool Flat, repack::PairOrder Order, class Out, class Form>
ZEL_INLINE int streamBlocks(const PairStream<Order>& in, const Out& out, int x, int end, const Form& form) {
  using V = typename U::V;
  using L = StreamLoad<U, Flat>;
  const StreamPatterns& k = kStreamPatterns<Order>;
  const V luma = U::shuffleOf(k.luma), chroma = U::shuffleOf(k.chroma);
  for (; x + U::kPixels <= end; x += U::kPixels) {
    const uint8_t* q = in.p + 2 * x;
    const V a = L::first(q), b = L::second(q);
    const V ca = U::shuffle8(a, chroma), cb = U::shuffle8(b, chroma);
    const Spread<U> t = spread<2, U>(form.template chroma<U>(L::lowHalves(ca, cb), L::highHalves(ca, cb)));
    const Trio<U> lo = form.template combine<U>(U::shuffle8(a, luma), t.lo);
    const Trio<U> hi = form.template combine<U>(U::shuffle8(b, luma), t.hi);
    const Trio<U> bytes{U::packU8(lo.c0, hi.c0), U::packU8(lo.c1, hi.c1), U::packU8(lo.c2, hi.c2)};
    if constexpr (Flat)
      storeFlat(out, x, bytes);
    else
      out.template block<U>(x, bytes);
  }
  return x;
}

// Luma rows and 4:2:0 or 4:2:2 chroma planes into four-byte pixels, with
// AVX2: blocks of 32 contiguous pixels laid out as the flat stream blocks
// (dwords 0, 2, 4, 6 of the luma in the low lane, 1, 3, 5, 7 in the high
// one), the chroma samples of each lane picked from 16 bytes of each plane.
template <int Rows, class Out, class Form>
ZEL_AVX2 inline int planesFlatBlocks(const RowSet<Rows, LumaRow, ChromaPlanes<2>, Out>& rows, int x, int end,
                                     const Form& form) {
  const __m256i dwords = _mm256_setr_epi32(0, 2, 4, 6, 1, 3, 5, 7);
  const __m256i pick = _mm256_setr_epi8(0, -1, 1, -1, 4, -1, 5, -1, 8, -1, 9, -1, 12, -1, 13, -1,  //
                                        2, -1, 3, -1, 6, -1, 7, -1, 10, -1, 11, -1, 14, -1, 15, -1);
  const __m256i z = _mm256_setzero_si256();
  for (; x + 32 <= end; x += 32) {
    const __m256i u = _mm256_shuffle_epi8(_mm256_broadcastsi128_si256(load128(rows.chroma.cb + x / 2)), pick);
    const __m256i v = _mm256_shuffle_epi8(_mm256_broadcastsi128_si256(load128(rows.chroma.cr + x / 2)), pick);
    const Spread<Avx> t = spread<2, Avx>(form.template chroma<Avx>(u, v));
    for (int r = 0; r < Rows; ++r) {
      const __m256i y = _mm256_permutevar8x32_epi32(load256(rows.luma[r].p + x), dwords);
      const Trio<Avx> lo = form.template combine<Avx>(_mm256_unpacklo_epi8(y, z), t.lo);
      const Trio<Avx> hi = form.template combine<Avx>(_mm256_unpackhi_epi8(y, z), t.hi);
      storeFlat(rows.out[r], x,
                Trio<Avx>{_mm256_packus_epi16(lo.c0, hi.c0), _mm256_packus_epi16(lo.c1, hi.c1),
                          _mm256_packus_epi16(lo.c2, hi.c2)});
    }
  }
  return x;
}

template <class Set>
struct PlanesFlatSet : std::false_type {};
template <int Rows, bool Reverse>
struct PlanesFlatSet<RowSet<Rows, LumaRow, ChromaPlanes<2>, PackedOutAlpha<Reverse>>> : std::true_type {};

template <class Set>
struct StreamSet : std::false_type {};
template <repack::PairOrder Order, class Out>
struct StreamSet<RowSet<1, PairStream<Order>, PairStream<Order>, Out>> : std::true_type {};

template <class U, int Rows, class Luma, class Chroma, class Out, class Form>
ZEL_INLINE int expandBlocks(const RowSet<Rows, Luma, Chroma, Out>& rowSet, int x, int end, const Form& formIn) {
  // Local copies: the destination's byte stores cannot alias them, so the
  // row pointers and the constants stay in registers across the loop.
  const RowSet<Rows, Luma, Chroma, Out> rows = rowSet;
  const Form form = formIn;
  if constexpr (StreamSet<RowSet<Rows, Luma, Chroma, Out>>::value) {
    constexpr bool kFlat = !std::is_same_v<U, Sse> && FlatOut<Out>::value;
    return streamBlocks<U, kFlat>(rows.chroma, rows.out[0], x, end, form);
  }
  if constexpr (std::is_same_v<U, Avx> && PlanesFlatSet<RowSet<Rows, Luma, Chroma, Out>>::value)
    return planesFlatBlocks(rows, x, end, form);
  for (; x + U::kPixels <= end; x += U::kPixels) {
    const ChromaLanes<U> c = rows.chroma.template chromaBlock<U>(x);
    const Spread<U> t = spread<Chroma::kSpread, U>(form.template chroma<U>(c.u, c.v));
    for (int r = 0; r < Rows; ++r) {
      const Wide16<U> y = rows.luma[r].template lumaBlock<U>(x);
      const Trio<U> lo = form.template combine<U>(y.lo, t.lo);
      const Trio<U> hi = form.template combine<U>(y.hi, t.hi);
      rows.out[r].template block<U>(x,
                                    Trio<U>{U::packU8(lo.c0, hi.c0), U::packU8(lo.c1, hi.c1), U::packU8(lo.c2, hi.c2)});
    }
  }
  return x;
}

template <int Rows, class Luma, class Chroma, class Out, class Form>
ZEL_AVX2 __attribute__((flatten)) int expandBlocksAvx(const RowSet<Rows, Luma, Chroma, Out>& rows, int x, int end,
                                                      const Form& form) {
  return expandBlocks<Avx>(rows, x, end, form);
}
template <int Rows, class Luma, class Chroma, class Out, class Form>
ZEL_AVX512_VBMI __attribute__((flatten)) int expandBlocksAvx512(const RowSet<Rows, Luma, Chroma, Out>& rows, int x,
                                                                int end, const Form& form) {
  return expandBlocks<Avx512>(rows, x, end, form);
}

template <int Rows, class Luma, class Chroma, class Out, class Form>
inline void expandPixels(const RowSet<Rows, Luma, Chroma, Out>& rows, int x, int end, const Form& form) {
  for (; x < end; ++x) {
    int u, v;
    rows.chroma.pair(x, u, v);
    for (int r = 0; r < Rows; ++r) {
      const Rgb8 p = form.pixel(rows.luma[r].sample(x), u, v);
      rows.out[r].pixel(x, p.r, p.g, p.b);
    }
  }
}

// Pixels [0, bodyEnd) take the body form, [bodyEnd, end) the tail form.
// The body's whole vector blocks run at the widest unit of the tier first
// (512-bit, then AVX2) and SSE4.1, its last pixels one at a time in the
// same form.
template <int Rows, class Luma, class Chroma, class Out, class Body, class Tail>
inline void expandRow(const RowSet<Rows, Luma, Chroma, Out>& rows, int bodyEnd, int end, const Body& body,
                      const Tail& tail, VectorTier tier) {
  int x = 0;
  if (tier >= VectorTier::Avx512) x = expandBlocksAvx512(rows, x, bodyEnd, body);
  if (tier >= VectorTier::Avx2) x = expandBlocksAvx(rows, x, bodyEnd, body);
  x = expandBlocks<Sse>(rows, x, bodyEnd, body);
  expandPixels(rows, x, bodyEnd, body);
  expandPixels(rows, bodyEnd, end, tail);
}

}  // namespace zel::lc::expand
