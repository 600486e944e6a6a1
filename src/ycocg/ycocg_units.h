// The vector operations of the YCoCg kernels at three widths:
//   Sse     one 128-bit register, 8 pixels in 16-bit lanes;
//   Avx     one 256-bit register, 16 pixels (lane 0 pixels 0..7, lane 1
//           pixels 8..15), chosen at run time;
//   Avx512  one 512-bit register, 32 pixels, four such lanes.
// Lane arithmetic works within a 128-bit lane, so one kernel template gives
// the same bits at every width. Avx and Avx512 kernels are instantiated
// only inside a ZEL_AVX2 or ZEL_AVX512 function marked `flatten`, which
// pulls every operation in.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/lane_shuffle.h"
#include "frame/lane_units.h"
#include "frame/simd.h"

// 256-bit values only pass between helpers the flattened AVX2 kernels
// inline; none crosses a real call.
#pragma GCC diagnostic ignored "-Wpsabi"

namespace zel::ycocg {

// Every chunk of the group at p, one at a time, and back: the group moves of
// a unit (ON its target marker) that has no wider ones.
#define ZEL_YCOCG_GROUP_BY_CHUNKS(ON)                                     \
  template <class G>                                                      \
  ON static void getGroup(const uint8_t* p, V* chunks) {                  \
    for (int i = 0; i < G::kChunks; ++i) chunks[i] = chunk<G>(p, i);      \
  }                                                                       \
  template <class G, bool Stream>                                         \
  ON static void putGroup(uint8_t* p, const V* chunks) {                  \
    for (int i = 0; i < G::kChunks; ++i) put<G, Stream>(p, i, chunks[i]); \
  }

struct Sse {
  using V = __m128i;
  static constexpr int kPixels = 8;

  static V load(const void* p) { return load128(p); }
  static void store(void* p, V v) { store128(p, v); }
  static void stream(void* p, V v) { storeStream128(p, v); }
  // kPixels bytes to 16-bit lanes, and back clamped to 0..255.
  static V loadBytes(const uint8_t* p) { return _mm_cvtepu8_epi16(load64(p)); }
  static void storeBytes(uint8_t* p, V v) { store64(p, _mm_packus_epi16(v, v)); }
  // Chunk i of the group of 8 pixels at p (each lane its own group).
  template <class G>
  static V chunk(const uint8_t* p, int i) {
    return G::chunk(p, i);
  }
  template <class G, bool Stream>
  static void put(uint8_t* p, int i, V v) {
    G::template put<Stream>(p, i, v);
  }
  ZEL_YCOCG_GROUP_BY_CHUNKS()
  static V mask(const ByteMask& m) { return maskOf(m); }

  ZEL_UNIT_LANE_OPS(, _mm, 128)
  template <int Imm>
  static V blend16(V a, V b) {
    return _mm_blend_epi16(a, b, Imm);
  }
  static V blend8(V a, V b, V m) { return _mm_blendv_epi8(a, b, m); }
  // Signed 16-bit lanes of the first and second half of the pixels to
  // 32-bit lanes; and the low 16 bits of 32-bit lanes back, in order.
  static V widenLo(V v) { return _mm_cvtepi16_epi32(v); }
  static V widenHi(V v) { return _mm_cvtepi16_epi32(_mm_srli_si128(v, 8)); }
  static V narrowLow(V lo, V hi) {
    const V low = _mm_set1_epi32(0xFFFF);
    return _mm_packus_epi32(_mm_and_si128(lo, low), _mm_and_si128(hi, low));
  }
};

struct Avx {
  using V = __m256i;
  static constexpr int kPixels = 16;

