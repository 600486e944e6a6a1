// Picture files: PNG and PNM round trips at both depths, rescaled maxvals,
// palettes, and damaged or foreign files turned into errors.
#include <gtest/gtest.h>
#include <png.h>

#include <fstream>
#include <random>

#include "image_io.h"
#include "scratch_dir.h"

namespace {

using namespace zel::tool;

Picture randomPicture(int w, int h, int channels, int depth, uint32_t seed) {
  Picture p(w, h, channels, depth);
  std::mt19937 rng(seed);
  for (uint16_t& s : p.samples) s = uint16_t(rng() % (p.maxValue() + 1u));
  return p;
}

// A literal's bytes, zeros included.
template <size_t N>
std::string bytesOf(const char (&literal)[N]) {
  return std::string(literal, N - 1);
}

void writeBytes(const std::string& path, const std::string& bytes) {
  std::ofstream(path, std::ios::binary) << bytes;
}

void expectSame(const Picture& a, const Picture& b) {
  EXPECT_EQ(a.width, b.width);
  EXPECT_EQ(a.height, b.height);
  EXPECT_EQ(a.channels, b.channels);
  EXPECT_EQ(a.depth, b.depth);
  EXPECT_TRUE(a.samples == b.samples);
}

std::string errorOf(const std::string& path) {
  try {
    readImage(path);
  } catch (const ToolError& e) {
    return e.what();
  }
  return "";
}

TEST(ImageFiles, RoundTripsKeepEverySample) {
  zel::tool::test::ScratchDir dir;
  for (int depth : {8, 16}) {
    for (int channels = 1; channels <= 4; ++channels) {
      const Picture p = randomPicture(13, 7, channels, depth, uint32_t(depth * 10 + channels));
      writePng(dir.file("a.png"), p);
      SCOPED_TRACE("png, " + std::to_string(channels) + " channels, " + std::to_string(depth) + " bits");
      expectSame(readImage(dir.file("a.png")), p);
    }
    for (int channels : {1, 3}) {
      const Picture p = randomPicture(5, 9, channels, depth, uint32_t(depth + channels));
      writePnm(dir.file("a.pnm"), p);
      SCOPED_TRACE("pnm, " + std::to_string(channels) + " channels, " + std::to_string(depth) + " bits");
      expectSame(readImage(dir.file("a.pnm")), p);
    }
  }
  EXPECT_THROW(writePnm(dir.file("b.pnm"), randomPicture(2, 2, 4, 8, 1)), ToolError);
}

TEST(ImageFiles, OtherMaxvalsAndCommentsAreRead) {
  zel::tool::test::ScratchDir dir;
  // maxval 1023 goes to 16 bits, 15 to 8 bits, both rounded to nearest.
  writeBytes(dir.file("a.pgm"), bytesOf("P5\n# a comment\n3 1\n1023\n\x00\x00\x03\xff\x02\x00"));
  Picture p = readImage(dir.file("a.pgm"));
  ASSERT_EQ(p.depth, 16);
  EXPECT_EQ(p.samples, (std::vector<uint16_t>{0, 65535, 32800}));
  writeBytes(dir.file("b.ppm"), bytesOf("P6 1 1 15\n\x0f\x07\x00"));
  p = readImage(dir.file("b.ppm"));
  ASSERT_EQ(p.depth, 8);
  EXPECT_EQ(p.samples, (std::vector<uint16_t>{255, 119, 0}));
}

TEST(ImageFiles, PalettePngIsExpandedToRgb) {
  zel::tool::test::ScratchDir dir;
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.width = 2;
  image.height = 1;
  image.format = PNG_FORMAT_RGB_COLORMAP;
  image.colormap_entries = 2;
  const uint8_t colours[6] = {10, 20, 30, 200, 100, 50}, indices[2] = {1, 0};
  ASSERT_TRUE(png_image_write_to_file(&image, dir.file("p.png").c_str(), 0, indices, 0, colours));
  const Picture p = readImage(dir.file("p.png"));
  ASSERT_EQ(p.channels, 3);
  EXPECT_EQ(p.samples, (std::vector<uint16_t>{200, 100, 50, 10, 20, 30}));
}

TEST(ImageFiles, DamagedAndForeignFilesGiveErrorsNamingTheFile) {
  zel::tool::test::ScratchDir dir;
  writePng(dir.file("good.png"), randomPicture(64, 64, 3, 8, 5));
  std::string png;
  {
    std::ifstream in(dir.file("good.png"), std::ios::binary);
    png.assign(std::istreambuf_iterator<char>(in), {});
  }
  const std::pair<const char*, std::string> cases[] = {
      {"empty", ""},
      {"truncated.png", png.substr(0, png.size() / 2)},
      {"junk.png", png.substr(0, 8) + std::string(200, 'x')},
      {"text.txt", "hello, world\n"},
      {"ascii.pgm", "P2\n2 2\n255\n0 1 2 3\n"},
      {"short.ppm", "P6\n10 10\n255\nabc"},
      {"huge.pgm", "P5\n100000 100000\n255\n"},
      {"maxval.pgm", "P5\n1 1\n70000\n\x01\x02"},
      {"nomaxval.pgm", "P5\n1 1\n"},
      {"above.pgm", bytesOf("P5\n1 1\n100\n\x65")},
  };
  for (const auto& [name, bytes] : cases) {
    writeBytes(dir.file(name), bytes);
    const std::string message = errorOf(dir.file(name));
    EXPECT_NE(message.find(dir.file(name)), std::string::npos) << name << ": '" << message << "'";
    EXPECT_EQ(message.find('\n'), std::string::npos) << name;
  }
  EXPECT_NE(errorOf(dir.file("missing.png")).find("No such file"), std::string::npos);
  EXPECT_THROW(writePng(dir.file("no/such/dir.png"), randomPicture(1, 1, 1, 8, 1)), ToolError);
}

}  // namespace
