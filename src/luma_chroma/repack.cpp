// Repacking of 8-bit YCbCr between 4:2:2, 4:2:0 and 4:1:1, pair streams,
// two planes and three planes, and the YCbCr, YCrCb and CbYCr orders. Each
// route makes one pass over a row: pair streams split into or woven from
// the target's layout directly, planar layouts copy luma and deal chroma
// bytes from source rows to target rows by the rule of the two schemes.
#include <algorithm>
#include <cstring>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/scalar_ops.h"
#include "frame/simd.h"
#include "luma_chroma/repack_rows.h"

namespace zel::repack {

namespace {

enum class Scheme : uint8_t { S422, S420, S411 };
enum class Kind : uint8_t { Pairs, TwoPlanes, Planes };

struct Layout {
  Kind kind;
  PairOrder order;   // for Pairs
  bool crFirst;      // for Planes: planes Y, Cr, Cb
  Scheme scheme;
};

// How much of the region a member works on, and what size it rejects.
enum class SizeRule : uint8_t {
  Even2x2,       // width, height >= 2; width & ~1, height & ~1
  Quad4x2,       // width >= 4, height >= 2; width & ~3, height & ~1
  Quad4,         // width >= 4; width & ~3; height below 1 does no rows
  Quad4x1,       // width >= 4, height >= 1; width & ~3
  Even2x1,       // width >= 2, height >= 1; width & ~1
  Even2,         // width >= 2; width & ~1; height below 1 does no rows
};

struct Member {
  Layout src, dst;
  SizeRule rule;
  bool nonTemporalRoute;  // large aligned targets bypass the cache
  bool streamedLuma;      // luma rows through the streaming row copy
};

// Image pointers and steps of one side: a pair stream uses [0]; two planes
// [0] luma, [1] chroma pairs; three planes [0] Y, [1] Cb, [2] Cr (already
// swapped for YCrCb names).
struct Side {
  uint8_t* p[3];
  int step[3];
  int count;
};

int chromaWidth(Scheme s, int width) { return s == Scheme::S411 ? width / 4 : width / 2; }

// Gapless rows are joined into one only while every offset within it,
// counted in the bytes of a pair stream, stays well inside an int.
constexpr int64_t kLongestRow = int64_t(1) << 28;

uint8_t* at(const Side& s, int plane, int row, int offset) { return rowAt(s.p[plane], s.step[plane], row) + offset; }

// Whether each plane's step is exactly the bytes of its row.
bool gapless(const Layout& l, const Side& s, int width) {
  const int chroma = chromaWidth(l.scheme, width);
  for (int i = 0; i < s.count; ++i) {
    const int bytes = l.kind == Kind::Pairs ? 2 * width : i == 0 ? width : l.kind == Kind::TwoPlanes ? 2 * chroma : chroma;
    if (s.step[i] != bytes) return false;
  }
  return true;
}

// Luma rows copied, as one row when no gap lies between them.
void copyLuma(const Side& src, const Side& dst, int width, int height, bool nonTemporal) {
  if (src.step[0] == width && dst.step[0] == width && int64_t(width) * height <= kLongestRow)
    copyBytes(src.p[0], dst.p[0], width * height, nonTemporal);
  else
    for (int y = 0; y < height; ++y) copyBytes(at(src, 0, y, 0), at(dst, 0, y, 0), width, nonTemporal);
}

// A pair stream into planes or two planes: one pass a row writes luma and,
// on rows that keep chroma, the chroma in the target's scheme and layout.
void unpackPairs(const Member& m, const Side& src, const Side& dst, int width, int height, bool nonTemporal) {
  const PairOrder o = m.src.order;
  for (int y = 0; y < height; ++y) {
    const uint8_t* in = at(src, 0, y, 0);
    uint8_t* luma = at(dst, 0, y, 0);
    const bool half = m.dst.scheme == Scheme::S420;
    if (half && (y & 1)) {  // odd rows drop their chroma
      lumaOfPairs(in, o, luma, width);
      continue;
    }
    const int row = half ? y / 2 : y;
    if (m.dst.kind == Kind::Planes) {
      if (m.dst.scheme == Scheme::S411)
        splitPairs411(in, o, luma, at(dst, 1, row, 0), at(dst, 2, row, 0), width);
      else
        splitPairs(in, o, luma, at(dst, 1, row, 0), at(dst, 2, row, 0), width);
    } else if (m.dst.scheme == Scheme::S411) {
      splitPairsToCbCr411(in, o, luma, at(dst, 1, row, 0), width, nonTemporal);
    } else {
      splitPairsToCbCr(in, o, luma, at(dst, 1, row, 0), width, nonTemporal);
    }
  }
}

// Planes or two planes into a pair stream: each row reads its chroma row
// (shared by two rows in 4:2:0) and weaves it with luma in one pass.
void packPairs(const Member& m, const Side& src, const Side& dst, int width, int height, bool nonTemporal) {
  const PairOrder o = m.dst.order;
  // 4:2:2 planes whose rows follow each other without a gap, in every plane
  // and in the pair stream, weave as one long row.
  const bool planes422 = m.src.scheme == Scheme::S422 && m.src.kind == Kind::Planes;
  if (planes422 && width % 2 == 0 && src.step[0] == width && src.step[1] == width / 2 && src.step[2] == width / 2 &&
      dst.step[0] == 2 * width && int64_t(width) * height <= kLongestRow) {
    mergePairs(src.p[0], src.p[1], src.p[2], o, dst.p[0], width * height, nonTemporal);
    return;
  }
  if (m.src.kind == Kind::Planes && m.src.scheme != Scheme::S411) {
    const PairRows rows{src.p[0],    src.p[1],    src.p[2], src.step[0], src.step[1], src.step[2],
                        m.src.scheme == Scheme::S420 ? 2 : 1, dst.p[0], dst.step[0]};
    mergePairRows(rows, o, width, height, nonTemporal);
    return;
  }
  for (int y = 0; y < height; ++y) {
    const uint8_t* luma = at(src, 0, y, 0);
    uint8_t* out = at(dst, 0, y, 0);
    const int row = m.src.scheme == Scheme::S420 ? y / 2 : y;
    if (m.src.kind == Kind::Planes) {
      if (m.src.scheme == Scheme::S411)
        mergePairs411(luma, at(src, 1, row, 0), at(src, 2, row, 0), o, out, width, nonTemporal);
      else
        mergePairs(luma, at(src, 1, row, 0), at(src, 2, row, 0), o, out, width, nonTemporal);
    } else if (m.src.scheme == Scheme::S411) {
      mergePairsCbCr411(luma, at(src, 1, row, 0), o, out, width, nonTemporal);
    } else {
      mergePairsCbCr(luma, at(src, 1, row, 0), o, out, width, nonTemporal);
    }
  }
}

// Chroma between planar layouts (planes or two planes, either side): each
// rule moves whole rows or deals out bytes, straight from source rows to
// target rows.
void moveChroma(const Member& m, const Side& src, const Side& dst, int width, int height) {
  const Scheme from = m.src.scheme, to = m.dst.scheme;
  const bool srcPlanes = m.src.kind == Kind::Planes, dstPlanes = m.dst.kind == Kind::Planes;
  // One chroma row in the same scheme (or a row kept or repeated whole);
  // `cw` samples of each plane.
  auto sameRow = [&](int s, int d, int cw) {
    if (srcPlanes && dstPlanes) {
      copyBytes(at(src, 1, s, 0), at(dst, 1, d, 0), cw, false);
      copyBytes(at(src, 2, s, 0), at(dst, 2, d, 0), cw, false);
    } else if (srcPlanes) {
      zip(at(src, 1, s, 0), at(src, 2, s, 0), at(dst, 1, d, 0), cw, false);
    } else if (dstPlanes) {
      unzip(at(src, 1, s, 0), at(dst, 1, d, 0), at(dst, 2, d, 0), cw);
    } else {
      copyBytes(at(src, 1, s, 0), at(dst, 1, d, 0), 2 * cw, false);
    }
  };
  const int rowSamples = chromaWidth(to, width);
  if (from == to) {
    const int rows = from == Scheme::S420 ? height / 2 : height;
    // Rows that follow each other without a gap in every plane go as one.
    const int srcBytes = srcPlanes ? rowSamples : 2 * rowSamples, dstBytes = dstPlanes ? rowSamples : 2 * rowSamples;
    const bool gapless = src.step[1] == srcBytes && dst.step[1] == dstBytes &&
                         (!srcPlanes || src.step[2] == srcBytes) && (!dstPlanes || dst.step[2] == dstBytes) &&
                         int64_t(rowSamples) * rows <= kLongestRow;
    if (gapless) {
      sameRow(0, 0, rowSamples * rows);
    } else {
      for (int r = 0; r < rows; ++r) sameRow(r, r, rowSamples);
    }
  } else if (from == Scheme::S422 && to == Scheme::S420) {
    for (int r = 0; r < height / 2; ++r) sameRow(2 * r, r, rowSamples);  // even rows kept
  } else if (from == Scheme::S420 && to == Scheme::S422) {
    for (int r = 0; r < height; ++r) sameRow(r / 2, r, rowSamples);  // each row twice
  } else if (from == Scheme::S422 && to == Scheme::S411) {
    const int cw = width / 4;  // even samples kept
    for (int r = 0; r < height; ++r) {
      if (dstPlanes) {
        keepEven(at(src, 1, r, 0), at(dst, 1, r, 0), cw);
        keepEven(at(src, 2, r, 0), at(dst, 2, r, 0), cw);
      } else {
        zipEvens(at(src, 1, r, 0), at(src, 2, r, 0), at(dst, 1, r, 0), cw);
      }
    }
  } else if (from == Scheme::S411 && to == Scheme::S422) {
    const int cw = width / 4;  // each sample twice
    for (int r = 0; r < height; ++r) {
      if (srcPlanes) {
        doubleSamples(at(src, 1, r, 0), at(dst, 1, r, 0), cw, false);
        doubleSamples(at(src, 2, r, 0), at(dst, 2, r, 0), cw, false);
      } else {
        unzipDouble(at(src, 1, r, 0), at(dst, 1, r, 0), at(dst, 2, r, 0), cw);
      }
    }
  } else if (from == Scheme::S411 && to == Scheme::S420) {
    const int cw = width / 4;  // two source rows interleave into one
    for (int r = 0; r < height / 2; ++r) {
      if (srcPlanes && dstPlanes) {
        zip(at(src, 1, 2 * r, 0), at(src, 1, 2 * r + 1, 0), at(dst, 1, r, 0), cw, false);
        zip(at(src, 2, 2 * r, 0), at(src, 2, 2 * r + 1, 0), at(dst, 2, r, 0), cw, false);
      } else if (srcPlanes) {
        zip4(at(src, 1, 2 * r, 0), at(src, 2, 2 * r, 0), at(src, 1, 2 * r + 1, 0), at(src, 2, 2 * r + 1, 0),
             at(dst, 1, r, 0), cw);
      } else {
        crossPairs(at(src, 1, 2 * r, 0), at(src, 1, 2 * r + 1, 0), at(dst, 1, r, 0), at(dst, 2, r, 0), 2 * cw);
      }
    }
  } else {  // 4:2:0 to 4:1:1, the inverse
    const int cw = width / 4;
    for (int r = 0; r < height / 2; ++r) {
      if (srcPlanes && dstPlanes) {
        unzip(at(src, 1, r, 0), at(dst, 1, 2 * r, 0), at(dst, 1, 2 * r + 1, 0), cw);
        unzip(at(src, 2, r, 0), at(dst, 2, 2 * r, 0), at(dst, 2, 2 * r + 1, 0), cw);
      } else if (srcPlanes) {
        crossPairs(at(src, 1, r, 0), at(src, 2, r, 0), at(dst, 1, 2 * r, 0), at(dst, 1, 2 * r + 1, 0), 2 * cw);
      } else {
        unzip4(at(src, 1, r, 0), at(dst, 1, 2 * r, 0), at(dst, 2, 2 * r, 0), at(dst, 1, 2 * r + 1, 0),
               at(dst, 2, 2 * r + 1, 0), cw);
      }
    }
  }
}

Status run(const Member& m, const Side& src, const Side& dst, ImageSize size) {
  int width = size.width, height = size.height;
  switch (m.rule) {
    case SizeRule::Even2x2:
      if (width < 2 || height < 2) return StatusSizeError;
      width &= ~1;
      height &= ~1;
      break;
    case SizeRule::Quad4x2:
      if (width < 4 || height < 2) return StatusSizeError;
      width &= ~3;
      height &= ~1;
      break;
    case SizeRule::Quad4:
      if (width < 4) return StatusSizeError;
      width &= ~3;
      break;
    case SizeRule::Quad4x1:
      if (width < 4 || height < 1) return StatusSizeError;
      width &= ~3;
      break;
    case SizeRule::Even2x1:
      if (width < 2 || height < 1) return StatusSizeError;
      width &= ~1;
      break;
    case SizeRule::Even2:
      if (width < 2) return StatusSizeError;
      width &= ~1;
      break;
  }
  if (height < 1) return StatusOk;

  // Non-temporal stores when the rows touched are large and the target
  // is aligned; the bytes are the same either way.
  bool nonTemporal = false;
  if (m.nonTemporalRoute) {
    int64_t steps = 0;
    bool aligned = true;
    for (int i = 0; i < src.count; ++i) steps += src.step[i];
    for (int i = 0; i < dst.count; ++i) {
      steps += dst.step[i];
      aligned = aligned && isAligned16(dst.p[i]) && isAligned16(dst.step[i]);
    }
    nonTemporal = aligned && steps * height >= 524289;
  }
  const bool streamLuma = m.streamedLuma && int64_t(width) * height >= 348603;

  // Without 4:2:0 every row stands alone; when no plane has a gap between
  // rows, the image is one long row.
  if (m.src.scheme != Scheme::S420 && m.dst.scheme != Scheme::S420 && gapless(m.src, src, width) &&
      gapless(m.dst, dst, width) && int64_t(width) * height <= kLongestRow) {
    width *= height;
    height = 1;
  }

  if (m.src.kind == Kind::Pairs && m.dst.kind == Kind::Pairs) {
    // 4:2:2 streams of two byte orders: one byte permutation a row.
    for (int y = 0; y < height; ++y)
      reorderPairs(at(src, 0, y, 0), m.src.order, at(dst, 0, y, 0), m.dst.order, width, nonTemporal);
  } else if (m.src.kind == Kind::Pairs) {
    unpackPairs(m, src, dst, width, height, nonTemporal);
  } else if (m.dst.kind == Kind::Pairs) {
    packPairs(m, src, dst, width, height, nonTemporal);
  } else {
    // Planar both sides: luma rows copied, then the chroma rule.
    copyLuma(src, dst, width, height, nonTemporal || streamLuma);
    moveChroma(m, src, dst, width, height);
  }
  if (nonTemporal || streamLuma) _mm_sfence();
  return StatusOk;
}

// ---- filtered members ----

// Samples and the rounded means of their right neighbours, 32 a step.
ZEL_AVX2 void meansBetweenAvx(const uint8_t* c, uint8_t* o, int size) {
  for (int j = 0; j < size; j += 32) {
    const __m256i a = load256(c + j), m = _mm256_avg_epu8(a, load256(c + j + 1));
    const __m256i lo = _mm256_unpacklo_epi8(a, m), hi = _mm256_unpackhi_epi8(a, m);
    store256(o + 2 * j, _mm256_permute2x128_si256(lo, hi, 0x20));
    store256(o + 2 * j + 32, _mm256_permute2x128_si256(lo, hi, 0x31));
  }
}

// 4:1:1 to 4:2:0 from the even source rows, the new odd columns the
// average of their neighbours: rounded in blocks of 64 and 16 while more
// than that many samples remain, truncated for single samples.
void filter411To420Row(const uint8_t* c, uint8_t* o, int n) {
  int k = 0;
  const bool avx2 = hasAvx2();
  auto block = [&](int size) {
    if (avx2 && size == 64) {
      meansBetweenAvx(c + k, o + 2 * k, size);
      k += size;
      return;
    }
    for (int j = 0; j < size; j += 16) {
      const __m128i a = load128(c + k + j), b = load128(c + k + j + 1);
      const __m128i m = _mm_avg_epu8(a, b);
      store128(o + 2 * (k + j), _mm_unpacklo_epi8(a, m));
      store128(o + 2 * (k + j) + 16, _mm_unpackhi_epi8(a, m));
    }
    k += size;
  };
  while (n - k > 64) block(64);
  while (n - k > 16) block(16);
  for (; k < n; ++k) {
    o[2 * k] = c[k];
    o[2 * k + 1] = k + 1 < n ? uint8_t(TruncatedMean(c[k], c[k + 1])) : c[k];
  }
}

// The 32 even samples of 64 bytes.
ZEL_AVX2 ZEL_INLINE __m256i evens256(const uint8_t* p, __m256i m) {
  const __m256i lo = _mm256_shuffle_epi8(load256(p), m), hi = _mm256_shuffle_epi8(load256(p + 32), m);
  return _mm256_permute4x64_epi64(_mm256_unpacklo_epi64(lo, hi), _MM_SHUFFLE(3, 1, 2, 0));
}

// Even samples and their rounded means with the row below, 32 a step.
ZEL_AVX2 int evenMeansAvx(const uint8_t* c, const uint8_t* below, uint8_t* even, uint8_t* odd, int n) {
  const __m256i m = _mm256_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, -1, -1, -1, -1, -1, -1, -1, -1, 0, 2, 4, 6, 8, 10,
                                     12, 14, -1, -1, -1, -1, -1, -1, -1, -1);
  int k = 0;
  for (; n - k >= 32; k += 32) {
    const __m256i a = evens256(c + 2 * k, m);
    store256(even + k, a);
    store256(odd + k, below ? _mm256_avg_epu8(a, evens256(below + 2 * k, m)) : a);
  }
  return k;
}

// 4:2:0 to 4:1:1 from the even columns, the new odd rows the average of
// the rows above and below: rounded in blocks of 32 while 32 remain,
// truncated after that; the last source row is copied.

void filter420To411Rows(const uint8_t* c, const uint8_t* below, uint8_t* even, uint8_t* odd, int n) {
  const __m128i m = _mm_setr_epi8(0, 2, 4, 6, 8, 10, 12, 14, -1, -1, -1, -1, -1, -1, -1, -1);
  auto evens = [&](const uint8_t* p) {
    return _mm_unpacklo_epi64(_mm_shuffle_epi8(load128(p), m), _mm_shuffle_epi8(load128(p + 16), m));
  };
  int k = hasAvx2() ? evenMeansAvx(c, below, even, odd, n) : 0;
  for (; n - k >= 32; k += 32)
    for (int j = 0; j < 32; j += 16) {
      const __m128i a = evens(c + 2 * (k + j));
      store128(even + k + j, a);
      store128(odd + k + j, below ? _mm_avg_epu8(a, evens(below + 2 * (k + j))) : a);
    }
  for (; k < n; ++k) {
    even[k] = c[2 * k];
    odd[k] = below ? uint8_t(TruncatedMean(c[2 * k], below[2 * k])) : c[2 * k];
  }
}

Status filter411To420(const Side& src, const Side& dst, ImageSize size) {
  if (size.width < 4 || size.height < 4 || (size.width & 3) || (size.height & 3)) return StatusSizeError;
  const int n = size.width / 4;
  copyLuma(src, dst, size.width, size.height, false);
  for (int i = 0; i < size.height / 2; ++i)
    for (int p = 1; p <= 2; ++p) filter411To420Row(at(src, p, 2 * i, 0), at(dst, p, i, 0), n);
  return StatusOk;
}

Status filter420To411(const Side& src, const Side& dst, ImageSize size) {
  if (size.width < 4 || size.height < 2 || (size.width & 3) || (size.height & 1)) return StatusSizeError;
  const int n = size.width / 4;
  const int rows = size.height / 2;
  copyLuma(src, dst, size.width, size.height, false);
  for (int i = 0; i < rows; ++i)
    for (int p = 1; p <= 2; ++p)
      filter420To411Rows(at(src, p, i, 0), i + 1 < rows ? at(src, p, i + 1, 0) : nullptr, at(dst, p, 2 * i, 0),
                         at(dst, p, 2 * i + 1, 0), n);
  return StatusOk;
}

// ---- sides from the public arguments ----

Side pairSide(const uint8_t* p, int step) { return Side{{const_cast<uint8_t*>(p), nullptr, nullptr}, {step, 0, 0}, 1}; }
Side twoPlaneSide(const uint8_t* y, int yStep, const uint8_t* c, int cStep) {
  return Side{{const_cast<uint8_t*>(y), const_cast<uint8_t*>(c), nullptr}, {yStep, cStep, 0}, 2};
}
Side planeSide(const uint8_t* const* p, const int* steps, bool crFirst) {
  const int b = crFirst ? 2 : 1, r = crFirst ? 1 : 2;
  return Side{{const_cast<uint8_t*>(p[0]), const_cast<uint8_t*>(p[b]), const_cast<uint8_t*>(p[r])},
              {steps[0], steps[b], steps[r]},
              3};
}

constexpr Layout pairsOf(PairOrder o) { return Layout{Kind::Pairs, o, false, Scheme::S422}; }
constexpr Layout twoPlanes(Scheme s) { return Layout{Kind::TwoPlanes, PairOrder::YCbCr, false, s}; }
constexpr Layout planes(Scheme s, bool crFirst = false) { return Layout{Kind::Planes, PairOrder::YCbCr, crFirst, s}; }

// The size rule that follows from the two schemes.
constexpr SizeRule ruleOf(Scheme a, Scheme b) {
  const bool has411 = a == Scheme::S411 || b == Scheme::S411;
  const bool has420 = a == Scheme::S420 || b == Scheme::S420;
  return has411 && has420 ? SizeRule::Quad4x2 : has420 ? SizeRule::Even2x2 : has411 ? SizeRule::Quad4 : SizeRule::Even2x1;
}

constexpr Member member(Layout s, Layout d, bool nonTemporal = false) {
  return Member{s, d, ruleOf(s.scheme, d.scheme), nonTemporal, false};
}
constexpr Member withRule(Member m, SizeRule r) {
  m.rule = r;
  return m;
}
constexpr Member withStreamedLuma(Member m) {
  m.streamedLuma = true;
  return m;
}

constexpr Scheme S422 = Scheme::S422, S420 = Scheme::S420, S411 = Scheme::S411;
constexpr Layout kYCbCrPairs = pairsOf(PairOrder::YCbCr), kYCrCbPairs = pairsOf(PairOrder::YCrCb),
                 kCbYCrPairs = pairsOf(PairOrder::CbYCr);

}  // namespace

}  // namespace zel::repack

