/* Where the fields of emitter files lie, and records that applications share with 32-bit ones: on 32-bit
 * targets the records in memory are the same. Only compiled, for such a target; no C library is needed. */
#include <stddef.h>

#include "Qex.h"

#define AT(type, member, offset) _Static_assert(offsetof(type, member) == (offset), #type "." #member)
#define SIZE(type, bytes) _Static_assert(sizeof(type) == (bytes), #type)

SIZE(QexParticleEmitter, QEX_EMITTER_FILE_SIZE);
SIZE(QexParticleEmitter, 45304);
AT(QexParticleEmitter, emitting, 0);
AT(QexParticleEmitter, emitDuration, 4);
AT(QexParticleEmitter, emissionRate, 8);
AT(QexParticleEmitter, lifetime, 16);
AT(QexParticleEmitter, colors, 24);
AT(QexParticleEmitter, colorCount, 184);
AT(QexParticleEmitter, startOpacity, 188);
AT(QexParticleEmitter, endOpacity, 192);
AT(QexParticleEmitter, scaleMin, 196);
AT(QexParticleEmitter, scaleMax, 208);
AT(QexParticleEmitter, scaleFactor, 220);
AT(QexParticleEmitter, rotationMin, 224);
AT(QexParticleEmitter, rotationMax, 236);
AT(QexParticleEmitter, angularVelocityMin, 248);
AT(QexParticleEmitter, angularVelocityMax, 260);
AT(QexParticleEmitter, angularAccelerationMin, 272);
AT(QexParticleEmitter, angularAccelerationMax, 284);
AT(QexParticleEmitter, position, 296);
AT(QexParticleEmitter, positionSpread, 308);
AT(QexParticleEmitter, velocityMin, 320);
AT(QexParticleEmitter, velocityMax, 332);
AT(QexParticleEmitter, accelerationMin, 344);
AT(QexParticleEmitter, accelerationMax, 356);
AT(QexParticleEmitter, animations, 368);
AT(QexParticleEmitter, animationCount, 888);
AT(QexParticleEmitter, particles, 892);
AT(QexParticleEmitter, particleCount, 45292);
AT(QexParticleEmitter, currentRate, 45296);
AT(QexParticleEmitter, accumulator, 45300);

SIZE(QexParticleAnimation, 52);
AT(QexParticleAnimation, frames, 0);
AT(QexParticleAnimation, frameCount, 40);
AT(QexParticleAnimation, frameDuration, 44);
AT(QexParticleAnimation, loop, 48);

SIZE(QexParticleEx, 148);
AT(QexParticleEx, active, 0);
AT(QexParticleEx, age, 4);
AT(QexParticleEx, lifetime, 8);
AT(QexParticleEx, color, 12);
AT(QexParticleEx, opacity, 28);
AT(QexParticleEx, startOpacity, 32);
AT(QexParticleEx, endOpacity, 36);
AT(QexParticleEx, scale, 40);
AT(QexParticleEx, scaleFactor, 52);
AT(QexParticleEx, rotation, 56);
AT(QexParticleEx, angularVelocity, 68);
AT(QexParticleEx, angularAcceleration, 80);
AT(QexParticleEx, position, 92);
AT(QexParticleEx, velocity, 104);
AT(QexParticleEx, acceleration, 116);
AT(QexParticleEx, animation, 128);
AT(QexParticleEx, frame, 132);
AT(QexParticleEx, frameAge, 136);
AT(QexParticleEx, billboard, 140);
AT(QexParticleEx, spare, 144);

SIZE(QexParticleSetEntry, 28);
SIZE(QexSkyBox, 72);
SIZE(QexEngineConfig, 44);
SIZE(QexRuntimeContext, 64);
