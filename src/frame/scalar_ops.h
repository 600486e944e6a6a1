// Exact scalar meanings of the 16-bit vector lane operations. The family
// formulas are written with these, so a scalar tail and a vector body built
// from them agree bit for bit.
#pragma once

#include <cstdint>

namespace zel {

// (a * b + 16384) >> 15, low 16 bits (pmulhrsw).
inline int16_t MulHighRound(int16_t a, int16_t b) {
  return static_cast<int16_t>((int32_t(a) * int32_t(b) + 16384) >> 15);
}
// (a * b) >> 16, unsigned (pmulhuw).
inline uint16_t MulHighU16(uint16_t a, uint16_t b) {
  return static_cast<uint16_t>((uint32_t(a) * uint32_t(b)) >> 16);
}
// (a * b) >> 16, arithmetic: rounds towards minus infinity (pmulhw).
inline int16_t MulHighS16(int16_t a, int16_t b) {
  return static_cast<int16_t>((int32_t(a) * int32_t(b)) >> 16);
}
inline uint16_t AddSaturateU16(uint16_t a, uint16_t b) {
  uint32_t s = uint32_t(a) + b;
  return static_cast<uint16_t>(s > 65535u ? 65535u : s);
}
inline int16_t AddSaturateS16(int16_t a, int16_t b) {
  int32_t s = int32_t(a) + b;
  return static_cast<int16_t>(s < -32768 ? -32768 : (s > 32767 ? 32767 : s));
}
inline uint8_t SaturateU8(int32_t x) { return static_cast<uint8_t>(x < 0 ? 0 : (x > 255 ? 255 : x)); }
inline int16_t SaturateS16(int32_t x) {
  return static_cast<int16_t>(x < -32768 ? -32768 : (x > 32767 ? 32767 : x));
}
inline uint16_t SaturateU16(int32_t x) {
  return static_cast<uint16_t>(x < 0 ? 0 : (x > 65535 ? 65535 : x));
}
inline uint8_t AverageRoundU8(uint8_t a, uint8_t b) { return static_cast<uint8_t>((a + b + 1) >> 1); }
inline int32_t TruncatedMean(int32_t a, int32_t b) { return (a + b) >> 1; }

}  // namespace zel
