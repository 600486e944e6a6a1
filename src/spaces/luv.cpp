// RGB (or BGR) to CIE L*u*v* and back: 8u in table and power forms, 16u,
// 16s and 32f, C3 and AC4.
#include <type_traits>

#include "frame/export.h"
#include "spaces/float_lanes.h"
#include "spaces/luv_formulas.h"
#include "spaces/luv_kernels.h"
#include "spaces/space_frame.h"

namespace zel::spaces::luv {

#define ZEL_BLOCKS "spaces/luv_blocks.inc"
#define ZEL_WITH_CUBE_ROOT
#include "spaces/both_widths.inc"

template <bool Bgr>
int forwardTableBlocks(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::forwardTableBlocks<lanes::F8, Bgr>(src, dst, n)
                              : sse::forwardTableBlocks<lanes::F4, Bgr>(src, dst, n);
}
template <int Stride, bool Bgr>
int forward32fBlocks(Lanes lanes, const float* src, float* dst, int n, RowStores how) {
  if constexpr (Stride == 3)
    if (lanes == Lanes::Avx512) return avx512::forward32fBlocks<lanes::F16, 3, Bgr>(src, dst, n, how);
  return lanes != Lanes::Sse4 ? avx2::forward32fBlocks<lanes::F8, Stride, Bgr>(src, dst, n, how)
                              : sse::forward32fBlocks<lanes::F4, Stride, Bgr>(src, dst, n, how);
}
template <int Stride, typename T>
int forward16Blocks(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::forward16Blocks<lanes::F8, Stride, T>(src, dst, n)
                              : sse::forward16Blocks<lanes::F4, Stride, T>(src, dst, n);
}
template <int Stride, bool Bgr>
int inverse8uBlocks(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::inverse8uBlocks<lanes::F8, Stride, Bgr>(src, dst, n)
                              : sse::inverse8uBlocks<lanes::F4, Stride, Bgr>(src, dst, n);
}
template <int Stride, typename T>
int inverse16Blocks(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::inverse16Blocks<lanes::F8, Stride, T>(src, dst, n)
                              : sse::inverse16Blocks<lanes::F4, Stride, T>(src, dst, n);
}
template <bool Bgr>
int inverse32fBlocks(Lanes lanes, const float* src, float* dst, int n, RowStores how) {
  if (lanes == Lanes::Avx512) return avx512::inverse32fBlocks<lanes::F16, Bgr>(src, dst, n, how);
  return lanes != Lanes::Sse4 ? avx2::inverse32fBlocks<lanes::F8, Bgr>(src, dst, n, how)
                              : sse::inverse32fBlocks<lanes::F4, Bgr>(src, dst, n, how);
}

template int forwardTableBlocks<false>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int forwardTableBlocks<true>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int forward32fBlocks<3, false>(Lanes, const float*, float*, int, RowStores);
template int forward32fBlocks<4, false>(Lanes, const float*, float*, int, RowStores);
template int forward32fBlocks<3, true>(Lanes, const float*, float*, int, RowStores);
template int forward16Blocks<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int forward16Blocks<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int forward16Blocks<3, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int forward16Blocks<4, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int inverse8uBlocks<3, false>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int inverse8uBlocks<3, true>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int inverse8uBlocks<4, false>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int inverse16Blocks<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int inverse16Blocks<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int inverse16Blocks<3, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int inverse16Blocks<4, int16_t>(Lanes, const int16_t*, int16_t*, int, RowStores);
template int inverse32fBlocks<false>(Lanes, const float*, float*, int, RowStores);
template int inverse32fBlocks<true>(Lanes, const float*, float*, int, RowStores);

namespace {

// All block forms take 4 pixels.
constexpr int kBlock = 4;

template <bool Bgr>
Status forwardTable(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Bytes,
                      [](const uint8_t* s, uint8_t* d, int w, const RowContext& c) {
                        splitRow<3, 3>(s, d, w, kBlock, c, forwardTableBlocks<Bgr>, forwardTablePixel<Bgr, Zone::Tail>);
                      });
}

// Float frames of three-float pixels larger than the cache stream their
// output.
template <int Stride, bool Bgr>
Status forwardFloat(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  constexpr Streaming kStream = Stride == 3 ? Streaming::BeyondCache : Streaming::Never;
  return convertImage<kStream>(
      src, srcStep, dst, dstStep, size, StepUnit::Bytes,
      [](const float* s, float* d, int w, const RowContext& c) {
        splitRow<Stride, Stride>(s, d, w, kBlock, c, forward32fBlocks<Stride, Bgr>, forward32fPixel<Bgr, Zone::Tail>);
      },
      4 * Stride, 4 * Stride);
}

// The tail of 16u AC4 truncates where the others round.
template <int Stride, typename T>
Status forwardWide(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {
  constexpr bool truncating = Stride == 4 && std::is_same_v<T, uint16_t>;
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples,
                      [](const T* s, T* d, int w, const RowContext& c) {
                        splitRow<Stride, Stride>(s, d, w, kBlock, c, forward16Blocks<Stride, T>,
                                                 forward16Pixel<T, Zone::Tail, truncating>);
                      });
}

template <int Stride, bool Bgr>
Status inverse8u(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Bytes,
                      [](const uint8_t* s, uint8_t* d, int w, const RowContext& c) {
                        splitRow<Stride, Stride>(s, d, w, kBlock, c, inverse8uBlocks<Stride, Bgr>,
                                                 inverse8uPixel<Bgr, Stride == 4, Zone::Tail>);
                      });
}

