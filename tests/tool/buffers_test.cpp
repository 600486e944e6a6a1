// Source buffers filled and destination buffers read by descriptor alone,
// for layouts, formats and sample types whether or not the library has an
// export of that shape yet.
#include <gtest/gtest.h>

#include <cstring>

#include "buffers.h"

namespace {

using namespace zel::tool;
using zel::meta::Descriptor;
using zel::meta::Workspace;

Descriptor described(const std::string& name, const std::string& extras = "") {
  Descriptor d;
  std::string error;
  EXPECT_TRUE(zel::meta::describe(name, extras, d, error)) << error;
  return d;
}

// An 8-bit RGBA picture whose samples tell where they are.
Picture patterned(int w, int h) {
  Picture p(w, h, 4, 8);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x)
      for (int c = 0; c < 4; ++c) p.at(x, y, c) = uint16_t((x * 13 + y * 7 + c * 50 + 1) & 255);
  return p;
}

// A 16-bit scale value to 8 bits, rounded.
int to8(int wide) { return (wide * 255 + 32767) / 65535; }

template <typename T>
T sampleAt(Workspace& ws, int side, int plane, int y, int i) {
  T v;
  const Workspace::Buffer* b = ws.bufferOf(side, plane);
  std::memcpy(&v, b->first + size_t(y) * b->step + size_t(i) * sizeof(T), sizeof(T));
  return v;
}

template <typename T>
void setSample(Workspace& ws, int side, int plane, int y, int i, T v) {
  Workspace::Buffer* b = ws.bufferOf(side, plane);
  std::memcpy(b->first + size_t(y) * b->step + size_t(i) * sizeof(T), &v, sizeof(T));
}

