// The table of implementations, one slot per exported name in byte-wise
// order of the names.
#pragma once

namespace zel {

struct EntrySlot {
  const char* name;
  void (*impl)();
};

extern const EntrySlot kEntryTable[];
extern const int kEntryCount;

}  // namespace zel
