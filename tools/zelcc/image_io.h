// Reading and writing pictures: PNG through libpng, binary PGM and PPM.
#pragma once

#include <string>

#include "picture.h"

namespace zel::tool {

// Reads a PNG (any bit depth and colour type; palettes and depths below 8
// are expanded) or a binary PGM/PPM (P5/P6, maxval 1..65535), told apart by
// their first bytes. Maxvals other than 255 and 65535 are rescaled to 8 or
// 16 bits. Throws ToolError naming the file on any failure.
Picture readImage(const std::string& path);

// Writes a PNG of the picture's channels and depth.
void writePng(const std::string& path, const Picture& picture);

// Writes a binary PGM (one channel) or PPM (three channels), maxval 255 or
// 65535 by depth.
void writePnm(const std::string& path, const Picture& picture);

}  // namespace zel::tool
