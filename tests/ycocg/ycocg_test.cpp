// YCoCg: every member against the transform definitions at every width and
// alignment (vector blocks, aligned streaming rows, the pixel tail), the
// lossless round trips, and the values the transforms are known for.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <functional>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "support/test_image.h"
#include "ycocg/ycocg_kernels.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

int16_t low16(int64_t v) { return int16_t(uint16_t(uint64_t(v))); }
int32_t low32(int64_t v) { return int32_t(uint32_t(uint64_t(v))); }
int64_t clamp(int64_t v, int64_t lo, int64_t hi) { return v < lo ? lo : v > hi ? hi : v; }

struct Triple {
  int64_t a, b, c;
};
using Formula = std::function<Triple(int64_t, int64_t, int64_t)>;

// ---- the transforms as defined, in wide integers (>> floors) ----
Triple plain(int64_t b, int64_t g, int64_t r) {
  return {(r + 2 * g + b + 2) >> 2, (r - b + 1) >> 1, (2 * g - r - b + 2) >> 2};
}
Triple lift(int64_t b, int64_t g, int64_t r) {
  const int64_t co = r - b, t = b + (co >> 1), cg = g - t;
  return {t + (cg >> 1), co, cg};
}
Triple lift16(int64_t b, int64_t g, int64_t r) {
  const int64_t co = low16(r - b), t = low16(b + (co >> 1)), cg = low16(g - t);
  return {low16(t + (cg >> 1)), co, cg};
}
Triple saturated(int64_t b, int64_t g, int64_t r) {
  const Triple v = plain(b, g, r);
  return {clamp(v.a, -32768, 32767), clamp(v.b, -32768, 32767), clamp(v.c, -32768, 32767)};
}
Triple wrapped(int64_t b, int64_t g, int64_t r) {
  const Triple v = plain(b, g, r);
  return {low16(v.a), low16(v.b), low16(v.c)};
}
// B, G, R of the inverses.
Triple plainBack(int64_t y, int64_t co, int64_t cg) { return {low16(y - co - cg), low16(y + cg), low16(y + co - cg)}; }
Triple liftBack16(int64_t y, int64_t co, int64_t cg) {
  const int64_t t = low16(y - (cg >> 1)), g = low16(cg + t), b = low16(t - (co >> 1));
  return {b, g, low16(co + b)};
}
Triple liftBack32(int64_t y, int64_t co, int64_t cg) {
  const int64_t t = low32(y - (cg >> 1)), g = low32(cg + t), b = low32(t - (co >> 1));
  return {low16(b), low16(g), low16(co + b)};
}

// Samples that often sit at the corners of the 16-bit range.
template <typename T>
T sample(std::mt19937& rng) {
  static const int32_t corners[] = {-32768, -32767, -2, -1, 0, 1, 32766, 32767, 255};
  const uint32_t pick = rng();
  if (sizeof(T) == 1) return T(pick >> 24);
  if ((pick & 3) == 0) return T(corners[(pick >> 8) % 9]);
  return T(int32_t(rng()) >> (sizeof(T) == 4 ? 0 : 16));
}

// Offset 0 with padding 0 or 32 puts rows on 16-byte boundaries: the
// streaming case of the 32-bit members.
const int kLayouts[][2] = {{0, 0}, {0, 32}, {1, 5}, {3, 16}, {8, 2}, {2, 6}};

// Pixels below width & ~3 by `body`, the rest by `tail`, for widths 1..70.
template <typename Src, typename Plane>
void checkForward(Status (*fn)(const Src*, int, Plane* const*, int, ImageSize), int ch, Formula body, Formula tail) {
  std::mt19937 rng(1234);
  for (int width = 1; width <= 70; ++width)
    for (const auto& l : kLayouts) {
      TestImage<Src> src(ch * width, 2, l[0], l[1]);
      for (int y = 0; y < 2; ++y)
        for (int x = 0; x < ch * width; ++x) src.set(x, y, sample<Src>(rng));
      TestImage<Plane> p[3] = {{width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}};
      Plane* const planes[3] = {p[0].data(), p[1].data(), p[2].data()};
      ASSERT_EQ(fn(src.data(), src.step(), planes, p[0].step(), ImageSize{width, 2}), StatusOk);
      for (int y = 0; y < 2; ++y)
        for (int x = 0; x < width; ++x) {
          const int64_t b = src.get(x * ch, y), g = src.get(x * ch + 1, y), r = src.get(x * ch + 2, y);
          const Triple want = x < (width & ~3) ? body(b, g, r) : tail(b, g, r);
          const int64_t wants[3] = {want.a, want.b, want.c};
          for (int k = 0; k < 3; ++k)
            ASSERT_EQ(p[k].get(x, y), Plane(wants[k])) << "plane " << k << " pixel " << x << " width " << width;
        }
      for (auto& plane : p) ASSERT_TRUE(plane.guardsIntact()) << width;
    }
}

