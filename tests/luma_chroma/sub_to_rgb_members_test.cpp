// The subsampled-to-RGB members against a model of their zones: every
// pixel of every width from the minimum to 70, heights 1 to 5, rows at odd
// addresses with padding, the kernels chosen by alignment, the names
// without steps, odd sizes and their warning.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <string>
#include <vector>

#include "luma_chroma/repack_rows.h"
#include "luma_chroma/sub_to_rgb_forms.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::expand;
using zel::repack::PairOrder;
using zel::test::TestImage;

using Form = Rgb8 (*)(int, int, int);

// ---- layouts ----

enum class SrcKind { Planes, Pairs, Stream };
struct SrcLayout {
  SrcKind kind;
  int spreadX, spreadY;  // pixels to a chroma sample
  bool crFirst;          // planes 1, 2 (or a pair) hold Cr before Cb
  PairOrder order;       // of a stream
};
constexpr SrcLayout kPlanes420{SrcKind::Planes, 2, 2, false, PairOrder::YCbCr};
constexpr SrcLayout kPlanes420Cr{SrcKind::Planes, 2, 2, true, PairOrder::YCbCr};
constexpr SrcLayout kPlanes422{SrcKind::Planes, 2, 1, false, PairOrder::YCbCr};
constexpr SrcLayout kPlanes411{SrcKind::Planes, 4, 1, false, PairOrder::YCbCr};
constexpr SrcLayout kPairs{SrcKind::Pairs, 2, 2, false, PairOrder::YCbCr};
constexpr SrcLayout kPairsCr{SrcKind::Pairs, 2, 2, true, PairOrder::YCbCr};
constexpr SrcLayout kStreamYCbCr{SrcKind::Stream, 2, 1, false, PairOrder::YCbCr};
constexpr SrcLayout kStreamYCrCb{SrcKind::Stream, 2, 1, false, PairOrder::YCrCb};
constexpr SrcLayout kStreamCbYCr{SrcKind::Stream, 2, 1, false, PairOrder::CbYCr};

enum class DstKind { C3, C4, P3 };
struct DstLayout {
  DstKind kind;
  bool bgr;
  bool zeroFourth = false;  // the fourth byte is 0, not the caller's alpha
};
constexpr DstLayout kRgb{DstKind::C3, false};
constexpr DstLayout kBgr{DstKind::C3, true};
constexpr DstLayout kRgba{DstKind::C4, false};
constexpr DstLayout kBgra{DstKind::C4, true};
constexpr DstLayout kRgbZero{DstKind::C4, false, true};
constexpr DstLayout kRgbPlanes{DstKind::P3, false};

constexpr uint8_t kAlpha = 77;
constexpr uint8_t kUnwritten = 0xD3;

struct Call {
  const uint8_t* src[3];
  int srcSteps[3];
  uint8_t* dst[3];
  int dstStep;
  ImageSize size;
};

struct Member {
  const char* name;
  std::function<Status(const Call&)> run;
  SrcLayout src;
  DstLayout dst;
  Form body;
  int (*bodyEnd)(int width);
  Form tail;
  int minWidth = 1, minHeight = 1;
  bool implied = false;        // a name without steps
  bool wholeRow = false;       // ... that takes a large even-width image as one row
  Form alignedBody = nullptr;  // the body when every pointer and step is a multiple of 16
};

bool is420(const Member& m) { return m.src.spreadY == 2; }

// ---- the forms, as the member table names them ----

