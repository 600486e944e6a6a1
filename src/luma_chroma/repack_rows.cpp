#include "luma_chroma/repack_rows.h"

#include <array>
#include <cstring>

#include "frame/image_layout.h"
#include "frame/simd.h"

namespace zel::repack {

namespace {

using Mask = std::array<int8_t, 16>;

// Eight pairs (16 bytes: two vectors' worth of a 32-byte block) are first
// gathered per vector into Y0..Y7 | Cb0..Cb3 | Cr0..Cr3.
constexpr Mask gatherMask(PairOrder o) {
  const PairSlots s = slotsOf(o);
  Mask m{};
  for (int p = 0; p < 4; ++p) {
    m[2 * p] = int8_t(4 * p + s.y0);
    m[2 * p + 1] = int8_t(4 * p + s.y1);
    m[8 + p] = int8_t(4 * p + s.cb);
    m[12 + p] = int8_t(4 * p + s.cr);
  }
  return m;
}

constexpr Mask inverse(const Mask& m) {
  Mask inv{};
  for (int i = 0; i < 16; ++i) inv[m[i]] = int8_t(i);
  return inv;
}

constexpr std::array<Mask, 3> kGather = {gatherMask(PairOrder::YCbCr), gatherMask(PairOrder::YCrCb),
                                         gatherMask(PairOrder::CbYCr)};
constexpr std::array<Mask, 3> kScatter = {inverse(kGather[0]), inverse(kGather[1]), inverse(kGather[2])};

inline __m128i maskOf(const Mask& m) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(m.data())); }

inline void put(void* p, __m128i v, bool nonTemporal) {
  if (nonTemporal && (reinterpret_cast<uintptr_t>(p) & 15u) == 0)
    storeStream128(p, v);
  else
    store128(p, v);
}

// A target on a 16-byte boundary streams its 32 bytes as two halves.
ZEL_AVX2 inline void put256(void* p, __m256i v, bool nonTemporal) {
  const uintptr_t a = reinterpret_cast<uintptr_t>(p);
  if (nonTemporal && (a & 31u) == 0) {
    _mm256_stream_si256(static_cast<__m256i*>(p), v);
  } else if (nonTemporal && (a & 15u) == 0) {
    storeStream128(p, _mm256_castsi256_si128(v));
    storeStream128(static_cast<uint8_t*>(p) + 16, _mm256_extracti128_si256(v, 1));
  } else {
    store256(p, v);
  }
}

// AVX2 bodies: 32 pixels a step, each 128-bit lane doing what one SSE
// step does; they return the pixels done.
ZEL_AVX2 int splitPairsAvx(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels) {
  const __m256i g = _mm256_broadcastsi128_si256(maskOf(kGather[int(o)]));
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    // Lanes: pairs 0-3 | 8-11 and 4-7 | 12-15.
    const __m256i v0 = load256(in + 2 * x), v1 = load256(in + 2 * x + 32);
    const __m256i a = _mm256_shuffle_epi8(_mm256_permute2x128_si256(v0, v1, 0x20), g);  // Y0-7 c0-3 | Y16-23 c8-11
    const __m256i b = _mm256_shuffle_epi8(_mm256_permute2x128_si256(v0, v1, 0x31), g);  // Y8-15 c4-7 | Y24-31 c12-15
    store256(y + x, _mm256_unpacklo_epi64(a, b));
    const __m256i c = _mm256_unpackhi_epi32(a, b);  // Cb0-7 Cr0-7 | Cb8-15 Cr8-15
    const __m256i q = _mm256_permute4x64_epi64(c, _MM_SHUFFLE(3, 1, 2, 0));  // Cb0-15 | Cr0-15
    store128(cb + x / 2, _mm256_castsi256_si128(q));
    store128(cr + x / 2, _mm256_extracti128_si256(q, 1));
  }
  return x;
}

ZEL_AVX2 ZEL_INLINE int mergePairBlocks(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o,
                                        uint8_t* out, int pixels, bool nonTemporal) {
  const __m256i s = _mm256_broadcastsi128_si256(maskOf(kScatter[int(o)]));
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    const __m256i luma = load256(y + x);
    const __m128i b16 = load128(cb + x / 2), r16 = load128(cr + x / 2);
    const __m256i chroma = _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_unpacklo_epi32(b16, r16)),
                                                   _mm_unpackhi_epi32(b16, r16), 1);
    const __m256i a = _mm256_shuffle_epi8(_mm256_unpacklo_epi64(luma, chroma), s);  // px 0-7 | 16-23
    const __m256i b = _mm256_shuffle_epi8(_mm256_unpackhi_epi64(luma, chroma), s);  // px 8-15 | 24-31
    put256(out + 2 * x, _mm256_permute2x128_si256(a, b, 0x20), nonTemporal);
    put256(out + 2 * x + 32, _mm256_permute2x128_si256(a, b, 0x31), nonTemporal);
  }
  return x;
}
ZEL_AVX2 int mergePairsAvx(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out,
                           int pixels, bool nonTemporal) {
  return mergePairBlocks(y, cb, cr, o, out, pixels, nonTemporal);
}

