#include "support/LoaderSupport.h"

namespace {

using KtxLoader = LoaderTest;

// Offsets in the header.
constexpr size_t kType = 16, kFormat = 24, kInternal = 28, kBase = 32, kWidth = 36, kHeight = 40, kFaces = 52,
                 kLevels = 56, kKeyValues = 60;

constexpr TryFunction TryFile = ::TryFile<QexTexture_LoadKTXFromFile>;

TEST_F(KtxLoader, EachFormatIsUploadedAsItIs) {
    const struct {
        uint32_t type, format, width;
        size_t rowBytes;  // in the file
        int64_t alignment;
        uint32_t bytesPerPixel, code;
    } rows[] = {
        {GL_UNSIGNED_BYTE, GL_RGBA, 5, 20, 4, 4, QEX_TEXFMT_RGBA8888},
        {GL_UNSIGNED_BYTE, GL_RGB, 5, 16, 4, 3, QEX_TEXFMT_RGB888},
        {GL_UNSIGNED_BYTE, GL_RGB, 5, 15, 1, 3, QEX_TEXFMT_RGB888},  // tight, as some writers have it
        {GL_UNSIGNED_SHORT_5_6_5, GL_RGB, 5, 12, 4, 3, QEX_TEXFMT_RGB888},
        {GL_UNSIGNED_SHORT_4_4_4_4, GL_RGBA, 5, 10, 1, 4, QEX_TEXFMT_RGBA8888},
        {GL_UNSIGNED_SHORT_5_5_5_1, GL_RGBA, 4, 8, 4, 4, QEX_TEXFMT_RGBA8888},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.type) + ", rows of " + std::to_string(row.rowBytes));
        Ktx ktx;
        ktx.type = row.type;
        ktx.format = ktx.base = ktx.internal = row.format;
        ktx.width = row.width;
        ktx.height = 3;
        ktx.levels = {{Noise(3 * row.rowBytes)}};
        ktx.keyValues = Noise(20);
        const Bytes file = ktx.File();
        // Through the PVR entry, which knows the other container too.
        const Outcome outcome = Try(
            [&](QexTexture* t) { return QexTexture_LoadPVRFromMem(t, file.data(), nullptr, 1, 0, nullptr); });
        ExpectFormat(outcome, row.format, row.type, row.alignment, row.bytesPerPixel, row.code);
        // GL does not read the padding of the last row.
        const Bytes &level = ktx.levels[0][0], &read = outcome.uploads.at(0).data;
        EXPECT_GT(read.size(), 2 * row.rowBytes);
        ExpectUpload(outcome.uploads[0], false, 0, 0, row.width,
                     Bytes(level.begin(), level.begin() + static_cast<long>(read.size())));
    }
}

TEST_F(KtxLoader, LevelsAndFacesAreFoundInOrder) {
    Ktx narrow;  // the shorter side stays 1
    narrow.height = 1;
    narrow.levels = {{Noise(16)}, {Noise(8)}, {Noise(4)}};
    Ktx compressed = Etc1Ktx();
    compressed.width = 4;
    compressed.levels = {{Noise(8, 1)}, {Noise(8, 2)}, {Noise(8, 3)}};
    Ktx odd;  // faces of a size that is no multiple of four
    odd.type = GL_UNSIGNED_SHORT_4_4_4_4;
    odd.width = odd.height = 3;
    odd.faces = 6;
    odd.levels = {std::vector<Bytes>(6, Noise(18)), std::vector<Bytes>(6, Noise(2))};
    for (const Ktx& ktx : {SoundKtx(), CubeKtx(), compressed, narrow, odd}) {
        const Outcome outcome = TryFile(ktx.File());
        ASSERT_EQ(outcome.result, 0) << outcome.out;
        ASSERT_EQ(outcome.uploads.size(), ktx.levels.size() * ktx.faces);
        for (size_t i = 0; i < outcome.uploads.size(); ++i) {
            const size_t level = i / ktx.faces, face = i % ktx.faces;
            ExpectUpload(outcome.uploads[i], ktx.faces == 6, face, level, ktx.width >> level,
                         ktx.levels[level][face]);
            EXPECT_EQ(outcome.uploads[i].format, ktx.type ? ktx.base : kEtc1);
        }
        EXPECT_EQ(outcome.texture.flags, ktx.faces == 6 ? QEX_TEXFLAG_CUBEMAP : 0u);
        EXPECT_EQ(outcome.texture.bytesPerPixel, ktx.type ? 4u : 3u);
        EXPECT_EQ(outcome.texture.format, ktx.type ? QEX_TEXFMT_RGBA8888 : 0u);
    }
}

