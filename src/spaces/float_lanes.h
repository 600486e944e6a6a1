// Lane types for the float kernels of the colour-space families: F4/I4 are
// four float or int32 lanes of SSE4.1, F8/I8 eight lanes of AVX2. A kernel
// body is written once as a template over the lane type and instantiated
// for both; every operation has the same meaning per lane in both widths, so
// the two give the same bits.
//
// Pixel input and output go through byte shuffles: four pixels of a C3 or
// AC4 row (8, 16 or 32 bits a sample) become three vectors of int32 or float
// lanes, one per channel in memory order, and back. Exactly the bytes of the
// four pixels are read and written; the fourth sample of an AC4 destination
// is read and put back unchanged.
#pragma once

#include <immintrin.h>

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "frame/simd.h"

#define ZEL_LANE inline __attribute__((always_inline))
#define ZEL_LANE_AVX2 ZEL_AVX2 inline __attribute__((always_inline))

namespace zel::lanes {

// ---------------------------------------------------------------- 4 lanes

struct I4 {
  __m128i v;
  static ZEL_LANE I4 splat(int32_t x) { return {_mm_set1_epi32(x)}; }
};

struct F4 {
  using Int = I4;
  static constexpr int kLanes = 4;
  __m128 v;
  static ZEL_LANE F4 splat(float x) { return {_mm_set1_ps(x)}; }
};

ZEL_LANE F4 operator+(F4 a, F4 b) { return {_mm_add_ps(a.v, b.v)}; }
ZEL_LANE F4 operator-(F4 a, F4 b) { return {_mm_sub_ps(a.v, b.v)}; }
ZEL_LANE F4 operator*(F4 a, F4 b) { return {_mm_mul_ps(a.v, b.v)}; }
ZEL_LANE F4 operator/(F4 a, F4 b) { return {_mm_div_ps(a.v, b.v)}; }
// MINPS / MAXPS: the second operand when the comparison fails.
ZEL_LANE F4 vmin(F4 a, F4 b) { return {_mm_min_ps(a.v, b.v)}; }
ZEL_LANE F4 vmax(F4 a, F4 b) { return {_mm_max_ps(a.v, b.v)}; }
ZEL_LANE F4 approxRcp(F4 a) { return {_mm_rcp_ps(a.v)}; }
ZEL_LANE F4 refinedRcp(F4 x) {
  const __m128 r = _mm_rcp_ps(x.v);
  return {_mm_sub_ps(_mm_add_ps(r, r), _mm_mul_ps(_mm_mul_ps(x.v, r), r))};
}
ZEL_LANE F4 vabs(F4 a) { return {_mm_andnot_ps(_mm_set1_ps(-0.0f), a.v)}; }
// Comparisons give all-ones lanes where true.
ZEL_LANE F4 eq(F4 a, F4 b) { return {_mm_cmpeq_ps(a.v, b.v)}; }
ZEL_LANE F4 lt(F4 a, F4 b) { return {_mm_cmplt_ps(a.v, b.v)}; }
ZEL_LANE F4 le(F4 a, F4 b) { return {_mm_cmple_ps(a.v, b.v)}; }
ZEL_LANE F4 gt(F4 a, F4 b) { return {_mm_cmpgt_ps(a.v, b.v)}; }
ZEL_LANE F4 ge(F4 a, F4 b) { return {_mm_cmpge_ps(a.v, b.v)}; }
ZEL_LANE F4 maskOr(F4 a, F4 b) { return {_mm_or_ps(a.v, b.v)}; }
ZEL_LANE F4 maskAnd(F4 a, F4 b) { return {_mm_and_ps(a.v, b.v)}; }
// a where the mask is set, else b.
ZEL_LANE F4 select(F4 mask, F4 a, F4 b) { return {_mm_blendv_ps(b.v, a.v, mask.v)}; }
// The value where the mask is clear, zero where it is set.
ZEL_LANE F4 clearWhere(F4 mask, F4 a) { return {_mm_andnot_ps(mask.v, a.v)}; }
ZEL_LANE I4 roundEven(F4 a) { return {_mm_cvtps_epi32(a.v)}; }
ZEL_LANE I4 truncate(F4 a) { return {_mm_cvttps_epi32(a.v)}; }
ZEL_LANE F4 toFloat(I4 a) { return {_mm_cvtepi32_ps(a.v)}; }
ZEL_LANE F4 asFloat(I4 a) { return {_mm_castsi128_ps(a.v)}; }
ZEL_LANE I4 asInt(F4 a) { return {_mm_castps_si128(a.v)}; }

ZEL_LANE I4 operator+(I4 a, I4 b) { return {_mm_add_epi32(a.v, b.v)}; }
ZEL_LANE I4 operator-(I4 a, I4 b) { return {_mm_sub_epi32(a.v, b.v)}; }
ZEL_LANE I4 operator|(I4 a, I4 b) { return {_mm_or_si128(a.v, b.v)}; }
ZEL_LANE I4 operator&(I4 a, I4 b) { return {_mm_and_si128(a.v, b.v)}; }
ZEL_LANE I4 operator^(I4 a, I4 b) { return {_mm_xor_si128(a.v, b.v)}; }
template <int N>
ZEL_LANE I4 shiftRightArith(I4 a) {
  return {_mm_srai_epi32(a.v, N)};
}
template <int N>
ZEL_LANE I4 shiftLeft(I4 a) {
  return {_mm_slli_epi32(a.v, N)};
}
ZEL_LANE I4 imin(I4 a, I4 b) { return {_mm_min_epi32(a.v, b.v)}; }
ZEL_LANE I4 imax(I4 a, I4 b) { return {_mm_max_epi32(a.v, b.v)}; }
ZEL_LANE I4 ieq(I4 a, I4 b) { return {_mm_cmpeq_epi32(a.v, b.v)}; }
ZEL_LANE I4 iselect(I4 mask, I4 a, I4 b) { return {_mm_blendv_epi8(b.v, a.v, mask.v)}; }
ZEL_LANE I4 iselect(F4 mask, I4 a, I4 b) { return iselect(asInt(mask), a, b); }
// Sums of the products of 16-bit pairs (PMADDWD).
ZEL_LANE I4 multiplyAddPairs(I4 a, I4 b) { return {_mm_madd_epi16(a.v, b.v)}; }

// Four (c, w) pairs of a table of float pairs, one 64-bit read per lane.
ZEL_LANE void gatherPairs(const float (*table)[2], I4 index, F4& c, F4& w) {
  alignas(16) int32_t at[4];
  _mm_store_si128(reinterpret_cast<__m128i*>(at), index.v);
  const __m128 p01 = _mm_loadh_pi(_mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(table[at[0]]))),
                                  reinterpret_cast<const __m64*>(table[at[1]]));
  const __m128 p23 = _mm_loadh_pi(_mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(table[at[2]]))),
                                  reinterpret_cast<const __m64*>(table[at[3]]));
  c.v = _mm_shuffle_ps(p01, p23, _MM_SHUFFLE(2, 0, 2, 0));
  w.v = _mm_shuffle_ps(p01, p23, _MM_SHUFFLE(3, 1, 3, 1));
}

