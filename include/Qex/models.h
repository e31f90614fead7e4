/* Models: loading, from arrays, rendering. */
#ifndef QEX_MODELS_H
#define QEX_MODELS_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/meshes.h"
#include "Qex/resources.h"
#include "Qex/shader_modules.h"

QEX_BEGIN

/* ======================================================================================================
 * Models: records and loading
 *
 * A model joins a POD scene with its GL buffers, textures and shader modules. The caller owns the record,
 * which stays in place from QexModel_Create to QexModel_Unload. Needs a current GL context, except where a
 * function says not.
 * ====================================================================================================== */

/** The skinned shadow program that all models share. */
typedef struct QexSkinShadowProgram {
    uint32_t program;           /* GL program, 0 while there is none */
    int32_t viewProjMatrixLoc;  /* "viewProjMatrix" */
    int32_t boneCountLoc;       /* "boneCount" */
    int32_t boneMatrixArrayLoc; /* "boneMatrixArray" */
} QexSkinShadowProgram;

/** The static shadow program that all models share. */
typedef struct QexModelShadowProgram {
    uint32_t program;     /* GL program, 0 while there is none */
    int32_t mvpMatrixLoc; /* "mvpMatrix" */
} QexModelShadowProgram;

#ifdef QEX_UNPREFIXED_NAMES
/** The shared shadow programs, made with the default shaders. */
QEX_API extern QexSkinShadowProgram m_SkinShadowShaderProgram;
QEX_API extern QexModelShadowProgram m_uModelShadowShaderProgram;
#endif

/** Clears a model record; a load of a model that was there is given up. No GL context needed.
 *  @return 0, or -1 when a hook calls it for the model whose load has called the hook. */
QEX_API int32_t QexModel_Create(QexModel* model);

/** Loads a model whole: scene, default shaders, buffers, textures; then calls the hook for each mesh node and
 *  gives all of them the default modules. A model that was loaded before is unloaded first. Hooks may load
 *  other models; loading or unloading their own one is refused with a line.
 *  @param directory  put in front of the file's and the textures' names as it is, with its separator
 *  @param file       POD file; directory and name together at most 255 characters
 *  @return 0, or the failing step's result, with lines in the log that say what is wrong; the model then
 * holds nothing but may be unloaded all the same. Missing textures fail nothing. */
QEX_API int32_t QexModel_LoadContent(QexModel* model, const char* directory, const char* file);

/** Loads a model whole from memory, its textures from a cache.
 *  @param data   the POD file; must outlive the model, which uses its animation keys in place
 *  @param size   bytes of data
 *  @param cache  name cache of QexTexture records or of pointers to them (its element size tells), or null
 * for none; keeps owning the textures. Records must stay in place while the model uses them: such a cache may
 * not grow.
 *  @return 0, also when reading the scene fails; -1 when its geometry cannot be drawn or memory runs out.
 *  Failures put a line in the log; the model then holds nothing and draws nothing. */
QEX_API int32_t QexModel_LoadContentFromCache(QexModel* model, const void* data, uint32_t size,
                                              QexNameCache* cache);

/** Begins to load a model as QexModel_LoadContent does, in parts: QexModel_ContinueLoad does the work. A
 * model that was loaded or is being loaded is unloaded first. Until the load is done the model stands empty:
 * it draws nothing, may be passed to every function, and what is set in it but for its hooks and its frame is
 *  lost. Its record stays in place. QexModel_Unload, or another load into it, gives the load up.
 *  @param directory, file  as in QexModel_LoadContent; copied
 *  @return 0; -1, with the lines of QexModel_LoadContent in the log and nothing begun, when the file cannot
 * be opened or memory runs out. */
QEX_API int32_t QexModel_BeginLoad(QexModel* model, const char* directory, const char* file);

/** QexModel_BeginLoad from memory, as QexModel_LoadContentFromCache loads.
 *  @param data, size, cache  as there; data and cache must live until the load is done or given up, too
 *  @return 0; -1, with a line in the log, for null data or when memory runs out. */
QEX_API int32_t QexModel_BeginLoadFromCache(QexModel* model, const void* data, uint32_t size,
                                            QexNameCache* cache);

