// Interleaved pixels and channel planes of 64 pixels, by the byte permutes
// of the 512-bit tier: a permute of one or two 64-byte tables puts every
// byte where it goes, and a masked permute merges a third table. Channel
// planes are in pixel order; interleaved bytes are those of memory.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"
#include "luma_chroma/vector_units.h"

ZEL_TIER512_BEGIN

namespace zel::lc {

// A permute's byte indices and, for a masked permute, the lanes it writes.
struct Permute64 {
  uint8_t index[64];
  uint64_t mask;
};

// Channel c of 64 three-byte pixels from the 192 bytes held in tables a,
// b, c: `fromBC` takes the pixels whose byte lies past the first 64 from
// the pair b, c; `fromA` (masked) the others from a.
constexpr Permute64 split3FromBC(int channel) {
  Permute64 p{};
  for (int i = 0; i < 64; ++i) {
    const int at = 3 * i + channel;
    p.index[i] = static_cast<uint8_t>(at >= 64 ? at - 64 : 0);
  }
  p.mask = ~0ull;
  return p;
}
constexpr Permute64 split3FromA(int channel) {
  Permute64 p{};
  for (int i = 0; i < 64; ++i) {
    const int at = 3 * i + channel;
    p.index[i] = static_cast<uint8_t>(at < 64 ? at : 0);
    if (at < 64) p.mask |= 1ull << i;
  }
  return p;
}

// Byte k of the 192 bytes of 64 three-byte pixels: `pair` takes channels 0
// and 1 from the planes p0, p1, `third` (masked) channel 2 from p2.
constexpr Permute64 merge3Pair(int part) {
  Permute64 p{};
  for (int j = 0; j < 64; ++j) {
    const int at = 64 * part + j, pixel = at / 3, channel = at % 3;
    p.index[j] = static_cast<uint8_t>(channel == 1 ? 64 + pixel : pixel);
  }
  p.mask = ~0ull;
  return p;
}
constexpr Permute64 merge3Third(int part) {
  Permute64 p{};
  for (int j = 0; j < 64; ++j) {
    const int at = 64 * part + j;
    p.index[j] = static_cast<uint8_t>(at / 3);
    if (at % 3 == 2) p.mask |= 1ull << j;
  }
  return p;
}

// Four-byte pixels: channels `lo` of pixels 0..31 in bytes 0..31 and `hi`
// of them in bytes 32..63, from the 128 bytes of 32 pixels.
constexpr Permute64 split4Halves(int lo, int hi) {
  Permute64 p{};
  for (int i = 0; i < 64; ++i) p.index[i] = static_cast<uint8_t>(4 * (i & 31) + (i < 32 ? lo : hi));
  p.mask = ~0ull;
  return p;
}

// Byte k of the 64 bytes of pixels 16m..16m+15, four bytes a pixel:
// `pair` takes channels 0 and 1 from the planes p0, p1, `third` (masked)
// channel 2 from p2; byte 3 is the fourth sample.
constexpr Permute64 merge4Pair(int part) {
  Permute64 p{};
  for (int j = 0; j < 64; ++j) {
    const int pixel = 16 * part + j / 4;
    p.index[j] = static_cast<uint8_t>(j % 4 == 1 ? 64 + pixel : pixel);
  }
  p.mask = ~0ull;
  return p;
}
constexpr Permute64 merge4Third(int part) {
  Permute64 p{};
  for (int j = 0; j < 64; ++j) {
    p.index[j] = static_cast<uint8_t>(16 * part + j / 4);
    if (j % 4 == 2) p.mask |= 1ull << j;
  }
  return p;
}

struct PermuteTables {
  Permute64 split3BC[3], split3A[3], merge3Pair[3], merge3Third[3];
  Permute64 split4First, split4Second, split4Third;
  Permute64 merge4Pair[4], merge4Third[4];
};
constexpr PermuteTables makePermuteTables() {
  PermuteTables t{};
  for (int k = 0; k < 3; ++k) {
    t.split3BC[k] = split3FromBC(k);
    t.split3A[k] = split3FromA(k);
    t.merge3Pair[k] = merge3Pair(k);
    t.merge3Third[k] = merge3Third(k);
  }
  t.split4First = split4Halves(0, 1);
  t.split4Second = split4Halves(1, 0);
  t.split4Third = split4Halves(2, 2);
  for (int m = 0; m < 4; ++m) {
    t.merge4Pair[m] = merge4Pair(m);
    t.merge4Third[m] = merge4Third(m);
  }
  return t;
}
inline constexpr PermuteTables kPermutes = makePermuteTables();

ZEL_AVX512_VBMI inline __m512i indexOf(const Permute64& p) { return _mm512_loadu_si512(p.index); }

// The three channels of 64 three-byte pixels at q.
ZEL_AVX512_VBMI inline void split3(const uint8_t* q, __m512i out[3]) {
  const __m512i a = _mm512_loadu_si512(q), b = _mm512_loadu_si512(q + 64), c = _mm512_loadu_si512(q + 128);
  for (int k = 0; k < 3; ++k) {
    const Permute64& fromA = kPermutes.split3A[k];
    const __m512i late = _mm512_permutex2var_epi8(b, indexOf(kPermutes.split3BC[k]), c);
    out[k] = _mm512_mask_permutexvar_epi8(late, fromA.mask, indexOf(fromA), a);
  }
}

// 64 three-byte pixels to q from their channel planes in memory order.
ZEL_AVX512_VBMI inline void merge3(uint8_t* q, __m512i p0, __m512i p1, __m512i p2) {
  for (int k = 0; k < 3; ++k) {
    const Permute64& third = kPermutes.merge3Third[k];
    const __m512i pair = _mm512_permutex2var_epi8(p0, indexOf(kPermutes.merge3Pair[k]), p1);
    _mm512_storeu_si512(q + 64 * k, _mm512_mask_permutexvar_epi8(pair, third.mask, indexOf(third), p2));
  }
}

// The first three channels of 64 four-byte pixels at q.
ZEL_AVX512_VBMI inline void split4(const uint8_t* q, __m512i out[3]) {
  const __m512i a = _mm512_loadu_si512(q), b = _mm512_loadu_si512(q + 64);
  const __m512i c = _mm512_loadu_si512(q + 128), d = _mm512_loadu_si512(q + 192);
  // [0 of pixels 0..31 | 1 of them] and [1 of pixels 32..63 | 0 of them].
  const __m512i early = _mm512_permutex2var_epi8(a, indexOf(kPermutes.split4First), b);
  const __m512i late = _mm512_permutex2var_epi8(c, indexOf(kPermutes.split4Second), d);
  const __m512i third = indexOf(kPermutes.split4Third);
  const __mmask64 upper = 0xFFFFFFFF00000000ull;
  out[0] = _mm512_mask_blend_epi8(upper, early, late);
  out[1] = middleLanes(early, late);
  out[2] = _mm512_mask_blend_epi8(upper, _mm512_permutex2var_epi8(a, third, b), _mm512_permutex2var_epi8(c, third, d));
}

// 64 four-byte pixels to q from three channel planes in memory order and
// the fourth byte of every pixel.
ZEL_AVX512_VBMI inline void merge4(uint8_t* q, __m512i p0, __m512i p1, __m512i p2, __m512i fourth) {
  for (int m = 0; m < 4; ++m) {
    const Permute64& third = kPermutes.merge4Third[m];
    const __m512i pair = _mm512_permutex2var_epi8(p0, indexOf(kPermutes.merge4Pair[m]), p1);
    const __m512i three = _mm512_mask_permutexvar_epi8(pair, third.mask, indexOf(third), p2);
    _mm512_storeu_si512(q + 64 * m, _mm512_mask_blend_epi8(0x8888888888888888ull, three, fourth));
  }
}

}  // namespace zel::lc

ZEL_TIER512_END