TEST_F(KtxLoader, EitherByteOrder) {
    for (const uint32_t type : {GL_UNSIGNED_SHORT_5_6_5, GL_UNSIGNED_BYTE}) {
        Ktx ktx;
        ktx.type = type;
        ktx.format = ktx.base = ktx.internal = GL_RGB;
        ktx.levels = {{Noise(type == GL_UNSIGNED_BYTE ? 48 : 32)},
                      {Noise(type == GL_UNSIGNED_BYTE ? 16 : 8)}};
        const Outcome plain = TryFile(ktx.File()), other = TryFile(SwappedFile(ktx));
        EXPECT_EQ(other.result, 0) << other.out;
        ASSERT_EQ(other.uploads.size(), 2u);
        for (size_t level = 0; level < 2; ++level)
            EXPECT_EQ(other.uploads[level].data, plain.uploads[level].data);
    }
}

TEST_F(KtxLoader, WithoutLevelsTheyAreGenerated) {
    Ktx ktx = SoundKtx();
    ktx.levels.resize(1);
    ktx.levelCount = 0;
    const Outcome outcome = TryFile(ktx.File());
    EXPECT_EQ(outcome.result, 0);
    EXPECT_EQ(outcome.uploads.size(), 1u);
    EXPECT_EQ(outcome.calls->Of({"glGenerateMipmap"}).size(), 1u);
    // GL that refuses to: level 0 is there all the same, and nothing ends the process.
    gltapInjectError("glGenerateMipmap", 1, GL_INVALID_OPERATION);
    EXPECT_EQ(TryFile(ktx.File()).result, 0);
}

TEST_F(KtxLoader, RefusesWithItsCode) {
    const struct {
        size_t offset;
        uint32_t word;
        int32_t result;
        const char* line;
    } cases[] = {
        {kFormat, GL_LUMINANCE, -4, "pixels of format 0x1909 and type 0x1401"},
        {kFormat, GL_RGB, -4, "pixels of format 0x1907"},  // the base format says RGBA
        {kType, GL_UNSIGNED_SHORT_5_6_5, -4, "and type 0x8363"},
        {kType, GL_FLOAT, -4, "and type 0x1406"},
        {kBase, GL_RGB, -4, "kept as 0x1907"},
        {kFaces, 7, -1, "7 faces instead of 1 or 6."},
        {kFaces, 6, -1, "the file is cut short in level 0."},
        {kWidth, 0, -1, "0 x 4 pixels are not possible here"},
        {kHeight, UINT32_MAX, -1, "4 x 4294967295 pixels are not possible here"},
        {kLevels, 4, -1, "4 levels of 4 x 4 pixels."},
        {kLevels, UINT32_MAX, -1, "4294967295 levels of 4 x 4 pixels."},
        {kKeyValues, UINT32_MAX, -1, "the file is cut short in level 0."},
        {kWidth, 2, -1, "level 0 of 64 bytes is not of its size."},
        {64 + 12, 63, -1, "level 0 of 63 bytes is not of its size."},
        {64 + 12, UINT32_MAX, -1, "the file is cut short in level 0."},
    };
    for (const auto& c : cases) {
        Bytes file = SoundKtx().File();
        PutWord(&file, c.offset, c.word);
        ExpectRefused(file, TryFile, c.result, c.line);
    }
    for (size_t i = 0; i < 12; ++i) {
        Bytes file = SoundKtx().File();
        file[i] ^= 1;
        EXPECT_EQ(TryFile(file).result, -3) << i;
    }
    Bytes unknown = Etc1Ktx().File();
    PutWord(&unknown, kInternal, 0x12345);
    ExpectRefused(unknown, TryFile, -1, "the GL does not take the compressed format 0x12345.");
    Ktx odd = Etc1Ktx();
    odd.internal = 0x8C00;
    odd.width = 12;
    ExpectRefused(odd.File(), TryFile, -1, "PVRTC of a size that is no power of two.");
}

