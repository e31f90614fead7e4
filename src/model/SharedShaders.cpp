// The shader modules and the shadow pass that all models share: made with the first, gone with the last.
#include <cstring>

#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "model/SharedShaders.h"
#include "Qex/base.h"
#include "Qex/models.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/shadows.h"
#include "Shaders/QexShaderModule.h"
#include "Shaders/QexShaderVariant.h"
#include "texture/RenderTarget.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr int32_t kDefaultShadowSize = 512;
constexpr char kName[] = "QexModel_CreateDefaultShader";

// What lies before the near plane is drawn at it: it stands between the light and the view, and casts.
constexpr const char* kSkinShadowVertexSource = R"(
attribute highp vec3 inVertex;
attribute mediump vec2 inTexCoord;
attribute mediump vec4 inBoneWeight;
attribute mediump vec4 inBoneIndex;
uniform highp mat4 viewProjMatrix;
uniform lowp int boneCount;
uniform highp mat4 boneMatrixArray[16];
varying highp vec4 fPosition;
varying mediump vec2 fTexCoord;
void main() {
    highp vec4 vertex = vec4(inVertex, 1.0);
    highp vec4 position = boneMatrixArray[int(inBoneIndex.x)] * vertex * inBoneWeight.x;
    position += boneMatrixArray[int(inBoneIndex.y)] * vertex * inBoneWeight.y;
    position += boneMatrixArray[int(inBoneIndex.z)] * vertex * inBoneWeight.z;
    fPosition = viewProjMatrix * position;
    fTexCoord = inTexCoord;
    gl_Position = vec4(fPosition.xy, max(fPosition.z, -fPosition.w), fPosition.w);
}
)";

constexpr const char* kShadowVertexSource = R"(
attribute highp vec3 inVertex;
attribute mediump vec2 inTexCoord;
uniform highp mat4 mvpMatrix;
varying highp vec4 fPosition;
varying mediump vec2 fTexCoord;
void main() {
    fPosition = mvpMatrix * vec4(inVertex, 1.0);
    fTexCoord = inTexCoord;
    gl_Position = vec4(fPosition.xy, max(fPosition.z, -fPosition.w), fPosition.w);
}
)";

// The light's projection is orthographic: w is 1.
constexpr const char* kShadowFragmentSource = R"(
#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#else
precision mediump float;
#endif
uniform sampler2D alphaTexture;
varying vec4 fPosition;
varying mediump vec2 fTexCoord;
void main() {
#ifndef QEX_CONSTANT_ALPHA
    if (texture2D(alphaTexture, fTexCoord).r <= 0.01) discard;
#endif
    float depth = (fPosition.z + 1.0) / 2.0;
    gl_FragColor = vec4(depth, depth, depth, 1.0);
}
)";

// The vertex elements that the programs read. Described drawing takes these alone from here, lean drawing
// makes variants.
constexpr QexShaderModuleType MakeCaster(const char* vertexSource, uint32_t trait,
                                         const QexShaderList& attributes, const QexShaderList& uniforms) {
    QexShaderModuleType type = {};
    type.path = QEX_MODULE;
    type.vertexSource = vertexSource;
    type.fragmentSource = kShadowFragmentSource;
    type.attributes = attributes;
    type.uniforms = uniforms;
    type.isCaster = true;
    type.traits = trait | kTraitVariants;
    return type;
}
constexpr QexShaderModuleType kStaticCaster =
    MakeCaster(kShadowVertexSource, kTraitStatic, QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0),
               QexShaderList_Of(kUniform_mvpMatrix));
constexpr QexShaderModuleType kSkinnedCaster = MakeCaster(
    kSkinShadowVertexSource, kTraitSkinned,
    QexShaderList_Of(QEX_ELEMENT_POSITION, QEX_ELEMENT_UV0, QEX_ELEMENT_BONE_WEIGHT, QEX_ELEMENT_BONE_INDEX),
    QexShaderList_Of(kUniform_viewProjMatrix, kUniform_boneCount, kUniform_boneMatrixArray));

const char* const kSkinShadowAttributes[] = {"inVertex", "inTexCoord", "inBoneWeight", "inBoneIndex"};
const char* const kShadowAttributes[] = {"inVertex", "inTexCoord"};

struct ShadowShaders {
    GLuint vertex;
    GLuint fragment;
};

