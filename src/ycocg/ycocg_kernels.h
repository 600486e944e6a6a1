// YCoCg row kernels: blocks of 32 pixels (512-bit tier), 16 pixels (AVX2)
// or 8 pixels in 16-bit lanes (32-bit lanes where the arithmetic needs
// them), then single pixels. Each
// transform is a small struct with its vector block, written once for both
// widths, and the scalar formulas of its body and tail; the row templates
// are shared by every member.
#pragma once

#include <immintrin.h>

#include <cstdint>
#include <type_traits>

#include "frame/simd.h"
#include "ycocg/ycocg_formulas.h"
#include "ycocg/ycocg_units.h"

namespace zel::ycocg {

// ---- lane forms of the formulas ----

// Plain forward in 16-bit lanes: exact for byte samples.
template <class U, class V>
ZEL_INLINE void plainForwardLanes16(V b, V g, V r, V& y, V& co, V& cg) {
  const V one = U::set16(1), two = U::set16(2);
  const V g2 = U::add16(g, g), rb = U::add16(r, b);
  y = U::template sra16<2>(U::add16(U::add16(rb, g2), two));
  co = U::template sra16<1>(U::add16(U::sub16(r, b), one));
  cg = U::template sra16<2>(U::add16(U::sub16(g2, rb), two));
}
template <class U, class V>
ZEL_INLINE void plainForwardLanes32(V b, V g, V r, V& y, V& co, V& cg) {
  const V one = U::set32(1), two = U::set32(2);
  const V g2 = U::add32(g, g), rb = U::add32(r, b);
  y = U::template sra32<2>(U::add32(U::add32(rb, g2), two));
  co = U::template sra32<1>(U::add32(U::sub32(r, b), one));
  cg = U::template sra32<2>(U::add32(U::sub32(g2, rb), two));
}
// Halves of two signed 16-bit lanes without leaving 16 bits:
// a + b = 2 (a & b) + (a ^ b) = 2 (a | b) - (a ^ b).
template <class U, class V>
ZEL_INLINE V floorHalfSum(V a, V b) {
  return U::add16(U::and_(a, b), U::template sra16<1>(U::xor_(a, b)));
}
template <class U, class V>
ZEL_INLINE V ceilHalfSum(V a, V b) {
  return U::sub16(U::or_(a, b), U::template sra16<1>(U::xor_(a, b)));
}
// Plain forward of signed 16-bit samples, saturated to 16 bits, in 16-bit
// lanes. With s = R + B and ~x = -x - 1:
//   Y  = (s + 2G + 2) >> 2   = ceil((floor(s / 2) + G) / 2)
//   Co = (R - B + 1) >> 1    = floor((R + ~B) / 2) + 1
//   Cg = (2G - s + 2) >> 2   = floor((G + ~ceil(s / 2)) / 2) + 1
// Every half sum lies in range; only the final + 1 can pass 32767, and the
// saturating add clamps it there.
template <class U, class V>
ZEL_INLINE void plainForwardSaturatedLanes16(V b, V g, V r, V& y, V& co, V& cg) {
  const V one = U::set16(1), all = U::ones();
  y = ceilHalfSum<U>(floorHalfSum<U>(r, b), g);
  co = U::addSatS16(floorHalfSum<U>(r, U::xor_(b, all)), one);
  cg = U::addSatS16(floorHalfSum<U>(g, U::xor_(ceilHalfSum<U>(r, b), all)), one);
}
// Lifting steps in 16-bit lanes: wrapping, shifts on the wrapped values.
template <class U, class V>
ZEL_INLINE void liftForwardLanes16(V b, V g, V r, V& y, V& co, V& cg) {
  co = U::sub16(r, b);
  const V t = U::add16(b, U::template sra16<1>(co));
  cg = U::sub16(g, t);
  y = U::add16(t, U::template sra16<1>(cg));
}
template <class U, class V>
ZEL_INLINE void liftForwardLanes32(V b, V g, V r, V& y, V& co, V& cg) {
  co = U::sub32(r, b);
  const V t = U::add32(b, U::template sra32<1>(co));
  cg = U::sub32(g, t);
  y = U::add32(t, U::template sra32<1>(cg));
}
template <class U, class V>
ZEL_INLINE void plainInverseLanes16(V y, V co, V cg, V& b, V& g, V& r) {
  const V yc = U::sub16(y, cg);
  b = U::sub16(yc, co);
  g = U::add16(y, cg);
  r = U::add16(yc, co);
}
template <class U, class V>
ZEL_INLINE void liftInverseLanes16(V y, V co, V cg, V& b, V& g, V& r) {
  const V t = U::sub16(y, U::template sra16<1>(cg));
  g = U::add16(cg, t);
  b = U::sub16(t, U::template sra16<1>(co));
  r = U::add16(co, b);
}
template <class U, class V>
ZEL_INLINE void liftInverseLanes32(V y, V co, V cg, V& b, V& g, V& r) {
  const V t = U::sub32(y, U::template sra32<1>(cg));
  g = U::add32(cg, t);
  b = U::sub32(t, U::template sra32<1>(co));
  r = U::add32(co, b);
}

// ---- forward transforms: the elements 0..2 of U::kPixels pixels in 16-bit
// lanes to planes ----
// out[p][k]: plane p (Y, Co, Cg), vector k (two for 32-bit planes, pixels
// of the first and second half). Elements are B, G, R except in BytePlanes.

// Byte samples, 16-bit planes, rounded matrix.
struct PlainBytes {
  using Plane = int16_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    plainForwardLanes16<U>(e[0], e[1], e[2], out[0][0], out[1][0], out[2][0]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) {
    const Ycc<int32_t> v = plainForward(b, g, r);
    return {int16_t(v.y), int16_t(v.co), int16_t(v.cg)};
  }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// Byte samples, 16-bit planes, lifting.
struct LiftBytes {
  using Plane = int16_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    liftForwardLanes16<U>(e[0], e[1], e[2], out[0][0], out[1][0], out[2][0]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) {
    const Ycc<int32_t> v = liftForward(b, g, r);
    return {int16_t(v.y), int16_t(v.co), int16_t(v.cg)};
  }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// Signed 16-bit samples, 32-bit planes: both transforms are exact.
template <bool Lift>
struct Wide {
  using Plane = int32_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    const V b[2] = {U::widenLo(e[0]), U::widenHi(e[0])};
    const V g[2] = {U::widenLo(e[1]), U::widenHi(e[1])};
    const V r[2] = {U::widenLo(e[2]), U::widenHi(e[2])};
    for (int k = 0; k < 2; ++k) {
      if constexpr (Lift)
        liftForwardLanes32<U>(b[k], g[k], r[k], out[0][k], out[1][k], out[2][k]);
      else
        plainForwardLanes32<U>(b[k], g[k], r[k], out[0][k], out[1][k], out[2][k]);
    }
  }
  static Ycc<int32_t> body(int32_t b, int32_t g, int32_t r) {
    return Lift ? liftForward(b, g, r) : plainForward(b, g, r);
  }
  static Ycc<int32_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// Signed 16-bit samples, 16-bit planes, rounded matrix: the blocks
// saturate, the last width & 3 pixels keep the low 16 bits.
struct PlainShort {
  using Plane = int16_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    plainForwardSaturatedLanes16<U>(e[0], e[1], e[2], out[0][0], out[1][0], out[2][0]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) { return plainForwardSaturated(b, g, r); }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return plainForwardWrapped(b, g, r); }
};

// Signed 16-bit samples, 16-bit planes, lifting modulo 2^16.
struct LiftShort {
  using Plane = int16_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    liftForwardLanes16<U>(e[0], e[1], e[2], out[0][0], out[1][0], out[2][0]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) {
    return liftForward16(int16_t(b), int16_t(g), int16_t(r));
  }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// R, G, B bytes (R at element 0) to byte planes, chroma offset by 128; the
// byte stores clamp to 0..255, which is all the clamping Co and Cg need.
struct BytePlanes {
  using Plane = uint8_t;
  template <class U, class V>
  ZEL_INLINE static void block(const V* e, V (*out)[2]) {
    const V r = e[0], g = e[1], b = e[2];
    const V one = U::set16(1), two = U::set16(2), offset = U::set16(128);
    const V g2 = U::add16(g, g), rb = U::add16(r, b);
    out[0][0] = U::template sra16<2>(U::add16(U::add16(rb, g2), two));
    out[1][0] = U::add16(U::template sra16<1>(U::add16(U::sub16(r, b), one)), offset);
    out[2][0] = U::add16(U::template sra16<2>(U::add16(U::sub16(g2, rb), two)), offset);
  }
  static Ycc<uint8_t> body(int32_t r, int32_t g, int32_t b) { return bytePlaneForward(r, g, b); }
  static Ycc<uint8_t> tail(int32_t r, int32_t g, int32_t b) { return body(r, g, b); }
};

// ---- inverse transforms: U::kPixels pixels of Y, Co, Cg to the elements
// 0..2 in 16-bit lanes (B, G, R except in BytePlanesBack) ----

template <bool Lift>
struct Short {  // 16-bit planes
  using Plane = int16_t;
  template <class U, class V>
  ZEL_INLINE static void block(const int16_t* const* in, int x, V* e) {
    const V y = U::load(in[0] + x), co = U::load(in[1] + x), cg = U::load(in[2] + x);
    if constexpr (Lift)
      liftInverseLanes16<U>(y, co, cg, e[0], e[1], e[2]);
    else
      plainInverseLanes16<U>(y, co, cg, e[0], e[1], e[2]);
  }
  static Bgr<int16_t> pixel(int32_t y, int32_t co, int32_t cg) {
    return Lift ? liftInverse16(int16_t(y), int16_t(co), int16_t(cg)) : plainInverse16(y, co, cg);
  }
};

template <bool Lift>
struct Long {  // 32-bit planes
  using Plane = int32_t;
  template <class U, class V>
  ZEL_INLINE static void block(const int32_t* const* in, int x, V* e) {
    constexpr int kHalf = U::kPixels / 2;
    V v[3][2];
    for (int p = 0; p < 3; ++p) {
      v[p][0] = U::load(in[p] + x);
      v[p][1] = U::load(in[p] + x + kHalf);
    }
    if constexpr (Lift) {
      V b[2], g[2], r[2];
      for (int k = 0; k < 2; ++k) liftInverseLanes32<U>(v[0][k], v[1][k], v[2][k], b[k], g[k], r[k]);
      e[0] = U::narrowLow(b[0], b[1]);
      e[1] = U::narrowLow(g[0], g[1]);
      e[2] = U::narrowLow(r[0], r[1]);
    } else {
      // Sums modulo 2^16 need only the low 16 bits of the planes.
      plainInverseLanes16<U>(U::narrowLow(v[0][0], v[0][1]), U::narrowLow(v[1][0], v[1][1]),
                             U::narrowLow(v[2][0], v[2][1]), e[0], e[1], e[2]);
    }
  }
  static Bgr<int16_t> pixel(int32_t y, int32_t co, int32_t cg) {
    return Lift ? liftInverse32(y, co, cg) : plainInverse16(y, co, cg);
  }
};

// Byte planes, chroma offset by 128, to R, G, B bytes (R at element 0);
// the byte stores clamp.
struct BytePlanesBack {
  using Plane = uint8_t;
  template <class U, class V>
  ZEL_INLINE static void block(const uint8_t* const* in, int x, V* e) {
    const V y = U::loadBytes(in[0] + x), co = U::loadBytes(in[1] + x), cg = U::loadBytes(in[2] + x);
    const V yc = U::sub16(y, cg);
    e[0] = U::add16(yc, co);
    e[1] = U::add16(U::add16(y, cg), U::set16(-128));
    e[2] = U::add16(U::sub16(yc, co), U::set16(256));
  }
  // Elements in order: R in the `b` field, B in the `r` field.
  static Bgr<int16_t> pixel(int32_t y, int32_t co, int32_t cg) {
    const Bgr<uint8_t> v = bytePlaneInverse(y, co, cg);
    return {v.r, v.g, v.b};
  }
};

// ---- rows ----

// Reading ahead: the source lines of a block some way further on are asked
// for now, so that memory keeps pace on large frames. A prefetch is a hint
// that neither faults nor changes a byte, so it may point past the row.
constexpr int kReadAhead = 8192;
template <int Bytes>
ZEL_INLINE void readAhead(const void* p) {
  const char* at = static_cast<const char*>(p) + kReadAhead;
  for (int b = 0; b < Bytes; b += 64) _mm_prefetch(at + b, _MM_HINT_T0);
}

template <class U, bool Stream, typename Plane, class V>
ZEL_INLINE void putPlane(Plane* p, V v) {
  if constexpr (sizeof(Plane) == 1)
    U::storeBytes(p, v);
  else if constexpr (Stream)
    U::stream(p, v);
  else
    U::store(p, v);
}

// Interleaved pixels to three planes, blocks of U::kPixels from x while
// they end by `end`; returns where they stopped.
template <class U, class Op, typename Src, int Ch, bool Stream>
ZEL_INLINE int forwardBlocks(const Src* src, typename Op::Plane* const* out, int x, int end) {
  using V = typename U::V;
  constexpr int kWide = sizeof(typename Op::Plane) == 4 ? 2 : 1;  // vectors a plane
  for (; x + U::kPixels <= end; x += U::kPixels) {
    V e[3];
    readAhead<U::kPixels * Ch * int(sizeof(Src))>(src + x * Ch);
    Interleaved<U, int(sizeof(Src)), Ch>::load(src + x * Ch, e);
    V res[3][2];
    Op::template block<U>(e, res);
    for (int p = 0; p < 3; ++p)
      for (int k = 0; k < kWide; ++k) putPlane<U, Stream>(out[p] + x + k * (U::kPixels / 2), res[p][k]);
  }
  return x;
}
template <class Op, typename Src, int Ch, bool Stream>
ZEL_AVX2 __attribute__((flatten)) int forwardBlocksAvx(const Src* src, typename Op::Plane* const* out, int x, int end) {
  return forwardBlocks<Avx, Op, Src, Ch, Stream>(src, out, x, end);
}
template <class Op, typename Src, int Ch, bool Stream>
ZEL_AVX512 __attribute__((flatten)) int forwardBlocksAvx512(const Src* src, typename Op::Plane* const* out, int end) {
  return forwardBlocks<Avx512, Op, Src, Ch, Stream>(src, out, 0, end);
}

// The byte-plane forward in byte lanes, 2 * U::kPixels pixels a block.
// With ~x = 255 - x and means of two bytes:
//   Y  = (R + 2G + B + 2) >> 2        = ceil((floor((R + B) / 2) + G) / 2)
//   Co = ((R - B + 1) >> 1) + 128     = floor((R + ~B) / 2) + 1
//   Cg = ((2G - B - R + 2) >> 2) + 128 = floor((G + ~ceil((R + B) / 2)) / 2) + 1
// Co and Cg reach 256 at most, where the saturating add stops at 255, and
// never go below 1.
template <class U, class V>
ZEL_INLINE V floorMeanU8(V a, V b) {
  return U::sub8(U::averageU8(a, b), U::and_(U::xor_(a, b), U::set8(1)));
}
template <class U>
ZEL_INLINE int bytePlaneBlocks(const uint8_t* src, uint8_t* const* out, int x, int end) {
  using V = typename U::V;
  constexpr int kStep = 2 * U::kPixels;
  const V one = U::set8(1), all = U::ones();
  for (; x + kStep <= end; x += kStep) {
    V e[3];
    readAhead<3 * kStep>(src + 3 * x);
    ByteTriples<U>::load(src + 3 * x, e);
    const V r = e[0], g = e[1], b = e[2];
    const V up = U::averageU8(r, b);
    const V down = U::sub8(up, U::and_(U::xor_(r, b), one));
    U::store(out[0] + x, U::averageU8(down, g));
    U::store(out[1] + x, U::addSatU8(floorMeanU8<U>(r, U::xor_(b, all)), one));
    U::store(out[2] + x, U::addSatU8(floorMeanU8<U>(g, U::xor_(up, all)), one));
  }
  return x;
}
ZEL_AVX2 __attribute__((flatten)) inline int bytePlaneBlocksAvx(const uint8_t* src, uint8_t* const* out, int x,
                                                                 int end) {
  return bytePlaneBlocks<Avx>(src, out, x, end);
}
ZEL_AVX512 __attribute__((flatten)) inline int bytePlaneBlocksAvx512(const uint8_t* src, uint8_t* const* out, int end) {
  return bytePlaneBlocks<Avx512>(src, out, 0, end);
}

// Interleaved B, G, R (and an unused fourth element) to three planes.
// Pixels below width & ~3 take the body formula, the rest the tail.
template <class Op, typename Src, int Ch, bool Stream>
void forwardRow(const Src* src, typename Op::Plane* const* out, int width, VectorTier tier) {
  const int blocks = width & ~7, body = width & ~3;
  int x = 0;
  if constexpr (std::is_same_v<Op, BytePlanes>) {
    if (tier == VectorTier::Avx512) x = bytePlaneBlocksAvx512(src, out, width);
    if (tier != VectorTier::Sse41) x = bytePlaneBlocksAvx(src, out, x, width);
    x = bytePlaneBlocks<Sse>(src, out, x, width);
  } else {
    if (tier == VectorTier::Avx512) x = forwardBlocksAvx512<Op, Src, Ch, Stream>(src, out, blocks);
    if (tier != VectorTier::Sse41) x = forwardBlocksAvx<Op, Src, Ch, Stream>(src, out, x, blocks);
  }
  x = forwardBlocks<Sse, Op, Src, Ch, Stream>(src, out, x, blocks);
  auto write = [&](int at, const auto& v) {
    out[0][at] = v.y;
    out[1][at] = v.co;
    out[2][at] = v.cg;
  };
  for (; x < body; ++x) write(x, Op::body(src[x * Ch], src[x * Ch + 1], src[x * Ch + 2]));
  for (; x < width; ++x) write(x, Op::tail(src[x * Ch], src[x * Ch + 1], src[x * Ch + 2]));
}

template <class U, class Op, typename Dst, int Ch, bool Stream>
ZEL_INLINE int inverseBlocks(const typename Op::Plane* const* in, Dst* dst, int x, int end, Dst alpha) {
  using V = typename U::V;
  const V alphaLanes = U::set16(alpha);
  for (; x + U::kPixels <= end; x += U::kPixels) {
    V e[4];
    for (int p = 0; p < 3; ++p) readAhead<U::kPixels * int(sizeof(typename Op::Plane))>(in[p] + x);
    Op::template block<U>(in, x, e);
    e[3] = alphaLanes;
    if constexpr (!Stream) readAhead<U::kPixels * Ch * int(sizeof(Dst))>(dst + x * Ch);  // lines to be written
    Interleaved<U, int(sizeof(Dst)), Ch>::template store<Stream>(dst + x * Ch, e);
  }
  return x;
}
template <class Op, typename Dst, int Ch, bool Stream>
ZEL_AVX2 __attribute__((flatten)) int inverseBlocksAvx(const typename Op::Plane* const* in, Dst* dst, int x, int end,
                                                       Dst alpha) {
  return inverseBlocks<Avx, Op, Dst, Ch, Stream>(in, dst, x, end, alpha);
}
template <class Op, typename Dst, int Ch, bool Stream>
ZEL_AVX512 __attribute__((flatten)) int inverseBlocksAvx512(const typename Op::Plane* const* in, Dst* dst, int end,
                                                            Dst alpha) {
  return inverseBlocks<Avx512, Op, Dst, Ch, Stream>(in, dst, 0, end, alpha);
}

// Three planes to interleaved elements; a fourth element takes `alpha`.
// Byte destinations clamp to 0..255 after the 16-bit sums.
template <class Op, typename Dst, int Ch, bool Stream>
void inverseRow(const typename Op::Plane* const* in, Dst* dst, int width, Dst alpha, VectorTier tier) {
  constexpr bool kBytes = std::is_same_v<Dst, uint8_t>;
  const int blocks = width & ~7;
  int x = 0;
  if (tier == VectorTier::Avx512) x = inverseBlocksAvx512<Op, Dst, Ch, Stream>(in, dst, blocks, alpha);
  if (tier != VectorTier::Sse41) x = inverseBlocksAvx<Op, Dst, Ch, Stream>(in, dst, x, blocks, alpha);
  x = inverseBlocks<Sse, Op, Dst, Ch, Stream>(in, dst, x, blocks, alpha);
  for (; x < width; ++x) {
    const Bgr<int16_t> v = Op::pixel(in[0][x], in[1][x], in[2][x]);
    Dst* d = dst + x * Ch;
    if constexpr (kBytes) {
      d[0] = SaturateU8(v.b);
      d[1] = SaturateU8(v.g);
      d[2] = SaturateU8(v.r);
    } else {
      d[0] = v.b;
      d[1] = v.g;
      d[2] = v.r;
    }
    if constexpr (Ch == 4) d[3] = alpha;
  }
}

}  // namespace zel::ycocg
