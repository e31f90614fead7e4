#include "RenderEffects.h"

#include <cstdio>
#include <cstring>

#include <GLES2/gl2.h>

namespace {

// The clip-space z of a camera's near and far plane.
constexpr float kNearDepth = 0, kFarDepth = 1;
constexpr float kShadowIntensity = 0.4f, kShadowBias = 0.01f;
constexpr float kCasterMargin = 1.3f;
constexpr float kMirrorOpacity = 0.6f;  // of the plane over its image

using Create = QexShaderModule* (*)(void);
using ReleaseModule = void (*)(QexShaderModule**);
using SetParameters = void (*)(QexShaderModule*, float, float);

// Modules by their short names. What has no skinned sister leaves skinned nodes to the engine's choice.
struct ShaderRow {
    const char* name;
    Create create;
    ReleaseModule release;
    Create createSkinned;
    ReleaseModule releaseSkinned;
    SetParameters setDepth, setSkinnedDepth;
};

#define PAIR(Name, Skinned) Name##_CreateProgram, Name##_Release, Skinned##_CreateProgram, Skinned##_Release

const ShaderRow kShaders[] = {
    {"texture", PAIR(QexTextureShader, QexSkinningTextureShader), nullptr, nullptr},
    {"texture-noalpha", PAIR(QexTextureNoAlphaShader, QexSkinningTextureNoAlphaShader), nullptr, nullptr},
    {"gouraud", PAIR(QexGouraudShader, QexSkinningGouraudShader), nullptr, nullptr},
    {"specular", PAIR(QexGouraudSpecularShader, QexSkinningGouraudSpecularShader), nullptr, nullptr},
    {"normalmap", PAIR(QexGouraudNormalMapShader, QexSkinningGouraudNormalMapShader), nullptr, nullptr},
    {"shadow", PAIR(QexGouraudShadowShader, QexSkinningGouraudShader), nullptr, nullptr},
    {"shadow-ext", PAIR(QexGouraudShadowExtShader, QexSkinningGouraudShader), nullptr, nullptr},
    {"uv", PAIR(QexUVDisplacementShader, QexSkinningTextureShader), nullptr, nullptr},
    {"simple", QexSimpleShader_CreateProgram, QexSimpleShader_Release, nullptr, nullptr, nullptr, nullptr},
    {"depth", PAIR(QexDepthShader, QexSkinningDepthShader), QexDepthShader_SetParameters,
     QexSkinningDepthShader_SetParameters},
};

const ShaderRow* FindShader(const std::string& name) {
    for (const ShaderRow& row : kShaders)
        if (name == row.name) return &row;
    return nullptr;
}

// The names of the scene's nodes, as many as a line may hold.
std::string NodeNames(const QexPODModel& scene) {
    std::string names;
    for (uint32_t i = 0; i < scene.nodeCount; ++i) {
        if (!scene.nodes[i].name) continue;
        if (names.size() > 400) return names + ", ...";
        names += (names.empty() ? "" : ", ") + std::string(scene.nodes[i].name);
    }
    return names.empty() ? "none with a name" : names;
}

// A skinned node's box goes along with one of its bones; the others may reach beyond it.
void Widen(QexBoundingBox* box) {
    for (QexVec3& corner : box->corners) QexVec3_Lerp(&corner, &box->centre, &corner, kCasterMargin);
}

// What draws the passes of a frame: the depth pass gets no arguments of its caller.
const DrawPass* s_drawPass;

int32_t CallDrawPass(QexRuntimeContext*, void*, void*, void*, QexShaderModule* module,
                     QexShaderModule* skinned, const float*) {
    (*s_drawPass)(module, skinned);
    return 0;
}

// Where the shadow's light shines: the first directional light, or from the first point light to the target.
QexVec3 ShadowDirection(const QexLightSet& lights, const QexCamera& camera) {
    for (uint32_t i = 0; i < lights.count; ++i) {
        const float* v = lights.lights[i].vector;
        if (lights.lights[i].type == QEX_LIGHT_DIRECTIONAL) return {v[0], v[1], v[2]};
    }
    QexVec3 direction = {0, -1, 0};
    if (lights.count) {
        const float* v = lights.lights[0].vector;
        const QexVec3 from = {v[0], v[1], v[2]};
        QexVec3_Subtract(&direction, &camera.target, &from);
    }
    return direction;
}

}  // namespace

