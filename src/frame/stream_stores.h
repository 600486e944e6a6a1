// Streaming (non-temporal) stores for kernels whose frames are larger than
// the largest cache: such a frame's output is not read back from the cache
// anyway, and streaming it saves the read of each destination line before
// it is written. Results are the same bits either way.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"

namespace zel {

// True when a call that reads and writes `bytesTouched` bytes in all should
// stream its output: more than a mebibyte, and more than the largest cache
// holds. A failing cache query keeps ordinary stores.
bool streamsBeyondCache(int64_t bytesTouched);

// The two store kinds, as a template parameter of a kernel. The streaming
// kind needs its addresses aligned to the vector width and a fence when the
// call is done.
struct PlainStores {
  static constexpr bool streaming = false;
  static void put(float* p, __m128 v) { _mm_storeu_ps(p, v); }
  static void put(void* p, __m128i v) { _mm_storeu_si128(static_cast<__m128i*>(p), v); }
  ZEL_AVX2 static void put(float* p, __m256 v) { _mm256_storeu_ps(p, v); }
  ZEL_AVX2 static void put(void* p, __m256i v) { _mm256_storeu_si256(static_cast<__m256i*>(p), v); }
  static void fence() {}
};

struct StreamStores {
  static constexpr bool streaming = true;
  static void put(float* p, __m128 v) { _mm_stream_ps(p, v); }
  static void put(void* p, __m128i v) { _mm_stream_si128(static_cast<__m128i*>(p), v); }
  ZEL_AVX2 static void put(float* p, __m256 v) { _mm256_stream_ps(p, v); }
  ZEL_AVX2 static void put(void* p, __m256i v) { _mm256_stream_si256(static_cast<__m256i*>(p), v); }
  static void fence() { _mm_sfence(); }
};

}  // namespace zel