using namespace zel::repack;
using zel::anyPlaneNull;

// Public frames by layout pair: pointers and plane entries, then the
// member's size rule, then the work.
#define REPACK_C2C2(name, m)                                                                      \
  ZEL_PUBLIC Status name(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) { \
    if (!src || !dst) return StatusNullPointerError;                                                \
    return run(m, pairSide(src, srcStep), pairSide(dst, dstStep), size);                           \
  }
#define REPACK_C2P3(name, m)                                                                                \
  ZEL_PUBLIC Status name(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3],      \
                         ImageSize size) {                                                                  \
    if (!src || !dst || !dstStep || anyPlaneNull(dst)) return StatusNullPointerError;                       \
    return run(m, pairSide(src, srcStep), planeSide(dst, dstStep, (m).dst.crFirst), size);                  \
  }
#define REPACK_C2P2(name, m)                                                                                 \
  ZEL_PUBLIC Status name(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr,    \
                         int dstCbCrStep, ImageSize size) {                                                  \
    if (!src || !dstY || !dstCbCr) return StatusNullPointerError;                                           \
    return run(m, pairSide(src, srcStep), twoPlaneSide(dstY, dstYStep, dstCbCr, dstCbCrStep), size);        \
  }
#define REPACK_P3C2(name, m)                                                                                \
  ZEL_PUBLIC Status name(const uint8_t* const src[3], const int srcStep[3], uint8_t* dst, int dstStep,      \
                         ImageSize size) {                                                                  \
    if (!src || !srcStep || anyPlaneNull(src) || !dst) return StatusNullPointerError;                       \
    return run(m, planeSide(src, srcStep, (m).src.crFirst), pairSide(dst, dstStep), size);                  \
  }
