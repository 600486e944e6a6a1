// Row kernels of the full-resolution YUV conversions. Each converts one row
// of `width` pixels with its member's body and tail; with `avx2` the vector
// body takes AVX2 blocks first (the bits are the same either way).
#pragma once

#include <cstdint>

namespace zel::lc {

// RGB to YUV.
void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, bool avx2);
void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, bool avx2);
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, bool avx2);
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, bool avx2);
// Writes the source's fourth bytes into dst[3].
void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, bool avx2);

// YUV to RGB.
void yuvToRgbC3Row(const uint8_t* src, uint8_t* dst, int width, bool avx2);
void yuvToRgbAC4Row(const uint8_t* src, uint8_t* dst, int width, bool avx2);
void yuvToRgbC3C4Row(const uint8_t* src, uint8_t* dst, int width, uint8_t alpha, bool avx2);
void yuvToRgbP3C3Row(const uint8_t* const src[3], uint8_t* dst, int width, bool avx2);
void yuvToRgbP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, bool avx2);

}  // namespace zel::lc
