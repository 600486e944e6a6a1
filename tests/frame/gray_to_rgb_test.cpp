// Gray to RGB: every width's body and tail, misaligned rows, special floats.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

#include "frame/gray_to_rgb.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

template <typename T, int Channels, typename Fn>
void checkAllWidths(Fn fn, T alpha) {
  for (int width = 1; width <= 70; ++width)
    for (int offset : {0, 1, 3, 8}) {
      if (offset % int(sizeof(T)) != 0 && sizeof(T) > 1) continue;
      const int height = 3;
      TestImage<T> src(width, height, offset, 5);
      TestImage<T> dst(width * Channels, height, offset + int(sizeof(T)), 7);
      src.fillRandom(uint32_t(width * 7 + offset));
      const Status s = fn(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, height}, alpha);
      ASSERT_EQ(s, StatusOk);
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
          const T g = src.get(x, y);
          for (int c = 0; c < 3; ++c)
            ASSERT_EQ(std::memcmp(&dst.row(y)[x * Channels + c], &g, sizeof(T)), 0) << width << " " << x;
          if (Channels == 4) ASSERT_EQ(std::memcmp(&dst.row(y)[x * 4 + 3], &alpha, sizeof(T)), 0);
        }
      ASSERT_TRUE(dst.guardsIntact()) << "width " << width << " offset " << offset;
    }
}

Status c1c3_8u(const uint8_t* s, int ss, uint8_t* d, int ds, ImageSize z, uint8_t) {
  return zeliGrayToRGB_8u_C1C3R(s, ss, d, ds, z);
}
Status c1c3_16u(const uint16_t* s, int ss, uint16_t* d, int ds, ImageSize z, uint16_t) {
  return zeliGrayToRGB_16u_C1C3R(s, ss, d, ds, z);
}
Status c1c3_32f(const float* s, int ss, float* d, int ds, ImageSize z, float) {
  return zeliGrayToRGB_32f_C1C3R(s, ss, d, ds, z);
}

TEST(GrayToRGB, EveryWidthAndAlignment) {
  checkAllWidths<uint8_t, 3>(c1c3_8u, uint8_t(0));
  checkAllWidths<uint16_t, 3>(c1c3_16u, uint16_t(0));
  checkAllWidths<float, 3>(c1c3_32f, 0.0f);
  checkAllWidths<uint8_t, 4>(zeliGrayToRGB_8u_C1C4R, uint8_t(77));
  checkAllWidths<uint16_t, 4>(zeliGrayToRGB_16u_C1C4R, uint16_t(65535));
  checkAllWidths<float, 4>(zeliGrayToRGB_32f_C1C4R, -2.5f);
}

TEST(GrayToRGB, FloatPatternsArriveBitForBit) {
  // A signalling NaN, negative zero and infinity, in the body and the tail.
  const uint32_t patterns[] = {0x7f800001u, 0x80000000u, 0x7f800000u, 0xffc00123u, 0x00000001u};
  float src[7];
  for (int i = 0; i < 7; ++i) std::memcpy(&src[i], &patterns[i % 5], 4);
  float alpha;
  const uint32_t alphaBits = 0x7fa00000u;  // signalling NaN as alpha
  std::memcpy(&alpha, &alphaBits, 4);
  float dst[28];
  ASSERT_EQ(zeliGrayToRGB_32f_C1C4R(src, sizeof src, dst, sizeof dst, ImageSize{7, 1}, alpha), StatusOk);
  for (int i = 0; i < 7; ++i) {
    for (int c = 0; c < 3; ++c) {
      uint32_t bits;
      std::memcpy(&bits, &dst[i * 4 + c], 4);
      EXPECT_EQ(bits, patterns[i % 5]) << i;
    }
    uint32_t a;
    std::memcpy(&a, &dst[i * 4 + 3], 4);
    EXPECT_EQ(a, alphaBits);
  }
}

TEST(GrayToRGB, RowKernelsMatchThePixelFormula) {
  // The vector bodies alone, on block multiples, against grayPixel.
  for (int count = 4; count <= 96; count += 4) {
    TestImage<uint8_t> src(count, 1, 1);
    src.fillRandom(uint32_t(count));
    std::vector<uint8_t> got(count * 4), want(count * 4);
    zel::grayRowKernel<uint8_t, 4>(src.data(), got.data(), count, 9);
    for (int x = 0; x < count; ++x) zel::grayPixel<uint8_t, 4>(src.data() + x, &want[x * 4], 9);
    ASSERT_EQ(got, want) << count;
    std::vector<uint8_t> got3(count * 3), want3(count * 3);
    zel::grayRowKernel<uint8_t, 3>(src.data(), got3.data(), count, 0);
    for (int x = 0; x < count; ++x) zel::grayPixel<uint8_t, 3>(src.data() + x, &want3[x * 3], 0);
    ASSERT_EQ(got3, want3) << count;
  }
}

}  // namespace
