// Billboards: textured quads in space that face the camera in one of several ways.
#include <cmath>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "gl/Quad.h"
#include "math/Float4.h"
#include "overlay/Billboard.h"
#include "overlay/BillboardBatch.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexBillboard"

namespace {

constexpr float kAlphaThreshold = 0.001f;

const char* const kVertexSource = R"(
attribute highp vec4 inVertex;
attribute mediump vec2 inTexCoord;
uniform highp mat4 mvpMatrix;
varying mediump vec2 fTexCoord;
void main() {
    gl_Position = mvpMatrix * inVertex;
    fTexCoord = inTexCoord;
}
)";

// The threshold is too small for low precision.
const char* const kFragmentSource = R"(
precision mediump float;
uniform sampler2D sTexture;
uniform float opacity;
uniform float alphaThreshold;
varying vec2 fTexCoord;
void main() {
    vec4 texel = texture2D(sTexture, fTexCoord);
    float materialAlpha = opacity * texel.a;
    if (materialAlpha <= alphaThreshold) materialAlpha = 0.0;
    gl_FragColor = vec4(texel.rgb, materialAlpha);
}
)";

const char* const kAttributes[] = {"inVertex", "inTexCoord"};

const QexProgramNames kProgramNames = {&g_BillboardShaderProgramID, &g_BillboardVShader, &g_BillboardFShader};

void Forget() {
    g_BillboardShaderProgramID = g_BillboardVShader = g_BillboardFShader = 0;
}
bool Restore();
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

bool CreateProgram() {
    if (!QexProgram_Build({"QexBillboard_Create", kVertexSource, kFragmentSource, kAttributes, 2},
                          kProgramNames)) {
        QexError(QEX_TAG, "<QexBillboard_Create> the billboards' program cannot be built");
        return false;
    }
    QexContext_Register(&s_Part);
    const QexProgramLookup lookup = {QEX_MODULE, g_BillboardShaderProgramID, false};
    lookup.Attributes({{&g_BillboardInPosLoc, "inVertex"}, {&g_BillboardUVLoc, "inTexCoord"}});
    lookup.Uniforms({{&g_BillboardMvpMatrixLoc, "mvpMatrix"},
                     {&g_BillboardOpacityLoc, "opacity"},
                     {&g_BillboardAlphaThresholdLoc, "alphaThreshold"},
                     {&g_BillboardTextureLoc, "sTexture"}});
    QexVec3_Set(&g_VecUp, 0, 1, 0);
    QexVec3_Set(&g_VecNormal, 0, 0, 1);
    return true;
}

bool Restore() {
    return !g_BillboardCount || CreateProgram();
}

// The angle of that cosine in degrees, with 3.14 for pi as ever: a quarter turn comes to 90.05 degrees. 0
// where rounding took the cosine out of range.
float AngleOf(float cosine, bool negative) {
    if (!(cosine >= -1 && cosine < 1)) return 0;
    const float degrees = static_cast<float>(acos(static_cast<double>(cosine)) * 180 / 3.14);
    return negative ? -degrees : degrees;
}

void RotateTowardsEye(QexMatrix* out, const QexBillboard& b, const QexVec3& eye) {
    QexVec3 towards, level, side;
    QexVec3_Subtract(&towards, &eye, &b.position);
    QexVec3_Set(&level, towards.x, 0, towards.z);
    QexVec3_Normalize(&towards, &towards);
    QexVec3_Normalize(&level, &level);
    QexVec3_CrossProduct(&side, &g_VecNormal, &level);
    // An eye straight above or below is to neither side.
    const bool aside = level.x != 0 || level.z != 0;
    QexMatrix yaw, roll;
    QexMatrix_RotateY(&yaw, aside ? AngleOf(QexVec3_DotProduct(&g_VecNormal, &level), side.y < 0) : 0);
    QexMatrix_Multiply(out, &yaw, QexMatrixRotateZ(&roll, b.rotation.z));
    if (b.mode != QEX_BILLBOARD_CAMERA) return;
    QexMatrix pitch;
    QexMatrixRotateX(&pitch, AngleOf(QexVec3_DotProduct(&level, &towards), towards.y < 0));
    QexMatrix_Multiply(out, &pitch, out);
}

void SetAxis(QexMatrix* m, int column, float x, float y, float z) {
    m->m[4 * column] = x;
    m->m[4 * column + 1] = y;
    m->m[4 * column + 2] = z;
}

void BuildMVP(QexMatrix* out, const QexBillboard& b, const QexCamera& camera) {
    const float width = b.width * b.scale.x, height = b.height * b.scale.y;
    if (b.mode == QEX_BILLBOARD_CAMERA || b.mode == QEX_BILLBOARD_YAW)
        RotateTowardsEye(out, b, camera.eye);
    else
        QexMatrix_RotateXYZ(out, b.rotation.x, b.rotation.y, b.rotation.z);
    // Translation * rotation * scaling, put together in place.
    Store4(out->m, Load4(out->m) * width);
    Store4(out->m + 4, Load4(out->m + 4) * height);
    SetAxis(out, 3, b.position.x, b.position.y, b.position.z);
    QexMatrix_Multiply(out, &camera.viewMatrix, out);
    if (b.mode == QEX_BILLBOARD_SCREEN || b.mode == QEX_BILLBOARD_UPRIGHT) {
        SetAxis(out, 0, width, 0, 0);
        if (b.mode == QEX_BILLBOARD_SCREEN) SetAxis(out, 1, 0, height, 0);
        SetAxis(out, 2, 0, 0, 1);
    }
    QexMatrix_Multiply(out, &camera.projectionMatrix, out);
}

