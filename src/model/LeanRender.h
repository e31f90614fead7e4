// Lean drawing of models: nodes in an order that changes little, with the variants of their modules'
// programs.
#pragma once

#include "Qex/math.h"
#include "Qex/shader_modules.h"

// What a render call hands to the modules, and which nodes it draws.
struct QexLeanCall {
    const QexLightSet* lights;  // may be null, as modelMatrix and shadow may
    const QexMatrix* modelMatrix;
    const QexMatrix* view;
    const QexMatrix* projection;
    const QexShadowInfo* shadow;
    uint32_t pass = 0;
    bool (*wants)(QexModel* model, uint32_t node, uint32_t mode) = nullptr;  // null: all nodes of the pass
    uint32_t mode = 0;
};

// Draws the nodes of the pass that the call wants.
void QexModel_DrawLean(QexModel* model, const QexLeanCall& call);

// Draws one node of any pass.
void QexModel_DrawNodeLean(QexModel* model, uint32_t node, const QexLeanCall& call);

// Frees what lean drawing keeps of a model, its vertex array objects with it.
void QexModel_ReleaseLean(QexModel* model);
