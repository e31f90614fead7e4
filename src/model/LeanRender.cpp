// Which node is drawn when and with what, kept from call to call, and the draw itself.
#include "model/LeanRender.h"

#include <cstdlib>
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/LeanState.h"
#include "math/Float4.h"
#include "pod/Animation.h"
#include "pod/BoneBoxes.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "Shaders/QexShaderVariant.h"
#include "texture/Texture.h"

namespace {

// What a material's opacity and textures allow.
enum Look : uint8_t { kOpaque = 1, kTextured = 2, kAlphaTextured = 4 };

// ---- Order ----

QexTexture* TextureOf(QexTexture** textures, int32_t material) {
    return textures && material >= 0 ? textures[material] : nullptr;
}

uint8_t LookOf(const QexModel* model, int32_t material) {
    const bool opaque = QexShaderModule_MaterialOf(model, material)->opacity * g_fQexGlobalAlpha >= 1;
    return static_cast<uint8_t>((opaque ? kOpaque : 0) |
                                (TextureOf(model->textures, material) ? kTextured : 0) |
                                (TextureOf(model->alphaTextures, material) ? kAlphaTextured : 0));
}

// The module's description where it has variants and they draw the node. A module that takes alpha from the
// diffuse texture draws nodes without material with whatever is bound.
const QexShaderModuleType* LeanType(const QexModel* model, const QexPODNode& node) {
    const QexShaderModuleType* type = QexShaderVariant_TypeOf(node.shader);
    if (!type || model->bindTextureHook) return nullptr;
    return type->traits & kTraitAlphaTexture || node.materialIndex >= 0 ? type : nullptr;
}

uint32_t FlagsOf(const QexShaderModuleType* type, uint8_t look) {
    if (!type->units.count) return kVariantNoTexture | kVariantConstantAlpha;
    const uint8_t alphaSource = type->traits & kTraitAlphaTexture ? kAlphaTextured : kTextured;
    return (look & kTextured ? 0u : kVariantNoTexture) | (look & alphaSource ? 0u : kVariantConstantAlpha);
}

int CompareEntries(const void* a, const void* b) {
    const QexLeanEntry &x = *static_cast<const QexLeanEntry*>(a), &y = *static_cast<const QexLeanEntry*>(b);
    const uint64_t keys[][2] = {
        {x.run, y.run},
        {reinterpret_cast<uintptr_t>(x.type), reinterpret_cast<uintptr_t>(y.type)},
        {x.flags, y.flags},
        {reinterpret_cast<uintptr_t>(x.module), reinterpret_cast<uintptr_t>(y.module)},
        {static_cast<uint64_t>(x.material + 1), static_cast<uint64_t>(y.material + 1)},
        {x.mesh, y.mesh},
        {x.node, y.node},
    };
    for (const auto& key : keys)
        if (key[0] != key[1]) return key[0] < key[1] ? -1 : 1;
    return 0;
}

// Whether a node hides what lies behind it. Modules with lights take alpha from both textures.
bool Hides(const QexLeanEntry& entry, uint8_t look) {
    const uint32_t bare = kVariantConstantAlpha | (entry.type->traits & kTraitLit ? kVariantNoTexture : 0u);
    return look & kOpaque && (entry.flags & bare) == bare;
}

void MakeOrder(QexModel* model, QexModelDrawing* kept) {
    uint32_t run = 0;
    bool movable = false;
    for (uint32_t i = 0; i <= kept->materialCount; ++i)
        kept->looks[i] = LookOf(model, static_cast<int32_t>(i) - 1);
    for (uint32_t i = 0; i < kept->nodeCount; ++i) {
        const QexPODNode& node = model->scene.nodes[i];
        QexLeanEntry& entry = kept->entries[i];
        entry = {i,
                 static_cast<uint32_t>(node.objectIndex),
                 node.materialIndex,
                 0,
                 node.shader,
                 LeanType(model, node),
                 0,
                 nullptr};
        const uint8_t look = kept->looks[node.materialIndex + 1];
        if (entry.type) entry.flags = FlagsOf(entry.type, look);
        const bool moves = entry.type && (!kept->blends || Hides(entry, look));
        if (!moves || !movable) ++run;
        movable = moves;
        entry.run = run;
    }
    qsort(kept->entries, kept->nodeCount, sizeof *kept->entries, CompareEntries);
    kept->moved = false;
    for (uint32_t i = 0; i < kept->nodeCount; ++i) {
        kept->places[kept->entries[i].node] = i;
        kept->moved |= kept->entries[i].node != i;
    }
    kept->generation = QexShaderVariant_Generation();
}

bool IsInOrder(const QexModel* model, const QexModelDrawing& kept) {
    if (kept.generation != QexShaderVariant_Generation()) return false;
    for (uint32_t i = 0; i <= kept.materialCount; ++i)
        if (kept.looks[i] != LookOf(model, static_cast<int32_t>(i) - 1)) return false;
    for (uint32_t i = 0; i < kept.nodeCount; ++i) {
        const QexLeanEntry& entry = kept.entries[i];
        const QexPODNode& node = model->scene.nodes[entry.node];
        if (node.shader != entry.module || node.materialIndex != entry.material ||
            static_cast<uint32_t>(node.objectIndex) != entry.mesh)
            return false;
        if (entry.type && (model->bindTextureHook || node.shader->render != entry.type->render)) return false;
    }
    return true;
}

// What is kept of the model, in order; null when there is no memory for it.
QexModelDrawing* Keep(QexModel* model, bool anyOrder) {
    QexModelDrawing* kept = QexModel_KeepDrawing(model);
    if (!kept) return nullptr;
    const bool blends = anyOrder ? kept->blends : glIsEnabled(GL_BLEND);
    if (kept->blends == blends && IsInOrder(model, *kept)) return kept;
    kept->blends = blends;
    MakeOrder(model, kept);
    return kept;
}

// ---- Lost contexts: all that lean drawing made is made again when it is needed ----

QexModelDrawing* s_Drawings;

void Forget() {
    for (QexModelDrawing* kept = s_Drawings; kept; kept = kept->next) {
        for (uint32_t i = 0; kept->vertexArrays && i < kept->meshCount; ++i) kept->vertexArrays[i] = 0;
        QexMemory_FreeArray(kept->instances);
    }
}

QexContextPart s_Part = {kRankGeometry, Forget, nullptr, nullptr, nullptr, false};

// ---- Drawing ----

void DrawAsDescribed(QexLeanDrawing* drawing, uint32_t node) {
    const QexLeanCall& call = *drawing->call;
    QexModel* model = drawing->model;
    QexShaderModule* module = model->scene.nodes[node].shader;
    drawing->given = drawing->mesh = nullptr;
    if (!module) return;
    QexRenderState_Restore();
    module->render(module, model, node, call.lights, call.modelMatrix, call.view, call.projection,
                   call.shadow);
    // A module or a hook of the application may have changed anything, and drawn lean itself.
    QexRenderState_Restore();
    QexRenderState_Reset(nullptr);
    QexShaderFrame_Set(call.view, call.projection, call.lights, call.shadow);
}

void BindTexture(QexTexture* texture, uint32_t unit) {
    if (!texture) texture = Qextexture_GetDefault();
    texture->stage = static_cast<uint8_t>(unit);
    QexLeanState_BindTexture(unit, QexTexture_Target(texture), texture->glName);
}

void BindTextures(const QexLeanDrawing& drawing, const QexLeanEntry& entry) {
    const QexModel* model = drawing.model;
    const uint32_t traits = entry.type->traits;
    if (traits & kTraitNormalMap) BindTexture(QexTexture_GetBlankNormalMap(), kNormalMapUnit);
    if (traits & kTraitShadow) {
        const QexShadowInfo* shadow = drawing.call->shadow;
        QexLeanState_BindTexture(
            kShadowMapUnit, GL_TEXTURE_2D,
            shadow && shadow->shadowTexture ? shadow->shadowTexture : Qextexture_GetDefault()->glName);
    }
    if (!(entry.flags & kVariantConstantAlpha) && traits & kTraitAlphaTexture)
        BindTexture(TextureOf(model->alphaTextures, entry.material), kAlphaUnit);
    if (!(entry.flags & kVariantNoTexture))
        BindTexture(TextureOf(model->textures, entry.material), kDiffuseUnit);
}

// Makes program, material and textures the entry's; false when its variant cannot be had.
bool Give(QexLeanDrawing* drawing, QexLeanEntry* entry) {
    const QexLeanEntry* given = drawing->given;
    if (given && given->variant == entry->variant && given->material == entry->material &&
        given->module == entry->module)
        return true;
    if (!entry->variant) entry->variant = QexShaderVariant_Get(entry->type, entry->flags);
    if (!entry->variant) return false;
    QexLeanDrawing_Give(drawing, *entry, entry->variant);
    return true;
}

void BindMesh(QexLeanDrawing* drawing, const QexLeanEntry& entry) {
    const QexLeanEntry* bound = drawing->mesh;
    if (bound && bound->mesh == entry.mesh && bound->variant == entry.variant) return;
    drawing->mesh = &entry;
    QexModel_BindMeshLean(drawing->model, entry.mesh, entry.variant->elements);
}

// Sets what the entry is drawn with; where its variant cannot be had, draws it in the described way: false.
bool BeginNode(QexLeanDrawing* drawing, QexLeanEntry* entry) {
    if (!Give(drawing, entry)) {
        DrawAsDescribed(drawing, entry->node);
        return false;
    }
    BindMesh(drawing, *entry);
    return true;
}

void DrawStatic(QexLeanDrawing* drawing, QexLeanEntry* entry) {
    QexPODModel* scene = &drawing->model->scene;
    const QexLeanCall& call = *drawing->call;
    const QexMatrix* world = QexPODAnimation_WorldMatrix(scene, &scene->nodes[entry->node]);
    QexMatrix placed;
    if (call.modelMatrix) {
        QexMatrix_Multiply(&placed, call.modelMatrix, world);
        world = &placed;
    }
    const Float4x4 mvp = Product(drawing->viewProjection, Load4x4(world->m));
    if (QexLeanDrawing_IsOutside(scene->meshes[entry->mesh], mvp)) return;
    if (!BeginNode(drawing, entry)) return;
    const int32_t* at = entry->variant->locations;
    QexMatrix matrix;
    Store4x4(matrix.m, mvp);
    glUniformMatrix4fv(at[kUniform_mvpMatrix], 1, GL_FALSE, matrix.m);
    if (entry->type->traits & kTraitLit) {
        QexMatrix3 normal;
        QexShaderModule_NormalMatrix(&normal, world);
        glUniformMatrix4fv(at[kUniform_transMatrix], 1, GL_FALSE, world->m);
        glUniformMatrix3fv(at[kUniform_normalMatrix], 1, GL_FALSE, normal.m);
    }
    if (entry->type->traits & kTraitShadow && call.shadow) {
        QexMatrix_Multiply(&matrix, &call.shadow->shadowSpaceMatrix, world);
        glUniformMatrix4fv(at[kUniform_shadowSpaceMatrix], 1, GL_FALSE, matrix.m);
    }
    QexShaderModule_DrawFaces(entry->type, drawing->model, entry->mesh);
}

// Whether a box lies outside the view. It is tested in clip space, against each pair of planes at once, and
// rather kept than left out.
bool IsOutside(const QexVec3& centre, const QexVec3& half, const Float4x4& mvp) {
    const Float4 at = mvp.x * centre.x + mvp.y * centre.y + mvp.z * centre.z + mvp.w;
    const Float4 reach = Magnitude(mvp.x) * half.x + Magnitude(mvp.y) * half.y + Magnitude(mvp.z) * half.z;
    const Float4 limit = Splat<3>(at) + Splat<3>(reach) + reach;
    const Float4 over = Magnitude(at) - limit * 1.0001f;
    return over[0] > 0 || over[1] > 0 || over[2] > 0;
}

bool IsOutsideOnBones(const QexLeanDrawing& drawing, const QexLeanEntry& entry) {
    const QexMatrix* modelMatrix = drawing.call->modelMatrix;
    QexAABB around;
    if (!QexPODAnimation_SkinnedBox(&drawing.model->scene, entry.node, &around)) return false;
    QexBoundingBox box;
    QexBoundingBox_ComputeInterleaved(&box, &around, 2, 0, sizeof around.min);
    const Float4x4 mvp =
        modelMatrix ? Product(drawing.viewProjection, Load4x4(modelMatrix->m)) : drawing.viewProjection;
    return IsOutside(box.centre, box.halfExtent, mvp);
}

void DrawSkinned(QexLeanDrawing* drawing, QexLeanEntry* entry) {
    if (!drawing->model->scene.meshes[entry->mesh].skinned || IsOutsideOnBones(*drawing, *entry)) return;
    if (!BeginNode(drawing, entry)) return;
    const int32_t* at = entry->variant->locations;
    const bool lit = entry->type->traits & kTraitLit;
    QexShaderModule_DrawBatches(entry->type, drawing->model, entry->node,
                                {at[kUniform_boneCount], at[kUniform_boneMatrixArray], lit,
                                 at[kUniform_boneVecMatrixArray], drawing->call->modelMatrix});
}

}  // namespace