Rgb8 pairRawA(int y, int u, int v) { return pairLanesRaw(pairLanesA, y, u, v); }
Rgb8 pairRawB(int y, int u, int v) { return pairLanesRaw(pairLanesB, y, u, v); }
Rgb8 pairCentredA(int y, int u, int v) { return pairLanesCentred(pairLanesA, y, u, v); }
Rgb8 lanes601a_(int y, int u, int v) { return laneAdded(lanes601a, y, u, v, 8); }
Rgb8 lanes601b_(int y, int u, int v) { return laneAdded(lanes601b, y, u, v, 8); }
Rgb8 lanes709_(int y, int u, int v) { return laneAdded(lanes709, y, u, v, 8); }
Rgb8 hdtv(int y, int u, int v) { return lumaSixteenths(lanesHDTV, y, u, v); }
Rgb8 yuvQuad(int y, int u, int v) { return lumaSixteenths(lanesYuvQuad, y, u, v); }
Rgb8 wide601aRounded(int y, int u, int v) { return wideRounded(wide601a, y, u, v); }
Rgb8 wide601bRounded(int y, int u, int v) { return wideRounded(wide601b, y, u, v); }
Rgb8 wide601bTruncated(int y, int u, int v) { return wideTruncated(wide601b, y, u, v); }
Rgb8 wide709Rounded(int y, int u, int v) { return wideRounded(wide709, y, u, v); }
Rgb8 wideHdtvRounded(int y, int u, int v) { return wideRounded(wideHDTV, y, u, v); }
Rgb8 wide411Rounded(int y, int u, int v) { return wideRounded(wide411, y, u, v); }
Rgb8 raw(int y, int u, int v) { return wideRaw(y, u, v); }
Rgb8 rgb(const Pixel8& p) { return {p.c0, p.c1, p.c2}; }
Rgb8 halves2(int y, int u, int v) { return rgb(rgbLanes2(y, u, v)); }
Rgb8 halves1(int y, int u, int v) { return rgb(rgbLanesShape<1, 4, 0, 1, false>(rgbLanes1Set, y, u, v)); }
Rgb8 yuvWideTruncated(int y, int u, int v) { return rgb(rgbWide(rgbWideA, {0, 0, 0}, y, u, v)); }
Rgb8 yuvWideRounded(int y, int u, int v) { return rgb(rgbWide(rgbWideA, {32768, 32768, 32768}, y, u, v)); }

// ---- body ends, as the member table states them ----

int evenPart(int w) { return w - w % 2; }
int halfGroupsOf4(int w) { return 2 * ((w / 2) & ~3); }
int andNot7(int w) { return w & ~7; }
int andNot15(int w) { return w & ~15; }
int blocksOf8Then4(int w) { return w - w % 4; }
int by16Plus8(int w) { return (w & ~15) + ((w & 15) >= 8 ? 8 : 0); }
int halfPairsOf2(int w) { return 2 * ((w / 2) & ~1); }
int none(int) { return 0; }

#define RUN_P3(f) [](const Call& c) { return f(c.src, c.srcSteps, c.dst[0], c.dstStep, c.size); }
#define RUN_P3A(f) [](const Call& c) { return f(c.src, c.srcSteps, c.dst[0], c.dstStep, c.size, kAlpha); }
#define RUN_P2(f) \
  [](const Call& c) { return f(c.src[0], c.srcSteps[0], c.src[1], c.srcSteps[1], c.dst[0], c.dstStep, c.size); }
#define RUN_P2A(f) \
  [](const Call& c) { return f(c.src[0], c.srcSteps[0], c.src[1], c.srcSteps[1], c.dst[0], c.dstStep, c.size, kAlpha); }
