// The ten YUV members: which form each pixel takes at every width, rows at
// odd addresses with padding, the fourth bytes and planes, and the row kernels
// on both vector widths.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <string>
#include <vector>

#include "frame/image_layout.h"
#include "luma_chroma/yuv_kernels.h"
#include "luma_chroma/yuv_lane_check.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::lc;
using zel::VectorTier;
using zel::rowAt;
using zel::lc::test::str;
using zel::test::TestImage;

using Form = Pixel8 (*)(int, int, int);
Pixel8 wideAGreenTruncated(int y, int u, int v) { return rgbWide(rgbWideA, {32768, 0, 32768}, y, u, v); }
Pixel8 wideARounded(int y, int u, int v) { return rgbWide(rgbWideA, {32768, 32768, 32768}, y, u, v); }
Pixel8 wideBTruncated(int y, int u, int v) { return rgbWide(rgbWideB, {0, 0, 0}, y, u, v); }

// Pointers and steps of one call: one pointer for an interleaved side, one
// per plane for a planar side.
struct Call {
  std::vector<const uint8_t*> src;
  int srcStep;
  std::vector<uint8_t*> dst;
  int dstStep;
  ImageSize size;
  std::vector<const uint8_t*> srcRow(int y) const {
    std::vector<const uint8_t*> p;
    for (const uint8_t* b : src) p.push_back(rowAt(b, srcStep, y));
    return p;
  }
  std::vector<uint8_t*> dstRow(int y) const {
    std::vector<uint8_t*> p;
    for (uint8_t* b : dst) p.push_back(rowAt(b, dstStep, y));
    return p;
  }
};

struct Member {
  const char* name;
  bool planarIn, planarOut;
  int inCount, outCount;  // bytes a pixel or planes
  int block;              // body = width AND NOT (block - 1); 0: no body
  Form body, tail;
  std::function<Status(const Call&)> run;
  std::function<void(const Call&, int y, VectorTier tier)> row;  // the row kernel alone
  int alpha = -1;  // a C4 destination's fourth byte
};

