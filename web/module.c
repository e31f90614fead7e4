/* What the JavaScript module needs besides the engine's own functions: calls that take numbers in place of
 * records. */
#include <stdlib.h>
#include <string.h>

#include <emscripten.h>
#include <GLES2/gl2.h>
#include <Qex.h>

typedef struct WebModel {
    QexModel model;
    QexMatrix place;
} WebModel;

static QexRuntimeContext s_Engine;
static QexCamera s_Camera;
static QexLightSet s_Lights;
static QexShaderModule *s_Lit, *s_Skinned;

EMSCRIPTEN_KEEPALIVE int QexWeb_Start(int width, int height) {
    QexEngineConfig config = {0};
    config.width = width;
    config.height = height;
    QexEngine_KeepTextures(1);
    if (QexEngine_Init(&s_Engine, sizeof config, &config) != 0) return -1;
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    s_Lit = QexGouraudShader_CreateProgram();
    s_Skinned = QexSkinningGouraudShader_CreateProgram();
    return s_Lit && s_Skinned ? 0 : -1;
}

EMSCRIPTEN_KEEPALIVE void QexWeb_Stop(void) {
    QexGouraudShader_Release(&s_Lit);
    QexSkinningGouraudShader_Release(&s_Skinned);
    QexEngine_Shutdown(&s_Engine);
}

EMSCRIPTEN_KEEPALIVE void QexWeb_Resize(int width, int height) {
    QexEngine_Resize(&s_Engine, width, height);
}

/* A file of the module's memory, with its textures beside it; null where it cannot be loaded. */
EMSCRIPTEN_KEEPALIVE WebModel* QexWeb_LoadModel(const char* folder, const char* name) {
    WebModel* model = calloc(1, sizeof *model);
    if (!model) return NULL;
    QexModel_Create(&model->model);
    QexMatrix_Identity(&model->place);
    if (QexModel_LoadContent(&model->model, folder, name) != 0) {
        free(model);
        return NULL;
    }
    QexModel_SetShaderProgramForAllNode(&model->model, s_Lit, s_Skinned);
    return model;
}

EMSCRIPTEN_KEEPALIVE void QexWeb_UnloadModel(WebModel* model) {
    QexModel_Unload(&model->model);
    free(model);
}

/* Where `box` is to get the smallest and the largest coordinates. */
EMSCRIPTEN_KEEPALIVE void QexWeb_GetBounds(WebModel* model, QexAABB* box) {
    uint32_t i, j;
    memset(box, 0, sizeof *box);
    QexModel_UpdateModelBoundingBox(&model->model, NULL);
    for (i = 0; i < QexModel_GetNumMeshNodes(&model->model); ++i)
        for (j = 0; j < 8; ++j) {
            const QexVec3 corner = model->model.nodeBoxes[i].corners[j];
            const int first = i == 0 && j == 0;
            if (first || corner.x < box->min.x) box->min.x = corner.x;
            if (first || corner.y < box->min.y) box->min.y = corner.y;
            if (first || corner.z < box->min.z) box->min.z = corner.z;
            if (first || corner.x > box->max.x) box->max.x = corner.x;
            if (first || corner.y > box->max.y) box->max.y = corner.y;
            if (first || corner.z > box->max.z) box->max.z = corner.z;
        }
}

EMSCRIPTEN_KEEPALIVE QexMatrix* QexWeb_GetPlace(WebModel* model) {
    return &model->place;
}

EMSCRIPTEN_KEEPALIVE void QexWeb_SetCamera(const QexVec3* eyeAndTarget, float fov, float nearPlane,
                                           float farPlane) {
    QexCamera_Create(&s_Camera, 0);
    QexCamera_LookAt(&s_Camera, &eyeAndTarget[0], &eyeAndTarget[1], NULL);
    QexCamera_Project(&s_Camera, fov, (float)s_Engine.width / (float)s_Engine.height, nearPlane, farPlane);
}

EMSCRIPTEN_KEEPALIVE void QexWeb_ClearLights(void) {
    s_Lights.count = 0;
}

/* Six numbers: a position or direction, and a colour. */
EMSCRIPTEN_KEEPALIVE void QexWeb_AddLight(int type, const float* numbers) {
    QexLight* light = &s_Lights.lights[s_Lights.count];
    if (s_Lights.count == QEX_MAX_LIGHTS) return;
    ++s_Lights.count;
    light->type = type;
    memcpy(light->vector, numbers, sizeof light->vector);
    memcpy(light->colour, numbers + 3, 3 * sizeof(float));
    light->colour[3] = 1;
}

EMSCRIPTEN_KEEPALIVE void QexWeb_Clear(float red, float green, float blue) {
    glViewport(0, 0, s_Engine.width, s_Engine.height);
    QexRenderer_SetZWrite(1);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    glClearColor(red, green, blue, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
}

EMSCRIPTEN_KEEPALIVE void QexWeb_Draw(WebModel* model, float seconds) {
    QexModel_Update(NULL, &model->model, seconds);
    QexModel_RenderWithCamera(&model->model, &s_Lights, &s_Camera, &model->place, 0);
}
