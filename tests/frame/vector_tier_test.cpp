// The tier cap lowers what the kernels may take and never raises it above
// what the processor has.
#include <gtest/gtest.h>

#include "frame/simd.h"

namespace {

TEST(VectorTier, CapLowersTheChoice) {
  const zel::VectorTier before = zel::vectorTierCap();
  const bool avx2 = __builtin_cpu_supports("avx2");
  zel::setVectorTierCap(zel::VectorTier::Sse41);
  EXPECT_FALSE(zel::hasAvx2());
  EXPECT_FALSE(zel::hasAvx512());
  zel::setVectorTierCap(zel::VectorTier::Avx2);
  EXPECT_EQ(zel::hasAvx2(), avx2);
  EXPECT_FALSE(zel::hasAvx512());
  EXPECT_FALSE(zel::hasAvx512Vbmi());
  zel::setVectorTierCap(zel::VectorTier::Avx512);
  EXPECT_EQ(zel::hasAvx2(), avx2);
  if (zel::hasAvx512()) EXPECT_TRUE(__builtin_cpu_supports("avx512bw"));
  zel::setVectorTierCap(before);
}

}  // namespace