ZEL_AVX2 int zipAvx(const uint8_t* a, const uint8_t* b, uint8_t* out, int n, bool nonTemporal) {
  int k = 0;
  // Samples widened to 16 bits, the second moved to the high byte.
  for (; k + 32 <= n; k += 32) {
    const __m256i lo = _mm256_or_si256(_mm256_cvtepu8_epi16(load128(a + k)),
                                       _mm256_slli_epi16(_mm256_cvtepu8_epi16(load128(b + k)), 8));
    const __m256i hi = _mm256_or_si256(_mm256_cvtepu8_epi16(load128(a + k + 16)),
                                       _mm256_slli_epi16(_mm256_cvtepu8_epi16(load128(b + k + 16)), 8));
    put256(out + 2 * k, lo, nonTemporal);
    put256(out + 2 * k + 32, hi, nonTemporal);
  }
  return k;
}

ZEL_AVX2 int unzipAvx(const uint8_t* in, uint8_t* a, uint8_t* b, int n) {
  const __m256i m = _mm256_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, 1, 3, 5, 7, 9, 11, 13, 15, 0, 2, 4, 6, 8, 10, 12, 14,
                                     1, 3, 5, 7, 9, 11, 13, 15);
  int k = 0;
  for (; k + 32 <= n; k += 32) {
    const __m256i lo = _mm256_shuffle_epi8(load256(in + 2 * k), m);       // a0-7 b0-7 | a8-15 b8-15
    const __m256i hi = _mm256_shuffle_epi8(load256(in + 2 * k + 32), m);  // a16-23 b16-23 | a24-31 b24-31
    const __m256i av = _mm256_unpacklo_epi64(lo, hi), bv = _mm256_unpackhi_epi64(lo, hi);  // a0-7 a16-23 | a8-15 a24-31
    store256(a + k, _mm256_permute4x64_epi64(av, _MM_SHUFFLE(3, 1, 2, 0)));
    store256(b + k, _mm256_permute4x64_epi64(bv, _MM_SHUFFLE(3, 1, 2, 0)));
  }
  return k;
}

// Byte moves of one pair order into another, for 16 bytes (four pairs).
Mask reorderMask(PairOrder from, PairOrder to) {
  const PairSlots f = slotsOf(from), t = slotsOf(to);
  Mask m{};
  for (int p = 0; p < 4; ++p) {
    m[4 * p + t.y0] = int8_t(4 * p + f.y0);
    m[4 * p + t.y1] = int8_t(4 * p + f.y1);
    m[4 * p + t.cb] = int8_t(4 * p + f.cb);
    m[4 * p + t.cr] = int8_t(4 * p + f.cr);
  }
  return m;
}

ZEL_AVX2 int reorderPairsAvx(const uint8_t* in, const Mask& mask, uint8_t* out, int pixels, bool nonTemporal) {
  const __m256i m = _mm256_broadcastsi128_si256(maskOf(mask));
  int x = 0;
  for (; x + 16 <= pixels; x += 16) put256(out + 2 * x, _mm256_shuffle_epi8(load256(in + 2 * x), m), nonTemporal);
  return x;
}

inline void store32(void* p, __m128i v) {
  const int32_t w = _mm_cvtsi128_si32(v);
  __builtin_memcpy(p, &w, 4);
}

// Per 16 bytes (four pairs): Y0..Y7, then the chroma that a planar target of
// another scheme keeps, the other bytes cleared.
constexpr Mask gather411Mask(PairOrder o) {  // Y0-7 | Cb0 Cb2 Cr0 Cr2
  const PairSlots s = slotsOf(o);
  Mask m{};
  for (int i = 0; i < 16; ++i) m[i] = -1;
  for (int p = 0; p < 4; ++p) {
    m[2 * p] = int8_t(4 * p + s.y0);
    m[2 * p + 1] = int8_t(4 * p + s.y1);
  }
  m[8] = int8_t(s.cb);
  m[9] = int8_t(8 + s.cb);
  m[10] = int8_t(s.cr);
  m[11] = int8_t(8 + s.cr);
  return m;
}
constexpr Mask gatherCbCrMask(PairOrder o) {  // Y0-7 | Cb0 Cr0 Cb1 Cr1 ... Cb3 Cr3
  const PairSlots s = slotsOf(o);
  Mask m{};
  for (int p = 0; p < 4; ++p) {
    m[2 * p] = int8_t(4 * p + s.y0);
    m[2 * p + 1] = int8_t(4 * p + s.y1);
    m[8 + 2 * p] = int8_t(4 * p + s.cb);
    m[9 + 2 * p] = int8_t(4 * p + s.cr);
  }
  return m;
}
constexpr Mask gatherCbCr411Mask(PairOrder o) {  // Y0-7 | Cb0 Cr0 Cb2 Cr2
  Mask m = gather411Mask(o);
  const PairSlots s = slotsOf(o);
  m[8] = int8_t(s.cb);
  m[9] = int8_t(s.cr);
  m[10] = int8_t(8 + s.cb);
  m[11] = int8_t(8 + s.cr);
  return m;
}
constexpr std::array<Mask, 3> k411 = {gather411Mask(PairOrder::YCbCr), gather411Mask(PairOrder::YCrCb),
                                      gather411Mask(PairOrder::CbYCr)};