  ZEL_AVX2 static V load(const void* p) { return load256(p); }
  ZEL_AVX2 static void store(void* p, V v) { store256(p, v); }
  // Rows are 16-byte aligned only: two 16-byte non-temporal stores.
  ZEL_AVX2 static void stream(void* p, V v) {
    auto* b = static_cast<uint8_t*>(p);
    storeStream128(b, _mm256_castsi256_si128(v));
    storeStream128(b + 16, _mm256_extracti128_si256(v, 1));
  }
  ZEL_AVX2 static V loadBytes(const uint8_t* p) { return _mm256_cvtepu8_epi16(load128(p)); }
  ZEL_AVX2 static void storeBytes(uint8_t* p, V v) {
    store128(p, _mm256_castsi256_si128(_mm256_permute4x64_epi64(_mm256_packus_epi16(v, v), 0x08)));
  }
  // Lane 0 takes chunk i of the group at p, lane 1 that of the next group.
  template <class G>
  ZEL_AVX2 static V chunk(const uint8_t* p, int i) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(G::chunk(p, i)), G::chunk(p + G::kBytes, i), 1);
  }
  template <class G, bool Stream>
  ZEL_AVX2 static void put(uint8_t* p, int i, V v) {
    G::template put<Stream>(p, i, _mm256_castsi256_si128(v));
    G::template put<Stream>(p + G::kBytes, i, _mm256_extracti128_si256(v, 1));
  }
  ZEL_YCOCG_GROUP_BY_CHUNKS(ZEL_AVX2)
  ZEL_AVX2 static V mask(const ByteMask& m) { return _mm256_broadcastsi128_si256(maskOf(m)); }

  ZEL_UNIT_LANE_OPS(ZEL_AVX2, _mm256, 256)
  template <int Imm>
  ZEL_AVX2 static V blend16(V a, V b) {
    return _mm256_blend_epi16(a, b, Imm);
  }
  ZEL_AVX2 static V blend8(V a, V b, V m) { return _mm256_blendv_epi8(a, b, m); }
  ZEL_AVX2 static V widenLo(V v) { return _mm256_cvtepi16_epi32(_mm256_castsi256_si128(v)); }
  ZEL_AVX2 static V widenHi(V v) { return _mm256_cvtepi16_epi32(_mm256_extracti128_si256(v, 1)); }
  ZEL_AVX2 static V narrowLow(V lo, V hi) {
    const V low = _mm256_set1_epi32(0xFFFF);
    const V packed = _mm256_packus_epi32(_mm256_and_si256(lo, low), _mm256_and_si256(hi, low));
    return _mm256_permute4x64_epi64(packed, 0xD8);
  }
};

ZEL_TIER512_BEGIN

// The 512-bit tier: one register, 32 pixels (lane k pixels 8k..8k+7), the
// same lane arithmetic. Byte layouts move whole groups with dword permutes
// over the exact bytes of the four groups; others go lane by lane.
struct Avx512 {
  using V = __m512i;
  static constexpr int kPixels = 32;

