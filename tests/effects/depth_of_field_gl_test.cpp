// Blur and depth of field: what they make of lines and blocks, what the passes bind, and what they leave
// behind.
#include <GLES2/gl2.h>

#include <algorithm>
#include <cmath>
#include <random>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

// RGBA, the lowest row first.
struct Texels {
    int width, height;
    std::vector<uint8_t> bytes;

    double At(double u, double v, int channel) const {
        const int x = std::clamp(int(std::floor(u)), 0, width - 1);
        const int y = std::clamp(int(std::floor(v)), 0, height - 1);
        return bytes[static_cast<size_t>((y * width + x) * 4 + channel)];
    }
};

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

// The place of the first pixel of the third row or column that is not black, and the values from there.
std::vector<int> Profile(const Texels& texels, bool column) {
    std::vector<int> values;
    for (int i = 0; i < (column ? texels.height : texels.width); ++i) {
        const auto at = [&](int c) { return int(column ? texels.At(3, i, c) : texels.At(i, 3, c)); };
        EXPECT_EQ(at(1), 0);
        EXPECT_EQ(at(2), at(0));
        EXPECT_EQ(at(3), 255);
        if (at(0) && values.empty()) values = {i};
        if (!values.empty()) values.push_back(at(0));
    }
    while (!values.empty() && values.back() == 0) values.pop_back();
    return values;
}

void ExpectNear(const std::vector<int>& actual, const std::vector<int>& expected) {
    ASSERT_EQ(actual.size(), expected.size());
    for (size_t i = 0; i < actual.size(); ++i) EXPECT_NEAR(actual[i], expected[i], i ? 1 : 0) << i;
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

// A line each way, which comes out as the shares of the Gaussian.
TEST_F(PostProcessingTest, BlurIsAGaussianAlongRowsThenColumns) {
    const struct {
        int width, height, mode;
        float sigma, samples, pixels;
        std::vector<int> row, column;
    } cases[] = {
        // Targets of half the size skip texels of a row, and have those of a column twice.
        {128, 96, 0, 5, 9, 1, {39, 23, 30, 32, 30, 23}, {28, 50, 61, 64, 57, 23}},
        {101, 75, 0, 1.5f, 9, 1, {41, 9, 54, 54, 9}, {23, 11, 82, 122, 37, 2}},
        {101, 75, 2, 3, 5, 1.5f, {83, 45, 54, 0, 57, 54, 0, 45}, {48, 45, 54, 0, 57, 54, 0, 45}},
        // clang-format off
        {128, 96, 2, -3, 9, 1, {78, 16, 24, 31, 37, 39, 37, 31, 24, 16}, {57, 16, 24, 31, 37, 39, 37, 31, 24, 16}},
        // clang-format on
        {128, 96, 2, 2, 7, 1, {79, 18, 33, 49, 55, 49, 33, 18}, {58, 18, 33, 49, 55, 49, 33, 18}},
        {128, 96, 2, 1, 5, 1, {80, 14, 62, 103, 62, 14}, {59, 14, 62, 103, 62, 14}},
        {128, 96, 2, 1, 8, 1, {81, 70, 115, 70}, {60, 70, 115, 70}},
        {128, 96, 2, 2, NAN, 1, {81, 81, 92, 81}, {60, 81, 92, 81}},
        {128, 96, 2, INFINITY, -9, 1, {81, 85, 85, 85}, {60, 85, 85, 85}},
        {128, 96, 2, 0, 9, 1, {82, 255}, {61, 255}},
        {128, 96, 2, NAN, 9, 1, {82, 255}, {61, 255}},
    };
    // All that could cut into a quad.
    QexRenderer_SetZTestFunc(QEX_DEPTH_NEVER);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BOTH);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ADD_ALPHA);
    for (const auto& c : cases) {
        SCOPED_TRACE(&c - cases);
        const QexRuntimeContext screen = Screen(c.width, c.height);
        const uint32_t target = c.mode < 2 ? 0 : 3;
        ASSERT_EQ(QexPostProcessing_Initialize(&screen), 0);
        std::vector<uint8_t> lines;
        const int x = c.width == 128 ? 81 : 85, y = c.width == 128 ? 61 : 51;
        for (int i = 0; i < c.width * c.height; ++i) {
            const uint8_t value = i % c.width == x || i / c.width == y ? 255 : 0;
            lines.insert(lines.end(), {value, 0, value, 0});
        }
        ScopedTexture texture(c.width, c.height, lines.data());
        QexRenderTarget &rows = *QexPP_GetRenderTarget(target), &columns = *QexPP_GetRenderTarget(target + 1);
        EXPECT_EQ(QexPP_DrawBlurImage(&screen, nullptr, nullptr, nullptr, c.sigma, c.samples,
                                      c.pixels / float(c.width), c.pixels / float(c.height), &texture, &rows,
                                      &columns),
                  0);
        ExpectNear(Profile(ReadTarget(rows), false), c.row);
        ExpectNear(Profile(ReadTarget(columns), true), c.column);
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
        const double scale = c.mode < 2 ? 0.5 : 1;
        int wrong = 0;
        // Off the edges of texels, which move by one over the screen.
        for (int y = 2; y < kHeight; y += 3)
            for (int x = 1; x < kWidth; x += 3) {
                const double u = (x + 0.5) * kWidth / (kWidth + 1),
                             v = (1 - (y + 0.5) / (kHeight + 1)) * kHeight;
                if (!Inside(u) || !Inside(v)) continue;
                const double share =
                    std::clamp(c.range * std::fabs(c.focus - depth.At(u, v, 0) / 255), 0.0, 1.0);
                for (int i = 0; i < 4; ++i) {
                    const double mixed =
                        glm::mix(sharp.At(u, v, i), blurred.At(u * scale, v * scale, i), share);
                    wrong += std::fabs(picture.Pixel(x, y)[static_cast<size_t>(i)] - mixed) > 2;
                }
            }
        EXPECT_EQ(wrong, 0) << c.focus << " " << c.range << " " << c.mode;
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
    for (const char* line :
         {"<QexPostProcessing_Initialize> 0 x 480 pixels",
          "E/Qex: <QexPP_CreateShader> the fragment shader does not compile: 0:1(1): error",
          "<QexPostProcessing_DrawDOF> Post-processing not initialized"})
        EXPECT_NE(text.find(line), std::string::npos) << text;
}

}  // namespace
