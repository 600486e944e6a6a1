#include "demosaic/ahd_kernels.h"

#include <initializer_list>

#include "demosaic/rgb_store.h"
#include "frame/simd.h"

namespace zel {

VectorLevel bestVectorLevel() { return hasAvx2() ? VectorLevel::Avx2 : VectorLevel::Sse41; }

namespace {

// Two 16-bit weights side by side in a 32-bit lane, for multiply-adds.
constexpr int32_t wordWeights(int first, int second) {
  return int32_t(uint32_t(uint16_t(first)) | (uint32_t(uint16_t(second)) << 16));
}

}  // namespace

// ---- SSE4.1: 4 lanes ----
namespace sse {

using Vec = __m128i;
constexpr int kLanes = 4;

inline Vec loadLanes(const uint8_t* p) { return _mm_cvtepu8_epi32(load32(p)); }
inline Vec loadLanes(const uint16_t* p) { return _mm_cvtepu16_epi32(load64(p)); }
inline Vec loadLanes(const int32_t* p) { return load128(p); }
// Samples keep the low bits of each lane, as a cast to the sample type.
inline void storeLanes(uint8_t* p, Vec v) {
  const int32_t w = _mm_cvtsi128_si32(
      _mm_shuffle_epi8(v, _mm_setr_epi8(0, 4, 8, 12, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1)));
  __builtin_memcpy(p, &w, 4);
}
inline void storeLanes(uint16_t* p, Vec v) {
  store64(p, _mm_shuffle_epi8(v, _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1)));
}
inline void storeLanes(int32_t* p, Vec v) { store128(p, v); }

inline Vec broadcast(int32_t v) { return _mm_set1_epi32(v); }
inline Vec add(Vec a, Vec b) { return _mm_add_epi32(a, b); }
inline Vec sub(Vec a, Vec b) { return _mm_sub_epi32(a, b); }
template <int N>
inline Vec shiftRight(Vec a) {
  return _mm_srai_epi32(a, N);
}
inline Vec smaller(Vec a, Vec b) { return _mm_min_epi32(a, b); }
inline Vec larger(Vec a, Vec b) { return _mm_max_epi32(a, b); }
inline Vec magnitude(Vec a) { return _mm_abs_epi32(a); }
inline Vec multiplyLow(Vec a, Vec b) { return _mm_mullo_epi32(a, b); }
inline Vec multiplyAdd(Vec a, Vec b) { return _mm_madd_epi16(a, b); }
inline Vec greater(Vec a, Vec b) { return _mm_cmpgt_epi32(a, b); }
inline Vec either(Vec a, Vec b) { return _mm_or_si128(a, b); }
inline Vec select(Vec mask, Vec a, Vec b) { return _mm_blendv_epi8(b, a, mask); }
// The low word of `low` and the low word of `high` side by side in a lane.
inline Vec wordPairs(Vec low, Vec high) { return _mm_blend_epi16(low, _mm_slli_epi32(high, 16), 0xAA); }
inline Vec greenLanes(bool firstGreen) {
  return firstGreen ? _mm_setr_epi32(-1, 0, -1, 0) : _mm_setr_epi32(0, -1, 0, -1);
}

#define ZEL_LANES
#include "demosaic/ahd_lanes.inc"
#undef ZEL_LANES

// 8-bit samples: 8 pixels in 16-bit lanes.
namespace words {

using Vec = __m128i;
constexpr int kLanes = 8;

inline Vec loadBytes(const uint8_t* p) { return _mm_cvtepu8_epi16(load64(p)); }
inline Vec loadWords(const int16_t* p) { return load128(p); }
inline void storeBytes(uint8_t* p, Vec v) { store64(p, _mm_packus_epi16(v, v)); }
inline void storeSignedBytes(uint8_t* p, Vec v) { store64(p, _mm_packs_epi16(v, v)); }
inline void storeWords(int16_t* p, Vec v) { store128(p, v); }

inline Vec broadcast(int16_t v) { return _mm_set1_epi16(v); }
inline Vec add(Vec a, Vec b) { return _mm_add_epi16(a, b); }
inline Vec sub(Vec a, Vec b) { return _mm_sub_epi16(a, b); }
template <int N>
inline Vec shiftRight(Vec a) {
  return _mm_srai_epi16(a, N);
}
template <int N>
inline Vec shiftRightLogical(Vec a) {
  return _mm_srli_epi16(a, N);
}
inline Vec smaller(Vec a, Vec b) { return _mm_min_epi16(a, b); }
inline Vec larger(Vec a, Vec b) { return _mm_max_epi16(a, b); }
inline Vec magnitude(Vec a) { return _mm_abs_epi16(a); }
inline Vec multiplyLow(Vec a, Vec b) { return _mm_mullo_epi16(a, b); }
// Unsigned bytes of `a` by the signed bytes of `b`, pairs summed to words.
inline Vec multiplyAddBytes(Vec a, Vec b) { return _mm_maddubs_epi16(a, b); }
// 2 * kLanes bytes, laid out so that pairLow and pairHigh interleave the
// bytes of two such vectors for the first and the second kLanes pixels.
inline Vec loadPairable(const uint8_t* p) { return load128(p); }
inline Vec pairLow(Vec a, Vec b) { return _mm_unpacklo_epi8(a, b); }
inline Vec pairHigh(Vec a, Vec b) { return _mm_unpackhi_epi8(a, b); }
inline Vec either(Vec a, Vec b) { return _mm_or_si128(a, b); }
inline Vec select(Vec mask, Vec a, Vec b) { return _mm_blendv_epi8(b, a, mask); }
inline Vec greenLanes(bool firstGreen) {
  return firstGreen ? _mm_setr_epi16(-1, 0, -1, 0, -1, 0, -1, 0) : _mm_setr_epi16(0, -1, 0, -1, 0, -1, 0, -1);
}
inline Vec smallerUnsigned(Vec a, Vec b) { return _mm_min_epu16(a, b); }
inline Vec largerUnsigned(Vec a, Vec b) { return _mm_max_epu16(a, b); }
// a - b where a is above b, else 0, unsigned.
inline Vec excess(Vec a, Vec b) { return _mm_subs_epu16(a, b); }
inline Vec equal(Vec a, Vec b) { return _mm_cmpeq_epi16(a, b); }

#define ZEL_LANES
#include "demosaic/ahd_words.inc"
#undef ZEL_LANES

}  // namespace words
using words::colourBlocks;
using words::greenBlocks;
using words::homogeneityBlocks;
using words::lumaChromaBlocks;

}  // namespace sse

