// Rows of the subsampling encoders: RGB sources, subsampled destinations
// (planes, a luma plane with interleaved chroma pairs, 4:2:2 pair streams)
// and the row converters that run a body form over the first N pixels and
// a tail form over the rest of the whole blocks.
//
// A body runs in vector blocks of 16 pixels (32 with AVX2), and its last
// pixels below N take the same form one block at a time in scalar code. The
// tail converts one chroma block at a time. Vector blocks read and write
// exactly the bytes of their pixels and chroma samples.
#pragma once

#include <cstdint>

#include "frame/simd.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/repack_rows.h"
#include "luma_chroma/rgb_to_sub_forms.h"
#include "luma_chroma/rgb_to_sub_units.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc::sub {

using repack::PairOrder;

// ---- sources: pixels as R, G, B whatever the memory order ----

template <class In, bool Bgr>
struct RgbSource {
  In in;
  Rgb pixel(int x) const {
    int a, b, c;
    in.pixel(x, a, b, c);
    return Bgr ? Rgb{c, b, a} : Rgb{a, b, c};
  }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    const Trio<U> t = in.template block<U>(x);
    return Bgr ? Trio<U>{t.c2, t.c1, t.c0} : t;
  }
};

template <int Stride, bool Bgr>
using PackedSource = RgbSource<PackedIn<Stride>, Bgr>;
using PlanesSource = RgbSource<PlanesIn, false>;

// ---- destinations ----
//
// `put` stores one chroma block of scalar results (the luma of its pixels
// in row order, then top row before bottom row for 4:2:0); `block` stores
// a vector block: luma bytes and `cc`, whose units hold the block's first
// chroma samples in bytes 0..7 and the second ones in bytes 8..15.

// Byte pattern that zips the two halves of a unit: c1 c2 c1 c2 ...
inline constexpr Shuffle16 kZipHalves{{0, 8, 1, 9, 2, 10, 3, 11, 4, 12, 5, 13, 6, 14, 7, 15}};
inline constexpr Shuffle16 kZipHalvesSwapped{{8, 0, 9, 1, 10, 2, 11, 3, 12, 4, 13, 5, 14, 6, 15, 7}};

// Three planes of one row, `Ratio` pixels to a chroma sample. The last
// pixel of an odd width writes its luma, and its chroma when OddChroma.
template <int Ratio, bool OddChroma = false>
struct PlanesOutSub {
  uint8_t* y;
  uint8_t* c1;
  uint8_t* c2;
  void put(int x, const uint8_t* ys, Chroma2 c) const {
    for (int i = 0; i < Ratio; ++i) y[x + i] = ys[i];
    c1[x / Ratio] = c.c1;
    c2[x / Ratio] = c.c2;
  }
  void odd(int x, const OddPixel& o) const {
    y[x] = o.y;
    if (OddChroma) {
      c1[x / Ratio] = o.c1;
      c2[x / Ratio] = o.c2;
    }
  }
  template <class U>
  ZEL_INLINE void block(int x, typename U::V yv, typename U::V cc) const {
    U::storeUnits(y + x, 16, yv);
    if constexpr (Ratio == 2)
      More<U>::storeHalves(c1 + x / 2, c2 + x / 2, 8, cc);
    else
      More<U>::storeQuarters(c1 + x / 4, c2 + x / 4, 4, cc);
  }
};

// A 4:2:2 pair stream. The last pixel of an odd width writes its luma and
// the chroma byte next to it (the first chroma of the pair in memory).
template <PairOrder O>
struct PairsOut {
  uint8_t* p;
  static constexpr repack::PairSlots kSlots = repack::slotsOf(O);
  void put(int x, const uint8_t* ys, Chroma2 c) const { repack::mergePair(ys, c.c1, c.c2, O, p + 2 * x); }
  void odd(int x, const OddPixel& o) const {
    uint8_t* q = p + 2 * x;
    q[kSlots.y0] = o.y;
    if (kSlots.cb < 2)
      q[kSlots.cb] = o.c1;
    else
      q[kSlots.cr] = o.c2;
  }
  template <class U>
  ZEL_INLINE void block(int x, typename U::V yv, typename U::V cc) const {
    const typename U::V zipped = U::shuffle8(cc, U::shuffleOf(O == PairOrder::YCrCb ? kZipHalvesSwapped : kZipHalves));
    uint8_t* q = p + 2 * x;
    if constexpr (O == PairOrder::CbYCr) {
      U::storeUnits(q, 32, U::unpackLo8(zipped, yv));
      U::storeUnits(q + 16, 32, U::unpackHi8(zipped, yv));
    } else {
      U::storeUnits(q, 32, U::unpackLo8(yv, zipped));
      U::storeUnits(q + 16, 32, U::unpackHi8(yv, zipped));
    }
  }
};

