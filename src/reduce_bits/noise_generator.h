// The noise generator of the dithers: a subtract-with-borrow sequence mixed
// with a linear congruential one, scaled to a range. Two record forms, one
// with integer bounds and one with float bounds, each guarded by an identity
// value. Records come from zelcore and go back through the Free operations.
#pragma once

#include <cstdint>

#include "zelcc/zelcc.h"

namespace zel::reduce {

inline constexpr int32_t kNoiseGen16Identity = 36;
inline constexpr int32_t kNoiseGen32fIdentity = 37;

template <typename Bound>
struct NoiseGenState {
  int32_t identity;
  uint32_t seed;
  Bound low, high;
  double mid;    // (low + high) * 0.5
  double scale;  // (high - low) * 2^-32
  uint32_t lcg;
  uint32_t swbA, swbB, swbC;  // latest first
  int32_t borrow;             // 0 or -1
};
using NoiseGenState16 = NoiseGenState<int16_t>;
using NoiseGenState32f = NoiseGenState<float>;

Status NoiseGenInit16(NoiseGenState16** state, int16_t low, int16_t high, uint32_t seed);
Status NoiseGenInit32f(NoiseGenState32f** state, float low, float high, uint32_t seed);
Status NoiseGenFill16(int16_t* values, int count, NoiseGenState16* state);
Status NoiseGenFill32f(float* values, int count, NoiseGenState32f* state);
Status NoiseGenFree16(NoiseGenState16* state);
Status NoiseGenFree32f(NoiseGenState32f* state);

// The two tables of a noisy call: 1024 random indices in 0..1023 and 1024
// noise values in [low, high), both from seed 0.
inline constexpr int kNoiseTableSize = 1024;
struct NoiseTables {
  float* values = nullptr;
  int16_t* randomIndex = nullptr;
  NoiseGenState16* indexGen = nullptr;
  NoiseGenState32f* valueGen = nullptr;
};

// Builds both tables; on failure nothing stays allocated.
Status buildNoiseTables(NoiseTables& tables, float low, float high);
// Frees the records and releases the tables.
void releaseNoiseTables(NoiseTables& tables);

}  // namespace zel::reduce