// ---- AVX2: 8 lanes, the same bits ----
namespace avx2 {

using Vec = __m256i;
constexpr int kLanes = 8;

ZEL_AVX2 inline Vec loadLanes(const uint8_t* p) { return _mm256_cvtepu8_epi32(load64(p)); }
ZEL_AVX2 inline Vec loadLanes(const uint16_t* p) { return _mm256_cvtepu16_epi32(load128(p)); }
ZEL_AVX2 inline Vec loadLanes(const int32_t* p) { return load256(p); }
ZEL_AVX2 inline void storeLanes(uint8_t* p, Vec v) {
  const __m256i bytes =
      _mm256_shuffle_epi8(v, _mm256_setr_epi8(0, 4, 8, 12, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, 0, 4, 8, 12,
                                              -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1));
  store64(p, _mm_unpacklo_epi32(_mm256_castsi256_si128(bytes), _mm256_extracti128_si256(bytes, 1)));
}
ZEL_AVX2 inline void storeLanes(uint16_t* p, Vec v) {
  const __m256i words =
      _mm256_shuffle_epi8(v, _mm256_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1, 0, 1, 4, 5, 8,
                                              9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1));
  store128(p, _mm256_castsi256_si128(_mm256_permute4x64_epi64(words, 0x08)));
}
ZEL_AVX2 inline void storeLanes(int32_t* p, Vec v) { store256(p, v); }

