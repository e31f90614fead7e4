// Depth of field: the scene drawn sharp into one target, a blurred copy of it in another, its depth in a
// third, and a mix of the three on the screen. The modules are Shaders/QexBlurShader, QexDOFShader and the
// two depth modules; the copy program, which shows a target as it is, is made here.
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/Program.h"
#include "gl/Quad.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"
#include "Shaders/QexBlurShader.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexScreenShader.h"
#include "texture/RenderTarget.h"

#define QEX_MODULE "src/QexPostProcessing"

namespace {

constexpr int32_t kFailed = -1, kNullArgument = -9, kWrongSize = -10;

// The first blur pass writes one of each pair, the second the other. The depth pass takes kFullFirst over.
enum { kHalfFirst, kHalfBlurred, kSharp, kFullFirst, kFullBlurred, kDepth = kFullFirst };

struct Quad {
    float positions[4][3];
    float texCoords[4][2];
};

// Of the size of the screen.
Quad s_ScreenQuad;

// The copy program's other names.
GLuint s_VertexShader, s_FragmentShader;
GLint s_Position, s_TexCoord;
const QexProgramNames kProgramNames = {&m_iProgNamePP, &s_VertexShader, &s_FragmentShader};

QexMatrix s_CopyProjection;
bool s_HadCopy;  // when the context was lost

int32_t CreateCopyProgram();

void Forget() {
    s_HadCopy |= m_iProgNamePP != 0;
    m_iProgNamePP = s_VertexShader = s_FragmentShader = 0;
}
bool Restore() {
    if (s_HadCopy) s_HadCopy = CreateCopyProgram() != 0;
    return !s_HadCopy;
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

// What a scene may have left switched on that would cut into a quad.
const GLenum kSwitches[] = {GL_DEPTH_TEST, GL_BLEND, GL_CULL_FACE};
constexpr int kSwitchCount = sizeof kSwitches / sizeof kSwitches[0];

float WidthOf(const QexRuntimeContext* context) {
    return static_cast<float>(context->width);
}

float HeightOf(const QexRuntimeContext* context) {
    return static_cast<float>(context->height);
}

// A quad that hangs from the upper left corner of the screen and shows the lower left part of a texture, up
// to s and t.
Quad MakeQuad(float screenHeight, float width, float height, float s, float t) {
    Quad quad;
    for (int i = 0; i < 4; ++i) {
        const bool right = i & 1, lower = i > 1;
        quad.positions[i][0] = right ? width : 0;
        quad.positions[i][1] = lower ? screenHeight - height : screenHeight;
        quad.positions[i][2] = 0;
        quad.texCoords[i][0] = right ? s : 0;
        quad.texCoords[i][1] = lower ? 0 : t;
    }
    return quad;
}

void DrawQuad(GLint position, GLint texCoord, const Quad& quad) {
    GLboolean wasOn[kSwitchCount];
    for (int i = 0; i < kSwitchCount; ++i) {
        QEX_GL(wasOn[i] = glIsEnabled(kSwitches[i]));
        if (wasOn[i]) QEX_GL(glDisable(kSwitches[i]));
    }
    const QexQuadArray arrays[] = {{position, 3, quad.positions[0]}, {texCoord, 2, quad.texCoords[0]}};
    QexQuad_Draw(QEX_MODULE, arrays);
    for (int i = 0; i < kSwitchCount; ++i)
        if (wasOn[i]) QEX_GL(glEnable(kSwitches[i]));
}

void DrawQuad(const QexShaderModule* module, const Quad& quad) {
    DrawQuad(QexShaderModule_Location(module, kScreenPosition),
             QexShaderModule_Location(module, kScreenTexCoord), quad);
}

void BeginScene(QexRenderTarget* target) {
    QexRenderTarget_BeginScene(target);
    QEX_GL_CHECK();
}

void EndScene(QexRenderTarget* target) {
    QexRenderTarget_EndScene(target);
    QEX_GL_CHECK();
}

// 0 when a call may go on, else its result; what has not been initialised is said in the log.
int32_t Check(const char* function, bool argumentsAreThere, bool programIsThere) {
    if (!argumentsAreThere) return kNullArgument;
    if (programIsThere) return 0;
    QexLog(QEX_TAG, "<%s> Post-processing not initialized yet!", function);
    return kFailed;
}

bool IsThere(const QexShaderModule* module) {
    return module && module->program;
}

}  // namespace

extern "C" {

QexRenderTarget PostProcessingRenderTargets[QEX_POST_PROCESSING_TARGETS];
QexShaderModule* depthShaderProgram;
QexShaderModule* skinningDepthShaderProgram;
QexShaderModule* blurShaderProgram;
QexShaderModule* DOFShaderProgram;
uint32_t m_iProgNamePP;
const char* pVertexShaderPP = QEX_GLSL_SCREEN_VERTEX;
const char* pFragmentShaderPP = R"(
precision mediump float;
uniform sampler2D u_s2dTexture;
varying vec2 v_v2TexCoord;
void main() {
    gl_FragColor = texture2D(u_s2dTexture, v_v2TexCoord);
}
)";

// ---- Start and end ----

int32_t QexPostProcessing_Initialize(const QexRuntimeContext* context) {
    if (!context) return kNullArgument;
    const int32_t width = context->width, height = context->height;
    if (!QexRenderTarget_CheckSize("QexPostProcessing_Initialize", width, height)) return kFailed;
    const QexMaking making;
    QexPostProcessing_Finalize();
    QexPP_CreateQuad(context);
    for (int i = 0; i < QEX_POST_PROCESSING_TARGETS; ++i) {
        const int32_t part = i < kSharp ? 2 : 1;
        QexRenderTarget_Create(&PostProcessingRenderTargets[i], width > part ? width / part : 1,
                               height > part ? height / part : 1, 0);
        QEX_GL_CHECK();
    }
    const int32_t result = QexPP_CreateShader(context);
    depthShaderProgram = QexDepthShader_CreateProgram();
    skinningDepthShaderProgram = QexSkinningDepthShader_CreateProgram();
    blurShaderProgram = QexBlurShader_CreateProgram(context);
    DOFShaderProgram = QexDOFShader_CreateProgram(context);
    if (result == 0 && depthShaderProgram && skinningDepthShaderProgram && blurShaderProgram &&
        DOFShaderProgram && !making.Failed())
        return 0;
    QexPostProcessing_Finalize();
    return kFailed;
}

int32_t QexPostProcessing_Finalize(void) {
    QexPP_ReleaseShader();
    QexDepthShader_Release(&depthShaderProgram);
    QexSkinningDepthShader_Release(&skinningDepthShaderProgram);
    QexBlurShader_Release(&blurShaderProgram);
    QexDOFShader_Release(&DOFShaderProgram);
    for (QexRenderTarget& target : PostProcessingRenderTargets) {
        QexRenderTarget_Release(&target);
        QEX_GL_CHECK();
    }
    return 0;
}

int32_t QexPP_CreateQuad(const QexRuntimeContext* context) {
    if (!context) return kNullArgument;
    const float width = WidthOf(context), height = HeightOf(context);
    s_ScreenQuad = MakeQuad(height, width + 1, height + 1, 1, 1);
    return 0;
}

int32_t QexPP_CreateShader(const QexRuntimeContext* context) {
    if (!context) return kNullArgument;
    QexMatrix_Orthographic(&s_CopyProjection, 0, WidthOf(context), 0, HeightOf(context), 0, 1);
    QexPP_ReleaseShader();
    return CreateCopyProgram();
}

}  // extern "C"

