// YCoCg: every member against the transform definitions at every width and
// alignment (vector blocks, the aligned streaming rows, the pixel tail), the
// lossless round trips, and the values the transforms are known for.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <functional>
#include <random>
#include <vector>

#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

int64_t asr(int64_t v, int n) { return v >> n; }  // arithmetic on the platforms we build for
int16_t low16(int64_t v) { return int16_t(uint16_t(uint64_t(v))); }
int32_t low32(int64_t v) { return int32_t(uint32_t(uint64_t(v))); }
int64_t clamp(int64_t v, int64_t lo, int64_t hi) { return v < lo ? lo : v > hi ? hi : v; }

struct Triple {
  int64_t a, b, c;
};

// ---- the transforms as defined, in wide integers ----

Triple plainForward(int64_t b, int64_t g, int64_t r) {
  return {asr(r + 2 * g + b + 2, 2), asr(r - b + 1, 1), asr(2 * g - r - b + 2, 2)};
}
Triple liftForward(int64_t b, int64_t g, int64_t r) {
  const int64_t co = r - b, t = b + asr(co, 1), cg = g - t;
  return {t + asr(cg, 1), co, cg};
}
Triple liftForwardWrapped(int64_t b, int64_t g, int64_t r) {
  const int64_t co = low16(r - b), t = low16(b + asr(co, 1)), cg = low16(g - t);
  return {low16(t + asr(cg, 1)), co, cg};
}
// B, G, R of the plain inverse, modulo 2^16.
Triple plainInverse(int64_t y, int64_t co, int64_t cg) { return {low16(y - co - cg), low16(y + cg), low16(y + co - cg)}; }
Triple liftInverseWrapped(int64_t y, int64_t co, int64_t cg) {
  const int64_t t = low16(y - asr(cg, 1)), g = low16(cg + t), b = low16(t - asr(co, 1));
  return {b, g, low16(co + b)};
}
Triple liftInverseWide(int64_t y, int64_t co, int64_t cg) {
  const int64_t t = low32(y - asr(cg, 1)), g = low32(cg + t), b = low32(t - asr(co, 1));
  return {low16(b), low16(g), low16(low32(co + b))};
}

// Samples that reach the corners of the 16-bit range often.
template <typename T>
T sample(std::mt19937& rng) {
  static const int64_t corners[] = {-32768, -32767, -2, -1, 0, 1, 2, 32766, 32767, 255, 254};
  const uint32_t pick = rng();
  if (std::is_same_v<T, uint8_t>) return T(pick >> 24);
  if (std::is_same_v<T, int16_t> && (pick & 3) == 0) return T(corners[(pick >> 8) % 11]);
  if (std::is_same_v<T, int32_t> && (pick & 7) == 0) return T(corners[(pick >> 8) % 11]);
  return T(int64_t(int32_t(rng())) >> (std::is_same_v<T, int32_t> ? 0 : 16));
}

// The layouts tried for every width: byte offset of the first sample and
// padding after each row. Offset 0 with padding 0 or 16 gives rows on
// 16-byte boundaries, the streaming case of the 32-bit members.
struct Layout {
  int offset, pad;
};
const Layout kLayouts[] = {{0, 0}, {0, 32}, {1, 5}, {3, 16}, {8, 2}, {2, 6}};

// ---- forward members ----

template <typename Src, typename Plane>
using ForwardFn = Status (*)(const Src*, int, Plane* const*, int, ImageSize);
using Formula = std::function<Triple(int64_t, int64_t, int64_t)>;

// Checks every pixel of the planes: pixels below width & ~3 by `body`, the
// rest by `tail`; stores keep the low bits of the plane type.
template <typename Src, typename Plane>
void checkForward(const char* name, ForwardFn<Src, Plane> fn, int channels, Formula body, Formula tail) {
  SCOPED_TRACE(name);
  std::mt19937 rng(1234);
  for (int width = 1; width <= 70; ++width)
    for (const Layout& l : kLayouts) {
      const int height = 2;
      TestImage<Src> src(channels * width, height, l.offset, l.pad);
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < channels * width; ++x) src.set(x, y, sample<Src>(rng));
      TestImage<Plane> py(width, height, l.offset, l.pad), pco(width, height, l.offset, l.pad),
          pcg(width, height, l.offset, l.pad);
      Plane* const planes[3] = {py.data(), pco.data(), pcg.data()};
      ASSERT_EQ(fn(src.data(), src.step(), planes, py.step(), ImageSize{width, height}), StatusOk);
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
          const int64_t b = src.get(x * channels, y), g = src.get(x * channels + 1, y), r = src.get(x * channels + 2, y);
          const Triple want = x < (width & ~3) ? body(b, g, r) : tail(b, g, r);
          ASSERT_EQ(py.get(x, y), Plane(want.a)) << "Y at " << x << " of width " << width << " offset " << l.offset;
          ASSERT_EQ(pco.get(x, y), Plane(want.b)) << "Co at " << x << " of width " << width << " offset " << l.offset;
          ASSERT_EQ(pcg.get(x, y), Plane(want.c)) << "Cg at " << x << " of width " << width << " offset " << l.offset;
        }
      ASSERT_TRUE(py.guardsIntact() && pco.guardsIntact() && pcg.guardsIntact()) << width;
    }
}

