#include <GLES2/gl2.h>

#include <cmath>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <sstream>

#include "support/Capture.h"
#include "support/RenderFixture.h"
#include "support/RenderScenes.h"

namespace {

QexCamera PixelCamera() {
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    camera.viewMatrix = g_sMatIdentity;
    camera.projectionMatrix = PixelProjection();
    return camera;
}

// ---- Sets ----

class ParticleSetTest : public RenderTest {
  protected:
    void Create(uint32_t count, float pointSize, float duration, QexTexture* texture = nullptr,
                QexTexture* alpha = nullptr) {
        ASSERT_EQ(QexParticleSet_Create(&set_, texture, alpha, count, pointSize, duration), 0);
        EXPECT_EQ(QexParticleSet_GetBuffer(&set_, &entries_, nullptr), 0);
    }
    void TearDown() override {
        QexParticleSet_Release(&set_);
        RenderTest::TearDown();
    }
    void Update(float elapsed, const QexMatrix* model = nullptr) {
        QexParticleSet_Update(&set_, elapsed, &camera_, model);
    }

    QexParticleSet set_ = {};
    QexParticleSetEntry* entries_ = nullptr;
    QexCamera camera_ = PixelCamera();
};

TEST_F(ParticleSetTest, PointsMoveShrinkAndFade) {
    // The upper left quarter of the mask is empty, its upper right quarter half; black and white otherwise.
    const uint8_t masks[16] = {0, 255, 255, 255, 128, 0, 0, 0, 255, 0, 0, 0, 255, 0, 0, 0};
    ScopedTexture texture({255, 128, 255, 204}), mask(2, 2, masks);
    Create(3, 32, 10, &texture, &mask);
    const QexParticleSetEntry entries[] = {
        {4, {8, 0, 0}, {20, 20, 0}}, {2, {0, -16, 0}, {60, 60, 0}}, {0.75f, {0, 0, 0}, {90, 40, 0}}};
    memcpy(entries_, entries, sizeof entries);
    set_.startColor = {1, 1, 0, 1};
    set_.endColor = {0, 0, 1, 0.5f};
    set_.centerPosition = {4, 8, 0};
    const QexMatrix model = ToQex(glm::translate(glm::mat4(1), {10, -6, 0}));
    QexParticleSet_Trigger(&set_);
    Update(0, &model);
    for (const float time : {0.0f, 1.0f, 1.5f}) {
        if (time > 0) Update(time - set_.time, &model);
        Clear();
        QexParticleSet_Draw(&set_);
        Picture expected;
        for (const QexParticleSetEntry& e : entries) {
            const float v = 1 - time / e.lifetime;
            if (v <= 0) continue;
            const int half = static_cast<int>(std::lround(16 * v * v));
            const int x = static_cast<int>(e.startPosition.x + time * e.velocity.x) + 14,
                      y = kHeight - static_cast<int>(e.startPosition.y + time * e.velocity.y) - 2;
            const auto colour = [&](float alpha) -> Rgba {
                const float a = (0.5f * (1 - v) + v) * 0.8f * v * alpha;
                const auto byte = [](float c) { return static_cast<int>(std::lround(255 * c)); };
                return {byte(v), byte(v * 128 / 255), byte(1 - v), byte(a)};
            };
            expected.Fill(x, y - half, x + half, y, colour(128 / 255.0f));
            expected.Fill(x - half, y, x + half, y + half, colour(1));
        }
        EXPECT_TRUE(SamePicture(Read(), expected, 2)) << "at " << time;
    }
}

TEST_F(ParticleSetTest, RunsUntilItsDuration) {
    Create(1, 4, 2);
    static std::string told;
    told.clear();
    set_.onFinished = [](QexParticleSet* set, int32_t finished, int32_t zero) {
        told += std::to_string(finished) + std::to_string(zero) + " ";
        if (told.size() > 3) return QexParticleSet_Release(set);
        QexParticleSet_Trigger(set);
    };
    Update(5);
    EXPECT_EQ(set_.active, 0u);
    QexParticleSet_Trigger(&set_);
    for (int i = 0; i < 3; ++i) Update(0.5f);
    EXPECT_EQ(told, "");
    EXPECT_TRUE(SameMatrix(set_.mvpMatrix.m, glm::make_mat4(camera_.projectionMatrix.m)));
    EXPECT_EQ(set_.time, 1.5f);
    Update(0.5f);
    EXPECT_EQ(told, "10 ");
    // The callback triggered it again, and releases it the next time.
    EXPECT_EQ(set_.active, 1u);
    EXPECT_EQ(set_.time, 0);
    Update(2);
    EXPECT_EQ(told, "10 10 ");
    QexParticleSet_Trigger(&set_);
    EXPECT_EQ(GLCalls([&] { Update(0.5f), QexParticleSet_Draw(&set_); }).Size(), 0u);
}

TEST_F(ParticleSetTest, LifeAndStateLeftBehind) {
    const std::string before = LiveObjects();
    BothOutputs outputs;
    EXPECT_EQ(QexParticleSet_GetBuffer(&set_, nullptr, nullptr), -1);
    // More memory than any block may have.
    EXPECT_EQ(QexParticleSet_Create(&set_, nullptr, nullptr, 100000000, 1, 1), -1);
    EXPECT_EQ(LiveObjects(), before);
    EXPECT_EQ(outputs.Out().compare(0, 20, "Error: Out of memory"), 0);

    Create(3, 4, 2);
    QexParticleSet other;
    ASSERT_EQ(QexParticleSet_Create(&other, nullptr, nullptr, 0, 9, 1), 0);
    uint32_t count = 0;
    EXPECT_EQ(QexParticleSet_GetBuffer(&set_, nullptr, &count), 0);
    EXPECT_EQ(count, 3u);
    QexParticleSet_Trigger(&set_);
    QexParticleSet_Draw(&set_);
    QexRenderState_ActiveTexture(GL_TEXTURE2);
    QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
    glDisable(GL_DEPTH_TEST);
    glDepthMask(GL_FALSE);
    const GLCalls creation([&] {
        QexParticleSet third;
        QexParticleSet_Create(&third, nullptr, nullptr, 1, 7, 1);
        QexParticleSet_Release(&third);
    });
    // All sets share the program, so the last point size holds.
    EXPECT_EQ(creation.Of({"glLinkProgram", "glDeleteProgram"}).size(), 0u);
    EXPECT_EQ(creation.Of({"glUniform1f"}).size(), 1u);
    EXPECT_EQ(
        StateChange([&] { Update(0.1f), QexParticleSet_Draw(&set_); }),
        "activeUnit: 2 -> 3\ndepthTest: 0 -> 1\ndepthMask: 0 -> 1\ndepthFunc: GL_ALWAYS -> GL_LEQUAL\n");
    QexParticleSet_Release(&set_);
    QexParticleSet_Release(&set_);
    EXPECT_NE(LiveObjects(), before);
    QexParticleSet_Release(&other);
    EXPECT_EQ(LiveObjects(), before);
}

// ---- Emitters ----

constexpr long kSeed = 20240229;

// Emitters once more, a container and loops, with the random source's own numbers.
struct Model {
    explicit Model(QexParticleEmitter* settings) : e(*settings), rate(settings->currentRate) {}
    float Random() { return std::min(static_cast<float>(nrand48(state)) * 4.656613e-10f, 0.99999994f); }
    int Index(int count) { return count > 1 ? static_cast<int>(static_cast<float>(count) * Random()) : 0; }
    float Value(float a, float b) { return a < b ? a + (b - a) * Random() : a; }
    QexVec3 Value(const QexVec3& a, const QexVec3& b) {
        const float x = Value(a.x, b.x), y = Value(a.y, b.y), z = Value(a.z, b.z);
        return {x, y, z};
    }