TEST(FillSources, ChannelOrderAlphaAndSampleTypes) {
  const Picture p = patterned(5, 3);
  {  // BGR interleaved: blue first
    const Descriptor d = described("zeliBGRToHLS_8u_C3P3R");
    Workspace ws(d, {5, 3});
    fillSources(ws, p, -1);
    for (int k = 0; k < 3; ++k) EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 2, 3 * 4 + k), p.at(4, 2, 2 - k));
  }
  {  // AC4 takes the picture's alpha; planar BGR planes go blue, green, red
    const Descriptor d = described("zeliHLSToBGR_8u_AC4P4R");
    Workspace ws(d, {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 1, 2 * 4 + 3), p.at(2, 1, 3));
    const Descriptor planar = described("zeliBGRToHLS_8u_P3R");
    Workspace wp(planar, {5, 3});
    fillSources(wp, p, -1);
    for (int k = 0; k < 3; ++k) EXPECT_EQ(sampleAt<uint8_t>(wp, 0, k, 1, 3), p.at(3, 1, 2 - k));
  }
  const uint16_t red = uint16_t(p.at(1, 0, 0) * 257);
  {
    Workspace ws(described("zeliRGBToHLS_16u_C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<uint16_t>(ws, 0, 0, 0, 3), red);
  }
  {
    Workspace ws(described("zeliRGBToHLS_16s_C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<int16_t>(ws, 0, 0, 0, 3), red - 32768);
  }
  {
    Workspace ws(described("zeliRGBToHLS_32f_C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_FLOAT_EQ(sampleAt<float>(ws, 0, 0, 0, 3), p.at(1, 0, 0) / 255.0f);
  }
  {
    Workspace ws(described("zeliColorToGray_64f_C3C1R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_DOUBLE_EQ(sampleAt<double>(ws, 0, 0, 0, 3), p.at(1, 0, 0) / 255.0);
  }
  {
    Workspace ws(described("zeliColorTwist32f_8s_C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<int8_t>(ws, 0, 0, 0, 3), p.at(1, 0, 0) - 128);
  }
  {  // one channel: luma of a colour picture, or its mosaic
    Workspace ws(described("zeliGrayToRGB_8u_C1C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 2, 4), to8(p.luma(4, 2)));
    fillSources(ws, p, 1);  // RGGB: blue at odd row and column
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 1, 3), p.at(3, 1, 2));
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 2, 4), p.at(4, 2, 0));
  }
}

TEST(FillSources, LumaChromaFormatsTakeBt601) {
  auto eight = [](const std::string& format, int r, int g, int b) {
    const auto c = sourceChannels(format, uint16_t(r * 257), uint16_t(g * 257), uint16_t(b * 257));
    return std::vector<int>{to8(c[0]), to8(c[1]), to8(c[2])};
  };
  EXPECT_EQ(eight("YCbCr420", 255, 255, 255), (std::vector<int>{235, 128, 128}));
  EXPECT_EQ(eight("YCbCr", 0, 0, 0), (std::vector<int>{16, 128, 128}));
  EXPECT_EQ(eight("CbYCr422", 255, 0, 0), (std::vector<int>{81, 90, 240}));
  EXPECT_EQ(eight("YCrCb420", 255, 0, 0), (std::vector<int>{81, 240, 90}));
  EXPECT_EQ(eight("YUV422", 255, 255, 255), (std::vector<int>{255, 128, 128}));
  EXPECT_EQ(eight("YUV", 0, 0, 255), (std::vector<int>{29, 239, 102}));
  EXPECT_EQ(eight("BGR", 1, 2, 3), (std::vector<int>{3, 2, 1}));
  EXPECT_EQ(eight("HLS", 1, 2, 3), (std::vector<int>{1, 2, 3}));
}

TEST(FillSources, YCoCgPlanesHoldTheTransform) {
  const uint16_t full = 65535;
  EXPECT_EQ(ycocgPlanes({false, true, false}, full, 0, 0), (std::array<int32_t, 3>{64, 128, -64}));
  EXPECT_EQ(ycocgPlanes({true, true, false}, full, 0, 0), (std::array<int32_t, 3>{63, 255, -127}));
  EXPECT_EQ(ycocgPlanes({false, true, true}, full, 0, 0), (std::array<int32_t, 3>{64, 255, 64}));
  EXPECT_EQ(ycocgPlanes({false, false, false}, full, 0, 0), (std::array<int32_t, 3>{-16383, 32767, -16383}));
  // The lifting form undoes exactly, on either colour scale.
  for (bool bytes : {true, false})
    for (uint32_t i = 0; i < 500; ++i) {
      const uint16_t r = uint16_t(i * 7919), g = uint16_t(i * 104729), b = uint16_t(i * 1299709);
      const auto [y, co, cg] = ycocgPlanes({true, bytes, false}, r, g, b);
      const int32_t t = y - (cg >> 1), G = cg + t, B = t - (co >> 1), R = co + B;
      auto scaled = [&](uint16_t w) { return bytes ? to8(w) : std::max(int(w) - 32768, -32767); };
      ASSERT_EQ(R, scaled(r));
      ASSERT_EQ(G, scaled(g));
      ASSERT_EQ(B, scaled(b));
    }
  // Planes by member: 16-bit planes of byte colour, 32-bit planes of signed 16-bit colour.
  const Picture p = patterned(5, 3);
  Workspace rev(described("zeliYCoCgToBGR_Rev_16s8u_P3C3R"), {5, 3});
  fillSources(rev, p, -1);
  EXPECT_EQ(sampleAt<int16_t>(rev, 0, 1, 2, 3), ycocgPlanes({true, true, false}, p.wide(3, 2, 0), p.wide(3, 2, 1), p.wide(3, 2, 2))[1]);
  Workspace wide(described("zeliYCoCgToSBGR_32s16s_P3C3R"), {5, 3});
  fillSources(wide, p, -1);
  EXPECT_EQ(sampleAt<int32_t>(wide, 0, 2, 1, 4), ycocgPlanes({false, false, false}, p.wide(4, 1, 0), p.wide(4, 1, 1), p.wide(4, 1, 2))[2]);
}

TEST(FillSources, ChromaPlanesStreamsAndPackedWords) {
  const Picture p = patterned(5, 3);
  auto channel = [&](const std::string& format, int k, int x, int y) {
    return int(sourceChannels(format, p.wide(x, y, 0), p.wide(x, y, 1), p.wide(x, y, 2))[k]);
  };
  auto mean = [&](const std::string& format, int k, int x0, int y0, int fx, int fy) {
    int sum = 0, n = 0;
    for (int y = y0; y < std::min(y0 + fy, 3); ++y)
      for (int x = x0; x < std::min(x0 + fx, 5); ++x, ++n) sum += channel(format, k, x, y);
    return to8((sum + n / 2) / n);  // the mean on the 16-bit scale
  };
  {  // 4:2:0 planes: luma full, chroma block means, the odd column and row alone
    Workspace ws(described("zeliYCbCr420ToRGB_8u_P3C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 2, 4), to8(channel("YCbCr420", 0, 4, 2)));
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 1, 0, 0), mean("YCbCr420", 1, 0, 0, 2, 2));
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 2, 1, 2), mean("YCbCr420", 2, 4, 2, 2, 2));
  }
  {  // two planes: chroma pairs
    Workspace ws(described("zeliYCbCr420ToRGB_8u_P2C3R"), {5, 3});
    fillSources(ws, p, -1);
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 1, 0, 2), mean("YCbCr420", 1, 2, 0, 2, 2));
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 1, 0, 3), mean("YCbCr420", 2, 2, 0, 2, 2));
  }
  {  // 4:2:2 streams: luma first, or chroma first
    Workspace ws(described("zeliYCbCr422ToRGB_8u_C2C3R"), {5, 3});
    fillSources(ws, p, -1);
    const int yc[] = {to8(channel("YCbCr", 0, 2, 1)), mean("YCbCr", 1, 2, 1, 2, 1), to8(channel("YCbCr", 0, 3, 1)),
                      mean("YCbCr", 2, 2, 1, 2, 1)};
    for (int i = 0; i < 4; ++i) EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 1, 4 + i), yc[i]) << i;
    EXPECT_EQ(sampleAt<uint8_t>(ws, 0, 0, 1, 9), mean("YCbCr", 1, 4, 1, 2, 1));  // the odd last pixel
    Workspace wc(described("zeliCbYCr422ToRGB_8u_C2C3R"), {5, 3});
    fillSources(wc, p, -1);
    const int cy[] = {yc[1], yc[0], yc[3], yc[2]};
    for (int i = 0; i < 4; ++i) EXPECT_EQ(sampleAt<uint8_t>(wc, 0, 0, 1, 4 + i), cy[i]) << i;
  }
  {  // packed words: the name lists fields from the low end
    Workspace bgr(described("zeliBGR565ToBGR_16u8u_C3R"), {5, 3});
    fillSources(bgr, p, -1);
    const int r = p.at(1, 2, 0), g = p.at(1, 2, 1), b = p.at(1, 2, 2);
    EXPECT_EQ(sampleAt<uint16_t>(bgr, 0, 0, 2, 1), (b >> 3) | (g >> 2) << 5 | (r >> 3) << 11);
    Workspace rgb(described("zeliRGB555ToYUV420_16u8u_C3P3R"), {5, 3});
    fillSources(rgb, p, -1);
    EXPECT_EQ(sampleAt<uint16_t>(rgb, 0, 0, 2, 1), (r >> 3) | (g >> 3) << 5 | (b >> 3) << 10);
  }
}