// 4:2:0 in three planes: two luma rows and one chroma row of each plane.
struct Planes420Out {
  uint8_t* y0;
  uint8_t* y1;
  uint8_t* c1;
  uint8_t* c2;
  void put(int x, const uint8_t* ys, Chroma2 c) const {
    y0[x] = ys[0];
    y0[x + 1] = ys[1];
    y1[x] = ys[2];
    y1[x + 1] = ys[3];
    c1[x / 2] = c.c1;
    c2[x / 2] = c.c2;
  }
  template <class U>
  ZEL_INLINE void block(int x, typename U::V top, typename U::V bottom, typename U::V cc) const {
    U::storeUnits(y0 + x, 16, top);
    U::storeUnits(y1 + x, 16, bottom);
    More<U>::storeHalves(c1 + x / 2, c2 + x / 2, 8, cc);
  }
};

// 4:2:0 as a luma plane and a plane of interleaved Cb, Cr pairs.
struct TwoPlane420Out {
  uint8_t* y0;
  uint8_t* y1;
  uint8_t* cbcr;
  void put(int x, const uint8_t* ys, Chroma2 c) const {
    y0[x] = ys[0];
    y0[x + 1] = ys[1];
    y1[x] = ys[2];
    y1[x + 1] = ys[3];
    cbcr[x] = c.c1;
    cbcr[x + 1] = c.c2;
  }
  template <class U>
  ZEL_INLINE void block(int x, typename U::V top, typename U::V bottom, typename U::V cc) const {
    U::storeUnits(y0 + x, 16, top);
    U::storeUnits(y1 + x, 16, bottom);
    U::storeUnits(cbcr + x, 16, U::shuffle8(cc, U::shuffleOf(kZipHalves)));
  }
};

// ---- vector blocks ----

// One row, `Ratio` pixels (2 or 4) to a chroma sample.
template <class U, int Ratio, class Body, class Src, class Out>
ZEL_INLINE int rowBlocks(const Src& in, const Out& out, int x, int end, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  for (; x + U::kPixels <= end; x += U::kPixels) {
    const Trio<U> s = in.template block<U>(x);
    const Wide16<U> r = widen<U>(s.c0), g = widen<U>(s.c1), b = widen<U>(s.c2);
    V tlo = U::zero(), thi = U::zero();
    const V ylo = body.template luma<U>(r.lo, g.lo, b.lo, tlo);
    const V yhi = body.template luma<U>(r.hi, g.hi, b.hi, thi);
    V y = U::packU8(ylo, yhi);
    V sr = M::pairSums(s.c0), sg = M::pairSums(s.c1), sb = M::pairSums(s.c2);
    V st = Body::kTerm ? M::hadd16(tlo, thi) : U::zero();
    if constexpr (Ratio == 4) {
      sr = M::hadd16(sr, sr);
      sg = M::hadd16(sg, sg);
      sb = M::hadd16(sb, sb);
    }
    V c1, c2;
    body.template chroma<U>(sr, sg, sb, st, c1, c2);
    V cc = U::packU8(c1, c2);
    if constexpr (Body::kNarrow) {
      y = M::clampNarrow(y);
      cc = M::clampNarrow(cc);
    }
    out.template block<U>(x, y, cc);
  }
  return x;
}

// A row pair of 4:2:0: chroma from the sums of 2 by 2 pixels.
template <class U, class Body, class Src, class Out>
ZEL_INLINE int pairBlocks(const Src& top, const Src& bottom, const Out& out, int x, int end, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  for (; x + U::kPixels <= end; x += U::kPixels) {
    const Trio<U> s0 = top.template block<U>(x), s1 = bottom.template block<U>(x);
    V y[2], st = U::zero();
    const Trio<U>* rows[2] = {&s0, &s1};
    for (int k = 0; k < 2; ++k) {
      const Wide16<U> r = widen<U>(rows[k]->c0), g = widen<U>(rows[k]->c1), b = widen<U>(rows[k]->c2);
      V tlo = U::zero(), thi = U::zero();
      const V ylo = body.template luma<U>(r.lo, g.lo, b.lo, tlo);
      const V yhi = body.template luma<U>(r.hi, g.hi, b.hi, thi);
      y[k] = U::packU8(ylo, yhi);
      if (Body::kTerm) st = U::add16(st, M::hadd16(tlo, thi));
    }
    const V sr = U::add16(M::pairSums(s0.c0), M::pairSums(s1.c0));
    const V sg = U::add16(M::pairSums(s0.c1), M::pairSums(s1.c1));
    const V sb = U::add16(M::pairSums(s0.c2), M::pairSums(s1.c2));
    V c1, c2;
    body.template chroma<U>(sr, sg, sb, st, c1, c2);
    V cc = U::packU8(c1, c2);
    if constexpr (Body::kNarrow) {
      y[0] = M::clampNarrow(y[0]);
      y[1] = M::clampNarrow(y[1]);
      cc = M::clampNarrow(cc);
    }
    out.template block<U>(x, y[0], y[1], cc);
  }
  return x;
}