  ZEL_AVX512 static V load(const void* p) { return _mm512_loadu_si512(p); }
  ZEL_AVX512 static void store(void* p, V v) { _mm512_storeu_si512(p, v); }
  // Rows are 16-byte aligned only: four 16-byte non-temporal stores.
  ZEL_AVX512 static void stream(void* p, V v) {
    auto* b = static_cast<uint8_t*>(p);
    storeStream128(b, _mm512_castsi512_si128(v));
    storeStream128(b + 16, _mm512_extracti32x4_epi32(v, 1));
    storeStream128(b + 32, _mm512_extracti32x4_epi32(v, 2));
    storeStream128(b + 48, _mm512_extracti32x4_epi32(v, 3));
  }
  ZEL_AVX512 static V loadBytes(const uint8_t* p) { return _mm512_cvtepu8_epi16(load256(p)); }
  ZEL_AVX512 static void storeBytes(uint8_t* p, V v) {
    const V packed = _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7), _mm512_packus_epi16(v, v));
    store256(p, _mm512_castsi512_si256(packed));
  }
  ZEL_AVX512 static __m128i lane(V v, int k) {
    switch (k) {
      case 0: return _mm512_castsi512_si128(v);
      case 1: return _mm512_extracti32x4_epi32(v, 1);
      case 2: return _mm512_extracti32x4_epi32(v, 2);
      default: return _mm512_extracti32x4_epi32(v, 3);
    }
  }
  // Lane k takes chunk i of group k.
  template <class G>
  ZEL_AVX512 static V chunk(const uint8_t* p, int i) {
    V v = _mm512_castsi128_si512(G::chunk(p, i));
    v = _mm512_inserti32x4(v, G::chunk(p + G::kBytes, i), 1);
    v = _mm512_inserti32x4(v, G::chunk(p + 2 * G::kBytes, i), 2);
    return _mm512_inserti32x4(v, G::chunk(p + 3 * G::kBytes, i), 3);
  }
  template <class G, bool Stream>
  ZEL_AVX512 static void put(uint8_t* p, int i, V v) {
    for (int k = 0; k < 4; ++k) G::template put<Stream>(p + k * G::kBytes, i, lane(v, k));
  }
  // Dword d of the four groups' bytes for chunk i of lane k (four dwords a
  // lane): byte groups of two chunks, whose dwords lie in two registers.
  template <class G>
  static constexpr bool kByteGroups = G::kChunks == 2 && G::kBytes % 8 == 0 && G::kBytes <= 32;
  template <class G>
  struct GroupOrder {
    int32_t chunk[2][16];  // dword of the groups for lane dword j of chunk i
    int32_t out[2][16];    // and back: chunk dword (chunk 1 from 16) of group dword d
    static constexpr GroupOrder make() {
      GroupOrder m{};
      constexpr int words = G::kBytes / 4;  // dwords a group
      for (int i = 0; i < 2; ++i)
        for (int j = 0; j < 16; ++j) {
          const int k = j / 4, w = 4 * i + j % 4;
          m.chunk[i][j] = w < words ? k * words + w : 0;
        }
      for (int o = 0; o < 2; ++o)
        for (int j = 0; j < 16; ++j) {
          const int d = 16 * o + j, k = d / words, r = d % words;
          m.out[o][j] = k < 4 ? (r < 4 ? 4 * k + r : 16 + 4 * k + r - 4) : 0;
        }
      return m;
    }
  };
  template <class G>
  static constexpr GroupOrder<G> kGroupOrder = GroupOrder<G>::make();
  template <class G>
  ZEL_AVX512 static __mmask16 chunkDwords(int i) {
    // Dwords of a lane that chunk i fills (the rest read as zero).
    const int filled = G::kBytes / 4 - 4 * i < 4 ? G::kBytes / 4 - 4 * i : 4;
    return __mmask16(((1u << filled) - 1) * 0x1111u);
  }
  template <class G>
  ZEL_AVX512 static void getGroup(const uint8_t* p, V* chunks) {
    if constexpr (kByteGroups<G>) {
      constexpr int words = G::kBytes;  // dwords of the four groups
      const V a = _mm512_loadu_si512(p);
      const V b = words == 32 ? _mm512_loadu_si512(p + 64)
                              : _mm512_castsi256_si512(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(p + 64)));
      for (int i = 0; i < 2; ++i)
        chunks[i] =
            _mm512_maskz_permutex2var_epi32(chunkDwords<G>(i), a, _mm512_loadu_si512(kGroupOrder<G>.chunk[i]), b);
    } else {
      for (int i = 0; i < G::kChunks; ++i) chunks[i] = chunk<G>(p, i);
    }
  }
  template <class G, bool Stream>
  ZEL_AVX512 static void putGroup(uint8_t* p, const V* chunks) {
    if constexpr (kByteGroups<G> && !Stream) {
      constexpr int words = G::kBytes;
      const V first = _mm512_permutex2var_epi32(chunks[0], _mm512_loadu_si512(kGroupOrder<G>.out[0]), chunks[1]);
      const V second = _mm512_permutex2var_epi32(chunks[0], _mm512_loadu_si512(kGroupOrder<G>.out[1]), chunks[1]);
      _mm512_storeu_si512(p, first);
      if constexpr (words == 32) _mm512_storeu_si512(p + 64, second);
      else _mm256_storeu_si256(reinterpret_cast<__m256i*>(p + 64), _mm512_castsi512_si256(second));
    } else {
      for (int i = 0; i < G::kChunks; ++i) put<G, Stream>(p, i, chunks[i]);
    }
  }
  ZEL_AVX512 static V mask(const ByteMask& m) { return _mm512_broadcast_i32x4(maskOf(m)); }

  ZEL_UNIT_LANE_OPS(ZEL_AVX512, _mm512, 512)
  template <int Imm>
  ZEL_AVX512 static V blend16(V a, V b) {
    return _mm512_mask_blend_epi16(__mmask32(uint32_t(Imm & 0xFF) * 0x01010101u), a, b);
  }
  ZEL_AVX512 static V blend8(V a, V b, V m) { return _mm512_mask_blend_epi8(_mm512_movepi8_mask(m), a, b); }
  ZEL_AVX512 static V widenLo(V v) { return _mm512_cvtepi16_epi32(_mm512_castsi512_si256(v)); }
  ZEL_AVX512 static V widenHi(V v) { return _mm512_cvtepi16_epi32(_mm512_extracti64x4_epi64(v, 1)); }
  ZEL_AVX512 static V narrowLow(V lo, V hi) {
    const V low = _mm512_set1_epi32(0xFFFF);
    const V packed = _mm512_packus_epi32(_mm512_and_si512(lo, low), _mm512_and_si512(hi, low));
    return _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7), packed);
  }
};

