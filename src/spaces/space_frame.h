// The frame shared by the XYZ, LUV, Lab and HSV families: the public
// function's checks, steps in bytes or in whole samples, sample access in
// the scalar tails, and the split of a row into vector blocks and a tail.
#pragma once

#include <cstdint>
#include <cstring>

#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "zelcc/zelcc.h"

namespace zel::spaces {

// Which lanes a block function runs on: four with SSE4.1, eight with AVX2.
enum class Lanes { Sse4, Avx2 };

// Some members count their steps in samples: the byte step is shifted right
// arithmetically by log2 of the sample size, so odd bytes are dropped.
enum class StepUnit { Bytes, Samples };

template <typename T>
inline int effectiveStep(int step, StepUnit unit) {
  if (unit == StepUnit::Bytes || sizeof(T) == 1) return step;
  constexpr int shift = sizeof(T) == 2 ? 1 : 2;
  return (step >> shift) * int(sizeof(T));
}

// Samples are read and written through bytes: rows of 16-bit and float
// samples may start at any address.
template <typename T>
inline T loadSample(const T* p) {
  T v;
  std::memcpy(&v, p, sizeof v);
  return v;
}
template <typename T>
inline void storeSample(T* p, T v) {
  std::memcpy(p, &v, sizeof v);
}

// Integer samples as levels: 8u and 16u as they are, 16s biased by 32768 so
// that -32768 is level 0.
inline int32_t level(const uint8_t* p) { return *p; }
inline int32_t level(const uint16_t* p) { return loadSample(p); }
inline int32_t level(const int16_t* p) { return int32_t(loadSample(p)) + 32768; }
// Back: the low bits of a level (a 16s sample has the bias taken off).
inline void storeLevel(uint8_t* p, int32_t v) { *p = uint8_t(v); }
inline void storeLevel(uint16_t* p, int32_t v) { storeSample(p, uint16_t(v)); }
inline void storeLevel(int16_t* p, int32_t v) { storeSample(p, int16_t(uint16_t(uint32_t(v) ^ 0x8000u))); }

// The public frame of these families: pointers, then size; steps are not
// checked. `row` converts one row of `width` pixels.
template <typename S, typename D, typename Row>
inline Status convertImage(const S* src, int srcStep, D* dst, int dstStep, ImageSize size, StepUnit unit,
                           Row&& row) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const int ss = effectiveStep<S>(srcStep, unit), ds = effectiveStep<D>(dstStep, unit);
  plainWalk(size.height, [&](int y) { row(rowAt(src, ss, y), rowAt(dst, ds, y), size.width); });
  return StatusOk;
}

// A row in two zones: pixels [0, width AND NOT (block - 1)) through the
// vector blocks, eight at a time with AVX2 where the processor has it and
// then four at a time; the rest one by one through the tail formula.
// `blocks(lanes, s, d, n)` converts n pixels rounded down to its lane count
// and returns how many it did.
template <int SrcStride, int DstStride, typename S, typename D, typename Blocks, typename Tail>
inline void splitRow(const S* s, D* d, int width, int block, Blocks&& blocks, Tail&& tail) {
  const int body = bodyEnd(width, block);
  int x = 0;
  if (body >= 8 && hasAvx2()) x = blocks(Lanes::Avx2, s, d, body);
  if (x < body) x += blocks(Lanes::Sse4, s + x * SrcStride, d + x * DstStride, body - x);
  for (; x < width; ++x) tail(s + x * SrcStride, d + x * DstStride);
}

}  // namespace zel::spaces
