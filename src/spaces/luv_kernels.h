// Vector bodies of the LUV family: n pixels rounded down to the lane count,
// by the body formula; they return how many they did.
#pragma once

#include <cstdint>

#include "spaces/space_frame.h"

namespace zel::spaces::luv {

template <bool Bgr>
int forwardTableBlocks(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores how);
template <int Stride, bool Bgr>
int forward32fBlocks(Lanes lanes, const float* src, float* dst, int n, RowStores how);
// T is uint16_t or int16_t (biased).
template <int Stride, typename T>
int forward16Blocks(Lanes lanes, const T* src, T* dst, int n, RowStores how);
// Stride 4 is the AC4 form of the body, with its own linear segment,
// scaling and truncation.
template <int Stride, bool Bgr>
int inverse8uBlocks(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores how);
template <int Stride, typename T>
int inverse16Blocks(Lanes lanes, const T* src, T* dst, int n, RowStores how);
template <bool Bgr>
int inverse32fBlocks(Lanes lanes, const float* src, float* dst, int n, RowStores how);

}  // namespace zel::spaces::luv
