// YCoCg row kernels: blocks of 8 pixels in 16-bit lanes (32-bit lanes where
// the arithmetic needs them), then single pixels. Each transform is a small
// struct with its vector block and the scalar formulas of its body and
// tail; the row templates are shared by every member.
#pragma once

#include <immintrin.h>

#include <cstdint>
#include <type_traits>

#include "frame/lane_shuffle.h"
#include "frame/simd.h"
#include "ycocg/ycocg_formulas.h"

namespace zel::ycocg {

// Signed 16-bit lanes to two vectors of 32-bit lanes.
inline void widen(__m128i v, __m128i& lo, __m128i& hi) {
  lo = _mm_cvtepi16_epi32(v);
  hi = _mm_cvtepi16_epi32(_mm_srli_si128(v, 8));
}
// The low 16 bits of eight 32-bit lanes, in order.
inline __m128i narrowLow(__m128i lo, __m128i hi) {
  const __m128i pick = _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -128, -128, -128, -128, -128, -128, -128, -128);
  return _mm_unpacklo_epi64(_mm_shuffle_epi8(lo, pick), _mm_shuffle_epi8(hi, pick));
}

// ---- lane forms of the formulas ----

// Plain forward in 16-bit lanes: exact for byte samples.
inline void plainForwardLanes16(__m128i b, __m128i g, __m128i r, __m128i& y, __m128i& co, __m128i& cg) {
  const __m128i one = _mm_set1_epi16(1), two = _mm_set1_epi16(2);
  const __m128i g2 = _mm_add_epi16(g, g), rb = _mm_add_epi16(r, b);
  y = _mm_srai_epi16(_mm_add_epi16(_mm_add_epi16(rb, g2), two), 2);
  co = _mm_srai_epi16(_mm_add_epi16(_mm_sub_epi16(r, b), one), 1);
  cg = _mm_srai_epi16(_mm_add_epi16(_mm_sub_epi16(g2, rb), two), 2);
}
inline void plainForwardLanes32(__m128i b, __m128i g, __m128i r, __m128i& y, __m128i& co, __m128i& cg) {
  const __m128i one = _mm_set1_epi32(1), two = _mm_set1_epi32(2);
  const __m128i g2 = _mm_add_epi32(g, g), rb = _mm_add_epi32(r, b);
  y = _mm_srai_epi32(_mm_add_epi32(_mm_add_epi32(rb, g2), two), 2);
  co = _mm_srai_epi32(_mm_add_epi32(_mm_sub_epi32(r, b), one), 1);
  cg = _mm_srai_epi32(_mm_add_epi32(_mm_sub_epi32(g2, rb), two), 2);
}
// Lifting steps in 16-bit lanes: wrapping, shifts on the wrapped values.
inline void liftForwardLanes16(__m128i b, __m128i g, __m128i r, __m128i& y, __m128i& co, __m128i& cg) {
  co = _mm_sub_epi16(r, b);
  const __m128i t = _mm_add_epi16(b, _mm_srai_epi16(co, 1));
  cg = _mm_sub_epi16(g, t);
  y = _mm_add_epi16(t, _mm_srai_epi16(cg, 1));
}
inline void liftForwardLanes32(__m128i b, __m128i g, __m128i r, __m128i& y, __m128i& co, __m128i& cg) {
  co = _mm_sub_epi32(r, b);
  const __m128i t = _mm_add_epi32(b, _mm_srai_epi32(co, 1));
  cg = _mm_sub_epi32(g, t);
  y = _mm_add_epi32(t, _mm_srai_epi32(cg, 1));
}
inline void plainInverseLanes16(__m128i y, __m128i co, __m128i cg, __m128i& b, __m128i& g, __m128i& r) {
  const __m128i yc = _mm_sub_epi16(y, cg);
  b = _mm_sub_epi16(yc, co);
  g = _mm_add_epi16(y, cg);
  r = _mm_add_epi16(yc, co);
}
inline void liftInverseLanes16(__m128i y, __m128i co, __m128i cg, __m128i& b, __m128i& g, __m128i& r) {
  const __m128i t = _mm_sub_epi16(y, _mm_srai_epi16(cg, 1));
  g = _mm_add_epi16(cg, t);
  b = _mm_sub_epi16(t, _mm_srai_epi16(co, 1));
  r = _mm_add_epi16(co, b);
}
inline void liftInverseLanes32(__m128i y, __m128i co, __m128i cg, __m128i& b, __m128i& g, __m128i& r) {
  const __m128i t = _mm_sub_epi32(y, _mm_srai_epi32(cg, 1));
  g = _mm_add_epi32(cg, t);
  b = _mm_sub_epi32(t, _mm_srai_epi32(co, 1));
  r = _mm_add_epi32(co, b);
}