QexModelDrawing* QexModel_KeepDrawing(QexModel* model) {
    if (model->drawing) return model->drawing;
    const QexPODModel& scene = model->scene;
    QexModelDrawing* kept = model->drawing = QexMemory_AllocZeroed<QexModelDrawing>(1);
    if (!kept) return nullptr;
    QexContext_Register(&s_Part);
    kept->next = s_Drawings;
    if (s_Drawings) s_Drawings->previous = kept;
    s_Drawings = kept;
    kept->nodeCount = scene.meshNodeCount;
    kept->meshCount = scene.meshCount;
    kept->materialCount = scene.materialCount;
    kept->entries = QexMemory_AllocZeroed<QexLeanEntry>(kept->nodeCount);
    kept->places = QexMemory_AllocZeroed<uint32_t>(kept->nodeCount);
    kept->looks = QexMemory_AllocZeroed<uint8_t>(kept->materialCount + 1);
    kept->vertexArrays = QexMemory_AllocZeroed<GLuint>(kept->meshCount);
    if (!kept->entries || !kept->places || !kept->looks || !kept->vertexArrays) QexModel_ReleaseLean(model);
    return model->drawing;
}

void QexModel_BindMeshLean(const QexModel* model, uint32_t mesh, uint32_t elements) {
    QexLeanState_BindMesh(
        {model->vertexBuffers[mesh], model->indexBuffers[mesh], model->scene.meshes[mesh].attributes,
         QEX_ELEMENT_COUNT, &model->drawing->vertexArrays[mesh]},
        elements);
}