constexpr std::array<Mask, 3> kCbCr = {gatherCbCrMask(PairOrder::YCbCr), gatherCbCrMask(PairOrder::YCrCb),
                                       gatherCbCrMask(PairOrder::CbYCr)};
constexpr std::array<Mask, 3> kCbCr411 = {gatherCbCr411Mask(PairOrder::YCbCr), gatherCbCr411Mask(PairOrder::YCrCb),
                                          gatherCbCr411Mask(PairOrder::CbYCr)};

// 64 bytes of pairs (32 pixels) shuffled per 128-bit lane by `g`: `a` holds
// pairs 0-3 | 8-11, `b` pairs 4-7 | 12-15, so unpacking their 64-bit halves
// gives luma 0-31 in order.
struct LaneGather {
  __m256i a, b;
};
ZEL_AVX2 ZEL_INLINE LaneGather gatherLanes(const uint8_t* in, __m256i g) {
  const __m256i v0 = load256(in), v1 = load256(in + 32);
  return {_mm256_shuffle_epi8(_mm256_permute2x128_si256(v0, v1, 0x20), g),
          _mm256_shuffle_epi8(_mm256_permute2x128_si256(v0, v1, 0x31), g)};
}

// Luma is the low byte of every 16-bit word (the high byte for CbYCr):
// words narrowed, then the lanes put in order.
ZEL_AVX2 int lumaOfPairsAvx(const uint8_t* in, PairOrder o, uint8_t* y, int pixels) {
  const __m256i low = _mm256_set1_epi16(0x00FF);
  const bool high = o == PairOrder::CbYCr;
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    __m256i a = load256(in + 2 * x), b = load256(in + 2 * x + 32);
    a = high ? _mm256_srli_epi16(a, 8) : _mm256_and_si256(a, low);
    b = high ? _mm256_srli_epi16(b, 8) : _mm256_and_si256(b, low);
    store256(y + x, _mm256_permute4x64_epi64(_mm256_packus_epi16(a, b), _MM_SHUFFLE(3, 1, 2, 0)));
  }
  return x;
}

ZEL_AVX2 int splitPairs411Avx(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels) {
  const __m256i g = _mm256_broadcastsi128_si256(maskOf(k411[int(o)]));
  const __m256i order = _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7);
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    const LaneGather v = gatherLanes(in + 2 * x, g);
    store256(y + x, _mm256_unpacklo_epi64(v.a, v.b));
    // Cb0-3 Cr0-3 | Cb4-7 Cr4-7 in the low halves, then Cb0-7 Cr0-7.
    const __m128i c =
        _mm256_castsi256_si128(_mm256_permutevar8x32_epi32(_mm256_unpackhi_epi16(v.a, v.b), order));
    store64(cb + x / 4, c);
    store64(cr + x / 4, _mm_unpackhi_epi64(c, c));
  }
  return x;
}

ZEL_AVX2 int splitPairsToCbCrAvx(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels,
                                 bool nonTemporal) {
  const __m256i g = _mm256_broadcastsi128_si256(maskOf(kCbCr[int(o)]));
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    const LaneGather v = gatherLanes(in + 2 * x, g);
    put256(y + x, _mm256_unpacklo_epi64(v.a, v.b), nonTemporal);
    put256(cbcr + x, _mm256_unpackhi_epi64(v.a, v.b), nonTemporal);
  }
  return x;
}

ZEL_AVX2 int splitPairsToCbCr411Avx(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels,
                                    bool nonTemporal) {
  const __m256i g = _mm256_broadcastsi128_si256(maskOf(kCbCr411[int(o)]));
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    const LaneGather v = gatherLanes(in + 2 * x, g);
    put256(y + x, _mm256_unpacklo_epi64(v.a, v.b), nonTemporal);
    const __m256i c = _mm256_permute4x64_epi64(_mm256_unpackhi_epi32(v.a, v.b), _MM_SHUFFLE(3, 1, 2, 0));
    put(cbcr + x / 2, _mm256_castsi256_si128(c), nonTemporal);
  }
  return x;
}

// Luma and the (Cb, Cr) byte pair of each output pair into a pair stream:
// bytes interleave, with the chroma pair's bytes swapped for YCrCb and
// leading for CbYCr.
inline void weave(__m128i luma, __m128i chroma, PairOrder o, __m128i& lo, __m128i& hi) {
  if (o == PairOrder::CbYCr) {
    lo = _mm_unpacklo_epi8(chroma, luma);
    hi = _mm_unpackhi_epi8(chroma, luma);
    return;
  }
  if (o == PairOrder::YCrCb) chroma = _mm_or_si128(_mm_slli_epi16(chroma, 8), _mm_srli_epi16(chroma, 8));
  lo = _mm_unpacklo_epi8(luma, chroma);
  hi = _mm_unpackhi_epi8(luma, chroma);
}
ZEL_AVX2 ZEL_INLINE void weave(__m256i luma, __m256i chroma, PairOrder o, __m256i& lo, __m256i& hi) {
  if (o == PairOrder::CbYCr) {
    lo = _mm256_unpacklo_epi8(chroma, luma);
    hi = _mm256_unpackhi_epi8(chroma, luma);
    return;
  }
  if (o == PairOrder::YCrCb) chroma = _mm256_or_si256(_mm256_slli_epi16(chroma, 8), _mm256_srli_epi16(chroma, 8));
  lo = _mm256_unpacklo_epi8(luma, chroma);
  hi = _mm256_unpackhi_epi8(luma, chroma);
}

