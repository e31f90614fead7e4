// qex texture writes what it was given, bit by bit where the format keeps it, and reads what others wrote.
#include "Headless.h"
#include "Qex.h"
#include "qex/QexCommandTest.h"
#include "support/Capture.h"
#include "texture/Command.h"
#include "texture/Container.h"

namespace {

Image Picture(int width, int height, const Bytes& rgba) {
    return {width, height, rgba, false};
}

Image Uniform(int size, const Bytes& rgba) {
    return Picture(size, size, Pixels(static_cast<uint32_t>(size), rgba));
}

class QexTextureVerb : public QexCommandTest {
  protected:
    // In this process; what it says is kept.
    int Convert(const std::string& in, const std::string& out, TextureOptions options = {}) {
        if (options.faces.empty()) options.input = in[0] == '/' ? in : Path(in);
        options.output = Path(out);
        testing::internal::CaptureStderr();
        const int status = RunTexture(options);
        said_ = testing::internal::GetCapturedStderr();
        return status;
    }
    void ExpectSaid(const std::string& part) const {
        EXPECT_TRUE(Contains(said_, part)) << said_;
        EXPECT_EQ(CountLines(said_), 1) << said_;
    }
    // A level and face of a texture by way of a PNG file.
    Bytes Read(const std::string& texture, int level = -1, int face = -1) {
        TextureOptions options;
        options.level = level;
        options.face = face;
        EXPECT_EQ(Convert(texture, "read.png", options), 0) << said_;
        return LoadPicture("read.png").pixels;
    }

    std::string said_;
};

TextureOptions Format(const std::string& name, bool mipmaps = false) {
    TextureOptions options;
    options.format = name;
    options.mipmaps = mipmaps;
    return options;
}

// The nearest of 2^bits values from 0 to 255.
uint8_t Nearest(uint8_t value, int bits) {
    const double most = (1 << bits) - 1;
    return bits ? static_cast<uint8_t>(std::lround(std::lround(value / 255.0 * most) / most * 255)) : 255;
}

Bytes Pvr(uint32_t type, uint32_t width, uint32_t height, uint32_t levels = 1, uint32_t surfaces = 1) {
    return pod::WritePvr(PvrNoise(type, width, height, levels, surfaces));
}

Bytes Part(const Bytes& bytes, size_t first, size_t count) {
    if (bytes.size() < first + count) return {};
    const auto begin = bytes.begin() + static_cast<long>(first);
    return Bytes(begin, begin + static_cast<long>(count));
}

}  // namespace

