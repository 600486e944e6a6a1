// Vector bodies of the Lab family: n pixels rounded down to the lane count,
// by the body formula; they return how many they did.
#pragma once

#include <cstdint>

#include "spaces/space_frame.h"

namespace zel::spaces::lab {

// S, D as in forwardPixel and inversePixel (lab_formulas.h).
template <typename S, typename D, bool Bgr>
int forwardBlocks(Lanes lanes, const S* src, D* dst, int n, RowStores how);
template <typename S, typename D, bool Bgr>
int inverseBlocks(Lanes lanes, const S* src, D* dst, int n, RowStores how);

}  // namespace zel::spaces::lab
