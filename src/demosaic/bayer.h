// What the two demosaicing families share: the colour of a frame site, the
// frame as a view of unaligned samples, and the clipping of a region.
#pragma once

#include <cstdint>
#include <cstring>

#include "frame/image_layout.h"
#include "zelcc/zelcc.h"

namespace zel {

enum CfaColour : int { kRed = 0, kGreen = 1, kBlue = 2 };

// Colour of a site by grid kind and the parities of its frame row and column.
inline constexpr int8_t kCfaColours[4][2][2] = {{{kBlue, kGreen}, {kGreen, kRed}},   // CfaGridBGGR
                                                {{kRed, kGreen}, {kGreen, kBlue}},   // CfaGridRGGB
                                                {{kGreen, kBlue}, {kRed, kGreen}},   // CfaGridGBRG
                                                {{kGreen, kRed}, {kBlue, kGreen}}};  // CfaGridGRBG

inline int cfaColour(int grid, int x, int y) { return kCfaColours[grid][y & 1][x & 1]; }
inline bool isValidGrid(int grid) { return grid >= 0 && grid <= 3; }

// A whole mosaic frame: first sample, byte step, size.
template <typename T>
struct CfaFrame {
  const T* base;
  int step;
  int width, height;
  const T* row(int y) const { return rowAt(base, step, y); }
  int at(int x, int y) const { return loadSample(row(y) + x); }
};

// Reflection of a coordinate across the frame's edge, the edge sample being
// the axis: parity, and so the colour phase, is kept.
inline int reflectLow(int c) { return c < 0 ? -c : c; }
inline int reflectHigh(int c, int last) { return c > last ? 2 * last - c : c; }
inline int reflect(int c, int last) { return reflectHigh(reflectLow(c), last); }

// A region after clipping, in frame coordinates: [x0, x1) by [y0, y1).
struct ClippedRegion {
  int x0, y0, x1, y1;
  bool empty() const { return x1 <= x0 || y1 <= y0; }
  int width() const { return x1 - x0; }
  int height() const { return y1 - y0; }
};

// A negative origin is raised to 0 without shortening the region; the
// right and bottom are cut at the frame's edge.
inline ClippedRegion clipRegion(const CfaRegion& r, ImageSize frame) {
  const int64_t x0 = r.x < 0 ? 0 : r.x, y0 = r.y < 0 ? 0 : r.y;
  int64_t x1 = x0 + r.width, y1 = y0 + r.height;
  if (x1 > frame.width) x1 = frame.width;
  if (y1 > frame.height) y1 = frame.height;
  ClippedRegion c{int(x0 < frame.width ? x0 : frame.width), int(y0 < frame.height ? y0 : frame.height), 0, 0};
  c.x1 = x1 < c.x0 ? c.x0 : int(x1);
  c.y1 = y1 < c.y0 ? c.y0 : int(y1);
  return c;
}

}  // namespace zel
