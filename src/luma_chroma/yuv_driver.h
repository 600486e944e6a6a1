// Row walking of the full-resolution luma-chroma members: plain walks over
// interleaved rows and over plane sets that share one step.
#pragma once

#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "luma_chroma/yuv_rows.h"
#include "zelcc/zelcc.h"

namespace zel {

inline bool sizeBelowOne(ImageSize size) { return size.width < 1 || size.height < 1; }

// Row y of each plane of a set with one common step.
template <typename T, int N>
struct PlaneRows {
  T* p[N];
  PlaneRows(T* const* base, int step, int y) {
    for (int k = 0; k < N; ++k) p[k] = rowAt(base[k], step, y);
  }
};

template <typename T>
inline bool anyNull(T* const* planes, int count) {
  for (int k = 0; k < count; ++k)
    if (!planes[k]) return true;
  return false;
}

// Interleaved source and destination: the pointers, the size, then a plain
// walk; `row(src, dst, width, path)` converts one row.
template <typename Row>
inline Status walkInterleaved(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, Row row) {
  if (!src || !dst) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) { row(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, path); });
  return StatusOk;
}

}  // namespace zel