#define RUN_C2(f) [](const Call& c) { return f(c.src[0], c.srcSteps[0], c.dst[0], c.dstStep, c.size); }
#define RUN_C2A(f) [](const Call& c) { return f(c.src[0], c.srcSteps[0], c.dst[0], c.dstStep, c.size, kAlpha); }
#define RUN_C2P3(f) [](const Call& c) { return f(c.src[0], c.srcSteps[0], c.dst, c.dstStep, c.size); }
#define RUN_P3P3(f) [](const Call& c) { return f(c.src, c.srcSteps, c.dst, c.dstStep, c.size); }
#define RUN_P3C3_(f) [](const Call& c) { return f(c.src, c.dst[0], c.size); }
#define RUN_P3P3_(f) [](const Call& c) { return f(c.src, c.dst, c.size); }
#define M(f, how, ...) \
  { #f, RUN_##how(f), __VA_ARGS__ }

const std::vector<Member>& members() {
  static const std::vector<Member> all = {
      // 4:2:0, luma and chroma pairs
      M(zeliYCbCr420ToRGB_8u_P2C3R, P2, kPairs, kRgb, pairRawA, evenPart, pairRawA),
      M(zeliYCbCr420ToRGB_8u_P2C4R, P2A, kPairs, kRgba, pairRawA, evenPart, pairRawA),
      M(zeliYCbCr420ToBGR_8u_P2C3R, P2, kPairs, kBgr, pairRawA, evenPart, pairRawA),
      M(zeliYCbCr420ToBGR_8u_P2C4R, P2A, kPairs, kBgra, pairRawA, evenPart, pairRawA),
      M(zeliYCrCb420ToRGB_8u_P2C3R, P2, kPairsCr, kRgb, pairRawA, evenPart, pairRawA),
      M(zeliYCrCb420ToRGB_8u_P2C4R, P2A, kPairsCr, kRgba, pairRawA, evenPart, pairRawA),
      M(zeliYCrCb420ToBGR_8u_P2C3R, P2, kPairsCr, kBgr, pairRawA, evenPart, pairRawA),
      M(zeliYCrCb420ToBGR_8u_P2C4R, P2A, kPairsCr, kBgra, pairRawA, evenPart, pairRawA),
      // 4:2:0 planes
      M(zeliYCbCr420ToBGR_8u_P3C4R, P3A, kPlanes420, kBgra, pairRawA, evenPart, pairRawA),
      M(zeliYCrCb420ToRGB_8u_P3C4R, P3A, kPlanes420Cr, kRgba, pairRawA, evenPart, pairRawA),
      M(zeliYCbCr420ToBGR_8u_P3C3R, P3, kPlanes420, kBgr, lanes601b_, halfGroupsOf4, wide601aRounded, 1, 1, false,
        false, pairCentredA),
      M(zeliYCbCr420ToRGB_8u_P3C3R, P3, kPlanes420, kRgb, lanes601b_, halfGroupsOf4, wide601aRounded),
      M(zeliYCbCr420ToBGR_709CSC_8u_P3C3R, P3, kPlanes420, kBgr, lanes709_, halfGroupsOf4, wide709Rounded),
      M(zeliYCbCr420ToBGR_709HDTV_8u_P3C4R, P3A, kPlanes420, kBgra, hdtv, halfGroupsOf4, wideHdtvRounded),
      // Cb Y0 Cr Y1 streams
      M(zeliCbYCr422ToBGR_709HDTV_8u_C2C3R, C2, kStreamCbYCr, kBgr, hdtv, andNot7, wideHdtvRounded),
      M(zeliCbYCr422ToBGR_709HDTV_8u_C2C4R, C2A, kStreamCbYCr, kBgra, hdtv, andNot7, wideHdtvRounded),
      M(zeliCbYCr422ToBGR_8u_C2C4R, C2A, kStreamCbYCr, kBgra, lanes601b_, andNot7, wide601bRounded),
      M(zeliCbYCr422ToRGB_8u_C2C3R, C2, kStreamCbYCr, kRgb, lanes601b_, andNot7, wide601bRounded),
      // 4:1:1
      M(zeliYCbCr411ToBGR_8u_P3C3R, P3, kPlanes411, kBgr, lanes601a_, blocksOf8Then4, wide411Rounded, 4),
      M(zeliYCbCr411ToBGR_8u_P3C4R, P3A, kPlanes411, kBgra, lanes601a_, blocksOf8Then4, wide411Rounded, 4),
      // Y0 Cb Y1 Cr streams and 4:2:2 planes
      M(zeliYCbCr422ToBGR_8u_C2C3R, C2, kStreamYCbCr, kBgr, lanes601b_, by16Plus8, raw, 2),
      M(zeliYCbCr422ToBGR_8u_C2C4R, C2A, kStreamYCbCr, kBgra, lanes601b_, by16Plus8, raw, 2),
      M(zeliYCbCr422ToBGR_8u_P3C3R, P3, kPlanes422, kBgr, lanes601b_, by16Plus8, raw),
      M(zeliYCbCr422ToRGB_8u_C2C3R, C2, kStreamYCbCr, kRgb, lanes601a_, evenPart, raw),
      M(zeliYCbCr422ToRGB_8u_C2P3R, C2P3, kStreamYCbCr, kRgbPlanes, lanes601a_, evenPart, raw),
      M(zeliYCrCb422ToRGB_8u_C2P3R, C2P3, kStreamYCrCb, kRgbPlanes, lanes601a_, evenPart, raw),
      M(zeliYCbCr422ToRGB_8u_C2C4R, C2A, kStreamYCbCr, kRgba, pairRawB, evenPart, wide601aRounded),
      M(zeliYCbCr422ToRGB_8u_P3C3R, P3, kPlanes422, kRgb, lanes601b_, andNot7, wide601bTruncated, 1, 1, false, false,
        pairCentredA),
      // Y0 Cr Y1 Cb streams
      M(zeliYCrCb422ToRGB_8u_C2C3R, C2, kStreamYCrCb, kRgb, pairRawB, andNot7, wide601aRounded),
      M(zeliYCrCb422ToRGB_8u_C2C4R, C2A, kStreamYCrCb, kRgba, pairRawB, andNot7, wide601aRounded),
      M(zeliYCrCb422ToBGR_8u_C2C3R, C2, kStreamYCrCb, kBgr, pairRawB, andNot7, wide601aRounded),
      M(zeliYCrCb422ToBGR_8u_C2C4R, C2A, kStreamYCrCb, kBgra, pairRawB, andNot7, wide601aRounded),
      // YUV 4:2:0
      M(zeliYUV420ToRGB_8u_P3R, P3P3, kPlanes420, kRgbPlanes, yuvWideTruncated, none, yuvWideTruncated),
      M(zeliYUV420ToRGB_8u_P3, P3P3_, kPlanes420, kRgbPlanes, yuvWideTruncated, none, yuvWideTruncated, 1, 1, true),
      M(zeliYUV420ToRGB_8u_P3C3R, P3, kPlanes420, kRgb, halves2, evenPart, halves2),
      M(zeliYUV420ToRGB_8u_P3C3, P3C3_, kPlanes420, kRgb, halves2, evenPart, halves2, 1, 1, true),
      M(zeliYUV420ToBGR_8u_P3C3R, P3, kPlanes420, kBgr, halves1, evenPart, halves1, 2, 2),
      M(zeliYUV420ToRGB_8u_P3AC4R, P3, kPlanes420, kRgbZero, yuvQuad, halfPairsOf2, yuvWideRounded),
      // YUV 4:2:2
      M(zeliYUV422ToRGB_8u_C2C3R, C2, kStreamYCbCr, kRgb, halves2, andNot15, yuvWideRounded),
      M(zeliYUV422ToRGB_8u_P3C3R, P3, kPlanes422, kRgb, halves2, andNot15, yuvWideTruncated),
      M(zeliYUV422ToRGB_8u_P3C3, P3C3_, kPlanes422, kRgb, halves2, andNot15, yuvWideTruncated, 1, 1, true, true),
      M(zeliYUV422ToRGB_8u_P3R, P3P3, kPlanes422, kRgbPlanes, halves2, andNot15, yuvWideTruncated),
      M(zeliYUV422ToRGB_8u_P3, P3P3_, kPlanes422, kRgbPlanes, halves2, andNot15, yuvWideTruncated, 1, 1, true, true),
      M(zeliYUV422ToRGB_8u_P3AC4R, P3, kPlanes422, kRgbZero, yuvQuad, blocksOf8Then4, yuvWideTruncated),
  };
  return all;
}

// ---- the images of one call ----

struct Placement {
  int offset = 1;        // bytes past a 64-byte boundary, for every buffer
  int pad = 0;           // bytes after each row
  bool aligned = false;  // every pointer and step a multiple of 16
};

struct Images {
  const Member& m;
  int width, height;
  std::vector<TestImage<uint8_t>> src, dst;

  Images(const Member& member, int w, int h, const Placement& at, uint32_t seed) : m(member), width(w), height(h) {
    const int cw = (w + m.src.spreadX - 1) / m.src.spreadX, ch = (h + m.src.spreadY - 1) / m.src.spreadY;
    std::vector<std::pair<int, int>> planes;  // bytes of a row, rows
    if (m.src.kind == SrcKind::Stream) {
      planes = {{4 * ((w + 1) / 2), h}};  // a last odd pixel's pair is whole
    } else if (m.src.kind == SrcKind::Pairs) {
      planes = {{w, h}, {2 * cw, ch}};
    } else if (m.implied) {
      const int c = is420(m) ? w / 2 : w / 2 + (w & 1);
      planes = {{w, h}, {c, ch}, {c, ch}};
    } else {
      planes = {{w, h}, {cw, ch}, {cw, ch}};
    }
    int k = 0;
    for (auto [bytes, rows] : planes) {
      src.push_back(make(bytes, rows, at, k, k + 1));
      ++k;
    }
    const int dstPlanes = m.dst.kind == DstKind::P3 ? 3 : 1;
    const int dstBytes = m.dst.kind == DstKind::C3 ? 3 * w : m.dst.kind == DstKind::C4 ? 4 * w : w;
    // The planes of a destination set share one step.
    for (int p = 0; p < dstPlanes; ++p) dst.push_back(make(dstBytes, h, at, k++, 0));
    uint32_t s = seed;
    for (auto& img : src) img.fillRandom(s++);
    for (auto& img : dst) img.fill(kUnwritten);
  }

  // Buffer k; `spread` varies the padding between buffers.
  TestImage<uint8_t> make(int bytes, int rows, const Placement& at, int k, int spread) const {
    if (m.implied) return TestImage<uint8_t>(bytes, rows, at.offset + 16 * k, 0);
    if (at.aligned) return TestImage<uint8_t>(bytes, rows, 0, (16 - bytes % 16) % 16 + 16 * (spread & 1));
    return TestImage<uint8_t>(bytes, rows, at.offset + 2 * k, at.pad + spread);
  }

  Call call() {
    Call c{};
    for (size_t k = 0; k < src.size(); ++k) {
      c.src[k] = src[k].data();
      c.srcSteps[k] = src[k].step();
    }
    for (size_t k = 0; k < dst.size(); ++k) c.dst[k] = dst[k].data();
    c.dstStep = dst[0].step();
    c.size = ImageSize{width, height};
    return c;
  }

  int luma(int x, int y) const {
    if (m.src.kind != SrcKind::Stream) return src[0].get(x, y);
    const zel::repack::PairSlots s = zel::repack::slotsOf(m.src.order);
    return src[0].get(4 * (x / 2) + (x % 2 ? s.y1 : s.y0), y);
  }
  void chroma(int x, int y, int& u, int& v) const {
    const int cx = x / m.src.spreadX, cy = y / m.src.spreadY;
    int a, b;
    if (m.src.kind == SrcKind::Stream) {
      const zel::repack::PairSlots s = zel::repack::slotsOf(m.src.order);
      a = src[0].get(4 * cx + s.cb, y);
      b = src[0].get(4 * cx + s.cr, y);
    } else if (m.src.kind == SrcKind::Pairs) {
      a = src[1].get(2 * cx, cy);
      b = src[1].get(2 * cx + 1, cy);
    } else {
      a = src[1].get(cx, cy);
      b = src[2].get(cx, cy);
    }
    u = m.src.crFirst ? b : a;
    v = m.src.crFirst ? a : b;
  }

  bool written(int x, int y) const { return !is420(m) || (x < (width & ~1) && y < (height & ~1)); }

  // The form of a pixel: its place in the row decides, or its place in the
  // whole image when the image is taken as one row.
  Rgb8 expected(int x, int y, Form body) const {
    const long long n = (long long)width * height;
    const bool whole = m.wholeRow && n >= 256 && width % 2 == 0;
    const int at = whole ? y * width + x : x;
    const int end = whole ? int(n) & ~15 : m.bodyEnd(width);
    int u, v;
    chroma(x, y, u, v);
    return (at < end ? body : m.tail)(luma(x, y), u, v);
  }

  // "" when every pixel and every byte around the rows is as the model says.
  std::string check(Form body) const {
    const int n = m.dst.kind == DstKind::C4 ? 4 : 3;
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) {
        int want[4] = {kUnwritten, kUnwritten, kUnwritten, kUnwritten};
        if (written(x, y)) {
          const Rgb8 p = expected(x, y, body);
          want[0] = m.dst.bgr ? p.b : p.r;
          want[1] = p.g;
          want[2] = m.dst.bgr ? p.r : p.b;
          want[3] = m.dst.zeroFourth ? 0 : kAlpha;
        }
        for (int c = 0; c < n; ++c) {
          const int got = m.dst.kind == DstKind::P3 ? dst[c].get(x, y) : dst[0].get(n * x + c, y);
          if (got != want[c])
            return "pixel " + std::to_string(x) + "," + std::to_string(y) + " byte " + std::to_string(c) + ": " +
                   std::to_string(got) + " for " + std::to_string(want[c]);
        }
      }
    for (const auto& d : dst)
      if (!d.guardsIntact()) return "a byte outside the rows changed";
    return "";
  }
};

