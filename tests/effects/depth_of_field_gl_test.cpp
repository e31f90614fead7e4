// Blur and depth of field against a plain model of both; what the passes bind, and what they leave behind.
#include <GLES2/gl2.h>

#include <algorithm>
#include <cmath>
#include <random>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

// RGBA, the lowest row first, as GL has it.
struct Texels {
    int width, height;
    std::vector<uint8_t> bytes;

    double At(double u, double v, int channel) const {
        const int x = std::clamp(int(std::floor(u)), 0, width - 1);
        const int y = std::clamp(int(std::floor(v)), 0, height - 1);
        return bytes[static_cast<size_t>((y * width + x) * 4 + channel)];
    }
};

Texels Noise(int width, int height) {
    std::minstd_rand random(7);
    Texels texels = {width, height, std::vector<uint8_t>(static_cast<size_t>(width * height * 4))};
    for (uint8_t& byte : texels.bytes) byte = static_cast<uint8_t>(random() >> 8);
    return texels;
}

Texels ReadTarget(const QexRenderTarget& target) {
    Texels texels = {target.viewport[2], target.viewport[3], {}};
    texels.bytes.resize(static_cast<size_t>(texels.width * texels.height * 4));
    glBindFramebuffer(GL_FRAMEBUFFER, target.framebuffer);
    glReadPixels(0, 0, texels.width, texels.height, GL_RGBA, GL_UNSIGNED_BYTE, texels.bytes.data());
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    return texels;
}

// Where unfiltered sampling is not decided by rounding; drivers keep a few binary places of a texel.
bool Inside(double coordinate) {
    const double within = coordinate - std::floor(coordinate);
    return within > 0.05 && within < 0.95;
}

// One pass as described: the texture's size, halved or not, cut to whole units, and one unit more; `size` is
// that of the projection along x and y.
struct Pass {
    const Texels* source;
    glm::dvec2 size;
    bool half, vertical;
    float sigma, samples, blurSize;
};

void ExpectBlurred(const Texels& actual, const Pass& pass, const std::string& where) {
    const glm::dvec2 texture(pass.source->width, pass.source->height);
    const glm::dvec2 shown = pass.half ? texture / 2.0 : texture, whole = glm::floor(shown);
    const int n = pass.samples == 9 ? 4 : pass.samples == 7 ? 3 : pass.samples == 5 ? 2 : 1;
    int checked = 0, wrong = 0;
    for (int y = 0; y < actual.height; ++y)
        for (int x = 0; x < actual.width; ++x) {
            const glm::dvec2 unit = pass.size / glm::dvec2(actual.width, actual.height);
            const double across = (x + 0.5) * unit.x / (whole.x + 1);
            const double up = 1 - (actual.height - y - 0.5) * unit.y / (whole.y + 1);
            const glm::dvec2 centre = glm::dvec2(across, up) * whole / shown * texture;
            const glm::dvec2 step = pass.vertical ? glm::dvec2(0, pass.blurSize * texture.y)
                                                  : glm::dvec2(pass.blurSize * texture.x, 0);
            bool clear = true;
            glm::dvec3 sum(0);
            double weights = 0;
            for (int i = -n; i <= n; ++i) {
                const glm::dvec2 at = centre + step * double(i);
                const double sigma = std::isnan(pass.sigma) ? 0 : pass.sigma;
                const double weight = i == 0 ? 1 : sigma == 0 ? 0 : std::exp(-i * i / (2 * sigma * sigma));
                clear = clear && Inside(at.x) && Inside(at.y);
                for (int c = 0; c < 3; ++c) sum[c] += weight * pass.source->At(at.x, at.y, c);
                weights += weight;
            }
            if (!clear) continue;
            ++checked;
            for (int c = 0; c < 3; ++c) wrong += !(std::fabs(actual.At(x, y, c) - sum[c] / weights) <= 2);
            wrong += actual.At(x, y, 3) != 255;
        }
    EXPECT_EQ(wrong, 0) << where;
    EXPECT_GT(checked, actual.width * actual.height / 2) << where;
}

// What a scene callback was called with, its context and colour apart.
using SceneCall = std::array<const void*, 5>;
std::vector<SceneCall> s_Calls;

