// Pictures are looked up beside the scene or within it, made fit for the GL, and written once.
#include "convert/Textures.h"

#include <assimp/scene.h>
#include <algorithm>
#include <cstring>
#include <filesystem>

#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "PodWriter.h"
#include "texture/Write.h"

namespace fs = std::filesystem;

namespace {

constexpr int kMaxSide = 4096;
constexpr size_t kMaxStem = 64;
constexpr char kFileUrl[] = "file://";

// Scenes name their pictures with either slash, and now and then as URLs.
std::string CleanPath(std::string path) {
    path = SlashedPath(path);
    if (path.rfind(kFileUrl, 0) == 0) path.erase(0, strlen(kFileUrl));
    return path;
}

void MakeOpaque(Image* image) {
    for (size_t i = 3; i < image->pixels.size(); i += 4) image->pixels[i] = 255;
    image->hasAlpha = false;
}

bool IsGrey(const Image& image) {
    for (size_t i = 0; i < image.pixels.size(); i += 4) {
        const uint8_t* p = &image.pixels[i];
        if (p[0] != p[1] || p[1] != p[2]) return false;
    }
    return true;
}

// The engine's normal-mapped shaders read the map in the order green, red, blue.
void SwapRedGreen(Image* image) {
    for (size_t i = 0; i < image->pixels.size(); i += 4) std::swap(image->pixels[i], image->pixels[i + 1]);
}

}  // namespace

const std::vector<std::string>& TextureFormatNames() {
    static const std::vector<std::string> names = {"etc1", "rgba8888", "rgb888"};
    return names;
}

int PowerOfTwoSide(int side) {
    int lower = 1;
    while (lower * 2 <= side && lower < kMaxSide) lower *= 2;
    const bool upperIsCloser = lower < kMaxSide && lower * 2 - side <= side - lower;
    return upperIsCloser ? lower * 2 : lower;
}

std::vector<uint8_t> EncodePvr(const Image& image, TextureFormat format, bool mipmaps) {
    Image level = FlipRows(image);
    const int width = PowerOfTwoSide(image.width), height = PowerOfTwoSide(image.height);
    if (width != image.width || height != image.height) {
        level = ResizeImage(level, width, height);
        level.hasAlpha = image.hasAlpha;
    }
    return EncodePvrFile({level}, *FindFormat(TextureFormatNames()[static_cast<size_t>(format)]), mipmaps,
                         true);
}

TextureSet::TextureSet(const aiScene* scene, std::string inputPath, std::string outputDirectory,
                       TextureFormat format, ConvertLog* log)
    : scene_(scene),
      inputPath_(std::move(inputPath)),
      inputDirectory_(fs::path(inputPath_).parent_path().string()),
      outputDirectory_(std::move(outputDirectory)),
      format_(format),
      log_(log) {
    if (inputDirectory_.empty()) inputDirectory_ = ".";
}

int TextureSet::Add(const std::string& path, const std::string& opacityPath, TextureUse use) {
    const std::string key = path + '\n' + opacityPath + '\n' + std::to_string(static_cast<int>(use));
    const auto [entry, isNew] = known_.emplace(key, -1);
    if (!isNew) return entry->second;

    Image image;
    if (!Load(path, &image)) return -1;
    if (!opacityPath.empty()) ApplyOpacity(opacityPath, &image);
    if (use != TextureUse::kColour) MakeOpaque(&image);
    if (use == TextureUse::kNormalMap) {
        if (IsGrey(image)) {
            log_->Warn("texture " + path + " is a grey height map, not a normal map; it is left out");
            return -1;
        }
        SwapRedGreen(&image);
    }
    entry->second = WriteTexture(path, image, use == TextureUse::kColour && image.hasAlpha, {format_, true});
    return entry->second;
}

int TextureSet::AddFile(const std::string& file, TextureUse use) {
    return Add(kFileUrl + fs::absolute(file).string(), "", use);
}

int TextureSet::AddPlain(const std::string& name, const Image& image) {
    return WriteTexture(name, image, image.hasAlpha, {TextureFormat::kRgb888, false});
}

int TextureSet::WriteTexture(const std::string& path, const Image& image, bool withAlpha,
                             const Coding& coding) {
    const std::string stem = UniqueStem(path);
    if (!Write(stem + ".pvr", image, coding)) return -1;
    std::error_code ec;
    const std::string alphaName = stem + "_a.pvr";
    if (withAlpha) {
        if (!Write(alphaName, AlphaAsGrey(image), coding)) return -1;
    } else if (fs::exists(fs::path(outputDirectory_) / alphaName, ec)) {
        log_->Warn(alphaName + " lies in the output folder and will be taken for the alpha of " + stem +
                   ".pvr; remove it unless that is meant");
    }
    names_.push_back(stem + ".pvr");
    hasAlpha_.push_back(withAlpha);
    return static_cast<int>(names_.size()) - 1;
}

