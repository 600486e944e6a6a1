#include "pixel_ops/to_gray.h"

#include <type_traits>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"

namespace zel::gray {

namespace {

// ---- byte shuffles that split pixels into channel lanes ----

// For 8u: channel `ch` of pixel k goes into the high byte of 16-bit lane k,
// the low byte is zero, so that an unsigned high multiply by the weight
// gives (sample * weight) >> 8. `lo` picks from the first register, `hi`
// from the second, whose first byte is byte `hiStart` of the pixels.
struct Spread8 {
  alignas(16) int8_t lo[3][16];
  alignas(16) int8_t hi[3][16];
  constexpr Spread8(int channels, int hiStart) : lo{}, hi{} {
    for (int ch = 0; ch < 3; ++ch)
      for (int k = 0; k < 8; ++k) {
        const int at = channels * k + ch;
        lo[ch][2 * k] = hi[ch][2 * k] = int8_t(0x80);
        lo[ch][2 * k + 1] = at < 16 ? int8_t(at) : int8_t(0x80);
        hi[ch][2 * k + 1] = at < 16 ? int8_t(0x80) : int8_t(at - hiStart);
      }
  }
};
// C3: the second register holds bytes 16..23 (SSE) or 8..23 (AVX2 lanes).
constexpr Spread8 kSpreadC3(3, 16);
constexpr Spread8 kSpreadC3Wide(3, 8);
constexpr Spread8 kSpreadAC4(4, 16);

// For 16-bit samples: channel `ch` of pixel k, zero-extended into 32-bit
// lane k; the first register holds samples 0..7, the second samples
// hiStart..hiStart + 7.
struct Spread16 {
  alignas(16) int8_t lo[3][16];
  alignas(16) int8_t hi[3][16];
  constexpr Spread16(int channels, int hiStart) : lo{}, hi{} {
    for (int ch = 0; ch < 3; ++ch)
      for (int k = 0; k < 4; ++k) {
        const int at = channels * k + ch;
        for (int b = 0; b < 4; ++b) {
          const bool data = b < 2;
          lo[ch][4 * k + b] = data && at < 8 ? int8_t(2 * at + b) : int8_t(0x80);
          hi[ch][4 * k + b] = data && at >= 8 ? int8_t(2 * (at - hiStart) + b) : int8_t(0x80);
        }
      }
  }
};
constexpr Spread16 kSpread16C3(3, 8);
constexpr Spread16 kSpread16AC4(4, 8);
// C3 in AVX2 lanes: the second register holds samples 4..11.
constexpr Spread16 kSpread16C3Wide(3, 4);

// Low 16 bits of four 32-bit lanes into the first 8 bytes.
alignas(16) constexpr int8_t kLowWords[16] = {0, 1, 4, 5, 8, 9, 12, 13, -128, -128, -128, -128, -128, -128, -128, -128};

inline __m128i mask(const int8_t* m) { return _mm_load_si128(reinterpret_cast<const __m128i*>(m)); }
inline __m128i pick(__m128i lo, __m128i hi, const int8_t* mlo, const int8_t* mhi) {
  return _mm_or_si128(_mm_shuffle_epi8(lo, mask(mlo)), _mm_shuffle_epi8(hi, mask(mhi)));
}

// ---- 8u ----

struct Lanes8 {
  __m128i c0, c1, c2;
  explicit Lanes8(Weights8 w)
      : c0(_mm_set1_epi16(int16_t(w.c0))), c1(_mm_set1_epi16(int16_t(w.c1))), c2(_mm_set1_epi16(int16_t(w.c2))) {}
};

// The block form on eight lanes of samples in the high bytes.
inline __m128i blockSum8(__m128i a, __m128i b, __m128i d, const Lanes8& c) {
  __m128i s = _mm_adds_epu16(_mm_mulhi_epu16(a, c.c0), _mm_mulhi_epu16(b, c.c1));
  s = _mm_adds_epu16(s, _mm_mulhi_epu16(d, c.c2));
  s = _mm_adds_epu16(s, _mm_set1_epi16(64));
  s = _mm_srai_epi16(s, 7);
  return _mm_packus_epi16(s, s);
}

template <int Channels>
inline __m128i block8Pixels(const uint8_t* s, const Lanes8& c) {
  const Spread8& m = Channels == 3 ? kSpreadC3 : kSpreadAC4;
  const __m128i lo = load128(s);
  const __m128i hi = Channels == 3 ? load64(s + 16) : load128(s + 16);
  return blockSum8(pick(lo, hi, m.lo[0], m.hi[0]), pick(lo, hi, m.lo[1], m.hi[1]), pick(lo, hi, m.lo[2], m.hi[2]), c);
}

// C3 only: four pixels, 12 bytes, all in one register.
inline __m128i block4PixelsC3(const uint8_t* s, const Lanes8& c) {
  int32_t last;
  __builtin_memcpy(&last, s + 8, 4);
  const __m128i v = _mm_insert_epi32(load64(s), last, 2);
  return blockSum8(_mm_shuffle_epi8(v, mask(kSpreadC3.lo[0])), _mm_shuffle_epi8(v, mask(kSpreadC3.lo[1])),
                   _mm_shuffle_epi8(v, mask(kSpreadC3.lo[2])), c);
}

ZEL_AVX2 inline __m256i mask256(const int8_t* m) { return _mm256_broadcastsi128_si256(mask(m)); }
ZEL_AVX2 inline __m256i pick256(__m256i lo, __m256i hi, const int8_t* mlo, const int8_t* mhi) {
  return _mm256_or_si256(_mm256_shuffle_epi8(lo, mask256(mlo)), _mm256_shuffle_epi8(hi, mask256(mhi)));
}

// Sixteen pixels: 128-bit lane 0 takes pixels 0..7, lane 1 pixels 8..15,
// each by the shuffles of the 8-pixel block.
template <int Channels>
ZEL_AVX2 int wide8u(const uint8_t* s, uint8_t* d, int end, Weights8 w) {
  const __m256i c0 = _mm256_set1_epi16(int16_t(w.c0)), c1 = _mm256_set1_epi16(int16_t(w.c1)),
                c2 = _mm256_set1_epi16(int16_t(w.c2)), round = _mm256_set1_epi16(64);
  const Spread8& m = Channels == 3 ? kSpreadC3Wide : kSpreadAC4;
  int x = 0;
  for (; x + 16 <= end; x += 16) {
    const uint8_t* p = s + x * Channels;
    __m256i lo, hi;
    if constexpr (Channels == 3) {
      lo = _mm256_set_m128i(load128(p + 24), load128(p));     // bytes 0..15 | 24..39
      hi = _mm256_set_m128i(load128(p + 32), load128(p + 8));  // bytes 8..23 | 32..47
    } else {
      lo = _mm256_set_m128i(load128(p + 32), load128(p));       // pixels 0..3 | 8..11
      hi = _mm256_set_m128i(load128(p + 48), load128(p + 16));  // pixels 4..7 | 12..15
    }
    const __m256i a = pick256(lo, hi, m.lo[0], m.hi[0]);
    const __m256i b = pick256(lo, hi, m.lo[1], m.hi[1]);
    const __m256i e = pick256(lo, hi, m.lo[2], m.hi[2]);
    __m256i sum = _mm256_adds_epu16(_mm256_mulhi_epu16(a, c0), _mm256_mulhi_epu16(b, c1));
    sum = _mm256_adds_epu16(sum, _mm256_mulhi_epu16(e, c2));
    sum = _mm256_srai_epi16(_mm256_adds_epu16(sum, round), 7);
    const __m256i packed = _mm256_permute4x64_epi64(_mm256_packus_epi16(sum, sum), 0x08);
    store128(d + x, _mm256_castsi256_si128(packed));
  }
  return x;
}

// ---- 16-bit and 32f: four pixels as three float vectors ----

struct Channels3f {
  __m128 a, b, d;
};

template <int Channels, bool Signed>
inline Channels3f load4x16(const void* s) {
  const Spread16& m = Channels == 3 ? kSpread16C3 : kSpread16AC4;
  const auto* p = static_cast<const uint8_t*>(s);
  const __m128i lo = load128(p);
  const __m128i hi = Channels == 3 ? load64(p + 16) : load128(p + 16);
  __m128i v[3];
  for (int ch = 0; ch < 3; ++ch) {
    v[ch] = pick(lo, hi, m.lo[ch], m.hi[ch]);
    if (Signed) v[ch] = _mm_xor_si128(v[ch], _mm_set1_epi32(0x8000));  // s + 32768
  }
  return {_mm_cvtepi32_ps(v[0]), _mm_cvtepi32_ps(v[1]), _mm_cvtepi32_ps(v[2])};
}

template <int Channels>
inline Channels3f load4x32f(const float* s) {
  if constexpr (Channels == 3) {
    const __m128 p0 = _mm_loadu_ps(s), p1 = _mm_loadu_ps(s + 4), p2 = _mm_loadu_ps(s + 8);
    const __m128 r = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x4), p2, 0x2);
    const __m128 g = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x9), p2, 0x4);
    const __m128 b = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x2), p2, 0x9);
    return {_mm_shuffle_ps(r, r, _MM_SHUFFLE(1, 2, 3, 0)), _mm_shuffle_ps(g, g, _MM_SHUFFLE(2, 3, 0, 1)),
            _mm_shuffle_ps(b, b, _MM_SHUFFLE(3, 0, 1, 2))};
  } else {
    __m128 p0 = _mm_loadu_ps(s), p1 = _mm_loadu_ps(s + 4), p2 = _mm_loadu_ps(s + 8), p3 = _mm_loadu_ps(s + 12);
    _MM_TRANSPOSE4_PS(p0, p1, p2, p3);
    return {p0, p1, p2};
  }
}

