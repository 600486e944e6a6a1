// Photo YCC: worked values of every form, the vector forms against the scalar
// ones, and the sixteen members at every width with their zones, fourth
// samples and element steps.
#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <cstring>
#include <functional>
#include <limits>

#include "core/zelcore.h"
#include "frame/image_layout.h"
#include "luma_chroma/photo_ycc_forms.h"
#include "luma_chroma/photo_ycc_kernels.h"
#include "luma_chroma/yuv_lane_check.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::lc;
using zel::VectorTier;
using namespace zel::lc::test;
using zel::lc::test::str;
using zel::test::TestImage;

std::string str(Word3 w) {
  return std::to_string(w.c0) + "," + std::to_string(w.c1) + "," + std::to_string(w.c2);
}
Word3 signedWords(int a, int b, int c) { return {uint16_t(a), uint16_t(b), uint16_t(c)}; }
uint32_t bits(float f) {
  uint32_t u;
  std::memcpy(&u, &f, 4);
  return u;
}

// ---------------------------------------------------------------- values

TEST(PhotoYccForms, EightBitValuesOfBodyAndTail) {
  struct Row {
    int in[3];
    const char *lanes, *wide;
  };
  // Black and white agree; white's body luma is L = 16316,
  // MulHighS16(16316, 2921) = 727, 727 >> 2 = 181. The others part in the
  // last bit.
  const Row forward[] = {{{0, 0, 0}, "0,156,137", "0,156,137"},
                         {{255, 255, 255}, "181,156,137", "181,156,137"},
                         {{242, 198, 218}, "152,158,152", "152,157,152"},
                         {{45, 176, 34}, "85,118,96", "86,118,96"},
                         {{113, 16, 233}, "49,227,160", "49,227,159"}};
  for (const Row& r : forward) {
    EXPECT_EQ(str(rgbToYccLanes(r.in[0], r.in[1], r.in[2])), r.lanes);
    EXPECT_EQ(str(rgbToYccWide(r.in[0], r.in[1], r.in[2])), r.wide);
  }
  // The inverse body carries 5563, the tail 5564.
  const Row inverse[] = {{{181, 156, 137}, "245,245,245", "245,245,245"},
                         {{0, 156, 137}, "0,0,0", "0,0,0"},
                         {{21, 93, 101}, "0,88,0", "0,89,0"},
                         {{49, 227, 231}, "237,0,223", "237,0,224"},
                         {{89, 237, 122}, "93,99,255", "93,100,255"}};
  for (const Row& r : inverse) {
    EXPECT_EQ(str(yccToRgbLanes(r.in[0], r.in[1], r.in[2])), r.lanes);
    EXPECT_EQ(str(yccToRgbWide(r.in[0], r.in[1], r.in[2])), r.wide);
  }
}

TEST(PhotoYccForms, SixteenBitValuesWorkedInSinglePrecision) {
  struct Row {
    int in[3];
    const char *body, *tail;
  };
  // White: 65535 x 0.7132668 rounds to 46744.
  const Row forward16u[] = {{{65535, 65535, 65535}, "46744,40092,35209", "46744,40092,35209"},
                            {{65535, 0, 0}, "13976,31532,59646", "13976,31532,59645"},
                            {{0, 65535, 0}, "27439,23286,14746", "27439,23286,14747"},
                            {{1000, 30000, 60000}, "17653,55492,22576", "17653,55492,22576"}};
  for (const Row& r : forward16u) {
    const Float3 f = rgbToYccBody16(float(r.in[0]), float(r.in[1]), float(r.in[2]));
    EXPECT_EQ(str(Word3{roundToWord(f.c0), roundToWord(f.c1), roundToWord(f.c2)}), r.body);
    EXPECT_EQ(str(rgbToYccTail16u(r.in[0], r.in[1], r.in[2])), r.tail);
  }
  const Row inverse16u[] = {{{46744, 40092, 35209}, "63497,63497,63497", "63497,63497,63497"},
                            {{0, 0, 0}, "0,49894,0", "0,49894,0"},
                            {{20000, 30000, 60000}, "65535,8525,4785", "65535,8525,4785"}};
  for (const Row& r : inverse16u) {
    const Float3 f = yccToRgbBody16(float(r.in[0]), float(r.in[1]), float(r.in[2]));
    EXPECT_EQ(str(Word3{roundToWord(f.c0), roundToWord(f.c1), roundToWord(f.c2)}), r.body);
    EXPECT_EQ(str(yccToRgbTail16u(r.in[0], r.in[1], r.in[2])), r.tail);
  }
  // Signed samples: the tails as stored bit patterns.
  EXPECT_EQ(str(rgbToYccTail16s(-20000, 5000, 30000)), str(signedWords(-9128, 20266, -8397)));
  EXPECT_EQ(str(rgbToYccTail16s(-32768, -32768, -32768)), str(signedWords(-32768, 7324, 2441)));
  EXPECT_EQ(str(yccToRgbTail16s(-2768, 17232, -12768)), str(signedWords(-19720, 17821, 29958)));
  EXPECT_EQ(str(yccToRgbTail16s(0, 0, 0)), str(signedWords(7297, 17158, -4500)));
  // The signed body is the unsigned body on samples plus 32768: one above
  // the tail here.
  const Float3 f = yccToRgbBody16(-2768 + 32768.0f, 17232 + 32768.0f, -12768 + 32768.0f);
  EXPECT_EQ(str(Word3{roundToSignedWord(f.c0), roundToSignedWord(f.c1), roundToSignedWord(f.c2)}),
            str(signedWords(-19719, 17822, 29959)));
}

