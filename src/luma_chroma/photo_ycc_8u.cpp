// Photo YCC with 8-bit samples: high multiplies on 16-bit lanes in the body,
// 32-bit integers in the tail (whose luma constant differs by one on the way
// back).
#include "frame/export.h"
#include "luma_chroma/photo_ycc_forms.h"
#include "luma_chroma/photo_ycc_kernels.h"
#include "luma_chroma/yuv_driver.h"

namespace zel {

namespace {

struct ForwardLanes {
  static constexpr bool kAvx2 = true;
  static Lanes3 vec(__m128i r, __m128i g, __m128i b) { return rgbToYccLanes(r, g, b); }
  ZEL_AVX2 static Lanes3x16 vec(__m256i r, __m256i g, __m256i b) { return rgbToYccLanes(r, g, b); }
};
struct ForwardWide {
  static Pixel8 scalar(int r, int g, int b) { return rgbToYccWide(r, g, b); }
};
struct InverseLanes {
  static constexpr bool kAvx2 = true;
  static Lanes3 vec(__m128i y, __m128i c1, __m128i c2) { return yccToRgbLanes(y, c1, c2); }
  ZEL_AVX2 static Lanes3x16 vec(__m256i y, __m256i c1, __m256i c2) { return yccToRgbLanes(y, c1, c2); }
};
struct InverseWide {
  static Pixel8 scalar(int y, int c1, int c2) { return yccToRgbWide(y, c1, c2); }
};

// Three-channel rows take blocks of 8, four-channel rows blocks of 4.
template <typename Body, typename Tail, int Channels>
void yccRow8u(const uint8_t* src, uint8_t* dst, int width, Path path) {
  if constexpr (Channels == 3)
    convertRow<Body, Tail, 8>(ReadC3{src}, WriteC3{dst}, bodyEnd(width, 8), width, path);
  else
    convertRow<Body, Tail, 4>(ReadC4{src}, WriteAC4{dst}, bodyEnd(width, 4), width, path);
}

}  // namespace

template <int Channels>
void rgbToYcc8uRow(const uint8_t* src, uint8_t* dst, int width, Path path) {
  yccRow8u<ForwardLanes, ForwardWide, Channels>(src, dst, width, path);
}
template <int Channels>
void yccToRgb8uRow(const uint8_t* src, uint8_t* dst, int width, Path path) {
  yccRow8u<InverseLanes, InverseWide, Channels>(src, dst, width, path);
}

template void rgbToYcc8uRow<3>(const uint8_t*, uint8_t*, int, Path);
template void rgbToYcc8uRow<4>(const uint8_t*, uint8_t*, int, Path);
template void yccToRgb8uRow<3>(const uint8_t*, uint8_t*, int, Path);
template void yccToRgb8uRow<4>(const uint8_t*, uint8_t*, int, Path);

}  // namespace zel

using namespace zel;

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
