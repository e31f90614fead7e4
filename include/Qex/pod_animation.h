/* POD scenes that move: bone batching, animation and world matrices. */
#ifndef QEX_POD_ANIMATION_H
#define QEX_POD_ANIMATION_H

#include "Qex/base.h"
#include "Qex/math.h"
#include "Qex/pod.h"

QEX_BEGIN

/* ======================================================================================================
 * POD scenes: bone batching
 *
 * A skinned mesh may follow more bones than a vertex shader has room for matrices. Batching cuts it into runs
 * of triangles that need few bones each. Scenes read from files usually bring their batches; these functions
 * make them for other data, and export the small containers that the work uses. No pointer may be null except
 * where a function says so. No GL context needed.
 * ====================================================================================================== */

/** Most bones in a batch that the skinned modules draw. */
#define QEX_MAX_BATCH_BONES 16

/** A set of bone indices with a fixed capacity. */
typedef struct CBatch {
    int32_t capacity;
    int32_t count;
    int32_t* bones; /* capacity entries, owned; null before CBatch_SetSize */
} CBatch;

/** An array of elements of one size that grows at its end. */
typedef struct CGrowableArray {
    void* data;           /* owned; from QexMemory_Alloc */
    uint32_t elementSize; /* bytes */
    uint32_t elementCount;
} CGrowableArray;

/** A growing array of integers. */
typedef struct CStdVectorInt {
    uint32_t capacity;
    uint32_t size;
    int32_t* data; /* owned */
} CStdVectorInt;

/** Makes an empty set without room. */
QEX_API void CBatch_Constructor(CBatch* batch);

/** Frees the set's storage. CBatch_Constructor makes it usable again. */
QEX_API void CBatch_Destructor(CBatch* batch);

/** Empties the set and gives it room for `capacity` bones; without memory, or below 1, for none. */
QEX_API void CBatch_SetSize(CBatch* batch, int32_t capacity);

/** Empties the set. */
QEX_API void CBatch_Clear(CBatch* batch);

/** Adds a bone. @return 1, also when it is there already; 0 when it is negative or the set is full. */
QEX_API int32_t CBatch_Add(CBatch* batch, int32_t bone);

/** @return 1 when the set holds the bone, else 0. */
QEX_API int32_t CBatch_ContainsIdx(const CBatch* batch, int32_t bone);

/** @return 1 when every bone of b is in a (an empty b always is), else 0. */
QEX_API int32_t CBatch_Contains(const CBatch* a, const CBatch* b);

/** @return the number of b's bones that a lacks, or -1 when a has no room for them. */
QEX_API int32_t CBatch_TestMerge(const CBatch* a, const CBatch* b);

/** Adds b's bones to a, as far as there is room. */
QEX_API void CBatch_Merge(CBatch* a, const CBatch* b);

/** Makes a's bones those of b, as far as there is room. */
QEX_API void CBatch_Assign(CBatch* a, const CBatch* b);

/** Makes a new set with b's capacity and bones. @param a  uninitialised */
QEX_API void CBatch_CopyConstructor(CBatch* a, const CBatch* b);

/** Copies the bones out. @param destination  room for the set's bones  @param count  their number, out */
QEX_API void CBatch_Write(const CBatch* batch, int32_t* destination, int32_t* count);

/** Turns a vertex's bones into positions within the set.
 *  @param indices  n bone indices, changed: a bone of weight 0 becomes 0, one that is not in the set stays
 *  @param weights  n weights */
QEX_API void CBatch_GetVertexBoneIndices(const CBatch* batch, float* indices, const float* weights,
                                         int32_t n);

/** Makes an empty array. @param elementSize  bytes */
QEX_API void CGrowableArray_Constructor(CGrowableArray* array, uint32_t elementSize);

/** Frees the array's block and empties it. */
QEX_API void CGrowableArray_Destructor(CGrowableArray* array);

/** Copies n elements to the end; without memory nothing changes, and a line is printed. */
QEX_API void CGrowableArray_Append(CGrowableArray* array, const void* source, uint32_t n);