#define REPACK_P3P3(name, m)                                                                                           \
  ZEL_PUBLIC Status name(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],                     \
                         const int dstStep[3], ImageSize size) {                                                       \
    if (!src || !srcStep || anyPlaneNull(src) || !dst || !dstStep || anyPlaneNull(dst)) return StatusNullPointerError; \
    return run(m, planeSide(src, srcStep, (m).src.crFirst), planeSide(dst, dstStep, (m).dst.crFirst), size);           \
  }
#define REPACK_P3P2(name, m)                                                                                           \
  ZEL_PUBLIC Status name(const uint8_t* const src[3], const int srcStep[3], uint8_t* dstY, int dstYStep,               \
                         uint8_t* dstCbCr, int dstCbCrStep, ImageSize size) {                                          \
    if (!src || !srcStep || anyPlaneNull(src) || !dstY || !dstCbCr) return StatusNullPointerError;                     \
    return run(m, planeSide(src, srcStep, (m).src.crFirst), twoPlaneSide(dstY, dstYStep, dstCbCr, dstCbCrStep), size); \
  }
#define REPACK_P2C2(name, m)                                                                                 \
  ZEL_PUBLIC Status name(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,        \
                         uint8_t* dst, int dstStep, ImageSize size) {                                        \
    if (!srcY || !srcCbCr || !dst) return StatusNullPointerError;                                           \
    return run(m, twoPlaneSide(srcY, srcYStep, srcCbCr, srcCbCrStep), pairSide(dst, dstStep), size);        \
  }
