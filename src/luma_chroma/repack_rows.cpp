#include "luma_chroma/repack_rows.h"

#include <array>
#include <cstring>

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

ZEL_AVX2 inline void put256(void* p, __m256i v, bool nonTemporal) {
  if (nonTemporal && (reinterpret_cast<uintptr_t>(p) & 31u) == 0)
    _mm256_stream_si256(static_cast<__m256i*>(p), v);
  else
    store256(p, v);
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

ZEL_AVX2 int mergePairsAvx(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out,
                           int pixels, bool nonTemporal) {
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

ZEL_AVX2 int zipAvx(const uint8_t* a, const uint8_t* b, uint8_t* out, int n, bool nonTemporal) {
  int k = 0;
  for (; k + 32 <= n; k += 32) {
    const __m256i va = load256(a + k), vb = load256(b + k);
    const __m256i lo = _mm256_unpacklo_epi8(va, vb), hi = _mm256_unpackhi_epi8(va, vb);
    put256(out + 2 * k, _mm256_permute2x128_si256(lo, hi, 0x20), nonTemporal);
    put256(out + 2 * k + 32, _mm256_permute2x128_si256(lo, hi, 0x31), nonTemporal);
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

void mergePairs(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out, int pixels,
                bool nonTemporal) {
  const __m128i s = maskOf(kScatter[int(o)]);
  int x = hasAvx2() ? mergePairsAvx(y, cb, cr, o, out, pixels, nonTemporal) : 0;
  for (; x + 16 <= pixels; x += 16) {
    const __m128i luma = load128(y + x);
    const __m128i chroma = _mm_unpacklo_epi32(load64(cb + x / 2), load64(cr + x / 2));  // Cb0-3 Cr0-3 Cb4-7 Cr4-7
    put(out + 2 * x, _mm_shuffle_epi8(_mm_unpacklo_epi64(luma, chroma), s), nonTemporal);
    put(out + 2 * x + 16, _mm_shuffle_epi8(_mm_unpackhi_epi64(luma, chroma), s), nonTemporal);
  }
  for (; x < pixels; x += 2) mergePair(y + x, cb[x / 2], cr[x / 2], o, out + 2 * x);
}

void lumaOfPairs(const uint8_t* in, PairOrder o, uint8_t* y, int pixels) {
  const __m128i g = maskOf(kGather[int(o)]);
  int x = 0;
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
  int k = 0;
  for (; k + 16 <= n; k += 16) {
    const __m128i lo = _mm_shuffle_epi8(load128(in + 2 * k), m);
    const __m128i hi = _mm_shuffle_epi8(load128(in + 2 * k + 16), m);
    store128(out + k, _mm_unpacklo_epi64(lo, hi));
  }
  for (; k < n; ++k) out[k] = in[2 * k];
}

void doubleSamples(const uint8_t* in, uint8_t* out, int n, bool nonTemporal) { zip(in, in, out, n, nonTemporal); }

void copyBytes(const uint8_t* in, uint8_t* out, int n, bool nonTemporal) {
  if (!nonTemporal) {
    std::memcpy(out, in, size_t(n));
    return;
  }
  int k = 0;
  for (; k + 16 <= n; k += 16) put(out + k, load128(in + k), true);
  std::memcpy(out + k, in + k, size_t(n - k));
}

}  // namespace zel::repack
