// Particle emitters: what is drawn at random, how particles move, and how they are drawn.
#include <cmath>

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "gl/LeanState.h"
#include "overlay/Billboard.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

#define QEX_MODULE "src/QexParticle"

namespace {

// Numbers that the application may have written too large are cut where they are used.
int32_t Limited(int32_t count, int32_t most) {
    return count < 0 ? 0 : count < most ? count : most;
}

int32_t FrameCount(const QexParticleAnimation* animation) {
    return animation ? Limited(animation->frameCount, QEX_ANIMATION_MAX_FRAMES) : 0;
}

int32_t ParticleCount(const QexParticleEmitter* emitter) {
    return Limited(emitter->particleCount, QEX_EMITTER_SLOTS);
}

float Draw(float min, float max) {
    return min < max ? GetRandomFloatByRange(min, max) : min;
}

QexVec3 Draw(const QexVec3& min, const QexVec3& max) {
    return {Draw(min.x, max.x), Draw(min.y, max.y), Draw(min.z, max.z)};
}

int32_t DrawIndex(int32_t count) {
    return count >= 2 ? GetRandomInt(0, count - 1) : 0;
}

float Spread(float spread) {
    return spread > 0 ? spread * (2 * GetRandomFloat() - 1) : 0;
}

void AddScaled(QexVec3* v, const QexVec3& rate, float time) {
    v->x += rate.x * time;
    v->y += rate.y * time;
    v->z += rate.z * time;
}

// The order in which values are drawn is part of what a seed stands for.
void Spawn(QexParticleEmitter* e, QexParticleEx* p) {
    p->active = 1;
    p->age = p->frameAge = 0;
    p->lifetime = e->lifetime[0] < 0 || e->lifetime[1] < 0 ? -1 : Draw(e->lifetime[0], e->lifetime[1]);
    p->color = e->colors[DrawIndex(Limited(e->colorCount, QEX_EMITTER_MAX_COLORS))];
    p->opacity = p->startOpacity = e->startOpacity;
    p->endOpacity = e->endOpacity;
    p->scale = Draw(e->scaleMin, e->scaleMax);
    p->scaleFactor = e->scaleFactor;
    p->rotation = Draw(e->rotationMin, e->rotationMax);
    p->angularVelocity = Draw(e->angularVelocityMin, e->angularVelocityMax);
    p->angularAcceleration = Draw(e->angularAccelerationMin, e->angularAccelerationMax);
    const QexVec3 offset = {Spread(e->positionSpread.x), Spread(e->positionSpread.y),
                            Spread(e->positionSpread.z)};
    QexVec3_Add(&p->position, &e->position, &offset);
    p->velocity = Draw(e->velocityMin, e->velocityMax);
    p->acceleration = Draw(e->accelerationMin, e->accelerationMax);
    p->animation = &e->animations[DrawIndex(Limited(e->animationCount, QEX_EMITTER_MAX_ANIMATIONS))];
    p->frame = p->animation->loop ? DrawIndex(FrameCount(p->animation)) : 0;
    p->billboard = QexBillboard_Create(p->animation->frames[0]);
}

// Moves the living particles on and closes the gaps that the others leave.
void Advance(QexParticleEmitter* e, float elapsed) {
    const int32_t count = ParticleCount(e);
    QexParticleEx* kept = e->particles;
    for (QexParticleEx* p = e->particles; p < e->particles + count; ++p) {
        QexLog("Emitter", "particles=%d, Active=%d", count, p->active);
        if (p->active) {
            QexParticleEx_Update(p, elapsed);
            if (kept != p) *kept = *p;
            ++kept;
        } else {
            QexBillboard_Release(p->billboard);
            p->billboard = nullptr;
        }
    }
    e->particleCount = static_cast<int32_t>(kept - e->particles);
}

void Emit(QexParticleEmitter* e) {
    e->accumulator += e->currentRate;
    if (!(e->accumulator >= 1)) return;
    const float due = truncf(e->accumulator);
    e->accumulator -= due;
    e->currentRate = Draw(e->emissionRate[0], e->emissionRate[1]);
    for (float i = 0; i < due && e->particleCount < QEX_EMITTER_MAX_PARTICLES; ++i)
        Spawn(e, &e->particles[e->particleCount++]);
}

void CountDown(QexParticleEmitter* e, float elapsed) {
    if (e->emitDuration < 0) return;
    if (e->emitDuration > 0) e->emitDuration -= elapsed;
    if (e->emitDuration <= 0) e->emitting = 0;
}

void AdvanceFrame(QexParticleEx* p) {
    const int32_t frames = FrameCount(p->animation);
    if (!frames || !(p->age - p->frameAge >= p->animation->frameDuration)) return;
    if (p->frame < frames - 1)
        ++p->frame;
    else
        p->frame = p->animation->loop ? 0 : frames - 1;
    p->frameAge += p->animation->frameDuration;
}

}  // namespace

