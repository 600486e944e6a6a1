// 4:2:2 and 4:1:1 YCbCr to RGB or BGR: pair streams in three byte orders
// and three planes. Rows are walked one by one; a last odd pixel takes the
// chroma of its pair and no member warns.
#include "frame/export.h"
#include "luma_chroma/sub_to_rgb_drivers.h"

namespace zel::lc::expand {

namespace {

using repack::PairOrder;

// A pair stream to interleaved pixels, row by row.
template <PairOrder Order, class MakeOut, class Body, class Tail>
void streamRows(const uint8_t* src, int srcStep, MakeOut out, ImageSize size, int bodyEnd, const Body& body,
                const Tail& tail) {
  expandRows(
      size.height, bodyEnd, size.width, [=](int y) { return streamRow<Order>(rowAt(src, srcStep, y), out(y)); }, body,
      tail);
}

// Three planes, chroma subsampled by Spread, row by row.
template <int Spread, class MakeOut, class Body, class Tail>
void planarRows(const SubPlanes& src, MakeOut out, ImageSize size, int bodyEnd, const Body& body, const Tail& tail) {
  using Set = RowSet<1, LumaRow, ChromaPlanes<Spread>, decltype(out(0))>;
  expandRows(
      size.height, bodyEnd, size.width,
      [=](int y) {
        return Set{{LumaRow{src.luma(y)}}, chromaPlanes<Spread>(src, y), {out(y)}};
      },
      body, tail);
}

Status streamArguments(const uint8_t* src, const void* dst, ImageSize size, int minWidth = 1) {
  if (!src || !dst) return StatusNullPointerError;
  if (sizeBelow(size, minWidth, 1)) return StatusSizeError;
  return StatusOk;
}

Status planeArguments(const uint8_t* const srcPlanes[3], const void* dst, ImageSize size, int minWidth = 1) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (sizeBelow(size, minWidth, 1)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  return StatusOk;
}

// The lane form up to width AND NOT 7, the raw wide form after it.
template <PairOrder Order, class MakeOut>
void lanesThenRaw(const uint8_t* src, int srcStep, MakeOut out, ImageSize size) {
  streamRows<Order>(src, srcStep, out, size, size.width & ~7, LanesForm{lanes601b}, RawTail{});
}

// The lane form on the even part of a row, the raw wide form on a last odd
// pixel.
template <PairOrder Order, class MakeOut>
void lanesEvenPart(const uint8_t* src, int srcStep, MakeOut out, ImageSize size) {
  streamRows<Order>(src, srcStep, out, size, size.width & ~1, LanesForm{lanes601a}, RawTail{});
}

// The raw pair lanes up to width AND NOT 7, the rounded wide form after it.
template <PairOrder Order, class MakeOut>
void pairsThenWide(const uint8_t* src, int srcStep, MakeOut out, ImageSize size) {
  streamRows<Order>(src, srcStep, out, size, size.width & ~7, PairRawForm{pairLanesB}, WideTail{wide601a, 32768});
}

}  // namespace

}  // namespace zel::lc::expand

using namespace zel::lc::expand;
using zel::anyPlaneNull;
using zel::lc::lanes601a;
using zel::lc::lanes601b;
using zel::lc::wide601a;
using zel::lc::wide601b;
using zel::repack::PairOrder;

// ---- Cb Y0 Cr Y1 streams ----

ZEL_PUBLIC Status zeliCbYCr422ToBGR_709HDTV_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                     ImageSize size) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  streamRows<PairOrder::CbYCr>(src, srcStep, packedRows3<true>(dst, dstStep), size, size.width & ~7,
                               SixteenthsForm{lanesHDTV}, WideTail{wideHDTV, 32768});
  return StatusOk;
}

ZEL_PUBLIC Status zeliCbYCr422ToBGR_709HDTV_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                     ImageSize size, uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  streamRows<PairOrder::CbYCr>(src, srcStep, packedRows4<true>(dst, dstStep, alpha), size, size.width & ~7,
                               SixteenthsForm{lanesHDTV}, WideTail{wideHDTV, 32768});
  return StatusOk;
}

ZEL_PUBLIC Status zeliCbYCr422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                             uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  streamRows<PairOrder::CbYCr>(src, srcStep, packedRows4<true>(dst, dstStep, alpha), size, size.width & ~7,
                               LanesForm{lanes601b}, WideTail{wide601b, 32768});
  return StatusOk;
}