template <typename Plane, typename Dst>
void checkInverse(Status (*fn)(const Plane* const*, int, Dst*, int, ImageSize, Dst), int ch, Formula formula) {
  std::mt19937 rng(99);
  const Dst alpha = Dst(0xC3A5);
  for (int width = 1; width <= 70; ++width)
    for (const auto& l : kLayouts) {
      TestImage<Plane> p[3] = {{width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}};
      for (auto& plane : p)
        for (int y = 0; y < 2; ++y)
          for (int x = 0; x < width; ++x) plane.set(x, y, sample<Plane>(rng));
      TestImage<Dst> dst(ch * width, 2, l[0], l[1]);
      const Plane* const planes[3] = {p[0].data(), p[1].data(), p[2].data()};
      ASSERT_EQ(fn(planes, p[0].step(), dst.data(), dst.step(), ImageSize{width, 2}, alpha), StatusOk);
      for (int y = 0; y < 2; ++y)
        for (int x = 0; x < width; ++x) {
          const Triple v = formula(p[0].get(x, y), p[1].get(x, y), p[2].get(x, y));
          const int64_t wants[4] = {v.a, v.b, v.c, alpha};
          for (int k = 0; k < ch; ++k) {
            const int64_t want = sizeof(Dst) == 1 && k < 3 ? clamp(wants[k], 0, 255) : wants[k];
            ASSERT_EQ(dst.get(x * ch + k, y), Dst(want)) << "element " << k << " pixel " << x << " width " << width;
          }
        }
      ASSERT_TRUE(dst.guardsIntact()) << width;
    }
}

// The three-channel inverses have no alpha argument.
template <typename Plane, typename Dst, Status (*Fn)(const Plane* const*, int, Dst*, int, ImageSize)>
Status noAlpha(const Plane* const* s, int ss, Dst* d, int ds, ImageSize z, Dst) {
  return Fn(s, ss, d, ds, z);
}

TEST(YCoCgForward, EveryMemberAtEveryWidth) {
  checkForward<uint8_t, int16_t>(zeliBGRToYCoCg_8u16s_C3P3R, 3, plain, plain);
  checkForward<uint8_t, int16_t>(zeliBGRToYCoCg_8u16s_C4P3R, 4, plain, plain);
  checkForward<uint8_t, int16_t>(zeliBGRToYCoCg_Rev_8u16s_C3P3R, 3, lift, lift);
  checkForward<uint8_t, int16_t>(zeliBGRToYCoCg_Rev_8u16s_C4P3R, 4, lift, lift);
  checkForward<int16_t, int32_t>(zeliSBGRToYCoCg_16s32s_C3P3R, 3, plain, plain);
  checkForward<int16_t, int32_t>(zeliSBGRToYCoCg_16s32s_C4P3R, 4, plain, plain);
  checkForward<int16_t, int32_t>(zeliSBGRToYCoCg_Rev_16s32s_C3P3R, 3, lift, lift);
  checkForward<int16_t, int32_t>(zeliSBGRToYCoCg_Rev_16s32s_C4P3R, 4, lift, lift);
  // 16-bit planes: the blocks saturate, the tail keeps the low bits.
  checkForward<int16_t, int16_t>(zeliSBGRToYCoCg_16s_C3P3R, 3, saturated, wrapped);
  checkForward<int16_t, int16_t>(zeliSBGRToYCoCg_16s_C4P3R, 4, saturated, wrapped);
  checkForward<int16_t, int16_t>(zeliSBGRToYCoCg_Rev_16s_C3P3R, 3, lift16, lift16);
  checkForward<int16_t, int16_t>(zeliSBGRToYCoCg_Rev_16s_C4P3R, 4, lift16, lift16);
}

