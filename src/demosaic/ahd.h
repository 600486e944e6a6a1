// Adaptive homogeneity-directed demosaicing. Every pixel is rebuilt twice,
// with green interpolated along the row (H) and along the column (V); a
// count of homogeneous neighbours in a luma-chroma space, summed over a 3 by
// 3 window, picks one of the two whole. Integer arithmetic throughout,
// arithmetic shifts without rounding terms.
#pragma once

#include <cstdint>
#include <initializer_list>

#include "demosaic/bayer.h"

namespace zel {

// Green at a red or blue site from centre c, the same colour two away on
// each side (a, b) and the greens next to it (l, r), held between l and r.
inline int greenAlong(int c, int a, int b, int l, int r) {
  const int e = ((l + r) >> 1) + (((c - a) + (c - b)) >> 2);
  const int lo = l < r ? l : r, hi = l < r ? r : l;
  return e < lo ? lo : (e > hi ? hi : e);
}

inline int clampSample(int v, int top) { return v < 0 ? 0 : (v > top ? top : v); }

// A colour at a green site from its two neighbours of that colour: the
// green plane plus the mean colour difference of the neighbours.
inline int colourFromPair(int green, int sampleSum, int greenSum, int top) {
  return clampSample(green + ((sampleSum - greenSum) >> 1), top);
}
// The opposite colour at a red or blue site from the four diagonals.
inline int colourFromDiagonals(int green, int sampleSum, int greenSum, int top) {
  return clampSample(green + ((sampleSum - greenSum) >> 2), top);
}

struct LumaChroma {
  int32_t y, cb, cr;
};

inline LumaChroma lumaChroma(int r, int g, int b) {
  return LumaChroma{(66 * r + 129 * g + 25 * b + 128) >> 8, (-38 * r - 74 * g + 112 * b + 128) >> 8,
                    (112 * r - 94 * g - 18 * b + 128) >> 8};
}

inline int32_t lumaDistance(const LumaChroma& a, const LumaChroma& b) { return a.y > b.y ? a.y - b.y : b.y - a.y; }
// Squares and sum wrap at 32 bits (16-bit images with strong colour edges
// overflow); the result compares as signed.
inline int32_t chromaDistance(const LumaChroma& a, const LumaChroma& b) {
  const uint32_t db = uint32_t(a.cb - b.cb), dr = uint32_t(a.cr - b.cr);
  return int32_t(db * db + dr * dr);
}

// Homogeneity of H minus that of V at one pixel, from the luma-chroma of
// the pixel and its left, right, upper and lower neighbours in each
// direction: -4..4.
struct Neighbourhood {
  LumaChroma centre, left, right, up, down;
};

inline int homogeneityDifference(const Neighbourhood& h, const Neighbourhood& v) {
  auto larger = [](int32_t a, int32_t b) { return a > b ? a : b; };
  auto smaller = [](int32_t a, int32_t b) { return a < b ? a : b; };
  const int32_t epsY = smaller(larger(lumaDistance(h.left, h.centre), lumaDistance(h.right, h.centre)),
                               larger(lumaDistance(v.up, v.centre), lumaDistance(v.down, v.centre)));
  const int32_t epsC = smaller(larger(chromaDistance(h.left, h.centre), chromaDistance(h.right, h.centre)),
                               larger(chromaDistance(v.up, v.centre), chromaDistance(v.down, v.centre)));
  auto count = [&](const Neighbourhood& n) {
    int k = 0;
    for (const LumaChroma* m : {&n.left, &n.right, &n.up, &n.down})
      k += lumaDistance(*m, n.centre) <= epsY && chromaDistance(*m, n.centre) <= epsC;
    return k;
  };
  return count(h) - count(v);
}

// A rectangle of the frame, made as one tile.
struct AhdTile {
  int x, y, width, height;
};

// The tiles of a clipped region, in the order they are made: interior,
// top, bottom, left, right. Each is cut to the region; empty ones are left
// out. Returns the count.
int ahdTiles(const ClippedRegion& r, ImageSize frame, int grid, AhdTile out[5]);

// Makes one tile of the frame into `dst` (the pixel of frame position
// (origin x, origin y)) through the scratch rows of `tmp`.
template <typename T>
void ahdTile(const CfaFrame<T>& f, int grid, const AhdTile& tile, T* dst, int dstStep, int originX, int originY,
             uint8_t* tmp, int tmpStep);

}  // namespace zel
