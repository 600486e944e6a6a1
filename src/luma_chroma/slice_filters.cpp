// 4:2:0 two-plane frames filtered vertically, luma and chroma, fed as a
// whole frame or in slices (`layout` 1 first, 4 middle, 16 last; a mask
// with all three is a whole frame). Slices write two rows behind their
// end, which the next slice finishes from two rows above its pointers.
#include <algorithm>
#include <cstring>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/scalar_ops.h"
#include "frame/simd.h"
#include "luma_chroma/repack_rows.h"

namespace zel::slices {

namespace {

// ---- scalar forms ----

// Tail forms of the luma filter (the vector blocks take rounded means of
// means, in lumaRow).
inline uint8_t innerTail(int up, int y, int down) { return uint8_t((up + 2 * y + down) >> 2); }
inline uint8_t firstTail(int y, int down) { return uint8_t((3 * y + down) >> 2); }
inline uint8_t lastTail(int up, int y) { return uint8_t((up + 3 * y) >> 2); }
// Whole-frame edge rows: biased by one and clamped.
inline uint8_t firstBiased(int y, int down) { return SaturateU8((3 * y + down + 4) >> 2); }
inline uint8_t innerBiased(int up, int y, int down) { return SaturateU8((up + 2 * y + down + 4) >> 2); }
inline uint8_t lastBiased(int up, int y) { return SaturateU8((up + 3 * y + 4) >> 2); }
// Whole-frame inner rows, tail: the first pixel of a pair.
inline uint8_t innerPairFirst(int up, int y, int down) { return SaturateU8(((((up + down) >> 1) + y) >> 1) + 1); }

enum class Form { First, Inner, Last };

bool validLayout(int layout) { return layout == 1 || layout == 4 || layout == 16 || (layout & 21) == 21; }

struct Frame {
  const uint8_t* y;
  int yStep;
  const uint8_t* c;
  int cStep;
  int width, height;  // the part used: even
  const uint8_t* Y(int r) const { return rowAt(y, yStep, r); }
  const uint8_t* C(int r) const { return rowAt(c, cStep, r); }
  // The two chroma rows blended for chroma row j: j and j + 1, the last
  // row j = n - 1 with the one above.
  void blendRows(int j, const uint8_t*& a, const uint8_t*& b) const {
    const int n = height / 2;
    a = C(j);
    b = j < n - 1 ? C(j + 1) : C(n - 2);
  }
};

// The vector luma forms: rounded means of means.
ZEL_AVX2 ZEL_INLINE __m256i lumaForm(Form form, __m256i v, __m256i u, __m256i d) {
  if (form == Form::First) return _mm256_avg_epu8(v, _mm256_avg_epu8(v, d));
  if (form == Form::Last) return _mm256_avg_epu8(v, _mm256_avg_epu8(v, u));
  return _mm256_avg_epu8(_mm256_avg_epu8(v, u), _mm256_avg_epu8(v, d));
}

ZEL_AVX2 int lumaBodyAvx(const uint8_t* y, const uint8_t* up, const uint8_t* down, Form form, int bodyEnd,
                         uint8_t* out) {
  int x = 0;
  for (; x + 32 <= bodyEnd; x += 32) store256(out + x, lumaForm(form, load256(y + x), load256(up + x), load256(down + x)));
  return x;
}

ZEL_AVX2 int chromaBodyAvx(const uint8_t* a, const uint8_t* b, int bodyEnd, uint8_t* out) {
  int x = 0;
  for (; x + 32 <= bodyEnd; x += 32) store256(out + x, _mm256_avg_epu8(load256(a + x), load256(b + x)));
  return x;
}

// Inner rows of the interleaved output in one pass, 32 pixels a step:
// luma form, chroma blend and the Y0 Cb Y1 Cr weave.
ZEL_AVX2 int innerInterleavedAvx(const uint8_t* y, const uint8_t* up, const uint8_t* down, const uint8_t* ca,
                                 const uint8_t* cb, int bodyEnd, uint8_t* out) {
  int x = 0;
  for (; x + 32 <= bodyEnd; x += 32) {
    const __m256i luma = lumaForm(Form::Inner, load256(y + x), load256(up + x), load256(down + x));
    const __m256i chroma = _mm256_avg_epu8(load256(ca + x), load256(cb + x));
    const __m256i lo = _mm256_unpacklo_epi8(luma, chroma), hi = _mm256_unpackhi_epi8(luma, chroma);
    store256(out + 2 * x, _mm256_permute2x128_si256(lo, hi, 0x20));
    store256(out + 2 * x + 32, _mm256_permute2x128_si256(lo, hi, 0x31));
  }
  return x;
}

// Luma of one output row in the vector form below `bodyEnd` (16 a step)
// and the tail form after it.
void lumaRow(const Frame& f, int r, Form form, int bodyEnd, uint8_t* out) {
  const uint8_t* y = f.Y(r);
  const uint8_t* up = form == Form::First ? y : f.Y(r - 1);
  const uint8_t* down = form == Form::Last ? y : f.Y(r + 1);
  auto body = [&](__m128i v, __m128i u, __m128i d) {
    if (form == Form::First) return _mm_avg_epu8(v, _mm_avg_epu8(v, d));
    if (form == Form::Last) return _mm_avg_epu8(v, _mm_avg_epu8(v, u));
    return _mm_avg_epu8(_mm_avg_epu8(v, u), _mm_avg_epu8(v, d));
  };
  int x = hasAvx2() ? lumaBodyAvx(y, up, down, form, bodyEnd, out) : 0;
  for (; x + 16 <= bodyEnd; x += 16) store128(out + x, body(load128(y + x), load128(up + x), load128(down + x)));
  for (; x < bodyEnd; x += 8) store64(out + x, body(load64(y + x), load64(up + x), load64(down + x)));
  for (; x < f.width; ++x)
    out[x] = form == Form::First  ? firstTail(y[x], down[x])
             : form == Form::Last ? lastTail(up[x], y[x])
                                  : innerTail(up[x], y[x], down[x]);
}

// Chroma pair bytes of one blend: rounded below `bodyEnd` bytes, truncated after.
void chromaBlend(const uint8_t* a, const uint8_t* b, int bodyEnd, int bytes, uint8_t* out) {
  int x = hasAvx2() ? chromaBodyAvx(a, b, bodyEnd, out) : 0;
  for (; x + 16 <= bodyEnd; x += 16) store128(out + x, _mm_avg_epu8(load128(a + x), load128(b + x)));
  for (; x < bodyEnd; x += 8) store64(out + x, _mm_avg_epu8(load64(a + x), load64(b + x)));
  for (; x < bytes; ++x) out[x] = uint8_t(TruncatedMean(a[x], b[x]));
}

// ---- interleaved output ----

constexpr int kChunk = 2048;  // pixels a step

// Luma and chroma pair rows merged into Y0 Cb Y1 Cr.
void mergeRow(const uint8_t* y, const uint8_t* c, uint8_t* out, int width) {
  if (!(width & 1)) {
    repack::mergePairsCbCr(y, c, repack::PairOrder::YCbCr, out, width, false);
    return;
  }
  int x = 0;
  for (; x + 16 <= width; x += 16) {
    const __m128i luma = load128(y + x), chroma = load128(c + x);
    store128(out + 2 * x, _mm_unpacklo_epi8(luma, chroma));
    store128(out + 2 * x + 16, _mm_unpackhi_epi8(luma, chroma));
  }
  for (; x < width; ++x) {
    out[2 * x] = y[x];
    out[2 * x + 1] = c[x];
  }
}

// One output row of the slice kernels: `block` is 8 at the frame's first
// two and last two rows, 32 elsewhere. Wide rows go in chunks; the body
// limit is counted from the row's start.
void sliceRowInterleaved(const Frame& f, int r, Form form, int block, uint8_t* out) {
  const int bodyEnd = f.width & ~(block - 1);
  const uint8_t *ca, *cb;
  f.blendRows(r >> 1, ca, cb);
  alignas(16) uint8_t luma[kChunk + 16], chroma[kChunk + 16];
  for (int x0 = 0; x0 < f.width; x0 += kChunk) {
    const int n = std::min(kChunk, f.width - x0);
    const int body = std::clamp(bodyEnd - x0, 0, n);
    Frame part = f;
    part.y = f.y + x0;
    part.width = n;
    lumaRow(part, r, form, body, luma);
    chromaBlend(ca + x0, cb + x0, body, n, chroma);
    mergeRow(luma, chroma, out + 2 * x0, n);
  }
}

// The whole-frame edge rows, scalar across the row.
void frameEdgeRowInterleaved(const Frame& f, int r, uint8_t* out) {
  const int h = f.height;
  const uint8_t* y = f.Y(r);
  if (h == 2) {
    const uint8_t* other = f.Y(1 - r);
    const uint8_t* c = f.C(0);
    for (int x = 0; x < f.width; ++x) {
      out[2 * x] = r == 0 ? firstBiased(y[x], other[x]) : lastBiased(other[x], y[x]);
      out[2 * x + 1] = c[x];
    }
    return;
  }
  const uint8_t *ca, *cb;
  f.blendRows(r >> 1, ca, cb);
  for (int x = 0; x < f.width; ++x) {
    if (r == 0) out[2 * x] = firstBiased(y[x], f.Y(1)[x]);
    else if (r == h - 1) out[2 * x] = lastBiased(f.Y(r - 1)[x], y[x]);
    else out[2 * x] = innerBiased(f.Y(r - 1)[x], y[x], f.Y(r + 1)[x]);
    out[2 * x + 1] = uint8_t(TruncatedMean(ca[x], cb[x]));
  }
}

// Whole-frame inner rows: vector body below width & ~31, and a tail whose
// two pixels of a pair take different forms.
void frameInnerRowInterleaved(const Frame& f, int r, uint8_t* out) {
  const int bodyEnd = f.width & ~31;
  const uint8_t *ca, *cb;
  f.blendRows(r >> 1, ca, cb);
  alignas(16) uint8_t luma[kChunk + 16], chroma[kChunk + 16];
  const int fused = hasAvx2() ? innerInterleavedAvx(f.Y(r), f.Y(r - 1), f.Y(r + 1), ca, cb, bodyEnd, out) : 0;
  for (int x0 = fused; x0 < bodyEnd; x0 += kChunk) {
    const int n = std::min(kChunk, bodyEnd - x0);
    Frame part = f;
    part.y = f.y + x0;
    part.width = n;
    lumaRow(part, r, Form::Inner, n, luma);
    chromaBlend(ca + x0, cb + x0, n, n, chroma);
    mergeRow(luma, chroma, out + 2 * x0, n);
  }
  const uint8_t *up = f.Y(r - 1), *y = f.Y(r), *down = f.Y(r + 1);
  for (int x = bodyEnd; x < f.width; ++x) {
    out[2 * x] = (x & 1) ? innerBiased(up[x], y[x], down[x]) : innerPairFirst(up[x], y[x], down[x]);
    out[2 * x + 1] = uint8_t(TruncatedMean(ca[x], cb[x]));
  }
}

void filterInterleaved(const Frame& f, uint8_t* dst, int dstStep, int layout) {
  const int h = f.height;
  auto out = [&](int r) { return rowAt(dst, dstStep, r); };
  if ((layout & 21) == 21) {
    for (int r = 0; r < h; ++r) {
      if (r < 2 || r >= h - 2)
        frameEdgeRowInterleaved(f, r, out(r));
      else
        frameInnerRowInterleaved(f, r, out(r));
    }
    // The last row's chroma is that of the row above it.
    if (h > 2)
      for (int x = 0; x < f.width; ++x) out(h - 1)[2 * x + 1] = out(h - 2)[2 * x + 1];
    return;
  }
  const int first = layout == 1 ? 0 : -2;
  const int last = layout == 16 ? h - 1 : h - 3;
  for (int r = first; r <= last; ++r) {
    Form form = Form::Inner;
    int block = 32;
    if (layout == 1 && r < 2) block = 8;
    if (layout == 1 && r == 0) form = Form::First;
    if (layout == 16 && r >= h - 2) block = 8;
    if (layout == 16 && r == h - 1) form = Form::Last;
    sliceRowInterleaved(f, r, form, block, out(r));
  }
  if (layout == 16) {
    // In the tail of the very last row the chroma repeats the row above.
    for (int x = f.width & ~7; x < f.width; ++x) out(h - 1)[2 * x + 1] = out(h - 2)[2 * x + 1];
  }
}

// ---- planar output, chroma at 4:2:0 ----

void filterPlanar(const Frame& f, uint8_t* const dst[3], const int dstStep[3], int layout, bool aligned) {
  const int h = f.height, n = h / 2, cw = f.width / 2;
  auto lumaOut = [&](int r) { return rowAt(dst[0], dstStep[0], r); };
  alignas(16) uint8_t pairs[2 * kChunk + 32];

  // Chroma row j of both planes; in the general middle and last slices
  // the planes cross their steps, each from one row above its pointer.
  auto chromaOut = [&](int plane, int j) {
    if (!aligned && (layout == 4 || layout == 16)) {
      const int other = plane == 1 ? 2 : 1;
      return rowAt(dst[plane], -dstStep[plane], 1) + ptrdiff_t(j + 1) * dstStep[other];
    }
    return rowAt(dst[plane], dstStep[plane], j);
  };
  auto chromaRow = [&](int j, bool alwaysTruncated) {
    const uint8_t *a, *b;
    f.blendRows(j, a, b);
    const int bodyPairs = aligned ? cw : alwaysTruncated ? 0 : cw & ~15;
    for (int k0 = 0; k0 < cw; k0 += kChunk) {
      const int m = std::min(kChunk, cw - k0);
      const int body = std::clamp(bodyPairs - k0, 0, m);
      chromaBlend(a + 2 * k0, b + 2 * k0, 2 * body, 2 * m, pairs);
      uint8_t* p1 = chromaOut(1, j) + k0;
      uint8_t* p2 = chromaOut(2, j) + k0;
      repack::unzip(pairs, p1, p2, m);
    }
  };

  if ((layout & 21) == 21) {
    if (h == 2) {
      const uint8_t *y0 = f.Y(0), *y1 = f.Y(1);
      for (int x = 0; x < f.width; ++x) {
        lumaOut(0)[x] = firstBiased(y0[x], y1[x]);
        lumaOut(1)[x] = lastBiased(y0[x], y1[x]);
      }
      for (int k = 0; k < cw; ++k) {
        chromaOut(1, 0)[k] = f.C(0)[2 * k];
        chromaOut(2, 0)[k] = f.C(0)[2 * k + 1];
      }
      return;
    }
    lumaRow(f, 0, Form::First, 0, lumaOut(0));
    for (int r = 1; r < h - 1; ++r) lumaRow(f, r, Form::Inner, f.width & ~15, lumaOut(r));
    lumaRow(f, h - 1, Form::Last, 0, lumaOut(h - 1));
    for (int j = 0; j < n; ++j) chromaRow(j, j == n - 1);
    return;
  }
  const int first = layout == 1 ? 0 : -2;
  const int last = layout == 16 ? h - 1 : h - 3;
  for (int r = first; r <= last; ++r) {
    const Form form = (layout == 1 && r == 0) ? Form::First : (layout == 16 && r == h - 1) ? Form::Last : Form::Inner;
    const int body = aligned ? f.width : form == Form::Inner ? (f.width & ~15) : 0;
    lumaRow(f, r, form, body, lumaOut(r));
  }
  const int chromaFirst = layout == 1 ? 0 : -1;
  const int chromaLast = layout == 1 ? (h - 2) / 2 - 1 : layout == 4 ? n - 2 : n - 1;
  for (int j = chromaFirst; j <= chromaLast; ++j) chromaRow(j, layout == 16 && j == n - 1);
}

bool aligned16(const void* p) { return (reinterpret_cast<uintptr_t>(p) & 15u) == 0; }

}  // namespace

}  // namespace zel::slices