// Blocks of colours, half transparent; as depth, strips from black to white.
int32_t DrawBlocks(QexRuntimeContext*, void* user1, void* user2, void* user3, QexShaderModule* shader,
                   QexShaderModule* skinned, const float* colour) {
    s_Calls.push_back({user1, user2, user3, shader, skinned});
    EXPECT_EQ(shader == nullptr, colour == nullptr);
    EXPECT_EQ(colour ? glm::make_vec3(colour) : glm::vec3(1), glm::vec3(1));
    std::minstd_rand random(3);
    glEnable(GL_SCISSOR_TEST);
    for (int i = 0; i < 192; ++i) {
        const float grey = static_cast<float>(i % 16) / 15;
        const auto next = [&] { return static_cast<float>(random() % 256) / 255; };
        glScissor(i % 16 * 8, i / 16 * 8, 8, 8);
        glClearColor(shader ? grey : next(), next(), next(), 0.5f);
        glClear(GL_COLOR_BUFFER_BIT);
    }
    glDisable(GL_SCISSOR_TEST);
    return 5;
}

QexRuntimeContext Screen(int width, int height) {
    QexRuntimeContext screen = {};
    screen.width = width;
    screen.height = height;
    return screen;
}

class PostProcessingTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        before_ = LiveObjects();
        ASSERT_EQ(QexPostProcessing_Initialize(&runtime_), 0);
    }
    void TearDown() override {
        EXPECT_EQ(QexPostProcessing_Finalize(), 0);
        EXPECT_EQ(LiveObjects(), before_);
        RenderTest::TearDown();
    }
    int32_t DrawDOF(float focus, float range, int mode, QexSceneCallback callback = DrawBlocks) {
        return QexPostProcessing_DrawDOF(&runtime_, &runtime_, nullptr, this, callback, focus, range,
                                         1.0f / kWidth, 1.0f / kHeight, 5, 9, mode, 0.25f, 8);
    }

    std::string before_;
};

TEST_F(PostProcessingTest, BlurIsAGaussianAlongRowsThenColumns) {
    const struct {
        int width, height, mode;
        float sigma, samples, pixels;
    } cases[] = {{128, 96, 0, 5, 9, 1},    {128, 96, 2, 2, 7, 1},       {128, 96, 2, 1, 5, 1},
                 {128, 96, 2, 1, 8, 1},    {128, 96, 2, 1, 3, 1},       {101, 75, 0, 1.5f, 9, 1},
                 {101, 75, 2, 3, 9, 1.5f}, {128, 96, 2, -3, 9, 1},      {128, 96, 2, 0, 9, 1},
                 {128, 96, 2, NAN, 9, 1},  {128, 96, 2, 2, NAN, 1},     {128, 96, 2, 2, -9, 1},
                 {128, 96, 2, 2, 0.5f, 1}, {128, 96, 2, INFINITY, 9, 1}};
    // All that could cut into a quad.
    QexRenderer_SetZTestFunc(QEX_DEPTH_NEVER);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BOTH);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ADD_ALPHA);
    for (const auto& c : cases) {
        const QexRuntimeContext screen = Screen(c.width, c.height);
        const bool half = c.mode < 2;
        ASSERT_EQ(QexPostProcessing_Initialize(&screen), 0);
        QexRenderTarget& first = *QexPP_GetRenderTarget(half ? 0 : 3);
        QexRenderTarget& second = *QexPP_GetRenderTarget(half ? 1 : 4);
        const float blurH = c.pixels / static_cast<float>(c.width);
        const float blurV = c.pixels / static_cast<float>(c.height);
        const Texels source = Noise(c.width, c.height);
        ScopedTexture texture(c.width, c.height, source.bytes.data());
        EXPECT_EQ(QexPP_DrawBlurImage(&screen, nullptr, nullptr, nullptr, c.sigma, c.samples, blurH, blurV,
                                      &texture, &first, &second),
                  0);
        const Texels rows = ReadTarget(first), columns = ReadTarget(second);
        const auto where =
            std::to_string(c.sigma) + ", " + std::to_string(c.samples) + ", " + std::to_string(c.mode);
        const glm::dvec2 size = glm::dvec2(c.width, c.height) * (half ? 0.5 : 1.0);
        ExpectBlurred(rows, {&source, size, half, false, c.sigma, c.samples, blurH}, "rows " + where);
        ExpectBlurred(columns, {&rows, size, false, true, c.sigma, c.samples, blurV}, "columns " + where);
    }
}

