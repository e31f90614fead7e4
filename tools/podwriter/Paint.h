// Textures made by arithmetic: skies from a colour for each direction, spots for particles, waves for water.
#pragma once

#include <array>
#include <functional>

#include "PodBuild.h"
#include "PvrWriter.h"

namespace pod {

// The cube map of a sky box that shows `paint` (red, green, blue, alpha) in the directions that it is given,
// in which one of x, y and z is 1 or -1 and the others are between.
using SkyPaint = std::function<std::array<uint8_t, 4>(const Vec3& direction)>;
PvrImage SkyCube(uint32_t size, const SkyPaint& paint);

// A round spot of a colour (red, green, blue, 0 to 255), dense in the middle, as smoke, sparks and drops are
// made of: size x size pixels, RGBA.
std::vector<uint8_t> Spot(uint32_t size, const std::array<uint8_t, 3>& colour);

// Normals of waves, size x size pixels (RGBA) to be repeated: across in red and blue, up in green.
std::vector<uint8_t> Waves(uint32_t size);

}  // namespace pod
