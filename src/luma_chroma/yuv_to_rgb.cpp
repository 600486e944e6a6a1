// Full-range YUV to RGB at full resolution. Lane forms in the body, the exact
// 16.16 forms in the tail; which constant set and which rounding terms each
// member takes is part of its result.
#include "frame/export.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/yuv_driver.h"
#include "luma_chroma/yuv_kernels.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc {

namespace {

struct Lanes1 {
  static constexpr bool kVector = true;
  static constexpr bool kHighLanes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbLanes1(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return rgbLanes1<U>(s);
  }
  template <class U>
  ZEL_INLINE Trio<U> highLanes(const Trio<U>& s8) const {
    return rgbLanes1High<U>(s8);
  }
};

struct Lanes2 {
  static constexpr bool kVector = true;
  static constexpr bool kHighLanes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbLanes2(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return rgbLanes2<U>(s);
  }
  template <class U>
  ZEL_INLINE Trio<U> highLanes(const Trio<U>& s8) const {
    return rgbLanes2High<U>(s8);
  }
};

struct Lanes3 {
  static constexpr bool kVector = true;
  static constexpr bool kHighLanes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbLanes3(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return rgbLanes3<U>(s);
  }
  template <class U>
  ZEL_INLINE Trio<U> highLanes(const Trio<U>& s8) const {
    return rgbLanes3High<U>(s8);
  }
};

// A wide form with its set and its rounding terms (32768 or 0 a channel).
struct Wide {
  static constexpr bool kVector = true;
  RgbWideSet set;
  RgbRounding rounding;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbWide(set, rounding, s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return rgbWide<U>(set, rounding, s);
  }
};

// Green without rounding beside red and blue with it.
constexpr Wide kWideAGreenTruncated{rgbWideA, {32768, 0, 32768}};
constexpr Wide kWideARounded{rgbWideA, {32768, 32768, 32768}};
constexpr Wide kWideBTruncated{rgbWideB, {0, 0, 0}};

PlanesIn planesIn(const uint8_t* const src[3]) { return {src[0], src[1], src[2]}; }

}  // namespace

void yuvToRgbC3Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  convertRow(PackedIn<3>{src}, PackedOut3<false>{dst}, width, width & ~7, Lanes1{}, kWideAGreenTruncated, tier);
}

// One exact formula for the whole row, in vector blocks and one by one.
void yuvToRgbAC4Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  convertRow(PackedIn<4>{src}, PackedOutKeep{dst}, width, width, kWideAGreenTruncated, kWideAGreenTruncated, tier);
}

void yuvToRgbC3C4Row(const uint8_t* src, uint8_t* dst, int width, uint8_t alpha, VectorTier tier) {
  convertRow(PackedIn<3>{src}, PackedOutAlpha<false>{dst, alpha}, width, width & ~7, Lanes3{}, kWideARounded, tier);
}

void yuvToRgbP3C3Row(const uint8_t* const src[3], uint8_t* dst, int width, VectorTier tier) {
  convertRow(planesIn(src), PackedOut3<false>{dst}, width, width & ~15, Lanes2{}, kWideBTruncated, tier);
}

void yuvToRgbP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, VectorTier tier) {
  convertRow(planesIn(src), PlanesOut{dst[0], dst[1], dst[2]}, width, width, kWideBTruncated, kWideBTruncated, tier);
}

}  // namespace zel::lc

using namespace zel::lc;
using zel::anyPlaneNull;

ZEL_PUBLIC Status zeliYUVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yuvToRgbC3Row);
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yuvToRgbAC4Row);
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_C3C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                        uint8_t alpha) {
  return walkInterleaved(src, srcStep, dst, dstStep, size,
                         [alpha](const uint8_t* s, uint8_t* d, int width, zel::VectorTier tier) {
                           yuvToRgbC3C4Row(s, d, width, alpha, tier);
                         });
}

ZEL_PUBLIC Status zeliYUVToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes, 3)) return StatusNullPointerError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    yuvToRgbP3C3Row(s.p, zel::rowAt(dst, dstStep, y), size.width, tier);
  });
  return StatusOk;
}

// Destination entries are tested before source entries.
ZEL_PUBLIC Status zeliYUVToRGB_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  if (anyPlaneNull(srcPlanes, 3)) return StatusNullPointerError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    yuvToRgbP3Row(s.p, d.p, size.width, tier);
  });
  return StatusOk;
}
