// Row kernels of the readers of packed words. Each converts one row (or
// one row pair for 4:2:0) of `width` pixels, with its vector body, its
// further short blocks and its scalar tail exactly where the member's path
// split puts them; with `avx2` the body takes AVX2 blocks first (the same
// bits either way). W is a Words<Layout, RedHigh> of packed_read_lanes.h.
#pragma once

#include <cstdint>

#include "packed16/packed_fields.h"

namespace zel::unpack {

template <class L, bool RedHigh>
struct Words;

using Blue555 = Words<packed::Layout555, true>;
using Blue565 = Words<packed::Layout565, true>;
using Red565 = Words<packed::Layout565, false>;

// A row pair of 4:2:0: two source rows, two luma rows, one row of each
// chroma plane (Cb, Cr or U, V).
struct PairRows {
  const uint16_t* s0;
  const uint16_t* s1;
  uint8_t* y0;
  uint8_t* y1;
  uint8_t* c1;
  uint8_t* c2;
};

// One row of the 4:2:2 and 4:1:1 planes.
struct PlaneRow {
  const uint16_t* s;
  uint8_t* y;
  uint8_t* c1;
  uint8_t* c2;
};

// 565 words to three bytes a pixel, low field first: the same code for
// blue-low and red-low words.
void wordsToBytesRow(const uint16_t* src, uint8_t* dst, int width, bool avx2);

// Studio-range YCbCr.
template <class W>
void studio420Pair(const PairRows& rows, int width, bool avx2);
// The last odd row of 4:2:0: luma alone, by the tail formula.
template <class W>
void studioLumaRow(const uint16_t* src, uint8_t* y, int width);
template <class W>
void studio422PlanesRow(const PlaneRow& row, int width, bool avx2);
// Y0 Cb Y1 Cr pairs; an odd width ends with the last Y and its own Cb.
template <class W>
void studio422PairsRow(const uint16_t* src, uint8_t* dst, int width, bool avx2);
template <class W>
void studio411Row(const PlaneRow& row, int width, bool avx2);

// Full-range YUV 4:2:0 of blue-low words: the even part of the pair only.
template <class W>
void yuv420Pair(const PairRows& rows, int width, bool avx2);
// Full-range YUV of red-low 565 words, 4:2:0 and 4:2:2: the even part only.
void yuvRedLow420Pair(const PairRows& rows, int width, bool avx2);
void yuvRedLow422Row(const PlaneRow& row, int width, bool avx2);

}  // namespace zel::unpack
