// What holds for the sizes of textures in every kind of file.
#include "image/Image.h"

#include "Qex/math.h"

uint32_t QexImage_ChainLength(uint32_t width, uint32_t height) {
    uint32_t levels = 1;
    for (uint32_t size = width > height ? width : height; size > 1; size /= 2) ++levels;
    return levels;
}

bool QexImage_IsPowerOfTwo(uint32_t width, uint32_t height) {
    return util_number_is_power_2(width) && util_number_is_power_2(height);
}

void QexImage_JudgeSize(QexImage* image) {
    const bool pvrtc = image->format && image->format->coding == kQexPVRTC;
    if (pvrtc && !QexImage_IsPowerOfTwo(image->width, image->height)) image->faults |= kQexFaultSides;
    if (!image->levelCount || image->levelCount > QexImage_ChainLength(image->width, image->height))
        image->faults |= kQexFaultLevelCount;
}