#define REPACK_P2P3(name, m)                                                                                           \
  ZEL_PUBLIC Status name(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,                   \
                         uint8_t* const dst[3], const int dstStep[3], ImageSize size) {                                \
    if (!srcY || !srcCbCr || !dst || !dstStep || anyPlaneNull(dst)) return StatusNullPointerError;                     \
    return run(m, twoPlaneSide(srcY, srcYStep, srcCbCr, srcCbCrStep), planeSide(dst, dstStep, (m).dst.crFirst), size); \
  }

// 4:2:2 to 4:2:2
REPACK_C2P3(zeliCbYCr422ToYCbCr422_8u_C2P3R, member(kCbYCrPairs, planes(S422)))
REPACK_C2C2(zeliCbYCr422ToYCbCr422_8u_C2R, member(kCbYCrPairs, kYCbCrPairs))
REPACK_C2C2(zeliYCbCr422ToCbYCr422_8u_C2R, member(kYCbCrPairs, kCbYCrPairs, true))
REPACK_P3C2(zeliYCbCr422ToCbYCr422_8u_P3C2R, member(planes(S422), kCbYCrPairs))
REPACK_C2C2(zeliYCbCr422ToYCrCb422_8u_C2R, withRule(member(kYCbCrPairs, kYCrCbPairs, true), SizeRule::Even2))
REPACK_P3C2(zeliYCbCr422ToYCrCb422_8u_P3C2R, withRule(member(planes(S422), kYCrCbPairs, true), SizeRule::Even2))
REPACK_C2P3(zeliYCbCr422_8u_C2P3R, member(kYCbCrPairs, planes(S422)))
REPACK_P3C2(zeliYCbCr422_8u_P3C2R, member(planes(S422), kYCbCrPairs))
REPACK_C2P3(zeliYCrCb422ToYCbCr422_8u_C2P3R, member(kYCrCbPairs, planes(S422)))

