// Billboards for the engine's own modules: several of them in lean drawing.
#pragma once

#include "overlay/BillboardBatch.h"
#include "Qex/overlay.h"

// Draws the billboard with those that follow, when QexBillboardBatch_Draw is called; in lean drawing only.
void QexBillboard_Queue(const QexBillboard& billboard, const QexCamera& camera);
