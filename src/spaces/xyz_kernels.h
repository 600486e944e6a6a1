// Vector bodies of the XYZ family. Each converts n pixels rounded down to
// its lane count (4, 8 or 16) by the body formula and returns how many it
// did; the float bodies store as `how` says, the others plainly.
#pragma once

#include <cstdint>

#include "spaces/space_frame.h"

namespace zel::spaces::xyz {

template <int Stride>
int rgbToXyzBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores how);
template <int Stride>
int xyzToRgbBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores how);
// T is uint16_t or int16_t (biased).
template <int Stride, typename T>
int rgbToXyzBlocks16(Lanes lanes, const T* src, T* dst, int n, RowStores how);
template <int Stride, typename T>
int xyzToRgbBlocks16(Lanes lanes, const T* src, T* dst, int n, RowStores how);
template <int Stride>
int rgbToXyzBlocks32f(Lanes lanes, const float* src, float* dst, int n, RowStores how);
// The inverse has no zones: every pixel takes the one clamped formula.
template <int Stride>
int xyzToRgbBlocks32f(Lanes lanes, const float* src, float* dst, int n, RowStores how);

}  // namespace zel::spaces::xyz
