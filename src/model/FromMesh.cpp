// Models of meshes that the application makes: the records that reading a scene would have filled.
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "mesh/Colours.h"
#include "mesh/Mesh.h"
#include "model/SharedShaders.h"
#include "pod/Scene.h"
#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/images.h"
#include "Qex/math.h"
#include "Qex/meshes.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/shader_modules.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr float kAmbient = 0.2f, kDiffuse = 0.8f;

int32_t Refuse(const char* why) {
    QexError(QEX_TAG, "<QexModel_CreateFromMesh> %s", why);
    return -1;
}

bool Check(const QexMesh& mesh) {
    const uint32_t corners = QexMesh_CornerCount(mesh);
    if (!mesh.vertexCount || mesh.vertexCount > QEX_MESH_MAX_VERTICES) {
        QexError(QEX_TAG, "<QexModel_CreateFromMesh> %u vertices; 1 to %u can be drawn", mesh.vertexCount,
                 QEX_MESH_MAX_VERTICES);
        return false;
    }
    if (corners % 3 || corners > INT32_MAX) {
        QexError(QEX_TAG, "<QexModel_CreateFromMesh> %u corners are no whole triangles", corners);
        return false;
    }
    for (uint32_t i = 0; i < mesh.indexCount; ++i)
        if (mesh.indices[i] >= mesh.vertexCount) {
            QexError(QEX_TAG, "<QexModel_CreateFromMesh> index %u names vertex %u of %u", i, mesh.indices[i],
                     mesh.vertexCount);
            return false;
        }
    return true;
}

template <class T>
T* CopyArray(const T* from, uint64_t count) {
    T* copy = QexMemory_AllocArray<T>(count);
    if (copy) memcpy(copy, from, static_cast<size_t>(count * sizeof(T)));
    return copy;
}

// An element of floats with a copy of its own; nothing for a null array. False without memory.
template <class T>
bool CopyElement(CPODData* element, const T* from, uint32_t count) {
    *element = {QEX_POD_FLOAT, 0, 0, nullptr};
    if (!from) return true;
    element->data = reinterpret_cast<uint8_t*>(CopyArray(from, count));
    element->componentCount = sizeof(T) / sizeof(float);
    element->stride = sizeof(T);
    return element->data != nullptr;
}

bool FillMesh(QexPODMesh* out, const QexMesh& mesh, bool tangents) {
    const uint32_t count = mesh.vertexCount;
    QexPODMesh_SetDefaults(out);
    out->vertexCount = count;
    out->faceCount = QexMesh_CornerCount(mesh) / 3;
    if (mesh.uvs) {
        out->uvws = QexMemory_AllocZeroed<CPODData>(1);
        if (!out->uvws) return false;
        out->uvwChannelCount = 1;
        if (!CopyElement(out->uvws, mesh.uvs, count)) return false;
    }
    if (mesh.indexCount) {
        out->faces = {QEX_POD_UNSIGNED_SHORT, 1, sizeof(uint16_t),
                      reinterpret_cast<uint8_t*>(CopyArray(mesh.indices, mesh.indexCount))};
        if (!out->faces.data) return false;
    }
    QexScratch<QexVec3> along;
    if (tangents) {
        if (!along.Alloc(count)) return false;
        QexMesh_MakeTangents(mesh, along.Get());
    }
    return CopyElement(&out->vertices, mesh.positions, count) &&
           CopyElement(&out->normals, mesh.normals, count) && CopyElement(&out->tangents, along.Get(), count);
}

void FillMaterial(QexPODMaterial* material) {
    QexPODMaterial_SetDefaults(material);
    material->opacity = 1;
    for (int i = 0; i < 3; ++i) {
        material->ambient[i] = kAmbient;
        material->diffuse[i] = kDiffuse;
    }
}

