// Full-range YUV to RGB at full resolution. Lane forms in the body, the exact
// 16.16 forms in the tail; which constant set and which rounding terms each
// member takes is part of its result.
#include "frame/export.h"
#include "luma_chroma/yuv_driver.h"
#include "luma_chroma/yuv_kernels.h"

namespace zel {

namespace {

template <Pixel8 (*Scalar)(int, int, int), Lanes3 (*Vec)(__m128i, __m128i, __m128i),
          Lanes3x16 (*VecAvx2)(__m256i, __m256i, __m256i)>
struct LaneForm {
  static constexpr bool kAvx2 = true;
  static Pixel8 scalar(int y, int u, int v) { return Scalar(y, u, v); }
  static Lanes3 vec(__m128i y, __m128i u, __m128i v) { return Vec(y, u, v); }
  ZEL_AVX2 static Lanes3x16 vec(__m256i y, __m256i u, __m256i v) { return VecAvx2(y, u, v); }
};

using Lanes1 = LaneForm<rgbLanes1, rgbLanes1, rgbLanes1>;
using Lanes2 = LaneForm<rgbLanes2, rgbLanes2, rgbLanes2>;
using Lanes3Form = LaneForm<rgbLanes3, rgbLanes3, rgbLanes3>;

// A wide form with its set and its rounding terms (32768 or 0 per channel).
template <const RgbWideSet& Set, int32_t RoundR, int32_t RoundG, int32_t RoundB>
struct WideForm {
  static constexpr bool kAvx2 = false;
  static constexpr RgbRounding kRounding{RoundR, RoundG, RoundB};
  static Pixel8 scalar(int y, int u, int v) { return rgbWide(Set, kRounding, y, u, v); }
  static Lanes3 vec(__m128i y, __m128i u, __m128i v) { return rgbWide(Set, kRounding, y, u, v); }
};

// Green without rounding beside red and blue with it.
using WideAGreenTruncated = WideForm<rgbWideA, 32768, 0, 32768>;
using WideARounded = WideForm<rgbWideA, 32768, 32768, 32768>;
using WideBTruncated = WideForm<rgbWideB, 0, 0, 0>;

}  // namespace

void yuvToRgbC3Row(const uint8_t* src, uint8_t* dst, int width, Path path) {
  convertRow<Lanes1, WideAGreenTruncated>(ReadC3{src}, WriteC3{dst}, bodyEnd(width, 8), width, path);
}

// One formula for the whole row: its exact vector form over whole blocks of
// eight, the same formula one by one after them.
void yuvToRgbAC4Row(const uint8_t* src, uint8_t* dst, int width, Path path) {
  convertRow<WideAGreenTruncated, WideAGreenTruncated>(ReadC4{src}, WriteAC4{dst}, bodyEnd(width, 8), width, path);
}

void yuvToRgbC3C4Row(const uint8_t* src, uint8_t* dst, int width, uint8_t alpha, Path path) {
  convertRow<Lanes3Form, WideARounded>(ReadC3{src}, WriteC4{dst, alpha}, bodyEnd(width, 8), width, path);
}

void yuvToRgbP3C3Row(const uint8_t* const src[3], uint8_t* dst, int width, Path path) {
  convertRow<Lanes2, WideBTruncated>(ReadP3{src[0], src[1], src[2]}, WriteC3{dst}, bodyEnd(width, 16), width, path);
}

void yuvToRgbP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, Path path) {
  convertRow<WideBTruncated, WideBTruncated>(ReadP3{src[0], src[1], src[2]}, WriteP3{dst[0], dst[1], dst[2]},
                                             bodyEnd(width, 8), width, path);
}

}  // namespace zel

using namespace zel;

ZEL_PUBLIC Status zeliYUVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yuvToRgbC3Row);
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yuvToRgbAC4Row);
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_C3C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                        uint8_t alpha) {
  return walkInterleaved(src, srcStep, dst, dstStep, size,
                         [alpha](const uint8_t* s, uint8_t* d, int width, Path path) {
                           yuvToRgbC3C4Row(s, d, width, alpha, path);
                         });
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(srcPlanes, 3)) return StatusNullPointerError;
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    yuvToRgbP3C3Row(s.p, rowAt(dst, dstStep, y), size.width, path);
  });
  return StatusOk;
}

// Destination entries are tested before source entries.
ZEL_PUBLIC Status zeliYUVToRGB_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyNull(dstPlanes, 3)) return StatusNullPointerError;
  if (anyNull(srcPlanes, 3)) return StatusNullPointerError;
  const Path path = bestPath();
  plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    yuvToRgbP3Row(s.p, d.p, size.width, path);
  });
  return StatusOk;
}
