// For the tests of the texture loaders: a context under the GL tap, what was uploaded, and small files.
#pragma once

#include <GLES2/gl2.h>

#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/RenderFixture.h"

struct Upload {
    GLenum target;
    GLint level;
    GLenum format;  // the internal format; with uncompressed pixels the format is the same, or `mismatch`
    GLenum type;    // 0 when compressed
    GLsizei width, height;
    int64_t alignment;
    Bytes data;
    bool mismatch;
};

// The GL calls of one piece of code.
struct Recorded : GLCalls {
    using GLCalls::GLCalls;

    std::vector<Upload> Uploads() const {
        std::vector<Upload> uploads;
        int64_t alignment = 4;
        for (const gltapCall* call : Of({"glPixelStorei", "glCompressedTexImage2D", "glTexImage2D"})) {
            const auto argument = [&](int k) { return static_cast<GLenum>(call->argument[k].i); };
            const std::string name = gltapFunctionName(call->function);
            if (name == "glPixelStorei") {
                if (argument(0) == GL_UNPACK_ALIGNMENT) alignment = call->argument[1].i;
                continue;
            }
            const bool compressed = name == "glCompressedTexImage2D";
            const auto* data = static_cast<const uint8_t*>(call->data);
            uploads.push_back(
                {argument(0), static_cast<GLint>(argument(1)), argument(2), compressed ? 0 : argument(7),
                 static_cast<GLsizei>(argument(3)), static_cast<GLsizei>(argument(4)), alignment,
                 Bytes(data, data + call->dataSize), !compressed && argument(6) != argument(2)});
        }
        return uploads;
    }

    // The last value given to a texture parameter of a target; 0 when there was none.
    GLenum Parameter(GLenum target, GLenum parameter) const {
        GLenum value = 0;
        for (const gltapCall* call : Of({"glTexParameteri"}))
            if (static_cast<GLenum>(call->argument[0].i) == target &&
                static_cast<GLenum>(call->argument[1].i) == parameter)
                value = static_cast<GLenum>(call->argument[2].i);
        return value;
    }
};

class LoaderTest : public ContextTest {
  protected:
    void TearDown() override {
        EXPECT_EQ(glGetError(), GLenum(GL_NO_ERROR));
        ContextTest::TearDown();
    }
    static size_t LiveTextures() { return gltapLiveObjects(GLTAP_TEXTURE, nullptr, 0); }
};

// What a loader returned, printed, called and left behind.
struct Outcome {
    int32_t result;
    std::string out;
    size_t textures;
    QexTexture texture;  // as it was before it was released
    std::shared_ptr<Recorded> calls;
    std::vector<Upload> uploads;
};

// Calls a loader with a record, a cleared one by default, and releases what it made.
inline Outcome Try(const std::function<int32_t(QexTexture*)>& load, const QexTexture& before = {}) {
    Outcome outcome = {};
    outcome.texture = before;
    {
        BothOutputs outputs;
        outcome.calls = std::make_shared<Recorded>([&] { outcome.result = load(&outcome.texture); });
        outcome.out = outputs.Out() + outputs.Errors();
    }
    outcome.uploads = outcome.calls->Uploads();
    outcome.textures = gltapLiveObjects(GLTAP_TEXTURE, nullptr, 0);
    QexTexture made = outcome.texture;
    if (made.glName) QexTexture_Release(&made);
    return outcome;
}

// Loads a file of the given bytes.
using TryFunction = Outcome (*)(const Bytes& file);