// 32 pixels a step: luma 0-31 and the chroma pairs of output pairs 0-7 |
// 8-15 per lane.
ZEL_AVX2 ZEL_INLINE void putWoven(uint8_t* out, __m256i luma, __m256i chroma, PairOrder o, bool nonTemporal) {
  __m256i lo, hi;
  weave(luma, chroma, o, lo, hi);
  put256(out, _mm256_permute2x128_si256(lo, hi, 0x20), nonTemporal);
  put256(out + 32, _mm256_permute2x128_si256(lo, hi, 0x31), nonTemporal);
}
inline void putWoven(uint8_t* out, __m128i luma, __m128i chroma, PairOrder o, bool nonTemporal) {
  __m128i lo, hi;
  weave(luma, chroma, o, lo, hi);
  put(out, lo, nonTemporal);
  put(out + 16, hi, nonTemporal);
}

// Each (Cb, Cr) byte pair of `p` twice: 4:1:1 samples for two output pairs.
ZEL_AVX2 ZEL_INLINE __m256i doublePairs(__m128i p) {
  return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_unpacklo_epi16(p, p)), _mm_unpackhi_epi16(p, p), 1);
}

ZEL_AVX2 int mergePairsCbCrAvx(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels,
                               bool nonTemporal) {
  int x = 0;
  for (; x + 32 <= pixels; x += 32) putWoven(out + 2 * x, load256(y + x), load256(cbcr + x), o, nonTemporal);
  return x;
}

ZEL_AVX2 int mergePairs411Avx(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out,
                              int pixels, bool nonTemporal) {
  int x = 0;
  for (; x + 32 <= pixels; x += 32) {
    const __m128i p = _mm_unpacklo_epi8(load64(cb + x / 4), load64(cr + x / 4));
    putWoven(out + 2 * x, load256(y + x), doublePairs(p), o, nonTemporal);
  }
  return x;
}

ZEL_AVX2 int mergePairsCbCr411Avx(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels,
                                  bool nonTemporal) {
  int x = 0;
  for (; x + 32 <= pixels; x += 32)
    putWoven(out + 2 * x, load256(y + x), doublePairs(load128(cbcr + x / 2)), o, nonTemporal);
  return x;
}

ZEL_AVX2 int keepEvenAvx(const uint8_t* in, uint8_t* out, int n) {
  const __m256i m = _mm256_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, -1, -1, -1, -1, -1, -1, -1, -1, 0, 2, 4, 6, 8, 10,
                                     12, 14, -1, -1, -1, -1, -1, -1, -1, -1);
  int k = 0;
  for (; k + 32 <= n; k += 32) {
    const __m256i lo = _mm256_shuffle_epi8(load256(in + 2 * k), m);       // 0-7 | 8-15
    const __m256i hi = _mm256_shuffle_epi8(load256(in + 2 * k + 32), m);  // 16-23 | 24-31
    store256(out + k, _mm256_permute4x64_epi64(_mm256_unpacklo_epi64(lo, hi), _MM_SHUFFLE(3, 1, 2, 0)));
  }
  return k;
}

ZEL_AVX2 int unzipDoubleAvx(const uint8_t* in, uint8_t* a, uint8_t* b, int n) {
  const __m256i ma = _mm256_setr_epi8(0, 0, 2, 2, 4, 4, 6, 6, 8, 8, 10, 10, 12, 12, 14, 14, 0, 0, 2, 2, 4, 4, 6, 6,
                                      8, 8, 10, 10, 12, 12, 14, 14);
  const __m256i mb = _mm256_add_epi8(ma, _mm256_set1_epi8(1));
  int k = 0;
  for (; k + 16 <= n; k += 16) {
    const __m256i v = load256(in + 2 * k);
    store256(a + 2 * k, _mm256_shuffle_epi8(v, ma));
    store256(b + 2 * k, _mm256_shuffle_epi8(v, mb));
  }
  return k;
}

ZEL_AVX2 int zipEvensAvx(const uint8_t* a, const uint8_t* b, uint8_t* out, int n) {
  const __m256i low = _mm256_set1_epi16(0x00FF);
  int k = 0;
  for (; k + 16 <= n; k += 16)
    store256(out + 2 * k,
             _mm256_or_si256(_mm256_and_si256(load256(a + 2 * k), low), _mm256_slli_epi16(load256(b + 2 * k), 8)));
  return k;
}

// Even 16-bit words to the low half of each lane, odd ones to the high half.
constexpr Mask kWordsByParity = {0, 1, 4, 5, 8, 9, 12, 13, 2, 3, 6, 7, 10, 11, 14, 15};