// ---------------------------------------------------------------- pixel shuffles

// Shuffle masks for four pixels of `Stride` samples of `Bytes` bytes: for
// each channel, `gather` moves its samples from the input registers into
// int32 lanes (zero-extended), `scatter` moves the low bytes of int32 lanes
// back to their places; `keep` marks the fourth sample of each pixel.
template <int Stride, int Bytes>
struct PixelShuffles {
  static constexpr int kTotal = 4 * Stride * Bytes;
  static constexpr int kRegs = (kTotal + 15) / 16;
  struct Masks {
    int8_t gather[3][kRegs][16];
    int8_t scatter[3][kRegs][16];
    int8_t keep[kRegs][16];
  };
  static constexpr Masks make() {
    Masks m{};
    for (int ch = 0; ch < 3; ++ch)
      for (int r = 0; r < kRegs; ++r)
        for (int j = 0; j < 16; ++j) {
          const int lane = j / 4, q = j % 4;
          int8_t g = -128;
          if (q < Bytes) {
            const int at = (lane * Stride + ch) * Bytes + q;
            if (at / 16 == r) g = int8_t(at % 16);
          }
          m.gather[ch][r][j] = g;
          const int out = 16 * r + j;
          int8_t s = -128;
          if (out < kTotal) {
            const int pixel = out / (Stride * Bytes), within = out % (Stride * Bytes);
            if (within / Bytes == ch) s = int8_t(pixel * 4 + within % Bytes);
          }
          m.scatter[ch][r][j] = s;
        }
    for (int r = 0; r < kRegs; ++r)
      for (int j = 0; j < 16; ++j) {
        const int out = 16 * r + j;
        m.keep[r][j] = int8_t(out < kTotal && (out % (Stride * Bytes)) / Bytes == 3 ? -1 : 0);
      }
    return m;
  }
  static constexpr Masks kMasks = make();
};

