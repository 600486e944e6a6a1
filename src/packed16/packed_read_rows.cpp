#include "packed16/packed_read_rows.h"

#include <cstring>

#include "frame/simd.h"
#include "luma_chroma/pixel_rows.h"
#include "packed16/packed_read_lanes.h"

namespace zel::unpack {

namespace {

using packed::Rgb;

// Rows may start at any byte: words are read without assuming alignment.
inline uint16_t wordAt(const uint16_t* s, int x) {
  uint16_t w;
  std::memcpy(&w, s + x, 2);
  return w;
}

template <class W>
inline Rgb pixelAt(const uint16_t* s, int x) {
  return packed::unpackRgb<typename W::Layout>(wordAt(s, x), W::kRedHigh);
}

template <class W>
inline uint8_t studioLumaAt(const uint16_t* s, int x) {
  const Rgb p = pixelAt<W>(s, x);
  return studioLumaTail(p.r, p.g, p.b);
}

template <class W>
inline int32_t yuvSumAt(const uint16_t* s, int x) {
  const Rgb p = pixelAt<W>(s, x);
  return yuvLumaSum(p.r, p.g, p.b);
}

inline Rgb operator+(const Rgb& a, const Rgb& b) { return {a.r + b.r, a.g + b.g, a.b + b.b}; }

// ---- 4:2:0 vector part ----

template <class U, class W, class Form>
ZEL_INLINE int blocks420(const PairRows& r, int x, int end) {
  for (; x + U::kPixels <= end; x += U::kPixels) {
    V<U> y0, y1, c;
    block420<U, W, Form>(loadLanes<U>(r.s0 + x), loadLanes<U>(r.s0 + x + 8), loadLanes<U>(r.s1 + x),
                         loadLanes<U>(r.s1 + x + 8), y0, y1, c);
    U::storeUnits(r.y0 + x, 16, y0);
    U::storeUnits(r.y1 + x, 16, y1);
    U::storeHalves(r.c1 + x / 2, r.c2 + x / 2, c);
  }
  return x;
}

template <class W, class Form>
ZEL_AVX2 __attribute__((flatten)) int blocks420Avx(const PairRows& r, int end) {
  return blocks420<AvxUnit, W, Form>(r, 0, end);
}

// A short block of n = 8 or 4 pixels: the results land on the stack and
// only the block's own bytes are copied out.
template <class W, class Form>
inline void short420(const PairRows& r, int x, int n) {
  const __m128i a = loadShort(r.s0 + x, n), b = loadShort(r.s1 + x, n);
  __m128i v[3];
  block420<SseUnit, W, Form>(a, a, b, b, v[0], v[1], v[2]);
  alignas(16) uint8_t out[3][16];
  for (int k = 0; k < 3; ++k) _mm_store_si128(reinterpret_cast<__m128i*>(out[k]), v[k]);
  std::memcpy(r.y0 + x, out[0], n);
  std::memcpy(r.y1 + x, out[1], n);
  std::memcpy(r.c1 + x / 2, out[2], n / 2);
  std::memcpy(r.c2 + x / 2, out[2] + 8, n / 2);
}

// Pixels [0, end) of a row pair by the body form; end is a multiple of 4:
// whole blocks, then a block of eight and one of four where they remain.
template <class W, class Form>
inline int vector420(const PairRows& r, int end, bool avx2) {
  int x = 0;
  if (avx2) x = blocks420Avx<W, Form>(r, end);
  x = blocks420<SseUnit, W, Form>(r, x, end);
  for (int n = 8; n >= 4; n -= 4)
    if (end - x >= n) {
      short420<W, Form>(r, x, n);
      x += n;
    }
  return x;
}

// ---- single-row vector part: sinks of 4:2:2 and 4:1:1 blocks ----

// Stack copies of a short block's luma and chroma bytes.
struct ShortBytes {
  alignas(16) uint8_t y[16], c[16];
  ShortBytes(__m128i yv, __m128i cv) {
    _mm_store_si128(reinterpret_cast<__m128i*>(y), yv);
    _mm_store_si128(reinterpret_cast<__m128i*>(c), cv);
  }
};

template <int Group>
struct PlanesSink {
  static constexpr int kGroup = Group;
  PlaneRow row;
  template <class U>
  ZEL_INLINE void store(int x, V<U> y, V<U> c) const {
    U::storeUnits(row.y + x, 16, y);
    if constexpr (Group == 4)
      U::storeQuarters(row.c1 + x / 4, row.c2 + x / 4, c);
    else
      U::storeHalves(row.c1 + x / 2, row.c2 + x / 2, c);
  }
  void storeShort(int x, int n, __m128i y, __m128i c) const {
    const ShortBytes b(y, c);
    std::memcpy(row.y + x, b.y, n);
    std::memcpy(row.c1 + x / Group, b.c, n / Group);
    std::memcpy(row.c2 + x / Group, b.c + 8, n / Group);
  }
};

struct StreamSink422 {
  static constexpr int kGroup = 2;
  uint8_t* dst;
  template <class U>
  ZEL_INLINE void store(int x, V<U> y, V<U> c) const {
    storePairStream<U>(dst + 2 * x, y, c);
  }
  void storeShort(int x, int n, __m128i y, __m128i c) const {
    alignas(16) uint8_t q[32];
    storePairStream<SseUnit>(q, y, c);
    std::memcpy(dst + 2 * x, q, 2 * n);
  }
};

template <class U, class W, class Form, class Sink>
ZEL_INLINE int blocksRow(const uint16_t* s, const Sink& sink, int x, int end) {
  for (; x + U::kPixels <= end; x += U::kPixels) {
    V<U> y, c;
    blockRow<Sink::kGroup, U, W, Form>(loadLanes<U>(s + x), loadLanes<U>(s + x + 8), y, c);
    sink.template store<U>(x, y, c);
  }
  return x;
}

template <class W, class Form, class Sink>
ZEL_AVX2 __attribute__((flatten)) int blocksRowAvx(const uint16_t* s, const Sink& sink, int end) {
  return blocksRow<AvxUnit, W, Form>(s, sink, 0, end);
}

// Pixels [0, end) of a row by the body form; end is a multiple of 4.
template <class W, class Form, class Sink>
inline int vectorRow(const uint16_t* s, const Sink& sink, int end, bool avx2) {
  int x = 0;
  if (avx2) x = blocksRowAvx<W, Form>(s, sink, end);
  x = blocksRow<SseUnit, W, Form>(s, sink, x, end);
  for (int n = 8; n >= 4; n -= 4)
    if (end - x >= n) {
      const __m128i w = loadShort(s + x, n);
      __m128i y, c;
      blockRow<Sink::kGroup, SseUnit, W, Form>(w, w, y, c);
      sink.storeShort(x, n, y, c);
      x += n;
    }
  return x;
}

// Body ends of the path splits.
inline int studio420End(int width) { return (width & ~15) + ((width & 7) >= 4 ? 4 : 0); }
inline int studio422End(int width) { return (width & ~31) + ((width & 15) >= 8 ? 8 : 0); }
inline int yuv420End(int width) { return (width & ~7) + ((width & 6) >= 4 ? 4 : 0); }

// ---- words to bytes ----

template <class U>
ZEL_INLINE int wordBytesBlocks(const uint16_t* s, uint8_t* d, int x, int end) {
  const lc::PackedOut3<false> out{d};
  for (; x + U::kPixels <= end; x += U::kPixels) {
    lc::Trio<U> t;
    byteChannels<U, packed::Layout565>(loadLanes<U>(s + x), loadLanes<U>(s + x + 8), t.c0, t.c1, t.c2);
    out.template block<U>(x, t);
  }
  return x;
}

ZEL_AVX2 __attribute__((flatten)) int wordBytesBlocksAvx(const uint16_t* s, uint8_t* d, int end) {
  return wordBytesBlocks<AvxUnit>(s, d, 0, end);
}

}  // namespace

void wordsToBytesRow(const uint16_t* src, uint8_t* dst, int width, bool avx2) {
  int x = 0;
  if (avx2) x = wordBytesBlocksAvx(src, dst, width);
  x = wordBytesBlocks<SseUnit>(src, dst, x, width);
  using L = packed::Layout565;
  for (; x < width; ++x) {
    const uint16_t w = wordAt(src, x);
    uint8_t* q = dst + 3 * x;
    q[0] = uint8_t(L::lowExpanded(w));
    q[1] = uint8_t(L::midExpanded(w));
    q[2] = uint8_t(L::topExpanded(w));
  }
}

// ---- studio-range YCbCr ----

template <class W>
void studio420Pair(const PairRows& r, int width, bool avx2) {
  int x = vector420<W, StudioLanes<4>>(r, studio420End(width), avx2);
  using Chroma = StudioChromaTail<4>;
  for (; x + 2 <= width; x += 2) {
    const Rgb a = pixelAt<W>(r.s0, x), b = pixelAt<W>(r.s0, x + 1);
    const Rgb c = pixelAt<W>(r.s1, x), d = pixelAt<W>(r.s1, x + 1);
    r.y0[x] = studioLumaTail(a.r, a.g, a.b);
    r.y0[x + 1] = studioLumaTail(b.r, b.g, b.b);
    r.y1[x] = studioLumaTail(c.r, c.g, c.b);
    r.y1[x + 1] = studioLumaTail(d.r, d.g, d.b);
    const Rgb s = a + b + c + d;
    r.c1[x / 2] = Chroma::cb(s.r, s.g, s.b);
    r.c2[x / 2] = Chroma::cr(s.r, s.g, s.b);
  }
  if (x < width) {
    r.y0[x] = studioLumaAt<W>(r.s0, x);
    r.y1[x] = studioLumaAt<W>(r.s1, x);
  }
}

template <class W>
void studioLumaRow(const uint16_t* src, uint8_t* y, int width) {
  for (int x = 0; x < width; ++x) y[x] = studioLumaAt<W>(src, x);
}

template <class W>
void studio422PlanesRow(const PlaneRow& row, int width, bool avx2) {
  int x = vectorRow<W, StudioLanes<2>>(row.s, PlanesSink<2>{row}, studio422End(width), avx2);
  using Chroma = StudioChromaTail<2>;
  for (; x + 2 <= width; x += 2) {
    const Rgb a = pixelAt<W>(row.s, x), b = pixelAt<W>(row.s, x + 1);
    row.y[x] = studioLumaTail(a.r, a.g, a.b);
    row.y[x + 1] = studioLumaTail(b.r, b.g, b.b);
    const Rgb s = a + b;
    row.c1[x / 2] = Chroma::cb(s.r, s.g, s.b);
    row.c2[x / 2] = Chroma::cr(s.r, s.g, s.b);
  }
  if (x < width) row.y[x] = studioLumaAt<W>(row.s, x);
}

template <class W>
void studio422PairsRow(const uint16_t* src, uint8_t* dst, int width, bool avx2) {
  int x = vectorRow<W, StudioLanes<2>>(src, StreamSink422{dst}, studio422End(width), avx2);
  using Chroma = StudioChromaTail<2>;
  for (; x + 2 <= width; x += 2) {
    const Rgb a = pixelAt<W>(src, x), b = pixelAt<W>(src, x + 1);
    const Rgb s = a + b;
    uint8_t* q = dst + 2 * x;
    q[0] = studioLumaTail(a.r, a.g, a.b);
    q[1] = Chroma::cb(s.r, s.g, s.b);
    q[2] = studioLumaTail(b.r, b.g, b.b);
    q[3] = Chroma::cr(s.r, s.g, s.b);
  }
  if (x < width) {
    const Rgb a = pixelAt<W>(src, x);
    dst[2 * x] = studioLumaTail(a.r, a.g, a.b);
    dst[2 * x + 1] = studioLoneCb(a.r, a.g, a.b);
  }
}

template <class W>
void studio411Row(const PlaneRow& row, int width, bool avx2) {
  int x = vectorRow<W, StudioLanes<4>>(row.s, PlanesSink<4>{row}, width & ~3, avx2);
  for (; x < width; ++x) row.y[x] = studioLumaAt<W>(row.s, x);
}

// ---- full-range YUV ----

// The tail of a 2 x 2 block (4:2:0) or of a pair (4:2:2, s1 null).
template <class W, bool RoundedLuma, class Chroma>
inline void yuvTailGroup(const uint16_t* s0, const uint16_t* s1, uint8_t* y0, uint8_t* y1, uint8_t* u, uint8_t* v,
                         int x) {
  auto luma = [](int32_t sum) { return uint8_t(RoundedLuma ? (sum + 32768) >> 16 : sum >> 16); };
  const int32_t a = yuvSumAt<W>(s0, x), b = yuvSumAt<W>(s0, x + 1);
  y0[x] = luma(a);
  y0[x + 1] = luma(b);
  Rgb sums = pixelAt<W>(s0, x) + pixelAt<W>(s0, x + 1);
  int32_t S = a + b;
  if (s1) {
    const int32_t c = yuvSumAt<W>(s1, x), d = yuvSumAt<W>(s1, x + 1);
    y1[x] = luma(c);
    y1[x + 1] = luma(d);
    sums = sums + pixelAt<W>(s1, x) + pixelAt<W>(s1, x + 1);
    S += c + d;
  }
  u[x / 2] = Chroma::u(sums.b, S);
  v[x / 2] = Chroma::v(sums.r, S);
}

template <class W>
void yuv420Pair(const PairRows& r, int width, bool avx2) {
  int x = vector420<W, YuvLanes>(r, yuv420End(width), avx2);
  for (; x + 2 <= width; x += 2) yuvTailGroup<W, true, YuvChromaTail4>(r.s0, r.s1, r.y0, r.y1, r.c1, r.c2, x);
}

void yuvRedLow420Pair(const PairRows& r, int width, bool avx2) {
  int x = vector420<Red565, YuvTwiceLanes<4>>(r, width & ~15, avx2);
  for (; x + 2 <= width; x += 2) yuvTailGroup<Red565, false, YuvChromaTail4>(r.s0, r.s1, r.y0, r.y1, r.c1, r.c2, x);
}

void yuvRedLow422Row(const PlaneRow& row, int width, bool avx2) {
  int x = vectorRow<Red565, YuvTwiceLanes<2>>(row.s, PlanesSink<2>{row}, width & ~15, avx2);
  for (; x + 2 <= width; x += 2)
    yuvTailGroup<Red565, false, YuvChromaTail2>(row.s, nullptr, row.y, nullptr, row.c1, row.c2, x);
}

template void studio420Pair<Blue555>(const PairRows&, int, bool);
template void studio420Pair<Blue565>(const PairRows&, int, bool);
template void studioLumaRow<Blue555>(const uint16_t*, uint8_t*, int);
template void studioLumaRow<Blue565>(const uint16_t*, uint8_t*, int);
template void studio422PlanesRow<Blue555>(const PlaneRow&, int, bool);
template void studio422PlanesRow<Blue565>(const PlaneRow&, int, bool);
template void studio422PairsRow<Blue555>(const uint16_t*, uint8_t*, int, bool);
template void studio422PairsRow<Blue565>(const uint16_t*, uint8_t*, int, bool);
template void studio411Row<Blue555>(const PlaneRow&, int, bool);
template void studio411Row<Blue565>(const PlaneRow&, int, bool);
template void yuv420Pair<Blue555>(const PairRows&, int, bool);
template void yuv420Pair<Blue565>(const PairRows&, int, bool);

}  // namespace zel::unpack