TEST(PhotoYccForms, FloatValuesBitForBit) {
  struct Row {
    Float3 (*form)(float, float, float);
    float in[3];
    uint32_t out[3];
  };
  // Luma 1 with neutral chroma clamps all three to 1.
  const Row rows[] = {{rgbToYcc32f, {1.0f, 1.0f, 1.0f}, {0x3f3698a7, 0x3f1c9c9d, 0x3f09898a}},
                      {rgbToYcc32f, {0.25f, 0.5f, 0.75f}, {0x3ea5b4c6, 0x3f3dbe52, 0x3edb95aa}},
                      {yccToRgb32f, {1.0f, 0.6117647f, 0.5372549f}, {0x3f800000, 0x3f800000, 0x3f800000}},
                      {yccToRgb32f, {0.5f, 0.2f, 0.9f}, {0x3f800000, 0x3f052249, 0x00000000}},
                      {yccToRgb32f, {0.3f, 0.7f, 0.4f}, {0x3e214a5a, 0x3efe5ddc, 0x3f1a6c6e}}};
  for (const Row& r : rows) {
    const Float3 v = r.form(r.in[0], r.in[1], r.in[2]);
    EXPECT_EQ(bits(v.c0), r.out[0]);
    EXPECT_EQ(bits(v.c1), r.out[1]);
    EXPECT_EQ(bits(v.c2), r.out[2]);
  }
}

// ---------------------------------------------------------------- lanes

ZEL_LANE_FORM(ForwardLanes, rgbToYccLanes)
ZEL_LANE_FORM(InverseLanes, yccToRgbLanes)

TEST(PhotoYccForms, EightBitVectorFormsGiveTheScalarBits) {
  std::vector<Triple> grid;
  for (int x = 0; x < 256; x += 2)
    for (int y = 0; y < 256; y += 3)
      for (int z : {0, 1, 77, 128, 155, 156, 157, 200, 254, 255}) grid.push_back({x, y, z});
  for (bool avx2 : vectorWidths()) {
    expectLanesMatch("rgbToYccLanes", ForwardLanes{}, avx2, grid);
    expectLanesMatch("yccToRgbLanes", InverseLanes{}, avx2, grid);
  }
}

TEST(PhotoYccForms, ClampKeepsNaNAndNegativeZero) {
  const float nan = std::numeric_limits<float>::quiet_NaN();
  alignas(16) float in[4] = {nan, -0.0f, 1.5f, -3.0f}, out[4];
  _mm_store_ps(out, clampUnit(_mm_load_ps(in)));
  for (int k = 0; k < 4; ++k) EXPECT_EQ(bits(out[k]), bits(clampUnit(in[k]))) << k;
  EXPECT_TRUE(std::isnan(out[0]));
  EXPECT_EQ(bits(out[1]), bits(-0.0f));
}

// ---------------------------------------------------------------- members

// One member: how to call it, and the expected samples of pixel x of a row
// of `width` given its three source samples.
template <typename T>
struct Member {
  const char* name;
  int channels;
  std::function<Status(const T*, int, T*, int, ImageSize)> run;
  std::function<std::array<T, 3>(const T* px, int x, int width)> expected;
};

