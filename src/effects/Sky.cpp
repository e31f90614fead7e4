// The sky cube around the camera, and a plane of water at a fixed height in it. The water takes three passes:
// the mirrored scene into one texture, the water's surface, which distorts that one, into a second, and the
// water's plane on the screen, which shows the second one where it lies.
#include <cmath>
#include <cstdio>

#include "base/Memory.h"
#include "effects/SkyPrograms.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexSkyBox"

namespace {

constexpr int32_t kTargetSize = 256;  // pixels, of both textures
constexpr int32_t kNormalisationSize = 8;
constexpr float kWaveDistortion = 30;
constexpr float kClipOffset = 2.5f;  // how far below the surface the mirrored scene is cut
constexpr int kMaxWaterVertices = 5;
constexpr int32_t kVertexBytes = 3 * sizeof(float);

// Of the two layers of waves.
constexpr QexVec2 kBumpVelocities[] = {{0.16f, -0.14f}, {0.25f, -0.3f}};
constexpr QexVec2 kBumpScales[] = {{0.0012f, 0.0012f}, {0.0005f, 0.0005f}};

// The cube +-1, a strip of four corners a face: back, right, front, left, top, bottom.
constexpr int kFaces = 6;
constexpr int8_t kCube[kFaces * 4][3] = {
    {-1, 1, -1}, {1, 1, -1}, {-1, -1, -1}, {1, -1, -1}, {1, 1, -1},   {1, 1, 1},   {1, -1, -1}, {1, -1, 1},
    {1, 1, 1},   {-1, 1, 1}, {1, -1, 1},   {-1, -1, 1}, {-1, 1, 1},   {-1, 1, -1}, {-1, -1, 1}, {-1, -1, -1},
    {-1, 1, 1},  {1, 1, 1},  {-1, 1, -1},  {1, 1, -1},  {-1, -1, -1}, {1, -1, -1}, {-1, -1, 1}, {1, -1, 1}};
constexpr uint32_t kSkyBytes = sizeof kCube / sizeof kCube[0] * 3 * sizeof(float);

bool s_Drawable;     // all of it is there
bool s_WasDrawable;  // when the context was lost
float *s_SkyVertices, *s_SkyTexCoords;
GLuint s_SkyBuffer;
QexRenderTarget s_Reflection, s_Surface;
QexTexture s_Normalisation;

QexVec4 s_Plane;
QexMatrix s_View, s_Projection;
GLint s_SavedFramebuffer;
float s_WaterVertices[kMaxWaterVertices * 3];

void SetMatrix(GLint location, const QexMatrix& matrix) {
    QEX_GL(glUniformMatrix4fv(location, 1, GL_FALSE, matrix.m));
}

// ---- Set-up ----

// False, with a line, when the GL cannot draw into it.
bool CreateTarget(QexRenderTarget* target) {
    GLenum status;
    if (QexRenderTarget_Create(target, kTargetSize, kTargetSize, 0) != 0) return false;
    QexTexture_SetFilter(&target->colorTexture, QEX_FILTER_LINEAR);
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, target->framebuffer));
    QEX_GL(glClear(GL_COLOR_BUFFER_BIT));
    QEX_GL(status = glCheckFramebufferStatus(GL_FRAMEBUFFER));
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(target->savedFramebuffer)));
    if (status == GL_FRAMEBUFFER_COMPLETE) return true;
    QexSystem_Printf("ERROR: Frame buffer did not set up correctly\n");
    return false;
}

void FillBuffer() {
    QEX_GL(glGenBuffers(1, &s_SkyBuffer));
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, s_SkyBuffer));
    QEX_GL(glBufferData(GL_ARRAY_BUFFER, kSkyBytes, s_SkyVertices, GL_STATIC_DRAW));
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, 0));
}

void Forget() {
    s_SkyBuffer = 0;
    s_WasDrawable |= s_Drawable;
    s_Drawable = false;
    QexSkyBox_ForgetPrograms();
}
// Textures and targets are there again.
bool Restore() {
    const QexMaking making;
    if (!s_SkyVertices) return true;
    FillBuffer();
    s_Drawable = QexSkyBox_CreatePrograms() && !making.Failed();
    return s_Drawable || !s_WasDrawable;
}
QexContextPart s_Part = {kRankOthers, Forget, nullptr, Restore, nullptr, false};

void SetCamera(const QexCamera& camera) {
    QexMatrix_LookAtRH(&s_View, &camera.eye, &camera.target, &camera.up);
    QexMatrix_Perspective(&s_Projection, camera.fov, camera.aspect, camera.nearPlane, camera.farPlane);
}

