#include "support/RenderFixture.h"

#include <GLES2/gl2.h>
#include <sys/stat.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <sstream>

#include "support/Capture.h"

namespace {

template <typename Describe>
std::string TapText(Describe describe) {
    std::string text(describe(nullptr, 0), '\0');
    describe(text.data(), text.size() + 1);
    return text;
}

int Difference(Rgba a, Rgba b) {
    int most = 0;
    for (size_t c = 0; c < 4; ++c) most = std::max(most, std::abs(a[c] - b[c]));
    return most;
}

}  // namespace

void Picture::Fill(int left, int top, int right, int bottom, Rgba colour) {
    for (int y = top; y < bottom; ++y)
        for (int x = left; x < right; ++x)
            std::copy(colour.begin(), colour.end(), &bytes[static_cast<size_t>(y * kWidth + x) * 4]);
}

testing::AssertionResult Near(Rgba actual, Rgba expected, int tolerance) {
    if (Difference(actual, expected) <= tolerance) return testing::AssertionSuccess();
    return testing::AssertionFailure()
           << testing::PrintToString(actual) << " is not " << testing::PrintToString(expected);
}

testing::AssertionResult SamePicture(const Picture& actual, const Picture& expected, int tolerance) {
    size_t wrong = 0;
    std::ostringstream first;
    for (int y = 0; y < kHeight; ++y)
        for (int x = 0; x < kWidth; ++x) {
            const Rgba a = actual.Pixel(x, y), e = expected.Pixel(x, y);
            if (Difference(a, e) <= tolerance || wrong++) continue;
            first << x << ", " << y << ": " << testing::PrintToString(a) << ", not "
                  << testing::PrintToString(e);
        }
    if (!wrong) return testing::AssertionSuccess();
    return testing::AssertionFailure() << wrong << " pixels differ, the first at " << first.str();
}

testing::AssertionResult SameMatrix(const void* floats, const glm::mat4& expected) {
    float m[16];
    std::memcpy(m, floats, sizeof m);
    for (int i = 0; i < 16; ++i)
        if (!(std::fabs(m[i] - glm::value_ptr(expected)[i]) <= 1e-4f * (1 + std::fabs(m[i]))))
            return testing::AssertionFailure() << "element " << i << " is " << m[i];
    return testing::AssertionSuccess();
}

GLCalls::GLCalls(const std::function<void()>& draw) : recording_(nullptr, gltapReleaseRecording) {
    gltapBeginRecording();
    draw();
    recording_.reset(gltapEndRecording());
}

std::vector<const gltapCall*> GLCalls::Of(std::initializer_list<std::string> functions) const& {
    std::vector<const gltapCall*> calls;
    for (size_t i = 0; i < Size(); ++i) {
        const gltapCall* call = gltapRecordingCall(recording_.get(), i);
        const std::string name = gltapFunctionName(call->function);
        const bool named = std::find(functions.begin(), functions.end(), name) != functions.end();
        if (named || (!functions.size() && name != "glGetError")) calls.push_back(call);
    }
    return calls;
}

std::string GLCalls::Text(std::initializer_list<std::string> functions) const {
    std::string text;
    for (const gltapCall* call : Of(functions))
        text += TapText([&](char* out, size_t size) { return gltapDescribeCall(call, out, size); }) + "\n";
    return text;
}

std::string StateChange(const std::function<void()>& draw) {
    gltapState before, after;
    gltapGetState(&before);
    draw();
    gltapGetState(&after);
    return TapText([&](char* out, size_t size) { return gltapDiffState(&before, &after, out, size); });
}

std::string LiveObjects() {
    return TapText(gltapDescribeObjects);
}

std::string ErrorLines(const std::string& log) {
    std::istringstream lines(log);
    std::string errors;
    for (std::string line; std::getline(lines, line);)
        if (line.compare(0, 2, "E/") == 0) errors += line + "\n";
    return errors;
}

QexMatrix ToQex(const glm::mat4& matrix) {
    QexMatrix out;
    std::memcpy(out.m, glm::value_ptr(matrix), sizeof out.m);
    return out;
}

QexMatrix PixelProjection() {
    return ToQex(glm::ortho(0.0f, float{kWidth}, 0.0f, float{kHeight}, -100.0f, 100.0f));
}

std::string OutputPath(const std::string& name) {
    mkdir(QEX_RENDER_OUTPUT, 0777);
    return std::string(QEX_RENDER_OUTPUT) + "/" + name;
}

QexEngineConfig SurfaceConfig() {
    QexEngineConfig config = {};
    config.width = kWidth;
    config.height = kHeight;
    return config;
}

void ContextTest::SetUp() {
    std::string error;
    gltapSetMode(mode_);
    if (mode_ == GLTAP_FORWARD) {
        context_ = qex::HeadlessContext::Create(kWidth, kHeight, &error);
        ASSERT_TRUE(context_) << error;
    }
    gltapReset();
    QexRenderState_Reset(nullptr);
}

void ContextTest::TearDown() {
    EXPECT_EQ(LiveObjects(), "");
    gltapSetMode(GLTAP_FORWARD);
}

void ContextTest::Clear(float r, float g, float b, float a) {
    glClearColor(r, g, b, a);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
}

Picture ContextTest::Read() const {
    return {context_->ReadPixels()};
}

void RenderTest::SetUp() {
    ContextTest::SetUp();
    if (HasFatalFailure()) return;
    QexEngineConfig config = SurfaceConfig();
    Capture quiet(STDERR_FILENO);
    ASSERT_EQ(QexEngine_Init(&runtime_, sizeof config, &config), 0);
}

void RenderTest::TearDown() {
    Capture quiet(STDERR_FILENO);
    if (!HasFatalFailure()) QexEngine_Shutdown(&runtime_);
    ContextTest::TearDown();
}