template <typename T>
std::array<T, 3> fromPixel(Pixel8 p) {
  return {T(p.c0), T(p.c1), T(p.c2)};
}

std::vector<Member<uint8_t>> eightBitMembers() {
  using P = const uint8_t*;
  auto zones = [](int block, Pixel8 (*body)(int, int, int), Pixel8 (*tail)(int, int, int)) {
    return [=](P p, int x, int width) {
      return fromPixel<uint8_t>((x < (width & ~(block - 1)) ? body : tail)(p[0], p[1], p[2]));
    };
  };
  std::vector<Member<uint8_t>> out = {
      {"zeliRGBToYCC_8u_C3R", 3, zeliRGBToYCC_8u_C3R, zones(8, rgbToYccLanes, rgbToYccWide)},
      {"zeliRGBToYCC_8u_AC4R", 4, zeliRGBToYCC_8u_AC4R, zones(4, rgbToYccLanes, rgbToYccWide)},
      {"zeliYCCToRGB_8u_C3R", 3, zeliYCCToRGB_8u_C3R, zones(8, yccToRgbLanes, yccToRgbWide)},
      {"zeliYCCToRGB_8u_AC4R", 4, zeliYCCToRGB_8u_AC4R, zones(4, yccToRgbLanes, yccToRgbWide)}};
  // The row kernels on each vector width, walked here.
  using Row = void (*)(const uint8_t*, uint8_t*, int, VectorTier);
  const Row rows[4] = {rgbToYcc8uRow<3>, rgbToYcc8uRow<4>, yccToRgb8uRow<3>, yccToRgb8uRow<4>};
  for (VectorTier tier : rowTiers())
    for (int k = 0; k < 4; ++k) {
      Member<uint8_t> m = out[k];
      const Row row = rows[k];
      m.run = [row, tier](P src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
        for (int y = 0; y < size.height; ++y)
          row(zel::rowAt(src, srcStep, y), zel::rowAt(dst, dstStep, y), size.width, tier);
        return StatusOk;
      };
      out.push_back(m);
    }
  return out;
}

// 16-bit members: the float body below width AND NOT 3, rounded; the tail of
// the sample type after it.
template <typename T>
std::function<std::array<T, 3>(const T*, int, int)> wordZones(Float3 (*body)(float, float, float),
                                                               Word3 (*tail)(int, int, int)) {
  return [=](const T* p, int x, int width) {
    const bool isSigned = std::is_signed_v<T>;
    Word3 w;
    if (x < (width & ~3)) {
      const float bias = isSigned ? 32768.0f : 0.0f;
      const Float3 f = body(float(p[0]) + bias, float(p[1]) + bias, float(p[2]) + bias);
      w = isSigned ? Word3{roundToSignedWord(f.c0), roundToSignedWord(f.c1), roundToSignedWord(f.c2)}
                   : Word3{roundToWord(f.c0), roundToWord(f.c1), roundToWord(f.c2)};
    } else {
      w = tail(p[0], p[1], p[2]);
    }
    return std::array<T, 3>{T(w.c0), T(w.c1), T(w.c2)};
  };
}

