// The 512-bit blocks of the integer colour twist: sixteen pixels a block,
// held as three channel vectors with one float lane per pixel, so that nine
// products and nine sums give all 48 outputs. One byte (or word) permute
// takes a channel out of the interleaved pixels, widened to 32 bits; the
// results are narrowed by the saturating packs and one more permute puts
// them back in pixel order. Every lane runs the per-sample formula of its
// type exactly, in the same order as the narrower blocks.
#include <type_traits>

#include "frame/simd.h"
#include "pixel_ops/twist.h"

ZEL_TIER512_BEGIN

namespace zel::twist {

namespace {

// Index tables of a block of sixteen pixels of K samples (three planes for
// Planar) of `Bytes` bytes each.
//   split[ch]: sample ch of pixel k into 32-bit lane k, at the bottom of the
//     lane for unsigned samples and at its top for signed ones (a shift then
//     extends the sign); a lane mask zeroes the rest of the lane.
//   merge: the narrowed outputs back to their places. The packs leave
//     output ch of pixel k = 4q + j at byte 16q + 4ch + j of one register
//     for bytes; for words at word 8q + 4ch + j of the first register
//     (ch 0, 1) or 8q + j of the second (ch 2, index 32 on). The place of
//     an output is sample K * k + ch of the block, or k of plane ch.
template <int K, int Bytes, bool Sign>
struct Permutes512 {
  using Unit = std::conditional_t<Bytes == 1, uint8_t, uint16_t>;
  static constexpr int kUnits = 64 / Bytes;
  alignas(64) Unit split[3][kUnits];
  alignas(64) Unit merge[2][kUnits];
  constexpr Permutes512() : split{}, merge{} {
    constexpr int perLane = 4 / Bytes;
    for (int ch = 0; ch < 3; ++ch)
      for (int k = 0; k < 16; ++k) {
        split[ch][perLane * k + (Sign ? perLane - 1 : 0)] = Unit(K * k + ch);
        const int q = k / 4, j = k % 4;
        const int from = Bytes == 1 ? 16 * q + 4 * ch + j : (ch == 2 ? 32 + 8 * q + j : 8 * q + 4 * ch + j);
        const int to = K == Planar ? 16 * ch + k : K * k + ch;
        merge[to / kUnits][to % kUnits] = Unit(from);
      }
  }
};

template <typename T, int K>
constexpr Permutes512<K, int(sizeof(T)), std::is_signed_v<T>> kPermutes512{};

template <typename T>
constexpr bool isByte = sizeof(T) == 1;

ZEL_AVX512_VBMI ZEL_INLINE __m512i table(const void* p) { return _mm512_load_si512(p); }

// Lanes of a 32-bit lane that the split keeps: its bottom or top byte/word.
template <typename T>
constexpr uint64_t kLaneKeep = isByte<T> ? (std::is_signed_v<T> ? 0x8888888888888888ull : 0x1111111111111111ull)
                                         : (std::is_signed_v<T> ? 0xAAAAAAAAull : 0x55555555ull);
// The first three samples of each of sixteen four-sample pixels.
constexpr uint64_t kColourBytes = 0x7777777777777777ull;
constexpr uint32_t kColourWords = 0x77777777u;
constexpr uint64_t kBytes48 = 0xFFFFFFFFFFFFull;

// Channel ch of sixteen pixels as 32-bit integers, from the bytes of the
// block in `lo` (and its bytes 64..127 in `hi` for words).
template <typename T, int K>
ZEL_AVX512_VBMI ZEL_INLINE __m512i split16(__m512i lo, __m512i hi, int ch) {
  const auto& p = kPermutes512<T, K>;
  __m512i v;
  if constexpr (isByte<T>) {
    v = _mm512_maskz_permutexvar_epi8(kLaneKeep<T>, table(p.split[ch]), lo);
  } else {
    v = _mm512_maskz_permutex2var_epi16(__mmask32(kLaneKeep<T>), lo, table(p.split[ch]), hi);
  }
  if constexpr (std::is_signed_v<T>) v = _mm512_srai_epi32(v, 32 - 8 * int(sizeof(T)));
  return v;
}

// Sixteen samples of one plane as 32-bit integers.
template <typename T>
ZEL_AVX512_VBMI ZEL_INLINE __m512i widen16(const T* p) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm512_cvtepu8_epi32(load128(p));
  else if constexpr (std::is_same_v<T, int8_t>) return _mm512_cvtepi8_epi32(load128(p));
  else if constexpr (std::is_same_v<T, uint16_t>) return _mm512_cvtepu16_epi32(load256(p));
  else return _mm512_cvtepi16_epi32(load256(p));
}

// The type's saturating packs, lane by lane as the narrower blocks do.
template <typename T>
ZEL_AVX512_VBMI ZEL_INLINE __m512i narrow16(__m512i x, __m512i y) {
  if constexpr (std::is_same_v<T, uint16_t>) return _mm512_packus_epi32(x, y);
  else return _mm512_packs_epi32(x, y);
}
template <typename T>
ZEL_AVX512_VBMI ZEL_INLINE __m512i narrow8(__m512i x, __m512i y) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm512_packus_epi16(x, y);
  else return _mm512_packs_epi16(x, y);
}

