// The drivers of the bit-depth reduction family, one template for every
// source/destination pair and layout: the plain levels, Floyd-Steinberg,
// the three-row diffusions and the ordered dither, each with and without
// noise.
#pragma once

#include <cstring>
#include <utility>

#include "frame/allocate.h"
#include "frame/image_layout.h"
#include "reduce_bits/diffusion_bands.h"
#include "reduce_bits/noise_generator.h"
#include "reduce_bits/reduce_formulas.h"
#include "reduce_bits/reduce_lanes.h"

namespace zel::reduce {

// The dithered drivers count steps in whole elements (an arithmetic shift),
// so a byte step that is not a multiple of the element size rounds down.
template <typename T>
inline int elementStep(int byteStep) {
  constexpr int shift = sizeof(T) == 1 ? 0 : sizeof(T) == 2 ? 1 : 2;
  return (byteStep >> shift) * int(sizeof(T));
}

// ---- Quantisation without dither ----

template <typename M, LayoutCode L>
constexpr Pack plainPack() {
  if constexpr (M::byteDest) return Pack::SaturateBytes;
  else if constexpr (M::signedDest) return Pack::SignedWords;
  else return L == LayoutCode::AC4 ? Pack::BiasedWords : Pack::LowWords;
}

template <typename M>
inline __m128i plainLanes(const typename M::Source* s, const PlainLevels& p) {
  return plainScaled4<typename M::Dest>(nearestLevel4(normalise4(s), p));
}

// AVX2 blocks of 16 samples below `end`; returns the samples done.
template <typename M, Pack P>
ZEL_AVX2 int plainRunAvx2(const typename M::Source* s, typename M::Dest* d, int end, const PlainLevels& p) {
  using Dst = typename M::Dest;
  int x = 0;
  for (; x + 16 <= end; x += 16) {
    const __m256i a = plainScaled8<Dst>(nearestLevel8(normalise8(s + x), p));
    const __m256i b = plainScaled8<Dst>(nearestLevel8(normalise8(s + x + 8), p));
    storePacked16(d + x, pack16<P>(a, b));
  }
  return x;
}

// C1, C3 and C4 rows: one run of count samples. Samples from bodyEnd on
// take the row's end store; the vector blocks stop at vecEnd.
template <typename M, LayoutCode L>
void plainRun(const typename M::Source* s, typename M::Dest* d, int count, const PlainLevels& p, bool avx2) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  constexpr Pack P = plainPack<M, L>();
  const int bodyEndAt = bodyEnd(count, plainBlock<Src, Dst>());
  const int vecEnd = M::byteDest ? bodyEndAt : (count & ~3);
  int x = avx2 ? plainRunAvx2<M, P>(s, d, vecEnd, p) : 0;
  for (; x + 8 <= vecEnd; x += 8)
    storePacked(d + x, pack8<P>(plainLanes<M>(s + x, p), plainLanes<M>(s + x + 4, p)), 8);
  if (x + 4 <= vecEnd) {
    const __m128i a = plainLanes<M>(s + x, p);
    storePacked(d + x, pack8<P>(a, a), 4);
    x += 4;
  }
  for (; x < count; ++x) storeSample(d, x, plainSample<Src, Dst>(loadSample(s, x), p, x >= bodyEndAt, false));
}

// AC4 rows: three samples of each pixel; the alpha lane is computed and
// dropped. Pixels wholly inside the row's blocks of samples take the body.
template <typename M>
void plainAlphaRow(const typename M::Source* s, typename M::Dest* d, int width, const PlainLevels& p) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  constexpr Pack P = plainPack<M, LayoutCode::AC4>();
  const int bodyPixels = bodyEnd(4 * width, plainBlock<Src, Dst>()) / 4;
  const int vecEnd = M::byteDest ? bodyPixels : width;
  int x = 0;
  for (; x + 2 <= vecEnd; x += 2)
    storeThreeOfFour(d + 4 * x, pack8<P>(plainLanes<M>(s + 4 * x, p), plainLanes<M>(s + 4 * x + 4, p)), 2);
  if (x < vecEnd) {
    const __m128i a = plainLanes<M>(s + 4 * x, p);
    storeThreeOfFour(d + 4 * x, pack8<P>(a, a), 1);
    ++x;
  }
  for (; x < width; ++x)
    for (int c = 0; c < 3; ++c)
      storeSample(d, 4 * x + c, plainSample<Src, Dst>(loadSample(s, 4 * x + c), p, x >= bodyPixels, true));
}

