// An imported scene as a POD scene: nodes in the file's order, cameras, lights, frames.
#pragma once

#include "ConvertNodes.h"
#include "ConvertTextures.h"
#include "PodWriter.h"

struct aiScene;

struct SceneSettings {
    double fps = 30;
    bool textureReplacesColour = false;  // see ConvertMaterial
    CameraQuirks cameras;
};

// False, with the reason in `error`, when the scene holds no triangle.
bool ConvertScene(const aiScene& source, const SceneSettings& settings, TextureSet* textures, ConvertLog* log,
                  pod::Scene* out, std::string* error);
