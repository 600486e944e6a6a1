// The row drivers of the packed writers. Each walks the rows of a region
// and decides which pixels take which form; the vector blocks and the word
// reductions are those of packed_write_lanes.h. One driver serves a
// BGR-named and an RGB-named member (`redHigh`), and the plain and the
// dithered twins (`dither`). The drivers never check arguments.
#pragma once

#include <cstddef>
#include <cstdint>

#include "packed16/packed_write_fields.h"
#include "zelcc/zelcc.h"

namespace zel::pack {

// Destination rows of packed words, `words` words apart: a public function
// passes its byte step shifted right by one, so an odd step loses its low
// bit.
struct WordRows {
  uint16_t* base;
  int words;
  uint16_t* row(int y) const { return base + std::ptrdiff_t(y) * words; }
};

struct PackedTarget {
  Packing packing;
  bool redHigh;  // red in the top field: the BGR names
};

// Chroma planes at full resolution, half width, half width and height.
enum class PlaneChroma { Full, Half, HalfBoth };

// YCbCr planes, one formula everywhere.
void ycbcrPlanesToWords(PlaneChroma chroma, const uint8_t* const planes[3], const int steps[3], WordRows dst,
                        ImageSize size, PackedTarget target, bool dither, bool avx2);

// YCbCr 4:1:1 planes: the lane form below width AND NOT 3, the rounded
// 16.16 form for the last width AND 3 pixels.
void ycbcr411ToWords(const uint8_t* const planes[3], const int steps[3], WordRows dst, ImageSize size,
                     PackedTarget target, bool avx2);

// Interleaved Y, Cb, Cr bytes. Plain: lane form below width AND NOT 7, the
// truncating 16.16 form after it. Dithered: the lane form everywhere.
void ycbcrPixelsToWords(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, PackedTarget target,
                        bool dither, bool avx2);

// Y0 Cb Y1 Cr groups. Plain: lane form below width AND NOT 7, the offset
// form for the pairs after it, and a lone last pixel with the Cr of the
// pair before it by the truncating form; width 1 writes three unpacked
// bytes a row. Dithered: the lane form everywhere, a lone last pixel taking
// the byte after its Y as both chroma samples.
void ycbcrPairsToWords(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, PackedTarget target,
                       bool dither, bool avx2);

// YUV 4:2:0 planes. Plain: nothing at all when width or height is 1; the
// lane form on the even columns of the even rows, the 16.16 form on the last
// odd column and the last odd row. Dithered: the lane form everywhere.
void yuv420ToWords(const uint8_t* const planes[3], const int steps[3], WordRows dst, ImageSize size,
                   PackedTarget target, bool dither, bool avx2);

// Three bytes a pixel truncated into 565 words, the first byte low.
void bytesTo565Words(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, bool avx2);

}  // namespace zel::pack