TEST(YCoCgInverse, EveryMemberAtEveryWidth) {
  checkInverse<int16_t, uint8_t>(noAlpha<int16_t, uint8_t, zeliYCoCgToBGR_16s8u_P3C3R>, 3, plainBack);
  checkInverse<int16_t, uint8_t>(zeliYCoCgToBGR_16s8u_P3C4R, 4, plainBack);
  checkInverse<int16_t, uint8_t>(noAlpha<int16_t, uint8_t, zeliYCoCgToBGR_Rev_16s8u_P3C3R>, 3, liftBack16);
  checkInverse<int16_t, uint8_t>(zeliYCoCgToBGR_Rev_16s8u_P3C4R, 4, liftBack16);
  checkInverse<int16_t, int16_t>(noAlpha<int16_t, int16_t, zeliYCoCgToSBGR_16s_P3C3R>, 3, plainBack);
  checkInverse<int16_t, int16_t>(zeliYCoCgToSBGR_16s_P3C4R, 4, plainBack);
  checkInverse<int16_t, int16_t>(noAlpha<int16_t, int16_t, zeliYCoCgToSBGR_Rev_16s_P3C3R>, 3, liftBack16);
  checkInverse<int16_t, int16_t>(zeliYCoCgToSBGR_Rev_16s_P3C4R, 4, liftBack16);
  // Full-range 32-bit planes: the lifting shifts 32-bit values, so bit 16
  // of Co and Cg reaches the result.
  checkInverse<int32_t, int16_t>(noAlpha<int32_t, int16_t, zeliYCoCgToSBGR_32s16s_P3C3R>, 3, plainBack);
  checkInverse<int32_t, int16_t>(zeliYCoCgToSBGR_32s16s_P3C4R, 4, plainBack);
  checkInverse<int32_t, int16_t>(noAlpha<int32_t, int16_t, zeliYCoCgToSBGR_Rev_32s16s_P3C3R>, 3, liftBack32);
  checkInverse<int32_t, int16_t>(zeliYCoCgToSBGR_Rev_32s16s_P3C4R, 4, liftBack32);
}

TEST(YCoCgBytePlanes, BothWaysAgainstTheDefinition) {
  std::mt19937 rng(5);
  for (int width = 1; width <= 70; ++width)
    for (const auto& l : kLayouts) {
      TestImage<uint8_t> src(3 * width, 2, l[1], 3),
          p[3] = {{width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}, {width, 2, l[0], l[1]}};
      src.fillRandom(uint32_t(width));
      src.set(0, 0, 255), src.set(1, 0, 0), src.set(2, 0, 0);  // Co of 256 clamps to 255
      uint8_t* const planes[3] = {p[0].data(), p[1].data(), p[2].data()};
      ASSERT_EQ(zeliRGBToYCoCg_8u_C3P3R(src.data(), src.step(), planes, p[0].step(), ImageSize{width, 2}), StatusOk);
      EXPECT_EQ(p[1].get(0, 0), 255);
      for (int y = 0; y < 2; ++y)
        for (int x = 0; x < width; ++x) {
          const int64_t r = src.get(3 * x, y), g = src.get(3 * x + 1, y), b = src.get(3 * x + 2, y);
          ASSERT_EQ(p[0].get(x, y), (r + 2 * g + b + 2) >> 2);
          ASSERT_EQ(p[1].get(x, y), std::min<int64_t>(((r - b + 1) >> 1) + 128, 255));
          ASSERT_EQ(p[2].get(x, y), clamp(((2 * g - b - r + 2) >> 2) + 128, 0, 255));
        }
      for (auto& plane : p) plane.fillRandom(rng());
      TestImage<uint8_t> out(3 * width, 2, l[0] + 3, l[1]);
      const uint8_t* const in[3] = {p[0].data(), p[1].data(), p[2].data()};
      ASSERT_EQ(zeliYCoCgToRGB_8u_P3C3R(in, p[0].step(), out.data(), out.step(), ImageSize{width, 2}), StatusOk);
      for (int y = 0; y < 2; ++y)
        for (int x = 0; x < width; ++x) {
          const int64_t Y = p[0].get(x, y), co = p[1].get(x, y), cg = p[2].get(x, y);
          ASSERT_EQ(out.get(3 * x, y), clamp(Y + co - cg, 0, 255));
          ASSERT_EQ(out.get(3 * x + 1, y), clamp(Y + cg - 128, 0, 255));
          ASSERT_EQ(out.get(3 * x + 2, y), clamp(Y - co - cg + 256, 0, 255));
        }
      ASSERT_TRUE(out.guardsIntact() && p[0].guardsIntact() && p[1].guardsIntact() && p[2].guardsIntact());
    }
}

