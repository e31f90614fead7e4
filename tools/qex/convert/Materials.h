// Materials of a converted scene.
#pragma once

#include "convert/Textures.h"
#include "PodWriter.h"
#include "texture/Overrides.h"

struct aiMaterial;

// What the kind of file says about its materials, and the command line.
struct MaterialSettings {
    // A diffuse texture stands in place of the diffuse colour, which then holds some default, rather than
    // being multiplied by it.
    bool textureReplacesColour = false;
    bool linearColours = false;  // colours are in linear light; the engine's are encoded as textures are
    TextureOverrides overrides;  // pictures
};

struct MaterialResult {
    pod::Material material;
    unsigned uvChannel = 0;   // of the diffuse texture
    bool textured = false;    // has a texture in any role
    bool alphaCounts = true;  // of textures and vertices
};

MaterialResult ConvertMaterial(const aiMaterial& source, const MaterialSettings& settings,
                               TextureSet* textures, ConvertLog* log);

// Makes a material without textures one of vertices with colours: `texture` holds these.
void UseColourTexture(int texture, const TextureSet& textures, pod::Material* material);
