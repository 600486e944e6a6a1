// The version record and the load routine.
#include "frame/load.h"
#include "core/zelcore.h"
#include "zelcc/zelcc.h"

namespace zel {

int cpuPairEnabled = 0;

namespace {
constexpr LibraryVersion kVersion = {8, 2, 1, 44077, {'q', '3', 0, 0}, "zelCC AVX (q3)", "8.2.1 (r44077)",
                                     "Oct  9 2014"};
}  // namespace

int onLoad(int reason) {
  if (reason == kAttachProcess) {
    const uint64_t features = zelGetEnabledCpuFeatures();
    cpuPairEnabled = ((features & 16u) && (features & 32u)) ? 1 : 0;
  }
  return 1;
}

namespace {
// The loader attaches the library to the process once.
__attribute__((constructor)) void attachToProcess() { onLoad(kAttachProcess); }
}  // namespace

}  // namespace zel

extern "C" ZELCC_API const LibraryVersion* zelccGetLibVersion(void) { return &zel::kVersion; }