TEST(YCoCgRoundTrip, EveryByteColourThroughLifting) {
  // All 2^24 colours in chunks of 4096 by 64 pixels, alternating the
  // three- and four-channel forms.
  const int width = 4096, height = 64;
  std::vector<uint8_t> bgr(size_t(width) * height * 4), back(bgr.size());
  std::vector<int16_t> y(size_t(width) * height), co(y.size()), cg(y.size());
  int16_t* const planes[3] = {y.data(), co.data(), cg.data()};
  const int16_t* const in[3] = {y.data(), co.data(), cg.data()};
  const ImageSize size{width, height};
  int failedChunks = 0;
  for (uint32_t first = 0; first < (1u << 24); first += uint32_t(width) * height) {
    const int ch = (first >> 18) & 1 ? 4 : 3;
    for (uint32_t i = 0; i < uint32_t(width) * height; ++i)
      for (int c = 0; c < ch; ++c) bgr[i * ch + c] = c < 3 ? uint8_t((first + i) >> (8 * c)) : 0;
    if (ch == 4) {
      ASSERT_EQ(zeliBGRToYCoCg_Rev_8u16s_C4P3R(bgr.data(), width * 4, planes, width * 2, size), StatusOk);
      ASSERT_EQ(zeliYCoCgToBGR_Rev_16s8u_P3C4R(in, width * 2, back.data(), width * 4, size, 0), StatusOk);
    } else {
      ASSERT_EQ(zeliBGRToYCoCg_Rev_8u16s_C3P3R(bgr.data(), width * 3, planes, width * 2, size), StatusOk);
      ASSERT_EQ(zeliYCoCgToBGR_Rev_16s8u_P3C3R(in, width * 2, back.data(), width * 3, size), StatusOk);
    }
    failedChunks += std::memcmp(bgr.data(), back.data(), size_t(width) * height * ch) != 0;
  }
  EXPECT_EQ(failedChunks, 0);
}

TEST(YCoCgRoundTrip, ShortSamplesAtTheExtremes) {
  // Every triple of extremes, then random samples, through 16-bit planes
  // (wrapping lifts) and 32-bit planes; the row ends in a tail.
  const int16_t extremes[] = {-32768, -32767, -16385, -1, 0, 1, 16384, 32766, 32767};
  std::vector<int16_t> bgr;
  for (int16_t b : extremes)
    for (int16_t g : extremes)
      for (int16_t r : extremes) bgr.insert(bgr.end(), {b, g, r});
  std::mt19937 rng(8);
  while (bgr.size() < 3 * 1027) bgr.push_back(int16_t(rng()));
  const int width = int(bgr.size() / 3);
  const ImageSize size{width, 1};
  std::vector<int16_t> p16[3], back(bgr.size());
  std::vector<int32_t> p32[3];
  for (int k = 0; k < 3; ++k) p16[k].resize(width), p32[k].resize(width);
  int16_t* const out16[3] = {p16[0].data(), p16[1].data(), p16[2].data()};
  ASSERT_EQ(zeliSBGRToYCoCg_Rev_16s_C3P3R(bgr.data(), width * 6, out16, width * 2, size), StatusOk);
  const int16_t* const in16[3] = {p16[0].data(), p16[1].data(), p16[2].data()};
  ASSERT_EQ(zeliYCoCgToSBGR_Rev_16s_P3C3R(in16, width * 2, back.data(), width * 6, size), StatusOk);
  EXPECT_EQ(back, bgr) << "through 16-bit planes";
  int32_t* const out32[3] = {p32[0].data(), p32[1].data(), p32[2].data()};
  ASSERT_EQ(zeliSBGRToYCoCg_Rev_16s32s_C3P3R(bgr.data(), width * 6, out32, width * 4, size), StatusOk);
  const int32_t* const in32[3] = {p32[0].data(), p32[1].data(), p32[2].data()};
  ASSERT_EQ(zeliYCoCgToSBGR_Rev_32s16s_P3C3R(in32, width * 4, back.data(), width * 6, size), StatusOk);
  EXPECT_EQ(back, bgr) << "through 32-bit planes";
  EXPECT_EQ(p32[1][8], 65535) << "B = -32768, R = 32767: the true difference";
  EXPECT_EQ(p16[1][8], -1) << "the same difference wrapped";
}

