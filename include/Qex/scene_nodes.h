/* Nodes of a model, picking, and the tree of scene nodes. */
#ifndef QEX_SCENE_NODES_H
#define QEX_SCENE_NODES_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/pod.h"

QEX_BEGIN

/* ======================================================================================================
 * Models: node control, picking
 *
 * Finds a loaded model's nodes by name, moves and aims them, switches their animation and rendering, and
 * tells where they are in the world and on the screen. A ...ByName function takes the first node of exactly
 * that name; an unknown or null name changes nothing. A ...R function is applied to a node and then, depth
 * first, to all below it, and returns the last result. A node index out of range changes nothing. No GL
 * context needed on this page.
 * ====================================================================================================== */

/** @return the index of the first node of exactly that name, mesh node or not; -1 when there is none. */
QEX_API int32_t QexModel_FindNodeIdxByName(const QexModel* model, const char* name);

/** @return the node's name, owned by the scene; null for a node without one or a bad index. */
QEX_API const char* QexModel_GetNodeName(const QexModel* model, uint32_t nodeIndex);

/** @return the scene's name of the diffuse texture of the node's material, owned by the scene; null for a
 * node without material or texture or a bad index. */
QEX_API const char* QexModel_GetNodeTextureName(const QexModel* model, uint32_t nodeIndex);

/** Sets the position of a node's override, which is applied in front of its keys: the node goes to
 *  translation * rotation * scale * its own transform, in its parent's space. Parts not set keep (0, 0, 0),
 * no rotation, (1, 1, 1). So keys that place a node are turned and scaled about its parent's origin. */
