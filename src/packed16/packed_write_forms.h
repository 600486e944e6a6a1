// The colour arithmetic of the packed writers, one function per form, each
// giving the 8-bit R, G, B of one pixel before its reduction to fields.
//
// YCbCr (video range): the body is the subtracted lane form of the second
// 601 set with no rounding term; the last pixels of some members take one
// of three 16.16 forms (truncating, rounded, or the uncentred "offset" form
// of 4:2:2 pairs). YUV 4:2:0: a lane form on Y << 4 and chroma << 7 with
// green subtracted, and the exact 16.16 form for the odd column and row.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/sub_to_rgb_forms.h"
#include "luma_chroma/ycbcr_lanes.h"
#include "luma_chroma/yuv_lanes.h"
#include "packed16/packed_write_fields.h"

namespace zel::pack {

inline Rgb rgbOf(const lc::Rgb8& p) { return {p.r, p.g, p.b}; }
inline Rgb rgbOf(const lc::Pixel8& p) { return {p.c0, p.c1, p.c2}; }

// ---- YCbCr ----

// Body of every YCbCr writer: y = MulHighS16((Y - 16) << 7, 9535), chroma
// centred and shifted by 7, green subtracted, sums >> 4.
inline Rgb ycbcrLaneForm(int y, int cb, int cr) { return rgbOf(lc::laneSubtracted(lc::lanes601b, y, cb, cr, 0)); }

// 16.16 on centred chroma, c = 76284 Y - 1220544, no rounding term.
inline Rgb ycbcrTruncatedForm(int y, int cb, int cr) { return rgbOf(lc::wideTruncated(lc::wide601a, y, cb, cr)); }

// The same with 32768 added in each channel (the 4:1:1 tail).
inline Rgb ycbcrRoundedForm(int y, int cb, int cr) { return rgbOf(lc::wideRounded(lc::wide601a, y, cb, cr)); }

// Uncentred chroma with folded offsets (222.912, 135.616, 276.8 in 16.16);
// the offsets are not the exact equivalents of centring, and stay so.
inline Rgb ycbcrOffsetForm(int y, int cb, int cr) { return rgbOf(lc::expand::wideRaw(y, cb, cr)); }

// The one-column path of the interleaved 4:2:2 writers: the one chroma
// byte c serves as both Cb and Cr of the offset form.
inline Rgb ycbcrOneColumnForm(int y, int c) { return ycbcrOffsetForm(y, c, c); }

// ---- YUV 4:2:0 ----

// Lane constants for Y << 4 and chroma << 7: V to R, V to G, U to G, U to B;
// the green ones are subtracted.
inline constexpr lc::RgbLaneSet kYuvPackedLanes{9338, 4759, 3227, 16646};

inline Rgb yuvLaneForm(int y, int u, int v) {
  return rgbOf(lc::rgbLanesShape<4, 7, 0, 4, true>(kYuvPackedLanes, y, u, v));
}

// Exact 16.16 on Y << 16, no rounding term.
inline Rgb yuvWideForm(int y, int u, int v) { return rgbOf(lc::rgbWide(lc::rgbWideA, {0, 0, 0}, y, u, v)); }

}  // namespace zel::pack
