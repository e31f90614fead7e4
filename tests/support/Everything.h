// A program that uses everything of the engine that holds GL objects or memory, for tests that disturb it.
// What cannot be had is left out: each part is drawn if it is there.
#pragma once

#include <string>

#include "support/RenderScenes.h"

class Everything {
  public:
    // Writes the files that it loads.
    explicit Everything(const std::string& folder);
    Everything(const Everything&) = delete;
    Everything& operator=(const Everything&) = delete;

    // Starts the engine and makes everything; whether all is there.
    bool Load();
    // One frame; always the same one.
    void Draw();
    // Gives everything back and ends the engine.
    void Release();

  private:
    bool LoadTextures();
    bool LoadModels();
    bool LoadEffects();
    void DrawScene(const QexCamera& camera);

    static int32_t DrawForEffect(QexRuntimeContext*, void*, void*, void*, QexShaderModule* still,
                                 QexShaderModule* skinned, const float* colour);

    std::string folder_;
    std::vector<uint8_t> worm_, wood_, sky_, tga_;
    QexRuntimeContext runtime_;
    QexCamera camera_;
    QexLightSet lights_;
    bool started_ = false;
    QexNameCache cache_;
    QexTexture inMemory_, painted_, skyCube_;
    QexModel fromFile_, fromCache_, fromMesh_;
    QexShaderModule* lit_ = nullptr;
    QexShaderModule* shadowed_ = nullptr;
    QexShadowInfo* shadow_ = nullptr;
    QexBillboard* billboard_ = nullptr;
    QexParticleEmitter* emitter_ = nullptr;
    QexParticleSet particles_;
    QexRenderTarget target_;
    QexShaderProgram program_;
    QexSkyBox box_;
    bool effects_ = false, hasSky_ = false, hasTarget_ = false, hasProgram_ = false;
};
