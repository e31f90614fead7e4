// Billboards in lean drawing: those of one texture that follow each other go to GL in one buffer and one
// draw.
#pragma once

#include "Qex/overlay.h"

// Puts a billboard's corners behind those that wait. Another texture, or a full buffer, draws those first.
void QexBillboardBatch_Add(const QexBillboard& billboard, const QexMatrix& mvp);

// Draws what waits.
void QexBillboardBatch_Draw();

// Deletes program and buffers, when the last billboard goes.
void QexBillboardBatch_Release();
