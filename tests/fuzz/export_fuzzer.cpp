// libFuzzer entry: one case a run (fuzz_case.h); a broken expectation
// aborts with the case in words, a fault is the sanitizers' to report.
#include <cstdio>
#include <cstdlib>

#include "fuzz/fuzz_case.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string failure = zel::fuzz::runCase(data, size);
  if (!failure.empty()) {
    std::fprintf(stderr, "zelcc fuzz case failed: %s\n", failure.c_str());
    std::abort();
  }
  return 0;
}