// 4:2:2 to 4:2:0
REPACK_C2P2(zeliCbYCr422ToYCbCr420_8u_C2P2R, member(kCbYCrPairs, twoPlanes(S420)))
REPACK_C2P3(zeliCbYCr422ToYCbCr420_8u_C2P3R, member(kCbYCrPairs, planes(S420)))
REPACK_C2P3(zeliCbYCr422ToYCrCb420_8u_C2P3R, member(kCbYCrPairs, planes(S420, true)))
REPACK_C2P2(zeliYCbCr422ToYCbCr420_8u_C2P2R, member(kYCbCrPairs, twoPlanes(S420)))
REPACK_C2P3(zeliYCbCr422ToYCbCr420_8u_C2P3R, member(kYCbCrPairs, planes(S420)))
REPACK_P3P2(zeliYCbCr422ToYCbCr420_8u_P3P2R, member(planes(S422), twoPlanes(S420)))
REPACK_P3P3(zeliYCbCr422ToYCbCr420_8u_P3R, withStreamedLuma(member(planes(S422), planes(S420))))
REPACK_C2P3(zeliYCbCr422ToYCrCb420_8u_C2P3R, member(kYCbCrPairs, planes(S420, true)))
REPACK_C2P3(zeliYCrCb422ToYCbCr420_8u_C2P3R, member(kYCrCbPairs, planes(S420)))

