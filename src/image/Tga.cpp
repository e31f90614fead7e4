// Reads the headers of TGA images.
#include "image/Tga.h"

QexTga QexTga_ReadHeader(const uint8_t* file) {
    const auto word = [&](uint32_t at) { return file[at] | static_cast<uint32_t>(file[at + 1]) << 8; };
    QexTga tga = {};
    tga.identifierBytes = file[0];
    tga.mapped = file[1];
    tga.mapBytes = file[1] ? word(5) * ((file[7] + 7u) / 8) : 0;
    tga.type = file[2];
    tga.width = word(12);
    tga.height = word(14);
    tga.bits = file[16];
    tga.alphaBits = file[17] & 15;
    tga.rightFirst = file[17] & 0x10;
    tga.topFirst = file[17] & 0x20;
    return tga;
}

bool QexTga_IsWhole(const QexImageBytes& file) {
    return file.size >= kQexTgaHeaderSize &&
           file.size - kQexTgaHeaderSize >= QexTga_ReadHeader(file.bytes).PixelBytes();
}