// ---- Drawing ----

QexMatrix ViewProjection() {
    QexMatrix product;
    QexMatrix_Multiply(&product, &s_Projection, &s_View);
    return product;
}

void BindTarget(GLuint framebuffer) {
    // Whatever the application's last frame ended with.
    QexRenderer_SetZWrite(1);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, framebuffer));
    QEX_GL(glViewport(0, 0, kTargetSize, kTargetSize));
    QEX_GL(glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT));
}

void BindScreen(const QexRuntimeContext* context) {
    QEX_GL(glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(s_SavedFramebuffer)));
    QEX_GL(glViewport(0, 0, context->width, context->height));
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
}

void DrawSky(const QexSkyBox& box) {
    QexRenderState_UseProgram(g_QexSkyProgram.program);
    QexRenderState_ActiveTexture(GL_TEXTURE0);
    QexRenderState_Bind(GL_TEXTURE_CUBE_MAP, box.skyTexture->glName);
    QexMatrix model, mvp = ViewProjection();
    QexMatrix_Translate(&model, box.centre.x, box.centre.y, box.centre.z);
    QexMatrix_Multiply(&mvp, &mvp, &model);
    SetMatrix(g_QexSkyProgram.modelMatrix, model);
    SetMatrix(g_QexSkyProgram.mvpMatrix, mvp);
    QEX_GL(glDisable(GL_CULL_FACE));
    QexRenderState_Restore();
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, s_SkyBuffer));
    QEX_GL(glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, 3 * sizeof(float), nullptr));
    QEX_GL(glEnableVertexAttribArray(0));
    for (int face = 0; face < kFaces; ++face) QEX_GL(glDrawArrays(GL_TRIANGLE_STRIP, 4 * face, 4));
    QEX_GL(glDisableVertexAttribArray(0));
    QEX_GL(glEnable(GL_CULL_FACE));
    QEX_GL(glBindBuffer(GL_ARRAY_BUFFER, 0));
}

// The application's scene, and the sky behind it.
void DrawScene(QexSkyBox* box) {
    if (box->drawScene) box->drawScene(box, &s_View, &s_Projection);
    const QexCamera& camera = *box->camera;
    QexMatrix_Perspective(&s_Projection, camera.fov, camera.aspect, camera.nearPlane, camera.farPlane);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    DrawSky(*box);
}

void DrawFan(int32_t count) {
    QEX_GL(glEnableVertexAttribArray(0));
    if (count) {
        QEX_GL(glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, kVertexBytes, s_WaterVertices));
        QEX_GL(glDrawArrays(GL_TRIANGLE_FAN, 0, count));
    }
    QEX_GL(glDisableVertexAttribArray(0));
}

void DrawFanLean(int32_t count) {
    const GLuint buffer = QexLeanState_StreamBuffer();
    const QexFloatAttribute position = {0, 3, 0};
    if (!count) return;
    QexLeanState_Fill(buffer, s_WaterVertices, static_cast<size_t>(count) * kVertexBytes, GL_STREAM_DRAW);
    QexLeanState_BindFloats({buffer, 0, kVertexBytes, &position, 1});
    glDrawArrays(GL_TRIANGLE_FAN, 0, count);
}

// Draws what the camera sees of the water's plane with the program in use.
void DrawWaterPlane(const QexCamera& camera) {
    // QexMatrix_Perspective is the usual projection divided by the far distance. The polygon is that of the
    // usual one, which puts its far corners where the picture has them.
    QexMatrix inverse = ViewProjection();
    for (float& element : inverse.m) element *= camera.farPlane;
    QexMatrix_InverseEx(&inverse, &inverse);
    const int32_t count = QexMath_CalculateInfinitePlane(s_WaterVertices, kVertexBytes, &s_Plane, &inverse,
                                                         &camera.eye, camera.farPlane);
    QEX_GL(glDisable(GL_CULL_FACE));
    (QexLeanState_IsLean() ? DrawFanLean : DrawFan)(count);
    QEX_GL(glEnable(GL_CULL_FACE));
}

void MirrorView() {
    QexMatrix mirror;
    QexMatrix_Identity(&mirror);
    mirror.m[1] = -s_Plane.x;
    mirror.m[5] = -s_Plane.y;
    mirror.m[9] = -s_Plane.z;
    mirror.m[13] = -2 * s_Plane.w;
    QexMatrix_Multiply(&s_View, &s_View, &mirror);
}

float Dot(const QexVec4& a, const QexVec4& b) {
    return a.x * b.x + a.y * b.y + a.z * b.z + a.w * b.w;
}

