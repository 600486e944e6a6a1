// Rows of three-channel 8-bit pixels in the full-resolution layouts, and
// the row converter that runs a body form and a tail form over them.
//
// A source view gives three channels in memory order, a destination view
// takes three channels in the order of its format (Reverse writes them
// backwards, for BGR). Interleaved rows are split into channels and merged
// again with byte shuffles, so the vector arithmetic is that of planes.
// Vector blocks read and write exactly the bytes of their pixels.
#pragma once

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "luma_chroma/pixel_permutes.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc {

// ---- shuffle patterns for interleaved rows ----

// gather[c][k]: channel c of the 16 pixels from the k-th 16 bytes of a
// block of pixels `Stride` bytes apart.
template <int Stride>
struct GatherPatterns {
  Shuffle16 gather[3][Stride];
};
template <int Stride>
constexpr GatherPatterns<Stride> makeGather() {
  GatherPatterns<Stride> p{};
  for (int c = 0; c < 3; ++c)
    for (int k = 0; k < Stride; ++k)
      for (int i = 0; i < 16; ++i) {
        const int at = Stride * i + c - 16 * k;
        p.gather[c][k].b[i] = static_cast<int8_t>(at >= 0 && at < 16 ? at : -1);
      }
  return p;
}

// Three-byte pixels by rotation and blend. 3 is invertible modulo 16, so
// byte j of the k-th 16 bytes of 16 pixels, which is channel (16k + j) mod 3
// of pixel (16k + j) / 3, is also byte j of that channel rotated: pixel p of
// channel c moved to byte (3p + c) mod 16. Splitting blends the three 16-byte
// parts byte by byte into the rotated channels and rotates them back; merging
// rotates and blends.
//   rotate[c]  channel c, pixel order to rotated order;
//   unrotate[c] rotated order back to pixel order;
//   part[k][c] blend mask: the bytes of part k that belong to channel c;
//   from[c][k] blend mask: the bytes of rotated channel c found in part k.
struct RotatePatterns {
  Shuffle16 rotate[3], unrotate[3], part[3][3], from[3][3];
};
constexpr RotatePatterns makeRotate() {
  RotatePatterns p{};
  for (int c = 0; c < 3; ++c)
    for (int i = 0; i < 16; ++i) {
      const int j = (3 * i + c) % 16;
      p.rotate[c].b[j] = static_cast<int8_t>(i);
      p.unrotate[c].b[i] = static_cast<int8_t>(j);
    }
  for (int k = 0; k < 3; ++k)
    for (int c = 0; c < 3; ++c)
      for (int j = 0; j < 16; ++j) {
        p.part[k][c].b[j] = static_cast<int8_t>((16 * k + j) % 3 == c ? -128 : 0);
        p.from[c][k].b[j] = static_cast<int8_t>(((c - j) % 3 + 3) % 3 == k ? -128 : 0);
      }
  return p;
}

template <int Stride>
inline constexpr GatherPatterns<Stride> kGather = makeGather<Stride>();
inline constexpr RotatePatterns kRotate3 = makeRotate();

// ---- 64-pixel blocks (Avx512) ----

// The full-resolution rows hand a form 64 pixels as two halves of 16-bit
// lanes, pixels 0..31 and 32..63 in order, each sample in the high byte of
// its lane (S << 8): one zero-masked byte permute a half and channel. The
// form's bytes come back in lane-split order, the order in which the byte
// pack of the two halves leaves them: byte m of 128-bit lane k is pixel
// 8k + m for m < 8 and pixel 32 + 8k + m - 8 for m >= 8.
constexpr int splitPosition(int p) { return 16 * ((p & 31) >> 3) + (p & 32 ? 8 : 0) + (p & 7); }

// The odd bytes: the high bytes of the 16-bit lanes.
inline constexpr uint64_t kHighByteLanes = 0xAAAAAAAAAAAAAAAAu;

