// qex texture: options, inputs of all kinds, outputs of all kinds.
#include "texture/Command.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/ImageFile.h"
#include "common/OutputFile.h"
#include "common/TextureFiles.h"
#include "image/Tga.h"
#include "texture/Container.h"
#include "texture/Formats.h"
#include "texture/Write.h"

namespace {

constexpr int kMaxSide = 8192;

struct Failure {
    int status = 0;
    std::string text;
};

void Say(const std::string& text) {
    fprintf(stderr, "qex texture: %s\n", text.c_str());
}

bool WritesPicture(const TextureOptions& options) {
    return WhyNoPictureName(options.output).empty();
}

bool IsTexture(const std::vector<uint8_t>& file, const std::string& path) {
    const bool newer = file.size() >= 4 && memcmp(file.data(), "PVR\x03", 4) == 0;
    return QexPvr_Is(BytesOf(file)) || QexKtx_Is(BytesOf(file)) || newer || Extension(path) == "pvr" ||
           Extension(path) == "ktx";
}

// The picture reader fills up a TGA image that is cut short with what lies there.
bool IsCutTga(const std::vector<uint8_t>& file, const std::string& path) {
    if (Extension(path) != "tga" || file.size() < kQexTgaHeaderSize) return false;
    const QexTga tga = QexTga_ReadHeader(file.data());
    const uint64_t pixels = uint64_t{tga.width} * tga.height * ((tga.bits + 7) / 8);
    return tga.type >= 1 && tga.type <= 3 &&
           kQexTgaHeaderSize + tga.identifierBytes + tga.mapBytes + pixels > file.size();
}

Failure LoadPicture(const std::vector<uint8_t>& file, const TextureOptions& options, const std::string& path,
                    std::vector<Image>* images) {
    if (options.level >= 0 || options.face >= 0)
        return {2, path + " is a picture; --level and --face are for textures"};
    images->resize(1);
    std::string error;
    if (IsCutTga(file, path)) return {1, path + ": is cut short"};
    if (!LoadImage(file.data(), file.size(), &(*images)[0], &error)) return {1, path + ": " + error};
    return {};
}

// The faces of one level: the one that is asked for, for a PNG the first, else all.
Failure LoadTexture(std::vector<uint8_t> file, const TextureOptions& options, const std::string& path,
                    std::vector<Image>* images) {
    Texture texture;
    std::string error;
    if (!ReadTexture(std::move(file), &texture, &error)) return {1, path + ": " + error};
    const size_t levels = texture.levels.size(), faces = texture.faces;
    const size_t level = static_cast<size_t>(std::max(options.level, 0));
    const size_t first = static_cast<size_t>(std::max(options.face, 0));
    if (level >= levels)
        return {1, path + ": has no level " + std::to_string(level) + ", it has " + std::to_string(levels)};
    if (first >= faces)
        return {1, path + ": has no face " + std::to_string(first) + ", it has " + std::to_string(faces)};
    const bool one = options.face >= 0 || WritesPicture(options) || faces != 6;
    for (size_t face = first; face < (one ? first + 1 : faces); ++face)
        images->push_back(DecodeFace(texture, level, face));
    return {};
}

Failure Load(const TextureOptions& options, const std::string& path, std::vector<Image>* images) {
    std::vector<uint8_t> file;
    std::string error;
    const InputFile input(path);
    const std::string& name = input.Name();
    if (!ReadFileBytes(input.Path(), SIZE_MAX, &file, &error)) return {1, name + ": " + error};
    const Failure failure = IsTexture(file, path) ? LoadTexture(std::move(file), options, name, images)
                                                  : LoadPicture(file, options, name, images);
    if (failure.status) return failure;
    const Image& image = images->back();
    if (std::max(image.width, image.height) > kMaxSide)
        return {1, path + ": has " + std::to_string(image.width) + " x " + std::to_string(image.height) +
                       " pixels; at most 8192 a side are possible"};
    return {};
}

Failure LoadAll(const TextureOptions& options, std::vector<Image>* images) {
    if (options.faces.empty()) return Load(options, options.input, images);
    for (const std::string& path : options.faces) {
        std::vector<Image> face;
        const Failure failure = Load(options, path, &face);
        if (failure.status) return failure;
        if (face.size() != 1) return {1, path + ": is a cube map already"};
        if (face[0].width != face[0].height)
            return {1, path + ": is not square, as a cube map's face has to be"};
        if (!images->empty() && face[0].width != (*images)[0].width)
            return {1, path + ": is not of the size of " + options.faces[0]};
        images->push_back(std::move(face[0]));
    }
    return {};
}

// What is wrong with the options before any file is read; empty when nothing is.
std::string Misuse(const TextureOptions& options) {
    const std::string extension = Extension(options.output), &format = options.format;
    const bool picture = WritesPicture(options), ktx = extension == "ktx";
    if (!picture && !ktx && extension != "pvr")
        return "'" + options.output +
               "' is no output; expected a name that ends in .png, .jpg, .bmp, .tga, .pvr or .ktx";
    if (options.input.empty() == options.faces.empty())
        return "expected one picture or texture, or the six faces of a cube map after --faces";
    if (!options.faces.empty() && options.faces.size() != 6)
        return "a cube map has 6 faces, not " + std::to_string(options.faces.size());
    if (picture && !(format.empty() && !options.mipmaps && options.faces.empty()))
        return "a picture has no --format, --mipmaps or --faces";
    if (!options.faces.empty() && (options.level >= 0 || options.face >= 0))
        return "--level and --face do not go with --faces";
    if (format.rfind("pvrtc", 0) == 0) return "PVRTC is read, not written; expected one of " + FormatNames();
    const PixelFormat* known = FindFormat(format);
    if (!format.empty() && !known) return "'" + format + "' is no format; expected one of " + FormatNames();
    if (ktx && known && !known->Compressed() && known->pixelOrder != kQexGLRGB &&
        known->pixelOrder != kQexGLRGBA)
        return "the engine takes no " + format + " from KTX files; write a .pvr";
    return "";
}

Failure WriteTexture(const TextureOptions& options, const PixelFormat& format,
                     const std::vector<Image>& faces, const std::string& path) {
    const auto encode = Extension(path) == "ktx" ? EncodeKtxFile : EncodePvrFile;
    std::string problem;
    if (WriteOutput(path, encode(faces, format, options.mipmaps, options.flip), &problem)) return {};
    return {2, path + ": " + problem};
}

Failure WriteTextures(const TextureOptions& options, const std::vector<Image>& faces) {
    const bool alpha = std::any_of(faces.begin(), faces.end(), [](const Image& i) { return i.hasAlpha; });
    const PixelFormat& format = *FindFormat(!options.format.empty() ? options.format
                                            : alpha                 ? "rgba8888"
                                                                    : "rgb888");
    const auto width = static_cast<uint32_t>(faces[0].width), height = static_cast<uint32_t>(faces[0].height);
    const Failure failure = WriteTexture(options, format, faces, options.output);
    if (failure.status) return failure;
    const std::string warning = options.output + ": warning: ";
    if (options.mipmaps && !MipmapsFit(width, height, QexImage_ChainLength(width, height)))
        Say(warning + "its sides are no powers of two; a plain GL ES 2.0 has no mipmaps for it");
    if (format.coding != kQexETC1) {
        if (alpha && !format.alpha) Say(warning + "the picture's alpha is lost in " + format.name);
        return {};
    }
    // ETC1 has no alpha; the engine takes it from a second texture.
    const std::string alphaPath = AlphaPath(options.output);
    if (alpha) {
        std::vector<Image> greys;
        for (const Image& face : faces) greys.push_back(AlphaAsGrey(face));
        return WriteTexture(options, format, greys, alphaPath);
    }
    if (IsRegularFile(alphaPath)) Say(warning + alphaPath + " will be taken for its alpha");
    return {};
}

Failure Convert(const TextureOptions& options) {
    std::string misuse = Misuse(options);
    if (!misuse.empty()) return {2, misuse};
    std::vector<std::string> inputs = options.faces;
    inputs.push_back(options.input);
    for (const std::string& output : {options.output, AlphaPath(options.output)}) {
        misuse = WhyNotOutput(output, inputs);
        if (!misuse.empty()) return {2, output + ": " + misuse};
        if (options.format != "etc1") break;
    }
    std::vector<Image> images;
    const Failure failure = LoadAll(options, &images);
    if (failure.status) return failure;
    if (options.flip)
        for (Image& image : images) image = FlipRows(image);
    if (!WritesPicture(options)) return WriteTextures(options, images);
    std::string error;
    const Image& image = images[0];
    if (image.hasAlpha && Extension(options.output)[0] == 'j')
        Say(options.output + ": warning: the alpha is lost in JPEG");
    if (SavePicture(options.output, image.width, image.height, image.pixels.data(), &error)) return {};
    return {2, options.output + ": " + error};
}

}  // namespace