Triple saturate16(Triple v) { return {clamp(v.a, -32768, 32767), clamp(v.b, -32768, 32767), clamp(v.c, -32768, 32767)}; }
Triple wrap16(Triple v) { return {low16(v.a), low16(v.b), low16(v.c)}; }

TEST(YCoCgForward, ByteSamplesToShortPlanes) {
  checkForward<uint8_t, int16_t>("plain C3", zeliBGRToYCoCg_8u16s_C3P3R, 3, plainForward, plainForward);
  checkForward<uint8_t, int16_t>("plain C4", zeliBGRToYCoCg_8u16s_C4P3R, 4, plainForward, plainForward);
  checkForward<uint8_t, int16_t>("Rev C3", zeliBGRToYCoCg_Rev_8u16s_C3P3R, 3, liftForward, liftForward);
  checkForward<uint8_t, int16_t>("Rev C4", zeliBGRToYCoCg_Rev_8u16s_C4P3R, 4, liftForward, liftForward);
}

TEST(YCoCgForward, ShortSamplesToWidePlanes) {
  checkForward<int16_t, int32_t>("plain C3", zeliSBGRToYCoCg_16s32s_C3P3R, 3, plainForward, plainForward);
  checkForward<int16_t, int32_t>("plain C4", zeliSBGRToYCoCg_16s32s_C4P3R, 4, plainForward, plainForward);
  checkForward<int16_t, int32_t>("Rev C3", zeliSBGRToYCoCg_Rev_16s32s_C3P3R, 3, liftForward, liftForward);
  checkForward<int16_t, int32_t>("Rev C4", zeliSBGRToYCoCg_Rev_16s32s_C4P3R, 4, liftForward, liftForward);
}

TEST(YCoCgForward, ShortSamplesToShortPlanes) {
  auto saturated = [](int64_t b, int64_t g, int64_t r) { return saturate16(plainForward(b, g, r)); };
  auto wrapped = [](int64_t b, int64_t g, int64_t r) { return wrap16(plainForward(b, g, r)); };
  checkForward<int16_t, int16_t>("plain C3", zeliSBGRToYCoCg_16s_C3P3R, 3, saturated, wrapped);
  checkForward<int16_t, int16_t>("plain C4", zeliSBGRToYCoCg_16s_C4P3R, 4, saturated, wrapped);
  checkForward<int16_t, int16_t>("Rev C3", zeliSBGRToYCoCg_Rev_16s_C3P3R, 3, liftForwardWrapped, liftForwardWrapped);
  checkForward<int16_t, int16_t>("Rev C4", zeliSBGRToYCoCg_Rev_16s_C4P3R, 4, liftForwardWrapped, liftForwardWrapped);
}

// ---- inverse members ----

template <typename Plane, typename Dst>
using InverseFn = std::function<Status(const Plane* const*, int, Dst*, int, ImageSize)>;

