// The built-in test picture: colour bars, ramps, a hue sweep, fine lines,
// a zone plate and gray steps, laid out in proportion to any size.
#pragma once

#include "picture.h"

namespace zel::tool {

// A 16-bit RGB card of the given size (any size from 1x1).
Picture makeTestCard(int width, int height);

// Which colour a Bayer grid kind (0 BGGR, 1 RGGB, 2 GBRG, 3 GRBG) puts at
// frame place (x, y): 0 red, 1 green, 2 blue.
int bayerColour(int grid, int x, int y);

// The one-channel mosaic a sensor with that grid would see of a colour
// picture; a gray picture is taken as a mosaic already and copied.
Picture bayerMosaic(const Picture& picture, int grid);

}  // namespace zel::tool
