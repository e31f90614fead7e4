#include "QexTextureShader.h"

#define QEX_MODULE (kType.path)

namespace {

// A vertex follows boneCount bones; the bone matrices lead straight into the world.
const char* const kVertexSource = R"(
attribute highp vec3 inVertex;
attribute mediump vec2 inTexCoord;
attribute mediump vec4 inBoneIndex;
attribute mediump vec4 inBoneWeight;
uniform lowp int boneCount;
uniform highp mat4 boneMatrixArray[16];
uniform highp mat4 viewProjMatrix;
varying mediump vec2 fTexCoord;
void main() {
    highp vec4 position = vec4(0.0);
    highp vec4 vertex = vec4(inVertex, 1.0);
    if (boneCount > 0) position += boneMatrixArray[int(inBoneIndex.x)] * vertex * inBoneWeight.x;
    if (boneCount > 1) position += boneMatrixArray[int(inBoneIndex.y)] * vertex * inBoneWeight.y;
    if (boneCount > 2) position += boneMatrixArray[int(inBoneIndex.z)] * vertex * inBoneWeight.z;
    if (boneCount > 3) position += boneMatrixArray[int(inBoneIndex.w)] * vertex * inBoneWeight.w;
    gl_Position = viewProjMatrix * position;
    fTexCoord = inTexCoord;
}
)";

enum { kBoneCount, kBoneMatrixArray, kViewProjMatrix, kOpacity, kAlphaThreshold, kThreshold };

const QexShaderModuleType kType = {
    "src/Shaders/QexSkinningTextureShader",
    kVertexSource,
    kQexTextureFragmentSource,
    QexSkinningTextureShader_Render,
    {{"inVertex", QEX_ELEMENT_POSITION},
     {"inTexCoord", QEX_ELEMENT_UV0},
     {"inBoneIndex", QEX_ELEMENT_BONE_INDEX},
     {"inBoneWeight", QEX_ELEMENT_BONE_WEIGHT}},
    {"boneCount", "boneMatrixArray", "viewProjMatrix", "opacity", "alphaThreshold"},
    {{"sTexture", kDiffuseUnit}, {"alphaTexture", kAlphaUnit}},
    true,
    kThreshold,
};

}  // namespace

extern "C" {

QEX_SHADER_MODULE_LIFETIME(QexSkinningTextureShader, &kType)
QEX_SHADER_MODULE_THRESHOLD(QexSkinningTextureShader, kThreshold)

int32_t QexSkinningTextureShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                          const QexMatrix* modelMatrix) {
    const QexShaderBones bones = {QexShaderModule_Location(module, kBoneCount),
                                  QexShaderModule_Location(module, kBoneMatrixArray), modelMatrix};
    return QexShaderModule_DrawSkinnedMesh(&kType, model, nodeIndex, bones);
}

void QexSkinningTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet*, const QexMatrix* modelMatrix, const QexMatrix* view,
                                     const QexMatrix* projection, const QexShadowInfo*) {
    QexShaderDraw draw;
    QexMatrix viewProjection;
    if (!QexShaderModule_Begin(&draw, &kType, module, model, nodeIndex)) return;
    QexMatrix_Multiply(&viewProjection, projection, view);
    QEX_GL(glUniform1f(QexShaderModule_Location(module, kOpacity), QexShaderModule_Opacity(draw)));
    QEX_GL(glUniform1f(QexShaderModule_Location(module, kAlphaThreshold), module->slots[kThreshold].value));
    QEX_GL(
        glUniformMatrix4fv(QexShaderModule_Location(module, kViewProjMatrix), 1, GL_FALSE, viewProjection.m));
    QexShaderModule_BindMaterialKeepPass(draw);
    QexSkinningTextureShader_DrawMesh(module, model, nodeIndex, modelMatrix);
}

}  // extern "C"
