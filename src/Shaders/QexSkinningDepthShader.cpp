// Depth as a grey level, on bones.
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexShaderModule.h"

#define QEX_MODULE (kType.path)

namespace {

const char* const kVertexSource = QEX_GLSL_SKINNED_VERTEX QEX_GLSL_DEPTH R"(
void main() {
    placeVertex();
    fDepth = depthValue(gl_Position.z);
}
)";

const char* const kFragmentSource = QEX_GLSL_FRAGMENT_PRECISION QEX_GLSL_ALPHA R"(
varying float fDepth;
void main() {
    lowp float alpha = opacity;
#ifndef QEX_CONSTANT_ALPHA
    alpha *= texture2D(alphaTexture, fTexCoord).r;
#endif
    gl_FragColor = vec4(fDepth, fDepth, fDepth, alpha <= alphaThreshold ? 0.0 : 1.0);
}
)";

enum {
    kNear,
    kFar,
    kBoneCount,
    kBoneMatrixArray,
    kViewProjMatrix,
    kOpacity,
    kAlphaThreshold,
    kThreshold,
    kNearValue,
    kFarValue
};

const QexShaderModuleType kType = {
    "src/Shaders/QexSkinningDepthShader",
    kVertexSource,
    kFragmentSource,
    QexSkinningDepthShader_Render,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0, QEX_ELEMENT_BONE_INDEX, QEX_ELEMENT_BONE_WEIGHT),
    QexShaderList_Of(kUniform_near, kUniform_far, kUniform_boneCount, kUniform_boneMatrixArray,
                     kUniform_viewProjMatrix, kUniform_opacity, kUniform_alphaThreshold),
    QexShaderList_Of(kDiffuseUnit, kAlphaUnit),
    true,
    kThreshold,
    0,
    false,
    kTraitSkinned | kTraitAlphaTexture | kTraitKeepsPass | kTraitDepth | kTraitVariants,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexSkinningDepthShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexSkinningDepthShader, kThreshold)

void QexSkinningDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar) {
    QEX_GL(QexShaderModule_SetFloat(module, kNear, zNear));
    QEX_GL(QexShaderModule_SetFloat(module, kFar, zFar));
    module->slots[kNearValue].value = zNear;
    module->slots[kFarValue].value = zFar;
}

int32_t QexSkinningDepthShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                        const QexMatrix* modelMatrix) {
    const QexShaderBones bones = {QexShaderModule_Location(module, kBoneCount),
                                  QexShaderModule_Location(module, kBoneMatrixArray), false, 0, modelMatrix};
    return QexShaderModule_DrawSkinnedMesh(&kType, model, nodeIndex, bones);
}

void QexSkinningDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                   const QexLightSet*, const QexMatrix* modelMatrix, const QexMatrix* view,
                                   const QexMatrix* projection, const QexShadowInfo*) {
    QexShaderDraw draw;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexMatrix viewProjection;
    QexMatrix_Multiply(&viewProjection, projection, view);
    QEX_GL(glUniform1f(QexShaderModule_Location(module, kOpacity), QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(QexShaderModule_Location(module, kAlphaThreshold), module->slots[kThreshold].value));
    QEX_GL(
        glUniformMatrix4fv(QexShaderModule_Location(module, kViewProjMatrix), 1, GL_FALSE, viewProjection.m));
    QexShaderModule_BindMaterialKeepPass(draw);
    QexSkinningDepthShader_DrawMesh(module, model, nodeIndex, modelMatrix);
}

}  // extern "C"
