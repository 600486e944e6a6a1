// Rows of the full-resolution YCbCr conversions: the vector kernels against
// their scalar forms, and every export's body and tail zones, layouts,
// alpha and argument checks.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/rgb_to_ycbcr_forms.h"
#include "luma_chroma/ycbcr_lanes.h"
#include "luma_chroma/yuv_lane_check.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::lc;
using zel::VectorTier;
using zel::test::TestImage;

// ---- kernels: vector blocks against the scalar form ----

// A buffer with guard bytes on both sides and its first byte `offset`
// bytes past a 64-byte boundary.
struct Guarded {
  std::vector<uint8_t> bytes;
  uint8_t* first;
  // Random bytes, one in four of them an edge value of the formulas.
  Guarded(int size, int offset, uint32_t seed) : bytes(size_t(size) + 192) {
    static const uint8_t edges[] = {0, 1, 15, 16, 17, 127, 128, 129, 234, 235, 236, 239, 240, 241, 254, 255};
    std::mt19937 rng(seed);
    for (uint8_t& b : bytes) {
      const uint32_t r = rng();
      b = (r & 3) == 0 ? edges[(r >> 2) & 15] : uint8_t(r >> 24);
    }
    first = bytes.data() + 64;
    first += (64 - (reinterpret_cast<uintptr_t>(first) & 63u)) & 63u;
    first += offset;
  }
};

// Converts rows of every width 1..70 and some past 128 at odd offsets
// through a blocked row function (on every vector tier the processor has)
// and through the scalar form alone; the two buffers must agree byte for
// byte, guards included.
template <class Blocked, class Scalar>
void rowsAgree(int inBytes, int outBytes, Blocked blocked, Scalar scalar, const std::vector<VectorTier>& tiers) {
  for (VectorTier tier : tiers)
    for (int width : zel::lc::test::rowWidths())
      for (int offset : {0, 1, 3, 7}) {
        const uint32_t seed = uint32_t(width * 16 + offset);
        const Guarded src(width * inBytes, offset, seed);
        Guarded vector(width * outBytes, (offset * 5) & 15, seed + 1);
        Guarded plain = vector;
        plain.first = plain.bytes.data() + (vector.first - vector.bytes.data());
        blocked(src.first, vector.first, width, tier);
        scalar(src.first, plain.first, width);
        ASSERT_TRUE(vector.bytes == plain.bytes)
            << "width " << width << " offset " << offset << " " << zel::tierName(tier);
      }
}

template <class Form, class MakeIn, class MakeOut>
void kernelMatchesScalar(const Form& form, int inBytes, int outBytes, MakeIn makeIn, MakeOut makeOut,
                         const std::vector<VectorTier>& tiers = zel::lc::test::rowTiers()) {
  rowsAgree(
      inBytes, outBytes,
      [&](const uint8_t* s, uint8_t* d, int w, VectorTier tier) {
        convertRow(makeIn(s, w), makeOut(d, w), w, w, form, form, tier);
      },
      [&](const uint8_t* s, uint8_t* d, int w) { formPixels(makeIn(s, w), makeOut(d, w), 0, w, form); }, tiers);
}

// The wide forms four pixels at a time, the fourth byte kept.
template <class Form>
void keepAlphaMatchesScalar(const Form& form) {
  rowsAgree(
      4, 4, [&](const uint8_t* s, uint8_t* d, int w, VectorTier) { keepAlphaRow(s, d, w, form); },
      [&](const uint8_t* s, uint8_t* d, int w) { formPixels(PackedIn<4>{s}, PackedOutKeep{d}, 0, w, form); },
      {VectorTier::Sse41});
}

auto planesIn = [](const uint8_t* p, int width) { return PlanesIn{p, p + width, p + 2 * width}; };
auto planesOut = [](uint8_t* p, int width) { return PlanesOut{p, p + width, p + 2 * width}; };
template <int Stride>
PackedIn<Stride> packedIn(const uint8_t* p, int) {
  return {p};
}
template <bool Reverse>
PackedOut3<Reverse> packedOut(uint8_t* p, int) {
  return {p};
}
template <bool Reverse>
PackedOutAlpha<Reverse> alphaOut(uint8_t* p, int) {
  return {p, 0xA5};
}

