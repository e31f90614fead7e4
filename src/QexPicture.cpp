// Pictures of a HUD: texture files that know which way up they are.
#include <cstdio>
#include <cstring>

#include "QexDiagnostics.h"

namespace {

constexpr size_t kPathSize = 256;
constexpr uint32_t kPVRFlipped = 0x10000;
constexpr uint32_t kTGATopFirst = 0x20;  // in the header's last byte

// Where a container says which edge comes first.
struct Header {
    uint8_t bytes[256];
    uint32_t size;
    uint32_t Word(uint32_t at) const {
        uint32_t word = 0;
        for (uint32_t i = 0; i < 4; ++i) word |= static_cast<uint32_t>(bytes[at + i]) << (8 * i);
        return word;
    }
};

bool ReadHeader(Header* header, const char* path) {
    QexResFile file;
    memset(header, 0, sizeof *header);
    const int32_t result = QexResFile_Create(&file, path);
    const bool open = QexResFile_IsOpen(&file);
    // What cannot even be opened was said.
    if (!open && result == 0) QexError(QEX_TAG, "<QexPicture_Load> %s cannot be read", path);
    if (open) {
        const uint32_t size = QexResFile_GetSize(&file);
        header->size = size < sizeof header->bytes ? size : static_cast<uint32_t>(sizeof header->bytes);
        memcpy(header->bytes, QexResFile_DataPtr(&file), header->size);
    }
    QexResFile_Release(&file);
    return open;
}

bool IsKTX(const Header& header) {
    return memcmp(header.bytes, "\xABKTX 11\xBB\r\n\x1A\n", 12) == 0;
}

bool IsPVR(const Header& header) {
    const uint32_t headerSize = header.Word(0);
    return headerSize == 44 || headerSize == 52;
}

// KTX files that say nothing begin with the upper edge, as pictures do.
bool SaysUp(const Header& header) {
    static const char key[] = "KTXorientation\0S=r,T=u";
    for (uint32_t at = 64; at + sizeof key <= sizeof header.bytes; ++at)
        if (memcmp(header.bytes + at, key, sizeof key - 1) == 0) return true;
    return false;
}

bool IsTopFirst(const Header& header) {
    if (IsKTX(header)) return !SaysUp(header);
    if (IsPVR(header)) return !(header.Word(16) & kPVRFlipped);
    return header.bytes[17] & kTGATopFirst;
}

// Loads a file of any of the three kinds; true when there is a texture afterwards.
bool Load(QexTexture* texture, const char* path, const Header& header) {
    memset(texture, 0, sizeof *texture);
    if (IsKTX(header) || IsPVR(header))
        QexTexture_LoadPVRFromFile(texture, path, nullptr, 1, 0);
    else
        QexTexture_CreateTGAFromFile(texture, 0, 0, QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, path);
    if (!texture->glName) return false;
    QexTexture_SetFilter(texture, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(texture, QEX_WRAP_CLAMP);
    return true;
}

// "_a" before the extension; false where it does not fit or there is no such file.
bool FindAlphaPath(char (&alphaPath)[kPathSize], const char* path) {
    const char* dot = strrchr(path, '.');
    if (!dot || strlen(path) + 3 > kPathSize) return false;
    snprintf(alphaPath, kPathSize, "%.*s_a%s", static_cast<int>(dot - path), path, dot);
    return QexResFile_Exists(alphaPath);
}

bool IsWithin(const QexRect& part, const QexTexture& texture) {
    return part.left >= 0 && part.top >= 0 && part.left <= part.right && part.top <= part.bottom &&
           part.right < texture.width && part.bottom < static_cast<int32_t>(texture.height);
}

int32_t Refuse(const char* function, const char* why) {
    QexError(QEX_TAG, "<%s> %s", function, why);
    return -1;
}

}  // namespace

extern "C" {

int32_t QexPicture_Load(QexPicture* picture, const char* path) {
    char alphaPath[kPathSize];
    Header header;
    if (!picture || !path) return Refuse("QexPicture_Load", "no picture or no path");
    memset(picture, 0, sizeof *picture);
    if (!ReadHeader(&header, path)) return -1;
    if (!Load(&picture->texture, path, header)) {
        QexError(QEX_TAG, "<QexPicture_Load> %s is no picture that can be loaded", path);
        return -1;
    }
    picture->topFirst = IsTopFirst(header);
    if (FindAlphaPath(alphaPath, path) && ReadHeader(&header, alphaPath))
        Load(&picture->alpha, alphaPath, header);
    return 0;
}

int32_t QexPicture_Draw(const QexRuntimeContext* context, QexPicture* picture, const QexRect* part, float x,
                        float y, float width, float height, uint32_t colour) {
    static const char function[] = "QexPicture_Draw";
    if (!context) return Refuse(function, "no context");
    if (picture && !picture->texture.glName) return Refuse(function, "an empty picture");
    QexTexture* texture = picture ? &picture->texture : nullptr;
    const QexRect whole = {0, 0, texture ? texture->width - 1 : 0,
                           texture ? static_cast<int32_t>(texture->height) - 1 : 0};
    const QexRect shown = texture && part ? *part : whole;
    if (texture && !IsWithin(shown, *texture))
        return Refuse(function, "a part that is not within the picture");
    const int32_t columns = shown.right + 1 - shown.left, rows = shown.bottom + 1 - shown.top;
    if (texture && width == 0 && height == 0) {
        width = static_cast<float>(columns);
        height = static_cast<float>(rows);
    }
    if (!(width > 0) || !(height > 0)) return Refuse(function, "a width and a height have to be above 0");
    // A texture without a rectangle is drawn one texel larger than it is.
    if (!texture)
        return QexTexture_Draw(context, nullptr, x, y, nullptr, width * 64 / 65, height * 64 / 65, colour);
    // Rectangles count texels from the last row, include their ends and are scaled with a texel more. Between
    // upper edge u and lower edge l of the rows, one that is turned over runs from row H - u to row H - l.
    const int32_t h = static_cast<int32_t>(texture->height);
    QexRect texels = {shown.left, shown.top, shown.right + 1, shown.bottom + 1};
    if (picture->topFirst && rows > 1) {
        texels.top = h - shown.top;
        texels.bottom = h - (shown.bottom + 1);
    } else if (picture->topFirst) {
        texels.top = h - 1 - shown.top;
        texels.bottom = texels.top + 1;
    }
    const float drawn = static_cast<float>(texels.bottom + 1 - texels.top);
    const float scaleX = width / static_cast<float>(columns + 1), scaleY = height / drawn;
    if (picture->alpha.glName)
        return QexTexture_Draw2(context, texture, &picture->alpha, x, y, &texels, scaleX, scaleY, colour);
    return QexTexture_Draw(context, texture, x, y, &texels, scaleX, scaleY, colour);
}

void QexPicture_Release(QexPicture* picture) {
    if (!picture) return;
    QexTexture_Release(&picture->texture);
    QexTexture_Release(&picture->alpha);
    memset(picture, 0, sizeof *picture);
}

}  // extern "C"
