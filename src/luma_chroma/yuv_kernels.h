// Row kernels of the full-resolution YUV conversions. Each converts one row
// of `width` pixels with its member's body and tail; `path` says whether the
// vector body may take AVX2 blocks (the bits are the same either way).
#pragma once

#include <cstdint>

#include "luma_chroma/yuv_rows.h"

namespace zel {

// RGB to YUV.
void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, Path path);
void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, Path path);
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, Path path);
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, Path path);
// Writes the source's fourth bytes into dst[3].
void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, Path path);

// YUV to RGB.
void yuvToRgbC3Row(const uint8_t* src, uint8_t* dst, int width, Path path);
void yuvToRgbAC4Row(const uint8_t* src, uint8_t* dst, int width, Path path);
void yuvToRgbC3C4Row(const uint8_t* src, uint8_t* dst, int width, uint8_t alpha, Path path);
void yuvToRgbP3C3Row(const uint8_t* const src[3], uint8_t* dst, int width, Path path);
void yuvToRgbP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, Path path);

}  // namespace zel
