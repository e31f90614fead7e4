// Sample 14: a fountain, a fire and its smoke on a square at night, each an emitter from a file; textures are
// not in the files and are set afterwards.
#define QEX_UNPREFIXED_NAMES  // for GetRandomNumber

#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "window.h"

static constexpr float kStep = 1 / 60.0f;

struct Kind {
    const char* file;
    const char* frames[3];
    int32_t blending;
    QexParticleEmitter* emitter;
    QexTexture textures[3];
};
static Kind s_Kinds[] = {
    {"smoke.emitter", {"smoke.pvr"}, QEX_BLEND_ALPHA, nullptr, {}},
    {"fire.emitter", {"flame1.pvr", "flame2.pvr", "flame3.pvr"}, QEX_BLEND_ADD_ALPHA, nullptr, {}},
    {"fountain.emitter", {"drop.pvr"}, QEX_BLEND_ALPHA, nullptr, {}}};

static bool Load(const Window& window, Kind* kind) {
    char path[256];
    snprintf(path, sizeof path, "%s%s", window.files, kind->file);
    kind->emitter = QexParticleEmitter_CreateFromBinFile(path);
    for (int i = 0; kind->emitter && i < 3 && kind->frames[i]; ++i) {
        Window_LoadTexture(&window, &kind->textures[i], kind->frames[i]);
        kind->emitter->animations[0].frames[i] = &kind->textures[i];
    }
    return kind->emitter != nullptr;
}

static void Update(Kind* kind, float seconds) {
    for (float time = 0; time < seconds; time += kStep)
        QexParticleEmitter_Update(kind->emitter, kStep, nullptr);
    // Upright, turned to the eye, and rotated by what the particles have of it.
    for (int32_t i = 0; i < kind->emitter->particleCount; ++i)
        kind->emitter->particles[i].billboard->mode = QEX_BILLBOARD_YAW;
}

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Emitters", argc, argv) != 0) return 1;
    // The engine seeds its random numbers by the time when it draws the first one; this picture is always the
    // same.
    GetRandomNumber();
    srand48(1);
    for (Kind& kind : s_Kinds) {
        if (!Load(window, &kind)) return 1;
        Update(&kind, 2);
    }
    QexModel village;
    Window_LoadModel(&window, &village, "village.pod");
    QexShaderModule* lit = QexGouraudShader_CreateProgram();
    QexModel_SetShaderProgramForAllNode(&village, lit, nullptr);
    QexModel_EnableNodeRendering(&village, 0, 0);  // the day's sky
    for (uint32_t i = 0; i < village.scene.materialCount; ++i)
        for (float& channel : village.scene.materials[i].ambient)
            if (channel < 1) channel *= 0.2f;  // but for the lamps
    QexLightSet lights = {};
    lights.count = 2;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.5f, -1, -0.3f}, {0.1f, 0.13f, 0.22f, 1}};
    QexMatrix place;
    QexMatrix_Translate(&place, 0, 0, -2.2f);

    Window_Run(&window, [&] {
        const QexCamera camera = Window_Camera(&window, {0, 1.6f, 5.5f}, {0, 1.1f, 0});
        const float flicker = 0.9f + 0.1f * std::sin(17 * window.seconds) * std::sin(11 * window.seconds);
        lights.lights[1] = {
            QEX_LIGHT_POINT, {1.1f, 1.2f, 0.8f}, {flicker, 0.55f * flicker, 0.2f * flicker, 1}};
        Window_Clear(&window, 0.03f, 0.04f, 0.09f);
        QexModel_RenderWithCamera(&village, &lights, &camera, &place, 0);
        QexRenderer_SetZWrite(0);
        for (Kind& kind : s_Kinds) {
            Update(&kind, window.elapsed);
            QexRenderer_SetAlphaBlendMode(kind.blending);
            QexParticleEmitter_Draw(kind.emitter, &camera);
        }
    });

    QexModel_Unload(&village);
    QexGouraudShader_Release(&lit);
    for (Kind& kind : s_Kinds) {
        QexParticleEmitter_Release(kind.emitter);
        for (QexTexture& texture : kind.textures) QexTexture_Release(&texture);
    }
    return Window_Close(&window);
}
