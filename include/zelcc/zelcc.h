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
/* Full-range YUV: Y with no offset, U and V centred on 128. */
ZELCC_API Status zeliRGBToYUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYUV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYUV_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                       ImageSize size);
/* The fourth plane receives the source's fourth bytes; its pointer is not tested. */
ZELCC_API Status zeliRGBToYUV_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliRGBToYUV_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYUVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUVToRGB_8u_C3C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                       uint8_t alpha);
ZELCC_API Status zeliYUVToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliYUVToRGB_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);

/* ---- Photo YCC ---- */
/* Steps of 16-bit and float images are used as step / sample size elements. */
ZELCC_API Status zeliRGBToYCC_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYCC_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCCToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);

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
ZELCC_API Status zeliRGBToYUV422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_C3P3(const uint8_t* src, uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliRGBToYUV422_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3], const int dstSteps[3], ImageSize size);

/* Subsampled YCbCr and YUV to RGB or BGR with 8-bit channels; 4:2:0 members leave a last odd row and column unwritten and warn, 4:2:2 members give a last odd pixel the chroma of its pair. */
ZELCC_API Status zeliCbYCr422ToBGR_709HDTV_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliCbYCr422ToBGR_709HDTV_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliCbYCr422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliCbYCr422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr420ToBGR_709CSC_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR_709HDTV_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr420ToBGR_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr420ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr420ToRGB_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr420ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr422ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCbCr422ToRGB_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToBGR_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToBGR_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCrCb420ToRGB_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb420ToRGB_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCrCb420ToRGB_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCrCb422ToBGR_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb422ToBGR_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCrCb422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCrCb422ToRGB_8u_C2C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCrCb422ToRGB_8u_C2P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliYUV420ToRGB_8u_P3AC4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB_8u_P3C3(const uint8_t* const srcPlanes[3], uint8_t* dst, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB_8u_P3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* const dstPlanes[3], int dstStep, ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_P3AC4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_P3C3(const uint8_t* const srcPlanes[3], uint8_t* dst, ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYUV422ToRGB_8u_P3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* const dstPlanes[3], int dstStep, ImageSize size);

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
ZELCC_API Status zeliBGR555ToYCbCr411_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR555ToYCbCr420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR555ToYCbCr422_16u8u_C3C2R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGR555ToYCbCr422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR555ToYCrCb420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR555ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                ImageSize size);
ZELCC_API Status zeliBGR565ToBGR_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGR565ToYCbCr411_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR565ToYCbCr420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR565ToYCbCr422_16u8u_C3C2R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGR565ToYCbCr422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR565ToYCrCb420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                  ImageSize size);
ZELCC_API Status zeliBGR565ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                ImageSize size);
ZELCC_API Status zeliRGB565ToRGB_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGB565ToYUV420_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                ImageSize size);
ZELCC_API Status zeliRGB565ToYUV422_16u8u_C3P3R(const uint16_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],
                                                ImageSize size);

/* Writers: each colour reduced to its field by truncation or, in the Dither
 * names, by a 4 x 4 ordered dither counted from the region's corner. The
 * destination step is taken as whole 16-bit words (an odd step loses its
 * low bit). Plane sources take one step per plane. */
ZELCC_API Status zeliBGRToBGR565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToRGB565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr411ToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                               int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                     int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR444_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR555_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB444_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB555_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB565_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR444Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR555Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToBGR565Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB444Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB555Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCrToRGB565Dither_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR444_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR555_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR565_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB444_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB555_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB565_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR444Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR555Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToBGR565Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB444Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB555Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr422ToRGB565Dither_8u16u_C2C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToBGR565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYCbCr420ToRGB565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                        int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB444_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB555_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB565_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToBGR565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB444Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB555Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);
ZELCC_API Status zeliYUV420ToRGB565Dither_8u16u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint16_t* dst,
                                                      int dstStep, ImageSize size);

/* ---- YCoCg ---- */
/* Interleaved BGR (RGB for the byte-plane pair) to and from planes Y, Co, Cg
 * that share one step. `Rev` is the lifting transform that the inverse
 * undoes exactly; `SBGR` samples are signed 16-bit. */
