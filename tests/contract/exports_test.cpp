// The exported surface: the manifest against the list of all export names,
// the shared library's dynamic symbol table, and the version record.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstring>
#include <fstream>
#include <regex>
#include <set>
#include <string>
#include <vector>

#include "frame/descriptor.h"

namespace {

std::vector<std::string> readLines(const char* path) {
  std::vector<std::string> out;
  std::ifstream in(path);
  std::string line;
  while (std::getline(in, line))
    if (!line.empty()) out.push_back(line);
  return out;
}

std::vector<std::string> manifestNames() {
  std::vector<std::string> out;
  const std::regex entry("^ZEL_(EXPORT|SHARED)\\(([A-Za-z0-9_]+)");
  for (const std::string& line : readLines(ZELCC_MANIFEST_FILE)) {
    std::smatch m;
    if (std::regex_search(line, m, entry)) out.push_back(m[2]);
  }
  return out;
}

TEST(Exports, ListIsCompleteAndInByteOrder) {
  const auto all = readLines(ZELCC_EXPORTS_FILE);
  ASSERT_EQ(all.size(), 521u);
  for (size_t i = 1; i < all.size(); ++i) EXPECT_LT(std::strcmp(all[i - 1].c_str(), all[i].c_str()), 0) << all[i];
  EXPECT_EQ(all.front(), "zelccGetLibVersion");
  EXPECT_EQ(all.back(), "zeliYUVToRGB_8u_P3R");
  std::ifstream shared(ZELCC_SHARED_EXPORTS_FILE);
  if (shared) EXPECT_EQ(readLines(ZELCC_SHARED_EXPORTS_FILE), all) << "the project's list differs from ours";
}

TEST(Exports, ManifestFollowsTheListInSlotOrder) {
  const auto all = readLines(ZELCC_EXPORTS_FILE);
  const auto names = manifestNames();
  size_t at = 0;
  for (const std::string& n : names) {
    while (at < all.size() && all[at] != n) ++at;
    ASSERT_LT(at, all.size()) << n << " is not an export name or is out of slot order";
    ++at;
  }
  // The descriptors are the manifest, in the same order.
  const auto& ds = zel::meta::allDescriptors();
  ASSERT_EQ(ds.size(), names.size());
  for (size_t i = 0; i < names.size(); ++i) EXPECT_EQ(ds[i].name, names[i]);
}

TEST(Exports, EveryNameIsBuilt) {
  // The manifest is the whole list: every slot, in order.
  EXPECT_EQ(manifestNames(), readLines(ZELCC_EXPORTS_FILE));
}

TEST(Exports, DynamicSymbolTableHoldsExactlyTheManifest) {
  const std::string command = std::string("nm -D --defined-only '") + ZELCC_SHARED_LIBRARY + "'";
  FILE* pipe = popen(command.c_str(), "r");
  ASSERT_NE(pipe, nullptr);
  std::set<std::string> symbols;
  char line[512];
  while (std::fgets(line, sizeof line, pipe)) {
    char address[64], type[8], name[400];
    if (std::sscanf(line, "%63s %7s %399s", address, type, name) == 3) {
      std::string n = name;
      const size_t at = n.find('@');
      if (at != std::string::npos) n.erase(at);
      symbols.insert(n);
    }
  }
  ASSERT_EQ(pclose(pipe), 0) << "nm failed";
  const auto names = manifestNames();
  const std::set<std::string> expected(names.begin(), names.end());
  EXPECT_EQ(symbols, expected);
}

TEST(Version, RecordReadsAsPublished) {
  const LibraryVersion* v = zelccGetLibVersion();
  ASSERT_NE(v, nullptr);
  EXPECT_EQ(v, zelccGetLibVersion());
  EXPECT_EQ(v->major, 8);
  EXPECT_EQ(v->minor, 2);
  EXPECT_EQ(v->revision, 1);
  EXPECT_EQ(v->build, 44077);
  EXPECT_EQ(std::memcmp(v->variantCode, "q3\0\0", 4), 0);
  EXPECT_STREQ(v->name, "zelCC AVX (q3)");
  EXPECT_STREQ(v->version, "8.2.1 (r44077)");
  EXPECT_STREQ(v->buildDate, "Oct  9 2014");
}

}  // namespace
