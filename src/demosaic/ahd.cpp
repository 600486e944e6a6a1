#include "demosaic/ahd.h"

#include <algorithm>
#include <cstddef>

#include "demosaic/ahd_kernels.h"
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
    if (c < 0)
      c = -c;
    else if (c > last)
      c = 2 * last - c;
    else
      return c;
  }
}

// The row pipeline of one tile. Rows of the planes live in rings in the
// scratch, at frame columns from tile x - 3 on; the homogeneity differences
// are made two rows at a time, which needs one row more of each ring than
// single rows would, 30 rows in all:
//   green, per direction, 5 rows: tile columns -3 .. width + 2
//   red and blue, per direction, 4 rows each: -2 .. width + 1
//   homogeneity differences, 4 rows: -1 .. width
// Reads of the mosaic outside the frame are reflected: near the frame's
// left and right edges the samples are gathered into a short reflected row
// first, elsewhere the kernels read the frame directly.
template <typename T>
class AhdRows {
 public:
  AhdRows(const CfaFrame<T>& f, int grid, const AhdTile& t, uint8_t* tmp, int tmpStep)
      : f_(f), grid_(grid), t_(t), origin_(t.x - 3), tmp_(tmp), tmpStep_(tmpStep), level_(bestVectorLevel()) {}

  void run(T* dst, int dstStep, int originX, int originY) {
    const int bottom = t_.y + t_.height;  // the last row of differences the tile needs
    int greenNext = t_.y - 3, colourNext = t_.y - 2, homNext = t_.y - 1;
    for (int y = t_.y; y < bottom; ++y) {
      while (homNext <= y + 1) {
        const int rows = homNext < bottom ? 2 : 1;
        for (; colourNext <= homNext + rows; ++colourNext) {
          for (; greenNext <= colourNext + 1; ++greenNext) greenRows(greenNext);
          colourRows(kH, colourNext);
          colourRows(kV, colourNext);
        }
        homogeneityRows(homNext, rows);
        homNext += rows;
      }
      outputRow(y, rowAt(dst, dstStep, y - originY) + 3 * (t_.x - originX));
    }
  }

 private:
  static constexpr int kH = 0, kV = 1;
  static constexpr int kPiece = 16;  // columns gathered at a time near an edge
  // Columns of differences made at a time: with the one more on either side
  // the luma-chroma rows take whole vector blocks.
  static constexpr int kChunk = sizeof(T) == 1 ? 254 : 126;

  static int ring(int y, int n) {
    const int m = y % n;
    return m < 0 ? m + n : m;
  }
  T* scratch(int k) const { return reinterpret_cast<T*>(tmp_ + std::ptrdiff_t(k) * tmpStep_); }
  // Plane rows, addressed by frame column.
  T* green(int d, int y) const { return scratch(d * 5 + ring(y, 5)) - origin_; }
  T* red(int d, int y) const { return scratch(10 + d * 4 + ring(y, 4)) - origin_; }
  T* blue(int d, int y) const { return scratch(18 + d * 4 + ring(y, 4)) - origin_; }
  T* homDiff(int y) const { return scratch(26 + ring(y, 4)) - origin_; }

  const T* sourceRow(int y) const { return f_.row(reflectInto(y, f_.height - 1)); }
  bool greenAt(int c, int y) const { return cfaColour(grid_, c, y) == kGreen; }
  bool redRow(int y) const {
    const int c = cfaColour(grid_, 0, y);
    return (c == kGreen ? cfaColour(grid_, 1, y) : c) == kRed;
  }

  // Columns [lo, hi) of a kernel whose taps reach `reach` samples to either
  // side: directly where the taps stay in the frame, else gathered.
  template <typename Direct, typename Gathered>
  void walkColumns(int lo, int hi, int reach, Direct direct, Gathered gathered) const {
    const int a = std::min(std::max(lo, reach), hi);
    const int b = std::min(std::max(f_.width - reach, a), hi);
    for (int c = lo; c < a; c += kPiece) gathered(c, std::min(a, c + kPiece));
    if (b > a) direct(a, b);
    for (int c = b; c < hi; c += kPiece) gathered(c, std::min(hi, c + kPiece));
  }
  // Samples of columns from-reach .. to+reach-1 of a row, reflected.
  void gather(const T* row, int from, int to, int reach, T* out) const {
    for (int c = from - reach; c < to + reach; ++c)
      out[c - from + reach] = loadSample(row + reflectInto(c, f_.width - 1));
  }

