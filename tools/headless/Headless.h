// An OpenGL ES 2.0 context without a window: what tests, benchmarks and the command-line tools draw into.
//
// The context renders into a pbuffer of its own (RGBA8888, 24-bit depth, 8-bit stencil) and is current on
// the calling thread from Create until it is destroyed or another one is made current. Several may live in
// one process; MakeCurrent switches between them. All GL calls go through the plain gl* symbols, so a
// library that stands before libGLESv2 sees them.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qex {

// What stands behind the gl* functions of the program.
enum class HeadlessGL {
    kContext,  // a real context, made current
    kNone,     // nothing is opened and no GL function is called: for programs under a null driver
};

class HeadlessContext {
  public:
    // Null on failure, with one line in *error (which may be null). Each pixel gets at least that many
    // samples, if there is such a pbuffer; else one.
    static std::unique_ptr<HeadlessContext> Create(int width, int height, std::string* error,
                                                   HeadlessGL gl = HeadlessGL::kContext, int samples = 1);
    ~HeadlessContext();
    HeadlessContext(const HeadlessContext&) = delete;
    HeadlessContext& operator=(const HeadlessContext&) = delete;

    bool MakeCurrent();

    // The bound framebuffer's lower left width x height pixels as RGBA8, the top row first. All zero without
    // a context. The pack alignment is left as it was.
    std::vector<uint8_t> ReadPixels() const;

    int Width() const { return width_; }
    int Height() const { return height_; }
    int Samples() const { return samples_; }

    // The driver's strings; empty without a context.
    std::string Vendor() const;
    std::string Renderer() const;
    std::string Version() const;

  private:
    HeadlessContext(int width, int height, int samples) : width_(width), height_(height), samples_(samples) {}
    bool Open(std::string* error);

    int width_;
    int height_;
    int samples_;
    // EGL handles, kept untyped so that users of this header need no EGL header.
    void* display_ = nullptr;
    void* surface_ = nullptr;
    void* context_ = nullptr;
};

}  // namespace qex