void SetUpTexture(CLI::App* app, TextureOptions* options) {
    app->add_option("IN", options->input,
                    "PNG, JPEG, TGA, ... picture, or PVR or KTX texture; - is standard input");
    app->add_option("-o,--output", options->output,
                    "PNG, JPEG, BMP or TGA picture, or PVR or KTX texture, by its extension")
        ->required();
    app->add_option("--format", options->format, FormatNames() + " (rgba8888 with alpha, rgb888 without)");
    app->add_flag("--mipmaps", options->mipmaps, "write the whole mipmap chain");
    app->add_flag("--flip", options->flip, "turn the rows over; else the first is the picture's top");
    app->add_option("--faces", options->faces, "instead of IN: squares +X -X +Y -Y +Z -Z of a cube map")
        ->expected(1, 100);
    app->add_option("--level", options->level, "mipmap level of the texture IN (0)")
        ->check(NumberFrom(0, 31));
    app->add_option("--face", options->face, "face of the cube map IN (PNG: 0; PVR and KTX: all)")
        ->check(NumberFrom(0, 5));
    app->footer(
        "ETC1 has no alpha: that of the picture goes into a second file, NAME_a. KTX files have no l8, la88\n"
        "and a8. PVRTC is read, not written. In a picture luminance is grey, and alpha 8 is white with\n"
        "alpha. From texture to texture blocks and mipmaps are made anew.");
}

int RunTexture(const TextureOptions& options) {
    const Failure failure = Convert(options);
    if (failure.status) Say(failure.text);
    return failure.status;
}
