#include "frame/fill_bytes.h"
#include "frame/stream_stores.h"

#include "core/zelcore.h"
#include "frame/image_layout.h"
#include "frame/simd.h"

namespace zel {

namespace {

void fillRow(uint8_t* p, int64_t length, __m128i v, uint8_t value, bool nonTemporal) {
  if (length >= 64) {
    const uintptr_t misalign = reinterpret_cast<uintptr_t>(p) & 15u;
    if (misalign != 0) {
      store128(p, v);
      p += 16 - misalign;
      length -= int64_t(16 - misalign);
    }
    bool streamed = false;
    for (; length >= 64; p += 64, length -= 64) {
      if (nonTemporal) {
        storeStream128(p, v);
        storeStream128(p + 16, v);
        storeStream128(p + 32, v);
        storeStream128(p + 48, v);
        streamed = true;
      } else {
        _mm_store_si128(reinterpret_cast<__m128i*>(p), v);
        _mm_store_si128(reinterpret_cast<__m128i*>(p + 16), v);
        _mm_store_si128(reinterpret_cast<__m128i*>(p + 32), v);
        _mm_store_si128(reinterpret_cast<__m128i*>(p + 48), v);
      }
    }
    if (streamed) _mm_sfence();
  }
  for (int i = 0; i < 3 && length >= 16; ++i, p += 16, length -= 16) store128(p, v);
  for (; length > 0; --length) *p++ = value;
}

}  // namespace

bool streamsBeyondCache(int64_t bytesTouched) {
  if (bytesTouched <= 1048576) return false;
  int cacheSize = 0;
  if (zelGetMaxCacheSizeB(&cacheSize) != 0) return false;
  return bytesTouched > cacheSize;
}

bool fillBytesNonTemporal(int64_t total) {
  if (total <= 1048576) return false;
  int cacheSize = 0;
  if (zelGetMaxCacheSizeB(&cacheSize) != 0) return false;
  return total >= cacheSize;
}

Status fillBytes(uint8_t value, uint8_t* dst, int dstStep, int width, int height) {
  if (!dst) return StatusNullPointerError;
  if (width < 1 || height < 1) return StatusSizeError;
  const int64_t total = int64_t(width) * height;
  const bool nonTemporal = fillBytesNonTemporal(total);
  const __m128i v = _mm_set1_epi8(static_cast<char>(value));
  if (dstStep == width) {
    fillRow(dst, total, v, value, nonTemporal);
    return StatusOk;
  }
  for (int y = 0; y < height; ++y) fillRow(rowAt(dst, dstStep, y), width, v, value, nonTemporal);
  return StatusOk;
}

}  // namespace zel
