/* The built-in shader modules, and the records that they draw: model, lights, shadow.
 *
 * A module draws one mesh node of a model with one pair of GLSL ES shaders. All share one record and one
 * contract: CreateProgram makes a module, its `render` draws nodes, Release ends it; one module serves any
 * number of nodes and models. Texture units: 0 diffuse, 1 normal map, 2 shadow map, 3 alpha texture. Alpha is
 * opacity (material's times g_fQexGlobalAlpha) times the alpha source, and 0 when that is not above the
 * module's threshold; a node without a material is opaque. A mesh without one of the attributes that a module
 * reads supplies (0, 0, 0, 1) for it. DrawMesh does not check its node: it has to be a mesh node of a model
 * whose geometry is loaded. When the GL does not take a module's shaders, its reason is logged and the GL
 * error ends the process, or, with an error handler, CreateProgram gives null and SetupProgram -1. Needs a
 * current GL context, except to set or get thresholds, shifts and fades.
 */
#ifndef QEX_SHADER_MODULES_H
#define QEX_SHADER_MODULES_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/pod.h"

QEX_BEGIN

/** Bit of QexModel.flags: the model loaded its textures from files and owns them. */
#define QEX_MODEL_OWNS_TEXTURES 0x01u
/** Bit of QexModel.flags: the model holds no share of the default shaders (its load failed, or it was
 *  unloaded), so that unloading it gives none back. */
#define QEX_MODEL_NO_SHADERS 0x02u

/** Called before a node's diffuse texture is bound. @return non-zero: the hook bound a texture itself. */
typedef int32_t (*QexBindTextureHook)(QexModel* model, uint32_t nodeIndex);
/** Called before a material's texture is loaded.
 *  @param path      directory and texture name; may be rewritten, which the alpha texture's does not follow
 *  @param capacity  characters that path holds, besides the NUL
 *  @return 0: the engine loads `path`. Non-zero: the hook dealt with it; the material's record (the last
 *  non-null entry of model->textures) is zeroed, and the hook may fill it with a texture of its own, which
 * the model then owns. QexModel_LoadTextureFromCache makes no record: there the material's entries stay null.
 */
typedef int32_t (*QexLoadTextureHook)(QexModel* model, char* path, int32_t capacity);
/** Called once for each mesh node near the end of loading; the default modules are set after it. @return not
 *  read. */
typedef int32_t (*QexMeshNodeLoadedHook)(QexModel* model, QexPODMesh* mesh, uint32_t meshNodeIndex);

struct QexModel {
    uint32_t flags; /* QEX_MODEL_... */
    QexPODModel scene;
    QexTexture** textures;              /* diffuse texture of each material, null where none */
    QexTexture** alphaTextures;         /* alpha texture of each material, null where none */
    QexBoundingBox* nodeBoxes;          /* box of each mesh node in the world: its corners, as of
                                           QexModel_UpdateModelBoundingBox, 0 before */
    QexBoundingBox* screenBoxes;        /* box of each mesh node on screen, see QexModel_CalcScreenBBox */
    uint32_t* vertexBuffers;            /* GL buffer of each mesh */
    uint32_t* indexBuffers;             /* GL buffer of each mesh, 0 for one without indices */
    float currentFrame;                 /* animation position in frames */
    QexBindTextureHook bindTextureHook; /* the three hooks: optional, set between */
    QexLoadTextureHook loadTextureHook; /* QexModel_Create and loading */
    QexMeshNodeLoadedHook meshNodeLoadedHook;
    uint32_t
        sharedGeneration; /* the engine's: which set of shared shaders its nodes were given, 0 for none */
    struct QexModelDrawing* drawing; /* the engine's: what lean drawing keeps of the model, null at first */
};

/** Light types of QexLight. */
#define QEX_LIGHT_POINT 0
#define QEX_LIGHT_DIRECTIONAL 1

/** One light of a light set. */
typedef struct QexLight {
    int32_t type;    /* QEX_LIGHT_POINT: vector is its position; otherwise the direction in which it shines */
    float vector[3]; /* world space */
    float colour[4]; /* red, green, blue, 1 */
} QexLight;