ZEL_AVX2 int crossPairsAvx(const uint8_t* a, const uint8_t* b, uint8_t* even, uint8_t* odd, int n) {
  const __m256i m = _mm256_broadcastsi128_si256(maskOf(kWordsByParity));
  int k = 0;
  for (; k + 32 <= n; k += 32) {
    const __m256i va = load256(a + k), vb = load256(b + k);
    const __m256i lo = _mm256_shuffle_epi8(_mm256_unpacklo_epi8(va, vb), m);  // words 0-7 | 16-23 by parity
    const __m256i hi = _mm256_shuffle_epi8(_mm256_unpackhi_epi8(va, vb), m);  // words 8-15 | 24-31
    store256(even + k, _mm256_unpacklo_epi64(lo, hi));
    store256(odd + k, _mm256_unpackhi_epi64(lo, hi));
  }
  return k;
}

ZEL_AVX2 int zip4Avx(const uint8_t* a, const uint8_t* b, const uint8_t* c, const uint8_t* d, uint8_t* out, int n) {
  int k = 0;
  for (; k + 32 <= n; k += 32) {
    const __m256i va = load256(a + k), vb = load256(b + k), vc = load256(c + k), vd = load256(d + k);
    const __m256i abLo = _mm256_unpacklo_epi8(va, vb), abHi = _mm256_unpackhi_epi8(va, vb);
    const __m256i cdLo = _mm256_unpacklo_epi8(vc, vd), cdHi = _mm256_unpackhi_epi8(vc, vd);
    const __m256i w0 = _mm256_unpacklo_epi16(abLo, cdLo), w1 = _mm256_unpackhi_epi16(abLo, cdLo);  // 0-3 4-7 | 16-23
    const __m256i w2 = _mm256_unpacklo_epi16(abHi, cdHi), w3 = _mm256_unpackhi_epi16(abHi, cdHi);  // 8-15 | 24-31
    store256(out + 4 * k, _mm256_permute2x128_si256(w0, w1, 0x20));
    store256(out + 4 * k + 32, _mm256_permute2x128_si256(w2, w3, 0x20));
    store256(out + 4 * k + 64, _mm256_permute2x128_si256(w0, w1, 0x31));
    store256(out + 4 * k + 96, _mm256_permute2x128_si256(w2, w3, 0x31));
  }
  return k;
}

}  // namespace

void reorderPairs(const uint8_t* in, PairOrder from, uint8_t* out, PairOrder to, int pixels, bool nonTemporal) {
  const Mask mask = reorderMask(from, to);
  int x = hasAvx2() ? reorderPairsAvx(in, mask, out, pixels, nonTemporal) : 0;
  const __m128i m = maskOf(mask);
  for (; x + 8 <= pixels; x += 8) put(out + 2 * x, _mm_shuffle_epi8(load128(in + 2 * x), m), nonTemporal);
  for (; x < pixels; x += 2) {
    uint8_t y[2], cb, cr;
    splitPair(in + 2 * x, from, y, &cb, &cr);
    mergePair(y, cb, cr, to, out + 2 * x);
  }
}

void splitPairs(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels) {
  const __m128i g = maskOf(kGather[int(o)]);
  int x = hasAvx2() ? splitPairsAvx(in, o, y, cb, cr, pixels) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i a = _mm_shuffle_epi8(load128(in + 2 * x), g);       // Y0-7 Cb0-3 Cr0-3
    const __m128i b = _mm_shuffle_epi8(load128(in + 2 * x + 16), g);  // Y8-15 Cb4-7 Cr4-7
    store128(y + x, _mm_unpacklo_epi64(a, b));
    const __m128i c = _mm_unpackhi_epi32(a, b);  // Cb0-3 Cb4-7 Cr0-3 Cr4-7
    store64(cb + x / 2, c);
    store64(cr + x / 2, _mm_unpackhi_epi64(c, c));
  }
  for (; x < pixels; x += 2) splitPair(in + 2 * x, o, y + x, cb + x / 2, cr + x / 2);
}

namespace {

// The rest of a woven row from pixel x (a multiple of 16).
void mergePairsFrom(int x, const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out,
                    int pixels, bool nonTemporal) {
  const __m128i s = maskOf(kScatter[int(o)]);
  for (; x + 16 <= pixels; x += 16) {
    const __m128i luma = load128(y + x);
    const __m128i chroma = _mm_unpacklo_epi32(load64(cb + x / 2), load64(cr + x / 2));  // Cb0-3 Cr0-3 Cb4-7 Cr4-7
    put(out + 2 * x, _mm_shuffle_epi8(_mm_unpacklo_epi64(luma, chroma), s), nonTemporal);
    put(out + 2 * x + 16, _mm_shuffle_epi8(_mm_unpackhi_epi64(luma, chroma), s), nonTemporal);
  }
  for (; x < pixels; x += 2) mergePair(y + x, cb[x / 2], cr[x / 2], o, out + 2 * x);
}

// Rows at a few nanoseconds each are worth a walk inside the vector code.
struct PairRow {
  const uint8_t *y, *cb, *cr;
  uint8_t* out;
};
inline PairRow pairRow(const PairRows& r, int row) {
  const int c = row / r.lumaRowsPerChromaRow;
  return {rowAt(r.y, r.yStep, row), rowAt(r.cb, r.cbStep, c), rowAt(r.cr, r.crStep, c), rowAt(r.out, r.outStep, row)};
}
// The store kind is a constant of each loop.
template <bool NonTemporal>
ZEL_AVX2 void mergePairRowsAvx(const PairRows& r, PairOrder o, int width, int height) {
  for (int row = 0; row < height; ++row) {
    const PairRow p = pairRow(r, row);
    const int x = mergePairBlocks(p.y, p.cb, p.cr, o, p.out, width, NonTemporal);
    if (x < width) mergePairsFrom(x, p.y, p.cb, p.cr, o, p.out, width, NonTemporal);
  }
}

}  // namespace

