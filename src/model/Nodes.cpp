// The nodes of a model: names, transforms, frames, world positions, and their boxes on the screen.
#include <cmath>

#include "math/Pi.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/scene_nodes.h"
#include "Qex/shader_modules.h"

namespace {

constexpr int32_t kUnknownName = -1;
constexpr int32_t kIndexOutOfRange = -12;

// A name's index, beyond all nodes when no node has it.
uint32_t IndexOf(const QexModel* model, const char* name) {
    return static_cast<uint32_t>(QexModel_FindNodeIdxByName(model, name));
}

// Applies an operation to a node, then, depth first, to all below it; the last result counts. A scene has at
// most 1000 parents above a node, so the recursion is as deep at most.
template <class Result, class Value>
Result ApplyR(QexPODModel* scene, uint32_t index, Value value,
              Result (*operation)(QexPODModel*, uint32_t, Value)) {
    Result result = operation(scene, index, value);
    for (uint32_t i = 0; index < scene->nodeCount && i < scene->nodeCount; ++i)
        if (scene->nodes[i].parentIndex == static_cast<int32_t>(index))
            result = ApplyR(scene, i, value, operation);
    return result;
}

const QexBoundingBox* BoxOf(const QexModel* model, const QexBoundingBox* boxes, uint32_t meshNode) {
    return boxes && meshNode < model->scene.meshNodeCount ? &boxes[meshNode] : nullptr;
}

// A screen box's sides in pixels, y downwards.
struct ScreenRect {
    float left, right, top, bottom;
};

ScreenRect RectOf(const QexBoundingBox& box) {
    return {box.corners[3].x, box.corners[4].x, box.corners[2].y, box.corners[1].y};
}

// Turns corners in device coordinates into a box with x and y in pixels. A hidden node's box, and one that
// reaches past the far plane or lies wholly before the near one, shrinks to the upper left pixel corner.
void ToScreen(QexBoundingBox* box, bool visible, float halfWidth, float halfHeight) {
    if (visible) {
        QexBoundingBox_ComputeInterleaved(box, box->corners, 8, 0, sizeof box->corners[0]);
        const float zMin = box->corners[0].z, zMax = box->corners[7].z;
        if ((zMax > 1 && zMin > -1) || (zMax < -1 && zMin < -1)) visible = false;
    }
    for (QexVec3& corner : box->corners) {
        corner.x = visible ? halfWidth * corner.x + halfWidth : 0;
        corner.y = visible ? halfHeight - halfHeight * corner.y : 0;
    }
}

}  // namespace

