#include "ConvertMaterials.h"

#include <assimp/GltfMaterial.h>
#include <assimp/material.h>
#include <algorithm>

namespace {

constexpr float kEngineShininessScale = 256.0f;
// Part of the diffuse colour that a material without an ambient colour reflects, so that its side away
// from the lights, or all of it in a scene without lights, does not turn black.
constexpr float kDefaultAmbient = 0.2f;

constexpr uint32_t kGlSrcAlpha = 0x0302;
constexpr uint32_t kGlOneMinusSrcAlpha = 0x0303;

using Colour = std::array<float, 3>;

bool GetColour(const aiMaterial& m, const char* key, unsigned type, unsigned index, Colour* out) {
    aiColor3D c;
    if (m.Get(key, type, index, c) != aiReturn_SUCCESS) return false;
    *out = {c.r, c.g, c.b};
    return true;
}

float GetFloat(const aiMaterial& m, const char* key, unsigned type, unsigned index, float otherwise) {
    float value;
    return m.Get(key, type, index, value) == aiReturn_SUCCESS ? value : otherwise;
}

Colour Scaled(const Colour& c, float factor) {
    return {c[0] * factor, c[1] * factor, c[2] * factor};
}

bool IsBlack(const Colour& c) {
    return c[0] <= 0 && c[1] <= 0 && c[2] <= 0;
}

std::string TexturePath(const aiMaterial& m, aiTextureType type, unsigned* uvChannel = nullptr) {
    aiString path;
    unsigned channel = 0;
    if (m.GetTexture(type, 0, &path, nullptr, &channel) != aiReturn_SUCCESS) return {};
    if (uvChannel) *uvChannel = channel;
    return path.C_Str();
}

// Textures besides the diffuse one. What stands in the place of a height map is nearly always a normal map;
// a grey picture, which cannot be one, is left out by the texture set.
struct TextureRole {
    aiTextureType type;
    int32_t pod::Material::*index;
    TextureUse use;
};

constexpr TextureRole kRoles[] = {
    {aiTextureType_NORMALS, &pod::Material::bumpTexture, TextureUse::kNormalMap},
    {aiTextureType_HEIGHT, &pod::Material::bumpTexture, TextureUse::kNormalMap},
    {aiTextureType_AMBIENT, &pod::Material::ambientTexture, TextureUse::kOpaqueColour},
    {aiTextureType_SPECULAR, &pod::Material::specularColourTexture, TextureUse::kOpaqueColour},
    {aiTextureType_EMISSIVE, &pod::Material::emissiveTexture, TextureUse::kOpaqueColour},
    {aiTextureType_SHININESS, &pod::Material::glossinessTexture, TextureUse::kOpaqueColour},
    {aiTextureType_REFLECTION, &pod::Material::reflectionTexture, TextureUse::kOpaqueColour},
};

bool AlphaModeIsOpaque(const aiMaterial& m) {
    aiString mode;
    return m.Get(AI_MATKEY_GLTF_ALPHAMODE, mode) == aiReturn_SUCCESS && std::string(mode.C_Str()) == "OPAQUE";
}

void ConvertTextures(const aiMaterial& source, TextureSet* textures, MaterialResult* result) {
    pod::Material& out = result->material;
    std::string diffuse = TexturePath(source, aiTextureType_DIFFUSE, &result->uvChannel);
    if (diffuse.empty()) diffuse = TexturePath(source, aiTextureType_BASE_COLOR, &result->uvChannel);
    if (!diffuse.empty()) {
        const TextureUse use = AlphaModeIsOpaque(source) ? TextureUse::kOpaqueColour : TextureUse::kColour;
        std::string opacity = TexturePath(source, aiTextureType_OPACITY);
        // The same picture in both places means: the alpha channel that it already has.
        if (opacity == diffuse || use == TextureUse::kOpaqueColour) opacity.clear();
        out.diffuseTexture = textures->Add(diffuse, opacity, use);
    }
    for (const TextureRole& role : kRoles) {
        const std::string path = TexturePath(source, role.type);
        if (path.empty() || out.*role.index >= 0) continue;
        const bool sameAsDiffuse = path == diffuse && role.use != TextureUse::kNormalMap;
        out.*role.index = sameAsDiffuse ? out.diffuseTexture : textures->Add(path, "", role.use);
    }
}

void ConvertColours(const aiMaterial& source, bool textureReplacesColour, pod::Material* out) {
    Colour diffuse{1, 1, 1};
    if (!GetColour(source, AI_MATKEY_COLOR_DIFFUSE, &diffuse)) {
        GetColour(source, AI_MATKEY_BASE_COLOR, &diffuse);
    }
    const bool textured = out->diffuseTexture >= 0;
    // Black times a texture is black: such a colour was never meant to be multiplied.
    if (textured && (textureReplacesColour || IsBlack(diffuse))) diffuse = {1, 1, 1};
    out->diffuse = diffuse;
    if (!GetColour(source, AI_MATKEY_COLOR_AMBIENT, &out->ambient)) {
        out->ambient = Scaled(diffuse, kDefaultAmbient);
    }

    const float exponent = GetFloat(source, AI_MATKEY_SHININESS, 0.0f);
    out->shininess = std::clamp(exponent / kEngineShininessScale, 0.0f, 1.0f);
    // An exponent of 0 means no highlight; the engine would draw it all over the surface.
    if (exponent > 0 && GetColour(source, AI_MATKEY_COLOR_SPECULAR, &out->specular)) {
        out->specular = Scaled(out->specular, GetFloat(source, AI_MATKEY_SHININESS_STRENGTH, 1.0f));
    }
}

}  // namespace

MaterialResult ConvertMaterial(const aiMaterial& source, bool textureReplacesColour, TextureSet* textures,
                               ConvertLog* log) {
    MaterialResult result;
    pod::Material& out = result.material;
    aiString name;
    if (source.Get(AI_MATKEY_NAME, name) == aiReturn_SUCCESS) out.name = name.C_Str();
    ConvertTextures(source, textures, &result);
    ConvertColours(source, textureReplacesColour, &out);

    out.opacity = std::clamp(GetFloat(source, AI_MATKEY_OPACITY, 1.0f), 0.0f, 1.0f);
    if (out.opacity == 0) {
        // Exporters that mix up opacity and transparency are far more common than invisible materials.
        log->Warn("material " + out.name + " is fully transparent; it is made opaque");
        out.opacity = 1;
    }
    const bool textureAlpha = out.diffuseTexture >= 0 && textures->HasAlpha(out.diffuseTexture);
    if (out.opacity < 1 || textureAlpha) {
        out.blendSourceRgb = out.blendSourceAlpha = kGlSrcAlpha;
        out.blendDestRgb = out.blendDestAlpha = kGlOneMinusSrcAlpha;
    }
    return result;
}