// The members again through their row kernels on each vector tier, walked
// here; `rows` are the kernels in member order, on the kernels' sample type
// W (a null entry has no such kernel). A streaming kernel fences at the end.
template <typename W, typename T>
void addRowKernels(std::vector<Member<T>>& out, const std::array<void (*)(const W*, W*, int, VectorTier), 4>& rows,
                   bool streaming = false) {
  for (VectorTier tier : rowTiers(false))
    for (int k = 0; k < 4; ++k) {
      if (!rows[k]) continue;
      Member<T> m = out[k];
      const auto row = rows[k];
      m.run = [row, tier, streaming](const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {
        for (int y = 0; y < size.height; ++y)
          row(reinterpret_cast<const W*>(zel::rowAt(src, srcStep, y)), reinterpret_cast<W*>(zel::rowAt(dst, dstStep, y)),
              size.width, tier);
        if (streaming) zel::StreamStores::fence();
        return StatusOk;
      };
      out.push_back(m);
    }
}

std::vector<Member<uint16_t>> unsignedMembers() {
  std::vector<Member<uint16_t>> out = {
      {"zeliRGBToYCC_16u_C3R", 3, zeliRGBToYCC_16u_C3R, wordZones<uint16_t>(rgbToYccBody16, rgbToYccTail16u)},
      {"zeliRGBToYCC_16u_AC4R", 4, zeliRGBToYCC_16u_AC4R, wordZones<uint16_t>(rgbToYccBody16, rgbToYccTail16u)},
      {"zeliYCCToRGB_16u_C3R", 3, zeliYCCToRGB_16u_C3R, wordZones<uint16_t>(yccToRgbBody16, yccToRgbTail16u)},
      {"zeliYCCToRGB_16u_AC4R", 4, zeliYCCToRGB_16u_AC4R, wordZones<uint16_t>(yccToRgbBody16, yccToRgbTail16u)}};
  addRowKernels<uint16_t>(out, {rgbToYcc16Row<3, false>, rgbToYcc16Row<4, false>, yccToRgb16Row<3, false>,
                      yccToRgb16Row<4, false>});
  return out;
}

std::vector<Member<int16_t>> signedMembers() {
  std::vector<Member<int16_t>> out = {
      {"zeliRGBToYCC_16s_C3R", 3, zeliRGBToYCC_16s_C3R, wordZones<int16_t>(rgbToYccBody16, rgbToYccTail16s)},
      {"zeliRGBToYCC_16s_AC4R", 4, zeliRGBToYCC_16s_AC4R, wordZones<int16_t>(rgbToYccBody16, rgbToYccTail16s)},
      {"zeliYCCToRGB_16s_C3R", 3, zeliYCCToRGB_16s_C3R, wordZones<int16_t>(yccToRgbBody16, yccToRgbTail16s)},
      {"zeliYCCToRGB_16s_AC4R", 4, zeliYCCToRGB_16s_AC4R, wordZones<int16_t>(yccToRgbBody16, yccToRgbTail16s)}};
  addRowKernels<uint16_t>(out, {rgbToYcc16Row<3, true>, rgbToYcc16Row<4, true>, yccToRgb16Row<3, true>, yccToRgb16Row<4, true>});
  return out;
}

std::vector<Member<float>> floatMembers() {
  auto all = [](Float3 (*form)(float, float, float)) {
    return [=](const float* p, int, int) {
      const Float3 f = form(p[0], p[1], p[2]);
      return std::array<float, 3>{f.c0, f.c1, f.c2};
    };
  };
  std::vector<Member<float>> out = {{"zeliRGBToYCC_32f_C3R", 3, zeliRGBToYCC_32f_C3R, all(rgbToYcc32f)},
                                    {"zeliRGBToYCC_32f_AC4R", 4, zeliRGBToYCC_32f_AC4R, all(rgbToYcc32f)},
                                    {"zeliYCCToRGB_32f_C3R", 3, zeliYCCToRGB_32f_C3R, all(yccToRgb32f)},
                                    {"zeliYCCToRGB_32f_AC4R", 4, zeliYCCToRGB_32f_AC4R, all(yccToRgb32f)}};
  using zel::PlainStores;
  using zel::StreamStores;
  addRowKernels<float>(out, {rgbToYcc32fRow<3, PlainStores>, rgbToYcc32fRow<4, PlainStores>,
                             yccToRgb32fRow<3, PlainStores>, yccToRgb32fRow<4, PlainStores>});
  addRowKernels<float>(out, {rgbToYcc32fRow<3, StreamStores>, nullptr, yccToRgb32fRow<3, StreamStores>, nullptr}, true);
  return out;
}

template <typename T>
bool sameBits(T a, T b) {
  return std::memcmp(&a, &b, sizeof(T)) == 0;
}

// Random rows at byte offsets that keep the samples' own alignment and at
// odd ones, padded; every sample by its zone's form, the fourth samples and
// the bytes around the rows unchanged.
template <typename T>
void checkMembers(const std::vector<Member<T>>& members) {
  for (const Member<T>& m : members)
    for (int width : rowWidths())
      for (int offset : {0, int(sizeof(T)), 3}) {
        const int height = 2, n = m.channels;
        TestImage<T> src(width * n, height, offset, 2 * int(sizeof(T)));
        TestImage<T> dst(width * n, height, offset + int(sizeof(T)) * (width & 1), 3 * int(sizeof(T)));
        // Floats in a range past 0..1 on both sides, so the clamps work.
        src.fillRandom(uint32_t(width * 7 + offset), -0.2, 1.2);
        std::vector<T> fourth;
        for (int y = 0; y < height && n == 4; ++y)
          for (int x = 0; x < width; ++x) fourth.push_back(dst.get(4 * x + 3, y));
        ASSERT_EQ(m.run(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, height}), StatusOk);
        for (int y = 0; y < height; ++y)
          for (int x = 0; x < width; ++x) {
            T px[3] = {src.get(n * x, y), src.get(n * x + 1, y), src.get(n * x + 2, y)};
            const std::array<T, 3> want = m.expected(px, x, width);
            for (int c = 0; c < 3; ++c)
              ASSERT_TRUE(sameBits(dst.get(n * x + c, y), want[c]))
                  << m.name << " width " << width << " offset " << offset << " pixel " << x << " channel " << c
                  << ": " << +dst.get(n * x + c, y) << " for " << +want[c];
            if (n == 4) ASSERT_TRUE(sameBits(dst.get(4 * x + 3, y), fourth[size_t(y) * width + x])) << m.name;
          }
        ASSERT_TRUE(dst.guardsIntact()) << m.name << " width " << width << " offset " << offset;
      }
}