ZEL_TIER512_END

// ---- interleaved pixels to and from one vector of 16-bit lanes a channel ----

// Three 16-bit elements a pixel: element e of the group lies in word e % 8
// of chunk e / 8, and 3k + c runs over every word of a chunk once as k runs
// over the pixels, so a channel is two word blends and one byte shuffle.
constexpr int wordsFromChunk(int channel, int chunk) {
  int bits = 0;
  for (int k = 0; k < 8; ++k)
    if ((3 * k + channel) / 8 == chunk) bits |= 1 << ((3 * k + channel) % 8);
  return bits;
}
constexpr int wordsOfChannel(int chunk, int channel) {
  int bits = 0;
  for (int p = 0; p < 8; ++p)
    if ((8 * chunk + p) % 3 == channel) bits |= 1 << p;
  return bits;
}
// Word (3k + c) % 8 to word k (collect), or word k to word (3k + c) % 8.
constexpr ByteMask wordOrder(int channel, bool collect) {
  ByteMask m{};
  for (int k = 0; k < 8; ++k) {
    const int p = (3 * k + channel) % 8;
    const int to = collect ? k : p, from = collect ? p : k;
    m.b[2 * to] = int8_t(2 * from);
    m.b[2 * to + 1] = int8_t(2 * from + 1);
  }
  return m;
}
template <int C, bool Collect>
inline constexpr ByteMask kWordOrder = wordOrder(C, Collect);

// Three channels of bytes in 16-bit lanes, packed as [c0 | c1] and [c2 | c2]:
// the bytes of output chunk `chunk` that come from one of the two.
constexpr ByteMask packedBytes(int chunk, bool fromFirst) {
  ByteMask m{};
  for (int i = 0; i < 16; ++i) {
    const int at = 16 * chunk + i, k = at / 3, c = at % 3;
    m.b[i] = -128;
    if (k >= 8) continue;
    if (fromFirst && c < 2) m.b[i] = int8_t(8 * c + k);
    if (!fromFirst && c == 2) m.b[i] = int8_t(k);
  }
  return m;
}
template <int Chunk, bool First>
inline constexpr ByteMask kPackedBytes = packedBytes(Chunk, First);

