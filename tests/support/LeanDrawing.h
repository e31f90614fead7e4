// What tests of lean drawing share.
#pragma once

#include "support/RenderScenes.h"

struct Lean {
    Lean() { QexRenderer_SetDrawing(QEX_DRAWING_LEAN); }
    ~Lean() { QexRenderer_SetDrawing(QEX_DRAWING_DESCRIBED); }
};

// An instance of a module, by number.
struct Module {
    explicit Module(uint32_t number) : kind(number), module(QexShaders_CreateShaderProgram(number)) {}
    ~Module() { QexShaders_ReleaseShaderProgram(module, kind); }
    Module(const Module&) = delete;
    Module& operator=(const Module&) = delete;
    uint32_t kind;
    QexShaderModule* module;
};

inline QexLightSet TwoLights() {
    QexLightSet lights = {};
    lights.count = 2;
    lights.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.4f, 0.3f, -1}, {0.7f, 0.5f, 0.3f, 1}};
    lights.lights[1] = {QEX_LIGHT_POINT, {20, 80, 60}, {0.2f, 0.3f, 0.6f, 1}};
    return lights;
}