// Byte steps, honoured to the byte.
template <typename M, LayoutCode L>
void plainDriver(const Image<typename M::Source, typename M::Dest>& im, int levels) {
  const PlainLevels p = plainLevels(levels);
  const bool avx2 = hasAvx2();
  for (int y = 0; y < im.height; ++y) {
    const auto* s = rowAt(im.src, im.srcStep, y);
    auto* d = rowAt(im.dst, im.dstStep, y);
    if constexpr (L == LayoutCode::AC4) plainAlphaRow<M>(s, d, im.width, p);
    else plainRun<M, L>(s, d, im.width * LayoutOf<L>::channels, p, avx2);
  }
}

// ---- Error diffusion ----

// Noise thresholds of the diffusion kinds: around half a step.
inline Status diffusionNoise(NoiseTables& t, int noise, float q) {
  const float low = float(50 - noise) * q / 100.0f;
  const float high = float(50 + noise) * q / 100.0f;
  return buildNoiseTables(t, low, high);
}

// Floyd-Steinberg: two rows of error, P above and C current, swapped after
// every row and carried on from one channel to the next. Row by row, one
// pixel after the other: the plain form of what the banded kernel does.
template <typename M, LayoutCode L, bool Noisy>
void floydSteinbergRows(const Image<typename M::Source, typename M::Dest>& im, float* block, const QuantValues& qv,
                        const NoiseTables& tables) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  constexpr int stride = LayoutOf<L>::stride;
  const int w = im.width;
  float* P = block + 1;
  float* C = block + w + 3;
  const float bottom = diffusionBottom<Src>(true);
  const int srcStep = elementStep<Src>(im.srcStep), dstStep = elementStep<Dst>(im.dstStep);
  for (int c = 0; c < LayoutOf<L>::channels; ++c)
    for (int y = 0; y < im.height; ++y) {
      const Src* s = rowAt(im.src, srcStep, y) + c;
      Dst* d = rowAt(im.dst, dstStep, y) + c;
      float left = C[-1];  // the zero margin
      for (int x = 0; x < w; ++x) {
        const float e = floydSteinbergError<M::roundedDiffusion>(P, left, x);
        const float v = working(loadSample(s, std::ptrdiff_t(x) * stride)) + e * 0.0625f;
        float n = 0.0f;
        if constexpr (Noisy) n = tables.values[noiseIndex(tables.randomIndex, x, y)];
        Dst out;
        left = diffuse<M, Noisy>(v, qv, bottom, n, M::roundedDiffusion, &out);
        C[x] = left;
        storeSample(d, std::ptrdiff_t(x) * stride, out);
      }
      std::swap(P, C);
    }
}

// The banded kernel, sixteen rows at a time with AVX2, else eight. The row
// above a band is the first half of the block, written over in place.
template <typename M, LayoutCode L, bool Noisy>
void floydSteinbergBands(const Image<typename M::Source, typename M::Dest>& im, float* block, const QuantValues& qv,
                         const NoiseTables& tables, bool avx2) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  const int srcStep = elementStep<Src>(im.srcStep), dstStep = elementStep<Dst>(im.dstStep);
  const float bottom = diffusionBottom<Src>(true);
  if (avx2) avx2::floydSteinbergBands<M, L, Noisy>(im, srcStep, dstStep, block + 1, qv, bottom, tables);
  else sse::floydSteinbergBands<M, L, Noisy>(im, srcStep, dstStep, block + 1, qv, bottom, tables);
}

template <typename M, LayoutCode L, bool Noisy>
Status floydSteinbergDriver(const Image<typename M::Source, typename M::Dest>& im, int levels, int noise) {
  const QuantValues qv = quantValues<typename M::Source>(levels);
  NoiseTables tables;
  if constexpr (Noisy) {
    const Status s = diffusionNoise(tables, noise, qv.q);
    if (s != StatusOk) return s;
  }
  const int w = im.width;
  float* block = reinterpret_cast<float*>(allocate32(2 * w + 4));
  // Without the row block the call ends here; the noise tables and their
  // records are not given back on this path.
  if (!block) return StatusOutOfMemoryError;
  std::memset(block, 0, sizeof(float) * size_t(2 * w + 4));
  floydSteinbergBands<M, L, Noisy>(im, block, qv, tables, hasAvx2());
  release(block);
  if constexpr (Noisy) releaseNoiseTables(tables);
  return StatusOk;
}

