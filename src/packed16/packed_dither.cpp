// Writers of 16-bit packed words with the 4 x 4 ordered dither: the plain
// writers' drivers with each colour reduced against the threshold of its
// place in the region. They take the lane forms in every position and never
// warn about odd sizes.
#include "packed16/packed_write_members.h"

ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCrTo, Dither_8u16u_P3C3R, Full, true)
ZEL_PACKED_SIX(ZEL_PACKED_PIXELS, zeliYCbCrTo, Dither_8u16u_C3R, true)
ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCr422To, Dither_8u16u_P3C3R, Half, true)
ZEL_PACKED_SIX(ZEL_PACKED_PAIRS, zeliYCbCr422To, Dither_8u16u_C2C3R, true)
ZEL_PACKED_SIX(ZEL_PACKED_PLANES, zeliYCbCr420To, Dither_8u16u_P3C3R, HalfBoth, true)
ZEL_PACKED_SIX(ZEL_PACKED_YUV420, zeliYUV420To, Dither_8u16u_P3C3R, true)
