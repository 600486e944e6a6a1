// RGB or BGR to subsampled full-range YUV: 4:2:0 and 4:2:2 in planes, with
// and without steps. The names without steps take tightly packed images;
// their 4:2:2 members treat a large enough image of even width as one long
// row. The interleaved 4:2:2 member with steps (and its twin without) runs
// a second kernel of its own arithmetic when all its buffers and steps are
// multiples of 16.
#include <cstdint>
#include <type_traits>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "luma_chroma/rgb_to_sub_rows.h"
#include "luma_chroma/rgb_to_sub_yuv_forms.h"

namespace zel::lc::sub {

namespace {

// The checks of the members from planes: the arrays (and the step array
// where there is one), the size, then the planes the arrays hold.
Status planarChecks(const uint8_t* const src[3], uint8_t* const dst[3], const int* dstSteps, bool withSteps,
                    ImageSize size) {
  if (!src || !dst || (withSteps && !dstSteps)) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(src) || anyPlaneNull(dst)) return StatusNullPointerError;
  return StatusOk;
}

// ---- 4:2:0 ----

template <class Body, class Tail, class Rows>
void walk420(const Rows& rows, uint8_t* const dst[3], const int steps[3], ImageSize size, int n) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  rowPairWalk(size.height, [&](int r, int c) {
    const Planes420Out out{rowAt(dst[0], steps[0], r), rowAt(dst[0], steps[0], r + 1), rowAt(dst[1], steps[1], c),
                           rowAt(dst[2], steps[2], c)};
    convertPair(rows(r), rows(r + 1), out, size.width, n, Body{}, Tail{}, tier);
  });
}

// The wide form for every pixel (no body), in exact 32-bit lanes where
// whole blocks of 16 fit.
void planes420(const uint8_t* const src[3], int srcStep, uint8_t* const dst[3], const int steps[3], ImageSize size) {
  const PlaneRows rows{src, srcStep};
  const int end = size.width & ~1;
  rowPairWalk(size.height, [&](int r, int c) {
    const Planes420Out out{rowAt(dst[0], steps[0], r), rowAt(dst[0], steps[0], r + 1), rowAt(dst[1], steps[1], c),
                           rowAt(dst[2], steps[2], c)};
    const PlanesSource top = rows(r), bottom = rows(r + 1);
    pairSpan(top, bottom, out, wideDifference420Blocks(top, bottom, out, 0, end), end, WideDifference420Tail{});
  });
}

// Rounded lanes over half-width blocks, 2.14 tail.
void packed420(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int steps[3], ImageSize size) {
  walk420<RoundedDifferenceBody<4>, Wide14Difference420Tail>(PackedRows<3, false>{src, srcStep}, dst, steps, size,
                                                             bodyByHalfWidth(size.width));
}

// ---- 4:2:2 in planes ----

template <bool Rounding>
using PlanesTail422 = WideDifference422Tail<0, 65535, Odd15<Rounding>>;

// One row of the general kernel, or of the aligned kernel's own arithmetic.
template <class Src>
void row422(const Src& in, const PlanesOutSub<2, true>& out, int width, bool aligned, VectorTier tier) {
  constexpr bool kInterleaved = !std::is_same_v<Src, PlanesSource>;
  if (aligned)
    convertRow<2>(in, out, width, width & ~15, RoundedDifferenceBody<2>{}, SplitLumaPairTail{}, tier);
  else
    convertRow<2>(in, out, width, width & ~15, DifferenceBody<2>{}, PlanesTail422<kInterleaved>{}, tier);
}

template <class Rows>
void walk422(const Rows& rows, uint8_t* const dst[3], const int steps[3], ImageSize size, bool aligned) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  plainWalk(size.height, [&](int y) {
    row422(rows(y),
           PlanesOutSub<2, true>{rowAt(dst[0], steps[0], y), rowAt(dst[1], steps[1], y), rowAt(dst[2], steps[2], y)},
           size.width, aligned, tier);
  });
}

// The aligned kernel's test: the source, its step, every plane and step a
// multiple of 16.
bool allAligned16(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int steps[3]) {
  bool aligned = isAligned16(src) && isAligned16(srcStep);
  for (int k = 0; k < 3; ++k) aligned = aligned && isAligned16(dst[k]) && isAligned16(steps[k]);
  return aligned;
}

// Names without steps: an image of even width and at least 256 pixels is
// one row, cut after (width * height) AND NOT 7 pixels; `image` converts a
// row of the given pixels from the given first pixel.
template <class Image, class Rows>
void packedOrRows(ImageSize size, Image image, Rows rows) {
  const int64_t total = int64_t(size.width) * size.height;
  if (total >= 256 && !(size.width & 1) && total <= INT32_MAX) {
    const int first = int(total) & ~7;
    image(0, first);
    image(first, int(total) - first);
  } else {
    rows();
  }
}

}  // namespace

}  // namespace zel::lc::sub

