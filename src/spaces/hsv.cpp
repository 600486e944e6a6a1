// RGB to HSV and back, 8u and 16u, C3 and AC4.
#include "frame/export.h"
#include "spaces/float_lanes.h"
#include "spaces/hsv_formulas.h"
#include "spaces/hsv_kernels.h"
#include "spaces/space_frame.h"

namespace zel::spaces::hsv {

#define ZEL_BLOCKS "spaces/hsv_blocks.inc"
#include "spaces/both_widths.inc"

template <int Stride>
int rgbToHsvBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::rgbToHsvBlocks8u<lanes::F8, Stride>(src, dst, n)
                              : sse::rgbToHsvBlocks8u<lanes::F4, Stride>(src, dst, n);
}
template <int Stride, typename T>
int hsvToRgbBlocks(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::hsvToRgbBlocks<lanes::F8, Stride>(src, dst, n)
                              : sse::hsvToRgbBlocks<lanes::F4, Stride>(src, dst, n);
}

template int rgbToHsvBlocks8u<3>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int rgbToHsvBlocks8u<4>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<3, uint8_t>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<4, uint8_t>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int hsvToRgbBlocks<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);

namespace {

template <typename T, typename Formula>
inline void levelPixel(const T* s, T* d, Formula f) {
  const Levels o = f(level(s), level(s + 1), level(s + 2));
  for (int k = 0; k < 3; ++k) storeLevel(d + k, o.c[k]);
}

// Blocks of 4 pixels in both layouts.
template <int Stride>
void rgbToHsvRow8u(const uint8_t* s, uint8_t* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, rgbToHsvBlocks8u<Stride>,
                           [](const uint8_t* p, uint8_t* q) { levelPixel(p, q, rgbToHsvTail8u); });
}
// No vector form.
template <int Stride>
void rgbToHsvRow16u(const uint16_t* s, uint16_t* d, int width, const RowContext&) {
  for (int x = 0; x < width; ++x) levelPixel(s + x * Stride, d + x * Stride, rgbToHsv16u);
}
template <int Stride, typename T>
void hsvToRgbRow(const T* s, T* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, hsvToRgbBlocks<Stride, T>, [](const T* p, T* q) {
    levelPixel(p, q, sizeof(T) == 1 ? hsvToRgb8u : hsvToRgb16u);
  });
}

template <typename T, typename Row>
Status convert(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, Row row) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples, row);
}

}  // namespace

}  // namespace zel::spaces::hsv

using namespace zel::spaces::hsv;

ZEL_PUBLIC Status zeliRGBToHSV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow8u<3>);
}
ZEL_PUBLIC Status zeliRGBToHSV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow8u<4>);
}
ZEL_PUBLIC Status zeliRGBToHSV_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow16u<3>);
}
ZEL_PUBLIC Status zeliRGBToHSV_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow16u<4>);
}
ZEL_PUBLIC Status zeliHSVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<3, uint8_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<4, uint8_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<3, uint16_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<4, uint16_t>);
}