// Makes the near plane the water's, a little lowered, so that what lies below it is cut off, after Lengyel,
// "Oblique View Frustum Depth Projection and Clipping", Journal of Game Development 1.2, 2005.
void ClipAtWater(float farPlane) {
    QexMatrix inverse;
    QexVec4 clip = {s_Plane.x, s_Plane.y, s_Plane.z, s_Plane.w + kClipOffset}, corner, transposed;
    QexMatrix_TransformVec4Raw(QexMatrix_InverseEx(&inverse, &s_View), &clip, &clip);
    const QexVec4 opposite = {Qex_Sign(clip.x), Qex_Sign(clip.y), 1, 1};
    QexMatrix_InverseEx(&inverse, &s_Projection);
    // The far plane goes through the corner opposite to the clip plane, so that nothing of the view is lost,
    // or beyond it, which costs depth precision alone: the transposed inverse puts it further away unless the
    // camera is low or the near plane below 1.
    QexMatrix_TransformVec4(&inverse, &opposite, &corner);
    QexMatrix_TransformVec4Raw(&inverse, &opposite, &transposed);
    const float reach = fmaxf(Dot(corner, clip), Dot(transposed, clip));
    if (!(reach > 0)) return;  // the volume lies behind the plane
    const float scale = 2 * farPlane / reach;
    s_Projection.m[2] = scale * clip.x / farPlane;
    s_Projection.m[6] = scale * clip.y / farPlane;
    s_Projection.m[10] = (scale * clip.z + 1) / farPlane;
    s_Projection.m[14] = scale * clip.w / farPlane;
}

void DrawReflection(QexSkyBox* box) {
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &s_SavedFramebuffer));
    BindTarget(s_Reflection.framebuffer);
    SetCamera(*box->camera);
    MirrorView();
    ClipAtWater(box->camera->farPlane);
    QexRenderer_SetBackFaceCulling(QEX_CULL_FRONT);
    DrawScene(box);
}

float WaveStep(float velocity) {
    return static_cast<float>(fmod(static_cast<double>(velocity) * 100, 1));
}

void SetWaves() {
    QexVec2 translations[2];
    for (int i = 0; i < 2; ++i)
        translations[i] = {WaveStep(kBumpVelocities[i].x), WaveStep(kBumpVelocities[i].y)};
    QexDiagnostics_Print(stdout, "T0:%f, S0:%f, T1:%f, S1:%f\n", static_cast<double>(translations[0].x),
                         static_cast<double>(kBumpScales[0].x), static_cast<double>(translations[1].x),
                         static_cast<double>(kBumpScales[1].x));
    for (int i = 0; i < 2; ++i) {
        QEX_GL(glUniform2fv(g_QexWaterProgram.bumpTranslation[i], 1, &translations[i].x));
        QEX_GL(glUniform2fv(g_QexWaterProgram.bumpScale[i], 1, &kBumpScales[i].x));
    }
}

void DrawSurface(const QexSkyBox& box) {
    const QexCamera& camera = *box.camera;
    BindTarget(s_Surface.framebuffer);
    SetCamera(camera);
    QexRenderState_UseProgram(g_QexWaterProgram.program);
    QexTexture_Set(box.waterNormalTexture, 0);
    QexRenderState_ActiveTexture(GL_TEXTURE1);
    QexRenderState_Bind(GL_TEXTURE_2D, s_Reflection.colorTexture.glName);
    QexRenderState_ActiveTexture(GL_TEXTURE2);
    QexRenderState_Bind(GL_TEXTURE_CUBE_MAP, s_Normalisation.glName);
    SetMatrix(g_QexWaterProgram.modelViewMatrix, s_View);
    SetMatrix(g_QexWaterProgram.mvpMatrix, ViewProjection());
    QexMatrix inverse;
    QexMatrix_InverseEx(&inverse, &s_View);
    QEX_GL(glUniform3fv(g_QexWaterProgram.eyePosition, 1, &inverse.m[12]));
    QEX_GL(glUniform4fv(g_QexWaterProgram.waterColour, 1, box.waterColour));
    SetWaves();
    // Without a normal map the water is smooth.
    QEX_GL(glUniform1f(g_QexWaterProgram.waveDistortion, box.waterNormalTexture ? kWaveDistortion : 0));
    QEX_GL(glUniform2f(g_QexWaterProgram.rcpWindowSize, 1.0f / kTargetSize, 1.0f / kTargetSize));
    DrawWaterPlane(camera);
}

