// Which way up a converted scene stands, and how large it is.
#pragma once

#include <assimp/quaternion.h>
#include <string>

#include "PodWriter.h"

struct Placement {
    aiQuaternion turn;  // from the source's axes to those with +Y up
    float scale = 1;
    float fit = 0;  // longest edge of the scene instead of a scale; 0 for none
};

// `up` is x, y, z, -x, -y or -z, the source's vertical axis; `scale` a number above 0 or "fit:SIZE". False,
// with what is expected in `error`.
bool ParsePlacement(const std::string& up, const std::string& scale, Placement* placement,
                    std::string* error);

// Turns the nodes that have no parent and scales vertices, nodes, cameras and lights themselves, so that no
// node gets a scale that it had not. False for a scene without any size, which cannot be made to fit: it is
// turned only.
bool PlaceScene(const Placement& placement, pod::Scene* scene);
