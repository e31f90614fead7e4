// A village among hills, that samples show from several sides and at several times of the day.
#pragma once

#include "PodBuild.h"

namespace scenes {

// Its square is at the origin, 10 across; houses look at it, a mill stands on a hill behind. The ground is
// about 90 across, the sky a dome around it. Mesh nodes by name: "sky", "grass", "square", houses and their
// roofs, trees, "well", "lantern ...", "mill", "mill roof", "sails", which turn about their own Z axis.
pod::Scene Village();

// A round table with pottery and fruit. Mesh nodes: "left vase", "middle vase", whose glaze shines, "right
// vase", "table" and what else lies on it. The table's top is at y = 0, 6 across.
pod::Scene StillLife();

// Vases that go away from the viewer, to the right, on a long table.
pod::Scene RowOfVases();

// The height of the ground.
float VillageGround(float x, float z);

}  // namespace scenes