#define QEX_MAX_LIGHTS 4

/** The lights that a render call hands to the modules. */
struct QexLightSet {
    uint32_t count; /* 0 to QEX_MAX_LIGHTS */
    QexLight lights[QEX_MAX_LIGHTS];
};

/** A model that may cast shadows. */
typedef struct QexShadowCaster {
    QexModel* model;
    uint8_t allMeshNodes; /* non-zero: every mesh node; zero: those listed */
    int32_t* nodeIndices; /* mesh nodes */
    uint32_t nodeCount;   /* length of nodeIndices */
} QexShadowCaster;

/** What a shadow pass hands to the shadow-receiving modules. */
struct QexShadowInfo {
    QexVec3 lightDir;
    QexMatrix lightViewProj;     /* world to the light's clip space */
    QexMatrix shadowSpaceMatrix; /* world to shadow-map coordinates, 0..1 */
    QexShadowCaster* casters;
    uint32_t casterCount;
    uint32_t shadowTexture; /* GL texture */
    float shadowIntensity;  /* brightness factor of shadowed pixels */
    float biasValue;        /* depth bias */
};

/** Draws one node.
 *  @param module       the instance whose `render` is called
 *  @param model        a loaded model
 *  @param nodeIndex    a mesh node; one whose rendering flag is clear is skipped, as is any other number
 *  @param lights       the lights; only lit modules read them
 *  @param modelMatrix  applied in front of the node's world matrix, or null
 *  @param view         world to camera
 *  @param projection   camera to clip space
 *  @param shadow       shadow parameters; only shadow-receiving modules read them; null otherwise */
typedef void (*QexShaderRenderFn)(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                  const QexLightSet* lights, const QexMatrix* modelMatrix,
                                  const QexMatrix* view, const QexMatrix* projection,
                                  const QexShadowInfo* shadow);

/** One word of a module's record: a uniform's location or a parameter. */
typedef union QexShaderSlot {
    int32_t location;
    float value;
} QexShaderSlot;

#define QEX_SHADER_SLOTS 28

/** A module. The slots hold the uniform locations in the module's own order, then its parameters. */
struct QexShaderModule {
    QexShaderRenderFn render; /* draws a node */
    uint32_t vertexShader;    /* GL names */
    uint32_t fragmentShader;
    uint32_t program;
    QexShaderSlot slots[QEX_SHADER_SLOTS];
};

/* Every module that draws nodes has these functions; NAME is the module's, such as QexGouraudShader:
 * - NAME_CreateProgram() creates the module, threshold 0.5. It returns it, owned by the caller, or null when
 *   memory runs out.
 * - NAME_SetupProgram(module) compiles and links into a module's record, in place of what it holds;
 *   CreateProgram calls it. It returns 0.
 * - NAME_Release(module) deletes the module's GL objects, frees it and sets the caller's pointer to null. A
 *   null module is fine.
 * - NAME_SetAlphaThreshold(module, threshold) and NAME_GetAlphaThreshold(module) are about the alpha
 *   threshold, used from the next Render on; in modules that have one.
 * - NAME_DrawMesh(module, model, nodeIndex) draws a node's geometry; the module's program is current and its
 *   uniforms set. It returns 0. Skinned modules draw the node's bone batches and take a modelMatrix as well,
 *   applied in front of the bone matrices; it may be null.
 * - NAME_Render(...) draws a node, see QexShaderRenderFn.
 *
 * What a module adds or leaves out is said at its name, with its number, by which
 * QexShaders_CreateShaderProgram makes it. "Slots" are what the record's slots hold, in order: locations of
 * the uniforms, then the parameters. */

/** QexTextureShader (QEX_SHADER_TEXTURE): unlit, diffuse texture, alpha from the red of the alpha texture. It
 *  takes a node whose material has an alpha texture out of the opaque pass. Slots: mvpMatrix, opacity,
 *  alphaThreshold locations; the threshold. */
QEX_API QexShaderModule* QexTextureShader_CreateProgram(void);
QEX_API int32_t QexTextureShader_SetupProgram(QexShaderModule* module);
QEX_API void QexTextureShader_Release(QexShaderModule** module);
QEX_API void QexTextureShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexTextureShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexTextureShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
QEX_API void QexTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet* lights, const QexMatrix* modelMatrix,
                                     const QexMatrix* view, const QexMatrix* projection,
                                     const QexShadowInfo* shadow);

