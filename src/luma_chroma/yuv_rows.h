// Row walking for the 8-bit luma-chroma kernels: readers and writers of the
// pixel layouts (interleaved three or four channels, planes), and the row
// template that runs a vector form over the body and a scalar form over the
// tail. Layouts are split into channels with byte shuffles, so every form
// sees planar 16-bit lanes.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel {

// Three samples of one pixel, in memory channel order.
struct Sample3 {
  int c0, c1, c2;
};

namespace rows_detail {

struct Mask16 {
  int8_t b[16];
};

// Byte k of channel `channel` of 16 interleaved three-byte pixels, taken from
// the 16-byte part `part` of the 48 bytes: -128 where another part holds it.
constexpr Mask16 gatherC3(int channel, int part) {
  Mask16 m{};
  for (int i = 0; i < 16; ++i) {
    const int pos = 3 * i + channel;
    m.b[i] = pos / 16 == part ? int8_t(pos % 16) : int8_t(-128);
  }
  return m;
}

// The inverse: byte j of output part `part` from channel `channel`.
constexpr Mask16 scatterC3(int part, int channel) {
  Mask16 m{};
  for (int j = 0; j < 16; ++j) {
    const int pos = 16 * part + j;
    m.b[j] = pos % 3 == channel ? int8_t(pos / 3) : int8_t(-128);
  }
  return m;
}

inline constexpr Mask16 kGatherC3[3][3] = {{gatherC3(0, 0), gatherC3(0, 1), gatherC3(0, 2)},
                                           {gatherC3(1, 0), gatherC3(1, 1), gatherC3(1, 2)},
                                           {gatherC3(2, 0), gatherC3(2, 1), gatherC3(2, 2)}};
inline constexpr Mask16 kScatterC3[3][3] = {{scatterC3(0, 0), scatterC3(0, 1), scatterC3(0, 2)},
                                            {scatterC3(1, 0), scatterC3(1, 1), scatterC3(1, 2)},
                                            {scatterC3(2, 0), scatterC3(2, 1), scatterC3(2, 2)}};
// Four-byte pixels: channel bytes of four pixels gathered together.
inline constexpr Mask16 kGatherC4 = {{0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15}};

inline __m128i mask(const Mask16& m) { return load128(m.b); }

inline __m128i shuffle3(__m128i a, __m128i b, __m128i c, const Mask16 (&m)[3]) {
  return _mm_or_si128(_mm_or_si128(_mm_shuffle_epi8(a, mask(m[0])), _mm_shuffle_epi8(b, mask(m[1]))),
                      _mm_shuffle_epi8(c, mask(m[2])));
}

inline __m128i widenLo(__m128i bytes) { return _mm_cvtepu8_epi16(bytes); }
inline __m128i widenHi(__m128i bytes) { return _mm_unpackhi_epi8(bytes, _mm_setzero_si128()); }

// Four-byte pixels x .. x+15 as 16-byte channel vectors.
inline void splitC4x16(const uint8_t* p, __m128i& c0, __m128i& c1, __m128i& c2, __m128i& c3) {
  const __m128i m = mask(kGatherC4);
  const __m128i q0 = _mm_shuffle_epi8(load128(p), m), q1 = _mm_shuffle_epi8(load128(p + 16), m);
  const __m128i q2 = _mm_shuffle_epi8(load128(p + 32), m), q3 = _mm_shuffle_epi8(load128(p + 48), m);
  const __m128i t0 = _mm_unpacklo_epi32(q0, q1), t1 = _mm_unpackhi_epi32(q0, q1);
  const __m128i t2 = _mm_unpacklo_epi32(q2, q3), t3 = _mm_unpackhi_epi32(q2, q3);
  c0 = _mm_unpacklo_epi64(t0, t2);
  c1 = _mm_unpackhi_epi64(t0, t2);
  c2 = _mm_unpacklo_epi64(t1, t3);
  c3 = _mm_unpackhi_epi64(t1, t3);
}

// Bytes of three channels as four-byte pixels with a zero fourth byte:
// pixels 0..3 and 4..7 of the low halves.
inline void joinC4Lo(__m128i c0, __m128i c1, __m128i c2, __m128i& p0, __m128i& p1) {
  const __m128i ab = _mm_unpacklo_epi8(c0, c1);
  const __m128i cz = _mm_unpacklo_epi8(c2, _mm_setzero_si128());
  p0 = _mm_unpacklo_epi16(ab, cz);
  p1 = _mm_unpackhi_epi16(ab, cz);
}
inline void joinC4Hi(__m128i c0, __m128i c1, __m128i c2, __m128i& p0, __m128i& p1) {
  const __m128i ab = _mm_unpackhi_epi8(c0, c1);
  const __m128i cz = _mm_unpackhi_epi8(c2, _mm_setzero_si128());
  p0 = _mm_unpacklo_epi16(ab, cz);
  p1 = _mm_unpackhi_epi16(ab, cz);
}

inline __m128i packLanes(__m128i lanes) { return _mm_packus_epi16(lanes, lanes); }

}  // namespace rows_detail

