#include "reduce_bits/noise_generator.h"

#include <emmintrin.h>

#include "frame/allocate.h"

namespace zel::reduce {

namespace {

constexpr uint32_t kLcgMultiplier = 69069u;
constexpr uint32_t kLcgIncrement = 1013904243u;
constexpr uint32_t kLcgStart = 1131199209u;
constexpr double kTwoToMinus32 = 2.3283064365387e-10;

template <typename Bound>
Status initState(NoiseGenState<Bound>** out, Bound low, Bound high, uint32_t seed, int32_t identity) {
  if (!out) return StatusNullPointerError;
  constexpr int words = int((sizeof(NoiseGenState<Bound>) + 3) / 4);
  auto* s = reinterpret_cast<NoiseGenState<Bound>*>(allocate32(words));
  if (!s) return StatusOutOfMemoryError;
  s->identity = identity;
  s->seed = seed;
  s->low = low;
  s->high = high;
  // The bounds are summed in their own type, then widened.
  s->mid = double(low + high) * 0.5;
  s->scale = double(high - low) * kTwoToMinus32;
  s->lcg = kLcgStart;
  s->swbA = seed;
  s->swbB = seed * kLcgMultiplier + kLcgIncrement;
  s->swbC = s->swbB * kLcgMultiplier + kLcgIncrement;
  s->borrow = -1;
  *out = s;
  return StatusOk;
}

// One output of the sequence, before its conversion.
template <typename Bound>
inline double nextNoise(NoiseGenState<Bound>& s) {
  uint32_t t = s.swbB - s.swbC + uint32_t(s.borrow);
  if (t & 0x80000000u) {
    t -= 18u;
    s.borrow = -1;
  } else {
    s.borrow = 0;
  }
  s.lcg = s.lcg * kLcgMultiplier + kLcgIncrement;
  const int32_t r = int32_t(t + s.lcg);
  const double x = s.mid + s.scale * double(r);
  s.swbC = s.swbB;
  s.swbB = s.swbA;
  s.swbA = t;
  return x;
}

template <typename Bound, typename Value, typename Convert>
Status fill(Value* values, int count, NoiseGenState<Bound>* state, int32_t identity, Convert convert) {
  if (!values || !state) return StatusNullPointerError;
  if (count < 1) return StatusSizeError;
  if (state->identity != identity) return StatusStateIdentityError;
  for (int i = 0; i < count; ++i) values[i] = convert(nextNoise(*state));
  return StatusOk;
}

template <typename Bound>
Status freeState(NoiseGenState<Bound>* state, int32_t identity) {
  if (!state) return StatusNullPointerError;
  if (state->identity != identity) return StatusStateIdentityError;
  release(state);
  return StatusOk;
}

}  // namespace

Status NoiseGenInit16(NoiseGenState16** state, int16_t low, int16_t high, uint32_t seed) {
  return initState<int16_t>(state, low, high, seed, kNoiseGen16Identity);
}
Status NoiseGenInit32f(NoiseGenState32f** state, float low, float high, uint32_t seed) {
  return initState<float>(state, low, high, seed, kNoiseGen32fIdentity);
}
Status NoiseGenFill16(int16_t* values, int count, NoiseGenState16* state) {
  return fill(values, count, state, kNoiseGen16Identity,
              [](double x) { return int16_t(_mm_cvttsd_si32(_mm_set_sd(x))); });
}
Status NoiseGenFill32f(float* values, int count, NoiseGenState32f* state) {
  return fill(values, count, state, kNoiseGen32fIdentity, [](double x) { return float(x); });
}
Status NoiseGenFree16(NoiseGenState16* state) { return freeState(state, kNoiseGen16Identity); }
Status NoiseGenFree32f(NoiseGenState32f* state) { return freeState(state, kNoiseGen32fIdentity); }

Status buildNoiseTables(NoiseTables& t, float low, float high) {
  t = NoiseTables{};
  t.values = reinterpret_cast<float*>(allocate32(kNoiseTableSize));
  if (!t.values) return StatusOutOfMemoryError;
  t.randomIndex = allocate16(kNoiseTableSize);
  Status s = t.randomIndex ? NoiseGenInit16(&t.indexGen, 0, 1024, 0) : StatusOutOfMemoryError;
  if (s == StatusOk) s = NoiseGenFill16(t.randomIndex, kNoiseTableSize, t.indexGen);
  if (s == StatusOk) s = NoiseGenInit32f(&t.valueGen, low, high, 0);
  if (s == StatusOk) s = NoiseGenFill32f(t.values, kNoiseTableSize, t.valueGen);
  if (s != StatusOk) releaseNoiseTables(t);
  return s;
}

void releaseNoiseTables(NoiseTables& t) {
  if (t.indexGen) NoiseGenFree16(t.indexGen);
  if (t.valueGen) NoiseGenFree32f(t.valueGen);
  if (t.randomIndex) release(t.randomIndex);
  if (t.values) release(t.values);
  t = NoiseTables{};
}

}  // namespace zel::reduce