/** QexTextureNoAlphaShader (QEX_SHADER_TEXTURE_NOALPHA): unlit, alpha from the diffuse texture's own alpha.
 *  It never changes a node's pass; a node without a material keeps what is bound on unit 0. Slots: mvpMatrix,
 *  opacity, alphaThreshold locations; the threshold. */
QEX_API QexShaderModule* QexTextureNoAlphaShader_CreateProgram(void);
QEX_API int32_t QexTextureNoAlphaShader_SetupProgram(QexShaderModule* module);
QEX_API void QexTextureNoAlphaShader_Release(QexShaderModule** module);
QEX_API void QexTextureNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexTextureNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexTextureNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                 uint32_t nodeIndex);
QEX_API void QexTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                            const QexLightSet* lights, const QexMatrix* modelMatrix,
                                            const QexMatrix* view, const QexMatrix* projection,
                                            const QexShadowInfo* shadow);

/** QexSkinningTextureShader (QEX_SHADER_SKINNING_TEXTURE): as QexTextureShader for meshes that follow bones,
 *  one draw a bone batch, up to 16 bones a batch and 4 a vertex; other meshes are not drawn. It leaves the
 *  node's pass alone. Slots: boneCount, boneMatrixArray, viewProjMatrix, opacity, alphaThreshold locations;
 *  the threshold. */
QEX_API QexShaderModule* QexSkinningTextureShader_CreateProgram(void);
QEX_API int32_t QexSkinningTextureShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningTextureShader_Release(QexShaderModule** module);
QEX_API void QexSkinningTextureShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningTextureShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexSkinningTextureShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex, const QexMatrix* modelMatrix);
QEX_API void QexSkinningTextureShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/** QexSimpleShader: flat white, a mask; no textures, no threshold. Slots: mvpMatrix location. */
QEX_API QexShaderModule* QexSimpleShader_CreateProgram(void);
QEX_API int32_t QexSimpleShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSimpleShader_Release(QexShaderModule** module);
QEX_API int32_t QexSimpleShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
QEX_API void QexSimpleShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                    const QexLightSet* lights, const QexMatrix* modelMatrix,
                                    const QexMatrix* view, const QexMatrix* projection,
                                    const QexShadowInfo* shadow);

/** QexUVDisplacementShader (QEX_SHADER_UV_DISPLACEMENT): as QexTextureShader with the texture coordinates
 *  shifted by an amount that may change from frame to frame. The shift is in texture widths and heights,
 *  (0, 0) at first. Slots: displacement, mvpMatrix, opacity, alphaThreshold locations; shift u, shift v,
 *  threshold. */
QEX_API QexShaderModule* QexUVDisplacementShader_CreateProgram(void);
QEX_API int32_t QexUVDisplacementShader_SetupProgram(QexShaderModule* module);
QEX_API void QexUVDisplacementShader_Release(QexShaderModule** module);
QEX_API void QexUVDisplacementShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexUVDisplacementShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API void QexUVDisplacementShader_SetDisplacement(QexShaderModule* module, float u, float v);
QEX_API void QexUVDisplacementShader_GetDisplacement(const QexShaderModule* module, float* u, float* v);
QEX_API int32_t QexUVDisplacementShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                 uint32_t nodeIndex);
QEX_API void QexUVDisplacementShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                            const QexLightSet* lights, const QexMatrix* modelMatrix,
                                            const QexMatrix* view, const QexMatrix* projection,
                                            const QexShadowInfo* shadow);

/** QexUVDisplacementNoAlphaShader (no kind): as QexTextureNoAlphaShader with shifted texture coordinates.
 *  Slots as QexUVDisplacementShader. */
