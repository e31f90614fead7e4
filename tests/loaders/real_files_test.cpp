// Files that others made. QEX_REAL_FILES names a folder with scenes/ and textures/; without it these are
// skipped.
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>

#include "LoaderSupport.h"
#include "support/WalkScene.h"

namespace {

namespace fs = std::filesystem;

std::vector<fs::path> Files(const fs::path& folder, const std::vector<std::string>& extensions) {
    std::vector<fs::path> files;
    if (fs::is_directory(folder))
        for (const auto& entry : fs::recursive_directory_iterator(folder))
            if (std::find(extensions.begin(), extensions.end(), entry.path().extension()) != extensions.end())
                files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    return files;
}

// What the folder's tables say about each file, all columns in one.
std::map<std::string, std::string> Descriptions(const fs::path& folder) {
    std::map<std::string, std::string> descriptions;
    for (const fs::path& table : Files(folder, {".tsv"})) {
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
        const char* folder = std::getenv("QEX_REAL_FILES");
        if (!folder || !*folder) GTEST_SKIP() << "QEX_REAL_FILES names no folder of real scenes and textures";
        folder_ = folder;
        LoaderTest::SetUp();
    }
    fs::path folder_;
};

TEST_F(RealFiles, ScenesLoadAndCanBeUsed) {
    const auto files = Files(folder_ / "scenes", {".pod"});
    ASSERT_FALSE(files.empty());
    for (const fs::path& path : files) {
        SCOPED_TRACE(path.filename());
        std::ifstream stream(path, std::ios::binary);
        const Bytes bytes((std::istreambuf_iterator<char>(stream)), {});
        QexPODModel fromFile, fromMemory;
        {
            BothOutputs quiet;
            QexPODModel_ReadFromFile(&fromFile, path.c_str(), 0, 0, 0, 0);
            const auto size = static_cast<uint32_t>(bytes.size());
            QexPODModel_ReadFromMemory(&fromMemory, bytes.data(), size, 0, 0, 0, 0);
        }
        EXPECT_NE(fromFile.runtime, nullptr);
        EXPECT_NE(fromMemory.runtime, nullptr);
        if (fromFile.runtime && fromMemory.runtime) {
            const SceneWalk a(&fromFile), b(&fromMemory);
            EXPECT_EQ(a.fault, nullptr);
            EXPECT_EQ(a.sum, b.sum) << "from memory it is another scene";
            EXPECT_TRUE(std::isfinite(a.sum));
        }
        QexPODModel_Release(&fromFile);
        QexPODModel_Release(&fromMemory);
    }
}

TEST_F(RealFiles, TexturesLoadAsTheirHeadersPromise) {
    const auto files = Files(folder_ / "textures", {".pvr", ".ktx", ".tga"});
    const auto descriptions = Descriptions(folder_ / "textures");
    ASSERT_FALSE(files.empty());
    for (const fs::path& path : files) {
        const auto described = descriptions.find(path.filename());
        const std::string description = described == descriptions.end() ? "" : described->second;
        SCOPED_TRACE(path.filename().string() + ": " + description);
        const bool tga = path.extension() == ".tga";
        const Outcome outcome = Try([&](QexTexture* t) {
            if (!tga) return QexTexture_LoadPVRFromFile(t, path.c_str(), nullptr, 1, 0);
            return QexTexture_CreateTGAFromFile(t, 0, 0, QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, path.c_str());
        });
        const bool loaded = outcome.texture.glName != 0;
        EXPECT_TRUE(tga || loaded == (outcome.result == 0)) << outcome.out;
        EXPECT_EQ(outcome.textures, loaded ? 1u : 0u);
        const Fate fate = Expected(path.filename().string() + description);
        EXPECT_TRUE(fate == Fate::Either || loaded == (fate == Fate::Loads)) << outcome.out;
        const size_t size = description.find(" w=");
        if (!loaded || size == std::string::npos) continue;
        EXPECT_EQ(outcome.texture.width, std::atoi(description.c_str() + size + 3));
        EXPECT_EQ(outcome.texture.height,
                  static_cast<uint32_t>(std::atoi(description.c_str() + description.find(" h=") + 3)));
    }
}

}  // namespace