ZEL_AVX2 inline Vec broadcast(int32_t v) { return _mm256_set1_epi32(v); }
ZEL_AVX2 inline Vec add(Vec a, Vec b) { return _mm256_add_epi32(a, b); }
ZEL_AVX2 inline Vec sub(Vec a, Vec b) { return _mm256_sub_epi32(a, b); }
template <int N>
ZEL_AVX2 inline Vec shiftRight(Vec a) {
  return _mm256_srai_epi32(a, N);
}
ZEL_AVX2 inline Vec smaller(Vec a, Vec b) { return _mm256_min_epi32(a, b); }
ZEL_AVX2 inline Vec larger(Vec a, Vec b) { return _mm256_max_epi32(a, b); }
ZEL_AVX2 inline Vec magnitude(Vec a) { return _mm256_abs_epi32(a); }
ZEL_AVX2 inline Vec multiplyLow(Vec a, Vec b) { return _mm256_mullo_epi32(a, b); }
ZEL_AVX2 inline Vec multiplyAdd(Vec a, Vec b) { return _mm256_madd_epi16(a, b); }
ZEL_AVX2 inline Vec greater(Vec a, Vec b) { return _mm256_cmpgt_epi32(a, b); }
ZEL_AVX2 inline Vec either(Vec a, Vec b) { return _mm256_or_si256(a, b); }
ZEL_AVX2 inline Vec select(Vec mask, Vec a, Vec b) { return _mm256_blendv_epi8(b, a, mask); }
ZEL_AVX2 inline Vec wordPairs(Vec low, Vec high) { return _mm256_blend_epi16(low, _mm256_slli_epi32(high, 16), 0xAA); }
ZEL_AVX2 inline Vec greenLanes(bool firstGreen) {
  return firstGreen ? _mm256_setr_epi32(-1, 0, -1, 0, -1, 0, -1, 0) : _mm256_setr_epi32(0, -1, 0, -1, 0, -1, 0, -1);
}

#define ZEL_LANES ZEL_AVX2
#include "demosaic/ahd_lanes.inc"
#undef ZEL_LANES

// 8-bit samples: 16 pixels in 16-bit lanes.
namespace words {

using Vec = __m256i;
constexpr int kLanes = 16;

ZEL_AVX2 inline Vec loadBytes(const uint8_t* p) { return _mm256_cvtepu8_epi16(load128(p)); }
ZEL_AVX2 inline Vec loadWords(const int16_t* p) { return load256(p); }
ZEL_AVX2 inline void storeBytes(uint8_t* p, Vec v) {
  store128(p, _mm_packus_epi16(_mm256_castsi256_si128(v), _mm256_extracti128_si256(v, 1)));
}
ZEL_AVX2 inline void storeSignedBytes(uint8_t* p, Vec v) {
  store128(p, _mm_packs_epi16(_mm256_castsi256_si128(v), _mm256_extracti128_si256(v, 1)));
}
ZEL_AVX2 inline void storeWords(int16_t* p, Vec v) { store256(p, v); }

ZEL_AVX2 inline Vec broadcast(int16_t v) { return _mm256_set1_epi16(v); }
ZEL_AVX2 inline Vec add(Vec a, Vec b) { return _mm256_add_epi16(a, b); }
ZEL_AVX2 inline Vec sub(Vec a, Vec b) { return _mm256_sub_epi16(a, b); }
template <int N>
ZEL_AVX2 inline Vec shiftRight(Vec a) {
  return _mm256_srai_epi16(a, N);
}
template <int N>
ZEL_AVX2 inline Vec shiftRightLogical(Vec a) {
  return _mm256_srli_epi16(a, N);
}
ZEL_AVX2 inline Vec smaller(Vec a, Vec b) { return _mm256_min_epi16(a, b); }
ZEL_AVX2 inline Vec larger(Vec a, Vec b) { return _mm256_max_epi16(a, b); }
ZEL_AVX2 inline Vec magnitude(Vec a) { return _mm256_abs_epi16(a); }
ZEL_AVX2 inline Vec multiplyLow(Vec a, Vec b) { return _mm256_mullo_epi16(a, b); }
ZEL_AVX2 inline Vec multiplyAddBytes(Vec a, Vec b) { return _mm256_maddubs_epi16(a, b); }
// Quarters 0 2 1 3: the in-half interleaves then give pixels 0..15 and
// 16..31 in order.
ZEL_AVX2 inline Vec loadPairable(const uint8_t* p) { return _mm256_permute4x64_epi64(load256(p), 0xD8); }
ZEL_AVX2 inline Vec pairLow(Vec a, Vec b) { return _mm256_unpacklo_epi8(a, b); }
ZEL_AVX2 inline Vec pairHigh(Vec a, Vec b) { return _mm256_unpackhi_epi8(a, b); }
ZEL_AVX2 inline Vec either(Vec a, Vec b) { return _mm256_or_si256(a, b); }
ZEL_AVX2 inline Vec select(Vec mask, Vec a, Vec b) { return _mm256_blendv_epi8(b, a, mask); }
ZEL_AVX2 inline Vec greenLanes(bool firstGreen) {
  return firstGreen ? _mm256_set1_epi32(0x0000FFFF) : _mm256_set1_epi32(int32_t(0xFFFF0000u));
}
ZEL_AVX2 inline Vec smallerUnsigned(Vec a, Vec b) { return _mm256_min_epu16(a, b); }
ZEL_AVX2 inline Vec largerUnsigned(Vec a, Vec b) { return _mm256_max_epu16(a, b); }
ZEL_AVX2 inline Vec excess(Vec a, Vec b) { return _mm256_subs_epu16(a, b); }
ZEL_AVX2 inline Vec equal(Vec a, Vec b) { return _mm256_cmpeq_epi16(a, b); }

#define ZEL_LANES ZEL_AVX2
#include "demosaic/ahd_words.inc"
#undef ZEL_LANES

}  // namespace words
using words::colourBlocks;
using words::greenBlocks;
using words::homogeneityBlocks;
using words::lumaChromaBlocks;

}  // namespace avx2