// Interleaved pixels of Stride bytes: half h reads two 64-byte parts of the
// block (the first two, or the last two); half[h][c] names, in the high byte
// of lane w, the byte of those 128 that holds channel c of pixel 32h + w.
// Planes (Stride 1) take half[h][0] from their 64 bytes.
template <int Stride>
struct HighGather {
  Permute64 half[2][3];
};
template <int Stride>
constexpr HighGather<Stride> makeHighGather() {
  HighGather<Stride> g{};
  for (int h = 0; h < 2; ++h)
    for (int c = 0; c < 3; ++c) {
      g.half[h][c].mask = kHighByteLanes;
      for (int w = 0; w < 32; ++w) {
        const int first = Stride > 1 ? 64 * (Stride - 2) * h : 0;  // the half's first byte
        g.half[h][c].index[2 * w + 1] = static_cast<uint8_t>(Stride * (32 * h + w) + c - first);
      }
    }
  return g;
}

struct HighWords512 {
  Trio<Avx512> lo, hi;
};

// Interleaved destinations of Stride bytes a pixel from lane-split bytes,
// 64 bytes at a time: byte j of part r takes the pixel at position
// part[r].index[j] of the channel that its place names (plus 64 for the
// second channel, read from the second of two tables); part[r].mask marks
// the bytes of the third channel. A fourth channel's bytes are kFourthBytes.
template <int Stride>
struct SplitScatter {
  Permute64 part[Stride];
};
template <int Stride>
constexpr SplitScatter<Stride> makeSplitScatter() {
  SplitScatter<Stride> s{};
  for (int r = 0; r < Stride; ++r)
    for (int j = 0; j < 64; ++j) {
      const int at = 64 * r + j, channel = at % Stride;
      s.part[r].index[j] = static_cast<uint8_t>(splitPosition(at / Stride) + (channel == 1 ? 64 : 0));
      if (channel == 2) s.part[r].mask |= uint64_t(1) << j;
    }
  return s;
}
inline constexpr uint64_t kFourthBytes = 0x8888888888888888u;

// Plane bytes from lane-split order to memory order.
constexpr Permute64 makeMemoryOrder() {
  Permute64 o{};
  for (int j = 0; j < 64; ++j) o.index[j] = static_cast<uint8_t>(splitPosition(j));
  o.mask = ~uint64_t(0);
  return o;
}

template <int Stride>
inline constexpr HighGather<Stride> kHighGather = makeHighGather<Stride>();
template <int Stride>
inline constexpr SplitScatter<Stride> kSplitScatter = makeSplitScatter<Stride>();
inline constexpr Permute64 kToMemory = makeMemoryOrder();

// Four-byte pixels of one 64-byte part of an interleaved destination: the
// first three channels placed, the fourth byte left to the caller.
ZEL_AVX512_VBMI inline __m512i scatterPart(const SplitScatter<4>& s, int r, __m512i first, __m512i second,
                                           __m512i third) {
  const __m512i index = indexOf(s.part[r]);
  return _mm512_mask_permutexvar_epi8(_mm512_permutex2var_epi8(first, index, second), s.part[r].mask, index, third);
}

// ---- sources ----

