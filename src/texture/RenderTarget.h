// Sizes of what is drawn into: the GL takes textures and renderbuffers up to a limit, and ends the process,
// by way of the error check, beyond it.
#pragma once

#include <cstdint>

// The most pixels a side that the current GL can draw into; no limit where it names none.
int32_t QexRenderTarget_MaxSize();

// Whether the GL can draw into that many pixels; an error line in the function's name when it cannot.
bool QexRenderTarget_CheckSize(const char* function, int32_t width, int32_t height);

// Tells the application's error handler, where there is one, of a bound framebuffer that is incomplete.
void QexRenderTarget_CheckComplete();
