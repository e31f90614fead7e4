// Sky and water: what is seen where against rays worked out with glm, the clip at the water, the state left
// behind, what is released.
#include <dlfcn.h>
#include <GLES2/gl2.h>

#include "scenes/Scenes.h"
#include "support/Capture.h"
#include "support/RenderScenes.h"

static int s_linkToFail;   // counts down; 0: all programs link
static bool s_incomplete;  // no framebuffer is complete

// Both stand before the tap's.
extern "C" void glLinkProgram(GLuint program) {
    static const auto next = reinterpret_cast<void (*)(GLuint)>(dlsym(RTLD_NEXT, "glLinkProgram"));
    if (!s_linkToFail || --s_linkToFail) next(program);
}
extern "C" GLenum glCheckFramebufferStatus(GLenum target) {
    static const auto next =
        reinterpret_cast<GLenum (*)(GLenum)>(dlsym(RTLD_NEXT, "glCheckFramebufferStatus"));
    return s_incomplete ? GL_FRAMEBUFFER_UNSUPPORTED : next(target);
}

namespace {

constexpr int kTarget = 256;
// As far as half floats, which a GL may take for mediump, no longer tell corners from the far plane.
constexpr float kSky = 4000, kWaterLevel = 2;
const Rgba kWhite = {255, 255, 255, 255};
const char kLine[] = "T0:1.000000, S0:0.001200, T1:0.000000, S1:0.000500\n";

// A cube map whose texels hold their direction; the GL's own table of faces: major axis, s and t.
QexTexture DirectionCube() {
    constexpr int kSize = 32;
    const glm::vec3 faces[6][3] = {{{1, 0, 0}, {0, 0, -1}, {0, -1, 0}}, {{-1, 0, 0}, {0, 0, 1}, {0, -1, 0}},
                                   {{0, 1, 0}, {1, 0, 0}, {0, 0, 1}},   {{0, -1, 0}, {1, 0, 0}, {0, 0, -1}},
                                   {{0, 0, 1}, {1, 0, 0}, {0, -1, 0}},  {{0, 0, -1}, {-1, 0, 0}, {0, -1, 0}}};
    QexTexture cube = {};
    QexTexture_GenerateNormalisationCubeMap(&cube, kSize);
    for (GLenum face = 0; face < 6; ++face) {
        std::vector<uint8_t> texels;
        for (int i = 0; i < kSize * kSize; ++i) {
            const float s = (float(i % kSize) + 0.5f) * 2 / kSize - 1,
                        t = (float(i / kSize) + 0.5f) * 2 / kSize - 1;
            const glm::vec3 d = glm::normalize(faces[face][0] + s * faces[face][1] + t * faces[face][2]);
            for (int c = 0; c < 3; ++c) texels.push_back(static_cast<uint8_t>(127.5f + 127.5f * d[c]));
        }
        glTexImage2D(GL_TEXTURE_CUBE_MAP_POSITIVE_X + face, 0, GL_RGB, kSize, kSize, 0, GL_RGB,
                     GL_UNSIGNED_BYTE, texels.data());
    }
    return cube;
}

// What a ray from a place in the cube, counted from its centre, meets.
Rgba SkyColour(const glm::vec3& ray, const glm::vec3& from = glm::vec3(0)) {
    const glm::vec3 walls = (glm::sign(ray) * kSky / 2.0f - from) / ray;
    const glm::vec3 wall = from + ray * std::min({walls.x, walls.y, walls.z});
    const glm::ivec3 c(127.5f - 127.5f * glm::normalize(wall));
    return {c.x, c.y, c.z, 255};
}

pod::Scene Boxes(const std::vector<std::array<glm::vec3, 2>>& boxes) {
    std::vector<scenes::Object> objects;
    for (const auto& [centre, half] : boxes) {
        pod::MeshArrays cube = scenes::Cube();
        for (pod::Vec3& p : cube.positions)
            for (int c = 0; c < 3; ++c) p[size_t(c)] *= half[c];
        objects.push_back({"box", cube, {centre.x, centre.y, centre.z}});
    }
    return scenes::Still(objects);
}

struct SceneCall {
    QexSkyBox* sky;
    glm::mat4 view, projection;
    uint32_t culled;
};
std::vector<SceneCall> s_calls;
QexModel* s_model;

void DrawBoxes(QexSkyBox* sky, const QexMatrix* view, const QexMatrix* projection) {
    gltapState state;
    gltapGetState(&state);
    s_calls.push_back({sky, glm::make_mat4(view->m), glm::make_mat4(projection->m), state.cullFaceMode});
    if (s_model) QexModel_RenderWithViewProjection(s_model, nullptr, nullptr, view, projection, 0);
}

class SkyTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        before_ = LiveObjects();
        cube_ = DirectionCube();
        Look({30, 22, 60}, {0, 5, 0});
        QexCamera_Project(&camera_, 0.9f, float{kWidth} / kHeight, 1, kSky);
        sky_.skyTexture = &cube_;
        sky_.size = kSky;
        sky_.waterEnabled = 1;
        sky_.camera = &camera_;
        sky_.waterHeight = -kWaterLevel;
        sky_.drawScene = DrawBoxes;
        s_calls.clear();
    }
    void TearDown() override {
        QexSkyBox_Release();
        QexSkyBox_Release();
        s_model = nullptr;
        QexTexture_Release(&cube_);
        EXPECT_EQ(LiveObjects(), before_);
        RenderTest::TearDown();
    }
    void Look(glm::vec3 eye, glm::vec3 target, glm::vec3 up = {0, 1, 0}) {
        const QexVec3 e = {eye.x, eye.y, eye.z}, t = {target.x, target.y, target.z}, u = {up.x, up.y, up.z};
        QexCamera_LookAt(&camera_, &e, &t, &u);
    }
    // What the frame printed.
    std::string Update() {
        Capture out(STDOUT_FILENO);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
        QexSkyBox_Update(&runtime_, &sky_, 0);
        return out.Text();
    }
    glm::mat4 View() const { return glm::make_mat4(camera_.viewMatrix.m); }
    glm::mat4 Projection() const { return glm::make_mat4(camera_.projectionMatrix.m); }
    // The direction of a pixel of a picture of w x h, y counted from below.
    glm::vec3 Ray(double x, double y, int w, int h) const {
        const glm::dvec4 far = glm::inverse(glm::dmat4(Projection()) * glm::dmat4(View())) *
                               glm::dvec4(2 * (x + 0.5) / w - 1, 2 * (y + 0.5) / h - 1, 1, 1);
        return glm::normalize(glm::vec3(glm::dvec3(far) / far.w) - Eye());
    }
    glm::vec3 Eye() const { return {camera_.eye.x, camera_.eye.y, camera_.eye.z}; }

    // The reflection texture of the next frame, the lowest row first.
    std::vector<Rgba> Reflection() {
        const GLCalls calls([this] { Update(); });
        glBindFramebuffer(GL_FRAMEBUFFER, GLuint(calls.Of({"glBindFramebuffer"})[0]->argument[1].i));
        return ReadTarget();
    }
    std::vector<Rgba> ReadTarget() {
        std::vector<uint8_t> bytes(kTarget * kTarget * 4);
        glReadPixels(0, 0, kTarget, kTarget, GL_RGBA, GL_UNSIGNED_BYTE, bytes.data());
        glBindFramebuffer(GL_FRAMEBUFFER, 0);
        std::vector<Rgba> pixels;
        for (size_t i = 0; i < bytes.size(); i += 4)
            pixels.push_back({bytes[i], bytes[i + 1], bytes[i + 2], bytes[i + 3]});
        return pixels;
    }
    long White(const std::vector<Rgba>& pixels) { return std::count(pixels.begin(), pixels.end(), kWhite); }
    // The scene mirrored in the water, drawn without the sky box.
    std::vector<Rgba> DirectMirror() {
        const glm::mat4 mirror =
            glm::scale(glm::translate(glm::mat4(1), {0, 2 * kWaterLevel, 0}), {1, -1, 1});
        const QexMatrix view = ToQex(View() * mirror);
        QexRenderTarget target;
        QexRenderTarget_Create(&target, kTarget, kTarget, 0);
        QexRenderTarget_BeginScene(&target);
        Clear();
        QexRenderer_SetBackFaceCulling(QEX_CULL_FRONT);
        QexModel_RenderWithViewProjection(s_model, nullptr, nullptr, &view, &camera_.projectionMatrix, 0);
        const std::vector<Rgba> pixels = ReadTarget();
        glViewport(0, 0, kWidth, kHeight);
        QexRenderTarget_Release(&target);
        return pixels;
    }

    std::string before_;
    QexTexture cube_ = {};
    QexCamera camera_ = {};
    QexSkyBox sky_ = {};
};