// Interleaved pixels of Stride bytes (C3: 3, AC4: 4; a fourth byte is
// never read by the arithmetic).
template <int Stride>
struct PackedIn {
  const uint8_t* p;
  void pixel(int x, int& a, int& b, int& c) const {
    const uint8_t* q = p + Stride * x;
    a = q[0];
    b = q[1];
    c = q[2];
  }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    const uint8_t* q = p + Stride * x;
    typename U::V chunk[Stride];
    if constexpr (std::is_same_v<U, Avx512>) {
      // The byte permutes split 64 pixels in memory order.
      if constexpr (Stride == 3)
        split3(q, chunk);
      else
        split4(q, chunk);
      return {chunk[0], chunk[1], chunk[2]};
    } else if constexpr (Stride == 3) {
      for (int k = 0; k < 3; ++k) chunk[k] = U::loadUnits(q + 16 * k, 48);
      const RotatePatterns& r = kRotate3;
      typename U::V out[3];
      for (int c = 0; c < 3; ++c) {
        const typename U::V mixed = U::blend8(U::blend8(chunk[0], chunk[1], U::shuffleOf(r.from[c][1])), chunk[2],
                                              U::shuffleOf(r.from[c][2]));
        out[c] = U::shuffle8(mixed, U::shuffleOf(r.unrotate[c]));
      }
      return {out[0], out[1], out[2]};
    } else {
      for (int k = 0; k < Stride; ++k) chunk[k] = U::loadUnits(q + 16 * k, 16 * Stride);
      const GatherPatterns<Stride>& g = kGather<Stride>;
      typename U::V out[3];
      for (int c = 0; c < 3; ++c) {
        out[c] = U::shuffle8(chunk[0], U::shuffleOf(g.gather[c][0]));
        for (int k = 1; k < Stride; ++k) out[c] = U::or_(out[c], U::shuffle8(chunk[k], U::shuffleOf(g.gather[c][k])));
      }
      return {out[0], out[1], out[2]};
    }
  }
  // 64 pixels for the full-resolution forms (see the 64-pixel blocks above).
  ZEL_AVX512_VBMI ZEL_INLINE HighWords512 highWords512(int x) const {
    const uint8_t* q = p + Stride * x;
    const HighGather<Stride>& g = kHighGather<Stride>;
    __m512i chunk[Stride];
    for (int k = 0; k < Stride; ++k) chunk[k] = _mm512_loadu_si512(q + 64 * k);
    __m512i out[2][3];
    for (int h = 0; h < 2; ++h)
      for (int c = 0; c < 3; ++c)
        out[h][c] = _mm512_maskz_permutex2var_epi8(g.half[h][c].mask, chunk[h ? Stride - 2 : 0],
                                                   indexOf(g.half[h][c]), chunk[h ? Stride - 1 : 1]);
    return {{out[0][0], out[0][1], out[0][2]}, {out[1][0], out[1][1], out[1][2]}};
  }
};

// Three planes at full resolution.
struct PlanesIn {
  const uint8_t* p0;
  const uint8_t* p1;
  const uint8_t* p2;
  void pixel(int x, int& a, int& b, int& c) const {
    a = p0[x];
    b = p1[x];
    c = p2[x];
  }
  template <class U>
  ZEL_INLINE Trio<U> block(int x) const {
    return {U::loadUnits(p0 + x, 16), U::loadUnits(p1 + x, 16), U::loadUnits(p2 + x, 16)};
  }
  // 64 pixels for the full-resolution forms (see the 64-pixel blocks above).
  ZEL_AVX512_VBMI ZEL_INLINE HighWords512 highWords512(int x) const {
    const HighGather<1>& g = kHighGather<1>;
    const __m512i lo = indexOf(g.half[0][0]), hi = indexOf(g.half[1][0]);
    const __m512i a = _mm512_loadu_si512(p0 + x), b = _mm512_loadu_si512(p1 + x), c = _mm512_loadu_si512(p2 + x);
    return {{half(lo, a), half(lo, b), half(lo, c)}, {half(hi, a), half(hi, b), half(hi, c)}};
  }
  ZEL_AVX512_VBMI ZEL_INLINE static __m512i half(__m512i index, __m512i v) {
    return _mm512_maskz_permutexvar_epi8(kHighByteLanes, index, v);
  }
};

// ---- destinations ----

// Interleaved three-byte pixels; Reverse stores the channels backwards.
template <bool Reverse>
struct PackedOut3 {
  uint8_t* p;
  void pixel(int x, int a, int b, int c) const {
    uint8_t* q = p + 3 * x;
    q[Reverse ? 2 : 0] = static_cast<uint8_t>(a);
    q[1] = static_cast<uint8_t>(b);
    q[Reverse ? 0 : 2] = static_cast<uint8_t>(c);
  }
  template <class U>
  ZEL_INLINE void block(int x, const Trio<U>& v) const {
    const typename U::V ch[3] = {Reverse ? v.c2 : v.c0, v.c1, Reverse ? v.c0 : v.c2};
    uint8_t* q = p + 3 * x;
    if constexpr (std::is_same_v<U, Avx512>) {
      merge3(q, ch[0], ch[1], ch[2]);
    } else {
      const RotatePatterns& r = kRotate3;
      typename U::V turned[3];
      for (int c = 0; c < 3; ++c) turned[c] = U::shuffle8(ch[c], U::shuffleOf(r.rotate[c]));
      for (int k = 0; k < 3; ++k) {
        const typename U::V o = U::blend8(U::blend8(turned[0], turned[1], U::shuffleOf(r.part[k][1])), turned[2],
                                          U::shuffleOf(r.part[k][2]));
        U::storeUnits(q + 16 * k, 48, o);
      }
    }
  }
  // 64 pixels from lane-split bytes (block<Avx512> takes memory order).
  ZEL_AVX512_VBMI ZEL_INLINE void block512(int x, const Trio<Avx512>& v) const {
    const __m512i first = Reverse ? v.c2 : v.c0, third = Reverse ? v.c0 : v.c2;
    const SplitScatter<3>& s = kSplitScatter<3>;
    uint8_t* q = p + 3 * x;
    for (int r = 0; r < 3; ++r) {
      const __m512i index = indexOf(s.part[r]);
      const __m512i two = _mm512_permutex2var_epi8(first, index, v.c1);
      _mm512_storeu_si512(q + 64 * r, _mm512_mask_permutexvar_epi8(two, s.part[r].mask, index, third));
    }
  }
};

