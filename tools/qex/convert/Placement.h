// Which way up a converted scene stands, and how large it is.
#pragma once

#include "common/CommandLine.h"
#include "PodWriter.h"

struct Placement {
    UpAxis up = UpAxis::kY;  // the source's vertical axis
    float scale = 1;
    float fit = 0;  // longest edge of the scene instead of a scale; 0 for none
};

// Adds --up and --scale.
void SetUpPlacement(CLI::App* app, Placement* placement);

// Turns the nodes that have no parent and scales vertices, nodes, cameras and lights themselves, so that no
// node gets a scale that it had not. False for a scene without any size, which cannot be made to fit: it is
// turned only.
bool PlaceScene(const Placement& placement, pod::Scene* scene);
