// How a vector body puts its float pixels: with ordinary stores, streamed
// past the caches (every address aligned to the vector), or only the first
// `keep` pixels of one block (the head of a row before its first aligned
// pixel, computed by the body formula like every other body pixel). The
// three give the same bits.
#pragma once

#include <cstdint>

namespace zel::spaces {

struct RowStores {
  enum Kind { Plain, Stream, Head };
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