TEST_F(QexTextureVerb, KeepsTheBitsOfEachFormatAndTheEngineLoadsThem) {
    std::string error;
    const auto context = qex::HeadlessContext::Create(16, 16, &error);
    ASSERT_TRUE(context) << error;
    Image colours = Picture(5, 3, Noise(60)), greys = colours;
    for (size_t i = 0; i < 60; i += 4) greys.pixels[i + 1] = greys.pixels[i + 2] = greys.pixels[i];
    SavePicture("colours.png", colours);
    SavePicture("greys.png", greys);
    SavePicture("pixel.png", Uniform(1, {51, 102, 204, 136}));
    const struct {
        const char* format;
        int bits[4];
        bool grey, ktx;
        Bytes pixel;  // that one as it is stored; words have their low byte first
    } cases[] = {{"rgba8888", {8, 8, 8, 8}, false, true, {51, 102, 204, 136}},
                 {"rgb888", {8, 8, 8, 0}, false, true, {51, 102, 204}},
                 {"rgba4444", {4, 4, 4, 4}, false, true, {0xC8, 0x36}},
                 {"rgba5551", {5, 5, 5, 1}, false, true, {(12 & 3) << 6 | 25 << 1 | 1, 6 << 3 | 12 >> 2}},
                 {"rgb565", {5, 6, 5, 0}, false, true, {(25 & 7) << 5 | 25, 6 << 3 | 25 >> 3}},
                 {"l8", {8, 8, 8, 0}, true, false, {98}},  // 0.299, 0.587 and 0.114 of the three
                 {"la88", {8, 8, 8, 8}, true, false, {98, 136}},
                 {"a8", {0, 0, 0, 8}, false, false, {136}},
                 {"", {8, 8, 8, 8}, false, true, {51, 102, 204, 136}}};
    for (const auto& c : cases) {
        Bytes expected = c.grey ? greys.pixels : colours.pixels;
        for (size_t i = 0; i < 60; ++i) expected[i] = Nearest(expected[i], c.bits[i % 4]);
        ASSERT_EQ(Convert("pixel.png", "pixel.pvr", Format(c.format)), 0) << said_;
        EXPECT_EQ(Part(ReadBytes(Path("pixel.pvr")), 52, c.pixel.size()), c.pixel) << c.format;
        for (const std::string extension : {".pvr", ".ktx"}) {
            if (extension == ".ktx" && !c.ktx) continue;
            SCOPED_TRACE(c.format + extension);
            const std::string first = "first" + extension, second = "second" + extension;
            ASSERT_EQ(Convert(c.grey ? "greys.png" : "colours.png", first, Format(c.format)), 0) << said_;
            EXPECT_EQ(Contains(said_, "alpha is lost"), c.bits[3] == 0) << said_;
            EXPECT_EQ(Read(first), expected);
            ASSERT_EQ(Convert("read.png", second, Format(c.format)), 0) << said_;
            EXPECT_EQ(ReadBytes(Path(second)), ReadBytes(Path(first)));
            BothOutputs quiet;
            QexTexture texture = {};
            EXPECT_EQ(QexTexture_LoadPVRFromFile(&texture, Path(first).c_str(), nullptr, 1, 0), 0);
            QexTexture_Release(&texture);
        }
    }
}

// Red, green, blue over white, black, grey in 565, and the mean of the four at the left.
TEST_F(QexTextureVerb, WritesHeadersRowsAndLevels) {
    SavePicture("six.png", Picture(3, 2, {255, 0,   0,   255, 0, 255, 0, 255, 0,   0,   255, 255,
                                          255, 255, 255, 255, 0, 0,   0, 255, 128, 128, 128, 255}));
    const Bytes top = {0x00, 0xF8, 0xE0, 0x07, 0x1F, 0x00}, bottom = {0xFF, 0xFF, 0, 0, 0x10, 0x84};
    for (const bool flip : {false, true}) {
        TextureOptions options = Format("rgb565", true);
        options.flip = flip;
        const Bytes &first = flip ? bottom : top, &second = flip ? top : bottom;
        ASSERT_EQ(Convert("six.png", "a.pvr", options), 0);
        ExpectSaid("no powers of two");
        const Bytes pvr = ReadBytes(Path("a.pvr"));
        const uint32_t flags = flip ? 0x10113 : 0x113;
        const uint32_t pvrWords[13] = {52, 2, 3, 1, flags, 14, 16, 0, 0, 0, 0, 0x21525650, 1};
        ASSERT_EQ(pvr.size(), 52u + 12 + 2);
        for (size_t i = 0; i < 13; ++i) EXPECT_EQ(GetWord(pvr, 4 * i), pvrWords[i]) << i;
        EXPECT_EQ(Part(pvr, 52, 6), first);
        EXPECT_EQ(Part(pvr, 58, 6), second);
        // (510 + 2) / 4 = 128 of red and green, 64 of blue: 16, 32 and 8.
        EXPECT_EQ(Part(pvr, 64, 2), Bytes({0x08, 0x84}));

        ASSERT_EQ(Convert("six.png", "a.ktx", options), 0);
        const Bytes ktx = ReadBytes(Path("a.ktx"));
        const uint32_t ktxWords[13] = {0x04030201, 0x8363, 2, 0x1907, 0x8D62, 0x1907, 3, 2, 0, 0, 1, 2, 28};
        ASSERT_EQ(ktx.size(), 64u + 28 + 4 + 16 + 4 + 4);
        for (size_t i = 0; i < 13; ++i) EXPECT_EQ(GetWord(ktx, 12 + 4 * i), ktxWords[i]) << i;
        const std::string pair = std::string("\x17\0\0\0KTXorientation\0S=r,T=", 25) + (flip ? "u" : "d");
        EXPECT_EQ(Part(ktx, 64, 26), Bytes(pair.begin(), pair.end()));
        EXPECT_EQ(GetWord(ktx, 92), 16u);
        EXPECT_EQ(Part(ktx, 96, 6), first);
        EXPECT_EQ(Part(ktx, 104, 6), second);
        EXPECT_EQ(GetWord(ktx, 112), 4u);
        EXPECT_EQ(Part(ktx, 116, 2), Bytes({0x08, 0x84}));
        EXPECT_EQ(Read("a.ktx", 1), Bytes({132, 130, 66, 255}));
    }
}