// 4:2:2 to 4:1:1
REPACK_C2P3(zeliCbYCr422ToYCbCr411_8u_C2P3R, member(kCbYCrPairs, planes(S411)))
REPACK_C2P2(zeliYCbCr422ToYCbCr411_8u_C2P2R, member(kYCbCrPairs, twoPlanes(S411), true))
REPACK_C2P3(zeliYCbCr422ToYCbCr411_8u_C2P3R, withRule(member(kYCbCrPairs, planes(S411)), SizeRule::Quad4x1))
REPACK_P3P2(zeliYCbCr422ToYCbCr411_8u_P3P2R, member(planes(S422), twoPlanes(S411)))
REPACK_P3P3(zeliYCbCr422ToYCbCr411_8u_P3R, member(planes(S422), planes(S411)))
REPACK_C2P3(zeliYCrCb422ToYCbCr411_8u_C2P3R, member(kYCrCbPairs, planes(S411)))

// 4:2:0 to 4:2:2
REPACK_P2C2(zeliYCbCr420ToCbYCr422_8u_P2C2R, member(twoPlanes(S420), kCbYCrPairs))
REPACK_P2C2(zeliYCbCr420ToYCbCr422_8u_P2C2R, member(twoPlanes(S420), kYCbCrPairs))
REPACK_P2P3(zeliYCbCr420ToYCbCr422_8u_P2P3R, member(twoPlanes(S420), planes(S422)))
REPACK_P3P3(zeliYCbCr420ToYCbCr422_8u_P3R, member(planes(S420), planes(S422)))
REPACK_P3C2(zeliYCrCb420ToCbYCr422_8u_P3C2R, member(planes(S420, true), kCbYCrPairs, true))
REPACK_P3C2(zeliYCrCb420ToYCbCr422_8u_P3C2R, member(planes(S420, true), kYCbCrPairs))
REPACK_P3P3(zeliYCrCb420ToYCbCr422_8u_P3R, member(planes(S420, true), planes(S422)))