/** @return the address of element i, which is below the count; good until the array grows. */
QEX_API void* CGrowableArray_at(const CGrowableArray* array, uint32_t i);

/** @return the address of the last element, or null. */
QEX_API void* CGrowableArray_last(const CGrowableArray* array);

/** @return the number of elements. */
QEX_API uint32_t CGrowableArray_size(const CGrowableArray* array);

/** Hands the block over and empties the array.
 *  @param block  out; the caller frees it with QexMemory_Free; null when there were no elements
 *  @return the number of elements. */
QEX_API uint32_t CGrowableArray_Surrender(CGrowableArray* array, void** block);

/** Makes an empty array with room for `capacity` integers. */
QEX_API void CStdVectorInt_Constructor(CStdVectorInt* vector, uint32_t capacity);

/** Frees the array and zeroes the record. */
QEX_API void CStdVectorInt_Destructor(CStdVectorInt* vector);

/** Appends an integer; the room grows by 64 when only one place is left. Without memory nothing changes, and
 *  a line is printed. */
QEX_API void CStdVectorInt_PushBack(CStdVectorInt* vector, int32_t value);

/** @return element i, which is below the size. */
QEX_API int32_t CStdVectorInt_At(const CStdVectorInt* vector, uint32_t i);

/** @return the number of integers. */
QEX_API uint32_t CStdVectorInt_Size(const CStdVectorInt* vector);

/** Cuts a skinned mesh into batches. In triangle order, a triangle's bones go into the first batch that holds
 * them all, or widen the first one whose bones they include, or become a new batch; then every triangle goes
 * to the first batch that holds its bones. A vertex that triangles of several batches share is repeated; bone
 * indices count within the batch afterwards, and a bone of weight 0 has index 0.
 *  @param batches         out; overwritten; release with QexBoneBatches_Release. maxBones entries a row
 *  @param outVertexCount  out: the number of new vertices; may be null
 *  @param outVertices     out: the new vertices, of the same layout; the caller frees them with
 * QexMemory_Free
 *  @param indices         3 * triangleCount vertex numbers, replaced by those of the new vertices, grouped by
 *                         batch
 *  @param vertices        vertexCount vertices of `stride` bytes; bone indices there are node indices
 *  @param weightType, indexType      QEX_POD_...
 *  @param weightOffset, indexOffset  bytes from the start of a vertex
 *  @param maxBones        bones a batch, 1 or more; the skinned modules draw at most QEX_MAX_BATCH_BONES
 *  @param bonesPerVertex  1 to 4 weights and bone indices a vertex
 *  @return 0, or -1 with the indices unchanged: another number of bones a vertex, a triangle with more bones
 *  than maxBones, a bone or vertex index out of range, elements that reach beyond the stride, more than 512
 *  batches, or no memory. outVertices is not written then, and batches holds nothing to release. */
QEX_API int32_t QexBoneBatches_Create(QexBoneBatches* batches, uint32_t* outVertexCount, void** outVertices,
                                      uint32_t* indices, uint32_t vertexCount, const void* vertices,
                                      uint32_t stride, uint32_t weightOffset, uint32_t weightType,
                                      uint32_t indexOffset, uint32_t indexType, uint32_t triangleCount,
                                      int32_t maxBones, uint32_t bonesPerVertex);

/** Frees the three tables and sets the batch count to 0. */
QEX_API void QexBoneBatches_Release(QexBoneBatches* batches);

/* ======================================================================================================
 * POD scenes: animation and world matrices
 *
 * Every node has its own frame. A world matrix is computed once and kept until a frame, an override or the
 * scene's `cacheStale` flag changes. Frames beyond the last key hold the last key. Scenes with 0 or 1 frames
 * stand still. Result codes: -9 null argument, -11 no node of that name, -12 node index out of range.
 * No GL context needed on this page.
 * ====================================================================================================== */