extern "C" {

// ---- Names ----

int32_t QexModel_FindNodeIdxByName(const QexModel* model, const char* name) {
    return QexPODModel_FindNodeIdxByName(&model->scene, name);
}

const char* QexModel_GetNodeName(const QexModel* model, uint32_t nodeIndex) {
    return nodeIndex < model->scene.nodeCount ? model->scene.nodes[nodeIndex].name : nullptr;
}

const char* QexModel_GetNodeTextureName(const QexModel* model, uint32_t nodeIndex) {
    const QexPODModel& scene = model->scene;
    if (nodeIndex >= scene.nodeCount) return nullptr;
    const uint32_t material = static_cast<uint32_t>(scene.nodes[nodeIndex].materialIndex);
    if (material >= scene.materialCount) return nullptr;
    const uint32_t texture = static_cast<uint32_t>(scene.materials[material].diffuseTexture);
    return texture < scene.textureCount ? scene.textures[texture].name : nullptr;
}

// ---- Transforms ----

void QexModel_SetNodePosition(QexModel* model, uint32_t nodeIndex, float x, float y, float z) {
    QexPODModel_SetNodePosition(&model->scene, nodeIndex, x, y, z);
}

void QexModel_SetNodePositionByName(QexModel* model, const char* name, float x, float y, float z) {
    QexModel_SetNodePosition(model, IndexOf(model, name), x, y, z);
}

void QexModel_SetNodeRotation(QexModel* model, uint32_t nodeIndex, float x, float y, float z) {
    QexPODModel_SetNodeRotation(&model->scene, nodeIndex, x, y, z);
}

void QexModel_SetNodeRotationByName(QexModel* model, const char* name, float x, float y, float z) {
    QexModel_SetNodeRotation(model, IndexOf(model, name), x, y, z);
}

void QexModel_SetNodeScale(QexModel* model, uint32_t nodeIndex, float x, float y, float z) {
    QexPODModel_SetNodeScale(&model->scene, nodeIndex, x, y, z);
}

void QexModel_SetNodeScaleByName(QexModel* model, const char* name, float x, float y, float z) {
    QexModel_SetNodeScale(model, IndexOf(model, name), x, y, z);
}

int32_t QexModel_SetNodeMatrix(QexModel* model, uint32_t nodeIndex, const QexMatrix* matrix) {
    if (nodeIndex >= model->scene.nodeCount) return kIndexOutOfRange;
    QexPODModel_SetNodeMatrix(&model->scene, nodeIndex, matrix);
    return 0;
}

int32_t QexModel_SetNodeMatrixByName(QexModel* model, const char* name, const QexMatrix* matrix) {
    const int32_t result = QexModel_SetNodeMatrix(model, IndexOf(model, name), matrix);
    return result == kIndexOutOfRange ? kUnknownName : result;
}

void QexModel_ResetNodeTransform(QexModel* model, uint32_t nodeIndex) {
    if (nodeIndex >= model->scene.nodeCount) return;
    QexPODModel_ResetNodeTransform(&model->scene.nodes[nodeIndex]);
    model->scene.cacheStale = 1;
}

void QexModel_SetNodeFaceTo(QexModel* model, uint32_t nodeIndex, const QexVec3* target) {
    QexVec3 position, direction;
    if (QexModel_GetNodeWorldPos(model, nodeIndex, &position) != 0) return;
    QexVec3_Subtract(&direction, target, &position);
    QexVec3_Normalize(&direction, &direction);
    // Neither the node's own position nor a NaN is a direction.
    if (!(QexVec3_DotProduct(&direction, &direction) > 0)) return;

    // The axis is direction x +Z; its length is the sine of the angle, which the arc cosine would lose.
    QexVec3 axis = {direction.y, -direction.x, 0};
    const double sine = sqrt(static_cast<double>(QexVec3_DotProduct(&axis, &axis)));
    const double angle = atan2(sine, static_cast<double>(direction.z));
    // Along the Z axis, or as near as floats tell, any axis across it will do.
    if (sine < 1e-6) axis = {0, 1, 0};
    QexMatrix rotation;
    QexMatrix_RotateAngelAxis(&rotation, static_cast<float>(-angle / kQexPi * 180), axis.x, axis.y, axis.z);

    float radians[3], degrees[3];
    QexMatrix_ToEulerAnglesXYZ(&rotation, radians);
    for (int i = 0; i < 3; ++i) degrees[i] = static_cast<float>(radians[i] * 180.0 / kQexPi);
    QexModel_SetNodeRotation(model, nodeIndex, degrees[0], degrees[1], degrees[2]);
}

void QexModel_SetNodeFaceToByName(QexModel* model, const char* name, const QexVec3* target) {
    QexModel_SetNodeFaceTo(model, IndexOf(model, name), target);
}

// ---- Animation and rendering ----

// An operation of the scene on a node by its index, by its name, and on a node with all below it.
#define QEX_NODE_OPERATION(Result, Name, Value)                                      \
    Result QexModel_##Name(QexModel* model, uint32_t nodeIndex, Value value) {       \
        return QexPODModel_##Name(&model->scene, nodeIndex, value);                  \
    }                                                                                \
    Result QexModel_##Name##ByName(QexModel* model, const char* name, Value value) { \
        return QexPODModel_##Name##ByName(&model->scene, name, value);               \
    }                                                                                \
    Result QexModel_##Name##R(QexModel* model, uint32_t nodeIndex, Value value) {    \
        return ApplyR(&model->scene, nodeIndex, value, QexPODModel_##Name);          \
    }
QEX_NODE_OPERATION(int32_t, SetNodeAnimationFrame, float)
QEX_NODE_OPERATION(int32_t, SetMeshNodeBoneAnimationFrame, float)
QEX_NODE_OPERATION(uint32_t, EnableNodeRendering, uint32_t)
QEX_NODE_OPERATION(uint32_t, EnableNodeAnimation, uint32_t)

QexPODNode* QexModel_SetNodeAnimationSpeed(QexModel* model, const char* name, float speed) {
    QexPODNode* node = QexPODModel_FindNodeByName(&model->scene, name);
    if (node) node->speed = speed;
    return node;
}

