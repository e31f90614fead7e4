// Plain words for what keeps a picture from being what was asked for.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Qex.h"

// Why a file cannot be what is wanted, judged by its first bytes: missing, a directory, empty, a format that
// no qex verb reads. Empty when it may be it.
std::string WhyNotPod(const std::string& path, const std::string& wanted = "a POD scene");

// Whether RGBA pixels all have a colour, 0xRRGGBB, or one as good as it.
bool ShowsOnly(uint32_t background, const std::vector<uint8_t>& pixels);

// Why nothing of a scene shows, whose vertices are at `points`, and what may help.
std::string WhyNothingShows(const QexModel& model, const QexCamera& camera,
                            const std::vector<QexVec3>& points);
