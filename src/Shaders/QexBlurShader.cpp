// One direction of a Gaussian blur over the screen.
#include <cstring>

#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexBlurShader.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexScreenShader.h"

#define QEX_MODULE (kType.path)

namespace {

// One direction of a Gaussian. Its factor 1 / (sqrt(2 pi) sigma) is left out, as the sum is divided by its
// weight: so a sigma of 0 leaves the centre alone. `g` steps from the weight of one pixel to the next.
const char* const kFragmentSource = R"(#version 100
precision mediump float;
uniform sampler2D u_s2dTexture;
uniform float sigma;
uniform float blurSize;
uniform float horizontal_or_vertical;
uniform float samples;
varying vec2 v_v2TexCoord;
void main() {
    vec2 pixel = horizontal_or_vertical == 0.0 ? vec2(blurSize, 0.0) : vec2(0.0, blurSize);
    int pixelsAside = samples == 9.0 ? 4 : samples == 7.0 ? 3 : samples == 5.0 ? 2 : 1;
    float fall = abs(sigma) > 0.0 ? exp(-0.5 / (sigma * sigma)) : 0.0;
    vec3 g = vec3(1.0, fall, fall * fall);
    vec3 sum = texture2D(u_s2dTexture, v_v2TexCoord).rgb;
    float weight = 1.0;
    for (int i = 1; i <= 4; i++) {
        if (i > pixelsAside) break;
        g.xy *= g.yz;
        vec2 offset = float(i) * pixel;
        sum += g.x * texture2D(u_s2dTexture, v_v2TexCoord - offset).rgb;
        sum += g.x * texture2D(u_s2dTexture, v_v2TexCoord + offset).rgb;
        weight += 2.0 * g.x;
    }
    gl_FragColor = vec4(sum / weight, 1.0);
}
)";

enum { kTexture = kScreenSlots, kSigma, kBlurSize, kDirection, kSamples, kProjectionMatrix };
static_assert(kProjectionMatrix + 16 <= QEX_SHADER_SLOTS, "the matrix fits into the slots");

constexpr float kDefaultSigma = 5, kDefaultSamples = 9;

const QexShaderModuleType kType = {
    "src/Shaders/QexBlurShader",
    QEX_GLSL_SCREEN_VERTEX,
    kFragmentSource,
    nullptr,
    {},
    QexShaderList_Of(kUniform_none, kUniform_u_m4Projection, kUniform_none, kUniform_u_s2dTexture,
                     kUniform_sigma, kUniform_blurSize, kUniform_horizontal_or_vertical, kUniform_samples),
    {},
    false,
    0,
};

QexMatrix ProjectionOf(const QexShaderModule* module) {
    QexMatrix projection;
    memcpy(projection.m, module->slots + kProjectionMatrix, sizeof projection.m);
    return projection;
}

int32_t SetUp(QexShaderModule* module) {
    const QexMatrix projection = ProjectionOf(module);
    return QexScreenShader_Setup(&kType, module, &projection, 1);
}

}  // namespace

void QexBlurShader_SetProjection(QexShaderModule* module, const QexMatrix* projection) {
    memcpy(module->slots + kProjectionMatrix, projection->m, sizeof projection->m);
}

extern "C" {

QexShaderModule* QexBlurShader_CreateProgram(const QexRuntimeContext* context) {
    QexShaderModule* module = QexShaderModule_Alloc(&kType, SetUp);
    if (!module) return nullptr;
    const float width = static_cast<float>(context->width), height = static_cast<float>(context->height);
    QexMatrix projection;
    QexMatrix_Orthographic(&projection, 0, width * 0.5f, height * 0.5f, height, 0, 1);
    QexBlurShader_SetProjection(module, &projection);
    return QexScreenShader_Finish(
        module, QexBlurShader_SetupProgram(context, module, kDefaultSigma, kDefaultSamples));
}

int32_t QexBlurShader_SetupProgram(const QexRuntimeContext* context, QexShaderModule* module, float sigma,
                                   float samples) {
    if (SetUp(module) != 0) return -1;
    QexBlurShader_SetParameters(module, nullptr, 0, sigma, samples,
                                1.0f / static_cast<float>(context->width));
    return 0;
}

void QexBlurShader_Release(QexShaderModule** module) {
    QexShaderModule_Release(&kType, module);
}

void QexBlurShader_SetParameters(QexShaderModule* module, const void*, float direction, float sigma,
                                 float samples, float blurSize) {
    const QexMatrix projection = ProjectionOf(module);
    QEX_GL(QexShaderModule_SetFloat(module, kDirection, direction));
    // GPUs differ in how they compare what is no number.
    QEX_GL(QexShaderModule_SetFloat(module, kSigma, sigma == sigma ? sigma : 0));
    QEX_GL(QexShaderModule_SetFloat(module, kSamples, samples));
    QEX_GL(QexShaderModule_SetFloat(module, kBlurSize, blurSize));
    QEX_GL(
        glUniformMatrix4fv(QexShaderModule_Location(module, kScreenProjection), 1, GL_FALSE, projection.m));
}

}  // extern "C"
