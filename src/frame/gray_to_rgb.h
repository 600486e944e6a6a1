// Gray to RGB: each output pixel repeats the gray sample in its three colour
// channels; a four-channel output takes the caller's alpha. No arithmetic
// touches a sample, so float NaN patterns arrive bit for bit.
#pragma once

#include <cstdint>

namespace zel {

// `s` and `d` may lie at any byte address: samples move as bytes.
template <typename T, int Channels>
inline void grayPixel(const T* s, T* d, T alpha) {
  // Copy through the bytes so float patterns (signalling NaN) stay exact.
  __builtin_memcpy(d, s, sizeof(T));
  __builtin_memcpy(d + 1, s, sizeof(T));
  __builtin_memcpy(d + 2, s, sizeof(T));
  if constexpr (Channels == 4) __builtin_memcpy(d + 3, &alpha, sizeof(T));
}

// Converts `count` pixels (a multiple of 4) in vector blocks.
template <typename T, int Channels>
void grayRowKernel(const T* src, T* dst, int count, T alpha);

}  // namespace zel
