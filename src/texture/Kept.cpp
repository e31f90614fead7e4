// Textures that outlive their context.
#include "texture/Kept.h"

#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/RenderTarget.h"
#include "texture/Texture.h"

#define QEX_MODULE "src/QexTexture"

namespace {

struct Kept {
    Kept* next;
    uint32_t name, target;
    QexKeptSource source;  // its bytes are ours, or null
    char* path;            // of a file, or given to the owner's hook; or null
    QexKeptLoader loader;  // the owner's, or null
    void* owner;
    uint8_t filter, wrap;  // codes; 0: as the source says
    uint32_t context;      // that it was made in
};

constexpr uint32_t kRows = 64;  // by name
Kept* s_Kept[kRows];
uint32_t s_Renewed;  // the texture that is being made again
bool s_Handed;       // its name, to who makes it
bool s_Keeping;
const char* s_Path;
QexKeptHook s_Hook;
QexTextureSource s_Source;
void* s_SourceUser;

Kept** Find(uint32_t name) {
    Kept** at = &s_Kept[name % kRows];
    while (*at && (*at)->name != name) at = &(*at)->next;
    return at;
}

template <class T>
bool Copy(T** out, const void* from, uint64_t size) {
    T* copy = QexMemory_AllocArray<T>(size);
    if (copy) memcpy(copy, from, static_cast<size_t>(size));
    *out = copy;
    return copy;
}

void Reserve() {
    for (const Kept* row : s_Kept)
        for (; row; row = row->next) QexContext_ReserveTexture(row->target, row->name);
}

// Loads what the bytes, or else the file, hold into the record.
int32_t Load(QexTexture* texture, const Kept& kept) {
    const QexKeptSource& s = kept.source;
    const uint32_t size = static_cast<uint32_t>(s.size);
    switch (s.kind) {
        case kKeptTarget: QexRenderTarget_CreateColourTexture(texture, s.width, s.height); return 0;
        case kKeptNormals: return QexTexture_GenerateNormalisationCubeMap(texture, s.width);
        case kKeptTga:
            return s.bytes ? QexTexture_CreateTGAFromMemSized(texture, 0, 0, QEX_FILTER_NEAREST,
                                                              QEX_WRAP_CLAMP, s.bytes, size)
                           : QexTexture_CreateTGAFromFile(texture, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP,
                                                          kept.path);
        case kKeptPixels:
            return QexTexture_CreateFromPixels(texture, s.width, s.height, s.format, 0, 0, QEX_FILTER_NEAREST,
                                               QEX_WRAP_CLAMP, const_cast<void*>(s.bytes));
        default:
            return s.bytes ? QexTexture_LoadPVRFromMemSized(texture, s.bytes, size, nullptr, s.decode,
                                                            s.firstLevel, nullptr)
                           : QexTexture_LoadPVRFromFile(texture, kept.path, nullptr, s.decode, s.firstLevel);
    }
}

bool RestoreOne(const Kept& kept) {
    QexTexture texture = {};
    const bool knows = kept.source.bytes || (kept.path && !kept.loader) || kept.source.kind >= kKeptTarget;
    s_Renewed = kept.name;
    s_Handed = false;
    int32_t result = -1;
    if (kept.loader)
        result = kept.loader(kept.owner, kept.name, kept.path, &texture);
    else if (knows)
        result = Load(&texture, kept);
    if (!knows && !texture.glName && s_Source) {
        s_Handed = false;
        result = s_Source(s_SourceUser, kept.name, &texture);
    }
    if (result != 0 || !texture.glName)
        QexError(QEX_TAG, "<QexEngine_ContextRestored> texture %u %s", kept.name,
                 knows || kept.loader || s_Source ? "could not be loaded again"
                                                  : "came from memory that was not kept");
    s_Renewed = 0;
    if (result != 0 || !texture.glName) {
        QexContext_ReserveTexture(kept.target, kept.name);  // or another texture would get it
        return false;
    }
    if (kept.filter) QexTexture_SetFilter(&texture, kept.filter);
    if (kept.wrap) QexTexture_SetWrapping(&texture, kept.wrap);
    if (texture.flags & QEX_TEXFLAG_OWNS_PIXELS) QexMemory_Free(texture.pixels);
    return true;
}

bool Restore() {
    bool whole = true;
    for (const Kept* row : s_Kept)
        for (; row && !g_QexContextLost; row = row->next)
            if (row->context != g_QexContexts) whole &= RestoreOne(*row);
    return whole;
}

void Forget() {}

QexContextPart s_Part = {kRankTextures, Forget, Reserve, Restore, nullptr, false};

}  // namespace

