// The dithers' noise generator: its sequence (values from an independent
// model), its continuation across fills, the tables of a noisy call, and
// the statuses of its operations.
#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "core/zelcore.h"
#include "reduce_bits/noise_generator.h"

namespace {

using namespace zel::reduce;

uint32_t bitsOf(float f) {
  uint32_t b;
  std::memcpy(&b, &f, 4);
  return b;
}

TEST(NoiseGenerator, SequencesOfBothRecords) {
  NoiseGenState16* g16 = nullptr;
  ASSERT_EQ(NoiseGenInit16(&g16, -1000, 1000, 12345), StatusOk);
  EXPECT_EQ(g16->identity, 36);
  int16_t ints[6];
  ASSERT_EQ(NoiseGenFill16(ints, 6, g16), StatusOk);
  EXPECT_EQ(std::vector<int16_t>(ints, ints + 6), (std::vector<int16_t>{-396, 863, 24, 807, 704, 882}));
  EXPECT_EQ(NoiseGenFree16(g16), StatusOk);

  NoiseGenState32f* g32 = nullptr;
  ASSERT_EQ(NoiseGenInit32f(&g32, 0.1f, 0.7f, 7), StatusOk);
  EXPECT_EQ(g32->identity, 37);
  float floats[4];
  ASSERT_EQ(NoiseGenFill32f(floats, 4, g32), StatusOk);
  const uint32_t expected[] = {0x3e71405cu, 0x3e364cfeu, 0x3eb95e3cu, 0x3e53c741u};
  for (int i = 0; i < 4; ++i) EXPECT_EQ(bitsOf(floats[i]), expected[i]) << i;
  EXPECT_EQ(NoiseGenFree32f(g32), StatusOk);
}

TEST(NoiseGenerator, FillsContinueTheSequence) {
  // One fill of 37 values equals fills of 1, 12 and 24 from a fresh record.
  NoiseGenState32f *whole = nullptr, *parts = nullptr;
  ASSERT_EQ(NoiseGenInit32f(&whole, -3.0f, 5.0f, 99), StatusOk);
  ASSERT_EQ(NoiseGenInit32f(&parts, -3.0f, 5.0f, 99), StatusOk);
  float a[37], b[37];
  ASSERT_EQ(NoiseGenFill32f(a, 37, whole), StatusOk);
  ASSERT_EQ(NoiseGenFill32f(b, 1, parts), StatusOk);
  ASSERT_EQ(NoiseGenFill32f(b + 1, 12, parts), StatusOk);
  ASSERT_EQ(NoiseGenFill32f(b + 13, 24, parts), StatusOk);
  EXPECT_EQ(std::memcmp(a, b, sizeof a), 0);
  for (float v : a) {
    EXPECT_GE(v, -3.0f);
    EXPECT_LE(v, 5.0f);
  }
  NoiseGenFree32f(whole);
  NoiseGenFree32f(parts);
}

TEST(NoiseGenerator, TablesOfANoisyCall) {
  // Indices from bounds 0..1024, values here from -0.3..0.3 (noise 30 of the
  // ordered kind), both from seed 0.
  NoiseTables t;
  ASSERT_EQ(buildNoiseTables(t, -0.3f, 0.3f), StatusOk);
  const int16_t indices[] = {0, 133, 216, 412, 361, 758};
  for (int i = 0; i < 6; ++i) EXPECT_EQ(t.randomIndex[i], indices[i]) << i;
  EXPECT_EQ(t.randomIndex[1023], 444);
  EXPECT_EQ(bitsOf(t.values[0]), 0xbe994e66u);
  EXPECT_EQ(bitsOf(t.values[1]), 0xbe633ae9u);
  EXPECT_EQ(bitsOf(t.values[2]), 0xbe3120b0u);
  EXPECT_EQ(bitsOf(t.values[1023]), 0xbd21e094u);
  for (int i = 0; i < kNoiseTableSize; ++i) ASSERT_TRUE(t.randomIndex[i] >= 0 && t.randomIndex[i] < 1024);
  releaseNoiseTables(t);
  EXPECT_EQ(t.values, nullptr);
}

TEST(NoiseGenerator, StatusesAndIdentities) {
  EXPECT_EQ(NoiseGenInit16(nullptr, 0, 1, 0), StatusNullPointerError);
  EXPECT_EQ(NoiseGenInit32f(nullptr, 0, 1, 0), StatusNullPointerError);
  NoiseGenState16* g16 = nullptr;
  NoiseGenState32f* g32 = nullptr;
  zelTestFailMallocAfter(0);
  EXPECT_EQ(NoiseGenInit16(&g16, 0, 1, 0), StatusOutOfMemoryError);
  EXPECT_EQ(NoiseGenInit32f(&g32, 0, 1, 0), StatusOutOfMemoryError);
  zelTestFailMallocAfter(-1);
  ASSERT_EQ(NoiseGenInit16(&g16, 0, 1024, 0), StatusOk);
  ASSERT_EQ(NoiseGenInit32f(&g32, 0.0f, 1.0f, 0), StatusOk);
  int16_t ints[4];
  float floats[4];
  EXPECT_EQ(NoiseGenFill16(nullptr, 4, g16), StatusNullPointerError);
  EXPECT_EQ(NoiseGenFill16(ints, 4, nullptr), StatusNullPointerError);
  EXPECT_EQ(NoiseGenFill16(ints, 0, g16), StatusSizeError);
  EXPECT_EQ(NoiseGenFill32f(floats, -1, g32), StatusSizeError);
  // A record of the other kind carries the other identity.
  EXPECT_EQ(NoiseGenFill32f(floats, 4, reinterpret_cast<NoiseGenState32f*>(g16)), StatusStateIdentityError);
  EXPECT_EQ(NoiseGenFill16(ints, 4, reinterpret_cast<NoiseGenState16*>(g32)), StatusStateIdentityError);
  EXPECT_EQ(NoiseGenFree32f(reinterpret_cast<NoiseGenState32f*>(g16)), StatusStateIdentityError);
  EXPECT_EQ(NoiseGenFree16(reinterpret_cast<NoiseGenState16*>(g32)), StatusStateIdentityError);
  EXPECT_EQ(NoiseGenFree16(nullptr), StatusNullPointerError);
  EXPECT_EQ(NoiseGenFree32f(nullptr), StatusNullPointerError);
  EXPECT_EQ(NoiseGenFree16(g16), StatusOk);
  EXPECT_EQ(NoiseGenFree32f(g32), StatusOk);
}

}  // namespace
