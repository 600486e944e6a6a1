// Photo YCC with 8-bit samples: high multiplies on 16-bit lanes in the body,
// 32-bit integers in the tail (whose luma constant differs by one on the way
// back).
#include "frame/export.h"
#include "luma_chroma/photo_ycc_forms.h"
#include "luma_chroma/photo_ycc_kernels.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/yuv_driver.h"

namespace zel::lc {

namespace {

struct ForwardLanes {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbToYccLanes(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return rgbToYccLanes<U>(s);
  }
};
struct ForwardWide {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(rgbToYccWide(s.c0, s.c1, s.c2)); }
};
struct InverseLanes {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yccToRgbLanes(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yccToRgbLanes<U>(s);
  }
};
struct InverseWide {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yccToRgbWide(s.c0, s.c1, s.c2)); }
};

// The body runs below width AND NOT 7 for three-byte pixels and below width
// AND NOT 3 for four-byte ones, whose fourth byte is kept.
template <int Channels, class Body, class Tail>
void yccRow8u(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  if constexpr (Channels == 3)
    convertRow(PackedIn<3>{src}, PackedOut3<false>{dst}, width, width & ~7, Body{}, Tail{}, tier);
  else
    convertRow(PackedIn<4>{src}, PackedOutKeep{dst}, width, width & ~3, Body{}, Tail{}, tier);
}

}  // namespace

template <int Channels>
void rgbToYcc8uRow(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  yccRow8u<Channels, ForwardLanes, ForwardWide>(src, dst, width, tier);
}
template <int Channels>
void yccToRgb8uRow(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  yccRow8u<Channels, InverseLanes, InverseWide>(src, dst, width, tier);
}

template void rgbToYcc8uRow<3>(const uint8_t*, uint8_t*, int, VectorTier);
template void rgbToYcc8uRow<4>(const uint8_t*, uint8_t*, int, VectorTier);
template void yccToRgb8uRow<3>(const uint8_t*, uint8_t*, int, VectorTier);
template void yccToRgb8uRow<4>(const uint8_t*, uint8_t*, int, VectorTier);

}  // namespace zel::lc

using namespace zel::lc;

ZEL_PUBLIC Status zeliRGBToYCC_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYcc8uRow<3>);
}
ZEL_PUBLIC Status zeliRGBToYCC_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYcc8uRow<4>);
}
ZEL_PUBLIC Status zeliYCCToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yccToRgb8uRow<3>);
}
ZEL_PUBLIC Status zeliYCCToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, yccToRgb8uRow<4>);
}
