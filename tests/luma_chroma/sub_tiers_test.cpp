// Whole calls of the subsampling members at every vector tier: the same
// image through the SSE4.1 blocks alone, with AVX2 blocks first and with
// 512-bit blocks first gives the same bytes everywhere, padding and the
// unwritten last row and column included. Sizes cover widths past two
// 512-bit blocks, odd widths and heights, odd steps and misaligned planes,
// and the fully aligned buffers that choose another kernel.
#include <gtest/gtest.h>

#include <functional>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "luma_chroma/vector_units.h"
#include "zelcc/zelcc.h"

namespace {

using zel::VectorTier;

// Up to three planes in one buffer: plane k has rows[k] rows of bytes[k]
// bytes. Unaligned: every plane starts at an odd offset and its step has a
// few bytes of odd padding. Aligned: 64-byte plane starts, steps a multiple
// of 16.
struct PlaneSet {
  std::vector<uint8_t> storage;
  uint8_t* plane[3] = {};
  int step[3] = {};

  PlaneSet(const PlaneSet&) = delete;
  PlaneSet(PlaneSet&&) = default;
  PlaneSet(std::initializer_list<std::pair<int, int>> shapes, bool aligned, uint32_t seed) {
    size_t total = 64;
    int k = 0;
    size_t at[3] = {};
    for (const auto& [bytes, rows] : shapes) {
      step[k] = aligned ? (bytes + 15) & ~15 : bytes + 3 + 2 * k;
      at[k] = total + (aligned ? 0 : 1 + 2 * k);
      total = (at[k] + size_t(step[k]) * rows + 64 + 63) & ~size_t(63);
      ++k;
    }
    storage.resize(total + 64);
    std::mt19937 rng(seed);
    for (uint8_t& b : storage) b = uint8_t(rng() >> 24);
    uint8_t* base = storage.data();
    base += (64 - (reinterpret_cast<uintptr_t>(base) & 63u)) & 63u;
    for (int j = 0; j < k; ++j) plane[j] = base + at[j];
  }
};

// One call of a member on a source and a destination.
using Call = std::function<int(PlaneSet& src, PlaneSet& dst, ImageSize size)>;

struct Member {
  const char* name;
  // The shapes of the source and destination planes for a size.
  std::function<PlaneSet(ImageSize, bool, uint32_t)> src, dst;
  Call call;
};

PlaneSet one(int bytes, int rows, bool aligned, uint32_t seed) { return PlaneSet({{bytes, rows}}, aligned, seed); }
PlaneSet planes420(ImageSize s, bool aligned, uint32_t seed) {
  const int h = (s.width + 1) / 2, hr = (s.height + 1) / 2;
  return PlaneSet({{s.width, s.height}, {h, hr}, {h, hr}}, aligned, seed);
}
PlaneSet planes422(ImageSize s, int ratio, bool aligned, uint32_t seed) {
  const int h = (s.width + ratio - 1) / ratio;
  return PlaneSet({{s.width, s.height}, {h, s.height}, {h, s.height}}, aligned, seed);
}
PlaneSet twoPlanes420(ImageSize s, bool aligned, uint32_t seed) {
  return PlaneSet({{s.width, s.height}, {s.width + 1, (s.height + 1) / 2}}, aligned, seed);
}
PlaneSet threePlanes(ImageSize s, bool aligned, uint32_t seed) {
  return PlaneSet({{s.width, s.height}, {s.width, s.height}, {s.width, s.height}}, aligned, seed);
}
auto packed(int bytesPerPixel) {
  return [bytesPerPixel](ImageSize s, bool aligned, uint32_t seed) { return one(bytesPerPixel * s.width, s.height, aligned, seed); };
}

template <class F>
Call encodeToPlanes(F f) {
  return [f](PlaneSet& s, PlaneSet& d, ImageSize size) { return f(s.plane[0], s.step[0], d.plane, d.step, size); };
}
template <class F>
Call packedToPacked(F f) {
  return [f](PlaneSet& s, PlaneSet& d, ImageSize size) { return f(s.plane[0], s.step[0], d.plane[0], d.step[0], size); };
}
template <class F>
Call encodeToTwoPlanes(F f) {
  return [f](PlaneSet& s, PlaneSet& d, ImageSize size) {
    return f(s.plane[0], s.step[0], d.plane[0], d.step[0], d.plane[1], d.step[1], size);
  };
}
template <class F>
Call planesToPacked(F f) {
  return [f](PlaneSet& s, PlaneSet& d, ImageSize size) {
    const uint8_t* const planes[3] = {s.plane[0], s.plane[1], s.plane[2]};
    return f(planes, s.step, d.plane[0], d.step[0], size);
  };
}
template <class F>
Call planesToPackedAlpha(F f) {
  return [f](PlaneSet& s, PlaneSet& d, ImageSize size) {
    const uint8_t* const planes[3] = {s.plane[0], s.plane[1], s.plane[2]};
    return f(planes, s.step, d.plane[0], d.step[0], size, uint8_t(77));
  };
}

std::vector<Member> members() {
  auto p420 = [](ImageSize s, bool a, uint32_t seed) { return planes420(s, a, seed); };
  auto p422 = [](ImageSize s, bool a, uint32_t seed) { return planes422(s, 2, a, seed); };
  auto p411 = [](ImageSize s, bool a, uint32_t seed) { return planes422(s, 4, a, seed); };
  auto two420 = [](ImageSize s, bool a, uint32_t seed) { return twoPlanes420(s, a, seed); };
  auto pairs = [](ImageSize s, bool a, uint32_t seed) { return one(2 * s.width + 2, s.height, a, seed); };
  return {
      {"RGBToYCbCr420 C3P3R", packed(3), p420, encodeToPlanes(zeliRGBToYCbCr420_8u_C3P3R)},
      {"BGRToYCbCr420 C3P3R", packed(3), p420, encodeToPlanes(zeliBGRToYCbCr420_8u_C3P3R)},
      {"BGRToYCbCr420 AC4P3R", packed(4), p420, encodeToPlanes(zeliBGRToYCbCr420_8u_AC4P3R)},
      {"BGRToYCbCr420 709HDTV AC4P3R", packed(4), p420, encodeToPlanes(zeliBGRToYCbCr420_709HDTV_8u_AC4P3R)},
      {"RGBToYCbCr420 C4P2R", packed(4), two420, encodeToTwoPlanes(zeliRGBToYCbCr420_8u_C4P2R)},
      {"BGRToYCbCr420 709CSC C3P2R", packed(3), two420, encodeToTwoPlanes(zeliBGRToYCbCr420_709CSC_8u_C3P2R)},
      {"RGBToYUV420 C3P3R", packed(3), p420, encodeToPlanes(zeliRGBToYUV420_8u_C3P3R)},
      {"BGRToYUV420 AC4P3R", packed(4), p420, encodeToPlanes(zeliBGRToYUV420_8u_AC4P3R)},
      {"RGBToYUV422 C3P3R", packed(3), p422, encodeToPlanes(zeliRGBToYUV422_8u_C3P3R)},
      {"BGRToYCbCr422 AC4P3R", packed(4), p422, encodeToPlanes(zeliBGRToYCbCr422_8u_AC4P3R)},
      {"BGRToYCbCr422 C3C2R", packed(3), pairs, packedToPacked(zeliBGRToYCbCr422_8u_C3C2R)},
      {"RGBToYCbCr422 C3C2R", packed(3), pairs, packedToPacked(zeliRGBToYCbCr422_8u_C3C2R)},
      {"BGRToYCbCr411 AC4P3R", packed(4), p411, encodeToPlanes(zeliBGRToYCbCr411_8u_AC4P3R)},
      {"BGRToYCbCr411 C3P3R", packed(3), p411, encodeToPlanes(zeliBGRToYCbCr411_8u_C3P3R)},
      {"YCbCr422ToRGB C2C3R", pairs, packed(3), packedToPacked(zeliYCbCr422ToRGB_8u_C2C3R)},
      {"YCbCr422ToBGR C2C3R", pairs, packed(3), packedToPacked(zeliYCbCr422ToBGR_8u_C2C3R)},
      {"YCrCb422ToRGB C2C3R", pairs, packed(3), packedToPacked(zeliYCrCb422ToRGB_8u_C2C3R)},
      {"CbYCr422ToBGR 709HDTV C2C3R", pairs, packed(3), packedToPacked(zeliCbYCr422ToBGR_709HDTV_8u_C2C3R)},
      {"YCbCr422ToRGB C2P3R", pairs, threePlanes,
       [](PlaneSet& s, PlaneSet& d, ImageSize size) {
         // One step for the three planes: the first, the shortest.
         uint8_t* const planes[3] = {d.plane[0], d.plane[1], d.plane[2]};
         return zeliYCbCr422ToRGB_8u_C2P3R(s.plane[0], s.step[0], planes, d.step[0], size);
       }},
      {"YCbCr422ToBGR C2C4R", pairs, packed(4),
       [](PlaneSet& s, PlaneSet& d, ImageSize size) {
         return zeliYCbCr422ToBGR_8u_C2C4R(s.plane[0], s.step[0], d.plane[0], d.step[0], size, 91);
       }},
      {"YCbCr422ToRGB C2C4R", pairs, packed(4),
       [](PlaneSet& s, PlaneSet& d, ImageSize size) {
         return zeliYCbCr422ToRGB_8u_C2C4R(s.plane[0], s.step[0], d.plane[0], d.step[0], size, 91);
       }},
      {"YCbCr420ToRGB P3C3R", p420, packed(3), planesToPacked(zeliYCbCr420ToRGB_8u_P3C3R)},
      {"YCbCr420ToBGR P3C3R", p420, packed(3), planesToPacked(zeliYCbCr420ToBGR_8u_P3C3R)},
      {"YCbCr420ToBGR P3C4R", p420, packed(4), planesToPackedAlpha(zeliYCbCr420ToBGR_8u_P3C4R)},
      {"YCbCr420ToBGR 709HDTV P3C4R", p420, packed(4), planesToPackedAlpha(zeliYCbCr420ToBGR_709HDTV_8u_P3C4R)},
      {"YCbCr422ToRGB P3C3R", p422, packed(3), planesToPacked(zeliYCbCr422ToRGB_8u_P3C3R)},
      {"YCbCr411ToBGR P3C4R", p411, packed(4), planesToPackedAlpha(zeliYCbCr411ToBGR_8u_P3C4R)},
      {"YCbCr420ToRGB P2C3R", two420, packed(3),
       [](PlaneSet& s, PlaneSet& d, ImageSize size) {
         return zeliYCbCr420ToRGB_8u_P2C3R(s.plane[0], s.step[0], s.plane[1], s.step[1], d.plane[0], d.step[0], size);
       }},
  };
}

// Restores the tier cap of the run when a test ends.
struct TierCap {
  VectorTier saved = zel::vectorTierCap();
  ~TierCap() { zel::setVectorTierCap(saved); }
};

TEST(SubsampledTiers, EveryTierWritesTheSameBytes) {
  const TierCap cap;
  std::vector<VectorTier> tiers;
  for (int k = 0; k <= int(zel::widestTierWithBytePermutes()); ++k) tiers.push_back(VectorTier(k));
  if (tiers.size() < 2) GTEST_SKIP() << "one vector tier only";
  const ImageSize sizes[] = {{300, 3}, {191, 5}, {130, 2}, {67, 4}, {64, 1}, {257, 6}};
  for (const Member& m : members())
    for (const ImageSize size : sizes)
      for (bool aligned : {false, true}) {
        const uint32_t seed = uint32_t(size.width * 31 + size.height);
        PlaneSet src = m.src(size, aligned, seed);
        std::vector<uint8_t> first;
        int firstStatus = 0;
        for (VectorTier tier : tiers) {
          PlaneSet dst = m.dst(size, aligned, seed + 1);
          zel::setVectorTierCap(tier);
          const int status = m.call(src, dst, size);
          if (tier == VectorTier::Sse41) {
            first = dst.storage;
            firstStatus = status;
            continue;
          }
          EXPECT_EQ(status, firstStatus) << m.name;
          ASSERT_TRUE(dst.storage == first) << m.name << " " << size.width << "x" << size.height
                                            << (aligned ? " aligned" : "") << " tier " << int(tier);
        }
      }
}

}  // namespace
