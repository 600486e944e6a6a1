// Filtered and field-aware chroma resampling: 1620 and 4:2:0, interlaced
// 4:2:2 and 4:2:0, the vertical half-sample filter, and 4:2:0 to BGR with
// horizontal chroma interpolation.
#include "luma_chroma/chroma_filters.h"

#include <algorithm>
#include <cstring>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "luma_chroma/repack_rows.h"

namespace zel::chroma {

namespace {

using repack::PairOrder;

// ---- row kernels ----

// out = (wa * a + wb * b + half) >> shift, the same in every zone: the
// byte pairs (a, b) are multiplied and summed by weight pairs in one step.
ZEL_AVX2 int weightedRowsAvx(const uint8_t* a, int wa, const uint8_t* b, int wb, int shift, uint8_t* out, int n) {
  const __m256i weights = _mm256_set1_epi16(int16_t((wb << 8) | wa));
  const __m256i half = _mm256_set1_epi16(int16_t(1 << (shift - 1)));
  const __m128i count = _mm_cvtsi32_si128(shift);
  int x = 0;
  for (; x + 32 <= n; x += 32) {
    const __m256i pa = load256(a + x), pb = load256(b + x);
    const __m256i lo = _mm256_srl_epi16(_mm256_add_epi16(_mm256_maddubs_epi16(_mm256_unpacklo_epi8(pa, pb), weights), half), count);
    const __m256i hi = _mm256_srl_epi16(_mm256_add_epi16(_mm256_maddubs_epi16(_mm256_unpackhi_epi8(pa, pb), weights), half), count);
    store256(out + x, _mm256_packus_epi16(lo, hi));
  }
  return x;
}

void weightedRows(const uint8_t* a, int wa, const uint8_t* b, int wb, int shift, uint8_t* out, int n) {
  const __m128i weights = _mm_set1_epi16(int16_t((wb << 8) | wa));
  const __m128i half = _mm_set1_epi16(int16_t(1 << (shift - 1)));
  const __m128i count = _mm_cvtsi32_si128(shift);
  int x = hasAvx2() ? weightedRowsAvx(a, wa, b, wb, shift, out, n) : 0;
  for (; x + 16 <= n; x += 16) {
    const __m128i pa = load128(a + x), pb = load128(b + x);
    const __m128i lo = _mm_srl_epi16(_mm_add_epi16(_mm_maddubs_epi16(_mm_unpacklo_epi8(pa, pb), weights), half), count);
    const __m128i hi = _mm_srl_epi16(_mm_add_epi16(_mm_maddubs_epi16(_mm_unpackhi_epi8(pa, pb), weights), half), count);
    store128(out + x, _mm_packus_epi16(lo, hi));
  }
  for (; x < n; ++x) out[x] = uint8_t((wa * a[x] + wb * b[x] + (1 << (shift - 1))) >> shift);
}

// The -1 9 9 -1 half-sample tap over four rows.
ZEL_AVX2 ZEL_INLINE __m256i halfSampleLanes(__m256i u, __m256i p, __m256i q, __m256i d) {
  const __m256i nine = _mm256_set1_epi16(9), eight = _mm256_set1_epi16(8);
  return _mm256_srai_epi16(
      _mm256_add_epi16(_mm256_sub_epi16(_mm256_mullo_epi16(_mm256_add_epi16(p, q), nine), _mm256_add_epi16(u, d)),
                       eight),
      4);
}

ZEL_AVX2 int halfSampleRowsAvx(const uint8_t* above, const uint8_t* a, const uint8_t* b, const uint8_t* below,
                               uint8_t* out, int n) {
  const __m256i zero = _mm256_setzero_si256();
  int x = 0;
  for (; x + 32 <= n; x += 32) {
    const __m256i u = load256(above + x), p = load256(a + x), q = load256(b + x), d = load256(below + x);
    const __m256i lo = halfSampleLanes(_mm256_unpacklo_epi8(u, zero), _mm256_unpacklo_epi8(p, zero),
                                       _mm256_unpacklo_epi8(q, zero), _mm256_unpacklo_epi8(d, zero));
    const __m256i hi = halfSampleLanes(_mm256_unpackhi_epi8(u, zero), _mm256_unpackhi_epi8(p, zero),
                                       _mm256_unpackhi_epi8(q, zero), _mm256_unpackhi_epi8(d, zero));
    store256(out + x, _mm256_packus_epi16(lo, hi));
  }
  return x;
}

void halfSampleRows(const uint8_t* above, const uint8_t* a, const uint8_t* b, const uint8_t* below, uint8_t* out,
                    int n) {
  const __m128i zero = _mm_setzero_si128(), nine = _mm_set1_epi16(9), eight = _mm_set1_epi16(8);
  int x = hasAvx2() ? halfSampleRowsAvx(above, a, b, below, out, n) : 0;
  for (; x + 16 <= n; x += 16) {
    const __m128i u = load128(above + x), p = load128(a + x), q = load128(b + x), d = load128(below + x);
    auto side = [&](auto unpack) {
      const __m128i sum = _mm_add_epi16(unpack(p, zero), unpack(q, zero));
      const __m128i outer = _mm_add_epi16(unpack(u, zero), unpack(d, zero));
      return _mm_srai_epi16(_mm_add_epi16(_mm_sub_epi16(_mm_mullo_epi16(sum, nine), outer), eight), 4);
    };
    const __m128i lo = side([](__m128i v, __m128i z) { return _mm_unpacklo_epi8(v, z); });
    const __m128i hi = side([](__m128i v, __m128i z) { return _mm_unpackhi_epi8(v, z); });
    store128(out + x, _mm_packus_epi16(lo, hi));
  }
  for (; x < n; ++x) out[x] = halfSampleTap(above[x], a[x], b[x], below[x]);
}

// Quarter-size chroma grown 2x2: one source row pair (c, next) gives two
// output rows. Rounded means in blocks of 32 and 16 columns, truncated
// means for single columns; the last column repeats its sample. With
// `next` null (the last source row) the lower row copies the samples.
void growRow(const uint8_t* c, const uint8_t* next, uint8_t* top, uint8_t* bottom, int n) {
  int j = 0;
  auto block = [&](int size) {
    for (int b = 0; b < size; b += 16) {
      const __m128i p = load128(c + j + b), right = load128(c + j + b + 1);
      const __m128i h = _mm_avg_epu8(p, right);
      store128(top + 2 * (j + b), _mm_unpacklo_epi8(p, h));
      store128(top + 2 * (j + b) + 16, _mm_unpackhi_epi8(p, h));
      if (next) {
        const __m128i q = load128(next + j + b), qright = load128(next + j + b + 1);
        const __m128i v = _mm_avg_epu8(p, q);
        const __m128i d = _mm_avg_epu8(h, _mm_avg_epu8(q, qright));
        store128(bottom + 2 * (j + b), _mm_unpacklo_epi8(v, d));
        store128(bottom + 2 * (j + b) + 16, _mm_unpackhi_epi8(v, d));
      } else {
        store128(bottom + 2 * (j + b), _mm_unpacklo_epi8(p, p));
        store128(bottom + 2 * (j + b) + 16, _mm_unpackhi_epi8(p, p));
      }
    }
    j += size;
  };
  if (next) {
    while (n - j >= 33) block(32);
  }
  while (n - j >= 17) block(16);
  for (; j < n - 1; ++j) {
    top[2 * j] = c[j];
    top[2 * j + 1] = uint8_t(TruncatedMean(c[j], c[j + 1]));
    if (next) {
      bottom[2 * j] = uint8_t(TruncatedMean(c[j], next[j]));
      bottom[2 * j + 1] = uint8_t(
          TruncatedMean(TruncatedMean(c[j], c[j + 1]), TruncatedMean(next[j], next[j + 1])));
    } else {
      bottom[2 * j] = bottom[2 * j + 1] = c[j];
    }
  }
  // The final column: the sample repeated, below it the truncated mean.
  top[2 * j] = top[2 * j + 1] = c[j];
  bottom[2 * j] = bottom[2 * j + 1] = next ? uint8_t(TruncatedMean(c[j], next[j])) : c[j];
}

// ---- planes ----

struct Planes3 {
  const uint8_t* p[3];
  int step[3];
  const uint8_t* row(int plane, int y) const { return rowAt(p[plane], step[plane], y); }
};
struct OutPlanes3 {
  uint8_t* p[3];
  int step[3];
  uint8_t* row(int plane, int y) const { return rowAt(p[plane], step[plane], y); }
};

// A plane set is missing when its array, its steps or any plane is null.
template <typename T>
bool missingPlanes(T* const* planes, const int* steps) {
  return !planes || !steps || anyPlaneNull(planes);
}

// Luma rows copied, as one row when no gap lies between them.
void copyLuma(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, int width, int height) {
  if (srcStep == width && dstStep == width && int64_t(width) * height <= (int64_t(1) << 30)) {
    repack::copyBytes(src, dst, width * height, false);
    return;
  }
  plainWalk(height, [&](int y) { repack::copyBytes(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), width, false); });
}

Status grow1620To420(const Planes3& s, const OutPlanes3& d, ImageSize size) {
  if (size.width < 4 || size.height < 4 || (size.width & 3) || (size.height & 3)) return StatusSizeError;
  copyLuma(s.p[0], s.step[0], d.p[0], d.step[0], size.width, size.height);
  const int n = size.width / 4, rows = size.height / 4;
  for (int plane = 1; plane <= 2; ++plane)
    for (int i = 0; i < rows; ++i)
      growRow(s.row(plane, i), i + 1 < rows ? s.row(plane, i + 1) : nullptr, d.row(plane, 2 * i),
              d.row(plane, 2 * i + 1), n);
  return StatusOk;
}

Status shrink420To1620(const Planes3& s, const OutPlanes3& d, ImageSize size) {
  if (size.width < 4 || size.height < 4 || (size.width & 3) || (size.height & 3)) return StatusSizeError;
  copyLuma(s.p[0], s.step[0], d.p[0], d.step[0], size.width, size.height);
  for (int plane = 1; plane <= 2; ++plane)
    for (int i = 0; i < size.height / 4; ++i) repack::keepEven(s.row(plane, 2 * i), d.row(plane, i), size.width / 4);
  return StatusOk;
}

// Interlaced 4:2:2 to 4:2:0 on chroma planes: four source rows give two.
void fieldsDown(const Planes3& s, const OutPlanes3& d, int cw, int height) {
  for (int plane = 1; plane <= 2; ++plane)
    for (int k = 0; k < height / 4; ++k) {
      weightedRows(s.row(plane, 4 * k), 3, s.row(plane, 4 * k + 2), 1, 2, d.row(plane, 2 * k), cw);
      weightedRows(s.row(plane, 4 * k + 1), 1, s.row(plane, 4 * k + 3), 3, 2, d.row(plane, 2 * k + 1), cw);
    }
}

// Interlaced 4:2:0 to 4:2:2: output chroma row `row` of a plane whose
// source rows come from `sourceRow`. The first two and the last two rows
// are copies; the rows between take taps of their own field.
template <typename RowOf>
const uint8_t* fieldUpRow(RowOf sourceRow, int height, int row, int cw, uint8_t* scratch) {
  if (row < 2) return sourceRow(row);
  if (row >= height - 2) return sourceRow(height / 2 - 2 + (row - (height - 2)));
  const int d = 2 + (row - 2) / 4 * 4, t = (d - 2) / 2;
  switch (row - d) {
    case 0: weightedRows(sourceRow(t), 5, sourceRow(t + 2), 3, 3, scratch, cw); break;
    case 1: weightedRows(sourceRow(t + 1), 7, sourceRow(t + 3), 1, 3, scratch, cw); break;
    case 2: weightedRows(sourceRow(t), 1, sourceRow(t + 2), 7, 3, scratch, cw); break;
    default: weightedRows(sourceRow(t + 1), 3, sourceRow(t + 3), 5, 3, scratch, cw); break;
  }
  return scratch;
}

// Columns of chroma a step of the interlaced and filtered kernels.
constexpr int kChunk = 1024;

Status interlaceSize(ImageSize size, int& width, int& height) {
  if (size.width < 2 || size.height < 4) return StatusSizeError;
  width = size.width & ~1;
  height = size.height & ~3;
  return (size.width & 1) || (size.height & 3) ? StatusOddSizeWarning : StatusOk;
}

// Vertical half-sample filter of one chroma plane (n source rows) into 2n
// output rows, source rows fetched through `rowOf`.
template <typename RowOf>
void halfSamplePlane(RowOf rowOf, int n, int cw, uint8_t* dst, int dstStep) {
  auto at = [&](int k) { return rowOf(std::clamp(k, 0, n - 1)); };
  for (int k = 0; k < n; ++k) {
    std::memcpy(rowAt(dst, dstStep, 2 * k), at(k), size_t(cw));
    halfSampleRows(at(k - 1), at(k), at(k + 1), at(k + 2), rowAt(dst, dstStep, 2 * k + 1), cw);
  }
}

Status halfSampleSize(ImageSize size, int& width, int& height) {
  if (size.width < 2 || size.height < 8) return StatusSizeError;
  width = size.width & ~1;
  height = size.height & ~7;
  return StatusOk;
}

// ---- 4:2:0 to BGR with horizontal interpolation ----

// The 16-bit form for 16 pixels: luma and chroma bytes widened, B G R
// alpha written.
ZEL_AVX2 ZEL_INLINE void bgrLanes16(__m128i luma, __m128i crPix, __m128i cbPix, __m256i alphaBytes, uint8_t* o) {
  const __m256i c16 = _mm256_set1_epi16(16), c128 = _mm256_set1_epi16(128);
  const __m256i y8 = _mm256_cvtepu8_epi16(luma), r8 = _mm256_cvtepu8_epi16(crPix), b8 = _mm256_cvtepu8_epi16(cbPix);
  const __m256i yy = _mm256_mulhi_epi16(_mm256_slli_epi16(_mm256_sub_epi16(y8, c16), 7), _mm256_set1_epi16(kLuma12));
  const __m256i crs = _mm256_slli_epi16(_mm256_sub_epi16(r8, c128), 7);
  const __m256i cbs = _mm256_slli_epi16(_mm256_sub_epi16(b8, c128), 7);
  const __m256i r = _mm256_srai_epi16(_mm256_add_epi16(yy, _mm256_mulhi_epi16(crs, _mm256_set1_epi16(kCrToR12))), 3);
  const __m256i g = _mm256_srai_epi16(
      _mm256_sub_epi16(_mm256_sub_epi16(yy, _mm256_mulhi_epi16(cbs, _mm256_set1_epi16(kCbToG12))),
                       _mm256_mulhi_epi16(crs, _mm256_set1_epi16(kCrToG12))),
      3);
  const __m256i b = _mm256_srai_epi16(_mm256_add_epi16(yy, _mm256_mulhi_epi16(cbs, _mm256_set1_epi16(kCbToB12))), 3);
  // Per lane: pixels 0-7 | 8-15.
  const __m256i bg = _mm256_unpacklo_epi8(_mm256_packus_epi16(b, b), _mm256_packus_epi16(g, g));
  const __m256i ra = _mm256_unpacklo_epi8(_mm256_packus_epi16(r, r), _mm256_setzero_si256());
  const __m256i lo = _mm256_or_si256(_mm256_unpacklo_epi16(bg, ra), alphaBytes);  // 0-3 | 8-11
  const __m256i hi = _mm256_or_si256(_mm256_unpackhi_epi16(bg, ra), alphaBytes);  // 4-7 | 12-15
  store256(o, _mm256_permute2x128_si256(lo, hi, 0x20));
  store256(o + 32, _mm256_permute2x128_si256(lo, hi, 0x31));
}

// Sixteen chroma samples (32 pixels) a step, while a whole step stays
// below `bodyPairs`.
ZEL_AVX2 int bgrFilterBodyAvx(const uint8_t* y, const uint8_t* cr, const uint8_t* cb, uint8_t* out, int bodyPairs,
                              uint8_t alpha) {
  const __m256i alphaBytes = _mm256_set1_epi32(int32_t(uint32_t(alpha) << 24));
  int k = 0;
  for (; k + 16 <= bodyPairs; k += 16) {
    const __m128i crv = load128(cr + k), cbv = load128(cb + k);
    const __m128i crOdd = _mm_avg_epu8(crv, load128(cr + k + 1));
    const __m128i cbOdd = _mm_avg_epu8(cbv, load128(cb + k + 1));
    bgrLanes16(load128(y + 2 * k), _mm_unpacklo_epi8(crv, crOdd), _mm_unpacklo_epi8(cbv, cbOdd), alphaBytes,
               out + 8 * k);
    bgrLanes16(load128(y + 2 * k + 16), _mm_unpackhi_epi8(crv, crOdd), _mm_unpackhi_epi8(cbv, cbOdd), alphaBytes,
               out + 8 * k + 64);
  }
  return k;
}

// Pixel pairs [0, pairs) of one row; pairs below `bodyPairs` take the
// 16-bit form, eight chroma samples a block.
void bgrFilterRow(const uint8_t* y, const uint8_t* cr, const uint8_t* cb, uint8_t* out, int pairs, uint8_t alpha) {
  const int bodyPairs = std::max(((pairs) - 1) & ~7, 0);
  const __m128i zero = _mm_setzero_si128();
  const __m128i c16 = _mm_set1_epi16(16), c128 = _mm_set1_epi16(128);
  const __m128i wy = _mm_set1_epi16(kLuma12), wcrR = _mm_set1_epi16(kCrToR12), wcrG = _mm_set1_epi16(kCrToG12),
                wcbG = _mm_set1_epi16(kCbToG12), wcbB = _mm_set1_epi16(kCbToB12);
  const __m128i alphaBytes = _mm_set1_epi32(int32_t(uint32_t(alpha) << 24));
  int k = hasAvx2() ? bgrFilterBodyAvx(y, cr, cb, out, bodyPairs, alpha) : 0;
  for (; k < bodyPairs; k += 8) {
    // Chroma of even pixels and the rounded means for odd pixels.
    const __m128i crv = load64(cr + k), cbv = load64(cb + k);
    const __m128i crOdd = _mm_avg_epu8(crv, load64(cr + k + 1));
    const __m128i cbOdd = _mm_avg_epu8(cbv, load64(cb + k + 1));
    const __m128i crPix = _mm_unpacklo_epi8(crv, crOdd), cbPix = _mm_unpacklo_epi8(cbv, cbOdd);  // 16 pixels
    const __m128i luma = load128(y + 2 * k);
    for (int half = 0; half < 2; ++half) {
      const __m128i y8 = half ? _mm_unpackhi_epi8(luma, zero) : _mm_unpacklo_epi8(luma, zero);
      const __m128i r8 = half ? _mm_unpackhi_epi8(crPix, zero) : _mm_unpacklo_epi8(crPix, zero);
      const __m128i b8 = half ? _mm_unpackhi_epi8(cbPix, zero) : _mm_unpacklo_epi8(cbPix, zero);
      const __m128i yy = _mm_mulhi_epi16(_mm_slli_epi16(_mm_sub_epi16(y8, c16), 7), wy);
      const __m128i crs = _mm_slli_epi16(_mm_sub_epi16(r8, c128), 7), cbs = _mm_slli_epi16(_mm_sub_epi16(b8, c128), 7);
      const __m128i r = _mm_srai_epi16(_mm_add_epi16(yy, _mm_mulhi_epi16(crs, wcrR)), 3);
      const __m128i g = _mm_srai_epi16(
          _mm_sub_epi16(_mm_sub_epi16(yy, _mm_mulhi_epi16(cbs, wcbG)), _mm_mulhi_epi16(crs, wcrG)), 3);
      const __m128i b = _mm_srai_epi16(_mm_add_epi16(yy, _mm_mulhi_epi16(cbs, wcbB)), 3);
      const __m128i bg = _mm_unpacklo_epi8(_mm_packus_epi16(b, b), _mm_packus_epi16(g, g));   // B G pairs
      const __m128i ra = _mm_unpacklo_epi8(_mm_packus_epi16(r, r), zero);                     // R 0 pairs
      uint8_t* o = out + 4 * (2 * k + 8 * half);
      store128(o, _mm_or_si128(_mm_unpacklo_epi16(bg, ra), alphaBytes));
      store128(o + 16, _mm_or_si128(_mm_unpackhi_epi16(bg, ra), alphaBytes));
    }
  }
  for (; k < pairs; ++k) {
    const bool last = k == pairs - 1;
    const int crOdd = last ? cr[k] : AverageRoundU8(cr[k], cr[k + 1]);
    const int cbOdd = last ? cb[k] : AverageRoundU8(cb[k], cb[k + 1]);
    bgrWide(y[2 * k], cr[k], cb[k], out + 8 * k);
    bgrWide(y[2 * k + 1], crOdd, cbOdd, out + 8 * k + 4);
    out[8 * k + 3] = out[8 * k + 7] = alpha;
  }
}

}  // namespace

}  // namespace zel::chroma