TEST_F(QexTextureVerb, Etc1HasBlocksForEveryLevelAndAlphaBesideIt) {
    // Colours that ETC1 has nearly all of: a grey ramp, and a hue in the corner of the last, partial blocks.
    Image image = Picture(18, 5, Bytes(4 * 18 * 5, 255));
    for (size_t i = 0; i < 90; ++i) {
        std::fill_n(&image.pixels[4 * i], 3, static_cast<uint8_t>(i % 18 / 4 * 40 + i / 18 * 4));
        image.pixels[4 * i + 3] = i / 18 == 4 ? 51 : 204;
    }
    for (size_t x = 16; x < 18; ++x) image.pixels[4 * (72 + x)] = 230;
    SavePicture("a.png", image);
    for (const std::string extension : {".pvr", ".ktx"}) {
        ASSERT_EQ(Convert("a.png", "a" + extension, Format("etc1")), 0);
        EXPECT_EQ(said_, "");
        const Bytes colour = Read("a" + extension), alpha = Read("a_a" + extension);
        ASSERT_EQ(colour.size(), image.pixels.size());
        for (size_t i = 0; i < colour.size(); ++i) {
            EXPECT_NEAR(colour[i], i % 4 == 3 ? 255 : image.pixels[i], 12) << i;
            EXPECT_NEAR(alpha[i], i % 4 == 3 ? 255 : image.pixels[i / 4 * 4 + 3], 4) << i;
        }
    }
    EXPECT_EQ(ReadBytes(Path("a.pvr")).size(), 52u + 5 * 2 * 8);
    EXPECT_EQ(GetWord(ReadBytes(Path("a.ktx")), 28), 0x8D64u);
    // 16 x 4, 8 x 2, 4 x 1, 2 x 1, 1 x 1 in blocks; and an old alpha texture lies about.
    SavePicture("b.png", Picture(16, 4, Bytes(256, 255)));
    for (const auto& [name, header] : {std::pair("a.pvr", 52u), {"a.ktx", 64u + 28 + 5 * 4}}) {
        ASSERT_EQ(Convert("b.png", name, Format("etc1", true)), 0);
        ExpectSaid("taken for its alpha");
        EXPECT_EQ(ReadBytes(Path(name)).size(), header + (4 + 2 + 1 + 1 + 1) * 8);
        EXPECT_EQ(Read(name, 4), Bytes(4, 255));
    }
}

