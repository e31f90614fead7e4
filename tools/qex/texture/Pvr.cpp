// PVR files: what is wrong with them, and their faces.
#include <algorithm>

#include "texture/Container.h"

namespace {

constexpr char kTwiddled[] = "its pixels are twiddled";

// What is wrong with a file whatever reads it. Finds its levels when its header is in order.
std::string PvrFault(QexPvr* pvr, const TextureBytes& file) {
    const QexPVRHeader& header = pvr->header;
    const QexImage& image = pvr->image;
    if (!image.format) return "its pixel type " + std::to_string(header.flags & 0xFF) + " is not known";
    if (image.faults & kQexFaultTwiddled && image.format->coding != kQexPVRTC) return kTwiddled;
    if (image.faults & kQexFaultBits)
        return std::to_string(header.bitsPerPixel) + " bits per pixel do not fit " +
               FormatOf(image.format).title;
    if (image.faults & kQexFaultFaces) return "a cube map of more than 6 faces";
    const std::string fault = SizeFault(image, pvr->IsCube());
    if (!fault.empty()) return fault;
    const uint64_t pixelBytes = file.size() - header.headerSize;
    bool found = QexPvr_FindLevels(pvr, header.dataSize, pixelBytes);
    // Some writers count all surfaces where others count one.
    if (header.dataSize == image.faces * pvr->surfaceBytes)
        found = QexPvr_FindLevels(pvr, pvr->surfaceBytes, pixelBytes);
    if (found) return "";
    if (image.faults & kQexFaultOverlap)
        return "surfaces of " + std::to_string(header.dataSize) + " bytes, whose levels take " +
               std::to_string(pvr->surfaceBytes);
    return "cut short: " + std::to_string(pixelBytes) + " bytes of pixels instead of " +
           std::to_string(pvr->NeededBytes());
}

}  // namespace

std::string PvrRefusal(QexPvr* pvr, const TextureBytes& file) {
    const QexImage& image = pvr->image;
    if (image.faults & kQexFaultTwiddled) return kTwiddled;
    if (image.format && FormatOf(image.format).refusal)
        return std::string(FormatOf(image.format).title) + " pixels: " + FormatOf(image.format).refusal;
    const std::string fault = PvrFault(pvr, file);
    if (!fault.empty() || image.faces == 1 || image.levels[0].stride == pvr->header.dataSize) return fault;
    return "its header counts the bytes of all surfaces instead of one";
}

bool ReadPvr(const TextureBytes& file, Texture* texture, std::string* error) {
    QexPvr pvr;
    const QexImage& image = pvr.image;
    if (!QexPvr_ReadHeader(&pvr, BytesOf(file))) {
        *error = "is cut short in the header of a PVR texture";
        return false;
    }
    *error = PvrFault(&pvr, file);
    if (error->empty() && image.format->coding == kQexUnread)
        *error = std::string(FormatOf(image.format).title) + " pixels are not read";
    if (!error->empty()) return false;
    texture->format = &FormatOf(image.format);
    texture->faces = std::min(image.faces, 6u);  // surfaces beyond six are no faces of anything
    texture->levels.assign(image.levels, image.levels + image.levelCount);
    for (QexImageLevel& level : texture->levels) level.offset += pvr.header.headerSize;
    return true;
}