bool QexLeanDrawing_DepthDecides() {
    GLboolean writes = GL_FALSE;
    if (!glIsEnabled(GL_DEPTH_TEST) || !QexLeanState_NearerIsSeen()) return false;
    glGetBooleanv(GL_DEPTH_WRITEMASK, &writes);
    if (!writes || !glIsEnabled(GL_BLEND)) return writes;
    // What adds to what is there shows wherever it stands.
    GLint destination = 0;
    glGetIntegerv(GL_BLEND_DST_RGB, &destination);
    return destination == GL_ONE_MINUS_SRC_ALPHA;
}

void QexLeanDrawing_MarkPass(QexLeanDrawing* drawing, const QexLeanEntry& entry) {
    const uint32_t traits = entry.type->traits;
    if (traits & kTraitAlphaTexture && !(traits & kTraitKeepsPass) &&
        TextureOf(drawing->model->alphaTextures, entry.material))
        drawing->model->scene.nodes[entry.node].blendFlags &= static_cast<uint8_t>(~QEX_NODE_OPAQUE);
}

bool QexLeanDrawing_IsOutside(const QexPODMesh& mesh, const Float4x4& mvp) {
    // A mesh of flat positions has no box.
    return mesh.attributes[QEX_ELEMENT_POSITION].componentCount >= 3 &&
           IsOutside(mesh.localBox.centre, mesh.localBox.halfExtent, mvp);
}

