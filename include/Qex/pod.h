/* POD scenes: records, reading, vertex access.
 *
 * A scene is read from a POD 2.0 file into plain records whose arrays belong to the scene. Reading checks
 * everything that drawing relies on (indices, parents, materials, textures, bones, batches, strips, keys,
 * offsets), so that a scene that was read is safe to draw. No GL context needed on this page.
 */
#ifndef QEX_POD_H
#define QEX_POD_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/resources.h"

QEX_BEGIN

/** POD data types of a vertex element. Integer types are converted as they are, normalised types to 0..1 or
 *  -1..1 by the divisor named. */
#define QEX_POD_FLOAT 1                /* 32-bit float */
#define QEX_POD_INT 2                  /* 32-bit signed integer */
#define QEX_POD_UNSIGNED_SHORT 3       /* 16-bit unsigned integer */
#define QEX_POD_RGBA 4                 /* one word, R in the top byte, then G, B, A; / 255 */
#define QEX_POD_ARGB 5                 /* one word, A in the top byte, then R, G, B; / 255 */
#define QEX_POD_D3DCOLOR 6             /* as QEX_POD_ARGB */
#define QEX_POD_UBYTE4 7               /* four bytes in memory order */
#define QEX_POD_DEC3N 8                /* one word of three signed 10-bit fields; / 511 */
#define QEX_POD_FIXED16_16 9           /* 16.16 fixed point; / 65536 */
#define QEX_POD_UNSIGNED_BYTE 10       /* 8-bit unsigned integer */
#define QEX_POD_SHORT 11               /* 16-bit signed integer */
#define QEX_POD_SHORT_NORM 12          /* 16-bit signed; / 32767 */
#define QEX_POD_BYTE 13                /* 8-bit integer */
#define QEX_POD_BYTE_NORM 14           /* 8-bit; / 127 */
#define QEX_POD_UNSIGNED_BYTE_NORM 15  /* 8-bit unsigned; / 255 */
#define QEX_POD_UNSIGNED_SHORT_NORM 16 /* 16-bit unsigned; / 65535 */
#define QEX_POD_UNSIGNED_INT 17        /* 32-bit unsigned integer */

/** One vertex element (positions, normals, a UV channel, ...) or the face indices of a mesh. */
typedef struct CPODData {
    uint32_t type;           /* QEX_POD_FLOAT .. QEX_POD_UNSIGNED_INT; 0 or 1 while unset */
    uint32_t componentCount; /* components a vertex, 0 when the mesh has no such element */
    uint32_t stride;         /* bytes from one vertex to the next; 0 for tightly packed own data */
    uint8_t* data; /* the element's own bytes, or its byte offset into the mesh's interleaved block */
} CPODData;

/** A scene camera. Its node is node (meshNodeCount + lightCount + camera index). */
typedef struct QexPODCamera {
    int32_t targetIndex; /* node that it looks at, -1 for none */
    float fov;           /* field of view in radians, horizontal */
    float farPlane;      /* distance of the far plane */
    float nearPlane;     /* distance of the near plane */
    float* animatedFov;  /* field of view per frame, or null */
} QexPODCamera;

/** Light types of QexPODLight. */
#define QEX_POD_LIGHT_POINT 0
#define QEX_POD_LIGHT_DIRECTIONAL 1
#define QEX_POD_LIGHT_SPOT 2

/** A scene light. Its node is node (meshNodeCount + light index). */
typedef struct QexPODLight {
    int32_t targetIndex; /* node that it shines at, -1 for none */
    float colour[3];     /* red, green, blue */
    uint32_t type;       /* QEX_POD_LIGHT_POINT, _DIRECTIONAL or _SPOT */
    float constantAttenuation;
    float linearAttenuation;
    float quadraticAttenuation;
    float fallOffAngle; /* radians */
    float fallOffExponent;
} QexPODLight;

/** A texture: only its file name; loading it is the model's business. */
typedef struct QexPODTexture {
    char* name; /* file name as the scene gives it */
} QexPODTexture;

/** A material. Texture indices are -1 for none. */
typedef struct QexPODMaterial {
    char* name;
    int32_t diffuseTexture;
    int32_t ambientTexture;
    int32_t specularColourTexture;
    int32_t specularLevelTexture;
    int32_t bumpTexture;
    int32_t emissiveTexture;
    int32_t glossinessTexture;
    int32_t opacityTexture;
    int32_t reflectionTexture;
    int32_t refractionTexture;
    float opacity;    /* 0 invisible to 1 opaque */
    float ambient[3]; /* red, green, blue */
    float diffuse[3];
    float specular[3];
    float shininess;         /* 0..1; the shaders use 256 times this */
    char* effectFile;        /* effect file name, or null */
    char* effectName;        /* effect name, or null */
    uint32_t blendSrcColour; /* GL blend factors and operations */
    uint32_t blendSrcAlpha;
    uint32_t blendDstColour;
    uint32_t blendDstAlpha;
    uint32_t blendOpColour;
    uint32_t blendOpAlpha;
    float blendColour[4];
    float blendFactor[4];
    uint32_t flags;
} QexPODMaterial;