TEST_F(SkyTest, CubeHasSixFacesAroundTheCamera) {
    // The vertices are those of the picture below; their coordinates keep off the edges where asked.
    for (const int inset : {0, 1}) {
        float *vertices, *coords;
        QexSky_NewVertices(10, inset, 512, &vertices, &coords);
        for (int v = 0; v < 24; ++v) {
            const float low = inset ? 4 / 512.0f : 0;
            EXPECT_EQ(coords[2 * v], v % 2 ? 1 - low : low) << v;
            EXPECT_EQ(coords[2 * v + 1], v % 4 < 2 ? 1 - low : low) << v;
        }
        EXPECT_EQ(glm::make_vec3(vertices), glm::vec3(-10, 10, -10));
        QexMemory_Free(vertices);
        QexMemory_Free(coords);
    }
    sky_.waterEnabled = 0;
    ASSERT_EQ(QexSkyBox_Create(&sky_), 0);
    sky_.centre = camera_.eye;
    std::vector<glm::vec3> looks;
    for (int i = 0; i < 27; ++i) looks.push_back({i % 3 - 1, i / 3 % 3 - 1, i / 9 - 1});
    looks.erase(looks.begin() + 13);  // nowhere
    for (const glm::vec3& look : looks) {
        Look(Eye(), Eye() + look,
             std::fabs(look.y) == glm::length(look) ? glm::vec3(1, 0, 0) : glm::vec3(0, 1, 0));
        EXPECT_EQ(Update(), "");
        const Picture picture = Read();
        for (int y = 0; y < kHeight; y += 5)
            for (int x = 0; x < kWidth; x += 5)
                EXPECT_TRUE(
                    Near(picture.Pixel(x, kHeight - 1 - y), SkyColour(Ray(x, y, kWidth, kHeight)), 6));
    }
}