void QexLeanDrawing_Give(QexLeanDrawing* drawing, const QexLeanEntry& entry, QexShaderVariant* variant) {
    QexShaderSurface surface;
    QexShaderVariant_Surface(variant, entry.module,
                             QexShaderModule_MaterialOf(drawing->model, entry.material), &surface);
    QexShaderVariant_Use(variant, drawing->frame, surface);
    BindTextures(*drawing, entry);
    drawing->given = &entry;
}

void QexLeanDrawing_Draw(QexLeanDrawing* drawing, QexLeanEntry* entry) {
    QexPODNode* node = &drawing->model->scene.nodes[entry->node];
    if (!entry->type) {
        DrawAsDescribed(drawing, entry->node);
        return;
    }
    if (!drawing->model->vertexBuffers || !(node->stateFlags & QEX_NODE_RENDERING_ENABLED)) return;
    QexLeanDrawing_MarkPass(drawing, *entry);
    (entry->type->traits & kTraitSkinned ? DrawSkinned : DrawStatic)(drawing, entry);
}

bool QexLeanDrawing_Begin(QexLeanDrawing* drawing, QexModel* model, const QexLeanCall& call, bool anyOrder) {
    if (QexContext_IsRestoring()) return false;
    QexModelDrawing* kept = Keep(model, anyOrder || model->scene.meshNodeCount < 2);
    if (!kept) return false;
    const QexShaderFrame* frame = QexShaderFrame_Set(call.view, call.projection, call.lights, call.shadow);
    *drawing = {model, kept, &call, frame, Load4x4(frame->viewProjection.m), nullptr, nullptr};
    return true;
}