/** Goes on with a load. The end is that of the load at once: the same scene, buffers and textures, hooks
 * called in the same order, the same lines in the log. GL state may be changed between calls; buffers are
 * unbound when it returns, and a texture may stay bound to the active unit.
 *  @param milliseconds  after which it stops; 0 and below: after one piece. The last piece is ended: 128 kB
 *  read, decoded, laid out or uploaded to a buffer, one mip level uploaded, one mesh checked, measured or cut
 *  into bone batches, one call of a hook, or the default shaders made with the first model
 *  @param progress      out, 0 to 1, 1 when it is done; never less than before; 0 on failure; may be null
 *  @return 1 while there is more to do, 0 when the model is loaded; -1 when the load failed, with the lines
 * of the load at once and nothing left behind, as it does after the GL context was lost and restored, and,
 * with a line, for a model that is not being loaded. */
QEX_API int32_t QexModel_ContinueLoad(QexModel* model, float milliseconds, float* progress);

/** Reads the scene only, in place of what the model holds. No GL context needed, unless that is GL objects.
 *  @return 0; -1 when the file cannot be opened or does not hold a sound scene (nothing is kept then). */
QEX_API int32_t QexModel_LoadFromFile(QexModel* model, const char* directory, const char* file);

/** QexModel_LoadFromFile from memory, which must outlive the scene. @return 0, or -1. */
QEX_API int32_t QexModel_LoadFromMemory(QexModel* model, const void* data, uint32_t size);

/** Creates the GL buffers and works out each mesh's box and attribute layout. Vertices are laid out
 *  interleaved where the file does not; 32-bit indices become 16-bit ones; batches of more than
 *  QEX_MAX_BATCH_BONES bones are cut into smaller ones; binormals that are missing next to normals and
 *  tangents are made.
 *  @return 0; -1 with a line in the log when memory runs out, a mesh needs more than 16-bit indices, or a
 *  batch cannot be cut. */
QEX_API int32_t QexModel_DownloadGeometry(QexModel* model);

/** Loads each material's diffuse texture (directory and name) and alpha texture ("_a" before the last four
 *  characters), PVR or KTX. A texture that fails to load is null. @return 0, or -1 when memory runs out. */
QEX_API int32_t QexModel_LoadTextureFromFile(QexModel* model, const char* directory);

/** Takes each material's textures from a cache, by name; see QexModel_LoadContentFromCache. Textures that the
 *  model owned are released. @return 0, or -1 when memory runs out. */
QEX_API int32_t QexModel_LoadTextureFromCache(QexModel* model, QexNameCache* cache);

/** Creates the shader modules and the shadow target that models share, on the first call; counts every call.
 *  @return 0. */
QEX_API int32_t QexModel_CreateDefaultShader(void);

/** Balances one QexModel_CreateDefaultShader; the last one frees the shared set.
 *  @param force  1: frees it whatever the count; models that were loaded with it are no longer drawn then,
 *                with a line in the log each, until they are loaded again */
QEX_API void QexModel_ReleaseShader(int32_t force);

/** Sets the size of the shadow target that is made with the next shared set; 512 x 512 at first. No GL
 *  context needed.
 *  @param width   pixels, 1 and more; what the GL cannot draw into is cut, with a line in the log, when the
 *                 target is made
 *  @param height  likewise. A size below 1 is refused with a line and changes nothing */
QEX_API void QexModel_SetShadowMapSize(int32_t width, int32_t height);

/** Frees everything that the model holds. A second call does nothing. */
QEX_API void QexModel_Unload(QexModel* model);

/** Deletes the GL buffers. */
QEX_API void QexModel_UnloadGeometry(QexModel* model);

/** Releases the textures that the model owns and forgets the others. */
QEX_API void QexModel_UnloadTextures(QexModel* model);

/** Replaces a material's diffuse texture. A model that owns its textures (QEX_MODEL_OWNS_TEXTURES) releases
 * the new one too and frees it with QexMemory_Free. No GL context needed.
 *  @param texture  may be null
 *  @param index    material
 *  @return the texture before, now the caller's; null, with nothing changed, for a bad index. */