// The filter that a texture starts with asks for all levels; a texture without them is black.
TEST_F(KtxLoader, CompressedChainsAreNeverBlack) {
    const auto minFilter = [](const Outcome& o) {
        return o.calls->Parameter(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER);
    };
    Ktx ktx = Etc1Ktx();  // 8 x 4, so four levels are a whole chain
    ktx.levels.resize(1);
    const Outcome one = TryFile(ktx.File());
    ASSERT_EQ(one.uploads.size(), 1u);
    EXPECT_EQ(one.uploads[0].format, kEtc1);
    EXPECT_EQ(minFilter(one), GLenum(GL_LINEAR));
    // A chain that ends early is decoded, so that the GL can make the rest.
    ktx.levels = {{Noise(16, 1)}, {Noise(8, 2)}};
    for (const size_t damaged : {2u, 1u}) {
        if (damaged == 1) ktx.levels.push_back({Noise(4)});  // a third level of a wrong size
        const Outcome two = TryFile(ktx.File());
        EXPECT_EQ(two.result, 0);
        ASSERT_EQ(two.uploads.size(), 2u);
        EXPECT_EQ(two.uploads[0].format, GLenum(GL_RGB));
        EXPECT_EQ(two.calls->Of({"glGenerateMipmap"}).size(), 1u);
        EXPECT_EQ(two.out.find("level 2 of 4 bytes is not of its size") != std::string::npos, damaged == 1);
    }
    Ktx whole = Etc1Ktx();
    whole.width = 4;
    whole.levels = {{Noise(8, 1)}, {Noise(8, 2)}, {Noise(8, 3)}};
    const Outcome complete = TryFile(whole.File());
    EXPECT_EQ(complete.uploads.at(2).format, kEtc1);
    EXPECT_EQ(minFilter(complete), 0u);
}

TEST_F(KtxLoader, PvrtcIsDecodedAndNoFacesAreOne) {
    Ktx ktx;
    ktx.type = ktx.format = 0;
    ktx.width = ktx.height = 16;
    ktx.faces = 0;
    for (const uint32_t internal : {0x8C00u, 0x8C01u, 0x8C02u, 0x8C03u}) {
        const bool twoBits = internal & 1;
        ktx.internal = internal;
        ktx.levels = {{Noise(twoBits ? 64 : 128, 5)}};
        const Outcome outcome = TryFile(ktx.File());
        ASSERT_EQ(outcome.uploads.size(), 1u) << outcome.out;
        Bytes expected(16 * 16 * 4);
        QexDecompressPVRTC(ktx.levels[0][0].data(), twoBits, 16, 16, expected.data());
        EXPECT_EQ(outcome.uploads[0].data, expected);
        EXPECT_EQ(outcome.texture.format, QEX_TEXFMT_RGBA8888);
        EXPECT_EQ(outcome.texture.flags, 0u);
        EXPECT_EQ(outcome.calls->Of({"glGenerateMipmap"}).size(), 1u);
    }
}

// RGB of 4 x 4: from 2 x 2 on the rows of the file are padded, but the sizes of the levels do not count it.
TEST_F(KtxLoader, LevelsThatLieWrongLeaveTheOthers) {
    Ktx ktx;
    ktx.format = ktx.base = ktx.internal = GL_RGB;
    ktx.width = ktx.height = 8;
    ktx.levels = {{Noise(192)}, {Noise(48)}, {Noise(16)}, {Noise(4)}};
    Bytes file = ktx.File();
    const size_t third = 64 + 4 + 192 + 4 + 48;
    ASSERT_EQ(GetWord(file, third), 16u);
    PutWord(&file, third, 12);
    PutWord(&file, third + 4 + 12, 0x00FF00FF);  // pixels, where the next size would be
    const Outcome outcome = TryFile(file);
    EXPECT_EQ(outcome.result, 0) << outcome.out;
    ASSERT_EQ(outcome.uploads.size(), 2u);
    EXPECT_EQ(outcome.uploads[1].data, ktx.levels[1][0]);
    EXPECT_EQ(outcome.calls->Of({"glGenerateMipmap"}).size(), 1u);
    EXPECT_NE(outcome.out.find("level 3 of 16711935 bytes is not of its size"), std::string::npos)
        << outcome.out;
}

TEST_F(KtxLoader, NoCutAndNoWordIsTrusted) {
    for (const Bytes& file : {SoundKtx().File(), CubeKtx().File(), Etc1Ktx().File()}) {
        ExpectEveryCutRefused(file, TryFile, "");
        ExpectEveryCutRefused(file, TrySized<QexTexture_LoadKTXFromMemSized>, "");
        ExpectNoWordTrusted(file, 12, 80, TryFile);
    }
}

}  // namespace