ZEL_PUBLIC Status zeliCbYCr422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  streamRows<PairOrder::CbYCr>(src, srcStep, packedRows3<false>(dst, dstStep), size, size.width & ~7,
                               LanesForm{lanes601b}, WideTail{wide601b, 32768});
  return StatusOk;
}

// ---- 4:1:1 planes ----

// Blocks of 8 and then 4 pixels; at most 3 pixels in the wide tail.
ZEL_PUBLIC Status zeliYCbCr411ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size, 4)) return s;
  planarRows<4>(SubPlanes{srcPlanes, srcSteps}, packedRows3<true>(dst, dstStep), size, size.width & ~3,
                LanesForm{lanes601a}, WideTail{wide411, 32768});
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr411ToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = planeArguments(srcPlanes, dst, size, 4)) return s;
  planarRows<4>(SubPlanes{srcPlanes, srcSteps}, packedRows4<true>(dst, dstStep, alpha), size, size.width & ~3,
                LanesForm{lanes601a}, WideTail{wide411, 32768});
  return StatusOk;
}

// ---- Y0 Cb Y1 Cr streams and 4:2:2 planes ----

ZEL_PUBLIC Status zeliYCbCr422ToBGR_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dst, size, 2)) return s;
  lanesThenRaw<PairOrder::YCbCr>(src, srcStep, packedRows3<true>(dst, dstStep), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                             uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size, 2)) return s;
  lanesThenRaw<PairOrder::YCbCr>(src, srcStep, packedRows4<true>(dst, dstStep, alpha), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr422ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  planarRows<2>(SubPlanes{srcPlanes, srcSteps}, packedRows3<true>(dst, dstStep), size, size.width & ~7,
                LanesForm{lanes601b}, RawTail{});
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  lanesEvenPart<PairOrder::YCbCr>(src, srcStep, packedRows3<false>(dst, dstStep), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr422ToRGB_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dstPlanes, size)) return s;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  lanesEvenPart<PairOrder::YCbCr>(src, srcStep, planeOutRows(dstPlanes, dstStep), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCr422ToRGB_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                             uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  streamRows<PairOrder::YCbCr>(src, srcStep, packedRows4<false>(dst, dstStep, alpha), size, size.width & ~1,
                               PairRawForm{pairLanesB}, WideTail{wide601a, 32768});
  return StatusOk;
}

// Two kernels of different results, chosen once for the image: the
// centred pair lanes when every pointer and step is a multiple of 16, the
// lane form otherwise. The truncated wide tail is the same in both.
ZEL_PUBLIC Status zeliYCbCr422ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  const SubPlanes src{srcPlanes, srcSteps};
  const WideTail tail{wide601b, 0};
  if (src.aligned() && zel::isAligned16(dst) && zel::isAligned16(dstStep))
    planarRows<2>(src, packedRows3<false>(dst, dstStep), size, size.width & ~7, PairCentredForm{pairLanesA}, tail);
  else
    planarRows<2>(src, packedRows3<false>(dst, dstStep), size, size.width & ~7, LanesForm{lanes601b}, tail);
  return StatusOk;
}

// ---- Y0 Cr Y1 Cb streams ----

ZEL_PUBLIC Status zeliYCrCb422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  pairsThenWide<PairOrder::YCrCb>(src, srcStep, packedRows3<false>(dst, dstStep), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCrCb422ToRGB_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                             uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  pairsThenWide<PairOrder::YCrCb>(src, srcStep, packedRows4<false>(dst, dstStep, alpha), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCrCb422ToBGR_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  pairsThenWide<PairOrder::YCrCb>(src, srcStep, packedRows3<true>(dst, dstStep), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCrCb422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                             uint8_t alpha) {
  if (const Status s = streamArguments(src, dst, size)) return s;
  pairsThenWide<PairOrder::YCrCb>(src, srcStep, packedRows4<true>(dst, dstStep, alpha), size);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCrCb422ToRGB_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                             ImageSize size) {
  if (const Status s = streamArguments(src, dstPlanes, size)) return s;
  if (anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  lanesEvenPart<PairOrder::YCrCb>(src, srcStep, planeOutRows(dstPlanes, dstStep), size);
  return StatusOk;
}
