// Vector bodies of the XYZ family. Each converts n pixels rounded down to
// its lane count (4 or 8) by the body formula and returns how many it did.
#pragma once

#include <cstdint>

#include "spaces/space_frame.h"

namespace zel::spaces::xyz {

template <int Stride>
int rgbToXyzBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n);
template <int Stride>
int xyzToRgbBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n);
// T is uint16_t or int16_t (biased).
template <int Stride, typename T>
int rgbToXyzBlocks16(Lanes lanes, const T* src, T* dst, int n);
template <int Stride, typename T>
int xyzToRgbBlocks16(Lanes lanes, const T* src, T* dst, int n);
template <int Stride>
int rgbToXyzBlocks32f(Lanes lanes, const float* src, float* dst, int n);
// The inverse has no zones: every pixel takes the one clamped formula.
template <int Stride>
int xyzToRgbBlocks32f(Lanes lanes, const float* src, float* dst, int n);

}  // namespace zel::spaces::xyz