TEST(DestinationImages, ViewableForms) {
  {  // BGR turned to RGB; AC4 alpha dropped; 8 bits
    Workspace ws(described("zeliYCbCrToBGR_8u_P3C3R"), {2, 1});
    for (int k = 0; k < 3; ++k) setSample<uint8_t>(ws, 1, 0, 0, 3 + k, uint8_t(10 + k));
    const Outputs o = destinationImages(ws, {});
    ASSERT_EQ(o.images.size(), 1u);
    EXPECT_EQ(o.images[0].suffix, "");
    EXPECT_EQ(o.images[0].picture.at(1, 0, 0), 12);
    EXPECT_EQ(o.images[0].picture.at(1, 0, 2), 10);
    Workspace wa(described("zeliYUVToRGB_8u_AC4R"), {2, 1});
    EXPECT_EQ(destinationImages(wa, {}).images[0].picture.channels, 3);
  }
  {  // signed 16 bits biased into a 16-bit picture
    Workspace ws(described("zeliHLSToRGB_16s_C3R"), {1, 1});
    setSample<int16_t>(ws, 1, 0, 0, 0, -32768);
    setSample<int16_t>(ws, 1, 0, 0, 1, 32767);
    setSample<int16_t>(ws, 1, 0, 0, 2, 0);
    const Picture p = destinationImages(ws, {}).images[0].picture;
    EXPECT_EQ(p.depth, 16);
    EXPECT_EQ(p.samples, (std::vector<uint16_t>{0, 65535, 32768}));
    // a small range, as of 8-bit YCoCg planes, is stretched over 8 bits
    setSample<int16_t>(ws, 1, 0, 0, 0, -10);
    setSample<int16_t>(ws, 1, 0, 0, 1, 10);
    const Outputs o = destinationImages(ws, {});
    EXPECT_EQ(o.images[0].picture.depth, 8);
    EXPECT_EQ(o.images[0].picture.samples, (std::vector<uint16_t>{0, 255, 128}));
    EXPECT_FALSE(o.note.empty());
  }
  {  // floats: 0..1 to 8 bits, a wider range stretched with a note
    Workspace ws(described("zeliHLSToRGB_32f_C3R"), {1, 1});
    for (int k = 0; k < 3; ++k) setSample<float>(ws, 1, 0, 0, k, k * 0.5f);
    Outputs o = destinationImages(ws, {});
    EXPECT_EQ(o.images[0].picture.samples, (std::vector<uint16_t>{0, 128, 255}));
    EXPECT_TRUE(o.note.empty());
    setSample<float>(ws, 1, 0, 0, 2, 4.0f);
    o = destinationImages(ws, {});
    EXPECT_EQ(o.images[0].picture.samples, (std::vector<uint16_t>{0, 32, 255}));
    EXPECT_FALSE(o.note.empty());
  }
  {  // packed words unpacked to 8-bit RGB, whichever colour is low
    Workspace ws(described("zeliYCbCrToRGB565_8u16u_C3R"), {2, 1});
    setSample<uint16_t>(ws, 1, 0, 0, 0, 0x001F);
    setSample<uint16_t>(ws, 1, 0, 0, 1, 0x07E0);
    EXPECT_EQ(destinationImages(ws, {}).images[0].picture.samples, (std::vector<uint16_t>{255, 0, 0, 0, 255, 0}));
    Workspace wb(described("zeliYCbCrToBGR444_8u16u_C3R"), {1, 1});
    setSample<uint16_t>(wb, 1, 0, 0, 0, 0x0F08);
    EXPECT_EQ(destinationImages(wb, {}).images[0].picture.samples, (std::vector<uint16_t>{255, 0, 136}));
  }
  {  // one bit a pixel, first pixel in the high bit
    Workspace ws(described("zeliReduceBits_8u1u_C1R"), {10, 1});
    setSample<uint8_t>(ws, 1, 0, 0, 0, 0xA0);
    setSample<uint8_t>(ws, 1, 0, 0, 1, 0x40);
    const Picture p = destinationImages(ws, {}).images[0].picture;
    EXPECT_EQ(p.samples, (std::vector<uint16_t>{255, 0, 255, 0, 0, 0, 0, 0, 0, 255}));
  }
}

