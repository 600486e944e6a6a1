#include "frame/entry_table.h"

#include "zelcc/zelcc.h"

namespace zel {

#define ZEL_EXPORT(name, extras) {#name, reinterpret_cast<void (*)()>(&::name)},
#define ZEL_SHARED(name, other, extras) {#name, reinterpret_cast<void (*)()>(&::other)},
const EntrySlot kEntryTable[] = {
#include "frame/manifest.inc"
};
#undef ZEL_EXPORT
#undef ZEL_SHARED

const int kEntryCount = sizeof(kEntryTable) / sizeof(kEntryTable[0]);

}  // namespace zel