// Jarvis-Judice-Ninke and Stucki: three rows, U2 two up, U1 one up and C
// current; after every row U1 becomes U2, C becomes U1 and the old U2 the
// new C, carried on from one channel to the next. With noise, the pixels of
// each whole block of 4 share the threshold of the block's first column.
// Row by row: the plain form of the banded kernel.
template <typename M, LayoutCode L, bool Noisy>
void threeRowRows(const Image<typename M::Source, typename M::Dest>& im, float* block, const QuantValues& qv,
                  const ThreeRowWeights& k, const NoiseTables& tables) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  constexpr int stride = LayoutOf<L>::stride;
  const int w = im.width;
  float* U2 = block + 2;
  float* U1 = block + w + 6;
  float* C = block + 2 * w + 10;
  const int blocksEnd = w & ~3;
  const int srcStep = elementStep<Src>(im.srcStep), dstStep = elementStep<Dst>(im.dstStep);
  for (int c = 0; c < LayoutOf<L>::channels; ++c)
    for (int y = 0; y < im.height; ++y) {
      const Src* s = rowAt(im.src, srcStep, y) + c;
      Dst* d = rowAt(im.dst, dstStep, y) + c;
      float left2 = C[-2], left1 = C[-1];  // the zero margin
      for (int x = 0; x < w; ++x) {
        const float v =
            working(loadSample(s, std::ptrdiff_t(x) * stride)) + threeRowError(U2, U1, left2, left1, x, k);
        float n = 0.0f;
        if constexpr (Noisy) {
          const int column = x < blocksEnd ? (x & ~3) : x;
          n = tables.values[noiseIndex(tables.randomIndex, column, y)];
        }
        Dst out;
        left2 = left1;
        left1 = diffuse<M, Noisy>(v, qv, 0.0f, n, false, &out);
        C[x] = left1;
        storeSample(d, std::ptrdiff_t(x) * stride, out);
      }
      float* oldU2 = U2;
      U2 = U1;
      U1 = C;
      C = oldU2;
    }
}

// The banded kernel; the rows above a band are the block's first two rows,
// written over in place.
template <typename M, LayoutCode L, bool Noisy>
void threeRowBands(const Image<typename M::Source, typename M::Dest>& im, float* block, const QuantValues& qv,
                   const ThreeRowWeights& k, const NoiseTables& tables, bool avx2) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  const int srcStep = elementStep<Src>(im.srcStep), dstStep = elementStep<Dst>(im.dstStep);
  float* U2 = block + 2;
  float* U1 = block + im.width + 6;
  if (avx2) avx2::threeRowBands<M, L, Noisy>(im, srcStep, dstStep, U2, U1, qv, k, tables);
  else sse::threeRowBands<M, L, Noisy>(im, srcStep, dstStep, U2, U1, qv, k, tables);
}

// The banded kernels are built once, a layout per file
// (reduce_bands_<layout>.cpp), for every member and with and without noise;
// the drivers and the tests call those.
#define ZEL_REDUCE_BANDS_NOISE(EXTERN, Src, Dst, L, Noisy)                                                    \
  EXTERN template void floydSteinbergBands<Member<Src, Dst>, LayoutCode::L, Noisy>(                           \
      const Image<Src, Dst>&, float*, const QuantValues&, const NoiseTables&, bool);                          \
  EXTERN template void threeRowBands<Member<Src, Dst>, LayoutCode::L, Noisy>(                                 \
      const Image<Src, Dst>&, float*, const QuantValues&, const ThreeRowWeights&, const NoiseTables&, bool);
#define ZEL_REDUCE_BANDS_MEMBER(EXTERN, Src, Dst, L) \
  ZEL_REDUCE_BANDS_NOISE(EXTERN, Src, Dst, L, false) \
  ZEL_REDUCE_BANDS_NOISE(EXTERN, Src, Dst, L, true)
#define ZEL_REDUCE_BANDS_LAYOUT(EXTERN, L)                 \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, uint8_t, uint8_t, L)     \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, uint16_t, uint16_t, L)   \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, int16_t, int16_t, L)     \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, uint16_t, uint8_t, L)    \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, int16_t, uint8_t, L)     \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, float, uint8_t, L)       \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, float, uint16_t, L)      \
  ZEL_REDUCE_BANDS_MEMBER(EXTERN, float, int16_t, L)
ZEL_REDUCE_BANDS_LAYOUT(extern, C1)
ZEL_REDUCE_BANDS_LAYOUT(extern, C3)
ZEL_REDUCE_BANDS_LAYOUT(extern, C4)
ZEL_REDUCE_BANDS_LAYOUT(extern, AC4)