  void greenRows(int y) {
    const int lo = t_.x - 3, hi = t_.x + t_.width + 3;
    const T* s = sourceRow(y);
    auto along = [&](const T* p, int a, int b) {
      greenRow(GreenTaps<T>{p, p - 2, p + 2, p - 1, p + 1}, b - a, greenAt(a, y), green(kH, y) + a, level_);
    };
    walkColumns(
        lo, hi, 2, [&](int a, int b) { along(s + a, a, b); },
        [&](int a, int b) {
          T row[kPiece + 4];
          gather(s, a, b, 2, row);
          along(row + 2, a, b);
        });
    const T* rows[5] = {sourceRow(y - 2), sourceRow(y - 1), s, sourceRow(y + 1), sourceRow(y + 2)};
    auto across = [&](const T* const p[5], int a, int b) {
      greenRow(GreenTaps<T>{p[2], p[0], p[4], p[1], p[3]}, b - a, greenAt(a, y), green(kV, y) + a, level_);
    };
    walkColumns(
        lo, hi, 0,
        [&](int a, int b) {
          const T* p[5] = {rows[0] + a, rows[1] + a, rows[2] + a, rows[3] + a, rows[4] + a};
          across(p, a, b);
        },
        [&](int a, int b) {
          T buffer[5][kPiece];
          const T* p[5];
          for (int k = 0; k < 5; ++k) gather(rows[k], a, b, 0, buffer[k]), p[k] = buffer[k];
          across(p, a, b);
        });
  }

  void colourRows(int d, int y) {
    const T* rows[3] = {sourceRow(y - 1), sourceRow(y), sourceRow(y + 1)};
    auto run = [&](const T* const p[3], int a, int b) {
      const ColourTaps<T> taps{green(d, y - 1) + a, green(d, y) + a, green(d, y + 1) + a, p[0], p[1], p[2]};
      colourRow(taps, b - a, greenAt(a, y), redRow(y), red(d, y) + a, blue(d, y) + a, level_);
    };
    walkColumns(
        t_.x - 2, t_.x + t_.width + 2, 1,
        [&](int a, int b) {
          const T* p[3] = {rows[0] + a, rows[1] + a, rows[2] + a};
          run(p, a, b);
        },
        [&](int a, int b) {
          T buffer[3][kPiece + 2];
          const T* p[3];
          for (int k = 0; k < 3; ++k) gather(rows[k], a, b, 1, buffer[k]), p[k] = buffer[k] + 1;
          run(p, a, b);
        });
  }

  // Luma-chroma of rows y - 1 .. y + rows for a chunk of columns and one
  // more on either side, then the homogeneity differences of the chunk in
  // rows y .. y + rows - 1: a pair of rows shares two of its four rows of
  // luma-chroma.
  void homogeneityRows(int y, int rows) {
    LumaChromaValue<T> values[2][4][3][kChunk + 2];
    for (int a = t_.x - 1; a < t_.x + t_.width + 1; a += kChunk) {
      const int n = std::min(kChunk, t_.x + t_.width + 1 - a);
      LumaChromaView<T> views[2][4];
      for (int d = 0; d < 2; ++d)
        for (int k = 0; k < rows + 2; ++k) {
          LumaChromaValue<T>(&v)[3][kChunk + 2] = values[d][k];
          const int row = y - 1 + k;
          lumaChromaRow(red(d, row) + a - 1, green(d, row) + a - 1, blue(d, row) + a - 1, n + 2,
                        LumaChromaRow<T>{v[0], v[1], v[2]}, level_);
          views[d][k] = LumaChromaView<T>{v[0] + 1, v[1] + 1, v[2] + 1};
        }
      for (int j = 0; j < rows; ++j) homogeneityRow(views[kH] + j, views[kV] + j, n, homDiff(y + j) + a, level_);
    }
  }

  // The running choice starts with H at each row of the tile.
  void outputRow(int y, T* out) {
    const T* h[3] = {red(kH, y) + t_.x, green(kH, y) + t_.x, blue(kH, y) + t_.x};
    const T* v[3] = {red(kV, y) + t_.x, green(kV, y) + t_.x, blue(kV, y) + t_.x};
    const T* hom[3] = {homDiff(y - 1) + t_.x, homDiff(y) + t_.x, homDiff(y + 1) + t_.x};
    choiceRow(h, v, hom, t_.width, out, level_);
  }

  const CfaFrame<T>& f_;
  int grid_;
  AhdTile t_;
  int origin_;
  uint8_t* tmp_;
  int tmpStep_;
  VectorLevel level_;
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