// Output i of sixteen pixels, rounded. The minimum alone clamps: a value
// below the lower limit (an infinity too) rounds to an integer that the
// saturating packs take to that limit, as the maximum would have; NaN has
// become the upper limit. Without `Clamp` (the caller having checked that
// the matrix keeps every output finite and far inside the 32-bit range,
// see narrowingClamps) the packs alone clamp: an integer past a limit saturates
// to it, as the clamped float would have rounded. 8s has only the upper
// limit and adds its terms left to right.
template <typename T, bool Clamp>
ZEL_AVX512_VBMI ZEL_INLINE __m512i output16(const __m512 (&t)[4], __m512 a, __m512 b, __m512 c) {
  __m512 o;
  if constexpr (std::is_same_v<T, int8_t>) {
    o = _mm512_add_ps(_mm512_add_ps(_mm512_add_ps(_mm512_mul_ps(a, t[0]), _mm512_mul_ps(b, t[1])),
                                    _mm512_mul_ps(c, t[2])),
                      t[3]);
  } else {
    o = _mm512_add_ps(_mm512_add_ps(t[3], _mm512_mul_ps(a, t[0])),
                      _mm512_add_ps(_mm512_mul_ps(c, t[2]), _mm512_mul_ps(b, t[1])));
  }
  if constexpr (Clamp) o = _mm512_min_ps(o, _mm512_set1_ps(Sample<T>::hi));
  return _mm512_cvtps_epi32(o);
}