using namespace zel::chroma;
using zel::rowAt;

ZEL_PUBLIC Status zeliYCbCr1620To420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                            const int dstStep[3], ImageSize size) {
  if (missingPlanes(src, srcStep) || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  return grow1620To420({{src[0], src[1], src[2]}, {srcStep[0], srcStep[1], srcStep[2]}},
                       {{dst[0], dst[1], dst[2]}, {dstStep[0], dstStep[1], dstStep[2]}}, size);
}

ZEL_PUBLIC Status zeliYCbCr420To1620_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                            const int dstStep[3], ImageSize size) {
  if (missingPlanes(src, srcStep) || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  return shrink420To1620({{src[0], src[1], src[2]}, {srcStep[0], srcStep[1], srcStep[2]}},
                         {{dst[0], dst[1], dst[2]}, {dstStep[0], dstStep[1], dstStep[2]}}, size);
}

ZEL_PUBLIC Status zeliYCbCr422To420_Interlace_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                     uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  if (missingPlanes(src, srcStep) || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  int width, height;
  const Status s = interlaceSize(size, width, height);
  if (s < 0) return s;
  copyLuma(src[0], srcStep[0], dst[0], dstStep[0], width, height);
  fieldsDown({{src[0], src[1], src[2]}, {srcStep[0], srcStep[1], srcStep[2]}},
             {{dst[0], dst[1], dst[2]}, {dstStep[0], dstStep[1], dstStep[2]}}, width / 2, height);
  return s;
}

ZEL_PUBLIC Status zeliCbYCr422ToYCbCr420_Interlace_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3],
                                                            const int dstStep[3], ImageSize size) {
  if (!src || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  int width, height;
  const Status s = interlaceSize(size, width, height);
  if (s < 0) return s;
  // Four stream rows at a time, split into planar rows, then the field taps.
  alignas(16) uint8_t cb[4][kChunk], cr[4][kChunk];
  for (int k = 0; k < height / 4; ++k)
    for (int x = 0; x < width; x += 2 * kChunk) {
      const int n = std::min(2 * kChunk, width - x);
      for (int r = 0; r < 4; ++r)
        zel::repack::splitPairs(rowAt(src, srcStep, 4 * k + r) + 2 * x, PairOrder::CbYCr,
                                rowAt(dst[0], dstStep[0], 4 * k + r) + x, cb[r], cr[r], n);
      for (int plane = 1; plane <= 2; ++plane) {
        auto& c = plane == 1 ? cb : cr;
        weightedRows(c[0], 3, c[2], 1, 2, rowAt(dst[plane], dstStep[plane], 2 * k) + x / 2, n / 2);
        weightedRows(c[1], 1, c[3], 3, 2, rowAt(dst[plane], dstStep[plane], 2 * k + 1) + x / 2, n / 2);
      }
    }
  return s;
}

ZEL_PUBLIC Status zeliYCbCr420To422_Interlace_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                     uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  if (missingPlanes(src, srcStep) || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  int width, height;
  const Status s = interlaceSize(size, width, height);
  if (s < 0) return s;
  copyLuma(src[0], srcStep[0], dst[0], dstStep[0], width, height);
  const int cw = width / 2;
  for (int plane = 1; plane <= 2; ++plane)
    for (int x = 0; x < cw; x += kChunk) {
      const int n = std::min(kChunk, cw - x);
      auto sourceRow = [&](int r) { return rowAt(src[plane], srcStep[plane], r) + x; };
      for (int row = 0; row < height; ++row) {
        // Tapped rows land in place; copied rows are copied.
        uint8_t* out = rowAt(dst[plane], dstStep[plane], row) + x;
        const uint8_t* got = fieldUpRow(sourceRow, height, row, n, out);
        if (got != out) std::memcpy(out, got, size_t(n));
      }
    }
  return s;
}

ZEL_PUBLIC Status zeliYCbCr420ToCbYCr422_Interlace_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3],
                                                            uint8_t* dst, int dstStep, ImageSize size) {
  if (missingPlanes(src, srcStep) || !dst) return StatusNullPointerError;
  int width, height;
  const Status s = interlaceSize(size, width, height);
  if (s < 0) return s;
  const int cw = width / 2;
  alignas(16) uint8_t cbRow[kChunk], crRow[kChunk];
  for (int x = 0; x < cw; x += kChunk) {
    const int n = std::min(kChunk, cw - x);
    auto cbSource = [&](int r) { return rowAt(src[1], srcStep[1], r) + x; };
    auto crSource = [&](int r) { return rowAt(src[2], srcStep[2], r) + x; };
    for (int row = 0; row < height; ++row)
      zel::repack::mergePairs(rowAt(src[0], srcStep[0], row) + 2 * x, fieldUpRow(cbSource, height, row, n, cbRow),
                              fieldUpRow(crSource, height, row, n, crRow), PairOrder::CbYCr,
                              rowAt(dst, dstStep, row) + 4 * x, 2 * n, false);
  }
  return s;
}

