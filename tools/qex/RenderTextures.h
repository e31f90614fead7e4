// Textures of the models that qex render draws: found beside the scene under several names and formats.
#pragma once

#include <string>
#include <vector>

#include "ImageFile.h"
#include "Qex.h"

// Puts the texture hook into a model. For NAME.png it looks for NAME.pvr, NAME.ktx, then NAME.png and other
// picture formats of that name; pictures are decoded here, with their alpha channel as the alpha texture.
void SetTextureHook(QexModel* model);

// A texture of a picture whose first row is its lower edge, with mipmaps. A model that gets it frees it.
QexTexture* NewPictureTexture(const Image& image, const std::string& name);

// After loading: materials without a texture get one of their diffuse colour, KTX textures a filter that
// needs no mipmaps, nodes with an alpha texture leave the opaque pass. Returns a line for each texture that
// is missing or could not be read.
std::vector<std::string> CompleteTextures(QexModel* model, const std::string& directory);

// Loads the materials' bump textures and has them bound for the normal-mapped modules. Returns what is wrong
// with them, one line each.
std::vector<std::string> LoadNormalMaps(QexModel* model, const std::string& directory);
void ReleaseNormalMaps();
