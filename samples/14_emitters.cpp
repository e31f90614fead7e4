// Sample 14: a fountain, a fire and its smoke, each an emitter. Their settings are written to files and read
// back, as an application ships them; textures are not in the files and are set afterwards.
#define QEX_UNPREFIXED_NAMES

#include <cstdlib>

#include "Sample.h"
#include "Silence.h"

static constexpr float kStep = 1 / 60.0f;

static void SetBetween(QexVec3* least, QexVec3* most, const QexVec3& first, const QexVec3& second) {
    *least = first;
    *most = second;
}

// Drops that fall back.
static void SetFountain(QexParticleEmitter* e) {
    e->position = {-1.3f, 0, 0};
    e->emissionRate[0] = e->emissionRate[1] = 2.5f;  // particles an update
    e->lifetime[0] = 1.3f;
    e->lifetime[1] = 1.5f;
    SetBetween(&e->scaleMin, &e->scaleMax, {0.004f, 0.004f, 1}, {0.007f, 0.007f, 1});
    SetBetween(&e->velocityMin, &e->velocityMax, {-0.7f, 4, -0.7f}, {0.7f, 4.6f, 0.7f});
    SetBetween(&e->accelerationMin, &e->accelerationMax, {0, -6, 0}, {0, -6, 0});
}

// Flames that go through the frames of an animation and shrink.
static void SetFire(QexParticleEmitter* e) {
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
static void SetSmoke(QexParticleEmitter* e) {
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

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleTexture drop(32, 32, scenes::Spot(32, {153, 204, 255})),
        smoke(32, 32, scenes::Spot(32, {140, 140, 153}));
    SampleTexture flames[] = {{32, 32, scenes::Spot(32, {255, 204, 77})},
                              {32, 32, scenes::Spot(32, {255, 115, 26})},
                              {32, 32, scenes::Spot(32, {179, 31, 13})}};
    // Modes 1: over what is there; 2: added to it.
    const struct {
        const char* name;
        void (*set)(QexParticleEmitter*);
        SampleTexture* frames;
        int32_t frameCount;
        int32_t blending;
    } kinds[] = {{"smoke", SetSmoke, &smoke, 1, 1},
                 {"fire", SetFire, flames, 3, 2},
                 {"fountain", SetFountain, &drop, 1, 1}};

    // The engine seeds its random numbers by the time when it draws the first one; this picture is always the
    // same.
    GetRandomNumber();
    srand48(1);
    sample.Clear(0.1f, 0.12f, 0.16f);
    const QexCamera camera = sample.Camera({0, 1.6f, 5.5f}, {0, 1.1f, 0});
    for (const auto& kind : kinds) {
        const std::string path = sample.Beside(std::string(kind.name) + ".emitter");
        QexParticleEmitter* made = QexParticleEmitter_Create();
        if (!made) return 1;
        kind.set(made);
        const int32_t written = QexParticleEmitter_WriteToBinFile(made, path.c_str());
        QexParticleEmitter_Release(made);
        QexParticleEmitter* emitter = QexParticleEmitter_CreateFromBinFile(path.c_str());
        if (written != 0 || !emitter) {
            fprintf(stderr, "%s: cannot be written and read back\n", path.c_str());
            return 1;
        }
        for (int32_t i = 0; i < kind.frameCount; ++i)
            emitter->animations[0].frames[i] = &kind.frames[i].texture;

        // Two seconds; an application updates and draws once a frame. The log has a line for each particle.
        {
            const Silence silence;
            for (float time = 0; time < 2; time += kStep) QexParticleEmitter_Update(emitter, kStep, nullptr);
        }
        // Upright, turned to the eye, and rotated by what the particles have of it.
        for (int32_t i = 0; i < emitter->particleCount; ++i)
            emitter->particles[i].billboard->mode = QEX_BILLBOARD_YAW;
        QexRenderer_SetAlphaBlendMode(kind.blending);
        QexParticleEmitter_Draw(emitter, &camera);
        QexParticleEmitter_Release(emitter);
    }
    return sample.Finish();
}
