// Particle sets and emitters.
#include <GLES2/gl2.h>

#include <cmath>
#include <cstdlib>
#include <cstring>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

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
    struct Point {
        int x, y, half;  // the middle from the upper left, half the size
        Rgba colour;     // of the lower left half of the mask
    };
    const std::pair<float, std::vector<Point>> frames[] = {
        {0,
         {{34, 74, 16, {255, 128, 0, 204}},
          {74, 34, 16, {255, 128, 0, 204}},
          {104, 54, 16, {255, 128, 0, 204}}}},
        {1, {{42, 74, 9, {191, 96, 64, 134}}, {74, 50, 4, {128, 64, 128, 77}}}},
        {1.5f, {{46, 74, 6, {159, 80, 96, 104}}, {74, 58, 1, {64, 32, 191, 32}}}}};
    for (const auto& [time, points] : frames) {
        if (time > 0) Update(time - set_.time, &model);
        Clear();
        QexParticleSet_Draw(&set_);
        Picture expected;
        for (const auto& [x, y, half, c] : points) {
            expected.Fill(x, y - half, x + half, y, {c[0], c[1], c[2], c[3] * 128 / 255});
            expected.Fill(x - half, y, x + half, y + half, c);
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
    // All sets share the program, so the last point size holds.
    const GLCalls creation([&] { ASSERT_EQ(QexParticleSet_Create(&other, nullptr, nullptr, 0, 9, 1), 0); });
    EXPECT_EQ(creation.Of({"glLinkProgram"}).size(), 0u);
    EXPECT_EQ(creation.Of({"glUniform1f"}).size(), 1u);
    uint32_t count = 0;
    EXPECT_EQ(QexParticleSet_GetBuffer(&set_, nullptr, &count), 0);
    EXPECT_EQ(count, 3u);
    QexParticleSet_Trigger(&set_);
    QexParticleSet_Draw(&set_);
    QexRenderState_ActiveTexture(GL_TEXTURE2);
    QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
    glDisable(GL_DEPTH_TEST);
    glDepthMask(GL_FALSE);
    EXPECT_EQ(
        StateChange([&] { Update(0.1f), QexParticleSet_Draw(&set_); }),
        "activeUnit: 2 -> 3\ndepthTest: 0 -> 1\ndepthMask: 0 -> 1\ndepthFunc: GL_ALWAYS -> GL_LEQUAL\n");
    QexParticleSet_Release(&set_);
    QexParticleSet_Release(&set_);
    EXPECT_NE(LiveObjects(), before);
    QexParticleSet_Release(&other);
    EXPECT_EQ(LiveObjects(), before);
}

constexpr long kSeed = 20240229;

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
    QexParticleEmitter* emitter_ = nullptr;
    QexTexture frames_[5] = {};
    std::unique_ptr<Capture> quiet_;
};

TEST_F(EmitterTest, ParticlesBeginWithinTheirRanges) {
    QexParticleEmitter& e = *emitter_;
    e.emissionRate[0] = 0.7f, e.emissionRate[1] = 2.6f;
    e.lifetime[0] = 0.25f, e.lifetime[1] = 3;
    e.colors[1] = {0.5f, 0.25f, 0, 1}, e.colors[2] = {0, 0, 1, 0.5f};
    e.colorCount = 3;
    e.scaleMin = {1, 2, 3}, e.scaleMax = {2, 2, 5};
    e.rotationMin = {-90, 0, 10}, e.rotationMax = {90, 0, 20};
    e.angularVelocityMin = {0, -5, 1}, e.angularVelocityMax = {0, 5, 2};
    e.angularAccelerationMin = {3, 0, -2}, e.angularAccelerationMax = {4, -1, -1};
    e.position = {100, 200, 300}, e.positionSpread = {10, 0, 30};
    e.accelerationMax = {5, -90, 0};
    e.animations[0] = {{&frames_[0], &frames_[1], &frames_[2]}, 3, 0.1f, 1};
    e.animations[1] = {{&frames_[3], &frames_[4]}, 2, 0.2f, 0};
    e.animationCount = 2;
    e.currentRate = 1;
    // The source's state after srand48, and its numbers in the order in which they are taken.
    unsigned short state[3] = {0x330E, kSeed & 0xFFFF, kSeed >> 16};
    const auto random = [&] { return static_cast<float>(nrand48(state)) * 4.656613e-10f; };
    const auto value = [&](float low, float high) {
        return low < high ? low + (high - low) * random() : low;
    };
    QexParticleEmitter_Update(&e, 0.1f, nullptr);
    ASSERT_EQ(e.particleCount, 1);
    const QexParticleEx& p = e.particles[0];
    EXPECT_NEAR(e.currentRate, value(0.7f, 2.6f), 1e-5f);
    EXPECT_NEAR(p.lifetime, value(0.25f, 3), 1e-5f);
    EXPECT_EQ(memcmp(&p.color, &e.colors[static_cast<int>(3 * random())], sizeof p.color), 0);
    const struct {
        const QexVec3 &actual, low, high;
    } vectors[] = {{p.scale, e.scaleMin, e.scaleMax},
                   {p.rotation, e.rotationMin, e.rotationMax},
                   {p.angularVelocity, e.angularVelocityMin, e.angularVelocityMax},
                   {p.angularAcceleration, e.angularAccelerationMin, e.angularAccelerationMax},
                   {p.position, {90, 200, 270}, {110, 200, 330}},
                   {p.velocity, e.velocityMin, e.velocityMax},
                   {p.acceleration, e.accelerationMin, e.accelerationMax}};
    for (const auto& v : vectors)
        for (int i = 0; i < 3; ++i)
            EXPECT_NEAR((&v.actual.x)[i], value((&v.low.x)[i], (&v.high.x)[i]), 1e-4f)
                << &v - vectors << " " << i;
    EXPECT_EQ(p.animation, &e.animations[static_cast<int>(2 * random())]);
    EXPECT_EQ(p.frame, p.animation->loop ? static_cast<int>(3 * random()) : 0);
    EXPECT_EQ(p.billboard->texture, p.animation->frames[0]);
}