TEST_F(SkyTest, WaterMirrorsSceneAndSky) {
    // Far from the origin.
    const glm::vec3 place(700, 0, -900);
    Look(Eye() + place, glm::vec3(0, 5, 0) + place);
    const LoadedModel boxes(Boxes(
        {{place + glm::vec3(-6, 16, 0), glm::vec3(4, 6, 4)}, {place + glm::vec3(10, 8, -10), glm::vec3(3)}}));
    s_model = const_cast<QexModel*>(&boxes.model);
    sky_.centre = camera_.eye;
    ScopedTexture flat({128, 255, 128, 255});
    sky_.waterNormalTexture = &flat;
    ASSERT_EQ(QexSkyBox_Create(&sky_), 0);
    const std::vector<Rgba> reflection = Reflection(), direct = DirectMirror();
    EXPECT_GT(White(direct), 1000);
    // Mirrored, the eye looks up from under the water.
    const glm::vec3 up(1, -1, 1), below(0, 2 * (kWaterLevel - Eye().y), 0);
    int wrong = 0;
    const auto index = [](int x, int y) { return size_t(y * kTarget + x); };
    for (int y = 0; y < kTarget; ++y)
        for (int x = 0; x < kTarget; ++x) {
            const Rgba expected =
                direct[index(x, y)] == kWhite ? kWhite : SkyColour(Ray(x, y, kTarget, kTarget) * up, below);
            wrong += !Near(reflection[index(x, y)], expected, 8);
        }
    EXPECT_EQ(wrong, 0);

    // On the screen the same where it shows water, but for the edges of the boxes.
    const Picture picture = Read();
    int water = 0;
    for (int y = 0; y < kHeight; ++y)
        for (int x = 0; x < kWidth; ++x) {
            const float slope = -Ray(x, y, kWidth, kHeight).y;
            const Rgba pixel = picture.Pixel(x, kHeight - 1 - y);
            const Rgba mirrored = reflection[index(x * kTarget / kWidth, y * kTarget / kHeight)];
            if (slope < 0.02f || (pixel == kWhite && mirrored != kWhite)) continue;
            ++water;
            wrong += !Near(pixel, mirrored, 10);
        }
    EXPECT_LT(wrong, water / 20);
    EXPECT_GT(water, 3000);
}

