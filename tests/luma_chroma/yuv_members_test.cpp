// The ten YUV members: which form each pixel takes at every width, rows at
// odd addresses with padding, the fourth bytes and planes, and the row kernels
// on both vector paths.
#include <gtest/gtest.h>

#include <functional>
#include <vector>

#include "frame/image_layout.h"
#include "luma_chroma/yuv_kernels.h"
#include "luma_chroma/yuv_lane_check.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::lc;
using zel::lc::test::vectorWidths;
using zel::rowAt;
using zel::test::TestImage;

using Form = Pixel8 (*)(int, int, int);

Pixel8 wideAGreenTruncated(int y, int u, int v) { return rgbWide(rgbWideA, {32768, 0, 32768}, y, u, v); }
Pixel8 wideARounded(int y, int u, int v) { return rgbWide(rgbWideA, {32768, 32768, 32768}, y, u, v); }
Pixel8 wideBTruncated(int y, int u, int v) { return rgbWide(rgbWideB, {0, 0, 0}, y, u, v); }

// A side of a conversion: interleaved with 3 or 4 bytes a pixel, or planes.
struct Shape {
  bool planar;
  int count;  // bytes a pixel, or planes
};
constexpr Shape C3{false, 3}, C4{false, 4}, P3{true, 3}, P4{true, 4};

// Pointers and steps of one call; `src`/`dst` hold one pointer for an
// interleaved side and one per plane for a planar one.
struct Call {
  std::vector<const uint8_t*> src;
  int srcStep;
  std::vector<uint8_t*> dst;
  int dstStep;
  ImageSize size;
};
using Runner = std::function<Status(const Call&)>;

struct Member {
  const char* name;
  Shape in, out;
  int block;  // body = width AND NOT (block - 1); 0: no body
  Form body, tail;
  Runner run;
  // The same conversion row by row through the row kernel on a given path.
  std::function<void(const Call&, int y, bool)> row;
  int alpha = -1;  // value of a C4 destination's fourth byte
};

template <typename T>
T* rowOf(T* base, int step, int y) {
  return rowAt(base, step, y);
}

