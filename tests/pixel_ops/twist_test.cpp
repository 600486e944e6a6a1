// Colour twist: vector blocks against the per-sample formulas for every
// type and layout, clamping, rounding under a caller's rounding mode, and
// the row merging of the float members.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <limits>
#include <random>
#include <type_traits>
#include <vector>

#include "frame/descriptor.h"
#include "frame/simd.h"
#include "pixel_ops/twist.h"
#include "support/guarded_call.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::twist;
using zel::test::TestImage;

// A weight of 0 asks for entries drawn from non-finite, huge and ordinary
// values, so that the clamps meet infinities, NaN and overflowing sums.
Matrix randomMatrix(std::mt19937& rng, float weight, float constant) {
  std::uniform_real_distribution<float> w(-weight, weight), c(-constant, constant);
  const float inf = std::numeric_limits<float>::infinity(), nan = std::numeric_limits<float>::quiet_NaN();
  const float special[] = {inf, -inf, nan, 3e9f, -3e9f, 1e30f, -1e30f, 0.5f, -0.75f, 1.0f, 127.5f, -300.0f, 0.0f};
  Matrix m{};
  for (int i = 0; i < 4; ++i)
    for (int j = 0; j < 4; ++j)
      m.t[i][j] = weight == 0 ? special[rng() % std::size(special)] : j == 3 ? c(rng) : w(rng);
  return m;
}

// Weights and constants that are multiples of a quarter, so that many
// outputs fall exactly halfway between two integers.
Matrix tieMatrix(std::mt19937& rng, float constant) {
  const float weights[] = {0.5f, -0.5f, 1.5f, 0.25f, -0.75f, 2.5f, -1.25f};
  std::uniform_int_distribution<int> c(-int(constant), int(constant));
  Matrix m{};
  for (int i = 0; i < 3; ++i) {
    for (int j = 0; j < 3; ++j) m.t[i][j] = weights[rng() % std::size(weights)];
    m.t[i][3] = float(c(rng)) + 0.5f;
  }
  return m;
}

using zel::VectorTier;

bool hasTier(VectorTier tier) {
  return tier == VectorTier::Sse41 || (tier == VectorTier::Avx2 && zel::hasAvx2()) ||
         (tier == VectorTier::Avx512 && zel::widestTierWithBytePermutes() == VectorTier::Avx512);
}

const std::vector<int> kWidths70 = [] {
  std::vector<int> w;
  for (int x = 1; x <= 70; ++x) w.push_back(x);
  return w;
}();

// Rows of one layout through the kernel, in place or not, against the
// formula of each sample; alpha and everything past the row unchanged.
// A weight of -1 asks for tieMatrix.
template <typename T, int K>
void checkKernel(float weight, float constant, bool inPlace, VectorTier tier,
                 const std::vector<int>& widths = kWidths70) {
  std::mt19937 rng(K * 100 + int(sizeof(T)));
  const int planes = K == Planar ? 3 : 1, perPixel = K == Planar ? 1 : K;
  for (int width : widths)
    for (int offset : {0, 1, 2, 5}) {
      if (offset % int(sizeof(T))) continue;
      const Matrix m = weight < 0 ? tieMatrix(rng, constant) : randomMatrix(rng, weight, constant);
      std::vector<TestImage<T>> src, dst;
      for (int k = 0; k < planes; ++k) {
        src.emplace_back(width * perPixel, 1, offset);
        dst.emplace_back(width * perPixel, 1, offset + 2 * int(sizeof(T)));
        src[k].fillRandom(rng(), -2, 3);
        dst[k].fillRandom(rng(), -2, 3);
      }
      std::vector<TestImage<T>>& out = inPlace ? src : dst;
      // Samples before the call (the images share storage when copied).
      auto samples = [&](std::vector<TestImage<T>>& imgs) {
        std::vector<std::vector<T>> v(planes);
        for (int k = 0; k < planes; ++k)
          for (int i = 0; i < width * perPixel; ++i) v[k].push_back(imgs[k].get(i, 0));
        return v;
      };
      const auto before = samples(out), in = samples(src);
      const T* s[3];
      T* d[3];
      for (int k = 0; k < 3; ++k) {
        s[k] = src[k < planes ? k : 0].data();
        d[k] = out[k < planes ? k : 0].data();
      }
      row<T, K>(s, d, width, m, tier);
      for (int x = 0; x < width; ++x) {
        auto inAt = [&](int ch) { return K == Planar ? in[ch][x] : in[0][x * K + ch]; };
        const float a = float(inAt(0)), b = float(inAt(1)), c = float(inAt(2));
        for (int ch = 0; ch < 3; ++ch) {
          const T want = Sample<T>::out(m, ch, a, b, c);
          const T got = K == Planar ? out[ch].get(x, 0) : out[0].get(x * K + ch, 0);
          ASSERT_EQ(std::memcmp(&got, &want, sizeof(T)), 0) << "width " << width << " pixel " << x << " ch " << ch;
        }
        if (K == AC4) {
          const T got = out[0].get(x * 4 + 3, 0), was = before[0][x * 4 + 3];
          ASSERT_EQ(std::memcmp(&got, &was, sizeof(T)), 0) << "alpha of pixel " << x;
        }
      }
      for (auto& img : out) ASSERT_TRUE(img.guardsIntact()) << width;
    }
}

