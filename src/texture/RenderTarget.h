// Sizes of what is drawn into: the GL takes textures and renderbuffers up to a limit, and ends the process,
// by way of the error check, beyond it.
#pragma once

#include <cstdint>

#include "Qex/textures.h"

// The most pixels a side that the current GL can draw into; no limit where it names none.
int32_t QexRenderTarget_MaxSize();

// Whether the GL can draw into that many pixels; an error line in the function's name when it cannot.
bool QexRenderTarget_CheckSize(const char* function, int32_t width, int32_t height);

// Tells the application's error handler, where there is one, of a bound framebuffer that is incomplete.
void QexRenderTarget_CheckComplete();

// The texture of a target.
void QexRenderTarget_CreateColourTexture(QexTexture* texture, int32_t width, int32_t height);

// A framebuffer with its attachments, which is made again when the context is lost.
struct QexTargetNames {
    uint32_t framebuffer, texture, depth;
    int32_t width, height;
};
// False when memory runs out.
bool QexRenderTarget_Note(const QexTargetNames& names);
// Forgets the target and its texture.
void QexRenderTarget_DropNote(uint32_t framebuffer);
