// Building variants, and giving them what is new.
#include "Shaders/QexShaderVariant.h"

#include <cstdio>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/Program.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Shaders/QexGLSL.h"
#include "Shaders/QexLitShader.h"

namespace {

constexpr uint32_t kMaxTypes = 20;  // there are 16 modules with variants, and two programs of the shadow pass

struct TypeVariants {
    const QexShaderModuleType* type;
    int32_t users;
    QexShaderVariant* variants[kShaderVariants];
    bool failed[kShaderVariants];
};

TypeVariants s_Types[kMaxTypes];
uint32_t s_Generation = 1;
QexShaderFrame s_Frame;

// In the order of the flags' bits.
const char* const kDefines[] = {"#define QEX_NO_TEXTURE\n", "#define QEX_CONSTANT_ALPHA\n", nullptr,
                                "#define QEX_INSTANCE_COLOURS\n"};

// The lines in front of a variant's sources.
void WriteDefines(char* out, size_t size, uint32_t flags) {
    out[0] = 0;
    for (uint32_t bit = 0; flags >> bit; ++bit) {
        const size_t used = strlen(out);
        if (!(flags >> bit & 1)) continue;
        if (kDefines[bit])
            snprintf(out + used, size - used, "%s", kDefines[bit]);
        else
            snprintf(out + used, size - used, "#define QEX_INSTANCES %u\n", QexShaderVariant_MaxInstances());
    }
}

TypeVariants* Find(const QexShaderModuleType* type) {
    for (TypeVariants& row : s_Types)
        if (row.type == type) return &row;
    return nullptr;
}

QexProgramNames NamesOf(QexShaderVariant* variant) {
    return {&variant->program, &variant->vertexShader, &variant->fragmentShader};
}

void LookUp(QexShaderVariant* variant) {
    const QexShaderModuleType* type = variant->type;
    const QexProgramLookup lookup = {type->path, variant->program, false};
    for (int32_t& location : variant->locations) location = -1;
    for (const uint8_t uniform : type->uniforms)
        if (uniform != kUniform_none)
            variant->locations[uniform] = lookup.Uniform(QexShaderModule_UniformName(uniform));
    const uint8_t instances[] = {kUniform_viewProjMatrix, kUniform_instanceRows, kUniform_instanceColours};
    for (const uint8_t uniform : instances)
        if (variant->flags & kVariantInstances)
            variant->locations[uniform] = lookup.Uniform(QexShaderModule_UniformName(uniform));
    for (const uint8_t unit : type->units) lookup.SetSampler({QexShaderModule_SamplerName(unit), unit});
}

bool Build(QexShaderVariant* variant) {
    const QexMaking making;
    const QexShaderModuleType* type = variant->type;
    const char* names[kInstanceAttribute + 1];
    char defines[160];
    for (uint8_t i = 0; i < QEX_ELEMENT_COUNT; ++i) names[i] = QexShaderModule_AttributeName(i);
    names[kInstanceAttribute] = "inInstance";
    WriteDefines(defines, sizeof defines, variant->flags);
    for (const uint8_t element : type->attributes) variant->elements |= 1u << element;
    // Without a texture there is nothing to look up at a coordinate.
    const uint32_t bare = kVariantNoTexture | kVariantConstantAlpha;
    if ((variant->flags & bare) == bare && !(type->traits & kTraitNormalMap))
        variant->elements &= ~(1u << QEX_ELEMENT_UV0);
    if (variant->flags & kVariantInstances) variant->elements |= 1u << kInstanceAttribute;
    if (!QexProgram_Build(
            {type->path, type->vertexSource, type->fragmentSource, names, kInstanceAttribute + 1, defines,
             variant->flags & kVariantInstances ? QEX_GLSL_INSTANCES : nullptr},
            NamesOf(variant)))
        return false;
    LookUp(variant);
    return !making.Failed();
}

void Delete(QexShaderVariant** variant) {
    if (!*variant) return;
    QexProgram_Delete(NamesOf(*variant));
    QexMemory_Free(*variant);
    *variant = nullptr;
}

void Forget() {
    for (TypeVariants& row : s_Types)
        for (uint32_t i = 0; i < kShaderVariants; ++i) {
            QexMemory_FreeArray(row.variants[i]);
            row.failed[i] = false;
        }
    ++s_Generation;
}

QexContextPart s_Part = {kRankPrograms, Forget, nullptr, nullptr, nullptr, false};

void SendVector(int32_t location, const float* value, const float* given, bool all) {
    if (location >= 0 && (all || memcmp(value, given, 3 * sizeof(float)) != 0))
        glUniform3fv(location, 1, value);
}

void SendFloat(int32_t location, float value, float given, bool all) {
    if (location >= 0 && (all || value != given)) glUniform1f(location, value);
}

void SendSurface(QexShaderVariant* variant, const QexShaderSurface& surface) {
    const int32_t* at = variant->locations;
    const QexShaderSurface& given = variant->surface;
    const bool all = !variant->hasSurface;
    SendVector(at[kUniform_sceneAmbient], surface.ambient, given.ambient, all);
    SendVector(at[kUniform_sceneDiffuse], surface.diffuse, given.diffuse, all);
    SendVector(at[kUniform_sceneSpecular], surface.specular, given.specular, all);
    SendFloat(at[kUniform_shininess], surface.shininess, given.shininess, all);
    SendFloat(at[kUniform_opacity], surface.opacity, given.opacity, all);
    SendFloat(at[kUniform_alphaThreshold], surface.threshold, given.threshold, all);
    SendFloat(at[kUniform_shadowFade], surface.shadowFade, given.shadowFade, all);
    SendFloat(at[kUniform_near], surface.depthRange[0], given.depthRange[0], all);
    SendFloat(at[kUniform_far], surface.depthRange[1], given.depthRange[1], all);
    if (at[kUniform_displacement] >= 0) glUniform2fv(at[kUniform_displacement], 1, surface.displacement);
    variant->surface = surface;
    variant->hasSurface = true;
}

void SendView(QexShaderVariant* variant, const QexShaderFrame& frame) {
    const int32_t* at = variant->locations;
    const float* v = frame.view.m;
    if (at[kUniform_cameraPos] >= 0) glUniform3f(at[kUniform_cameraPos], -v[12], -v[13], -v[14]);
    if (at[kUniform_viewProjMatrix] >= 0)
        glUniformMatrix4fv(at[kUniform_viewProjMatrix], 1, GL_FALSE, frame.viewProjection.m);
    variant->viewStamp = frame.viewStamp;
}

void SendShadow(QexShaderVariant* variant, const QexShaderFrame& frame) {
    const int32_t* at = variant->locations;
    glUniform3fv(at[kUniform_shadowLightDir], 1, &frame.shadowLightDirection.x);
    glUniform1f(at[kUniform_shadowIntensity], frame.shadowIntensity);
    glUniform1f(at[kUniform_biasValue], frame.shadowBias);
    variant->shadowStamp = frame.shadowStamp;
}

template <class T>
bool Replace(T* kept, const T& value) {
    if (memcmp(kept, &value, sizeof value) == 0) return false;
    memcpy(kept, &value, sizeof value);
    return true;
}

}  // namespace