/** Moves every node whose animation is enabled to a frame (nodes of a speed other than 1 move a part of the
 *  way forward, of a whole turn where they are there already), wrapped into the animation, whose last frame
 *  is where it starts again and shows the first.
 *  @param frame  in frames, fraction included; below 0 the loop is counted backwards from its end; what is no
 *                finite number, or 4294967040 and more either way, counts as 0 */
QEX_API void QexPODModel_SetFrame(QexPODModel* scene, float frame);

/** Sets one node's frame, wrapped by the frame count when it lies beyond the last; below 0 counts as 0.
 *  @return 0, or -12. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrame(QexPODModel* scene, uint32_t index, float frame);

/** Sets one node's frame as it is, without wrapping.
 *  @param node  may be null: only the cache is marked stale
 *  @return 0. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame);

/** QexPODModel_SetNodeAnimationFrame by name. @return 0, or -11. */
QEX_API int32_t QexPODModel_SetNodeAnimationFrameByName(QexPODModel* scene, const char* name, float frame);

/** Sets one node's frame by time.
 *  @param time  seconds; the frame is framesPerSecond * time
 *  @return 0, or -1 (logged) for an index out of range. */
QEX_API int32_t QexPODModel_SetNodeAnimationTime(QexPODModel* scene, uint32_t index, float time);

/** QexPODModel_SetNodeAnimationTime by name. @return as that, or -11. */
QEX_API int32_t QexPODModel_SetNodeAnimationTimeByName(QexPODModel* scene, const char* name, float time);

/** Sets the frame of every bone of a skinned mesh node (the nodes in its batches' bone lists). A node whose
 *  mesh is not skinned, or that draws no mesh, is left as it is.
 *  @return 0, or -12 for an index out of range. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrame(QexPODModel* scene, uint32_t index, float frame);

/** The same for a node given directly. @return 0, or -9 when scene or node is null. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrameA(QexPODModel* scene, QexPODNode* node, float frame);

/** The same by name. @return 0, or -11 when no node has that name. */
QEX_API int32_t QexPODModel_SetMeshNodeBoneAnimationFrameByName(QexPODModel* scene, const char* name,
                                                                float frame);

/** Lets QexPODModel_SetFrame move a node, or not.
 *  @param enable  its lowest bit counts
 *  @return the previous bit; 0 for an index out of range. */
QEX_API uint32_t QexPODModel_EnableNodeAnimation(QexPODModel* scene, uint32_t index, uint32_t enable);

/** Lets the shader modules draw a node, or not. Arguments and result as QexPODModel_EnableNodeAnimation. */
QEX_API uint32_t QexPODModel_EnableNodeRendering(QexPODModel* scene, uint32_t index, uint32_t enable);

/** QexPODModel_EnableNodeAnimation by name; 0 when no node has that name. */
QEX_API uint32_t QexPODModel_EnableNodeAnimationByName(QexPODModel* scene, const char* name, uint32_t enable);

/** QexPODModel_EnableNodeRendering by name; 0 when no node has that name. */
QEX_API uint32_t QexPODModel_EnableNodeRenderingByName(QexPODModel* scene, const char* name, uint32_t enable);

/** Sets the position part of a node's override, which is applied in front of its animated matrix
 *  (translation * rotation * scale). An index out of range is ignored. */
QEX_API void QexPODModel_SetNodePosition(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets the rotation part of a node's override: degrees about x, then y, then z. */
QEX_API void QexPODModel_SetNodeRotation(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets the scale part of a node's override. */
QEX_API void QexPODModel_SetNodeScale(QexPODModel* scene, uint32_t index, float x, float y, float z);

/** Sets a node's whole override matrix; it is used as it is until a part is set, which replaces it. */
QEX_API void QexPODModel_SetNodeMatrix(QexPODModel* scene, uint32_t index, const QexMatrix* matrix);

/** Takes a node's override away. The world matrices that are cached stay until the next change of a frame or
 *  an override. */
QEX_API void QexPODModel_ResetNodeTransform(QexPODNode* node);

/** The node's translation at its current frame, as a matrix; identity without position keys. */
QEX_API void QexPODModel_GetTranslationMatrix(const QexPODModel* scene, QexMatrix* out,
                                              const QexPODNode* node);

/** The node's rotation at its current frame (spherical interpolation); identity without rotation keys. */
QEX_API void QexPODModel_GetRotationMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node);

/** The node's scale at its current frame; identity without scale keys. */
QEX_API void QexPODModel_GetScalingMatrix(const QexPODModel* scene, QexMatrix* out, const QexPODNode* node);

/** The node's matrix key at its current frame, never interpolated; identity without matrix keys. */
QEX_API void QexPODModel_GetTransformationMatrix(const QexPODModel* scene, QexMatrix* out,
                                                 const QexPODNode* node);

/** The node's world matrix, from the cache while it is valid.
 *  @param node  a node of the scene */
QEX_API void QexPODModel_GetWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* node);