// Four-byte pixels whose fourth byte is the caller's alpha (C4).
template <bool Reverse>
struct PackedOutAlpha {
  uint8_t* p;
  uint8_t alpha;
  void pixel(int x, int a, int b, int c) const {
    uint8_t* q = p + 4 * x;
    q[Reverse ? 2 : 0] = static_cast<uint8_t>(a);
    q[1] = static_cast<uint8_t>(b);
    q[Reverse ? 0 : 2] = static_cast<uint8_t>(c);
    q[3] = alpha;
  }
  template <class U>
  ZEL_INLINE void block(int x, const Trio<U>& v) const {
    const typename U::V first = Reverse ? v.c2 : v.c0, third = Reverse ? v.c0 : v.c2;
    const typename U::V a = U::set8(alpha);
    uint8_t* q = p + 4 * x;
    if constexpr (std::is_same_v<U, Avx512>) {
      merge4(q, first, v.c1, third, a);
    } else {
      const typename U::V lo01 = U::unpackLo8(first, v.c1), hi01 = U::unpackHi8(first, v.c1);
      const typename U::V lo23 = U::unpackLo8(third, a), hi23 = U::unpackHi8(third, a);
      U::storeUnits(q, 64, U::unpackLo16(lo01, lo23));
      U::storeUnits(q + 16, 64, U::unpackHi16(lo01, lo23));
      U::storeUnits(q + 32, 64, U::unpackLo16(hi01, hi23));
      U::storeUnits(q + 48, 64, U::unpackHi16(hi01, hi23));
    }
  }
  // 64 pixels from lane-split bytes (block<Avx512> takes memory order).
  ZEL_AVX512_VBMI ZEL_INLINE void block512(int x, const Trio<Avx512>& v) const {
    const SplitScatter<4>& s = kSplitScatter<4>;
    const __m512i a = _mm512_set1_epi8(static_cast<char>(alpha));
    uint8_t* q = p + 4 * x;
    for (int r = 0; r < 4; ++r) {
      const __m512i rgb = scatterPart(s, r, Reverse ? v.c2 : v.c0, v.c1, Reverse ? v.c0 : v.c2);
      _mm512_storeu_si512(q + 64 * r, _mm512_mask_blend_epi8(kFourthBytes, rgb, a));
    }
  }
};

// Four-byte pixels whose fourth byte is left as it is (AC4). Written one
// pixel at a time: a vector store would rewrite the fourth byte. A vector
// block is merged into pixels on the stack and stored three bytes a pixel.
struct PackedOutKeep {
  uint8_t* p;
  void pixel(int x, int a, int b, int c) const {
    uint8_t* q = p + 4 * x;
    q[0] = static_cast<uint8_t>(a);
    q[1] = static_cast<uint8_t>(b);
    q[2] = static_cast<uint8_t>(c);
  }
  template <class U>
  ZEL_INLINE void block(int x, const Trio<U>& v) const {
    const typename U::V z = U::zero();
    const typename U::V lo01 = U::unpackLo8(v.c0, v.c1), hi01 = U::unpackHi8(v.c0, v.c1);
    const typename U::V lo23 = U::unpackLo8(v.c2, z), hi23 = U::unpackHi8(v.c2, z);
    alignas(32) uint8_t px[64 * U::kUnits];
    U::storeUnits(px, 64, U::unpackLo16(lo01, lo23));
    U::storeUnits(px + 16, 64, U::unpackHi16(lo01, lo23));
    U::storeUnits(px + 32, 64, U::unpackLo16(hi01, hi23));
    U::storeUnits(px + 48, 64, U::unpackHi16(hi01, hi23));
    uint8_t* q = p + 4 * x;
    for (int i = 0; i < U::kPixels; ++i) std::memcpy(q + 4 * i, px + 4 * i, 3);
  }
  // 64 pixels from lane-split bytes; a masked store writes the three bytes
  // of each pixel and no other.
  ZEL_AVX512_VBMI ZEL_INLINE void block512(int x, const Trio<Avx512>& v) const {
    const SplitScatter<4>& s = kSplitScatter<4>;
    uint8_t* q = p + 4 * x;
    for (int r = 0; r < 4; ++r)
      _mm512_mask_storeu_epi8(q + 64 * r, ~kFourthBytes, scatterPart(s, r, v.c0, v.c1, v.c2));
  }
};

