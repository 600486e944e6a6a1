// The public frame of the packed writers: argument checks in their order,
// then the row driver. Shared by the plain and the dithered members.
#pragma once

#include <cstdint>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/simd.h"
#include "packed16/packed_write_rows.h"
#include "zelcc/zelcc.h"

namespace zel::pack {

inline bool badSize(ImageSize size) { return size.width < 1 || size.height < 1; }
inline WordRows wordRows(uint16_t* dst, int dstStep) { return {dst, dstStep >> 1}; }

// Planes to words: the array and the destination, the size, then the plane
// entries, so that an empty size wins over a null plane.
inline Status planesMember(PlaneChroma chroma, const uint8_t* const srcPlanes[3], const int srcSteps[3],
                           uint16_t* dst, int dstStep, ImageSize size, PackedTarget target, bool dither) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  ycbcrPlanesToWords(chroma, srcPlanes, srcSteps, wordRows(dst, dstStep), size, target, dither, hasAvx2());
  return StatusOk;
}

inline Status yuv420Member(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst, int dstStep,
                           ImageSize size, PackedTarget target, bool dither) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  yuv420ToWords(srcPlanes, srcSteps, wordRows(dst, dstStep), size, target, dither, hasAvx2());
  return StatusOk;
}

inline Status pixelsMember(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size,
                           PackedTarget target, bool dither) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  ycbcrPixelsToWords(src, srcStep, wordRows(dst, dstStep), size, target, dither, hasAvx2());
  return StatusOk;
}

inline Status pairsMember(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size,
                          PackedTarget target, bool dither) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  ycbcrPairsToWords(src, srcStep, wordRows(dst, dstStep), size, target, dither, hasAvx2());
  return StatusOk;
}

}  // namespace zel::pack

// The definitions of the exported members, each a call of its frame above.
#define ZEL_PACKED_PLANES(NAME, TARGET, CHROMA, DITHER)                                                          \
  ZEL_PUBLIC Status NAME(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst, int dstStep, \
                         ImageSize size) {                                                                      \
    return zel::pack::planesMember(zel::pack::PlaneChroma::CHROMA, srcPlanes, srcSteps, dst, dstStep, size,       \
                                  TARGET, DITHER);                                                              \
  }
#define ZEL_PACKED_YUV420(NAME, TARGET, DITHER)                                                                 \
  ZEL_PUBLIC Status NAME(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst, int dstStep, \
                         ImageSize size) {                                                                      \
    return zel::pack::yuv420Member(srcPlanes, srcSteps, dst, dstStep, size, TARGET, DITHER);                     \
  }
#define ZEL_PACKED_PIXELS(NAME, TARGET, DITHER)                                                         \
  ZEL_PUBLIC Status NAME(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) { \
    return zel::pack::pixelsMember(src, srcStep, dst, dstStep, size, TARGET, DITHER);                    \
  }
#define ZEL_PACKED_PAIRS(NAME, TARGET, DITHER)                                                          \
  ZEL_PUBLIC Status NAME(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) { \
    return zel::pack::pairsMember(src, srcStep, dst, dstStep, size, TARGET, DITHER);                     \
  }

// The six field layouts of one pattern, BGR names with red in the top field:
// MEMBER(PREFIX BGR444 SUFFIX, target, ...) and so on.
#define ZEL_PACKED_SIX(MEMBER, PREFIX, SUFFIX, ...)                                                        \
  MEMBER(PREFIX##BGR444##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P444, true}), __VA_ARGS__)  \
  MEMBER(PREFIX##BGR555##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P555, true}), __VA_ARGS__)  \
  MEMBER(PREFIX##BGR565##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P565, true}), __VA_ARGS__)  \
  MEMBER(PREFIX##RGB444##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P444, false}), __VA_ARGS__) \
  MEMBER(PREFIX##RGB555##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P555, false}), __VA_ARGS__) \
  MEMBER(PREFIX##RGB565##SUFFIX, (zel::pack::PackedTarget{zel::pack::Packing::P565, false}), __VA_ARGS__)
