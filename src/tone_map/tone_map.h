// Tone mapping: a float image to 8 bits by one global scale, taken from
// the image's maximum (linear) or from twice its mean. Two passes: the
// reduction over the whole source, then the scaling.
#pragma once

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"
#include "zelcc/zelcc.h"

namespace zel::tone {

// The vector maximum: a failed comparison returns the new sample, so a NaN
// sample takes the lane and the next ordinary sample takes it back.
inline float foldMax(float acc, float s) { return acc > s ? acc : s; }

// The smallest normal float, below which (or NaN) an image counts as black.
constexpr float kTinyF = 1.1754944e-38f;
constexpr double kTinyD = 1.1754943508222875e-38;

// Linear: scale = 255 / m in 32 bits; the low 8 bits of the truncated
// product, no saturation (a negative sample wraps).
inline float linearScale(float m) { return 255.0f / m; }
inline uint8_t linearSample(float scale, float s) { return static_cast<uint8_t>(TruncateToInt(scale * s)); }

// Mean: scale = 255 / m in 64 bits, rounded to float; the truncated
// product saturated to 0..255.
inline float meanScale(double m) { return static_cast<float>(255.0 / m); }
inline uint8_t meanSample(float scale, float s) { return SaturateU8(TruncateToInt(scale * s)); }

// Maximum over the image, starting from the most negative finite float.
float imageMax(const float* src, int srcStep, int width, int height);
// Sum over the image: 64-bit accumulation up to width 16, wider images in
// 32-bit lanes (an 8-lane and a 4-lane accumulator) folded at the end.
double imageSum(const float* src, int srcStep, int width, int height);

// The scaling pass over one row.
enum class Scaling { Linear, Mean };
template <Scaling S>
void scaleRow(const float* src, uint8_t* dst, int width, float scale);

}  // namespace zel::tone
