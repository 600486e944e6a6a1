#include "demosaic/ahd.h"

#include <algorithm>
#include <cstddef>

#include "frame/export.h"

namespace zel {

int ahdTiles(const ClippedRegion& r, ImageSize frame, int grid, AhdTile out[5]) {
  const int x0 = r.x0, y0 = r.y0, rw = r.width(), rh = r.height();
  int ix = std::max(x0, 5), iy = std::max(y0, 5);
  int iw = std::min(frame.width - 5, x0 + rw) - ix;
  int ih = std::min(frame.height - 5, y0 + rh) - iy;
  // Move the interior's first pixel onto a red site; sizes become even.
  const int first = cfaColour(grid, ix, iy);
  if (first == kBlue || (first == kGreen && cfaColour(grid, ix + 1, iy) == kRed)) ++ix, --iw;
  if (cfaColour(grid, ix, iy) == kGreen) ++iy, --ih;
  iw &= ~1;
  ih &= ~1;

  const AhdTile candidates[5] = {{ix, iy, iw, ih},
                                 {x0, y0, rw, iy - y0},
                                 {x0, iy + ih, rw, (y0 + rh) - (iy + ih)},
                                 {x0, iy, ix - x0, ih},
                                 {ix + iw, iy, (x0 + rw) - (ix + iw), ih}};
  int n = 0;
  for (const AhdTile& t : candidates) {
    if (t.width < 1 || t.height < 1) continue;
    // Tiles may reach outside the region (small frames, regions within the
    // first rows or columns); only the region's pixels are made.
    const int left = std::max(t.x, r.x0), right = std::min(t.x + t.width, r.x1);
    const int top = std::max(t.y, r.y0), bottom = std::min(t.y + t.height, r.y1);
    if (right > left && bottom > top) out[n++] = AhdTile{left, top, right - left, bottom - top};
  }
  return n;
}

namespace {

// A coordinate outside the frame is reflected across the edge, the edge
// sample being the axis; the reflection repeats only in frames of 5, where
// the widest taps reach one further than a single one can bring back.
inline int reflectInto(int c, int last) {
  for (;;) {
    if (c < 0) c = -c;
    else if (c > last) c = 2 * last - c;
    else return c;
  }
}

// The row pipeline of one tile. Rows of the planes live in rings in the
// scratch, at frame columns from tile x - 3 on:
//   green, per direction, 4 rows: tile columns -3 .. width + 2
//   red and blue, per direction, 3 rows each: -2 .. width + 1
//   homogeneity differences, 3 rows: -1 .. width
template <typename T>
class AhdRows {
 public:
  AhdRows(const CfaFrame<T>& f, int grid, const AhdTile& t, uint8_t* tmp, int tmpStep)
      : f_(f), grid_(grid), t_(t), origin_(t.x - 3), tmp_(tmp), tmpStep_(tmpStep) {}

  void run(T* dst, int dstStep, int originX, int originY) {
    int greenNext = t_.y - 3, colourNext = t_.y - 2, homNext = t_.y - 1;
    for (int y = t_.y; y < t_.y + t_.height; ++y) {
      for (; homNext <= y + 1; ++homNext) {
        for (; colourNext <= homNext + 1; ++colourNext) {
          for (; greenNext <= colourNext + 1; ++greenNext) {
            greenRowH(greenNext);
            greenRowV(greenNext);
          }
          colourRow(kH, colourNext);
          colourRow(kV, colourNext);
        }
        homogeneityRow(homNext);
      }
      outputRow(y, rowAt(dst, dstStep, y - originY) + 3 * (t_.x - originX));
    }
  }

 private:
  static constexpr int kTop = sizeof(T) == 1 ? 255 : 65535;
  static constexpr int kH = 0, kV = 1;

  static int ring(int y, int n) {
    const int m = y % n;
    return m < 0 ? m + n : m;
  }
  T* scratch(int k) const { return reinterpret_cast<T*>(tmp_ + std::ptrdiff_t(k) * tmpStep_); }
  T* green(int d, int y) const { return scratch(d * 4 + ring(y, 4)); }
  T* red(int d, int y) const { return scratch(8 + d * 3 + ring(y, 3)); }
  T* blue(int d, int y) const { return scratch(14 + d * 3 + ring(y, 3)); }
  T* homDiff(int y) const { return scratch(20 + ring(y, 3)); }

