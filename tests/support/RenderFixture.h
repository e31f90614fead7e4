// What the tests that draw share: a context, the engine on it, the tap's records as text, pictures.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <functional>
#include <glm/glm.hpp>
#include <glm/gtc/matrix_transform.hpp>
#include <glm/gtc/type_ptr.hpp>
#include <memory>
#include <string>
#include <vector>

#include "gltap.h"
#include "Headless.h"
#include "Qex.h"

constexpr int kWidth = 128;
constexpr int kHeight = 96;

using Rgba = std::array<int, 4>;

// What the surface shows: RGBA, the top row first.
struct Picture {
    std::vector<uint8_t> bytes = std::vector<uint8_t>(kWidth * kHeight * 4);

    Rgba Pixel(int x, int y) const {
        const uint8_t* p = &bytes[static_cast<size_t>(y * kWidth + x) * 4];
        return {p[0], p[1], p[2], p[3]};
    }
    void Fill(int left, int top, int right, int bottom, Rgba colour);
};

testing::AssertionResult Near(Rgba actual, Rgba expected, int tolerance);
testing::AssertionResult SamePicture(const Picture& actual, const Picture& expected, int tolerance = 0);
// Compares 16 floats, of a recorded uniform for example.
testing::AssertionResult SameMatrix(const void* floats, const glm::mat4& expected);

// GL calls recorded while a function ran.
class GLCalls {
  public:
    explicit GLCalls(const std::function<void()>& draw);
    // The calls of these functions in order, one a line, or of all when none is named.
    std::string Text(std::initializer_list<std::string> functions = {}) const;
    // The calls belong to this recording.
    std::vector<const gltapCall*> Of(std::initializer_list<std::string> functions) const&;
    std::vector<const gltapCall*> Of(std::initializer_list<std::string> functions) const&& = delete;
    size_t Size() const { return gltapRecordingSize(recording_.get()); }

  private:
    std::unique_ptr<gltapRecording, decltype(&gltapReleaseRecording)> recording_;
};

// How the GL state after `draw` differs from that before, one line a value.
std::string StateChange(const std::function<void()>& draw);
std::string LiveObjects();

struct Allocations {
    long made;     // blocks made or moved
    long balance;  // blocks made less blocks freed
};
extern const bool kAllocationsAreCounted;
Allocations CountAllocations(const std::function<void()>& code);
// Runs the code, in which the engine's nth allocation fails (1: the first, 0: none), and, if wanted, all that
// follow. How many it asked for.
long EngineAllocations(const std::function<void()>& code, long nth, bool following);

// The lines of a log that report errors.
std::string ErrorLines(const std::string& log);

QexMatrix ToQex(const glm::mat4& matrix);
// One unit is one pixel of the surface, the origin its lower left corner.
QexMatrix PixelProjection();
std::string OutputPath(const std::string& name);
QexEngineConfig SurfaceConfig();

// A context without the engine, or the null driver: that draws nothing, allocates nothing and starts no
// threads. Leaving a GL object behind fails the test.
class ContextTest : public testing::Test {
  protected:
    explicit ContextTest(gltapMode mode = GLTAP_FORWARD) : mode_(mode) {}
    void SetUp() override;
    void TearDown() override;

    void Clear(float r = 0, float g = 0, float b = 0, float a = 0);
    Picture Read() const;

    gltapMode mode_;
    std::unique_ptr<qex::HeadlessContext> context_;
};

// The engine, on a context or on the null driver.
class RenderTest : public ContextTest {
  protected:
    using ContextTest::ContextTest;
    void SetUp() override;
    void TearDown() override;

    QexRuntimeContext runtime_;
};

class NullRenderTest : public RenderTest {
  protected:
    NullRenderTest() : RenderTest(GLTAP_NULL) {}
};