// A normal leaning along x or z shifts the reflection right or up by 30 * n / distance of the picture.
TEST_F(SkyTest, WavesShiftTheReflection) {
    const LoadedModel boxes(
        Boxes({{glm::vec3(-6, 16, 0), glm::vec3(4, 6, 4)}, {glm::vec3(10, 8, -10), glm::vec3(3)}}));
    s_model = const_cast<QexModel*>(&boxes.model);
    sky_.centre = camera_.eye;
    ASSERT_EQ(QexSkyBox_Create(&sky_), 0);
    Update();
    const Picture picture = Read();
    const auto shift = [&](Rgba normal) {
        ScopedTexture leaning(normal);
        sky_.waterNormalTexture = &leaning;
        Update();
        const Picture shown = Read();
        glm::dvec3 sum(0);
        for (int y = 0; y < kHeight; ++y)
            for (int x = 0; x < kWidth; ++x)
                if (shown.Pixel(x, y) == kWhite && picture.Pixel(x, y) != kWhite) sum += glm::dvec3(x, y, 1);
        return glm::dvec2(sum) / sum.z;
    };
    const double n = 2 * 140 / 255.0 - 1, distance = 60;
    const glm::dvec2 right = shift({140, 255, 128, 255}), left = shift({115, 255, 128, 255});
    const glm::dvec2 higher = shift({128, 255, 140, 255}), lower = shift({128, 255, 115, 255});
    EXPECT_GT(right.x - left.x, 30 * n / distance * kWidth * 0.8);
    EXPECT_GT(lower.y - higher.y, 30 * n / distance * kHeight * 0.8);
}

TEST_F(SkyTest, WhatIsUnderWaterIsNotReflected) {
    ASSERT_EQ(QexSkyBox_Create(&sky_), 0);
    const struct {
        float low, high;
        bool visible;
    } cases[] = {{3, 8, true}, {0, 1.5f, true}, {-6, -0.7f, false}, {-40, -30, false}};
    // The nearest near plane from high above, the farthest from just above the water.
    const std::pair<float, glm::vec3> views[] = {
        {1.0f, {30, 22, 60}}, {0.1f, {1, 80, 20}}, {5.0f, {30, 22, 60}}, {5.0f, {10, 3.5f, 60}}};
    for (const auto& [zNear, eye] : views) {
        Look(eye, {0, 0, 0});
        QexCamera_Project(&camera_, 0.9f, float{kWidth} / kHeight, zNear, kSky);
        for (const auto& c : cases) {
            const LoadedModel box(Boxes({{{{0, (c.low + c.high) / 2, 0}, {6, (c.high - c.low) / 2, 6}}}}));
            s_model = const_cast<QexModel*>(&box.model);
            const long seen = White(Reflection());
            EXPECT_TRUE(c.visible ? seen > 100 : seen == 0) << c.low << " " << zNear << ": " << seen;
        }
    }
    s_model = nullptr;
    s_calls.clear();
    Look({30, 22, 60}, {0, 5, 0});
    QexCamera_Project(&camera_, 0.9f, float{kWidth} / kHeight, 2, 500);
    Update();
    ASSERT_EQ(s_calls.size(), 2u);
    // Lengyel's formula with the transposed inverse, in doubles.
    const glm::vec4 depth = 500.0f * glm::transpose(s_calls[0].projection)[2];
    EXPECT_LT(glm::distance(depth, {0, -0.2101923f, 0.9467328f, -3.794644f}), 1e-3f);
    EXPECT_TRUE(SameMatrix(&s_calls[1].view, View()));
    EXPECT_TRUE(SameMatrix(&s_calls[1].projection, Projection()));
    for (const size_t i : {0, 1}) {
        EXPECT_EQ(s_calls[i].sky, &sky_);
        EXPECT_EQ(s_calls[i].culled, uint32_t(i ? GL_BACK : GL_FRONT));
    }
}

