// Files that others made; without them these tests are skipped.
#include <fstream>
#include <map>

#include "support/LoaderSupport.h"
#include "support/RealFiles.h"
#include "support/WalkScene.h"

namespace {

// What tables beside the textures say about each file, all columns in one.
std::map<std::string, std::string> Descriptions() {
    std::map<std::string, std::string> descriptions;
    for (const std::string& table : RealFilesIn("textures", ".tsv")) {
        std::ifstream stream(table);
        for (std::string line; std::getline(stream, line);)
            descriptions[line.substr(0, line.find('\t'))] = line;
    }
    return descriptions;
}

enum class Fate { Loads, Refused, Either };

// What is expected of a file from its description alone; Either where that depends on decoders and the
// driver.
Fate Expected(const std::string& text) {
    const struct {
        std::vector<const char*> parts;
        Fate fate;
    } rules[] = {
        {{"kind=PVRv3"}, Fate::Refused},
        {{"int0x8c"}, Fate::Either},
        // The old codes of PVRTC with the mark of twiddled data among them.
        {{"libktx_r8", "bpp=8 desc", "bpp=16 desc", "v2_mgl"}, Fate::Refused},
        {{"PVRTC", "pvrtc", "KTX1-BE", "big-endian"}, Fate::Loads},
        {{"kind=PVRv2", "fmt=type0x1401/fmt0x1908", "fmt=type0x1401/fmt0x1907", "int0x8d64", "bpp=24 desc"},
         Fate::Loads},
        {{"bpp=32 desc", "44-byte header", "payload lcg", "libktx-written", "rows tight"}, Fate::Loads},
        {{"rows padded", "unpadded row", "cube with 3 mips"}, Fate::Loads},
    };
    for (const auto& rule : rules)
        for (const char* part : rule.parts)
            if (text.find(part) != std::string::npos) return rule.fate;
    return Fate::Either;
}

class RealFiles : public LoaderTest {
  protected:
    void SetUp() override {
        if (RealFilesIn("scenes", ".pod").empty())
            GTEST_SKIP() << "QEX_REAL_FILES names no folder with scenes/*.pod";
        LoaderTest::SetUp();
    }
};

TEST_F(RealFiles, ScenesLoadAndCanBeUsed) {
    for (const std::string& path : RealFilesIn("scenes", ".pod")) {
        SCOPED_TRACE(path);
        std::ifstream stream(path, std::ios::binary);
        LoadedPod fromMemory(Bytes(std::istreambuf_iterator<char>(stream), {}));
        QexPODModel fromFile;
        {
            BothOutputs quiet;
            QexPODModel_ReadFromFile(&fromFile, path.c_str(), 0, 0, 0, 0);
        }
        EXPECT_NE(fromFile.runtime, nullptr);
        EXPECT_NE(fromMemory.scene.runtime, nullptr);
        if (fromFile.runtime && fromMemory.scene.runtime) {
            const SceneWalk a(&fromFile), b(&fromMemory.scene);
            EXPECT_EQ(a.fault, nullptr);
            EXPECT_EQ(a.sum, b.sum) << "from memory it is another scene";
            EXPECT_TRUE(std::isfinite(a.sum));
        }
        QexPODModel_Release(&fromFile);
    }
}

TEST_F(RealFiles, TexturesLoadAsTheirHeadersPromise) {
    const auto descriptions = Descriptions();
    std::vector<std::string> files;
    for (const char* extension : {".pvr", ".ktx", ".tga"})
        for (const std::string& file : RealFilesIn("textures", extension)) files.push_back(file);
    ASSERT_FALSE(files.empty());
    for (const std::string& path : files) {
        const std::string name = path.substr(path.rfind('/') + 1);
        const auto described = descriptions.find(name);
        const std::string description = described == descriptions.end() ? "" : described->second;
        SCOPED_TRACE(name + ": " + description);
        const bool tga = name.substr(name.size() - 4) == ".tga";
        const Outcome outcome = Try([&](QexTexture* t) {
            if (!tga) return QexTexture_LoadPVRFromFile(t, path.c_str(), nullptr, 1, 0);
            return QexTexture_CreateTGAFromFile(t, 0, 0, QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, path.c_str());
        });
        const bool loaded = outcome.texture.glName != 0;
        EXPECT_TRUE(tga || loaded == (outcome.result == 0)) << outcome.out;
        EXPECT_EQ(outcome.textures, loaded ? 1u : 0u);
        const Fate fate = Expected(name + description);
        EXPECT_TRUE(fate == Fate::Either || loaded == (fate == Fate::Loads)) << outcome.out;
        const size_t size = description.find(" w=");
        if (!loaded || size == std::string::npos) continue;
        EXPECT_EQ(outcome.texture.width, std::atoi(description.c_str() + size + 3));
        EXPECT_EQ(outcome.texture.height,
                  static_cast<uint32_t>(std::atoi(description.c_str() + description.find(" h=") + 3)));
    }
}

}  // namespace
