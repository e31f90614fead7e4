// Textures of the models that are shown: found beside the scene under several names and formats.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "Qex.h"
#include "texture/Overrides.h"

// What is said about textures besides what the scene says.
struct TextureChoices {
    TextureOverrides overrides;
    std::optional<bool> flipped;  // V runs down the pictures; as the scene's export options say

    bool operator==(const TextureChoices& o) const {
        return overrides == o.overrides && flipped == o.flipped;
    }
};

// Puts the texture hook into a model that will be loaded from `scenePath`, its textures from `directory`;
// what the functions below need to know of it is kept until ForgetTextures. For NAME.png it looks for
// NAME.pvr, NAME.ktx, then NAME.png and other picture formats of that name (see FindTexture); pictures are
// decoded here, with their alpha channel as the alpha texture.
void SetTextureHook(QexModel* model, const std::string& directory, const std::string& scenePath,
                    const TextureChoices& choices);

// After loading: a line about the first material with a texture of its choice that the scene lacks; else
// empty.
std::string CheckTextureChoices(const QexModel* model);

// A texture of a picture whose first row is its lower edge, with mipmaps. A model that gets it frees it.
QexTexture* NewPictureTexture(const Image& image, const std::string& name);

// After loading: the textures that are chosen, for materials without a texture one of their diffuse colour,
// white for those that are `lit`, as light brings the colour,
// for KTX textures a filter that needs no mipmaps; nodes with an alpha texture leave the opaque pass. Returns
// a line for each texture that is missing or could not be read.
std::vector<std::string> CompleteTextures(QexModel* model, const std::vector<bool>& lit);

// Loads the materials' bump textures and has them bound for the normal-mapped modules. Returns what is wrong
// with them, one line each.
std::vector<std::string> LoadNormalMaps(QexModel* model);

// How a texture holds its pixels, for people.
const char* FormatName(const QexTexture& texture);

// Whether a material has a texture, not only one of its colour.
bool HasTexture(const QexModel* model, uint32_t material);

// After loading: the textures of one colour again, white where materials are `lit` now.
void RecolourTextures(QexModel* model, const std::vector<bool>& lit);

// The files that the model's textures came from.
std::vector<std::string> TextureFilesOf(const QexModel* model);

// Before a model is unloaded: releases its normal maps.
void ForgetTextures(QexModel* model);
