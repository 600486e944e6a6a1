// The shapes in which drivers walk the rows of a region. A driver decides
// which rows (or row pairs) a kernel sees; the kernel converts one row.
#pragma once

#include <utility>

#include "frame/allocate.h"
#include "frame/image_layout.h"
#include "zelcc/zelcc.h"

namespace zel {

// One image side: base pointer and byte step.
template <typename T>
struct Plane {
  T* base;
  int step;
  T* row(int y) const { return rowAt(base, step, y); }
};

template <typename T>
Plane<T> plane(T* base, int step) {
  return Plane<T>{base, step};
}

// Plain walk: rows 0 .. height-1, one kernel call each.
template <typename Row>
inline void plainWalk(int height, Row&& row) {
  for (int y = 0; y < height; ++y) row(y);
}

// Dual walk: one choice for the whole image between an aligned and an
// unaligned kernel of identical results.
template <typename Aligned, typename Unaligned>
inline void dualWalk(bool aligned, int height, Aligned&& alignedRow, Unaligned&& unalignedRow) {
  if (aligned)
    plainWalk(height, alignedRow);
  else
    plainWalk(height, unalignedRow);
}

// Whole-image loop: the fast form only when every pointer, step and the
// width are multiples of 16; both forms compute the same formula.
template <typename Fast, typename General>
inline void wholeImageLoop(bool allMultiplesOf16, int height, Fast&& fastRow, General&& generalRow) {
  dualWalk(allMultiplesOf16, height, fastRow, generalRow);
}

// Row-pair walk: height / 2 pairs (a last odd row is left to the family).
// The pair function receives the first luma row index and the chroma row.
template <typename Pair>
inline void rowPairWalk(int height, Pair&& pair) {
  for (int p = 0; p < height / 2; ++p) pair(2 * p, p);
}

// Buffered walk: a temporary buffer for the length of the call.
template <typename Body>
inline Status bufferedWalk16(int count, Body&& body) {
  int16_t* buffer = allocate16(count);
  if (!buffer) return StatusOutOfMemoryError;
  body(buffer);
  release(buffer);
  return StatusOk;
}

template <typename Body>
inline Status bufferedWalk32(int count, Body&& body) {
  int32_t* buffer = allocate32(count);
  if (!buffer) return StatusOutOfMemoryError;
  body(buffer);
  release(buffer);
  return StatusOk;
}

}  // namespace zel
