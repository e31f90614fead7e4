// Many of one model: a mesh lies in a buffer several times, each with its instance's number, so that one draw
// shows as many instances as the vertex uniforms hold matrices.
#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/LeanState.h"
#include "model/Geometry.h"
#include "model/LeanRender.h"
#include "model/SharedShaders.h"
#include "pod/Animation.h"
#include "pod/Scene.h"
#include "Qex/models.h"
#include "Qex/pod.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexModel"

namespace {

constexpr uint32_t kMostVertices = 65536;  // that 16-bit indices reach
constexpr uint32_t kMostInstances = 128;
constexpr uint32_t kNumberBytes = sizeof(float);

// What a draw sends of its instances.
struct Batch {
    float rows[kMostInstances][3][4];
    float colours[kMostInstances][4];
    uint32_t count;
};
Batch s_Batch;

// A vertex and, behind it, the number of its instance.
void Repeat(uint8_t* out, const QexMeshUpload& upload, uint32_t vertices, uint32_t stride, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i) {
        const float number = static_cast<float>(i);
        for (uint32_t v = 0; v < vertices; ++v) {
            memcpy(out, upload.vertices + uint64_t{v} * stride, stride);
            memcpy(out + stride, &number, kNumberBytes);
            out += stride + kNumberBytes;
        }
    }
}

// The mesh's buffers with `count` instances; false when memory runs out.
bool Fill(QexInstanceMesh* out, const QexPODMesh& mesh, const QexMeshUpload& upload, uint32_t count) {
    const uint32_t stride = mesh.attributes[QEX_ELEMENT_POSITION].stride;
    const uint32_t corners = QexPODMesh_CountTriangles(mesh) * 3;
    const uint64_t bytes = uint64_t{stride + kNumberBytes} * mesh.vertexCount * count;
    QexScratch<uint8_t> vertices;
    QexScratch<uint32_t> list;
    QexScratch<uint16_t> indices;
    if (!vertices.Alloc(bytes) || !list.Alloc(corners) || !indices.Alloc(uint64_t{corners} * count))
        return false;
    Repeat(vertices.Get(), upload, mesh.vertexCount, stride, count);
    QexPODMesh_ListCorners(mesh, list.Get());
    for (uint32_t i = 0; i < count; ++i)
        for (uint32_t c = 0; c < corners; ++c)
            indices[uint64_t{i} * corners + c] = static_cast<uint16_t>(i * mesh.vertexCount + list[c]);
    memcpy(out->attributes, mesh.attributes, sizeof mesh.attributes);
    out->attributes[kInstanceAttribute] = {1, GL_FLOAT, 0, 0, stride};
    for (QexVertexAttribute& attribute : out->attributes) attribute.stride = stride + kNumberBytes;
    QexRenderState_Restore();
    const QexMaking making;
    GLuint buffers[2] = {};
    glGenBuffers(2, buffers);
    out->vertexBuffer = buffers[0];
    out->indexBuffer = buffers[1];
    glBindBuffer(GL_ARRAY_BUFFER, out->vertexBuffer);
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(bytes), vertices.Get(), GL_STATIC_DRAW);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, out->indexBuffer);
    glBufferData(GL_ELEMENT_ARRAY_BUFFER,
                 static_cast<GLsizeiptr>(uint64_t{corners} * count * sizeof(uint16_t)), indices.Get(),
                 GL_STATIC_DRAW);
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    QEX_GL_CHECK();
    if (making.Failed()) return false;  // both go with the model
    out->indexCount = corners;
    out->count = count;
    return true;
}

// The mesh as instances, made when first asked for; null where fewer than two would fit a draw, or memory is
// out.
const QexInstanceMesh* Prepare(QexLeanDrawing* drawing, uint32_t index) {
    QexModelDrawing* kept = drawing->kept;
    QexPODMesh* mesh = &drawing->model->scene.meshes[index];
    if (!kept->instances) kept->instances = QexMemory_AllocZeroed<QexInstanceMesh>(kept->meshCount);
    if (!kept->instances) return nullptr;
    QexInstanceMesh* made = &kept->instances[index];
    if (made->count || made->failed) return made->count ? made : nullptr;
    const uint32_t fits = mesh->vertexCount ? kMostVertices / mesh->vertexCount : 0;
    const uint32_t most = QexShaderVariant_MaxInstances(), count = fits < most ? fits : most;
    QexMeshUpload upload = {};
    made->failed = count < 2 || !mesh->attributes[QEX_ELEMENT_POSITION].componentCount ||
                   !QexModelGeometry_Prepare(&upload, mesh, index) || !Fill(made, *mesh, upload, count);
    QexModelGeometry_Release(&upload);
    drawing->given = drawing->mesh = nullptr;
    return made->failed ? nullptr : made;
}

