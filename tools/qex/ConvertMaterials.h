// Materials of a converted scene.
#pragma once

#include "ConvertTextures.h"
#include "PodWriter.h"

struct aiMaterial;

struct MaterialResult {
    pod::Material material;
    unsigned uvChannel = 0;  // of the diffuse texture
};

// `textureReplacesColour`: in this kind of file a diffuse texture stands in place of the diffuse colour,
// which then holds some default, rather than being multiplied by it.
MaterialResult ConvertMaterial(const aiMaterial& source, bool textureReplacesColour, TextureSet* textures,
                               ConvertLog* log);
