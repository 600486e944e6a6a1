// Row walking of the full-resolution YUV and Photo YCC members: plain walks
// over interleaved rows and over plane sets that share one step.
#pragma once

#include <cstddef>

#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "luma_chroma/vector_units.h"
#include "zelcc/zelcc.h"

namespace zel::lc {

inline bool sizeBelowOne(ImageSize size) { return size.width < 1 || size.height < 1; }

// Row y of each plane of a set with one common step.
template <typename T, int N>
struct PlaneRows {
  T* p[N];
  PlaneRows(T* const* base, int step, int y) {
    for (int k = 0; k < N; ++k) p[k] = rowAt(base[k], step, y);
  }
};

// Interleaved source and destination: the pointers, the size, then a plain
// walk; `row(src, dst, width, tier)` converts one row.
template <typename Row>
inline Status walkInterleaved(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, Row row) {
  if (!src || !dst) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  const VectorTier tier = zel::widestTierWithBytePermutes();
  plainWalk(size.height, [&](int y) { row(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, tier); });
  return StatusOk;
}

// The same with steps turned into element counts, step >> 1 for 16-bit
// samples and step >> 2 for 32-bit ones: an uneven step loses its low bits.
// `row(src, dst, width)` converts one row.
template <typename T, typename Row>
inline Status walkElements(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, Row row) {
  if (!src || !dst) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  constexpr int shift = sizeof(T) == 4 ? 2 : sizeof(T) == 2 ? 1 : 0;
  const std::ptrdiff_t srcElements = srcStep >> shift, dstElements = dstStep >> shift;
  plainWalk(size.height, [&](int y) { row(src + y * srcElements, dst + y * dstElements, size.width); });
  return StatusOk;
}

}  // namespace zel::lc
