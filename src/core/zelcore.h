/* zelcore: the small companion library of zelcc (memory, cache size,
 * processor features). */
#ifndef ZELCORE_H
#define ZELCORE_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#if defined(ZELCORE_BUILDING)
#define ZELCORE_API __attribute__((visibility("default")))
#else
#define ZELCORE_API
#endif

/* Feature bits reported by zelGetEnabledCpuFeatures. */
enum {
  zelCpuMMX = 1u << 0,
  zelCpuSSE = 1u << 1,
  zelCpuSSE2 = 1u << 2,
  zelCpuSSE3 = 1u << 3,
  zelCpuSSSE3 = 1u << 4,
  zelCpuSSE41 = 1u << 5,
  zelCpuSSE42 = 1u << 6,
  zelCpuAVX = 1u << 7,
  zelCpuAVX2 = 1u << 8,
  zelCpuFMA = 1u << 9,
  zelCpuBMI2 = 1u << 10
};

/* Memory of at least `length` bytes aligned to 64, or null. */
ZELCORE_API void* zelMalloc(int length);
ZELCORE_API void zelFree(void* ptr);
/* Stores the size in bytes of the largest cache; 0 on success, non-zero
 * when the size is unknown. */
ZELCORE_API int zelGetMaxCacheSizeB(int* size);
/* Mask of the zelCpu* bits the processor and operating system support. */
ZELCORE_API uint64_t zelGetEnabledCpuFeatures(void);

/* Test hooks, not for production use.
 * After `successes` more successful calls, zelMalloc returns null until the
 * hook is set again; a negative count switches failures off. */
ZELCORE_API void zelTestFailMallocAfter(int successes);
/* Makes zelGetMaxCacheSizeB fail (1), report `size` (0), or behave
 * normally (-1). */
ZELCORE_API void zelTestOverrideCacheSize(int mode, int size);

#ifdef __cplusplus
}
#endif

#endif
