// Lean drawing of models: nodes in an order that changes little, with the variants of their modules'
// programs.
#pragma once

#include "gl/GL.h"
#include "math/Float4.h"
#include "Qex/math.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderVariant.h"

// What a render call hands to the modules, and which nodes it draws.
struct QexLeanCall {
    const QexLightSet* lights;  // may be null, as modelMatrix and shadow may
    const QexMatrix* modelMatrix;
    const QexMatrix* view;
    const QexMatrix* projection;
    const QexShadowInfo* shadow;
    uint32_t pass = 0;
    bool (*wants)(QexModel* model, uint32_t node, uint32_t mode) = nullptr;  // null: all nodes of the pass
    uint32_t mode = 0;
};

// A mesh node as it was when the order was made.
struct QexLeanEntry {
    uint32_t node;
    uint32_t mesh;
    int32_t material;  // below 0: none
    uint32_t run;      // nodes of the same run may change places
    QexShaderModule* module;
    const QexShaderModuleType* type;  // null: drawn in the described way
    uint32_t flags;                   // kVariant...
    QexShaderVariant* variant;        // found when first drawn
};

// A mesh in its buffers as often as one draw shows it, see Instances.cpp.
struct QexInstanceMesh {
    uint32_t count;  // of instances in the buffers; 0: not made
    bool failed;
    uint32_t indexCount;  // of one instance
    GLuint vertexBuffer, indexBuffer, vertexArray;
    QexVertexAttribute attributes[kInstanceAttribute + 1];
};

// Beside a model: its nodes in the order in which they are drawn.
struct QexModelDrawing {
    QexModelDrawing *next, *previous;  // of other models
    uint32_t nodeCount, meshCount, materialCount;
    uint32_t generation;  // of the variants
    bool blends;          // whether the order is for blending, where what has alpha keeps its place
    bool moved;           // whether the order is another than the scene's
    QexLeanEntry* entries;
    uint32_t* places;  // of the nodes among them
    uint8_t* looks;    // Look, of no material and of each material
    GLuint* vertexArrays;
    QexInstanceMesh* instances;  // of the meshes that were drawn so; null while there are none
};

// A call while it is drawn.
struct QexLeanDrawing {
    QexModel* model;
    QexModelDrawing* kept;
    const QexLeanCall* call;
    const QexShaderFrame* frame;
    Float4x4 viewProjection;
    const QexLeanEntry* given;  // whose program, material and textures are set
    const QexLeanEntry* mesh;   // whose mesh is bound
};

// Finds what a call needs; false when there is nothing to draw. In `anyOrder` the nodes' order does not
// matter.
bool QexLeanDrawing_Begin(QexLeanDrawing* drawing, QexModel* model, const QexLeanCall& call, bool anyOrder);

// Draws a node in its own variant, or in the described way.
void QexLeanDrawing_Draw(QexLeanDrawing* drawing, QexLeanEntry* entry);

// Makes a variant current with the entry's material and textures.
void QexLeanDrawing_Give(QexLeanDrawing* drawing, const QexLeanEntry& entry, QexShaderVariant* variant);

// Whether a mesh's box lies outside the view, rather kept than left out.
bool QexLeanDrawing_IsOutside(const QexPODMesh& mesh, const Float4x4& mvp);

// Whether what is nearer is seen, whatever is drawn first.
bool QexLeanDrawing_DepthDecides();

// A node with an alpha texture is no opaque one from its first draw on.
void QexLeanDrawing_MarkPass(QexLeanDrawing* drawing, const QexLeanEntry& entry);

// What is kept of a model, made if need be, in no order yet; null when memory runs out.
QexModelDrawing* QexModel_KeepDrawing(QexModel* model);

// Binds a mesh of a model that something is kept of, for what reads these elements, bits by number.
void QexModel_BindMeshLean(const QexModel* model, uint32_t mesh, uint32_t elements);

// Draws the nodes of the pass that the call wants.
void QexModel_DrawLean(QexModel* model, const QexLeanCall& call);

// Deletes the instances' buffers.
void QexModel_ReleaseInstances(QexModelDrawing* kept);

// Draws one node of any pass.
void QexModel_DrawNodeLean(QexModel* model, uint32_t node, const QexLeanCall& call);

// Frees what lean drawing keeps of a model, its vertex array objects with it.
void QexModel_ReleaseLean(QexModel* model);