QEX_API QexTexture* QexModel_ReplaceTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index);

/** Replaces a material's alpha texture; as QexModel_ReplaceTextureByIdx. */
QEX_API QexTexture* QexModel_ReplaceAlphaTextureByIdx(QexModel* model, QexTexture* texture, uint32_t index);

/** @return the scene's number of animation frames. No GL context needed. */
QEX_API uint32_t QexModel_GetNumFrames(const QexModel* model);
/** @return the scene's frames per second. No GL context needed. */
QEX_API uint32_t QexModel_GetFPS(const QexModel* model);
/** @return the scene's number of nodes. No GL context needed. */
QEX_API uint32_t QexModel_GetNumNodes(const QexModel* model);
/** @return the scene's number of mesh nodes. No GL context needed. */
QEX_API uint32_t QexModel_GetNumMeshNodes(const QexModel* model);

/* ======================================================================================================
 * Models from arrays
 *
 * Geometry that the application makes: a mesh of plain arrays (Qex/meshes.h) becomes a model in one call. Its
 * textures stand upright where the first row is the lower
 * edge, as `qex convert` and `qex texture --flip` write them. Front faces are counter-clockwise.
 * ====================================================================================================== */

/** Makes a model of a mesh: one mesh node, "mesh", with a white material of ambient 0.2 and diffuse 0.8. It
 * is drawn, moved, picked and unloaded like any other. With normals its module is lit (an even 0.2 where no
 *  lights are given), without them unlit; meshes with normals and texture coordinates get tangents, for
 *  QexGouraudNormalMapShader. No module reads vertex colours: one colour for all vertices becomes a texture
 *  of one pixel, others a texture with a patch for each triangle, whose vertices are parted then, so that at
 *  most 21,845 triangles can have colours; such a mesh gets no tangents. Neither module regards the
 *  alpha of texture or colours; QexTextureNoAlphaShader does. The mesh is copied.
 *  @param model    cleared first; unload before what it holds
 *  @param mesh     arrays of at least the counts; vertices that no index names are allowed
 *  @param texture  stays the application's, alive as long as the model; colours are left out with it, with a
 *                  line in the log; null: the colours, or white
 *  @return 0; -1, with a line in the log and an empty model, for null pointers, counts out of range or of no
 *  whole triangles, an index that names no vertex, or when memory runs out. Needs a current GL context. */
QEX_API int32_t QexModel_CreateFromMesh(QexModel* model, const QexMesh* mesh, QexTexture* texture);

/* ======================================================================================================
 * Models: rendering
 *
 * The render calls draw mesh nodes in index order, each through its shader module. A `pass` argument draws
 * only the nodes whose mesh has that pass ID (0 after reading). `modelMatrix` is applied in front of every
 * node's world matrix and may be null; so may `lights`, for no light. Nothing is allocated.
 * Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** A transparent node that was put off. */
typedef struct TransparentSPODNodeInfo {
    QexModel* model; /* null: an empty entry */
    uint32_t nodeIndex;
    float distance; /* squared distance from the eye, filled when the list is drawn */
    QexLightSet lights;
    QexMatrix modelMatrix;
    QexVec3 eye;
    QexMatrix view;
    QexMatrix projection;
    int32_t passID; /* pass of the call that put it off */
} TransparentSPODNodeInfo;

#ifdef QEX_UNPREFIXED_NAMES
/** The eye of the last camera that a render call used. */
QEX_API extern QexVec3 g_VecEyePos;
#endif

/** Draws the model from a camera, without regard to opacity. */
QEX_API void QexModel_RenderWithCamera(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                       const QexMatrix* modelMatrix, uint32_t pass);

/** Draws the model with a view and a projection matrix, without regard to opacity. */
QEX_API void QexModel_RenderWithViewProjection(QexModel* model, const QexLightSet* lights,
                                               const QexMatrix* modelMatrix, const QexMatrix* view,
                                               const QexMatrix* projection, uint32_t pass);

