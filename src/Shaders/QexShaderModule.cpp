// Modules from their descriptions: programs, materials, meshes.
#include "Shaders/QexShaderModule.h"

#include "base/Memory.h"
#include "gl/Context.h"
#include "pod/Animation.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"
#include "Shaders/QexShaderVariant.h"

#define QEX_MODULE (type->path)

namespace {

constexpr float kDefaultThreshold = 0.5f;

const char* const kUniformNames[kShaderUniforms] = {"",
#define QEX_SHADER_UNIFORM_NAME(name) #name,
                                                    QEX_SHADER_UNIFORMS(QEX_SHADER_UNIFORM_NAME)
#undef QEX_SHADER_UNIFORM_NAME
};

// The samplers of the texture units.
const char* const kSamplerNames[] = {"sTexture", "sNormalMap", "shadowTexture", "alphaTexture"};

constexpr QexPODMaterial MakeWhite() {
    QexPODMaterial material = {};
    material.opacity = 1;
    for (int i = 0; i < 3; ++i) {
        material.ambient[i] = 0.3f;
        material.diffuse[i] = 1;
    }
    return material;
}

// What a node without a material is drawn with.
constexpr QexPODMaterial kNoMaterial = MakeWhite();

QexTexture* TextureOf(QexTexture** textures, const QexPODNode* node) {
    return node->materialIndex < 0 || !textures ? nullptr : textures[node->materialIndex];
}

// Whether the application's hook has bound a texture for the node.
bool HookBinds(const QexShaderDraw& draw) {
    QexModel* model = draw.model;
    return model->bindTextureHook && model->bindTextureHook(model, draw.nodeIndex);
}

// A module beside what makes it again.
struct Made {
    Made* next;
    const QexShaderModuleType* type;
    int32_t (*setup)(QexShaderModule*);  // or null
    bool built;                          // whether it had a program when the context was lost
    uint32_t context;                    // in which it was made again
    uint32_t set;                        // slots whose uniforms have these values
    float values[QEX_SHADER_SLOTS];
    QexShaderModule module;
};
Made* s_Made;

// Where the list leads to a module; to its end for one that was not made here.
Made** Find(const QexShaderModule* module) {
    Made** at = &s_Made;
    while (*at && &(*at)->module != module) at = &(*at)->next;
    return at;
}

void Forget() {
    for (Made* made = s_Made; made; made = made->next) {
        QexShaderModule& m = made->module;
        made->built |= m.program != 0;
        m.program = m.vertexShader = m.fragmentShader = 0;
    }
}

QexStep Restore(uint32_t) {
    for (Made* made = s_Made; made; made = made->next) {
        if (!made->built || made->context == g_QexContexts) continue;
        made->context = g_QexContexts;
        const bool set = (made->setup ? made->setup(&made->module)
                                      : QexShaderModule_Setup(made->type, &made->module)) == 0;
        made->built = !set;
        for (uint32_t slot = 0; set && made->set >> slot; ++slot)
            if (made->set >> slot & 1) glUniform1f(made->module.slots[slot].location, made->values[slot]);
        return set ? QexStep::kMore : QexStep::kFailed;
    }
    return QexStep::kDone;
}

QexContextPart s_Part = {kRankPrograms, Forget, nullptr, nullptr, nullptr, false, Restore};

QexProgramNames NamesOf(QexShaderModule* module) {
    return {&module->program, &module->vertexShader, &module->fragmentShader};
}

}  // namespace

const QexPODMaterial* QexShaderModule_MaterialOf(const QexModel* model, int32_t index) {
    return index < 0 ? &kNoMaterial : &model->scene.materials[index];
}

const char* QexShaderModule_UniformName(uint8_t uniform) {
    return kUniformNames[uniform];
}

const char* QexShaderModule_AttributeName(uint8_t element) {
    switch (element) {
        case QEX_ELEMENT_POSITION: return "inVertex";
        case QEX_ELEMENT_NORMAL: return "inNormal";
        case QEX_ELEMENT_TANGENT: return "inTangent";
        case QEX_ELEMENT_BINORMAL: return "inBiNormal";
        case QEX_ELEMENT_BONE_INDEX: return "inBoneIndex";
        case QEX_ELEMENT_BONE_WEIGHT: return "inBoneWeight";
        default: return "inTexCoord";
    }
}

const char* QexShaderModule_SamplerName(uint8_t unit) {
    return kSamplerNames[unit];
}

// ---- Lifetime ----

QexShaderModule* QexShaderModule_Alloc(const QexShaderModuleType* type, int32_t (*setup)(QexShaderModule*)) {
    Made* made = QexMemory_AllocZeroed<Made>(1);
    if (!made) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    made->type = type;
    made->setup = setup;
    made->next = s_Made;
    s_Made = made;
    QexContext_Register(&s_Part);
    return &made->module;
}

void QexShaderModule_Free(QexShaderModule* module) {
    Made** at = Find(module);
    Made* made = *at;
    if (made) *at = made->next;
    QexMemory_Free(made ? static_cast<void*>(made) : module);
}