// Three bytes a pixel, 16 pixels a 128-bit lane: byte 3k + c of the 48
// lies at byte (3k + c) % 16 of chunk (3k + c) / 16, and (3k + c) % 16 runs
// over every byte of a chunk once, so a channel is two byte blends and one
// shuffle.
constexpr ByteMask bytesFromChunk(int channel, int chunk) {
  ByteMask m{};
  for (int k = 0; k < 16; ++k) {
    const int e = 3 * k + channel;
    m.b[e % 16] = int8_t(e / 16 == chunk ? -1 : 0);
  }
  return m;
}
constexpr ByteMask byteOrder(int channel) {
  ByteMask m{};
  for (int k = 0; k < 16; ++k) m.b[k] = int8_t((3 * k + channel) % 16);
  return m;
}
template <int C, int Chunk>
inline constexpr ByteMask kBytesFromChunk = bytesFromChunk(C, Chunk);
template <int C>
inline constexpr ByteMask kByteOrder = byteOrder(C);

// 2 * kPixels three-byte pixels to one vector of bytes a channel (lane 0
// the first 16 pixels, lane 1 the next).
template <class U>
struct ByteTriples {
  using V = typename U::V;
  using G = PixelGroup<1, 3, 1>;  // 16 pixels, 48 bytes
  template <int C>
  ZEL_INLINE static V channel(const V* raw) {
    const V v =
        U::blend8(U::blend8(raw[0], raw[1], U::mask(kBytesFromChunk<C, 1>)), raw[2], U::mask(kBytesFromChunk<C, 2>));
    return U::shuffle8(v, U::mask(kByteOrder<C>));
  }
  ZEL_INLINE static void load(const uint8_t* p, V* lanes) {
    const V raw[3] = {U::template chunk<G>(p, 0), U::template chunk<G>(p, 1), U::template chunk<G>(p, 2)};
    lanes[0] = channel<0>(raw);
    lanes[1] = channel<1>(raw);
    lanes[2] = channel<2>(raw);
  }
};

// kPixels pixels of Ch elements of E bytes (1 unsigned, 2 signed 16-bit).
template <class U, int E, int Ch>
struct Interleaved {
  using V = typename U::V;
  using G = PixelGroup<E, Ch, 2>;

  template <int C, int I>
  ZEL_INLINE static V part(const V* raw) {
    return U::shuffle8(raw[I], U::mask(kGather<E, Ch, C, 16 * I, 2>));
  }
  template <int C>
  ZEL_INLINE static V gather(const V* raw) {
    V v = part<C, 0>(raw);
    if constexpr (G::kChunks > 1) v = U::or_(v, part<C, 1>(raw));
    if constexpr (G::kChunks > 2) v = U::or_(v, part<C, 2>(raw));
    if constexpr (G::kChunks > 3) v = U::or_(v, part<C, 3>(raw));
    return v;
  }
  template <int C>
  ZEL_INLINE static V collectWords(const V* raw) {
    const V v =
        U::template blend16<wordsFromChunk(C, 2)>(U::template blend16<wordsFromChunk(C, 1)>(raw[0], raw[1]), raw[2]);
    return U::shuffle8(v, U::mask(kWordOrder<C, true>));
  }