QEX_API QexShaderModule* QexUVDisplacementNoAlphaShader_CreateProgram(void);
QEX_API int32_t QexUVDisplacementNoAlphaShader_SetupProgram(QexShaderModule* module);
QEX_API void QexUVDisplacementNoAlphaShader_Release(QexShaderModule** module);
QEX_API void QexUVDisplacementNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexUVDisplacementNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API void QexUVDisplacementNoAlphaShader_SetDisplacement(QexShaderModule* module, float u, float v);
QEX_API void QexUVDisplacementNoAlphaShader_GetDisplacement(const QexShaderModule* module, float* u,
                                                            float* v);
QEX_API int32_t QexUVDisplacementNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                        uint32_t nodeIndex);
QEX_API void QexUVDisplacementNoAlphaShader_Render(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex, const QexLightSet* lights,
                                                   const QexMatrix* modelMatrix, const QexMatrix* view,
                                                   const QexMatrix* projection, const QexShadowInfo* shadow);

/** QexGouraudShader (QEX_SHADER_GOURAUD): lit per vertex: texture times (diffuse light times the material's
 *  diffuse colour, plus its ambient colour). Diffuse light is the sum over the first three lights of max(0, N
 *  . L) times the light's colour; it does not fall off with distance. Like all lit modules it takes a node
 *  whose material has an alpha texture out of the opaque pass; a null light set is an empty one. Slots:
 *  transMatrix, normalMatrix, mvpMatrix, lightCount, lightType, lightPosDir, lightColor, sceneAmbient,
 *  sceneDiffuse, opacity, alphaThreshold locations; the threshold. */
QEX_API QexShaderModule* QexGouraudShader_CreateProgram(void);
QEX_API int32_t QexGouraudShader_SetupProgram(QexShaderModule* module);
QEX_API void QexGouraudShader_Release(QexShaderModule** module);
QEX_API void QexGouraudShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexGouraudShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexGouraudShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
QEX_API void QexGouraudShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                     const QexLightSet* lights, const QexMatrix* modelMatrix,
                                     const QexMatrix* view, const QexMatrix* projection,
                                     const QexShadowInfo* shadow);

/** QexGouraudSpecularShader (QEX_SHADER_GOURAUD_SPECULAR): as QexGouraudShader plus highlights per fragment:
 *  the material's specular colour times the sum over three lights of pow(N . H, 256 * shininess) times the
 *  light's colour, H halfway between light and camera. The camera is taken to stand at the negated
 *  translation of the view matrix. Slots: as QexGouraudShader, with cameraPos before lightCount,
 *  sceneSpecular and shininess before opacity. */
QEX_API QexShaderModule* QexGouraudSpecularShader_CreateProgram(void);
QEX_API int32_t QexGouraudSpecularShader_SetupProgram(QexShaderModule* module);
QEX_API void QexGouraudSpecularShader_Release(QexShaderModule** module);
QEX_API void QexGouraudSpecularShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexGouraudSpecularShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexGouraudSpecularShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex);
QEX_API void QexGouraudSpecularShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/** QexGouraudNormalMapShader (QEX_SHADER_GOURAUD_NORMALMAP): as QexGouraudShader, lit per fragment with a
 *  tangent-space normal map on unit 1, whose texels hold the normal's x in green, y in red, z in blue, from
 *  -1 to 1 as 0 to 1. The module binds the blank map; a real one comes from the model's bindTextureHook.
 *  Meshes need tangents; where they have those and normals, but no binormals, QexModel_DownloadGeometry makes
 *  them. Slots as QexGouraudShader. */
QEX_API QexShaderModule* QexGouraudNormalMapShader_CreateProgram(void);
QEX_API int32_t QexGouraudNormalMapShader_SetupProgram(QexShaderModule* module);
QEX_API void QexGouraudNormalMapShader_Release(QexShaderModule** module);
QEX_API void QexGouraudNormalMapShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexGouraudNormalMapShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexGouraudNormalMapShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex);
QEX_API void QexGouraudNormalMapShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                              const QexLightSet* lights, const QexMatrix* modelMatrix,
                                              const QexMatrix* view, const QexMatrix* projection,
                                              const QexShadowInfo* shadow);

