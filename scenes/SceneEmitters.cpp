// The particle emitters of the samples: a fountain, a fire and its smoke.
#include <cstdlib>

#include "Qex.h"
#include "SceneFiles.h"

namespace {

void SetBetween(QexVec3* least, QexVec3* most, const QexVec3& first, const QexVec3& second) {
    *least = first;
    *most = second;
}

// Drops that fall back.
void SetFountain(QexParticleEmitter* e) {
    e->position = {-1.3f, 0, 0};
    e->emissionRate[0] = e->emissionRate[1] = 2.5f;  // particles an update
    e->lifetime[0] = 1.3f;
    e->lifetime[1] = 1.5f;
    SetBetween(&e->scaleMin, &e->scaleMax, {0.004f, 0.004f, 1}, {0.007f, 0.007f, 1});
    SetBetween(&e->velocityMin, &e->velocityMax, {-0.7f, 4, -0.7f}, {0.7f, 4.6f, 0.7f});
    SetBetween(&e->accelerationMin, &e->accelerationMax, {0, -6, 0}, {0, -6, 0});
}

// Flames that go through the frames of an animation and shrink.
void SetFire(QexParticleEmitter* e) {
    e->position = {1.3f, 0, 0};
    e->positionSpread = {0.25f, 0.05f, 0.25f};
    e->emissionRate[0] = 1;
    e->emissionRate[1] = 1.5f;
    e->lifetime[0] = 0.6f;
    e->lifetime[1] = 1;
    e->startOpacity = 0.8f;
    e->endOpacity = 0.1f;
    e->scaleFactor = 0.99f;  // at every update
    SetBetween(&e->scaleMin, &e->scaleMax, {0.015f, 0.015f, 1}, {0.02f, 0.02f, 1});
    SetBetween(&e->velocityMin, &e->velocityMax, {-0.2f, 0.8f, -0.2f}, {0.2f, 1.4f, 0.2f});
    SetBetween(&e->accelerationMin, &e->accelerationMax, {0, 0.5f, 0}, {0, 0.5f, 0});
    e->animations[0].frameCount = 3;
    e->animations[0].frameDuration = 0.25f;
}

// Puffs that grow, turn and fade.
void SetSmoke(QexParticleEmitter* e) {
    e->position = {1.3f, 0.9f, 0};
    e->positionSpread = {0.15f, 0, 0.15f};
    e->emissionRate[0] = e->emissionRate[1] = 0.3f;
    e->lifetime[0] = 2;
    e->lifetime[1] = 2.5f;
    e->startOpacity = 0.5f;
    e->scaleFactor = 1.006f;
    SetBetween(&e->scaleMin, &e->scaleMax, {0.012f, 0.012f, 1}, {0.016f, 0.016f, 1});
    SetBetween(&e->angularVelocityMin, &e->angularVelocityMax, {0, 0, -40}, {0, 0, 40});
    SetBetween(&e->velocityMin, &e->velocityMax, {0.1f, 0.7f, -0.1f}, {0.3f, 0.9f, 0.1f});
    SetBetween(&e->accelerationMin, &e->accelerationMax, {0.2f, 0, 0}, {0.2f, 0, 0});
}

}  // namespace

void WriteEmitters(const std::string& folder) {
    const struct {
        const char* name;
        void (*set)(QexParticleEmitter*);
    } emitters[] = {
        {"fountain.emitter", SetFountain}, {"fire.emitter", SetFire}, {"smoke.emitter", SetSmoke}};
    for (const auto& emitter : emitters) {
        QexParticleEmitter* e = QexParticleEmitter_Create();
        if (!e) exit(1);
        emitter.set(e);
        e->currentRate = e->emissionRate[0];  // not one drawn by the time of the build
        if (QexParticleEmitter_WriteToBinFile(e, (folder + emitter.name).c_str()) != 0) exit(1);
        QexParticleEmitter_Release(e);
    }
}