TEST(YCbCrKernels, ForwardBlocksMatchTheScalarForms) {
  kernelMatchesScalar(RoundedFwd{}, 3, 3, packedIn<3>, packedOut<false>);
  kernelMatchesScalar(HighWordFwd{}, 3, 3, packedIn<3>, planesOut);
  kernelMatchesScalar(HighWordFwd{}, 4, 3, packedIn<4>, planesOut);
  kernelMatchesScalar(HighWordFwd{}, 3, 3, planesIn, planesOut);
  keepAlphaMatchesScalar(WideFwd{});
}

TEST(YCbCrKernels, InverseBlocksMatchTheScalarForms) {
  kernelMatchesScalar(LaneAddedForm{lanes601a, 8}, 3, 3, packedIn<3>, packedOut<false>);
  kernelMatchesScalar(LaneAddedForm{lanes601a, 0}, 3, 3, planesIn, planesOut);
  kernelMatchesScalar(LaneAddedBytes<lanes601a, 8>{}, 3, 3, packedIn<3>, packedOut<false>);
  kernelMatchesScalar(LaneAddedBytes<lanes601a, 0>{}, 3, 3, planesIn, planesOut);
  kernelMatchesScalar(LaneAddedForm{lanes601b, 8}, 3, 3, planesIn, packedOut<false>);
  kernelMatchesScalar(LaneAddedForm{lanes709, 8}, 3, 3, planesIn, packedOut<true>);
  kernelMatchesScalar(LaneSubtractedForm{lanes601b}, 3, 4, planesIn, alphaOut<false>);
  kernelMatchesScalar(LaneSubtractedForm{lanes709}, 3, 4, planesIn, alphaOut<true>);
  for (int32_t round : {0, 32768}) {
    keepAlphaMatchesScalar(WideRgbForm{wide601a, round});
    keepAlphaMatchesScalar(WideRgbForm{wide601b, round});
  }
}

// The byte forms regroup the arithmetic of the lane form; every sample
// triple takes the same bits. Rows of every Y at each Cb and Cr.
template <class Form>
void everyTripleMatches(const Form& form) {
  std::vector<uint8_t> src(256 * 3), got(256 * 3), want(256 * 3);
  for (VectorTier tier : zel::lc::test::rowTiers()) {
    for (int cb = 0; cb < 256; ++cb)
      for (int cr = 0; cr < 256; ++cr) {
        for (int y = 0; y < 256; ++y) {
          src[3 * y] = uint8_t(y);
          src[3 * y + 1] = uint8_t(cb);
          src[3 * y + 2] = uint8_t(cr);
        }
        convertRow(PackedIn<3>{src.data()}, PackedOut3<false>{got.data()}, 256, 256, form, form, tier);
        formPixels(PackedIn<3>{src.data()}, PackedOut3<false>{want.data()}, 0, 256, form);
        ASSERT_TRUE(got == want) << "Cb " << cb << " Cr " << cr << " " << zel::tierName(tier);
      }
  }
}

// A form that gives back its samples: the 64-pixel blocks through it must
// return every byte to its own pixel and channel, whatever the layouts.
struct SameSamples {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return s; }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return s;
  }
};

TEST(YCbCrKernels, Blocks512MoveEveryByteToItsPixel) {
  if (!zel::hasAvx512Vbmi()) GTEST_SKIP() << "no 512-bit tier with byte permutes";
  const std::vector<VectorTier> wide{VectorTier::Avx512};
  const SameSamples same;
  kernelMatchesScalar(same, 3, 3, packedIn<3>, packedOut<false>, wide);
  kernelMatchesScalar(same, 3, 3, packedIn<3>, packedOut<true>, wide);
  kernelMatchesScalar(same, 3, 3, packedIn<3>, planesOut, wide);
  kernelMatchesScalar(same, 4, 3, packedIn<4>, planesOut, wide);
  kernelMatchesScalar(same, 3, 3, planesIn, planesOut, wide);
  kernelMatchesScalar(same, 3, 3, planesIn, packedOut<true>, wide);
  kernelMatchesScalar(same, 3, 4, planesIn, alphaOut<false>, wide);
  kernelMatchesScalar(same, 3, 4, planesIn, alphaOut<true>, wide);
  kernelMatchesScalar(same, 4, 4, packedIn<4>, [](uint8_t* p, int) { return PackedOutKeep{p}; }, wide);
}