void mergePairs(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out, int pixels,
                bool nonTemporal) {
  const int x = hasAvx2() ? mergePairsAvx(y, cb, cr, o, out, pixels, nonTemporal) : 0;
  mergePairsFrom(x, y, cb, cr, o, out, pixels, nonTemporal);
}

void mergePairRows(const PairRows& r, PairOrder o, int width, int height, bool nonTemporal) {
  if (hasAvx2()) {
    if (nonTemporal)
      mergePairRowsAvx<true>(r, o, width, height);
    else
      mergePairRowsAvx<false>(r, o, width, height);
    return;
  }
  for (int row = 0; row < height; ++row) {
    const int c = row / r.lumaRowsPerChromaRow;
    mergePairs(rowAt(r.y, r.yStep, row), rowAt(r.cb, r.cbStep, c), rowAt(r.cr, r.crStep, c), o,
               rowAt(r.out, r.outStep, row), width, nonTemporal);
  }
}

void lumaOfPairs(const uint8_t* in, PairOrder o, uint8_t* y, int pixels) {
  const __m128i g = maskOf(kGather[int(o)]);
  int x = hasAvx2() ? lumaOfPairsAvx(in, o, y, pixels) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i a = _mm_shuffle_epi8(load128(in + 2 * x), g);
    const __m128i b = _mm_shuffle_epi8(load128(in + 2 * x + 16), g);
    store128(y + x, _mm_unpacklo_epi64(a, b));
  }
  const PairSlots s = slotsOf(o);
  for (; x < pixels; ++x) y[x] = in[4 * (x / 2) + ((x & 1) ? s.y1 : s.y0)];
}

void zip(const uint8_t* a, const uint8_t* b, uint8_t* out, int n, bool nonTemporal) {
  int k = hasAvx2() ? zipAvx(a, b, out, n, nonTemporal) : 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i va = load128(a + k), vb = load128(b + k);
    put(out + 2 * k, _mm_unpacklo_epi8(va, vb), nonTemporal);
    put(out + 2 * k + 16, _mm_unpackhi_epi8(va, vb), nonTemporal);
  }
  for (; k < n; ++k) {
    out[2 * k] = a[k];
    out[2 * k + 1] = b[k];
  }
}

void unzip(const uint8_t* in, uint8_t* a, uint8_t* b, int n) {
  const __m128i m = _mm_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, 1, 3, 5, 7, 9, 11, 13, 15);
  int k = hasAvx2() ? unzipAvx(in, a, b, n) : 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i lo = _mm_shuffle_epi8(load128(in + 2 * k), m);       // a0-7 b0-7
    const __m128i hi = _mm_shuffle_epi8(load128(in + 2 * k + 16), m);  // a8-15 b8-15
    store128(a + k, _mm_unpacklo_epi64(lo, hi));
    store128(b + k, _mm_unpackhi_epi64(lo, hi));
  }
  for (; k < n; ++k) {
    a[k] = in[2 * k];
    b[k] = in[2 * k + 1];
  }
}

void keepEven(const uint8_t* in, uint8_t* out, int n) {
  const __m128i m = _mm_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, -1, -1, -1, -1, -1, -1, -1, -1);
  int k = hasAvx2() ? keepEvenAvx(in, out, n) : 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i lo = _mm_shuffle_epi8(load128(in + 2 * k), m);
    const __m128i hi = _mm_shuffle_epi8(load128(in + 2 * k + 16), m);
    store128(out + k, _mm_unpacklo_epi64(lo, hi));
  }
  for (; k < n; ++k) out[k] = in[2 * k];
}

void doubleSamples(const uint8_t* in, uint8_t* out, int n, bool nonTemporal) { zip(in, in, out, n, nonTemporal); }