template <typename Plane, typename Dst>
void checkInverse(const char* name, InverseFn<Plane, Dst> fn, int channels, Formula formula, Dst alpha = 0) {
  SCOPED_TRACE(name);
  std::mt19937 rng(99);
  for (int width = 1; width <= 70; ++width)
    for (const Layout& l : kLayouts) {
      const int height = 2;
      TestImage<Plane> py(width, height, l.offset, l.pad), pco(width, height, l.offset, l.pad),
          pcg(width, height, l.offset, l.pad);
      for (TestImage<Plane>* p : {&py, &pco, &pcg})
        for (int y = 0; y < height; ++y)
          for (int x = 0; x < width; ++x) p->set(x, y, sample<Plane>(rng));
      TestImage<Dst> dst(channels * width, height, l.offset, l.pad);
      const Plane* const planes[3] = {py.data(), pco.data(), pcg.data()};
      ASSERT_EQ(fn(planes, py.step(), dst.data(), dst.step(), ImageSize{width, height}), StatusOk);
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
          Triple want = formula(py.get(x, y), pco.get(x, y), pcg.get(x, y));
          if (std::is_same_v<Dst, uint8_t>) want = {clamp(want.a, 0, 255), clamp(want.b, 0, 255), clamp(want.c, 0, 255)};
          ASSERT_EQ(dst.get(x * channels, y), Dst(want.a)) << "B at " << x << " of width " << width << " offset " << l.offset;
          ASSERT_EQ(dst.get(x * channels + 1, y), Dst(want.b)) << "G at " << x << " of width " << width;
          ASSERT_EQ(dst.get(x * channels + 2, y), Dst(want.c)) << "R at " << x << " of width " << width;
          if (channels == 4) ASSERT_EQ(dst.get(x * 4 + 3, y), alpha) << "alpha at " << x << " of width " << width;
        }
      ASSERT_TRUE(dst.guardsIntact()) << width;
    }
}

template <typename Plane, typename Dst>
InverseFn<Plane, Dst> withAlpha(Status (*fn)(const Plane* const*, int, Dst*, int, ImageSize, Dst), Dst alpha) {
  return [fn, alpha](const Plane* const* s, int ss, Dst* d, int ds, ImageSize z) { return fn(s, ss, d, ds, z, alpha); };
}

TEST(YCoCgInverse, ShortPlanesToBytes) {
  checkInverse<int16_t, uint8_t>("plain C3", zeliYCoCgToBGR_16s8u_P3C3R, 3, plainInverse);
  checkInverse<int16_t, uint8_t>("plain C4", withAlpha(zeliYCoCgToBGR_16s8u_P3C4R, uint8_t(201)), 4, plainInverse,
                                 uint8_t(201));
  checkInverse<int16_t, uint8_t>("Rev C3", zeliYCoCgToBGR_Rev_16s8u_P3C3R, 3, liftInverseWrapped);
  checkInverse<int16_t, uint8_t>("Rev C4", withAlpha(zeliYCoCgToBGR_Rev_16s8u_P3C4R, uint8_t(255)), 4,
                                 liftInverseWrapped, uint8_t(255));
}

TEST(YCoCgInverse, ShortPlanesToShortSamples) {
  checkInverse<int16_t, int16_t>("plain C3", zeliYCoCgToSBGR_16s_P3C3R, 3, plainInverse);
  checkInverse<int16_t, int16_t>("plain C4", withAlpha(zeliYCoCgToSBGR_16s_P3C4R, int16_t(-32768)), 4, plainInverse,
                                 int16_t(-32768));
  checkInverse<int16_t, int16_t>("Rev C3", zeliYCoCgToSBGR_Rev_16s_P3C3R, 3, liftInverseWrapped);
  checkInverse<int16_t, int16_t>("Rev C4", withAlpha(zeliYCoCgToSBGR_Rev_16s_P3C4R, int16_t(-1)), 4,
                                 liftInverseWrapped, int16_t(-1));
}

TEST(YCoCgInverse, WidePlanesToShortSamples) {
  // Full-range 32-bit planes: the lifting steps shift 32-bit values, so
  // bit 16 of Cg and Co reaches the result.
  checkInverse<int32_t, int16_t>("plain C3", zeliYCoCgToSBGR_32s16s_P3C3R, 3, plainInverse);
  checkInverse<int32_t, int16_t>("plain C4", withAlpha(zeliYCoCgToSBGR_32s16s_P3C4R, int16_t(12345)), 4,
                                 plainInverse, int16_t(12345));
  checkInverse<int32_t, int16_t>("Rev C3", zeliYCoCgToSBGR_Rev_32s16s_P3C3R, 3, liftInverseWide);
  checkInverse<int32_t, int16_t>("Rev C4", withAlpha(zeliYCoCgToSBGR_Rev_32s16s_P3C4R, int16_t(7)), 4,
                                 liftInverseWide, int16_t(7));
}

// ---- the byte-plane pair ----

