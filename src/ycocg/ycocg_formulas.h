// YCoCg pixel formulas, one function per transform and arithmetic width.
// >> is an arithmetic shift throughout. The wrapping forms compute modulo
// 2^16 (or 2^32) exactly as 16-bit (or 32-bit) lanes do, so each function is
// the scalar meaning of one lane of the vector blocks.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"

namespace zel::ycocg {

template <typename T>
struct Ycc {
  T y, co, cg;
};
template <typename T>
struct Bgr {
  T b, g, r;
};

inline int16_t wrap16(int32_t v) { return static_cast<int16_t>(static_cast<uint16_t>(uint32_t(v))); }
inline int32_t wrap32(int64_t v) { return static_cast<int32_t>(static_cast<uint32_t>(uint64_t(v))); }

// ---- plain forward: rounded matrix ----
// Exact in 32 bits for any signed 16-bit samples.
inline Ycc<int32_t> plainForward(int32_t b, int32_t g, int32_t r) {
  return {(r + 2 * g + b + 2) >> 2, (r - b + 1) >> 1, (2 * g - r - b + 2) >> 2};
}
// 16-bit planes of signed 16-bit samples: the blocks saturate, the last
// pixels of a row keep the low 16 bits.
inline Ycc<int16_t> plainForwardSaturated(int32_t b, int32_t g, int32_t r) {
  const Ycc<int32_t> v = plainForward(b, g, r);
  return {SaturateS16(v.y), SaturateS16(v.co), SaturateS16(v.cg)};
}
inline Ycc<int16_t> plainForwardWrapped(int32_t b, int32_t g, int32_t r) {
  const Ycc<int32_t> v = plainForward(b, g, r);
  return {wrap16(v.y), wrap16(v.co), wrap16(v.cg)};
}

// ---- reversible forward: four lifting steps ----
// In 32 bits (no overflow for 16-bit samples).
inline Ycc<int32_t> liftForward(int32_t b, int32_t g, int32_t r) {
  const int32_t co = r - b;
  const int32_t t = b + (co >> 1);
  const int32_t cg = g - t;
  return {t + (cg >> 1), co, cg};
}
// Every step modulo 2^16, shifts on the wrapped values.
inline Ycc<int16_t> liftForward16(int16_t b, int16_t g, int16_t r) {
  const int16_t co = wrap16(r - b);
  const int16_t t = wrap16(b + (co >> 1));
  const int16_t cg = wrap16(g - t);
  return {wrap16(t + (cg >> 1)), co, cg};
}

// ---- plain inverse ----
// Sums modulo 2^16; the low 16 bits depend only on the low 16 bits of the
// planes, so 32-bit planes take the same form.
inline Bgr<int16_t> plainInverse16(int32_t y, int32_t co, int32_t cg) {
  const uint32_t uy = uint32_t(y), uco = uint32_t(co), ucg = uint32_t(cg);
  return {wrap16(int32_t(uy - uco - ucg)), wrap16(int32_t(uy + ucg)), wrap16(int32_t(uy + uco - ucg))};
}

// ---- reversible inverse ----
inline Bgr<int16_t> liftInverse16(int16_t y, int16_t co, int16_t cg) {
  const int16_t t = wrap16(y - (cg >> 1));
  const int16_t g = wrap16(cg + t);
  const int16_t b = wrap16(t - (co >> 1));
  return {b, g, wrap16(co + b)};
}
// Steps in 32 bits (shifts of the full 32-bit values), low 16 bits kept.
inline Bgr<int16_t> liftInverse32(int32_t y, int32_t co, int32_t cg) {
  const int32_t t = wrap32(int64_t(y) - (cg >> 1));
  const int32_t g = wrap32(int64_t(cg) + t);
  const int32_t b = wrap32(int64_t(t) - (co >> 1));
  const int32_t r = wrap32(int64_t(co) + b);
  return {wrap16(b), wrap16(g), wrap16(r)};
}

// ---- byte planes: chroma offset by 128 ----
inline Ycc<uint8_t> bytePlaneForward(int32_t r, int32_t g, int32_t b) {
  const int32_t co = ((r - b + 1) >> 1) + 128;
  const int32_t cg = ((2 * g - b - r + 2) >> 2) + 128;
  return {uint8_t((r + 2 * g + b + 2) >> 2), uint8_t(co > 255 ? 255 : co), SaturateU8(cg)};
}
// Returns R, G, B in the `b`, `g`, `r` fields by meaning.
inline Bgr<uint8_t> bytePlaneInverse(int32_t y, int32_t co, int32_t cg) {
  return {SaturateU8(y - co - cg + 256), SaturateU8(y + cg - 128), SaturateU8(y + co - cg)};
}

}  // namespace zel::ycocg