// The 128-bit blocks alone and the 256-bit and 512-bit blocks give the same
// rows (the members above run the widest the processor has), over widths
// 1..70 and a few past several 32-pixel blocks.
using zel::VectorTier;
std::vector<VectorTier> widerTiers() {
  std::vector<VectorTier> tiers{VectorTier::Avx2};
  if (zel::hasAvx512()) tiers.push_back(VectorTier::Avx512);
  return tiers;
}
std::vector<int> blockWidths() {
  std::vector<int> widths;
  for (int width = 1; width <= 70; ++width) widths.push_back(width);
  for (int width : {129, 150, 203}) widths.push_back(width);
  return widths;
}

template <class Op, typename Src, int Ch>
void forwardWidthsAgree() {
  using Plane = typename Op::Plane;
  std::mt19937 rng(3);
  for (int width : blockWidths()) {
    std::vector<Src> src(size_t(width) * Ch + 1);
    for (auto& v : src) v = sample<Src>(rng);
    std::vector<Plane> narrow(3 * width), wide(3 * width);
    Plane* const n[3] = {&narrow[0], &narrow[width], &narrow[2 * width]};
    Plane* const w[3] = {&wide[0], &wide[width], &wide[2 * width]};
    zel::ycocg::forwardRow<Op, Src, Ch, false>(src.data() + 1, n, width, VectorTier::Sse41);
    for (VectorTier tier : widerTiers()) {
      std::fill(wide.begin(), wide.end(), Plane(0x5a));
      zel::ycocg::forwardRow<Op, Src, Ch, false>(src.data() + 1, w, width, tier);
      ASSERT_EQ(narrow, wide) << "width " << width << " tier " << int(tier);
    }
  }
}
template <class Op, typename Dst, int Ch>
void inverseWidthsAgree() {
  using Plane = typename Op::Plane;
  std::mt19937 rng(4);
  for (int width : blockWidths()) {
    std::vector<Plane> planes(3 * width + 1);
    for (auto& v : planes) v = sample<Plane>(rng);
    const Plane* const in[3] = {&planes[1], &planes[1 + width], &planes[1 + 2 * width]};
    std::vector<Dst> narrow(size_t(width) * Ch), wide(narrow.size());
    zel::ycocg::inverseRow<Op, Dst, Ch, false>(in, narrow.data(), width, Dst(0x5A), VectorTier::Sse41);
    for (VectorTier tier : widerTiers()) {
      std::fill(wide.begin(), wide.end(), Dst(0x33));
      zel::ycocg::inverseRow<Op, Dst, Ch, false>(in, wide.data(), width, Dst(0x5A), tier);
      ASSERT_EQ(narrow, wide) << "width " << width << " tier " << int(tier);
    }
  }
}

