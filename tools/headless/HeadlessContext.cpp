// EGL without a window: a surfaceless display, a pbuffer, and what of multisampling there is.
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GLES2/gl2.h>

#include <cstdio>
#include <cstring>

#include "Headless.h"

namespace qex {
namespace {

std::string EGLErrorText(const char* step) {
    char text[96];
    std::snprintf(text, sizeof(text), "%s failed (EGL error 0x%04x)", step,
                  static_cast<unsigned>(eglGetError()));
    return text;
}

EGLDisplay SurfacelessDisplay() {
    const char* extensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
    if (!extensions || !std::strstr(extensions, "EGL_MESA_platform_surfaceless")) return EGL_NO_DISPLAY;
    auto getPlatformDisplay =
        reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(eglGetProcAddress("eglGetPlatformDisplayEXT"));
    if (!getPlatformDisplay) return EGL_NO_DISPLAY;
    return getPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
}

EGLDisplay OpenDisplay() {
    EGLDisplay display = SurfacelessDisplay();
    if (display != EGL_NO_DISPLAY && eglInitialize(display, nullptr, nullptr)) return display;
    display = eglGetDisplay(EGL_DEFAULT_DISPLAY);
    if (display != EGL_NO_DISPLAY && eglInitialize(display, nullptr, nullptr)) return display;
    return EGL_NO_DISPLAY;
}

// EGL sorts deeper buffers first where several configurations fit, so the exact sizes are looked for.
// Of those with enough samples the one with the fewest.
EGLConfig ChooseConfig(EGLDisplay display, int samples) {
    static const EGLint wanted[] = {EGL_SURFACE_TYPE,
                                    EGL_PBUFFER_BIT,
                                    EGL_RENDERABLE_TYPE,
                                    EGL_OPENGL_ES2_BIT,
                                    EGL_RED_SIZE,
                                    8,
                                    EGL_GREEN_SIZE,
                                    8,
                                    EGL_BLUE_SIZE,
                                    8,
                                    EGL_ALPHA_SIZE,
                                    8,
                                    EGL_DEPTH_SIZE,
                                    24,
                                    EGL_STENCIL_SIZE,
                                    8,
                                    EGL_NONE};
    EGLConfig configs[64], best = nullptr;
    EGLint count = 0, fewest = 0;
    if (!eglChooseConfig(display, wanted, configs, 64, &count)) return nullptr;
    for (EGLint i = 0; i < count; ++i) {
        EGLint red = 0, depth = 0, has = 0;
        eglGetConfigAttrib(display, configs[i], EGL_RED_SIZE, &red);
        eglGetConfigAttrib(display, configs[i], EGL_DEPTH_SIZE, &depth);
        eglGetConfigAttrib(display, configs[i], EGL_SAMPLES, &has);
        // Without multisampling it is 0.
        if (red != 8 || depth != 24 || (has > 1 ? has : 1) < samples || (samples == 1 && has > 1)) continue;
        if (best && has >= fewest) continue;
        best = configs[i];
        fewest = has;
    }
    return best;
}

std::string GLString(GLenum name) {
    const GLubyte* text = glGetString(name);
    return text ? reinterpret_cast<const char*>(text) : "";
}

// What OpenGL ES 3.0 adds, which a context for 2.0 may have as well.
constexpr GLenum kReadFramebuffer = 0x8CA8, kDrawFramebuffer = 0x8CA9, kRgba8 = 0x8058;
using BlitFramebuffer = void (*)(GLint, GLint, GLint, GLint, GLint, GLint, GLint, GLint, GLbitfield, GLenum);

BlitFramebuffer FindBlit() {
    if (GLString(GL_VERSION).rfind("OpenGL ES 3", 0) != 0) return nullptr;
    return reinterpret_cast<BlitFramebuffer>(eglGetProcAddress("glBlitFramebuffer"));
}

// Makes one pixel of the samples of each in another framebuffer, and binds that for the time that it lives:
// reading from where the samples are takes one of them.
class Resolved {
  public:
    Resolved(int width, int height) {
        glGenRenderbuffers(1, &colour_);
        glGenFramebuffers(1, &framebuffer_);
        glGetIntegerv(GL_RENDERBUFFER_BINDING, &bound_);
        glBindRenderbuffer(GL_RENDERBUFFER, colour_);
        glRenderbufferStorage(GL_RENDERBUFFER, kRgba8, width, height);
        glBindFramebuffer(kDrawFramebuffer, framebuffer_);
        glFramebufferRenderbuffer(kDrawFramebuffer, GL_COLOR_ATTACHMENT0, GL_RENDERBUFFER, colour_);
        const GLboolean scissor = glIsEnabled(GL_SCISSOR_TEST);
        glDisable(GL_SCISSOR_TEST);
        FindBlit()(0, 0, width, height, 0, 0, width, height, GL_COLOR_BUFFER_BIT, GL_NEAREST);
        if (scissor) glEnable(GL_SCISSOR_TEST);
        glBindFramebuffer(kReadFramebuffer, framebuffer_);
    }
    ~Resolved() {
        glBindFramebuffer(GL_FRAMEBUFFER, 0);
        glBindRenderbuffer(GL_RENDERBUFFER, static_cast<GLuint>(bound_));
        glDeleteFramebuffers(1, &framebuffer_);
        glDeleteRenderbuffers(1, &colour_);
    }
    Resolved(const Resolved&) = delete;
    Resolved& operator=(const Resolved&) = delete;

