// The table of exports: one row per export in table order, each with every
// cell, the arguments of the prototype and the checks of the descriptor.
#include <gtest/gtest.h>

#include <sstream>

#include "info.h"

namespace {

std::vector<std::string> cells(const std::string& row) {
  std::vector<std::string> out;
  size_t at = row.find('|');
  while (at != std::string::npos) {
    const size_t next = row.find('|', at + 1);
    if (next == std::string::npos) break;
    std::string cell = row.substr(at + 1, next - at - 1);
    cell.erase(0, cell.find_first_not_of(' '));
    cell.erase(cell.find_last_not_of(' ') + 1);
    out.push_back(cell);
    at = next;
  }
  return out;
}

TEST(ExportsDoc, OneFullRowPerExportInTableOrder) {
  const auto& all = zel::meta::allDescriptors();
  std::istringstream text(zel::tool::exportsMarkdown());
  std::string line;
  size_t row = 0;
  while (std::getline(text, line)) {
    if (line.rfind("| ", 0) != 0 || line.rfind("| # ", 0) == 0) continue;
    ASSERT_LT(row, all.size()) << line;
    const zel::meta::Descriptor& d = all[row];
    const std::vector<std::string> c = cells(line);
    ASSERT_EQ(c.size(), 9u) << line;
    EXPECT_EQ(c[0], std::to_string(row + 1));
    EXPECT_EQ(c[1], "`" + d.name + "`");
    if (d.isImageFunction()) {
      EXPECT_EQ(size_t(std::count(c[2].begin(), c[2].end(), ',')) + 1, d.prototype.size()) << line;
      EXPECT_EQ(c[5], !d.region ? "none" : d.checksSteps ? "checked" : "unchecked") << line;
      EXPECT_EQ(size_t(std::count(c[8].begin(), c[8].end(), ',')) + 1, zel::tool::shownChecks(d).size()) << line;
      EXPECT_EQ(c[2].find("argument"), std::string::npos) << "an unnamed argument: " << line;
      for (const zel::meta::Extra& e : d.extras) EXPECT_NE(c[7].find("`" + e.name + "`"), std::string::npos) << line;
    }
    ++row;
  }
  EXPECT_EQ(row, all.size());
}

}  // namespace