/** QexGouraudShadowShader (QEX_SHADER_GOURAUD_SHADOW): as QexGouraudShader, with the diffuse part of shadowed
 *  fragments times the shadow intensity. A fragment is in shadow when it faces the shadow light, lies within
 *  the shadow map, and the map holds a depth below its own less the bias. Null shadow parameters mean no
 *  shadow. Slots: as QexGouraudShader, then shadowLightDir, shadowSpaceMatrix, biasValue, shadowIntensity;
 *  the threshold. */
QEX_API QexShaderModule* QexGouraudShadowShader_CreateProgram(void);
QEX_API int32_t QexGouraudShadowShader_SetupProgram(QexShaderModule* module);
QEX_API void QexGouraudShadowShader_Release(QexShaderModule** module);
QEX_API void QexGouraudShadowShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexGouraudShadowShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexGouraudShadowShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
QEX_API void QexGouraudShadowShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                           const QexLightSet* lights, const QexMatrix* modelMatrix,
                                           const QexMatrix* view, const QexMatrix* projection,
                                           const QexShadowInfo* shadow);

/** QexGouraudShadowExtShader (QEX_SHADER_GOURAUD_SHADOW_EXT): as QexGouraudShadowShader, with shadows that
 *  lighten with the distance between what casts and what receives them: intensity + depth difference * fade,
 *  from 0 to 1. The fade, 1 at first, is in brightness per unit of shadow-map depth. Slots: as
 *  QexGouraudShadowShader to shadowIntensity (14), then the location of shadowFade (15), the threshold (16)
 *  and the fade (17). */
QEX_API QexShaderModule* QexGouraudShadowExtShader_CreateProgram(void);
QEX_API int32_t QexGouraudShadowExtShader_SetupProgram(QexShaderModule* module);
QEX_API void QexGouraudShadowExtShader_Release(QexShaderModule** module);
QEX_API void QexGouraudShadowExtShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexGouraudShadowExtShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API void QexGouraudShadowExtShader_SetShadowFade(QexShaderModule* module, float fade);
QEX_API float QexGouraudShadowExtShader_GetShadowFade(const QexShaderModule* module);
QEX_API int32_t QexGouraudShadowExtShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                   uint32_t nodeIndex);
QEX_API void QexGouraudShadowExtShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                              const QexLightSet* lights, const QexMatrix* modelMatrix,
                                              const QexMatrix* view, const QexMatrix* projection,
                                              const QexShadowInfo* shadow);

/** QexSkinningTextureNoAlphaShader (QEX_SHADER_SKINNING_TEXTURE_NOALPHA): as QexTextureNoAlphaShader for
 *  meshes that follow bones; the model's bindTextureHook is not asked. Slots as QexSkinningTextureShader. */
QEX_API QexShaderModule* QexSkinningTextureNoAlphaShader_CreateProgram(void);
QEX_API int32_t QexSkinningTextureNoAlphaShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningTextureNoAlphaShader_Release(QexShaderModule** module);
QEX_API void QexSkinningTextureNoAlphaShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningTextureNoAlphaShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexSkinningTextureNoAlphaShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                         uint32_t nodeIndex, const QexMatrix* modelMatrix);
QEX_API void QexSkinningTextureNoAlphaShader_Render(QexShaderModule* module, QexModel* model,
                                                    uint32_t nodeIndex, const QexLightSet* lights,
                                                    const QexMatrix* modelMatrix, const QexMatrix* view,
                                                    const QexMatrix* projection, const QexShadowInfo* shadow);

/** QexSkinningGouraudShader (QEX_SHADER_SKINNING_GOURAUD): as QexGouraudShader for meshes that follow bones.
 *  Slots: viewProjMatrix, boneCount, boneMatrixArray, boneVecMatrixArray, lightCount, lightType, lightPosDir,
 *  lightColor, sceneAmbient, sceneDiffuse, opacity, alphaThreshold locations; the threshold. */
QEX_API QexShaderModule* QexSkinningGouraudShader_CreateProgram(void);
QEX_API int32_t QexSkinningGouraudShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningGouraudShader_Release(QexShaderModule** module);
QEX_API void QexSkinningGouraudShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningGouraudShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexSkinningGouraudShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                  uint32_t nodeIndex, const QexMatrix* modelMatrix);
QEX_API void QexSkinningGouraudShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                             const QexLightSet* lights, const QexMatrix* modelMatrix,
                                             const QexMatrix* view, const QexMatrix* projection,
                                             const QexShadowInfo* shadow);

