// Bit-depth reduction to one bit a pixel: a threshold, or integer Stucki
// diffusion, packed eight pixels to a byte from the highest bit down.
#include "reduce_bits/reduce_bits_1u.h"

#include <cstring>

#include "frame/allocate.h"
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/simd.h"

namespace zel::reduce {

namespace {

// Writes one row of `width` bits starting at bit `off` (0..7) of out[0],
// asking bitOf(x) for the pixels in order. The first byte keeps its top
// `off` bits and loses all lower ones; a last partial byte keeps its
// unused low bits; bytes in between are written whole. wholeBytes(x, out,
// count) may write `count` whole bytes of pixels x.. and return how many it
// wrote; the rest go bit by bit.
template <typename BitOf, typename WholeBytes>
void packRow(uint8_t* out, int width, int off, BitOf&& bitOf, WholeBytes&& wholeBytes) {
  int x = 0;
  if (off != 0) {
    const int first = width < 8 - off ? width : 8 - off;
    uint8_t bits = 0;
    for (int i = 0; i < first; ++i) bits = uint8_t(bits | (bitOf(x + i) << (7 - off - i)));
    *out = uint8_t((*out & (0xFF00 >> off)) | bits);
    ++out;
    x = first;
  }
  const int bytes = (width - x) / 8;
  const int done = wholeBytes(x, out, bytes);
  x += 8 * done;
  out += done;
  for (int b = done; b < bytes; ++b, x += 8, ++out) {
    uint8_t bits = 0;
    for (int i = 0; i < 8; ++i) bits = uint8_t(bits | (bitOf(x + i) << (7 - i)));
    *out = bits;
  }
  if (x < width) {
    const int used = width - x;
    uint8_t bits = 0;
    for (int i = 0; i < used; ++i) bits = uint8_t(bits | (bitOf(x + i) << (7 - i)));
    *out = uint8_t((*out & ((1 << (8 - used)) - 1)) | bits);
  }
}

int noWholeBytes(int, uint8_t*, int) { return 0; }

}  // namespace

int thresholdBytes(const uint8_t* src, uint8_t* out, int count, uint8_t threshold) {
  // Unsigned s > threshold as a signed compare of both with the top bit
  // flipped; each group of 8 byte-reversed so that the sign-mask gather puts
  // the first pixel into the highest bit.
  const __m128i flip = _mm_set1_epi8(int8_t(0x80));
  const __m128i t = _mm_set1_epi8(int8_t(threshold ^ 0x80));
  const __m128i reverse = _mm_setr_epi8(7, 6, 5, 4, 3, 2, 1, 0, 15, 14, 13, 12, 11, 10, 9, 8);
  int b = 0;
  for (; b + 2 <= count; b += 2) {
    const __m128i s = _mm_xor_si128(load128(src + 8 * b), flip);
    const int mask = _mm_movemask_epi8(_mm_shuffle_epi8(_mm_cmpgt_epi8(s, t), reverse));
    const uint16_t pair = uint16_t(mask);
    std::memcpy(out + b, &pair, 2);
  }
  if (b < count) {
    const __m128i s = _mm_xor_si128(load64(src + 8 * b), flip);
    out[b] = uint8_t(_mm_movemask_epi8(_mm_shuffle_epi8(_mm_cmpgt_epi8(s, t), reverse)));
    ++b;
  }
  return b;
}

// The integer Stucki step of one pixel: returns the bit and leaves the
// error in C[x].
inline int stuckiBit(const int32_t* U2, const int32_t* U1, int32_t* C, int x, uint8_t s, int32_t limit) {
  const int32_t e = U2[x - 2] + U2[x + 2] + (U1[x] + C[x - 1]) * 8 + (U2[x] + U1[x - 1] + U1[x + 1] + C[x - 2]) * 4 +
                    (U2[x - 1] + U2[x + 1] + U1[x - 2] + U1[x + 2]) * 2;
  const int32_t a = (int32_t(s) << 13) + e * 23;
  int32_t d = a >> 10;
  const int bit = a > limit ? 1 : 0;
  if (bit) d -= 2047;
  C[x] = d;
  return bit;
}

Status reduceBitsTo1u(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, int dstBitOffset, ImageSize size,
                      int ditherKind, uint8_t threshold) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1 || dstBitOffset < 0) return StatusSizeError;
  if (ditherKind != 0 && ditherKind != 3) return StatusDitherKindError;
  const int off = dstBitOffset & 7;
  const int width = size.width;

  if (ditherKind == 0) {
    for (int y = 0; y < size.height; ++y) {
      const uint8_t* s = rowAt(src, srcStep, y);
      packRow(
          rowAt(dst, dstStep, y), width, off, [&](int x) { return s[x] > threshold ? 1 : 0; },
          [&](int x, uint8_t* out, int count) { return thresholdBytes(s + x, out, count, threshold); });
    }
    return StatusOk;
  }

  const int n = (width + 4) & ~4;
  int32_t* block = allocate32(3 * n + 12);
  if (!block) return StatusOutOfMemoryError;
  std::memset(block, 0, sizeof(int32_t) * size_t(3 * n + 12));
  int32_t* U2 = block + 2;
  int32_t* U1 = block + n + 6;
  int32_t* C = block + 2 * n + 10;
  const int32_t limit = int32_t(threshold) << 13;
  for (int y = 0; y < size.height; ++y) {
    const uint8_t* s = rowAt(src, srcStep, y);
    packRow(
        rowAt(dst, dstStep, y), width, off, [&](int x) { return stuckiBit(U2, U1, C, x, s[x], limit); },
        noWholeBytes);
    int32_t* oldU2 = U2;
    U2 = U1;
    U1 = C;
    C = oldU2;
  }
  release(block);
  return StatusOk;
}

}  // namespace zel::reduce

ZEL_PUBLIC Status zeliReduceBits_8u1u_C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                          int dstBitOffset, ImageSize size, int reserved1, int reserved2,
                                          int ditherKind, uint8_t threshold) {
  (void)reserved1;
  (void)reserved2;
  return zel::reduce::reduceBitsTo1u(src, srcStep, dst, dstStep, dstBitOffset, size, ditherKind, threshold);
}