TEST(YCoCgBytePlanes, EveryWidthAgainstTheDefinition) {
  std::mt19937 rng(5);
  for (int width = 1; width <= 40; ++width) {
    const int height = 2;
    TestImage<uint8_t> src(3 * width, height, 1, 3);
    src.fillRandom(uint32_t(width));
    TestImage<uint8_t> py(width, height, 2, 1), pco(width, height, 2, 1), pcg(width, height, 2, 1);
    uint8_t* const planes[3] = {py.data(), pco.data(), pcg.data()};
    ASSERT_EQ(zeliRGBToYCoCg_8u_C3P3R(src.data(), src.step(), planes, py.step(), ImageSize{width, height}), StatusOk);
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) {
        const int64_t r = src.get(3 * x, y), g = src.get(3 * x + 1, y), b = src.get(3 * x + 2, y);
        ASSERT_EQ(py.get(x, y), asr(r + 2 * g + b + 2, 2));
        ASSERT_EQ(pco.get(x, y), std::min<int64_t>(asr(r - b + 1, 1) + 128, 255));
        ASSERT_EQ(pcg.get(x, y), clamp(asr(2 * g - b - r + 2, 2) + 128, 0, 255));
      }
    // Back, from arbitrary stored planes (offsets included).
    for (TestImage<uint8_t>* p : {&py, &pco, &pcg})
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) p->set(x, y, uint8_t(rng()));
    TestImage<uint8_t> out(3 * width, height, 3, 2);
    const uint8_t* const in[3] = {py.data(), pco.data(), pcg.data()};
    ASSERT_EQ(zeliYCoCgToRGB_8u_P3C3R(in, py.step(), out.data(), out.step(), ImageSize{width, height}), StatusOk);
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) {
        const int64_t Y = py.get(x, y), co = pco.get(x, y), cg = pcg.get(x, y);
        ASSERT_EQ(out.get(3 * x, y), clamp(Y + co - cg, 0, 255)) << "R";
        ASSERT_EQ(out.get(3 * x + 1, y), clamp(Y + cg - 128, 0, 255)) << "G";
        ASSERT_EQ(out.get(3 * x + 2, y), clamp(Y - co - cg + 256, 0, 255)) << "B";
      }
    ASSERT_TRUE(py.guardsIntact() && pco.guardsIntact() && pcg.guardsIntact() && out.guardsIntact());
  }
}

TEST(YCoCgBytePlanes, ChromaClampsAtTheTop) {
  // R = 255, B = 0: Co is 256 before the clamp. Grey maps to the offset.
  const uint8_t src[6] = {255, 0, 0, 77, 77, 77};
  uint8_t y[2], co[2], cg[2];
  uint8_t* const planes[3] = {y, co, cg};
  ASSERT_EQ(zeliRGBToYCoCg_8u_C3P3R(src, 6, planes, 2, ImageSize{2, 1}), StatusOk);
  EXPECT_EQ(co[0], 255);
  EXPECT_EQ(y[0], 64);
  EXPECT_EQ(cg[0], 64);  // (-255 + 2) >> 2 floors to -64
  EXPECT_EQ(y[1], 77);
  EXPECT_EQ(co[1], 128);
  EXPECT_EQ(cg[1], 128);
}

// ---- round trips ----

TEST(YCoCgRoundTrip, EveryByteColourThroughLifting) {
  // All 2^24 colours, in images of 4096 pixels by 64 rows: forward, back,
  // and compare, for the three- and four-channel forms.
  const int width = 4096, height = 64;
  std::vector<uint8_t> bgr(size_t(width) * height * 4), back(bgr.size());
  std::vector<int16_t> y(size_t(width) * height), co(y.size()), cg(y.size());
  int16_t* const planes[3] = {y.data(), co.data(), cg.data()};
  const int16_t* const cplanes[3] = {y.data(), co.data(), cg.data()};
  const ImageSize size{width, height};
  int64_t mismatches = 0;
  for (uint32_t first = 0; first < (1u << 24); first += uint32_t(width) * height) {
    const bool four = (first >> 18) & 1;  // alternate the layouts by chunk
    const int ch = four ? 4 : 3;
    for (uint32_t i = 0; i < uint32_t(width) * height; ++i) {
      const uint32_t c = first + i;
      bgr[i * ch] = uint8_t(c);
      bgr[i * ch + 1] = uint8_t(c >> 8);
      bgr[i * ch + 2] = uint8_t(c >> 16);
      if (four) bgr[i * 4 + 3] = 0;
    }
    if (four) {
      ASSERT_EQ(zeliBGRToYCoCg_Rev_8u16s_C4P3R(bgr.data(), width * 4, planes, width * 2, size), StatusOk);
      ASSERT_EQ(zeliYCoCgToBGR_Rev_16s8u_P3C4R(cplanes, width * 2, back.data(), width * 4, size, 0), StatusOk);
    } else {
      ASSERT_EQ(zeliBGRToYCoCg_Rev_8u16s_C3P3R(bgr.data(), width * 3, planes, width * 2, size), StatusOk);
      ASSERT_EQ(zeliYCoCgToBGR_Rev_16s8u_P3C3R(cplanes, width * 2, back.data(), width * 3, size), StatusOk);
    }
    const size_t bytes = size_t(width) * height * ch;
    if (std::memcmp(bgr.data(), back.data(), bytes) != 0) ++mismatches;
  }
  EXPECT_EQ(mismatches, 0) << "chunks that did not come back unchanged";
}

