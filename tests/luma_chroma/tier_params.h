// Kernel tests run once for each vector tier: a parameter of the test
// suite, printed by name, and skipped where this processor (or the cap of
// the tier) lacks it.
#pragma once

#include <gtest/gtest.h>

#include <ostream>

#include "frame/simd.h"
#include "luma_chroma/vector_units.h"

namespace zel {

inline const char* tierName(VectorTier t) {
  return t == VectorTier::Sse41 ? "Sse41" : t == VectorTier::Avx2 ? "Avx2" : "Avx512";
}
inline void PrintTo(VectorTier t, std::ostream* os) { *os << tierName(t); }

namespace test {

class TierTest : public ::testing::TestWithParam<VectorTier> {
 protected:
  void SetUp() override {
    if (zel::widestTierWithBytePermutes() < GetParam()) GTEST_SKIP() << "the processor lacks this vector tier";
  }
};

inline auto allTiers() { return ::testing::Values(VectorTier::Sse41, VectorTier::Avx2, VectorTier::Avx512); }
inline std::string tierTestName(const ::testing::TestParamInfo<VectorTier>& info) { return tierName(info.param); }

}  // namespace test
}  // namespace zel