TEST_F(EmitterTest, ParticlesMoveFadeAndChangeTheirPicture) {
    QexParticleAnimation animation = {{&frames_[0], &frames_[1], &frames_[2]}, 3, 0.25f, 1};
    QexParticleEx p = {};
    p.active = 1;
    p.lifetime = 2;
    p.startOpacity = 1;
    p.scale = {1, 2, 4}, p.scaleFactor = 0.5f;
    p.rotation = {10, 20, 30}, p.angularVelocity = {1, 2, 3}, p.angularAcceleration = {2, 0, -2};
    p.position = {1, 1, 1}, p.velocity = {4, 0, -4}, p.acceleration = {0, 2, 0};
    p.animation = &animation;
    const struct {
        float opacity;
        QexVec3 scale, rotation, position;
        int frame;
    } expected[] = {{1, {0.5f, 1, 2}, {11, 21, 31}, {3, 1.5f, -1}, 0},
                    {0.75f, {0.25f, 0.5f, 1}, {12.5f, 22, 31.5f}, {5, 2.5f, -3}, 1},
                    {0.5f, {0.125f, 0.25f, 0.5f}, {14.5f, 23, 31.5f}, {7, 4, -5}, 2},
                    {0.25f, {0.0625f, 0.125f, 0.25f}, {17, 24, 31}, {9, 6, -7}, 0}};
    for (const auto& after : expected) {
        QexParticleEx_Update(&p, 0.5f);
        EXPECT_EQ(p.opacity, after.opacity);
        EXPECT_EQ(memcmp(&p.scale, &after.scale, sizeof p.scale), 0) << p.scale.x;
        EXPECT_EQ(memcmp(&p.rotation, &after.rotation, sizeof p.rotation), 0) << p.rotation.x;
        EXPECT_EQ(memcmp(&p.position, &after.position, sizeof p.position), 0) << p.position.x;
        EXPECT_EQ(p.frame, after.frame);
    }
    EXPECT_EQ(p.active, 1u);
    QexParticleEx_Update(&p, 0.5f);
    EXPECT_EQ(p.active, 0u);
    // Once through, the last picture stays.
    animation.loop = 0;
    p.active = 1, p.age = 1, p.frame = 2, p.frameAge = 0;
    QexParticleEx_Update(&p, 0.5f);
    EXPECT_EQ(p.frame, 2);
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
    // More than can be counted, endless ones, and numbers that the application got wrong.
    e.lifetime[1] = -2;
    e.startOpacity = 0.75f, e.endOpacity = 0.25f;
    e.emitting = 1;
    e.emitDuration = -1;
    e.currentRate = 1e30f;
    e.colorCount = e.animationCount = 1000;
    e.animations[0].frameCount = 50;
    e.animations[0].loop = 1;
    EXPECT_EQ(counts(2), "299 299 ");
    EXPECT_EQ(g_BillboardCount, 299);
    EXPECT_EQ(e.particles[298].opacity, 0.5f);
    e.particleCount = 5000;
    QexParticleEmitter_Update(&e, 0.25f, nullptr);
    EXPECT_LE(e.particleCount, 300);
}

TEST_F(EmitterTest, DrawsItsParticlesInOrder) {
    QexParticleEmitter& e = *emitter_;
    for (uint32_t i = 0; i < 3; ++i) {
        frames_[i].glName = 100 + i;
        frames_[i].width = 8 << i;
        frames_[i].height = 4;
        e.animations[0].frames[i] = &frames_[i];
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
    // The youngest has just reached its lifetime at the fourth.
    for (int i = 0; i < 6; ++i) QexParticleEmitter_Update(&e, 1, nullptr);
    EXPECT_EQ(e.particleCount, 0);
    EXPECT_EQ(g_BillboardShaderProgramID, 0u);
    EXPECT_EQ(GLCalls([&] { QexParticleEmitter_Draw(&e, &camera); }).Size(), 0u);
    const std::string log = quiet_->Text();
    for (const char* line : {"I/Emitter: particles=2, Active=1\n", "I/Emitter: particles=3, Active=0\n",
                             "I/Particle emitter: Particle Count = 3\n"})
        EXPECT_NE(log.find(line), std::string::npos) << line;
}

// As those of a file, before the application sets their textures; what cannot be drawn is left out.
TEST_F(EmitterTest, DrawsWithoutTexturesAndBillboards) {
    emitter_->currentRate = 3;
    emitter_->animations[0].frames[0] = nullptr;
    const QexCamera camera = PixelCamera();
    for (int i = 0; i < 2; ++i) QexParticleEmitter_Update(emitter_, 1, nullptr);
    QexBillboard_Release(emitter_->particles[1].billboard);
    emitter_->particles[1].billboard = nullptr;
    const GLCalls calls([&] { QexParticleEmitter_Draw(emitter_, &camera); });
    EXPECT_EQ(calls.Of({"glDrawElements"}).size(), 2u);
    EXPECT_EQ(calls.Of({"glBindTexture"}).at(0)->argument[1].i, Qextexture_GetDefault()->glName);
    QexParticleEmitter_Draw(nullptr, &camera);
    QexParticleEmitter_Update(nullptr, 1, nullptr);
    QexParticleEx_Update(nullptr, 1);
    QexParticleEmitter_Release(nullptr);
}

}  // namespace