namespace {

// Pointers moved on by `i` pixels.
template <typename T>
GreenTaps<T> advanced(const GreenTaps<T>& t, int i) {
  return GreenTaps<T>{t.c + i, t.a + i, t.b + i, t.l + i, t.r + i};
}
template <typename T>
ColourTaps<T> advanced(const ColourTaps<T>& t, int i) {
  return ColourTaps<T>{t.gUp + i, t.g + i, t.gDown + i, t.sUp + i, t.s + i, t.sDown + i};
}
template <typename T>
LumaChromaRow<T> advanced(const LumaChromaRow<T>& r, int i) {
  return LumaChromaRow<T>{r.y + i, r.cb + i, r.cr + i};
}
template <typename T>
LumaChromaView<T> advanced(const LumaChromaView<T>& r, int i) {
  return LumaChromaView<T>{r.y + i, r.cb + i, r.cr + i};
}

// Runs the blocks of the widest level on the row; the last pixels take one
// more block that ends at the row's end and overlaps pixels already made.
// Every kernel makes each pixel from its taps alone and never writes what
// it reads, so a pixel made twice comes out the same. A row narrower than
// a block goes to the next level down, and one narrower than every block is
// left to the scalar form: returns the pixels done. `wide` and `narrow` are
// the blocks of the two levels. A block at an odd pixel starts in the other
// site phase, so kernels are handed the phase of their first pixel.
template <typename Avx, typename Sse>
int vectorBlocks(VectorLevel level, int count, int wide, Avx avx, Sse sse) {
  auto whole = [count](int block, auto blocks) {
    if (blocks(0, count) < count) blocks(count - block, block);
    return count;
  };
  if (level == VectorLevel::Avx2 && count >= wide) return whole(wide, avx);
  if (level != VectorLevel::Scalar && count >= wide / 2) return whole(wide / 2, sse);
  return 0;
}

// Pixels per AVX2 block: 8-bit samples go in 16-bit lanes, 16-bit ones in
// 32-bit lanes; an SSE4.1 block is half as wide.
template <typename T>
constexpr int kWideBlock = sizeof(T) == 1 ? 16 : 8;

}  // namespace