// One block of sixteen pixels at x. `Spare`: the row holds 16 more bytes
// past a block of 8-bit three-sample pixels, which a whole 64-byte load may
// then read (never past the row; a masked load does the last blocks).
template <typename T, int K, bool Clamp, bool Spare = false>
ZEL_AVX512_VBMI ZEL_INLINE void block16(const T* const (&src)[3], T* const (&dst)[3], int x, const __m512 (&t)[3][4]) {
  const auto& p = kPermutes512<T, K>;
  __m512i v[3];
  if constexpr (K == Planar) {
    for (int k = 0; k < 3; ++k) v[k] = widen16(src[k] + x);
  } else {
    // The whole block is read before any of it is written (in place too).
    const T* s = src[0] + x * K;
    __m512i lo, hi = _mm512_setzero_si512();
    if constexpr (isByte<T>) {
      lo = K == C3 && !Spare ? _mm512_maskz_loadu_epi8(kBytes48, s) : _mm512_loadu_si512(s);
    } else {
      lo = _mm512_loadu_si512(s);
      hi = K == C3 ? _mm512_zextsi256_si512(load256(s + 32)) : _mm512_loadu_si512(s + 32);
    }
    for (int ch = 0; ch < 3; ++ch) v[ch] = split16<T, K>(lo, hi, ch);
  }
  const __m512 a = _mm512_cvtepi32_ps(v[0]), b = _mm512_cvtepi32_ps(v[1]), c = _mm512_cvtepi32_ps(v[2]);
  const __m512i r0 = output16<T, Clamp>(t[0], a, b, c), r1 = output16<T, Clamp>(t[1], a, b, c),
                r2 = output16<T, Clamp>(t[2], a, b, c);
  if constexpr (isByte<T>) {
    const __m512i n = narrow8<T>(narrow16<T>(r0, r1), narrow16<T>(r2, r2));
    const __m512i out = _mm512_permutexvar_epi8(table(p.merge[0]), n);
    if constexpr (K == Planar) {
      store128(dst[0] + x, _mm512_castsi512_si128(out));
      store128(dst[1] + x, _mm512_extracti32x4_epi32(out, 1));
      store128(dst[2] + x, _mm512_extracti32x4_epi32(out, 2));
    } else if constexpr (K == C3) {
      store256(dst[0] + x * 3, _mm512_castsi512_si256(out));
      store128(dst[0] + x * 3 + 32, _mm512_extracti32x4_epi32(out, 2));
    } else {
      _mm512_mask_storeu_epi8(dst[0] + x * 4, kColourBytes, out);
    }
  } else {
    const __m512i n01 = narrow16<T>(r0, r1), n22 = narrow16<T>(r2, r2);
    const __m512i out0 = _mm512_permutex2var_epi16(n01, table(p.merge[0]), n22);
    const __m512i out1 = _mm512_permutex2var_epi16(n01, table(p.merge[1]), n22);
    if constexpr (K == Planar) {
      store256(dst[0] + x, _mm512_castsi512_si256(out0));
      store256(dst[1] + x, _mm512_extracti64x4_epi64(out0, 1));
      store256(dst[2] + x, _mm512_castsi512_si256(out1));
    } else if constexpr (K == C3) {
      _mm512_storeu_si512(dst[0] + x * 3, out0);
      store256(dst[0] + x * 3 + 32, _mm512_castsi512_si256(out1));
    } else {
      _mm512_mask_storeu_epi16(dst[0] + x * 4, kColourWords, out0);
      _mm512_mask_storeu_epi16(dst[0] + x * 4 + 32, kColourWords, out1);
    }
  }
}

template <typename T, int K, bool Clamp>
ZEL_AVX512_VBMI ZEL_INLINE int blocks(const T* const (&s)[3], T* const (&d)[3], int width, const __m512 (&t)[3][4]) {
  // A whole 64-byte load at pixel x reads into pixel x + 21: a pair of
  // blocks at x takes it while 38 pixels are left.
  constexpr int spare = isByte<T> && K == C3 ? 6 : 0;
  int x = 0;
  for (; x + 32 + spare <= width; x += 32) {
    block16<T, K, Clamp, true>(s, d, x, t);
    block16<T, K, Clamp, true>(s, d, x + 16, t);
  }
  for (; x + 16 <= width; x += 16) block16<T, K, Clamp>(s, d, x, t);
  return x;
}

// Three-channel floats are computed where they lie, sixteen pixels (48
// samples, three registers) a block. Output sample L of register j belongs
// to pixel (16j + L) / 3 and channel (16j + L) % 3; a two-register permute
// brings that pixel's first, second and third sample to lane L, and a
// permute of the whole matrix brings the weights of that channel there.
// Every lane then runs the three-channel float formula as it is written.
struct FloatC3Tables {
  // pick[j][k]: sample k of each lane's pixel, counted from register
  // first[j][k] of the block (the permute reads it and the next one).
  alignas(64) int32_t pick[3][3][16];
  int first[3][3];
  // weight[j][col]: where column col of each lane's matrix row sits in the
  // 4 by 4 matrix read as sixteen floats.
  alignas(64) int32_t weight[3][4][16];
  constexpr FloatC3Tables() : pick{}, first{}, weight{} {
    for (int j = 0; j < 3; ++j) {
      for (int k = 0; k < 3; ++k) {
        const int lowest = 3 * ((16 * j) / 3) + k;
        first[j][k] = lowest / 16 < 1 ? lowest / 16 : 1;
        for (int l = 0; l < 16; ++l) pick[j][k][l] = 3 * ((16 * j + l) / 3) + k - 16 * first[j][k];
      }
      for (int col = 0; col < 4; ++col)
        for (int l = 0; l < 16; ++l) weight[j][col][l] = 4 * ((16 * j + l) % 3) + col;
    }
  }
};
constexpr FloatC3Tables kFloatC3{};

}  // namespace