template <typename T>
void checkAllLayouts(float weight, float constant, VectorTier tier, const std::vector<int>& widths = kWidths70) {
  for (bool inPlace : {false, true}) {
    checkKernel<T, C3>(weight, constant, inPlace, tier, widths);
    checkKernel<T, AC4>(weight, constant, inPlace, tier, widths);
    checkKernel<T, Planar>(weight, constant, inPlace, tier, widths);
  }
}
template <typename T>
void checkAllLayouts(float weight, float constant) {
  for (VectorTier tier : {VectorTier::Sse41, VectorTier::Avx2})
    if (hasTier(tier)) checkAllLayouts<T>(weight, constant, tier);
}

TEST(TwistKernels, BlocksMatchTheFormulaOfEveryType) {
  // Weights and constants big enough to reach both clamps often.
  checkAllLayouts<uint8_t>(1.5f, 200.0f);
  checkAllLayouts<int8_t>(1.5f, 200.0f);
  checkAllLayouts<uint16_t>(1.5f, 40000.0f);
  checkAllLayouts<int16_t>(1.5f, 40000.0f);
  checkAllLayouts<float>(2.0f, 1.0f);
  checkAllLayouts<uint8_t>(-1, 100.0f);  // ties
}

TEST(TwistKernels, NonFiniteAndHugeEntriesClampAlikeInBlocksAndTails) {
  checkAllLayouts<uint8_t>(0, 0);
  checkAllLayouts<int8_t>(0, 0);
  checkAllLayouts<uint16_t>(0, 0);
  checkAllLayouts<int16_t>(0, 0);
}

// Sixteen-pixel blocks: every width up to 70 and a few past 128 (several
// whole blocks, then the narrower blocks and the pixel tail).
TEST(TwistKernels, SixteenPixelBlocksMatchTheFormula) {
  if (!hasTier(VectorTier::Avx512)) GTEST_SKIP() << "no 512-bit tier with byte permutes";
  std::vector<int> widths = kWidths70;
  for (int w : {127, 128, 129, 143, 160, 171}) widths.push_back(w);
  const VectorTier t = VectorTier::Avx512;
  // Weights and constants big enough to reach both clamps often, including
  // constants far beyond the sample range on either side.
  checkAllLayouts<uint8_t>(1.5f, 200.0f, t, widths);
  checkAllLayouts<uint8_t>(3.0f, 2000.0f, t, widths);
  checkAllLayouts<int8_t>(1.5f, 200.0f, t, widths);
  checkAllLayouts<uint16_t>(1.5f, 40000.0f, t, widths);
  checkAllLayouts<int16_t>(1.5f, 40000.0f, t, widths);
  // Non-finite and huge entries.
  checkAllLayouts<uint8_t>(0, 0, t, widths);
  checkAllLayouts<int8_t>(0, 0, t, widths);
  checkAllLayouts<uint16_t>(0, 0, t, widths);
  checkAllLayouts<int16_t>(0, 0, t, widths);
  // Outputs halfway between integers round to even.
  checkAllLayouts<uint8_t>(-1, 100.0f, t, widths);
  checkAllLayouts<int8_t>(-1, 100.0f, t, widths);
  checkAllLayouts<uint16_t>(-1, 100.0f, t, widths);
  checkAllLayouts<int16_t>(-1, 100.0f, t, widths);
}

