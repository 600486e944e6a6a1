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

/* ---- Repacking between subsampled layouts ---- */

/* ---- Filtered, interlaced and 1620 chroma resampling ---- */

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
