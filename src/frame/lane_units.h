// The integer lane operations that the vector units of the 16-bit families
// (YCoCg, luma-chroma) share. A unit is a struct per width (one 128-, 256-
// or 512-bit register) whose static functions a kernel template calls; the
// operations below have one form at every width and differ only in the
// names of their intrinsics, so they are written once and stamped into each
// unit. A unit defines V, its register type, before the stamp.
//
// ZEL_UNIT_LANE_OPS(ON, MM, BITS): ON is the width's target marker (empty
// for SSE4.1, ZEL_AVX2, ZEL_AVX512 or ZEL_AVX512_VBMI), MM the prefix of its
// intrinsics (_mm, _mm256, _mm512) and BITS its register width. The stamped
// operations, lane by lane:
//   set8/16/32, zero, ones  a value in every lane;
//   add, sub                wrapping sums of 8-, 16- or 32-bit lanes;
//   addSatS16/U16, addSatU8 sums saturated to the lane's range;
//   mulHighS16/U16          the high 16 bits of the 32-bit product;
//   mulHighRound            MulHighRound (PMULHRSW);
//   mulLo16                 the low 16 bits of the product;
//   madd16                  pairs of 16-bit lanes times a pair, summed into
//                           32-bit lanes (PMADDWD);
//   sra, srl, sll           shifts by N bits (arithmetic, logical, left);
//   averageU8               AverageRoundU8;
//   packU8, packS8          signed 16-bit lanes to bytes: SaturateU8 and
//                           SaturateS8; packS32 32-bit lanes to SaturateS16;
//   shuffle8                bytes by index within each 128-bit lane;
//   unpackLo/Hi             interleaving within each 128-bit lane.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"

#define ZEL_UNIT_LANE_OPS(ON, MM, BITS)                                         \
  ON static V zero() { return MM##_setzero_si##BITS(); }                        \
  ON static V ones() { return MM##_set1_epi32(-1); }                            \
  ON static V set8(int v) { return MM##_set1_epi8(static_cast<int8_t>(v)); }    \
  ON static V set16(int v) { return MM##_set1_epi16(static_cast<int16_t>(v)); } \
  ON static V set32(int32_t v) { return MM##_set1_epi32(v); }                   \
  ON static V sub8(V a, V b) { return MM##_sub_epi8(a, b); }                    \
  ON static V addSatU8(V a, V b) { return MM##_adds_epu8(a, b); }               \
  ON static V averageU8(V a, V b) { return MM##_avg_epu8(a, b); }               \
  ON static V add16(V a, V b) { return MM##_add_epi16(a, b); }                  \
  ON static V sub16(V a, V b) { return MM##_sub_epi16(a, b); }                  \
  ON static V addSatS16(V a, V b) { return MM##_adds_epi16(a, b); }             \
  ON static V addSatU16(V a, V b) { return MM##_adds_epu16(a, b); }             \
  ON static V mulHighS16(V a, V b) { return MM##_mulhi_epi16(a, b); }           \
  ON static V mulHighU16(V a, V b) { return MM##_mulhi_epu16(a, b); }           \
  ON static V mulHighRound(V a, V b) { return MM##_mulhrs_epi16(a, b); }        \
  ON static V mulLo16(V a, V b) { return MM##_mullo_epi16(a, b); }              \
  ON static V madd16(V a, V b) { return MM##_madd_epi16(a, b); }                \
  template <int N>                                                              \
  ON static V sra16(V a) { return MM##_srai_epi16(a, N); }                      \
  template <int N>                                                              \
  ON static V srl16(V a) { return MM##_srli_epi16(a, N); }                      \
  template <int N>                                                              \
  ON static V sll16(V a) { return MM##_slli_epi16(a, N); }                      \
  template <int N>                                                              \
  ON static V sra32(V a) { return MM##_srai_epi32(a, N); }                      \
  ON static V add32(V a, V b) { return MM##_add_epi32(a, b); }                  \
  ON static V sub32(V a, V b) { return MM##_sub_epi32(a, b); }                  \
  ON static V and_(V a, V b) { return MM##_and_si##BITS(a, b); }                \
  ON static V or_(V a, V b) { return MM##_or_si##BITS(a, b); }                  \
  ON static V xor_(V a, V b) { return MM##_xor_si##BITS(a, b); }                \
  ON static V packU8(V lo, V hi) { return MM##_packus_epi16(lo, hi); }          \
  ON static V packS8(V lo, V hi) { return MM##_packs_epi16(lo, hi); }           \
  ON static V packS32(V lo, V hi) { return MM##_packs_epi32(lo, hi); }          \
  ON static V shuffle8(V a, V m) { return MM##_shuffle_epi8(a, m); }            \
  ON static V unpackLo8(V a, V b) { return MM##_unpacklo_epi8(a, b); }          \
  ON static V unpackHi8(V a, V b) { return MM##_unpackhi_epi8(a, b); }          \
  ON static V unpackLo16(V a, V b) { return MM##_unpacklo_epi16(a, b); }        \
  ON static V unpackHi16(V a, V b) { return MM##_unpackhi_epi16(a, b); }        \
  ON static V unpackLo32(V a, V b) { return MM##_unpacklo_epi32(a, b); }        \
  ON static V unpackHi32(V a, V b) { return MM##_unpackhi_epi32(a, b); }        \
  ON static V unpackLo64(V a, V b) { return MM##_unpacklo_epi64(a, b); }        \
  ON static V unpackHi64(V a, V b) { return MM##_unpackhi_epi64(a, b); }