    void Spawn() {
        QexParticleEx p = {};
        p.active = 1;
        p.lifetime = e.lifetime[0] < 0 || e.lifetime[1] < 0 ? -1 : Value(e.lifetime[0], e.lifetime[1]);
        p.color = e.colors[Index(e.colorCount)];
        p.opacity = p.startOpacity = e.startOpacity;
        p.endOpacity = e.endOpacity;
        p.scale = Value(e.scaleMin, e.scaleMax);
        p.scaleFactor = e.scaleFactor;
        p.rotation = Value(e.rotationMin, e.rotationMax);
        p.angularVelocity = Value(e.angularVelocityMin, e.angularVelocityMax);
        p.angularAcceleration = Value(e.angularAccelerationMin, e.angularAccelerationMax);
        for (int i = 0; i < 3; ++i) {
            const float spread = (&e.positionSpread.x)[i];
            (&p.position.x)[i] = (&e.position.x)[i] + (spread > 0 ? spread * (2 * Random() - 1) : 0);
        }
        p.velocity = Value(e.velocityMin, e.velocityMax);
        p.acceleration = Value(e.accelerationMin, e.accelerationMax);
        p.animation = &e.animations[Index(e.animationCount)];
        if (p.animation->loop) p.frame = Index(p.animation->frameCount);
        particles.push_back(p);
    }

