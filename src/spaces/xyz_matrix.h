// The RGB to XYZ matrix and its inverse in float form (Rec. 709 primaries,
// D65 white), shared by the XYZ, LUV and Lab families. Each output is the
// left-to-right sum (m0 * a + m1 * b) + m2 * c in 32-bit floats; a negative
// coefficient added is the same as its magnitude subtracted.
#pragma once

namespace zel::spaces {

inline constexpr float kRgbToXyz[3][3] = {{0.412453f, 0.35758f, 0.180423f},
                                          {0.212671f, 0.71516f, 0.072169f},
                                          {0.019334f, 0.119193f, 0.950227f}};

inline constexpr float kXyzToRgb[3][3] = {{3.240479f, -1.53715f, -0.498535f},
                                          {-0.969256f, 1.875991f, 0.041556f},
                                          {0.055648f, -0.204043f, 1.057311f}};

inline float matrixRow(const float (&m)[3], float a, float b, float c) { return (m[0] * a + m[1] * b) + m[2] * c; }

// MAXSS / MINSS: the second operand unless the comparison holds, so a NaN
// gives the bound. The vector bodies use the same instructions.
inline float maxOf(float a, float b) { return a > b ? a : b; }
inline float minOf(float a, float b) { return a < b ? a : b; }

}  // namespace zel::spaces