void DrawOnScreen(const QexRuntimeContext* context, const QexSkyBox& box) {
    QEX_GL(glGetIntegerv(GL_FRAMEBUFFER_BINDING, &s_SavedFramebuffer));
    QexRenderState_UseProgram(m_PlaneTexShader.program);
    QexRenderState_ActiveTexture(GL_TEXTURE0);
    QexRenderState_Bind(GL_TEXTURE_2D, s_Surface.colorTexture.glName);
    SetMatrix(m_PlaneTexShader.mvpMatrixLoc, ViewProjection());
    QEX_GL(glUniform2f(m_PlaneTexShader.rcpWindowSizeLoc, 1.0f / static_cast<float>(context->width),
                       1.0f / static_cast<float>(context->height)));
    DrawWaterPlane(*box.camera);
    BindScreen(context);
}

}  // namespace

extern "C" {

void QexSky_NewVertices(float scale, int32_t inset, int32_t textureSize, float** vertices,
                        float** texCoords) {
    if (!vertices || !texCoords) return;
    constexpr int count = kFaces * 4;
    const float a = inset ? 4.0f / static_cast<float>(textureSize) : 0, b = 1 - a;
    *vertices = static_cast<float*>(QexMemory_Alloc(kSkyBytes));
    *texCoords = static_cast<float*>(QexMemory_Alloc(count * 2 * sizeof(float)));
    if (!*vertices || !*texCoords) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        QexMemory_Free(*vertices);
        QexMemory_Free(*texCoords);
        *vertices = *texCoords = nullptr;
        return;
    }
    for (int i = 0; i < count; ++i) {
        for (int axis = 0; axis < 3; ++axis) (*vertices)[3 * i + axis] = kCube[i][axis] * scale;
        (*texCoords)[2 * i] = i & 1 ? b : a;
        (*texCoords)[2 * i + 1] = i & 2 ? a : b;
    }
}

int32_t QexSkyBox_Create(QexSkyBox* box) {
    if (!box || !box->skyTexture || !box->camera) {
        QexError(QEX_TAG, "<QexSkyBox_Create> a sky box without %s",
                 !box           ? "a record"
                 : !box->camera ? "a camera"
                                : "a sky texture");
        return -1;
    }
    const QexMaking making;
    QexSkyBox_Release();
    s_Plane = {0, 1, 0, box->waterHeight};
    QexSky_NewVertices(box->size * 0.5f, 1, box->skyTexture->width, &s_SkyVertices, &s_SkyTexCoords);
    if (!s_SkyVertices ||
        QexTexture_GenerateNormalisationCubeMap(&s_Normalisation, kNormalisationSize) != 0) {
        QexSkyBox_Release();
        return -1;
    }
    QexRenderState_Restore();
    FillBuffer();
    QexContext_Register(&s_Part);
    const bool linked = QexSkyBox_CreatePrograms();
    SetCamera(*box->camera);
    QEX_GL(glClearColor(box->waterColour[0], box->waterColour[1], box->waterColour[2], 1));
    if (!CreateTarget(&s_Reflection) || !CreateTarget(&s_Surface)) {
        if (making.Failed()) QexSkyBox_Release();
        return -1;
    }
    QexRenderer_SetZWrite(1);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    s_Drawable = linked;
    if (!making.Failed()) return 0;
    QexSkyBox_Release();
    return -1;
}

void QexSkyBox_Update(const QexRuntimeContext* context, QexSkyBox* box, int32_t) {
    if (!s_Drawable || !context || !box || !box->skyTexture || !box->camera) return;
    const bool water = box->waterEnabled == 1;
    if (water) {
        DrawReflection(box);
        DrawSurface(*box);
        BindScreen(context);
    }
    SetCamera(*box->camera);
    DrawScene(box);
    if (water) DrawOnScreen(context, *box);
}

void QexSkyBox_Release(void) {
    if (!s_SkyVertices) return;
    s_Drawable = s_WasDrawable = false;
    QexMemory_Free(s_SkyVertices);
    QexMemory_Free(s_SkyTexCoords);
    s_SkyVertices = s_SkyTexCoords = nullptr;
    QexRenderTarget_Release(&s_Reflection);
    QexRenderTarget_Release(&s_Surface);
    QEX_GL_CHECK();
    if (s_Normalisation.glName) QexTexture_Release(&s_Normalisation);
    QexSkyBox_ReleasePrograms();
    if (s_SkyBuffer) QEX_GL(glDeleteBuffers(1, &s_SkyBuffer));
    s_SkyBuffer = 0;
}

}  // extern "C"

#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexSkyBox) == 72, "18 words");
#endif