/** The batches of a skinned mesh: each draws a run of triangles with a small set of bones. */
typedef struct QexBoneBatches {
    int32_t* boneTable;     /* batchCount rows of maxBones node indices; -1: follows the mesh node */
    int32_t* bonesPerBatch; /* bones used in each row */
    int32_t* offsets;       /* first triangle of each batch, rising from 0 */
    int32_t maxBones;       /* length of a row of boneTable */
    int32_t batchCount;     /* 0 when the mesh has no batches */
} QexBoneBatches;

/** Vertex elements in the order of QexPODMesh.attributes. */
typedef enum QexVertexElement {
    QEX_ELEMENT_POSITION,
    QEX_ELEMENT_NORMAL,
    QEX_ELEMENT_TANGENT,
    QEX_ELEMENT_BINORMAL,
    QEX_ELEMENT_UV0,
    QEX_ELEMENT_BONE_INDEX,
    QEX_ELEMENT_BONE_WEIGHT,
    QEX_ELEMENT_COUNT
} QexVertexElement;

/** How one element lies in the mesh's GL vertex buffer, ready for glVertexAttribPointer. */
typedef struct QexVertexAttribute {
    int32_t componentCount; /* 1 to 4, 0 when the mesh has no such element */
    uint32_t glType;        /* GL_FLOAT, GL_UNSIGNED_BYTE, ... */
    uint32_t normalised;    /* 1 when integers map to 0..1 or -1..1 */
    uint32_t stride;        /* bytes from vertex to vertex */
    uint32_t offset;        /* bytes from the start of the buffer */
} QexVertexAttribute;

/** A mesh. */
typedef struct QexPODMesh {
    uint32_t vertexCount;
    uint32_t faceCount; /* triangles */
    uint32_t uvwChannelCount;
    CPODData faces;         /* indices, 16- or 32-bit, always with their own data; no data: not indexed */
    uint32_t* stripLengths; /* triangles in each strip, or null */
    uint32_t stripCount;    /* 0 when the faces are a plain list */
    CPODData vertices;      /* positions */
    CPODData normals;
    CPODData tangents;
    CPODData binormals;
    CPODData* uvws; /* uvwChannelCount UV channels */
    CPODData colours;
    CPODData boneIndices; /* indices into the bone list of the vertex's batch */
    CPODData boneWeights;
    uint8_t* interleaved;      /* the vertex block that the elements' data are offsets into, or null */
    uint32_t interleavedBytes; /* its length */
    uint32_t skinned;          /* 1 when the mesh follows bones */
    uint32_t passID;           /* pass that draws it, see QexPODModel_SetPassID */
    QexBoneBatches boneBatches;
    uint32_t reserved;
    QexMatrix unpackMatrix; /* turns stored positions into model positions; identity unless given */
    /* Filled by QexModel_DownloadGeometry: */
    QexBoundingBox localBox;                          /* box of the positions */
    QexVertexAttribute attributes[QEX_ELEMENT_COUNT]; /* layout of the GL vertex buffer */
    struct QexAABB* boneBoxes; /* boxes of what follows each entry of the bone table, or null; the engine's */
    uint32_t boneBoxCount;
} QexPODMesh;

/** Animation flags of a node: which of its keys change from frame to frame. */
#define QEX_NODE_POSITION_ANIMATED 1u
#define QEX_NODE_ROTATION_ANIMATED 2u
#define QEX_NODE_SCALE_ANIMATED 4u
#define QEX_NODE_MATRIX_ANIMATED 8u

/** State flags of a node. */
#define QEX_NODE_ANIMATION_ENABLED 0x01u
#define QEX_NODE_RENDERING_ENABLED 0x02u
#define QEX_NODE_POSITION_CHANGED 0x04u
#define QEX_NODE_ROTATION_CHANGED 0x08u
#define QEX_NODE_SCALE_CHANGED 0x10u
#define QEX_NODE_OVERRIDDEN 0x20u

/** Ownership flags of a node: arrays that lie in the memory that the scene was read from. */
#define QEX_NODE_SHARED_MATRIX 0x40u
#define QEX_NODE_SHARED_SCALE 0x80u
#define QEX_NODE_SHARED_POSITION 0x200u

/** Bit of QexPODNode.blendFlags: the node is drawn in the opaque pass. */
#define QEX_NODE_OPAQUE 0x80u