// The same for a billboard that faces the screen, under a view without perspective: only its position goes
// through the view. Particles are like that.
void BuildScreenMVP(QexMatrix* out, const QexBillboard& b, const QexCamera& camera) {
    const float *v = camera.viewMatrix.m, *p = camera.projectionMatrix.m;
    const Float4 p0 = Load4(p), p1 = Load4(p + 4), p2 = Load4(p + 8), p3 = Load4(p + 12);
    const Float4 position = {b.position.x, b.position.y, b.position.z, 1};
    const Float4 at = Combine3(Load4(v), Load4(v + 4), Load4(v + 8), position) + Load4(v + 12);
    Store4(out->m, p0 * (b.width * b.scale.x));
    Store4(out->m + 4, p1 * (b.height * b.scale.y));
    Store4(out->m + 8, p2);
    Store4(out->m + 12, Combine3(p0, p1, p2, at) + p3 * Splat<3>(at));
}

bool HasPerspective(const QexMatrix& view) {
    return view.m[3] != 0 || view.m[7] != 0 || view.m[11] != 0;
}

void BuildAnyMVP(QexMatrix* out, const QexBillboard& b, const QexCamera& camera) {
    const bool simple = b.mode == QEX_BILLBOARD_SCREEN && !HasPerspective(camera.viewMatrix);
    (simple ? BuildScreenMVP : BuildMVP)(out, b, camera);
}

}  // namespace

void QexBillboard_Queue(const QexBillboard& billboard, const QexCamera& camera) {
    QexMatrix mvp;
    BuildAnyMVP(&mvp, billboard, camera);
    QexBillboardBatch_Add(billboard, mvp);
}

extern "C" {

uint32_t g_BillboardVShader;
uint32_t g_BillboardFShader;
uint32_t g_BillboardShaderProgramID;
int32_t g_BillboardInPosLoc;
int32_t g_BillboardUVLoc;
int32_t g_BillboardMvpMatrixLoc;
int32_t g_BillboardOpacityLoc;
int32_t g_BillboardAlphaThresholdLoc;
int32_t g_BillboardTextureLoc;
int32_t g_BillboardCount;
const float g_BB_Vertices[12] = {-0.5f, 0.5f, 0, 0.5f, 0.5f, 0, -0.5f, -0.5f, 0, 0.5f, -0.5f, 0};
const float g_BB_UVs[8] = {0, 1, 1, 1, 0, 0, 1, 0};
const uint8_t g_BB_indices[4] = {0, 2, 1, 3};
QexVec3 g_VecUp;
QexVec3 g_VecNormal;

QexBillboard* QexBillboard_Create(QexTexture* texture) {
    QexScratch<QexBillboard> billboard(1);
    if (!billboard || (!g_BillboardShaderProgramID && !CreateProgram())) return nullptr;
    QexBillboard& b = billboard[0];
    b = {};
    QexBillboard_SetTexture(&b, texture);
    b.scale = {1, 1, 1};
    b.mode = QEX_BILLBOARD_SCREEN;
    b.opacity = 1;
    ++g_BillboardCount;
    return billboard.Take();
}

void QexBillboard_SetTexture(QexBillboard* billboard, QexTexture* texture) {
    if (!billboard) return;
    if (!texture) texture = Qextexture_GetDefault();
    billboard->texture = texture;
    billboard->width = static_cast<float>(texture->width);
    billboard->height = static_cast<float>(texture->height);
    billboard->unitScale = 1;
}

// Without error checks: a particle system draws hundreds of these.
void QexBillboard_Draw(QexBillboard* billboard, const QexCamera* camera) {
    if (!billboard || !camera) return;
    if (QexLeanState_IsLean()) {
        QexBillboard_Queue(*billboard, *camera);
        QexBillboardBatch_Draw();
        return;
    }
    if (!g_BillboardShaderProgramID) return;  // of a lost context
    QexMatrix mvp;
    BuildAnyMVP(&mvp, *billboard, *camera);
    QexRenderState_UseProgram(g_BillboardShaderProgramID);
    glUniform1f(g_BillboardOpacityLoc, billboard->opacity);
    glUniform1f(g_BillboardAlphaThresholdLoc, kAlphaThreshold);
    glUniformMatrix4fv(g_BillboardMvpMatrixLoc, 1, GL_FALSE, mvp.m);
    glUniform1i(g_BillboardTextureLoc, kDiffuseUnit);
    QexTexture_Set(billboard->texture, kDiffuseUnit);
    const QexQuadArray arrays[] = {{g_BillboardInPosLoc, 3, g_BB_Vertices}, {g_BillboardUVLoc, 2, g_BB_UVs}};
    glDisable(GL_CULL_FACE);
    QexQuad_Draw(nullptr, arrays);
    glEnable(GL_CULL_FACE);
}

void QexBillboard_Release(QexBillboard* billboard) {
    if (!billboard) return;
    QexMemory_Free(billboard);
    if (--g_BillboardCount != 0) return;
    QexProgram_Delete(kProgramNames, false);
    QexBillboardBatch_Release();
}

}  // extern "C"

#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexBillboard) == 60, "15 words");
#endif