// 4:2:0 to 4:2:0
REPACK_P2P3(zeliYCbCr420ToYCrCb420_8u_P2P3R, member(twoPlanes(S420), planes(S420, true)))
REPACK_P2P3(zeliYCbCr420_8u_P2P3R, member(twoPlanes(S420), planes(S420)))
REPACK_P3P2(zeliYCbCr420_8u_P3P2R, member(planes(S420), twoPlanes(S420)))
REPACK_P3P2(zeliYCrCb420ToYCbCr420_8u_P3P2R, member(planes(S420, true), twoPlanes(S420)))

// 4:2:0 to 4:1:1
REPACK_P2P3(zeliYCbCr420ToYCbCr411_8u_P2P3R, member(twoPlanes(S420), planes(S411)))
REPACK_P3P2(zeliYCbCr420ToYCbCr411_8u_P3P2R, member(planes(S420), twoPlanes(S411)))
REPACK_P3P2(zeliYCrCb420ToYCbCr411_8u_P3P2R, member(planes(S420, true), twoPlanes(S411)))

// 4:1:1 to 4:2:2
REPACK_P2C2(zeliYCbCr411ToYCbCr422_8u_P2C2R, member(twoPlanes(S411), kYCbCrPairs, true))
REPACK_P2P3(zeliYCbCr411ToYCbCr422_8u_P2P3R, member(twoPlanes(S411), planes(S422)))
REPACK_P3C2(zeliYCbCr411ToYCbCr422_8u_P3C2R, member(planes(S411), kYCbCrPairs, true))
REPACK_P3P3(zeliYCbCr411ToYCbCr422_8u_P3R, member(planes(S411), planes(S422)))
REPACK_P3C2(zeliYCbCr411ToYCrCb422_8u_P3C2R, member(planes(S411), kYCrCbPairs, true))
REPACK_P3P3(zeliYCbCr411ToYCrCb422_8u_P3R, member(planes(S411), planes(S422, true)))