// ---- readers: 16 pixels as channel bytes, 8 as 16-bit lanes, 1 as ints ----

// Interleaved three-byte pixels.
struct ReadC3 {
  const uint8_t* p;
  void bytes16(int x, __m128i& c0, __m128i& c1, __m128i& c2) const {
    using namespace rows_detail;
    const uint8_t* s = p + 3 * x;
    const __m128i a = load128(s), b = load128(s + 16), c = load128(s + 32);
    c0 = shuffle3(a, b, c, kGatherC3[0]);
    c1 = shuffle3(a, b, c, kGatherC3[1]);
    c2 = shuffle3(a, b, c, kGatherC3[2]);
  }
  // Reads exactly the 24 bytes of eight pixels.
  Lanes3 get8(int x) const {
    using namespace rows_detail;
    const uint8_t* s = p + 3 * x;
    const __m128i a = load128(s), b = load64(s + 16), z = _mm_setzero_si128();
    return {widenLo(shuffle3(a, b, z, kGatherC3[0])), widenLo(shuffle3(a, b, z, kGatherC3[1])),
            widenLo(shuffle3(a, b, z, kGatherC3[2]))};
  }
  Sample3 pixel(int x) const { return {p[3 * x], p[3 * x + 1], p[3 * x + 2]}; }
};

// Interleaved four-byte pixels; the fourth byte takes no part.
struct ReadC4 {
  const uint8_t* p;
  void bytes16(int x, __m128i& c0, __m128i& c1, __m128i& c2) const {
    __m128i unused;
    rows_detail::splitC4x16(p + 4 * x, c0, c1, c2, unused);
  }
  Lanes3 get8(int x) const {
    using namespace rows_detail;
    const __m128i m = mask(kGatherC4);
    const __m128i q0 = _mm_shuffle_epi8(load128(p + 4 * x), m), q1 = _mm_shuffle_epi8(load128(p + 4 * x + 16), m);
    const __m128i t0 = _mm_unpacklo_epi32(q0, q1), t1 = _mm_unpackhi_epi32(q0, q1);
    return {widenLo(t0), widenHi(t0), widenLo(t1)};
  }
  // Four pixels in the low four lanes (the other lanes hold other channels).
  Lanes3 get4(int x) const {
    using namespace rows_detail;
    const __m128i q = _mm_shuffle_epi8(load128(p + 4 * x), mask(kGatherC4));
    return {widenLo(q), widenLo(_mm_srli_si128(q, 4)), widenLo(_mm_srli_si128(q, 8))};
  }
  Sample3 pixel(int x) const { return {p[4 * x], p[4 * x + 1], p[4 * x + 2]}; }
};