// Outputs near the end of the 32-bit range: the sixteen-pixel blocks leave
// the clamp to the packs only while the matrix keeps every output below
// 2^30; past 2^31 the rounded integer would be the indefinite one.
TEST(TwistKernels, SixteenPixelBlocksClampOutputsBeyondTheIntegerRange) {
  std::mt19937 rng(8);
  EXPECT_TRUE(narrowingClamps<uint8_t>(randomMatrix(rng, 1.5f, 300.0f)));
  Matrix m{};
  m.t[0][0] = 4.2e6f;  // 255 * 4.2e6 = 1.071e9, just below 2^30
  EXPECT_TRUE(narrowingClamps<uint8_t>(m));
  EXPECT_FALSE(narrowingClamps<uint16_t>(m));
  m.t[1][3] = -1.1e9f;
  EXPECT_FALSE(narrowingClamps<uint8_t>(m));
  m.t[1][3] = 0;
  m.t[2][1] = std::numeric_limits<float>::quiet_NaN();
  EXPECT_FALSE(narrowingClamps<uint8_t>(m));
  m.t[2][1] = std::numeric_limits<float>::infinity();
  EXPECT_FALSE(narrowingClamps<int16_t>(m));
  EXPECT_FALSE(narrowingClamps<int8_t>(Matrix{{{0, 0, 0, 1.1e9f}}}));
  EXPECT_TRUE(narrowingClamps<int8_t>(Matrix{{{8.3e6f, 0, 0, 0}}}));  // 128 * 8.3e6 < 2^30

  if (!hasTier(VectorTier::Avx512)) GTEST_SKIP() << "no 512-bit tier with byte permutes";
  // Weights that take sample 255 past 2^31 on either side, and one that
  // stays just inside.
  for (float w : {8.5e6f, -8.5e6f, 1.7e7f, 3.0e9f, 4.1e6f}) {
    const Matrix big = {{{w, 0.5f, 0, 0.25f}, {0, -w, 1, 0}, {0.5f, 0, w, -w}}};
    const int width = 100;
    TestImage<uint8_t> in(width * 3, 1), out(width * 3, 1);
    in.fillRandom(rng());
    for (int x = 0; x < 12; ++x) in.set(x, 0, x % 2 ? 255 : 0);
    const uint8_t* s[3] = {in.data(), in.data(), in.data()};
    uint8_t* d[3] = {out.data(), out.data(), out.data()};
    row<uint8_t, C3>(s, d, width, big, VectorTier::Avx512);
    for (int x = 0; x < width; ++x)
      for (int ch = 0; ch < 3; ++ch) {
        const uint8_t* p = in.data() + 3 * x;
        ASSERT_EQ(out.get(3 * x + ch, 0), Sample<uint8_t>::out(big, ch, p[0], p[1], p[2]))
            << w << " pixel " << x << " ch " << ch;
      }
  }
}

// Every integer member at widths around the block sizes, the last row
// ending on an inaccessible page, in each tier: no block reads or writes
// past the row.
TEST(TwistKernels, NoTierTouchesBytesPastTheRow) {
  using namespace zel::meta;
  const VectorTier cap = zel::vectorTierCap();
  zel::test::GuardedCall guarded;
  std::vector<VectorTier> tiers;
  for (VectorTier tier : {VectorTier::Sse41, VectorTier::Avx2, VectorTier::Avx512})
    if (hasTier(tier)) tiers.push_back(tier);
  for (VectorTier tier : tiers) {
    zel::setVectorTierCap(tier);
    for (const Descriptor& d : allDescriptors()) {
      if (d.name.rfind("zeliColorTwist32f_", 0) != 0) continue;
      for (int width : {15, 16, 17, 21, 22, 31, 32, 33, 37, 38, 39, 47, 53, 54, 55, 64, 70}) {
        Workspace w(d, ImageSize{width, 2}, 0, 0, Fence::After);
        w.fillRandom(uint32_t(width));
        const auto out = guarded.call(w);
        ASSERT_FALSE(out.faulted) << d.name << " width " << width << ": " << out.message;
        ASSERT_EQ(out.status, StatusOk) << d.name;
        ASSERT_EQ(w.checkGuards(), "") << d.name << " width " << width;
      }
    }
  }
  zel::setVectorTierCap(cap);
}

