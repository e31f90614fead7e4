// KTX files: what is wrong with them, their faces, and the names of what they hold.
#include <algorithm>
#include <cstdio>

#include "texture/Container.h"

namespace {

const struct {
    uint32_t value;
    const char* name;
} kGlNames[] = {
    {0x1401, "GL_UNSIGNED_BYTE"},
    {0x1403, "GL_UNSIGNED_SHORT"},
    {0x1405, "GL_UNSIGNED_INT"},
    {0x1406, "GL_FLOAT"},
    {0x140B, "GL_HALF_FLOAT"},
    {0x1903, "GL_RED"},
    {0x1906, "GL_ALPHA"},
    {0x1907, "GL_RGB"},
    {0x1908, "GL_RGBA"},
    {0x1909, "GL_LUMINANCE"},
    {0x190A, "GL_LUMINANCE_ALPHA"},
    {0x8033, "GL_UNSIGNED_SHORT_4_4_4_4"},
    {0x8034, "GL_UNSIGNED_SHORT_5_5_5_1"},
    {0x8051, "GL_RGB8"},
    {0x8056, "GL_RGBA4"},
    {0x8057, "GL_RGB5_A1"},
    {0x8058, "GL_RGBA8"},
    {0x80E1, "GL_BGRA"},
    {0x8227, "GL_RG"},
    {0x8229, "GL_R8"},
    {0x83F0, "GL_COMPRESSED_RGB_S3TC_DXT1"},
    {0x83F1, "GL_COMPRESSED_RGBA_S3TC_DXT1"},
    {0x83F2, "GL_COMPRESSED_RGBA_S3TC_DXT3"},
    {0x83F3, "GL_COMPRESSED_RGBA_S3TC_DXT5"},
    {0x8363, "GL_UNSIGNED_SHORT_5_6_5"},
    {0x8C00, "GL_COMPRESSED_RGB_PVRTC_4BPPV1"},
    {0x8C01, "GL_COMPRESSED_RGB_PVRTC_2BPPV1"},
    {0x8C02, "GL_COMPRESSED_RGBA_PVRTC_4BPPV1"},
    {0x8C03, "GL_COMPRESSED_RGBA_PVRTC_2BPPV1"},
    {0x8C40, "GL_SRGB"},
    {0x8C41, "GL_SRGB8"},
    {0x8C43, "GL_SRGB8_ALPHA8"},
    {0x8D62, "GL_RGB565"},
    {0x8D64, "GL_ETC1_RGB8_OES"},
    {0x9274, "GL_COMPRESSED_RGB8_ETC2"},
    {0x9278, "GL_COMPRESSED_RGBA8_ETC2_EAC"},
};

// What is wrong with a header whatever reads it.
std::string KtxFault(const QexKtx& ktx) {
    const QexImage& image = ktx.image;
    if (image.faults & kQexFaultFaces) return std::to_string(image.faces) + " faces instead of 1 or 6";
    if (!image.width || !image.height) return "it has no pixels of two dimensions";
    return SizeFault(image, image.faces == 6);
}

// Finds the levels of a file whose header is in order; returns what is wrong with them.
std::string FindLevels(QexKtx* ktx, const TextureBytes& file) {
    if (QexKtx_FindLevels(ktx, BytesOf(file), ktx->image.levelCount)) return "";
    const std::string level = "level " + std::to_string(ktx->faultLevel);
    if (ktx->image.faults & kQexFaultCut) return "cut short in " + level;
    return level + " of " + std::to_string(ktx->image.levels[ktx->faultLevel].bytes) +
           " bytes is not of its size";
}

void SwapPixels(const Texture& texture, TextureBytes* file) {
    for (size_t level = 0; level < texture.levels.size(); ++level)
        for (size_t face = 0; face < texture.faces; ++face) {
            uint8_t* pixels = file->data() + texture.FaceOffset(level, face);
            for (uint64_t i = 0; i + 1 < texture.levels[level].bytes; i += 2)
                std::swap(pixels[i], pixels[i + 1]);
        }
}

}  // namespace

std::string GlName(uint32_t value) {
    char text[64];
    if (!value) return "0";
    for (const auto& known : kGlNames) {
        if (known.value != value) continue;
        snprintf(text, sizeof text, "%s (0x%04X)", known.name, value);
        return text;
    }
    snprintf(text, sizeof text, "0x%04X", value);
    return text;
}

std::string KtxRefusal(QexKtx* ktx, const TextureBytes& file) {
    const QexKtxHeader& header = ktx->header;
    const bool sameBase = header.glBaseInternalFormat == header.glFormat;
    const bool takesPixels =
        ktx->image.format && sameBase && (header.glFormat == kQexGLRGB || header.glFormat == kQexGLRGBA);
    if (!ktx->IsCompressed() && !takesPixels)
        return "it takes RGB and RGBA pixels of bytes or of 16 bits, not " + GlName(header.glFormat) +
               " of " + GlName(header.glType) +
               (sameBase ? "" : " as " + GlName(header.glBaseInternalFormat));
    const std::string fault = KtxFault(*ktx);
    return fault.empty() ? FindLevels(ktx, file) : fault;
}

bool ReadKtx(TextureBytes* file, Texture* texture, std::string* error) {
    QexKtx ktx;
    const QexImage& image = ktx.image;
    const QexKtxHeader& header = ktx.header;
    if (!QexKtx_ReadHeader(&ktx, BytesOf(*file))) {
        *error = "is cut short in the header of a KTX texture";
        return false;
    }
    if (!image.format)
        *error =
            ktx.IsCompressed()
                ? "the compressed format " + GlName(header.glInternalFormat) + " is not read"
                : "pixels of " + GlName(header.glFormat) + " and " + GlName(header.glType) + " are not read";
    else if (header.depth > 1 || header.arrayElements > 0)
        *error = "volumes and arrays are not read";
    else
        *error = KtxFault(ktx);
    if (error->empty()) *error = FindLevels(&ktx, *file);
    if (!error->empty()) return false;
    texture->format = &FormatOf(image.format);
    texture->faces = image.faces;
    texture->levels.assign(image.levels, image.levels + image.levelCount);
    if (ktx.HasSwappedPixels()) SwapPixels(*texture, file);
    return true;
}