ZEL_LANE __m128i maskAt(const int8_t* m) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(m)); }

// Reads exactly `Total` bytes into registers.
template <int Total>
ZEL_LANE void loadBytes(const void* from, __m128i* regs) {
  const uint8_t* p = static_cast<const uint8_t*>(from);
  int r = 0;
  for (; r < Total / 16; ++r) regs[r] = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + 16 * r));
  constexpr int rest = Total % 16;
  static_assert(rest == 0 || rest == 8 || rest == 12, "pixel blocks are whole 4-byte words");
  if constexpr (rest == 8) {
    regs[r] = load64(p + 16 * r);
  } else if constexpr (rest == 12) {
    int32_t last;
    std::memcpy(&last, p + 16 * r + 8, 4);
    regs[r] = _mm_insert_epi32(load64(p + 16 * r), last, 2);
  }
}

// Writes exactly `Total` bytes from registers.
template <int Total>
ZEL_LANE void storeBytes(void* to, const __m128i* regs) {
  uint8_t* p = static_cast<uint8_t*>(to);
  int r = 0;
  for (; r < Total / 16; ++r) _mm_storeu_si128(reinterpret_cast<__m128i*>(p + 16 * r), regs[r]);
  constexpr int rest = Total % 16;
  if constexpr (rest == 8) {
    store64(p + 16 * r, regs[r]);
  } else if constexpr (rest == 12) {
    store64(p + 16 * r, regs[r]);
    const int32_t last = _mm_extract_epi32(regs[r], 2);
    std::memcpy(p + 16 * r + 8, &last, 4);
  }
}

// The three channels of four pixels as int32 lanes holding the raw sample
// bits; a 16s sample is biased into 0..65535 on the way (Bias16).
template <int Stride, bool Bias16, typename T>
ZEL_LANE void loadRaw(const T* p, I4& c0, I4& c1, I4& c2) {
  using S = PixelShuffles<Stride, int(sizeof(T))>;
  __m128i in[S::kRegs];
  loadBytes<S::kTotal>(p, in);
  I4* out[3] = {&c0, &c1, &c2};
  for (int ch = 0; ch < 3; ++ch) {
    __m128i acc = _mm_shuffle_epi8(in[0], maskAt(S::kMasks.gather[ch][0]));
    for (int r = 1; r < S::kRegs; ++r) acc = _mm_or_si128(acc, _mm_shuffle_epi8(in[r], maskAt(S::kMasks.gather[ch][r])));
    if constexpr (Bias16) acc = _mm_xor_si128(acc, _mm_set1_epi32(0x8000));
    out[ch]->v = acc;
  }
}

// Samples as floats: integers converted, floats as they are.
template <int Stride, bool Bias16, typename T>
ZEL_LANE void loadPixels(const T* p, F4& c0, F4& c1, F4& c2) {
  I4 r0, r1, r2;
  loadRaw<Stride, Bias16>(p, r0, r1, r2);
  if constexpr (sizeof(T) == 4) {
    c0 = asFloat(r0), c1 = asFloat(r1), c2 = asFloat(r2);
  } else {
    c0 = toFloat(r0), c1 = toFloat(r1), c2 = toFloat(r2);
  }
}

