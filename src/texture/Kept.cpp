// Textures that outlive their context.
#include "texture/Kept.h"

#include <cstring>

#include "base/Memory.h"
#include "gl/Context.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"
#include "texture/LoadPvr.h"
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

// Whether an image file is loaded again, which is done in steps.
bool IsImage(const Kept& kept) {
    return kept.source.kind == kKeptImage && !kept.loader && (kept.source.bytes || kept.path);
}

// Loads what the bytes, or else the file, hold into the record.
int32_t Load(QexTexture* texture, const Kept& kept) {
    const QexKeptSource& s = kept.source;
    const uint32_t size = static_cast<uint32_t>(s.size);
    const bool file = kept.path && !kept.loader;
    if (s.kind == kKeptTarget) {
        QexRenderTarget_CreateColourTexture(texture, s.width, s.height);
        return 0;
    }
    if (s.kind == kKeptNormals) return QexTexture_GenerateNormalisationCubeMap(texture, s.width);
    if (kept.loader && kept.loader(kept.owner, kept.name, kept.path, texture) == 0) return 0;
    if (s.kind == kKeptTga && s.bytes)
        return QexTexture_CreateTGAFromMemSized(texture, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, s.bytes,
                                                size);
    if (s.kind == kKeptTga && file)
        return QexTexture_CreateTGAFromFile(texture, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_CLAMP, kept.path);
    if (s.kind == kKeptPixels && s.bytes)
        return QexTexture_CreateFromPixels(texture, s.width, s.height, s.format, 0, 0, QEX_FILTER_NEAREST,
                                           QEX_WRAP_CLAMP, const_cast<void*>(s.bytes));
    if (texture->glName || !s_Source) return -1;
    s_Handed = false;
    return s_Source(s_SourceUser, kept.name, texture);
}

// The texture that is made again, from its first step to its last one.
struct {
    Kept* kept;
    QexTexture texture;
    QexTextureFile* file;  // of an image, owned
} s_Current;

void GiveUpCurrent() {
    if (s_Current.file) QexTextureFile_End(s_Current.file);
    QexMemory_FreeArray(s_Current.file);
    s_Current.kept = nullptr;
}

QexStep Finish(bool made) {
    const Kept& kept = *s_Current.kept;
    QexTexture* texture = &s_Current.texture;
    GiveUpCurrent();
    if (!made) {
        QexError(QEX_TAG, "<QexEngine_ContextRestored> texture %u %s", kept.name,
                 IsImage(kept) || kept.loader || s_Source || kept.path
                     ? "could not be loaded again"
                     : "came from memory that was not kept");
        QexContext_ReserveTexture(kept.target, kept.name);  // or another texture would get it
        return QexStep::kFailed;
    }
    if (kept.filter) QexTexture_SetFilter(texture, kept.filter);
    if (kept.wrap) QexTexture_SetWrapping(texture, kept.wrap);
    if (texture->flags & QEX_TEXFLAG_OWNS_PIXELS) QexMemory_Free(texture->pixels);
    return QexStep::kMore;
}

// Takes the next texture of a lost context; false when there is none.
bool Take(uint32_t piece) {
    for (Kept* row : s_Kept)
        for (; row && !s_Current.kept; row = row->next)
            if (row->context != g_QexContexts) s_Current.kept = row;
    Kept* kept = s_Current.kept;
    if (!kept) return false;
    kept->context = g_QexContexts;
    s_Handed = false;
    s_Current.texture = {};
    const QexKeptSource& s = kept->source;
    const QexTextureLoad load = {&s_Current.texture,
                                 {static_cast<const uint8_t*>(s.bytes), s.size},
                                 nullptr,
                                 s.decode != 0,
                                 s.firstLevel,
                                 nullptr,
                                 piece};
    s_Current.file = IsImage(*kept) ? QexMemory_AllocArray<QexTextureFile>(1) : nullptr;
    if (s_Current.file && (s.bytes || !QexTextureFile_Begin(s_Current.file, load, kept->path)))
        QexTextureFile_BeginMemory(s_Current.file, load);  // of no bytes where there is no file: it fails
    return true;
}

// A part of a texture; one that is no image file is made at once.
QexStep Restore(uint32_t piece) {
    if (!s_Current.kept && !Take(piece)) return QexStep::kDone;
    Kept* kept = s_Current.kept;
    s_Renewed = kept->name;
    QexStep step;
    if (s_Current.file) {
        QexTextureLoad_Resume(s_Current.file);
        s_Current.file->piece = piece;
        step = QexTextureLoad_Step(s_Current.file);
    } else {
        const bool loaded = Load(&s_Current.texture, *kept) == 0;
        step = loaded && s_Current.texture.glName ? QexStep::kDone : QexStep::kFailed;
    }
    if (step != QexStep::kMore) step = Finish(step == QexStep::kDone);
    s_Renewed = 0;
    return step;
}

QexContextPart s_Part = {kRankTextures, GiveUpCurrent, Reserve, nullptr, nullptr, false, Restore};

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
    if (kept == s_Current.kept) GiveUpCurrent();
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