/** Draws one mesh node from a camera, whatever its pass; a bad index draws nothing. */
QEX_API void QexModel_RenderNodeWithCamera(QexModel* model, uint32_t nodeIndex, const QexLightSet* lights,
                                           const QexCamera* camera, const QexMatrix* modelMatrix);

/** Draws one mesh node with a view and a projection matrix, whatever its pass. */
QEX_API void QexModel_RenderNodeWithViewProjection(QexModel* model, uint32_t nodeIndex,
                                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                                   const QexMatrix* view, const QexMatrix* projection);

/** Node choices of the Ex calls. */
#define QEX_RENDER_ALL 0         /* opaque nodes are drawn */
#define QEX_RENDER_OPAQUE 1      /* those outside the alpha-blending list are drawn */
#define QEX_RENDER_ALPHA_NODES 2 /* those in the alpha-blending list are drawn */

/** Draws the opaque nodes from a camera and puts the others off; see QexModel_RenderWithViewProjectionEx. */
QEX_API void QexModel_RenderWithCameraEx(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                         const QexMatrix* modelMatrix, uint32_t pass, uint32_t mode,
                                         TransparentSPODNodeInfo* list, uint32_t* count);

/** Draws each node whose material's opacity and whose global alpha are at least 1 and whom the mode allows;
 * the others go to the list.
 *  @param eye    3 floats of the eye position, for sorting
 *  @param mode   QEX_RENDER_...; another draws none
 *  @param list   room for every mesh node that may be put off, or null: they are dropped
 *  @param count  in and out, entries in the list; may be null when list is */
QEX_API void QexModel_RenderWithViewProjectionEx(QexModel* model, const QexLightSet* lights,
                                                 const QexMatrix* modelMatrix, const QexVec3* eye,
                                                 const QexMatrix* view, const QexMatrix* projection,
                                                 uint32_t pass, uint32_t mode, TransparentSPODNodeInfo* list,
                                                 uint32_t* count);

/** Sorts the list by distance (with the C library's qsort, which may allocate for long lists) and draws the
 *  entries of the pass, farthest first. Entries of several models and cameras may share a list. The distance
 * is that from the eye to the node's own place in its scene: a model matrix that moves the model does not
 * count, so transparent instances of one model, told apart by their matrices alone, are to be drawn list by
 * list. */
QEX_API void QexModel_RenderAlphaBlendingNodes(TransparentSPODNodeInfo* list, uint32_t count, uint32_t pass);

/** qsort comparison of two list entries, nearest first. No GL context needed. @return -1, 0 or 1. */
QEX_API int TransparentSPODNodeInfo_Compare(const void* a, const void* b);

/** Advances the animation and sets the scene's frame; past the end it starts again at 0, before 0 it goes to
 *  the last frame. No GL context needed.
 *  @param ignored  not read, may be null
 *  @param dt       seconds, may be negative */
QEX_API void QexModel_Update(void* ignored, QexModel* model, float dt);

/** Sets the opacity of a node's material, and so of every node that shares it. No GL context needed.
 *  @param opacity  0 to 1
 *  @return the value before; 0, with nothing changed, for a node without a material or a bad index. */
QEX_API float QexModel_SetOpacity(QexModel* model, uint32_t nodeIndex, float opacity);

/** QexModel_SetOpacity on every descendant of a node, not on the node itself. No GL context needed. */
QEX_API void QexModel_SetOpacityR(QexModel* model, uint32_t nodeIndex, float opacity);

/** Puts all mesh nodes into the opaque pass, then those named into the alpha-blending list. No GL context
 *  needed.
 *  @param names  node names, or null for none */
QEX_API void QexModel_SetAlphaBlendingNodes(QexModel* model, const char* const* names, int32_t count);

/** Puts the named nodes into the alpha-blending list and stores their blend order. Other nodes are left
 * alone. No GL context needed.
 *  @param names   node names, or null: nothing happens
 *  @param orders  one value per node of the scene, indexed by node; null: orders stay */
QEX_API void QexModel_SetAlphaBlendingNodesWithOrder(QexModel* model, const char* const* names,
                                                     const int32_t* orders, int32_t count);

