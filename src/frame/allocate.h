// Temporary buffers of one call, from zelcore.
#pragma once

#include <cstdint>

namespace zel {

// Null, without asking zelcore, when count is below 1.
int32_t* allocate32(int count);
int16_t* allocate16(int count);
void release(void* ptr);

}  // namespace zel
