#include "frame/allocate.h"

#include "core/zelcore.h"

namespace zel {

int32_t* allocate32(int count) {
  if (count < 1) return nullptr;
  return static_cast<int32_t*>(zelMalloc(static_cast<int>(static_cast<unsigned>(count) * 4u)));
}

int16_t* allocate16(int count) {
  if (count < 1) return nullptr;
  return static_cast<int16_t*>(zelMalloc(static_cast<int>(static_cast<unsigned>(count) * 2u)));
}

void release(void* ptr) { zelFree(ptr); }

}  // namespace zel
