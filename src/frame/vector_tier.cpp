// The cap on the vector tier. It starts from the environment variable
// ZELCC_MAX_TIER (sse41, avx2 or avx512; unset means no cap), so that a
// user or a benchmark can compare the tiers of one build on one machine.
#include <cstdlib>
#include <cstring>

#include "frame/simd.h"

namespace zel {

namespace {

int capFromEnvironment() {
  const char* v = std::getenv("ZELCC_MAX_TIER");
  if (!v) return int(VectorTier::Avx512);
  if (std::strcmp(v, "sse41") == 0) return int(VectorTier::Sse41);
  if (std::strcmp(v, "avx2") == 0) return int(VectorTier::Avx2);
  return int(VectorTier::Avx512);
}

}  // namespace

void setVectorTierCap(VectorTier cap) { gVectorTierCap.store(int(cap), std::memory_order_relaxed); }

VectorTier readVectorTierCap() {
  const int cap = capFromEnvironment();
  gVectorTierCap.store(cap, std::memory_order_relaxed);
  return VectorTier(cap);
}

}  // namespace zel
