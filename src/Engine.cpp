// Start and end of the engine.
#include <GLES2/gl2.h>

#include <cstring>

#include "base/Diagnostics.h"
#include "gl/Extensions.h"
#include "gl/LeanState.h"
#include "overlay/Font.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/engine.h"
#include "Qex/models.h"
#include "Qex/overlay.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

namespace {

uint32_t s_Initialized;
uint32_t s_OwnerDrawInitialized;

static_assert(sizeof(QexEngineConfig) == QEX_ENGINE_CONFIG_SIZE || sizeof(void*) > 4, "11 words");
static_assert(sizeof(QexRuntimeContext) == 64 || sizeof(void*) > 4, "16 words");

bool IsConfigSize(uint32_t size) {
    return size == QEX_ENGINE_CONFIG_SIZE || size == sizeof(QexEngineConfig);
}

// Window-system words and surface size, from configuration to context and back.
template <class To, class From>
void CopyWindowWords(To* to, const From& from) {
    to->windowWord1 = from.windowWord1;
    to->windowWord2 = from.windowWord2;
    to->windowWord3 = from.windowWord3;
    to->windowWord4 = from.windowWord4;
    to->width = from.width;
    to->height = from.height;
    to->windowWord7 = from.windowWord7;
    to->windowWord8 = from.windowWord8;
}

// The pool starts at a multiple of 4 and loses what lies before it.
void SetPool(QexRuntimeContext* context, const QexEngineConfig& config) {
    const uint32_t skipped = static_cast<uint32_t>(-reinterpret_cast<uintptr_t>(config.memory) & 3);
    context->poolBlock = config.memory;
    context->poolBase = config.memory ? static_cast<uint8_t*>(config.memory) + skipped : nullptr;
    context->poolSize = config.memorySize > skipped ? config.memorySize - skipped : 0;
}

// Whether a GL answers. Without a current context it names no version and knows no limits. An error line in
// the function's name when there is none.
bool HasContext(const char* function) {
    GLint limit = 0;
    if (glGetString(GL_VERSION)) return true;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &limit);
    if (limit > 0) return true;
    QexError(QEX_TAG, "<%s> no GL context is current on this thread", function);
    return false;
}

// Post-processing anew, if it was made for a screen of that size. Its targets keep their filters.
int32_t ResizePostProcessing(const QexRuntimeContext* context, int32_t width, int32_t height) {
    const QexTexture& screen = PostProcessingRenderTargets[2].colorTexture;
    if (!DOFShaderProgram || screen.width != width || static_cast<int32_t>(screen.height) != height) return 0;
    uint8_t filters[QEX_POST_PROCESSING_TARGETS];
    for (uint32_t i = 0; i < QEX_POST_PROCESSING_TARGETS; ++i)
        filters[i] = QexPP_GetRenderTarget(i)->colorTexture.filter;
    const int32_t result = QexPostProcessing_Initialize(context);
    for (uint32_t i = 0; result == 0 && i < QEX_POST_PROCESSING_TARGETS; ++i)
        QexTexture_SetFilter(&QexPP_GetRenderTarget(i)->colorTexture, filters[i]);
    return result;
}

}  // namespace

extern "C" {

int32_t QexEngine_Init(QexRuntimeContext* context, uint32_t configSize, QexEngineConfig* config) {
    if (!IsConfigSize(configSize) || !context || !config || !HasContext("QexEngine_Init")) return -1;
    CopyWindowWords(context, *config);
    QexInitEGL(context);
    CopyWindowWords(config, *context);
    if (QexEngine_InitForOwnerDraw(context, configSize, config) != 0) return -1;
    s_Initialized = 1;
    QexLog(QEX_TAG, "<QexEngine_Init> Engine initialization success.");
    return 0;
}

int32_t QexEngine_InitForOwnerDraw(QexRuntimeContext* context, uint32_t configSize, QexEngineConfig* config) {
    if (!IsConfigSize(configSize) || !context || !config) return -1;
    if (!HasContext("QexEngine_InitForOwnerDraw")) return -1;
    memset(context, 0, sizeof *context);
    SetPool(context, *config);
    CopyWindowWords(context, *config);
    QexMemory_Init(context->poolBase, context->poolSize);
    context->startTime = QexTime_Init();
    QexExtensions_Forget();
    QexRenderState_Reset(context);
    if (QexEngine_ContextRestored() != 0 && g_QexContextLost) return -1;
    if (QexTexture_CreateDefault() != 0) return -1;
    QexFont_Create(context->width, context->height);
    s_OwnerDrawInitialized = 1;
    QexLog(QEX_TAG, "<QexEngine_InitForOwnerDraw> Owner draw initialized ok");
    return 0;
}

int32_t QexEngine_Resize(QexRuntimeContext* context, int32_t width, int32_t height) {
    if (!context || width < 1 || height < 1) {
        QexError(QEX_TAG, "<QexEngine_Resize> a surface of %d x %d pixels%s", width, height,
                 context ? "" : ", no context");
        return -1;
    }
    const int32_t widthBefore = context->width, heightBefore = context->height;
    if (width == widthBefore && height == heightBefore) return 0;
    context->width = width;
    context->height = height;
    QexFont_Resize(width, height, heightBefore);
    return ResizePostProcessing(context, widthBefore, heightBefore);
}

void QexEngine_Shutdown(QexRuntimeContext* context) {
    QexEngine_ShutdownForOwnerDraw(context);
    QexShutdownEGL(context);
    s_Initialized = 0;
    QexLog(QEX_TAG, "<QexEngine_Shutdown> Engine shutdown.");
}

void QexEngine_ShutdownForOwnerDraw(QexRuntimeContext* context) {
    QexLeanState_Release();
    QexFont_Release();
    QexTexture_ReleaseDefault();
    QexModel_ReleaseShader(1);
    destroyWindow();
    // A block without room for the signature was never touched.
    if (context && context->poolSize >= sizeof(uint32_t)) QexMemory_Shutdown(context->poolBase);
    s_Initialized = 0;
    QexLog(QEX_TAG, "<QexEngine_ShutdownForOwnerDraw> Shutdown ok.");
    s_OwnerDrawInitialized = 0;
}

uint32_t QexEngine_IsInitialized(void) {
    return s_Initialized;
}
uint32_t QexEngine_IsOwnerDrawInitialized(void) {
    return s_OwnerDrawInitialized;
}
void QexRenderer_Present(void) {}
int32_t QexInitEGL(QexRuntimeContext*) {
    return 0;
}
int32_t QexShutdownEGL(QexRuntimeContext*) {
    return 0;
}
int32_t createWindow(void) {
    return 0;
}
int32_t destroyWindow(void) {
    return 0;
}

}  // extern "C"
