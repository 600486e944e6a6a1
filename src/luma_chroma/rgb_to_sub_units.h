// Vector operations of the subsampling encoders beyond vector_units.h: block
// sums across neighbouring pixels, constant pairs of 32-bit dot products,
// the 1..254 clamp and the partial stores of chroma rows. `More<Sse>` and `More<Avx>` work within
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
  // Two 16-bit constants as one dword, for madd on interleaved lanes.
  static V pair16(int lo, int hi) {
    return _mm_set1_epi32(int32_t(uint32_t(uint16_t(lo)) | (uint32_t(uint16_t(hi)) << 16)));
  }
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
  ZEL_AVX2 static V pair16(int lo, int hi) {
    return _mm256_set1_epi32(int32_t(uint32_t(uint16_t(lo)) | (uint32_t(uint16_t(hi)) << 16)));
  }
  ZEL_AVX2 static void storeHalves(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    More<Sse>::storeHalves(lo, hi, 0, _mm256_castsi256_si128(v));
    More<Sse>::storeHalves(lo + unitStride, hi + unitStride, 0, _mm256_extracti128_si256(v, 1));
  }
  ZEL_AVX2 static void storeQuarters(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    More<Sse>::storeQuarters(lo, hi, 0, _mm256_castsi256_si128(v));
    More<Sse>::storeQuarters(lo + unitStride, hi + unitStride, 0, _mm256_extracti128_si256(v, 1));
  }
};

// Exact 32-bit a * ca + b * cb + c * cc + addend, arithmetic shift by
// Shift, for 16-bit lanes a, b, c whose values lie in 0..32767 and signed
// 16-bit constants; the results return as 16-bit lanes (they fit, so the
// signed pack never clamps them).
template <class U, int Shift>
ZEL_INLINE typename U::V dot3Shift(typename U::V a, typename U::V b, typename U::V c, int ca, int cb, int cc, int addend) {
  using V = typename U::V;
  const V kab = More<U>::pair16(ca, cb), kc = More<U>::pair16(cc, 0), add = U::set32(addend), z = U::zero();
  const V lo = U::add32(U::add32(U::madd16(U::unpackLo16(a, b), kab), U::madd16(U::unpackLo16(c, z), kc)), add);
  const V hi = U::add32(U::add32(U::madd16(U::unpackHi16(a, b), kab), U::madd16(U::unpackHi16(c, z), kc)), add);
  return U::packS32(U::template sra32<Shift>(lo), U::template sra32<Shift>(hi));
}

}  // namespace zel::lc::sub
