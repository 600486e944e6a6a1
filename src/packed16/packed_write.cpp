// Writers of 16-bit packed words that truncate each colour to its field:
// from YCbCr at full resolution, 4:2:2, 4:2:0 and 4:1:1, from YUV 4:2:0, and
// from three bytes a pixel.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "packed16/packed_write_members.h"

using namespace zel::pack;
using zel::anyPlaneNull;

ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCrTo, _8u16u_P3C3R, Full, false)
ZEL_PACKED_SIX(ZEL_PACKED_PIXELS, zeliYCbCrTo, _8u16u_C3R, false)
ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCr422To, _8u16u_P3C3R, Half, false)
ZEL_PACKED_SIX(ZEL_PACKED_PAIRS, zeliYCbCr422To, _8u16u_C2C3R, false)
ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCr420To, _8u16u_P3C3R, HalfBoth, false)
ZEL_PACKED_SIX(ZEL_PACKED_YUV420, zeliYUV420To, _8u16u_P3C3R, false)

namespace {

// 4:1:1: every pointer first, then the size; a width that is no multiple
// of 4 warns (its last pixels take the rounded form on the chroma sample
// they fall on).
Status ycbcr411Member(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst, int dstStep,
                      ImageSize size, PackedTarget target) {
  if (!srcPlanes || anyPlaneNull(srcPlanes) || !dst) return StatusNullPointerError;
  if (size.width < 4 || size.height < 1) return StatusSizeError;
  ycbcr411ToWords(srcPlanes, srcSteps, wordRows(dst, dstStep), size, target, zel::hasAvx2());
  return (size.width & 3) ? StatusOddSizeWarning : StatusOk;
}

}  // namespace

ZEL_PUBLIC Status zeliYCbCr411ToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                                   uint16_t* dst, int dstStep, ImageSize size) {
  return ycbcr411Member(srcPlanes, srcSteps, dst, dstStep, size, {Packing::P555, true});
}

ZEL_PUBLIC Status zeliYCbCr411ToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                                   uint16_t* dst, int dstStep, ImageSize size) {
  return ycbcr411Member(srcPlanes, srcSteps, dst, dstStep, size, {Packing::P565, true});
}

// The packing is the same whichever channel comes first, so the RGB name is
// the BGR one: the first byte of a pixel always lands in the low field.
ZEL_PUBLIC Status zeliBGRToBGR565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep,
                                            ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  bytesTo565Words(src, srcStep, wordRows(dst, dstStep), size, zel::hasAvx2());
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToRGB565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep,
                                            ImageSize size) __attribute__((alias("zeliBGRToBGR565_8u16u_C3R")));