template <typename M, LayoutCode L, bool Noisy>
Status threeRowDriver(const Image<typename M::Source, typename M::Dest>& im, int levels, int noise, uint32_t kind) {
  const QuantValues qv = quantValues<typename M::Source>(levels);
  const ThreeRowWeights k = threeRowWeights(kind);
  NoiseTables tables;
  if constexpr (Noisy) {
    const Status s = diffusionNoise(tables, noise, qv.q);
    if (s != StatusOk) return s;
  }
  const int w = im.width;
  float* block = reinterpret_cast<float*>(allocate32(3 * w + 12));
  // As in Floyd-Steinberg, a missing row block leaves the tables allocated.
  if (!block) return StatusOutOfMemoryError;
  std::memset(block, 0, sizeof(float) * size_t(3 * w + 12));
  threeRowBands<M, L, Noisy>(im, block, qv, k, tables, hasAvx2());
  release(block);
  if constexpr (Noisy) releaseNoiseTables(tables);
  return StatusOk;
}

// ---- Ordered dither ----

template <typename M>
constexpr Pack orderedPack() {
  if constexpr (M::byteDest) return Pack::SaturateBytes;
  else if constexpr (M::signedDest) return Pack::ClampedSigned;
  else return Pack::ClampedWords;
}

// Where a row's exceptional pixels begin.
struct OrderedZones {
  int vecEnd;    // vector blocks of 4 pixels below this
  int wrapFrom;  // from here the unclamped low byte is stored
  int bareFrom;  // from here the threshold is the bare matrix entry
};

template <typename M, LayoutCode L, bool Noisy>
OrderedZones orderedZones(int width) {
  OrderedZones z{width & ~3, width, width};
  if constexpr (L == LayoutCode::C1 && M::wrapsRowEnd) {
    z.wrapFrom = (!Noisy && std::is_same_v<typename M::Source, uint8_t>) ? (width & ~7) : (width & ~3);
    z.vecEnd = z.wrapFrom;
  }
  if constexpr (L == LayoutCode::AC4 && Noisy && std::is_same_v<typename M::Source, uint8_t> && M::byteDest)
    z.bareFrom = width & ~3;
  return z;
}

template <typename M, LayoutCode L>
inline void orderedScalarPixel(const typename M::Source* s, typename M::Dest* d, int x, float t,
                               const QuantValues& qv, bool wrap) {
  constexpr int stride = LayoutOf<L>::stride;
  for (int c = 0; c < LayoutOf<L>::channels; ++c) {
    const std::ptrdiff_t at = std::ptrdiff_t(x) * stride + c;
    const int32_t v = orderedInteger<M>(orderedLevel(working(loadSample(s, at)), t, qv));
    if constexpr (M::byteDest) storeSample(d, at, wrap ? orderedWrappedByte(v) : orderedStore<M>(v));
    else storeSample(d, at, orderedStore<M>(v));
  }
}

template <typename M>
inline __m128i orderedLanes(const typename M::Source* s, __m128 t, const QuantValues& qv) {
  return orderedInteger4<M>(orderedLevel4(loadWorking4(s), t, qv));
}

// AVX2 blocks of 8 pixels of a C1 row below `end`; returns the pixels done.
template <typename M, bool Noisy>
ZEL_AVX2 int orderedC1Avx2(const typename M::Source* s, typename M::Dest* d, int end, int y, const QuantValues& qv,
                           const NoiseTables& tables) {
  constexpr Pack P = orderedPack<M>();
  const __m256 matrixRow = _mm256_broadcast_ps(reinterpret_cast<const __m128*>(kOrderedMatrix[y & 3]));
  const __m256 q = _mm256_set1_ps(qv.q);
  const __m256 plainThresholds = _mm256_mul_ps(q, matrixRow);
  int x = 0;
  for (; x + 16 <= end; x += 16) {
    __m256 t0 = plainThresholds, t1 = plainThresholds;
    if constexpr (Noisy) {
      float n[16];
      for (int k = 0; k < 16; ++k) n[k] = tables.values[noiseIndex(tables.randomIndex, x + k, y)];
      t0 = _mm256_mul_ps(_mm256_add_ps(_mm256_loadu_ps(n), matrixRow), q);
      t1 = _mm256_mul_ps(_mm256_add_ps(_mm256_loadu_ps(n + 8), matrixRow), q);
    }
    const __m256i a = orderedInteger8<M>(orderedLevel8(loadWorking8(s + x), t0, qv));
    const __m256i b = orderedInteger8<M>(orderedLevel8(loadWorking8(s + x + 8), t1, qv));
    storePacked16(d + x, pack16<P>(a, b));
  }
  return x;
}