// One mesh, one material and the node that draws them.
bool FillScene(QexPODModel* scene, const QexMesh& mesh, bool tangents) {
    static const char name[] = "mesh";
    scene->meshes = QexMemory_AllocZeroed<QexPODMesh>(1);
    scene->materials = QexMemory_AllocZeroed<QexPODMaterial>(1);
    scene->nodes = QexMemory_AllocZeroed<QexPODNode>(1);
    if (!scene->meshes || !scene->materials || !scene->nodes) return false;
    scene->meshCount = scene->materialCount = scene->nodeCount = scene->meshNodeCount = 1;
    scene->framesPerSecond = 30;
    FillMaterial(scene->materials);
    scene->materials->name = CopyArray(name, sizeof name);
    QexPODNode* node = scene->nodes;
    node->name = CopyArray(name, sizeof name);
    node->parentIndex = -1;
    QexPODNode_SetDefaults(node);
    return scene->materials->name && node->name && FillMesh(scene->meshes, mesh, tangents) &&
           QexPODModel_InitImpl(scene) == 0;
}

// A texture that the model owns.
QexTexture* CreateTexture(const QexMeshColours& colours) {
    QexTexture* texture = QexMemory_AllocZeroed<QexTexture>(1);
    if (!texture) return nullptr;
    if (QexTexture_CreateFromPixels(texture, static_cast<int32_t>(colours.width),
                                    static_cast<int32_t>(colours.height), QEX_TEXFMT_RGBA8888, 0, 0,
                                    QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, colours.pixels) != 0) {
        QexMemory_Free(texture);
        return nullptr;
    }
    texture->pixels = nullptr;  // they go with the baking
    return texture;
}

// Everything after the scene; false without memory.
bool Complete(QexModel* model, QexTexture* texture, const QexMeshColours& colours, bool lit) {
    if (QexModel_DownloadGeometry(model) != 0 || QexModel_LoadTextureFromCache(model, nullptr) != 0)
        return false;
    if (colours.pixels) {
        texture = CreateTexture(colours);
        if (!texture) return false;
        model->flags |= QEX_MODEL_OWNS_TEXTURES;
    }
    model->textures[0] = texture;
    model->nodeBoxes = QexMemory_AllocZeroed<QexBoundingBox>(1);
    model->screenBoxes = QexMemory_AllocZeroed<QexBoundingBox>(1);
    QexShaderModule* module = lit ? QexModel_GetSharedLitShader() : QexModel_GetSharedShaders()->texture;
    QexModel_SetShaderProgramForAllNode(model, module, nullptr);
    model->sharedGeneration = QexModel_GetSharedGeneration();
    return module && model->nodeBoxes && model->screenBoxes;
}

}  // namespace

extern "C" int32_t QexModel_CreateFromMesh(QexModel* model, const QexMesh* mesh, QexTexture* texture) {
    if (!model) return Refuse("no model");
    if (QexModel_Create(model) != 0) return -1;
    if (!mesh || !mesh->positions || (mesh->indexCount && !mesh->indices))
        return Refuse("no mesh, no positions, or no indices");
    if (!Check(*mesh)) return -1;
    if (mesh->colours && texture)
        QexLog(QEX_TAG, "<QexModel_CreateFromMesh> colours left out: there is a texture");
    QexMesh parted = {};
    QexMeshColours colours = {};
    const char* fault = mesh->colours && !texture ? QexMesh_BakeColours(*mesh, &parted, &colours) : nullptr;
    if (fault) return Refuse(fault);
    const QexMesh& drawn = parted.positions ? parted : *mesh;
    const bool tangents = mesh->normals && mesh->uvs && !parted.positions;
    const bool filled = FillScene(&model->scene, drawn, tangents);
    bool done = false;
    if (filled) {
        if (QexModel_CreateDefaultShader() != 0)
            model->flags |= QEX_MODEL_NO_SHADERS;
        else
            done = Complete(model, texture, colours, mesh->normals != nullptr);
        if (!done) QexModel_Unload(model);
    } else {
        QexPODModel_Release(&model->scene);
    }
    QexMesh_Release(&parted);
    QexMemory_Free(colours.pixels);
    if (done) return 0;
    QexModel_Create(model);
    return Refuse("out of memory");
}