    static void Step(QexParticleEx& p, float dt) {
        if (p.lifetime >= 0 && p.lifetime <= p.age) {
            p.active = 0;
            return;
        }
        const float share = p.lifetime < 0 ? 0.5f : p.age / p.lifetime;
        p.opacity = p.startOpacity + (p.endOpacity - p.startOpacity) * share;
        for (int i = 0; i < 3; ++i) {
            (&p.scale.x)[i] *= p.scaleFactor;
            (&p.angularVelocity.x)[i] += dt * (&p.angularAcceleration.x)[i];
            (&p.rotation.x)[i] += dt * (&p.angularVelocity.x)[i];
            (&p.velocity.x)[i] += dt * (&p.acceleration.x)[i];
            (&p.position.x)[i] += dt * (&p.velocity.x)[i];
        }
        const QexParticleAnimation& a = *p.animation;
        if (a.frameCount > 0 && p.age - p.frameAge >= a.frameDuration) {
            p.frame = p.frame + 1 < a.frameCount ? p.frame + 1 : a.loop ? 0 : a.frameCount - 1;
            p.frameAge += a.frameDuration;
        }
        p.age += dt;
    }

    void Update(float dt) {
        std::vector<QexParticleEx> kept;
        for (QexParticleEx& p : particles)
            if (p.active) Step(p, dt), kept.push_back(p);
        particles = kept;
        due += rate;
        if (due < 1) return;
        const int count = static_cast<int>(due);
        due -= static_cast<float>(count);
        rate = Value(e.emissionRate[0], e.emissionRate[1]);
        for (int i = 0; i < count && particles.size() < 299; ++i) Spawn();
    }

    QexParticleEmitter& e;
    // The source's state after srand48.
    unsigned short state[3] = {0x330E, kSeed & 0xFFFF, kSeed >> 16};
    float rate, due = 0;
    std::vector<QexParticleEx> particles;
};

// How a particle differs from the model's, or nothing.
std::string Difference(const QexParticleEx& p, const QexParticleEx& m) {
    std::ostringstream text;
    const float *a = &p.age, *b = &m.age;
    for (size_t i = 0; i < (offsetof(QexParticleEx, animation) - offsetof(QexParticleEx, age)) / 4; ++i)
        if (!(std::fabs(a[i] - b[i]) <= 1e-5f * (1 + std::fabs(b[i]))))
            text << "word " << i + 1 << " is " << a[i] << ", not " << b[i] << "; ";
    if (p.active != m.active) text << "active " << p.active << "; ";
    if (p.animation != m.animation) text << "another animation; ";
    if (p.frame != m.frame) text << "frame " << p.frame << ", not " << m.frame << "; ";
    if (p.billboard != m.billboard) text << "another billboard; ";
    return text.str();
}

class EmitterTest : public NullRenderTest {
  protected:
    void SetUp() override {
        NullRenderTest::SetUp();
        quiet_ = std::make_unique<Capture>(STDERR_FILENO);
        emitter_ = QexParticleEmitter_Create();
        GetRandomNumber();  // seeds the source by the clock the first time
        srand48(kSeed);
    }
    void TearDown() override {
        QexParticleEmitter_Release(emitter_);
        EXPECT_EQ(g_BillboardCount, 0);
        quiet_.reset();
        NullRenderTest::TearDown();
    }
    void SetEverything() {
        QexParticleEmitter& e = *emitter_;
        e.emissionRate[0] = 0.7f, e.emissionRate[1] = 2.6f;
        e.lifetime[0] = 0.25f, e.lifetime[1] = 3;
        e.colors[1] = {0.5f, 0.25f, 0, 1}, e.colors[2] = {0, 0, 1, 0.5f};
        e.colorCount = 3;
        e.startOpacity = 0.75f, e.endOpacity = 0.25f;
        e.scaleMin = {1, 2, 3}, e.scaleMax = {2, 2, 5};
        e.scaleFactor = 1.01f;
        e.rotationMin = {-90, 0, 10}, e.rotationMax = {90, 0, 20};
        e.angularVelocityMin = {0, -5, 1}, e.angularVelocityMax = {0, 5, 2};
        e.angularAccelerationMin = {3, 0, -2}, e.angularAccelerationMax = {4, -1, -1};
        e.position = {100, 200, 300}, e.positionSpread = {10, 0, 30};
        e.accelerationMax = {5, -90, 0};
        e.animations[0] = {{&frames_[0], &frames_[1], &frames_[2]}, 3, 0.1f, 1};
        e.animations[1] = {{&frames_[3], &frames_[4]}, 2, 0.2f, 0};
        e.animationCount = 2;
    }
    // Updates both, compares all of their particles, and keeps the largest number of them.
    void Run(int updates, float elapsed) {
        Model model(emitter_);
        for (int i = 0; i < updates; ++i) {
            model.Update(elapsed);
            QexParticleEmitter_Update(emitter_, elapsed, nullptr);
            const size_t count = model.particles.size();
            ASSERT_EQ(static_cast<size_t>(emitter_->particleCount), count) << "after update " << i;
            ASSERT_EQ(static_cast<size_t>(g_BillboardCount), count);
            ASSERT_NEAR(emitter_->accumulator, model.due, 1e-4f);
            for (size_t k = 0; k < count; ++k) {
                const QexParticleEx& p = emitter_->particles[k];
                QexParticleEx& m = model.particles[k];
                if (!m.billboard) m.billboard = p.billboard;
                ASSERT_EQ(Difference(p, m), "") << "particle " << k << " after update " << i;
                ASSERT_EQ(p.billboard->texture, p.animation->frames[0]);
            }
            most_ = std::max(most_, count);
        }
    }