Status expectedStatus(const Member& m, int w, int h) {
  return is420(m) && ((w | h) & 1) ? StatusOddSizeWarning : StatusOk;
}

void sweep(const Member& m, const Placement& base, Form body) {
  for (int h = m.minHeight; h <= 5; ++h)
    for (int w = m.minWidth; w <= 70; ++w) {
      Placement at = base;
      at.offset = base.offset + 2 * ((w + h) % 3);
      at.pad = base.pad + (w % 5);
      Images img(m, w, h, at, uint32_t(w * 977 + h));
      const Status s = m.run(img.call());
      ASSERT_EQ(int(s), int(expectedStatus(m, w, h))) << m.name << " " << w << "x" << h;
      const std::string fault = img.check(body);
      ASSERT_EQ(fault, "") << m.name << " " << w << "x" << h << " offset " << at.offset;
    }
}

class Members : public ::testing::TestWithParam<const Member*> {};

TEST_P(Members, EveryPixelTakesTheFormOfItsZone) {
  const Member& m = *GetParam();
  sweep(m, Placement{1, 0, false}, m.body);
}

TEST_P(Members, AlignedBuffersChooseTheirKernel) {
  const Member& m = *GetParam();
  if (m.implied) GTEST_SKIP() << "steps are implied";
  sweep(m, Placement{0, 0, true}, m.alignedBody ? m.alignedBody : m.body);
}

std::vector<const Member*> allMembers() {
  std::vector<const Member*> out;
  for (const Member& m : members()) out.push_back(&m);
  return out;
}

INSTANTIATE_TEST_SUITE_P(SubsampledToRgb, Members, ::testing::ValuesIn(allMembers()),
                         [](const ::testing::TestParamInfo<const Member*>& info) { return info.param->name; });

TEST(SubsampledToRgbMembers, TableHoldsEveryMemberOnce) {
  std::vector<std::string> names;
  for (const Member& m : members()) names.push_back(m.name);
  std::sort(names.begin(), names.end());
  EXPECT_EQ(std::unique(names.begin(), names.end()), names.end());
  EXPECT_EQ(names.size(), 44u);
}

}  // namespace
