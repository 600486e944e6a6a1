// The fuzzer's regression inputs, replayed on every test run: each case
// must hold (fuzz_case.h); a fault fails the run.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "fuzz/fuzz_case.h"

namespace {

namespace fs = std::filesystem;

TEST(FuzzCorpus, EveryRegressionInputHolds) {
  const fs::path dir = ZELCC_FUZZ_CORPUS;
  ASSERT_TRUE(fs::is_directory(dir)) << dir;
  std::vector<fs::path> inputs;
  for (const auto& entry : fs::directory_iterator(dir))
    if (entry.is_regular_file()) inputs.push_back(entry.path());
  std::sort(inputs.begin(), inputs.end());
  ASSERT_FALSE(inputs.empty());
  for (const fs::path& path : inputs) {
    std::ifstream in(path, std::ios::binary);
    const std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    EXPECT_EQ(zel::fuzz::runCase(bytes.data(), bytes.size()), "") << path.filename();
  }
}

}  // namespace
