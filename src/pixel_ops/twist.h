// Row kernels of the colour twist. A pixel's three samples come from one
// interleaved row (C3, AC4: the fourth sample is neither used nor changed)
// or from the same column of three planes.
#pragma once

#include <cstdint>

#include "pixel_ops/twist_formulas.h"

namespace zel::twist {

enum Kind { Planar = 1, C3 = 3, AC4 = 4 };

// `src[k]`, `dst[k]`: the row of plane k, or the pixel row in [0]. Vector
// blocks of four pixels (eight with `wide`, the caller having checked for
// AVX2 in integer members), then one pixel at a time; one formula for all.
template <typename T, int K>
void row(const T* const src[3], T* const dst[3], int width, const Matrix& m, bool wide);

// Three-channel floats over `pixels` pixels; `stream` writes the blocks
// with non-temporal stores (where the destination holds whole floats) and
// ends with a store fence; `wide` takes blocks of eight pixels (the caller
// having checked for AVX2).
void row32fC3(const float* src, float* dst, int64_t pixels, const Matrix& m, bool stream, bool wide);
// Four-channel floats over `pixels` pixels.
void row32fC4(const float* src, float* dst, int64_t pixels, const Matrix& m);

// The integer members run with the rounding mode set to nearest and give
// the caller's mode back afterwards; the float members leave it alone.
class NearestRounding {
 public:
  NearestRounding();
  ~NearestRounding();
  NearestRounding(const NearestRounding&) = delete;
  NearestRounding& operator=(const NearestRounding&) = delete;

 private:
  unsigned saved_;
  bool changed_;
};

}  // namespace zel::twist