using namespace zel::lc::sub;
using zel::anyPlaneNull;
using zel::lc::PackedIn;
using zel::lc::PlanesIn;

// ---- 4:2:0 ----

ZEL_PUBLIC Status zeliBGRToYUV420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                            const int dstSteps[3], ImageSize size) {
  if (!src || !dstPlanes || !dstSteps) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  walk420<DifferenceBody<4>, WideDifference420Tail>(PackedRows<4, true>{src, srcStep}, dstPlanes, dstSteps, size,
                                                    size.width & ~15);
  return oddWarning(size, true);
}

ZEL_PUBLIC Status zeliRGBToYUV420_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                         const int dstSteps[3], ImageSize size) {
  if (const Status bad = planarChecks(srcPlanes, dstPlanes, dstSteps, true, size)) return bad;
  planes420(srcPlanes, srcStep, dstPlanes, dstSteps, size);
  return oddWarning(size, true);
}

ZEL_PUBLIC Status zeliRGBToYUV420_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3],
                                        ImageSize size) {
  if (const Status bad = planarChecks(srcPlanes, dstPlanes, nullptr, false, size)) return bad;
  const int steps[3] = {size.width, size.width >> 1, size.width >> 1};
  planes420(srcPlanes, size.width, dstPlanes, steps, size);
  return oddWarning(size, true);
}

ZEL_PUBLIC Status zeliRGBToYUV420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                           const int dstSteps[3], ImageSize size) {
  if (!src || !dstPlanes || !dstSteps) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  // Aligned planes would take aligned stores; the bytes are the same.
  packed420(src, srcStep, dstPlanes, dstSteps, size);
  return oddWarning(size, true);
}

ZEL_PUBLIC Status zeliRGBToYUV420_8u_C3P3(const uint8_t* src, uint8_t* const dstPlanes[3], ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  const int steps[3] = {size.width, size.width >> 1, size.width >> 1};
  packed420(src, 3 * size.width, dstPlanes, steps, size);
  return oddWarning(size, true);
}

// ---- 4:2:2 ----

ZEL_PUBLIC Status zeliRGBToYUV422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  using Tail = WideDifference422Tail<32768, 32768, OddDifferenceRounded>;
  zel::plainWalk(size.height, [&](int y) {
    convertRow<2>(PackedSource<3, false>{PackedIn<3>{zel::rowAt(src, srcStep, y)}},
                  PairsOut<PairOrder::YCbCr>{zel::rowAt(dst, dstStep, y)}, size.width, size.width & ~15,
                  DifferenceBody<2>{}, Tail{}, tier);
  });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                           const int dstSteps[3], ImageSize size) {
  if (!src || !dstPlanes || !dstSteps) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  walk422(PackedRows<3, false>{src, srcStep}, dstPlanes, dstSteps, size,
          allAligned16(src, srcStep, dstPlanes, dstSteps));
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV422_8u_C3P3(const uint8_t* src, uint8_t* const dstPlanes[3], ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  const int w = size.width;
  const int steps[3] = {w, w / 2 + (w & 1), w / 2 + (w & 1)};
  packedOrRows(
      size,
      [&](int first, int pixels) {
        const PlanesOutSub<2, true> out{dstPlanes[0] + first, dstPlanes[1] + first / 2, dstPlanes[2] + first / 2};
        row422(PackedSource<3, false>{PackedIn<3>{src + 3 * first}}, out, pixels, false,
               zel::widestTierWithBytePermutes());
      },
      [&] {
        walk422(PackedRows<3, false>{src, 3 * w}, dstPlanes, steps, size, allAligned16(src, 3 * w, dstPlanes, steps));
      });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV422_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                         const int dstSteps[3], ImageSize size) {
  if (const Status bad = planarChecks(srcPlanes, dstPlanes, dstSteps, true, size)) return bad;
  walk422(PlaneRows{srcPlanes, srcStep}, dstPlanes, dstSteps, size, false);
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV422_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3],
                                        ImageSize size) {
  if (const Status bad = planarChecks(srcPlanes, dstPlanes, nullptr, false, size)) return bad;
  const int w = size.width;
  const int steps[3] = {w, w / 2 + (w & 1), w / 2 + (w & 1)};
  packedOrRows(
      size,
      [&](int first, int pixels) {
        const PlanesSource in{PlanesIn{srcPlanes[0] + first, srcPlanes[1] + first, srcPlanes[2] + first}};
        const PlanesOutSub<2, true> out{dstPlanes[0] + first, dstPlanes[1] + first / 2, dstPlanes[2] + first / 2};
        row422(in, out, pixels, false, zel::widestTierWithBytePermutes());
      },
      [&] {
        walk422(PlaneRows{srcPlanes, w}, dstPlanes, steps, size, false);
      });
  return StatusOk;
}