TEST(TwistKernels, FloatRunsMatchTheFormula) {
  std::mt19937 rng(9);
  for (int pixels = 1; pixels <= 70; ++pixels)
    for (int offset : {0, 4, 8, 12}) {
      const Matrix m = randomMatrix(rng, 2.0f, 1.0f);
      TestImage<float> src(pixels * 4, 1, offset);
      src.fillRandom(rng(), -1, 2);
      // Three channels, with and without streaming stores, in every tier's
      // blocks, the destination at 4-byte places of a 64-byte line (the
      // first pixels go one by one to a boundary).
      for (int dstOffset : {0, 4, 8, 12, 16, 20, 28, 36, 44, 52, 60})
        for (VectorTier tier : {VectorTier::Sse41, VectorTier::Avx2, VectorTier::Avx512}) {
          if (tier > zel::widestTier()) continue;
          for (bool stream : {false, true}) {
            TestImage<float> dst(pixels * 3, 1, dstOffset);
            row32fC3(src.data(), dst.data(), pixels, m, stream, tier);
            for (int x = 0; x < pixels * 3; ++x) {
              const float* p = src.data() + (x / 3) * 3;
              const float got = dst.get(x, 0), want = output(m, x % 3, p[0], p[1], p[2]);
              ASSERT_EQ(std::memcmp(&got, &want, 4), 0) << pixels << " " << x << " at " << dstOffset;
            }
            ASSERT_TRUE(dst.guardsIntact());
          }
        }
      // Four channels.
      TestImage<float> dst(pixels * 4, 1, 0);
      row32fC4(src.data(), dst.data(), pixels, m);
      for (int x = 0; x < pixels * 4; ++x) {
        const float* p = src.data() + (x / 4) * 4;
        ASSERT_EQ(dst.get(x, 0), output4(m, x % 4, p[0], p[1], p[2], p[3])) << pixels << " " << x;
      }
      ASSERT_TRUE(dst.guardsIntact());
    }
}

// A 3 by 4 matrix for the public functions.
struct Twist {
  float t[3][4];
};
Twist identity(float constant = 0) {
  Twist w{};
  for (int i = 0; i < 3; ++i) {
    w.t[i][i] = 1;
    w.t[i][3] = constant;
  }
  return w;
}

TEST(TwistReference, IdentityKeepsEveryLayout) {
  std::mt19937 rng(4);
  const Twist id = identity();
  std::vector<uint8_t> px(11 * 4), out(11 * 4, 0);
  for (auto& v : px) v = uint8_t(rng());
  ASSERT_EQ(zeliColorTwist32f_8u_C3R(px.data(), 33, out.data(), 33, ImageSize{11, 1}, id.t), StatusOk);
  EXPECT_TRUE(std::equal(px.begin(), px.begin() + 33, out.begin()));
  out = px;
  ASSERT_EQ(zeliColorTwist32f_8u_AC4IR(out.data(), 44, ImageSize{11, 1}, id.t), StatusOk);
  EXPECT_EQ(out, px);
  std::vector<uint8_t> planes[3] = {px, px, px};
  for (int k = 0; k < 3; ++k) std::reverse(planes[k].begin(), planes[k].end() - k);
  uint8_t* p[3] = {planes[0].data(), planes[1].data(), planes[2].data()};
  const std::vector<uint8_t> keep[3] = {planes[0], planes[1], planes[2]};
  ASSERT_EQ(zeliColorTwist32f_8u_IP3R(p, 44, ImageSize{44, 1}, id.t), StatusOk);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(planes[k], keep[k]);
}

template <typename T, typename Fn>
std::vector<T> twistPixels(Fn fn, std::vector<T> pixels, const Twist& w) {
  const int width = int(pixels.size()) / 3;
  const int step = int(pixels.size() * sizeof(T));
  EXPECT_EQ(fn(pixels.data(), step, ImageSize{width, 1}, w.t), StatusOk);
  return pixels;
}