const QexShaderFrame* QexShaderFrame_Set(const QexMatrix* view, const QexMatrix* projection,
                                         const QexLightSet* lights, const QexShadowInfo* shadow) {
    static const QexLightSet none = {};
    QexShaderFrame& f = s_Frame;
    const bool newView = Replace(&f.view, *view), newProjection = Replace(&f.projection, *projection);
    if (newView || newProjection || !f.viewStamp) {
        QexMatrix_Multiply(&f.viewProjection, projection, view);
        ++f.viewStamp;
    }
    if (Replace(&f.lights, lights ? *lights : none) || !f.lightStamp) ++f.lightStamp;
    if (!shadow) return &f;
    bool newShadow = Replace(&f.shadowLightDirection, shadow->lightDir);
    newShadow |= Replace(&f.shadowIntensity, shadow->shadowIntensity);
    newShadow |= Replace(&f.shadowBias, shadow->biasValue);
    if (newShadow || !f.shadowStamp) ++f.shadowStamp;
    return &f;
}

QexShaderVariant* QexShaderVariant_Get(const QexShaderModuleType* type, uint32_t flags) {
    TypeVariants* row = Find(type);
    if (!row || row->failed[flags]) return nullptr;
    QexShaderVariant*& variant = row->variants[flags];
    if (variant) return variant;
    if (g_QexContextLost) return nullptr;
    QexContext_Register(&s_Part);
    variant = QexMemory_AllocZeroed<QexShaderVariant>(1);
    if (variant) {
        variant->type = type;
        variant->flags = flags;
        if (Build(variant)) return variant;
        Delete(&variant);
    }
    row->failed[flags] = true;
    return nullptr;
}

