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

template <class U, int Rows, class Luma, class Chroma, class Out, class Form>
ZEL_INLINE int expandBlocks(const RowSet<Rows, Luma, Chroma, Out>& rows, int x, int end, const Form& form) {
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
ZEL_AVX2 __attribute__((flatten)) int expandBlocksAvx(const RowSet<Rows, Luma, Chroma, Out>& rows, int end,
                                                      const Form& form) {
  return expandBlocks<Avx>(rows, 0, end, form);
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
// The body's whole vector blocks run in AVX2 (with `avx2`) and SSE4.1, its
// last pixels one at a time in the same form.
template <int Rows, class Luma, class Chroma, class Out, class Body, class Tail>
inline void expandRow(const RowSet<Rows, Luma, Chroma, Out>& rows, int bodyEnd, int end, const Body& body,
                      const Tail& tail, bool avx2) {
  int x = 0;
  if (avx2) x = expandBlocksAvx(rows, bodyEnd, body);
  x = expandBlocks<Sse>(rows, x, bodyEnd, body);
  expandPixels(rows, x, bodyEnd, body);
  expandPixels(rows, bodyEnd, end, tail);
}

}  // namespace zel::lc::expand