TEST(YCoCgBlocks, EveryVectorWidthAgrees) {
  if (!zel::hasAvx2()) GTEST_SKIP() << "no 256-bit blocks on this processor";
  using namespace zel::ycocg;
  forwardWidthsAgree<PlainBytes, uint8_t, 3>();
  forwardWidthsAgree<LiftBytes, uint8_t, 4>();
  forwardWidthsAgree<BytePlanes, uint8_t, 3>();
  forwardWidthsAgree<Wide<false>, int16_t, 3>();
  forwardWidthsAgree<Wide<true>, int16_t, 4>();
  forwardWidthsAgree<PlainShort, int16_t, 3>();
  forwardWidthsAgree<PlainShort, int16_t, 4>();
  forwardWidthsAgree<LiftShort, int16_t, 4>();
  inverseWidthsAgree<Short<false>, uint8_t, 3>();
  inverseWidthsAgree<Short<true>, uint8_t, 4>();
  inverseWidthsAgree<BytePlanesBack, uint8_t, 3>();
  inverseWidthsAgree<Short<false>, int16_t, 3>();
  inverseWidthsAgree<Short<true>, int16_t, 4>();
  inverseWidthsAgree<Long<false>, int16_t, 4>();
  inverseWidthsAgree<Long<true>, int16_t, 3>();
}

TEST(YCoCgValues, GreyHasNoChroma) {
  for (int v : {0, 1, 2, 3, 128, 254, 255}) {
    const std::vector<uint8_t> bgr(27, uint8_t(v));
    int16_t p[3][9];
    int16_t* const planes[3] = {p[0], p[1], p[2]};
    for (auto fn : {zeliBGRToYCoCg_8u16s_C3P3R, zeliBGRToYCoCg_Rev_8u16s_C3P3R}) {
      ASSERT_EQ(fn(bgr.data(), 27, planes, 18, ImageSize{9, 1}), StatusOk);
      for (int x = 0; x < 9; ++x) EXPECT_TRUE(p[0][x] == v && p[1][x] == 0 && p[2][x] == 0) << v << " at " << x;
    }
  }
}

TEST(YCoCgValues, SaturatingBlocksAndWrappingTail) {
  // R = 32767, B = -32768 gives Co = 32768, and G = 32767, R = B = -32768
  // gives Cg = 32768: 32767 below width & ~3, -32768 in the last pixels.
  for (int width : {4, 5, 7, 8, 11, 16}) {
    std::vector<int16_t> bgr;
    for (int x = 0; x < width; ++x)
      bgr.insert(bgr.end(), {-32768, int16_t(x % 2 ? 32767 : 0), int16_t(x % 2 ? -32768 : 32767)});
    std::vector<int16_t> y(width), co(width), cg(width);
    int16_t* const planes[3] = {y.data(), co.data(), cg.data()};
    ASSERT_EQ(zeliSBGRToYCoCg_16s_C3P3R(bgr.data(), width * 6, planes, width * 2, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x)
      EXPECT_EQ(x % 2 ? cg[x] : co[x], x < (width & ~3) ? 32767 : -32768) << "width " << width << " pixel " << x;
  }
}

TEST(YCoCgFrame, MembersWithoutSizeCheckDoNothingForEmptyRegions) {
  std::vector<int16_t> buffer(64, 0x5a5a);
  int16_t* const planes[3] = {&buffer[0], &buffer[8], &buffer[16]};
  const int16_t* const in[3] = {&buffer[0], &buffer[8], &buffer[16]};
  int16_t* const out = &buffer[24];
  for (ImageSize size : {ImageSize{0, 3}, ImageSize{3, 0}, ImageSize{2, -1}}) {
    EXPECT_EQ(zeliSBGRToYCoCg_Rev_16s_C3P3R(out, 18, planes, 16, size), StatusOk);
    EXPECT_EQ(zeliYCoCgToBGR_16s8u_P3C3R(in, 16, reinterpret_cast<uint8_t*>(out), 24, size), StatusOk);
    EXPECT_EQ(zeliYCoCgToSBGR_Rev_32s16s_P3C4R(reinterpret_cast<const int32_t* const*>(in), 16, out, 24, size, 1),
              StatusOk);
    // Their twins that check the size reject the same regions.
    EXPECT_EQ(zeliSBGRToYCoCg_16s_C3P3R(out, 18, planes, 16, size), StatusSizeError);
    EXPECT_EQ(zeliYCoCgToSBGR_16s_P3C4R(in, 16, out, 24, size, 0), StatusSizeError);
  }
  EXPECT_EQ(buffer, std::vector<int16_t>(64, 0x5a5a));
}

}  // namespace
