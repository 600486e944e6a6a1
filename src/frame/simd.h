// Thin wrappers over the vector instructions: SSE4.1 is the baseline of the
// build, AVX2 bodies are compiled per function with ZEL_AVX2 and chosen at
// run time when the processor has them. A few compute-bound kernels have a
// third, 512-bit tier (ZEL_AVX512). Every tier gives the same bits.
#pragma once

#include <immintrin.h>

#include <atomic>
#include <cstdint>

#define ZEL_AVX2 __attribute__((target("avx2")))
// The 512-bit tier: foundation, byte and word, 128/256-bit forms, and double
// and quad words. The byte permutes come with ZEL_AVX512_VBMI.
#define ZEL_AVX512 __attribute__((target("avx2,avx512f,avx512bw,avx512vl,avx512dq")))
#define ZEL_AVX512_VBMI __attribute__((target("avx2,avx512f,avx512bw,avx512vl,avx512dq,avx512vbmi")))

// Generic helpers that take or return vector values of a unit type chosen by
// template parameter: always inlined, so that a 256-bit value never crosses a
// call between a function built for AVX2 and one that is not (the two pass
// such values differently). Without it an unoptimised build breaks.
#define ZEL_INLINE __attribute__((always_inline)) inline
// The same for a lambda, written after its parameter list.
#define ZEL_LAMBDA_INLINE __attribute__((always_inline))

// GCC takes the undefined upper lanes that many 512-bit intrinsics start
// from for uninitialised values; code of the 512-bit tier sits between these
// two marks, which silence that false warning (other compilers need not).
#if defined(__GNUC__) && !defined(__clang__)
#define ZEL_TIER512_BEGIN                                                                     \
  _Pragma("GCC diagnostic push") _Pragma("GCC diagnostic ignored \"-Wuninitialized\"") \
      _Pragma("GCC diagnostic ignored \"-Wmaybe-uninitialized\"")
#define ZEL_TIER512_END _Pragma("GCC diagnostic pop")
#else
#define ZEL_TIER512_BEGIN
#define ZEL_TIER512_END
#endif

namespace zel {

// The widest tier the kernels may take: what the processor has, lowered by
// setVectorTierCap (tests run every tier on one machine, and benchmarks
// compare them).
enum class VectorTier { Sse41 = 0, Avx2 = 1, Avx512 = 2 };
void setVectorTierCap(VectorTier cap);
// The cap before its first reading is kUnreadTier; row kernels ask for it
// per row, so the common case is one load.
constexpr int kUnreadTier = -1;
inline std::atomic<int> gVectorTierCap{kUnreadTier};
VectorTier readVectorTierCap();
inline VectorTier vectorTierCap() {
  const int cap = gVectorTierCap.load(std::memory_order_relaxed);
  return cap == kUnreadTier ? readVectorTierCap() : VectorTier(cap);
}

inline bool hasAvx2() { return vectorTierCap() >= VectorTier::Avx2 && __builtin_cpu_supports("avx2"); }
inline bool hasAvx512() {
  return vectorTierCap() >= VectorTier::Avx512 && __builtin_cpu_supports("avx512f") &&
         __builtin_cpu_supports("avx512bw") && __builtin_cpu_supports("avx512vl") &&
         __builtin_cpu_supports("avx512dq");
}
inline bool hasAvx512Vbmi() { return hasAvx512() && __builtin_cpu_supports("avx512vbmi"); }

// The widest tier a kernel may take on this processor, under the cap; the
// second for kernels whose 512-bit bodies need the byte permutes too.
inline VectorTier widestTier() {
  return hasAvx512() ? VectorTier::Avx512 : hasAvx2() ? VectorTier::Avx2 : VectorTier::Sse41;
}
inline VectorTier widestTierWithBytePermutes() {
  return hasAvx512Vbmi() ? VectorTier::Avx512 : hasAvx2() ? VectorTier::Avx2 : VectorTier::Sse41;
}

inline __m128i load128(const void* p) { return _mm_loadu_si128(static_cast<const __m128i*>(p)); }
inline __m128i load64(const void* p) { return _mm_loadl_epi64(static_cast<const __m128i*>(p)); }
inline __m128i load32(const void* p) {
  int32_t v;
  __builtin_memcpy(&v, p, 4);
  return _mm_cvtsi32_si128(v);
}
inline void store128(void* p, __m128i v) { _mm_storeu_si128(static_cast<__m128i*>(p), v); }
inline void store64(void* p, __m128i v) { _mm_storel_epi64(static_cast<__m128i*>(p), v); }
inline void storeStream128(void* p, __m128i v) { _mm_stream_si128(static_cast<__m128i*>(p), v); }

ZEL_AVX2 inline __m256i load256(const void* p) { return _mm256_loadu_si256(static_cast<const __m256i*>(p)); }
ZEL_AVX2 inline __m256i broadcast128(const void* p) { return _mm256_broadcastsi128_si256(load128(p)); }
ZEL_AVX2 inline void store256(void* p, __m256i v) { _mm256_storeu_si256(static_cast<__m256i*>(p), v); }

}  // namespace zel
