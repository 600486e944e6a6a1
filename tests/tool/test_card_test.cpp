// The test card at any size, and the Bayer mosaic views of it.
#include <gtest/gtest.h>

#include "test_card.h"

namespace {

using namespace zel::tool;

TEST(TestCard, HasItsBandsAtEverySize) {
  for (auto [w, h] : {std::pair{1, 1}, {2, 3}, {5, 5}, {17, 9}, {640, 480}, {641, 479}}) {
    const Picture p = makeTestCard(w, h);
    ASSERT_EQ(p.width, w);
    ASSERT_EQ(p.height, h);
    ASSERT_EQ(p.channels, 3);
    ASSERT_EQ(p.depth, 16);
  }
  const Picture p = makeTestCard(640, 480);
  // Bars: white first, yellow second, black last.
  EXPECT_EQ(p.at(0, 0, 0), 65535);
  EXPECT_EQ(p.at(0, 0, 2), 65535);
  EXPECT_EQ(p.at(100, 10, 2), 0);
  EXPECT_EQ(p.at(100, 10, 1), 65535);
  EXPECT_EQ(p.at(639, 100, 0) + p.at(639, 100, 1) + p.at(639, 100, 2), 0);
  // The gray ramp rises from black to white.
  const int ramp = 480 * 8 / 20;
  EXPECT_EQ(p.at(0, ramp, 0), 0);
  EXPECT_EQ(p.at(639, ramp, 0), 65535);
  for (int x = 1; x < 640; ++x) ASSERT_GT(p.at(x, ramp, 0), p.at(x - 1, ramp, 0));
  // Finest detail: neighbouring columns and rows differ.
  const int detail = 480 * 12 / 20;
  EXPECT_NE(p.at(10, detail, 0), p.at(11, detail, 0));
  EXPECT_NE(p.at(250, detail, 0), p.at(250, detail + 1, 0));
}

TEST(TestCard, MosaicTakesTheColourOfEachGridPlace) {
  // Rows 0 and 1 of each grid kind, two places each: 0 red, 1 green, 2 blue.
  const int expected[4][2][2] = {{{2, 1}, {1, 0}}, {{0, 1}, {1, 2}}, {{1, 2}, {0, 1}}, {{1, 0}, {2, 1}}};
  for (int grid = 0; grid < 4; ++grid)
    for (int y = 0; y < 6; ++y)
      for (int x = 0; x < 6; ++x) ASSERT_EQ(bayerColour(grid, x, y), expected[grid][y & 1][x & 1]) << grid;

  const Picture card = makeTestCard(40, 30);
  for (int grid = 0; grid < 4; ++grid) {
    const Picture m = bayerMosaic(card, grid);
    ASSERT_EQ(m.channels, 1);
    for (int y = 0; y < 30; ++y)
      for (int x = 0; x < 40; ++x) ASSERT_EQ(m.at(x, y, 0), card.at(x, y, bayerColour(grid, x, y)));
  }
  Picture gray(3, 2, 1, 8);
  gray.samples = {1, 2, 3, 4, 5, 6};
  EXPECT_EQ(bayerMosaic(gray, 2).samples, gray.samples);
}

}  // namespace