/** QexSkinningGouraudSpecularShader (QEX_SHADER_SKINNING_GOURAUD_SPECULAR): highlights on meshes that follow
 *  bones: all four lights count, and the highlight is multiplied by the texture. Slots: as
 *  QexSkinningGouraudShader, with cameraPos before lightCount, sceneSpecular and shininess before opacity. */
QEX_API QexShaderModule* QexSkinningGouraudSpecularShader_CreateProgram(void);
QEX_API int32_t QexSkinningGouraudSpecularShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningGouraudSpecularShader_Release(QexShaderModule** module);
QEX_API void QexSkinningGouraudSpecularShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningGouraudSpecularShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexSkinningGouraudSpecularShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                          uint32_t nodeIndex, const QexMatrix* modelMatrix);
QEX_API void QexSkinningGouraudSpecularShader_Render(QexShaderModule* module, QexModel* model,
                                                     uint32_t nodeIndex, const QexLightSet* lights,
                                                     const QexMatrix* modelMatrix, const QexMatrix* view,
                                                     const QexMatrix* projection,
                                                     const QexShadowInfo* shadow);

/** QexSkinningGouraudNormalMapShader (QEX_SHADER_SKINNING_GOURAUD_NORMALMAP): as QexGouraudNormalMapShader
 *  for meshes that follow bones; all four lights count. Slots as QexSkinningGouraudShader. */
QEX_API QexShaderModule* QexSkinningGouraudNormalMapShader_CreateProgram(void);
QEX_API int32_t QexSkinningGouraudNormalMapShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningGouraudNormalMapShader_Release(QexShaderModule** module);
QEX_API void QexSkinningGouraudNormalMapShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningGouraudNormalMapShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API int32_t QexSkinningGouraudNormalMapShader_DrawMesh(QexShaderModule* module, QexModel* model,
                                                           uint32_t nodeIndex, const QexMatrix* modelMatrix);
QEX_API void QexSkinningGouraudNormalMapShader_Render(QexShaderModule* module, QexModel* model,
                                                      uint32_t nodeIndex, const QexLightSet* lights,
                                                      const QexMatrix* modelMatrix, const QexMatrix* view,
                                                      const QexMatrix* projection,
                                                      const QexShadowInfo* shadow);

/** QexDepthShader (no kind): depth as a grey level: 0 nearer than near, 1 beyond far, z / (far - near)
 *  between, z being the clip-space z. No threshold; textures are bound and a node's pass changes as by
 *  QexTextureShader. near and far are not set at first; SetParameters sets them, far above near, for the
 *  module's program, which must be current; lean drawing takes them from there alone. Slots: near, far,
 * mvpMatrix locations; unused; near and far as values. */
QEX_API QexShaderModule* QexDepthShader_CreateProgram(void);
QEX_API int32_t QexDepthShader_SetupProgram(QexShaderModule* module);
QEX_API void QexDepthShader_Release(QexShaderModule** module);
QEX_API void QexDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar);
QEX_API int32_t QexDepthShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex);
QEX_API void QexDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                   const QexMatrix* view, const QexMatrix* projection,
                                   const QexShadowInfo* shadow);

/** QexSkinningDepthShader (no kind): as QexDepthShader for meshes that follow bones, alpha 0 where it is for
 *  QexSkinningTextureShader, else 1; it leaves the node's pass alone. near and far as in QexDepthShader.
 *  Slots: near, far, boneCount, boneMatrixArray, viewProjMatrix, opacity, alphaThreshold locations; the
 *  threshold; near and far as values. */
