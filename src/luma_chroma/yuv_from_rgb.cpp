// RGB to full-range YUV at full resolution. Each member has its own pair of
// forms: a 16-bit lane body over the first pixels of a row and an exact wide
// tail, and the two differ in the last bit by design.
#include "frame/export.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/yuv_driver.h"
#include "luma_chroma/yuv_kernels.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc {

namespace {

struct MatrixLanes {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvMatrixLanes(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yuvMatrixLanes<U>(s);
  }
};

struct DifferenceLanes {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceLanes(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yuvDifferenceLanes<U>(s);
  }
};

struct DifferenceRounded {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceRounded(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yuvDifferenceRounded<U>(s);
  }
};

struct DifferenceTruncated {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceTruncated(s.c0, s.c1, s.c2)); }
};

struct MatrixWide {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvMatrixWide(s.c0, s.c1, s.c2)); }
};

PlanesOut planesOut(uint8_t* const dst[]) { return {dst[0], dst[1], dst[2]}; }

// The fourth byte of 16 four-byte pixels, gathered.
inline __m128i fourthBytes(const uint8_t* p) {
  const __m128i pick = _mm_setr_epi8(3, 7, 11, 15, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1);
  const __m128i a = _mm_shuffle_epi8(load128(p), pick), b = _mm_shuffle_epi8(load128(p + 16), pick);
  const __m128i c = _mm_shuffle_epi8(load128(p + 32), pick), d = _mm_shuffle_epi8(load128(p + 48), pick);
  return _mm_unpacklo_epi64(_mm_unpacklo_epi32(a, b), _mm_unpacklo_epi32(c, d));
}

}  // namespace

void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, bool avx2) {
  convertRow(PackedIn<3>{src}, PackedOut3<false>{dst}, width, width & ~15, MatrixLanes{}, DifferenceTruncated{}, avx2);
}

void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, bool avx2) {
  convertRow(PackedIn<3>{src}, planesOut(dst), width, width & ~7, MatrixLanes{}, DifferenceTruncated{}, avx2);
}

// Y, U and V of a row come from one pass: with planes that do not overlap
// (the only defined use) that is the same as a pass per output plane.
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, bool avx2) {
  convertRow(PlanesIn{src[0], src[1], src[2]}, planesOut(dst), width, width & ~15, MatrixLanes{}, MatrixWide{}, avx2);
}

// One exact formula for the whole row, in vector blocks and one by one.
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, bool avx2) {
  convertRow(PackedIn<4>{src}, PackedOutKeep{dst}, width, width, DifferenceRounded{}, DifferenceRounded{}, avx2);
}

void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, bool avx2) {
  convertRow(PackedIn<4>{src}, planesOut(dst), width, width & ~7, DifferenceLanes{}, DifferenceRounded{}, avx2);
  // The fourth source byte of every pixel goes to the fourth plane.
  int x = 0;
  for (; x + 16 <= width; x += 16) store128(dst[3] + x, fourthBytes(src + 4 * x));
  for (; x < width; ++x) dst[3][x] = src[4 * x + 3];
}

}  // namespace zel::lc

using namespace zel::lc;

ZEL_PUBLIC Status zeliRGBToYUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYuvC3Row);
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYuvAC4Row);
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                        ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  const bool avx2 = zel::hasAvx2();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvC3P3Row(zel::rowAt(src, srcStep, y), d.p, size.width, avx2);
  });
  return StatusOk;
}

// The fourth plane is not tested and is written.
ZEL_PUBLIC Status zeliRGBToYUV_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                         ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  const bool avx2 = zel::hasAvx2();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 4> d(dstPlanes, dstStep, y);
    rgbToYuvAC4P4Row(zel::rowAt(src, srcStep, y), d.p, size.width, avx2);
  });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(srcPlanes, 3)) return StatusNullPointerError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  const bool avx2 = zel::hasAvx2();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvP3Row(s.p, d.p, size.width, avx2);
  });
  return StatusOk;
}
