// What the built-in shader modules share.
//
// A module is a description (QexShaderModuleType: sources, attributes, uniforms, samplers) and a Render that
// sets its uniforms. Everything else, from compiling to drawing a mesh, is here and works from the
// description. An instance (QexShaderModule) is allocated by CreateProgram and freed by Release; its slots
// hold the uniform locations in the description's order, then the parameters, the first of which is the alpha
// threshold.
//
// GL errors are reported under the module whose description is at work: QEX_MODULE is `type->path` in every
// function that has one.
#pragma once

#include "gl/GL.h"
#include "gl/Program.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"

// The uniforms of all modules: one list that gives names and numbers.
#define QEX_SHADER_UNIFORMS(X) \
    X(displacement)            \
    X(near)                    \
    X(far)                     \
    X(transMatrix)             \
    X(normalMatrix)            \
    X(mvpMatrix)               \
    X(viewProjMatrix)          \
    X(boneCount)               \
    X(boneMatrixArray)         \
    X(boneVecMatrixArray)      \
    X(cameraPos)               \
    X(lightCount)              \
    X(lightType)               \
    X(lightPosDir)             \
    X(lightColor)              \
    X(sceneAmbient)            \
    X(sceneDiffuse)            \
    X(sceneSpecular)           \
    X(shininess)               \
    X(opacity)                 \
    X(alphaThreshold)          \
    X(shadowLightDir)          \
    X(shadowSpaceMatrix)       \
    X(biasValue)               \
    X(shadowIntensity)         \
    X(shadowFade)              \
    X(u_m4Projection)          \
    X(u_s2dTexture)            \
    X(u_s2dNormal)             \
    X(u_s2dDepth)              \
    X(u_s2dBlur)               \
    X(sigma)                   \
    X(blurSize)                \
    X(horizontal_or_vertical)  \
    X(samples)                 \
    X(instanceRows)            \
    X(instanceColours)         \
    X(focus)                   \
    X(range)

enum QexShaderUniform : uint8_t {
    kUniform_none,  // leaves its slot to the module
#define QEX_SHADER_UNIFORM_NUMBER(name) kUniform_##name,
    QEX_SHADER_UNIFORMS(QEX_SHADER_UNIFORM_NUMBER)
#undef QEX_SHADER_UNIFORM_NUMBER
        kShaderUniforms
};

// A short list of numbers.
struct QexShaderList {
    uint8_t count;
    uint8_t items[20];

    constexpr void Add(uint8_t item) { items[count++] = item; }
    const uint8_t* begin() const { return items; }
    const uint8_t* end() const { return items + count; }
};
template <class... Items>
constexpr QexShaderList QexShaderList_Of(Items... items) {
    return {sizeof...(items), {static_cast<uint8_t>(items)...}};
}

// What a module does, for those who draw with variants of its program.
enum QexShaderTrait : uint32_t {
    kTraitSkinned = 1,  // its meshes follow bones
    kTraitStatic = 2,
    kTraitNormalMap = 4,
    kTraitSpecular = 8,
    kTraitShadow = 16,         // it receives a shadow
    kTraitShadowFade = 32,     // the fade's value is in the slot behind the threshold
    kTraitLit = 64,            // it has lights
    kTraitAlphaTexture = 128,  // alpha is the alpha texture's; else the diffuse texture's
    kTraitKeepsPass = 256,     // an alpha texture does not make its nodes transparent ones
    kTraitDisplaced = 512,     // its texture coordinates are shifted by the two slots before the threshold
    kTraitDepth = 2048,        // it has a depth range, whose ends are in the slots behind the threshold
    kTraitVariants = 1024      // its sources know the variants, see QexShaderVariant.h
};

struct QexShaderModuleType {
    const char* path;  // of the module's source, without extension
    const char* vertexSource;
    const char* fragmentSource;
    QexShaderRenderFn render;
    QexShaderList attributes;  // QEX_ELEMENT_..., what feeds each; the names go by the element
    QexShaderList uniforms;    // kUniform_..., in the order of the slots
    QexShaderList units;       // k...Unit, whose samplers the module has; the names go by the unit
    bool hasThreshold;
    uint32_t thresholdSlot;
    float secondDefault = 0;  // of the slot behind the threshold, in modules that have a parameter there
    bool isCaster = false;    // draws what throws shadows, in the pass from the light
    uint32_t traits = 0;      // kTrait...
};

// The material of that number; below 0 an opaque white one, which nodes without material are drawn with.
const QexPODMaterial* QexShaderModule_MaterialOf(const QexModel* model, int32_t index);

// The names of a uniform, of the attribute that a vertex element feeds, of a texture unit's sampler.
const char* QexShaderModule_UniformName(uint8_t uniform);
const char* QexShaderModule_AttributeName(uint8_t element);
const char* QexShaderModule_SamplerName(uint8_t unit);

// Lifetime. Alloc gives a cleared record, or null with a line in the log; Create sets it up, too.
// `setup` makes its program again in another context where QexShaderModule_Setup is not all that it takes.
QexShaderModule* QexShaderModule_Alloc(const QexShaderModuleType* type,
                                       int32_t (*setup)(QexShaderModule*) = nullptr);