std::vector<Member> members() {
  auto s0 = [](const Call& c, int y) { return rowOf(c.src[0], c.srcStep, y); };
  auto d0 = [](const Call& c, int y) { return rowOf(c.dst[0], c.dstStep, y); };
  auto sPlanes = [](const Call& c, int y) {
    std::vector<const uint8_t*> p;
    for (const uint8_t* b : c.src) p.push_back(rowOf(b, c.srcStep, y));
    return p;
  };
  auto dPlanes = [](const Call& c, int y) {
    std::vector<uint8_t*> p;
    for (uint8_t* b : c.dst) p.push_back(rowOf(b, c.dstStep, y));
    return p;
  };
  return {
      {"zeliRGBToYUV_8u_C3R", C3, C3, 16, yuvMatrixLanes, yuvDifferenceTruncated,
       [](const Call& c) { return zeliRGBToYUV_8u_C3R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { rgbToYuvC3Row(s0(c, y), d0(c, y), c.size.width, p); }},
      {"zeliRGBToYUV_8u_C3P3R", C3, P3, 8, yuvMatrixLanes, yuvDifferenceTruncated,
       [](const Call& c) { return zeliRGBToYUV_8u_C3P3R(c.src[0], c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { rgbToYuvC3P3Row(s0(c, y), dPlanes(c, y).data(), c.size.width, p); }},
      {"zeliRGBToYUV_8u_P3R", P3, P3, 16, yuvMatrixLanes, yuvMatrixWide,
       [](const Call& c) { return zeliRGBToYUV_8u_P3R(c.src.data(), c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) {
         rgbToYuvP3Row(sPlanes(c, y).data(), dPlanes(c, y).data(), c.size.width, p);
       }},
      {"zeliRGBToYUV_8u_AC4R", C4, C4, 0, nullptr, yuvDifferenceRounded,
       [](const Call& c) { return zeliRGBToYUV_8u_AC4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { rgbToYuvAC4Row(s0(c, y), d0(c, y), c.size.width, p); }},
      {"zeliRGBToYUV_8u_AC4P4R", C4, P4, 8, yuvDifferenceLanes, yuvDifferenceRounded,
       [](const Call& c) { return zeliRGBToYUV_8u_AC4P4R(c.src[0], c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { rgbToYuvAC4P4Row(s0(c, y), dPlanes(c, y).data(), c.size.width, p); }},
      {"zeliYUVToRGB_8u_C3R", C3, C3, 8, rgbLanes1, wideAGreenTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_C3R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { yuvToRgbC3Row(s0(c, y), d0(c, y), c.size.width, p); }},
      {"zeliYUVToRGB_8u_AC4R", C4, C4, 0, nullptr, wideAGreenTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_AC4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { yuvToRgbAC4Row(s0(c, y), d0(c, y), c.size.width, p); }},
      {"zeliYUVToRGB_8u_C3C4R", C3, C4, 8, rgbLanes3, wideARounded,
       [](const Call& c) { return zeliYUVToRGB_8u_C3C4R(c.src[0], c.srcStep, c.dst[0], c.dstStep, c.size, 201); },
       [=](const Call& c, int y, bool p) { yuvToRgbC3C4Row(s0(c, y), d0(c, y), c.size.width, 201, p); }, 201},
      {"zeliYUVToRGB_8u_P3C3R", P3, C3, 16, rgbLanes2, wideBTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_P3C3R(c.src.data(), c.srcStep, c.dst[0], c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) { yuvToRgbP3C3Row(sPlanes(c, y).data(), d0(c, y), c.size.width, p); }},
      {"zeliYUVToRGB_8u_P3R", P3, P3, 0, nullptr, wideBTruncated,
       [](const Call& c) { return zeliYUVToRGB_8u_P3R(c.src.data(), c.srcStep, c.dst.data(), c.dstStep, c.size); },
       [=](const Call& c, int y, bool p) {
         yuvToRgbP3Row(sPlanes(c, y).data(), dPlanes(c, y).data(), c.size.width, p);
       }},
  };
}

// Images of one call: rows start at odd distances past a 64-byte boundary
// and are followed by guard bytes; the planes of a set share one step.
struct Images {
  std::vector<TestImage<uint8_t>> src, dst;
  Images(const Member& m, int width, int height, int offset, int pad) {
    for (int k = 0; k < (m.in.planar ? m.in.count : 1); ++k)
      src.emplace_back(m.in.planar ? width : width * m.in.count, height, offset + 5 * k, pad);
    for (int k = 0; k < (m.out.planar ? m.out.count : 1); ++k)
      dst.emplace_back(m.out.planar ? width : width * m.out.count, height, offset + 2 * k + 1, pad + 3);
  }
  Call call(ImageSize size) {
    Call c{{}, src[0].step(), {}, dst[0].step(), size};
    for (auto& s : src) c.src.push_back(s.data());
    for (auto& d : dst) c.dst.push_back(d.data());
    return c;
  }
  Samples3 pixel(const Member& m, int x, int y) const {
    if (m.in.planar) return {src[0].get(x, y), src[1].get(x, y), src[2].get(x, y)};
    const int n = m.in.count;
    return {src[0].get(n * x, y), src[0].get(n * x + 1, y), src[0].get(n * x + 2, y)};
  }
  Pixel8 result(const Member& m, int x, int y) const {
    if (m.out.planar) return {dst[0].get(x, y), dst[1].get(x, y), dst[2].get(x, y)};
    const int n = m.out.count;
    return {dst[0].get(n * x, y), dst[0].get(n * x + 1, y), dst[0].get(n * x + 2, y)};
  }
};

std::string str(Pixel8 p) {
  return std::to_string(p.c0) + "," + std::to_string(p.c1) + "," + std::to_string(p.c2);
}

constexpr uint8_t kUnwritten = 0xD3;

// Converts a random image and checks every pixel against its zone's form,
// the fourth bytes or plane, and the bytes around the rows.
void checkMember(const Member& m, int width, int height, int offset, int pad,
                 const std::function<void(const Call&)>& convert) {
  Images img(m, width, height, offset, pad);
  for (size_t k = 0; k < img.src.size(); ++k) img.src[k].fillRandom(uint32_t(width * 977 + offset * 31 + k));
  for (auto& d : img.dst) d.fill(kUnwritten);
  const auto before = img.src;
  convert(img.call(ImageSize{width, height}));
  const int body = m.block ? width & ~(m.block - 1) : 0;
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      const Samples3 s = img.pixel(m, x, y);
      const Pixel8 want = (x < body ? m.body : m.tail)(s.c0, s.c1, s.c2);
      ASSERT_EQ(str(img.result(m, x, y)), str(want))
          << m.name << " width " << width << " pixel " << x << "," << y << (x < body ? " (body)" : " (tail)");
      if (!m.out.planar && m.out.count == 4)
        ASSERT_EQ(img.dst[0].get(4 * x + 3, y), m.alpha >= 0 ? m.alpha : kUnwritten) << m.name << " alpha " << x;
      if (m.out.planar && m.out.count == 4)
        ASSERT_EQ(img.dst[3].get(x, y), img.src[0].get(4 * x + 3, y)) << m.name << " fourth plane " << x;
    }
  for (auto& d : img.dst) ASSERT_TRUE(d.guardsIntact()) << m.name << " width " << width << " offset " << offset;
  for (size_t k = 0; k < img.src.size(); ++k)
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < img.src[k].rowSamples(); ++x) ASSERT_EQ(img.src[k].get(x, y), before[k].get(x, y));
}

TEST(YuvMembers, EveryWidthTakesItsZonesForms) {
  for (const Member& m : members())
    for (int width = 1; width <= 70; ++width)
      for (int offset : {0, 3})
        checkMember(m, width, 2, offset + (width & 1), width % 3 == 0 ? 0 : 9, [&](const Call& c) {
          ASSERT_EQ(m.run(c), StatusOk) << m.name;
        });
}

TEST(YuvMembers, RowKernelsAgreeOnBothVectorPaths) {
  for (const Member& m : members())
    for (bool path : vectorWidths())
      for (int width : {1, 7, 8, 9, 15, 16, 17, 24, 31, 32, 33, 47, 48, 64, 70})
        for (int offset : {1, 6})
          checkMember(m, width, 3, offset, 2, [&](const Call& c) {
            for (int y = 0; y < c.size.height; ++y) m.row(c, y, path);
          });
}

TEST(YuvMembers, NegativeStepsWalkUpwards) {
  // The last row given first with a negative step: the same bytes as the
  // plain call.
  for (const Member& m : members()) {
    const int width = 21, height = 4;
    Images a(m, width, height, 1, 4), b(m, width, height, 1, 4);
    for (size_t k = 0; k < a.src.size(); ++k) {
      a.src[k].fillRandom(uint32_t(40 + k));
      b.src[k].fillRandom(uint32_t(40 + k));
    }
    for (auto& d : a.dst) d.fill(kUnwritten);
    for (auto& d : b.dst) d.fill(kUnwritten);
    ASSERT_EQ(m.run(a.call(ImageSize{width, height})), StatusOk);
    Call up = b.call(ImageSize{width, height});
    for (auto& p : up.src) p = rowAt(p, up.srcStep, height - 1);
    for (auto& p : up.dst) p = rowAt(p, up.dstStep, height - 1);
    up.srcStep = -up.srcStep;
    up.dstStep = -up.dstStep;
    ASSERT_EQ(m.run(up), StatusOk);
    for (size_t k = 0; k < a.dst.size(); ++k)
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < a.dst[k].rowSamples(); ++x) ASSERT_EQ(a.dst[k].get(x, y), b.dst[k].get(x, y)) << m.name;
  }
}

// ---- the members' own cases ----

template <size_t N>
std::vector<uint8_t> repeat(int width, const uint8_t (&px)[N]) {
  std::vector<uint8_t> row;
  for (int x = 0; x < width; ++x) row.insert(row.end(), px, px + N);
  return row;
}

TEST(YuvMembers, BlackInTheFourPlaneBodyAndTail) {
  // Eight pixels are one body block of the 16-bit difference form, where
  // black floors to 127; seven are all tail.
  for (int width : {7, 8}) {
    const uint8_t black[4] = {0, 0, 0, 99};
    const std::vector<uint8_t> src = repeat(width, black);
    std::vector<uint8_t> y(width, 1), u(width, 1), v(width, 1), a(width, 1);
    uint8_t* planes[4] = {y.data(), u.data(), v.data(), a.data()};
    ASSERT_EQ(zeliRGBToYUV_8u_AC4P4R(src.data(), 4 * width, planes, width, ImageSize{width, 1}), StatusOk);
    const int chroma = width == 8 ? 127 : 128;
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(y[x], 0);
      EXPECT_EQ(u[x], chroma) << width;
      EXPECT_EQ(v[x], chroma) << width;
      EXPECT_EQ(a[x], 99);
    }
  }
}

TEST(YuvMembers, WhiteThroughTheInterleavedBodyAndTail) {
  for (int width : {15, 16}) {
    const uint8_t white[3] = {255, 255, 255};
    const std::vector<uint8_t> src = repeat(width, white);
    std::vector<uint8_t> dst(3 * width, 7);
    ASSERT_EQ(zeliRGBToYUV_8u_C3R(src.data(), 3 * width, dst.data(), 3 * width, ImageSize{width, 1}), StatusOk);
    const uint8_t want[2][3] = {{255, 128, 128}, {254, 127, 127}};
    for (int x = 0; x < width; ++x)
      for (int c = 0; c < 3; ++c) EXPECT_EQ(dst[3 * x + c], want[width == 16][c]) << width << " " << x;
  }
}

TEST(YuvMembers, PureGreenClampsV) {
  const uint8_t green[4] = {0, 255, 0, 0};
  const std::vector<uint8_t> src = repeat(11, green);
  std::vector<uint8_t> dst(44, 9);
  ASSERT_EQ(zeliRGBToYUV_8u_AC4R(src.data(), 44, dst.data(), 44, ImageSize{11, 1}), StatusOk);
  for (int x = 0; x < 11; ++x) {
    EXPECT_EQ(dst[4 * x], 150);
    EXPECT_EQ(dst[4 * x + 1], 54);
    EXPECT_EQ(dst[4 * x + 2], 0);
    EXPECT_EQ(dst[4 * x + 3], 9);
  }
}

TEST(YuvMembers, PlanarInverseTruncatesAtEveryWidth) {
  for (int width : {1, 8, 16, 33}) {
    std::vector<uint8_t> y(width, 128), u(width, 128), v(width, 128);
    std::vector<uint8_t> r(width), g(width), b(width);
    const uint8_t* src[3] = {y.data(), u.data(), v.data()};
    uint8_t* dst[3] = {r.data(), g.data(), b.data()};
    ASSERT_EQ(zeliYUVToRGB_8u_P3R(src, width, dst, width, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x) EXPECT_TRUE(r[x] == 128 && g[x] == 128 && b[x] == 128) << x;
    // A colour where rounding would show: one value across the row.
    std::fill(u.begin(), u.end(), 170);
    std::fill(v.begin(), v.end(), 178);
    ASSERT_EQ(zeliYUVToRGB_8u_P3R(src, width, dst, width, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x) EXPECT_TRUE(r[x] == 184 && g[x] == 82 && b[x] == 213) << width << " " << x;
  }
}

TEST(YuvMembers, FourChannelOutputTakesAlphaEverywhere) {
  for (int width : {3, 8, 13}) {
    std::vector<uint8_t> src(3 * width, 100), dst(4 * width, 0);
    ASSERT_EQ(zeliYUVToRGB_8u_C3C4R(src.data(), 3 * width, dst.data(), 4 * width, ImageSize{width, 1}, 255),
              StatusOk);
    for (int x = 0; x < width; ++x) EXPECT_EQ(dst[4 * x + 3], 255) << x;
  }
}

}  // namespace