/** Gives a node a shader module. No GL context needed.
 *  @param module  null: the node is not drawn */
QEX_API void QexModel_SetShaderProgram(QexModel* model, uint32_t nodeIndex, QexShaderModule* module);

/** Gives all mesh nodes a module. No GL context needed.
 *  @param staticModule   for meshes that follow no bones, or null: they keep theirs
 *  @param skinnedModule  for meshes that do, or null. With both, a model of an earlier start of the engine
 * can be drawn again */
QEX_API void QexModel_SetShaderProgramForAllNode(QexModel* model, QexShaderModule* staticModule,
                                                 QexShaderModule* skinnedModule);

/** Sets the alpha threshold of the modules that models get by default, the lit one of models from arrays
 *  included, where they exist. No GL context needed. */
QEX_API void QexModel_SetAlphaTestCmpValue(float threshold);

/** Does nothing; kept for callers. */
QEX_API void QexModel_SetAnimatedUVUniform(QexModel* model, float u, float v);

/** Recomputes a mesh node's box (nodeBoxes): its mesh's box carried by the node. The box of a skinned mesh
 * goes along with the first bone of its first batch; while lean drawing is on (QexRenderer_SetDrawing) it is
 * the axis-aligned box around all that its bones carry, so that shadow maps, screen boxes and picking miss no
 *  bent part. No GL context needed.
 *  @param modelMatrix  applied in front for meshes that are not skinned, or null */
QEX_API void QexModel_UpdateMeshNodeBoundingBox(QexModel* model, uint32_t meshNodeIndex,
                                                const QexMatrix* modelMatrix);

/** QexModel_UpdateMeshNodeBoundingBox for every mesh node. No GL context needed. */
QEX_API void QexModel_UpdateModelBoundingBox(QexModel* model, const QexMatrix* modelMatrix);

/** Reads the scene's first lights, at most QEX_MAX_LIGHTS. A light that is neither point nor directional, a
 * spot light for one, is counted but leaves its entry as it was: zero the set first, and the entry is a black
 * point light. No GL context needed. @param set  out */
QEX_API void QexModel_GetLight(QexModel* model, QexLightSet* set);

/** Reads a scene camera at the current frame. No GL context needed.
 *  @param eye, target  out; not written when the result is 0
 *  @param up           out; (0, 1, 0) but for a camera without a target node
 *  @param fov          out, radians, horizontal; 0.785 when the result is 0
 *  @return 1, or 0 when the scene has no such camera. */
QEX_API int32_t QexModel_UpdateCamera(QexModel* model, QexVec3* eye, QexVec3* target, QexVec3* up, float* fov,
                                      uint32_t index);

/** Reads a scene camera's clip distances. No GL context needed.
 *  @param zNear, zFar  out, > 0; not written when the result is 0
 *  @return 1, or 0 when the scene has no such camera. */
QEX_API int32_t QexModel_GetCameraNearFar(const QexModel* model, float* zNear, float* zFar, uint32_t index);

/** Draws a model many times in few draws: each mesh node of the pass once for each matrix, as if
 *  QexModel_RenderWithCamera were called with it as modelMatrix, but node by node. Small meshes are put into
 * buffers of their own as often as the vertex uniforms hold matrices (25 on the least GL), at the first call;
 * instances outside the view are left out. Nodes on bones, with modules that receive shadows or that are the
 * application's, and models with a texture hook are drawn one by one. Draws lean in either way of drawing.
 *  @param lights    may be null
 *  @param matrices  `count` matrices, affine: what their bottom rows hold beside (0, 0, 0, 1) does not count;
 * null draws nothing
 *  @param colours   `count` times red, green, blue, alpha, by which the diffuse texture's colour and the
 * opacity are multiplied, without what is drawn one by one; null for white
 *  @param count     of instances
 *  @param pass      as in QexModel_RenderWithCamera. Needs a current GL context. */
QEX_API void QexModel_RenderInstances(QexModel* model, const QexLightSet* lights, const QexCamera* camera,
                                      const QexMatrix* matrices, const float (*colours)[4], uint32_t count,
                                      uint32_t pass);

QEX_END

#endif
