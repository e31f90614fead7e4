// Plain words for what keeps a picture from being what was asked for.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Qex.h"

namespace qex {
class HeadlessContext;
}

// Why a file cannot be what is wanted, judged by its first bytes: missing, a directory, empty, a format that
// no qex verb reads. Empty when it may be it.
std::string WhyNotPod(const std::string& path, const std::string& wanted = "a POD scene");

// When the bound framebuffer shows nothing but the background (0xRRGGBB): why. Empty when something shows.
std::string WhyNothingShows(const QexModel& model, const QexCamera& camera,
                            const qex::HeadlessContext& context, uint32_t background,
                            const std::vector<QexVec3>& points);
