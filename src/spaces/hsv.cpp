// RGB to HSV and back, 8u and 16u, C3 and AC4.
#include "frame/export.h"
#include "spaces/float_lanes.h"
#include "spaces/hsv_formulas.h"
#include "spaces/hsv_kernels.h"
#include "spaces/space_frame.h"

namespace zel::spaces::hsv {

#define ZEL_BLOCKS "spaces/hsv_blocks.inc"
#include "spaces/both_widths.inc"

ZEL_TIER512_BEGIN
namespace avx512 {

// The inverse of bytes in 16 lanes. p, q and t are formed as in every
// width; then, instead of six sextant masks and a chain of selects, the
// low bytes of V, p, q, t go into the bytes of one word a pixel and the
// sextant looks up which byte each of R, G, B takes: one byte shuffle.
// Sextants past 5 give 0, 0, 0 (as in the other widths, though in-range
// hues never make them) and grey pixels take V three times.
struct SextantBytes {
  uint32_t entry[16];
  static constexpr uint32_t pick(int r, int g, int b) {
    return uint32_t(r) | uint32_t(g) << 8 | uint32_t(b) << 16 | 0x80u << 24;
  }
  static constexpr SextantBytes make() {
    // Bytes of a word: 0 V, 1 p, 2 q, 3 t.
    SextantBytes t{};
    const uint32_t sextants[6] = {pick(0, 3, 1), pick(2, 0, 1), pick(1, 0, 3),
                                  pick(1, 2, 0), pick(3, 1, 0), pick(0, 1, 2)};
    for (int i = 0; i < 16; ++i) t.entry[i] = i < 6 ? sextants[i] : 0x80808080u;
    t.entry[kGrey] = pick(0, 0, 0);
    return t;
  }
  static constexpr int kGrey = 8;  // past the clamped sextants 0..7
};
inline constexpr SextantBytes kSextantBytes = SextantBytes::make();

template <int Stride>
ZEL_AVX512 int hsvToRgbBytes(const uint8_t* s, uint8_t* d, int n) {
  using namespace zel::lanes;
  const F16 top = F16::splat(255.0f), degree = F16::splat(kDegree8), inverse = F16::splat(kInv8);
  const __m512i table = _mm512_loadu_si512(kSextantBytes.entry);
  // Byte b of word j indexes within its 128-bit lane: add 4 (j mod 4).
  const __m512i within = _mm512_set4_epi32(0x0C0C0C0C, 0x08080808, 0x04040404, 0);
  int x = 0;
  for (; x + 16 <= n; x += 16) {
    I16 hi, si, vi;
    readAhead<16 * Stride>(s + x * Stride);
    loadRaw<Stride, false>(s + x * Stride, hi, si, vi);
    const F16 hue = toFloat(hi), sat = toFloat(si), vf = toFloat(vi);
    const F16 hd = clearWhere(eq(hue, top), hue * F16::splat(kInv60)) * degree;
    const I16 i = truncate(hd);
    const F16 f = hd - toFloat(i);
    const F16 vs = vf * (sat * inverse);
    const F16 fr = f * vs;
    const I16 p = roundEven(vf - vs), q = roundEven(vf - fr), t = roundEven((vf - vs) + fr);
    __m512i words = vi.v;  // V is a byte already
    words = _mm512_mask_mov_epi8(words, 0x2222222222222222ull, _mm512_slli_epi32(p.v, 8));
    words = _mm512_mask_mov_epi8(words, 0x4444444444444444ull, _mm512_slli_epi32(q.v, 16));
    words = _mm512_mask_mov_epi8(words, 0x8888888888888888ull, _mm512_slli_epi32(t.v, 24));
    __m512i sextant = _mm512_min_epu32(i.v, _mm512_set1_epi32(7));
    sextant = _mm512_mask_mov_epi32(sextant, _mm512_cmpeq_epi32_mask(si.v, _mm512_setzero_si512()),
                                    _mm512_set1_epi32(SextantBytes::kGrey));
    const __m512i control = _mm512_add_epi8(permuteLanes(sextant, table), within);
    const __m512i rgb = _mm512_shuffle_epi8(words, control);
    if constexpr (Stride == 3) {
      const __m512i bytes = _mm512_shuffle_epi8(
          rgb, _mm512_broadcast_i32x4(_mm_setr_epi8(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, -1, -1, -1, -1)));
      storeLanesAsBytes3(d + 3 * x, bytes);
    } else {
      _mm512_mask_storeu_epi8(d + 4 * x, 0x7777777777777777ull, rgb);
    }
  }
  return x;
}

}  // namespace avx512
ZEL_TIER512_END

// Lanes::Avx512 takes the 16-lane bodies of the byte members; the 16-bit
// inverse stays at 8 lanes.
template <int Stride>
int rgbToHsvBlocks8u(Lanes lanes, const uint8_t* src, uint8_t* dst, int n, RowStores) {
  if (lanes == Lanes::Avx512) return avx512::rgbToHsvBlocks8u<lanes::F16, Stride>(src, dst, n);
  return lanes != Lanes::Sse4 ? avx2::rgbToHsvBlocks8u<lanes::F8, Stride>(src, dst, n)
                              : sse::rgbToHsvBlocks8u<lanes::F4, Stride>(src, dst, n);
}
template <int Stride, typename T>
int hsvToRgbBlocks(Lanes lanes, const T* src, T* dst, int n, RowStores) {
  if constexpr (sizeof(T) == 1)
    if (lanes == Lanes::Avx512) return avx512::hsvToRgbBytes<Stride>(src, dst, n);
  return lanes != Lanes::Sse4 ? avx2::hsvToRgbBlocks<lanes::F8, Stride>(src, dst, n)
                              : sse::hsvToRgbBlocks<lanes::F4, Stride>(src, dst, n);
}

template int rgbToHsvBlocks8u<3>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int rgbToHsvBlocks8u<4>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<3, uint8_t>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<4, uint8_t>(Lanes, const uint8_t*, uint8_t*, int, RowStores);
template int hsvToRgbBlocks<3, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);
template int hsvToRgbBlocks<4, uint16_t>(Lanes, const uint16_t*, uint16_t*, int, RowStores);