QEX_API void QexModel_SetNodePosition(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodePosition by name. */
QEX_API void QexModel_SetNodePositionByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets the rotation of a node's override: degrees about X, then Y, then Z. */
QEX_API void QexModel_SetNodeRotation(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodeRotation by name. */
QEX_API void QexModel_SetNodeRotationByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets the scale of a node's override. */
QEX_API void QexModel_SetNodeScale(QexModel* model, uint32_t nodeIndex, float x, float y, float z);

/** QexModel_SetNodeScale by name. */
QEX_API void QexModel_SetNodeScaleByName(QexModel* model, const char* name, float x, float y, float z);

/** Sets a node's whole override. It is used as it is until a part is set: then the parts replace it.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_SetNodeMatrix(QexModel* model, uint32_t nodeIndex, const QexMatrix* matrix);

/** QexModel_SetNodeMatrix by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_SetNodeMatrixByName(QexModel* model, const char* name, const QexMatrix* matrix);

/** Takes a node's override away: it follows its keys alone. */
QEX_API void QexModel_ResetNodeTransform(QexModel* model, uint32_t nodeIndex);

/** Turns a node's local +Z axis towards a point in the world, with the smallest turn from +Z, by setting the
 *  override's rotation; half a turn about Y where the point lies straight along -Z. Exact for a node that
 *  neither its parents nor its own keys turn or mirror and that its keys do not move from its parent's
 * origin. The node's own position as target changes nothing.
 *  @param target  world space */
QEX_API void QexModel_SetNodeFaceTo(QexModel* model, uint32_t nodeIndex, const QexVec3* target);

/** QexModel_SetNodeFaceTo by name. */
QEX_API void QexModel_SetNodeFaceToByName(QexModel* model, const char* name, const QexVec3* target);

/** Sets one node's frame; see QexPODModel_SetNodeAnimationFrame. The next QexModel_Update moves it on, unless
 *  its animation is disabled.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_SetNodeAnimationFrame(QexModel* model, uint32_t nodeIndex, float frame);

/** QexModel_SetNodeAnimationFrame by name. @return 0, or -11 when no node has that name. */
QEX_API int32_t QexModel_SetNodeAnimationFrameByName(QexModel* model, const char* name, float frame);

/** QexModel_SetNodeAnimationFrame on a node and all below it. */
QEX_API int32_t QexModel_SetNodeAnimationFrameR(QexModel* model, uint32_t nodeIndex, float frame);

/** Sets the frame of every bone of a skinned mesh node; see QexPODModel_SetMeshNodeBoneAnimationFrame.
 *  @return 0 (also for a node without mesh or bones), or -12 for an index out of range. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrame(QexModel* model, uint32_t nodeIndex, float frame);

/** QexModel_SetMeshNodeBoneAnimationFrame by name. @return as that, or -11 when no node has that name. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrameByName(QexModel* model, const char* name, float frame);

/** QexModel_SetMeshNodeBoneAnimationFrame on a node and all below it. @return the last node's result. */
QEX_API int32_t QexModel_SetMeshNodeBoneAnimationFrameR(QexModel* model, uint32_t nodeIndex, float frame);

/** Lets the shader modules draw a node, or not.
 *  @param enable  its lowest bit counts
 *  @return the bit before, 0 or 1; 0 for an index out of range. */
QEX_API uint32_t QexModel_EnableNodeRendering(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** QexModel_EnableNodeRendering by name. @return as that; 0 when no node has that name. */
QEX_API uint32_t QexModel_EnableNodeRenderingByName(QexModel* model, const char* name, uint32_t enable);

/** QexModel_EnableNodeRendering on a node and all below it. */
QEX_API uint32_t QexModel_EnableNodeRenderingR(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** Lets QexModel_Update move a node along its keys, or not. Arguments and result as
 *  QexModel_EnableNodeRendering. */
QEX_API uint32_t QexModel_EnableNodeAnimation(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** QexModel_EnableNodeAnimation by name. @return as that; 0 when no node has that name. */
QEX_API uint32_t QexModel_EnableNodeAnimationByName(QexModel* model, const char* name, uint32_t enable);

/** QexModel_EnableNodeAnimation on a node and all below it. */
QEX_API uint32_t QexModel_EnableNodeAnimationR(QexModel* model, uint32_t nodeIndex, uint32_t enable);

/** Sets how fast a node follows the animation.
 *  @param speed  share of the way to the new frame that an update goes; 1 for the whole
 *  @return the node, or null when no node has that name. */
QEX_API QexPODNode* QexModel_SetNodeAnimationSpeed(QexModel* model, const char* name, float speed);

/** Reads a node's world matrix at its current frame, model matrices of render calls left out.
 *  @param out  out; not written on failure
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexModel_GetNodeWorldMatrix(QexModel* model, uint32_t nodeIndex, QexMatrix* out);

/** QexModel_GetNodeWorldMatrix by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_GetNodeWorldMatrixByName(QexModel* model, const char* name, QexMatrix* out);

/** Reads a node's position in the world. Arguments and result as QexModel_GetNodeWorldMatrix. */
QEX_API int32_t QexModel_GetNodeWorldPos(QexModel* model, uint32_t nodeIndex, QexVec3* out);

/** QexModel_GetNodeWorldPos by name. @return 0, or -1 when no node has that name. */
QEX_API int32_t QexModel_GetNodeWorldPosByName(QexModel* model, const char* name, QexVec3* out);

/** Tests the world boxes of two mesh nodes, of one model or two; see QexBoundingBox_TestBBoxBBox, which wants
 *  boxes that no rotation has turned. Call QexModel_UpdateModelBoundingBox before.
 *  @param overlap  out, may be null; not written for an index that is no mesh node's
 *  @return 1 when they overlap or touch, else 0; 0 for an index that is no mesh node's. */
QEX_API int32_t QexModel_TestNodes(const QexModel* modelA, uint32_t nodeA, const QexModel* modelB,
                                   uint32_t nodeB, QexVec3* overlap);

/** QexModel_TestNodes by name. @return as that; 0 when either name is unknown. */
QEX_API int32_t QexModel_TestNodesByName(const QexModel* modelA, const char* nameA, const QexModel* modelB,
                                         const char* nameB, QexVec3* overlap);

/** Works out where the mesh nodes are on the screen, from their world boxes (call
 *  QexModel_UpdateModelBoundingBox before). Fills screenBoxes: corners in the order of an axis-aligned box, x
 *  and y in pixels from the upper left corner of the surface, y downwards, z the depth; centre and halfExtent
 *  in normalised device coordinates. The corners' x and y are all 0 for a node whose rendering is disabled
 *  (its centre is not written), for a box that reaches past the far plane or behind the eye, and for one
 * wholly at depths below -1, close before the eye. A box that goes from that close to behind the eye has no
 *  meaningful place.
 *  @param context  the engine's context; its width and height are read
 *  @param camera   view and projection */
QEX_API void QexModel_CalcScreenBBox(const QexRuntimeContext* context, QexModel* model,
                                     const QexCamera* camera);

/** Tells whether a mesh node's screen box lies wholly on the surface; call QexModel_CalcScreenBBox before.
 *  @return 1 or 0; 0 for an index that is no mesh node's. The empty box of a disabled node lies on it. */
QEX_API int32_t QexModel_IsNodeInScreen(const QexRuntimeContext* context, const QexModel* model,
                                        uint32_t meshNodeIndex);

/** Lists the mesh nodes whose screen boxes contain a point, in index order, whatever their depth; call
 *  QexModel_CalcScreenBBox before. The nearest is the one of the least screenBoxes[i].centre.z. Nodes whose
 *  rendering is disabled are never listed.
 *  @param ignored   not read, may be null
 *  @param point     pixels from the upper left corner of the surface, y downwards
 *  @param count     out, entries written
 *  @param indices   out, room for `capacity` mesh node indices
 *  @param capacity  below 1 lists nothing */
QEX_API void QexModel_Pick(const QexModel* model, const void* ignored, const QexVec2* point, int32_t* count,
                           uint32_t* indices, int32_t capacity);

/* ======================================================================================================
 * Scene nodes
 *
 * A small tree above the models, for what carries what: nodes with a position, rotation and scale, some of
 * which draw a model. The caller allocates the records, which stay in place while they are linked; the engine
 * sets the links. Update and render calls cover a node, the siblings after it and everything below these,
 * each node once and before its children. No call needs more stack for a deeper tree. No GL context needed,
 * except where a function says so.
 * ====================================================================================================== */

/** Values of QexNode.type. */
#define QEX_SCENE_NODE_PLAIN 0
#define QEX_SCENE_NODE_MODEL 4

/** Bits of QexNode.nodeFlags. */
#define QEX_SCENE_NODE_CHANGED 0x0001u      /* position, rotation or scale set since the last update */
#define QEX_SCENE_NODE_MATRIX_GIVEN 0x0002u /* the local matrix was given and stays as it is */
#define QEX_SCENE_NODE_HAS_MESH 0x1000u     /* the model had a mesh when the node was created */

/** A scene node. */
typedef struct QexNode QexNode;
struct QexNode {
    int32_t type;          /* QEX_SCENE_NODE_PLAIN or QEX_SCENE_NODE_MODEL */
    char name[16];         /* at most 15 characters and the NUL */
    QexNode* parent;       /* null for a root; stays when the node is removed */
    QexNode* next;         /* next sibling */
    QexNode* firstChild;   /* first child */
    QexVec3 scale;         /* factors */
    QexVec3 rotation;      /* degrees about X, then Y, then Z */
    QexVec3 position;      /* in the parent's space */
    uint32_t nodeFlags;    /* QEX_SCENE_NODE_... */
    QexMatrix worldMatrix; /* parent's world matrix * localMatrix, as of the last update */
    QexMatrix localMatrix; /* translation * rotation * scale, as of the last update */
    QexModel* model;       /* of a model node; not owned */
};

/** Creates a node, as the last child of its parent.
 *  @param node    every field but `model` is set
 *  @param name    its first 15 characters are kept; may be null for ""
 *  @param parent  a created node, or null for a root
 *  @param matrix  local matrix, or null for none (position 0, scale 1). Updates keep it until position,
 *                 rotation or scale is set for the first time: then the other two are taken from it, without
 *                 its shear or mirroring. Until then the three fields are 0.
 *  @return 0. */
QEX_API int32_t QexNode_Create(QexNode* node, const char* name, QexNode* parent, const QexMatrix* matrix);

/** Creates a node that draws a model.
 *  @param model  stays the caller's and in place while the node is used; null draws nothing. One model may
 *                hang on several nodes: every one of them advances its animation
 *  @return 0. */
QEX_API int32_t QexModelNode_Create(QexNode* node, const char* name, QexNode* parent, QexModel* model);

/** Sets a node's position in its parent's space; the next update applies it. */
QEX_API void QexNode_SetPosition(QexNode* node, float x, float y, float z);

/** QexNode_SetPosition from a vector. */
QEX_API void QexNode_SetPosVec3(QexNode* node, const QexVec3* position);

/** Sets a node's rotation: degrees about X, then Y, then Z. */
QEX_API void QexNode_SetRotation(QexNode* node, float x, float y, float z);

/** Sets a node's scale factors. */
QEX_API void QexNode_SetScale(QexNode* node, float x, float y, float z);

/** @return the sibling before a node; null for a root, a first child, or a node that was removed. */
QEX_API QexNode* QexNode_GetPreviousSibling(const QexNode* node);

/** Takes a node, with all below it, out of its parent's children. Its `parent` field stays.
 *  @return 0 (also when it was removed before), or -1 for a root, which is left as it is. */
QEX_API int32_t QexNode_Remove(QexNode* node);

/** Modes of QexNode_Release: what becomes of the records below the node. */
#define QEX_SCENE_NODE_KEEP 0  /* they stay below the node */
#define QEX_SCENE_NODE_FREE 1  /* freed with QexMemory_Free, from which they must come */
#define QEX_SCENE_NODE_CLEAR 2 /* cleared to zero, as for any other mode */

/** Removes a node and lets go of all below it, each once. The node's own record and all models stay.
 *  @param mode  QEX_SCENE_NODE_KEEP, _FREE or _CLEAR
 *  @return 0. */
QEX_API int32_t QexNode_Release(QexNode* node, int32_t mode);

/** Recomputes local and world matrices and advances the model nodes' animation (QexModel_Update).
 *  @param ignored  not read, may be null
 *  @param node     first node; null does nothing. Its parent's world matrix is used as it is
 *  @param dt       seconds, may be negative */
QEX_API void QexNode_Update(void* ignored, QexNode* node, float dt);

/** Draws pass 0 of the model nodes, each with its world matrix as the model matrix and its own scene's lights
 *  (QexModel_GetLight). Needs a current GL context.
 *  @param node  first node; null draws nothing */
QEX_API void QexNode_RenderWithCamera(QexNode* node, const QexCamera* camera);

QEX_END

#endif
