// Lane types for the float kernels of the colour-space families: F4/I4 are
// four float or int32 lanes of SSE4.1, F8/I8 eight lanes of AVX2 and F16/I16
// sixteen lanes of the 512-bit tier. A kernel body is written once as a
// template over the lane type and instantiated for each; every operation has
// the same meaning per lane at every width, so all give the same bits.
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
#include "spaces/row_stores.h"

#define ZEL_LANE inline __attribute__((always_inline))
#define ZEL_LANE_AVX2 ZEL_AVX2 inline __attribute__((always_inline))
#define ZEL_LANE_AVX512 ZEL_AVX512 inline __attribute__((always_inline))

namespace zel::lanes {

// Reading ahead: a block's source lines some way further on are asked for
// now, so that memory keeps pace with the arithmetic (the processor's own
// prefetch does not, on large frames). A prefetch is a hint: it neither
// faults nor changes a byte, so it may point past the row.
inline constexpr int kReadAhead = 8192;
template <int Bytes>
ZEL_LANE void readAhead(const void* p) {
  const char* at = static_cast<const char*>(p) + kReadAhead;
  for (int b = 0; b < Bytes; b += 64) _mm_prefetch(at + b, _MM_HINT_T0);
}

// Pairs k and k + 1 of a table of float pairs in one register, one 64-bit
// read each: the (c, w) gathers of every width are made of these.
ZEL_LANE __m128 pairsAt(const float (*table)[2], const int32_t* at, int k) {
  return _mm_loadh_pi(_mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(table[at[k]]))),
                      reinterpret_cast<const __m64*>(table[at[k + 1]]));
}

