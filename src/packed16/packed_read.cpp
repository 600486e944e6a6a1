// Readers of 16-bit packed words: to three bytes a pixel, and to
// subsampled YCbCr or YUV planes or pair streams. Each public function
// checks its arguments and walks the rows with its row kernel.
//
// Source rows: the words-to-bytes member uses its step as a whole number of
// words. The readers to planes take row 2p at base + 2p * srcStep and its
// partner row 2p + 1 at (srcStep rounded down to even) beyond it; rows of
// the single-row layouts lie at base + y * srcStep.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "packed16/packed_fields.h"
#include "packed16/packed_read_rows.h"

namespace zel::unpack {

namespace {

// Null source, then the plane array and its entries, then the minima.
inline Status checkPlanes(const uint16_t* src, uint8_t* const dst[3], ImageSize size, int minWidth, int minHeight) {
  if (!src || !dst || anyPlaneNull(dst)) return StatusNullPointerError;
  if (size.width < minWidth || size.height < minHeight) return StatusSizeError;
  return StatusOk;
}

// The second row of a pair.
inline const uint16_t* partnerRow(const uint16_t* even, int srcStep) { return rowAt(even, srcStep & ~1, 1); }

// Row pairs of a 4:2:0 reader; chroma planes in the order given.
template <typename Kernel>
void walkPairs(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], uint8_t* c1, int c1Step,
               uint8_t* c2, int c2Step, ImageSize size, Kernel kernel) {
  const bool avx2 = hasAvx2();
  rowPairWalk(size.height, [&](int y, int p) {
    const uint16_t* s0 = rowAt(src, srcStep, y);
    const PairRows rows{s0,
                        partnerRow(s0, srcStep),
                        rowAt(dst[0], dstSteps[0], y),
                        rowAt(dst[0], dstSteps[0], y + 1),
                        rowAt(c1, c1Step, p),
                        rowAt(c2, c2Step, p)};
    kernel(rows, size.width, avx2);
  });
}

template <typename Kernel>
void walkRows(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], ImageSize size,
              Kernel kernel) {
  const bool avx2 = hasAvx2();
  plainWalk(size.height, [&](int y) {
    const PlaneRow row{rowAt(src, srcStep, y), rowAt(dst[0], dstSteps[0], y), rowAt(dst[1], dstSteps[1], y),
                       rowAt(dst[2], dstSteps[2], y)};
    kernel(row, size.width, avx2);
  });
}

// 4:2:0 studio YCbCr; YCrCb members exchange the chroma planes. A last odd
// row gets its luma by the tail formula.
template <class W>
Status studio420(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], ImageSize size,
                 bool crFirst) {
  if (Status s = checkPlanes(src, dst, size, 2, 2); s != StatusOk) return s;
  const int cb = crFirst ? 2 : 1, cr = crFirst ? 1 : 2;
  walkPairs(src, srcStep, dst, dstSteps, dst[cb], dstSteps[cb], dst[cr], dstSteps[cr], size, studio420Pair<W>);
  if (size.height & 1) {
    const int y = size.height - 1;
    studioLumaRow<W>(rowAt(src, srcStep, y), rowAt(dst[0], dstSteps[0], y), size.width);
  }
  return StatusOk;
}

template <class W>
Status studio422Planes(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], ImageSize size) {
  if (Status s = checkPlanes(src, dst, size, 2, 1); s != StatusOk) return s;
  walkRows(src, srcStep, dst, dstSteps, size, studio422PlanesRow<W>);
  return StatusOk;
}

template <class W>
Status studio422Pairs(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 2 || size.height < 1) return StatusSizeError;
  const bool avx2 = hasAvx2();
  plainWalk(size.height,
            [&](int y) { studio422PairsRow<W>(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, avx2); });
  return StatusOk;
}