  int get(const T* row, int c) const { return loadSample(row + (c - origin_)); }
  void put(T* row, int c, int v) const { storeSample(row + (c - origin_), T(v)); }
  int getSigned(const T* row, int c) const {
    return sizeof(T) == 1 ? int(int8_t(get(row, c))) : int(int16_t(get(row, c)));
  }

  const T* sourceRow(int y) const { return f_.row(reflectInto(y, f_.height - 1)); }
  int sample(const T* row, int c) const { return loadSample(row + reflectInto(c, f_.width - 1)); }
  int colour(int c, int y) const { return cfaColour(grid_, c, y); }

  void greenRowH(int y) {
    T* out = green(kH, y);
    const T* s = sourceRow(y);
    for (int c = t_.x - 3; c < t_.x + t_.width + 3; ++c) {
      const int centre = sample(s, c);
      put(out, c,
          colour(c, y) == kGreen
              ? centre
              : greenAlong(centre, sample(s, c - 2), sample(s, c + 2), sample(s, c - 1), sample(s, c + 1)));
    }
  }

  void greenRowV(int y) {
    T* out = green(kV, y);
    const T *up2 = sourceRow(y - 2), *up = sourceRow(y - 1), *s = sourceRow(y), *down = sourceRow(y + 1),
            *down2 = sourceRow(y + 2);
    for (int c = t_.x - 3; c < t_.x + t_.width + 3; ++c) {
      const int centre = sample(s, c);
      put(out, c,
          colour(c, y) == kGreen
              ? centre
              : greenAlong(centre, sample(up2, c), sample(down2, c), sample(up, c), sample(down, c)));
    }
  }

  void colourRow(int d, int y) {
    const T *gUp = green(d, y - 1), *g = green(d, y), *gDown = green(d, y + 1);
    const T *sUp = sourceRow(y - 1), *s = sourceRow(y), *sDown = sourceRow(y + 1);
    T *outR = red(d, y), *outB = blue(d, y);
    for (int c = t_.x - 2; c < t_.x + t_.width + 2; ++c) {
      const int own = colour(c, y), g0 = get(g, c);
      int r, b;
      if (own == kGreen) {
        const int alongRow = colourFromPair(g0, sample(s, c - 1) + sample(s, c + 1), get(g, c - 1) + get(g, c + 1), kTop);
        const int alongColumn = colourFromPair(g0, sample(sUp, c) + sample(sDown, c), get(gUp, c) + get(gDown, c), kTop);
        const bool redRow = colour(c + 1, y) == kRed;
        r = redRow ? alongRow : alongColumn;
        b = redRow ? alongColumn : alongRow;
      } else {
        const int other = colourFromDiagonals(
            g0, sample(sUp, c - 1) + sample(sUp, c + 1) + sample(sDown, c - 1) + sample(sDown, c + 1),
            get(gUp, c - 1) + get(gUp, c + 1) + get(gDown, c - 1) + get(gDown, c + 1), kTop);
        r = own == kRed ? sample(s, c) : other;
        b = own == kRed ? other : sample(s, c);
      }
      put(outR, c, r);
      put(outB, c, b);
    }
  }

  LumaChroma lumaAt(int d, int c, int y) const {
    return lumaChroma(get(red(d, y), c), get(green(d, y), c), get(blue(d, y), c));
  }

  // Each luma-chroma value of row y is made once, in a window of three
  // columns that slides along the row.
  void homogeneityRow(int y) {
    T* out = homDiff(y);
    Neighbourhood n[2];
    for (int d = 0; d < 2; ++d) {
      n[d].left = lumaAt(d, t_.x - 2, y);
      n[d].centre = lumaAt(d, t_.x - 1, y);
    }
    for (int c = t_.x - 1; c < t_.x + t_.width + 1; ++c) {
      for (int d = 0; d < 2; ++d) {
        n[d].right = lumaAt(d, c + 1, y);
        n[d].up = lumaAt(d, c, y - 1);
        n[d].down = lumaAt(d, c, y + 1);
      }
      put(out, c, homogeneityDifference(n[kH], n[kV]));
      for (int d = 0; d < 2; ++d) {
        n[d].left = n[d].centre;
        n[d].centre = n[d].right;
      }
    }
  }

