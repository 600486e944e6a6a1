// Row kernels of the colour twist. A pixel's three samples come from one
// interleaved row (C3, AC4: the fourth sample is neither used nor changed)
// or from the same column of three planes.
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include "frame/simd.h"
#include "pixel_ops/twist_formulas.h"

namespace zel::twist {

enum Kind { Planar = 1, C3 = 3, AC4 = 4 };

// `src[k]`, `dst[k]`: the row of plane k, or the pixel row in [0]. Vector
// blocks of four pixels (eight from the AVX2 tier, sixteen from the 512-bit
// one in integer members; `tier` as the caller found the processor), then
// one pixel at a time; one formula for all.
template <typename T, int K>
void row(const T* const src[3], T* const dst[3], int width, const Matrix& m, VectorTier tier);

// Integer samples, sixteen pixels a block while whole blocks remain;
// returns the pixels done. Needs the 512-bit tier with byte permutes.
template <typename T, int K>
ZEL_AVX512_VBMI int blocks512(const T* const src[3], T* const dst[3], int width, const Matrix& m);

// True when no output of `m` can be NaN or reach 2^30 in magnitude for any
// samples of type T: the rounded outputs then stay inside the 32-bit range,
// and the saturating narrowing to T alone gives the clamped result.
template <typename T>
bool narrowingClamps(const Matrix& m) {
  constexpr double reach = std::is_signed_v<T> ? -double(std::numeric_limits<T>::min())
                                               : double(std::numeric_limits<T>::max());
  for (int i = 0; i < 3; ++i) {
    double weights = 0;
    for (int j = 0; j < 3; ++j) weights += std::fabs(double(m.t[i][j]));
    const double bound = std::fabs(double(m.t[i][3])) + reach * weights;
    if (!(bound < 1073741824.0)) return false;  // NaN and infinities too
  }
  return true;
}

// Three-channel floats over `pixels` pixels; `stream` writes the blocks
// with non-temporal stores (where the destination holds whole floats) and
// ends with a store fence. Blocks of four pixels, eight from the AVX2 tier
// and sixteen from the 512-bit one (`tier` as the caller found the
// processor).
void row32fC3(const float* src, float* dst, int64_t pixels, const Matrix& m, bool stream, VectorTier tier);

// Three-channel floats, sixteen pixels a block from pixel x while whole
// blocks remain; returns where the blocks stop. `Stream`: dst + 3 * x lies
// on a 64-byte boundary and every store is a whole non-temporal line.
template <bool Stream>
ZEL_AVX512 int64_t blocks32fC3(const float* src, float* dst, int64_t x, int64_t pixels, const Matrix& m);
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
