// Colours, opacity and textures of the importer's materials, by what each file type means by them.
#include "convert/Materials.h"

#include <assimp/GltfMaterial.h>
#include <assimp/material.h>
#include <algorithm>
#include <cmath>

#include "convert/Colours.h"

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

void ConvertTextures(const aiMaterial& source, const std::string& given, TextureSet* textures,
                     MaterialResult* result) {
    pod::Material& out = result->material;
    std::string diffuse = TexturePath(source, aiTextureType_DIFFUSE, &result->uvChannel);
    if (diffuse.empty()) diffuse = TexturePath(source, aiTextureType_BASE_COLOR, &result->uvChannel);
    if (!given.empty()) {
        out.diffuseTexture = textures->AddFile(given, TextureUse::kColour);
    } else if (!diffuse.empty()) {
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

// Colours of the file, encoded where they are linear.
class Colours {
  public:
    Colours(const aiMaterial& source, bool linear) : source_(source), linear_(linear) {}

    bool Get(const char* key, unsigned type, unsigned index, Colour* out) const {
        if (!GetColour(source_, key, type, index, out)) return false;
        for (float& c : *out) c = linear_ ? EncodeSrgb(c) : c;
        return true;
    }

  private:
    const aiMaterial& source_;
    bool linear_;
};

void ConvertColours(const aiMaterial& source, const MaterialSettings& settings, pod::Material* out) {
    const Colours colours(source, settings.linearColours);
    Colour diffuse{1, 1, 1};
    if (!colours.Get(AI_MATKEY_COLOR_DIFFUSE, &diffuse)) colours.Get(AI_MATKEY_BASE_COLOR, &diffuse);
    const bool textured = out->diffuseTexture >= 0;
    // Black times a texture is black: such a colour was never meant to be multiplied.
    if (textured && (settings.textureReplacesColour || IsBlack(diffuse))) diffuse = {1, 1, 1};
    out->diffuse = diffuse;
    if (!colours.Get(AI_MATKEY_COLOR_AMBIENT, &out->ambient)) out->ambient = Scaled(diffuse, kDefaultAmbient);

    const float exponent = GetFloat(source, AI_MATKEY_SHININESS, 0.0f);
    out->shininess = std::clamp(exponent / kEngineShininessScale, 0.0f, 1.0f);
    // An exponent of 0 means no highlight; the engine would draw it all over the surface.
    if (exponent > 0 && colours.Get(AI_MATKEY_COLOR_SPECULAR, &out->specular)) {
        out->specular = Scaled(out->specular, GetFloat(source, AI_MATKEY_SHININESS_STRENGTH, 1.0f));
    }
}

// A texture of one colour: what the surface shows in full light. The others become shares of it.
void GlowInOneColour(const Colour& glow, TextureSet* textures, pod::Material* out) {
    Image image{1, 1, std::vector<uint8_t>(4, 255), false};
    for (size_t i = 0; i < 3; ++i) {
        const float full = std::min(out->diffuse[i] + glow[i], 1.0f);
        image.pixels[i] = static_cast<uint8_t>(std::lround(full * 255));
        out->ambient[i] = full > 0 ? std::min((out->ambient[i] + glow[i]) / full, 1.0f) : 0;
        out->diffuse[i] = full > 0 ? std::min(out->diffuse[i] / full, 1.0f) : 0;
    }
    out->diffuseTexture = textures->AddPlain(out->name.empty() ? "glow" : out->name, image);
}

// No shader module knows of light that a surface gives off; the ambient colour is what shows without light.
void ConvertGlow(const aiMaterial& source, const MaterialSettings& settings, TextureSet* textures,
                 ConvertLog* log, pod::Material* out) {
    Colour glow{0, 0, 0};
    const bool given = Colours(source, settings.linearColours).Get(AI_MATKEY_COLOR_EMISSIVE, &glow);
    if (given && IsBlack(glow) && settings.linearColours) return;  // times any texture
    for (float& c : glow) c = std::isfinite(c) ? std::clamp(c, 0.0f, 1.0f) : 0;
    if (out->emissiveTexture >= 0 && out->emissiveTexture != out->diffuseTexture) {
        if (out->diffuseTexture < 0 && IsBlack(out->diffuse)) {
            out->diffuseTexture = out->emissiveTexture;
            out->ambient = IsBlack(glow) ? Colour{1, 1, 1} : glow;
        } else {
            log->Warn("the emissive texture of material " + out->name +
                      " is not drawn: no shader module has one");
        }
    } else if (!IsBlack(glow)) {
        if (out->diffuseTexture < 0) return GlowInOneColour(glow, textures, out);
        for (size_t i = 0; i < 3; ++i) out->ambient[i] = std::min(out->ambient[i] + glow[i], 1.0f);
    }
}

bool HasTexture(const pod::Material& m) {
    return std::any_of(std::begin(kRoles), std::end(kRoles),
                       [&](const TextureRole& role) { return m.*role.index >= 0; }) ||
           m.diffuseTexture >= 0;
}

void BlendByAlpha(pod::Material* out) {
    out->blendSourceRgb = out->blendSourceAlpha = kGlSrcAlpha;
    out->blendDestRgb = out->blendDestAlpha = kGlOneMinusSrcAlpha;
}

}  // namespace

MaterialResult ConvertMaterial(const aiMaterial& source, const MaterialSettings& settings,
                               TextureSet* textures, ConvertLog* log) {
    MaterialResult result;
    pod::Material& out = result.material;
    aiString name;
    if (source.Get(AI_MATKEY_NAME, name) == aiReturn_SUCCESS) out.name = name.C_Str();
    ConvertTextures(source, OverrideOf(settings.overrides, out.name), textures, &result);
    ConvertColours(source, settings, &out);
    ConvertGlow(source, settings, textures, log, &out);
    result.textured = HasTexture(out);
    result.alphaCounts = settings.linearColours && !AlphaModeIsOpaque(source);

    out.opacity = std::clamp(GetFloat(source, AI_MATKEY_OPACITY, 1.0f), 0.0f, 1.0f);
    if (out.opacity == 0) {
        // Exporters that mix up opacity and transparency are far more common than invisible materials.
        log->Warn("material " + out.name + " is fully transparent; it is made opaque");
        out.opacity = 1;
    }
    const bool textureAlpha = out.diffuseTexture >= 0 && textures->HasAlpha(out.diffuseTexture);
    if (out.opacity < 1 || textureAlpha) BlendByAlpha(&out);
    return result;
}

void UseColourTexture(int texture, const TextureSet& textures, pod::Material* material) {
    material->diffuseTexture = texture;
    material->diffuse = {1, 1, 1};
    material->ambient = Scaled(material->diffuse, kDefaultAmbient);
    if (textures.HasAlpha(texture)) BlendByAlpha(material);
}