/** A node. Mesh nodes come first, then the lights', then the cameras', then all others. Key arrays that lie
 *  in the caller's memory may be unaligned: read them with memcpy. */
typedef struct QexPODNode {
    int32_t objectIndex; /* its mesh, light or camera */
    char* name;
    int32_t materialIndex;   /* -1 for none */
    int32_t parentIndex;     /* -1 for a root */
    uint32_t animationFlags; /* QEX_NODE_..._ANIMATED */
    uint32_t* positionIndex; /* per frame the float offset of its key, or null: keys follow each other */
    float* position;         /* 3 floats a key, or null */
    uint32_t* rotationIndex;
    float* rotation; /* quaternions x, y, z, w, 4 floats a key */
    uint32_t* scaleIndex;
    float* scale; /* 7 floats a key, the first three the scale */
    uint32_t* matrixIndex;
    float* matrix;             /* 16 floats a key; a node with matrices ignores the other keys */
    float speed;               /* factor on the frame advance, 1 after reading */
    float frameFraction;       /* the node's own frame: fraction */
    uint32_t frame;            /* and integer part */
    uint32_t stateFlags;       /* QEX_NODE_ANIMATION_ENABLED .. QEX_NODE_OVERRIDDEN */
    float overrideScale[3];    /* (1, 1, 1) after reset */
    float overrideRotation[3]; /* Euler angles in degrees, (0, 0, 0) after reset */
    float overridePosition[3]; /* (0, 0, 0) after reset */
    uint32_t ownershipFlags;   /* QEX_NODE_SHARED_... */
    QexMatrix overrideScaleMatrix;
    QexMatrix overrideRotationMatrix;
    QexMatrix overrideTranslationMatrix;
    QexMatrix overrideMatrix; /* applied in front of the animated matrix while QEX_NODE_OVERRIDDEN is set */
    QexShaderModule* shader;  /* draws the node; null: never drawn */
    uint8_t blendFlags;       /* QEX_NODE_OPAQUE */
    int32_t blendOrder;       /* for the application, see QexModel_SetAlphaBlendingNodesWithOrder */
    /* Frames that have keys of their own, of position, rotation, scale and matrix; later frames hold the last
       key. 0: all frames have. */
    uint32_t keyFrames[4];
} QexPODNode;

/** The run-time part of a scene: current frame and world matrices. */
typedef struct SPVRTPODImpl {
    float frame;               /* frame last set, as given */
    float frameFraction;       /* the same within the animation: fraction */
    uint32_t frameInteger;     /* and integer part */
    float* cacheKeys;          /* per node: frame + fraction that its cached matrix belongs to, -1 none */
    QexMatrix* cachedMatrices; /* per node: world matrix */
    QexMatrix* bindPose;       /* per node: world matrix at frame 0 */
    uint32_t reserved;
    QexMatrix* inverseBindPose; /* per node: affine inverse of bindPose */
    QexMatrix* boneMatrices;    /* per node: its matrix as a bone of the mesh node named next */
    int32_t* boneMeshNodes;     /* per node: index of that mesh node, -1 while the matrix is not valid */
    QexMatrix* meshToBone;      /* per node: inverseBindPose * bindPose of the mesh node named next */
    int32_t* bindMeshNodes;     /* per node: index of that mesh node, -1 none */
} SPVRTPODImpl;

/** A scene. */
struct QexPODModel {
    float backgroundColour[3];
    float ambientColour[3];
    uint32_t cameraCount;
    QexPODCamera* cameras;
    uint32_t lightCount;
    QexPODLight* lights;
    uint32_t meshCount;
    QexPODMesh* meshes;
    uint32_t nodeCount;     /* all nodes */
    uint32_t meshNodeCount; /* the first nodes: those that draw meshes */
    QexPODNode* nodes;
    uint32_t textureCount;
    QexPODTexture* textures;
    uint32_t materialCount;
    QexPODMaterial* materials;
    uint32_t frameCount;      /* 0 or 1: not animated */
    uint32_t framesPerSecond; /* 30 unless the file says otherwise */
    uint32_t flags;
    SPVRTPODImpl* runtime; /* null until the scene was read whole */
    uint32_t cacheStale;   /* 1: every world matrix is recomputed when next asked for */
    uint32_t highestPass;  /* highest pass given to QexPODModel_SetPassID */
};

/** Reads a POD file.
 *  @param scene    filled; its former contents are overwritten, not released
 *  @param path     file path
 *  @param optionA  passed on to QexPODModel_ReadFromSourceStream, like the three after it
 *  @return 0 when the file could be read, -1 when not. What its bytes hold does not show here: a scene
 *  that was read whole has a non-null `runtime`; otherwise it is partly filled. Release it in both cases. */
