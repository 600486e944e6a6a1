#include "packed16/packed_write_rows.h"

#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "packed16/packed_write_forms.h"
#include "packed16/packed_write_lanes.h"

namespace zel::pack {

namespace {

// Calls fn with the word writer of the target: truncating or dithering, in
// the target's field widths.
template <class Fn>
void withWords(PackedTarget t, bool dither, Fn&& fn) {
  switch (t.packing) {
    case Packing::P444:
      if (dither) fn(Dithering<Layout444>{t.redHigh});
      else fn(Truncating<Layout444>{t.redHigh});
      break;
    case Packing::P555:
      if (dither) fn(Dithering<Layout555>{t.redHigh});
      else fn(Truncating<Layout555>{t.redHigh});
      break;
    case Packing::P565:
      if (dither) fn(Dithering<Layout565>{t.redHigh});
      else fn(Truncating<Layout565>{t.redHigh});
      break;
  }
}

template <class Planes>
Planes planesRow(const uint8_t* const planes[3], const int steps[3], int y, int chromaRow) {
  return {rowAt(planes[0], steps[0], y), rowAt(planes[1], steps[1], chromaRow), rowAt(planes[2], steps[2], chromaRow)};
}

// A scalar form as the pixel function of wordPixels.
template <Rgb (*Form)(int, int, int)>
Rgb scalarForm(const Samples3& s) {
  return Form(s.c0, s.c1, s.c2);
}

}  // namespace

void ycbcrPlanesToWords(PlaneChroma chroma, const uint8_t* const planes[3], const int steps[3], WordRows dst,
                        ImageSize size, PackedTarget target, bool dither, bool avx2) {
  withWords(target, dither, [&](const auto& writer) {
    if (chroma == PlaneChroma::HalfBoth) {
      // Row pairs share their chroma terms; a last odd row goes alone.
      rowPairWalk(size.height, [&](int y, int c) {
        ycbcrPairRun(planesRow<HalfPlanes>(planes, steps, y, c), planesRow<HalfPlanes>(planes, steps, y + 1, c),
                     writer, y, dst.row(y), dst.row(y + 1), size.width, avx2);
      });
      if (size.height & 1) {
        const int y = size.height - 1;
        formRun(planesRow<HalfPlanes>(planes, steps, y, y >> 1), YCbCrLanes{}, writer, y, dst.row(y), size.width,
                avx2);
      }
      return;
    }
    plainWalk(size.height, [&](int y) {
      uint16_t* out = dst.row(y);
      switch (chroma) {
        case PlaneChroma::Full:
          formRun(planesRow<FullPlanes>(planes, steps, y, y), YCbCrLanes{}, writer, y, out, size.width, avx2);
          break;
        case PlaneChroma::Half:
          formRun(planesRow<HalfPlanes>(planes, steps, y, y), YCbCrLanes{}, writer, y, out, size.width, avx2);
          break;
        case PlaneChroma::HalfBoth:  // walked in pairs above
          break;
      }
    });
  });
}

void ycbcr411ToWords(const uint8_t* const planes[3], const int steps[3], WordRows dst, ImageSize size,
                     PackedTarget target, bool avx2) {
  const int body = size.width & ~3;
  withWords(target, false, [&](const auto& writer) {
    plainWalk(size.height, [&](int y) {
      const QuarterPlanes src = planesRow<QuarterPlanes>(planes, steps, y, y);
      uint16_t* out = dst.row(y);
      formRun(src, YCbCrLanes{}, writer, y, out, body, avx2);
      wordPixels(src, scalarForm<ycbcrRoundedForm>, writer, y, out, body, size.width);
    });
  });
}

void ycbcrPixelsToWords(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, PackedTarget target,
                        bool dither, bool avx2) {
  const int body = dither ? size.width : size.width & ~7;
  withWords(target, dither, [&](const auto& writer) {
    plainWalk(size.height, [&](int y) {
      const Triples row{rowAt(src, srcStep, y)};
      uint16_t* out = dst.row(y);
      formRun(row, YCbCrLanes{}, writer, y, out, body, avx2);
      wordPixels(row, scalarForm<ycbcrTruncatedForm>, writer, y, out, body, size.width);
    });
  });
}

namespace {

// Width 1 of the plain interleaved 4:2:2 writers: no packing, three bytes at
// the start of each row, rows `words` bytes apart.
void oneColumnBytes(const uint8_t* src, int srcStep, WordRows dst, int height) {
  auto* base = reinterpret_cast<uint8_t*>(dst.base);
  plainWalk(height, [&](int y) {
    const uint8_t* in = rowAt(src, srcStep, y);
    uint8_t* out = base + std::ptrdiff_t(y) * dst.words;
    const Rgb c = ycbcrOneColumnForm(in[0], in[1]);
    out[0] = static_cast<uint8_t>(c.r);
    out[1] = static_cast<uint8_t>(c.g);
    out[2] = static_cast<uint8_t>(c.b);
  });
}

}  // namespace

void ycbcrPairsToWords(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, PackedTarget target,
                       bool dither, bool avx2) {
  const int width = size.width, even = width & ~1;
  if (!dither && width == 1) {
    oneColumnBytes(src, srcStep, dst, size.height);
    return;
  }
  withWords(target, dither, [&](const auto& writer) {
    plainWalk(size.height, [&](int y) {
      const Pairs row{rowAt(src, srcStep, y)};
      uint16_t* out = dst.row(y);
      if (dither) {
        formRun(row, YCbCrLanes{}, writer, y, out, even, avx2);
      } else {
        formRun(row, YCbCrLanes{}, writer, y, out, width & ~7, avx2);
        wordPixels(row, scalarForm<ycbcrOffsetForm>, writer, y, out, width & ~7, even);
      }
      if (width & 1) {
        // The lone last pixel: its Y and the byte after it; the plain
        // writers take Cr from the pair before.
        const int x = width - 1;
        const uint8_t* p = row.p + 2 * x;
        const Rgb c = dither ? ycbcrLaneForm(p[0], p[1], p[1]) : ycbcrTruncatedForm(p[0], p[1], p[-1]);
        out[x] = writer.word(c, x, y);
      }
    });
  });
}

void yuv420ToWords(const uint8_t* const planes[3], const int steps[3], WordRows dst, ImageSize size,
                   PackedTarget target, bool dither, bool avx2) {
  const int width = size.width, height = size.height;
  if (!dither && (width == 1 || height == 1)) return;
  // The lane form covers columns below `laneColumns` of rows below
  // `laneRows`; the rest takes the 16.16 form.
  const int laneColumns = dither ? width : width & ~1, laneRows = dither ? height : height & ~1;
  withWords(target, dither, [&](const auto& writer) {
    plainWalk(height, [&](int y) {
      const HalfPlanes row = planesRow<HalfPlanes>(planes, steps, y, y >> 1);
      uint16_t* out = dst.row(y);
      const int lanes = y < laneRows ? laneColumns : 0;
      formRun(row, YuvLanes{}, writer, y, out, lanes, avx2);
      wordPixels(row, scalarForm<yuvWideForm>, writer, y, out, lanes, width);
    });
  });
}

void bytesTo565Words(const uint8_t* src, int srcStep, WordRows dst, ImageSize size, bool avx2) {
  const Truncating<Layout565> writer{false};
  plainWalk(size.height, [&](int y) {
    formRun(Triples{rowAt(src, srcStep, y)}, SameBytes{}, writer, y, dst.row(y), size.width, avx2);
  });
}

}  // namespace zel::pack
