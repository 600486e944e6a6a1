// One fuzzing case: an input of bytes picks an export from the descriptor
// table, a size (sometimes one the member must reject), where the buffers
// lie (heap with guard bytes, or against an inaccessible page), steps
// (negative and zero where the member takes them unchecked), family values
// (inside the range their rejected values bound, sometimes a rejected one)
// and the source data. The call must then
//   - return a status of the library's list; an error where a size or value
//     was chosen to be rejected, success where everything is the default;
//   - write nothing when it fails, and on success nothing outside the rows
//     of its destinations (guard bytes, step padding, sources, records, an
//     AC4 destination's alpha);
//   - give the same bytes when made again on the same bytes.
// A fault is left to the caller: the fuzzer's own handler, or a test's.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace zel::fuzz {

// "" when the case holds, else what went wrong (with the export, size and
// layout chosen).
std::string runCase(const uint8_t* data, size_t size);

// What the case chose, in words, for messages and for tools/fuzz.sh.
std::string describeCase(const uint8_t* data, size_t size);

}  // namespace zel::fuzz
