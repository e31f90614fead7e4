// Drawing an emitter's billboards against the same GL calls replayed from a record, both under the tap's null
// driver; and updating 10,000 particles against a plain loop over arrays.
#include <cstdio>
#include <cstdlib>

#include "BenchEngine.h"
#include "gltap.h"
#include "Ratio.h"

namespace {

constexpr int kEmitters = 40;
constexpr int kEach = 250;
constexpr size_t kParticles = kEmitters * kEach;
constexpr float kElapsed = 1 / 60.0f;

QexParticleEmitter* FilledEmitter(int count) {
    QexParticleEmitter* e = QexParticleEmitter_Create();
    e->currentRate = static_cast<float>(count);
    e->lifetime[0] = e->lifetime[1] = 1e30f;
    e->animations[0].frames[1] = e->animations[0].frames[0];
    e->animations[0].frameCount = 2;
    e->animations[0].frameDuration = 0.1f;
    e->animations[0].loop = 1;
    QexParticleEmitter_Update(e, kElapsed, nullptr);
    e->emitting = 0;
    if (e->particleCount != count) abort();
    return e;
}

struct Vectors {
    std::vector<float> x, y, z;
    explicit Vectors(float value) : x(kParticles, value), y(x), z(x) {}
};

// The state of 10,000 particles, an array for each component.
struct Arrays {
    std::vector<float> age, lifetime, opacity, start, end, frameAge;
    std::vector<int32_t> active, frame;
    Vectors scale{1}, rotation{0}, spin{0}, spinRate{1}, position{0}, velocity{1}, acceleration{-98};

    Arrays()
        : age(kParticles),
          lifetime(kParticles, 1e30f),
          opacity(kParticles),
          start(kParticles, 1),
          end(kParticles),
          frameAge(kParticles),
          active(kParticles, 1),
          frame(kParticles) {}

    static void Add(Vectors* v, const Vectors& rate, size_t i, float time) {
        v->x[i] += rate.x[i] * time;
        v->y[i] += rate.y[i] * time;
        v->z[i] += rate.z[i] * time;
    }

    void Update(float elapsed, float scaleFactor, const QexParticleAnimation& animation) {
        for (size_t i = 0; i < kParticles; ++i) {
            if (!active[i]) continue;
            if (lifetime[i] < 0) {
                opacity[i] = (start[i] + end[i]) * 0.5f;
            } else if (lifetime[i] <= age[i]) {
                active[i] = 0;
                continue;
            } else {
                opacity[i] = start[i] + (end[i] - start[i]) * age[i] / lifetime[i];
            }
            scale.x[i] *= scaleFactor;
            scale.y[i] *= scaleFactor;
            scale.z[i] *= scaleFactor;
            Add(&spin, spinRate, i, elapsed);
            Add(&rotation, spin, i, elapsed);
            Add(&velocity, acceleration, i, elapsed);
            Add(&position, velocity, i, elapsed);
            if (age[i] - frameAge[i] >= animation.frameDuration) {
                frame[i] = frame[i] < animation.frameCount - 1 ? frame[i] + 1 : 0;
                frameAge[i] += animation.frameDuration;
            }
            age[i] += elapsed;
        }
    }
};

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    const BenchEngine engine(640, 480);
    // The emitters' log lines, one a particle and update, go nowhere.
    if (!freopen("/dev/null", "w", stderr)) abort();
    std::vector<QexParticleEmitter*> emitters;
    {
        const Silence silence;
        for (int i = 0; i < kEmitters; ++i) emitters.push_back(FilledEmitter(kEach));
        emitters.push_back(FilledEmitter(QEX_EMITTER_MAX_PARTICLES));
    }
    QexParticleEmitter* drawn = emitters.back();
    const QexCamera camera = BenchEngine::Camera({16, 16, 60}, {16, 16, 0}, 4.0f / 3);

    const auto draw = [&] { QexParticleEmitter_Draw(drawn, &camera); };
    draw();
    gltapBeginRecording();
    draw();
    gltapRecording* recording = gltapEndRecording();
    bench.Compare(
        "draw a particle as a billboard / its GL calls", 1.3, draw, [&] { gltapReplay(recording); },
        QEX_EMITTER_MAX_PARTICLES);

    Arrays arrays;
    const auto update = [&] {
        arrays.Update(kElapsed, 1, drawn->animations[0]);
        KeepValue(arrays);
    };
    bench.Compare(
        "update a particle / plain loop over arrays", 3,
        [&] {
            for (int i = 0; i < kEmitters; ++i)
                for (int k = 0; k < kEach; ++k)
                    QexParticleEx_Update(&emitters[static_cast<size_t>(i)]->particles[k], kElapsed);
        },
        update, kParticles);
    bench.Compare(
        "update an emitter's particle / plain loop and log lines", 1.3,
        [&] {
            for (int i = 0; i < kEmitters; ++i)
                QexParticleEmitter_Update(emitters[static_cast<size_t>(i)], kElapsed, nullptr);
        },
        [&] {
            for (size_t i = 0; i < kParticles; ++i)
                QexLog("Emitter", "particles=%d, Active=%d", kEach, arrays.active[i]);
            update();
        },
        kParticles);
    const int status = bench.Result();
    printf("GL calls a billboard: %.1f\n",
           static_cast<double>(gltapRecordingSize(recording)) / QEX_EMITTER_MAX_PARTICLES);
    gltapReleaseRecording(recording);
    const Silence silence;
    for (QexParticleEmitter* e : emitters) QexParticleEmitter_Release(e);
    return status;
}
