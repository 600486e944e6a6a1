// How a vector body reads and writes its three-float pixels: ordinary
// loads and stores, stores streamed past the caches (every address aligned
// to the vector), or one block of which only the first `keep` pixels are
// read and written (the head of a streamed row before its first aligned
// pixel, and the rest of its body after the last whole block; both are
// body pixels and take the body formula). All give the same bits.
#pragma once

#include <cstdint>

namespace zel::spaces {

struct RowStores {
  enum Kind { Plain, Stream, Part };
  Kind kind = Plain;
  int keep = 0;
};

// Pixels of `pixelBytes` bytes from `p` before the first one at a multiple
// of `vectorBytes`; -1 when no pixel ever is (p off the float grid).
inline int pixelsToAlignment(const void* p, int pixelBytes, int vectorBytes) {
  const uintptr_t a = reinterpret_cast<uintptr_t>(p);
  if (a & 3u) return -1;
  for (int k = 0; k < vectorBytes; ++k)
    if ((a + uintptr_t(k) * uintptr_t(pixelBytes)) % uintptr_t(vectorBytes) == 0) return k;
  return -1;
}

}  // namespace zel::spaces
