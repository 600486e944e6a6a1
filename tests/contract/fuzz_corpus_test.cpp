// The fuzzer's regression inputs, replayed on every test run: each case
// must hold (fuzz_case.h); a fault fails the run, naming the input.
#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "fuzz/fuzz_case.h"

namespace {

namespace fs = std::filesystem;

char gCurrent[256];
struct sigaction gOldSegv, gOldBus;

// Names the input and puts back whoever had the fault before (the address
// sanitizer, or the default end): the faulting access runs again and meets
// that handler.
void tellAndPass(int sig) {
  const char what[] = "fault in fuzzing case ";
  (void)!write(2, what, sizeof what - 1);
  (void)!write(2, gCurrent, strlen(gCurrent));
  (void)!write(2, "\n", 1);
  sigaction(sig, sig == SIGSEGV ? &gOldSegv : &gOldBus, nullptr);
}

TEST(FuzzCorpus, EveryRegressionInputHolds) {
  const fs::path dir = ZELCC_FUZZ_CORPUS;
  ASSERT_TRUE(fs::is_directory(dir)) << dir;
  std::vector<fs::path> inputs;
  for (const auto& entry : fs::directory_iterator(dir))
    if (entry.is_regular_file()) inputs.push_back(entry.path());
  std::sort(inputs.begin(), inputs.end());
  ASSERT_FALSE(inputs.empty());
  struct sigaction tell {};
  tell.sa_handler = tellAndPass;
  sigemptyset(&tell.sa_mask);
  tell.sa_flags = SA_NODEFER;
  sigaction(SIGSEGV, &tell, &gOldSegv);
  sigaction(SIGBUS, &tell, &gOldBus);
  for (const fs::path& path : inputs) {
    std::strncpy(gCurrent, path.filename().c_str(), sizeof gCurrent - 1);
    std::ifstream in(path, std::ios::binary);
    const std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    EXPECT_EQ(zel::fuzz::runCase(bytes.data(), bytes.size()), "") << path.filename();
  }
  sigaction(SIGSEGV, &gOldSegv, nullptr);
  sigaction(SIGBUS, &gOldBus, nullptr);
}

}  // namespace