bool TextureSet::Write(const std::string& name, const Image& image, const Coding& coding) {
    const std::string path = (fs::path(outputDirectory_) / name).string();
    std::string problem;
    if (WriteOutput(path, EncodePvr(image, coding.format, coding.mipmaps), &problem)) {
        ++filesWritten_;
        return true;
    }
    writeError_ = path + ": " + problem;
    return false;
}

bool TextureSet::Load(const std::string& path, Image* image) {
    std::string error;
    bool embedded = false;
    if (LoadEmbedded(path, image, &error, &embedded)) return true;
    if (!embedded) {
        const std::string file = Find(path);
        if (file.empty()) {
            log_->Warn("texture " + path + " not found in " + inputDirectory_ +
                       " or its folders textures, texture, images, maps");
            return false;
        }
        if (LoadImage(file, image, &error)) return true;
    }
    log_->Warn("texture " + path + " " + error);
    return false;
}

bool TextureSet::LoadEmbedded(const std::string& path, Image* image, std::string* error, bool* found) {
    // Looked up by the last part of the name alone, which a file of one's choice may have, too.
    const aiTexture* texture =
        path.rfind(kFileUrl, 0) == 0 ? nullptr : scene_->GetEmbeddedTexture(path.c_str());
    *found = texture != nullptr;
    if (!texture) return false;
    // Height 0 marks a whole picture file of mWidth bytes.
    if (texture->mHeight == 0) {
        const auto* bytes = reinterpret_cast<const uint8_t*>(texture->pcData);
        return LoadImage(bytes, texture->mWidth, image, error);
    }
    image->width = static_cast<int>(texture->mWidth);
    image->height = static_cast<int>(texture->mHeight);
    const size_t count = static_cast<size_t>(texture->mWidth) * texture->mHeight;
    image->pixels.reserve(count * 4);
    for (size_t i = 0; i < count; ++i) {
        const aiTexel& t = texture->pcData[i];
        image->pixels.insert(image->pixels.end(), {t.r, t.g, t.b, t.a});
    }
    UpdateHasAlpha(image);
    return true;
}

std::string TextureSet::Find(const std::string& path) const {
    const fs::path clean = CleanPath(path);
    std::error_code ec;
    if (clean.is_absolute() && fs::is_regular_file(clean, ec)) return clean.string();
    if (clean.is_relative()) {
        const std::string found = FindFile(inputDirectory_, clean.string());
        if (!found.empty()) return found;
    }
    for (const char* folder : {"", "textures", "texture", "images", "maps"}) {
        const std::string found = FindFile(inputDirectory_, (fs::path(folder) / clean.filename()).string());
        if (!found.empty()) return found;
    }
    return {};
}

// The engine looks for NAME_a.pvr beside every NAME.pvr, so both have to be free. Case is ignored: the
// files may end up on a system that does the same.
std::string TextureSet::UniqueStem(const std::string& path) {
    const std::string base = path.empty() || path[0] == '*' ? fs::path(inputPath_).stem().string()
                                                            : fs::path(CleanPath(path)).stem().string();
    std::string stem;
    for (const char c : base.substr(0, kMaxStem)) {
        const bool safe = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
                          c == '-' || c == '_';
        stem += safe ? c : '_';
    }
    if (stem.empty()) stem = "texture";
    std::string name = stem;
    for (int n = 2; taken_.count(Lower(name)) || taken_.count(Lower(name) + "_a"); ++n) {
        name = stem + "_" + std::to_string(n);
    }
    taken_.insert(Lower(name));
    taken_.insert(Lower(name) + "_a");
    return name;
}

void TextureSet::ApplyOpacity(const std::string& opacityPath, Image* image) {
    Image opacity;
    if (!Load(opacityPath, &opacity)) return;
    if (opacity.width != image->width || opacity.height != image->height) {
        opacity = ResizeImage(opacity, image->width, image->height);
    }
    // A mask holds its values in its own alpha channel or, without one, in its grey.
    const size_t channel = opacity.hasAlpha ? 3 : 0;
    for (size_t i = 0; i < image->pixels.size(); i += 4) image->pixels[i + 3] = opacity.pixels[i + channel];
    UpdateHasAlpha(image);
}
