// RGB (or BGR) to CIE Lab and back: 8u, 16u Lab from and to 8u BGR, 32f.
#include <type_traits>

#include "frame/export.h"
#include "spaces/float_lanes.h"
#include "spaces/lab_formulas.h"
#include "spaces/lab_kernels.h"
#include "spaces/space_frame.h"

namespace zel::spaces::lab {

#define ZEL_BLOCKS "spaces/lab_blocks.inc"
#define ZEL_WITH_CUBE_ROOT
#include "spaces/both_widths.inc"

// Lanes::Avx512 takes the 16-lane body of the byte and float forms; the
// 16-bit Lab form stays at 8 lanes.
template <typename S, typename D, bool Bgr>
int forwardBlocks(Lanes lanes, const S* src, D* dst, int n, RowStores how) {
  if constexpr (sizeof(D) != 2)
    if (lanes == Lanes::Avx512) return avx512::forwardBlocks<lanes::F16, S, D, Bgr>(src, dst, n, how);
  return lanes != Lanes::Sse4 ? avx2::forwardBlocks<lanes::F8, S, D, Bgr>(src, dst, n, how)
                              : sse::forwardBlocks<lanes::F4, S, D, Bgr>(src, dst, n, how);
}
template <typename S, typename D, bool Bgr>
int inverseBlocks(Lanes lanes, const S* src, D* dst, int n, RowStores) {
  return lanes != Lanes::Sse4 ? avx2::inverseBlocks<lanes::F8, S, D, Bgr>(src, dst, n)
                              : sse::inverseBlocks<lanes::F4, S, D, Bgr>(src, dst, n);
}

template int forwardBlocks<uint8_t, uint8_t, false>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int forwardBlocks<uint8_t, uint8_t, true>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int forwardBlocks<uint8_t, uint16_t, true>(Lanes, const uint8_t*, uint16_t*, int, RowStores);
template int forwardBlocks<float, float, false>(Lanes, const float*, float*, int, RowStores);
template int forwardBlocks<float, float, true>(Lanes, const float*, float*, int, RowStores);
template int inverseBlocks<uint8_t, uint8_t, false>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int inverseBlocks<uint8_t, uint8_t, true>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int inverseBlocks<uint16_t, uint8_t, true>(Lanes, const uint16_t*, uint8_t*, int, RowStores);
template int inverseBlocks<float, float, false>(Lanes, const float*, float*, int, RowStores);
template int inverseBlocks<float, float, true>(Lanes, const float*, float*, int, RowStores);

namespace {

// Blocks of 4 pixels; steps stay in bytes for every sample type.
// Float frames larger than the cache stream the forward output.
template <typename S, typename D, bool Bgr>
Status forward(const S* src, int srcStep, D* dst, int dstStep, ImageSize size) {
  constexpr Streaming kStream = std::is_same_v<S, float> ? Streaming::BeyondCache : Streaming::Never;
  return convertImage<kStream>(
      src, srcStep, dst, dstStep, size, StepUnit::Bytes,
      [](const S* s, D* d, int width, const RowContext& c) {
        splitRow<3, 3>(s, d, width, 4, c, forwardBlocks<S, D, Bgr>, forwardPixel<S, D, Bgr, Zone::Tail>);
      },
      3 * int(sizeof(S)), 3 * int(sizeof(D)));
}
template <typename S, typename D, bool Bgr>
Status inverse(const S* src, int srcStep, D* dst, int dstStep, ImageSize size) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Bytes,
                      [](const S* s, D* d, int width, const RowContext& c) {
                        splitRow<3, 3>(s, d, width, 4, c, inverseBlocks<S, D, Bgr>, inversePixel<S, D, Bgr>);
                      });
}

}  // namespace

}  // namespace zel::spaces::lab

using namespace zel::spaces::lab;

ZEL_PUBLIC Status zeliRGBToLab_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return forward<uint8_t, uint8_t, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToLab_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return forward<uint8_t, uint8_t, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToLab_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep,
                                         ImageSize size) {
  return forward<uint8_t, uint16_t, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToLab_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return forward<float, float, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToLab_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return forward<float, float, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLabToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return inverse<uint8_t, uint8_t, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLabToBGR_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return inverse<uint8_t, uint8_t, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLabToBGR_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  return inverse<uint16_t, uint8_t, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLabToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return inverse<float, float, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliLabToBGR_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return inverse<float, float, true>(src, srcStep, dst, dstStep, size);
}