const QexShaderModuleType* QexShaderVariant_TypeOf(const QexShaderModule* module) {
    for (const TypeVariants& row : s_Types)
        if (module && module->render && row.type && row.type->render == module->render) return row.type;
    return nullptr;
}

uint32_t QexShaderVariant_MaxInstances() {
    static const uint32_t kMost = 128, kOthers = 28, kEach = 4;  // vectors: of other uniforms, of an instance
    GLint vectors = 0;
    glGetIntegerv(GL_MAX_VERTEX_UNIFORM_VECTORS, &vectors);
    const uint32_t room = vectors > 0 ? static_cast<uint32_t>(vectors) : 0;
    const uint32_t count = room > kOthers ? (room - kOthers) / kEach : 0;
    return count < kMost ? count : kMost;
}

uint32_t QexShaderVariant_Generation() {
    return s_Generation;
}

void QexShaderVariant_Retain(const QexShaderModuleType* type) {
    if (!(type->traits & kTraitVariants)) return;
    TypeVariants* row = Find(type);
    if (!row) row = Find(nullptr);
    if (!row) return;
    row->type = type;
    ++row->users;
    ++s_Generation;
}

void QexShaderVariant_Release(const QexShaderModuleType* type) {
    TypeVariants* row = type ? Find(type) : nullptr;
    if (!row) return;
    ++s_Generation;
    if (--row->users > 0) return;
    for (QexShaderVariant*& variant : row->variants) Delete(&variant);
    *row = {};
}

void QexShaderVariant_Surface(const QexShaderVariant* variant, const QexShaderModule* module,
                              const QexPODMaterial* material, QexShaderSurface* out) {
    const QexShaderModuleType* type = variant->type;
    const QexShaderSlot* parameters = module->slots + type->thresholdSlot;
    memcpy(out->ambient, material->ambient, sizeof out->ambient);
    memcpy(out->diffuse, material->diffuse, sizeof out->diffuse);
    memcpy(out->specular, material->specular, sizeof out->specular);
    out->shininess = material->shininess * 256.0f;
    out->opacity = material->opacity * g_fQexGlobalAlpha;
    out->threshold = parameters[0].value;
    const bool constant = variant->flags & kVariantConstantAlpha && !(variant->flags & kVariantColours);
    if (constant && out->opacity <= out->threshold) out->opacity = 0;
    out->shadowFade = type->traits & kTraitShadowFade ? parameters[1].value : 0;
    const bool displaced = type->traits & kTraitDisplaced;
    for (int i = 0; i < 2; ++i) {
        out->displacement[i] = displaced ? parameters[i - 2].value : 0;
        out->depthRange[i] = type->traits & kTraitDepth ? parameters[i + 1].value : 0;
    }
}

void QexShaderVariant_Use(QexShaderVariant* variant, const QexShaderFrame* frame,
                          const QexShaderSurface& surface) {
    const uint32_t traits = variant->type->traits;
    QexRenderState_UseProgram(variant->program);
    if (variant->viewStamp != frame->viewStamp) SendView(variant, *frame);
    if (traits & kTraitLit && variant->lightStamp != frame->lightStamp) {
        QexLitShader_SendLights(variant->locations, frame->lights);
        variant->lightStamp = frame->lightStamp;
    }
    if (traits & kTraitShadow && variant->shadowStamp != frame->shadowStamp) SendShadow(variant, *frame);
    if (!variant->hasSurface || memcmp(&variant->surface, &surface, sizeof surface) != 0)
        SendSurface(variant, surface);
}