extern "C" {

QexParticleEmitter* QexParticleEmitter_Create(void) {
    QexParticleEmitter* e = QexMemory_AllocZeroed<QexParticleEmitter>(1);
    if (!e) {
        QexDiagnostics_OutOfMemory(QEX_MODULE, __LINE__);
        return nullptr;
    }
    e->emitting = 1;
    e->emitDuration = -1;
    e->emissionRate[0] = 0.5f;
    e->emissionRate[1] = 0.8f;
    e->lifetime[0] = 5;
    e->lifetime[1] = 6;
    e->colors[0] = {1, 1, 1, 1};
    e->colorCount = 1;
    e->startOpacity = 1;
    e->scaleMin = e->scaleMax = {1, 1, 1};
    e->scaleFactor = 1;
    e->velocityMin = {-80, 300, -80};
    e->velocityMax = {80, 400, 80};
    e->accelerationMin = e->accelerationMax = {0, -98, 0};
    e->animations[0].frames[0] = Qextexture_GetDefault();
    e->animations[0].frameCount = 1;
    e->animationCount = 1;
    e->currentRate = Draw(e->emissionRate[0], e->emissionRate[1]);
    return e;
}

void QexParticleEmitter_Update(QexParticleEmitter* emitter, float elapsed, void*) {
    if (!emitter) return;
    Advance(emitter, elapsed);
    if (emitter->emitting) Emit(emitter);
    CountDown(emitter, elapsed);
}

void QexParticleEx_Update(QexParticleEx* particle, float elapsed) {
    if (!particle || !particle->active) return;
    QexParticleEx& p = *particle;
    if (p.lifetime < 0) {
        p.opacity = (p.startOpacity + p.endOpacity) * 0.5f;
    } else if (p.lifetime <= p.age) {
        p.active = 0;
        return;
    } else {
        p.opacity = p.startOpacity + (p.endOpacity - p.startOpacity) * p.age / p.lifetime;
    }
    QexVec3_Scale(&p.scale, &p.scale, p.scaleFactor);
    AddScaled(&p.angularVelocity, p.angularAcceleration, elapsed);
    AddScaled(&p.rotation, p.angularVelocity, elapsed);
    AddScaled(&p.velocity, p.acceleration, elapsed);
    AddScaled(&p.position, p.velocity, elapsed);
    AdvanceFrame(&p);
    p.age += elapsed;
}

void QexParticleEmitter_Draw(QexParticleEmitter* emitter, const QexCamera* camera) {
    if (!emitter) return;
    const int32_t count = ParticleCount(emitter);
    if (!emitter->emitting && !count) return;
    QexLog("Particle emitter", "Particle Count = %d", count);
    QexRenderer_SetZWrite(0);
    for (QexParticleEx* p = emitter->particles; p < emitter->particles + count; ++p) {
        QexBillboard* billboard = p->billboard;
        if (!billboard) continue;
        billboard->scale = p->scale;
        billboard->rotation = p->rotation;
        billboard->position = p->position;
        billboard->opacity = p->opacity;
        const int32_t frames = FrameCount(p->animation);
        if (frames > 1)
            QexBillboard_SetTexture(billboard, p->animation->frames[Limited(p->frame, frames - 1)]);
        if (QexLeanState_IsLean() && camera)
            QexBillboard_Queue(*billboard, *camera);
        else
            QexBillboard_Draw(billboard, camera);
    }
    if (QexLeanState_IsLean()) QexBillboardBatch_Draw();
    QexRenderer_SetZWrite(1);
}

void QexParticleEmitter_Release(QexParticleEmitter* emitter) {
    if (!emitter) return;
    for (int32_t i = 0; i < ParticleCount(emitter); ++i)
        QexBillboard_Release(emitter->particles[i].billboard);
    QexMemory_Free(emitter);
}

}  // extern "C"
