// Small files to convert, and the result read back.
#pragma once

#include <array>
#include <stdexcept>

#include "convert/Command.h"
#include "support/FolderTest.h"
#include "support/PodScenes.h"
#include "support/WalkScene.h"

using Pixel = std::array<uint8_t, 4>;  // red, green, blue, alpha

class ConvertTest : public FolderTest {
  protected:
    // The first row is the top one.
    void WriteTga(const std::string& name, int width, int height, const std::vector<Pixel>& pixels) const {
        Bytes file = {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, uint8_t(width), 0, uint8_t(height), 0, 32, 0x28};
        for (const Pixel& p : pixels) file.insert(file.end(), {p[2], p[1], p[0], p[3]});
        WriteBytes(Path(name), file);
    }

    ConvertOptions Options(const std::string& input) const {
        ConvertOptions options;
        options.input = input;
        options.output = Path("out.pod");
        options.textureFormat = TextureFormat::kRgba8888;
        options.quiet = true;
        return options;
    }
    int Run(const ConvertOptions& options) {
        testing::internal::CaptureStderr();
        const int status = RunConvert(options);
        said_ = testing::internal::GetCapturedStderr();
        return status;
    }
    // The scene in out.pod, which lives until the next one is read.
    QexPODModel& Read() {
        pod_ = std::make_unique<LoadedPod>(ReadBytes(Path("out.pod")));
        if (pod_->result) throw std::runtime_error(pod_->log);
        return pod_->scene;
    }
    // Converts to out.pod, keeps what was said on standard error and reads the scene.
    QexPODModel& Convert(const std::string& input, TextureFormat format = TextureFormat::kRgba8888,
                         int fps = 30, const std::string& clip = "") {
        ConvertOptions options = Options(input);
        options.textureFormat = format;
        options.fps = fps;
        options.clip = clip;
        EXPECT_EQ(Run(options), 0) << said_;
        return Read();
    }
    // A quad in the z = 0 plane with the whole picture on it, in the material "m" of a material file.
    QexPODModel& ConvertQuad(const std::string& material, TextureFormat format = TextureFormat::kRgba8888) {
        WriteText(Path("q.obj"),
                  "mtllib m.mtl\nusemtl m\nv -1 -1 0\nv 1 -1 0\nv 1 1 0\nv -1 1 0\n"
                  "vt 0 0\nvt 1 0\nvt 1 1\nvt 0 1\nvn 0 0 1\nf 1/1/1 2/2/1 3/3/1 4/4/1\n");
        WriteText(Path("m.mtl"), "newmtl m\n" + material);
        return Convert(Path("q.obj"), format);
    }
    // The pixels of a PVR file from its n-th byte on.
    Bytes PvrBytes(const std::string& name, size_t first, size_t count) const {
        const Bytes file = ReadBytes(Path(name));
        if (file.size() < 52 + first + count) return {};
        const auto begin = file.begin() + static_cast<long>(52 + first);
        return Bytes(begin, begin + static_cast<long>(count));
    }

    std::string said_;
    std::unique_ptr<LoadedPod> pod_;
};