TEST(PhotoYccMembers, EightBitEveryWidth) { checkMembers(eightBitMembers()); }
TEST(PhotoYccMembers, UnsignedSixteenBitEveryWidth) { checkMembers(unsignedMembers()); }
TEST(PhotoYccMembers, SignedSixteenBitEveryWidth) { checkMembers(signedMembers()); }
TEST(PhotoYccMembers, FloatEveryWidth) { checkMembers(floatMembers()); }

// A three-channel float frame of more than a mebibyte, against a cache of one
// mebibyte, streams its output: rows at addresses that reach the vector
// alignment after a few pixels and rows off the float grid, every sample by
// its formula, the padding and guards untouched.
TEST(PhotoYccMembers, FloatFramesBeyondTheCacheStreamTheSameBits) {
  const int width = 301, height = 150;  // 1.08 MB read and written
  zelTestOverrideCacheSize(0, 1 << 20);
  EXPECT_TRUE(zel::streamsBeyondCache(int64_t(width) * height * 24));
  const std::vector<Member<float>> members = floatMembers();
  for (int k : {0, 2}) {  // the C3 members
    const Member<float>& m = members[size_t(k)];
    for (int offset : {0, 4, 3}) {
      TestImage<float> src(width * 3, height, offset, 8), dst(width * 3, height, offset + 8, 20);
      src.fillRandom(uint32_t(k * 10 + offset), -0.2, 1.2);
      ASSERT_EQ(m.run(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, height}), StatusOk);
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
          const float px[3] = {src.get(3 * x, y), src.get(3 * x + 1, y), src.get(3 * x + 2, y)};
          const std::array<float, 3> want = m.expected(px, x, width);
          for (int c = 0; c < 3; ++c)
            ASSERT_TRUE(sameBits(dst.get(3 * x + c, y), want[c]))
                << m.name << " offset " << offset << " pixel " << x << "," << y << " channel " << c;
        }
      ASSERT_TRUE(dst.guardsIntact()) << m.name << " offset " << offset;
    }
  }
  zelTestOverrideCacheSize(-1, 0);
}

TEST(PhotoYccMembers, UnevenStepsLoseTheirLowBits) {
  // A step one byte past the rows' true distance walks the same rows as the
  // true one for 16-bit and float samples.
  const int width = 9, height = 4;
  TestImage<uint16_t> src(width * 3, height), a(width * 3, height), b(width * 3, height);
  src.fillRandom(77);
  ASSERT_EQ(zeliRGBToYCC_16u_C3R(src.data(), src.step(), a.data(), a.step(), ImageSize{width, height}), StatusOk);
  ASSERT_EQ(zeliRGBToYCC_16u_C3R(src.data(), src.step() + 1, b.data(), b.step() + 1, ImageSize{width, height}),
            StatusOk);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width * 3; ++x) ASSERT_EQ(a.get(x, y), b.get(x, y));
  TestImage<float> fs(width * 4, height), fa(width * 4, height), fb(width * 4, height);
  fs.fillRandom(78);
  ASSERT_EQ(zeliYCCToRGB_32f_AC4R(fs.data(), fs.step(), fa.data(), fa.step(), ImageSize{width, height}), StatusOk);
  ASSERT_EQ(zeliYCCToRGB_32f_AC4R(fs.data(), fs.step() + 3, fb.data(), fb.step() + 3, ImageSize{width, height}),
            StatusOk);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width * 4; ++x) ASSERT_TRUE(sameBits(fa.get(x, y), fb.get(x, y)));
}

}  // namespace