// The same by its name, or from a block of just its size, with one of the loaders of PVR and KTX files.
template <int32_t (*kLoad)(QexTexture*, const char*, QexPVRHeader*, int32_t, uint32_t)>
Outcome TryFile(const Bytes& file) {
    const MemoryFile memory(file);
    return Try([&](QexTexture* t) { return kLoad(t, memory.Path(), nullptr, 1, 0); });
}
template <int32_t (*kLoad)(QexTexture*, const void*, uint32_t, QexPVRHeader*, int32_t, uint32_t, const void*)>
Outcome TrySized(const Bytes& file) {
    const std::unique_ptr<uint8_t[]> block(new uint8_t[file.size()]);
    std::copy(file.begin(), file.end(), block.get());
    const auto size = static_cast<uint32_t>(file.size());
    return Try([&](QexTexture* t) { return kLoad(t, block.get(), size, nullptr, 1, 0, nullptr); });
}

// A file that is refused with a result and a line, without a texture.
inline void ExpectRefused(const Bytes& file, TryFunction tryFile, int32_t result, const std::string& line) {
    const Outcome outcome = tryFile(file);
    EXPECT_EQ(outcome.result, result) << line;
    EXPECT_EQ(outcome.textures, 0u) << line;
    EXPECT_EQ(outcome.texture.glName, 0u) << line;
    EXPECT_NE(outcome.out.find(line), std::string::npos) << line << "\n" << outcome.out;
    EXPECT_EQ(outcome.out.empty(), line.empty()) << outcome.out;
}

// No beginning of a file is a texture, and each is refused with the line.
inline void ExpectEveryCutRefused(const Bytes& file, TryFunction tryFile, const std::string& line) {
    for (size_t size = 0; size < file.size(); ++size) {
        const Outcome outcome = tryFile(Bytes(file.begin(), file.begin() + static_cast<long>(size)));
        ASSERT_EQ(outcome.texture.glName, 0u) << size;
        ASSERT_EQ(outcome.textures, 0u) << size;
        ASSERT_NE(outcome.out.find(line), std::string::npos) << size << outcome.out;
    }
    EXPECT_NE(tryFile(file).texture.glName, 0u);
}

// Whatever a word says, there is a texture or nothing. The tap copies what GL would read, so a sanitizer sees
// uploads from beyond the file.
inline void ExpectNoWordTrusted(const Bytes& file, size_t begin, size_t end, TryFunction tryFile) {
    for (size_t offset = begin; offset < end; offset += 4)
        for (const uint32_t word :
             {UINT32_MAX, 0x7FFFFFFFu, 0u, GetWord(file, offset) + 1, GetWord(file, offset) - 1}) {
            Bytes changed = file;
            PutWord(&changed, offset, word);
            const Outcome outcome = tryFile(changed);
            EXPECT_EQ(outcome.textures, outcome.result == 0 ? 1u : 0u) << offset << " is " << word;
        }
}

// The upload of a level of a face with its bytes.
inline void ExpectUpload(const Upload& upload, bool cube, size_t face, size_t level, uint32_t width,
                         const Bytes& data) {
    EXPECT_EQ(upload.target, cube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : GLenum(GL_TEXTURE_2D));
    EXPECT_EQ(upload.level, static_cast<GLint>(level));
    EXPECT_EQ(upload.width, static_cast<GLsizei>(width));
    EXPECT_EQ(upload.data, data);
}

// A single upload in a format, and what the record says of it: bytes a pixel, and a code.
inline void ExpectFormat(const Outcome& outcome, GLenum format, GLenum type, int64_t alignment,
                         uint32_t bytesPerPixel, uint32_t code) {
    ASSERT_EQ(outcome.result, 0);
    ASSERT_EQ(outcome.uploads.size(), 1u);
    const Upload& u = outcome.uploads[0];
    EXPECT_EQ(u.format, format);
    EXPECT_EQ(u.type, type);
    EXPECT_FALSE(u.mismatch);
    EXPECT_EQ(u.alignment, alignment);
    EXPECT_EQ(outcome.texture.bytesPerPixel, bytesPerPixel);
    EXPECT_EQ(outcome.texture.format, code);
    EXPECT_EQ(outcome.texture.rowBytes, bytesPerPixel * static_cast<uint32_t>(u.width));
    EXPECT_EQ(outcome.textures, 1u);
}