TEST_F(PostProcessingTest, DepthOfFieldMixesSharpAndBlurred) {
    const struct {
        float focus, range;
        int mode;
    } cases[] = {{0.5f, 0, 1}, {9, 100, 1}, {9, 100, 2}, {0.4f, 1.5f, 0}, {0.4f, 1.5f, 2}, {0.4f, -5, 1}};
    QexRenderer_SetZTestFunc(QEX_DEPTH_NEVER);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BOTH);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    for (const auto& c : cases) {
        Clear(0, 1, 0, 1);
        EXPECT_EQ(DrawDOF(c.focus, c.range, c.mode), 0);
        const Picture picture = Read();
        const Texels sharp = ReadTarget(PostProcessingRenderTargets[2]);
        const Texels depth = ReadTarget(PostProcessingRenderTargets[3]);
        const Texels blurred = ReadTarget(PostProcessingRenderTargets[c.mode < 2 ? 1 : 4]);
        EXPECT_EQ(depth.At(127, 3, 0), 255);
        const glm::dvec2 scale = glm::dvec2(blurred.width, blurred.height) / glm::dvec2(kWidth, kHeight);
        int wrong = 0, checked = 0;
        for (int y = 0; y < kHeight; ++y)
            for (int x = 0; x < kWidth; ++x) {
                const double u = (x + 0.5) * kWidth / (kWidth + 1),
                             v = (1 - (y + 0.5) / (kHeight + 1)) * kHeight;
                const double bu = u * scale.x, bv = v * scale.y;
                if (!Inside(u) || !Inside(v) || !Inside(bu) || !Inside(bv)) continue;
                ++checked;
                const double away = std::fabs(c.focus - depth.At(u, v, 0) / 255);
                const double share = std::clamp(c.range * away, 0.0, 1.0);
                for (int i = 0; i < 4; ++i) {
                    const double mixed = glm::mix(sharp.At(u, v, i), blurred.At(bu, bv, i), share);
                    wrong += std::fabs(picture.Pixel(x, y)[static_cast<size_t>(i)] - mixed) > 2;
                }
            }
        EXPECT_EQ(wrong, 0) << c.focus << " " << c.range << " " << c.mode;
        EXPECT_GT(checked, kWidth * kHeight / 2);
    }
}

TEST_F(PostProcessingTest, PassesInOrderAndNothingElseChanges) {
    QexRenderTarget outer;
    QexRenderTarget_Create(&outer, 64, 64, 0);
    glBindFramebuffer(GL_FRAMEBUFFER, outer.framebuffer);
    glViewport(5, 6, 50, 40);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    DrawDOF(0.5f, 1, 0);
    s_Calls.clear();
    std::string bound;
    for (const int mode : {0, 2}) {
        std::unique_ptr<GLCalls> calls;
        const auto record = [&] { calls = std::make_unique<GLCalls>([&] { DrawDOF(0.5f, 1, mode); }); };
        const std::string change = StateChange(record);
        EXPECT_EQ(change.substr(0, change.find(':')), mode ? "texture2D[2]" : "") << "of the second frame";
        EXPECT_LE(std::count(change.begin(), change.end(), '\n'), mode / 2);
        for (const gltapCall* call : calls->Of({"glBindFramebuffer"})) {
            const auto name = static_cast<uint32_t>(call->argument[1].i);
            char label = name == outer.framebuffer ? '.' : '?';
            for (int i = 0; i < 5; ++i)
                if (name == PostProcessingRenderTargets[i].framebuffer) label = static_cast<char>('0' + i);
            bound += label;
        }
        EXPECT_EQ(calls->Of({"glDrawElements"}).size(), 3u);
    }
    EXPECT_EQ(bound, "2.0.1.3.2.3.4.3.");
    ASSERT_EQ(s_Calls.size(), 4u);
    for (size_t i = 0; i < 4; i += 2) {
        EXPECT_EQ(s_Calls[i], (SceneCall{&runtime_, nullptr, this, nullptr, nullptr}));
        EXPECT_EQ(s_Calls[i + 1],
                  (SceneCall{nullptr, nullptr, nullptr, depthShaderProgram, skinningDepthShaderProgram}));
    }
    for (const QexShaderModule* module : {depthShaderProgram, skinningDepthShaderProgram})
        for (const int slot : {0, 1}) {
            float value = 0;
            glGetUniformfv(module->program, module->slots[slot].location, &value);
            EXPECT_EQ(value, slot ? 8 : 0.25f);
        }
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glViewport(0, 0, kWidth, kHeight);
    QexRenderTarget_Release(&outer);
}

TEST_F(PostProcessingTest, ATargetIsShownAsItIsThroughAnotherOne) {
    QexRenderTarget *source = QexPP_GetRenderTarget(2), *copy = QexPP_GetRenderTarget(4);
    QexPP_DrawNormalScene(&runtime_, nullptr, nullptr, nullptr, DrawBlocks, source);
    QexPP_DrawNormalScene(&runtime_, nullptr, nullptr, nullptr, DrawBlocks, nullptr);
    const Picture scene = Read();
    Clear();
    QexPP_DrawImage(&runtime_, nullptr, nullptr, nullptr, source, copy);
    EXPECT_EQ(Read().Pixel(4, 4), (Rgba{0, 0, 0, 0}));
    QexPP_DrawImage(&runtime_, nullptr, nullptr, nullptr, copy, nullptr);
    const Picture shown = Read();
    for (int x = 4; x < kWidth; x += 8)
        for (int y = 4; y < kHeight; y += 8) EXPECT_EQ(shown.Pixel(x, y), scene.Pixel(x, y));
}