TEST_F(SkyTest, DrawsWaterOnlyWhereItIsSeenAndLeavesTheStateAsDescribed) {
    ASSERT_EQ(QexSkyBox_Create(&sky_), 0);
    const struct {
        glm::vec3 eye, look, up;
        int32_t enabled;
        int strips, fans;
    } cases[] = {
        {{0, 20, 0}, {0, 0, -1}, {0, 1, 0}, 1, 12, 2}, {{0, 20, 0}, {0, -1, 0}, {0, 0, -1}, 1, 12, 2},
        {{0, 20, 0}, {0, 1, 0}, {0, 0, 1}, 1, 12, 0},  {{0, 1, 0}, {0, 0, -1}, {0, 1, 0}, 1, 12, 0},
        {{0, 20, 0}, {0, 0, -1}, {0, 1, 0}, 0, 6, 0},  {{0, 20, 0}, {0, 0, -1}, {0, 1, 0}, 2, 6, 0}};
    QexRenderTarget outer;
    QexRenderTarget_Create(&outer, 64, 64, 0);
    glBindFramebuffer(GL_FRAMEBUFFER, outer.framebuffer);
    for (const auto& c : cases) {
        Look(c.eye, c.eye + c.look, c.up);
        sky_.waterEnabled = c.enabled;
        Update();
        glViewport(5, 6, 50, 40);
        std::unique_ptr<GLCalls> calls;
        std::string printed;
        const std::string change =
            StateChange([&] { calls = std::make_unique<GLCalls>([&] { printed = Update(); }); });
        const bool water = c.enabled == 1;
        EXPECT_EQ(printed, water ? kLine : "");
        EXPECT_EQ(
            change,
            water
                ? "viewport[0]: 5 -> 0\nviewport[1]: 6 -> 0\nviewport[2]: 50 -> 128\nviewport[3]: 40 -> 96\n"
                : "");
        std::string bound;
        for (const gltapCall* call : calls->Of({"glBindFramebuffer"}))
            bound += call->argument[1].i == outer.framebuffer ? '.' : '?';
        EXPECT_EQ(bound, water ? "??.." : "");
        int strips = 0, fans = 0;
        for (const gltapCall* call : calls->Of({"glDrawArrays"})) {
            strips += call->argument[0].i == GL_TRIANGLE_STRIP;
            fans += call->argument[0].i == GL_TRIANGLE_FAN;
        }
        EXPECT_EQ(strips, c.strips);
        EXPECT_EQ(fans, c.fans);
    }
    gltapState state;
    gltapGetState(&state);
    EXPECT_TRUE(state.cullFace);
    EXPECT_EQ(state.cullFaceMode, uint32_t{GL_BACK});
    EXPECT_EQ(state.depthFunc, uint32_t{GL_LEQUAL});
    EXPECT_EQ(state.arrayBuffer, 0u);
    EXPECT_EQ(state.attributeArrays, 0u);
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glViewport(0, 0, kWidth, kHeight);
    QexRenderTarget_Release(&outer);
}

TEST_F(SkyTest, FailuresAreSaidAndNothingIsLeft) {
    const std::string own = LiveObjects();
    sky_.waterColour[1] = 1;
    BothOutputs output;
    QexSkyBox broken[3] = {sky_, sky_, sky_};
    broken[0].camera = nullptr;
    broken[1].skyTexture = nullptr;
    EXPECT_EQ(QexSkyBox_Create(nullptr), -1);
    for (int i = 0; i < 2; ++i) EXPECT_EQ(QexSkyBox_Create(&broken[i]), -1);
    s_incomplete = true;
    EXPECT_EQ(QexSkyBox_Create(&sky_), -1);
    s_incomplete = false;
    // Neither after a failure nor with anything missing is there a frame.
    const auto drawn = [this](const QexRuntimeContext* context, QexSkyBox* sky) {
        const GLCalls calls([&] { QexSkyBox_Update(context, sky, 0); });
        return calls.Of({"glDrawArrays"}).size();
    };
    EXPECT_EQ(drawn(&runtime_, &sky_), 0u);
    QexSkyBox_Release();
    EXPECT_EQ(LiveObjects(), own);
    for (int i = 0; i < 4; ++i) {
        s_linkToFail = i + 1;
        EXPECT_EQ(QexSkyBox_Create(&sky_), 0);
        EXPECT_EQ(drawn(&runtime_, &sky_), 0u) << i;
    }
    EXPECT_EQ(QexSkyBox_Create(&sky_), 0) << "once more, the first one released";
    EXPECT_EQ(drawn(nullptr, &sky_) + drawn(&runtime_, nullptr) + drawn(&runtime_, &broken[0]) +
                  drawn(&runtime_, &broken[1]),
              0u);
    gltapState state;
    gltapGetState(&state);
    EXPECT_EQ(glm::make_vec4(state.clearColor), glm::vec4(0, 1, 0, 1));
    EXPECT_EQ(state.framebuffer, 0u);
    QexSkyBox_Release();
    EXPECT_EQ(LiveObjects(), own);
    EXPECT_EQ(m_Tex2DShader.program + m_PlaneTexShader.program, 0u);
    const std::string text = output.Out();
    for (const char* line : {"ERROR: Frame buffer did not set up correctly\n",
                             "ERROR:< LoadWaterShader> link program failed because ", "ERROR:<LoadShaders> "})
        EXPECT_NE(text.find(line), std::string::npos) << line;
}

}  // namespace