TEST(TwistReference, ClampBeforeRounding) {
  // 8u: a constant of 300 saturates, -10 on black stays 0; in block and tail.
  const std::vector<uint8_t> black(7 * 3, 0);
  for (uint8_t v : twistPixels(zeliColorTwist32f_8u_C3IR, black, identity(300))) EXPECT_EQ(v, 255);
  for (uint8_t v : twistPixels(zeliColorTwist32f_8u_C3IR, black, identity(-10))) EXPECT_EQ(v, 0);
  // 8s: 127.4 is clamped to 127; -200 reaches -128 by saturation only.
  const std::vector<int8_t> zero8s(6 * 3, 0);
  for (int8_t v : twistPixels(zeliColorTwist32f_8s_C3IR, zero8s, identity(127.4f))) EXPECT_EQ(v, 127);
  for (int8_t v : twistPixels(zeliColorTwist32f_8s_C3IR, zero8s, identity(-200))) EXPECT_EQ(v, -128);
  for (int8_t v : twistPixels(zeliColorTwist32f_8s_C3IR, zero8s, identity(-3e9f))) EXPECT_EQ(v, -128);
  // 16s: 40000 becomes 32767, -40000 -32768.
  const std::vector<int16_t> zero16s(5 * 3, 0);
  for (int16_t v : twistPixels(zeliColorTwist32f_16s_C3IR, zero16s, identity(40000))) EXPECT_EQ(v, 32767);
  for (int16_t v : twistPixels(zeliColorTwist32f_16s_C3IR, zero16s, identity(-40000))) EXPECT_EQ(v, -32768);
  // Floats are not clamped.
  const std::vector<float> ones(5 * 3, 1.0f);
  for (float v : twistPixels(zeliColorTwist_32f_C3IR, ones, identity(2.5f))) EXPECT_EQ(v, 3.5f);
}

TEST(TwistReference, EightBitSignedAddsLeftToRight) {
  // With a = b = c = 1: the general order gives (0.5 + 2^24) + (1 - 2^24)
  // = 1, the 8s order ((2^24 + 1) - 2^24) + 0.5 = 0.5, rounded to 0.
  Twist w{};
  for (int i = 0; i < 3; ++i) {
    w.t[i][0] = 16777216.0f;
    w.t[i][1] = 1.0f;
    w.t[i][2] = -16777216.0f;
    w.t[i][3] = 0.5f;
  }
  for (int8_t v : twistPixels(zeliColorTwist32f_8s_C3IR, std::vector<int8_t>(5 * 3, 1), w)) EXPECT_EQ(v, 0);
  for (uint8_t v : twistPixels(zeliColorTwist32f_8u_C3IR, std::vector<uint8_t>(5 * 3, 1), w)) EXPECT_EQ(v, 1);
}

// Sets a rounding mode for the length of a test and restores the default.
struct CallerRounding {
  explicit CallerRounding(unsigned mode) : saved(_mm_getcsr()) { _mm_setcsr((saved & ~_MM_ROUND_MASK) | mode); }
  ~CallerRounding() { _mm_setcsr(saved); }
  unsigned saved;
};

TEST(TwistRounding, IntegerMembersRoundToNearestAndRestoreTheCallersMode) {
  // v = 2.5 gives 2 and v = 3.5 gives 4, in the vector block and the tail.
  std::vector<uint8_t> px;
  for (int x = 0; x < 18; ++x) px.push_back(x % 3 == 1 ? 3 : 2);
  for (unsigned mode : {_MM_ROUND_TOWARD_ZERO, _MM_ROUND_UP, _MM_ROUND_DOWN}) {
    CallerRounding caller(mode);
    const auto out = twistPixels(zeliColorTwist32f_8u_C3IR, px, identity(0.5f));
    const unsigned after = _mm_getcsr() & _MM_ROUND_MASK;
    for (int x = 0; x < 6; ++x) {
      EXPECT_EQ(out[3 * x], 2) << mode;
      EXPECT_EQ(out[3 * x + 1], 4) << mode;
    }
    EXPECT_EQ(after, mode);
  }
  // A failed check also leaves the mode alone.
  CallerRounding caller(_MM_ROUND_UP);
  const Twist id = identity();
  EXPECT_EQ(zeliColorTwist32f_16u_C3IR(nullptr, 6, ImageSize{1, 1}, id.t), StatusNullPointerError);
  EXPECT_EQ(_mm_getcsr() & _MM_ROUND_MASK, unsigned(_MM_ROUND_UP));
}