TEST(YCbCrKernels, ByteFormsGiveTheLaneFormForEverySample) {
  everyTripleMatches(LaneAddedBytes<lanes601a, 8>{});
  everyTripleMatches(LaneAddedBytes<lanes601a, 0>{});
}

// ---- exports: zones, layouts, alpha ----

enum class Layout { C3, AC4, C4, P3 };

// One image side of a call: three planes or one interleaved buffer.
struct Side {
  Layout layout;
  std::vector<TestImage<uint8_t>> images;
  std::vector<uint8_t*> planes;
  bool flipped = false;
  Side(Layout l, int width, int height, int offset, int pad) : layout(l) {
    const int stride = l == Layout::C3 ? 3 : l == Layout::P3 ? 1 : 4;
    for (int p = 0; p < (l == Layout::P3 ? 3 : 1); ++p) images.emplace_back(width * stride, height, offset + p, pad);
    for (auto& im : images) planes.push_back(im.data());
  }
  uint8_t* ptr() { return planes[0]; }
  int step() const { return flipped ? -images[0].step() : images[0].step(); }
  // Addresses the image from its last row with a negative step.
  void flip() {
    flipped = true;
    for (size_t p = 0; p < images.size(); ++p) planes[p] = images[p].row(images[p].rows() - 1);
  }
  uint8_t* const* planeArray() { return planes.data(); }
  int get(int x, int y, int c) const {
    switch (layout) {
      case Layout::P3: return images[c].get(x, y);
      case Layout::C3: return images[0].get(3 * x + c, y);
      default: return images[0].get(4 * x + c, y);
    }
  }
  bool guardsIntact() const {
    for (const auto& im : images)
      if (!im.guardsIntact()) return false;
    return true;
  }
};

using Form = std::function<Samples3(const Samples3&)>;
template <class F>
Form formOf(F f) {
  return [f](const Samples3& s) { return f.pixel(s); };
}

struct Member {
  const char* name;
  Layout src, dst;
  bool reverse;
  std::function<Status(Side&, Side&, ImageSize, uint8_t alpha)> call;
  Form body, tail;
  int (*bodyEnd)(int width);
};

int andNot15(int w) { return w & ~15; }
int andNot7(int w) { return w & ~7; }
int andNot3(int w) { return w & ~3; }
int none(int) { return 0; }
int all(int w) { return w; }

// Calls by argument shape: interleaved or planes on each side, alpha.
template <auto F>
Status packedToPacked(Side& s, Side& d, ImageSize z, uint8_t) {
  return F(s.ptr(), s.step(), d.ptr(), d.step(), z);
}
template <auto F>
Status packedToPlanes(Side& s, Side& d, ImageSize z, uint8_t) {
  return F(s.ptr(), s.step(), d.planeArray(), d.step(), z);
}
template <auto F>
Status planesToPlanes(Side& s, Side& d, ImageSize z, uint8_t) {
  return F(s.planeArray(), s.step(), d.planeArray(), d.step(), z);
}
template <auto F>
Status planesToPacked(Side& s, Side& d, ImageSize z, uint8_t) {
  return F(s.planeArray(), s.step(), d.ptr(), d.step(), z);
}
template <auto F>
Status planesToAlpha(Side& s, Side& d, ImageSize z, uint8_t a) {
  return F(s.planeArray(), s.step(), d.ptr(), d.step(), z, a);
}

