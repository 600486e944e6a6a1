/* zelcc: image colour-conversion primitives.
 *
 * Every image function takes caller-owned buffers: the address of the first
 * sample of the region, a row step in bytes (a signed distance, not checked
 * unless the function says so), the region size in pixels of the
 * full-resolution grid, and family arguments after the size. */
#ifndef ZELCC_ZELCC_H
#define ZELCC_ZELCC_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#if defined(ZELCC_BUILDING)
#define ZELCC_API __attribute__((visibility("default")))
#else
#define ZELCC_API
#endif

typedef enum Status {
  StatusOk = 0,
  StatusNothingDoneWarning = 1,
  StatusOddSizeWarning = 35,
  StatusBadArgumentError = -5,
  StatusSizeError = -6,
  StatusNullPointerError = -8,
  StatusOutOfMemoryError = -9,
  StatusStepError = -14,
  StatusStateIdentityError = -17,
  StatusEmptyRangeError = -49,
  StatusLevelsError = -54,
  StatusNoiseError = -55,
  StatusDitherKindError = -224
} Status;

/* Width then height, in pixels. */
typedef struct ImageSize {
  int32_t width;
  int32_t height;
} ImageSize;

/* A rectangle of a colour filter array frame. */
typedef struct CfaRegion {
  int32_t x;
  int32_t y;
  int32_t width;
  int32_t height;
} CfaRegion;

typedef enum CfaGrid {
  CfaGridBGGR = 0,
  CfaGridRGGB = 1,
  CfaGridGBRG = 2,
  CfaGridGRBG = 3
} CfaGrid;

typedef struct LibraryVersion {
  int32_t major;
  int32_t minor;
  int32_t revision;
  int32_t build;
  char variantCode[4];
  const char* name;
  const char* version;
  const char* buildDate;
} LibraryVersion;

/* The constant version record; never written or freed by the caller. */
ZELCC_API const LibraryVersion* zelccGetLibVersion(void);

/* ---- Gray to RGB: the gray sample goes into the three colour channels. ---- */
ZELCC_API Status zeliGrayToRGB_8u_C1C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliGrayToRGB_16u_C1C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliGrayToRGB_32f_C1C3R(const float* src, int srcStep, float* dst, int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliGrayToRGB_8u_C1C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size, uint8_t alpha);
ZELCC_API Status zeliGrayToRGB_16u_C1C4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                         ImageSize size, uint16_t alpha);
ZELCC_API Status zeliGrayToRGB_32f_C1C4R(const float* src, int srcStep, float* dst, int dstStep,
                                         ImageSize size, float alpha);

/* ---- RGB to and from YCbCr and YUV at full resolution ---- */
/* RGB to video-range YCbCr: Y in 16..235, Cb and Cr in 16..240. */
ZELCC_API Status zeliRGBToYCbCr_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliRGBToYCbCr_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                          ImageSize size);
ZELCC_API Status zeliRGBToYCbCr_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                       int dstStep, ImageSize size);
/* Video-range YCbCr to RGB or BGR. */
ZELCC_API Status zeliYCbCrToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliYCbCrToRGB_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCrToRGB_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                       int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliYCbCrToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCrToBGR_709CSC_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR_709CSC_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst,
                                                int dstStep, ImageSize size, uint8_t alpha);

/* ---- Photo YCC ---- */

/* ---- RGB to and from chroma-subsampled YCbCr and YUV ---- */
/* RGB or BGR to subsampled video-range YCbCr; 4:2:0 members leave a last odd row and column unwritten. */
ZELCC_API Status zeliBGRToCbYCr422_709HDTV_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToCbYCr422_709HDTV_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToCbYCr422_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToYCbCr411_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr411_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_709CSC_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_709CSC_8u_C3P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_709CSC_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_709HDTV_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr422_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToYCbCr422_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCbCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToYCbCr422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCrCb420_709CSC_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCrCb420_709CSC_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCrCb420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliBGRToYCrCb420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToCbYCr422Gamma_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToCbYCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr420_8u_C3P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYCbCr420_8u_C4P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCbCr422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYCbCr422_8u_P3C2R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCrCb420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYCrCb422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCrCb422_8u_P3C2R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep, ImageSize size);
/* RGB or BGR to subsampled full-range YUV; the names without steps take tightly packed images. */
ZELCC_API Status zeliBGRToYUV420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV420_8u_C3P3(const uint8_t* src, uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV420_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV420_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_C3P3(const uint8_t* src, uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);

/* ---- Repacking between subsampled layouts ---- */
ZELCC_API Status zeliCbYCr422ToYCbCr411_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCbCr420_8u_C2P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCbCr420_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCbCr422_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCbCr422_8u_C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCrCb420_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411To420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr420_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr420_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr422_8u_P2C2R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr422_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCbCr422_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCrCb420_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCrCb422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToYCrCb422_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr411_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr420To411_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToCbYCr422_8u_P2C2R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr411_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr411_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr422_8u_P2C2R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr422_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr422_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCrCb420_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToCbYCr422_8u_C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToCbYCr422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToGray_8u_C2C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr411_8u_C2P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr411_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr411_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr411_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr420_8u_C2P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr420_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr420_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCbCr420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCrCb420_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCrCb422_8u_C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToYCrCb422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToCbYCr422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToYCbCr411_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToYCbCr420_8u_P3P2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep, uint8_t* dstCbCr, int dstCbCrStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToYCbCr422_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToYCbCr422_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCrCb422ToYCbCr411_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCrCb422ToYCbCr420_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCrCb422ToYCbCr422_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size);

/* ---- Filtered, interlaced and 1620 chroma resampling ---- */
ZELCC_API Status zeliYCbCr1620To420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                           const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420To1620_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                           const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420To422_Interlace_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                    uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr422To420_Interlace_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                    uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliCbYCr422ToYCbCr420_Interlace_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3],
                                                           const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToCbYCr422_Interlace_8u_P3C2R(const uint8_t* const src[3], const int srcStep[3],
                                                           uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr422_Filter_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                      uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCrCb420ToYCbCr422_Filter_8u_P3R(const uint8_t* const src[3], const int srcStep[3],
                                                      uint8_t* const dst[3], const int dstStep[3], ImageSize size);
ZELCC_API Status zeliYCbCr420ToYCbCr422_Filter_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                        int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3],
                                                        ImageSize size);
/* `layout`: 1 first slice, 4 middle slice, 16 last slice, 21 a whole frame. */
ZELCC_API Status zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                        int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size,
                                                        int layout);
ZELCC_API Status zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr,
                                                        int srcCbCrStep, uint8_t* const dst[3], const int dstStep[3],
                                                        ImageSize size, int layout);
ZELCC_API Status zeliYCrCb420ToBGR_Filter_8u_P3C4R(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst,
                                                   int dstStep, ImageSize size, uint8_t alpha);

/* ---- 16-bit packed RGB ---- */

/* ---- YCoCg ---- */

/* ---- HLS and HSV ---- */

/* ---- XYZ, LUV and Lab ---- */

/* ---- Colour twist ---- */

/* ---- Gamma ---- */

/* ---- Gray conversion ---- */

/* ---- Bit-depth reduction ---- */

/* ---- Bayer demosaicing ---- */

/* ---- Tone mapping ---- */

#ifdef __cplusplus
}
#endif

#endif /* ZELCC_ZELCC_H */