TEST_F(QexTextureVerb, CubeMapsKeepTheirFaces) {
    TextureOptions options;
    for (uint8_t face = 0; face < 6; ++face) {
        SavePicture(std::string(1, 'a' + face), Uniform(2, {face, 100, 200, 255}));
        options.faces.push_back(Path(std::string(1, 'a' + face)));
    }
    ASSERT_EQ(Convert("", "cube.pvr", options), 0) << said_;
    const Bytes pvr = ReadBytes(Path("cube.pvr"));
    EXPECT_EQ(GetWord(pvr, 16), 0x1015u);  // cube map of RGB 888
    EXPECT_EQ(GetWord(pvr, 48), 6u);
    ASSERT_EQ(pvr.size(), 52u + 6 * 12);
    ASSERT_EQ(Convert("cube.pvr", "cube.ktx"), 0) << said_;  // all faces go along
    const Bytes ktx = ReadBytes(Path("cube.ktx"));
    EXPECT_EQ(GetWord(ktx, 92), 16u);  // of one face, rows padded to 8 bytes
    EXPECT_EQ(ktx.size(), 96u + 6 * 16);
    for (uint8_t face = 0; face < 6; ++face) {
        EXPECT_EQ(Read("cube.pvr", -1, face), Pixels(2, {face, 100, 200, 255}));
        EXPECT_EQ(Read("cube.ktx", 0, face), Pixels(2, {face, 100, 200, 255}));
    }
    const auto refused = [&](const std::string& part) {
        EXPECT_EQ(Convert("", "no.pvr", options), 1);
        ExpectSaid(part);
        EXPECT_FALSE(std::filesystem::exists(Path("no.pvr")));
    };
    SavePicture("d", Uniform(4, {0, 0, 0, 255}));
    refused("/d: is not of the size of ");
    SavePicture("d", Picture(2, 1, Bytes(8)));
    refused("/d: is not square");
    options.faces[3] = Path("cube.ktx");
    refused("is a cube map already");
}

TEST_F(QexTextureVerb, ReadsWhatOthersWrite) {
    const auto holds = [&](const std::string& name, const Bytes& file, const Bytes& pixels, int face = -1) {
        WriteBytes(Path(name), file);
        EXPECT_EQ(Read(name, -1, face), pixels) << name;
    };
    const Bytes redBlue = {255, 0, 0, 255, 0, 0, 255, 255};
    Ktx ktx;
    ktx.type = GL_UNSIGNED_SHORT_5_6_5;
    ktx.format = ktx.internal = ktx.base = GL_RGB;
    ktx.width = 2;
    ktx.height = 1;
    ktx.levels = {{{0x00, 0xF8, 0x1F, 0x00}}};
    ktx.levelCount = 0;
    holds("swapped.ktx", SwappedFile(ktx), redBlue);

    pod::PvrImage image;
    image.type = pod::kPvrBgra8888;
    image.width = image.height = 1;
    image.surfaces.assign(6, {{1, 2, 3, 4}});
    image.surfaces[5][0] = {5, 6, 7, 8};
    Bytes pvr = pod::WritePvr(image);
    holds("cube.pvr", pvr, {7, 6, 5, 8}, 5);
    PutWord(&pvr, 20, 24);
    holds("all_faces_counted.pvr", pvr, {7, 6, 5, 8}, 5);
    PutWord(&pvr, 0, 44);
    pvr.erase(pvr.begin() + 44, pvr.begin() + 52);  // the tag and the number of surfaces
    holds("old_header.pvr", pvr, {7, 6, 5, 8}, 5);

    for (const bool two : {false, true}) {
        image = PvrNoise(two ? pod::kPvrtc2 : pod::kPvrtc4, 16, 8, 1, 1);
        Bytes pixels(16 * 8 * 4);
        QexDecompressPVRTC(image.surfaces[0][0].data(), two, 16, 8, pixels.data());
        holds("pvrtc.pvr", pod::WritePvr(image), pixels);
    }

    Bytes tga = TgaFile(1, 2, 24, {0, 0, 255, 255, 0, 0});  // the lower row comes first
    holds("a.tga", tga, {0, 0, 255, 255, 255, 0, 0, 255});
    tga.pop_back();
    WriteBytes(Path("cut.tga"), tga);
    EXPECT_EQ(Convert("cut.tga", "a.png"), 1);
}