std::string ShaderNames() {
    std::string names;
    for (const ShaderRow& row : kShaders) names += (names.empty() ? "" : ", ") + std::string(row.name);
    return names;
}

bool IsShaderName(const std::string& name) {
    return FindShader(name) != nullptr;
}

void SceneShaders::Use(QexModel* model, const std::string& name) {
    const ShaderRow* row = FindShader(name);
    if (!row) return;
    Release();
    row_ = static_cast<size_t>(row - kShaders);
    static_ = row->create();
    if (row->createSkinned) skinned_ = row->createSkinned();
    const std::pair<SetParameters, QexShaderModule*> modules[] = {{row->setDepth, static_},
                                                                  {row->setSkinnedDepth, skinned_}};
    for (const auto& [set, module] : modules) {
        if (!set || !module) continue;
        QexRenderState_UseProgram(module->program);
        set(module, kNearDepth, kFarDepth);
    }
    QexModel_SetShaderProgramForAllNode(model, static_, skinned_);
}

void SceneShaders::Release() {
    if (static_) kShaders[row_].release(&static_);
    if (skinned_) kShaders[row_].releaseSkinned(&skinned_);
}

ShaderOverride::ShaderOverride(QexModel* model, QexShaderModule* module, QexShaderModule* skinned)
    : model_(model) {
    if (!model) return;
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) own_.push_back(model->scene.nodes[i].shader);
    QexModel_SetShaderProgramForAllNode(model, module, skinned);
}

ShaderOverride::~ShaderOverride() {
    for (size_t i = 0; i < own_.size(); ++i) model_->scene.nodes[i].shader = own_[i];
}

int32_t FindNode(const QexModel& model, const std::string& name, std::string* problem) {
    const int32_t index = QexModel_FindNodeIdxByName(&model, name.c_str());
    if (index < 0) *problem = "no node '" + name + "'; the scene has " + NodeNames(model.scene);
    return index;
}

std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes) {
    std::string problem;
    for (const NodeChange& change : changes) {
        const int32_t found = FindNode(*model, change.node, &problem);
        if (found < 0) return problem;
        const uint32_t node = static_cast<uint32_t>(found);
        const QexVec3& v = change.value;
        if (change.what == "hide") QexModel_EnableNodeRenderingR(model, node, 0);
        if (change.what == "move") QexModel_SetNodePosition(model, node, v.x, v.y, v.z);
        if (change.what == "rotate") QexModel_SetNodeRotation(model, node, v.x, v.y, v.z);
        if (change.what == "face") QexModel_SetNodeFaceTo(model, node, &v);
    }
    return "";
}

QexLightSet ChooseLights(QexModel* model, const EffectOptions& options, const QexCamera& camera) {
    QexLightSet set = {};
    for (const QexLight& light : options.lights)
        if (set.count < QEX_MAX_LIGHTS) set.lights[set.count++] = light;
    if (!set.count) QexModel_GetLight(model, &set);
    if (!set.count) {
        QexVec3 direction;
        QexVec3_Subtract(&direction, &camera.target, &camera.eye);
        set.count = 1;
        set.lights[0] = {QEX_LIGHT_DIRECTIONAL, {direction.x, direction.y, direction.z}, {1, 1, 1, 1}};
    }
    return set;
}

