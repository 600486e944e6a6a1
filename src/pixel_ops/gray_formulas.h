// Colour to gray: the weighted sum of a pixel's three channels, one formula
// per sample type. 8u has two: the block form truncates each product in a
// 16-bit lane and reads the saturated sum as signed, the tail form is the
// exact 32-bit sum; the two differ by one on a few pixels and a lot when the
// weights add up to clearly more than one.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"

namespace zel::gray {

// 8u weights in format shift 15.
struct Weights8 {
  uint16_t c0, c1, c2;
};
struct WeightsF {
  float w0, w1, w2;
};
struct WeightsD {
  double w0, w1, w2;
};

// The fixed weights 0.299, 0.587, 0.114 (their 8u form sums to 32769).
inline constexpr Weights8 kFixed8{9798, 19235, 3736};
inline WeightsF fixedFloat() {
  const uint32_t bits[3] = {0x3E991687u, 0x3F1645A2u, 0x3DE978D5u};
  WeightsF w;
  __builtin_memcpy(&w.w0, &bits[0], 4);
  __builtin_memcpy(&w.w1, &bits[1], 4);
  __builtin_memcpy(&w.w2, &bits[2], 4);
  return w;
}
inline WeightsD fixedDouble() {
  const WeightsF f = fixedFloat();
  return {double(f.w0), double(f.w1), double(f.w2)};
}

// A caller's float weight in shift 15: truncation of 0.5 + 32768 * c in
// 64 bits, low 16 bits kept. Nothing is range checked, so -0.5 or 2.0 wrap.
inline uint16_t weight8(float c) {
  const double v = 0.5 + 32768.0 * double(c);
  return static_cast<uint16_t>(_mm_cvttsd_si32(_mm_set_sd(v)));
}

inline Weights8 weights8(const float* coeffs) {
  if (!coeffs) return kFixed8;
  return {weight8(coeffs[0]), weight8(coeffs[1]), weight8(coeffs[2])};
}
inline WeightsF weightsF(const float* coeffs) {
  if (!coeffs) return fixedFloat();
  return {coeffs[0], coeffs[1], coeffs[2]};
}
inline WeightsD weightsD(const double* coeffs) {
  if (!coeffs) return fixedDouble();
  return {coeffs[0], coeffs[1], coeffs[2]};
}

// 8u block form: (sample << 8) high-multiplied by the weight, saturated
// sums, + 64, read as signed, shifted by 7, saturated to 8 bits.
inline uint8_t block8(uint8_t a, uint8_t b, uint8_t d, Weights8 w) {
  uint16_t s = AddSaturateU16(MulHighU16(uint16_t(a << 8), w.c0), MulHighU16(uint16_t(b << 8), w.c1));
  s = AddSaturateU16(s, MulHighU16(uint16_t(d << 8), w.c2));
  s = AddSaturateU16(s, 64);
  return SaturateU8(static_cast<int16_t>(s) >> 7);
}

// 8u tail form: the exact sum, rounded at bit 15, low 8 bits.
inline uint8_t tail8(uint8_t a, uint8_t b, uint8_t d, Weights8 w) {
  const uint32_t y = uint32_t(a) * w.c0 + uint32_t(b) * w.c1 + uint32_t(d) * w.c2 + 16384u;
  return static_cast<uint8_t>(y >> 15);
}

inline float sumF(float a, float b, float d, WeightsF w) { return (a * w.w0 + b * w.w1) + d * w.w2; }

// 16u: nearest integer of the float sum, low 16 bits (no saturation).
inline uint16_t gray16u(uint16_t a, uint16_t b, uint16_t d, WeightsF w) {
  return static_cast<uint16_t>(RoundEven(sumF(float(a), float(b), float(d), w)));
}

// 16s works on 0..65535: samples biased by 32768, the result unbiased in
// 32 bits. The block saturates it to 16 bits, the tail keeps the low bits.
inline int32_t biased16s(int16_t a, int16_t b, int16_t d, WeightsF w) {
  const float fa = float(int32_t(a) + 32768), fb = float(int32_t(b) + 32768), fd = float(int32_t(d) + 32768);
  return static_cast<int32_t>(static_cast<uint32_t>(RoundEven(sumF(fa, fb, fd, w))) - 32768u);
}
inline int16_t block16s(int16_t a, int16_t b, int16_t d, WeightsF w) { return SaturateS16(biased16s(a, b, d, w)); }
inline int16_t tail16s(int16_t a, int16_t b, int16_t d, WeightsF w) {
  return static_cast<int16_t>(static_cast<uint16_t>(biased16s(a, b, d, w)));
}

inline float gray32f(float a, float b, float d, WeightsF w) { return sumF(a, b, d, w); }
inline double gray64f(double a, double b, double d, WeightsD w) { return (a * w.w0 + b * w.w1) + d * w.w2; }

}  // namespace zel::gray
