#include "support/LoaderSupport.h"

namespace {

using TgaLoader = LoaderTest;

Outcome TryFile(const Bytes& file) {
    const MemoryFile memory(file);
    return Try([&](QexTexture* t) {
        return QexTexture_CreateTGAFromFile(t, 0, 2, QEX_FILTER_LINEAR, QEX_WRAP_REPEAT, memory.Path());
    });
}
Outcome TryMemory(const Bytes& file) {
    return Try([&](QexTexture* t) {
        return QexTexture_CreateTGAFromMem(t, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, file.data());
    });
}

TEST_F(TgaLoader, RedAndBlueChangePlaces) {
    const Bytes rgb = {3, 2, 1, 6, 5, 4, 9, 8, 7}, rgba = {3, 2, 1, 4, 7, 6, 5, 8, 11, 10, 9, 12};
    const struct {
        uint32_t width, height, bits;  // rows of any length follow each other
        uint32_t code, filter, wrap;
        GLenum format, filterGL, wrapGL;
        Bytes uploaded;
    } rows[] = {{3, 1, 24, QEX_TEXFMT_RGB888, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, GL_RGB, GL_NEAREST,
                 GL_CLAMP_TO_EDGE, rgb},
                {1, 3, 32, QEX_TEXFMT_RGBA8888, QEX_FILTER_LINEAR, QEX_WRAP_REPEAT, GL_RGBA, GL_LINEAR,
                 GL_REPEAT, rgba}};
    for (const auto& row : rows) {
        const Bytes file = TgaFile(row.width, row.height, row.bits, {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12});
        QexTexture before;
        std::memset(&before, 0xFF, sizeof before);
        const auto load = [&](QexTexture* t) {
            return QexTexture_CreateTGAFromMem(t, 5, 2, row.filter, row.wrap, file.data());
        };
        const Outcome outcome = Try(load, before);
        ASSERT_EQ(outcome.uploads.size(), 1u);
        ExpectUpload(outcome.uploads[0], false, 0, 0, row.width, row.uploaded);
        EXPECT_EQ(outcome.uploads[0].format, row.format);
        EXPECT_EQ(outcome.texture.format, row.code);
        EXPECT_EQ(outcome.texture.rowBytes, row.bits / 8 * row.width);
        EXPECT_EQ(outcome.texture.pixels, nullptr);
        EXPECT_STREQ(outcome.texture.name, "");
        for (const GLenum filter : {GL_TEXTURE_MIN_FILTER, GL_TEXTURE_MAG_FILTER})
            EXPECT_EQ(outcome.calls->Parameter(GL_TEXTURE_2D, filter), row.filterGL);
        for (const GLenum wrap : {GL_TEXTURE_WRAP_S, GL_TEXTURE_WRAP_T})
            EXPECT_EQ(outcome.calls->Parameter(GL_TEXTURE_2D, wrap), row.wrapGL);
    }
}

TEST_F(TgaLoader, OtherDepthsAndSizesGiveNoTexture) {
    GLint most = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &most);
    const auto tooWide = static_cast<uint32_t>(most) + 1;
    ASSERT_LT(tooWide, 0x10000u);
    const struct {
        uint32_t width, height, bits;
        int32_t result;
    } cases[] = {{2, 2, 0, -4},  {2, 2, 1, -4},  {2, 2, 8, -4},        {2, 2, 15, -4},
                 {2, 2, 16, -4}, {2, 2, 25, -4}, {2, 2, 64, -4},       {2, 2, 255, -4},
                 {0, 4, 24, -1}, {4, 0, 32, -1}, {tooWide, 1, 24, -1}, {1, tooWide, 32, -1}};
    for (const auto& c : cases) {
        const Bytes file = TgaFile(c.width, c.height, c.bits, Noise(4 * (c.width * c.height + 1)));
        const Outcome memory = TryMemory(file), disk = TryFile(file);
        EXPECT_EQ(memory.result, c.result) << c.bits;
        EXPECT_EQ(disk.result, 0) << c.bits;
        EXPECT_EQ(memory.textures + disk.textures, 0u) << c.bits;
        EXPECT_EQ(memory.texture.glName + disk.texture.glName, 0u) << c.bits;
        const std::string line = "E/Qex: <QexTexture_CreateTGAFromMem> " + std::to_string(c.width) + " x " +
                                 std::to_string(c.height) + " pixels are not possible here";
        EXPECT_EQ(memory.out.find(line), c.result == -1 ? 0 : std::string::npos) << memory.out;
    }
}

TEST_F(TgaLoader, NoCutGivesATexture) {
    Bytes file = TgaFile(3, 2, 32, Noise(24));
    ExpectEveryCutRefused(file, TryFile, "are not a whole uncompressed TGA image");
    file[12] = file[13] = file[14] = file[15] = 0xFF;
    EXPECT_EQ(TryFile(file).textures, 0u);
}

TEST_F(TgaLoader, FilesNameTheirTextures) {
    const MemoryFile file(TgaFile(1, 1, 24, {1, 2, 3}));
    const std::string descriptor = std::string(file.Path()).substr(14);
    const auto load = [](const std::string& path) {
        return Try([&](QexTexture* t) {
            return QexTexture_CreateTGAFromFile(t, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, path.c_str());
        });
    };
    // From the last separator on, which is kept.
    EXPECT_EQ(load(file.Path()).texture.name, "/" + descriptor);
    EXPECT_EQ(load("/nonexistent.tga").result, -1);
    const char* paths[][2] = {{"textures/wall.tga", "/wall.tga"},
                              {"wall.tga", "wall.tga"},
                              {"c:wall", ":wall"},
                              {"a\\b", "\\b"},
                              {"a/", "/"}};
    for (const auto& p : paths) EXPECT_STREQ(GetNameFromFullPath(p[0]), p[1]);
    EXPECT_EQ(GetNameFromFullPath(""), nullptr);
    QexTexture texture = {};
    QexTexture_SetName(&texture, std::string(40, 'n').c_str());
    EXPECT_EQ(texture.name, std::string(31, 'n'));
}

}  // namespace