namespace {

template <typename T, typename Formula>
inline void levelPixel(const T* s, T* d, Formula f) {
  const Levels o = f(level(s), level(s + 1), level(s + 2));
  for (int k = 0; k < 3; ++k) storeLevel(d + k, o.c[k]);
}

// Blocks of 4 pixels in both layouts.
template <int Stride>
void rgbToHsvRow8u(const uint8_t* s, uint8_t* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, rgbToHsvBlocks8u<Stride>,
                           [](const uint8_t* p, uint8_t* q) { levelPixel(p, q, rgbToHsvTail8u); });
}
// No vector form.
template <int Stride>
void rgbToHsvRow16u(const uint16_t* s, uint16_t* d, int width, const RowContext&) {
  for (int x = 0; x < width; ++x) levelPixel(s + x * Stride, d + x * Stride, rgbToHsv16u);
}
template <int Stride, typename T>
void hsvToRgbRow(const T* s, T* d, int width, const RowContext& c) {
  splitRow<Stride, Stride>(s, d, width, 4, c, hsvToRgbBlocks<Stride, T>, [](const T* p, T* q) {
    levelPixel(p, q, sizeof(T) == 1 ? hsvToRgb8u : hsvToRgb16u);
  });
}

template <typename T, typename Row>
Status convert(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, Row row) {
  return convertImage(src, srcStep, dst, dstStep, size, StepUnit::Samples, row);
}

}  // namespace

}  // namespace zel::spaces::hsv

using namespace zel::spaces::hsv;

ZEL_PUBLIC Status zeliRGBToHSV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow8u<3>);
}
ZEL_PUBLIC Status zeliRGBToHSV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow8u<4>);
}
ZEL_PUBLIC Status zeliRGBToHSV_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow16u<3>);
}
ZEL_PUBLIC Status zeliRGBToHSV_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, rgbToHsvRow16u<4>);
}
ZEL_PUBLIC Status zeliHSVToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<3, uint8_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<4, uint8_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<3, uint16_t>);
}
ZEL_PUBLIC Status zeliHSVToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return convert(src, srcStep, dst, dstStep, size, hsvToRgbRow<4, uint16_t>);
}