QexModelSharedShaders s_Shared = {nullptr, nullptr, nullptr, 0, 0, 0, 0, 0};
int32_t s_ShadowWidth = kDefaultShadowSize;  // of the next target
int32_t s_ShadowHeight = kDefaultShadowSize;
ShadowShaders s_SkinShadowShaders;
ShadowShaders s_ModelShadowShaders;
int32_t s_ReferenceCount;
uint32_t s_Generation = 1;  // counts the shared sets that there were, from 1
QexShaderModule* s_Lit;

// The shadow programs, each with its alpha texture on its unit.
void CreateShadowPrograms() {
    const QexMaking making;
    QexSkinShadowProgram& skin = m_SkinShadowShaderProgram;
    QexModelShadowProgram& model = m_uModelShadowShaderProgram;
    const QexProgramSampler alpha = {"alphaTexture", kAlphaUnit};
    QexProgram_Compile({kName, kSkinShadowVertexSource, kShadowFragmentSource, kSkinShadowAttributes, 4},
                       {&skin.program, &s_SkinShadowShaders.vertex, &s_SkinShadowShaders.fragment});
    if (making.Failed()) return;
    const QexProgramLookup skinLookup = {QEX_MODULE, skin.program};
    skinLookup.SetSampler(alpha);
    skinLookup.Uniforms({{&skin.viewProjMatrixLoc, "viewProjMatrix"},
                         {&skin.boneCountLoc, "boneCount"},
                         {&skin.boneMatrixArrayLoc, "boneMatrixArray"}});
    QexProgram_Compile({kName, kShadowVertexSource, kShadowFragmentSource, kShadowAttributes, 2},
                       {&model.program, &s_ModelShadowShaders.vertex, &s_ModelShadowShaders.fragment});
    if (making.Failed()) return;
    const QexProgramLookup modelLookup = {QEX_MODULE, model.program};
    modelLookup.SetSampler(alpha);
    model.mvpMatrixLoc = modelLookup.Uniform("mvpMatrix");
}

void CreateShadowTarget() {
    GLint framebuffer = 0;
    const QexMaking making;
    const int32_t most = QexRenderTarget_MaxSize();
    s_Shared.shadowWidth = s_ShadowWidth < most ? s_ShadowWidth : most;
    s_Shared.shadowHeight = s_ShadowHeight < most ? s_ShadowHeight : most;
    if (s_ShadowWidth > most || s_ShadowHeight > most)
        QexError(QEX_TAG,
                 "<QexModel_SetShadowMapSize> %d x %d pixels are cut to %d each, which this GL takes",
                 s_ShadowWidth, s_ShadowHeight, most);
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer));
    QexRenderState_ActiveTexture(GL_TEXTURE0 + kShadowMapUnit);
    QEX_GL(glGenTextures(1, &s_Shared.shadowTexture));
    QexRenderState_Bind(GL_TEXTURE_2D, s_Shared.shadowTexture);
    QEX_GL(glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST));
    QEX_GL(glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST));
    QEX_GL(glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE));
    QEX_GL(glTexParameterf(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE));
    QEX_GL(glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, s_Shared.shadowWidth, s_Shared.shadowHeight, 0, GL_RGBA,
                        GL_UNSIGNED_BYTE, nullptr));
    QEX_GL(glGenRenderbuffers(1, &s_Shared.shadowDepth));
    QEX_GL(glBindRenderbuffer(GL_RENDERBUFFER, s_Shared.shadowDepth));
    QEX_GL(glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH_COMPONENT16, s_Shared.shadowWidth,
                                 s_Shared.shadowHeight));
    QEX_GL(glGenFramebuffers(1, &s_Shared.shadowFramebuffer));
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, s_Shared.shadowFramebuffer));
    QEX_GL(glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, s_Shared.shadowTexture,
                                  0));
    QEX_GL(glFramebufferRenderbuffer(GL_FRAMEBUFFER, GL_DEPTH_ATTACHMENT, GL_RENDERBUFFER,
                                     s_Shared.shadowDepth));
    QexRenderTarget_CheckComplete();
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(framebuffer)));
    QexRenderTarget_Note({s_Shared.shadowFramebuffer, s_Shared.shadowTexture, s_Shared.shadowDepth,
                          s_Shared.shadowWidth, s_Shared.shadowHeight});
}

