// An imported scene as a POD scene: nodes in the file's order, cameras, lights, frames.
#pragma once

#include <optional>

#include "convert/Materials.h"
#include "convert/Nodes.h"
#include "convert/Textures.h"
#include "PodWriter.h"

struct aiScene;

struct SceneSettings {
    double fps = 30;
    int maxBones = 16;        // in a batch
    std::optional<int> clip;  // index of the animation; the first unless given
    MaterialSettings materials;
    CameraQuirks cameras;
};

// With the reason in `error`: kBadInput when the scene holds no triangle, kBadArgument when settings.maxBones
// is too low for it.
ExitStatus ConvertScene(const aiScene& source, const SceneSettings& settings, TextureSet* textures,
                        ConvertLog* log, pod::Scene* out, std::string* error);
