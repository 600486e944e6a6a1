// Scalar formulas of the readers of packed words: the 16-bit lane forms of
// the vector bodies (written with the lane meanings, so that a scalar pixel
// and a vector lane agree bit for bit) and the exact wide forms of the
// tails. Inputs are the 8-bit expansions r, g, b of the fields (low bits
// zero), or their sums over the pixels that share a chroma sample.
//
// Studio-range YCbCr: the matrix of the full-resolution RGB to YCbCr
// conversion; full-range YUV: the luma sum of the YUV difference forms.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/rgb_to_ycbcr_forms.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::unpack {

// A 16-bit lane sum wraps; with these constants no sum comes near the limit.
inline int16_t lane16(int32_t v) { return static_cast<int16_t>(v); }

// ============================ studio YCbCr ============================

// Luma weights in Q15 (0.25702, 0.504, 0.09802) and 16.5 in Q7.
inline constexpr int kStudioYR = 8422, kStudioYG = 16515, kStudioYB = 3212, kStudioYAdd = 2112;
// Chroma weights in Q16: the matrix rows of the full-resolution form.
inline constexpr int kStudioBlue = lc::kCbB;  // 28770, 0.439 (B in Cb, R in Cr)
inline constexpr int kStudioCbR = -lc::kCbR;  // 9699
inline constexpr int kStudioCbG = -lc::kCbG;  // 19071
inline constexpr int kStudioCrG = -lc::kCrG;  // 24117
inline constexpr int kStudioCrB = -lc::kCrB;  // 4653
static_assert(lc::kCrR == lc::kCbB, "one weight serves B in Cb and R in Cr");

// Body luma: Y = SaturateU8((H(r) + H(g) + H(b) + 2112) >> 7) with
// H(c) = MulHighU16(c << 8, weight).
inline uint8_t studioLumaBody(int r, int g, int b) {
  auto h = [](int c, int w) { return int(MulHighU16(uint16_t(c << 8), uint16_t(w))); };
  return SaturateU8(lane16(h(r, kStudioYR) + h(g, kStudioYG) + h(b, kStudioYB) + kStudioYAdd) >> 7);
}

// Tail luma, exact in 16.16 with 16.5 added: the wide form of the
// full-resolution matrix (r5 x 134744 is r x 16843, and so on).
inline uint8_t studioLumaTail(int r, int g, int b) { return lc::ycbcrWide(r, g, b).y; }

// Body chroma of Rs, Gs, Bs summed over the 2 pixels (4:2:2, Pixels 2) or
// 4 pixels (4:2:0 and 4:1:1, Pixels 4) of one sample. The addend is 128.125
// in the format (16400 >> 7, 8200 >> 6): chroma truncates.
template <int Pixels>
struct StudioChromaBody {
  static_assert(Pixels == 2 || Pixels == 4, "two or four pixels a sample");
  static constexpr int kShift = Pixels == 4 ? 7 : 6;
  static constexpr int kAdd = Pixels == 4 ? 16400 : 8200;
  static int h(int sum, int w) { return MulHighU16(uint16_t(sum << 5), uint16_t(w)); }
  static uint8_t cb(int Rs, int Gs, int Bs) {
    return SaturateU8(lane16(h(Bs, kStudioBlue) - h(Rs, kStudioCbR) - h(Gs, kStudioCbG) + kAdd) >> kShift);
  }
  static uint8_t cr(int Rs, int Gs, int Bs) {
    return SaturateU8(lane16(h(Rs, kStudioBlue) - h(Gs, kStudioCrG) - h(Bs, kStudioCrB) + kAdd) >> kShift);
  }
};

// Tail chroma of the same sums, exact: ((sum + half) >> shift) + 128, the
// low byte stored.
template <int Pixels>
struct StudioChromaTail {
  static_assert(Pixels == 2 || Pixels == 4, "two or four pixels a sample");
  static constexpr int kShift = Pixels == 4 ? 18 : 17;
  static constexpr int32_t kHalf = Pixels == 4 ? 0x8000 : 0x4000;
  static uint8_t cb(int Rs, int Gs, int Bs) {
    return uint8_t(((Bs * kStudioBlue - Gs * kStudioCbG - Rs * kStudioCbR + kHalf) >> kShift) + 128);
  }
  static uint8_t cr(int Rs, int Gs, int Bs) {
    return uint8_t(((Rs * kStudioBlue - Gs * kStudioCrG - Bs * kStudioCrB + kHalf) >> kShift) + 128);
  }
};

