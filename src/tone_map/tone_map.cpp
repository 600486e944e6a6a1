#include "tone_map/tone_map.h"

#include <cmath>

#include "frame/export.h"
#include "frame/fill_bytes.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"

namespace zel::tone {

float imageMax(const float* src, int srcStep, int width, int height) {
  __m128 acc0 = _mm_set1_ps(-3.4028235e38f), acc1 = acc0;
  for (int y = 0; y < height; ++y) {
    const float* s = rowAt(src, srcStep, y);
    int x = 0;
    // Singly up to a 16-byte boundary, then 8 at a time over both
    // accumulators, then 4, 2 and 1.
    for (; x < width && !isAligned16(s + x); ++x) acc0 = _mm_max_ss(acc0, _mm_load_ss(s + x));
    for (; x + 8 <= width; x += 8) {
      acc0 = _mm_max_ps(acc0, _mm_loadu_ps(s + x));
      acc1 = _mm_max_ps(acc1, _mm_loadu_ps(s + x + 4));
    }
    if (x + 4 <= width) {
      acc0 = _mm_max_ps(acc0, _mm_loadu_ps(s + x));
      x += 4;
    }
    if (x + 2 <= width) {
      const __m128 pair = _mm_castsi128_ps(load64(s + x));
      acc0 = _mm_blend_ps(acc0, _mm_max_ps(acc0, pair), 0x3);
      x += 2;
    }
    if (x < width) acc0 = _mm_max_ss(acc0, _mm_load_ss(s + x));
  }
  // A lane still NaN at the end (its last sample was NaN) makes the whole
  // maximum NaN, whichever lanes it meets in the fold.
  if (_mm_movemask_ps(_mm_cmpunord_ps(acc0, acc1)) != 0) return _mm_cvtss_f32(_mm_set1_ps(NAN));
  const __m128 both = _mm_max_ps(acc0, acc1);
  const __m128 half = _mm_max_ps(both, _mm_movehl_ps(both, both));
  return _mm_cvtss_f32(_mm_max_ss(half, _mm_shuffle_ps(half, half, _MM_SHUFFLE(1, 1, 1, 1))));
}

double imageSum(const float* src, int srcStep, int width, int height) {
  if (width <= 16) {
    double sum = 0.0;
    for (int y = 0; y < height; ++y) {
      const float* s = rowAt(src, srcStep, y);
      for (int x = 0; x < width; ++x) sum += double(s[x]);
    }
    return sum;
  }
  // The 8-lane accumulator as two halves: lanes 0..3 and 4..7.
  __m128 lo = _mm_setzero_ps(), hi = _mm_setzero_ps(), acc4 = _mm_setzero_ps();
  for (int y = 0; y < height; ++y) {
    const float* s = rowAt(src, srcStep, y);
    const uintptr_t at = reinterpret_cast<uintptr_t>(s);
    int x = 0;
    if (at & 63u) {
      // Singly into lane 0 up to the next 32-byte boundary.
      const int head = int((((32u - (at & 31u)) & 31u) + 3u) / 4u);
      for (; x < head && x < width; ++x) acc4 = _mm_add_ss(acc4, _mm_load_ss(s + x));
    }
    for (; x + 16 <= width; x += 16) {
      lo = _mm_add_ps(lo, _mm_add_ps(_mm_loadu_ps(s + x), _mm_loadu_ps(s + x + 8)));
      hi = _mm_add_ps(hi, _mm_add_ps(_mm_loadu_ps(s + x + 4), _mm_loadu_ps(s + x + 12)));
    }
    if (x + 8 <= width) {
      lo = _mm_add_ps(lo, _mm_loadu_ps(s + x));
      hi = _mm_add_ps(hi, _mm_loadu_ps(s + x + 4));
      x += 8;
    }
    if (x + 4 <= width) {
      acc4 = _mm_add_ps(acc4, _mm_loadu_ps(s + x));
      x += 4;
    }
    for (; x < width; ++x) acc4 = _mm_add_ss(acc4, _mm_load_ss(s + x));
  }
  acc4 = _mm_add_ps(acc4, _mm_add_ps(lo, hi));
  // (lane 0 + lane 2) + (lane 1 + lane 3).
  const __m128 pairs = _mm_add_ps(acc4, _mm_movehl_ps(acc4, acc4));
  return double(_mm_cvtss_f32(_mm_add_ss(pairs, _mm_shuffle_ps(pairs, pairs, _MM_SHUFFLE(1, 1, 1, 1)))));
}

namespace {

template <Scaling S>
inline uint8_t sample(float scale, float s) {
  return S == Scaling::Linear ? linearSample(scale, s) : meanSample(scale, s);
}

inline bool overlaps(const float* src, const uint8_t* dst, int width) {
  const auto s = reinterpret_cast<uintptr_t>(src), d = reinterpret_cast<uintptr_t>(dst);
  return s < d + uintptr_t(width) && d < s + uintptr_t(width) * 4u;
}

}  // namespace

template <Scaling S>
void scaleRow(const float* src, uint8_t* dst, int width, float scale) {
  int x = 0;
  if (width >= 7 && !overlaps(src, dst, width)) {
    const int head = int((16u - (reinterpret_cast<uintptr_t>(dst) & 15u)) & 15u);
    if (width - head >= 16) {
      for (; x < head; ++x) dst[x] = sample<S>(scale, src[x]);
      const __m128 k = _mm_set1_ps(scale);
      const __m128i low8 = _mm_set1_epi32(0xFF);
      for (; x + 16 <= width; x += 16) {
        __m128i v[4];
        for (int i = 0; i < 4; ++i) {
          v[i] = _mm_cvttps_epi32(_mm_mul_ps(_mm_loadu_ps(src + x + 4 * i), k));
          if (S == Scaling::Linear) v[i] = _mm_and_si128(v[i], low8);
        }
        const __m128i ab = S == Scaling::Linear ? _mm_packus_epi32(v[0], v[1]) : _mm_packs_epi32(v[0], v[1]);
        const __m128i cd = S == Scaling::Linear ? _mm_packus_epi32(v[2], v[3]) : _mm_packs_epi32(v[2], v[3]);
        _mm_store_si128(reinterpret_cast<__m128i*>(dst + x), _mm_packus_epi16(ab, cd));
      }
      for (; x < width; ++x) dst[x] = sample<S>(scale, src[x]);
      return;
    }
  }
  // Short or overlapping rows: a scalar loop, two samples read before
  // their two bytes are written.
  for (; x + 2 <= width; x += 2) {
    const float a = src[x], b = src[x + 1];
    dst[x] = sample<S>(scale, a);
    dst[x + 1] = sample<S>(scale, b);
  }
  if (x < width) dst[x] = sample<S>(scale, src[x]);
}

template void scaleRow<Scaling::Linear>(const float*, uint8_t*, int, float);
template void scaleRow<Scaling::Mean>(const float*, uint8_t*, int, float);

namespace {

template <Scaling S>
Status toneMap(const float* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  float scale;
  if constexpr (S == Scaling::Linear) {
    const float m = imageMax(src, srcStep, size.width, size.height);
    if (m < 0.0f) return StatusNothingDoneWarning;
    if (!(m > kTinyF)) return fillBytes(0, dst, dstStep, size.width, size.height);
    scale = linearScale(m);
  } else {
    const int32_t count = static_cast<int32_t>(uint32_t(size.width) * uint32_t(size.height));
    const double m = 2.0 * (imageSum(src, srcStep, size.width, size.height) / double(count));
    if (m < 0.0) return StatusNothingDoneWarning;
    if (!(m > kTinyD)) return fillBytes(0, dst, dstStep, size.width, size.height);
    scale = meanScale(m);
  }
  plainWalk(size.height,
            [&](int y) { scaleRow<S>(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, scale); });
  return StatusOk;
}

}  // namespace

}  // namespace zel::tone

ZEL_PUBLIC Status zeliToneMapLinear_32f8u_C1R(const float* src, int srcStep, uint8_t* dst, int dstStep,
                                              ImageSize size) {
  return zel::tone::toneMap<zel::tone::Scaling::Linear>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliToneMapMean_32f8u_C1R(const float* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return zel::tone::toneMap<zel::tone::Scaling::Mean>(src, srcStep, dst, dstStep, size);
}