  // The running choice starts with H at each row of the tile; a non-zero
  // window sum decides, a zero sum repeats the last decision.
  void outputRow(int y, T* out) {
    const T *up = homDiff(y - 1), *mid = homDiff(y), *down = homDiff(y + 1);
    auto columnSum = [&](int c) { return getSigned(up, c) + getSigned(mid, c) + getSigned(down, c); };
    int before = columnSum(t_.x - 1), here = columnSum(t_.x);
    int t = 1;
    for (int c = t_.x; c < t_.x + t_.width; ++c) {
      const int after = columnSum(c + 1);
      const int sum = before + here + after;
      if (sum != 0) t = sum;
      const int d = t < 0 ? kV : kH;
      T* px = out + 3 * (c - t_.x);
      storeSample(px, T(get(red(d, y), c)));
      storeSample(px + 1, T(get(green(d, y), c)));
      storeSample(px + 2, T(get(blue(d, y), c)));
      before = here;
      here = after;
    }
  }

  const CfaFrame<T>& f_;
  int grid_;
  AhdTile t_;
  int origin_;
  uint8_t* tmp_;
  int tmpStep_;
};

}  // namespace

template <typename T>
void ahdTile(const CfaFrame<T>& f, int grid, const AhdTile& tile, T* dst, int dstStep, int originX, int originY,
             uint8_t* tmp, int tmpStep) {
  AhdRows<T>(f, grid, tile, tmp, tmpStep).run(dst, dstStep, originX, originY);
}

template void ahdTile<uint8_t>(const CfaFrame<uint8_t>&, int, const AhdTile&, uint8_t*, int, int, int, uint8_t*, int);
template void ahdTile<uint16_t>(const CfaFrame<uint16_t>&, int, const AhdTile&, uint16_t*, int, int, int, uint8_t*,
                                int);

namespace {

// The public frame. Checks: pointers, frame size (at least 5 by 5), grid
// kind; the scratch is the caller's and is not checked.
template <typename T>
Status demosaicAhd(const T* src, CfaRegion region, ImageSize frame, int srcStep, T* dst, int dstStep, int grid,
                   uint8_t* tmp, int tmpStep) {
  if (!src || !dst) return StatusNullPointerError;
  if (frame.width < 5 || frame.height < 5) return StatusSizeError;
  if (!isValidGrid(grid)) return StatusBadArgumentError;
  // The 16-bit member's destination step counts whole samples.
  if constexpr (sizeof(T) == 2) dstStep = dstStep / 2 * 2;
  const ClippedRegion r = clipRegion(region, frame);
  if (r.empty()) return StatusOk;
  const CfaFrame<T> f{src, srcStep, frame.width, frame.height};
  AhdTile tiles[5];
  const int n = ahdTiles(r, frame, grid, tiles);
  for (int i = 0; i < n; ++i) ahdTile(f, grid, tiles[i], dst, dstStep, r.x0, r.y0, tmp, tmpStep);
  return StatusOk;
}

}  // namespace

}  // namespace zel

ZEL_PUBLIC Status zeliDemosaicAHD_8u_C1C3R(const uint8_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                           uint8_t* dst, int dstStep, int grid, uint8_t* tmp, int tmpStep) {
  return zel::demosaicAhd(src, srcRegion, srcSize, srcStep, dst, dstStep, grid, tmp, tmpStep);
}
ZEL_PUBLIC Status zeliDemosaicAHD_16u_C1C3R(const uint16_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                            uint16_t* dst, int dstStep, int grid, uint8_t* tmp, int tmpStep) {
  return zel::demosaicAhd(src, srcRegion, srcSize, srcStep, dst, dstStep, grid, tmp, tmpStep);
}
