// Reads the headers of PVR files and finds their levels, which follow each other without gaps.
#include "image/Pvr.h"

#include "Qex/images.h"

bool QexPvr_Is(const QexImageBytes& file) {
    const uint32_t size = file.size >= 4 ? QexImage_ReadWord(file.bytes) : 0;
    return size == kQexPvrHeaderSize || size == kQexPvrOldHeaderSize;
}

bool QexPvr_ReadHeader(QexPvr* pvr, const QexImageBytes& file) {
    memset(pvr, 0, sizeof *pvr);
    if (!QexPvr_Is(file) || file.size < QexImage_ReadWord(file.bytes)) return false;
    QexPVRHeader& header = pvr->header;
    QexImage& image = pvr->image;
    memcpy(&header, file.bytes, QexImage_ReadWord(file.bytes));
    header.tag = kQexPvrTag;
    if (!header.numSurfaces) header.numSurfaces = pvr->IsCube() ? 6 : 1;
    image.format = QexFormat_FindPVR(header.flags & 0xFF);
    image.width = header.width;
    image.height = header.height;
    image.faces = header.numSurfaces;
    image.levelCount = header.flags & kQexPvrMipmaps ? header.mipmapCount + 1 : 1;
    if (header.flags & kQexPvrTwiddled && !(image.format && image.format->twiddled))
        image.faults |= kQexFaultTwiddled;
    if (image.format && header.bitsPerPixel != image.format->bits) image.faults |= kQexFaultBits;
    if (pvr->IsCube() && image.faces > 6) image.faults |= kQexFaultFaces;
    QexImage_JudgeSize(&image);
    return true;
}

bool QexPvr_FindLevels(QexPvr* pvr, uint64_t stride, uint64_t size) {
    QexImage& image = pvr->image;
    image.faults &= ~uint32_t{kQexFaultOverlap | kQexFaultCut};
    if (image.faults & kQexFaultLevelCount) return false;
    uint64_t offset = 0;
    for (uint32_t i = 0; i < image.levelCount; ++i) {
        const uint32_t width = QexImage_SideAtLevel(image.width, i),
                       height = QexImage_SideAtLevel(image.height, i);
        const uint64_t bytes = QexFormat_LevelBytes(*image.format, width, height);
        image.levels[i] = {width, height, offset, stride, bytes, uint64_t{width} * image.format->bits / 8};
        offset += bytes;
    }
    pvr->surfaceBytes = offset;
    // Surfaces that overlapped could be billions in a file of a few bytes.
    if (image.faces > 1 && stride < offset)
        image.faults |= kQexFaultOverlap;
    else if (pvr->NeededBytes() > size)
        image.faults |= kQexFaultCut;
    return !(image.faults & (kQexFaultOverlap | kQexFaultCut));
}