template <typename T>
void greenRow(const GreenTaps<T>& t, int count, bool firstGreen, T* out, VectorLevel level) {
  const int done = vectorBlocks(
      level, count, kWideBlock<T>,
      [&](int i, int n) { return avx2::greenBlocks(advanced(t, i), n, isGreenLane(firstGreen, i), out + i); },
      [&](int i, int n) { return sse::greenBlocks(advanced(t, i), n, isGreenLane(firstGreen, i), out + i); });
  greenRowScalar(advanced(t, done), count - done, isGreenLane(firstGreen, done), out + done);
}

template <typename T>
void colourRow(const ColourTaps<T>& t, int count, bool firstGreen, bool redRow, T* outR, T* outB, VectorLevel level) {
  const int done = vectorBlocks(
      level, count, kWideBlock<T>,
      [&](int i, int n) {
        return avx2::colourBlocks(advanced(t, i), n, isGreenLane(firstGreen, i), redRow, outR + i, outB + i);
      },
      [&](int i, int n) {
        return sse::colourBlocks(advanced(t, i), n, isGreenLane(firstGreen, i), redRow, outR + i, outB + i);
      });
  colourRowScalar(advanced(t, done), count - done, isGreenLane(firstGreen, done), redRow, outR + done, outB + done);
}

template <typename T>
void lumaChromaRow(const T* r, const T* g, const T* b, int count, const LumaChromaRow<T>& out, VectorLevel level) {
  // 8-bit samples go through byte pairs, two blocks of words at a time.
  const int done = vectorBlocks(
      level, count, sizeof(T) == 1 ? 2 * kWideBlock<T> : kWideBlock<T>,
      [&](int i, int n) { return avx2::lumaChromaBlocks(r + i, g + i, b + i, n, advanced(out, i)); },
      [&](int i, int n) { return sse::lumaChromaBlocks(r + i, g + i, b + i, n, advanced(out, i)); });
  lumaChromaRowScalar(r + done, g + done, b + done, count - done, advanced(out, done));
}

template <typename T>
void homogeneityRow(const LumaChromaView<T> h[3], const LumaChromaView<T> v[3], int count, T* out, VectorLevel level) {
  auto shifted = [&](int i, LumaChromaView<T>(&hs)[3], LumaChromaView<T>(&vs)[3]) {
    for (int k = 0; k < 3; ++k) hs[k] = advanced(h[k], i), vs[k] = advanced(v[k], i);
  };
  const int done = vectorBlocks(
      level, count, kWideBlock<T>,
      [&](int i, int n) {
        LumaChromaView<T> hs[3], vs[3];
        shifted(i, hs, vs);
        return avx2::homogeneityBlocks(hs, vs, n, out + i);
      },
      [&](int i, int n) {
        LumaChromaView<T> hs[3], vs[3];
        shifted(i, hs, vs);
        return sse::homogeneityBlocks(hs, vs, n, out + i);
      });
  LumaChromaView<T> hs[3], vs[3];
  shifted(done, hs, vs);
  homogeneityRowScalar(hs, vs, count - done, out + done);
}

