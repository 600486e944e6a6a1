// Every name the library is to export, described from its name alone:
// its sources fill from a picture and its destinations read back as
// pictures, so that families to come run through the tool unchanged.
#include <gtest/gtest.h>

#include <fstream>

#include "buffers.h"
#include "test_card.h"

namespace {

using namespace zel::tool;

TEST(EveryName, FillsAndReadsBackAtOddAndEvenSizes) {
  std::ifstream list(ZELCC_EXPORTS_FILE);
  ASSERT_TRUE(list.good());
  std::string name;
  int described = 0;
  for (auto [w, h] : {std::pair{1, 1}, {5, 3}, {64, 48}}) {
    const Picture card = makeTestCard(w, h);
    list.clear();
    list.seekg(0);
    while (list >> name) {
      if (name.rfind("zeli", 0) != 0) continue;
      zel::meta::Descriptor d;
      std::string error;
      ASSERT_TRUE(zel::meta::describe(name, "", d, error)) << error;
      ++described;
      zel::meta::Workspace ws(d, {w, h});
      fillSources(ws, card, readsMosaic(d) ? 0 : -1);
      const std::string damage = ws.checkGuards();
      ASSERT_TRUE(damage.empty()) << name << ": " << damage;
      const Outputs out = destinationImages(ws, {});
      ASSERT_FALSE(out.images.empty()) << name;
      for (const OutputImage& img : out.images) {
        ASSERT_GE(img.picture.width, 1) << name << img.suffix;
        ASSERT_LE(img.picture.width, w) << name << img.suffix;
        ASSERT_GE(img.picture.height, 1) << name << img.suffix;
        ASSERT_LE(img.picture.height, h) << name << img.suffix;
        // A planar destination keeps its plane suffixes even when its chroma
        // planes are empty (one pixel wide without steps).
        if (out.images.size() == 1 && !d.dst.isPlanar()) EXPECT_EQ(img.suffix, "") << name;
        else EXPECT_EQ(img.suffix[0], '_') << name;
      }
    }
  }
  EXPECT_EQ(described, 3 * 520);
}

}  // namespace
