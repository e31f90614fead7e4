// What samples need and are not about: a GL context without a window, the engine on it, scenes and textures
// made in memory, the picture at the end. Sample 1 does all of it by itself.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <GLES2/gl2.h>

#include "Headless.h"
#include "ImageFile.h"
#include "Qex.h"
#include "Scenes.h"

class Sample {
  public:
    static constexpr int kWidth = 320, kHeight = 240;

    // The first argument is the picture's file.
    Sample(int argc, char** argv) : output_(argc > 1 ? argv[1] : "sample.png") {
        std::string error;
        gl_ = qex::HeadlessContext::Create(kWidth, kHeight, &error);
        QexEngineConfig config = {};
        config.width = kWidth;
        config.height = kHeight;
        started_ = gl_ && QexEngine_Init(&engine, sizeof config, &config) == 0;
        if (!started_) fprintf(stderr, "the sample cannot start: %s\n", error.c_str());
    }
    ~Sample() {
        if (started_) QexEngine_Shutdown(&engine);
    }
    Sample(const Sample&) = delete;
    Sample& operator=(const Sample&) = delete;

    bool Started() const { return started_; }

    QexCamera Camera(const QexVec3& eye, const QexVec3& target) const {
        QexCamera camera;
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 0.8f, static_cast<float>(kWidth) / kHeight, 0.1f, 100);
        return camera;
    }

    // An empty picture, depth and stencil, and the settings that most scenes want.
    void Clear(float r = 0.25f, float g = 0.3f, float b = 0.4f) const {
        glViewport(0, 0, kWidth, kHeight);
        glDisable(GL_SCISSOR_TEST);
        QexRenderer_SetZWrite(1);
        QexRenderer_SetZTestFunc(3);
        QexRenderer_SetAlphaBlendMode(1);
        glClearColor(r, g, b, 1);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
    }

    // A file of that name in the picture's directory.
    std::string Beside(const std::string& name) const {
        const size_t slash = output_.rfind('/');
        return slash == std::string::npos ? name : output_.substr(0, slash + 1) + name;
    }

    // Saves what was drawn; the result is the program's exit status.
    int Finish() const {
        std::vector<uint8_t> pixels = gl_->ReadPixels();
        for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;  // what blending left in alpha
        std::string error;
        if (SavePng(output_, kWidth, kHeight, pixels.data(), &error)) return 0;
        fprintf(stderr, "%s: %s\n", output_.c_str(), error.c_str());
        return 1;
    }

    QexRuntimeContext engine = {};

  private:
    std::string output_;
    std::unique_ptr<qex::HeadlessContext> gl_;
    bool started_ = false;
};

// A texture painted in code: paint(s, t) is a pixel's colour, red, green, blue and alpha from 0 to 1, with s
// counted from the left and t from the lower edge, 0 to 1. An application loads one from a file instead.
class SampleTexture {
  public:
    template <class Paint>
    SampleTexture(int width, int height, Paint paint) {
        for (int y = 0; y < height; ++y)
            for (int x = 0; x < width; ++x) {
                const QexVec4 colour = paint((static_cast<float>(x) + 0.5f) / static_cast<float>(width),
                                             (static_cast<float>(y) + 0.5f) / static_cast<float>(height));
                for (const float channel : {colour.x, colour.y, colour.z, colour.w})
                    pixels_.push_back(static_cast<uint8_t>(255 * std::clamp(channel, 0.0f, 1.0f) + 0.5f));
            }
        Create(width, height);
    }
    SampleTexture(int width, int height, std::vector<uint8_t> rgba) : pixels_(std::move(rgba)) {
        Create(width, height);
    }
    ~SampleTexture() { QexTexture_Release(&texture); }
    SampleTexture(const SampleTexture&) = delete;
    SampleTexture& operator=(const SampleTexture&) = delete;

    QexTexture texture;

  private:
    void Create(int width, int height) {
        QexTexture_CreateFromPixels(&texture, width, height, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_LINEAR,
                                    QEX_WRAP_CLAMP, pixels_.data());
    }

    std::vector<uint8_t> pixels_;
};

// A model of a scene built in code. An application calls QexModel_LoadContent with a directory and a file
// instead; from memory, the bytes stay as long as the model.
class SampleModel {
  public:
    explicit SampleModel(const pod::Scene& scene) : file_(pod::WritePod(scene)) {
        QexModel_Create(&model);
        QexModel_LoadContentFromCache(&model, file_.data(), static_cast<uint32_t>(file_.size()), nullptr);
    }
    ~SampleModel() { QexModel_Unload(&model); }
    SampleModel(const SampleModel&) = delete;
    SampleModel& operator=(const SampleModel&) = delete;

    // How much diffuse and ambient light all materials give back.
    void SetLightColours(float diffuse, float ambient) {
        for (uint32_t i = 0; i < model.scene.materialCount; ++i) {
            for (float& value : model.scene.materials[i].diffuse) value = diffuse;
            for (float& value : model.scene.materials[i].ambient) value = ambient;
        }
    }

    // Makes a texture of pixels, the lowest row first, for a material; the model frees it.
    void SetTexture(uint32_t material, int width, int height, const uint8_t* rgba) {
        QexTexture* texture = static_cast<QexTexture*>(QexMemory_Alloc(sizeof *texture));
        if (!texture) return;
        *texture = {};
        QexTexture_CreateFromPixels(texture, width, height, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_LINEAR,
                                    QEX_WRAP_REPEAT, const_cast<uint8_t*>(rgba));
        texture->pixels = nullptr;  // they stay the caller's
        QexModel_ReplaceTextureByIdx(&model, texture, material);
    }
    // Squares of two colours, 2 x 2 to a repetition of the texture.
    void SetChequers(uint32_t material, uint32_t first, uint32_t second) {
        constexpr int kSize = 64;
        std::vector<uint8_t> pixels;
        for (int y = 0; y < kSize; ++y)
            for (int x = 0; x < kSize; ++x) {
                const uint32_t colour = (x < kSize / 2) == (y < kSize / 2) ? first : second;
                for (const int shift : {16, 8, 0}) pixels.push_back(static_cast<uint8_t>(colour >> shift));
                pixels.push_back(255);
            }
        SetTexture(material, kSize, kSize, pixels.data());
    }

    QexModel model;

  private:
    std::vector<uint8_t> file_;
};