void Flush(const QexInstanceMesh& mesh, const QexShaderVariant& variant) {
    if (!s_Batch.count) return;
    const GLsizei count = static_cast<GLsizei>(s_Batch.count);
    glUniform4fv(variant.locations[kUniform_instanceRows], 3 * count, s_Batch.rows[0][0]);
    if (variant.flags & kVariantColours)
        glUniform4fv(variant.locations[kUniform_instanceColours], count, s_Batch.colours[0]);
    glDrawElements(GL_TRIANGLES, static_cast<GLsizei>(mesh.indexCount) * count, GL_UNSIGNED_SHORT, nullptr);
    s_Batch.count = 0;
}

struct Instances {
    const QexMatrix* matrices;
    const float (*colours)[4];
    uint32_t count;
};

// Draws a node's instances in few draws; false when it cannot be drawn so.
bool DrawTogether(QexLeanDrawing* drawing, QexLeanEntry* entry, const Instances& instances) {
    QexPODModel* scene = &drawing->model->scene;
    if (!entry->type || !drawing->model->vertexBuffers || !(entry->type->traits & kTraitStatic) ||
        entry->type->traits & (kTraitShadow | kTraitDepth))
        return false;
    const QexInstanceMesh* mesh = Prepare(drawing, entry->mesh);
    const uint32_t flags = entry->flags | kVariantInstances | (instances.colours ? kVariantColours : 0u);
    QexShaderVariant* variant = mesh ? QexShaderVariant_Get(entry->type, flags) : nullptr;
    if (!variant) {
        drawing->given = nullptr;
        return false;
    }
    QexLeanDrawing_MarkPass(drawing, *entry);
    QexLeanDrawing_Give(drawing, *entry, variant);
    QexLeanState_BindMesh({mesh->vertexBuffer, mesh->indexBuffer, mesh->attributes, kInstanceAttribute + 1,
                           &drawing->kept->instances[entry->mesh].vertexArray},
                          variant->elements);
    drawing->given = drawing->mesh = nullptr;
    const QexMatrix* world = QexPODAnimation_WorldMatrix(scene, &scene->nodes[entry->node]);
    const Float4x4 local = Load4x4(world->m);
    for (uint32_t i = 0; i < instances.count; ++i) {
        const Float4x4 placed = Product(Load4x4(instances.matrices[i].m), local);
        if (QexLeanDrawing_IsOutside(scene->meshes[entry->mesh], Product(drawing->viewProjection, placed)))
            continue;
        QexMatrix m;
        Store4x4(m.m, placed);
        for (int row = 0; row < 3; ++row)
            for (int column = 0; column < 4; ++column)
                s_Batch.rows[s_Batch.count][row][column] = m.m[4 * column + row];
        if (instances.colours)
            memcpy(s_Batch.colours[s_Batch.count], instances.colours[i], 4 * sizeof(float));
        if (++s_Batch.count == mesh->count) Flush(*mesh, *variant);
    }
    Flush(*mesh, *variant);
    return true;
}

}  // namespace

void QexModel_ReleaseInstances(QexModelDrawing* kept) {
    for (uint32_t i = 0; !g_QexContextLost && kept->instances && i < kept->meshCount; ++i) {
        QexInstanceMesh& mesh = kept->instances[i];
        QexLeanState_DeleteVertexArrays(1, &mesh.vertexArray);
        if (mesh.vertexBuffer) glDeleteBuffers(1, &mesh.vertexBuffer);
        if (mesh.indexBuffer) glDeleteBuffers(1, &mesh.indexBuffer);
    }
    QexMemory_FreeArray(kept->instances);
}

extern "C" {

void QexModel_RenderInstances(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                              const QexMatrix* matrices, const float (*colours)[4], uint32_t count,
                              uint32_t pass) {
    if (!matrices || QexModel_IsOutdated(model)) return;
    const int32_t way = QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexLeanCall call = {lights, nullptr, &camera->viewMatrix, &camera->projectionMatrix, nullptr, pass};
    QexLeanDrawing drawing;
    g_VecEyePos = camera->eye;
    if (QexLeanDrawing_Begin(&drawing, model, call, false)) {
        const QexModelDrawing& kept = *drawing.kept;
        // Colours may make what hides the rest translucent.
        const bool inPlace = kept.moved && (!QexLeanDrawing_DepthDecides() || (colours && kept.blends));
        for (uint32_t e = 0; e < kept.nodeCount; ++e) {
            QexLeanEntry* entry = &kept.entries[inPlace ? kept.places[e] : e];
            const uint32_t state = model->scene.nodes[entry->node].stateFlags;
            if (model->scene.meshes[entry->mesh].passID != pass || !(state & QEX_NODE_RENDERING_ENABLED))
                continue;
            if (DrawTogether(&drawing, entry, {matrices, colours, count})) continue;
            for (uint32_t i = 0; i < count; ++i) {
                call.modelMatrix = &matrices[i];
                QexLeanDrawing_Draw(&drawing, entry);
            }
        }
    }
    QexRenderer_SetDrawing(way);
}

}  // extern "C"