ZELCC_API Status zeliBGRToYCoCg_8u16s_C3P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                            ImageSize size);
ZELCC_API Status zeliBGRToYCoCg_8u16s_C4P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                            ImageSize size);
ZELCC_API Status zeliBGRToYCoCg_Rev_8u16s_C3P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                ImageSize size);
ZELCC_API Status zeliBGRToYCoCg_Rev_8u16s_C4P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                ImageSize size);
ZELCC_API Status zeliRGBToYCoCg_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_16s32s_C3P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                              ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_16s32s_C4P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                              ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_16s_C3P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                           ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_16s_C4P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                           ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_Rev_16s32s_C3P3R(const int16_t* src, int srcStep, int32_t* const dst[3],
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_Rev_16s32s_C4P3R(const int16_t* src, int srcStep, int32_t* const dst[3],
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_Rev_16s_C3P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                               ImageSize size);
ZELCC_API Status zeliSBGRToYCoCg_Rev_16s_C4P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                               ImageSize size);
ZELCC_API Status zeliYCoCgToBGR_16s8u_P3C3R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                            ImageSize size);
ZELCC_API Status zeliYCoCgToBGR_16s8u_P3C4R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                            ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCoCgToBGR_Rev_16s8u_P3C3R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                                ImageSize size);
ZELCC_API Status zeliYCoCgToBGR_Rev_16s8u_P3C4R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                                ImageSize size, uint8_t alpha);
ZELCC_API Status zeliYCoCgToRGB_8u_P3C3R(const uint8_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size);
ZELCC_API Status zeliYCoCgToSBGR_16s_P3C3R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                           ImageSize size);
ZELCC_API Status zeliYCoCgToSBGR_16s_P3C4R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                           ImageSize size, int16_t alpha);
ZELCC_API Status zeliYCoCgToSBGR_32s16s_P3C3R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                              ImageSize size);
ZELCC_API Status zeliYCoCgToSBGR_32s16s_P3C4R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                              ImageSize size, int16_t alpha);
ZELCC_API Status zeliYCoCgToSBGR_Rev_16s_P3C3R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                               ImageSize size);
ZELCC_API Status zeliYCoCgToSBGR_Rev_16s_P3C4R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                               ImageSize size, int16_t alpha);
ZELCC_API Status zeliYCoCgToSBGR_Rev_32s16s_P3C3R(const int32_t* const src[3], int srcStep, int16_t* dst,
                                                  int dstStep, ImageSize size);
ZELCC_API Status zeliYCoCgToSBGR_Rev_32s16s_P3C4R(const int32_t* const src[3], int srcStep, int16_t* dst,
                                                  int dstStep, ImageSize size, int16_t alpha);

/* ---- HLS and HSV ---- */
/* RGB or BGR to and from hue, lightness, saturation, in 32-bit float
 * arithmetic. The RGB members use steps unchecked (16-bit and float steps
 * count whole samples); the BGR members reject steps below 1. */
ZELCC_API Status zeliRGBToHLS_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToHLS_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_AP4C4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_AP4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* const dstPlanes[4],
                                      int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliBGRToHLS_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_AP4C4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_AP4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* const dstPlanes[4],
                                      int dstStep, ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliHLSToBGR_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);

/* RGB to and from hue, saturation, value. */
ZELCC_API Status zeliRGBToHSV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliRGBToHSV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToHSV_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToHSV_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliHSVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliHSVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliHSVToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliHSVToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);

/* ---- XYZ, LUV and Lab ---- */
ZELCC_API Status zeliBGRToLUV_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToLUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliLUVToBGR_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliLUVToBGR_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliLUVToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliLUVToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliLUVToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliLUVToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliLUVToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliLUVToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliLUVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliLUVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliRGBToLUV_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliRGBToLUV_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToLUV_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliRGBToLUV_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToLUV_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliRGBToLUV_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToLUV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToLUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliRGBToLab_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliBGRToLab_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliBGRToLab_8u16u_C3R(const uint8_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliRGBToLab_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliBGRToLab_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliLabToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliLabToBGR_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliLabToBGR_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size);
ZELCC_API Status zeliLabToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliLabToBGR_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToXYZ_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliRGBToXYZ_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToXYZ_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToXYZ_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliRGBToXYZ_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliRGBToXYZ_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliRGBToXYZ_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToXYZ_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliXYZToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                     ImageSize size);
ZELCC_API Status zeliXYZToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliXYZToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliXYZToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliXYZToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                      ImageSize size);
ZELCC_API Status zeliXYZToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                       ImageSize size);
ZELCC_API Status zeliXYZToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliXYZToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep,
                                       ImageSize size);

