// Row addressing: row y of an image starts at base + y * step bytes, for any
// step, zero and negative included.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace zel {

template <typename T>
inline T* rowAt(T* base, int step, int y) {
  using Byte = std::conditional_t<std::is_const_v<T>, const uint8_t, uint8_t>;
  return reinterpret_cast<T*>(reinterpret_cast<Byte*>(base) + std::ptrdiff_t(y) * step);
}

// A sample at any byte address: rows of 16-bit and float samples may start
// anywhere (steps are byte counts), so scalar accesses go through bytes.
template <typename T>
inline T loadSample(const T* p) {
  T v;
  std::memcpy(&v, p, sizeof v);
  return v;
}
template <typename T>
inline void storeSample(T* p, T v) {
  std::memcpy(p, &v, sizeof v);
}

inline bool isAligned16(const void* p) { return (reinterpret_cast<uintptr_t>(p) & 15u) == 0; }
inline bool isAligned16(int step) { return (step & 15) == 0; }

// Body and tail of a row: pixels [0, bodyEnd) go in blocks of `block`, the
// rest one by one. `block` is a power of two.
inline int bodyEnd(int width, int block) { return width & ~(block - 1); }

// True when one of the first `count` plane pointers of an array is null.
template <typename T>
inline bool anyPlaneNull(T* const* planes, int count = 3) {
  for (int k = 0; k < count; ++k)
    if (!planes[k]) return true;
  return false;
}

}  // namespace zel
