// Bit-depth reduction: what each member computes for one sample. All level
// arithmetic is 32-bit float, every step rounded as written; conversions to
// integer truncate toward zero (CVTTSS2SI, whose out-of-range result the
// vector bodies share).
#pragma once

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "frame/float_ops.h"
#include "frame/scalar_ops.h"
#include "zelcc/zelcc.h"

namespace zel::reduce {

// The layout of a member: channels worked on and samples a pixel.
enum class LayoutCode { C1 = 1, C3 = 3, AC4 = 4, C4 = 5 };

template <LayoutCode L>
struct LayoutOf {
  static constexpr int channels = L == LayoutCode::C1 ? 1 : L == LayoutCode::C4 ? 4 : 3;
  static constexpr int stride = L == LayoutCode::C1 ? 1 : L == LayoutCode::C3 ? 3 : 4;
  static constexpr bool keepsAlpha = L == LayoutCode::AC4;
};

// Samples may sit at any byte address (steps are byte distances).
template <typename T>
inline T loadSample(const T* row, std::ptrdiff_t i) {
  T v;
  std::memcpy(&v, row + i, sizeof(T));
  return v;
}
template <typename T>
inline void storeSample(T* row, std::ptrdiff_t i, T v) {
  std::memcpy(row + i, &v, sizeof(T));
}

// 32-bit wrapping difference, as the vector lanes subtract.
inline int32_t wrapSub(int32_t a, int32_t b) { return int32_t(uint32_t(a) - uint32_t(b)); }
inline int32_t clampInt(int32_t v, int32_t lo, int32_t hi) { return v < lo ? lo : (v > hi ? hi : v); }

enum class SourceClass { Bits8, Bits16, Float };

// One source/destination pair of the family.
template <typename Src, typename Dst>
struct Member {
  using Source = Src;
  using Dest = Dst;
  static constexpr SourceClass source = std::is_same_v<Src, uint8_t>   ? SourceClass::Bits8
                                        : std::is_same_v<Src, float> ? SourceClass::Float
                                                                     : SourceClass::Bits16;
  static constexpr bool signedSource = std::is_same_v<Src, int16_t>;
  static constexpr bool byteDest = std::is_same_v<Dst, uint8_t>;
  static constexpr bool signedDest = std::is_same_v<Dst, int16_t>;
  static constexpr int maxLevels = byteDest ? 256 : 65536;
  // A 16-bit integer source to an 8-bit destination drops the low byte.
  static constexpr bool narrows = source == SourceClass::Bits16 && byteDest;
  // Floyd-Steinberg of a signed 16-bit source to bytes and of float sources
  // sums the row above in another order and rounds its store by a half.
  static constexpr bool roundedDiffusion = (signedSource && byteDest) || source == SourceClass::Float;
  // Ordered dither of an integer source to bytes, C1: the samples behind the
  // last whole block store their low 8 bits without a clamp.
  static constexpr bool wrapsRowEnd = byteDest && source != SourceClass::Float;

