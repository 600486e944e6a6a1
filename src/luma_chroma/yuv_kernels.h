// Row kernels of the full-resolution YUV conversions. Each converts one row
// of `width` pixels with its member's body and tail; the vector body takes
// the widest blocks that `tier` (at most widestTierWithBytePermutes())
// allows first; the bits are the same at every tier.
#pragma once

#include <cstdint>

#include "luma_chroma/vector_units.h"

namespace zel::lc {

// RGB to YUV.
void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);
void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, VectorTier tier);
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, VectorTier tier);
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);
// Writes the source's fourth bytes into dst[3].
void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, VectorTier tier);

// YUV to RGB.
void yuvToRgbC3Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);
void yuvToRgbAC4Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);
void yuvToRgbC3C4Row(const uint8_t* src, uint8_t* dst, int width, uint8_t alpha, VectorTier tier);
void yuvToRgbP3C3Row(const uint8_t* const src[3], uint8_t* dst, int width, VectorTier tier);
void yuvToRgbP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, VectorTier tier);

}  // namespace zel::lc