void QexShaderModule_Free(QexShaderModule* module);
QexShaderModule* QexShaderModule_Create(const QexShaderModuleType* type);
int32_t QexShaderModule_Setup(const QexShaderModuleType* type, QexShaderModule* module);
void QexShaderModule_Release(const QexShaderModuleType* type, QexShaderModule** module);

inline int32_t QexShaderModule_Location(const QexShaderModule* module, uint32_t uniform) {
    return module->slots[uniform].location;
}

// Sets a float of the module's current program; in another context it is set again.
void QexShaderModule_SetFloat(QexShaderModule* module, uint32_t slot, float value);

// What a Render works with, found once.
struct QexShaderDraw {
    const QexShaderModuleType* type;
    QexShaderModule* module;
    QexModel* model;
    uint32_t nodeIndex;
    QexPODNode* node;
    const QexPODMesh* mesh;
    const QexPODMaterial* material;  // never null: a node without one gets an opaque white one
};

// Finds the node and makes the program current; false when there is nothing to draw: no such mesh node, one
// whose rendering is off, or a model whose geometry is not loaded.
bool QexShaderModule_Begin(QexShaderDraw* draw, const QexShaderModuleType* type, QexShaderModule* module,
                           QexModel* model, uint32_t nodeIndex);

// The material's opacity times the global alpha.
float QexShaderModule_Opacity(const QexShaderDraw& draw);

// [model matrix *] node world.
void QexShaderModule_World(const QexShaderDraw& draw, QexMatrix* out, const QexMatrix* modelMatrix);

// What turns normals: the transposed inverse of the upper left 3 x 3 of a world matrix.
void QexShaderModule_NormalMatrix(QexMatrix3* out, const QexMatrix* world);

// projection * view * [model matrix *] node world.
void QexShaderModule_ModelViewProjection(const QexShaderDraw& draw, QexMatrix* out,
                                         const QexMatrix* modelMatrix, const QexMatrix* view,
                                         const QexMatrix* projection);

// Binds the alpha texture (a node whose material has one leaves the opaque pass), asks the model's hook, and
// binds the diffuse texture unless the hook bound something itself.
void QexShaderModule_BindMaterial(const QexShaderDraw& draw);

// The same for modules that take a node's pass as it is.
void QexShaderModule_BindMaterialKeepPass(const QexShaderDraw& draw);

// For modules that read alpha from the diffuse texture: no alpha texture; without a material the diffuse unit
// stays as it is. The model's hook is asked by some of them only.
enum class QexBindHook { kAsk, kIgnore };
void QexShaderModule_BindDiffuseOnly(const QexShaderDraw& draw, QexBindHook hook);

// Binds the mesh's buffers and feeds the module's attributes; End undoes both.
void QexShaderModule_BeginMesh(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex);
void QexShaderModule_EndMesh(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex);

// The draw calls of a mesh whose buffers are bound: triangles or strips, indexed or not.
void QexShaderModule_DrawFaces(const QexShaderModuleType* type, const QexModel* model, uint32_t meshIndex);

// The whole draw of a mesh that follows no bones.
int32_t QexShaderModule_DrawMesh(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex);

// The whole draw of a mesh that follows bones: for each bone batch it sets boneCount, boneMatrixArray and,
// for lit modules, boneVecMatrixArray at those locations and draws the batch's triangles.
struct QexShaderBones {
    int32_t boneCountLocation;
    int32_t boneMatrixLocation;
    bool hasVectors;
    int32_t boneVectorLocation;
    const QexMatrix* modelMatrix;  // in front of every bone matrix, or null
};
int32_t QexShaderModule_DrawSkinnedMesh(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex,
                                        const QexShaderBones& bones);
// The same with the mesh's buffers bound.
void QexShaderModule_DrawBatches(const QexShaderModuleType* type, QexModel* model, uint32_t nodeIndex,
                                 const QexShaderBones& bones);

// The operations that every module exports and that its description settles. `type` is a pointer to it.
#define QEX_SHADER_MODULE_LIFETIME(Name, type)             \
    QexShaderModule* Name##_CreateProgram(void) {          \
        return QexShaderModule_Create(type);               \
    }                                                      \
    int32_t Name##_SetupProgram(QexShaderModule* module) { \
        return QexShaderModule_Setup(type, module);        \
    }                                                      \
    void Name##_Release(QexShaderModule** module) {        \
        QexShaderModule_Release(type, module);             \
    }

#define QEX_SHADER_MODULE_THRESHOLD(Name, slot)                               \
    void Name##_SetAlphaThreshold(QexShaderModule* module, float threshold) { \
        module->slots[slot].value = threshold;                                \
    }                                                                         \
    float Name##_GetAlphaThreshold(const QexShaderModule* module) {           \
        return module->slots[slot].value;                                     \
    }

#define QEX_SHADER_MODULE_DRAW_MESH(Name, type)                                      \
    int32_t Name##_DrawMesh(QexShaderModule*, QexModel* model, uint32_t nodeIndex) { \
        return QexShaderModule_DrawMesh(type, model, nodeIndex);                     \
    }