TEST(DestinationImages, PlanesAndStreamsAreSplitAndNamed) {
  auto suffixes = [](const Outputs& o) {
    std::string s;
    for (const OutputImage& i : o.images)
      s += i.suffix + ":" + std::to_string(i.picture.width) + "x" + std::to_string(i.picture.height) + " ";
    return s;
  };
  Workspace c2(described("zeliRGBToCbYCr422_8u_C3C2R"), {5, 3});
  EXPECT_EQ(suffixes(destinationImages(c2, {})), "_Y:5x3 _Cb:3x3 _Cr:3x3 ");
  Workspace p2(described("zeliRGBToYCbCr420_8u_C3P2R"), {5, 3});
  EXPECT_EQ(suffixes(destinationImages(p2, {})), "_Y:5x3 _Cb:3x2 _Cr:3x2 ");
  Workspace p3(described("zeliBGRToYCrCb420_8u_C3P3R"), {5, 3});
  EXPECT_EQ(suffixes(destinationImages(p3, {})), "_Y:5x3 _Cr:3x2 _Cb:3x2 ");
  Workspace repack(described("zeliYCbCr420To411_8u_P3R"), {8, 2});
  EXPECT_EQ(suffixes(destinationImages(repack, {})), "_Y:8x2 _Cb:2x2 _Cr:2x2 ");
  Workspace ap4(described("zeliBGRToHLS_8u_AP4R"), {2, 2});
  EXPECT_EQ(suffixes(destinationImages(ap4, {})), "_H:2x2 _L:2x2 _S:2x2 _A:2x2 ");

  // A stream written by the fill reads back as its planes.
  const Picture p = patterned(5, 3);
  Workspace ws(described("zeliYCrCb422ToYCrCb422_8u_C2R"), {5, 3});
  fillSources(ws, p, -1);
  const Workspace::Buffer &from = *ws.bufferOf(0, 0), &to = *ws.bufferOf(1, 0);
  for (int y = 0; y < 3; ++y)
    std::memcpy(to.first + size_t(y) * to.step, from.first + size_t(y) * from.step, from.geometry.rowBytes);
  const Outputs o = destinationImages(ws, {});
  ASSERT_EQ(o.images.size(), 3u);
  EXPECT_EQ(o.images[0].suffix, "_Y");
  EXPECT_EQ(o.images[1].suffix, "_Cr");
  auto channel = [&](int k, int x, int y) {
    return to8(sourceChannels("YCrCb422", p.wide(x, y, 0), p.wide(x, y, 1), p.wide(x, y, 2))[k]);
  };
  for (int x = 0; x < 5; ++x) EXPECT_EQ(o.images[0].picture.at(x, 2, 0), channel(0, x, 2));
  EXPECT_EQ(o.images[1].picture.at(2, 0, 0), channel(1, 4, 0));
  // In place: the image read back is what went in.
  Workspace ip(described("zeliGammaFwd_8u_C3IR"), {5, 3});
  fillSources(ip, p, -1);
  const Picture back = destinationImages(ip, {}).images[0].picture;
  for (int c = 0; c < 3; ++c) EXPECT_EQ(back.at(4, 2, c), p.at(4, 2, c));
}

}  // namespace