const std::vector<Member>& members() {
  using L = Layout;
  const Form wideFwd = formOf(WideFwd{}), highWord = formOf(HighWordFwd{});
  const Form wideA = formOf(WideRgbForm{wide601a, 0}), wideB = formOf(WideRgbForm{wide601b, 0});
  const Form wideRoundedA = formOf(WideRgbForm{wide601a, 32768}), wideRoundedB = formOf(WideRgbForm{wide601b, 32768});
  static const std::vector<Member> list = {
      {"zeliRGBToYCbCr_8u_C3R", L::C3, L::C3, false, packedToPacked<zeliRGBToYCbCr_8u_C3R>, formOf(RoundedFwd{}),
       wideFwd, andNot15},
      {"zeliRGBToYCbCr_8u_AC4R", L::AC4, L::AC4, false, packedToPacked<zeliRGBToYCbCr_8u_AC4R>, wideFwd, wideFwd, none},
      {"zeliRGBToYCbCr_8u_C3P3R", L::C3, L::P3, false, packedToPlanes<zeliRGBToYCbCr_8u_C3P3R>, highWord, wideFwd,
       andNot7},
      {"zeliRGBToYCbCr_8u_AC4P3R", L::AC4, L::P3, false, packedToPlanes<zeliRGBToYCbCr_8u_AC4P3R>, highWord, wideFwd,
       andNot7},
      {"zeliRGBToYCbCr_8u_P3R", L::P3, L::P3, false, planesToPlanes<zeliRGBToYCbCr_8u_P3R>, highWord, wideFwd, andNot7},
      {"zeliYCbCrToRGB_8u_AC4R", L::AC4, L::AC4, false, packedToPacked<zeliYCbCrToRGB_8u_AC4R>, wideA, wideA, none},
      {"zeliYCbCrToRGB_8u_C3R", L::C3, L::C3, false, packedToPacked<zeliYCbCrToRGB_8u_C3R>,
       formOf(LaneAddedForm{lanes601a, 8}), wideA, andNot3},
      {"zeliYCbCrToRGB_8u_P3R", L::P3, L::P3, false, planesToPlanes<zeliYCbCrToRGB_8u_P3R>,
       formOf(LaneAddedForm{lanes601a, 0}), wideRoundedA, andNot3},
      {"zeliYCbCrToRGB_8u_P3C3R", L::P3, L::C3, false, planesToPacked<zeliYCbCrToRGB_8u_P3C3R>,
       formOf(LaneAddedForm{lanes601b, 8}), wideB, andNot7},
      {"zeliYCbCrToRGB_8u_P3C4R", L::P3, L::C4, false, planesToAlpha<zeliYCbCrToRGB_8u_P3C4R>,
       formOf(LaneSubtractedForm{lanes601b}), wideRoundedB, andNot7},
      {"zeliYCbCrToBGR_8u_P3C3R", L::P3, L::C3, true, planesToPacked<zeliYCbCrToBGR_8u_P3C3R>,
       formOf(LaneAddedForm{lanes601b, 8}), nullptr, all},
      {"zeliYCbCrToBGR_8u_P3C4R", L::P3, L::C4, true, planesToAlpha<zeliYCbCrToBGR_8u_P3C4R>,
       formOf(LaneSubtractedForm{lanes601b}), nullptr, all},
      {"zeliYCbCrToBGR_709CSC_8u_P3C3R", L::P3, L::C3, true, planesToPacked<zeliYCbCrToBGR_709CSC_8u_P3C3R>,
       formOf(LaneAddedForm{lanes709, 8}), nullptr, all},
      {"zeliYCbCrToBGR_709CSC_8u_P3C4R", L::P3, L::C4, true, planesToAlpha<zeliYCbCrToBGR_709CSC_8u_P3C4R>,
       formOf(LaneSubtractedForm{lanes709}), nullptr, all},
  };
  return list;
}

