// The scalar meanings against the 16-bit vector instructions they describe.
#include <gtest/gtest.h>
#include <immintrin.h>

#include <random>

#include "frame/scalar_ops.h"

namespace {

using namespace zel;

// Compares a lane instruction with its scalar meaning over 16-bit pairs:
// every pair when `exhaustive`, else a few million random ones. The lane
// instruction comes wrapped: an intrinsic has no address of its own.
template <typename Vec, typename Scalar>
void compareLanes(const char* what, Vec vec, Scalar scalar, bool exhaustive) {
  std::mt19937 rng(7);
  alignas(16) int16_t a[8], b[8], r[8];
  const int64_t total = exhaustive ? int64_t(1) << 32 : int64_t(1) << 22;
  int64_t mismatches = 0;
  for (int64_t i = 0; i < total; i += 8) {
    for (int k = 0; k < 8; ++k) {
      const uint32_t v = exhaustive ? uint32_t(i + k) : uint32_t(rng());
      a[k] = int16_t(v & 0xffff);
      b[k] = int16_t(v >> 16);
    }
    const __m128i va = _mm_load_si128(reinterpret_cast<const __m128i*>(a));
    const __m128i vb = _mm_load_si128(reinterpret_cast<const __m128i*>(b));
    _mm_store_si128(reinterpret_cast<__m128i*>(r), vec(va, vb));
    for (int k = 0; k < 8; ++k)
      if (r[k] != int16_t(scalar(a[k], b[k])) && mismatches++ == 0)
        ADD_FAILURE() << what << "(" << a[k] << ", " << b[k] << "): lane " << r[k];
  }
  EXPECT_EQ(mismatches, 0) << what;
}

TEST(ScalarOps, MatchTheLaneInstructions) {
  compareLanes("MulHighU16", [](__m128i a, __m128i b) { return _mm_mulhi_epu16(a, b); },
               [](int16_t a, int16_t b) { return MulHighU16(uint16_t(a), uint16_t(b)); }, false);
  compareLanes("MulHighS16", [](__m128i a, __m128i b) { return _mm_mulhi_epi16(a, b); },
               [](int16_t a, int16_t b) { return MulHighS16(a, b); }, false);
  compareLanes("AddSaturateU16", [](__m128i a, __m128i b) { return _mm_adds_epu16(a, b); },
               [](int16_t a, int16_t b) { return AddSaturateU16(uint16_t(a), uint16_t(b)); }, false);
  compareLanes("AddSaturateS16", [](__m128i a, __m128i b) { return _mm_adds_epi16(a, b); },
               [](int16_t a, int16_t b) { return AddSaturateS16(a, b); }, false);
}

TEST(ScalarOps, MulHighRoundOverAllPairs) {
  // The rounding product has the surprising corner (-32768 squared wraps).
  compareLanes("MulHighRound", [](__m128i a, __m128i b) { return _mm_mulhrs_epi16(a, b); },
               [](int16_t a, int16_t b) { return MulHighRound(a, b); }, true);
}

TEST(ScalarOps, SaturationsAndAverages) {
  for (int v = -70000; v <= 70000; ++v) {
    const __m128i x = _mm_set1_epi32(v);
    EXPECT_EQ(SaturateS16(v), int16_t(_mm_extract_epi16(_mm_packs_epi32(x, x), 0)));
    EXPECT_EQ(SaturateU16(v), uint16_t(_mm_extract_epi16(_mm_packus_epi32(x, x), 0)));
    if (v >= -32768 && v <= 32767) {
      const __m128i h = _mm_set1_epi16(int16_t(v));
      EXPECT_EQ(SaturateU8(v), uint8_t(_mm_extract_epi8(_mm_packus_epi16(h, h), 0)));
    }
  }
  for (int a = 0; a < 256; ++a)
    for (int b = 0; b < 256; ++b) {
      const __m128i r = _mm_avg_epu8(_mm_set1_epi8(char(a)), _mm_set1_epi8(char(b)));
      EXPECT_EQ(AverageRoundU8(uint8_t(a), uint8_t(b)), uint8_t(_mm_extract_epi8(r, 0)));
      EXPECT_EQ(TruncatedMean(a, b), (a + b) / 2);
    }
  EXPECT_EQ(TruncatedMean(-3, 0), -2);  // shift, not division
}

TEST(ScalarOps, IdentitiesOfTheLumaChromaForms) {
  for (int s = 0; s < 256; ++s)
    for (int c = -32768; c < 32768; c += 7) {
      EXPECT_EQ(MulHighRound(int16_t(s << 7), int16_t(c)), int16_t((s * c + 128) >> 8));
      EXPECT_EQ(MulHighS16(int16_t(s << 7), int16_t(c)), int16_t((s * c) >> 9));
      EXPECT_EQ(MulHighU16(uint16_t(s << 8), uint16_t(c + 32768)), uint16_t((s * (c + 32768)) >> 8));
    }
}

}  // namespace
