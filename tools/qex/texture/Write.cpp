// Encodes the levels of pictures and hands them to the writers of the two containers.
#include "texture/Write.h"

#include <algorithm>

#include "KtxWriter.h"
#include "PvrWriter.h"

namespace {

// [face][level], as both writers want them.
std::vector<std::vector<std::vector<uint8_t>>> EncodeFaces(const std::vector<Image>& faces,
                                                           const PixelFormat& format, bool mipmaps) {
    std::vector<std::vector<std::vector<uint8_t>>> surfaces;
    for (const Image& face : faces) {
        surfaces.push_back({EncodeLevel(format, face)});
        Image level = face;
        while (mipmaps && (level.width > 1 || level.height > 1)) {
            level = HalveImage(level);
            surfaces.back().push_back(EncodeLevel(format, level));
        }
    }
    return surfaces;
}

}  // namespace

std::vector<uint8_t> EncodePvrFile(const std::vector<Image>& faces, const PixelFormat& format, bool mipmaps,
                                   bool flipped) {
    pod::PvrImage pvr;
    pvr.type = format.pvrType;
    pvr.width = static_cast<uint32_t>(faces[0].width);
    pvr.height = static_cast<uint32_t>(faces[0].height);
    if (flipped) pvr.flags |= pod::kPvrFlipped;
    const bool hasAlpha = std::any_of(faces.begin(), faces.end(), [](const Image& i) { return i.hasAlpha; });
    if (format.alpha && hasAlpha) pvr.flags |= pod::kPvrAlpha;
    pvr.surfaces = EncodeFaces(faces, format, mipmaps);
    return pod::WritePvr(pvr);
}

std::vector<uint8_t> EncodeKtxFile(const std::vector<Image>& faces, const PixelFormat& format, bool mipmaps,
                                   bool flipped) {
    pod::KtxImage ktx;
    ktx.glType = format.pixelType;
    ktx.glFormat = format.pixelOrder;
    ktx.glInternalFormat = format.glInternal;
    ktx.glBaseInternalFormat = format.Compressed() ? kQexGLRGB : format.pixelOrder;
    ktx.pixelBytes = format.Compressed() ? 0 : format.bits / 8;
    ktx.width = static_cast<uint32_t>(faces[0].width);
    ktx.height = static_cast<uint32_t>(faces[0].height);
    // The second axis points down in the picture, or up.
    ktx.keyValues = {{"KTXorientation", flipped ? "S=r,T=u" : "S=r,T=d"}};
    ktx.surfaces = EncodeFaces(faces, format, mipmaps);
    return pod::WriteKtx(ktx);
}