template <int Ratio, class Body, class Src, class Out>
ZEL_AVX2 __attribute__((flatten)) int rowBlocksAvx(const Src& in, const Out& out, int end, const Body& body) {
  return rowBlocks<Avx, Ratio>(in, out, 0, end, body);
}

template <class Body, class Src, class Out>
ZEL_AVX2 __attribute__((flatten)) int pairBlocksAvx(const Src& top, const Src& bottom, const Out& out, int end,
                                                    const Body& body) {
  return pairBlocks<Avx>(top, bottom, out, 0, end, body);
}

// ---- scalar blocks ----

template <int Ratio, class Form, class Src, class Out>
inline void rowSpan(const Src& in, const Out& out, int x, int end, const Form& form) {
  for (; x < end; x += Ratio) {
    Rgb px[Ratio];
    uint8_t ys[Ratio];
    for (int i = 0; i < Ratio; ++i) {
      px[i] = in.pixel(x + i);
      ys[i] = form.luma(px[i], i & 1);
    }
    out.put(x, ys, form.chroma(px, Ratio));
  }
}

template <class Form, class Src, class Out>
inline void pairSpan(const Src& top, const Src& bottom, const Out& out, int x, int end, const Form& form) {
  for (; x < end; x += 2) {
    const Rgb px[4] = {top.pixel(x), top.pixel(x + 1), bottom.pixel(x), bottom.pixel(x + 1)};
    const uint8_t ys[4] = {form.luma(px[0], 0), form.luma(px[1], 1), form.luma(px[2], 0), form.luma(px[3], 1)};
    out.put(x, ys, form.chroma(px, 4));
  }
}

// ---- row converters ----

// Pixels [0, n) take the body, whole blocks after it the tail; with Ratio 2
// the last pixel of an odd width takes the tail's odd form. Pixels after
// the last whole block of 4:1:1 are not written.
template <int Ratio, class Body, class Tail, class Src, class Out>
inline void convertRow(const Src& in, const Out& out, int width, int n, const Body& body, const Tail& tail, bool avx2) {
  int x = 0;
  if (avx2) x = rowBlocksAvx<Ratio>(in, out, n, body);
  x = rowBlocks<Sse, Ratio>(in, out, x, n, body);
  rowSpan<Ratio>(in, out, x, n, body);
  rowSpan<Ratio>(in, out, n, width & ~(Ratio - 1), tail);
  if constexpr (Ratio == 2)
    if (width & 1) out.odd(width - 1, tail.odd(in.pixel(width - 1)));
}

// A row pair of 4:2:0; a last odd column is not written.
template <class Body, class Tail, class Src, class Out>
inline void convertPair(const Src& top, const Src& bottom, const Out& out, int width, int n, const Body& body,
                        const Tail& tail, bool avx2) {
  int x = 0;
  if (avx2) x = pairBlocksAvx(top, bottom, out, n, body);
  x = pairBlocks<Sse>(top, bottom, out, x, n, body);
  pairSpan(top, bottom, out, x, n, body);
  pairSpan(top, bottom, out, n, width & ~1, tail);
}

// ---- body lengths ----

// Blocks of 16, and one of 4 when width AND 7 is 4 or more.
inline int bodyBy16Then4(int width) { return (width & ~15) + ((width & 7) >= 4 ? 4 : 0); }
// Blocks of 8 chroma pairs, and one of 4 pairs when half the width has bit 2.
inline int bodyByHalfWidth(int width) {
  const int half = width / 2;
  return 2 * (half & ~7) + ((half & 4) ? 8 : 0);
}
// Blocks of 32, and one of 8 when width AND 15 is 8 or more.
inline int bodyBy32Then8(int width) { return (width & ~31) + ((width & 15) >= 8 ? 8 : 0); }

}  // namespace zel::lc::sub