template <int Stride, typename T>
Status inverseWide(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples,
                      [](const T* s, T* d, int w, const RowContext& c) {
                        splitRow<Stride, Stride>(s, d, w, kBlock, c, inverse16Blocks<Stride, T>,
                                                 inverse16Pixel<T, Zone::Tail>);
                      });
}

template <bool Bgr>
Status inverseFloat(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convertImage<Streaming::BeyondCache>(
      src, srcStep, dst, dstStep, size, StepUnit::Bytes,
      [](const float* s, float* d, int w, const RowContext& c) {
        splitRow<3, 3>(s, d, w, kBlock, c, inverse32fBlocks<Bgr>, inverse32fPixel<Bgr, Zone::Tail>);
      },
      12, 12);
}

}  // namespace

}  // namespace zel::spaces::luv

using namespace zel::spaces::luv;
using zel::spaces::convertImage;
using zel::spaces::RowContext;
using zel::spaces::StepUnit;

ZEL_PUBLIC Status zeliRGBToLUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return forwardTable<false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToLUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return forwardTable<true>(src, srcStep, dst, dstStep, size);
}
// The power form: one pixel at a time, no vector form.
ZEL_PUBLIC Status zeliRGBToLUV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Bytes,
                      [](const uint8_t* s, uint8_t* d, int w, const RowContext&) {
                        for (int x = 0; x < w; ++x) forwardPowerPixel(s + 4 * x, d + 4 * x);
  });
}
ZEL_PUBLIC Status zeliRGBToLUV_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return forwardWide<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLUV_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return forwardWide<4>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLUV_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size) {
  return forwardWide<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLUV_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size) {
  return forwardWide<4>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLUV_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return forwardFloat<3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLUV_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return forwardFloat<4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToLUV_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return forwardFloat<3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return inverse8u<3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToBGR_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return inverse8u<3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return inverse8u<4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return inverseWide<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return inverseWide<4>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size) {
  return inverseWide<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size) {
  return inverseWide<4>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return inverseFloat<false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLUVToBGR_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return inverseFloat<true>(src, srcStep, dst, dstStep, size);
}
// No block form; the only float member that counts its steps in samples.
ZEL_PUBLIC Status zeliLUVToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples,
                      [](const float* s, float* d, int w, const RowContext&) {
                        for (int x = 0; x < w; ++x) inverse32fPixel<false, Zone::Tail>(s + 4 * x, d + 4 * x);
  });
}