// ---- forward transforms: 8 pixels of B, G, R in 16-bit lanes to planes ----
// out[p][k]: plane p (Y, Co, Cg), vector k (two for 32-bit planes).

// Byte samples, 16-bit planes, rounded matrix.
struct PlainBytes {
  using Plane = int16_t;
  static void block(const __m128i* bgr, __m128i (*out)[2]) {
    plainForwardLanes16(bgr[0], bgr[1], bgr[2], out[0][0], out[1][0], out[2][0]);
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
  static void block(const __m128i* bgr, __m128i (*out)[2]) {
    liftForwardLanes16(bgr[0], bgr[1], bgr[2], out[0][0], out[1][0], out[2][0]);
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
  static void block(const __m128i* bgr, __m128i (*out)[2]) {
    __m128i b[2], g[2], r[2];
    widen(bgr[0], b[0], b[1]);
    widen(bgr[1], g[0], g[1]);
    widen(bgr[2], r[0], r[1]);
    for (int k = 0; k < 2; ++k) {
      if constexpr (Lift) liftForwardLanes32(b[k], g[k], r[k], out[0][k], out[1][k], out[2][k]);
      else plainForwardLanes32(b[k], g[k], r[k], out[0][k], out[1][k], out[2][k]);
    }
  }
  static Ycc<int32_t> body(int32_t b, int32_t g, int32_t r) {
    return Lift ? liftForward(b, g, r) : plainForward(b, g, r);
  }
  static Ycc<int32_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// Signed 16-bit samples, 16-bit planes, rounded matrix: computed in 32 bits,
// saturated in blocks, low 16 bits in the last width & 3 pixels.
struct PlainShort {
  using Plane = int16_t;
  static void block(const __m128i* bgr, __m128i (*out)[2]) {
    __m128i wide[3][2];
    Wide<false>::block(bgr, wide);
    for (int p = 0; p < 3; ++p) out[p][0] = _mm_packs_epi32(wide[p][0], wide[p][1]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) { return plainForwardSaturated(b, g, r); }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return plainForwardWrapped(b, g, r); }
};

// Signed 16-bit samples, 16-bit planes, lifting modulo 2^16.
struct LiftShort {
  using Plane = int16_t;
  static void block(const __m128i* bgr, __m128i (*out)[2]) {
    liftForwardLanes16(bgr[0], bgr[1], bgr[2], out[0][0], out[1][0], out[2][0]);
  }
  static Ycc<int16_t> body(int32_t b, int32_t g, int32_t r) {
    return liftForward16(int16_t(b), int16_t(g), int16_t(r));
  }
  static Ycc<int16_t> tail(int32_t b, int32_t g, int32_t r) { return body(b, g, r); }
};

// ---- inverse transforms: 8 pixels of Y, Co, Cg to B, G, R in 16-bit lanes ----

template <bool Lift>
struct Short {  // 16-bit planes
  using Plane = int16_t;
  static void block(const int16_t* const* in, int x, __m128i* bgr) {
    const __m128i y = load128(in[0] + x), co = load128(in[1] + x), cg = load128(in[2] + x);
    if constexpr (Lift) liftInverseLanes16(y, co, cg, bgr[0], bgr[1], bgr[2]);
    else plainInverseLanes16(y, co, cg, bgr[0], bgr[1], bgr[2]);
  }
  static Bgr<int16_t> pixel(int32_t y, int32_t co, int32_t cg) {
    return Lift ? liftInverse16(int16_t(y), int16_t(co), int16_t(cg)) : plainInverse16(y, co, cg);
  }
};

template <bool Lift>
struct Long {  // 32-bit planes
  using Plane = int32_t;
  static void block(const int32_t* const* in, int x, __m128i* bgr) {
    __m128i v[3][2];
    for (int p = 0; p < 3; ++p) {
      v[p][0] = load128(in[p] + x);
      v[p][1] = load128(in[p] + x + 4);
    }
    if constexpr (Lift) {
      __m128i b[2], g[2], r[2];
      for (int k = 0; k < 2; ++k) liftInverseLanes32(v[0][k], v[1][k], v[2][k], b[k], g[k], r[k]);
      bgr[0] = narrowLow(b[0], b[1]);
      bgr[1] = narrowLow(g[0], g[1]);
      bgr[2] = narrowLow(r[0], r[1]);
    } else {
      // Sums modulo 2^16 need only the low 16 bits of the planes.
      plainInverseLanes16(narrowLow(v[0][0], v[0][1]), narrowLow(v[1][0], v[1][1]), narrowLow(v[2][0], v[2][1]),
                          bgr[0], bgr[1], bgr[2]);
    }
  }
  static Bgr<int16_t> pixel(int32_t y, int32_t co, int32_t cg) {
    return Lift ? liftInverse32(y, co, cg) : plainInverse16(y, co, cg);
  }
};

// ---- rows ----

template <bool Stream>
inline void putLanes(void* p, __m128i v) {
  if constexpr (Stream) storeStream128(p, v);
  else store128(p, v);
}

// Interleaved B, G, R (and an unused fourth element) to three planes.
// Pixels below width & ~3 take the body formula, the rest the tail.
template <class Op, typename Src, int Ch, bool Stream>
void forwardRow(const Src* src, typename Op::Plane* const* out, int width) {
  using Group = PixelGroup<int(sizeof(Src)), Ch, 2>;
  using Plane = typename Op::Plane;
  constexpr int kWide = sizeof(Plane) / 2;
  const int blocks = width & ~7, body = width & ~3;
  int x = 0;
  for (; x < blocks; x += 8) {
    __m128i bgr[3];
    Group::template load<3>(src + x * Ch, bgr);
    __m128i res[3][2];
    Op::block(bgr, res);
    for (int p = 0; p < 3; ++p)
      for (int k = 0; k < kWide; ++k) putLanes<Stream>(out[p] + x + 4 * k, res[p][k]);
  }
  auto write = [&](int at, const auto& v) {
    out[0][at] = v.y;
    out[1][at] = v.co;
    out[2][at] = v.cg;
  };
  for (; x < body; ++x) write(x, Op::body(src[x * Ch], src[x * Ch + 1], src[x * Ch + 2]));
  for (; x < width; ++x) write(x, Op::tail(src[x * Ch], src[x * Ch + 1], src[x * Ch + 2]));
}

// Three planes to interleaved B, G, R; a fourth element takes `alpha`.
// Byte destinations clamp to 0..255 after the 16-bit sums.
template <class Op, typename Dst, int Ch, bool Stream>
void inverseRow(const typename Op::Plane* const* in, Dst* dst, int width, Dst alpha) {
  using Group = PixelGroup<int(sizeof(Dst)), Ch, 2>;
  constexpr bool kBytes = std::is_same_v<Dst, uint8_t>;
  const int blocks = width & ~7;
  int x = 0;
  const __m128i alphaLanes = _mm_set1_epi16(int16_t(alpha));
  const __m128i zero = _mm_setzero_si128(), top = _mm_set1_epi16(255);
  for (; x < blocks; x += 8) {
    __m128i lanes[4];
    Op::block(in, x, lanes);
    if constexpr (kBytes)
      for (int c = 0; c < 3; ++c) lanes[c] = _mm_min_epi16(_mm_max_epi16(lanes[c], zero), top);
    lanes[3] = alphaLanes;
    Group::template store<Ch, Stream>(dst + x * Ch, lanes);
  }
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
