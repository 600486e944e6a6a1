#include "test_card.h"

#include <algorithm>
#include <cmath>

namespace zel::tool {

namespace {

constexpr double kPi = 3.14159265358979323846;

struct Rgb {
  double r, g, b;  // 0..1
};

Rgb hueColour(double h) {  // h in 0..1, full saturation and value
  const double s = h * 6.0;
  const int sector = std::min(int(s), 5);
  const double f = s - sector;
  switch (sector) {
    case 0: return {1, f, 0};
    case 1: return {1 - f, 1, 0};
    case 2: return {0, 1, f};
    case 3: return {0, 1 - f, 1};
    case 4: return {f, 0, 1};
    default: return {1, 0, 1 - f};
  }
}

Rgb gray(double v) { return {v, v, v}; }

// The card's colour at (x, y). Bands from the top, in twentieths of the
// height: bars 0-7, gray ramp 8-9, hue sweep 10-11, fine detail 12-15,
// gray steps 16-19.
Rgb cardColour(int x, int y, int width, int height) {
  const int band = int(int64_t(y) * 20 / height);
  const double u = width > 1 ? double(x) / (width - 1) : 0.0;
  if (band < 8) {
    static const Rgb bars[8] = {{1, 1, 1}, {1, 1, 0}, {0, 1, 1}, {0, 1, 0}, {1, 0, 1}, {1, 0, 0}, {0, 0, 1}, {0, 0, 0}};
    return bars[int(int64_t(x) * 8 / width)];
  }
  if (band < 10) return gray(u);
  if (band < 12) return hueColour(width > 1 ? double(x) / width : 0.0);
  if (band < 16) {
    // Six cells: 1-pixel columns, 2-pixel columns, 1-pixel rows, a 1-pixel
    // checkerboard, diagonals, a zone plate up to the finest frequency.
    const int cell = int(int64_t(x) * 6 / width);
    switch (cell) {
      case 0: return gray(x & 1);
      case 1: return gray((x >> 1) & 1);
      case 2: return gray(y & 1);
      case 3: return gray((x ^ y) & 1);
      case 4: return gray(((x + y) & 3) < 2 ? 1.0 : 0.0);
      default: {
        const int top = int((int64_t(height) * 12 + 19) / 20), bottom = int((int64_t(height) * 16 + 19) / 20);
        const int left = int((int64_t(width) * 5 + 5) / 6);
        const double cx = (left + width - 1) / 2.0, cy = (top + bottom - 1) / 2.0;
        const double reach = std::max({width - left, bottom - top, 2}) / 2.0;
        const double dx = x - cx, dy = y - cy;
        return gray(0.5 + 0.5 * std::cos(kPi * (dx * dx + dy * dy) / (2.0 * reach)));
      }
    }
  }
  return gray(double(int64_t(x) * 11 / width) / 10.0);
}

uint16_t toWide(double v) { return uint16_t(std::lround(std::clamp(v, 0.0, 1.0) * 65535.0)); }

}  // namespace

Picture makeTestCard(int width, int height) {
  checkDimensions(width, height, "the test card");
  Picture p(width, height, 3, 16);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      const Rgb c = cardColour(x, y, width, height);
      p.at(x, y, 0) = toWide(c.r);
      p.at(x, y, 1) = toWide(c.g);
      p.at(x, y, 2) = toWide(c.b);
    }
  return p;
}

int bayerColour(int grid, int x, int y) {
  // The top left 2 by 2 block of each grid kind, row by row.
  static const int kBlocks[4][4] = {{2, 1, 1, 0}, {0, 1, 1, 2}, {1, 2, 0, 1}, {1, 0, 2, 1}};
  return kBlocks[grid & 3][(y & 1) * 2 + (x & 1)];
}

Picture bayerMosaic(const Picture& picture, int grid) {
  Picture out(picture.width, picture.height, 1, picture.depth);
  for (int y = 0; y < picture.height; ++y)
    for (int x = 0; x < picture.width; ++x)
      out.at(x, y, 0) = picture.hasColour() ? picture.at(x, y, bayerColour(grid, x, y)) : picture.at(x, y, 0);
  return out;
}

}  // namespace zel::tool