// Stores the low bytes of each int32 lane as the sample (8 or 16 bits, or
// the float bits); Bias16 moves 0..65535 back to a 16s sample.
template <int Stride, bool Bias16, typename T>
ZEL_LANE void storeRaw(T* p, I4 c0, I4 c1, I4 c2) {
  using S = PixelShuffles<Stride, int(sizeof(T))>;
  if constexpr (Bias16) {
    const __m128i b = _mm_set1_epi32(0x8000);
    c0.v = _mm_xor_si128(c0.v, b), c1.v = _mm_xor_si128(c1.v, b), c2.v = _mm_xor_si128(c2.v, b);
  }
  __m128i out[S::kRegs];
  if constexpr (Stride == 4) loadBytes<S::kTotal>(p, out);
  for (int r = 0; r < S::kRegs; ++r) {
    __m128i v = _mm_or_si128(_mm_or_si128(_mm_shuffle_epi8(c0.v, maskAt(S::kMasks.scatter[0][r])),
                                          _mm_shuffle_epi8(c1.v, maskAt(S::kMasks.scatter[1][r]))),
                             _mm_shuffle_epi8(c2.v, maskAt(S::kMasks.scatter[2][r])));
    if constexpr (Stride == 4) v = _mm_or_si128(v, _mm_and_si128(out[r], maskAt(S::kMasks.keep[r])));
    out[r] = v;
  }
  storeBytes<S::kTotal>(p, out);
}

template <int Stride>
ZEL_LANE void storePixels(float* p, F4 c0, F4 c1, F4 c2) {
  storeRaw<Stride, false>(p, asInt(c0), asInt(c1), asInt(c2));
}

// ---------------------------------------------------------------- 8 lanes

struct I8 {
  __m256i v;
  static ZEL_LANE_AVX2 I8 splat(int32_t x) { return {_mm256_set1_epi32(x)}; }
};

struct F8 {
  using Int = I8;
  static constexpr int kLanes = 8;
  __m256 v;
  static ZEL_LANE_AVX2 F8 splat(float x) { return {_mm256_set1_ps(x)}; }
};