// Converts random images and checks every pixel against the form of its
// zone, the alpha byte, and the bytes around the region.
void checkMember(const Member& m, int width, int height, int srcOffset, int dstOffset) {
  Side src(m.src, width, height, srcOffset, 5);
  Side dst(m.dst, width, height, dstOffset, 7);
  for (auto& im : src.images) im.fillRandom(uint32_t(width * 97 + srcOffset));
  for (auto& im : dst.images) im.fillRandom(uint32_t(width * 89 + dstOffset + 1));
  const Side before = dst;
  const uint8_t alpha = uint8_t(width * 37 + 11);
  ASSERT_EQ(m.call(src, dst, ImageSize{width, height}, alpha), StatusOk);
  const int n = m.bodyEnd(width);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      const Samples3 in{src.get(x, y, 0), src.get(x, y, 1), src.get(x, y, 2)};
      const Samples3 want = x < n ? m.body(in) : m.tail(in);
      const int got[3] = {dst.get(x, y, m.reverse ? 2 : 0), dst.get(x, y, 1), dst.get(x, y, m.reverse ? 0 : 2)};
      ASSERT_TRUE(got[0] == want.c0 && got[1] == want.c1 && got[2] == want.c2)
          << m.name << " width " << width << " pixel " << x << "," << y << (x < n ? " (body)" : " (tail)");
      if (m.dst == Layout::C4) ASSERT_EQ(dst.get(x, y, 3), alpha) << m.name << " alpha of pixel " << x;
      if (m.dst == Layout::AC4) ASSERT_EQ(dst.get(x, y, 3), before.get(x, y, 3)) << m.name << " pixel " << x;
    }
  ASSERT_TRUE(dst.guardsIntact()) << m.name << " width " << width;
}

TEST(YCbCrExports, EveryWidthTakesItsZones) {
  for (const Member& m : members())
    for (int width : zel::lc::test::rowWidths())
      for (int offsets : {0, 1, 2}) {
        checkMember(m, width, 3, offsets * 3, offsets * 5 % 7);
        if (HasFatalFailure()) return;
      }
}

// A negative step walks the image upwards from the first row given: a
// source addressed from its last row gives the rows mirrored.
TEST(YCbCrExports, NegativeStepsWalkUpwards) {
  for (const Member& m : members()) {
    const int width = 37, height = 4;
    Side src(m.src, width, height, 1, 3), plain(m.dst, width, height, 2, 0), mirrored(m.dst, width, height, 2, 0);
    for (auto& im : src.images) im.fillRandom(9);
    ASSERT_EQ(m.call(src, plain, ImageSize{width, height}, 9), StatusOk);
    src.flip();
    ASSERT_EQ(m.call(src, mirrored, ImageSize{width, height}, 9), StatusOk);
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x)
        for (int c = 0; c < 3; ++c)
          ASSERT_EQ(plain.get(x, y, c), mirrored.get(x, height - 1 - y, c)) << m.name << " pixel " << x << "," << y;
    ASSERT_TRUE(mirrored.guardsIntact()) << m.name;
  }
}