void QexModel_DrawLean(QexModel* model, const QexLeanCall& call) {
    QexLeanDrawing drawing;
    if (!QexLeanDrawing_Begin(&drawing, model, call, false)) return;
    const QexPODMesh* meshes = model->scene.meshes;
    const QexModelDrawing& kept = *drawing.kept;
    const bool inPlace = kept.moved && !QexLeanDrawing_DepthDecides();
    for (uint32_t i = 0; i < kept.nodeCount; ++i) {
        QexLeanEntry* entry = &kept.entries[inPlace ? kept.places[i] : i];
        if (meshes[entry->mesh].passID != call.pass) continue;
        if (call.wants && !call.wants(model, entry->node, call.mode)) continue;
        QexLeanDrawing_Draw(&drawing, entry);
    }
}

void QexModel_DrawNodeLean(QexModel* model, uint32_t node, const QexLeanCall& call) {
    QexLeanDrawing drawing;
    if (QexLeanDrawing_Begin(&drawing, model, call, true))
        QexLeanDrawing_Draw(&drawing, &drawing.kept->entries[drawing.kept->places[node]]);
}

void QexModel_ReleaseLean(QexModel* model) {
    QexModelDrawing* kept = model->drawing;
    if (!kept) return;
    QexRenderState_Restore();
    QexModel_ReleaseInstances(kept);
    if (kept->vertexArrays && !g_QexContextLost)
        QexLeanState_DeleteVertexArrays(kept->meshCount, kept->vertexArrays);
    QexMemory_FreeArray(kept->entries);
    QexMemory_FreeArray(kept->places);
    QexMemory_FreeArray(kept->looks);
    QexMemory_FreeArray(kept->vertexArrays);
    (kept->previous ? kept->previous->next : s_Drawings) = kept->next;
    if (kept->next) kept->next->previous = kept->previous;
    QexMemory_Free(kept);
    model->drawing = nullptr;
}
