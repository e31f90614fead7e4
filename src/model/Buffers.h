// The GL buffers of a model's meshes, filled step by step.
#pragma once

#include "base/Step.h"
#include "model/Geometry.h"
#include "Qex/shader_modules.h"

struct QexBufferLoad {
    uint32_t piece;  // bytes that a step uploads at most
    uint32_t mesh;
    uint32_t phase;  // of that mesh
    uint32_t sent;   // bytes of the buffer that is being filled
    bool bound;      // that buffer
    QexMeshUpload upload;
};

// Gives a model buffers for its meshes in place of those that it had. False when memory runs out.
bool QexBufferLoad_Begin(QexBufferLoad* load, QexModel* model, uint32_t piece);

// Lays out a part of a mesh or uploads a piece of it.
QexStep QexBufferLoad_Step(QexBufferLoad* load, QexModel* model);

// Between steps somebody else calls the GL; and after the last one.
void QexBufferLoad_Pause(QexBufferLoad* load);

// Ends a load, in the middle as well. The buffers stay the model's.
void QexBufferLoad_End(QexBufferLoad* load);
