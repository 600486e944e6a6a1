// Vector bodies of the HSV family: n pixels rounded down to the lane count,
// by the body formula; they return how many they did.
#pragma once

#include <cstdint>

#include "spaces/space_frame.h"

namespace zel::spaces::hsv {

template <int Stride>
int rgbToHsvBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores how);
// T is uint8_t or uint16_t.
template <int Stride, typename T>
int hsvToRgbBlocks(Lanes lanes, const T* src, T* dst, int n, RowStores how);

}  // namespace zel::spaces::hsv