// The operations of one form at every width, written once and stamped for
// each: F and I are the float and int32 lane types, ON the width's
// always-inline marker, MM the prefix of its intrinsics (_mm, _mm256,
// _mm512) and BITS its register width. The width's approxRcp comes first.
//   vmin, vmax        MINPS / MAXPS: the second operand when the comparison
//                     fails (the wider forms keep that rule);
//   refinedRcp        one Newton step on ApproxRcp, 2r - x r r;
//   multiplyAddPairs  sums of the products of 16-bit pairs (PMADDWD);
//   clampToByte/Word  SaturateU8 (also after SaturateS16, which it absorbs)
//                     and SaturateU16;
//   samplesAsFloat    raw samples of type T as floats: integers converted,
//                     float bits as they are.
#define ZEL_LANE_ARITHMETIC(F, I, ON, MM, BITS)                                 \
  ON F operator+(F a, F b) { return {MM##_add_ps(a.v, b.v)}; }                  \
  ON F operator-(F a, F b) { return {MM##_sub_ps(a.v, b.v)}; }                  \
  ON F operator*(F a, F b) { return {MM##_mul_ps(a.v, b.v)}; }                  \
  ON F operator/(F a, F b) { return {MM##_div_ps(a.v, b.v)}; }                  \
  ON F vmin(F a, F b) { return {MM##_min_ps(a.v, b.v)}; }                       \
  ON F vmax(F a, F b) { return {MM##_max_ps(a.v, b.v)}; }                       \
  ON F refinedRcp(F x) {                                                        \
    const F r = approxRcp(x);                                                   \
    return (r + r) - ((x * r) * r);                                             \
  }                                                                             \
  ON I roundEven(F a) { return {MM##_cvtps_epi32(a.v)}; }                       \
  ON I truncate(F a) { return {MM##_cvttps_epi32(a.v)}; }                       \
  ON F toFloat(I a) { return {MM##_cvtepi32_ps(a.v)}; }                         \
  ON F asFloat(I a) { return {MM##_castsi##BITS##_ps(a.v)}; }                   \
  ON I asInt(F a) { return {MM##_castps_si##BITS(a.v)}; }                       \
  ON I operator+(I a, I b) { return {MM##_add_epi32(a.v, b.v)}; }               \
  ON I operator-(I a, I b) { return {MM##_sub_epi32(a.v, b.v)}; }               \
  ON I operator|(I a, I b) { return {MM##_or_si##BITS(a.v, b.v)}; }             \
  ON I operator&(I a, I b) { return {MM##_and_si##BITS(a.v, b.v)}; }            \
  ON I operator^(I a, I b) { return {MM##_xor_si##BITS(a.v, b.v)}; }            \
  template <int N>                                                              \
  ON I shiftRightArith(I a) {                                                   \
    return {MM##_srai_epi32(a.v, N)};                                           \
  }                                                                             \
  template <int N>                                                              \
  ON I shiftLeft(I a) {                                                         \
    return {MM##_slli_epi32(a.v, N)};                                           \
  }                                                                             \
  ON I imin(I a, I b) { return {MM##_min_epi32(a.v, b.v)}; }                    \
  ON I imax(I a, I b) { return {MM##_max_epi32(a.v, b.v)}; }                    \
  ON I multiplyAddPairs(I a, I b) { return {MM##_madd_epi16(a.v, b.v)}; }       \
  ON I clampToByte(I x) { return imax(imin(x, I::splat(255)), I::splat(0)); }   \
  ON I clampToWord(I x) { return imax(imin(x, I::splat(65535)), I::splat(0)); } \
  template <typename T>                                                         \
  ON F samplesAsFloat(I raw) {                                                  \
    return sizeof(T) == 4 ? asFloat(raw) : toFloat(raw);                        \
  }

// The widths whose comparisons give all-ones lanes (4 and 8): masks are
// float vectors, combined and applied bit by bit.
//   select      a where the mask is set, else b;
//   clearWhere  the value where the mask is clear, zero where it is set.
#define ZEL_LANE_ALL_ONES_MASKS(F, I, ON, MM, BITS)                               \
  ON F approxRcp(F a) { return {MM##_rcp_ps(a.v)}; }                              \
  ON F vabs(F a) { return {MM##_andnot_ps(MM##_set1_ps(-0.0f), a.v)}; }           \
  ON F maskOr(F a, F b) { return {MM##_or_ps(a.v, b.v)}; }                        \
  ON F maskAnd(F a, F b) { return {MM##_and_ps(a.v, b.v)}; }                      \
  ON F select(F mask, F a, F b) { return {MM##_blendv_ps(b.v, a.v, mask.v)}; }    \
  ON F clearWhere(F mask, F a) { return {MM##_andnot_ps(mask.v, a.v)}; }          \
  ON I ieq(I a, I b) { return {MM##_cmpeq_epi32(a.v, b.v)}; }                     \
  ON I iselect(I mask, I a, I b) { return {MM##_blendv_epi8(b.v, a.v, mask.v)}; } \
  ON I iselect(F mask, I a, I b) { return iselect(I{MM##_castps_si##BITS(mask.v)}, a, b); }

// ---------------------------------------------------------------- 4 lanes

struct I4 {
  __m128i v;
  static ZEL_LANE I4 splat(int32_t x) { return {_mm_set1_epi32(x)}; }
};

struct F4 {
  using Int = I4;
  using Mask = F4;  // comparisons give all-ones lanes
  static constexpr int kLanes = 4;
  __m128 v;
  static ZEL_LANE F4 splat(float x) { return {_mm_set1_ps(x)}; }
};

ZEL_LANE_ALL_ONES_MASKS(F4, I4, ZEL_LANE, _mm, 128)
ZEL_LANE F4 eq(F4 a, F4 b) { return {_mm_cmpeq_ps(a.v, b.v)}; }
ZEL_LANE F4 lt(F4 a, F4 b) { return {_mm_cmplt_ps(a.v, b.v)}; }
ZEL_LANE F4 le(F4 a, F4 b) { return {_mm_cmple_ps(a.v, b.v)}; }
ZEL_LANE F4 gt(F4 a, F4 b) { return {_mm_cmpgt_ps(a.v, b.v)}; }
ZEL_LANE F4 ge(F4 a, F4 b) { return {_mm_cmpge_ps(a.v, b.v)}; }
ZEL_LANE_ARITHMETIC(F4, I4, ZEL_LANE, _mm, 128)

// Four (c, w) pairs of a table of float pairs, one 64-bit read per lane.
ZEL_LANE void gatherPairs(const float (*table)[2], I4 index, F4& c, F4& w) {
  alignas(16) int32_t at[4];
  _mm_store_si128(reinterpret_cast<__m128i*>(at), index.v);
  const __m128 p01 = pairsAt(table, at, 0), p23 = pairsAt(table, at, 2);
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
  c0 = samplesAsFloat<T>(r0), c1 = samplesAsFloat<T>(r1), c2 = samplesAsFloat<T>(r2);
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

// Float pixels read and written as `how` says (see row_stores.h); only
// three-sample pixels are ever streamed or cut to a part.
template <int Stride, bool Bias16, typename T>
ZEL_LANE void getPixels(const spaces::RowStores& how, const T* p, F4& c0, F4& c1, F4& c2) {
  if constexpr (Stride == 3 && std::is_same_v<T, float>) {
    if (how.kind == spaces::RowStores::Part) {
      alignas(16) float v[12] = {};
      std::memcpy(v, p, sizeof(float) * 3 * size_t(how.keep));
      loadPixels<3, false>(v, c0, c1, c2);
      return;
    }
  }
  loadPixels<Stride, Bias16>(p, c0, c1, c2);
}
template <int Stride>
ZEL_LANE void putPixels(const spaces::RowStores& how, float* p, F4 c0, F4 c1, F4 c2) {
  if (Stride != 3 || how.kind == spaces::RowStores::Plain) return storePixels<Stride>(p, c0, c1, c2);
  alignas(16) float v[12];
  storePixels<3>(v, c0, c1, c2);
  if (how.kind == spaces::RowStores::Part) {
    std::memcpy(p, v, sizeof(float) * 3 * size_t(how.keep));
    return;
  }
  for (int k = 0; k < 3; ++k) _mm_stream_ps(p + 4 * k, _mm_load_ps(v + 4 * k));
}

// ---------------------------------------------------------------- 8 lanes

struct I8 {
  __m256i v;
  static ZEL_LANE_AVX2 I8 splat(int32_t x) { return {_mm256_set1_epi32(x)}; }
};

struct F8 {
  using Int = I8;
  using Mask = F8;
  static constexpr int kLanes = 8;
  __m256 v;
  static ZEL_LANE_AVX2 F8 splat(float x) { return {_mm256_set1_ps(x)}; }
};

ZEL_LANE_ALL_ONES_MASKS(F8, I8, ZEL_LANE_AVX2, _mm256, 256)
ZEL_LANE_AVX2 F8 eq(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_EQ_OQ)}; }
ZEL_LANE_AVX2 F8 lt(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_LT_OS)}; }
ZEL_LANE_AVX2 F8 le(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_LE_OS)}; }
ZEL_LANE_AVX2 F8 gt(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_GT_OS)}; }
ZEL_LANE_AVX2 F8 ge(F8 a, F8 b) { return {_mm256_cmp_ps(a.v, b.v, _CMP_GE_OS)}; }
ZEL_LANE_ARITHMETIC(F8, I8, ZEL_LANE_AVX2, _mm256, 256)

// Eight pairs, each one 64-bit read: cheaper than two gathers of floats.
ZEL_LANE_AVX2 void gatherPairs(const float (*table)[2], I8 index, F8& c, F8& w) {
  alignas(32) int32_t at[8];
  _mm256_store_si256(reinterpret_cast<__m256i*>(at), index.v);
  // [c0 w0 c1 w1 | c4 w4 c5 w5] and [c2 w2 c3 w3 | c6 w6 c7 w7].
  const __m256 a = _mm256_insertf128_ps(_mm256_castps128_ps256(pairsAt(table, at, 0)), pairsAt(table, at, 4), 1);
  const __m256 b = _mm256_insertf128_ps(_mm256_castps128_ps256(pairsAt(table, at, 2)), pairsAt(table, at, 6), 1);
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

// Twelve bytes at the start of each 128-bit half back to 24 bytes, written
// exactly.
ZEL_LANE_AVX2 void storeLanesAsBytes3(uint8_t* p, __m256i v) {
  const __m128i lo = _mm256_castsi256_si128(v), hi = _mm256_extracti128_si256(v, 1);
  _mm_storeu_si128(reinterpret_cast<__m128i*>(p), _mm_or_si128(lo, _mm_slli_si128(hi, 12)));
  _mm_storel_epi64(reinterpret_cast<__m128i*>(p + 16), _mm_srli_si128(hi, 4));
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
  storeLanesAsBytes3(p, v);
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
ZEL_LANE_AVX2 void deinterleaveFloat3(__m256 v0, __m256 v1, __m256 v2, F8& c0, F8& c1, F8& c2) {
  const __m256 a = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x92), v2, 0x24);
  const __m256 b = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x24), v2, 0x49);
  const __m256 c = _mm256_blend_ps(_mm256_blend_ps(v0, v1, 0x49), v2, 0x92);
  c0.v = _mm256_permutevar8x32_ps(a, _mm256_setr_epi32(0, 3, 6, 1, 4, 7, 2, 5));
  c1.v = _mm256_permutevar8x32_ps(b, _mm256_setr_epi32(1, 4, 7, 2, 5, 0, 3, 6));
  c2.v = _mm256_permutevar8x32_ps(c, _mm256_setr_epi32(2, 5, 0, 3, 6, 1, 4, 7));
}
ZEL_LANE_AVX2 void loadFloat3(const float* p, F8& c0, F8& c1, F8& c2) {
  deinterleaveFloat3(_mm256_loadu_ps(p), _mm256_loadu_ps(p + 8), _mm256_loadu_ps(p + 16), c0, c1, c2);
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
  c0 = samplesAsFloat<T>(r0), c1 = samplesAsFloat<T>(r1), c2 = samplesAsFloat<T>(r2);
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

// The three vectors of storeFloat3 streamed (p aligned to 32), or the
// samples of the first `keep` pixels alone; and those read alone.
ZEL_LANE_AVX2 __m256i firstSamples(int samples, int k) {
  return _mm256_cmpgt_epi32(_mm256_set1_epi32(samples - 8 * k), _mm256_setr_epi32(0, 1, 2, 3, 4, 5, 6, 7));
}
ZEL_LANE_AVX2 void interleaveFloat3(F8 c0, F8 c1, F8 c2, __m256* out) {
  const __m256 a = _mm256_permutevar8x32_ps(c0.v, _mm256_setr_epi32(0, 3, 6, 1, 4, 7, 2, 5));
  const __m256 b = _mm256_permutevar8x32_ps(c1.v, _mm256_setr_epi32(5, 0, 3, 6, 1, 4, 7, 2));
  const __m256 c = _mm256_permutevar8x32_ps(c2.v, _mm256_setr_epi32(2, 5, 0, 3, 6, 1, 4, 7));
  out[0] = _mm256_blend_ps(_mm256_blend_ps(a, b, 0x92), c, 0x24);
  out[1] = _mm256_blend_ps(_mm256_blend_ps(c, a, 0x92), b, 0x24);
  out[2] = _mm256_blend_ps(_mm256_blend_ps(b, c, 0x92), a, 0x24);
}

template <int Stride>
ZEL_LANE_AVX2 void putPixels(const spaces::RowStores& how, float* p, F8 c0, F8 c1, F8 c2) {
  if (Stride != 3 || how.kind == spaces::RowStores::Plain) return storePixels<Stride>(p, c0, c1, c2);
  __m256 v[3];
  interleaveFloat3(c0, c1, c2, v);
  if (how.kind == spaces::RowStores::Stream) {
    for (int k = 0; k < 3; ++k) _mm256_stream_ps(p + 8 * k, v[k]);
    return;
  }
  for (int k = 0; k < 3; ++k) _mm256_maskstore_ps(p + 8 * k, firstSamples(3 * how.keep, k), v[k]);
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX2 void getPixels(const spaces::RowStores& how, const T* p, F8& c0, F8& c1, F8& c2) {
  if constexpr (Stride == 3 && std::is_same_v<T, float>) {
    if (how.kind == spaces::RowStores::Part) {
      const __m256 v0 = _mm256_maskload_ps(p, firstSamples(3 * how.keep, 0));
      const __m256 v1 = _mm256_maskload_ps(p + 8, firstSamples(3 * how.keep, 1));
      const __m256 v2 = _mm256_maskload_ps(p + 16, firstSamples(3 * how.keep, 2));
      deinterleaveFloat3(v0, v1, v2, c0, c1, c2);
      return;
    }
  }
  loadPixels<Stride, Bias16>(p, c0, c1, c2);
}

// Integer lanes stored as bytes saturated to 0..255 (SaturateS16 then
// SaturateU8, which together clamp any int32 to 0..255). Eight pixels of
// three bytes pack with saturation and take one shuffle; other shapes clamp
// and store the low bytes.
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
    storeLanesAsBytes3(p, _mm256_shuffle_epi8(bytes, _mm256_setr_epi8(0, 4, 8, 1, 5, 9, 2, 6, 10, 3, 7, 11, -1, -1, -1,
                                                                      -1, 0, 4, 8, 1, 5, 9, 2, 6, 10, 3, 7, 11, -1, -1,
                                                                      -1, -1)));
  } else {
    storeRaw<Stride, false>(p, clampToByte(c0), clampToByte(c1), clampToByte(c2));
  }
}

ZEL_TIER512_BEGIN

// ---------------------------------------------------------------- 16 lanes
//
// The 512-bit tier. Comparisons give a mask register (M16) rather than
// all-ones lanes; select and the masked forms read it. ApproxRcp stays
// RCPPS: the sixteen lanes take two 256-bit reciprocals, lane by lane the
// same bits as every other width.

struct I16 {
  __m512i v;
  static ZEL_LANE_AVX512 I16 splat(int32_t x) { return {_mm512_set1_epi32(x)}; }
};

struct M16 {
  __mmask16 k;
};

struct F16 {
  using Int = I16;
  using Mask = M16;
  static constexpr int kLanes = 16;
  __m512 v;
  static ZEL_LANE_AVX512 F16 splat(float x) { return {_mm512_set1_ps(x)}; }
};

ZEL_LANE_AVX512 F16 approxRcp(F16 a) {
  const __m256 lo = _mm256_rcp_ps(_mm512_castps512_ps256(a.v));
  const __m256 hi = _mm256_rcp_ps(_mm512_extractf32x8_ps(a.v, 1));
  return {_mm512_insertf32x8(_mm512_castps256_ps512(lo), hi, 1)};
}
ZEL_LANE_AVX512 F16 vabs(F16 a) { return {_mm512_abs_ps(a.v)}; }
ZEL_LANE_AVX512 M16 eq(F16 a, F16 b) { return {_mm512_cmp_ps_mask(a.v, b.v, _CMP_EQ_OQ)}; }
ZEL_LANE_AVX512 M16 lt(F16 a, F16 b) { return {_mm512_cmp_ps_mask(a.v, b.v, _CMP_LT_OS)}; }
ZEL_LANE_AVX512 M16 le(F16 a, F16 b) { return {_mm512_cmp_ps_mask(a.v, b.v, _CMP_LE_OS)}; }
ZEL_LANE_AVX512 M16 gt(F16 a, F16 b) { return {_mm512_cmp_ps_mask(a.v, b.v, _CMP_GT_OS)}; }
ZEL_LANE_AVX512 M16 ge(F16 a, F16 b) { return {_mm512_cmp_ps_mask(a.v, b.v, _CMP_GE_OS)}; }
ZEL_LANE_AVX512 M16 maskOr(M16 a, M16 b) { return {__mmask16(a.k | b.k)}; }
ZEL_LANE_AVX512 M16 maskAnd(M16 a, M16 b) { return {__mmask16(a.k & b.k)}; }
// The value where the mask is set, zero elsewhere (as maskAnd of an
// all-ones mask and a value).
ZEL_LANE_AVX512 F16 maskAnd(M16 m, F16 a) { return {_mm512_maskz_mov_ps(m.k, a.v)}; }
ZEL_LANE_AVX512 F16 select(M16 m, F16 a, F16 b) { return {_mm512_mask_blend_ps(m.k, b.v, a.v)}; }
ZEL_LANE_AVX512 F16 clearWhere(M16 m, F16 a) { return {_mm512_maskz_mov_ps(__mmask16(~m.k), a.v)}; }
ZEL_LANE_AVX512 M16 clearWhere(M16 m, M16 a) { return {__mmask16(a.k & ~m.k)}; }
ZEL_LANE_AVX512 M16 ieq(I16 a, I16 b) { return {_mm512_cmpeq_epi32_mask(a.v, b.v)}; }
ZEL_LANE_AVX512 I16 iselect(M16 m, I16 a, I16 b) { return {_mm512_mask_blend_epi32(m.k, b.v, a.v)}; }
ZEL_LANE_ARITHMETIC(F16, I16, ZEL_LANE_AVX512, _mm512, 512)

// Sixteen (c, w) pairs, each one 64-bit read, as the narrower forms.
ZEL_LANE_AVX512 void gatherPairs(const float (*table)[2], I16 index, F16& c, F16& w) {
  alignas(64) int32_t at[16];
  _mm512_store_si512(at, index.v);
  // Quarters [c0 w0 c1 w1 | c4 w4 c5 w5 | c8 .. | c12 ..] and the same
  // from pixels 2, 3, 6, 7, ...
  __m512 a = _mm512_castps128_ps512(pairsAt(table, at, 0)), b = _mm512_castps128_ps512(pairsAt(table, at, 2));
  a = _mm512_insertf32x4(a, pairsAt(table, at, 4), 1), b = _mm512_insertf32x4(b, pairsAt(table, at, 6), 1);
  a = _mm512_insertf32x4(a, pairsAt(table, at, 8), 2), b = _mm512_insertf32x4(b, pairsAt(table, at, 10), 2);
  a = _mm512_insertf32x4(a, pairsAt(table, at, 12), 3), b = _mm512_insertf32x4(b, pairsAt(table, at, 14), 3);
  c.v = _mm512_shuffle_ps(a, b, _MM_SHUFFLE(2, 0, 2, 0));
  w.v = _mm512_shuffle_ps(a, b, _MM_SHUFFLE(3, 1, 3, 1));
}

// Sixteen float pixels of three samples are three whole vectors. Sample
// 3k + c (channel c of pixel k) lies at place (3k + c) % 16 of vector
// (3k + c) / 16, and for one channel those places are distinct across the
// three vectors (p = c, c + 2, c + 1 modulo 3 in vectors 0, 1, 2): each
// channel is two masked blends and one permute, and back.
struct Float3Order {
  int32_t order[3][16];   // pixel k of channel c sits at place order[c][k]
  int32_t spread[3][16];  // and place p holds pixel spread[c][p]
  static constexpr Float3Order make() {
    Float3Order m{};
    for (int c = 0; c < 3; ++c)
      for (int k = 0; k < 16; ++k) {
        m.order[c][k] = (3 * k + c) % 16;
        m.spread[c][(3 * k + c) % 16] = k;
      }
    return m;
  }
};
inline constexpr Float3Order kFloat3Order = Float3Order::make();

// Places p of vector v (0..2) that hold channel c: (16 v + p) % 3 == c.
constexpr __mmask16 channelPlaces(int v, int c) {
  int bits = 0;
  for (int p = 0; p < 16; ++p)
    if ((16 * v + p) % 3 == c) bits |= 1 << p;
  return __mmask16(bits);
}

ZEL_LANE_AVX512 __m512i indexVector(const int32_t* at) { return _mm512_loadu_si512(at); }
// Lanes of v by index (VPERMPS / VPERMD).
ZEL_LANE_AVX512 __m512 permuteLanes(__m512i index, __m512 v) { return _mm512_permutexvar_ps(index, v); }
ZEL_LANE_AVX512 __m512i permuteLanes(__m512i index, __m512i v) { return _mm512_permutexvar_epi32(index, v); }

template <int C>
ZEL_LANE_AVX512 __m512 channelOf(__m512 v0, __m512 v1, __m512 v2) {
  const __m512 a = _mm512_mask_blend_ps(channelPlaces(2, C), _mm512_mask_blend_ps(channelPlaces(1, C), v0, v1), v2);
  return permuteLanes(indexVector(kFloat3Order.order[C]), a);
}
ZEL_LANE_AVX512 void deinterleaveFloat3(__m512 v0, __m512 v1, __m512 v2, F16& c0, F16& c1, F16& c2) {
  c0.v = channelOf<0>(v0, v1, v2);
  c1.v = channelOf<1>(v0, v1, v2);
  c2.v = channelOf<2>(v0, v1, v2);
}

template <int V>
ZEL_LANE_AVX512 __m512 vectorOf(__m512 s0, __m512 s1, __m512 s2) {
  return _mm512_mask_blend_ps(channelPlaces(V, 2), _mm512_mask_blend_ps(channelPlaces(V, 1), s0, s1), s2);
}
ZEL_LANE_AVX512 void interleaveFloat3(F16 c0, F16 c1, F16 c2, __m512* out) {
  // Each channel spread to its places (place (3k + c) % 16 takes pixel k).
  const __m512 s0 = permuteLanes(indexVector(kFloat3Order.spread[0]), c0.v);
  const __m512 s1 = permuteLanes(indexVector(kFloat3Order.spread[1]), c1.v);
  const __m512 s2 = permuteLanes(indexVector(kFloat3Order.spread[2]), c2.v);
  out[0] = vectorOf<0>(s0, s1, s2);
  out[1] = vectorOf<1>(s0, s1, s2);
  out[2] = vectorOf<2>(s0, s1, s2);
}

ZEL_LANE_AVX512 void loadFloat3(const float* p, F16& c0, F16& c1, F16& c2) {
  deinterleaveFloat3(_mm512_loadu_ps(p), _mm512_loadu_ps(p + 16), _mm512_loadu_ps(p + 32), c0, c1, c2);
}
// The masks of the first `samples` floats of three vectors.
ZEL_LANE_AVX512 __mmask16 firstSampleBits(int samples, int k) {
  return __mmask16(((uint64_t(1) << samples) - 1) >> (16 * k));
}

ZEL_LANE_AVX512 void storeFloat3(float* p, F16 c0, F16 c1, F16 c2) {
  __m512 v[3];
  interleaveFloat3(c0, c1, c2, v);
  _mm512_storeu_ps(p, v[0]);
  _mm512_storeu_ps(p + 16, v[1]);
  _mm512_storeu_ps(p + 32, v[2]);
}

// Sixteen byte pixels of three samples (48 bytes, read exactly): each
// 128-bit lane takes the 12 bytes of four pixels, then one byte shuffle a
// channel as in the 8-lane form.
ZEL_LANE_AVX512 __m512i bytes3ToLanes(const uint8_t* p) {
  const __m512i raw = _mm512_maskz_loadu_epi32(0x0FFF, p);
  return permuteLanes(_mm512_setr_epi32(0, 1, 2, 0, 3, 4, 5, 0, 6, 7, 8, 0, 9, 10, 11, 0), raw);
}
// The same byte shuffle in every 128-bit lane.
ZEL_LANE_AVX512 __m512i laneShuffle(__m512i v, __m128i mask) {
  return _mm512_shuffle_epi8(v, _mm512_broadcast_i32x4(mask));
}
ZEL_LANE_AVX512 void loadBytes3(const uint8_t* p, I16& c0, I16& c1, I16& c2) {
  const __m512i v = bytes3ToLanes(p);
  c0.v = laneShuffle(v, _mm_setr_epi8(0, -1, -1, -1, 3, -1, -1, -1, 6, -1, -1, -1, 9, -1, -1, -1));
  c1.v = laneShuffle(v, _mm_setr_epi8(1, -1, -1, -1, 4, -1, -1, -1, 7, -1, -1, -1, 10, -1, -1, -1));
  c2.v = laneShuffle(v, _mm_setr_epi8(2, -1, -1, -1, 5, -1, -1, -1, 8, -1, -1, -1, 11, -1, -1, -1));
}
// Twelve bytes at the start of each 128-bit lane back to 48 bytes, written
// exactly.
ZEL_LANE_AVX512 void storeLanesAsBytes3(uint8_t* p, __m512i v) {
  const __m512i packed =
      permuteLanes(_mm512_setr_epi32(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, 0, 0, 0, 0), v);
  _mm512_mask_storeu_epi32(p, 0x0FFF, packed);
}
// The low byte of each lane to its place.
ZEL_LANE_AVX512 void storeBytes3(uint8_t* p, I16 c0, I16 c1, I16 c2) {
  const __m512i v =
      _mm512_or_si512(_mm512_or_si512(laneShuffle(c0.v, _mm_setr_epi8(0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1,
                                                                      -1, -1, -1)),
                                      laneShuffle(c1.v, _mm_setr_epi8(-1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1,
                                                                      -1, -1, -1))),
                      laneShuffle(c2.v, _mm_setr_epi8(-1, -1, 0, -1, -1, 4, -1, -1, 8, -1, -1, 12, -1, -1, -1, -1)));
  storeLanesAsBytes3(p, v);
}

// Four-byte pixels: the first three bytes of each as lanes; back, the
// three bytes alone are written and the fourth is not touched.
ZEL_LANE_AVX512 void loadBytes4(const uint8_t* p, I16& c0, I16& c1, I16& c2) {
  const __m512i v = _mm512_loadu_si512(p), low = _mm512_set1_epi32(0xFF);
  c0.v = _mm512_and_si512(v, low);
  c1.v = _mm512_and_si512(_mm512_srli_epi32(v, 8), low);
  c2.v = _mm512_and_si512(_mm512_srli_epi32(v, 16), low);
}
ZEL_LANE_AVX512 void storeBytes4(uint8_t* p, I16 c0, I16 c1, I16 c2) {
  const __m512i low = _mm512_set1_epi32(0xFF);
  const __m512i v01 = _mm512_or_si512(_mm512_and_si512(c0.v, low), _mm512_slli_epi32(_mm512_and_si512(c1.v, low), 8));
  const __m512i v = _mm512_or_si512(v01, _mm512_slli_epi32(c2.v, 16));
  _mm512_mask_storeu_epi8(p, 0x7777777777777777ull, v);
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX512 void loadRaw(const T* p, I16& c0, I16& c1, I16& c2) {
  static_assert(sizeof(T) == 1 && !Bias16, "the 16-lane forms read bytes");
  if constexpr (Stride == 3) loadBytes3(p, c0, c1, c2);
  else loadBytes4(p, c0, c1, c2);
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX512 void loadPixels(const T* p, F16& c0, F16& c1, F16& c2) {
  if constexpr (std::is_same_v<T, float>) {
    static_assert(Stride == 3, "the 16-lane forms read three-float pixels");
    loadFloat3(p, c0, c1, c2);
  } else {
    I16 r0, r1, r2;
    loadRaw<Stride, Bias16>(p, r0, r1, r2);
    c0 = toFloat(r0), c1 = toFloat(r1), c2 = toFloat(r2);
  }
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX512 void storeRaw(T* p, I16 c0, I16 c1, I16 c2) {
  static_assert(sizeof(T) == 1 && !Bias16, "the 16-lane forms write bytes");
  if constexpr (Stride == 3) storeBytes3(p, c0, c1, c2);
  else storeBytes4(p, c0, c1, c2);
}

template <int Stride>
ZEL_LANE_AVX512 void storeClampedBytes(uint8_t* p, I16 c0, I16 c1, I16 c2) {
  if constexpr (Stride == 3) {
    // Per 128-bit lane: c0 of four pixels, c1, c2, c2 again, as saturated
    // bytes, then put in pixel order.
    const __m512i bytes = _mm512_packus_epi16(_mm512_packs_epi32(c0.v, c1.v), _mm512_packs_epi32(c2.v, c2.v));
    storeLanesAsBytes3(p, laneShuffle(bytes, _mm_setr_epi8(0, 4, 8, 1, 5, 9, 2, 6, 10, 3, 7, 11, -1, -1, -1, -1)));
  } else {
    storeBytes4(p, clampToByte(c0), clampToByte(c1), clampToByte(c2));
  }
}

template <int Stride>
ZEL_LANE_AVX512 void storePixels(float* p, F16 c0, F16 c1, F16 c2) {
  static_assert(Stride == 3, "the 16-lane forms write three-float pixels");
  storeFloat3(p, c0, c1, c2);
}

template <int Stride>
ZEL_LANE_AVX512 void putPixels(const spaces::RowStores& how, float* p, F16 c0, F16 c1, F16 c2) {
  static_assert(Stride == 3, "the 16-lane forms write three-float pixels");
  __m512 v[3];
  interleaveFloat3(c0, c1, c2, v);
  if (how.kind == spaces::RowStores::Plain) {
    for (int k = 0; k < 3; ++k) _mm512_storeu_ps(p + 16 * k, v[k]);
  } else if (how.kind == spaces::RowStores::Stream) {
    for (int k = 0; k < 3; ++k) _mm512_stream_ps(p + 16 * k, v[k]);
  } else {
    for (int k = 0; k < 3; ++k) _mm512_mask_storeu_ps(p + 16 * k, firstSampleBits(3 * how.keep, k), v[k]);
  }
}

template <int Stride, bool Bias16, typename T>
ZEL_LANE_AVX512 void getPixels(const spaces::RowStores& how, const T* p, F16& c0, F16& c1, F16& c2) {
  if constexpr (Stride == 3 && std::is_same_v<T, float>) {
    if (how.kind == spaces::RowStores::Part) {
      const int n = 3 * how.keep;
      deinterleaveFloat3(_mm512_maskz_loadu_ps(firstSampleBits(n, 0), p),
                         _mm512_maskz_loadu_ps(firstSampleBits(n, 1), p + 16),
                         _mm512_maskz_loadu_ps(firstSampleBits(n, 2), p + 32), c0, c1, c2);
      return;
    }
  }
  loadPixels<Stride, Bias16>(p, c0, c1, c2);
}

ZEL_TIER512_END

}  // namespace zel::lanes
