// Scene nodes: a tree of what an application places and moves, down to the models that it draws.
#include <cstddef>
#include <cstring>

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/models.h"
#include "Qex/scene_nodes.h"
#include "Qex/shader_modules.h"

namespace {

// The node after `at` in a walk over a list of siblings and all below them, a node before its children; null
// at the end. `depth` counts the levels below the list.
QexNode* NextInWalk(QexNode* at, uint32_t* depth) {
    if (at->firstChild) {
        ++*depth;
        return at->firstChild;
    }
    for (; !at->next && *depth > 0; --*depth) at = at->parent;
    return at->next;
}

bool DrawsModel(const QexNode* node) {
    return node->type == QEX_SCENE_NODE_MODEL && node->model;
}

// Where a node was given its local matrix, takes position, rotation and scale from there, so that those that
// are not set stay as they look.
void LeaveMatrix(QexNode* node) {
    if (!(node->nodeFlags & QEX_SCENE_NODE_MATRIX_GIVEN)) return;
    node->nodeFlags &= ~QEX_SCENE_NODE_MATRIX_GIVEN;
    GetTranslationFromMatrix(&node->localMatrix, &node->position);
    GetScaleFromMatrix(&node->localMatrix, &node->scale);
    // A matrix that flattens has no rotation that could be told.
    float other[3];
    if (node->scale.x > 0 && node->scale.y > 0 && node->scale.z > 0)
        GetRotationXYZFromTransformMatrix(&node->localMatrix, &node->rotation.x, other);
}

void SetPart(QexNode* node, QexVec3 QexNode::*part, float x, float y, float z) {
    LeaveMatrix(node);
    node->*part = {x, y, z};
    node->nodeFlags |= QEX_SCENE_NODE_CHANGED;
}

void UpdateMatrices(QexNode* node) {
    if (!(node->nodeFlags & QEX_SCENE_NODE_MATRIX_GIVEN)) {
        const QexVec3 &p = node->position, &r = node->rotation, &s = node->scale;
        QexMatrix step;
        QexMatrix_Translate(&node->localMatrix, p.x, p.y, p.z);
        QexMatrix_RotateXYZ(&step, r.x, r.y, r.z);
        QexMatrix_Multiply(&node->localMatrix, &node->localMatrix, &step);
        QexMatrix_Scale(&step, s.x, s.y, s.z);
        QexMatrix_Multiply(&node->localMatrix, &node->localMatrix, &step);
    }
    const QexMatrix* parent = node->parent ? &node->parent->worldMatrix : &g_sMatIdentity;
    QexMatrix_Multiply(&node->worldMatrix, parent, &node->localMatrix);
    node->nodeFlags &= ~QEX_SCENE_NODE_CHANGED;
}

}  // namespace

extern "C" {

int32_t QexNode_Create(QexNode* node, const char* name, QexNode* parent, const QexMatrix* matrix) {
    memset(node, 0, offsetof(QexNode, model));
    node->parent = parent;
    if (name) strncpy(node->name, name, sizeof node->name - 1);
    if (matrix) {
        node->localMatrix = *matrix;
        node->nodeFlags = QEX_SCENE_NODE_MATRIX_GIVEN;
    } else {
        QexMatrix_Identity(&node->localMatrix);
        QexNode_SetPosition(node, 0, 0, 0);
        QexNode_SetRotation(node, 0, 0, 0);
        QexNode_SetScale(node, 1, 1, 1);
    }
    if (!parent) return 0;
    QexNode** end = &parent->firstChild;
    while (*end) end = &(*end)->next;
    *end = node;
    return 0;
}

int32_t QexModelNode_Create(QexNode* node, const char* name, QexNode* parent, QexModel* model) {
    QexNode_Create(node, name, parent, nullptr);
    node->type = QEX_SCENE_NODE_MODEL;
    node->model = model;
    if (model && model->scene.meshCount > 0) node->nodeFlags |= QEX_SCENE_NODE_HAS_MESH;
    return 0;
}

void QexNode_SetPosition(QexNode* node, float x, float y, float z) {
    SetPart(node, &QexNode::position, x, y, z);
}

void QexNode_SetPosVec3(QexNode* node, const QexVec3* position) {
    QexNode_SetPosition(node, position->x, position->y, position->z);
}

void QexNode_SetRotation(QexNode* node, float x, float y, float z) {
    SetPart(node, &QexNode::rotation, x, y, z);
}

void QexNode_SetScale(QexNode* node, float x, float y, float z) {
    SetPart(node, &QexNode::scale, x, y, z);
}

QexNode* QexNode_GetPreviousSibling(const QexNode* node) {
    QexNode* at = node->parent ? node->parent->firstChild : nullptr;
    while (at && at->next != node) at = at->next;
    return at;
}

int32_t QexNode_Remove(QexNode* node) {
    if (!node->parent) return -1;
    QexNode** link = &node->parent->firstChild;
    while (*link && *link != node) link = &(*link)->next;
    // A node that was removed before still knows its parent; that list is not touched again.
    if (*link) *link = node->next;
    node->next = nullptr;
    return 0;
}

int32_t QexNode_Release(QexNode* node, int32_t mode) {
    QexNode_Remove(node);
    // Takes each first child out of its list; a node without children left goes, and its parent is next.
    for (QexNode* at = node; mode != QEX_SCENE_NODE_KEEP;) {
        if (QexNode* child = at->firstChild) {
            at->firstChild = child->next;
            at = child;
            continue;
        }
        if (at == node) break;
        QexNode* const parent = at->parent;
        if (mode == QEX_SCENE_NODE_FREE)
            QexMemory_Free(at);
        else
            memset(at, 0, sizeof *at);
        at = parent;
    }
    return 0;
}

void QexNode_Update(void* ignored, QexNode* node, float dt) {
    uint32_t depth = 0;
    for (; node; node = NextInWalk(node, &depth)) {
        UpdateMatrices(node);
        if (DrawsModel(node)) QexModel_Update(ignored, node->model, dt);
    }
}

void QexNode_RenderWithCamera(QexNode* node, const QexCamera* camera) {
    uint32_t depth = 0;
    for (; node; node = NextInWalk(node, &depth)) {
        if (!DrawsModel(node)) continue;
        QexLightSet lights = {};
        QexModel_GetLight(node->model, &lights);
        QexModel_RenderWithCamera(node->model, &lights, camera, &node->worldMatrix, 0);
    }
}

}  // extern "C"