struct LanesF {
  __m128 w0, w1, w2;
  explicit LanesF(WeightsF w) : w0(_mm_set1_ps(w.w0)), w1(_mm_set1_ps(w.w1)), w2(_mm_set1_ps(w.w2)) {}
};

inline __m128 sum4(const Channels3f& c, const LanesF& w) {
  return _mm_add_ps(_mm_add_ps(_mm_mul_ps(c.a, w.w0), _mm_mul_ps(c.b, w.w1)), _mm_mul_ps(c.d, w.w2));
}

// ---- 16-bit and 32f, eight pixels a block ----

// Eight pixels of T, 128-bit lane 0 holding the channels of pixels 0..3
// and lane 1 those of pixels 4..7, except AC4: there lane 0 holds pixels
// 0, 1, 4, 5 for 16-bit samples and 0, 2, 4, 6 for floats (the loads stay
// whole), which kOrder puts right after the sums.
struct Lanes8f {
  __m256 a, b, d;
};

template <typename T, int Channels>
ZEL_AVX2 ZEL_INLINE Lanes8f load8(const T* p) {
  if constexpr (std::is_same_v<T, float>) {
    if constexpr (Channels == 3) {
      const __m256 m0 = _mm256_loadu2_m128(p + 12, p), m1 = _mm256_loadu2_m128(p + 16, p + 4),
                   m2 = _mm256_loadu2_m128(p + 20, p + 8);
      const __m256 r = _mm256_blend_ps(_mm256_blend_ps(m0, m1, 0x44), m2, 0x22);
      const __m256 g = _mm256_blend_ps(_mm256_blend_ps(m0, m1, 0x99), m2, 0x44);
      const __m256 b = _mm256_blend_ps(_mm256_blend_ps(m0, m1, 0x22), m2, 0x99);
      return {_mm256_permute_ps(r, _MM_SHUFFLE(1, 2, 3, 0)), _mm256_permute_ps(g, _MM_SHUFFLE(2, 3, 0, 1)),
              _mm256_permute_ps(b, _MM_SHUFFLE(3, 0, 1, 2))};
    } else {
      const __m256 p0 = _mm256_loadu_ps(p), p1 = _mm256_loadu_ps(p + 8), p2 = _mm256_loadu_ps(p + 16),
                   p3 = _mm256_loadu_ps(p + 24);
      const __m256 t0 = _mm256_unpacklo_ps(p0, p1), t1 = _mm256_unpackhi_ps(p0, p1), t2 = _mm256_unpacklo_ps(p2, p3),
                   t3 = _mm256_unpackhi_ps(p2, p3);
      return {_mm256_castpd_ps(_mm256_unpacklo_pd(_mm256_castps_pd(t0), _mm256_castps_pd(t2))),
              _mm256_castpd_ps(_mm256_unpackhi_pd(_mm256_castps_pd(t0), _mm256_castps_pd(t2))),
              _mm256_castpd_ps(_mm256_unpacklo_pd(_mm256_castps_pd(t1), _mm256_castps_pd(t3)))};
    }
  } else {
    const Spread16& m = Channels == 3 ? kSpread16C3Wide : kSpread16AC4;
    __m256i lo, hi;
    if constexpr (Channels == 3) {
      lo = _mm256_loadu2_m128i(reinterpret_cast<const __m128i*>(p + 12), reinterpret_cast<const __m128i*>(p));
      hi = _mm256_loadu2_m128i(reinterpret_cast<const __m128i*>(p + 16), reinterpret_cast<const __m128i*>(p + 4));
    } else {
      lo = load256(p);
      hi = load256(p + 16);
    }
    if constexpr (std::is_signed_v<T>) {  // s + 32768 in 16 bits
      lo = _mm256_xor_si256(lo, _mm256_set1_epi16(int16_t(0x8000)));
      hi = _mm256_xor_si256(hi, _mm256_set1_epi16(int16_t(0x8000)));
    }
    return {_mm256_cvtepi32_ps(pick256(lo, hi, m.lo[0], m.hi[0])), _mm256_cvtepi32_ps(pick256(lo, hi, m.lo[1], m.hi[1])),
            _mm256_cvtepi32_ps(pick256(lo, hi, m.lo[2], m.hi[2]))};
  }
}

