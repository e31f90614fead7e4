// Sample 15: a firework from a particle set. The vertex shader moves all sparks of a rocket; when they have
// burnt out the set says so, and the next rocket goes off in another place and colour.
#include <cmath>

#include "window.h"

static constexpr uint32_t kSparks = 150;
static constexpr float kDuration = 1.6f, kStep = 1 / 60.0f;

static const struct {
    QexVec3 place;
    QexVec4 from, to;
} kRockets[] = {{{-1.5f, 0.4f, 0}, {1, 0.9f, 0.5f, 0.4f}, {1, 0.2f, 0.1f, 1}},
                {{1.4f, 0.9f, 0}, {0.8f, 1, 1, 0.4f}, {0.2f, 0.4f, 1, 1}},
                {{0.2f, -0.3f, 0}, {0.9f, 1, 0.7f, 0.4f}, {0.1f, 0.8f, 0.3f, 1}}};
static int s_Rocket = -1;

// Directions that are even over the sphere, speeds that differ a little.
static void Load(QexParticleSet* set) {
    QexParticleSetEntry* sparks;
    uint32_t count;
    if (QexParticleSet_GetBuffer(set, &sparks, &count) != 0) return;
    for (uint32_t i = 0; i < count; ++i) {
        const float turn = 2.399963f * static_cast<float>(i);  // the golden angle
        const float height = 1 - 2 * (static_cast<float>(i) + 0.5f) / static_cast<float>(count);
        const float radius = std::sqrt(1 - height * height);
        const float speed = 0.9f + 0.4f * std::fmod(0.618034f * static_cast<float>(i * i), 1.0f);
        sparks[i].velocity = {speed * radius * std::cos(turn), speed * height,
                              speed * radius * std::sin(turn)};
        sparks[i].startPosition = {0, 0, 0};
        sparks[i].lifetime = kDuration * (0.6f + 0.4f * static_cast<float>(i % 7) / 6);
    }
}

static void Fire(QexParticleSet* set, int32_t, int32_t) {
    s_Rocket = (s_Rocket + 1) % 3;
    set->centerPosition = kRockets[s_Rocket].place;
    set->startColor = kRockets[s_Rocket].from;
    set->endColor = kRockets[s_Rocket].to;
    QexParticleSet_Trigger(set);
}

// Three rockets, one after the other, with the sparks of a third of a second, like a long exposure.
static void Expose(QexParticleSet* set, const QexCamera& camera) {
    for (int rocket = 0; rocket < 3; ++rocket) {
        const int shown = s_Rocket;
        while (s_Rocket == shown) {
            QexParticleSet_Update(set, kStep, &camera, nullptr);
            if (set->time > 0.45f && set->time < 0.75f) QexParticleSet_Draw(set);
        }
    }
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Firework", argc, argv) != 0) return 1;
    QexTexture spark, shape;
    Window_LoadTexture(&window, &spark, "spark.pvr");
    Window_LoadTexture(&window, &shape, "star.pvr");  // its red gives each spark its shape
    QexParticleSet set;
    if (QexParticleSet_Create(&set, &spark, &shape, kSparks, 22, kDuration) != 0) return 1;
    set.onFinished = Fire;
    Load(&set);
    Fire(&set, 0, 0);
    // A village below, dark but for its lamps.
    QexModel village;
    Window_LoadModel(&window, &village, "village.pod");
    QexModel_EnableNodeRendering(&village, 0, 0);  // the day's sky
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&village, lit, nullptr);
    for (uint32_t i = 0; i < village.scene.materialCount; ++i)
        for (float& channel : village.scene.materials[i].ambient)
            if (channel < 1) channel *= 0.7f;
    QexMatrix size, place;
    QexMatrix_Scale(&size, 0.14f, 0.14f, 0.14f);
    QexMatrix_Translate(&place, 0, -1.3f, 0);
    QexMatrix_Multiply(&place, &place, &size);

    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0, 0, 5}, {0, 0.3f, 0});
        Window_Clear(&window, 0.02f, 0.02f, 0.08f);
        QexModel_RenderWithCamera(&village, nullptr, &camera, &place, 0);
        QexRenderer_SetZWrite(0);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_ADD_ALPHA);
        if (window.picture) {
            Expose(&set, camera);
        } else {
            QexParticleSet_Update(&set, window.elapsed, &camera, nullptr);
            QexParticleSet_Draw(&set);
        }
    });

    set.onFinished = nullptr;
    QexModel_Unload(&village);
    QexGouraudShader_Release(&lit);
    QexParticleSet_Release(&set);
    QexTexture_Release(&spark);
    QexTexture_Release(&shape);
    return Window_Close(&window);
}
