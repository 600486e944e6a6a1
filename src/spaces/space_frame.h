// The frame shared by the XYZ, LUV, Lab and HSV families: the public
// function's checks, steps in bytes or in whole samples, sample access in
// the scalar tails, and the split of a row into vector blocks and a tail.
#pragma once

#include <cstdint>
#include <cstring>

#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "frame/stream_stores.h"
#include "spaces/row_stores.h"
#include "zelcc/zelcc.h"

namespace zel::spaces {

// Which lanes a block function runs on: four with SSE4.1, eight with AVX2,
// sixteen with the 512-bit tier. A block function without a 512-bit body
// takes eight lanes for Avx512.
enum class Lanes { Sse4, Avx2, Avx512 };

inline int laneCount(Lanes lanes) { return lanes == Lanes::Avx512 ? 16 : (lanes == Lanes::Avx2 ? 8 : 4); }
inline Lanes narrower(Lanes lanes) { return lanes == Lanes::Avx512 ? Lanes::Avx2 : Lanes::Sse4; }

// What every row of a call shares: the widest lanes the processor (and the
// tier cap) allow, and whether the float body streams its stores.
struct RowContext {
  Lanes widest = Lanes::Sse4;
  bool stream = false;
};

inline Lanes widestLanes() {
  return hasAvx512() ? Lanes::Avx512 : (hasAvx2() ? Lanes::Avx2 : Lanes::Sse4);
}

// Members whose float rows may stream: only where a frame is larger than
// the largest cache (its output would not be read back from there anyway).
enum class Streaming { Never, BeyondCache };

// Some members count their steps in samples: the byte step is shifted right
// arithmetically by log2 of the sample size, so odd bytes are dropped.
enum class StepUnit { Bytes, Samples };

template <typename T>
inline int effectiveStep(int step, StepUnit unit) {
  if (unit == StepUnit::Bytes || sizeof(T) == 1) return step;
  constexpr int shift = sizeof(T) == 2 ? 1 : 2;
  return (step >> shift) * int(sizeof(T));
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
// checked. `row(s, d, width, context)` converts one row of `width` pixels.
// `srcPixel` and `dstPixel` are the bytes of a pixel on either side (for
// the streaming decision).
template <Streaming Stream = Streaming::Never, typename S, typename D, typename Row>
inline Status convertImage(const S* src, int srcStep, D* dst, int dstStep, ImageSize size, StepUnit unit,
                           Row&& row, int srcPixel = 0, int dstPixel = 0) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const int ss = effectiveStep<S>(srcStep, unit), ds = effectiveStep<D>(dstStep, unit);
  RowContext context;
  context.widest = widestLanes();
  if constexpr (Stream == Streaming::BeyondCache)
    context.stream = context.widest != Lanes::Sse4 &&
                     streamsBeyondCache(int64_t(size.width) * size.height * (srcPixel + dstPixel));
  plainWalk(size.height, [&](int y) { row(rowAt(src, ss, y), rowAt(dst, ds, y), size.width, context); });
  if (context.stream) StreamStores::fence();
  return StatusOk;
}

// A row in two zones: pixels [0, width AND NOT (block - 1)) through the
// vector blocks, the widest lanes first and then narrower ones; the rest
// one by one through the tail formula. `blocks(lanes, s, d, n, how)`
// converts n pixels rounded down to its lane count, reads and stores them
// as `how` says and returns how many it did.
//
// A streaming row of three-float pixels is cut at its first aligned pixel:
// the pixels before it go as a part of one block, whole blocks stream from
// there, and the body pixels after the last whole block go as a part of
// one more. Every body pixel keeps the body formula. (Members that stream
// have a body at every lane width.)
template <int SrcStride, int DstStride, typename S, typename D, typename Blocks, typename Tail>
inline void splitRow(const S* s, D* d, int width, int block, const RowContext& context, Blocks&& blocks,
                     Tail&& tail) {
  const int body = bodyEnd(width, block);
  int x = 0;
  bool streamed = false;
  if constexpr (DstStride == 3 && sizeof(D) == 4) {
    if (context.stream) {
      const int group = laneCount(context.widest);
      const int head = pixelsToAlignment(d, 12, 4 * group);
      if (head >= 0 && head + group <= body) {
        if (head > 0) blocks(context.widest, s, d, group, RowStores{RowStores::Part, head});
        x = head;
        x += blocks(context.widest, s + x * SrcStride, d + x * DstStride, body - x, RowStores{RowStores::Stream, 0});
        if (x < body)
          blocks(context.widest, s + x * SrcStride, d + x * DstStride, group, RowStores{RowStores::Part, body - x});
        x = body;
        streamed = true;
      }
    }
  }
  if (!streamed)
    for (Lanes lanes = context.widest;; lanes = narrower(lanes)) {
      if (body - x >= 4) x += blocks(lanes, s + x * SrcStride, d + x * DstStride, body - x, RowStores{});
      if (lanes == Lanes::Sse4) break;
    }
  for (; x < width; ++x) tail(s + x * SrcStride, d + x * DstStride);
}

}  // namespace zel::spaces
