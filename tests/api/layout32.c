/* Records that have one size everywhere have no gap or pointer too many on 32-bit targets, where emitter
 * files are the record in memory. Only compiled, for such a target; no C library is needed. */
#include <stddef.h>

#include "Qex.h"

#define AT(type, member, offset) _Static_assert(offsetof(type, member) == (offset), #type "." #member)
#define SIZE(type, bytes) _Static_assert(sizeof(type) == (bytes), #type)

SIZE(QexParticleEmitter, QEX_EMITTER_FILE_SIZE);
AT(QexParticleEmitter, animations, 368);
AT(QexParticleEmitter, animationCount, 888);
AT(QexParticleEmitter, particles, 892);
AT(QexParticleEmitter, particleCount, 45292);
SIZE(QexParticleAnimation, 52);
AT(QexParticleAnimation, frameCount, 40);
SIZE(QexParticleEx, 148);
AT(QexParticleEx, animation, 128);
AT(QexParticleEx, billboard, 140);
SIZE(QexParticleSetEntry, 28);
SIZE(QexSkyBox, 72);
SIZE(QexEngineConfig, 44);
SIZE(QexRuntimeContext, 64);
