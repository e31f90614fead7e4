#include "support/LoaderSupport.h"

namespace {

using PvrLoader = LoaderTest;

// Offsets in the header.
constexpr size_t kSize = 0, kHeight = 4, kWidth = 8, kMipmaps = 12, kFlags = 16, kDataSize = 20, kBits = 24,
                 kSurfaces = 48;

Outcome TryMemory(const Bytes& file, uint32_t firstLevel, QexPVRHeader* header,
                  const QexTexture& before = {}) {
    const auto load = [&](QexTexture* t) {
        return QexTexture_LoadPVRFromMem(t, file.data(), header, 1, firstLevel, nullptr);
    };
    return Try(load, before);
}
constexpr TryFunction TryFile = ::TryFile<QexTexture_LoadPVRFromFile>;

Bytes File(uint32_t type, uint32_t width, uint32_t height, uint32_t levels = 1, uint32_t surfaces = 1) {
    return pod::WritePvr(PvrNoise(type, width, height, levels, surfaces));
}

TEST_F(PvrLoader, EachPixelTypeIsUploadedAsItIs) {
    const struct {
        uint32_t type;
        GLenum format, dataType;
        uint32_t bytesPerPixel, code;  // 77: the record's stay as they are
    } rows[] = {
        {0x10, GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4, 2, QEX_TEXFMT_RGBA4444},
        {0x11, GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1, 2, QEX_TEXFMT_RGBA5551},
        {0x12, GL_RGBA, GL_UNSIGNED_BYTE, 4, QEX_TEXFMT_RGBA8888},
        {0x13, GL_RGB, GL_UNSIGNED_SHORT_5_6_5, 2, 0},
        {0x15, GL_RGB, GL_UNSIGNED_BYTE, 3, QEX_TEXFMT_RGB888},
        {0x16, GL_LUMINANCE, GL_UNSIGNED_BYTE, 77, 77},
        {0x17, GL_LUMINANCE_ALPHA, GL_UNSIGNED_BYTE, 77, 77},
        {0x1B, GL_ALPHA, GL_UNSIGNED_BYTE, 77, 77},
        {0x36, kEtc1, 0, 77, 77},
    };
    QexTexture before = {};
    before.bytesPerPixel = 77;
    before.format = 77;
    for (const auto& row : rows) {
        SCOPED_TRACE("type " + std::to_string(row.type));
        const Bytes file = File(row.type, 7, 4);
        const Outcome outcome = TryMemory(file, 0, nullptr, before);
        ExpectFormat(outcome, row.format, row.dataType, 1, row.bytesPerPixel, row.code);
        ExpectUpload(outcome.uploads.at(0), false, 0, 0, 7,
                     Noise(row.type == 0x36 ? 16 : file.size() - 52, 0));
        EXPECT_EQ(outcome.uploads[0].height, 4);
        EXPECT_EQ(outcome.calls->Parameter(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER), GLenum(GL_LINEAR));
        EXPECT_EQ(outcome.calls->Parameter(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S), GLenum(GL_CLAMP_TO_EDGE));
    }
}

TEST_F(PvrLoader, LevelsFromTheFirstOneOnAndFaces) {
    const struct {
        uint32_t size, levels, surfaces, first, declared;
    } cases[] = {{256, 9, 1, 0, 1}, {256, 9, 1, 2, 1}, {256, 9, 1, 8, 1}, {4, 3, 6, 0, 6}, {4, 3, 6, 0, 0}};
    for (const auto& c : cases) {
        const pod::PvrImage image = PvrNoise(0x13, c.size, c.size, c.levels, c.surfaces);
        Bytes file = pod::WritePvr(image);
        PutWord(&file, kSurfaces, c.declared);
        QexPVRHeader header = {};
        const Outcome outcome = TryMemory(file, c.first, &header);
        const uint32_t levels = c.levels - c.first;
        ASSERT_EQ(outcome.uploads.size(), levels * c.surfaces);
        for (uint32_t i = 0; i < outcome.uploads.size(); ++i) {
            const uint32_t face = i / levels, level = c.first + i % levels;
            ExpectUpload(outcome.uploads[i], c.surfaces == 6, face, i % levels, c.size >> level,
                         image.surfaces[face][level]);
        }
        const GLenum target = c.surfaces == 6 ? GL_TEXTURE_CUBE_MAP : GL_TEXTURE_2D;
        EXPECT_EQ(outcome.calls->Parameter(target, GL_TEXTURE_MIN_FILTER), GLenum(GL_LINEAR_MIPMAP_NEAREST));
        EXPECT_EQ(outcome.calls->Parameter(target, GL_TEXTURE_WRAP_T), GLenum(GL_REPEAT)) << "powers of two";
        EXPECT_EQ(outcome.texture.width, static_cast<int32_t>(c.size)) << "of level 0";
        EXPECT_EQ(outcome.texture.flags, c.surfaces == 6 ? QEX_TEXFLAG_CUBEMAP : 0u);
        EXPECT_EQ(header.numSurfaces, c.surfaces);
    }
}

// The header of 44 bytes ends before tag and surfaces.
Bytes OldFile(uint32_t type, uint32_t width, uint32_t height, uint32_t surfaces = 1) {
    Bytes file = File(type, width, height, 1, surfaces);
    PutWord(&file, kSize, 44);
    file.erase(file.begin() + 44, file.begin() + 52);
    return file;
}

TEST_F(PvrLoader, OldHeadersComeBackInTheCurrentForm) {
    for (const uint32_t surfaces : {1u, 6u}) {
        QexPVRHeader header = {};
        const Outcome outcome = TryMemory(OldFile(0x12, 2, 2, surfaces), 0, &header);
        EXPECT_EQ(outcome.result, 0);
        EXPECT_NE(
            outcome.out.find("WARNING:<QexTexture_LoadPVRFromMem> this is an old pvr format. You can use "
                             "PVRTexTool to update its header.\n"),
            std::string::npos);
        EXPECT_EQ(std::memcmp(&header.tag, "PVR!", 4), 0);
        EXPECT_EQ(header.numSurfaces, surfaces);
    }
}

TEST_F(PvrLoader, RefusesWithItsLineAndWithoutATexture) {
    // clang-format off
    const struct {
        const char* line;
        std::vector<std::pair<size_t, uint32_t>> words;  // offsets and what stands there
    } cases[] = {
        {"failed: not a valid pvr.", {{kSize, 51}}},
        {"failed: not a valid pvr.", {{kSize, 0x03525650}}},  // the newer container's first bytes
        {"texture should be untwiddled.", {{kFlags, 0x12 | 0x200}}},
        {"pixel type OGL_RGB_555 not supported.", {{kFlags, 0x14}}},
        {"Unable to load GL_BGRA texture as extension GL_IMG_texture_format_BGRA8888 is un", {{kFlags, 0x1A}}},
        {"texture should be untwiddled.", {{kFlags, 0x20D}, {kBits, 4}}},
        {"PVRTC of a size that is no power of two.", {{kFlags, 0x19}, {kBits, 4}, {kWidth, 12}}},
        {"pixel type not supported.", {{kFlags, 0x37}}},
        {"bits per pixel do not fit the pixel type.", {{kBits, 16}}},
        {"0 x 8 pixels are not possible here", {{kWidth, 0}}},
        {"8 x 2147483647 pixels are not possible here", {{kHeight, 0x7FFFFFFF}}},
        {"4 x 8 pixels are not possible here", {{kFlags, 0x1112}, {kWidth, 4}}},  // a cube that is none
        {"4294967295 mipmaps of 8 x 8 pixels, first level 0.", {{kMipmaps, UINT32_MAX}}},
        {"4 mipmaps of 8 x 8 pixels, first level 0.", {{kMipmaps, 4}}},
        {"the file is cut short: 340 bytes of pixels instead of", {{kSurfaces, 2}}},
        // Surfaces that would take no room at all.
        {"4294967295 surfaces of 0 bytes, whose levels take 340.", {{kSurfaces, UINT32_MAX}, {kDataSize, 0}}},
        {"a cube map of more than 6 faces.", {{kFlags, 0x1112}, {kMipmaps, 0}, {kDataSize, 16}, {kSurfaces, 7}}},
    };
    // clang-format on
    for (const auto& c : cases) {
        Bytes file = File(0x12, 8, 8, 4);
        for (const auto& [offset, word] : c.words) PutWord(&file, offset, word);
        ExpectRefused(file, TryFile, -1, std::string("ERROR:<QexTexture_LoadPVRFromMem> ") + c.line);
    }
    EXPECT_EQ(TryMemory(File(0x12, 8, 8, 4), 4, nullptr).result, -1) << "no fifth level";
}

TEST_F(PvrLoader, PvrtcIsDecoded) {
    for (const uint32_t flags : {0x0Cu, 0x0Du, 0x18u, 0x19u, 0x218u, 0x219u}) {
        SCOPED_TRACE(flags);
        const bool two = (flags & 0xFF) == 0x0C || (flags & 0xFF) == 0x18;
        // Two words a side are the least that there is: of all levels but the first.
        const pod::PvrImage image = PvrNoise(two ? pod::kPvrtc2 : pod::kPvrtc4, 32, 16, 6, 1);
        Bytes file = pod::WritePvr(image);
        PutWord(&file, kFlags, flags | 0x100);
        const Outcome outcome = TryFile(file);
        const std::string name = two ? "PVRTC2" : "PVRTC4";
        EXPECT_EQ(outcome.result, 0) << outcome.out;
        EXPECT_EQ(outcome.out.find("WARNING:<QexTexture_LoadPVRFromMem> " + name +
                                   " not supported. Converting to RGBA8888 instead.\n"),
                  0u);
        EXPECT_EQ(outcome.texture.format, QEX_TEXFMT_RGBA8888);
        EXPECT_EQ(outcome.texture.rowBytes, 32u * 4);
        ASSERT_EQ(outcome.uploads.size(), 6u);
        for (uint32_t level = 0; level < 6; ++level) {
            const uint32_t width = 32 >> level, height = std::max(16u >> level, 1u);
            Bytes decoded(size_t{width} * height * 4);
            QexDecompressPVRTC(image.surfaces[0][level].data(), two, static_cast<int32_t>(width),
                               static_cast<int32_t>(height), decoded.data());
            ExpectUpload(outcome.uploads[level], false, 0, level, width, decoded);
            EXPECT_EQ(outcome.uploads[level].format, GLenum(GL_RGBA));
        }
        const Outcome refused = Try(
            [&](QexTexture* t) { return QexTexture_LoadPVRFromMem(t, file.data(), nullptr, 0, 0, nullptr); });
        EXPECT_EQ(refused.result, -1);
        EXPECT_EQ(refused.out.find("ERROR:<QexTexture_LoadPVRFromMem> " + name + " not supported.\n"), 0u);
        EXPECT_EQ(refused.textures, 0u);
    }
}

// Four blocks of which all but the first reach beyond the picture, in either container.
TEST_F(PvrLoader, Etc1IsDecodedForAGLWithoutIt) {
    pod::PvrImage pvr = PvrNoise(pod::kPvrEtc1, 6, 5, 1, 1);
    Ktx ktx = Etc1Ktx();
    ktx.width = 6;
    ktx.height = 5;
    ktx.levels = {pvr.surfaces[0]};
    Bytes rgba(6 * 5 * 4), rgb;
    QexDecompressETC(pvr.surfaces[0][0].data(), 6, 5, rgba.data(), 0);
    for (size_t i = 0; i < rgba.size(); ++i)
        if (i % 4 != 3) rgb.push_back(rgba[i]);
    gltapSetInteger(GL_NUM_COMPRESSED_TEXTURE_FORMATS, 0);
    for (const Bytes& file : {pod::WritePvr(pvr), ktx.File()}) {
        const Outcome outcome = TryFile(file);
        ASSERT_EQ(outcome.uploads.size(), 1u) << outcome.out;
        ExpectUpload(outcome.uploads[0], false, 0, 0, 6, rgb);
        EXPECT_EQ(outcome.uploads[0].format, GLenum(GL_RGB));
    }
}

TEST_F(PvrLoader, NoCutAndNoWordIsTrusted) {
    for (const Bytes& file :
         {File(0x10, 8, 4, 4), File(0x36, 4, 4, 2, 6), OldFile(0x15, 5, 3), File(0x19, 8, 8)}) {
        for (const TryFunction load : {TryFile, &TrySized<QexTexture_LoadPVRFromMemSized>})
            ExpectEveryCutRefused(file, load, "ERROR:<QexTexture_LoadPVRFromMem> ");
    }
    ExpectNoWordTrusted(File(0x12, 4, 4, 3, 6), 0, 52, TryFile);
    for (const char* path : {"/nonexistent/x.pvr", "/"}) {
        const Outcome none =
            Try([&](QexTexture* t) { return QexTexture_LoadPVRFromFile(t, path, nullptr, 1, 0); });
        EXPECT_EQ(none.result, -1);
        EXPECT_EQ(none.textures, 0u);
    }
}

}  // namespace