QexShaderModule* QexShaderModule_Create(const QexShaderModuleType* type) {
    QexShaderModule* module = QexShaderModule_Alloc(type);
    if (!module) return nullptr;
    if (QexShaderModule_Setup(type, module) != 0) {
        QexShaderModule_Free(module);
        return nullptr;
    }
    if (type->hasThreshold) {
        module->slots[type->thresholdSlot].value = kDefaultThreshold;
        module->slots[type->thresholdSlot + 1].value = type->secondDefault;
    }
    module->render = type->render;
    QexShaderVariant_Retain(type);
    return module;
}

int32_t QexShaderModule_Setup(const QexShaderModuleType* type, QexShaderModule* module) {
    const QexMaking making;
    if (module->program) QexProgram_Delete(NamesOf(module));
    const char* names[sizeof type->attributes.items];
    for (uint8_t i = 0; i < type->attributes.count; ++i)
        names[i] = QexShaderModule_AttributeName(type->attributes.items[i]);
    QexProgram_Compile({type->path, type->vertexSource, type->fragmentSource, names, type->attributes.count},
                       NamesOf(module));
    if (making.Failed()) return -1;  // nothing is left
    const QexProgramLookup lookup = {type->path, module->program, false};
    QexShaderSlot* slot = module->slots;
    for (const uint8_t uniform : type->uniforms) {
        if (uniform != kUniform_none) slot->location = lookup.Uniform(kUniformNames[uniform]);
        ++slot;
    }
    for (const uint8_t unit : type->units) lookup.SetSampler({kSamplerNames[unit], unit});
    if (!making.Failed()) return 0;
    QexProgram_Delete(NamesOf(module), false);
    return -1;
}

void QexShaderModule_SetFloat(QexShaderModule* module, uint32_t slot, float value) {
    Made* made = *Find(module);
    if (made) {
        made->set |= 1u << slot;
        made->values[slot] = value;
    }
    glUniform1f(module->slots[slot].location, value);
}

void QexShaderModule_Release(const QexShaderModuleType* type, QexShaderModule** module) {
    QexShaderModule* m = *module;
    if (!m) return;
    QexShaderVariant_Release(type);
    QexProgram_Delete(NamesOf(m));
    QexShaderModule_Free(m);
    *module = nullptr;
}

// ---- A node ----

bool QexShaderModule_Begin(QexShaderDraw* draw, const QexShaderModuleType* type, QexShaderModule* module,
                           QexModel* model, uint32_t nodeIndex) {
    if (nodeIndex >= model->scene.meshNodeCount || !model->vertexBuffers) return false;
    QexPODNode* node = &model->scene.nodes[nodeIndex];
    if (!(node->stateFlags & QEX_NODE_RENDERING_ENABLED) || !module->program) return false;
    const QexPODMaterial* material = QexShaderModule_MaterialOf(model, node->materialIndex);
    *draw = {type, module, model, nodeIndex, node, QexPODModel_MeshOf(&model->scene, nodeIndex), material};
    QexRenderState_UseProgram(module->program);
    return true;
}

float QexShaderModule_Opacity(const QexShaderDraw& draw) {
    return draw.material->opacity * g_fQexGlobalAlpha;
}

void QexShaderModule_World(const QexShaderDraw& draw, QexMatrix* out, const QexMatrix* modelMatrix) {
    const QexMatrix* world = QexPODAnimation_WorldMatrix(&draw.model->scene, draw.node);
    if (modelMatrix)
        QexMatrix_Multiply(out, modelMatrix, world);
    else
        *out = *world;
}

void QexShaderModule_NormalMatrix(QexMatrix3* out, const QexMatrix* world) {
    QexMatrix3 linear, inverse;
    QexMatrix3_ConstructorFromMatrix(&linear, world);
    QexMatrix3_Inverse(&inverse, &linear);
    QexMatrix3_Transpose(out, &inverse);
}

void QexShaderModule_ModelViewProjection(const QexShaderDraw& draw, QexMatrix* out,
                                         const QexMatrix* modelMatrix, const QexMatrix* view,
                                         const QexMatrix* projection) {
    QexMatrix world;
    QexShaderModule_World(draw, &world, modelMatrix);
    QexMatrix_Multiply(out, projection, view);
    QexMatrix_Multiply(out, out, &world);
}

void QexShaderModule_BindMaterial(const QexShaderDraw& draw) {
    if (TextureOf(draw.model->alphaTextures, draw.node))
        draw.node->blendFlags &= static_cast<uint8_t>(~QEX_NODE_OPAQUE);
    QexShaderModule_BindMaterialKeepPass(draw);
}

void QexShaderModule_BindMaterialKeepPass(const QexShaderDraw& draw) {
    QexTexture_Set(TextureOf(draw.model->alphaTextures, draw.node), kAlphaUnit);
    if (!HookBinds(draw)) QexTexture_Set(TextureOf(draw.model->textures, draw.node), kDiffuseUnit);
}

void QexShaderModule_BindDiffuseOnly(const QexShaderDraw& draw, QexBindHook hook) {
    QexTexture_Set(nullptr, kAlphaUnit);
    if (hook == QexBindHook::kAsk && HookBinds(draw)) return;
    if (draw.node->materialIndex >= 0)
        QexTexture_Set(TextureOf(draw.model->textures, draw.node), kDiffuseUnit);
}
