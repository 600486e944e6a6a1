// The ordered-dither thresholds, indexed [y & 3][x & 3] with x and y counted
// from the region's top left pixel. Both are one 16-entry pattern scaled to
// the width of a quantisation level in 8.8 fixed point (a colour c counts as
// c * 256); the values stand as listed.
#pragma once

#include <cstdint>

namespace zel::pack {

// 5-bit fields (and, halved, the 6-bit green of 565).
inline constexpr int16_t kDitherMatrix5[4][4] = {
    {0, 1118, 279, 1398},
    {1678, 559, 1957, 839},
    {419, 1538, 139, 1258},
    {2097, 978, 1817, 699},
};

// 4-bit fields.
inline constexpr int16_t kDitherMatrix4[4][4] = {
    {0, 2312, 578, 2890},
    {3468, 1156, 4046, 1734},
    {867, 3179, 289, 2601},
    {4335, 2023, 3757, 1445},
};

}  // namespace zel::pack