void DrawWithShadow(QexRuntimeContext* engine, QexModel* floor, QexModel* model, const QexLightSet& lights,
                    const QexCamera& camera) {
    const QexShadowCaster all = {model, 1, nullptr, 0};
    const QexVec3 direction = ShadowDirection(lights, camera);
    GLfloat clear[4];
    glGetFloatv(GL_COLOR_CLEAR_VALUE, clear);
    QexModel_UpdateModelBoundingBox(model, nullptr);
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) Widen(&model->nodeBoxes[i]);
    QexShadowInfo* info =
        QexModel_InitShadowInfo(&camera, &direction, &all, 1, kShadowIntensity, kShadowBias);
    QexModel_RenderShadow(engine, nullptr, info);
    glDisable(GL_SCISSOR_TEST);
    glClearColor(clear[0], clear[1], clear[2], clear[3]);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    if (floor) QexModel_RenderFromCameraWithShadow(floor, &lights, &camera, nullptr, info, 0);
    for (uint32_t pass = 0; pass <= model->scene.highestPass; ++pass)
        QexModel_RenderFromCameraWithShadow(model, &lights, &camera, nullptr, info, pass);
    QexModel_ReleaseShadowInfo(info);
}

void DrawMirrored(QexModel* model, const EffectOptions& options, const QexLightSet& lights,
                  const QexCamera& camera) {
    const QexShadowCaster all = {model, 1, nullptr, 0};
    const int32_t node = QexModel_FindNodeIdxByName(model, options.mirrorNode.c_str());
    QexReflection* reflection = nullptr;
    if (options.mirror) {
        const QexVec3 normal = {0, 1, 0}, point = {0, *options.mirror, 0};
        reflection = QexReflection_InitReflectionInfoInfinite(model, &normal, &point, &all, 1);
    } else if (node >= 0) {
        QexModel_SetOpacity(model, static_cast<uint32_t>(node), kMirrorOpacity);
        reflection = QexReflection_InitReflectionInfo(model, static_cast<uint32_t>(node), &all, 1, 1);
    }
    if (!reflection) return;
    glClearStencil(0);
    glClear(GL_STENCIL_BUFFER_BIT);
    QexReflection_RenderReflection(reflection, &lights, &camera);
    QexReflection_Release(reflection);
}

void DrawWithDepthOfField(QexRuntimeContext* engine, const EffectOptions& options, const DrawPass& draw) {
    const DepthOfField& effect = *options.depthOfField;
    // Steps of a pixel of the targets.
    const float step = options.fullBlur ? 1 : 2;
    const float stepX = step / static_cast<float>(engine->width),
                stepY = step / static_cast<float>(engine->height);
    for (uint32_t half : {0, 1})
        QexTexture_SetFilter(&QexPP_GetRenderTarget(half)->colorTexture, QEX_FILTER_LINEAR);
    s_drawPass = &draw;
    QexPostProcessing_DrawDOF(engine, nullptr, nullptr, nullptr, CallDrawPass, effect.focus, effect.range,
                              stepX, stepY, effect.sigma, effect.samples, options.fullBlur ? 2 : 0,
                              kNearDepth, kFarDepth);
    s_drawPass = nullptr;
}

void PrintPicked(QexRuntimeContext* engine, QexModel* model, const QexCamera& camera,
                 const std::vector<QexVec2>& points) {
    std::vector<uint32_t> hit(model->scene.meshNodeCount + size_t{1});
    QexModel_UpdateModelBoundingBox(model, nullptr);
    QexModel_CalcScreenBBox(engine, model, &camera);
    for (const QexVec2& point : points) {
        int32_t count = 0;
        QexModel_Pick(model, nullptr, &point, &count, hit.data(),
                      static_cast<int32_t>(model->scene.meshNodeCount));
        printf("%g,%g:", static_cast<double>(point.x), static_cast<double>(point.y));
        for (int32_t i = 0; i < count; ++i) {
            const char* name = QexModel_GetNodeName(model, hit[static_cast<size_t>(i)]);
            printf(" %s", name ? name : "(no name)");
        }
        printf("\n");
    }
}
