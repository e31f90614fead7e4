// The textures of a model's materials, loaded step by step.
#pragma once

#include "base/Step.h"
#include "Qex/resources.h"
#include "Qex/shader_modules.h"
#include "texture/LoadPvr.h"

constexpr uint32_t kQexPathSize = 256;

struct QexMaterialLoad {
    uint32_t piece;         // bytes that a step reads or decodes at most
    const char* directory;  // in front of names; null: from the cache
    QexNameCache* cache;    // or null for none
    uint32_t material;
    uint32_t phase;  // of that material
    char paths[2][kQexPathSize];
    QexTextureFile file;  // that is being loaded
    bool opened;
};

// Gives a model empty lists in place of the textures that it had, owned where there is a directory. False
// when memory runs out.
bool QexMaterialLoad_Begin(QexMaterialLoad* load, QexModel* model, const char* directory, QexNameCache* cache,
                           uint32_t piece);

// Calls the application's hook for a material, takes its textures from the cache, or loads a part of one.
QexStep QexMaterialLoad_Step(QexMaterialLoad* load, QexModel* model);

// Goes on after somebody else has called the GL.
void QexMaterialLoad_Resume(const QexMaterialLoad* load);

// Ends a load, in the middle as well. The textures that are whole stay the model's.
void QexMaterialLoad_End(QexMaterialLoad* load, QexModel* model);