namespace {

template <typename RowOf>
void halfSampleOut(RowOf rowOf, ImageSize used, uint8_t* const dst[3], const int dstStep[3], int plane) {
  const int cw = used.width / 2, n = used.height / 2;
  for (int x = 0; x < cw; x += kChunk) {
    const int m = std::min(kChunk, cw - x);
    halfSamplePlane([&](int k) { return rowOf(k) + x; }, n, m, dst[plane] + x, dstStep[plane]);
  }
}

Status halfSampleP3(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3],
                    ImageSize size, bool crFirst) {
  if (missingPlanes(src, srcStep) || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  int width, height;
  if (halfSampleSize(size, width, height) != StatusOk) return StatusSizeError;
  copyLuma(src[0], srcStep[0], dst[0], dstStep[0], width, height);
  const ImageSize used{width, height};
  for (int plane = 1; plane <= 2; ++plane) {
    const int from = crFirst ? 3 - plane : plane;
    halfSampleOut([&](int k) { return rowAt(src[from], srcStep[from], k); }, used, dst, dstStep, plane);
  }
  return StatusOk;
}

}  // namespace

ZEL_PUBLIC Status zeliYCbCr420ToYCbCr422_Filter_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                       uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  return halfSampleP3(src, srcStep, dst, dstStep, size, false);
}