  private:
    GLuint colour_ = 0, framebuffer_ = 0;
    GLint bound_ = 0;
};

}  // namespace

std::unique_ptr<HeadlessContext> HeadlessContext::Create(int width, int height, std::string* error,
                                                         HeadlessGL gl, int samples) {
    std::string ignored;
    if (!error) error = &ignored;
    if (width < 1 || height < 1) {
        *error = "a headless context needs a width and a height of at least 1";
        return nullptr;
    }
    std::unique_ptr<HeadlessContext> context(new HeadlessContext(width, height, samples));
    if (gl == HeadlessGL::kContext && !context->Open(error)) return nullptr;
    if (gl == HeadlessGL::kNone || context->samples_ == 1 || FindBlit()) return context;
    context.reset();
    return Create(width, height, error, gl, 1);
}

bool HeadlessContext::Open(std::string* error) {
    EGLDisplay display = OpenDisplay();
    if (display == EGL_NO_DISPLAY) {
        *error = EGLErrorText("opening an EGL display");
        return false;
    }
    display_ = display;

    EGLConfig config = ChooseConfig(display, samples_);
    if (!config && samples_ > 1) config = ChooseConfig(display, samples_ = 1);
    if (!config) {
        *error = "EGL offers no RGBA8888 pbuffer with 24-bit depth and 8-bit stencil for OpenGL ES 2.0";
        return false;
    }
    const EGLint size[] = {EGL_WIDTH, width_, EGL_HEIGHT, height_, EGL_NONE};
    surface_ = eglCreatePbufferSurface(display, config, size);
    if (surface_ == EGL_NO_SURFACE) {
        *error = EGLErrorText("eglCreatePbufferSurface");
        return false;
    }
    eglBindAPI(EGL_OPENGL_ES_API);
    static const EGLint version[] = {EGL_CONTEXT_CLIENT_VERSION, 2, EGL_NONE};
    context_ = eglCreateContext(display, config, EGL_NO_CONTEXT, version);
    if (context_ == EGL_NO_CONTEXT) {
        *error = EGLErrorText("eglCreateContext");
        return false;
    }
    if (!MakeCurrent()) {
        *error = EGLErrorText("eglMakeCurrent");
        return false;
    }
    return true;
}

// The display is the process's and stays open: terminating it would end it for every other user, and Mesa
// unloads its driver then, which costs the next context its start and a leak checker the driver's symbols.
HeadlessContext::~HeadlessContext() {
    if (!display_) return;
    if (context_ && eglGetCurrentContext() == context_)
        eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
    if (context_) eglDestroyContext(display_, context_);
    if (surface_) eglDestroySurface(display_, surface_);
}

bool HeadlessContext::MakeCurrent() {
    return !context_ || eglMakeCurrent(display_, surface_, surface_, context_);
}

std::vector<uint8_t> HeadlessContext::ReadPixels() const {
    const size_t rowBytes = static_cast<size_t>(width_) * 4;
    std::vector<uint8_t> topDown(rowBytes * static_cast<size_t>(height_));
    if (!context_) return topDown;

    GLint alignment = 4, framebuffer = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &framebuffer);
    std::unique_ptr<Resolved> resolved;
    if (samples_ > 1 && framebuffer == 0) resolved = std::make_unique<Resolved>(width_, height_);
    glGetIntegerv(GL_PACK_ALIGNMENT, &alignment);
    std::vector<uint8_t> bottomUp(topDown.size());
    glPixelStorei(GL_PACK_ALIGNMENT, 4);
    glReadPixels(0, 0, width_, height_, GL_RGBA, GL_UNSIGNED_BYTE, bottomUp.data());
    glPixelStorei(GL_PACK_ALIGNMENT, alignment);

    const size_t rows = static_cast<size_t>(height_);
    for (size_t y = 0; y < rows; ++y)
        std::memcpy(&topDown[y * rowBytes], &bottomUp[(rows - 1 - y) * rowBytes], rowBytes);
    return topDown;
}

std::string HeadlessContext::Vendor() const {
    return context_ ? GLString(GL_VENDOR) : "";
}
std::string HeadlessContext::Renderer() const {
    return context_ ? GLString(GL_RENDERER) : "";
}
std::string HeadlessContext::Version() const {
    return context_ ? GLString(GL_VERSION) : "";
}

}  // namespace qex