struct PlanesOut {
  uint8_t* p0;
  uint8_t* p1;
  uint8_t* p2;
  void pixel(int x, int a, int b, int c) const {
    p0[x] = static_cast<uint8_t>(a);
    p1[x] = static_cast<uint8_t>(b);
    p2[x] = static_cast<uint8_t>(c);
  }
  template <class U>
  ZEL_INLINE void block(int x, const Trio<U>& v) const {
    U::storeUnits(p0 + x, 16, v.c0);
    U::storeUnits(p1 + x, 16, v.c1);
    U::storeUnits(p2 + x, 16, v.c2);
  }
  // 64 pixels from lane-split bytes (block<Avx512> takes memory order).
  ZEL_AVX512_VBMI ZEL_INLINE void block512(int x, const Trio<Avx512>& v) const {
    const __m512i order = indexOf(kToMemory);
    _mm512_storeu_si512(p0 + x, _mm512_maskz_permutexvar_epi8(kToMemory.mask, order, v.c0));
    _mm512_storeu_si512(p1 + x, _mm512_maskz_permutexvar_epi8(kToMemory.mask, order, v.c1));
    _mm512_storeu_si512(p2 + x, _mm512_maskz_permutexvar_epi8(kToMemory.mask, order, v.c2));
  }
};

// ---- the row converter ----

// A form maps three samples to three samples: `pixel` (Samples3 to
// Samples3) in scalar code and, when kVector, `lanes<U>` (Trio of 16-bit
// lanes to Trio of 16-bit lanes before SaturateU8).

// A form may also offer `bytes<U>` (kBytes true): bytes of a block in,
// bytes out, widening and narrowing its own way; it gives the bits of its
// `pixel`.
template <class Form, class = void>
struct TakesBytes : std::false_type {};
template <class Form>
struct TakesBytes<Form, std::void_t<decltype(Form::kBytes)>> : std::bool_constant<Form::kBytes> {};

// One block of bytes in, bytes out, by the form's own byte path or by its
// 16-bit lanes on the two widened halves.
template <class U, class Form>
ZEL_INLINE Trio<U> formBlock(const Form& form, const Trio<U>& s) {
  if constexpr (TakesBytes<Form>::value) {
    return form.template bytes<U>(s);
  } else {
    const Wide16<U> a = widen<U>(s.c0), b = widen<U>(s.c1), c = widen<U>(s.c2);
    const Trio<U> lo = form.template lanes<U>(Trio<U>{a.lo, b.lo, c.lo});
    const Trio<U> hi = form.template lanes<U>(Trio<U>{a.hi, b.hi, c.hi});
    return {U::packU8(lo.c0, hi.c0), U::packU8(lo.c1, hi.c1), U::packU8(lo.c2, hi.c2)};
  }
}

template <class U, class In, class Out, class Form>
ZEL_INLINE int formBlocks(const In& in, const Out& out, int x, int end, const Form& form) {
  for (; x + U::kPixels <= end; x += U::kPixels) out.template block<U>(x, formBlock<U>(form, in.template block<U>(x)));
  return x;
}

template <class In, class Out, class Form>
ZEL_AVX2 __attribute__((flatten)) int formBlocksAvx(const In& in, const Out& out, int x, int end, const Form& form) {
  return formBlocks<Avx>(in, out, x, end, form);
}