using namespace zel::slices;

ZEL_PUBLIC Status zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                         int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size,
                                                         int layout) {
  if (!srcY || !srcCbCr || !dst) return StatusNullPointerError;
  if (size.width < 2 || size.height < 2) return StatusSizeError;
  if (!validLayout(layout)) return StatusOk;
  filterInterleaved(Frame{srcY, srcYStep, srcCbCr, srcCbCrStep, size.width & ~1, size.height & ~1}, dst, dstStep,
                    layout);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                         int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3],
                                                         ImageSize size, int layout) {
  if (!srcY || !srcCbCr || !dst || !dstStep) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (!dst[0] || !dst[1] || !dst[2]) return StatusNullPointerError;
  if (size.width < 2 || size.height < 2) return StatusSizeError;
  if (!validLayout(layout)) return StatusOk;
  // Aligned frames of the slice layouts take kernels that use the vector
  // forms across whole rows.
  const bool aligned = (layout & 21) != 21 && (size.width & 62) == 0 && (size.height & 15) == 0 &&
                       (srcYStep & 15) == 0 && (srcCbCrStep & 31) == 0 && (dstStep[0] & 31) == 0 &&
                       (dstStep[1] & 31) == 0 && (dstStep[2] & 31) == 0 && aligned16(srcY) && aligned16(srcCbCr) &&
                       aligned16(dst[0]) && aligned16(dst[1]) && aligned16(dst[2]);
  filterPlanar(Frame{srcY, srcYStep, srcCbCr, srcCbCrStep, size.width & ~1, size.height & ~1}, dst, dstStep, layout,
               aligned);
  return StatusOk;
}