TEST_F(PostProcessingTest, RefusesWhatCannotBeDrawn) {
    const QexRuntimeContext wide = Screen(800, 480), none = Screen(0, 480);
    Capture log(STDERR_FILENO);
    EXPECT_EQ(QexPostProcessing_Initialize(nullptr), -9);
    EXPECT_EQ(QexPostProcessing_Initialize(&none), -1);
    EXPECT_EQ(QexPostProcessing_Initialize(&wide), 0);
    for (int i = 0; i < 5; ++i) {
        const QexTexture& colour = QexPP_GetRenderTarget(static_cast<uint32_t>(i))->colorTexture;
        EXPECT_EQ(colour.width, i < 2 ? 400 : 800) << i;
        EXPECT_EQ(colour.height, i < 2 ? 240u : 480u) << i;
    }
    EXPECT_EQ(QexPP_GetRenderTarget(2), PostProcessingRenderTargets + 2);
    EXPECT_EQ(QexPP_GetRenderTarget(5), nullptr);
    QexRenderTarget small, *full = QexPP_GetRenderTarget(3);
    QexRenderTarget_Create(&small, 300, 240, 0);
    QexTexture* picture = &QexPP_GetRenderTarget(2)->colorTexture;
    const auto blur = [&](QexTexture* texture, QexRenderTarget* first, QexRenderTarget* second) {
        return QexPP_DrawBlurImage(&wide, nullptr, nullptr, nullptr, 5, 9, 0.1f, 0.1f, texture, first,
                                   second);
    };
    EXPECT_EQ(blur(picture, &small, full), -10);
    gltapState state;
    gltapGetState(&state);
    EXPECT_EQ(state.framebuffer, small.framebuffer);
    QexRenderTarget_EndScene(&small);
    QexRenderTarget_Release(&small);
    const std::string refused = StateChange([&] {
        EXPECT_EQ(blur(picture, nullptr, full), -9);
        EXPECT_EQ(blur(picture, full, nullptr), -9);
        EXPECT_EQ(blur(nullptr, full, full), -9);
        EXPECT_EQ(QexPP_DrawNormalScene(&runtime_, nullptr, nullptr, nullptr, nullptr, full), -9);
        EXPECT_EQ(DrawDOF(0, 0, 0, nullptr), -9);
    });
    EXPECT_EQ(refused, "");
    const char* const source = pFragmentShaderPP;
    pFragmentShaderPP = "this is no shader";
    EXPECT_EQ(QexPP_CreateShader(&wide), -1);
    EXPECT_EQ(QexPostProcessing_Initialize(&wide), -1);
    EXPECT_EQ(LiveObjects(), before_);
    pFragmentShaderPP = source;
    EXPECT_EQ(DOFShaderProgram, nullptr);
    QexPostProcessing_Finalize();
    EXPECT_EQ(StateChange([&] { EXPECT_EQ(DrawDOF(0, 0, 0), -1); }), "");
    const std::string text = log.Text();
    EXPECT_NE(text.find("<QexPostProcessing_Initialize> 0 x 480 pixels"), std::string::npos);
    // Why a program cannot be built is the GL's to say.
    EXPECT_NE(text.find("E/Qex: <QexPP_CreateShader> the fragment shader does not compile: 0:1(1): error"),
              std::string::npos)
        << text;
    EXPECT_NE(text.find("<QexPostProcessing_DrawDOF> Post-processing not initialized"), std::string::npos);
}

class PostProcessingFrame : public NullRenderTest {};

TEST_F(PostProcessingFrame, AllocatesNothing) {
    const QexSceneCallback nothing = [](QexRuntimeContext*, void*, void*, void*, QexShaderModule*,
                                        QexShaderModule*, const float*) { return 0; };
    QexPostProcessing_Initialize(&runtime_);
    for (const int mode : {0, 2}) {
        const auto frame = [&] {
            QexPostProcessing_DrawDOF(&runtime_, nullptr, nullptr, nullptr, nothing, 0, 1, 0.1f, 0.1f, 5, 9,
                                      mode, 0, 1);
        };
        EXPECT_EQ(CountAllocations(frame).made, 0);
    }
    QexPostProcessing_Finalize();
}

}  // namespace