// A form may take samples in the high bytes of 16-bit lanes (S << 8), as
// the 64-pixel blocks give them: `highLanes<U>` (kHighLanes) maps them to
// lanes before SaturateU8, `highBytes<U>` (kHighBytes) maps both halves to
// the bytes of the block. Other forms take the samples shifted down.
template <class Form, class = void>
struct TakesHighLanes : std::false_type {};
template <class Form>
struct TakesHighLanes<Form, std::void_t<decltype(Form::kHighLanes)>> : std::bool_constant<Form::kHighLanes> {};
template <class Form, class = void>
struct TakesHighBytes : std::false_type {};
template <class Form>
struct TakesHighBytes<Form, std::void_t<decltype(Form::kHighBytes)>> : std::bool_constant<Form::kHighBytes> {};

template <class Form>
ZEL_INLINE Trio<Avx512> formHighWords(const Form& form, const HighWords512& w) {
  using U = Avx512;
  if constexpr (TakesHighBytes<Form>::value) {
    return form.template highBytes<U>(w.lo, w.hi);
  } else {
    Trio<U> lo, hi;
    if constexpr (TakesHighLanes<Form>::value) {
      lo = form.template highLanes<U>(w.lo);
      hi = form.template highLanes<U>(w.hi);
    } else {
      auto down = [](const Trio<U>& t) ZEL_LAMBDA_INLINE {
        return Trio<U>{U::template srl16<8>(t.c0), U::template srl16<8>(t.c1), U::template srl16<8>(t.c2)};
      };
      lo = form.template lanes<U>(down(w.lo));
      hi = form.template lanes<U>(down(w.hi));
    }
    return {U::packU8(lo.c0, hi.c0), U::packU8(lo.c1, hi.c1), U::packU8(lo.c2, hi.c2)};
  }
}

// 64-pixel blocks from the start of the row.
template <class In, class Out, class Form>
ZEL_AVX512_VBMI __attribute__((flatten)) int formBlocks512(const In& in, const Out& out, int end, const Form& form) {
  int x = 0;
  for (; x + 64 <= end; x += 64) out.block512(x, formHighWords(form, in.highWords512(x)));
  return x;
}

template <class In, class Out, class Form>
inline void formPixels(const In& in, const Out& out, int x, int end, const Form& form) {
  for (; x < end; ++x) {
    int a, b, c;
    in.pixel(x, a, b, c);
    const Samples3 r = form.pixel(Samples3{a, b, c});
    out.pixel(x, r.c0, r.c1, r.c2);
  }
}

// Pixels [0, bodyEnd) take the body form, [bodyEnd, width) the tail form.
// Whole vector blocks of the body run at the widest unit that `tier` allows
// (64 pixels, then 32, then 16); the body's last pixels take the same form
// one at a time.
template <class In, class Out, class Body, class Tail>
inline void convertRow(const In& in, const Out& out, int width, int bodyEnd, const Body& body, const Tail& tail,
                       VectorTier tier) {
  int x = 0;
  if constexpr (Body::kVector) {
    if (tier >= VectorTier::Avx512) x = formBlocks512(in, out, bodyEnd, body);
    if (tier >= VectorTier::Avx2) x = formBlocksAvx(in, out, x, bodyEnd, body);
    x = formBlocks<Sse>(in, out, x, bodyEnd, body);
  }
  formPixels(in, out, x, bodyEnd, body);
  formPixels(in, out, bodyEnd, width, tail);
}

// Four-byte pixels in and out with the destination's fourth byte kept: a
// wide form four pixels at a time in 32-bit lanes, stored with the fourth
// bytes the destination holds (read and written back as they were).
template <class Form>
inline void keepAlphaRow(const uint8_t* src, uint8_t* dst, int width, const Form& form) {
  const __m128i fourth = _mm_set1_epi32(int32_t(0xFF000000u));
  int x = 0;
  for (; x + 4 <= width; x += 4) {
    uint8_t* q = dst + 4 * x;
    const __m128i px = form.pixels4(load128(src + 4 * x));  // the whole source block before any store
    store128(q, _mm_blendv_epi8(px, load128(q), fourth));
  }
  formPixels(PackedIn<4>{src}, PackedOutKeep{dst}, x, width, form);
}

}  // namespace zel::lc
