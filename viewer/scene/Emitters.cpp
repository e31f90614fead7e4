// Emitters run at a fixed rate and from a fixed seed.
#include "scene/Emitters.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <optional>
#include <vector>

#include "common/EngineOutput.h"
#include "common/TextureFiles.h"
#include "Paint.h"
#include "scene/Textures.h"

namespace {

constexpr int kUpdatesPerSecond = 60;
constexpr int kSpotSize = 64;  // pixels, as the engine's default texture

// Those that turn about the axis of sight need a mode that shows it.
int32_t ModeOf(const QexParticleEmitter& e) {
    const float turns[] = {e.rotationMin.z,
                           e.rotationMax.z,
                           e.angularVelocityMin.z,
                           e.angularVelocityMax.z,
                           e.angularAccelerationMin.z,
                           e.angularAccelerationMax.z};
    const bool turning =
        std::any_of(std::begin(turns), std::end(turns), [](float turn) { return turn != 0; });
    return turning ? QEX_BILLBOARD_YAW : QEX_BILLBOARD_SCREEN;
}

}  // namespace

QexParticleEmitter* LoadEmitterFile(const std::string& path, std::string* problem) {
    QexParticleEmitter* emitter = QexParticleEmitter_CreateFromBinFile(path.c_str());
    *problem = emitter ? "" : "is no emitter file";
    return emitter;
}

Emitters::~Emitters() {
    for (QexParticleEmitter* emitter : emitters_) QexParticleEmitter_Release(emitter);
    for (QexTexture* texture : textures_) {
        QexTexture_Release(texture);
        QexMemory_Free(texture);
    }
}

void Emitters::AddTexture(const Image& image, const std::string& name) {
    QexTexture* texture = NewPictureTexture(image, name);
    if (!texture) return;
    // It may have been resized for the GL; a particle's size is that of the picture.
    texture->width = image.width;
    texture->height = static_cast<uint32_t>(image.height);
    textures_.push_back(texture);
}

bool Emitters::Load(const EmitterScene& scene, EmitterLoader load, std::vector<std::string>* warnings,
                    std::string* problem) {
    for (const std::string& path : scene.textures) {
        Image image;
        if (!LoadImage(path, &image, problem)) {
            *problem = path + ": " + *problem;
            return false;
        }
        AddTexture(FlipRows(image), FileName(path));
    }
    if (scene.textures.empty())
        AddTexture({kSpotSize, kSpotSize, pod::Spot(kSpotSize, {255, 255, 255})}, "spot");
    for (const std::string& path : scene.emitters) {
        QexParticleEmitter* emitter = load(path, problem);
        if (!emitter) {
            *problem = path + ": " + *problem;
            return false;
        }
        if (!problem->empty()) warnings->push_back(path + ": " + *problem);
        emitters_.push_back(emitter);
        if (textures_.empty()) continue;
        size_t next = 0;
        for (int32_t i = 0; i < std::max(emitter->animationCount, 1); ++i)
            for (int32_t k = 0; k < std::max(emitter->animations[i].frameCount, 1); ++k)
                emitter->animations[i].frames[k] = textures_[next++ % textures_.size()];
    }
    problem->clear();
    // The engine seeds its numbers by the time of day when it draws the first one.
    GetRandomNumber();
    srand48(1);
    Run(scene.time);
    return true;
}

void Emitters::Run(float seconds) {
    time_ += seconds;
    // The engine writes a line a particle: they are let go of now and then.
    std::optional<EngineOutput> quiet;
    for (; updates_ < std::lround(time_ * kUpdatesPerSecond); ++updates_) {
        if (!quiet || updates_ % kUpdatesPerSecond == 0) quiet.emplace();
        for (QexParticleEmitter* emitter : emitters_)
            QexParticleEmitter_Update(emitter, 1.0f / kUpdatesPerSecond, nullptr);
    }
}

float Emitters::Time() const {
    return static_cast<float>(updates_) / kUpdatesPerSecond;
}

void Emitters::Draw(const QexCamera& camera) const {
    if (emitters_.empty()) return;
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetAlphaBlendModeSeparate(QEX_BLEND_ALPHA, QEX_BLEND_KEEP_ALPHA);
    for (QexParticleEmitter* emitter : emitters_) {
        const int32_t mode = ModeOf(*emitter);
        // Billboards that face the screen do not take a scale from the view matrix.
        const float* axis = camera.viewMatrix.m;
        const float scale = mode == QEX_BILLBOARD_SCREEN ? std::hypot(axis[0], axis[1], axis[2]) : 1;
        std::vector<QexVec3> scales;
        for (int32_t i = 0; i < emitter->particleCount; ++i) {
            QexParticleEx& particle = emitter->particles[i];
            if (particle.billboard) particle.billboard->mode = mode;
            scales.push_back(particle.scale);
            QexVec3_Scale(&particle.scale, &particle.scale, scale);
        }
        QexParticleEmitter_Draw(emitter, &camera);
        for (size_t i = 0; i < scales.size(); ++i) emitter->particles[i].scale = scales[i];
    }
}