// Three planes with one step.
struct ReadP3 {
  const uint8_t *a, *b, *c;
  void bytes16(int x, __m128i& c0, __m128i& c1, __m128i& c2) const {
    c0 = load128(a + x);
    c1 = load128(b + x);
    c2 = load128(c + x);
  }
  Lanes3 get8(int x) const {
    return {_mm_cvtepu8_epi16(load64(a + x)), _mm_cvtepu8_epi16(load64(b + x)), _mm_cvtepu8_epi16(load64(c + x))};
  }
  Sample3 pixel(int x) const { return {a[x], b[x], c[x]}; }
};

// ---- writers: the byte pack is SaturateU8 of each lane ----

struct WriteC3 {
  uint8_t* p;
  void putBytes16(int x, __m128i c0, __m128i c1, __m128i c2) const {
    using namespace rows_detail;
    uint8_t* d = p + 3 * x;
    store128(d, shuffle3(c0, c1, c2, kScatterC3[0]));
    store128(d + 16, shuffle3(c0, c1, c2, kScatterC3[1]));
    store128(d + 32, shuffle3(c0, c1, c2, kScatterC3[2]));
  }
  // Writes exactly the 24 bytes of eight pixels.
  void put8(int x, const Lanes3& v) const {
    using namespace rows_detail;
    uint8_t* d = p + 3 * x;
    const __m128i c0 = packLanes(v.c0), c1 = packLanes(v.c1), c2 = packLanes(v.c2);
    store128(d, shuffle3(c0, c1, c2, kScatterC3[0]));
    store64(d + 16, shuffle3(c0, c1, c2, kScatterC3[1]));
  }
  void putPixel(int x, Pixel8 v) const {
    p[3 * x] = v.c0;
    p[3 * x + 1] = v.c1;
    p[3 * x + 2] = v.c2;
  }
};

// Four-byte pixels whose fourth byte keeps its value (AC4) or takes a
// constant (C4).
template <bool KeepFourth>
struct WriteFour {
  uint8_t* p;
  uint8_t alpha = 0;
  __m128i finish(const uint8_t* d, __m128i px) const {
    if constexpr (KeepFourth)
      return _mm_or_si128(px, _mm_and_si128(load128(d), _mm_set1_epi32(int32_t(0xFF000000u))));
    else
      return _mm_or_si128(px, _mm_set1_epi32(int32_t(uint32_t(alpha) << 24)));
  }
  void putBytes16(int x, __m128i c0, __m128i c1, __m128i c2) const {
    using namespace rows_detail;
    uint8_t* d = p + 4 * x;
    __m128i p0, p1, p2, p3;
    joinC4Lo(c0, c1, c2, p0, p1);
    joinC4Hi(c0, c1, c2, p2, p3);
    store128(d, finish(d, p0));
    store128(d + 16, finish(d + 16, p1));
    store128(d + 32, finish(d + 32, p2));
    store128(d + 48, finish(d + 48, p3));
  }
  void put8(int x, const Lanes3& v) const {
    using namespace rows_detail;
    uint8_t* d = p + 4 * x;
    __m128i p0, p1;
    joinC4Lo(packLanes(v.c0), packLanes(v.c1), packLanes(v.c2), p0, p1);
    store128(d, finish(d, p0));
    store128(d + 16, finish(d + 16, p1));
  }
  void put4(int x, const Lanes3& v) const {
    using namespace rows_detail;
    uint8_t* d = p + 4 * x;
    __m128i p0, p1;
    joinC4Lo(packLanes(v.c0), packLanes(v.c1), packLanes(v.c2), p0, p1);
    store128(d, finish(d, p0));
  }
  void putPixel(int x, Pixel8 v) const {
    p[4 * x] = v.c0;
    p[4 * x + 1] = v.c1;
    p[4 * x + 2] = v.c2;
    if constexpr (!KeepFourth) p[4 * x + 3] = alpha;
  }
};
using WriteAC4 = WriteFour<true>;
using WriteC4 = WriteFour<false>;

