// Pictures of a HUD: texture files that know which way up they are.
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "image/Ktx.h"
#include "image/Pvr.h"
#include "image/Tga.h"
#include "Qex/base.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/resources.h"
#include "Qex/textures.h"

namespace {

constexpr size_t kPathSize = 256;

// Of a file that was loaded, so that its header is whole.
bool IsTopFirst(const QexImageBytes& file) {
    QexKtx ktx;
    QexPvr pvr;
    if (QexKtx_Is(file)) return QexKtx_ReadHeader(&ktx, file) && QexKtx_IsTopFirst(ktx, file);
    if (QexPvr_ReadHeader(&pvr, file)) return pvr.IsTopFirst();
    return QexTga_ReadHeader(file.bytes).topFirst;
}

// Loads an image of any of the three kinds; true when there is a texture afterwards.
bool Load(QexTexture* texture, const QexImageBytes& file) {
    const uint32_t size = static_cast<uint32_t>(file.size);
    memset(texture, 0, sizeof *texture);
    if (QexKtx_Is(file) || QexPvr_Is(file))
        QexTexture_LoadPVRFromMemSized(texture, file.bytes, size, nullptr, 1, 0, nullptr);
    else
        QexTexture_CreateTGAFromMemSized(texture, 0, 0, QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, file.bytes, size);
    if (!texture->glName) return false;
    QexTexture_SetFilter(texture, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(texture, QEX_WRAP_CLAMP);
    return true;
}

// The same for a file; a line when there is none. `topFirst` may be null.
bool LoadFile(QexTexture* texture, uint32_t* topFirst, const char* path) {
    QexResFile file;
    const bool opened = QexResFile_Create(&file, path) == 0;  // what cannot be opened was said
    const QexImageBytes image = {QexResFile_DataPtr(&file), QexResFile_GetSize(&file)};
    const bool loaded = QexResFile_IsOpen(&file) && Load(texture, image);
    if (opened && !loaded) QexError(QEX_TAG, "<QexPicture_Load> %s is no picture that can be loaded", path);
    if (!loaded) memset(texture, 0, sizeof *texture);
    if (loaded && topFirst) *topFirst = IsTopFirst(image);
    QexResFile_Release(&file);
    return loaded;
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
    if (!picture || !path) return Refuse("QexPicture_Load", "no picture or no path");
    memset(picture, 0, sizeof *picture);
    if (!LoadFile(&picture->texture, &picture->topFirst, path)) return -1;
    if (FindAlphaPath(alphaPath, path)) LoadFile(&picture->alpha, nullptr, alphaPath);
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