QEX_API QexShaderModule* QexSkinningDepthShader_CreateProgram(void);
QEX_API int32_t QexSkinningDepthShader_SetupProgram(QexShaderModule* module);
QEX_API void QexSkinningDepthShader_Release(QexShaderModule** module);
QEX_API void QexSkinningDepthShader_SetAlphaThreshold(QexShaderModule* module, float threshold);
QEX_API float QexSkinningDepthShader_GetAlphaThreshold(const QexShaderModule* module);
QEX_API void QexSkinningDepthShader_SetParameters(QexShaderModule* module, float zNear, float zFar);
QEX_API int32_t QexSkinningDepthShader_DrawMesh(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                                const QexMatrix* modelMatrix);
QEX_API void QexSkinningDepthShader_Render(QexShaderModule* module, QexModel* model, uint32_t nodeIndex,
                                           const QexLightSet* lights, const QexMatrix* modelMatrix,
                                           const QexMatrix* view, const QexMatrix* projection,
                                           const QexShadowInfo* shadow);

/* QexBlurShader (no kind, no render function): one direction of a Gaussian blur, for quads over the screen;
 * it reads the attributes a_v4Position and a_v2TexCoord and the texture on unit 0. A pixel becomes the mean
 * of those beside it, the one i steps away weighted with exp(-i * i / (2 * sigma * sigma)), its alpha 1.
 * `samples` is 9, 7, 5 or anything else, no number included: 4, 3, 2 or 1 pixels on each side. The sign of
 * sigma does not count; 0, or what is no number, leaves the picture as it is.
 * Slots: a_v4Position, u_m4Projection, a_v2TexCoord, u_s2dTexture, sigma, blurSize, horizontal_or_vertical,
 * samples locations; the projection, 16 floats by columns. */

/** Creates the blur module with sigma 5, 9 samples, steps of a pixel of the screen, for the upper left
 *  quarter of the screen.
 *  @param context  its size is the screen's, 1 and more
 *  @return the module, owned by the caller; null when memory runs out. */
QEX_API QexShaderModule* QexBlurShader_CreateProgram(const QexRuntimeContext* context);
/** Compiles and links into a module's record, whose projection is set; CreateProgram calls it.
 *  @return 0, or -1 when it cannot be built. */
QEX_API int32_t QexBlurShader_SetupProgram(const QexRuntimeContext* context, QexShaderModule* module,
                                           float sigma, float samples);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexBlurShader_Release(QexShaderModule** module);
/** Sets the uniforms and the record's projection for the module's program, which must be current.
 *  @param ignored    not read
 *  @param direction  0: blurs along s, else along t
 *  @param sigma      standard deviation in steps
 *  @param samples    9, 7, 5 or another number, see above
 *  @param blurSize   one step in texture coordinates: 1 / width of the texture is a pixel */
QEX_API void QexBlurShader_SetParameters(QexShaderModule* module, const void* ignored, float direction,
                                         float sigma, float samples, float blurSize);

/* QexDOFShader (no kind, no render function): the mix of a sharp and a blurred picture (units 0 and 2) by
 * clamp(range * |focus - depth|, 0, 1), depth being the red of a third (unit 1); for quads over the screen,
 * attributes as QexBlurShader. A range of 0 or below gives the sharp picture.
 * Slots: a_v4Position, u_m4Projection, a_v2TexCoord, u_s2dNormal, u_s2dDepth, u_s2dBlur, focus, range
 * locations. */

/** Creates the depth-of-field module; focus and range are not set yet. Its projection shows the whole screen.
 *  @param context  its size is the screen's, 1 and more
 *  @return the module, owned by the caller; null when memory runs out. */
QEX_API QexShaderModule* QexDOFShader_CreateProgram(const QexRuntimeContext* context);
/** Compiles and links into a module's record, with the projection of the module created last; CreateProgram
 *  calls it. @param context  not read  @return 0, or -1 when it cannot be built. */
QEX_API int32_t QexDOFShader_SetupProgram(const QexRuntimeContext* context, QexShaderModule* module);
/** Deletes the module's GL objects, frees it and sets the caller's pointer to null. A null module is fine. */
QEX_API void QexDOFShader_Release(QexShaderModule** module);
/** Sets focus, a depth from 0 to 1, and range, blur per unit of depth, for the module's program, which must
 * be current. */
QEX_API void QexDOFShader_SetParameters(QexShaderModule* module, float focus, float range);

QEX_END

#endif
