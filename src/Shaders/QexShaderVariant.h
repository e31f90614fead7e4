// Programs of the modules for lean drawing: each module's own, and variants of it for nodes without textures,
// which a fragment need not look up then. They are made when first needed, belong to all instances of a
// module and go with the last of them. A variant knows what it was given last, so that only what is new is
// sent.
#pragma once

#include "gl/GL.h"
#include "Qex/math.h"
#include "Qex/shader_modules.h"
#include "Shaders/QexShaderModule.h"

enum QexShaderVariantFlag : uint32_t {
    kVariantNoTexture = 1,      // the diffuse texture is white
    kVariantConstantAlpha = 2,  // alpha is the same for all of a node
    kVariantInstances = 4,      // several of a mesh in one draw, each with a matrix of its own
    kVariantColours = 8,        // and with a colour; with kVariantInstances only
    kShaderVariants = 16
};

// The attribute that says which instance a vertex belongs to, behind the elements of meshes.
constexpr uint32_t kInstanceAttribute = QEX_ELEMENT_COUNT;

// How many instances a draw can have: what the vertex uniforms hold.
uint32_t QexShaderVariant_MaxInstances();

// What the nodes of a call share. Stamps change with what they stand for.
struct QexShaderFrame {
    QexMatrix view, projection, viewProjection;
    QexLightSet lights;
    QexVec3 shadowLightDirection;
    float shadowIntensity, shadowBias;
    uint32_t viewStamp, lightStamp, shadowStamp;
};

// Makes these the frame's. Lights and shadow may be null.
const QexShaderFrame* QexShaderFrame_Set(const QexMatrix* view, const QexMatrix* projection,
                                         const QexLightSet* lights, const QexShadowInfo* shadow);

// What the nodes of a material share, as floats that are compared.
struct QexShaderSurface {
    float ambient[3], diffuse[3], specular[3];
    float shininess, opacity, threshold, shadowFade;
    float displacement[2];
    float depthRange[2];  // near and far
};

struct QexShaderVariant {
    const QexShaderModuleType* type;
    uint32_t flags;  // kVariant...
    GLuint program, vertexShader, fragmentShader;
    int32_t locations[kShaderUniforms];  // -1: none
    uint32_t elements;                   // that it reads, bits by number
    uint32_t viewStamp, lightStamp, shadowStamp;
    bool hasSurface;
    QexShaderSurface surface;
};

// The variant of a module, built if need be; null when the GL does not build it.
QexShaderVariant* QexShaderVariant_Get(const QexShaderModuleType* type, uint32_t flags);

// The description that an instance was made from, where that has variants; null for an application's own
// module. The instance may have any Render, so that is what tells.
const QexShaderModuleType* QexShaderVariant_TypeOf(const QexShaderModule* module);

// Changes whenever an instance of a module comes or goes, and variants with it: who keeps one asks whether it
// is still there.
uint32_t QexShaderVariant_Generation();

// Instances of modules count, so that the variants go with the last.
void QexShaderVariant_Retain(const QexShaderModuleType* type);
void QexShaderVariant_Release(const QexShaderModuleType* type);

// What a material comes to with an instance's parameters.
void QexShaderVariant_Surface(const QexShaderVariant* variant, const QexShaderModule* module,
                              const QexPODMaterial* material, QexShaderSurface* out);

// Makes the variant current and gives it what is new of frame and surface.
void QexShaderVariant_Use(QexShaderVariant* variant, const QexShaderFrame* frame,
                          const QexShaderSurface& surface);
