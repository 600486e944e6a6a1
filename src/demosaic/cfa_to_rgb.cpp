#include "demosaic/cfa_to_rgb.h"

#include <algorithm>
#include <type_traits>

#include "demosaic/rgb_store.h"
#include "frame/export.h"
#include "frame/simd.h"

namespace zel {

namespace {

// How the interior pixels of one row are laid out: the row holds green and
// one other colour; `firstGreen` says whether the first pixel is green.
struct RowPhase {
  bool redRow;
  bool firstGreen;
};

RowPhase rowPhase(int grid, int x, int y) {
  const int here = cfaColour(grid, x, y);
  const int other = here == kGreen ? cfaColour(grid, x + 1, y) : here;
  return RowPhase{other == kRed, here == kGreen};
}

// ---- SSE4.1 lane operations by sample type ----

inline __m128i avgU(__m128i a, __m128i b, uint8_t) { return _mm_avg_epu8(a, b); }
inline __m128i avgU(__m128i a, __m128i b, uint16_t) { return _mm_avg_epu16(a, b); }
inline __m128i maxU(__m128i a, __m128i b, uint8_t) { return _mm_max_epu8(a, b); }
inline __m128i maxU(__m128i a, __m128i b, uint16_t) { return _mm_max_epu16(a, b); }
inline __m128i cmpEq(__m128i a, __m128i b, uint8_t) { return _mm_cmpeq_epi8(a, b); }
inline __m128i cmpEq(__m128i a, __m128i b, uint16_t) { return _mm_cmpeq_epi16(a, b); }
inline __m128i absDiffU(__m128i a, __m128i b, uint8_t) {
  return _mm_or_si128(_mm_subs_epu8(a, b), _mm_subs_epu8(b, a));
}
inline __m128i absDiffU(__m128i a, __m128i b, uint16_t) {
  return _mm_or_si128(_mm_subs_epu16(a, b), _mm_subs_epu16(b, a));
}
// (a + b + c + d + 2) >> 2 in lanes twice as wide.
inline __m128i mean4U(__m128i a, __m128i b, __m128i c, __m128i d, uint8_t) {
  const __m128i z = _mm_setzero_si128(), two = _mm_set1_epi16(2);
  auto half = [&](auto unpack) {
    const __m128i s =
        _mm_add_epi16(_mm_add_epi16(unpack(a, z), unpack(b, z)), _mm_add_epi16(unpack(c, z), unpack(d, z)));
    return _mm_srli_epi16(_mm_add_epi16(s, two), 2);
  };
  return _mm_packus_epi16(half([](__m128i v, __m128i w) { return _mm_unpacklo_epi8(v, w); }),
                          half([](__m128i v, __m128i w) { return _mm_unpackhi_epi8(v, w); }));
}
inline __m128i mean4U(__m128i a, __m128i b, __m128i c, __m128i d, uint16_t) {
  const __m128i z = _mm_setzero_si128(), two = _mm_set1_epi32(2);
  auto half = [&](auto unpack) {
    const __m128i s =
        _mm_add_epi32(_mm_add_epi32(unpack(a, z), unpack(b, z)), _mm_add_epi32(unpack(c, z), unpack(d, z)));
    return _mm_srli_epi32(_mm_add_epi32(s, two), 2);
  };
  return _mm_packus_epi32(half([](__m128i v, __m128i w) { return _mm_unpacklo_epi16(v, w); }),
                          half([](__m128i v, __m128i w) { return _mm_unpackhi_epi16(v, w); }));
}
// All ones in the lanes of green sites: every other lane, from lane 0 or 1.
inline __m128i greenLanes(bool firstGreen, uint8_t) { return _mm_set1_epi16(firstGreen ? 0x00FF : int16_t(0xFF00)); }
inline __m128i greenLanes(bool firstGreen, uint16_t) {
  return _mm_set1_epi32(firstGreen ? 0x0000FFFF : int32_t(0xFFFF0000));
}

// The five rows a block reads, at the block's first column.
template <typename T>
struct RowWindow {
  const T *up2, *up, *mid, *down, *down2;
  RowWindow(const CfaFrame<T>& f, int x, int y)
      : up2(f.row(y - 2) + x),
        up(f.row(y - 1) + x),
        mid(f.row(y) + x),
        down(f.row(y + 1) + x),
        down2(f.row(y + 2) + x) {}
};

// One block of 16 / sizeof(T) pixels starting `at` samples into the window.
template <typename T>
inline void sseBlock(const RowWindow<T>& w, int at, bool redRow, __m128i green, T* rgb) {
  const T tag{};
  const __m128i own = load128(w.mid + at);
  const __m128i left = load128(w.mid + at - 1), right = load128(w.mid + at + 1);
  const __m128i up = load128(w.up + at), down = load128(w.down + at);
  const __m128i rowMean = avgU(left, right, tag);
  const __m128i columnMean = avgU(up, down, tag);
  const __m128i diagonal =
      mean4U(load128(w.up + at - 1), load128(w.up + at + 1), load128(w.down + at - 1), load128(w.down + at + 1), tag);
  const __m128i cross = mean4U(up, left, right, down, tag);
  const __m128i dV = absDiffU(load128(w.up2 + at), load128(w.down2 + at), tag);
  const __m128i dH = absDiffU(load128(w.mid + at - 2), load128(w.mid + at + 2), tag);
  const __m128i top = maxU(dV, dH, tag);
  const __m128i vAtLeastH = cmpEq(top, dV, tag), hAtLeastV = cmpEq(top, dH, tag);
  // Tie: cross; dV < dH: the column; dV > dH: the row.
  __m128i gradientGreen = _mm_blendv_epi8(columnMean, cross, vAtLeastH);
  gradientGreen = _mm_blendv_epi8(rowMean, gradientGreen, hAtLeastV);
  const __m128i g = _mm_blendv_epi8(gradientGreen, own, green);
  const __m128i rowColour = _mm_blendv_epi8(own, rowMean, green);
  const __m128i columnColour = _mm_blendv_epi8(diagonal, columnMean, green);
  if (redRow)
    storeRgb(rgb, rowColour, g, columnColour);
  else
    storeRgb(rgb, columnColour, g, rowColour);
}

// ---- AVX2 lane operations ----

ZEL_AVX2 inline __m256i avgU(__m256i a, __m256i b, uint8_t) { return _mm256_avg_epu8(a, b); }
ZEL_AVX2 inline __m256i avgU(__m256i a, __m256i b, uint16_t) { return _mm256_avg_epu16(a, b); }
ZEL_AVX2 inline __m256i maxU(__m256i a, __m256i b, uint8_t) { return _mm256_max_epu8(a, b); }
ZEL_AVX2 inline __m256i maxU(__m256i a, __m256i b, uint16_t) { return _mm256_max_epu16(a, b); }
ZEL_AVX2 inline __m256i cmpEq(__m256i a, __m256i b, uint8_t) { return _mm256_cmpeq_epi8(a, b); }
ZEL_AVX2 inline __m256i cmpEq(__m256i a, __m256i b, uint16_t) { return _mm256_cmpeq_epi16(a, b); }
ZEL_AVX2 inline __m256i absDiffU(__m256i a, __m256i b, uint8_t) {
  return _mm256_or_si256(_mm256_subs_epu8(a, b), _mm256_subs_epu8(b, a));
}
ZEL_AVX2 inline __m256i absDiffU(__m256i a, __m256i b, uint16_t) {
  return _mm256_or_si256(_mm256_subs_epu16(a, b), _mm256_subs_epu16(b, a));
}
// Unpacking and packing both work within 128-bit lanes, so the order holds.
ZEL_AVX2 inline __m256i mean4U(__m256i a, __m256i b, __m256i c, __m256i d, uint8_t) {
  const __m256i z = _mm256_setzero_si256(), two = _mm256_set1_epi16(2);
  const __m256i lo = _mm256_add_epi16(_mm256_add_epi16(_mm256_unpacklo_epi8(a, z), _mm256_unpacklo_epi8(b, z)),
                                      _mm256_add_epi16(_mm256_unpacklo_epi8(c, z), _mm256_unpacklo_epi8(d, z)));
  const __m256i hi = _mm256_add_epi16(_mm256_add_epi16(_mm256_unpackhi_epi8(a, z), _mm256_unpackhi_epi8(b, z)),
                                      _mm256_add_epi16(_mm256_unpackhi_epi8(c, z), _mm256_unpackhi_epi8(d, z)));
  return _mm256_packus_epi16(_mm256_srli_epi16(_mm256_add_epi16(lo, two), 2),
                             _mm256_srli_epi16(_mm256_add_epi16(hi, two), 2));
}
ZEL_AVX2 inline __m256i mean4U(__m256i a, __m256i b, __m256i c, __m256i d, uint16_t) {
  const __m256i z = _mm256_setzero_si256(), two = _mm256_set1_epi32(2);
  const __m256i lo = _mm256_add_epi32(_mm256_add_epi32(_mm256_unpacklo_epi16(a, z), _mm256_unpacklo_epi16(b, z)),
                                      _mm256_add_epi32(_mm256_unpacklo_epi16(c, z), _mm256_unpacklo_epi16(d, z)));
  const __m256i hi = _mm256_add_epi32(_mm256_add_epi32(_mm256_unpackhi_epi16(a, z), _mm256_unpackhi_epi16(b, z)),
                                      _mm256_add_epi32(_mm256_unpackhi_epi16(c, z), _mm256_unpackhi_epi16(d, z)));
  return _mm256_packus_epi32(_mm256_srli_epi32(_mm256_add_epi32(lo, two), 2),
                             _mm256_srli_epi32(_mm256_add_epi32(hi, two), 2));
}

// The same block over twice the pixels.
template <typename T>
ZEL_AVX2 inline void avxBlock(const RowWindow<T>& w, int at, bool redRow, __m256i green, T* rgb) {
  const T tag{};
  const __m256i own = load256(w.mid + at);
  const __m256i left = load256(w.mid + at - 1), right = load256(w.mid + at + 1);
  const __m256i up = load256(w.up + at), down = load256(w.down + at);
  const __m256i rowMean = avgU(left, right, tag);
  const __m256i columnMean = avgU(up, down, tag);
  const __m256i diagonal =
      mean4U(load256(w.up + at - 1), load256(w.up + at + 1), load256(w.down + at - 1), load256(w.down + at + 1), tag);
  const __m256i cross = mean4U(up, left, right, down, tag);
  const __m256i dV = absDiffU(load256(w.up2 + at), load256(w.down2 + at), tag);
  const __m256i dH = absDiffU(load256(w.mid + at - 2), load256(w.mid + at + 2), tag);
  const __m256i top = maxU(dV, dH, tag);
  const __m256i vAtLeastH = cmpEq(top, dV, tag), hAtLeastV = cmpEq(top, dH, tag);
  __m256i gradientGreen = _mm256_blendv_epi8(columnMean, cross, vAtLeastH);
  gradientGreen = _mm256_blendv_epi8(rowMean, gradientGreen, hAtLeastV);
  const __m256i g = _mm256_blendv_epi8(gradientGreen, own, green);
  const __m256i rowColour = _mm256_blendv_epi8(own, rowMean, green);
  const __m256i columnColour = _mm256_blendv_epi8(diagonal, columnMean, green);
  const __m256i r = redRow ? rowColour : columnColour, b = redRow ? columnColour : rowColour;
  constexpr int half = 16 / int(sizeof(T));
  storeRgb(rgb, _mm256_castsi256_si128(r), _mm256_castsi256_si128(g), _mm256_castsi256_si128(b));
  storeRgb(rgb + 3 * half, _mm256_extracti128_si256(r, 1), _mm256_extracti128_si256(g, 1),
           _mm256_extracti128_si256(b, 1));
}

// SSE blocks over pixels [from, count) of the row, a block at a time; the
// lane phase holds because blocks have an even number of pixels.
template <typename T>
int sseBlocks(const CfaFrame<T>& f, int grid, int x, int y, int from, int count, T* rgb) {
  constexpr int block = 16 / int(sizeof(T));
  const RowPhase phase = rowPhase(grid, x, y);
  const RowWindow<T> w(f, x, y);
  const __m128i green = greenLanes(phase.firstGreen, T{});
  int i = from;
  for (; i + block <= count; i += block) sseBlock(w, i, phase.redRow, green, rgb + 3 * i);
  return i;
}

template <typename T>
void scalarTail(const CfaFrame<T>& f, int grid, int x, int y, int from, int count, T* rgb) {
  for (int i = from; i < count; ++i) cfaInteriorPixel(f, grid, x + i, y, rgb + 3 * i);
}

}  // namespace

template <typename T>
void cfaInteriorRowScalar(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb) {
  scalarTail(f, grid, x, y, 0, count, rgb);
}

template <typename T>
void cfaInteriorRowSse(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb) {
  const int done = sseBlocks(f, grid, x, y, 0, count, rgb);
  scalarTail(f, grid, x, y, done, count, rgb);
}

namespace {

template <typename T>
ZEL_AVX2 int avxBlocks(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb) {
  constexpr int block = 32 / int(sizeof(T));
  const RowPhase phase = rowPhase(grid, x, y);
  const RowWindow<T> w(f, x, y);
  const __m256i green = _mm256_broadcastsi128_si256(greenLanes(phase.firstGreen, T{}));
  int i = 0;
  for (; i + block <= count; i += block) avxBlock(w, i, phase.redRow, green, rgb + 3 * i);
  return i;
}

}  // namespace

template <typename T>
void cfaInteriorRowAvx2(const CfaFrame<T>& f, int grid, int x, int y, int count, T* rgb) {
  int done = avxBlocks(f, grid, x, y, count, rgb);
  done = sseBlocks(f, grid, x, y, done, count, rgb);
  scalarTail(f, grid, x, y, done, count, rgb);
}

template void cfaInteriorRowScalar<uint8_t>(const CfaFrame<uint8_t>&, int, int, int, int, uint8_t*);
template void cfaInteriorRowScalar<uint16_t>(const CfaFrame<uint16_t>&, int, int, int, int, uint16_t*);
template void cfaInteriorRowSse<uint8_t>(const CfaFrame<uint8_t>&, int, int, int, int, uint8_t*);
template void cfaInteriorRowSse<uint16_t>(const CfaFrame<uint16_t>&, int, int, int, int, uint16_t*);
template void cfaInteriorRowAvx2<uint8_t>(const CfaFrame<uint8_t>&, int, int, int, int, uint8_t*);
template void cfaInteriorRowAvx2<uint16_t>(const CfaFrame<uint16_t>&, int, int, int, int, uint16_t*);

namespace {

// The public frame. Checks: pointers, frame width then height (at least 2),
// grid kind. The region is clipped at the frame's right and bottom; border
// pixels inside it come first, then the interior rows.
template <typename T>
Status cfaToRgb(const T* src, CfaRegion region, ImageSize frame, int srcStep, T* dst, int dstStep, int grid) {
  if (!src || !dst) return StatusNullPointerError;
  if (frame.width < 2) return StatusSizeError;
  if (frame.height < 2) return StatusSizeError;
  if (!isValidGrid(grid)) return StatusBadArgumentError;
  // The 16-bit member counts its steps in whole samples.
  if constexpr (sizeof(T) == 2) {
    srcStep = (srcStep >> 1) * 2;
    dstStep = (dstStep >> 1) * 2;
  }
  const ClippedRegion r = clipRegion(region, frame);
  if (r.empty()) return StatusOk;
  const CfaFrame<T> f{src, srcStep, frame.width, frame.height};
  const int w = frame.width, h = frame.height;
  auto out = [&](int x, int y) { return rowAt(dst, dstStep, y - r.y0) + 3 * (x - r.x0); };

  for (int y = r.y0; y < r.y1; ++y) {
    if (y < 2 || y >= h - 2) {
      for (int x = r.x0; x < r.x1; ++x) cfaBorderPixel(f, grid, x, y, out(x, y));
      continue;
    }
    for (int x = r.x0; x < std::min(r.x1, 2); ++x) cfaBorderPixel(f, grid, x, y, out(x, y));
    for (int x = std::max({r.x0, w - 2, 2}); x < r.x1; ++x) cfaBorderPixel(f, grid, x, y, out(x, y));
  }

  const int ix0 = std::max(r.x0, 2), ix1 = std::min(r.x1, w - 2);
  const int iy0 = std::max(r.y0, 2), iy1 = std::min(r.y1, h - 2);
  if (ix1 <= ix0 || iy1 <= iy0) return StatusOk;
  const bool avx2 = hasAvx2();
  for (int y = iy0; y < iy1; ++y) {
    if (avx2)
      cfaInteriorRowAvx2(f, grid, ix0, y, ix1 - ix0, out(ix0, y));
    else
      cfaInteriorRowSse(f, grid, ix0, y, ix1 - ix0, out(ix0, y));
  }
  return StatusOk;
}

}  // namespace

}  // namespace zel

ZEL_PUBLIC Status zeliCFAToRGB_8u_C1C3R(const uint8_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                        uint8_t* dst, int dstStep, int grid, int /*interpolation*/) {
  return zel::cfaToRgb(src, srcRegion, srcSize, srcStep, dst, dstStep, grid);
}
ZEL_PUBLIC Status zeliCFAToRGB_16u_C1C3R(const uint16_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                         uint16_t* dst, int dstStep, int grid, int /*interpolation*/) {
  return zel::cfaToRgb(src, srcRegion, srcSize, srcStep, dst, dstStep, grid);
}
