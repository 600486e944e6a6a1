#include "frame/gray_to_rgb.h"

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"

namespace zel {

namespace {

// Byte shuffles that spread 16 gray bytes over 48 bytes of RGB triples.
alignas(16) const int8_t kTriple8[3][16] = {
    {0, 0, 0, 1, 1, 1, 2, 2, 2, 3, 3, 3, 4, 4, 4, 5},
    {5, 5, 6, 6, 6, 7, 7, 7, 8, 8, 8, 9, 9, 9, 10, 10},
    {10, 11, 11, 11, 12, 12, 12, 13, 13, 13, 14, 14, 14, 15, 15, 15}};
// The same for 8 words of 16 bits into 24 words.
alignas(16) const int8_t kTriple16[3][16] = {
    {0, 1, 0, 1, 0, 1, 2, 3, 2, 3, 2, 3, 4, 5, 4, 5},
    {4, 5, 6, 7, 6, 7, 6, 7, 8, 9, 8, 9, 8, 9, 10, 11},
    {10, 11, 10, 11, 12, 13, 12, 13, 12, 13, 14, 15, 14, 15, 14, 15}};
// AVX2 form for 8 bits: each 128-bit lane of a broadcast load holds the
// source bytes from offsets 0, 8 and 16 of a 32-pixel block.
// Lanes: {m0|m1} on pixels 0..15, {m2|m0} on pixels 0..15 | 16..31,
// {m1|m2} on pixels 16..31.
alignas(32) const int8_t kTriple8Avx[3][32] = {
    {0, 0, 0, 1, 1, 1, 2, 2, 2, 3, 3, 3, 4, 4, 4, 5, 5, 5, 6, 6, 6, 7, 7, 7, 8, 8, 8, 9, 9, 9, 10, 10},
    {10, 11, 11, 11, 12, 12, 12, 13, 13, 13, 14, 14, 14, 15, 15, 15, 0, 0, 0, 1, 1, 1, 2, 2, 2, 3, 3, 3, 4, 4, 4, 5},
    {5, 5, 6, 6, 6, 7, 7, 7, 8, 8, 8, 9, 9, 9, 10, 10, 10, 11, 11, 11, 12, 12, 12, 13, 13, 13, 14, 14, 14, 15, 15, 15}};

alignas(32) const int8_t kTriple16Avx[3][32] = {
    {0, 1, 0, 1, 0, 1, 2, 3, 2, 3, 2, 3, 4, 5, 4, 5, 4, 5, 6, 7, 6, 7, 6, 7, 8, 9, 8, 9, 8, 9, 10, 11},
    {10, 11, 10, 11, 12, 13, 12, 13, 12, 13, 14, 15, 14, 15, 14, 15, 0, 1, 0, 1, 0, 1, 2, 3, 2, 3, 2, 3, 4, 5, 4, 5},
    {4, 5, 6, 7, 6, 7, 6, 7, 8, 9, 8, 9, 8, 9, 10, 11, 10, 11, 10, 11, 12, 13, 12, 13, 12, 13, 14, 15, 14, 15, 14, 15}};
// Four gray bytes to four pixels of four bytes, the fourth byte cleared for
// alpha; the second lane takes the next four pixels.
alignas(32) const int8_t kQuad8Avx[2][32] = {
    {0, 0, 0, -1, 1, 1, 1, -1, 2, 2, 2, -1, 3, 3, 3, -1, 4, 4, 4, -1, 5, 5, 5, -1, 6, 6, 6, -1, 7, 7, 7, -1},
    {8, 8, 8, -1, 9, 9, 9, -1, 10, 10, 10, -1, 11, 11, 11, -1, 12, 12, 12, -1, 13, 13, 13, -1, 14, 14, 14, -1,
     15, 15, 15, -1}};
alignas(32) const int32_t kTriple32Avx[3][8] = {
    {0, 0, 0, 1, 1, 1, 2, 2}, {2, 3, 3, 3, 4, 4, 4, 5}, {5, 5, 6, 6, 6, 7, 7, 7}};

inline __m128i mask(const int8_t* m) { return _mm_load_si128(reinterpret_cast<const __m128i*>(m)); }

template <typename T, int Channels>
void scalarPixels(const T* src, T* dst, int from, int to, T alpha) {
  for (int x = from; x < to; ++x) grayPixel<T, Channels>(src + x, dst + x * Channels, alpha);
}

// ---- SSE4.1 blocks: each returns the number of pixels it converted. ----

int sse8uC3(const uint8_t* s, uint8_t* d, int n) {
  int x = 0;
  const __m128i m0 = mask(kTriple8[0]), m1 = mask(kTriple8[1]), m2 = mask(kTriple8[2]);
  for (; x + 16 <= n; x += 16) {
    const __m128i g = load128(s + x);
    uint8_t* o = d + 3 * x;
    store128(o, _mm_shuffle_epi8(g, m0));
    store128(o + 16, _mm_shuffle_epi8(g, m1));
    store128(o + 32, _mm_shuffle_epi8(g, m2));
  }
  return x;
}

int sse16uC3(const uint16_t* s, uint16_t* d, int n) {
  int x = 0;
  const __m128i m0 = mask(kTriple16[0]), m1 = mask(kTriple16[1]), m2 = mask(kTriple16[2]);
  for (; x + 8 <= n; x += 8) {
    const __m128i g = load128(s + x);
    uint16_t* o = d + 3 * x;
    store128(o, _mm_shuffle_epi8(g, m0));
    store128(o + 8, _mm_shuffle_epi8(g, m1));
    store128(o + 16, _mm_shuffle_epi8(g, m2));
  }
  return x;
}

int sse32fC3(const float* s, float* d, int n) {
  int x = 0;
  for (; x + 4 <= n; x += 4) {
    const __m128i g = load128(s + x);  // moved as integers: bit exact
    float* o = d + 3 * x;
    store128(o, _mm_shuffle_epi32(g, _MM_SHUFFLE(1, 0, 0, 0)));
    store128(o + 4, _mm_shuffle_epi32(g, _MM_SHUFFLE(2, 2, 1, 1)));
    store128(o + 8, _mm_shuffle_epi32(g, _MM_SHUFFLE(3, 3, 3, 2)));
  }
  return x;
}

int sse8uC4(const uint8_t* s, uint8_t* d, int n, uint8_t alpha) {
  int x = 0;
  const __m128i a = _mm_set1_epi32(int32_t(uint32_t(alpha) << 24));
  const __m128i spread = _mm_set1_epi32(0x00010101);
  for (; x + 4 <= n; x += 4) {
    const __m128i g = _mm_cvtepu8_epi32(load32(s + x));
    store128(d + 4 * x, _mm_or_si128(_mm_mullo_epi32(g, spread), a));
  }
  return x;
}

int sse16uC4(const uint16_t* s, uint16_t* d, int n, uint16_t alpha) {
  int x = 0;
  const __m128i a = _mm_set1_epi16(static_cast<int16_t>(alpha));
  for (; x + 4 <= n; x += 4) {
    const __m128i g = load64(s + x);
    const __m128i gg = _mm_unpacklo_epi16(g, g);  // s0 s0 s1 s1 ...
    const __m128i ga = _mm_unpacklo_epi16(g, a);  // s0 a  s1 a  ...
    store128(d + 4 * x, _mm_unpacklo_epi32(gg, ga));
    store128(d + 4 * x + 8, _mm_unpackhi_epi32(gg, ga));
  }
  return x;
}

int sse32fC4(const float* s, float* d, int n, float alpha) {
  int x = 0;
  int32_t alphaBits;
  __builtin_memcpy(&alphaBits, &alpha, 4);
  const __m128i a = _mm_set1_epi32(alphaBits);
  for (; x + 2 <= n; x += 2) {
    const __m128i g = load64(s + x);
    float* o = d + 4 * x;
    store128(o, _mm_blend_epi16(_mm_shuffle_epi32(g, _MM_SHUFFLE(0, 0, 0, 0)), a, 0xC0));
    store128(o + 4, _mm_blend_epi16(_mm_shuffle_epi32(g, _MM_SHUFFLE(1, 1, 1, 1)), a, 0xC0));
  }
  return x;
}

// ---- AVX2 blocks: same bits, wider blocks. ----

ZEL_AVX2 int avx8uC3(const uint8_t* s, uint8_t* d, int n) {
  int x = 0;
  const __m256i m0 = load256(kTriple8Avx[0]), m1 = load256(kTriple8Avx[1]), m2 = load256(kTriple8Avx[2]);
  for (; x + 32 <= n; x += 32) {
    uint8_t* o = d + 3 * x;
    const __m256i a = broadcast128(s + x);
    const __m256i b = load256(s + x);
    const __m256i c = broadcast128(s + x + 16);
    store256(o, _mm256_shuffle_epi8(a, m0));
    store256(o + 32, _mm256_shuffle_epi8(b, m1));
    store256(o + 64, _mm256_shuffle_epi8(c, m2));
  }
  return x;
}

ZEL_AVX2 int avx16uC3(const uint16_t* s, uint16_t* d, int n) {
  int x = 0;
  const __m256i m0 = load256(kTriple16Avx[0]), m1 = load256(kTriple16Avx[1]), m2 = load256(kTriple16Avx[2]);
  for (; x + 16 <= n; x += 16) {
    uint16_t* o = d + 3 * x;
    store256(o, _mm256_shuffle_epi8(broadcast128(s + x), m0));
    store256(o + 16, _mm256_shuffle_epi8(load256(s + x), m1));
    store256(o + 32, _mm256_shuffle_epi8(broadcast128(s + x + 8), m2));
  }
  return x;
}

ZEL_AVX2 int avx32fC3(const float* s, float* d, int n) {
  int x = 0;
  const __m256i i0 = load256(kTriple32Avx[0]), i1 = load256(kTriple32Avx[1]), i2 = load256(kTriple32Avx[2]);
  for (; x + 8 <= n; x += 8) {
    const __m256i g = load256(s + x);  // moved as integers: bit exact
    float* o = d + 3 * x;
    store256(o, _mm256_permutevar8x32_epi32(g, i0));
    store256(o + 8, _mm256_permutevar8x32_epi32(g, i1));
    store256(o + 16, _mm256_permutevar8x32_epi32(g, i2));
  }
  return x;
}

ZEL_AVX2 int avx8uC4(const uint8_t* s, uint8_t* d, int n, uint8_t alpha) {
  int x = 0;
  const __m256i a = _mm256_set1_epi32(int32_t(uint32_t(alpha) << 24));
  const __m256i q0 = load256(kQuad8Avx[0]), q1 = load256(kQuad8Avx[1]);
  for (; x + 16 <= n; x += 16) {
    const __m256i g = broadcast128(s + x);
    store256(d + 4 * x, _mm256_or_si256(_mm256_shuffle_epi8(g, q0), a));
    store256(d + 4 * x + 32, _mm256_or_si256(_mm256_shuffle_epi8(g, q1), a));
  }
  return x;
}

ZEL_AVX2 int avx16uC4(const uint16_t* s, uint16_t* d, int n, uint16_t alpha) {
  int x = 0;
  const __m256i a = _mm256_set1_epi16(static_cast<int16_t>(alpha));
  for (; x + 8 <= n; x += 8) {
    // Lane 0 holds pixels 0..3, lane 1 pixels 4..7.
    const __m256i g = _mm256_cvtepu16_epi32(load128(s + x));  // s 0 s 0 ...
    const __m256i gg = _mm256_or_si256(g, _mm256_slli_epi32(g, 16));
    const __m256i ga = _mm256_blend_epi16(gg, a, 0xAA);  // s a s a ...
    // unpacklo gives px0,px1 | px4,px5 and unpackhi px2,px3 | px6,px7.
    const __m256i lo = _mm256_unpacklo_epi32(gg, ga);
    const __m256i hi = _mm256_unpackhi_epi32(gg, ga);
    store256(d + 4 * x, _mm256_permute2x128_si256(lo, hi, 0x20));
    store256(d + 4 * x + 16, _mm256_permute2x128_si256(lo, hi, 0x31));
  }
  return x;
}

}  // namespace

template <typename T, int Channels>
void grayRowKernel(const T* src, T* dst, int count, T alpha) {
  int done = 0;
  const bool avx2 = hasAvx2();
  if constexpr (std::is_same_v<T, uint8_t> && Channels == 3) {
    if (avx2) done = avx8uC3(src, dst, count);
    done += sse8uC3(src + done, dst + 3 * done, count - done);
  } else if constexpr (std::is_same_v<T, uint16_t> && Channels == 3) {
    if (avx2) done = avx16uC3(src, dst, count);
    done += sse16uC3(src + done, dst + 3 * done, count - done);
  } else if constexpr (std::is_same_v<T, float> && Channels == 3) {
    if (avx2) done = avx32fC3(src, dst, count);
    done += sse32fC3(src + done, dst + 3 * done, count - done);
  } else if constexpr (std::is_same_v<T, uint8_t> && Channels == 4) {
    if (avx2) done = avx8uC4(src, dst, count, alpha);
    done += sse8uC4(src + done, dst + 4 * done, count - done, alpha);
  } else if constexpr (std::is_same_v<T, uint16_t> && Channels == 4) {
    if (avx2) done = avx16uC4(src, dst, count, alpha);
    done += sse16uC4(src + done, dst + 4 * done, count - done, alpha);
  } else {
    done = sse32fC4(src, dst, count, alpha);
  }
  scalarPixels<T, Channels>(src, dst, done, count, alpha);
}

template void grayRowKernel<uint8_t, 3>(const uint8_t*, uint8_t*, int, uint8_t);
template void grayRowKernel<uint16_t, 3>(const uint16_t*, uint16_t*, int, uint16_t);
template void grayRowKernel<float, 3>(const float*, float*, int, float);
template void grayRowKernel<uint8_t, 4>(const uint8_t*, uint8_t*, int, uint8_t);
template void grayRowKernel<uint16_t, 4>(const uint16_t*, uint16_t*, int, uint16_t);
template void grayRowKernel<float, 4>(const float*, float*, int, float);

namespace {

// The public frame: pointers, then size; steps are used as given. The
// kernel takes width AND NOT 3 pixels, the row loop the last width AND 3.
template <typename T, int Channels>
Status grayToRgb(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, T alpha) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const int body = size.width & ~3;
  plainWalk(size.height, [&](int y) {
    const T* s = rowAt(src, srcStep, y);
    T* d = rowAt(dst, dstStep, y);
    grayRowKernel<T, Channels>(s, d, body, alpha);
    scalarPixels<T, Channels>(s, d, body, size.width, alpha);
  });
  return StatusOk;
}

}  // namespace

}  // namespace zel

using zel::grayToRgb;

ZEL_PUBLIC Status zeliGrayToRGB_8u_C1C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  return grayToRgb<uint8_t, 3>(src, srcStep, dst, dstStep, size, 0);
}
ZEL_PUBLIC Status zeliGrayToRGB_16u_C1C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                          ImageSize size) {
  return grayToRgb<uint16_t, 3>(src, srcStep, dst, dstStep, size, 0);
}
ZEL_PUBLIC Status zeliGrayToRGB_32f_C1C3R(const float* src, int srcStep, float* dst, int dstStep,
                                          ImageSize size) {
  return grayToRgb<float, 3>(src, srcStep, dst, dstStep, size, 0.0f);
}
ZEL_PUBLIC Status zeliGrayToRGB_8u_C1C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size, uint8_t alpha) {
  return grayToRgb<uint8_t, 4>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliGrayToRGB_16u_C1C4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                          ImageSize size, uint16_t alpha) {
  return grayToRgb<uint16_t, 4>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliGrayToRGB_32f_C1C4R(const float* src, int srcStep, float* dst, int dstStep,
                                          ImageSize size, float alpha) {
  return grayToRgb<float, 4>(src, srcStep, dst, dstStep, size, alpha);
}
