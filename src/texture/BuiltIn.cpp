// Textures that need no file: white, the flat normal map, the cube map of normals.
#include <cmath>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "image/Pvr.h"
#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/Kept.h"
#include "texture/Texture.h"

#define QEX_MODULE "src/QexTexture"

namespace {

constexpr uint32_t kPVRFlags = kQexPvrFlipped | kQexPvrMipmaps | 0x36;  // of ETC1
constexpr uint32_t kETCBlockSize = 8;

// The default texture: 64 x 64 with 7 levels, 343 blocks.
constexpr uint32_t kDefaultSize = 64;
constexpr uint32_t kDefaultMipmaps = 6;
constexpr uint32_t kDefaultBlocks = 256 + 64 + 16 + 4 + 1 + 1 + 1;
// Both halves 15, 15, 15 of 15; every texel adds the table's small step and stays 255.
const uint8_t kWhiteBlock[kETCBlockSize] = {0xFF, 0xFF, 0xFF, 0x00, 0, 0, 0, 0};

// The flat normal map: 16 x 16 with 5 levels, 23 blocks.
constexpr uint32_t kNormalSize = 16;
constexpr uint32_t kNormalMipmaps = 4;
constexpr uint32_t kNormalBlocks = 16 + 4 + 1 + 1 + 1;
// Base 15, 15, 31 of 31, that is 123, 123, 255, and table 1 in both halves: every texel adds 5 and comes to
// 128, 128, 255.
const uint8_t kFlatNormalBlock[kETCBlockSize] = {0x78, 0x78, 0xF8, 0x26, 0, 0, 0, 0};

QexTexture s_Default;
QexTexture s_BlankNormalMap;
bool s_Created;

// Loads a PVR image of one colour: every block of every level is the same. `image` is room for it.
bool LoadUniform(QexTexture* texture, uint8_t* image, uint32_t size, uint32_t mipmaps, const uint8_t* block,
                 uint32_t blocks) {
    const uint32_t words[13] = {
        kQexPvrHeaderSize, size, size, mipmaps, kPVRFlags, blocks * kETCBlockSize, 4, 0, 0, 0, 0,
        kQexPvrTag,        1};
    memcpy(image, words, sizeof words);
    for (uint32_t i = 0; i < blocks; ++i)
        memcpy(image + kQexPvrHeaderSize + i * kETCBlockSize, block, kETCBlockSize);
    memset(texture, 0, sizeof *texture);
    const bool loaded = QexTexture_LoadPVRFromMem(texture, image, nullptr, 1, 0, nullptr) == 0;
    QexKeptTexture_Drop(texture->glName);  // made again from here
    return loaded;
}

bool LoadBoth() {
    uint8_t image[kQexPvrHeaderSize + kDefaultBlocks * kETCBlockSize];
    if (!LoadUniform(&s_Default, image, kDefaultSize, kDefaultMipmaps, kWhiteBlock, kDefaultBlocks))
        return false;
    if (LoadUniform(&s_BlankNormalMap, image, kNormalSize, kNormalMipmaps, kFlatNormalBlock, kNormalBlocks))
        return true;
    QexTexture_Release(&s_Default);
    return false;
}

void Forget() {
    s_Default.glName = s_BlankNormalMap.glName = 0;
}
bool Restore() {
    return !s_Created || LoadBoth();
}
QexContextPart s_Part = {kRankTextures, Forget, nullptr, Restore, nullptr, false};

// Direction through a texel of each cube face, from the texel's offsets s and t and half the edge.
QexVec3 FaceDirection(uint32_t face, float s, float t, float h) {
    switch (face) {
        case 0: return {h, -t, -s};
        case 1: return {-h, -t, s};
        case 2: return {s, h, t};
        case 3: return {s, -h, -t};
        case 4: return {s, -t, h};
        default: return {-s, -t, -h};
    }
}

uint8_t PositiveByte(float component) {
    return component > 0 ? static_cast<uint8_t>(component * 255.0f) : uint8_t{0};
}

void FillFace(uint8_t* texels, uint32_t face, int32_t size) {
    const float h = static_cast<float>(size) * 0.5f;
    for (int32_t j = 0; j < size; ++j)
        for (int32_t i = 0; i < size; ++i, texels += 3) {
            QexVec3 direction =
                FaceDirection(face, static_cast<float>(i) + 0.5f - h, static_cast<float>(j) + 0.5f - h, h);
            QexVec3_Normalize(&direction, &direction);
            texels[0] = PositiveByte(direction.x);
            texels[1] = PositiveByte(direction.y);
            texels[2] = PositiveByte(direction.z);
        }
}

}  // namespace

QexTexture* QexTexture_GetBlankNormalMap() {
    return &s_BlankNormalMap;
}

extern "C" {

QexTexture* Qextexture_GetDefault(void) {
    return &s_Default;
}

void QexTexture_SetBlankNormalMap(uint32_t stage) {
    QexTexture_Set(&s_BlankNormalMap, stage);
}

int32_t QexTexture_CreateDefault(void) {
    if (s_Created) {
        QexLog(QEX_TAG, "<QexTexture_CreateDefault> Already created.");
        return 0;
    }
    if (!LoadBoth()) return -1;
    s_Created = true;
    QexContext_Register(&s_Part);
    QexLog(QEX_TAG, "<QexTexture_CreateDefault> Created.");
    return 0;
}

int32_t QexTexture_ReleaseDefault(void) {
    if (!s_Created) return QexLog(QEX_TAG, "<QexTexture_ReleaseDefault> Already release.");
    QexTexture_Release(&s_BlankNormalMap);
    QexTexture_Release(&s_Default);
    s_Created = false;
    return QexLog(QEX_TAG, "<QexTexture_ReleaseDefault> Released.");
}

int32_t QexTexture_GenerateNormalisationCubeMap(QexTexture* texture, int32_t size) {
    if (size < 1 ||
        !QexTexture_IsPossibleSize(static_cast<uint32_t>(size), static_cast<uint32_t>(size), true)) {
        QexSystem_Printf("ERROR:<GenerateNormalisationCubeMap> a cube map of %d pixels a side\n", size);
        return -1;
    }
    const QexMaking making;
    texture->glName = QexKeptTexture_NewName();
    QexKeptTexture_Note(texture->glName, GL_TEXTURE_CUBE_MAP,
                        {kKeptNormals, nullptr, 0, size, size, 0, 0, 0});
    QexRenderState_Bind(GL_TEXTURE_CUBE_MAP, texture->glName);
    texture->width = size;
    texture->height = static_cast<uint32_t>(size);
    texture->flags |= QEX_TEXFLAG_CUBEMAP;
    QexScratch<uint8_t> texels(static_cast<uint64_t>(size) * static_cast<uint64_t>(size) * 3);
    if (!texels) {
        QexSystem_Printf(
            "ERROR:<GenerateNormalisationCubeMap> Unable to allocate memory for texture data for cube map\n");
        QexTexture_Release(texture);
        return -1;
    }
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    for (uint32_t face = 0; face < 6; ++face) {
        FillFace(texels.Get(), face, size);
        glTexImage2D(GL_TEXTURE_CUBE_MAP_POSITIVE_X + face, 0, GL_RGB, size, size, 0, GL_RGB,
                     GL_UNSIGNED_BYTE, texels.Get());
    }
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
    if (QexDiagnostics_HasHandler()) QEX_GL_CHECK();
    if (!making.Failed()) return 0;
    QexTexture_Release(texture);
    return -1;
}

}  // extern "C"
