// Vector operations of the subsampling encoders beyond vector_units.h: block
// sums across neighbouring pixels, 32-bit dot products, the 1..254 clamp and
// the partial stores of chroma rows. `More<Sse>` and `More<Avx>` work within
// 128-bit lanes, so one kernel template computes the same bits at both
// widths (see vector_units.h).
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc::sub {

template <class U>
struct More;

template <>
struct More<Sse> {
  using V = __m128i;
  // Bytes to the sums of neighbouring pixel pairs in 16-bit lanes.
  static V pairSums(V bytes) { return _mm_maddubs_epi16(bytes, _mm_set1_epi8(1)); }
  // Sums of neighbouring lanes: a's pairs, then b's.
  static V hadd16(V a, V b) { return _mm_hadd_epi16(a, b); }
  static V clampNarrow(V bytes) { return _mm_min_epu8(_mm_max_epu8(bytes, _mm_set1_epi8(1)), _mm_set1_epi8(-2)); }
  static V set32(int v) { return _mm_set1_epi32(v); }
  // Two 16-bit constants as one dword, for madd on interleaved lanes.
  static V pair16(int lo, int hi) {
    return _mm_set1_epi32(int32_t(uint32_t(uint16_t(lo)) | (uint32_t(uint16_t(hi)) << 16)));
  }
  static V madd(V a, V b) { return _mm_madd_epi16(a, b); }
  static V add32(V a, V b) { return _mm_add_epi32(a, b); }
  template <int N>
  static V sra32(V a) { return _mm_srai_epi32(a, N); }
  static V packs32(V lo, V hi) { return _mm_packs_epi32(lo, hi); }
  static V min8(V a, V b) { return _mm_min_epu8(a, b); }
  // Bytes 0..7 of each unit to `lo`, bytes 8..15 to `hi`; the units of a
  // wider register lie `unitStride` bytes apart.
  static void storeHalves(uint8_t* lo, uint8_t* hi, int, V v) {
    store64(lo, v);
    store64(hi, _mm_unpackhi_epi64(v, v));
  }
  // Bytes 0..3 of each unit to `lo`, bytes 8..11 to `hi`.
  static void storeQuarters(uint8_t* lo, uint8_t* hi, int, V v) {
    const int32_t a = _mm_cvtsi128_si32(v), b = _mm_extract_epi32(v, 2);
    __builtin_memcpy(lo, &a, 4);
    __builtin_memcpy(hi, &b, 4);
  }
};

template <>
struct More<Avx> {
  using V = __m256i;
  ZEL_AVX2 static V pairSums(V bytes) { return _mm256_maddubs_epi16(bytes, _mm256_set1_epi8(1)); }
  ZEL_AVX2 static V hadd16(V a, V b) { return _mm256_hadd_epi16(a, b); }
  ZEL_AVX2 static V clampNarrow(V bytes) {
    return _mm256_min_epu8(_mm256_max_epu8(bytes, _mm256_set1_epi8(1)), _mm256_set1_epi8(-2));
  }
  ZEL_AVX2 static V set32(int v) { return _mm256_set1_epi32(v); }
  ZEL_AVX2 static V pair16(int lo, int hi) {
    return _mm256_set1_epi32(int32_t(uint32_t(uint16_t(lo)) | (uint32_t(uint16_t(hi)) << 16)));
  }
  ZEL_AVX2 static V madd(V a, V b) { return _mm256_madd_epi16(a, b); }
  ZEL_AVX2 static V add32(V a, V b) { return _mm256_add_epi32(a, b); }
  template <int N>
  ZEL_AVX2 static V sra32(V a) { return _mm256_srai_epi32(a, N); }
  ZEL_AVX2 static V packs32(V lo, V hi) { return _mm256_packs_epi32(lo, hi); }
  ZEL_AVX2 static V min8(V a, V b) { return _mm256_min_epu8(a, b); }
  ZEL_AVX2 static void storeHalves(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    More<Sse>::storeHalves(lo, hi, 0, _mm256_castsi256_si128(v));
    More<Sse>::storeHalves(lo + unitStride, hi + unitStride, 0, _mm256_extracti128_si256(v, 1));
  }
  ZEL_AVX2 static void storeQuarters(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    More<Sse>::storeQuarters(lo, hi, 0, _mm256_castsi256_si128(v));
    More<Sse>::storeQuarters(lo + unitStride, hi + unitStride, 0, _mm256_extracti128_si256(v, 1));
  }
};

// Exact 32-bit a * ca + b * cb + addend, arithmetic shift by Shift, for
// 16-bit lanes a and b whose values lie in 0..32767; the results return as
// 16-bit lanes (packs never clamps them: they fit).
template <class U, int Shift>
inline typename U::V dot2Shift(typename U::V a, typename U::V b, int ca, int cb, int addend) {
  using M = More<U>;
  const typename U::V k = M::pair16(ca, cb), add = M::set32(addend);
  const typename U::V lo = M::template sra32<Shift>(M::add32(M::madd(U::unpackLo16(a, b), k), add));
  const typename U::V hi = M::template sra32<Shift>(M::add32(M::madd(U::unpackHi16(a, b), k), add));
  return M::packs32(lo, hi);
}

// The same for three lanes: a * ca + b * cb + c * cc + addend.
template <class U, int Shift>
inline typename U::V dot3Shift(typename U::V a, typename U::V b, typename U::V c, int ca, int cb, int cc,
                               int addend) {
  using M = More<U>;
  const typename U::V kab = M::pair16(ca, cb), kc = M::pair16(cc, 0), add = M::set32(addend), z = U::zero();
  const typename U::V lo = M::add32(M::add32(M::madd(U::unpackLo16(a, b), kab), M::madd(U::unpackLo16(c, z), kc)), add);
  const typename U::V hi = M::add32(M::add32(M::madd(U::unpackHi16(a, b), kab), M::madd(U::unpackHi16(c, z), kc)), add);
  return M::packs32(M::template sra32<Shift>(lo), M::template sra32<Shift>(hi));
}

}  // namespace zel::lc::sub