TEST(YCoCgRoundTrip, ShortSamplesAtTheExtremes) {
  // Every triple of extreme values, then random ones, through both plane
  // widths; the last pixels of each row take the tail.
  const int16_t extremes[] = {-32768, -32767, -16385, -1, 0, 1, 16384, 32766, 32767};
  std::vector<int16_t> bgr;
  for (int16_t b : extremes)
    for (int16_t g : extremes)
      for (int16_t r : extremes) bgr.insert(bgr.end(), {b, g, r});
  std::mt19937 rng(8);
  while (bgr.size() < 3 * 1027) bgr.push_back(int16_t(rng()));
  const int width = int(bgr.size() / 3);
  std::vector<int16_t> y16(width), co16(width), cg16(width), back(bgr.size());
  std::vector<int32_t> y32(width), co32(width), cg32(width);
  const ImageSize size{width, 1};
  {
    int16_t* const planes[3] = {y16.data(), co16.data(), cg16.data()};
    const int16_t* const in[3] = {y16.data(), co16.data(), cg16.data()};
    ASSERT_EQ(zeliSBGRToYCoCg_Rev_16s_C3P3R(bgr.data(), width * 6, planes, width * 2, size), StatusOk);
    ASSERT_EQ(zeliYCoCgToSBGR_Rev_16s_P3C3R(in, width * 2, back.data(), width * 6, size), StatusOk);
    EXPECT_EQ(back, bgr) << "through 16-bit planes";
  }
  {
    int32_t* const planes[3] = {y32.data(), co32.data(), cg32.data()};
    const int32_t* const in[3] = {y32.data(), co32.data(), cg32.data()};
    std::fill(back.begin(), back.end(), 0);
    ASSERT_EQ(zeliSBGRToYCoCg_Rev_16s32s_C3P3R(bgr.data(), width * 6, planes, width * 4, size), StatusOk);
    ASSERT_EQ(zeliYCoCgToSBGR_Rev_32s16s_P3C3R(in, width * 4, back.data(), width * 6, size), StatusOk);
    EXPECT_EQ(back, bgr) << "through 32-bit planes";
    // The wide planes hold the true differences: R = 32767, B = -32768.
    EXPECT_EQ(co32[8], 65535);  // B = -32768, G = -32768, R = 32767
  }
}

// ---- values the transforms are known for ----

TEST(YCoCgValues, GreyHasNoChroma) {
  for (int v : {0, 1, 2, 3, 128, 254, 255}) {
    uint8_t bgr[3 * 9];
    std::fill(bgr, bgr + 27, uint8_t(v));
    int16_t y[9], co[9], cg[9];
    int16_t* const planes[3] = {y, co, cg};
    for (auto fn : {zeliBGRToYCoCg_8u16s_C3P3R, zeliBGRToYCoCg_Rev_8u16s_C3P3R}) {
      ASSERT_EQ(fn(bgr, 27, planes, 18, ImageSize{9, 1}), StatusOk);
      for (int x = 0; x < 9; ++x) {
        EXPECT_EQ(y[x], v) << x;
        EXPECT_EQ(co[x], 0);
        EXPECT_EQ(cg[x], 0);
      }
    }
  }
}

