// The engine while it lives, with a model of a scene built in code, and without its progress lines.
#pragma once

#include <vector>

#include "Qex.h"
#include "Scenes.h"
#include "Silence.h"

class BenchEngine {
  public:
    BenchEngine(int width, int height) {
        const Silence silence;
        QexEngineConfig config = {};
        config.width = width;
        config.height = height;
        QexEngine_Init(&context, sizeof config, &config);
    }
    BenchEngine(int width, int height, const pod::Scene& scene) : BenchEngine(width, height) {
        const Silence silence;
        file_ = pod::WritePod(scene);
        QexModel_Create(&model);
        QexModel_LoadContentFromCache(&model, file_.data(), static_cast<uint32_t>(file_.size()), nullptr);
    }
    ~BenchEngine() {
        const Silence silence;
        if (!file_.empty()) QexModel_Unload(&model);
        QexEngine_Shutdown(&context);
    }
    BenchEngine(const BenchEngine&) = delete;
    BenchEngine& operator=(const BenchEngine&) = delete;

    static QexCamera Camera(const QexVec3& eye, const QexVec3& target, float aspect) {
        QexCamera camera;
        QexCamera_Create(&camera, 0);
        QexCamera_LookAt(&camera, &eye, &target, nullptr);
        QexCamera_Project(&camera, 0.785f, aspect, 1, 100);
        return camera;
    }

    QexRuntimeContext context;
    QexModel model;

  private:
    std::vector<uint8_t> file_;
};