ZEL_LANE_AVX2 F8 operator+(F8 a, F8 b) { return {_mm256_add_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 operator-(F8 a, F8 b) { return {_mm256_sub_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 operator*(F8 a, F8 b) { return {_mm256_mul_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 operator/(F8 a, F8 b) { return {_mm256_div_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 vmin(F8 a, F8 b) { return {_mm256_min_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 vmax(F8 a, F8 b) { return {_mm256_max_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 approxRcp(F8 a) { return {_mm256_rcp_ps(a.v)}; }
ZEL_LANE_AVX2 F8 refinedRcp(F8 x) {
  const __m256 r = _mm256_rcp_ps(x.v);
  return {_mm256_sub_ps(_mm256_add_ps(r, r), _mm256_mul_ps(_mm256_mul_ps(x.v, r), r))};
}
ZEL_LANE_AVX2 F8 vabs(F8 a) { return {_mm256_andnot_ps(_mm256_set1_ps(-0.0f), a.v)}; }
ZEL_LANE_AVX2 F8 eq(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_EQ_OQ)}; }
ZEL_LANE_AVX2 F8 lt(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_LT_OS)}; }
ZEL_LANE_AVX2 F8 le(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_LE_OS)}; }
ZEL_LANE_AVX2 F8 gt(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_GT_OS)}; }
ZEL_LANE_AVX2 F8 ge(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_GE_OS)}; }
ZEL_LANE_AVX2 F8 maskOr(F8 a, F8 b) { return {_mm256_or_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 maskAnd(F8 a, F8 b) { return {_mm256_and_ps(a.v, b.v)}; }
ZEL_LANE_AVX2 F8 select(F8 mask, F8 a, F8 b) { return {_mm256_blendv_ps(b.v, a.v, mask.v)}; }
ZEL_LANE_AVX2 F8 clearWhere(F8 mask, F8 a) { return {_mm256_andnot_ps(mask.v, a.v)}; }
ZEL_LANE_AVX2 I8 roundEven(F8 a) { return {_mm256_cvtps_epi32(a.v)}; }
ZEL_LANE_AVX2 I8 truncate(F8 a) { return {_mm256_cvttps_epi32(a.v)}; }
ZEL_LANE_AVX2 F8 toFloat(I8 a) { return {_mm256_cvtepi32_ps(a.v)}; }
ZEL_LANE_AVX2 F8 asFloat(I8 a) { return {_mm256_castsi256_ps(a.v)}; }
ZEL_LANE_AVX2 I8 asInt(F8 a) { return {_mm256_castps_si256(a.v)}; }

ZEL_LANE_AVX2 I8 operator+(I8 a, I8 b) { return {_mm256_add_epi32(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 operator-(I8 a, I8 b) { return {_mm256_sub_epi32(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 operator|(I8 a, I8 b) { return {_mm256_or_si256(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 operator&(I8 a, I8 b) { return {_mm256_and_si256(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 operator^(I8 a, I8 b) { return {_mm256_xor_si256(a.v, b.v)}; }
template <int N>
ZEL_LANE_AVX2 I8 shiftRightArith(I8 a) {
  return {_mm256_srai_epi32(a.v, N)};
}
template <int N>
ZEL_LANE_AVX2 I8 shiftLeft(I8 a) {
  return {_mm256_slli_epi32(a.v, N)};
}
ZEL_LANE_AVX2 I8 imin(I8 a, I8 b) { return {_mm256_min_epi32(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 imax(I8 a, I8 b) { return {_mm256_max_epi32(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 ieq(I8 a, I8 b) { return {_mm256_cmpeq_epi32(a.v, b.v)}; }
ZEL_LANE_AVX2 I8 iselect(I8 mask, I8 a, I8 b) { return {_mm256_blendv_epi8(b.v, a.v, mask.v)}; }
ZEL_LANE_AVX2 I8 iselect(F8 mask, I8 a, I8 b) { return iselect(asInt(mask), a, b); }
ZEL_LANE_AVX2 I8 multiplyAddPairs(I8 a, I8 b) { return {_mm256_madd_epi16(a.v, b.v)}; }

// Eight pairs, each one 64-bit read: cheaper than two gathers of floats.
ZEL_LANE_AVX2 void gatherPairs(const float (*table)[2], I8 index, F8& c, F8& w) {
  alignas(32) int32_t at[8];
  _mm256_store_si256(reinterpret_cast<__m256i*>(at), index.v);
  auto pair = [&](int k) { return _mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(table[at[k]]))); };
  auto high = [&](__m128 lo, int k) { return _mm_loadh_pi(lo, reinterpret_cast<const __m64*>(table[at[k]])); };
  // [c0 w0 c1 w1 | c4 w4 c5 w5] and [c2 w2 c3 w3 | c6 w6 c7 w7].
  const __m256 a = _mm256_insertf128_ps(_mm256_castps128_ps256(high(pair(0), 1)), high(pair(4), 5), 1);
  const __m256 b = _mm256_insertf128_ps(_mm256_castps128_ps256(high(pair(2), 3)), high(pair(6), 7), 1);
  c.v = _mm256_shuffle_ps(a, b, _MM_SHUFFLE(2, 0, 2, 0));
  w.v = _mm256_shuffle_ps(a, b, _MM_SHUFFLE(3, 1, 3, 1));
}

// Eight pixels are two blocks of four.
ZEL_LANE_AVX2 I8 join(I4 lo, I4 hi) { return {_mm256_inserti128_si256(_mm256_castsi128_si256(lo.v), hi.v, 1)}; }
ZEL_LANE_AVX2 I4 lowHalf(I8 a) { return {_mm256_castsi256_si128(a.v)}; }
ZEL_LANE_AVX2 I4 highHalf(I8 a) { return {_mm256_extracti128_si256(a.v, 1)}; }

// Eight byte pixels of three samples, 24 bytes: the first four pixels in
// the low half of a vector, the last four in the high half at the same
// places, so one byte shuffle a channel serves both halves.
ZEL_LANE_AVX2 void loadBytes3(const uint8_t* p, I8& c0, I8& c1, I8& c2) {
  const __m128i lo = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
  const __m128i hi = _mm_alignr_epi8(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(p + 16)), lo, 12);
  const __m256i v = _mm256_inserti128_si256(_mm256_castsi128_si256(lo), hi, 1);
  c0.v = _mm256_shuffle_epi8(v, _mm256_setr_epi8(0, -1, -1, -1, 3, -1, -1, -1, 6, -1, -1, -1, 9, -1, -1, -1, 0, -1, -1,
                                                 -1, 3, -1, -1, -1, 6, -1, -1, -1, 9, -1, -1, -1));
  c1.v = _mm256_shuffle_epi8(v, _mm256_setr_epi8(1, -1, -1, -1, 4, -1, -1, -1, 7, -1, -1, -1, 10, -1, -1, -1, 1, -1,
                                                 -1, -1, 4, -1, -1, -1, 7, -1, -1, -1, 10, -1, -1, -1));
  c2.v = _mm256_shuffle_epi8(v, _mm256_setr_epi8(2, -1, -1, -1, 5, -1, -1, -1, 8, -1, -1, -1, 11, -1, -1, -1, 2, -1,
                                                 -1, -1, 5, -1, -1, -1, 8, -1, -1, -1, 11, -1, -1, -1));
}

// The low byte of each lane back to its place; 24 bytes written.
ZEL_LANE_AVX2 void storeBytes3(uint8_t* p, I8 c0, I8 c1, I8 c2) {
  const __m256i v = _mm256_or_si256(
      _mm256_or_si256(_mm256_shuffle_epi8(c0.v, _mm256_setr_epi8(0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1, -1, -1,
                                                                 -1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1,
                                                                 -1, -1, -1)),
                      _mm256_shuffle_epi8(c1.v, _mm256_setr_epi8(-1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1, -1,
                                                                 -1, -1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1,
                                                                 -1, -1, -1))),
      _mm256_shuffle_epi8(c2.v, _mm256_setr_epi8(-1, -1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1, -1, -1, -1, 0,
                                                 -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1, -1)));
  const __m128i lo = _mm256_castsi256_si128(v), hi = _mm256_extracti128_si256(v, 1);
  _mm_storeu_si128(reinterpret_cast<__m128i*>(p), _mm_or_si128(lo, _mm_slli_si128(hi, 12)));
  _mm_storel_epi64(reinterpret_cast<__m128i*>(p + 16), _mm_srli_si128(hi, 4));
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX2 void loadRaw(const T* p, I8& c0, I8& c1, I8& c2) {
  if constexpr (Stride == 3 && sizeof(T) == 1) {
    loadBytes3(p, c0, c1, c2);
    return;
  }
  I4 a0, a1, a2, b0, b1, b2;
  loadRaw<Stride, Bias16>(p, a0, a1, a2);
  loadRaw<Stride, Bias16>(p + 4 * Stride, b0, b1, b2);
  c0 = join(a0, b0), c1 = join(a1, b1), c2 = join(a2, b2);
}

// Eight float pixels of three samples are three whole vectors: each
// channel is picked from the three by two blends (its samples sit at
// distinct places of the three) and put in pixel order by one permute.
// Storing is the same the other way round.
ZEL_LANE_AVX2 void loadFloat3(const float* p, F8& c0, F8& c1, F8& c2) {
  const __m256 v0 = _mm256_loadu_ps(p), v1 = _mm256_loadu_ps(p + 8), v2 = _mm256_loadu_ps(p + 16);
  const __m256 a = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x92), v2, 0x24);
  const __m256 b = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x24), v2, 0x49);
  const __m256 c = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x49), v2, 0x92);
  c0.v = _mm256_permutevar8x32_ps(a, _mm256_setr_epi32(0, 3, 6, 1, 4, 7, 2, 5));
  c1.v = _mm256_permutevar8x32_ps(b, _mm256_setr_epi32(1, 4, 7, 2, 5, 0, 3, 6));
  c2.v = _mm256_permutevar8x32_ps(c, _mm256_setr_epi32(2, 5, 0, 3, 6, 1, 4, 7));
}

ZEL_LANE_AVX2 void storeFloat3(float* p, F8 c0, F8 c1, F8 c2) {
  const __m256 a = _mm256_permutevar8x32_ps(c0.v, _mm256_setr_epi32(0, 3, 6, 1, 4, 7, 2, 5));
  const __m256 b = _mm256_permutevar8x32_ps(c1.v, _mm256_setr_epi32(5, 0, 3, 6, 1, 4, 7, 2));
  const __m256 c = _mm256_permutevar8x32_ps(c2.v, _mm256_setr_epi32(2, 5, 0, 3, 6, 1, 4, 7));
  _mm256_storeu_ps(p, _mm256_blend_ps(_mm256_blend_ps(a, b, 0x92), c, 0x24));
  _mm256_storeu_ps(p + 8, _mm256_blend_ps(_mm256_blend_ps(c, a, 0x92), b, 0x24));
  _mm256_storeu_ps(p + 16, _mm256_blend_ps(_mm256_blend_ps(b, c, 0x92), a, 0x24));
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX2 void loadPixels(const T* p, F8& c0, F8& c1, F8& c2) {
  if constexpr (std::is_same_v<T, float> && Stride == 3) {
    loadFloat3(p, c0, c1, c2);
    return;
  }
  I8 r0, r1, r2;
  loadRaw<Stride, Bias16>(p, r0, r1, r2);
  if constexpr (sizeof(T) == 4) {
    c0 = asFloat(r0), c1 = asFloat(r1), c2 = asFloat(r2);
  } else {
    c0 = toFloat(r0), c1 = toFloat(r1), c2 = toFloat(r2);
  }
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX2 void storeRaw(T* p, I8 c0, I8 c1, I8 c2) {
  if constexpr (Stride == 3 && sizeof(T) == 1) {
    storeBytes3(p, c0, c1, c2);
    return;
  }
  storeRaw<Stride, Bias16>(p, lowHalf(c0), lowHalf(c1), lowHalf(c2));
  storeRaw<Stride, Bias16>(p + 4 * Stride, highHalf(c0), highHalf(c1), highHalf(c2));
}

template <int Stride>
ZEL_LANE_AVX2 void storePixels(float* p, F8 c0, F8 c1, F8 c2) {
  if constexpr (Stride == 3) storeFloat3(p, c0, c1, c2);
  else storeRaw<Stride, false>(p, asInt(c0), asInt(c1), asInt(c2));
}

// Integer lanes stored as bytes saturated to 0..255 (SaturateS16 then
// SaturateU8, which together clamp any int32 to 0..255). Eight pixels of
// three bytes pack with saturation and take one shuffle; other shapes clamp
// and store the low bytes.
template <int Stride>
ZEL_LANE void storeClampedBytes(uint8_t* p, I4 c0, I4 c1, I4 c2);
template <int Stride>
ZEL_LANE_AVX2 void storeClampedBytes(uint8_t* p, I8 c0, I8 c1, I8 c2);

// Integer results clamped to the range of a sample: SaturateU8 (also after
// SaturateS16, which it absorbs) and SaturateU16.
ZEL_LANE I4 clampToByte(I4 x) { return imax(imin(x, I4::splat(255)), I4::splat(0)); }
ZEL_LANE I4 clampToWord(I4 x) { return imax(imin(x, I4::splat(65535)), I4::splat(0)); }
ZEL_LANE_AVX2 I8 clampToByte(I8 x) { return imax(imin(x, I8::splat(255)), I8::splat(0)); }
ZEL_LANE_AVX2 I8 clampToWord(I8 x) { return imax(imin(x, I8::splat(65535)), I8::splat(0)); }

template <int Stride>
ZEL_LANE void storeClampedBytes(uint8_t* p, I4 c0, I4 c1, I4 c2) {
  storeRaw<Stride, false>(p, clampToByte(c0), clampToByte(c1), clampToByte(c2));
}
template <int Stride>
ZEL_LANE_AVX2 void storeClampedBytes(uint8_t* p, I8 c0, I8 c1, I8 c2) {
  if constexpr (Stride == 3) {
    // Per half: c0 of four pixels, c1, c2, c2 again, as saturated bytes.
    const __m256i words01 = _mm256_packs_epi32(c0.v, c1.v), words22 = _mm256_packs_epi32(c2.v, c2.v);
    const __m256i bytes = _mm256_packus_epi16(words01, words22);
    const __m256i v = _mm256_shuffle_epi8(bytes, _mm256_setr_epi8(0, 4, 8, 1, 5, 9, 2, 6, 10, 3, 7, 11, -1, -1, -1, -1, 0,
                                                                  4, 8, 1, 5, 9, 2, 6, 10, 3, 7, 11, -1, -1, -1, -1));
    const __m128i lo = _mm256_castsi256_si128(v), hi = _mm256_extracti128_si256(v, 1);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(p), _mm_or_si128(lo, _mm_slli_si128(hi, 12)));
    _mm_storel_epi64(reinterpret_cast<__m128i*>(p + 16), _mm_srli_si128(hi, 4));
  } else {
    storeRaw<Stride, false>(p, clampToByte(c0), clampToByte(c1), clampToByte(c2));
  }
}

}  // namespace zel::lanes