// The width decides the zones: a row of pure red takes Y 82 in the wide
// tail and 81 in the rounded body of 16-pixel blocks.
TEST(YCbCrExports, WidthDecidesTheForm) {
  for (int width : {15, 16, 17, 31, 32}) {
    std::vector<uint8_t> src(size_t(width) * 3), dst(size_t(width) * 3 + 1, 0xEE);
    for (int x = 0; x < width; ++x) src[3 * x] = 255;
    ASSERT_EQ(zeliRGBToYCbCr_8u_C3R(src.data(), 0, dst.data(), 0, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x) {
      const bool body = x < (width & ~15);
      EXPECT_EQ(dst[3 * x], body ? 81 : 82) << "width " << width << " pixel " << x;
      EXPECT_EQ(dst[3 * x + 2], body ? 239 : 240) << "width " << width << " pixel " << x;
    }
    EXPECT_EQ(dst.back(), 0xEE);
  }
}

// Neutral Y 235 by member and zone: the bodies of the C3 member round
// (255) and its tail truncates (254); the planar member drops the rounding
// term in its body (254) and rounds in its tail (255).
TEST(YCbCrExports, NeutralWhiteByMemberAndZone) {
  const int width = 7;  // body 0..3, tail 4..6
  std::vector<uint8_t> packed(width * 4), plane0(width, 235), plane1(width, 128), plane2(width, 128);
  for (int x = 0; x < width; ++x) {
    packed[4 * x] = 235;
    packed[4 * x + 1] = packed[4 * x + 2] = 128;
    packed[4 * x + 3] = uint8_t(x);
  }
  std::vector<uint8_t> c3(width * 3), ac4(width * 4, 0x11), r(width), g(width), b(width);
  ASSERT_EQ(zeliYCbCrToRGB_8u_AC4R(packed.data(), 0, ac4.data(), 0, ImageSize{width, 1}), StatusOk);
  // The C3 source is the same samples without the fourth byte.
  std::vector<uint8_t> src3;
  for (int x = 0; x < width; ++x) src3.insert(src3.end(), {235, 128, 128});
  ASSERT_EQ(zeliYCbCrToRGB_8u_C3R(src3.data(), 0, c3.data(), 0, ImageSize{width, 1}), StatusOk);
  const uint8_t* const srcPlanes[3] = {plane0.data(), plane1.data(), plane2.data()};
  uint8_t* const dstPlanes[3] = {r.data(), g.data(), b.data()};
  ASSERT_EQ(zeliYCbCrToRGB_8u_P3R(srcPlanes, 0, dstPlanes, 0, ImageSize{width, 1}), StatusOk);
  for (int x = 0; x < width; ++x) {
    const bool body = x < 4;
    for (int c = 0; c < 3; ++c) {
      EXPECT_EQ(ac4[4 * x + c], 254) << "AC4 pixel " << x;
      EXPECT_EQ(c3[3 * x + c], body ? 255 : 254) << "C3 pixel " << x;
    }
    EXPECT_EQ(ac4[4 * x + 3], 0x11);
    EXPECT_EQ(r[x], body ? 254 : 255) << "P3 pixel " << x;
    EXPECT_EQ(g[x], r[x]);
    EXPECT_EQ(b[x], r[x]);
  }
}

// Plane entries are tested after the size where the member says so, and
// with the pointers elsewhere.
TEST(YCbCrExports, PlaneEntriesAndSize) {
  uint8_t buffer[64] = {};
  const uint8_t* const srcMissing[3] = {buffer, nullptr, buffer};
  uint8_t* const dstMissing[3] = {buffer, buffer, nullptr};
  const uint8_t* const srcPlanes[3] = {buffer, buffer, buffer};
  uint8_t* const dstPlanes[3] = {buffer, buffer, buffer};
  const ImageSize empty{0, 1};
  EXPECT_EQ(zeliRGBToYCbCr_8u_P3R(srcMissing, 4, dstPlanes, 4, empty), StatusSizeError);
  EXPECT_EQ(zeliRGBToYCbCr_8u_P3R(srcMissing, 4, dstPlanes, 4, ImageSize{1, 1}), StatusNullPointerError);
  EXPECT_EQ(zeliRGBToYCbCr_8u_C3P3R(buffer, 4, dstMissing, 4, empty), StatusNullPointerError);
  EXPECT_EQ(zeliRGBToYCbCr_8u_AC4P3R(buffer, 4, dstMissing, 4, empty), StatusNullPointerError);
  EXPECT_EQ(zeliYCbCrToRGB_8u_P3R(srcPlanes, 4, dstMissing, 4, empty), StatusSizeError);
  EXPECT_EQ(zeliYCbCrToRGB_8u_P3C3R(srcMissing, 4, buffer, 4, empty), StatusSizeError);
  EXPECT_EQ(zeliYCbCrToRGB_8u_P3C4R(srcMissing, 4, buffer, 4, empty, 0), StatusSizeError);
  EXPECT_EQ(zeliYCbCrToBGR_8u_P3C3R(srcMissing, 4, buffer, 4, empty), StatusNullPointerError);
  EXPECT_EQ(zeliYCbCrToBGR_709CSC_8u_P3C4R(srcMissing, 4, buffer, 4, empty, 0), StatusNullPointerError);
  for (uint8_t v : buffer) EXPECT_EQ(v, 0);
}

}  // namespace