ZEL_PUBLIC Status zeliYCrCb420ToYCbCr422_Filter_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                       uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  return halfSampleP3(src, srcStep, dst, dstStep, size, true);
}

ZEL_PUBLIC Status zeliYCbCr420ToYCbCr422_Filter_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                         int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3],
                                                         ImageSize size) {
  if (!srcY || !srcCbCr || missingPlanes(dst, dstStep)) return StatusNullPointerError;
  int width, height;
  if (halfSampleSize(size, width, height) != StatusOk) return StatusSizeError;
  copyLuma(srcY, srcYStep, dst[0], dstStep[0], width, height);
  // The tap works byte by byte, so it runs on the pairs; the result is
  // then split into the two planes.
  const int cw = width / 2, n = height / 2;
  alignas(16) uint8_t row[2 * kChunk];
  for (int x = 0; x < cw; x += kChunk) {
    const int m = std::min(kChunk, cw - x);
    auto at = [&](int k) { return rowAt(srcCbCr, srcCbCrStep, std::clamp(k, 0, n - 1)) + 2 * x; };
    for (int k = 0; k < n; ++k) {
      zel::repack::unzip(at(k), rowAt(dst[1], dstStep[1], 2 * k) + x, rowAt(dst[2], dstStep[2], 2 * k) + x, m);
      halfSampleRows(at(k - 1), at(k), at(k + 1), at(k + 2), row, 2 * m);
      zel::repack::unzip(row, rowAt(dst[1], dstStep[1], 2 * k + 1) + x, rowAt(dst[2], dstStep[2], 2 * k + 1) + x, m);
    }
  }
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCrCb420ToBGR_Filter_8u_P3C4R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst,
                                                    int dstStep, ImageSize size, uint8_t alpha) {
  if (!src || !srcStep || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (zel::anyPlaneNull(src)) return StatusNullPointerError;
  // A last odd column and row stay unwritten, but a one-pixel-wide image
  // still gets a closing pair.
  const int pairs = std::max(size.width >> 1, 1);
  zel::rowPairWalk(size.height, [&](int y, int c) {
    const uint8_t* cr = rowAt(src[1], srcStep[1], c);
    const uint8_t* cb = rowAt(src[2], srcStep[2], c);
    for (int r = 0; r < 2; ++r)
      bgrFilterRow(rowAt(src[0], srcStep[0], y + r), cr, cb, rowAt(dst, dstStep, y + r), pairs, alpha);
  });
  return (size.width & 1) || (size.height & 1) ? StatusOddSizeWarning : StatusOk;
}
