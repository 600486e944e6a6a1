// RGB to XYZ and back for 8u, 16u, 16s and 32f samples, C3 and AC4.
#include <type_traits>

#include "frame/export.h"
#include "spaces/float_lanes.h"
#include "spaces/space_frame.h"
#include "spaces/xyz_formulas.h"
#include "spaces/xyz_kernels.h"

namespace zel::spaces::xyz {

#define ZEL_BLOCKS "spaces/xyz_blocks.inc"
#include "spaces/both_widths.inc"

// Lanes::Avx512 takes the 16-lane body where a member has one, else the
// 8-lane one. Only the float bodies store as `how` says.
template <int Stride>
int rgbToXyzBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::fixedBlocks8u<lanes::F8, Stride, true>(src, dst, n)
                              : sse::fixedBlocks8u<lanes::F4, Stride, true>(src, dst, n);
}
template <int Stride>
int xyzToRgbBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::fixedBlocks8u<lanes::F8, Stride, false>(src, dst, n)
                              : sse::fixedBlocks8u<lanes::F4, Stride, false>(src, dst, n);
}
template <int Stride, typename T>
int rgbToXyzBlocks16(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::floatBlocks16<lanes::F8, Stride, T, true>(src, dst, n)
                              : sse::floatBlocks16<lanes::F4, Stride, T, true>(src, dst, n);
}
template <int Stride, typename T>
int xyzToRgbBlocks16(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::floatBlocks16<lanes::F8, Stride, T, false>(src, dst, n)
                              : sse::floatBlocks16<lanes::F4, Stride, T, false>(src, dst, n);
}
template <int Stride>
int rgbToXyzBlocks32f(Lanes lanes, const float* src, float* dst, int n, RowStores how) {
  if constexpr (Stride == 3)
    if (lanes == Lanes::Avx512) return avx512::rgbToXyzBlocks32f<lanes::F16, 3>(src, dst, n, how);
  return lanes != Lanes::Sse4 ? avx2::rgbToXyzBlocks32f<lanes::F8, Stride>(src, dst, n, how)
                              : sse::rgbToXyzBlocks32f<lanes::F4, Stride>(src, dst, n, how);
}
template <int Stride>
int xyzToRgbBlocks32f(Lanes lanes, const float* src, float* dst, int n, RowStores how) {
  if constexpr (Stride == 3)
    if (lanes == Lanes::Avx512) return avx512::xyzToRgbBlocks32f<lanes::F16, 3>(src, dst, n, how);
  return lanes != Lanes::Sse4 ? avx2::xyzToRgbBlocks32f<lanes::F8, Stride>(src, dst, n, how)
                              : sse::xyzToRgbBlocks32f<lanes::F4, Stride>(src, dst, n, how);
}

template int rgbToXyzBlocks8u<3>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int rgbToXyzBlocks8u<4>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int xyzToRgbBlocks8u<3>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int xyzToRgbBlocks8u<4>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int rgbToXyzBlocks16<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int rgbToXyzBlocks16<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int rgbToXyzBlocks16<3, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int rgbToXyzBlocks16<4, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int xyzToRgbBlocks16<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int xyzToRgbBlocks16<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int xyzToRgbBlocks16<3, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int xyzToRgbBlocks16<4, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int rgbToXyzBlocks32f<3>(Lanes, const float*, float*, int, RowStores);
template int rgbToXyzBlocks32f<4>(Lanes, const float*, float*, int, RowStores);
template int xyzToRgbBlocks32f<3>(Lanes, const float*, float*, int, RowStores);
template int xyzToRgbBlocks32f<4>(Lanes, const float*, float*, int, RowStores);

namespace {

// Integer tails: the three levels of a pixel through a formula, stored as
// their low bits (the formulas have already limited them).
template <typename T, typename Formula>
inline void levelPixel(const T* s, T* d, Formula f) {
  const Levels o = f(level(s), level(s + 1), level(s + 2));
  for (int k = 0; k < 3; ++k) storeLevel(d + k, o.c[k]);
}

template <typename Formula>
inline void floatPixel(const float* s, float* d, Formula f) {
  const Floats o = f(loadSample(s), loadSample(s + 1), loadSample(s + 2));
  for (int k = 0; k < 3; ++k) storeSample(d + k, o.c[k]);
}

// 8u C3 blocks are 8 pixels (24 bytes), AC4 blocks 4.
template <int Stride>
void rgbToXyzRow8u(const uint8_t* s, uint8_t* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, Stride == 3 ? 8 : 4, c, rgbToXyzBlocks8u<Stride>,
                           [](const uint8_t* p, uint8_t* q) { levelPixel(p, q, rgbToXyzTail8u); });
}
template <int Stride>
void xyzToRgbRow8u(const uint8_t* s, uint8_t* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, Stride == 3 ? 8 : 4, c, xyzToRgbBlocks8u<Stride>,
                           [](const uint8_t* p, uint8_t* q) { levelPixel(p, q, xyzToRgbTail8u); });
}
template <int Stride, typename T>
void rgbToXyzRow16(const T* s, T* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, rgbToXyzBlocks16<Stride, T>,
                           [](const T* p, T* q) { levelPixel(p, q, rgbToXyz16); });
}
template <int Stride, typename T>
void xyzToRgbRow16(const T* s, T* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, xyzToRgbBlocks16<Stride, T>,
                           [](const T* p, T* q) { levelPixel(p, q, xyzToRgb16); });
}
template <int Stride>
void rgbToXyzRow32f(const float* s, float* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, rgbToXyzBlocks32f<Stride>,
                           [](const float* p, float* q) { floatPixel(p, q, rgbToXyz32f); });
}
// One formula for every pixel: the vector lanes compute exactly what the
// pixel-by-pixel form does, and the pixels after the last block take it.
template <int Stride>
void xyzToRgbRow32f(const float* s, float* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, xyzToRgbBlocks32f<Stride>,
                           [](const float* p, float* q) { floatPixel(p, q, xyzToRgb32f); });
}

template <typename T, typename Row>
Status convert(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, Row row) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples, row);
}
// Float C3 frames larger than the cache stream their output.
template <typename Row>
Status convertStreamed(const float* src, int srcStep, float* dst, int dstStep, ImageSize size, Row row) {
  return convertImage<Streaming::BeyondCache>(src, srcStep, dst, dstStep, size, StepUnit::Samples, row, 12, 12);
}

}  // namespace

}  // namespace zel::spaces::xyz

using namespace zel::spaces::xyz;

ZEL_PUBLIC Status zeliRGBToXYZ_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow8u<3>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow8u<4>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow16<3, uint16_t>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow16<4, uint16_t>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow16<3, int16_t>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow16<4, int16_t>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convertStreamed(src, srcStep, dst, dstStep, size, rgbToXyzRow32f<3>);
}
ZEL_PUBLIC Status zeliRGBToXYZ_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToXyzRow32f<4>);
}
ZEL_PUBLIC Status zeliXYZToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow8u<3>);
}
ZEL_PUBLIC Status zeliXYZToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow8u<4>);
}
ZEL_PUBLIC Status zeliXYZToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow16<3, uint16_t>);
}
ZEL_PUBLIC Status zeliXYZToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow16<4, uint16_t>);
}
ZEL_PUBLIC Status zeliXYZToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow16<3, int16_t>);
}
ZEL_PUBLIC Status zeliXYZToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow16<4, int16_t>);
}
ZEL_PUBLIC Status zeliXYZToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convertStreamed(src, srcStep, dst, dstStep, size, xyzToRgbRow32f<3>);
}
ZEL_PUBLIC Status zeliXYZToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, xyzToRgbRow32f<4>);
}