// The lone last pixel of an odd-width 4:2:2 pair stream: its own Cb.
inline uint8_t studioLoneCb(int r, int g, int b) {
  return uint8_t(((b * kStudioBlue - g * kStudioCbG - r * kStudioCbR + 0x2000) >> 16) + 128);
}

// ============================ full-range YUV ============================

// Step 4 (blue-low words): Q15 luma 0.29901, 0.58701, 0.11401 with 0.5 in
// Q7; U and V gains 0.246 and 0.43849 on doubled differences.
inline constexpr int kYuvYR = 9798, kYuvYG = 19235, kYuvYB = 3736;
inline constexpr int kYuvUGain = 16122, kYuvVGain = 28737;
// The red-low 565 member's U gain.
inline constexpr int kYuvUGainRedLow = 16121;
// Tail gains of the differences in Q16 (0.492, 0.877): a group's
// difference is a sum of four (or two) pixels' and is scaled back by a
// shift of 18 (or 17).
inline constexpr int32_t kYuvUTail = 32244, kYuvVTail = 57475;

// Body luma before saturation: y = (H(r) + H(g) + H(b) + 64) >> 7.
inline int yuvLumaBodyLane(int r, int g, int b) {
  auto h = [](int c, int w) { return int(MulHighU16(uint16_t(c << 8), uint16_t(w))); };
  return lane16(h(r, kYuvYR) + h(g, kYuvYG) + h(b, kYuvYB) + 64) >> 7;
}

// Body chroma of a 2 x 2 block: Ys the sum of the four y, Rs and Bs the
// sums of the expansions (Rs << 5 is the raw field sum << 8).
inline uint8_t yuvChromaBody(int Ys, int sum, int gain) {
  const int16_t d = lane16((sum << 5) - (Ys << 5));
  return SaturateU8(lane16(MulHighS16(d, int16_t(gain)) + 8224) >> 6);
}

// Tail luma sum in 16.16, the luma of the YUV difference forms.
inline int32_t yuvLumaSum(int r, int g, int b) { return lc::yuvDifferenceSum(r, g, b); }

// Tail chroma of a group: S the sum of its luma sums, Bs and Rs the sums
// of the expansions; ((sum << 16) - S + Half) >> 16 is the difference,
// scaled by the tail gain >> Shift. U is stored as its low byte (blue minus
// luma never leaves the range here), V is clamped.
template <int32_t Half, int Shift>
struct YuvChromaTail {
  static int32_t difference(int sum, int32_t S) { return ((int32_t(sum) << 16) - S + Half) >> 16; }
  static uint8_t u(int Bs, int32_t S) { return uint8_t(((difference(Bs, S) * kYuvUTail) >> Shift) + 128); }
  static uint8_t v(int Rs, int32_t S) { return SaturateU8(((difference(Rs, S) * kYuvVTail) >> Shift) + 128); }
};
using YuvChromaTail4 = YuvChromaTail<0x1ffff, 18>;  // 2 x 2 blocks
using YuvChromaTail2 = YuvChromaTail<65535, 17>;    // pairs

// Red-low 565 body: inputs are expansions times four (R' = r5 << 5, G' =
// g6 << 4, B' = b5 << 5); y2 is twice the luma.
inline int yuvLumaTwice(int r, int g, int b) {
  auto h = [](int c, int w) { return int(MulHighS16(int16_t(c << 2), int16_t(w))); };
  return lane16(lane16(h(r, kYuvYR) + h(b, kYuvYB)) + h(g, kYuvYG));
}
inline uint8_t yuvLumaFromTwice(int y2) { return SaturateU8(lane16(y2 + 1) >> 1); }
// m the mean of y2 over the group, mean the matching mean of B' or R'
// (sums >> 3 for a 2 x 2 block, >> 2 for a pair: twice the mean channel).
inline uint8_t yuvChromaFromTwice(int mean, int m, int gain) {
  return SaturateU8(lane16(MulHighS16(lane16(mean - m), int16_t(gain)) + 128));
}

}  // namespace zel::unpack