TEST(TwistRounding, FloatMembersComputeInTheCallersMode) {
  std::mt19937 rng(2);
  std::vector<float> px(9 * 3);
  for (auto& v : px) v = std::uniform_real_distribution<float>(0, 1)(rng);
  const Twist w = {{{0.3f, 0.6f, 0.1f, 0.01f}, {0.7f, -0.2f, 0.5f, 0.02f}, {0.1f, 0.1f, 0.9f, 0.03f}}};
  const Matrix m = matrix3(w.t);
  CallerRounding caller(_MM_ROUND_TOWARD_ZERO);
  const auto out = twistPixels(zeliColorTwist_32f_C3IR, px, w);
  int differs = 0;
  for (int x = 0; x < 9; ++x)
    for (int i = 0; i < 3; ++i) {
      const float* p = &px[3 * x];
      const float truncated = output(m, i, p[0], p[1], p[2]);
      EXPECT_EQ(out[3 * x + i], truncated);
      _mm_setcsr(caller.saved);
      differs += output(m, i, p[0], p[1], p[2]) != truncated;
      _mm_setcsr((caller.saved & ~_MM_ROUND_MASK) | _MM_ROUND_TOWARD_ZERO);
    }
  EXPECT_GT(differs, 0) << "the data does not tell the modes apart";
}

TEST(TwistFloatRows, DenseImagesStreamFromTheThresholdWithTheSameResults) {
  EXPECT_FALSE(streamsC3(100, 100));  // 30000 samples
  EXPECT_TRUE(streamsC3(200, 100));   // 60000 samples
  EXPECT_FALSE(streamsC3(11664, 1));  // 34992
  EXPECT_TRUE(streamsC3(11665, 1));   // 34995
  std::mt19937 rng(5);
  const Twist w = {{{0.3f, 0.6f, 0.1f, 0.5f}, {0.7f, -0.2f, 0.5f, -2.0f}, {0.1f, 0.1f, 0.9f, 0.03f}}};
  const Matrix m = matrix3(w.t);
  for (int width : {100, 200}) {
    std::vector<float> src(size_t(width) * 100 * 3), dst(src.size() + 1, -1.0f);
    for (auto& v : src) v = std::uniform_real_distribution<float>(-1, 2)(rng);
    ASSERT_EQ(zeliColorTwist_32f_C3R(src.data(), width * 12, dst.data(), width * 12, ImageSize{width, 100}, w.t),
              StatusOk);
    for (size_t i = 0; i < src.size(); ++i) {
      const float* p = &src[i / 3 * 3];
      ASSERT_EQ(dst[i], output(m, int(i % 3), p[0], p[1], p[2])) << width << " " << i;
    }
    EXPECT_EQ(dst.back(), -1.0f);
  }
}

TEST(TwistFloatRows, FourChannelDiagonalAndMergedRun) {
  std::mt19937 rng(6);
  float diag[4][4] = {};
  for (int i = 0; i < 4; ++i) diag[i][i] = 1.0f;
  std::vector<float> src(9 * 4 * 3), dst(src.size(), 0.0f);
  for (auto& v : src) v = std::uniform_real_distribution<float>(-5, 5)(rng) + 0.125f;
  ASSERT_EQ(zeliColorTwist_32f_C4R(src.data(), 9 * 16, dst.data(), 9 * 16, ImageSize{9, 3}, diag), StatusOk);
  EXPECT_EQ(std::memcmp(src.data(), dst.data(), src.size() * 4), 0);
  // Steps of width * 4 bytes: width * height pixels as one run from the
  // first row, which here covers exactly the 27 pixels of the buffer.
  float swap[4][4] = {{0, 1, 0, 0}, {1, 0, 0, 0}, {0, 0, 0, 1}, {0, 0, 1, 0}};
  std::fill(dst.begin(), dst.end(), 0.0f);
  ASSERT_EQ(zeliColorTwist_32f_C4R(src.data(), 9 * 4, dst.data(), 9 * 4, ImageSize{9, 3}, swap), StatusOk);
  for (int px = 0; px < 27; ++px) {
    EXPECT_EQ(dst[px * 4], src[px * 4 + 1]) << px;
    EXPECT_EQ(dst[px * 4 + 3], src[px * 4 + 2]) << px;
  }
  EXPECT_TRUE(mergesC4(36, 36, 9));
  EXPECT_FALSE(mergesC4(36, 40, 9));
}

}  // namespace