/* ---- Colour twist ---- */
/* Row i of `twist`: weights of the three inputs and a constant in sample units for output i; */
/* integer results are clamped, then rounded to nearest. Steps must be at least 1. */
ZELCC_API Status zeliColorTwist32f_16s_AC4IR(int16_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size,
                                            const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16s_C3IR(int16_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16s_IP3R(int16_t* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                            const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16s_P3R(const int16_t* const srcPlanes[3], int srcStep, int16_t* const dstPlanes[3],
                                           int dstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_AC4IR(uint16_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                            ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_C3IR(uint16_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_IP3R(uint16_t* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                            const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_16u_P3R(const uint16_t* const srcPlanes[3], int srcStep,
                                           uint16_t* const dstPlanes[3], int dstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_AC4IR(int8_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_AC4R(const int8_t* src, int srcStep, int8_t* dst, int dstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_C3IR(int8_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_C3R(const int8_t* src, int srcStep, int8_t* dst, int dstStep, ImageSize size,
                                          const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_IP3R(int8_t* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8s_P3R(const int8_t* const srcPlanes[3], int srcStep, int8_t* const dstPlanes[3],
                                          int dstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_AC4IR(uint8_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_C3IR(uint8_t* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                          const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_IP3R(uint8_t* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                           const float twist[3][4]);
ZELCC_API Status zeliColorTwist32f_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                          int dstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_AC4IR(float* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                         const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_C3IR(float* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                        const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_C4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                        const float twist[4][4]);
ZELCC_API Status zeliColorTwist_32f_IP3R(float* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                         const float twist[3][4]);
ZELCC_API Status zeliColorTwist_32f_P3R(const float* const srcPlanes[3], int srcStep, float* const dstPlanes[3],
                                        int dstStep, ImageSize size, const float twist[3][4]);

/* ---- Gamma ---- */
/* The video transfer function (Fwd) and its inverse (Inv) on R, G, B; 32f maps vMin..vMax onto 0..1 */
/* and returns StatusEmptyRangeError unless vMax - vMin > 0. Steps must be at least 1. */
ZELCC_API Status zeliGammaFwd_16u_AC4IR(uint16_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_16u_C3IR(uint16_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_16u_IP3R(uint16_t* const srcDstPlanes[3], int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_16u_P3R(const uint16_t* const srcPlanes[3], int srcStep, uint16_t* const dstPlanes[3],
                                      int dstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_32f_AC4IR(float* srcDst, int srcDstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaFwd_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                       float vMin, float vMax);
ZELCC_API Status zeliGammaFwd_32f_C3IR(float* srcDst, int srcDstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaFwd_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                      float vMin, float vMax);
ZELCC_API Status zeliGammaFwd_32f_IP3R(float* const srcDstPlanes[3], int srcDstStep, ImageSize size, float vMin,
                                       float vMax);
ZELCC_API Status zeliGammaFwd_32f_P3R(const float* const srcPlanes[3], int srcStep, float* const dstPlanes[3],
                                      int dstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaFwd_8u_AC4IR(uint8_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_8u_C3IR(uint8_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_8u_IP3R(uint8_t* const srcDstPlanes[3], int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaFwd_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_AC4IR(uint16_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_C3IR(uint16_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_IP3R(uint16_t* const srcDstPlanes[3], int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_16u_P3R(const uint16_t* const srcPlanes[3], int srcStep, uint16_t* const dstPlanes[3],
                                      int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_32f_AC4IR(float* srcDst, int srcDstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaInv_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                       float vMin, float vMax);
ZELCC_API Status zeliGammaInv_32f_C3IR(float* srcDst, int srcDstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaInv_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                      float vMin, float vMax);
ZELCC_API Status zeliGammaInv_32f_IP3R(float* const srcDstPlanes[3], int srcDstStep, ImageSize size, float vMin,
                                       float vMax);
ZELCC_API Status zeliGammaInv_32f_P3R(const float* const srcPlanes[3], int srcStep, float* const dstPlanes[3],
                                      int dstStep, ImageSize size, float vMin, float vMax);
ZELCC_API Status zeliGammaInv_8u_AC4IR(uint8_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_8u_C3IR(uint8_t* srcDst, int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_8u_IP3R(uint8_t* const srcDstPlanes[3], int srcDstStep, ImageSize size);
ZELCC_API Status zeliGammaInv_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                     int dstStep, ImageSize size);

/* ---- Gray conversion ---- */
/* Weighted sums of R, G, B; a null `coeffs` selects 0.299, 0.587, 0.114. */
ZELCC_API Status zeliRGBToGray_16s_AC4C1R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_16s_C3C1R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_16u_AC4C1R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_16u_C3C1R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_32f_AC4C1R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_32f_C3C1R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_8u_AC4C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliRGBToGray_8u_C3C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliColorToGray_16s_AC4C1R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size,
                                            const float coeffs[3]);
ZELCC_API Status zeliColorToGray_16s_C3C1R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size,
                                           const float coeffs[3]);
ZELCC_API Status zeliColorToGray_16u_AC4C1R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                            ImageSize size, const float coeffs[3]);
ZELCC_API Status zeliColorToGray_16u_C3C1R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size,
                                           const float coeffs[3]);
ZELCC_API Status zeliColorToGray_32f_AC4C1R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                            const float coeffs[3]);
ZELCC_API Status zeliColorToGray_32f_C3C1R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                           const float coeffs[3]);
ZELCC_API Status zeliColorToGray_64f_AC4C1R(const double* src, int srcStep, double* dst, int dstStep, ImageSize size,
                                            const double coeffs[3]);
ZELCC_API Status zeliColorToGray_64f_C3C1R(const double* src, int srcStep, double* dst, int dstStep, ImageSize size,
                                           const double coeffs[3]);
ZELCC_API Status zeliColorToGray_8u_AC4C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                           const float coeffs[3]);
ZELCC_API Status zeliColorToGray_8u_C3C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size,
                                          const float coeffs[3]);

/* ---- Bit-depth reduction ---- */
/* Samples reduced to `levels` equally spaced values of the destination's
 * range. `noise` is a percentage 0..100, `ditherKind` a ReduceDitherKind;
 * an unknown kind does nothing and succeeds. */
typedef enum ReduceDitherKind {
  ReduceDitherOff = 0,
  ReduceDitherFloydSteinberg = 1,
  ReduceDitherJarvisJudiceNinke = 2,
  ReduceDitherStucki = 3,
  ReduceDitherOrdered4x4 = 4
} ReduceDitherKind;
ZELCC_API Status zeliReduceBits_8u_C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_8u_C4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                       ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u_C1R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u_C4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                         ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s_C1R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s_C4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                        ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep,
                                         ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u8u_C1R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u8u_C3R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u8u_C4R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16u8u_AC4R(const uint16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s8u_C1R(const int16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s8u_C3R(const int16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s8u_C4R(const int16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_16s8u_AC4R(const int16_t* src, int srcStep, uint8_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f8u_C1R(const float* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f8u_C3R(const float* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f8u_C4R(const float* src, int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f8u_AC4R(const float* src, int srcStep, uint8_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16u_C1R(const float* src, int srcStep, uint16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16u_C3R(const float* src, int srcStep, uint16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16u_C4R(const float* src, int srcStep, uint16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16u_AC4R(const float* src, int srcStep, uint16_t* dst, int dstStep,
                                            ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16s_C1R(const float* src, int srcStep, int16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16s_C3R(const float* src, int srcStep, int16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16s_C4R(const float* src, int srcStep, int16_t* dst, int dstStep,
                                           ImageSize size, int noise, int ditherKind, int levels);
ZELCC_API Status zeliReduceBits_32f16s_AC4R(const float* src, int srcStep, int16_t* dst, int dstStep,
                                            ImageSize size, int noise, int ditherKind, int levels);
/* One bit a pixel, first pixel in the highest bit of its byte, from bit
 * dstBitOffset & 7 of dst; ditherKind 0 (threshold) or 3 (Stucki). */
ZELCC_API Status zeliReduceBits_8u1u_C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         int dstBitOffset, ImageSize size, int reserved1, int reserved2,
                                         int ditherKind, uint8_t threshold);


/* ---- Bayer demosaicing ---- */
/* A mosaic frame (src, the frame's size and step) is converted within
 * srcRegion, given in frame coordinates and clipped to the frame; the
 * frame's edges, not the region's, decide the border rules. grid is a
 * CfaGrid value. dst receives R, G, B from the clipped region's top left
 * pixel on. zeliCFAToRGB_16u_C1C3R takes both steps in whole samples (an
 * odd step loses its last bit); interpolation is not read. */
ZELCC_API Status zeliCFAToRGB_8u_C1C3R(const uint8_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                       uint8_t* dst, int dstStep, int grid, int interpolation);
ZELCC_API Status zeliCFAToRGB_16u_C1C3R(const uint16_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                        uint16_t* dst, int dstStep, int grid, int interpolation);
/* tmp: the caller's scratch, 30 rows of tmpStep bytes, each with room for
 * the clipped region's width + 6 samples; it is neither checked nor kept.
 * The frame must be at least 5 by 5. zeliDemosaicAHD_16u_C1C3R takes its
 * dstStep in whole samples, its srcStep in bytes. */
ZELCC_API Status zeliDemosaicAHD_8u_C1C3R(const uint8_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                          uint8_t* dst, int dstStep, int grid, uint8_t* tmp, int tmpStep);
ZELCC_API Status zeliDemosaicAHD_16u_C1C3R(const uint16_t* src, CfaRegion srcRegion, ImageSize srcSize, int srcStep,
                                           uint16_t* dst, int dstStep, int grid, uint8_t* tmp, int tmpStep);

/* ---- Tone mapping ---- */
/* Float samples to 8 bits by 255 / maximum (Linear, no saturation) or 255 / (2 * mean) (Mean, */
/* saturated). StatusNothingDoneWarning leaves dst as it was when the maximum or mean is negative. */
ZELCC_API Status zeliToneMapLinear_32f8u_C1R(const float* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);
ZELCC_API Status zeliToneMapMean_32f8u_C1R(const float* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size);

#ifdef __cplusplus
}
#endif

#endif /* ZELCC_ZELCC_H */