TEST(YCoCgValues, SaturatingBlocksAndWrappingTail) {
  // R = 32767, B = -32768 gives Co = 32768: 32767 in the blocks (pixels
  // below width & ~3), -32768 in the last width & 3. G = 32767 with
  // R = B = -32768 does the same to Cg.
  for (int width : {4, 7, 8, 11, 16}) {
    std::vector<int16_t> bgr;
    for (int x = 0; x < width; ++x) {
      if (x % 2) bgr.insert(bgr.end(), {-32768, 32767, -32768});
      else bgr.insert(bgr.end(), {-32768, 0, 32767});
    }
    std::vector<int16_t> y(width), co(width), cg(width);
    int16_t* const planes[3] = {y.data(), co.data(), cg.data()};
    ASSERT_EQ(zeliSBGRToYCoCg_16s_C3P3R(bgr.data(), width * 6, planes, width * 2, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x) {
      const int16_t want = x < (width & ~3) ? 32767 : -32768;
      if (x % 2) EXPECT_EQ(cg[x], want) << "Cg, width " << width << " pixel " << x;
      else EXPECT_EQ(co[x], want) << "Co, width " << width << " pixel " << x;
    }
  }
}

TEST(YCoCgValues, WidthDecidesTheZoneOfAPixel) {
  // The same pixel at position 4 is a tail pixel at width 5 and a block
  // pixel at width 8.
  std::vector<int16_t> bgr(8 * 4, 0);
  bgr[4 * 4 + 0] = -32768;
  bgr[4 * 4 + 2] = 32767;
  std::vector<int16_t> y(8), co(8), cg(8);
  int16_t* const planes[3] = {y.data(), co.data(), cg.data()};
  ASSERT_EQ(zeliSBGRToYCoCg_16s_C4P3R(bgr.data(), 64, planes, 16, ImageSize{5, 1}), StatusOk);
  EXPECT_EQ(co[4], -32768);
  ASSERT_EQ(zeliSBGRToYCoCg_16s_C4P3R(bgr.data(), 64, planes, 16, ImageSize{8, 1}), StatusOk);
  EXPECT_EQ(co[4], 32767);
}

// ---- frame ----

TEST(YCoCgFrame, MembersWithoutSizeCheckDoNothingForEmptyRegions) {
  int16_t planeBytes[3][8];
  for (auto& p : planeBytes) std::fill(p, p + 8, int16_t(0x5a5a));
  int16_t* const planes[3] = {planeBytes[0], planeBytes[1], planeBytes[2]};
  const int16_t* const cplanes[3] = {planeBytes[0], planeBytes[1], planeBytes[2]};
  int16_t src[24] = {1, 2, 3};
  uint8_t dst8[24];
  std::fill(dst8, dst8 + 24, 0x77);
  for (ImageSize size : {ImageSize{0, 3}, ImageSize{3, 0}, ImageSize{0, 0}, ImageSize{2, -1}}) {
    EXPECT_EQ(zeliSBGRToYCoCg_Rev_16s_C3P3R(src, 18, planes, 16, size), StatusOk);
    EXPECT_EQ(zeliYCoCgToBGR_16s8u_P3C3R(cplanes, 16, dst8, 24, size), StatusOk);
    EXPECT_EQ(zeliYCoCgToBGR_Rev_16s8u_P3C4R(cplanes, 16, dst8, 24, size, 1), StatusOk);
    EXPECT_EQ(zeliYCoCgToSBGR_16s_P3C3R(cplanes, 16, src, 18, size), StatusOk);
    // Members that check the size reject the same regions.
    EXPECT_EQ(zeliSBGRToYCoCg_16s_C3P3R(src, 18, planes, 16, size), StatusSizeError);
    EXPECT_EQ(zeliYCoCgToSBGR_16s_P3C4R(cplanes, 16, src, 24, size, 0), StatusSizeError);
  }
  for (auto& p : planeBytes)
    for (int16_t v : p) EXPECT_EQ(v, int16_t(0x5a5a));
  for (uint8_t v : dst8) EXPECT_EQ(v, 0x77);
  EXPECT_EQ(src[0], 1);
  EXPECT_EQ(src[3], 0);
}

TEST(YCoCgFrame, FourthSourceElementIsIgnored) {
  std::mt19937 rng(3);
  const int width = 21;
  std::vector<uint8_t> a(4 * width), b;
  for (auto& v : a) v = uint8_t(rng());
  b = a;
  for (int x = 0; x < width; ++x) b[4 * x + 3] = uint8_t(~a[4 * x + 3]);
  std::vector<int16_t> p[2][3];
  for (int k = 0; k < 2; ++k) {
    for (auto& v : p[k]) v.assign(width, 0);
    int16_t* const planes[3] = {p[k][0].data(), p[k][1].data(), p[k][2].data()};
    ASSERT_EQ(zeliBGRToYCoCg_Rev_8u16s_C4P3R(k ? b.data() : a.data(), 4 * width, planes, 2 * width,
                                            ImageSize{width, 1}),
              StatusOk);
  }
  for (int c = 0; c < 3; ++c) EXPECT_EQ(p[0][c], p[1][c]);
}

}  // namespace