// Where result k of the block sits: the 32-bit lanes of the sums for
// floats, the pairs of narrowed words for 16-bit samples.
template <typename T, int Channels>
constexpr int32_t kOrder[8] = {0, 1, 4, 5, 0, 0, 0, 0};
template <>
constexpr int32_t kOrder<uint16_t, 4>[8] = {0, 4, 1, 5, 0, 0, 0, 0};
template <>
constexpr int32_t kOrder<int16_t, 4>[8] = {0, 4, 1, 5, 0, 0, 0, 0};
template <>
constexpr int32_t kOrder<float, 3>[8] = {0, 1, 2, 3, 4, 5, 6, 7};
template <>
constexpr int32_t kOrder<float, 4>[8] = {0, 4, 1, 5, 2, 6, 3, 7};

// The four-pixel block form, eight pixels at a time, from pixel x while
// whole blocks remain before `end`; returns the pixels done.
template <typename T, int Channels>
ZEL_AVX2 int blocks256(const T* src, T* dst, int x, int end, WeightsF w) {
  const __m256 w0 = _mm256_set1_ps(w.w0), w1 = _mm256_set1_ps(w.w1), w2 = _mm256_set1_ps(w.w2);
  const __m256i order = _mm256_setr_epi32(kOrder<T, Channels>[0], kOrder<T, Channels>[1], kOrder<T, Channels>[2],
                                          kOrder<T, Channels>[3], kOrder<T, Channels>[4], kOrder<T, Channels>[5],
                                          kOrder<T, Channels>[6], kOrder<T, Channels>[7]);
  for (; x + 8 <= end; x += 8) {
    if constexpr (std::is_same_v<T, float>)
      _mm_prefetch(reinterpret_cast<const char*>(src + x * Channels) + kPrefetchBytes, _MM_HINT_T0);
    const Lanes8f c = load8<T, Channels>(src + x * Channels);
    const __m256 s = _mm256_add_ps(_mm256_add_ps(_mm256_mul_ps(c.a, w0), _mm256_mul_ps(c.b, w1)), _mm256_mul_ps(c.d, w2));
    if constexpr (std::is_same_v<T, float>) {
      _mm256_storeu_ps(dst + x, Channels == 3 ? s : _mm256_permutevar8x32_ps(s, order));
    } else {
      const __m256i r = _mm256_cvtps_epi32(s);
      __m256i n;
      if constexpr (std::is_signed_v<T>) {
        const __m256i u = _mm256_sub_epi32(r, _mm256_set1_epi32(32768));
        n = _mm256_packs_epi32(u, u);
      } else {
        n = _mm256_shuffle_epi8(r, mask256(kLowWords));
      }
      store128(dst + x, _mm256_castsi256_si128(_mm256_permutevar8x32_epi32(n, order)));
    }
  }
  return x;
}