void DeleteShadowTarget() {
    const bool there = !g_QexContextLost;
    QexRenderTarget_DropNote(s_Shared.shadowFramebuffer);
    if (there && s_Shared.shadowDepth) QEX_GL(glDeleteRenderbuffers(1, &s_Shared.shadowDepth));
    if (there && s_Shared.shadowFramebuffer) QEX_GL(glDeleteFramebuffers(1, &s_Shared.shadowFramebuffer));
    if (there && s_Shared.shadowTexture) QEX_GL(glDeleteTextures(1, &s_Shared.shadowTexture));
    QexLeanState_ForgetTextures();
    s_Shared.shadowDepth = s_Shared.shadowFramebuffer = s_Shared.shadowTexture = 0;
}

void Forget() {
    m_SkinShadowShaderProgram.program = m_uModelShadowShaderProgram.program = 0;
    s_SkinShadowShaders = s_ModelShadowShaders = {};
}
bool Restore() {
    const QexMaking making;
    if (s_ReferenceCount > 0) CreateShadowPrograms();
    return !making.Failed();
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

}  // namespace

const QexModelSharedShaders* QexModel_GetSharedShaders() {
    return &s_Shared;
}

const QexShaderModuleType* QexModel_CasterType(bool skinned) {
    return skinned ? &kSkinnedCaster : &kStaticCaster;
}

uint32_t QexModel_GetSharedGeneration() {
    return s_Generation;
}

QexShaderModule* QexModel_GetSharedLitShader() {
    if (!s_Lit) s_Lit = QexGouraudShader_CreateProgram();
    return s_Lit;
}

extern "C" {

QexSkinShadowProgram m_SkinShadowShaderProgram = {0, -1, -1, -1};
QexModelShadowProgram m_uModelShadowShaderProgram = {0, -1};

int32_t QexModel_CreateDefaultShader(void) {
    if (s_ReferenceCount++ > 0) return 0;
    const QexMaking making;
    s_Shared.texture = QexTextureShader_CreateProgram();
    s_Shared.skinning = QexSkinningTextureShader_CreateProgram();
    s_Shared.simple = QexSimpleShader_CreateProgram();
    CreateShadowPrograms();
    QexContext_Register(&s_Part);
    QexShaderVariant_Retain(&kStaticCaster);
    QexShaderVariant_Retain(&kSkinnedCaster);
    CreateShadowTarget();
    if (s_Shared.texture && s_Shared.skinning && s_Shared.simple && !making.Failed()) return 0;
    QexModel_ReleaseShader(1);
    return -1;
}

void QexModel_ReleaseShader(int32_t force) {
    if (s_ReferenceCount > 0 && --s_ReferenceCount > 0 && force != 1) return;
    DeleteShadowTarget();
    QexProgram_Delete(
        {&m_SkinShadowShaderProgram.program, &s_SkinShadowShaders.vertex, &s_SkinShadowShaders.fragment});
    QexProgram_Delete(
        {&m_uModelShadowShaderProgram.program, &s_ModelShadowShaders.vertex, &s_ModelShadowShaders.fragment});
    QexShaderVariant_Release(&kStaticCaster);
    QexShaderVariant_Release(&kSkinnedCaster);
    QexTextureShader_Release(&s_Shared.texture);
    QexSkinningTextureShader_Release(&s_Shared.skinning);
    QexSimpleShader_Release(&s_Shared.simple);
    QexGouraudShader_Release(&s_Lit);
    s_ReferenceCount = 0;
    ++s_Generation;
}

void QexModel_SetShadowMapSize(int32_t width, int32_t height) {
    if (width < 1 || height < 1) {
        QexError(QEX_TAG, "<QexModel_SetShadowMapSize> %d x %d pixels; it stays %d x %d", width, height,
                 s_ShadowWidth, s_ShadowHeight);
        return;
    }
    s_ShadowWidth = width;
    s_ShadowHeight = height;
}

void QexModel_ReleaseShadowTexture(void) {
    DeleteShadowTarget();
}

void QexModel_SetAlphaTestCmpValue(float threshold) {
    if (s_Shared.texture) QexTextureShader_SetAlphaThreshold(s_Shared.texture, threshold);
    if (s_Shared.skinning) QexSkinningTextureShader_SetAlphaThreshold(s_Shared.skinning, threshold);
    if (s_Lit) QexGouraudShader_SetAlphaThreshold(s_Lit, threshold);
}

}  // extern "C"