// One row: pixels left to right, the channels of a pixel sharing its
// threshold. Vector blocks of 4 pixels (C1 with AVX2: 16), the rest one by
// one.
template <typename M, LayoutCode L, bool Noisy>
void orderedRow(const typename M::Source* s, typename M::Dest* d, int width, int y, const QuantValues& qv,
                const NoiseTables& tables, const OrderedZones& z, bool avx2) {
  constexpr Pack P = orderedPack<M>();
  const __m128 matrixRow = _mm_load_ps(kOrderedMatrix[y & 3]);
  const __m128 q = _mm_set1_ps(qv.q);
  const __m128 plainThresholds = _mm_mul_ps(q, matrixRow);
  auto noiseAt = [&](int x) { return tables.values[noiseIndex(tables.randomIndex, x, y)]; };
  int x = 0;
  if constexpr (L == LayoutCode::C1)
    if (avx2) x = orderedC1Avx2<M, Noisy>(s, d, z.vecEnd, y, qv, tables);
  for (; x < z.vecEnd; x += 4) {
    __m128 t = plainThresholds;
    if constexpr (Noisy)
      t = _mm_mul_ps(_mm_add_ps(_mm_setr_ps(noiseAt(x), noiseAt(x + 1), noiseAt(x + 2), noiseAt(x + 3)), matrixRow), q);
    if constexpr (L == LayoutCode::C1) {
      const __m128i v = orderedLanes<M>(s + x, t, qv);
      storePacked(d + x, pack8<P>(v, v), 4);
    } else if constexpr (L == LayoutCode::C3) {
      const auto* sp = s + 3 * x;
      auto* dp = d + 3 * x;
      const __m128i v0 = orderedLanes<M>(sp, _mm_shuffle_ps(t, t, _MM_SHUFFLE(1, 0, 0, 0)), qv);
      const __m128i v1 = orderedLanes<M>(sp + 4, _mm_shuffle_ps(t, t, _MM_SHUFFLE(2, 2, 1, 1)), qv);
      const __m128i v2 = orderedLanes<M>(sp + 8, _mm_shuffle_ps(t, t, _MM_SHUFFLE(3, 3, 3, 2)), qv);
      storePacked(dp, pack8<P>(v0, v1), 8);
      storePacked(dp + 8, pack8<P>(v2, v2), 4);
    } else {
      const auto* sp = s + 4 * x;
      auto* dp = d + 4 * x;
      const __m128i v0 = orderedLanes<M>(sp, _mm_shuffle_ps(t, t, 0x00), qv);
      const __m128i v1 = orderedLanes<M>(sp + 4, _mm_shuffle_ps(t, t, 0x55), qv);
      const __m128i v2 = orderedLanes<M>(sp + 8, _mm_shuffle_ps(t, t, 0xAA), qv);
      const __m128i v3 = orderedLanes<M>(sp + 12, _mm_shuffle_ps(t, t, 0xFF), qv);
      if constexpr (L == LayoutCode::C4) {
        storePacked(dp, pack8<P>(v0, v1), 8);
        storePacked(dp + 8, pack8<P>(v2, v3), 8);
      } else {
        storeThreeOfFour(dp, pack8<P>(v0, v1), 2);
        storeThreeOfFour(dp + 8, pack8<P>(v2, v3), 2);
      }
    }
  }
  for (; x < width; ++x) {
    float t;
    if constexpr (Noisy) t = x >= z.bareFrom ? kOrderedMatrix[y & 3][x & 3] : noisyOrderedThreshold(qv, noiseAt(x), x, y);
    else t = orderedThreshold(qv, x, y);
    orderedScalarPixel<M, L>(s, d, x, t, qv, x >= z.wrapFrom);
  }
}

// Rows top to bottom; with noise the thresholds are offsets in steps.
template <typename M, LayoutCode L, bool Noisy>
Status orderedDriver(const Image<typename M::Source, typename M::Dest>& im, int levels, int noise) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  const QuantValues qv = quantValues<Src>(levels);
  NoiseTables tables;
  if constexpr (Noisy) {
    const Status s = buildNoiseTables(tables, float(-noise) / 100.0f, float(noise) / 100.0f);
    if (s != StatusOk) return s;
  }
  const OrderedZones z = orderedZones<M, L, Noisy>(im.width);
  const bool avx2 = hasAvx2();
  const int srcStep = elementStep<Src>(im.srcStep), dstStep = elementStep<Dst>(im.dstStep);
  for (int y = 0; y < im.height; ++y)
    orderedRow<M, L, Noisy>(rowAt(im.src, srcStep, y), rowAt(im.dst, dstStep, y), im.width, y, qv, tables, z, avx2);
  if constexpr (Noisy) releaseNoiseTables(tables);
  return StatusOk;
}

}  // namespace zel::reduce
