// Rows of the subsampling encoders: RGB sources, subsampled destinations
// (planes, a luma plane with interleaved chroma pairs, 4:2:2 pair streams)
// and the row converters that run a body form over the first N pixels and
// a tail form over the rest of the whole blocks.
//
// A body runs in vector blocks of 64 pixels (512-bit tier), then 32 (AVX2)
// and 16, and its last pixels below N take the same form one block at a
// time in scalar code. The tail converts one chroma block at a time.
// Vector blocks read and write exactly the bytes of their pixels and chroma
// samples.
#pragma once

#include <cstdint>
#include <type_traits>

#include "frame/image_layout.h"
#include "frame/simd.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/repack_rows.h"
#include "luma_chroma/rgb_to_sub_forms.h"
#include "luma_chroma/rgb_to_sub_units.h"
#include "luma_chroma/vector_units.h"
#include "zelcc/zelcc.h"

namespace zel::lc::sub {

using repack::PairOrder;

// The warning of an odd width (and, where row pairs share their chroma, of
// an odd height).
inline Status oddWarning(ImageSize size, bool rows) {
  return ((size.width & 1) || (rows && (size.height & 1))) ? StatusOddSizeWarning : StatusOk;
}

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

// The source row y of an interleaved image or of three planes.
template <int Stride, bool Bgr>
struct PackedRows {
  const uint8_t* src;
  int step;
  PackedSource<Stride, Bgr> operator()(int y) const { return {PackedIn<Stride>{rowAt(src, step, y)}}; }
};

struct PlaneRows {
  const uint8_t* const* planes;
  int step;
  PlanesSource operator()(int y) const {
    return {PlanesIn{rowAt(planes[0], step, y), rowAt(planes[1], step, y), rowAt(planes[2], step, y)}};
  }
};

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
  // The quad form (see quadPairBlocks): luma of row 0 or 1 in pixel order,
  // chroma as QuadOrder leaves it.
  void quadLuma(int x, int row, __m128i y) const { store128((row ? y1 : y0) + x, y); }
  ZEL_AVX2 void quadLuma(int x, int row, __m256i y) const { store256((row ? y1 : y0) + x, y); }
  void quadChroma(int x, __m128i cc) const { More<Sse>::storeHalves(c1 + x / 2, c2 + x / 2, 8, cc); }
  ZEL_AVX2 void quadChroma(int x, __m256i cc) const;
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
  void quadLuma(int x, int row, __m128i y) const { store128((row ? y1 : y0) + x, y); }
  ZEL_AVX2 void quadLuma(int x, int row, __m256i y) const { store256((row ? y1 : y0) + x, y); }
  void quadChroma(int x, __m128i cc) const { store128(cbcr + x, _mm_shuffle_epi8(cc, load128(kZipHalves.b))); }
  ZEL_AVX2 void quadChroma(int x, __m256i cc) const;
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

// The quads of a block: luma lanes (lo: channels 0, 2; hi: channel 1) and
// the sums of neighbouring pixels' channels.
//
// With SSE4.1 a block is 16 pixels and quad k holds pixels 4k..4k+3. With
// AVX2 a block is 32 contiguous pixels and quad k holds pixels 8k..8k+3 in
// its low lane and 8k+4..8k+7 in its high lane: the lane-wise arithmetic
// then leaves the pixels in a known order, which QuadOrder restores with
// one cross-lane permutation before the stores.
template <class U>
struct Quads {
  typename U::V lo[4], hi[4], pairs[4];
};

template <class U>
struct QuadOrder;

template <>
struct QuadOrder<Sse> {
  static __m128i chunk4(const uint8_t* p, int k) { return load128(p + 16 * k); }
  // Three-byte pixels: quad k of the 48 bytes at p, its first pixel at
  // byte 0 of the vector (or at byte 4 for the last quad), see quadsOf.
  static __m128i lumaBytes(__m128i v) { return v; }
};

template <>
struct QuadOrder<Avx> {
  ZEL_AVX2 static __m256i chunk4(const uint8_t* p, int k) { return load256(p + 32 * k); }
  // Luma bytes in the order [0-3, 8-11, 16-19, 24-27 | 4-7, 12-15, ...]
  // back to pixels 0..31.
  ZEL_AVX2 static __m256i lumaBytes(__m256i v) {
    return _mm256_permutevar8x32_epi32(v, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
  }
  // Chroma bytes [c1 of blocks 0 1 4 5 8 9 12 13, c2 of them | c1 of 2 3
  // 6 7 10 11 14 15, c2 of them] to [c1 of blocks 0..15 | c2 of 0..15].
  ZEL_AVX2 static __m256i chromaPlanes(__m256i v) {
    const __m256i q = _mm256_permute4x64_epi64(v, 0xD8);
    return _mm256_shuffle_epi8(q, _mm256_broadcastsi128_si256(
                                      _mm_setr_epi8(0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15)));
  }
  // The same chroma bytes to c1, c2 pairs of blocks 0..15.
  ZEL_AVX2 static __m256i chromaPairs(__m256i v) {
    const __m256i zip = _mm256_shuffle_epi8(
        v, _mm256_broadcastsi128_si256(_mm_setr_epi8(0, 8, 1, 9, 2, 10, 3, 11, 4, 12, 5, 13, 6, 14, 7, 15)));
    return _mm256_permutevar8x32_epi32(zip, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
  }
};

ZEL_AVX2 inline void Planes420Out::quadChroma(int x, __m256i cc) const {
  const __m256i planes = QuadOrder<Avx>::chromaPlanes(cc);
  store128(c1 + x / 2, _mm256_castsi256_si128(planes));
  store128(c2 + x / 2, _mm256_extracti128_si256(planes, 1));
}
ZEL_AVX2 inline void TwoPlane420Out::quadChroma(int x, __m256i cc) const {
  store256(cbcr + x, QuadOrder<Avx>::chromaPairs(cc));
}

template <class U>
ZEL_INLINE Quads<U> quadsOf(const PackedIn<4>& in, int x) {
  using V = typename U::V;
  using M = More<U>;
  Quads<U> q;
  const V high = U::set16(0xFF00), pairs = U::shuffleOf(kQuadPairs4);
  for (int k = 0; k < 4; ++k) {
    const V c = QuadOrder<U>::chunk4(in.p + 4 * x, k);
    q.lo[k] = U::template sll16<8>(c);
    q.hi[k] = M::and_(c, high);
    q.pairs[k] = M::pairSums32(U::shuffle8(c, pairs));
  }
  return q;
}

// Three-byte pixels: each quad is shuffled out of a vector holding its
// first pixel at byte 0 (`at` 0) or at byte 4 (`at` 1).
template <class U>
ZEL_INLINE void quadFrom3(Quads<U>& q, int k, typename U::V src, typename U::V luma0, typename U::V luma1,
                          typename U::V pairs) {
  q.lo[k] = U::shuffle8(src, luma0);
  q.hi[k] = U::shuffle8(src, luma1);
  q.pairs[k] = More<U>::pairSums32(U::shuffle8(src, pairs));
}

ZEL_INLINE Quads<Sse> quadsOf3(const uint8_t* p, Sse) {
  using M = More<Sse>;
  const __m128i a = load128(p), b = load128(p + 16), c = load128(p + 32);
  // Quads 0..3 start at bytes 0, 12, 24, 36: at byte 0 of a, of b:a from
  // 12, of c:b from 8, and at byte 4 of c.
  const __m128i src[4] = {a, M::alignr<12>(b, a), M::alignr<8>(c, b), c};
  Quads<Sse> q;
  for (int k = 0; k < 4; ++k) {
    const int at = k == 3 ? 1 : 0;
    quadFrom3<Sse>(q, k, src[k], load128(kQuadLuma3[at][0].b), load128(kQuadLuma3[at][1].b),
                   load128(kQuadPairs3[at].b));
  }
  return q;
}

// A pattern for each lane.
ZEL_AVX2 inline __m256i both(const Shuffle16& lo, const Shuffle16& hi) {
  return _mm256_inserti128_si256(_mm256_castsi128_si256(load128(lo.b)), load128(hi.b), 1);
}

ZEL_AVX2 inline Quads<Avx> quadsOf3(const uint8_t* p, Avx) {
  // Quad k: pixels 8k..8k+3 from byte 24k in the low lane, 8k+4..8k+7 from
  // byte 24k + 12, that is byte 4 of the high lane after the qwords of
  // 24k.. are spread as 0, 1 | 1, 2. The last quad loads from byte 64 (the
  // block ends at 96) and spreads qwords 1, 2 | 2, 3.
  const __m256i l0 = both(kQuadLuma3[0][0], kQuadLuma3[1][0]), l1 = both(kQuadLuma3[0][1], kQuadLuma3[1][1]),
                pr = both(kQuadPairs3[0], kQuadPairs3[1]);
  Quads<Avx> q;
  for (int k = 0; k < 3; ++k) quadFrom3<Avx>(q, k, _mm256_permute4x64_epi64(load256(p + 24 * k), 0x94), l0, l1, pr);
  quadFrom3<Avx>(q, 3, _mm256_permute4x64_epi64(load256(p + 64), 0xE9), l0, l1, pr);
  return q;
}

template <class U>
ZEL_INLINE Quads<U> quadsOf(const PackedIn<3>& in, int x) {
  return quadsOf3(in.p + 3 * x, U{});
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
  return QuadOrder<U>::lumaBytes(U::packU8(body.template quadLuma<U>(M::hadd16(t[0], t[1])),
                                          body.template quadLuma<U>(M::hadd16(t[2], t[3]))));
}

template <class U, bool Bgr, int Stride, class Body, class Out>
ZEL_INLINE int quadPairBlocks(const PackedIn<Stride>& topIn, const PackedIn<Stride>& bottomIn, const Out& outIn, int x,
                              int end, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  // Local copies: the byte stores cannot alias them, so the row pointers
  // stay in registers.
  const PackedIn<Stride> rows[2] = {topIn, bottomIn};
  const Out out = outIn;
  for (; x + U::kPixels <= end; x += U::kPixels) {
    V s[4];
    for (int r = 0; r < 2; ++r) {
      const Quads<U> q = quadsOf<U>(rows[r], x);
      V y = quadLuma<U, Bgr>(q, body);
      if constexpr (Body::kNarrow) y = M::clampNarrow(y);
      out.quadLuma(x, r, y);
      for (int k = 0; k < 4; ++k) s[k] = r ? U::add16(s[k], q.pairs[k]) : q.pairs[k];
    }
    // s[k]: channel 0 of blocks 2k, 2k + 1, channel 1 of them, channel 2.
    const V a = M::unpackLo32(s[0], s[1]), b = M::unpackHi32(s[0], s[1]);
    const V c = M::unpackLo32(s[2], s[3]), d = M::unpackHi32(s[2], s[3]);
    const V ch0 = M::unpackLo64(a, c), ch1 = M::unpackHi64(a, c), ch2 = M::unpackLo64(b, d);
    V c1, c2;
    body.template chromaOf32<U>(Bgr ? ch2 : ch0, ch1, Bgr ? ch0 : ch2, c1, c2);
    V cc = U::packU8(c1, c2);
    if constexpr (Body::kNarrow) cc = M::clampNarrow(cc);
    out.quadChroma(x, cc);
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
ZEL_INLINE int rowBlocks(const Src& inRow, const Out& outRow, int x, int end, const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  // Local copies: the byte stores cannot alias them, so the row pointers
  // stay in registers.
  const Src in = inRow;
  const Out out = outRow;
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
ZEL_INLINE int pairBlocks(const Src& topRow, const Src& bottomRow, const Out& outRow, int x, int end,
                          const Body& body) {
  using V = typename U::V;
  using M = More<U>;
  // The 512-bit tier splits pixels into planes by byte permutes instead.
  if constexpr (QuadSource<Src>::value && TakesQuads<Body>::value && !std::is_same_v<U, Avx512>)
    return quadPairBlocks<U, QuadSource<Src>::kBgr>(topRow.in, bottomRow.in, outRow, x, end, body);
  // Local copies, as in rowBlocks.
  const Src top = topRow, bottom = bottomRow;
  const Out out = outRow;
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
ZEL_AVX2 __attribute__((flatten)) int rowBlocksAvx(const Src& in, const Out& out, int x, int end, const Body& body) {
  return rowBlocks<Avx, Ratio>(in, out, x, end, body);
}
template <int Ratio, class Body, class Src, class Out>
ZEL_AVX512_VBMI __attribute__((flatten)) int rowBlocksAvx512(const Src& in, const Out& out, int x, int end,
                                                             const Body& body) {
  return rowBlocks<Avx512, Ratio>(in, out, x, end, body);
}

template <class Body, class Src, class Out>
ZEL_AVX2 __attribute__((flatten)) int pairBlocksAvx(const Src& top, const Src& bottom, const Out& out, int x, int end,
                                                    const Body& body) {
  return pairBlocks<Avx>(top, bottom, out, x, end, body);
}
template <class Body, class Src, class Out>
ZEL_AVX512_VBMI __attribute__((flatten)) int pairBlocksAvx512(const Src& top, const Src& bottom, const Out& out, int x,
                                                              int end, const Body& body) {
  return pairBlocks<Avx512>(top, bottom, out, x, end, body);
}

// The vector blocks of [0, end): the widest unit of the tier first, then
// the narrower ones on what is left. Returns the end of the last block.
template <int Ratio, class Body, class Src, class Out>
inline int rowVectorBlocks(const Src& in, const Out& out, int end, const Body& body, VectorTier tier) {
  int x = 0;
  if (tier >= VectorTier::Avx512) x = rowBlocksAvx512<Ratio>(in, out, x, end, body);
  if (tier >= VectorTier::Avx2) x = rowBlocksAvx<Ratio>(in, out, x, end, body);
  return rowBlocks<Sse, Ratio>(in, out, x, end, body);
}
template <class Body, class Src, class Out>
inline int pairVectorBlocks(const Src& top, const Src& bottom, const Out& out, int end, const Body& body,
                            VectorTier tier) {
  int x = 0;
  if (tier >= VectorTier::Avx512) x = pairBlocksAvx512(top, bottom, out, x, end, body);
  if (tier >= VectorTier::Avx2) x = pairBlocksAvx(top, bottom, out, x, end, body);
  return pairBlocks<Sse>(top, bottom, out, x, end, body);
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
inline void convertRow(const Src& in, const Out& out, int width, int n, const Body& body, const Tail& tail,
                       VectorTier tier) {
  rowSpan<Ratio>(in, out, rowVectorBlocks<Ratio>(in, out, n, body, tier), n, body);
  rowSpan<Ratio>(in, out, n, width & ~(Ratio - 1), tail);
  if constexpr (Ratio == 2)
    if (width & 1) out.odd(width - 1, tail.odd(in.pixel(width - 1)));
}

// A row pair of 4:2:0; a last odd column is not written.
template <class Body, class Tail, class Src, class Out>
inline void convertPair(const Src& top, const Src& bottom, const Out& out, int width, int n, const Body& body,
                        const Tail& tail, VectorTier tier) {
  pairSpan(top, bottom, out, pairVectorBlocks(top, bottom, out, n, body, tier), n, body);
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
