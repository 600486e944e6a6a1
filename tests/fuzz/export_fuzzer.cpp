// libFuzzer entry: one case a run (fuzz_case.h); a broken expectation
// aborts with the case in words, a fault is the sanitizers' to report.
// With ZELCC_FUZZ_TELL set, each case is told before it runs.
#include <cstdio>
#include <cstdlib>

#include "fuzz/fuzz_case.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const bool tell = std::getenv("ZELCC_FUZZ_TELL") != nullptr;
  if (tell) std::fprintf(stderr, "case: %s\n", zel::fuzz::describeCase(data, size).c_str());
  const std::string failure = zel::fuzz::runCase(data, size);
  if (!failure.empty()) {
    std::fprintf(stderr, "zelcc fuzz case failed: %s\n", failure.c_str());
    std::abort();
  }
  return 0;
}
