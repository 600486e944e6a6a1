// Vector operations of the subsampling encoders beyond vector_units.h: block
// sums across neighbouring pixels, constant pairs of 32-bit dot products,
// the 1..254 clamp and the partial stores of chroma rows. `More<Sse>`,
// `More<Avx>` and `More<Avx512>` work within 128-bit lanes, so one kernel
// template computes the same bits at every width (see vector_units.h).
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
  // The same sums times 32 (at most 16320: no saturation).
  static V pairSums32(V bytes) { return _mm_maddubs_epi16(bytes, _mm_set1_epi8(32)); }
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
  // Bytes N.. of the 32 bytes lo, hi (hi after lo).
  template <int N>
  static V alignr(V hi, V lo) { return _mm_alignr_epi8(hi, lo, N); }
};

template <>
struct More<Avx> {
  using V = __m256i;
  ZEL_AVX2 static V pairSums(V bytes) { return _mm256_maddubs_epi16(bytes, _mm256_set1_epi8(1)); }
  ZEL_AVX2 static V pairSums32(V bytes) { return _mm256_maddubs_epi16(bytes, _mm256_set1_epi8(32)); }
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
  template <int N>
  ZEL_AVX2 static V alignr(V hi, V lo) { return _mm256_alignr_epi8(hi, lo, N); }
};

// Word k of lane L of a horizontal pair sum: pair k of a's lane (k < 4) or
// pair k - 4 of b's, the pair sums lying in the low words of dwords.
struct HaddIndex {
  uint16_t w[32];
};
constexpr HaddIndex makeHaddIndex() {
  HaddIndex h{};
  for (int i = 0; i < 32; ++i) {
    const int lane = i / 8, k = i % 8;
    h.w[i] = static_cast<uint16_t>(k < 4 ? 8 * lane + 2 * k : 32 + 8 * lane + 2 * (k - 4));
  }
  return h;
}
inline constexpr HaddIndex kHaddIndex = makeHaddIndex();

ZEL_TIER512_BEGIN
template <>
struct More<Avx512> {
  using V = __m512i;
  ZEL_AVX512_VBMI static V pairSums(V bytes) { return _mm512_maddubs_epi16(bytes, _mm512_set1_epi8(1)); }
  ZEL_AVX512_VBMI static V pairSums32(V bytes) { return _mm512_maddubs_epi16(bytes, _mm512_set1_epi8(32)); }
  // No 512-bit form: the sum of a word pair as a dword, whose low word is
  // the wrapping 16-bit sum, then the low words of a and b lane by lane.
  ZEL_AVX512_VBMI static V hadd16(V a, V b) {
    const V ones = _mm512_set1_epi16(1);
    return _mm512_permutex2var_epi16(_mm512_madd_epi16(a, ones), _mm512_loadu_si512(kHaddIndex.w),
                                     _mm512_madd_epi16(b, ones));
  }
  ZEL_AVX512_VBMI static V clampNarrow(V bytes) {
    return _mm512_min_epu8(_mm512_max_epu8(bytes, _mm512_set1_epi8(1)), _mm512_set1_epi8(-2));
  }
  ZEL_AVX512_VBMI static V pair16(int lo, int hi) {
    return _mm512_set1_epi32(int32_t(uint32_t(uint16_t(lo)) | (uint32_t(uint16_t(hi)) << 16)));
  }
  // Units of halves (or quarters) that follow each other: all low halves
  // gathered into one store, all high halves into another.
  ZEL_AVX512_VBMI static void storeHalves(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    if (unitStride == 8) {
      const V q = qwordsAt(v, _mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7));
      _mm256_storeu_si256(reinterpret_cast<__m256i*>(lo), _mm512_castsi512_si256(q));
      _mm256_storeu_si256(reinterpret_cast<__m256i*>(hi), half256<1>(q));
      return;
    }
    const __m128i units[4] = {_mm512_castsi512_si128(v), lane128<1>(v), lane128<2>(v), lane128<3>(v)};
    for (int k = 0; k < 4; ++k) More<Sse>::storeHalves(lo + k * unitStride, hi + k * unitStride, 0, units[k]);
  }
  ZEL_AVX512_VBMI static void storeQuarters(uint8_t* lo, uint8_t* hi, int unitStride, V v) {
    if (unitStride == 4) {
      const V q = dwordsAt(v, _mm512_setr_epi32(0, 4, 8, 12, 2, 6, 10, 14, 0, 0, 0, 0, 0, 0, 0, 0));
      store128(lo, _mm512_castsi512_si128(q));
      store128(hi, lane128<1>(q));
      return;
    }
    const __m128i units[4] = {_mm512_castsi512_si128(v), lane128<1>(v), lane128<2>(v), lane128<3>(v)};
    for (int k = 0; k < 4; ++k) More<Sse>::storeQuarters(lo + k * unitStride, hi + k * unitStride, 0, units[k]);
  }
  template <int N>
  ZEL_AVX512_VBMI static V alignr(V hi, V lo) { return _mm512_alignr_epi8(hi, lo, N); }
};

ZEL_TIER512_END

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
