/* Shadows and planar reflection of models. */
#ifndef QEX_SHADOWS_H
#define QEX_SHADOWS_H

#include "Qex/base.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/shader_modules.h"

QEX_BEGIN

/* ======================================================================================================
 * Models: shadows
 *
 * Shadow maps for one directional light. A frame goes: QexModel_UpdateModelBoundingBox for each casting
 * model, QexModel_InitShadowInfo, QexModel_RenderShadow, then the nodes whose module receives shadows
 * (QexGouraudShadowShader, QexGouraudShadowExtShader) with the calls below, QexModel_ReleaseShadowInfo. The
 * map is a grey picture in the shadow target that all models share: 0 is nearest to the light, 1 is empty.
 * Needs a current GL context, except where a function says not.
 * ====================================================================================================== */

/** Lists the casters that may throw a shadow into the camera's view, and builds the light's matrices around
 * them. A node counts when its box in nodeBoxes overlaps the view volume as seen from the light; how far it
 * is from the light does not matter. With no caster in sight the matrices show the whole view and the map
 * stays empty. Indices that are no mesh nodes are left out. No GL context needed.
 *  @param lightDir         where the light shines, of any length but 0
 *  @param casters          casterCount requests; copied
 *  @param shadowIntensity  brightness factor of shadowed pixels, 0 to 1
 *  @param biasValue        taken off a receiver's depth (0..1 through the map), against surfaces that shade
 *                          themselves; the map has 256 steps
 *  @return the shadow parameters for one frame, to be released with QexModel_ReleaseShadowInfo; null, with a
 * line, when memory runs out. The models must stay loaded until then. */
QEX_API QexShadowInfo* QexModel_InitShadowInfo(const QexCamera* camera, const QexVec3* lightDir,
                                               const QexShadowCaster* casters, uint32_t casterCount,
                                               float shadowIntensity, float biasValue);

/** Frees the shadow parameters. Null is fine. No GL context needed. */
QEX_API void QexModel_ReleaseShadowInfo(QexShadowInfo* info);

/** Draws the casters into the shadow map. Leaves the framebuffer as it was; the viewport covers the context's
 *  surface, the scissor test is on (an application that does not use it switches it off again), depth is
 * written and tested with less or equal, back faces are culled, the clear colour is white.
 *  @param context      its width and height are read
 *  @param modelMatrix  in front of the world matrices of casters that follow no bones, or null
 *  @param info         null does nothing */
QEX_API void QexModel_RenderShadow(const QexRuntimeContext* context, const QexMatrix* modelMatrix,
                                   const QexShadowInfo* info);

/** Draws the listed casters that are enabled with the depth programs, into whatever is bound. A model's
 * bindTextureHook is called for each node and may bind an alpha texture to unit 3: where its red is at most
 * 0.01 the caster has a hole. Skinned casters follow three bones a vertex and take no model matrix. Leaves no
 * buffer bound. */
QEX_API void QexModel_RenderFromShadowCamera(const QexMatrix* modelMatrix, const QexShadowInfo* info);

/** Draws a mesh node's positions (attribute 0) and texture coordinates (1) with the current program. */
QEX_API void QexModel_DrawShadowMesh(QexModel* model, uint32_t nodeIndex);

/** The same for a node that follows bones, batch by batch, with weights (attribute 2), bone indices (3) and
 * the matrices of the skinned depth program. */
QEX_API void QexModel_DrawSkinShadowMesh(QexModel* model, uint32_t nodeIndex);

/** Deletes the shadow target; it comes back with the next shared set. Until then there are no shadows. */
QEX_API void QexModel_ReleaseShadowTexture(void);

/** As QexModel_RenderWithViewProjection, with shadow parameters for the modules that receive shadows. */
QEX_API void QexModel_RenderFromViewPerspectiveWithShadow(QexModel* model, const QexLightSet* lights,
                                                          const QexMatrix* modelMatrix, const QexMatrix* view,
                                                          const QexMatrix* projection,
                                                          const QexShadowInfo* info, uint32_t pass);

