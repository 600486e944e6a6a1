// Between pictures and an export's buffers, driven by its descriptor alone:
// sources filled from a picture whatever their layout, format and sample
// type, destinations turned into pictures a viewer can show.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "frame/descriptor.h"
#include "picture.h"

namespace zel::tool {

// Names of a format's three components in the order the tool feeds them
// (luma first for the luma-chroma formats), for naming planes: "RGB" gives
// R G B, "BGR" B G R, "YCrCb420" Y Cr Cb. A format that names no components
// (an operator, "420") borrows `other`'s names, and failing that R G B.
std::vector<std::string> componentNames(const std::string& format, const std::string& other);

// Whether a three-channel format keeps blue first in memory.
bool blueFirst(const std::string& format);

// The three channels a source format takes from a colour, on the 16-bit
// scale, in the format's order (luma first for luma-chroma formats): RGB
// as it is, BGR blue first, YCbCr (any order, any subsampling) as
// video-range BT.601, YUV as analog-style BT.601 centred on half scale.
// Other formats (YCC, HLS, Lab ...) take red, green and blue as their
// three channels; YCoCg planes take the transform's integers (ycocgPlanes).
std::array<uint16_t, 3> sourceChannels(const std::string& format, uint16_t r, uint16_t g, uint16_t b);

// The planes of YCoCg for a colour given on the 16-bit scale: the lifting
// transform or the plain one, on the 8-bit colour scale (colour side of
// bytes) or the signed 16-bit scale, byte planes with chroma offset by 128.
struct YCoCgForm {
  bool lifting = false;
  bool byteColour = true;
  bool bytePlanes = false;
};
std::array<int32_t, 3> ycocgPlanes(const YCoCgForm& form, uint16_t r, uint16_t g, uint16_t b);

// Whether the export reads a Bayer mosaic, and which grid kind its family
// values select.
bool readsMosaic(const meta::Descriptor& d);
int mosaicGrid(const meta::Descriptor& d, const std::vector<double>& familyValues);

// Fills every source buffer (the in-place image included) of `ws` from the
// picture, which has the workspace's size. Colour goes in as
// sourceChannels gives it; one-channel sources take
// luma, or the Bayer mosaic of grid `grid` (>= 0); chroma planes and 4:2:2
// streams take block means; packed words are packed from 8-bit RGB. Samples
// go in by type: 8u as is, 8s and 16s biased, 16u scaled by 257, 32s like
// 16s widened, floats in 0..1.
void fillSources(meta::Workspace& ws, const Picture& picture, int grid);

struct OutputImage {
  std::string suffix;  // "" for the one interleaved image, "_Y", "_Cb" ... for planes
  Picture picture;
};

struct Outputs {
  std::vector<OutputImage> images;
  std::string note;  // how float samples were scaled, if they needed a stretch
};

// The destination buffers (or the in-place image) as pictures: 8-bit and
// 16-bit samples as they are (signed ones biased to unsigned), 32s biased
// and clamped to 16 bits, signed samples spanning less than 4096 stretched
// over 8 bits, floats from 0..1 to 8 bits (or their own range, when they
// leave 0..1), packed words unpacked to 8-bit RGB, BGR turned to
// RGB, one-bit pixels to 0 and 255, 4:2:2 streams and two-plane chroma split
// into planes.
Outputs destinationImages(meta::Workspace& ws, const std::vector<double>& familyValues);

}  // namespace zel::tool