QexKeptPath::QexKeptPath(const char* path) : before_(s_Path) {
    s_Path = path;
}
QexKeptPath::~QexKeptPath() {
    s_Path = before_;
}

QexKeptOwner::QexKeptOwner(const QexKeptHook& hook) : before_(s_Hook) {
    s_Hook = hook;
}
QexKeptOwner::~QexKeptOwner() {
    s_Hook = before_;
}

void QexKeptOwner_Forget(const void* owner) {
    for (Kept* row : s_Kept)
        for (; row; row = row->next) {
            if (row->owner != owner) continue;
            row->loader = nullptr;
            row->owner = nullptr;
            QexMemory_FreeArray(row->path);
        }
}

uint32_t QexKeptTexture_NewName() {
    GLuint name = s_Renewed;
    // Once: what a source makes besides has a name of its own.
    if (name && !s_Handed)
        s_Handed = true;
    else
        QEX_GL(glGenTextures(1, &name));
    return name;
}

bool QexKeptTexture_Note(uint32_t name, uint32_t target, const QexKeptSource& source) {
    if (!name || name == s_Renewed) return true;
    QexContext_Register(&s_Part);
    QexKeptTexture_Drop(name);
    Kept* kept = QexMemory_AllocZeroed<Kept>(1);
    if (!kept) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return false;
    }
    kept->next = s_Kept[name % kRows];
    s_Kept[name % kRows] = kept;
    kept->name = name;
    kept->target = target;
    kept->context = g_QexContexts;
    kept->source = source;
    kept->source.bytes = nullptr;
    uint8_t* bytes = nullptr;
    const char* path = s_Path;
    if (!path && s_Hook.loader && !(s_Keeping && source.bytes)) {
        path = s_Hook.path;
        kept->loader = s_Hook.loader;
        kept->owner = s_Hook.owner;
    }
    const bool copied = path ? Copy(&kept->path, path, strlen(path) + 1)
                             : !s_Keeping || !source.bytes || Copy(&bytes, source.bytes, source.size);
    kept->source.bytes = bytes;
    if (!copied) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        QexKeptTexture_Drop(name);
    }
    return copied;
}

void QexKeptTexture_Drop(uint32_t name) {
    if (name == s_Renewed) return;
    Kept** at = Find(name);
    Kept* kept = *at;
    if (!kept) return;
    *at = kept->next;
    QexMemory_Free(const_cast<void*>(kept->source.bytes));
    QexMemory_Free(kept->path);
    QexMemory_Free(kept);
}

void QexKeptTexture_Replace(const QexTexture& texture, const void* pixels, uint64_t size) {
    Kept* kept = texture.glName == s_Renewed ? nullptr : *Find(texture.glName);
    if (!kept || kept->source.kind != kKeptPixels || !(s_Keeping || kept->source.bytes)) return;
    uint8_t* bytes = nullptr;
    Copy(&bytes, pixels, size);
    QexMemory_Free(const_cast<void*>(kept->source.bytes));
    kept->source = {kKeptPixels,    bytes, size, texture.width, static_cast<int32_t>(texture.height),
                    texture.format, 0,     0};
}

void QexKeptTexture_SetCodes(uint32_t name, uint8_t filter, uint8_t wrap) {
    Kept* kept = name == s_Renewed ? nullptr : *Find(name);
    if (!kept) return;
    if (filter) kept->filter = filter;
    if (wrap) kept->wrap = wrap;
}

bool QexKeptTexture_SetKeeping(bool keeps) {
    const bool before = s_Keeping;
    s_Keeping = keeps;
    return before;
}

extern "C" {

int32_t QexEngine_KeepTextures(int32_t keeps) {
    return QexKeptTexture_SetKeeping(keeps != 0);
}

void QexEngine_SetTextureSource(QexTextureSource source, void* user) {
    s_Source = source;
    s_SourceUser = user;
}

}  // extern "C"