// The last width & 3 pixels get luma alone: the warning says so.
template <class W>
Status studio411(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], ImageSize size) {
  if (Status s = checkPlanes(src, dst, size, 4, 1); s != StatusOk) return s;
  walkRows(src, srcStep, dst, dstSteps, size, studio411Row<W>);
  return (size.width & 3) ? StatusOddSizeWarning : StatusOk;
}

// A last odd column or row is left unwritten, luma included.
template <class W>
Status yuv420(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstSteps[3], ImageSize size) {
  if (Status s = checkPlanes(src, dst, size, 2, 2); s != StatusOk) return s;
  walkPairs(src, srcStep, dst, dstSteps, dst[1], dstSteps[1], dst[2], dstSteps[2], size, yuv420Pair<W>);
  return ((size.width | size.height) & 1) ? StatusOddSizeWarning : StatusOk;
}

// The red-low members test the size before the plane entries.
inline Status checkRedLow(const uint16_t* src, uint8_t* const dst[3], ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dst)) return StatusNullPointerError;
  return StatusOk;
}

}  // namespace

}  // namespace zel::unpack

using namespace zel::unpack;

ZEL_PUBLIC Status zeliBGR565ToBGR_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                            ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  const bool avx2 = zel::hasAvx2();
  zel::plainWalk(size.height, [&](int y) {
    wordsToBytesRow(zel::packed::wordRowAt(src, srcStep, y), zel::rowAt(dst, dstStep, y), size.width, avx2);
  });
  return StatusOk;
}

// The low field goes to byte 0 whatever the channel order: one code.
ZEL_PUBLIC Status zeliRGB565ToRGB_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size)
    __attribute__((alias("zeliBGR565ToBGR_16u8u_C3R")));

ZEL_PUBLIC Status zeliBGR555ToYCbCr411_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio411<Blue555>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR565ToYCbCr411_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio411<Blue565>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR555ToYCbCr420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio420<Blue555>(src, srcStep, dst, dstStep, size, false);
}

ZEL_PUBLIC Status zeliBGR565ToYCbCr420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio420<Blue565>(src, srcStep, dst, dstStep, size, false);
}

ZEL_PUBLIC Status zeliBGR555ToYCrCb420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio420<Blue555>(src, srcStep, dst, dstStep, size, true);
}

ZEL_PUBLIC Status zeliBGR565ToYCrCb420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio420<Blue565>(src, srcStep, dst, dstStep, size, true);
}

ZEL_PUBLIC Status zeliBGR555ToYCbCr422_16u8u_C3C2R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                   ImageSize size) {
  return studio422Pairs<Blue555>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR565ToYCbCr422_16u8u_C3C2R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                   ImageSize size) {
  return studio422Pairs<Blue565>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR555ToYCbCr422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio422Planes<Blue555>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR565ToYCbCr422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                   const int dstStep[3], ImageSize size) {
  return studio422Planes<Blue565>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR555ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                 const int dstStep[3], ImageSize size) {
  return yuv420<Blue555>(src, srcStep, dst, dstStep, size);
}

ZEL_PUBLIC Status zeliBGR565ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                 const int dstStep[3], ImageSize size) {
  return yuv420<Blue565>(src, srcStep, dst, dstStep, size);
}

// A last odd column or row is not written; with width or height 1 nothing is.
ZEL_PUBLIC Status zeliRGB565ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                 const int dstStep[3], ImageSize size) {
  if (Status s = checkRedLow(src, dst, size); s != StatusOk) return s;
  walkPairs(src, srcStep, dst, dstStep, dst[1], dstStep[1], dst[2], dstStep[2], size, yuvRedLow420Pair);
  return ((size.width | size.height) & 1) ? StatusOddSizeWarning : StatusOk;
}

ZEL_PUBLIC Status zeliRGB565ToYUV422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3],
                                                 const int dstStep[3], ImageSize size) {
  if (Status s = checkRedLow(src, dst, size); s != StatusOk) return s;
  walkRows(src, srcStep, dst, dstStep, size, yuvRedLow422Row);
  return (size.width & 1) ? StatusOddSizeWarning : StatusOk;
}