/** As QexModel_RenderWithCamera, with shadow parameters. */
QEX_API void QexModel_RenderFromCameraWithShadow(QexModel* model, const QexLightSet* lights,
                                                 const QexCamera* camera, const QexMatrix* modelMatrix,
                                                 const QexShadowInfo* info, uint32_t pass);

/** As QexModel_RenderNodeWithViewProjection, with shadow parameters. */
QEX_API void QexModel_RenderNodeFromViewPerspectiveWithShadow(
    QexModel* model, uint32_t nodeIndex, const QexLightSet* lights, const QexMatrix* modelMatrix,
    const QexMatrix* view, const QexMatrix* projection, const QexShadowInfo* info);

/* ======================================================================================================
 * Models: planar reflection
 *
 * Mirror images in a plane: a mesh node (a floor, water, a mirror) or an endless plane. The casters are drawn
 * reflected, within the plane node's pixels when the stencil is used, and the plane node over them. Render
 * the reflection before the scene of each frame. Needs a current GL context, except where a function says
 * not.
 * ====================================================================================================== */

/** A reflecting plane and what it reflects. */
typedef struct QexReflection {
    uint8_t infinite;   /* 1: an endless plane without node */
    uint8_t useStencil; /* 1: the image shows only within the plane node's pixels */
    QexModel* model;    /* holds the plane node */
    uint32_t planeNode; /* mesh node index */
    QexShadowCaster* casters;
    uint32_t casterCount;
    QexVec3 planeNormal;
    QexVec3 planePoint;
    QexMatrix reflectionMatrix; /* mirrors the world in the plane */
} QexReflection;

/** Makes a reflection in a mesh node, whose mesh must be flat: the plane goes through its first vertex, along
 *  its first normal, as the node stands now. A mesh without an interleaved block, as QexModel_CreateFromMesh
 *  makes them, gives the plane y = 0 of the world, with lines in the log. No GL context needed.
 *  @param casters     casterCount models and nodes to reflect; copied. The plane node itself is not drawn for
 * an entry of its own model that asks for all nodes
 *  @param useStencil  1 needs a stencil buffer, cleared to 0 at the start of each frame
 *  @return the record, to be released before the models are unloaded; null, with a line, when memory runs
 * out. */
QEX_API QexReflection* QexReflection_InitReflectionInfo(QexModel* model, uint32_t planeNode,
                                                        const QexShadowCaster* casters, uint32_t casterCount,
                                                        uint8_t useStencil);

/** Makes a reflection in an endless plane. No GL context needed.
 *  @param model        kept in the record; may be null
 *  @param planeNormal  of any length but 0
 *  @return as QexReflection_InitReflectionInfo. */
QEX_API QexReflection* QexReflection_InitReflectionInfoInfinite(QexModel* model, const QexVec3* planeNormal,
                                                                const QexVec3* planePoint,
                                                                const QexShadowCaster* casters,
                                                                uint32_t casterCount);

/** Frees the record. Null is fine. No GL context needed. */
QEX_API void QexReflection_Release(QexReflection* reflection);

/** Draws the reflected casters and the plane node over them. Clears the depth buffer; back faces are culled
 * afterwards, the stencil test is off when it was used, and the plane node's rendering is off, so that the
 * scene does not draw it again. */
QEX_API void QexReflection_RenderReflection(QexReflection* reflection, const QexLightSet* lights,
                                            const QexCamera* camera);

/** Sets the stencil to 1 where a plane node is, and leaves the stencil test on: what is drawn next shows only
 *  there. The depth test and the whole colour mask are on afterwards.
 *  @param modelMatrix  in front of the node's world matrix, or null */
QEX_API void QexModel_RenderReflectionPlaneStencil(QexModel* model, uint32_t planeNode,
                                                   const QexLightSet* lights, const QexMatrix* modelMatrix,
                                                   const QexMatrix* view, const QexMatrix* projection);

QEX_END

#endif