namespace {

int32_t CreateCopyProgram() {
    const QexMaking making;
    if (!QexProgram_Build({"QexPP_CreateShader", pVertexShaderPP, pFragmentShaderPP, nullptr, 0},
                          kProgramNames))
        return kFailed;
    const QexProgramLookup lookup = {QEX_MODULE, m_iProgNamePP};
    lookup.Attributes({{&s_Position, "a_v4Position"}, {&s_TexCoord, "a_v2TexCoord"}});
    QEX_GL(glUniformMatrix4fv(lookup.Uniform("u_m4Projection"), 1, GL_FALSE, s_CopyProjection.m));
    lookup.SetSampler({"u_s2dTexture", kDiffuseUnit});
    // For sources that an application puts in; the engine's own have no such sampler.
    lookup.SetSampler({"u_s2dAlpha", kAlphaUnit});
    QexContext_Register(&s_Part);
    if (!making.Failed()) return 0;
    QexPP_ReleaseShader();
    return kFailed;
}

}  // namespace

extern "C" {

void QexPP_ReleaseShader(void) {
    s_HadCopy = false;
    QexProgram_Delete(kProgramNames);
}

QexRenderTarget* QexPP_GetRenderTarget(uint32_t index) {
    return index < QEX_POST_PROCESSING_TARGETS ? &PostProcessingRenderTargets[index] : nullptr;
}

// ---- Passes ----

int32_t QexPostProcessing_DrawDOF(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                                  QexSceneCallback callback, float focus, float range, float blurH,
                                  float blurV, float sigma, float samples, int32_t mode, float zNear,
                                  float zFar) {
    const int32_t problem =
        Check("QexPostProcessing_DrawDOF", context && callback, IsThere(DOFShaderProgram));
    if (problem) return problem;
    QexRenderTarget* targets = PostProcessingRenderTargets;
    QexTexture* sharp = &targets[kSharp].colorTexture;
    const bool half = mode < 2;
    QexRenderTarget* first = &targets[half ? kHalfFirst : kFullFirst];
    QexRenderTarget* blurred = &targets[half ? kHalfBlurred : kFullBlurred];
    QexPP_DrawNormalScene(context, user1, user2, user3, callback, &targets[kSharp]);
    QexPP_DrawBlurImage(context, user1, user2, user3, sigma, samples, blurH, blurV, sharp, first, blurred);
    QexPP_DrawDepthImage(context, user1, user2, user3, callback, zNear, zFar, &targets[kDepth]);
    return QexPP_DrawDOF(context, user1, user2, user3, focus, range, sharp, &targets[kDepth].colorTexture,
                         &blurred->colorTexture, 0);
}

int32_t QexPP_DrawNormalScene(QexRuntimeContext* context, void* user1, void* user2, void* user3,
                              QexSceneCallback callback, QexRenderTarget* target) {
    if (!context || !callback) return kNullArgument;
    if (target)
        BeginScene(target);
    else
        QexRenderTarget_SetRenderTarget(context, nullptr);
    callback(context, user1, user2, user3, nullptr, nullptr, nullptr);
    QEX_GL_CHECK();
    if (target) EndScene(target);
    return 0;
}

int32_t QexPP_DrawBlurImage(const QexRuntimeContext* context, void*, void*, void*, float sigma, float samples,
                            float blurH, float blurV, QexTexture* source, QexRenderTarget* first,
                            QexRenderTarget* second) {
    const int32_t problem =
        Check("QexPP_DrawBlurImage", context && source && first && second, IsThere(blurShaderProgram));
    if (problem) return problem;
    BeginScene(first);
    const int32_t width = first->colorTexture.width;
    const bool half = width != context->width;
    if (half && width != context->width >> 1) return kWrongSize;
    const float right = WidthOf(context), top = HeightOf(context);
    QexMatrix projection;
    if (half)
        QexMatrix_Orthographic(&projection, 0, right * 0.5f, top * 0.5f, top, 0, 1);
    else
        QexMatrix_Orthographic(&projection, 0, right, 0, top, 0, 1);
    QexBlurShader_SetProjection(blurShaderProgram, &projection);
    QexPP_DrawBlurQuad(context, source, 0, sigma, samples, blurH, half);
    EndScene(first);
    BeginScene(second);
    QexPP_DrawBlurQuad(context, &first->colorTexture, 1, sigma, samples, blurV, 0);
    EndScene(second);
    return 0;
}

int32_t QexPP_DrawBlurQuad(const QexRuntimeContext* context, QexTexture* texture, float direction,
                           float sigma, float samples, float blurSize, int32_t half) {
    const int32_t problem = Check("QexPP_DrawBlurQuad", context && texture, IsThere(blurShaderProgram));
    if (problem) return problem;
    const float scale = half ? 0.5f : 1.0f;
    const float width = static_cast<float>(texture->width) * scale;
    const float height = static_cast<float>(texture->height) * scale;
    const float wholeWidth = static_cast<float>(static_cast<int32_t>(width));
    const float wholeHeight = static_cast<float>(static_cast<int32_t>(height));
    const Quad quad = MakeQuad(HeightOf(context), wholeWidth + 1, wholeHeight + 1, wholeWidth / width,
                               wholeHeight / height);
    QexRenderState_UseProgram(blurShaderProgram->program);
    QexBlurShader_SetParameters(blurShaderProgram, texture, direction, sigma, samples, blurSize);
    QexTexture_Set(texture, kDiffuseUnit);
    DrawQuad(blurShaderProgram, quad);
    return 0;
}

int32_t QexPP_DrawDepthImage(QexRuntimeContext* context, void*, void*, void*, QexSceneCallback callback,
                             float zNear, float zFar, QexRenderTarget* target) {
    static const float kWhite[3] = {1, 1, 1};
    const int32_t problem = Check("QexPP_DrawDepthImage", context && callback && target,
                                  IsThere(depthShaderProgram) && IsThere(skinningDepthShaderProgram));
    if (problem) return problem;
    QexRenderState_UseProgram(depthShaderProgram->program);
    QexDepthShader_SetParameters(depthShaderProgram, zNear, zFar);
    QexRenderState_UseProgram(skinningDepthShaderProgram->program);
    QexSkinningDepthShader_SetParameters(skinningDepthShaderProgram, zNear, zFar);
    BeginScene(target);
    callback(context, nullptr, nullptr, nullptr, depthShaderProgram, skinningDepthShaderProgram, kWhite);
    QEX_GL_CHECK();
    EndScene(target);
    return 0;
}

int32_t QexPP_DrawDOF(const QexRuntimeContext* context, void*, void*, void*, float focus, float range,
                      QexTexture* sharp, QexTexture* depth, QexTexture* blurred, int32_t) {
    const int32_t problem =
        Check("QexPP_DrawDOF", context && sharp && depth && blurred, IsThere(DOFShaderProgram));
    if (problem) return problem;
    QexRenderState_UseProgram(DOFShaderProgram->program);
    QexDOFShader_SetParameters(DOFShaderProgram, focus, range);
    QexTexture_Set(sharp, 0);
    QexTexture_Set(depth, 1);
    QexTexture_Set(blurred, 2);
    DrawQuad(DOFShaderProgram, s_ScreenQuad);
    return 0;
}

int32_t QexPP_DrawImage(const QexRuntimeContext* context, void*, void*, void*, QexRenderTarget* source,
                        QexRenderTarget* destination) {
    const int32_t problem = Check("QexPP_DrawImage", context && source, m_iProgNamePP);
    if (problem) return problem;
    QexRenderState_UseProgram(m_iProgNamePP);
    QexTexture_Set(&source->colorTexture, kDiffuseUnit);
    if (destination)
        BeginScene(destination);
    else
        QexRenderTarget_SetRenderTarget(context, nullptr);
    DrawQuad(s_Position, s_TexCoord, s_ScreenQuad);
    if (destination) EndScene(destination);
    return 0;
}

}  // extern "C"