// Cut anywhere and with any word changed, a file is refused in a line, or what is read of it can be decoded.
TEST_F(QexTextureVerb, DamagedTexturesAreRefusedOrDecoded) {
    for (const Bytes& file : {SoundKtx().File(), CubeKtx().File(), Etc1Ktx().File(),
                              Pvr(pod::kPvrRgb565, 4, 4, 3, 6), Pvr(pod::kPvrtc2, 16, 8)})
        for (size_t at = 0; at < std::min<size_t>(file.size(), 100); at += 4)
            for (const uint32_t value : {0u, 1u, 7u, 0x102u, 0xFFFFu, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
                Bytes changed = value ? file : Part(file, 0, at);
                if (value) PutWord(&changed, at, value);
                Texture texture;
                std::string error;
                const bool read = ReadTexture(changed, &texture, &error);
                EXPECT_TRUE(read ? value != 0 : !error.empty() && CountLines(error) == 0) << at << error;
                for (size_t level = 0; level < texture.levels.size(); ++level)
                    for (size_t face = 0; read && face < texture.faces; ++face)
                        EXPECT_FALSE(DecodeFace(texture, level, face).pixels.empty());
            }
}

TEST_F(QexTextureVerb, RefusesWhatDoesNotGoTogether) {
    SavePicture("a.png", Uniform(2, {1, 2, 3, 4}));
    WriteBytes(Path("new.pvr"), {'P', 'V', 'R', 3, 0, 0, 0, 0});
    WriteBytes(Path("r555.pvr"), Pvr(pod::kPvrRgb555, 4, 4));
    WriteBytes(Path("large.pvr"), Pvr(pod::kPvrAlpha8, 8193, 1));
    WriteBytes(Path("empty.pvr"), Pvr(pod::kPvrAlpha8, 0, 1));
    WriteBytes(Path("odd.pvr"), Pvr(pod::kPvrtc4, 12, 8));
    Bytes one = Pvr(pod::kPvrRgb888, 4, 4);
    WriteBytes(Path("one.pvr"), one);
    PutWord(&one, 8, 65536);  // its width
    WriteBytes(Path("vast.pvr"), one);
    const std::string a = Path("a.png"), pvr = Path("out.pvr"), png = Path("out.png");
    // clang-format off
    const struct {
        int status;
        std::vector<std::string> arguments;
        const char* part;
    } cases[] = {
        {2, {a}, "--output is required"},
        {2, {a, "-o", Path("out.dds")}, ".tga, .pvr or .ktx"},
        {2, {"-o", pvr}, "expected one picture or texture"},
        {2, {a, "-o", pvr, "--faces", a, a, a, a, a, a}, "expected one picture or texture"},
        {2, {"-o", pvr, "--faces", a, a, a, a, a}, "6 faces, not 5"},
        {2, {a, "-o", pvr, "--format", "rgb"}, "one of etc1, rgba8888, rgb888, rgba4444, rgba5551, rgb565, l8, la88, a8"},
        {2, {a, "-o", pvr, "--format", "pvrtc4"}, "PVRTC is read, not written"},
        {2, {a, "-o", Path("out.ktx"), "--format", "a8"}, "no a8 from KTX"},
        {2, {a, "-o", png, "--mipmaps"}, "a picture has no"},
        {2, {a, "-o", pvr, "--level", "0"}, "is a picture"},
        {2, {a, "-o", pvr, "--face", "6"}, "--face"},
        {1, {Path("gone.png"), "-o", pvr}, "gone.png: is not a file"},
        {1, {Path("one.pvr"), "-o", png, "--level", "1"}, "has no level 1, it has 1"},
        {1, {Path("one.pvr"), "-o", png, "--face", "1"}, "has no face 1, it has 1"},
        {1, {Path("new.pvr"), "-o", png}, "newer PVR container"},
        {1, {Path("r555.pvr"), "-o", png}, "RGB 555 pixels are not read"},
        {1, {Path("large.pvr"), "-o", png}, "8193 x 1 pixels; at most 8192"},
        {1, {Path("vast.pvr"), "-o", png}, "65536 x 4 pixels are too many"},
        {1, {Path("empty.pvr"), "-o", png}, "it has no pixels"},
        {1, {Path("odd.pvr"), "-o", png}, "powers of two"},
    };
    // clang-format on
    for (const auto& c : cases) {
        std::vector<std::string> arguments = {"texture"};
        arguments.insert(arguments.end(), c.arguments.begin(), c.arguments.end());
        ExpectRefused(arguments, c.status, c.part);
    }
    EXPECT_FALSE(std::filesystem::exists(pvr) || std::filesystem::exists(png));
    EXPECT_EQ(Run({"texture", a, "-o", pvr, "--flip"}).status, 0);
}