void splitPairs411(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels) {
  const __m128i g = maskOf(k411[int(o)]);
  int x = hasAvx2() ? splitPairs411Avx(in, o, y, cb, cr, pixels) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i a = _mm_shuffle_epi8(load128(in + 2 * x), g);       // Y0-7 Cb0 Cb2 Cr0 Cr2
    const __m128i b = _mm_shuffle_epi8(load128(in + 2 * x + 16), g);  // Y8-15 Cb4 Cb6 Cr4 Cr6
    store128(y + x, _mm_unpacklo_epi64(a, b));
    const __m128i c = _mm_unpackhi_epi16(a, b);  // Cb0 Cb2 Cb4 Cb6 Cr0 Cr2 Cr4 Cr6
    store32(cb + x / 4, c);
    store32(cr + x / 4, _mm_srli_si128(c, 4));
  }
  for (; x < pixels; x += 4) {
    uint8_t skip[2];
    splitPair(in + 2 * x, o, y + x, cb + x / 4, cr + x / 4);
    splitPair(in + 2 * x + 4, o, y + x + 2, &skip[0], &skip[1]);
  }
}

void splitPairsToCbCr(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels, bool nonTemporal) {
  const __m128i g = maskOf(kCbCr[int(o)]);
  int x = hasAvx2() ? splitPairsToCbCrAvx(in, o, y, cbcr, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i a = _mm_shuffle_epi8(load128(in + 2 * x), g);       // Y0-7 (Cb Cr)0-3
    const __m128i b = _mm_shuffle_epi8(load128(in + 2 * x + 16), g);  // Y8-15 (Cb Cr)4-7
    put(y + x, _mm_unpacklo_epi64(a, b), nonTemporal);
    put(cbcr + x, _mm_unpackhi_epi64(a, b), nonTemporal);
  }
  for (; x < pixels; x += 2) splitPair(in + 2 * x, o, y + x, cbcr + x, cbcr + x + 1);
}

void splitPairsToCbCr411(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels, bool nonTemporal) {
  const __m128i g = maskOf(kCbCr411[int(o)]);
  int x = hasAvx2() ? splitPairsToCbCr411Avx(in, o, y, cbcr, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i a = _mm_shuffle_epi8(load128(in + 2 * x), g);       // Y0-7 (Cb Cr)0 (Cb Cr)2
    const __m128i b = _mm_shuffle_epi8(load128(in + 2 * x + 16), g);  // Y8-15 (Cb Cr)4 (Cb Cr)6
    put(y + x, _mm_unpacklo_epi64(a, b), nonTemporal);
    store64(cbcr + x / 2, _mm_unpackhi_epi32(a, b));
  }
  for (; x < pixels; x += 4) {
    uint8_t skip[2];
    splitPair(in + 2 * x, o, y + x, cbcr + x / 2, cbcr + x / 2 + 1);
    splitPair(in + 2 * x + 4, o, y + x + 2, &skip[0], &skip[1]);
  }
}

void mergePairsCbCr(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels, bool nonTemporal) {
  int x = hasAvx2() ? mergePairsCbCrAvx(y, cbcr, o, out, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) putWoven(out + 2 * x, load128(y + x), load128(cbcr + x), o, nonTemporal);
  for (; x < pixels; x += 2) mergePair(y + x, cbcr[x], cbcr[x + 1], o, out + 2 * x);
}

void mergePairs411(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out, int pixels,
                   bool nonTemporal) {
  int x = hasAvx2() ? mergePairs411Avx(y, cb, cr, o, out, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i p = _mm_unpacklo_epi8(load32(cb + x / 4), load32(cr + x / 4));
    putWoven(out + 2 * x, load128(y + x), _mm_unpacklo_epi16(p, p), o, nonTemporal);
  }
  for (; x < pixels; x += 2) mergePair(y + x, cb[x / 4], cr[x / 4], o, out + 2 * x);
}

void mergePairsCbCr411(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels,
                       bool nonTemporal) {
  int x = hasAvx2() ? mergePairsCbCr411Avx(y, cbcr, o, out, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i p = load64(cbcr + x / 2);
    putWoven(out + 2 * x, load128(y + x), _mm_unpacklo_epi16(p, p), o, nonTemporal);
  }
  for (; x < pixels; x += 2) mergePair(y + x, cbcr[2 * (x / 4)], cbcr[2 * (x / 4) + 1], o, out + 2 * x);
}

void unzipDouble(const uint8_t* in, uint8_t* a, uint8_t* b, int n) {
  const __m128i ma = _mm_setr_epi8(0, 0, 2, 2, 4, 4, 6, 6, 8, 8, 10, 10, 12, 12, 14, 14);
  const __m128i mb = _mm_add_epi8(ma, _mm_set1_epi8(1));
  int k = hasAvx2() ? unzipDoubleAvx(in, a, b, n) : 0;
  for (; k + 8 <= n; k += 8) {
    const __m128i v = load128(in + 2 * k);
    store128(a + 2 * k, _mm_shuffle_epi8(v, ma));
    store128(b + 2 * k, _mm_shuffle_epi8(v, mb));
  }
  for (; k < n; ++k) {
    a[2 * k] = a[2 * k + 1] = in[2 * k];
    b[2 * k] = b[2 * k + 1] = in[2 * k + 1];
  }
}

void zipEvens(const uint8_t* a, const uint8_t* b, uint8_t* out, int n) {
  const __m128i low = _mm_set1_epi16(0x00FF);
  int k = hasAvx2() ? zipEvensAvx(a, b, out, n) : 0;
  for (; k + 8 <= n; k += 8)
    store128(out + 2 * k, _mm_or_si128(_mm_and_si128(load128(a + 2 * k), low), _mm_slli_epi16(load128(b + 2 * k), 8)));
  for (; k < n; ++k) {
    out[2 * k] = a[2 * k];
    out[2 * k + 1] = b[2 * k];
  }
}

