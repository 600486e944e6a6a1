#define ZELCORE_BUILDING 1
#include "zelcore.h"

#include <cpuid.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <unistd.h>

namespace {

std::atomic<int> gMallocBudget{-1};
std::atomic<int> gCacheMode{-1};
std::atomic<int> gCacheSize{0};

uint64_t xgetbv0() {
  uint32_t eax, edx;
  __asm__ volatile("xgetbv" : "=a"(eax), "=d"(edx) : "c"(0));
  return (uint64_t(edx) << 32) | eax;
}

// Largest cache from sysfs (all levels of cpu0), falling back to sysconf.
long largestCache() {
  long best = 0;
  for (int index = 0; index < 16; ++index) {
    char path[96];
    std::snprintf(path, sizeof path, "/sys/devices/system/cpu/cpu0/cache/index%d/size", index);
    FILE* f = std::fopen(path, "r");
    if (!f) continue;
    long value = 0;
    char unit = 0;
    if (std::fscanf(f, "%ld%c", &value, &unit) >= 1) {
      if (unit == 'K') value *= 1024;
      else if (unit == 'M') value *= 1024 * 1024;
      if (value > best) best = value;
    }
    std::fclose(f);
  }
  if (best > 0) return best;
#ifdef _SC_LEVEL3_CACHE_SIZE
  const int names[] = {_SC_LEVEL1_DCACHE_SIZE, _SC_LEVEL2_CACHE_SIZE, _SC_LEVEL3_CACHE_SIZE,
                       _SC_LEVEL4_CACHE_SIZE};
  for (int name : names) {
    long v = sysconf(name);
    if (v > best) best = v;
  }
#endif
  return best;
}

}  // namespace

extern "C" {

void* zelMalloc(int length) {
  if (length <= 0) return nullptr;
  int budget = gMallocBudget.load();
  while (budget >= 0) {
    if (budget == 0) return nullptr;
    if (gMallocBudget.compare_exchange_weak(budget, budget - 1)) break;
  }
  void* p = nullptr;
#if defined(__SANITIZE_ADDRESS__)
  // Exactly the length asked for, so that the address sanitizer sees a
  // read or write past a temporary buffer.
  const size_t rounded = size_t(length);
#else
  const size_t rounded = (size_t(length) + 63) & ~size_t(63);
#endif
  if (posix_memalign(&p, 64, rounded) != 0) return nullptr;
  return p;
}

void zelFree(void* ptr) { std::free(ptr); }

int zelGetMaxCacheSizeB(int* size) {
  if (!size) return 1;
  int mode = gCacheMode.load();
  if (mode == 1) return 1;
  if (mode == 0) {
    *size = gCacheSize.load();
    return 0;
  }
  // The hardware does not change while the process runs: read it once.
  static const long best = largestCache();
  if (best <= 0) return 1;
  *size = best > 0x7fffffffL ? 0x7fffffff : int(best);
  return 0;
}

uint64_t zelGetEnabledCpuFeatures(void) {
  unsigned a, b, c, d;
  uint64_t mask = 0;
  if (!__get_cpuid(1, &a, &b, &c, &d)) return 0;
  if (d & bit_MMX) mask |= zelCpuMMX;
  if (d & bit_SSE) mask |= zelCpuSSE;
  if (d & bit_SSE2) mask |= zelCpuSSE2;
  if (c & bit_SSE3) mask |= zelCpuSSE3;
  if (c & bit_SSSE3) mask |= zelCpuSSSE3;
  if (c & bit_SSE4_1) mask |= zelCpuSSE41;
  if (c & bit_SSE4_2) mask |= zelCpuSSE42;
  bool osYmm = (c & bit_OSXSAVE) && (xgetbv0() & 6) == 6;
  if ((c & bit_AVX) && osYmm) mask |= zelCpuAVX;
  if ((c & bit_FMA) && osYmm) mask |= zelCpuFMA;
  if (__get_cpuid_count(7, 0, &a, &b, &c, &d)) {
    if ((b & bit_AVX2) && osYmm) mask |= zelCpuAVX2;
    if (b & bit_BMI2) mask |= zelCpuBMI2;
  }
  return mask;
}

void zelTestFailMallocAfter(int successes) { gMallocBudget.store(successes < 0 ? -1 : successes); }

void zelTestOverrideCacheSize(int mode, int size) {
  gCacheSize.store(size);
  gCacheMode.store(mode);
}

}  // extern "C"