std::vector<Member> members() {
  return {
      {"zeliRGBToYUV_8u_C3R", false, false, 3, 3, 16, yuvMatrixLanes, yuvDifferenceTruncated,
       [](const Call& c) { return zeliRGBToYUV_8u_C3R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { rgbToYuvC3Row(c.srcRow(y)[0], c.dstRow(y)[0], c.size.width, a); }},
      {"zeliRGBToYUV_8u_C3P3R", false, true, 3, 3, 8, yuvMatrixLanes, yuvDifferenceTruncated,
       [](const Call& c) { return zeliRGBToYUV_8u_C3P3R(c.src[0], c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { rgbToYuvC3P3Row(c.srcRow(y)[0], c.dstRow(y).data(), c.size.width, a); }},
      {"zeliRGBToYUV_8u_P3R", true, true, 3, 3, 16, yuvMatrixLanes, yuvMatrixWide,
       [](const Call& c) { return zeliRGBToYUV_8u_P3R(c.src.data(), c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { rgbToYuvP3Row(c.srcRow(y).data(), c.dstRow(y).data(), c.size.width, a); }},
      {"zeliRGBToYUV_8u_AC4R", false, false, 4, 4, 0, nullptr, yuvDifferenceRounded,
       [](const Call& c) { return zeliRGBToYUV_8u_AC4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { rgbToYuvAC4Row(c.srcRow(y)[0], c.dstRow(y)[0], c.size.width, a); }},
      {"zeliRGBToYUV_8u_AC4P4R", false, true, 4, 4, 8, yuvDifferenceLanes, yuvDifferenceRounded,
       [](const Call& c) { return zeliRGBToYUV_8u_AC4P4R(c.src[0], c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { rgbToYuvAC4P4Row(c.srcRow(y)[0], c.dstRow(y).data(), c.size.width, a); }},
      {"zeliYUVToRGB_8u_C3R", false, false, 3, 3, 8, rgbLanes1, wideAGreenTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_C3R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { yuvToRgbC3Row(c.srcRow(y)[0], c.dstRow(y)[0], c.size.width, a); }},
      {"zeliYUVToRGB_8u_AC4R", false, false, 4, 4, 0, nullptr, wideAGreenTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_AC4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { yuvToRgbAC4Row(c.srcRow(y)[0], c.dstRow(y)[0], c.size.width, a); }},
      {"zeliYUVToRGB_8u_C3C4R", false, false, 3, 4, 8, rgbLanes3, wideARounded,
       [](const Call& c) { return zeliYUVToRGB_8u_C3C4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size, 201); },
       [](const Call& c, int y, VectorTier a) { yuvToRgbC3C4Row(c.srcRow(y)[0], c.dstRow(y)[0], c.size.width, 201, a); },
       201},
      {"zeliYUVToRGB_8u_P3C3R", true, false, 3, 3, 16, rgbLanes2, wideBTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_P3C3R(c.src.data(), c.srcStep, c.dst[0], c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { yuvToRgbP3C3Row(c.srcRow(y).data(), c.dstRow(y)[0], c.size.width, a); }},
      {"zeliYUVToRGB_8u_P3R", true, true, 3, 3, 0, nullptr, wideBTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_P3R(c.src.data(), c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [](const Call& c, int y, VectorTier a) { yuvToRgbP3Row(c.srcRow(y).data(), c.dstRow(y).data(), c.size.width, a); }},
  };
}

constexpr uint8_t kUnwritten = 0xD3;

// The images of one call: rows at odd distances past a 64-byte boundary,
// followed by guard bytes; the planes of a set share one step.
struct Images {
  const Member& m;
  int width, height;
  std::vector<TestImage<uint8_t>> src, dst;
  Images(const Member& member, int w, int h, int offset, int pad) : m(member), width(w), height(h) {
    for (int k = 0; k < (m.planarIn ? m.inCount : 1); ++k)
      src.emplace_back(m.planarIn ? w : w * m.inCount, h, offset + 5 * k, pad);
    for (int k = 0; k < (m.planarOut ? m.outCount : 1); ++k)
      dst.emplace_back(m.planarOut ? w : w * m.outCount, h, offset + 2 * k + 1, pad + 3);
    for (auto& d : dst) d.fill(kUnwritten);
  }
  Call call() {
    Call c{{}, src[0].step(), {}, dst[0].step(), ImageSize{width, height}};
    for (auto& s : src) c.src.push_back(s.data());
    for (auto& d : dst) c.dst.push_back(d.data());
    return c;
  }
  int in(int x, int y, int ch) const { return m.planarIn ? src[ch].get(x, y) : src[0].get(m.inCount * x + ch, y); }
  Pixel8 out(int x, int y) const {
    if (m.planarOut) return {dst[0].get(x, y), dst[1].get(x, y), dst[2].get(x, y)};
    const int n = m.outCount;
    return {dst[0].get(n * x, y), dst[0].get(n * x + 1, y), dst[0].get(n * x + 2, y)};
  }
  // The fourth byte or plane: kept, the caller's alpha, or the source's.
  void expectFourth(int x, int y) const {
    if (m.outCount != 4) return;
    if (m.planarOut)
      ASSERT_EQ(dst[3].get(x, y), in(x, y, 3)) << m.name << " fourth plane " << x;
    else
      ASSERT_EQ(dst[0].get(4 * x + 3, y), m.alpha >= 0 ? m.alpha : kUnwritten) << m.name << " fourth byte " << x;
  }
};

// Converts a random image and checks every pixel against its zone's form,
// the fourth bytes or plane, and the bytes around the rows and the sources.
void checkMember(const Member& m, int width, int height, int offset, int pad,
                 const std::function<void(const Call&)>& convert) {
  Images img(m, width, height, offset, pad);
  for (size_t k = 0; k < img.src.size(); ++k) img.src[k].fillRandom(uint32_t(width * 977 + offset * 31 + k));
  const std::vector<TestImage<uint8_t>> before = img.src;
  convert(img.call());
  const int body = m.block ? width & ~(m.block - 1) : 0;
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      const Pixel8 want = (x < body ? m.body : m.tail)(img.in(x, y, 0), img.in(x, y, 1), img.in(x, y, 2));
      ASSERT_EQ(str(img.out(x, y)), str(want))
          << m.name << " width " << width << " pixel " << x << "," << y << (x < body ? " (body)" : " (tail)");
      img.expectFourth(x, y);
    }
  for (auto& d : img.dst) ASSERT_TRUE(d.guardsIntact()) << m.name << " width " << width << " offset " << offset;
  for (size_t k = 0; k < img.src.size(); ++k)
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < img.src[k].rowSamples(); ++x) ASSERT_EQ(img.src[k].get(x, y), before[k].get(x, y));
}

TEST(YuvMembers, EveryWidthTakesItsZonesForms) {
  for (const Member& m : members())
    for (int width : zel::lc::test::rowWidths())
      for (int offset : {0, 3})
        checkMember(m, width, 2, offset + (width & 1), width % 3 == 0 ? 0 : 9,
                    [&](const Call& c) { ASSERT_EQ(m.run(c), StatusOk) << m.name; });
}

TEST(YuvMembers, RowKernelsOnEveryVectorTier) {
  for (const Member& m : members())
    for (VectorTier tier : zel::lc::test::rowTiers())
      for (int width : {1, 7, 8, 9, 15, 16, 17, 24, 31, 32, 33, 47, 48, 64, 70, 127, 128, 129, 143, 200})
        checkMember(m, width, 3, 1 + (width & 6), 2, [&](const Call& c) {
          for (int y = 0; y < c.size.height; ++y) m.row(c, y, tier);
        });
}

TEST(YuvMembers, NegativeStepsWalkUpwards) {
  // The last row given first with negated steps: the same bytes as the plain
  // call.
  for (const Member& m : members()) {
    const int width = 21, height = 4;
    Images a(m, width, height, 1, 4), b(m, width, height, 1, 4);
    for (size_t k = 0; k < a.src.size(); ++k) {
      a.src[k].fillRandom(uint32_t(40 + k));
      b.src[k].fillRandom(uint32_t(40 + k));
    }
    ASSERT_EQ(m.run(a.call()), StatusOk);
    Call up = b.call();
    up.src = up.srcRow(height - 1);
    for (auto& p : up.dst) p = rowAt(p, up.dstStep, height - 1);
    up.srcStep = -up.srcStep;
    up.dstStep = -up.dstStep;
    ASSERT_EQ(m.run(up), StatusOk);
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) ASSERT_EQ(str(a.out(x, y)), str(b.out(x, y))) << m.name;
  }
}

TEST(YuvMembers, PixelsWhoseZoneShows) {
  // One pixel repeated over the row: the body and the tail give it
  // different bytes, and the width decides which.
  struct Case {
    const char* member;
    int width;
    uint8_t in[4];
    const char* out;
  };
  const Case cases[] = {
      {"zeliRGBToYUV_8u_AC4P4R", 8, {0, 0, 0, 99}, "0,127,127"},  // black floors to 127 in the lanes
      {"zeliRGBToYUV_8u_AC4P4R", 7, {0, 0, 0, 99}, "0,128,128"},
      {"zeliRGBToYUV_8u_C3R", 16, {255, 255, 255}, "254,127,127"},
      {"zeliRGBToYUV_8u_C3R", 15, {255, 255, 255}, "255,128,128"},
      {"zeliRGBToYUV_8u_AC4R", 11, {0, 255, 0, 5}, "150,54,0"},  // V clamps
      {"zeliYUVToRGB_8u_P3R", 1, {128, 128, 128}, "128,128,128"},
      {"zeliYUVToRGB_8u_P3R", 33, {128, 170, 178}, "184,82,213"},  // truncated at every width
      {"zeliYUVToRGB_8u_C3R", 8, {128, 170, 178}, "185,81,213"},
      {"zeliYUVToRGB_8u_C3R", 7, {128, 170, 178}, "185,82,213"},
  };
  const std::vector<Member> all = members();
  for (const Case& c : cases) {
    auto it = std::find_if(all.begin(), all.end(), [&](const Member& m) { return std::string(m.name) == c.member; });
    ASSERT_NE(it, all.end()) << c.member;
    const Member& m = *it;
    Images img(m, c.width, 1, 0, 0);
    for (int x = 0; x < c.width; ++x)
      for (int ch = 0; ch < m.inCount; ++ch)
        if (m.planarIn)
          img.src[ch].set(x, 0, c.in[ch]);
        else
          img.src[0].set(m.inCount * x + ch, 0, c.in[ch]);
    ASSERT_EQ(m.run(img.call()), StatusOk);
    for (int x = 0; x < c.width; ++x) {
      EXPECT_EQ(str(img.out(x, 0)), c.out) << c.member << " width " << c.width << " pixel " << x;
      img.expectFourth(x, 0);
    }
  }
}

}  // namespace

namespace {

// The lane bodies of the interleaved YUV-to-RGB members, on every tier: the
// 64-pixel blocks take their samples in the high bytes of the lanes and
// shift them down their own way; every sample triple gives the lane form's
// bits. Rows of every Y at each U and V.
TEST(YuvMembers, LaneBodiesGiveTheLaneFormForEverySample) {
  std::vector<uint8_t> src(3 * 256), out3(3 * 256), out4(4 * 256), want3(3 * 256), want4(4 * 256);
  for (int u = 0; u < 256; ++u)
    for (int v = 0; v < 256; ++v) {
      for (int y = 0; y < 256; ++y) {
        src[3 * y] = uint8_t(y);
        src[3 * y + 1] = uint8_t(u);
        src[3 * y + 2] = uint8_t(v);
        const Pixel8 a = rgbLanes1(y, u, v), b = rgbLanes3(y, u, v);
        want3[3 * y] = a.c0, want3[3 * y + 1] = a.c1, want3[3 * y + 2] = a.c2;
        want4[4 * y] = b.c0, want4[4 * y + 1] = b.c1, want4[4 * y + 2] = b.c2, want4[4 * y + 3] = 7;
      }
      for (VectorTier tier : zel::lc::test::rowTiers()) {
        yuvToRgbC3Row(src.data(), out3.data(), 256, tier);
        yuvToRgbC3C4Row(src.data(), out4.data(), 256, 7, tier);
        ASSERT_TRUE(out3 == want3 && out4 == want4) << "U " << u << " V " << v << " " << zel::tierName(tier);
      }
    }
}

// The matrix body regroups the lane form's shifts and its final clamp; every
// sample triple takes the lane form's bits. Rows of every R at each G and B.
TEST(YuvMembers, MatrixBodyGivesTheLaneFormForEverySample) {
  std::vector<uint8_t> planes(3 * 256), out(3 * 256);
  const uint8_t* const src[3] = {planes.data(), planes.data() + 256, planes.data() + 512};
  uint8_t* const dst[3] = {out.data(), out.data() + 256, out.data() + 512};
  for (int r = 0; r < 256; ++r) planes[r] = uint8_t(r);
  for (VectorTier tier : zel::lc::test::rowTiers())
    for (int g = 0; g < 256; ++g)
      for (int b = 0; b < 256; ++b) {
        std::fill(planes.begin() + 256, planes.begin() + 512, uint8_t(g));
        std::fill(planes.begin() + 512, planes.end(), uint8_t(b));
        rgbToYuvP3Row(src, dst, 256, tier);
        for (int r = 0; r < 256; ++r) {
          const Pixel8 want = yuvMatrixLanes(r, g, b);
          ASSERT_TRUE(dst[0][r] == want.c0 && dst[1][r] == want.c1 && dst[2][r] == want.c2)
              << r << "," << g << "," << b << " " << zel::tierName(tier);
        }
      }
}

}  // namespace