namespace {

// Column sums of three homogeneity rows from pixel i on, as 16 signed bytes
// (each at most 12 in magnitude).
inline __m128i columnSums(const uint8_t* const hom[3], int i) {
  return _mm_add_epi8(_mm_add_epi8(load128(hom[0] + i), load128(hom[1] + i)), load128(hom[2] + i));
}
inline __m128i columnSums(const uint16_t* const hom[3], int i) {
  auto rows = [&](int at) {
    return _mm_add_epi16(_mm_add_epi16(load128(hom[0] + at), load128(hom[1] + at)), load128(hom[2] + at));
  };
  return _mm_packs_epi16(rows(i), rows(i + 8));
}

// Bytes still 0 take the byte of `from`.
inline __m128i fillZeros(__m128i code, __m128i from) {
  return _mm_or_si128(code, _mm_and_si128(_mm_cmpeq_epi8(code, _mm_setzero_si128()), from));
}

// A code per pixel: 1 takes H, -1 takes V, 0 repeats the code to its left.
// The scan hands each code on to the zeros 1, 2, 4 and 8 lanes to its right
// within each 16 bytes.
inline __m128i codesOf(__m128i sums) {
  __m128i code = _mm_sign_epi8(_mm_set1_epi8(1), sums);
  code = fillZeros(code, _mm_slli_si128(code, 1));
  code = fillZeros(code, _mm_slli_si128(code, 2));
  code = fillZeros(code, _mm_slli_si128(code, 4));
  return fillZeros(code, _mm_slli_si128(code, 8));
}
inline __m128i lastCode(__m128i code) { return _mm_shuffle_epi8(code, _mm_set1_epi8(15)); }

// The choice masks of 16 pixels from i on; what is still 0 after the scan
// takes `carry`, the last code before them, which moves on to the last code
// of these.
template <typename T>
inline __m128i choiceMasks(const T* const hom[3], int i, __m128i& carry) {
  const __m128i sums =
      _mm_add_epi8(_mm_add_epi8(columnSums(hom, i - 1), columnSums(hom, i)), columnSums(hom, i + 1));
  const __m128i code = fillZeros(codesOf(sums), carry);
  carry = lastCode(code);
  return _mm_cmplt_epi8(code, _mm_setzero_si128());
}

// The pixels of 16 / sizeof(T) lanes from H or, where `mask` is set, V.
template <typename T>
inline void storeChosen(const T* const h[3], const T* const v[3], int i, __m128i mask, T* dst) {
  __m128i c[3];
  for (int k = 0; k < 3; ++k) c[k] = _mm_blendv_epi8(load128(h[k] + i), load128(v[k] + i), mask);
  storeRgb(dst + 3 * i, c[0], c[1], c[2]);
}

// SSE4.1 blocks of 16 pixels from pixel i on; returns where they end.
template <typename T>
int choiceBlocks(const T* const h[3], const T* const v[3], const T* const hom[3], int i, int count, __m128i& carry,
                 T* dst) {
  for (; i + 16 <= count; i += 16) {
    const __m128i takeV = choiceMasks(hom, i, carry);
    if constexpr (sizeof(T) == 1) {
      storeChosen(h, v, i, takeV, dst);
    } else {
      storeChosen(h, v, i, _mm_cvtepi8_epi16(takeV), dst);
      storeChosen(h, v, i + 8, _mm_cvtepi8_epi16(_mm_srli_si128(takeV, 8)), dst);
    }
  }
  return i;
}

// AVX2: the pixels of the two 128-bit halves of the channel vectors, each
// interleaved as by storeRgb, stored one after the other.
template <typename T>
ZEL_AVX2 ZEL_INLINE void storeRgbHalves(T* dst, __m256i r, __m256i g, __m256i b) {
  const RgbShuffles& s = sizeof(T) == 1 ? kRgbShuffles8 : kRgbShuffles16;
  __m256i o[3];
  for (int j = 0; j < 3; ++j)
    o[j] = _mm256_or_si256(_mm256_or_si256(_mm256_shuffle_epi8(r, broadcast128(s.m[j][0])),
                                           _mm256_shuffle_epi8(g, broadcast128(s.m[j][1]))),
                           _mm256_shuffle_epi8(b, broadcast128(s.m[j][2])));
  uint8_t* out = reinterpret_cast<uint8_t*>(dst);
  store256(out, _mm256_permute2x128_si256(o[0], o[1], 0x20));
  store256(out + 32, _mm256_permute2x128_si256(o[2], o[0], 0x30));
  store256(out + 64, _mm256_permute2x128_si256(o[1], o[2], 0x31));
}

template <typename T>
ZEL_AVX2 ZEL_INLINE void storeChosenAvx2(const T* const h[3], const T* const v[3], int i, __m256i mask, T* dst) {
  __m256i c[3];
  for (int k = 0; k < 3; ++k) c[k] = _mm256_blendv_epi8(load256(h[k] + i), load256(v[k] + i), mask);
  storeRgbHalves(dst + 3 * i, c[0], c[1], c[2]);
}

ZEL_AVX2 ZEL_INLINE __m256i columnSums256(const uint8_t* const hom[3], int i) {
  return _mm256_add_epi8(_mm256_add_epi8(load256(hom[0] + i), load256(hom[1] + i)), load256(hom[2] + i));
}
ZEL_AVX2 ZEL_INLINE __m256i fillZeros256(__m256i code, __m256i from) {
  return _mm256_or_si256(code, _mm256_and_si256(_mm256_cmpeq_epi8(code, _mm256_setzero_si256()), from));
}

// AVX2 blocks of 32 bytes of pixels (32 of 8 bits, 16 of 16 bits) from
// pixel 0 on; returns where they end. 8-bit codes are scanned in both
// halves at once, the upper half's zeros then taking the lower half's last
// code.
template <typename T>
ZEL_AVX2 int choiceBlocksAvx2(const T* const h[3], const T* const v[3], const T* const hom[3], int count,
                              __m128i& carry, T* dst) {
  constexpr int block = 32 / int(sizeof(T));
  int i = 0;
  for (; i + block <= count; i += block) {
    if constexpr (sizeof(T) == 1) {
      const __m256i sums = _mm256_add_epi8(_mm256_add_epi8(columnSums256(hom, i - 1), columnSums256(hom, i)),
                                           columnSums256(hom, i + 1));
      __m256i code = _mm256_sign_epi8(_mm256_set1_epi8(1), sums);
      code = fillZeros256(code, _mm256_slli_si256(code, 1));
      code = fillZeros256(code, _mm256_slli_si256(code, 2));
      code = fillZeros256(code, _mm256_slli_si256(code, 4));
      code = fillZeros256(code, _mm256_slli_si256(code, 8));
      const __m128i low = fillZeros(_mm256_castsi256_si128(code), carry);
      const __m128i high = fillZeros(_mm256_extracti128_si256(code, 1), lastCode(low));
      carry = lastCode(high);
      const __m256i all = _mm256_inserti128_si256(_mm256_castsi128_si256(low), high, 1);
      storeChosenAvx2(h, v, i, _mm256_cmpgt_epi8(_mm256_setzero_si256(), all), dst);
    } else {
      storeChosenAvx2(h, v, i, _mm256_cvtepi8_epi16(choiceMasks(hom, i, carry)), dst);
    }
  }
  return i;
}

}  // namespace