void crossPairs(const uint8_t* a, const uint8_t* b, uint8_t* even, uint8_t* odd, int n) {
  const __m128i m = maskOf(kWordsByParity);
  int k = hasAvx2() ? crossPairsAvx(a, b, even, odd, n) : 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i va = load128(a + k), vb = load128(b + k);
    const __m128i lo = _mm_shuffle_epi8(_mm_unpacklo_epi8(va, vb), m);  // words 0-7 by parity
    const __m128i hi = _mm_shuffle_epi8(_mm_unpackhi_epi8(va, vb), m);  // words 8-15
    store128(even + k, _mm_unpacklo_epi64(lo, hi));
    store128(odd + k, _mm_unpackhi_epi64(lo, hi));
  }
  for (; k < n; k += 2) {
    even[k] = a[k];
    even[k + 1] = b[k];
    odd[k] = a[k + 1];
    odd[k + 1] = b[k + 1];
  }
}

void zip4(const uint8_t* a, const uint8_t* b, const uint8_t* c, const uint8_t* d, uint8_t* out, int n) {
  int k = hasAvx2() ? zip4Avx(a, b, c, d, out, n) : 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i va = load128(a + k), vb = load128(b + k), vc = load128(c + k), vd = load128(d + k);
    const __m128i abLo = _mm_unpacklo_epi8(va, vb), abHi = _mm_unpackhi_epi8(va, vb);
    const __m128i cdLo = _mm_unpacklo_epi8(vc, vd), cdHi = _mm_unpackhi_epi8(vc, vd);
    store128(out + 4 * k, _mm_unpacklo_epi16(abLo, cdLo));
    store128(out + 4 * k + 16, _mm_unpackhi_epi16(abLo, cdLo));
    store128(out + 4 * k + 32, _mm_unpacklo_epi16(abHi, cdHi));
    store128(out + 4 * k + 48, _mm_unpackhi_epi16(abHi, cdHi));
  }
  for (; k < n; ++k) {
    out[4 * k] = a[k];
    out[4 * k + 1] = b[k];
    out[4 * k + 2] = c[k];
    out[4 * k + 3] = d[k];
  }
}

void unzip4(const uint8_t* in, uint8_t* a, uint8_t* b, uint8_t* c, uint8_t* d, int n) {
  const __m128i t = _mm_setr_epi8(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15);
  int k = 0;
  for (; k + 16 <= n; k += 16) {
    // Per 16 bytes: a b c d of four samples as four 32-bit words, then a
    // 4 x 4 transpose.
    const __m128i v0 = _mm_shuffle_epi8(load128(in + 4 * k), t), v1 = _mm_shuffle_epi8(load128(in + 4 * k + 16), t);
    const __m128i v2 = _mm_shuffle_epi8(load128(in + 4 * k + 32), t), v3 = _mm_shuffle_epi8(load128(in + 4 * k + 48), t);
    const __m128i t0 = _mm_unpacklo_epi32(v0, v1), t1 = _mm_unpackhi_epi32(v0, v1);
    const __m128i t2 = _mm_unpacklo_epi32(v2, v3), t3 = _mm_unpackhi_epi32(v2, v3);
    store128(a + k, _mm_unpacklo_epi64(t0, t2));
    store128(b + k, _mm_unpackhi_epi64(t0, t2));
    store128(c + k, _mm_unpacklo_epi64(t1, t3));
    store128(d + k, _mm_unpackhi_epi64(t1, t3));
  }
  for (; k < n; ++k) {
    a[k] = in[4 * k];
    b[k] = in[4 * k + 1];
    c[k] = in[4 * k + 2];
    d[k] = in[4 * k + 3];
  }
}

// From this many bytes an ordinary copy goes by the string move.
constexpr int kLongCopy = 1 << 16;

void copyBytes(const uint8_t* in, uint8_t* out, int n, bool nonTemporal) {
  if (!nonTemporal) {
    if (n >= kLongCopy) {
      // A whole plane at once: the string move keeps its stores in the
      // cache where a library copy of this length may bypass it.
      size_t count = size_t(n);
      asm volatile("rep movsb" : "+D"(out), "+S"(in), "+c"(count) : : "memory");
    } else {
      std::memcpy(out, in, size_t(n));
    }
    return;
  }
  // Streamed: a first ordinary store up to a 16-byte boundary, then 64-byte
  // blocks of stream stores, the rest ordinary.
  int k = 0;
  if (n >= 64) {
    const int skew = int(reinterpret_cast<uintptr_t>(out) & 15u);
    if (skew) {
      store128(out, load128(in));
      k = 16 - skew;
    }
    for (; k + 64 <= n; k += 64)
      for (int j = 0; j < 64; j += 16) storeStream128(out + k + j, load128(in + k + j));
  }
  std::memcpy(out + k, in + k, size_t(n - k));
}

}  // namespace zel::repack
