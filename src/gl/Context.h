// A lost GL context takes all its objects along. Each part of the engine that holds some says once how it
// forgets and how it makes them again; what follows from that is done here.
//
// Textures, buffers, framebuffers and renderbuffers are made again under their old names, which a GL takes
// from any bind: records, of which applications have copies, stay right. Programs, shaders and vertex array
// objects get new names.
#pragma once

#include "base/Step.h"
#include "gl/GL.h"

// In the order of restoring.
// What is drawn with programs that are not there again yet is not drawn; so they come behind what they draw.
enum QexContextRank { kRankTextures, kRankTargets, kRankGeometry, kRankPrograms, kRankOthers };

// Registered when the part makes its first object, so that a program carries no part that it does not use.
struct QexContextPart {
    QexContextRank rank;
    void (*forget)();   // no GL call
    void (*reserve)();  // makes the old names its own again, before anything is made; may be null
    bool (*restore)();  // false when something could not be made; may be null
    QexContextPart* next;
    bool registered;
    // In place of restore where there is much: makes a bit, at most so many bytes where it can be parted.
    // kFailed: a thing could not be made, and there may be others.
    QexStep (*step)(uint32_t piece) = nullptr;
};
void QexContext_Register(QexContextPart* part);

// Whether the context is being restored, in parts, and models are not drawn yet.
bool QexContext_IsRestoring();

// Takes an error for a lost context. True when it is one, or one was lost already.
bool QexContext_IsLoss(uint32_t error);

// Makes a name of the lost context known to the present one.
void QexContext_ReserveTexture(GLenum target, GLuint name);
void QexContext_ReserveBuffer(GLuint name);
void QexContext_ReserveFramebuffer(GLuint name);
void QexContext_ReserveRenderbuffer(GLuint name);