// The blocks wider than four pixels that `tier` allows; returns the pixels
// done.
template <typename T, int Channels>
inline int wideBlocks(const T* src, T* dst, int end, WeightsF w, VectorTier tier) {
  int x = 0;
  if constexpr (!std::is_same_v<T, float> || Channels == 4)
    if (tier >= VectorTier::Avx512) x = blocks512<T, Channels>(src, dst, end, w);
  if (tier >= VectorTier::Avx2) x = blocks256<T, Channels>(src, dst, x, end, w);
  return x;
}

}  // namespace

template <int Channels>
void row8u(const uint8_t* src, uint8_t* dst, int width, Weights8 w, bool wide) {
  const int end = blockEnd8<Channels>(width);
  const Lanes8 c(w);
  int x = wide ? wide8u<Channels>(src, dst, end, w) : 0;
  for (; x + 8 <= end; x += 8) store64(dst + x, block8Pixels<Channels>(src + x * Channels, c));
  if (Channels == 3 && x < end) {  // the one block of 4
    const int32_t four = _mm_cvtsi128_si32(block4PixelsC3(src + x * 3, c));
    __builtin_memcpy(dst + x, &four, 4);
    x += 4;
  }
  for (; x < width; ++x) {
    const uint8_t* p = src + x * Channels;
    dst[x] = tail8(p[0], p[1], p[2], w);
  }
}