  // Elements 0..2 of every pixel to three vectors (bytes zero-extended).
  ZEL_INLINE static void load(const void* src, V* lanes) {
    const uint8_t* p = static_cast<const uint8_t*>(src);
    V raw[G::kChunks];
    U::template getGroup<G>(p, raw);
    if constexpr (E == 2 && Ch == 3) {
      lanes[0] = collectWords<0>(raw);
      lanes[1] = collectWords<1>(raw);
      lanes[2] = collectWords<2>(raw);
    } else if constexpr (E == 2 && Ch == 4) {
      // A 4x4 transpose of words, two pixels a chunk.
      const V t0 = U::unpackLo16(raw[0], raw[1]), t1 = U::unpackHi16(raw[0], raw[1]);
      const V t2 = U::unpackLo16(raw[2], raw[3]), t3 = U::unpackHi16(raw[2], raw[3]);
      const V u0 = U::unpackLo16(t0, t1), u1 = U::unpackHi16(t0, t1);
      const V u2 = U::unpackLo16(t2, t3), u3 = U::unpackHi16(t2, t3);
      lanes[0] = U::unpackLo64(u0, u2);
      lanes[1] = U::unpackHi64(u0, u2);
      lanes[2] = U::unpackLo64(u1, u3);
    } else {
      lanes[0] = gather<0>(raw);
      lanes[1] = gather<1>(raw);
      lanes[2] = gather<2>(raw);
    }
  }

  template <int C>
  ZEL_INLINE static V spreadWords(const V* lanes) {
    return U::shuffle8(lanes[C], U::mask(kWordOrder<C, false>));
  }
  template <int I>
  ZEL_INLINE static V mergeWords(const V* spread) {
    return U::template blend16<wordsOfChannel(I, 2)>(U::template blend16<wordsOfChannel(I, 1)>(spread[0], spread[1]),
                                                     spread[2]);
  }
  template <int I>
  ZEL_INLINE static V mergePacked(V first, V second) {
    return U::or_(U::shuffle8(first, U::mask(kPackedBytes<I, true>)),
                  U::shuffle8(second, U::mask(kPackedBytes<I, false>)));
  }

  // lanes[0..Ch) to elements 0..Ch-1 of every pixel; every byte of the
  // pixels is written. Byte elements are clamped to 0..255 (SaturateU8),
  // 16-bit elements keep their low 16 bits.
  template <bool Stream>
  ZEL_INLINE static void store(void* dst, const V* lanes) {
    uint8_t* p = static_cast<uint8_t*>(dst);
    if constexpr (E == 1 && Ch == 3) {
      const V first = U::packU8(lanes[0], lanes[1]), second = U::packU8(lanes[2], lanes[2]);
      const V chunks[2] = {mergePacked<0>(first, second), mergePacked<1>(first, second)};
      U::template putGroup<G, Stream>(p, chunks);
    } else if constexpr (E == 1 && Ch == 4) {
      const V evens = U::packU8(lanes[0], lanes[2]), odds = U::packU8(lanes[1], lanes[3]);
      const V x = U::unpackLo8(evens, odds), y = U::unpackHi8(evens, odds);
      const V chunks[2] = {U::unpackLo16(x, y), U::unpackHi16(x, y)};
      U::template putGroup<G, Stream>(p, chunks);
    } else if constexpr (E == 2 && Ch == 3) {
      const V spread[3] = {spreadWords<0>(lanes), spreadWords<1>(lanes), spreadWords<2>(lanes)};
      U::template put<G, Stream>(p, 0, mergeWords<0>(spread));
      U::template put<G, Stream>(p, 1, mergeWords<1>(spread));
      U::template put<G, Stream>(p, 2, mergeWords<2>(spread));
    } else {
      static_assert(E == 2 && Ch == 4, "layout");
      const V p0 = U::unpackLo16(lanes[0], lanes[1]), p1 = U::unpackHi16(lanes[0], lanes[1]);
      const V q0 = U::unpackLo16(lanes[2], lanes[3]), q1 = U::unpackHi16(lanes[2], lanes[3]);
      U::template put<G, Stream>(p, 0, U::unpackLo32(p0, q0));
      U::template put<G, Stream>(p, 1, U::unpackHi32(p0, q0));
      U::template put<G, Stream>(p, 2, U::unpackLo32(p1, q1));
      U::template put<G, Stream>(p, 3, U::unpackHi32(p1, q1));
    }
  }
};

}  // namespace zel::ycocg
