// Streams for the engine's own modules.
#pragma once

#include "Qex/resources.h"

// As QexSourceStream_Create, but what is read comes from the disk straight to its destination. The file has
// no data pointer.
int32_t QexSourceStream_CreateUnread(QexSourceStream* stream, const char* path);