template <int Channels>
void row16u(const uint16_t* src, uint16_t* dst, int width, WeightsF w, VectorTier tier) {
  const LanesF c(w);
  const int end = width & ~3;
  int x = wideBlocks<uint16_t, Channels>(src, dst, end, w, tier);
  for (; x < end; x += 4) {
    const __m128i r = _mm_cvtps_epi32(sum4(load4x16<Channels, false>(src + x * Channels), c));
    store64(dst + x, _mm_shuffle_epi8(r, mask(kLowWords)));
  }
  for (; x < width; ++x) {
    const uint16_t* p = src + x * Channels;
    dst[x] = gray16u(p[0], p[1], p[2], w);
  }
}

template <int Channels>
void row16s(const int16_t* src, int16_t* dst, int width, WeightsF w, VectorTier tier) {
  const LanesF c(w);
  const int end = blockEnd16s(width);
  int x = wideBlocks<int16_t, Channels>(src, dst, end, w, tier);
  for (; x < end; x += 4) {
    const __m128i r = _mm_cvtps_epi32(sum4(load4x16<Channels, true>(src + x * Channels), c));
    const __m128i u = _mm_sub_epi32(r, _mm_set1_epi32(32768));
    store64(dst + x, _mm_packs_epi32(u, u));
  }
  for (; x < width; ++x) {
    const int16_t* p = src + x * Channels;
    dst[x] = tail16s(p[0], p[1], p[2], w);
  }
}

template <int Channels>
void row32f(const float* src, float* dst, int width, WeightsF w, VectorTier tier) {
  const LanesF c(w);
  const int end = width & ~3;
  int x = wideBlocks<float, Channels>(src, dst, end, w, tier);
  for (; x < end; x += 4) _mm_storeu_ps(dst + x, sum4(load4x32f<Channels>(src + x * Channels), c));
  for (; x < width; ++x) {
    const float* p = src + x * Channels;
    dst[x] = gray32f(p[0], p[1], p[2], w);
  }
}

template <int Channels>
void row64f(const double* src, double* dst, int width, WeightsD w) {
  const __m128d w0 = _mm_set1_pd(w.w0), w1 = _mm_set1_pd(w.w1), w2 = _mm_set1_pd(w.w2);
  int x = 0;
  for (; x + 2 <= width; x += 2) {
    const double* p = src + x * Channels;
    __m128d a, b, d;
    if constexpr (Channels == 3) {
      const __m128d p0 = _mm_loadu_pd(p), p1 = _mm_loadu_pd(p + 2), p2 = _mm_loadu_pd(p + 4);
      a = _mm_shuffle_pd(p0, p1, 0x2);
      b = _mm_shuffle_pd(p0, p2, 0x1);
      d = _mm_shuffle_pd(p1, p2, 0x2);
    } else {
      const __m128d p0 = _mm_loadu_pd(p), p1 = _mm_loadu_pd(p + 2), p2 = _mm_loadu_pd(p + 4), p3 = _mm_loadu_pd(p + 6);
      a = _mm_unpacklo_pd(p0, p2);
      b = _mm_unpackhi_pd(p0, p2);
      d = _mm_unpacklo_pd(p1, p3);
    }
    const __m128d s = _mm_add_pd(_mm_add_pd(_mm_mul_pd(a, w0), _mm_mul_pd(b, w1)), _mm_mul_pd(d, w2));
    _mm_storeu_pd(dst + x, s);
  }
  for (; x < width; ++x) {
    const double* p = src + x * Channels;
    dst[x] = gray64f(p[0], p[1], p[2], w);
  }
}

