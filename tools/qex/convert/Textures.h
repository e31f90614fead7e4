// Textures of a converted scene: found, made power-of-two, mip-mapped, encoded and written as PVR files.
#pragma once

#include <map>
#include <set>
#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "convert/Log.h"

struct aiScene;

enum class TextureFormat { kEtc1, kRgba8888, kRgb888 };

// In the order of TextureFormat.
const std::vector<std::string>& TextureFormatNames();

enum class TextureUse {
    kColour,        // with alpha, if any pixel is not opaque
    kOpaqueColour,  // the picture's alpha means something else
    kNormalMap,
};

// The power of two closest to a side, the larger of two that are; at most 4096.
int PowerOfTwoSide(int side);

// A PVR file image of the picture, bottom row first.
std::vector<uint8_t> EncodePvr(const Image& image, TextureFormat format, bool mipmaps = true);

class TextureSet {
  public:
    TextureSet(const aiScene* scene, std::string inputPath, std::string outputDirectory, TextureFormat format,
               ConvertLog* log);

    // Index of the texture made of `path` (and of `opacityPath`, when not empty, for its alpha), written at
    // first use. -1, after one warning, when the picture is missing or cannot be read.
    int Add(const std::string& path, const std::string& opacityPath, TextureUse use);

    // The same for a file that is not one of the scene's.
    int AddFile(const std::string& file, TextureUse use);

    // A picture made here, texel for texel: uncompressed and without mipmaps.
    int AddPlain(const std::string& name, const Image& image);

    // Whether the texture was written with an alpha file.
    bool HasAlpha(int index) const { return hasAlpha_[static_cast<size_t>(index)]; }
    const std::vector<std::string>& Names() const { return names_; }
    int FilesWritten() const { return filesWritten_; }

    // The file that could not be written, and why, which ends the conversion.
    const std::string& WriteError() const { return writeError_; }

  private:
    struct Coding {
        TextureFormat format;
        bool mipmaps;
    };

    bool Load(const std::string& path, Image* image);
    bool LoadEmbedded(const std::string& path, Image* image, std::string* error, bool* found);
    std::string Find(const std::string& path) const;
    std::string UniqueStem(const std::string& path);
    void ApplyOpacity(const std::string& opacityPath, Image* image);
    bool Write(const std::string& name, const Image& image, const Coding& coding);
    int WriteTexture(const std::string& path, const Image& image, bool withAlpha, const Coding& coding);

    const aiScene* scene_;
    std::string inputPath_, inputDirectory_, outputDirectory_;
    TextureFormat format_;
    ConvertLog* log_;
    std::map<std::string, int> known_;
    std::set<std::string> taken_;
    std::vector<std::string> names_;
    std::vector<bool> hasAlpha_;
    std::string writeError_;
    int filesWritten_ = 0;
};
