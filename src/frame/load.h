// What the library does when it is loaded: record whether the processor
// reports both feature bits 4 and 5. Nothing reads the flag at conversion
// time; every function has one code path.
#pragma once

namespace zel {

constexpr int kAttachProcess = 1;
extern int cpuPairEnabled;
// Returns 1 for every reason; only attach does anything.
int onLoad(int reason);

}  // namespace zel