template void row8u<3>(const uint8_t*, uint8_t*, int, Weights8, bool);
template void row8u<4>(const uint8_t*, uint8_t*, int, Weights8, bool);
template void row16u<3>(const uint16_t*, uint16_t*, int, WeightsF, VectorTier);
template void row16u<4>(const uint16_t*, uint16_t*, int, WeightsF, VectorTier);
template void row16s<3>(const int16_t*, int16_t*, int, WeightsF, VectorTier);
template void row16s<4>(const int16_t*, int16_t*, int, WeightsF, VectorTier);
template void row32f<3>(const float*, float*, int, WeightsF, VectorTier);
template void row32f<4>(const float*, float*, int, WeightsF, VectorTier);
template void row64f<3>(const double*, double*, int, WeightsD);
template void row64f<4>(const double*, double*, int, WeightsD);

namespace {

// 16-bit and 32f steps are taken in whole samples (an arithmetic shift of
// the byte step), 8u and 64f steps as given.
template <typename T>
inline int sampleStep(int step) {
  if constexpr (sizeof(T) == 2) return (step >> 1) * 2;
  else if constexpr (sizeof(T) == 4) return (step >> 2) * 4;
  else return step;
}

// The public frame: pointers, then size; steps are not tested. A null
// `coeffs` selects the fixed weights.
template <typename T, int Channels, typename Coeff>
Status toGray(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, const Coeff* coeffs) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const Plane<const T> in{src, sampleStep<T>(srcStep)};
  const Plane<T> out{dst, sampleStep<T>(dstStep)};
  if constexpr (std::is_same_v<T, uint8_t>) {
    const Weights8 w = weights8(coeffs);
    const bool wide = hasAvx2();
    plainWalk(size.height, [&](int y) { row8u<Channels>(in.row(y), out.row(y), size.width, w, wide); });
  } else if constexpr (std::is_same_v<T, uint16_t>) {
    const WeightsF w = weightsF(coeffs);
    const VectorTier tier = zel::widestTier();
    plainWalk(size.height, [&](int y) { row16u<Channels>(in.row(y), out.row(y), size.width, w, tier); });
  } else if constexpr (std::is_same_v<T, int16_t>) {
    const WeightsF w = weightsF(coeffs);
    const VectorTier tier = zel::widestTier();
    plainWalk(size.height, [&](int y) { row16s<Channels>(in.row(y), out.row(y), size.width, w, tier); });
  } else if constexpr (std::is_same_v<T, float>) {
    const WeightsF w = weightsF(coeffs);
    const VectorTier tier = zel::widestTier();
    plainWalk(size.height, [&](int y) { row32f<Channels>(in.row(y), out.row(y), size.width, w, tier); });
  } else {
    const WeightsD w = weightsD(coeffs);
    plainWalk(size.height, [&](int y) { row64f<Channels>(in.row(y), out.row(y), size.width, w); });
  }
  return StatusOk;
}

}  // namespace

}  // namespace zel::gray

using zel::gray::toGray;

#define ZEL_GRAY(T, tok, Ch, layout)                                                                         \
  ZEL_PUBLIC Status zeliRGBToGray_##tok##_##layout##C1R(const T* src, int srcStep, T* dst, int dstStep,     \
                                                        ImageSize size) {                                   \
    return toGray<T, Ch, float>(src, srcStep, dst, dstStep, size, nullptr);                                  \
  }                                                                                                          \
  ZEL_PUBLIC Status zeliColorToGray_##tok##_##layout##C1R(const T* src, int srcStep, T* dst, int dstStep,   \
                                                          ImageSize size, const float coeffs[3]) {          \
    return toGray<T, Ch, float>(src, srcStep, dst, dstStep, size, coeffs);                                   \
  }

ZEL_GRAY(uint8_t, 8u, 3, C3)
ZEL_GRAY(uint8_t, 8u, 4, AC4)
ZEL_GRAY(uint16_t, 16u, 3, C3)
ZEL_GRAY(uint16_t, 16u, 4, AC4)
ZEL_GRAY(int16_t, 16s, 3, C3)
ZEL_GRAY(int16_t, 16s, 4, AC4)
ZEL_GRAY(float, 32f, 3, C3)
ZEL_GRAY(float, 32f, 4, AC4)

ZEL_PUBLIC Status zeliColorToGray_64f_C3C1R(const double* src, int srcStep, double* dst, int dstStep, ImageSize size,
                                            const double coeffs[3]) {
  return toGray<double, 3, double>(src, srcStep, dst, dstStep, size, coeffs);
}
ZEL_PUBLIC Status zeliColorToGray_64f_AC4C1R(const double* src, int srcStep, double* dst, int dstStep, ImageSize size,
                                             const double coeffs[3]) {
  return toGray<double, 4, double>(src, srcStep, dst, dstStep, size, coeffs);
}