    QexParticleEmitter* emitter_ = nullptr;
    QexTexture frames_[5] = {};
    size_t most_ = 0;
    std::unique_ptr<Capture> quiet_;
};

TEST_F(EmitterTest, FollowsTheModel) {
    SetEverything();
    Run(1000, 1 / 30.0f);
    EXPECT_GT(most_, 60u);
    EXPECT_LT(most_, 299u);
}

TEST_F(EmitterTest, EndlessParticlesFillAllSlotsButOne) {
    SetEverything();
    emitter_->lifetime[1] = -2;
    emitter_->emissionRate[1] = 40;
    Run(100, 0.01f);
    EXPECT_EQ(most_, 299u);
    EXPECT_EQ(emitter_->particles[298].opacity, 0.5f);
}

TEST_F(EmitterTest, EmitsWhatIsDueUntilItsEnd) {
    QexParticleEmitter& e = *emitter_;
    const auto counts = [&](int updates) {
        std::string text;
        for (int i = 0; i < updates; ++i) {
            QexParticleEmitter_Update(&e, 0.25f, nullptr);
            text += std::to_string(e.particleCount) + " ";
        }
        return text;
    };
    e.currentRate = e.emissionRate[0] = e.emissionRate[1] = 0.5f;
    EXPECT_EQ(counts(5), "0 1 1 2 2 ");
    e.emitDuration = 0.5f;
    EXPECT_EQ(counts(4), "3 3 3 3 ");
    EXPECT_EQ(e.emitting, 0);
    e.emitting = 1;
    e.emitDuration = 0;
    e.currentRate = 1;
    EXPECT_EQ(counts(3), "4 4 4 ");
    EXPECT_EQ(e.emitting, 0);
    // More than can be counted, and numbers that the application got wrong.
    e.emitting = 1;
    e.emitDuration = -1;
    e.currentRate = 1e30f;
    e.colorCount = e.animationCount = 1000;
    e.animations[0].frameCount = 50;
    e.animations[0].loop = 1;
    EXPECT_EQ(counts(2), "299 299 ");
    e.particleCount = 5000;
    QexParticleEmitter_Update(&e, 0.25f, nullptr);
    EXPECT_LE(e.particleCount, 300);
}

TEST_F(EmitterTest, DrawsItsParticlesInOrder) {
    QexParticleEmitter& e = *emitter_;
    QexTexture frames[3] = {};
    for (uint32_t i = 0; i < 3; ++i) {
        frames[i].glName = 100 + i;
        frames[i].width = 8 << i;
        frames[i].height = 4;
        e.animations[0].frames[i] = &frames[i];
    }
    e.animations[0].frameCount = 3;
    e.animations[0].frameDuration = 1;
    e.currentRate = e.emissionRate[0] = e.emissionRate[1] = 1;
    e.lifetime[0] = e.lifetime[1] = 4;
    e.velocityMin = e.velocityMax = {2, 0, 0};
    e.accelerationMin = e.accelerationMax = {0, 0, 0};
    e.scaleMin = e.scaleMax = {3, 5, 1};
    const QexCamera camera = PixelCamera();
    for (int i = 0; i < 3; ++i) QexParticleEmitter_Update(&e, 1, nullptr);
    e.emitting = 0;
    const GLCalls calls([&] { QexParticleEmitter_Draw(&e, &camera); });
    const auto masks = calls.Of({"glDepthMask", "glDrawElements"});
    ASSERT_EQ(masks.size(), 5u);
    EXPECT_EQ(masks.front()->argument[0].i, 0);
    EXPECT_EQ(masks.back()->argument[0].i, 1);
    const auto opacities = calls.Of({"glUniform1f"}), matrices = calls.Of({"glUniformMatrix4fv"});
    for (int k = 0; k < 3; ++k) {
        // The oldest comes first; it was updated twice after its birth. Its first update came at age 0.
        const int updates = 2 - k, frame = std::max(0, updates - 1);
        EXPECT_EQ(opacities.at(static_cast<size_t>(2 * k))->argument[1].f,
                  1 - 0.25f * static_cast<float>(frame));
        const glm::mat4 expected =
            glm::make_mat4(camera.projectionMatrix.m) *
            glm::translate(glm::mat4(1), glm::vec3(2.0f * static_cast<float>(updates), 0, 0)) *
            glm::scale(glm::mat4(1), glm::vec3(3 * (8 << frame), 5 * 4, 1));
        EXPECT_TRUE(SameMatrix(matrices.at(static_cast<size_t>(k))->data, expected)) << k;
    }
    QexParticleSet set;
    QexParticleSet_Create(&set, nullptr, nullptr, 10, 1, 9);
    QexParticleSet_Trigger(&set);
    EXPECT_EQ(CountAllocations([&] {
                  QexParticleEmitter_Update(&e, 1, nullptr);
                  QexParticleEmitter_Draw(&e, &camera);
                  QexParticleSet_Update(&set, 0.5f, &camera, nullptr);
                  QexParticleSet_Draw(&set);
              }).made,
              0);
    QexParticleSet_Release(&set);
    // The youngest has just reached its lifetime at the fourth.
    for (int i = 0; i < 5; ++i) QexParticleEmitter_Update(&e, 1, nullptr);
    EXPECT_EQ(e.particleCount, 0);
    EXPECT_EQ(g_BillboardShaderProgramID, 0u);
    EXPECT_EQ(GLCalls([&] { QexParticleEmitter_Draw(&e, &camera); }).Size(), 0u);
    const std::string log = quiet_->Text();
    EXPECT_NE(log.find("I/Emitter: particles=2, Active=1\n"), std::string::npos);
    EXPECT_NE(log.find("I/Emitter: particles=3, Active=0\n"), std::string::npos);
    EXPECT_NE(log.find("I/Particle emitter: Particle Count = 3\n"), std::string::npos);
}

// The file knows no textures; until the application sets them, particles show the default one.
TEST_F(EmitterTest, RunsFromAFile) {
    emitter_->currentRate = 3;
    const std::string path = OutputPath("emitter.bin");
    ASSERT_EQ(QexParticleEmitter_WriteToBinFile(emitter_, path.c_str()), 0);
    QexParticleEmitter_Release(emitter_);
    emitter_ = QexParticleEmitter_CreateFromBinFile(path.c_str());
    ASSERT_TRUE(emitter_);
    const QexCamera camera = PixelCamera();
    for (int i = 0; i < 2; ++i) QexParticleEmitter_Update(emitter_, 1, nullptr);
    const GLCalls calls([&] { QexParticleEmitter_Draw(emitter_, &camera); });
    EXPECT_EQ(calls.Of({"glDrawElements"}).size(), 3u);
    EXPECT_EQ(calls.Of({"glBindTexture"}).at(0)->argument[1].i, Qextexture_GetDefault()->glName);
    // What cannot be drawn is left out.
    QexParticleEmitter_Draw(nullptr, &camera);
    QexParticleEmitter_Update(nullptr, 1, nullptr);
    QexParticleEx_Update(nullptr, 1);
    QexParticleEmitter_Release(nullptr);
    QexBillboard_Release(emitter_->particles[1].billboard);
    emitter_->particles[1].billboard = nullptr;
    const GLCalls fewer([&] { QexParticleEmitter_Draw(emitter_, &camera); });
    EXPECT_EQ(fewer.Of({"glDrawElements"}).size(), 2u);
}

}  // namespace