  static constexpr int32_t destMin = byteDest ? 0 : signedDest ? -32768 : 0;
  static constexpr int32_t destMax = byteDest ? 255 : signedDest ? 32767 : 65535;
};

// ---- Quantisation without dither ----

struct PlainLevels {
  float span;  // levels - 1
  float inv;   // 1 / span
  float half;  // 0.5 / span
};

inline PlainLevels plainLevels(int levels) {
  const float span = float(levels - 1);
  return PlainLevels{span, 1.0f / span, 0.5f / span};
}

// The sample as a fraction of its range.
template <typename Src>
inline float normalise(Src s) {
  if constexpr (std::is_same_v<Src, uint8_t>) return float(s) * 0.003921569f;  // 0x3B808081
  else if constexpr (std::is_same_v<Src, uint16_t>) return float(s) * 1.5259022e-5f;  // 0x37800080
  else if constexpr (std::is_same_v<Src, int16_t>) return float(int32_t(s) + 32768) * 1.5259022e-5f;
  else return s;
}

// The nearest level below or at t, one up when t lies strictly beyond the
// half-way mark.
inline float nearestLevel(float t, const PlainLevels& p) {
  const int32_t i = TruncateToInt(t * p.span);
  float base = p.inv * float(i);
  if (t - base > p.half) base = base + p.inv;
  return base;
}

// The level scaled to the destination's range, before the store.
template <typename Dst>
inline int32_t plainScaled(float level) {
  return TruncateToInt(level * (std::is_same_v<Dst, uint8_t> ? 255.0f : 65535.0f));
}

// Stores of the plain path. Bytes: the body saturates through 16 bits, the
// row's end clamps the low 16 bits read as signed. Unsigned 16 bits: low 16
// bits, except AC4 which clamps. Signed 16 bits: saturated after the bias.
inline uint8_t plainBodyByte(int32_t v) { return SaturateU8(SaturateS16(v)); }
inline uint8_t plainEndByte(int32_t v) { return SaturateU8(int16_t(uint16_t(uint32_t(v)))); }
inline uint16_t plainWord(int32_t v) { return uint16_t(uint32_t(v)); }
inline uint16_t plainClampedWord(int32_t v) { return uint16_t(SaturateS16(wrapSub(v, 32768)) + 32768); }
inline int16_t plainSignedWord(int32_t v) { return SaturateS16(wrapSub(v, 32768)); }

// Samples of a row that the plain path takes as whole blocks: 8 for byte
// sources, 4 for float sources to bytes.
template <typename Src, typename Dst>
constexpr int plainBlock() {
  return std::is_same_v<Src, float> && std::is_same_v<Dst, uint8_t> ? 4 : 8;
}

// One sample of the plain path; `atEnd` for the samples behind the last
// whole block, `clampWords` for AC4 of 16-bit unsigned destinations.
template <typename Src, typename Dst>
inline Dst plainSample(Src s, const PlainLevels& p, bool atEnd, bool clampWords) {
  const int32_t v = plainScaled<Dst>(nearestLevel(normalise(s), p));
  if constexpr (std::is_same_v<Dst, uint8_t>) return atEnd ? plainEndByte(v) : plainBodyByte(v);
  else if constexpr (std::is_same_v<Dst, uint16_t>) return clampWords ? plainClampedWord(v) : plainWord(v);
  else return plainSignedWord(v);
}

// ---- Values shared by the dithers ----

struct QuantValues {
  float q;    // one quantisation step in working units
  float inv;  // steps per working unit
  float top;  // clamp of the diffusion kinds
};

template <typename Src>
inline QuantValues quantValues(int levels) {
  const float span = float(levels - 1);
  if constexpr (std::is_same_v<Src, uint8_t>) return QuantValues{(65280.0f / span) * 0.00390625f, span / 255.0f, 255.0f};
  else if constexpr (std::is_same_v<Src, float>) return QuantValues{1.0f / span, span, 1.0f};
  else return QuantValues{65535.0f / span, span / 65535.0f, 65535.0f};
}

// The value a dither works on.
template <typename Src>
inline float working(Src s) {
  if constexpr (std::is_same_v<Src, int16_t>) return float(int32_t(s) + 32768);
  else return float(s);
}

// The level at or below w. The truncation stays in the vector registers
// (the same CVTTPS2DQ result as CVTTSS2SI); diffusion waits on it.
inline float levelBelow(float w, const QuantValues& qv) {
  const __m128i i = _mm_cvttps_epi32(_mm_set_ss(w * qv.inv));
  return _mm_cvtss_f32(_mm_cvtepi32_ps(i)) * qv.q;
}

// Index into the noise values of pixel x of row y.
inline int noiseIndex(const int16_t* randomIndex, int x, int y) {
  return (int(randomIndex[x & 1023]) + 2 * y + x) & 1023;
}

// ---- Error diffusion ----

// Below this a diffusion sample takes the smallest value.
template <typename Src>
inline float diffusionBottom(bool floydSteinberg) {
  return floydSteinberg && std::is_same_v<Src, float> ? 1.1920929e-7f : 0.0f;
}

// The destination value of level o; `halfUp` in Floyd-Steinberg of the
// members that round their store.
template <typename M>
inline typename M::Dest diffusionStore(float o, bool halfUp) {
  float x = o;
  if constexpr (M::source == SourceClass::Float) x = x * (M::byteDest ? 255.0f : 65535.0f);
  if (halfUp) x = x + 0.5f;
  int32_t v = TruncateToInt(x);
  if constexpr (M::narrows) v >>= 8;
  if constexpr (M::signedDest) v = wrapSub(v, 32768);
  return static_cast<typename M::Dest>(v);
}

// base + q when a < b, else base, without a branch: the decision is as
// good as random, and the next pixel waits for it. base + 0.0f is base.
inline float stepUpIfLess(float a, float b, float base, float q) {
  const __m128 up = _mm_cmplt_ss(_mm_set_ss(a), _mm_set_ss(b));
  return _mm_cvtss_f32(_mm_add_ss(_mm_set_ss(base), _mm_and_ps(up, _mm_set_ss(q))));
}

// The common step of the diffusion kinds. v is the working value with the
// error added; `threshold` is the noise value, or unused without noise.
// Returns the error to keep and stores the destination value in *out.
template <typename M, bool Noisy>
inline float diffuse(float v, const QuantValues& qv, float bottom, float threshold, bool halfUp,
                     typename M::Dest* out) {
  using Dst = typename M::Dest;
  if (v >= qv.top) {
    *out = static_cast<Dst>(M::destMax);
    return 0.0f;
  }
  if (v < bottom) {
    *out = static_cast<Dst>(M::destMin);
    return 0.0f;
  }
  const float base = levelBelow(v, qv);
  // Up when the noise threshold, or else half a step, lies strictly below
  // v - base.
  const float o = stepUpIfLess(Noisy ? threshold : qv.q * 0.5f, v - base, base, qv.q);
  *out = diffusionStore<M>(o, halfUp);
  return v - o;
}

// Floyd-Steinberg error of column x from the previous row P and the error
// `left` just kept at column x - 1 of the current row, in the member's order
// of summation.
template <bool LateLeft>
inline float floydSteinbergError(const float* P, float left, int x) {
  if constexpr (LateLeft) return ((P[x + 1] * 3.0f + P[x] * 5.0f) + P[x - 1]) + left * 7.0f;
  else return ((P[x + 1] * 3.0f + P[x - 1]) + P[x] * 5.0f) + left * 7.0f;
}

// Weights of the three-row kinds.
struct ThreeRowWeights {
  float a, b, c, f;
};
inline ThreeRowWeights threeRowWeights(uint32_t kind) {
  return kind == ReduceDitherJarvisJudiceNinke ? ThreeRowWeights{5.0f, 3.0f, 7.0f, 0.020833334f}
                                    : ThreeRowWeights{4.0f, 2.0f, 8.0f, 0.023809524f};
}

// The weighted error of column x, U2 two rows up, U1 one row up, and the
// current row's errors left2, left1 at columns x - 2, x - 1; summed in this
// grouping for every pixel.
inline float threeRowError(const float* U2, const float* U1, float left2, float left1, int x,
                           const ThreeRowWeights& k) {
  const float g = (left2 * k.a + (U2[x - 2] + U1[x - 2] * k.b)) + (U2[x] * k.a + U1[x] * k.c);
  const float h = (left1 * k.c + (U2[x - 1] * k.b + U1[x - 1] * k.a)) + (U2[x + 1] * k.b + U1[x + 1] * k.a);
  return (((g + h) + U2[x + 2]) + U1[x + 2] * k.b) * k.f;
}

// ---- Ordered dither ----

// k / 15 as the nearest float, M[row][column].
alignas(16) inline constexpr float kOrderedMatrix[4][4] = {
    {0.0f / 15, 8.0f / 15, 2.0f / 15, 10.0f / 15},
    {12.0f / 15, 4.0f / 15, 14.0f / 15, 6.0f / 15},
    {3.0f / 15, 11.0f / 15, 1.0f / 15, 9.0f / 15},
    {15.0f / 15, 7.0f / 15, 13.0f / 15, 5.0f / 15}};

inline float orderedThreshold(const QuantValues& qv, int x, int y) { return qv.q * kOrderedMatrix[y & 3][x & 3]; }
inline float noisyOrderedThreshold(const QuantValues& qv, float noise, int x, int y) {
  return (noise + kOrderedMatrix[y & 3][x & 3]) * qv.q;
}

// The level that working value w takes against threshold t.
inline float orderedLevel(float w, float t, const QuantValues& qv) {
  const float base = levelBelow(w, qv);
  return t < w - base ? base + qv.q : base;
}

// The level as an integer in the source's units (scaled for float sources,
// the low byte dropped where 16 bits narrow to 8).
template <typename M>
inline int32_t orderedInteger(float o) {
  int32_t v;
  if constexpr (M::source == SourceClass::Float) v = TruncateToInt(o * (M::byteDest ? 255.0f : 65535.0f));
  else v = TruncateToInt(o);
  if constexpr (M::narrows) v >>= 8;
  return v;
}

// The clamped store, and the unclamped low byte of the row's end.
template <typename M>
inline typename M::Dest orderedStore(int32_t v) {
  if constexpr (M::byteDest) return static_cast<uint8_t>(clampInt(v, 0, 255));
  else if constexpr (M::signedDest) return static_cast<int16_t>(clampInt(v, 0, 65535) - 32768);
  else return static_cast<uint16_t>(clampInt(v, 0, 65535));
}
inline uint8_t orderedWrappedByte(int32_t v) { return static_cast<uint8_t>(uint32_t(v)); }

}  // namespace zel::reduce
