// Emitter files: written and read as one record of words, with a check of what was read.
#include <cmath>
#include <cstdio>
#include <cstring>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "data/ResFile.h"
#include "Qex/base.h"
#include "Qex/effects.h"

#define QEX_MODULE "src/QexParticle"

namespace {

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "fields are copied as they are");

// Carries a record to its file form or back, one run of fields after the other.
class FileCursor {
  public:
    FileCursor(uint8_t* file, bool writing) : at_(file), writing_(writing) {}

    // That many 32-bit fields from `first` on.
    void Words(void* first, size_t count) {
        if (writing_)
            memcpy(at_, first, 4 * count);
        else
            memcpy(first, at_, 4 * count);
        at_ += 4 * count;
    }
    // Addresses mean nothing outside their process.
    template <class T>
    void Pointers(T** first, size_t count) {
        if (writing_)
            memset(at_, 0, 4 * count);
        else
            for (size_t i = 0; i < count; ++i) first[i] = nullptr;
        at_ += 4 * count;
    }

  private:
    uint8_t* at_;
    bool writing_;
};

constexpr size_t kSettingWords = offsetof(QexParticleEmitter, animations) / 4;
constexpr size_t kParticleWords = offsetof(QexParticleEx, animation) / 4;

void Carry(FileCursor file, QexParticleEmitter* e) {
    file.Words(e, kSettingWords);
    for (QexParticleAnimation& animation : e->animations) {
        file.Pointers(animation.frames, QEX_ANIMATION_MAX_FRAMES);
        file.Words(&animation.frameCount, 3);
    }
    file.Words(&e->animationCount, 1);
    for (QexParticleEx& p : e->particles) {
        file.Words(&p, kParticleWords);
        file.Pointers(&p.animation, 1);
        file.Words(&p.frame, 2);
        file.Pointers(&p.billboard, 1);
        file.Words(&p.spare, 1);
    }
    file.Words(&e->particleCount, 3);
}

bool AreFinite(const float* values, size_t count) {
    for (size_t i = 0; i < count; ++i)
        if (!std::isfinite(values[i])) return false;
    return true;
}

// What is wrong with an emitter from a file, or null. Colours, animations and slots that are not in use may
// hold anything.
const char* Fault(const QexParticleEmitter& e) {
    if (e.colorCount < 0 || e.colorCount > QEX_EMITTER_MAX_COLORS) return "a colour count is not 0 to 10";
    if (e.animationCount < 0 || e.animationCount > QEX_EMITTER_MAX_ANIMATIONS)
        return "an animation count is not 0 to 10";
    if (e.particleCount < 0 || e.particleCount > QEX_EMITTER_SLOTS) return "a particle count is not 0 to 300";
    for (int32_t i = 0; i < e.animationCount; ++i) {
        const QexParticleAnimation& animation = e.animations[i];
        if (animation.frameCount < 0 || animation.frameCount > QEX_ANIMATION_MAX_FRAMES)
            return "a frame count is not 0 to 10";
        if (!std::isfinite(animation.frameDuration)) return "a frame duration is not a finite number";
    }
    constexpr size_t kAfterColors = offsetof(QexParticleEmitter, startOpacity) / 4;
    const float* opacity = &e.startOpacity;
    if (!AreFinite(&e.emitDuration, 5) || !AreFinite(&e.colors[0].x, static_cast<size_t>(e.colorCount) * 4) ||
        !AreFinite(opacity, kSettingWords - kAfterColors) || !AreFinite(&e.currentRate, 2))
        return "a setting is not a finite number";
    return nullptr;
}

bool ReadWhole(const char* path, FILE* file, uint8_t* bytes) {
    const size_t read = fread(bytes, 1, QEX_EMITTER_FILE_SIZE, file);
    if (read == QEX_EMITTER_FILE_SIZE) return true;
    QexError(QEX_TAG, "<QexParticleEmitter_CreateFromBinFile> %s has %zu bytes, not %d", path, read,
             QEX_EMITTER_FILE_SIZE);
    return false;
}

QexParticleEmitter* Read(const char* path, FILE* file) {
    QexScratch<uint8_t> bytes(QEX_EMITTER_FILE_SIZE);
    QexScratch<QexParticleEmitter> emitter(1);
    if (!bytes || !emitter) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    if (!ReadWhole(path, file, bytes.Get())) return nullptr;
    Carry({bytes.Get(), false}, emitter.Get());
    if (const char* fault = Fault(emitter[0])) {
        QexError(QEX_TAG, "<QexParticleEmitter_CreateFromBinFile> %s: %s", path, fault);
        return nullptr;
    }
    // Without their billboards the particles are nothing.
    int32_t& count = emitter[0].particleCount;
    if (count)
        QexError(QEX_TAG, "<QexParticleEmitter_CreateFromBinFile> %s: %d living particles are left out", path,
                 count);
    count = 0;
    return emitter.Take();
}

}  // namespace

extern "C" {

int32_t QexParticleEmitter_WriteToBinFile(const QexParticleEmitter* emitter, const char* path) {
    if (!emitter || !path) return -2;
    QexScratch<uint8_t> bytes(QEX_EMITTER_FILE_SIZE);
    if (!bytes) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return -1;
    }
    FILE* file = fopen(path, "wb");
    if (!file) return -1;
    // Writing does not change the record.
    Carry({bytes.Get(), true}, const_cast<QexParticleEmitter*>(emitter));
    const bool written = fwrite(bytes.Get(), QEX_EMITTER_FILE_SIZE, 1, file) == 1;
    if (fclose(file) == 0 && written) return 0;
    QexError(QEX_TAG, "<QexParticleEmitter_WriteToBinFile> %s cannot be written", path);
    return -1;
}

QexParticleEmitter* QexParticleEmitter_CreateFromBinFile(const char* path) {
    if (!path) return nullptr;
    FILE* file = QexResFile_OpenForReading(path);
    if (!file) return nullptr;
    QexParticleEmitter* emitter = Read(path, file);
    fclose(file);
    return emitter;
}

}  // extern "C"

// The file form is the record of 32-bit targets, and the runs that are carried whole have no gaps anywhere.
static_assert(offsetof(QexParticleEmitter, animations) == 368, "92 words before the first pointer");
static_assert(offsetof(QexParticleEx, animation) == 128, "32 words before the first pointer");
#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexParticleEmitter) == QEX_EMITTER_FILE_SIZE, "the file form");
static_assert(sizeof(QexParticleAnimation) == 52 && sizeof(QexParticleEx) == 148, "13 and 37 words");
static_assert(offsetof(QexParticleEmitter, animationCount) == 888, "the file form");
static_assert(offsetof(QexParticleEmitter, particles) == 892, "the file form");
static_assert(offsetof(QexParticleEmitter, particleCount) == 45292, "the file form");
static_assert(offsetof(QexParticleEx, billboard) == 140, "the file form");
#endif
