// The mix of a sharp and a blurred picture by depth.
#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexScreenShader.h"

#define QEX_MODULE (kType.path)

namespace {

const char* const kFragmentSource = R"(#version 100
precision mediump float;
uniform sampler2D u_s2dNormal;
uniform sampler2D u_s2dDepth;
uniform sampler2D u_s2dBlur;
uniform float focus;
uniform float range;
varying vec2 v_v2TexCoord;
void main() {
    float depth = texture2D(u_s2dDepth, v_v2TexCoord).r;
    vec4 sharp = texture2D(u_s2dNormal, v_v2TexCoord);
    vec4 blurred = texture2D(u_s2dBlur, v_v2TexCoord);
    gl_FragColor = mix(sharp, blurred, clamp(range * abs(focus - depth), 0.0, 1.0));
}
)";

enum { kNormal = kScreenSlots, kDepth, kBlur, kFocus, kRange };

const QexShaderModuleType kType = {
    "src/Shaders/QexDOFShader",
    QEX_GLSL_SCREEN_VERTEX,
    kFragmentSource,
    nullptr,
    {},
    QexShaderList_Of(kUniform_none, kUniform_u_m4Projection, kUniform_none, kUniform_u_s2dNormal,
                     kUniform_u_s2dDepth, kUniform_u_s2dBlur, kUniform_focus, kUniform_range),
    {},
    false,
    0,
};

// Of the module created last.
QexMatrix s_Projection;

int32_t SetUp(QexShaderModule* module) {
    return QexScreenShader_Setup(&kType, module, &s_Projection, 3);
}

}  // namespace

extern "C" {

QexShaderModule* QexDOFShader_CreateProgram(const QexRuntimeContext* context) {
    QexShaderModule* module = QexShaderModule_Alloc(&kType, SetUp);
    if (!module) return nullptr;
    QexMatrix_Orthographic(&s_Projection, 0, static_cast<float>(context->width), 0,
                           static_cast<float>(context->height), 0, 1);
    return QexScreenShader_Finish(module, QexDOFShader_SetupProgram(context, module));
}

int32_t QexDOFShader_SetupProgram(const QexRuntimeContext*, QexShaderModule* module) {
    return SetUp(module);
}

void QexDOFShader_Release(QexShaderModule** module) {
    QexShaderModule_Release(&kType, module);
}

void QexDOFShader_SetParameters(QexShaderModule* module, float focus, float range) {
    QEX_GL(QexShaderModule_SetFloat(module, kFocus, focus));
    QEX_GL(QexShaderModule_SetFloat(module, kRange, range));
}

}  // extern "C"