struct WriteP3 {
  uint8_t *a, *b, *c;
  void putBytes16(int x, __m128i c0, __m128i c1, __m128i c2) const {
    store128(a + x, c0);
    store128(b + x, c1);
    store128(c + x, c2);
  }
  void put8(int x, const Lanes3& v) const {
    using namespace rows_detail;
    store64(a + x, packLanes(v.c0));
    store64(b + x, packLanes(v.c1));
    store64(c + x, packLanes(v.c2));
  }
  void putPixel(int x, Pixel8 v) const {
    a[x] = v.c0;
    b[x] = v.c1;
    c[x] = v.c2;
  }
};

// ---- the row ----

// A form as a type: `scalar` for one pixel, `vec` for eight 16-bit lanes,
// and where kAvx2 is set a sixteen-lane `vec` in AVX2.

namespace rows_detail {

template <typename Form, int Block, typename In, typename Out>
inline int sseBody(const In in, const Out out, int from, int body) {
  int x = from;
  for (; x + 16 <= body; x += 16) {
    __m128i b0, b1, b2;
    in.bytes16(x, b0, b1, b2);
    const Lanes3 lo = Form::vec(widenLo(b0), widenLo(b1), widenLo(b2));
    const Lanes3 hi = Form::vec(widenHi(b0), widenHi(b1), widenHi(b2));
    out.putBytes16(x, _mm_packus_epi16(lo.c0, hi.c0), _mm_packus_epi16(lo.c1, hi.c1),
                   _mm_packus_epi16(lo.c2, hi.c2));
  }
  for (; x + 8 <= body; x += 8) {
    const Lanes3 v = in.get8(x);
    out.put8(x, Form::vec(v.c0, v.c1, v.c2));
  }
  if constexpr (Block == 4) {
    if (x + 4 <= body) {
      const Lanes3 v = in.get4(x);
      out.put4(x, Form::vec(v.c0, v.c1, v.c2));
      x += 4;
    }
  }
  return x;
}

ZEL_AVX2 inline __m128i packBytes(__m256i lanes) {
  return _mm_packus_epi16(_mm256_castsi256_si128(lanes), _mm256_extracti128_si256(lanes, 1));
}

template <typename Form, typename In, typename Out>
ZEL_AVX2 int avx2Body(const In in, const Out out, int body) {
  int x = 0;
  for (; x + 16 <= body; x += 16) {
    __m128i b0, b1, b2;
    in.bytes16(x, b0, b1, b2);
    const Lanes3x16 v = Form::vec(_mm256_cvtepu8_epi16(b0), _mm256_cvtepu8_epi16(b1), _mm256_cvtepu8_epi16(b2));
    out.putBytes16(x, packBytes(v.c0), packBytes(v.c1), packBytes(v.c2));
  }
  return x;
}

}  // namespace rows_detail

// Where the vector body runs: SSE4.1 only, or AVX2 blocks first.
enum class Path { Sse41, Avx2 };
inline Path bestPath() { return hasAvx2() ? Path::Avx2 : Path::Sse41; }

// Pixels [0, body) by the vector form of Body, which gives its scalar bits;
// [body, width) one by one by the scalar form of Tail. `body` is a multiple of
// Block, 8 or 4 (readers and writers of four-byte pixels take blocks of 4).
// Readers and writers travel by value: their pointers stay in registers.
template <typename Body, typename Tail, int Block = 8, typename In, typename Out>
inline void convertRow(const In in, const Out out, int body, int width, Path path) {
  static_assert(Block == 8 || Block == 4, "blocks of 8 or 4 pixels");
  int x = 0;
  if constexpr (Body::kAvx2)
    if (path == Path::Avx2) x = rows_detail::avx2Body<Body>(in, out, body);
  x = rows_detail::sseBody<Body, Block>(in, out, x, body);
  for (; x < width; ++x) {
    const Sample3 s = in.pixel(x);
    out.putPixel(x, Tail::scalar(s.c0, s.c1, s.c2));
  }
}

}  // namespace zel
