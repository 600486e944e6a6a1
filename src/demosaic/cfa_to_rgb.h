// Bayer mosaic to RGB by bilinear means with an edge test for green. The
// interior of the frame (two samples away from every edge) tests gradients
// of the site's own colour; the two outermost rows and columns take the
// plain four-neighbour mean, with neighbours outside the frame mirrored
// across its edge. Every mean rounds; sums are exact.
#pragma once

#include <cstdint>

#include "demosaic/bayer.h"

namespace zel {

inline int roundedMean2(int a, int b) { return (a + b + 1) >> 1; }
inline int roundedMean4(int a, int b, int c, int d) { return (a + b + c + d + 2) >> 2; }
inline int absDifference(int a, int b) { return a > b ? a - b : b - a; }

// Green at a red or blue interior site: along the flatter of the column
// and the row of the site's own colour, or all four neighbours on a tie.
inline int greenByGradient(int up2, int down2, int left2, int right2, int up, int down, int left, int right) {
  const int dV = absDifference(up2, down2);
  const int dH = absDifference(left2, right2);
  if (dV < dH) return roundedMean2(up, down);
  if (dV > dH) return roundedMean2(left, right);
  return roundedMean4(up, left, right, down);
}

// Neighbour reads of one pixel; the border form mirrors at the frame edge.
template <typename T>
struct InteriorTaps {
  const CfaFrame<T>& f;
  int x, y;
  int operator()(int dx, int dy) const { return f.at(x + dx, y + dy); }
};
template <typename T>
struct MirroredTaps {
  const CfaFrame<T>& f;
  int x, y;
  int operator()(int dx, int dy) const { return f.at(reflect(x + dx, f.width - 1), reflect(y + dy, f.height - 1)); }
};

// One output pixel, R G B. Interior sites test gradients; border sites do not.
template <typename T, bool Interior, typename Taps>
inline void cfaPixel(const Taps& s, int colour, int rowOther, T* rgb) {
  int c[3];
  if (colour == kGreen) {
    c[kGreen] = s(0, 0);
    c[rowOther] = roundedMean2(s(-1, 0), s(1, 0));
    c[2 - rowOther] = roundedMean2(s(0, -1), s(0, 1));
  } else {
    c[colour] = s(0, 0);
    c[2 - colour] = roundedMean4(s(-1, -1), s(1, -1), s(-1, 1), s(1, 1));
    if constexpr (Interior)
      c[kGreen] = greenByGradient(s(0, -2), s(0, 2), s(-2, 0), s(2, 0), s(0, -1), s(0, 1), s(-1, 0), s(1, 0));
    else
      c[kGreen] = roundedMean4(s(0, -1), s(-1, 0), s(1, 0), s(0, 1));
  }
  for (int k = 0; k < 3; ++k) storeSample(rgb + k, T(c[k]));
}

template <typename T>
inline void cfaInteriorPixel(const CfaFrame<T>& f, int grid, int x, int y, T* rgb) {
  cfaPixel<T, true>(InteriorTaps<T>{f, x, y}, cfaColour(grid, x, y), cfaColour(grid, x + 1, y), rgb);
}
template <typename T>
inline void cfaBorderPixel(const CfaFrame<T>& f, int grid, int x, int y, T* rgb) {
  cfaPixel<T, false>(MirroredTaps<T>{f, x, y}, cfaColour(grid, x, y), cfaColour(grid, x + 1, y), rgb);
}

// Interior pixels x .. x + count - 1 of frame row y into `rgb`: scalar, or
// vector blocks (16 pixels of 8 bits or 8 of 16 bits, twice that with AVX2)
// and a scalar tail. All give the same values. The row and its two
// neighbours on each side must lie in the frame, and so must columns
// x - 2 .. x + count + 1.
template <typename T>
void cfaInteriorRowScalar(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb);
template <typename T>
void cfaInteriorRowSse(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb);
template <typename T>
void cfaInteriorRowAvx2(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb);

}  // namespace zel