template <bool Stream>
ZEL_AVX512 int64_t blocks32fC3(const float* src, float* dst, int64_t x, int64_t pixels, const Matrix& m) {
  const __m512 all = _mm512_loadu_ps(&m.t[0][0]);
  __m512 w[3][4];
  __m512i pick[3][3];
  for (int j = 0; j < 3; ++j) {
    for (int col = 0; col < 4; ++col) w[j][col] = _mm512_permutexvar_ps(_mm512_load_si512(kFloatC3.weight[j][col]), all);
    for (int k = 0; k < 3; ++k) pick[j][k] = _mm512_load_si512(kFloatC3.pick[j][k]);
  }
  for (; x + 16 <= pixels; x += 16) {
    const float* s = src + x * 3;
    // The whole block is read before any of it is written (in place too).
    const __m512 in[3] = {_mm512_loadu_ps(s), _mm512_loadu_ps(s + 16), _mm512_loadu_ps(s + 32)};
    float* d = dst + x * 3;
    for (int j = 0; j < 3; ++j) {
      __m512 v[3];
      for (int k = 0; k < 3; ++k) {
        const int f = kFloatC3.first[j][k];
        v[k] = _mm512_permutex2var_ps(in[f], pick[j][k], in[f + 1]);
      }
      const __m512 o = _mm512_add_ps(_mm512_add_ps(w[j][3], _mm512_mul_ps(v[0], w[j][0])),
                                     _mm512_add_ps(_mm512_mul_ps(v[2], w[j][2]), _mm512_mul_ps(v[1], w[j][1])));
      if constexpr (Stream) _mm512_stream_ps(d + 16 * j, o);
      else _mm512_storeu_ps(d + 16 * j, o);
    }
  }
  return x;
}
template int64_t blocks32fC3<true>(const float*, float*, int64_t, int64_t, const Matrix&);
template int64_t blocks32fC3<false>(const float*, float*, int64_t, int64_t, const Matrix&);

template <typename T, int K>
ZEL_AVX512_VBMI int blocks512(const T* const src[3], T* const dst[3], int width, const Matrix& m) {
  __m512 t[3][4];
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 4; ++j) t[i][j] = _mm512_set1_ps(m.t[i][j]);
  const T* const s[3] = {src[0], src[1], src[2]};
  T* const d[3] = {dst[0], dst[1], dst[2]};
  return narrowingClamps<T>(m) ? blocks<T, K, false>(s, d, width, t) : blocks<T, K, true>(s, d, width, t);
}

#define ZEL_TWIST_BLOCKS512(T)                                                        \
  template int blocks512<T, Planar>(const T* const[3], T* const[3], int, const Matrix&); \
  template int blocks512<T, C3>(const T* const[3], T* const[3], int, const Matrix&);     \
  template int blocks512<T, AC4>(const T* const[3], T* const[3], int, const Matrix&);
ZEL_TWIST_BLOCKS512(uint8_t)
ZEL_TWIST_BLOCKS512(int8_t)
ZEL_TWIST_BLOCKS512(uint16_t)
ZEL_TWIST_BLOCKS512(int16_t)
#undef ZEL_TWIST_BLOCKS512

}  // namespace zel::twist

ZEL_TIER512_END