// ---- Queries ----

int32_t QexModel_GetNodeWorldMatrix(QexModel* model, uint32_t nodeIndex, QexMatrix* out) {
    if (nodeIndex >= model->scene.nodeCount) return kIndexOutOfRange;
    QexPODModel_GetWorldMatrix(&model->scene, out, &model->scene.nodes[nodeIndex]);
    return 0;
}

int32_t QexModel_GetNodeWorldMatrixByName(QexModel* model, const char* name, QexMatrix* out) {
    const int32_t result = QexModel_GetNodeWorldMatrix(model, IndexOf(model, name), out);
    return result == kIndexOutOfRange ? kUnknownName : result;
}

int32_t QexModel_GetNodeWorldPos(QexModel* model, uint32_t nodeIndex, QexVec3* out) {
    QexMatrix world;
    const int32_t result = QexModel_GetNodeWorldMatrix(model, nodeIndex, &world);
    if (result == 0) GetTranslationFromMatrix(&world, out);
    return result;
}

int32_t QexModel_GetNodeWorldPosByName(QexModel* model, const char* name, QexVec3* out) {
    const int32_t result = QexModel_GetNodeWorldPos(model, IndexOf(model, name), out);
    return result == kIndexOutOfRange ? kUnknownName : result;
}

int32_t QexModel_TestNodes(const QexModel* modelA, uint32_t nodeA, const QexModel* modelB, uint32_t nodeB,
                           QexVec3* overlap) {
    const QexBoundingBox* boxA = BoxOf(modelA, modelA->nodeBoxes, nodeA);
    const QexBoundingBox* boxB = BoxOf(modelB, modelB->nodeBoxes, nodeB);
    return boxA && boxB ? QexBoundingBox_TestBBoxBBox(boxA, boxB, overlap) : 0;
}

int32_t QexModel_TestNodesByName(const QexModel* modelA, const char* nameA, const QexModel* modelB,
                                 const char* nameB, QexVec3* overlap) {
    return QexModel_TestNodes(modelA, IndexOf(modelA, nameA), modelB, IndexOf(modelB, nameB), overlap);
}

void QexModel_CalcScreenBBox(const QexRuntimeContext* context, QexModel* model, const QexCamera* camera) {
    if (!model->nodeBoxes || !model->screenBoxes) return;
    const float halfWidth = static_cast<float>(context->width) / 2;
    const float halfHeight = static_cast<float>(context->height) / 2;
    QexMatrix viewProjection;
    QexMatrix_Multiply(&viewProjection, &camera->projectionMatrix, &camera->viewMatrix);
    for (uint32_t i = 0; i < model->scene.meshNodeCount; ++i) {
        const bool rendered = model->scene.nodes[i].stateFlags & QEX_NODE_RENDERING_ENABLED;
        QexBoundingBox* box = &model->screenBoxes[i];
        QexBoundingBox_TransformBoundingBox(&viewProjection, &model->nodeBoxes[i], box);
        ToScreen(box, rendered, halfWidth, halfHeight);
    }
}

int32_t QexModel_IsNodeInScreen(const QexRuntimeContext* context, const QexModel* model,
                                uint32_t meshNodeIndex) {
    const QexBoundingBox* box = BoxOf(model, model->screenBoxes, meshNodeIndex);
    if (!box) return 0;
    // A hidden node's corners are not in order, so all of them count.
    for (const QexVec3& corner : box->corners)
        if (!(corner.z >= -1 && corner.z <= 1)) return 0;
    const ScreenRect rect = RectOf(*box);
    return rect.left >= 0 && rect.right <= static_cast<float>(context->width) && rect.top >= 0 &&
           rect.bottom <= static_cast<float>(context->height);
}

void QexModel_Pick(const QexModel* model, const void*, const QexVec2* point, int32_t* count,
                   uint32_t* indices, int32_t capacity) {
    *count = 0;
    for (uint32_t i = 0; *count < capacity; ++i) {
        const QexBoundingBox* box = BoxOf(model, model->screenBoxes, i);
        if (!box) return;
        const ScreenRect rect = RectOf(*box);
        if (rect.left < point->x && point->x < rect.right && rect.top < point->y && point->y < rect.bottom)
            indices[(*count)++] = i;
    }
}

}  // extern "C"