template <typename T>
void choiceRow(const T* const hRows[3], const T* const vRows[3], const T* const homRows[3], int count, T* dst,
               VectorLevel level) {
  // Local copies, out of reach of the stores.
  const T* const h[3] = {hRows[0], hRows[1], hRows[2]};
  const T* const v[3] = {vRows[0], vRows[1], vRows[2]};
  const T* const hom[3] = {homRows[0], homRows[1], homRows[2]};
  int i = 0;
  __m128i carry = _mm_set1_epi8(1);  // H at the row's start
  if (level == VectorLevel::Avx2) i = choiceBlocksAvx2(h, v, hom, count, carry, dst);
  if (level != VectorLevel::Scalar) i = choiceBlocks(h, v, hom, i, count, carry, dst);
  const bool takingV = int8_t(_mm_cvtsi128_si32(carry)) < 0;
  const T* hr[3] = {h[0] + i, h[1] + i, h[2] + i};
  const T* vr[3] = {v[0] + i, v[1] + i, v[2] + i};
  const T* homr[3] = {hom[0] + i, hom[1] + i, hom[2] + i};
  choiceRowScalar(hr, vr, homr, count - i, takingV, dst + 3 * i);
}

#define ZEL_AHD_KERNELS(T)                                                                                 \
  template void greenRow<T>(const GreenTaps<T>&, int, bool, T*, VectorLevel);                              \
  template void colourRow<T>(const ColourTaps<T>&, int, bool, bool, T*, T*, VectorLevel);                  \
  template void lumaChromaRow<T>(const T*, const T*, const T*, int, const LumaChromaRow<T>&, VectorLevel);    \
  template void homogeneityRow<T>(const LumaChromaView<T>[3], const LumaChromaView<T>[3], int, T*, VectorLevel); \
  template void choiceRow<T>(const T* const[3], const T* const[3], const T* const[3], int, T*, VectorLevel);
ZEL_AHD_KERNELS(uint8_t)
ZEL_AHD_KERNELS(uint16_t)
#undef ZEL_AHD_KERNELS

}  // namespace zel
