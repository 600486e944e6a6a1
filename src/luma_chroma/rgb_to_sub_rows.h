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
#include <type_traits>

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

// ---- pixels as four-byte quads ----
//
// The 4:2:0 bodies of interleaved sources also run on pixels taken as
// four-byte quads, four pixels to a 16-byte vector (a three-byte row is
// spread into quads by byte shuffles), without splitting a block into
// channel planes. Luma: 16-bit lanes hold channels 0 and 2 of a pixel, or
// channel 1 and nothing, each shifted left by 8; the body's product of each
// lane with its channel's constant is summed over the two lanes of a pixel
// and then over the two vectors. Chroma: byte shuffles put the same channel
// of neighbouring pixels side by side and a multiply-add by 32 sums them,
// already shifted left by 5 as the chroma forms take them.
// Every sum is a 16-bit lane sum, which wraps alike in any order, so the
// bytes are those of the plane form.

template <class B, class = void>
struct TakesQuads : std::false_type {};
template <class B>
struct TakesQuads<B, std::void_t<decltype(B::kQuads)>> : std::bool_constant<B::kQuads> {};

// Bytes of a quad vector for the chroma sums: channel c of pixels 0, 1 and
// of pixels 2, 3 side by side, for c = 0, 1, 2; the pixels of a quad start
// at byte `at` of a source vector and lie `size` bytes apart.
constexpr Shuffle16 quadPairBytes(int at, int size) {
  Shuffle16 p{};
  for (int i = 0; i < 16; ++i) p.b[i] = -1;
  for (int c = 0; c < 3; ++c)
    for (int i = 0; i < 4; ++i) p.b[4 * c + i] = static_cast<int8_t>(at + size * i + c);
  return p;
}
// Channel c0 and c2 of each pixel (Second: channel 1 alone) in the high
// bytes of 16-bit lanes.
constexpr Shuffle16 quadLumaBytes(int at, bool second) {
  Shuffle16 p{};
  for (int i = 0; i < 16; ++i) p.b[i] = -1;
  for (int i = 0; i < 4; ++i) {
    p.b[4 * i + 1] = static_cast<int8_t>(at + 3 * i + (second ? 1 : 0));
    if (!second) p.b[4 * i + 3] = static_cast<int8_t>(at + 3 * i + 2);
  }
  return p;
}
inline constexpr Shuffle16 kQuadPairs4 = quadPairBytes(0, 4);
inline constexpr Shuffle16 kQuadPairs3[2] = {quadPairBytes(0, 3), quadPairBytes(4, 3)};
inline constexpr Shuffle16 kQuadLuma3[2][2] = {{quadLumaBytes(0, false), quadLumaBytes(0, true)},
                                               {quadLumaBytes(4, false), quadLumaBytes(4, true)}};

// The quads of a block of 16 pixels a unit: luma lanes (lo: channels 0, 2;
// hi: channel 1) and the sums of neighbouring pixels' channels.
template <class U>
struct Quads {
  typename U::V lo[4], hi[4], pairs[4];
};

template <class U>
ZEL_INLINE Quads<U> quadsOf(const PackedIn<4>& in, int x) {
  using V = typename U::V;
  using M = More<U>;
  Quads<U> q;
  const V high = U::set16(0xFF00), pairs = U::shuffleOf(kQuadPairs4);
  for (int k = 0; k < 4; ++k) {
    const V c = U::loadUnits(in.p + 4 * x + 16 * k, 64);
    q.lo[k] = U::template sll16<8>(c);
    q.hi[k] = M::and_(c, high);
    q.pairs[k] = M::pairSums32(U::shuffle8(c, pairs));
  }
  return q;
}

template <class U>
ZEL_INLINE Quads<U> quadsOf(const PackedIn<3>& in, int x) {
  using V = typename U::V;
  using M = More<U>;
  const uint8_t* p = in.p + 3 * x;
  const V a = U::loadUnits(p, 48), b = U::loadUnits(p + 16, 48), c = U::loadUnits(p + 32, 48);
  // Quads 0..3 start at bytes 0, 12, 24, 36: at byte 0 of a, of b:a from
  // 12, of c:b from 8, and at byte 4 of c.
  const V src[4] = {a, M::template alignr<12>(b, a), M::template alignr<8>(c, b), c};
  Quads<U> q;
  for (int k = 0; k < 4; ++k) {
    const int at = k == 3 ? 1 : 0;
    q.lo[k] = U::shuffle8(src[k], U::shuffleOf(kQuadLuma3[at][0]));
    q.hi[k] = U::shuffle8(src[k], U::shuffleOf(kQuadLuma3[at][1]));
    q.pairs[k] = M::pairSums32(U::shuffle8(src[k], U::shuffleOf(kQuadPairs3[at])));
  }
  return q;
}

// Luma bytes of the 16 pixels of a unit from their quads.
template <class U, bool Bgr, class Body>
ZEL_INLINE typename U::V quadLuma(const Quads<U>& q, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  const int c0 = Bgr ? Body::kLumaB : Body::kLumaR, c2 = Bgr ? Body::kLumaR : Body::kLumaB;
  const V kLo = M::pair16(c0, c2), kHi = M::pair16(Body::kLumaG, 0);
  V t[4];
  for (int k = 0; k < 4; ++k)
    t[k] = U::add16(body.template quadTerm<U>(q.lo[k], kLo), body.template quadTerm<U>(q.hi[k], kHi));
  return U::packU8(body.template quadLuma<U>(M::hadd16(t[0], t[1])), body.template quadLuma<U>(M::hadd16(t[2], t[3])));
}

template <class U, bool Bgr, int Stride, class Body, class Out>
ZEL_INLINE int quadPairBlocks(const PackedIn<Stride>& top, const PackedIn<Stride>& bottom, const Out& out, int x,
                              int end, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  for (; x + U::kPixels <= end; x += U::kPixels) {
    const Quads<U> q0 = quadsOf<U>(top, x);
    V y0 = quadLuma<U, Bgr>(q0, body);
    const Quads<U> q1 = quadsOf<U>(bottom, x);
    V y1 = quadLuma<U, Bgr>(q1, body);
    V s[4];
    for (int k = 0; k < 4; ++k) s[k] = U::add16(q0.pairs[k], q1.pairs[k]);
    // s[k]: channel 0 of blocks 2k, 2k + 1, channel 1 of them, channel 2.
    const V a = M::unpackLo32(s[0], s[1]), b = M::unpackHi32(s[0], s[1]);
    const V c = M::unpackLo32(s[2], s[3]), d = M::unpackHi32(s[2], s[3]);
    const V ch0 = M::unpackLo64(a, c), ch1 = M::unpackHi64(a, c), ch2 = M::unpackLo64(b, d);
    V c1, c2;
    body.template chromaOf32<U>(Bgr ? ch2 : ch0, ch1, Bgr ? ch0 : ch2, c1, c2);
    V cc = U::packU8(c1, c2);
    if constexpr (Body::kNarrow) {
      y0 = M::clampNarrow(y0);
      y1 = M::clampNarrow(y1);
      cc = M::clampNarrow(cc);
    }
    out.template block<U>(x, y0, y1, cc);
  }
  return x;
}

template <class Src>
struct QuadSource : std::false_type {};
template <int Stride, bool Bgr>
struct QuadSource<RgbSource<PackedIn<Stride>, Bgr>> : std::true_type {
  static constexpr bool kBgr = Bgr;
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
  if constexpr (QuadSource<Src>::value && TakesQuads<Body>::value)
    return quadPairBlocks<U, QuadSource<Src>::kBgr>(top.in, bottom.in, out, x, end, body);
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