// 4:1:1 to 4:2:0
REPACK_P2P3(zeliYCbCr411ToYCbCr420_8u_P2P3R, member(twoPlanes(S411), planes(S420)))
REPACK_P3P2(zeliYCbCr411ToYCbCr420_8u_P3P2R, member(planes(S411), twoPlanes(S420)))
REPACK_P3P3(zeliYCbCr411ToYCbCr420_8u_P3R, member(planes(S411), planes(S420)))
REPACK_P2P3(zeliYCbCr411ToYCrCb420_8u_P2P3R, member(twoPlanes(S411), planes(S420, true)))

// 4:1:1 to 4:1:1
REPACK_P2P3(zeliYCbCr411_8u_P2P3R, member(twoPlanes(S411), planes(S411)))
REPACK_P3P2(zeliYCbCr411_8u_P3P2R, member(planes(S411), twoPlanes(S411)))

// Filtered resampling between 4:1:1 and 4:2:0.
ZEL_PUBLIC Status zeliYCbCr411To420_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                           const int dstStep[3], ImageSize size) {
  if (!src || !srcStep || anyPlaneNull(src) || !dst || !dstStep || anyPlaneNull(dst)) return StatusNullPointerError;
  return filter411To420(planeSide(src, srcStep, false), planeSide(dst, dstStep, false), size);
}

ZEL_PUBLIC Status zeliYCbCr420To411_8u_P3R(const uint8_t* const src[3], const int srcStep[3], uint8_t* const dst[3],
                                           const int dstStep[3], ImageSize size) {
  if (!src || !srcStep || anyPlaneNull(src) || !dst || !dstStep || anyPlaneNull(dst)) return StatusNullPointerError;
  return filter420To411(planeSide(src, srcStep, false), planeSide(dst, dstStep, false), size);
}

// Luma of a 4:2:2 stream as a gray plane, a last odd pixel included.
ZEL_PUBLIC Status zeliYCbCr422ToGray_8u_C2C1R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                              ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  // Luma sits at every second byte, so gapless rows read as one long row.
  if (srcStep == 2 * size.width && dstStep == size.width && int64_t(size.width) * size.height <= kLongestRow) {
    lumaOfPairs(src, PairOrder::YCbCr, dst, size.width * size.height);
    return StatusOk;
  }
  zel::plainWalk(size.height, [&](int y) {
    lumaOfPairs(zel::rowAt(src, srcStep, y), PairOrder::YCbCr, zel::rowAt(dst, dstStep, y), size.width);
  });
  return StatusOk;
}