QEX_API int32_t QexPODModel_ReadFromFile(QexPODModel* scene, const char* path, uint32_t optionA,
                                         uint32_t option2, uint32_t optionB, uint32_t option4);

/** Reads a POD scene from memory. Position, scale and matrix keys stay in `data` where its bytes can serve as
 *  they are (QEX_NODE_SHARED_...), so `data` must outlive the scene.
 *  @param size  bytes of data
 *  @return 0, or -1 when the stream could not be created; see QexPODModel_ReadFromFile for the rest. */
QEX_API int32_t QexPODModel_ReadFromMemory(QexPODModel* scene, const void* data, uint32_t size,
                                           uint32_t optionA, uint32_t option2, uint32_t optionB,
                                           uint32_t option4);

/** Reads a POD scene from an open stream, from its position to its end.
 *  @param scene    filled; null reads and checks only the blocks outside the scene, which ends in -1 unless
 *                  optionA or optionB is set
 *  @param stream   open stream; null or closed gives -1, without a line
 *  @param optionA  non-zero: the end of the stream finishes the read even without version or scene
 *  @param option2  not read
 *  @param optionB  as optionA
 *  @param option4  not read
 *  @return 0, or -1 with one line in the log that says what is wrong and where. After -1 the scene is partly
 *  filled and only good to be released. */
QEX_API int32_t QexPODModel_ReadFromSourceStream(QexPODModel* scene, QexSourceStream* stream,
                                                 uint32_t optionA, uint32_t option2, uint32_t optionB,
                                                 uint32_t option4);

/** Builds the run-time part of a scene (frame 0, bind pose); an existing one is replaced. Reading calls it.
 *  @return 0, or -1 when memory runs out. */
QEX_API int32_t QexPODModel_InitImpl(QexPODModel* scene);

/** Frees everything that the scene holds and clears the pointers; memory that it was read from is left alone.
 *  A scene of zeros, or a partly read one, is fine. */
QEX_API void QexPODModel_Release(QexPODModel* scene);

/** Sets all fields of the run-time part to zero. */
QEX_API void SPVRTPODImpl_Contructor(SPVRTPODImpl* impl);

/** Frees the arrays of the run-time part (not the record) and clears their pointers. */
QEX_API void SPVRTPODImpl_Destructor(SPVRTPODImpl* impl);

/** Frees an element's own data and resets it: type 1, 0 components, stride 0. Not for elements whose data is
 *  an offset into an interleaved block. */
QEX_API void CPODData_Reset(CPODData* element);

/** @return the number of indices that drawing the mesh takes: 3 a face, or for strips the sum of their
 *  lengths + 2. */
QEX_API uint32_t QexPODModel_CountIndices(const QexPODMesh* mesh);

/** Gives a mesh the pass in which it is drawn (0 after reading) and raises the scene's highest pass.
 *  @param mesh  a mesh of the scene */
QEX_API void QexPODModel_SetPassID(QexPODModel* scene, QexPODMesh* mesh, uint32_t passID);

/** Reads one vertex element as floats.
 *  @param out     4 floats; starts as (0, 0, 0, 1)
 *  @param source  the element's bytes, of any alignment
 *  @param type    QEX_POD_...; another value leaves (0, 0, 0, 1)
 *  @param count   components, 1 to 4; types that hold a fixed number ignore it
 *  Bytes of types 13 and 14 are read as unsigned. */
QEX_API void QexPODVertex_ReadVec(float* out, const void* source, uint32_t type, int32_t count);

/** Reads one index.
 *  @param out   not written unless type is QEX_POD_UNSIGNED_SHORT or QEX_POD_UNSIGNED_INT */
QEX_API void QexPODVertex_ReadInt(uint32_t* out, const void* source, uint32_t type);

/** Writes one vertex element: the inverse of QexPODVertex_ReadVec. Integers are truncated, colours clamped to
 *  0..1, normalised types scaled by their divisor; values beyond a type's range are clamped to it.
 *  @param destination  of any alignment
 *  @param values       4 floats */
QEX_API void QexVertexWriteVec(void* destination, uint32_t type, int32_t count, const float* values);

/** Computes the box of float positions in an interleaved block: corners, centre, half extents.
 *  @param box     out
 *  @param data    the block
 *  @param count   vertices; 0 or less gives a box of zeros
 *  @param offset  byte offset of the position (3 floats) in a vertex
 *  @param stride  bytes a vertex */
QEX_API void QexBoundingBox_ComputeInterleaved(QexBoundingBox* box, const void* data, int32_t count,
                                               uint32_t offset, uint32_t stride);

QEX_END

#endif
