// Sample 15: a firework from a particle set. The vertex shader moves all sparks of a rocket; when they have
// burnt out the set says so, and the next rocket goes off in another place and colour.
#include <cstdlib>

#include "Sample.h"

static constexpr uint32_t kSparks = 150;
static constexpr float kDuration = 1.6f, kStep = 1 / 60.0f;

static const struct {
    QexVec3 place;
    QexVec4 from, to;
} kRockets[] = {{{-1.5f, 0.4f, 0}, {1, 0.9f, 0.5f, 0.4f}, {1, 0.2f, 0.1f, 1}},
                {{1.4f, 0.9f, 0}, {0.8f, 1, 1, 0.4f}, {0.2f, 0.4f, 1, 1}},
                {{0.2f, -0.3f, 0}, {0.9f, 1, 0.7f, 0.4f}, {0.1f, 0.8f, 0.3f, 1}}};
static int s_Rocket = -1;

// Directions that are even over the sphere, speeds that differ a little.
static void Load(QexParticleSet* set) {
    QexParticleSetEntry* sparks;
    uint32_t count;
    if (QexParticleSet_GetBuffer(set, &sparks, &count) != 0) return;
    for (uint32_t i = 0; i < count; ++i) {
        const float turn = 2.399963f * static_cast<float>(i);  // the golden angle
        const float height = 1 - 2 * (static_cast<float>(i) + 0.5f) / static_cast<float>(count);
        const float radius = std::sqrt(1 - height * height);
        const float speed = 0.9f + 0.4f * static_cast<float>(rand()) / static_cast<float>(RAND_MAX);
        sparks[i].velocity = {speed * radius * std::cos(turn), speed * height,
                              speed * radius * std::sin(turn)};
        sparks[i].startPosition = {0, 0, 0};
        sparks[i].lifetime = kDuration * (0.6f + 0.4f * static_cast<float>(i % 7) / 6);
    }
}

static void Fire(QexParticleSet* set, int32_t, int32_t) {
    s_Rocket = (s_Rocket + 1) % 3;
    set->centerPosition = kRockets[s_Rocket].place;
    set->startColor = kRockets[s_Rocket].from;
    set->endColor = kRockets[s_Rocket].to;
    QexParticleSet_Trigger(set);
}

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleTexture spark(32, 32, scenes::Spot(32, {255, 255, 255}));
    // The red of a second texture gives each spark its shape.
    SampleTexture shape(32, 32, [](float s, float t) {
        const float x = std::fabs(s - 0.5f), y = std::fabs(t - 0.5f);
        return QexVec4{1.2f - 6 * std::min(x, y) - 2 * std::max(x, y), 0, 0, 1};
    });
    QexParticleSet set;
    if (QexParticleSet_Create(&set, &spark.texture, &shape.texture, kSparks, 22, kDuration) != 0) return 1;
    set.onFinished = Fire;
    srand(1);
    Load(&set);
    sample.Clear(0.02f, 0.02f, 0.08f);
    QexRenderer_SetAlphaBlendMode(2);
    const QexCamera camera = sample.Camera({0, 0, 5}, {0, 0.3f, 0});

    // Three rockets, one after the other. The picture keeps the sparks of a third of a second, like a long
    // exposure.
    Fire(&set, 0, 0);
    for (int rocket = 0; rocket < 3; ++rocket) {
        const int shown = s_Rocket;
        while (s_Rocket == shown) {
            QexParticleSet_Update(&set, kStep, &camera, nullptr);
            if (set.time > 0.45f && set.time < 0.75f) QexParticleSet_Draw(&set);
        }
    }
    set.onFinished = nullptr;
    QexParticleSet_Release(&set);
    return sample.Finish();
}
