// RGB to full-range YUV at full resolution. Each member has its own pair of
// forms: a 16-bit lane body over the first pixels of a row and an exact wide
// tail, and the two differ in the last bit by design.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "luma_chroma/yuv_driver.h"
#include "luma_chroma/yuv_kernels.h"

namespace zel {

namespace {

struct MatrixLanes {
  static constexpr bool kAvx2 = true;
  static Pixel8 scalar(int r, int g, int b) { return yuvMatrixLanes(r, g, b); }
  static Lanes3 vec(__m128i r, __m128i g, __m128i b) { return yuvMatrixLanes(r, g, b); }
  ZEL_AVX2 static Lanes3x16 vec(__m256i r, __m256i g, __m256i b) { return yuvMatrixLanes(r, g, b); }
};

struct DifferenceLanes {
  static constexpr bool kAvx2 = true;
  static Pixel8 scalar(int r, int g, int b) { return yuvDifferenceLanes(r, g, b); }
  static Lanes3 vec(__m128i r, __m128i g, __m128i b) { return yuvDifferenceLanes(r, g, b); }
  ZEL_AVX2 static Lanes3x16 vec(__m256i r, __m256i g, __m256i b) { return yuvDifferenceLanes(r, g, b); }
};

struct DifferenceRounded {
  static constexpr bool kAvx2 = false;
  static Pixel8 scalar(int r, int g, int b) { return yuvDifferenceRounded(r, g, b); }
  static Lanes3 vec(__m128i r, __m128i g, __m128i b) { return yuvDifferenceRounded(r, g, b); }
};

struct DifferenceTruncated {
  static constexpr bool kAvx2 = false;
  static Pixel8 scalar(int r, int g, int b) { return yuvDifferenceTruncated(r, g, b); }
};

struct MatrixWide {
  static constexpr bool kAvx2 = false;
  static Pixel8 scalar(int r, int g, int b) { return yuvMatrixWide(r, g, b); }
};

}  // namespace

void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, Path path) {
  convertRow<MatrixLanes, DifferenceTruncated>(ReadC3{src}, WriteC3{dst}, bodyEnd(width, 16), width, path);
}

void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, Path path) {
  convertRow<MatrixLanes, DifferenceTruncated>(ReadC3{src}, WriteP3{dst[0], dst[1], dst[2]}, bodyEnd(width, 8),
                                               width, path);
}

// Y, U and V of a row come from one pass: with planes that do not overlap
// (the only defined use) that is the same as a pass per output plane.
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, Path path) {
  convertRow<MatrixLanes, MatrixWide>(ReadP3{src[0], src[1], src[2]}, WriteP3{dst[0], dst[1], dst[2]},
                                      bodyEnd(width, 16), width, path);
}

// One formula for the whole row: its exact vector form over whole blocks of
// eight, the same formula one by one after them.
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, Path path) {
  convertRow<DifferenceRounded, DifferenceRounded>(ReadC4{src}, WriteAC4{dst}, bodyEnd(width, 8), width, path);
}

void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, Path path) {
  convertRow<DifferenceLanes, DifferenceRounded>(ReadC4{src}, WriteP3{dst[0], dst[1], dst[2]}, bodyEnd(width, 8),
                                                 width, path);
  // The fourth source byte of every pixel goes to the fourth plane.
  int x = 0;
  for (; x + 16 <= width; x += 16) {
    __m128i c0, c1, c2, c3;
    rows_detail::splitC4x16(src + 4 * x, c0, c1, c2, c3);
    store128(dst[3] + x, c3);
  }
  for (; x < width; ++x) dst[3][x] = src[4 * x + 3];
}

}  // namespace zel

using namespace zel;

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
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvC3P3Row(rowAt(src, srcStep, y), d.p, size.width, path);
  });
  return StatusOk;
}

// The fourth plane is not tested and is written.
ZEL_PUBLIC Status zeliRGBToYUV_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                         ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 4> d(dstPlanes, dstStep, y);
    rgbToYuvAC4P4Row(rowAt(src, srcStep, y), d.p, size.width, path);
  });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(srcPlanes, 3)) return StatusNullPointerError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvP3Row(s.p, d.p, size.width, path);
  });
  return StatusOk;
}
