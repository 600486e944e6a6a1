// Row kernels of the colour-to-gray family. Each converts `width` pixels of
// C3 or AC4 samples into one gray sample each; the fourth sample of an AC4
// pixel is never used.
#pragma once

#include <cstdint>

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
template <int Channels>
void row16u(const uint16_t* src, uint16_t* dst, int width, WeightsF w);
template <int Channels>
void row16s(const int16_t* src, int16_t* dst, int width, WeightsF w);
template <int Channels>
void row32f(const float* src, float* dst, int width, WeightsF w);
template <int Channels>
void row64f(const double* src, double* dst, int width, WeightsD w);

}  // namespace zel::gray