/** The node's world matrix, computed anew (its parents' come from the cache). */
QEX_API void QexPODModel_GetWorldMatrixNoCache(QexPODModel* scene, QexMatrix* out, QexPODNode* node);

/** Goes back to frame 0 and takes the bind pose from there. */
QEX_API void QexPODModel_FlushCache(QexPODModel* scene);

/** The matrix that carries a skinned vertex from its mesh into the world along one bone:
 *  world(bone) * inverse(bind pose(bone)) * bind pose(mesh node). */
QEX_API void QexPODModel_GetBoneWorldMatrix(QexPODModel* scene, QexMatrix* out, QexPODNode* meshNode,
                                            QexPODNode* boneNode);

/** Reads a camera's position and target.
 *  @param position  out, 3 floats, world space
 *  @param target    out, 3 floats; not written when the camera has no target node
 *  @param index     0 to cameraCount - 1
 *  @return the field of view in radians at the current frame; 0, with nothing written, for a bad index. */
QEX_API float QexPODModel_GetCameraPos(QexPODModel* scene, float* position, float* target, uint32_t index);

/** Reads a camera's position and axes.
 *  @param position  out, 3 floats
 *  @param target    out, 3 floats: position minus the world matrix's second column
 *  @param up        out, 3 floats: the negated third column
 *  @return as QexPODModel_GetCameraPos. */
QEX_API float QexPODModel_GetCameraPosEx(QexPODModel* scene, float* position, float* target, float* up,
                                         uint32_t index);

/** Reads a camera's clip distances; nothing is written for a bad index. */
QEX_API void QexPODModel_GetCameraNearFar(const QexPODModel* scene, float* zNear, float* zFar,
                                          uint32_t index);

/** Reads a light's position and direction (the negated third column of its node's world matrix), 3 floats
 *  each; nothing is written for a bad index. */
QEX_API void QexPODModel_GetLight(QexPODModel* scene, float* position, float* direction, uint32_t index);

/** Reads a light's direction as 4 floats, the fourth 0.
 *  @return 0, or -1 for a point light, whose direction is given as (0.5, 0, 0.5, 0), or a bad index. */
QEX_API int32_t QexPODModel_GetLightDirection(QexPODModel* scene, uint32_t index, float* direction);

/** A point of a mesh node's plane: its first vertex in the world, 3 floats. Meshes without an interleaved
 *  block give (0, 0, 0) and a line in the log. */
QEX_API void QexPODModel_GetNodePlanePoint(QexPODModel* scene, uint32_t index, float* point);

/** The normal of a mesh node's plane: its first normal in the world, 3 floats, not normalised. Meshes without
 *  an interleaved block give (0, 1, 0) and a line in the log. */
QEX_API void QexPODModel_GetNodePlaneNormal(QexPODModel* scene, uint32_t index, float* normal);

/** @return the first node of exactly that name, or null. */
QEX_API QexPODNode* QexPODModel_FindNodeByName(const QexPODModel* scene, const char* name);

/** @return the index of the first node of exactly that name, or -1. */
QEX_API int32_t QexPODModel_FindNodeIdxByName(const QexPODModel* scene, const char* name);

QEX_END

#endif
