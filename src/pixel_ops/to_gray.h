// Row kernels of the colour-to-gray family. Each converts `width` pixels of
// C3 or AC4 samples into one gray sample each; the fourth sample of an AC4
// pixel is never used.
#pragma once

#include <cstdint>

#include "frame/simd.h"
#include "pixel_ops/gray_formulas.h"

namespace zel::gray {

// Pixels [0, blockEnd8(width)) take the 8u block form, the rest the tail
// form: C3 has blocks of 8 and one further block of 4, AC4 blocks of 8.
template <int Channels>
inline int blockEnd8(int width) {
  return Channels == 3 ? (width & ~3) : (width & ~7);
}
// 16s: blocks of 4 pixels saturate, the last width AND 3 wrap.
inline int blockEnd16s(int width) { return width & ~3; }

// `wide` lets the 8u kernels use their AVX2 blocks (the caller checks the
// processor); every other choice of blocks gives the same bits.
template <int Channels>
void row8u(const uint8_t* src, uint8_t* dst, int width, Weights8 w, bool wide);

// 16u, 16s and 32f: blocks of 4 pixels over [0, width AND NOT 3) (eight a
// block from the AVX2 tier, sixteen from the 512-bit one except in 32f C3,
// `tier` as the caller found the processor), then one pixel at a time.
template <int Channels>
void row16u(const uint16_t* src, uint16_t* dst, int width, WeightsF w, VectorTier tier);
template <int Channels>
void row16s(const int16_t* src, int16_t* dst, int width, WeightsF w, VectorTier tier);
template <int Channels>
void row32f(const float* src, float* dst, int width, WeightsF w, VectorTier tier);

// Float rows leave the caches more often than they fit: the wide blocks
// ask for their source this many bytes ahead of the block being read (an
// address past the row is only a hint, never touched).
constexpr int kPrefetchBytes = 4096;

// Sixteen pixels a block over [0, end) while whole blocks remain; returns
// the pixels done. T is uint16_t or int16_t, or float with four channels;
// each lane computes the four-pixel block form of its type.
template <typename T, int Channels>
ZEL_AVX512 int blocks512(const T* src, T* dst, int end, WeightsF w);

template <int Channels>
void row64f(const double* src, double* dst, int width, WeightsD w);

}  // namespace zel::gray
