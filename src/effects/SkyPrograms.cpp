// The shaders of sky and water.
#include "effects/SkyPrograms.h"

#include "gl/Program.h"
#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/renderer.h"

#define QEX_MODULE "src/QexSkyBox"

namespace {

const char* const kWaterVertexSource = R"(
attribute highp vec3 inVertex;
uniform highp mat4 ModelViewMatrix;
uniform highp mat4 MVPMatrix;
uniform highp vec3 EyePosition;
uniform mediump vec2 BumpTranslation0;
uniform mediump vec2 BumpScale0;
uniform mediump vec2 BumpTranslation1;
uniform mediump vec2 BumpScale1;
varying mediump vec2 BumpCoord0;
varying mediump vec2 BumpCoord1;
varying mediump float WaterToEyeLength;
void main() {
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
    BumpCoord0 = inVertex.xz * BumpScale0;
    BumpCoord1 = inVertex.xz * BumpScale1;
    highp vec3 WaterToEye = EyePosition - inVertex;
    WaterToEyeLength = 1.0 / length(WaterToEye);
}
)";

const char* const kWaterFragmentSource = R"(
precision mediump float;
uniform sampler2D NormalTex;
uniform sampler2D ReflectionTex;
uniform sampler2D RefractionTex;
uniform samplerCube NormalisationCubeMap;
uniform lowp vec4 WaterColour;
uniform float WaveDistortion;
uniform vec2 RcpWindowSize;
varying vec2 BumpCoord0;
varying vec2 BumpCoord1;
varying float WaterToEyeLength;
void main() {
    vec2 uv = gl_FragCoord.xy * RcpWindowSize;
    vec3 n = texture2D(NormalTex, BumpCoord0).rgb + texture2D(NormalTex, BumpCoord1).rgb - 1.0;
    uv -= n.xz * WaveDistortion * WaterToEyeLength;
    gl_FragColor = texture2D(ReflectionTex, uv);
}
)";

// Half floats would put far corners behind the far plane. All corners are as far from the middle, so the
// length of the direction does not matter, but half floats hold it.
const char* const kSkyVertexSource = R"(
attribute highp vec3 inVertex;
uniform highp mat4 MVPMatrix;
uniform mediump mat4 ModelMatrix;
uniform mediump mat4 ModelViewMatrix;
varying mediump vec3 EyeDir;
void main() {
    EyeDir = -normalize(inVertex);
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
}
)";

const char* const kSkyFragmentSource = R"(
uniform samplerCube CubeMap;
varying mediump vec3 EyeDir;
void main() {
    gl_FragColor = textureCube(CubeMap, EyeDir);
}
)";

const char* const kTex2DVertexSource = R"(
attribute highp vec3 inVertex;
attribute highp vec3 inNormal;
attribute highp vec2 inTexCoord;
uniform highp mat4 MVPMatrix;
varying mediump vec2 TexCoord;
void main() {
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
    TexCoord = inTexCoord;
}
)";

const char* const kTex2DFragmentSource = R"(
uniform sampler2D Texture;
varying mediump vec2 TexCoord;
void main() {
    gl_FragColor = texture2D(Texture, TexCoord);
}
)";

const char* const kPlaneTexVertexSource = R"(
attribute highp vec3 inVertex;
uniform highp mat4 MVPMatrix;
void main() {
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
}
)";

const char* const kPlaneTexFragmentSource = R"(
precision mediump float;
uniform sampler2D Texture;
uniform vec2 RcpWindowSize;
void main() {
    gl_FragColor = texture2D(Texture, gl_FragCoord.xy * RcpWindowSize);
}
)";

const char* const kAttributes[] = {"inVertex", "inNormal", "inTexCoord"};
// For the water's stages, which test none of them.
const char* const kWaterDefines[] = {"ENABLE_REFRACTION", "ENABLE_FRESNEL", "ENABLE_DISTORTION"};

// The shader objects, a vertex and a fragment shader each. The plain water pair is not linked.
enum { kPlainWater, kSky, kTex2D, kPlaneTex, kWater, kPairs };
const struct {
    const char *vertex, *fragment;
    uint32_t defines;
} kSources[kPairs] = {{kWaterVertexSource, kWaterFragmentSource, 0},
                      {kSkyVertexSource, kSkyFragmentSource, 0},
                      {kTex2DVertexSource, kTex2DFragmentSource, 0},
                      {kPlaneTexVertexSource, kPlaneTexFragmentSource, 0},
                      {kWaterVertexSource, kWaterFragmentSource, 3}};

struct {
    GLuint vertex, fragment;
} s_Shaders[kPairs];

void SetUpWater(const QexProgramLookup& lookup) {
    static const char* const samplers[] = {"NormalTex", "ReflectionTex", "RefractionTex",
                                           "NormalisationCubeMap"};
    for (GLint unit = 0; unit < 4; ++unit) lookup.SetSampler({samplers[unit], unit});
    QexWaterProgram& w = g_QexWaterProgram;
    lookup.Uniforms({{&w.modelViewMatrix, "ModelViewMatrix"},
                     {&w.mvpMatrix, "MVPMatrix"},
                     {&w.eyePosition, "EyePosition"},
                     {&w.bumpTranslation[0], "BumpTranslation0"},
                     {&w.bumpScale[0], "BumpScale0"},
                     {&w.bumpTranslation[1], "BumpTranslation1"},
                     {&w.bumpScale[1], "BumpScale1"},
                     {&w.waterColour, "WaterColour"},
                     {&w.waveDistortion, "WaveDistortion"},
                     {&w.rcpWindowSize, "RcpWindowSize"}});
}

void SetUpSky(const QexProgramLookup& lookup) {
    lookup.SetSampler({"CubeMap", 0});
    lookup.Uniforms(
        {{&g_QexSkyProgram.mvpMatrix, "MVPMatrix"}, {&g_QexSkyProgram.modelMatrix, "ModelMatrix"}});
}

void SetUpTex2D(const QexProgramLookup& lookup) {
    lookup.SetSampler({"Texture", 0});
    m_Tex2DShader.mvpMatrixLoc = lookup.Uniform("MVPMatrix");
}

void SetUpPlaneTex(const QexProgramLookup& lookup) {
    lookup.SetSampler({"Texture", 0});
    lookup.Uniforms({{&m_PlaneTexShader.mvpMatrixLoc, "MVPMatrix"},
                     {&m_PlaneTexShader.rcpWindowSizeLoc, "RcpWindowSize"}});
}

// Programs in the order in which they are linked.
const char kWaterError[] = "ERROR:< LoadWaterShader> link program failed because %s!\n";
const char kError[] = "ERROR:<LoadShaders> %s\n";
const struct {
    GLuint* program;
    int pair;
    int32_t attributeCount;
    void (*setUp)(const QexProgramLookup& lookup);
    const char* error;
} kPrograms[] = {{&g_QexWaterProgram.program, kWater, 1, SetUpWater, kWaterError},
                 {&g_QexSkyProgram.program, kSky, 1, SetUpSky, kError},
                 {&m_Tex2DShader.program, kTex2D, 3, SetUpTex2D, kError},
                 {&m_PlaneTexShader.program, kPlaneTex, 1, SetUpPlaneTex, kError}};

}  // namespace

QexSkyProgram g_QexSkyProgram;
QexWaterProgram g_QexWaterProgram;

extern "C" {

QexTex2DShader m_Tex2DShader;
QexPlaneTexShader m_PlaneTexShader;

}  // extern "C"

bool QexSkyBox_CreatePrograms() {
    for (int i = 0; i < kPairs; ++i) {
        const auto& source = kSources[i];
        QexShader_CreateFromMemEx(&s_Shaders[i].vertex, source.vertex, GL_VERTEX_SHADER, kWaterDefines,
                                  source.defines);
        QexShader_CreateFromMemEx(&s_Shaders[i].fragment, source.fragment, GL_FRAGMENT_SHADER, kWaterDefines,
                                  source.defines);
    }
    for (const auto& row : kPrograms) {
        char log[QEX_SHADER_LOG_SIZE];
        if (QexShader_CreateProgram(row.program, s_Shaders[row.pair].vertex, s_Shaders[row.pair].fragment,
                                    kAttributes, row.attributeCount, log) != 0) {
            QexSystem_Printf(row.error, log);
            QexProgram_LogFailure("QexSkyBox_Create", s_Shaders[row.pair].vertex,
                                  s_Shaders[row.pair].fragment, 0);
            if (*row.program) QEX_GL(glDeleteProgram(*row.program));
            *row.program = 0;
            return false;
        }
        row.setUp({QEX_MODULE, *row.program});
    }
    return true;
}

void QexSkyBox_ReleasePrograms() {
    GLuint none = 0;
    for (const auto& row : kPrograms)
        QexProgram_Delete({row.program, &s_Shaders[row.pair].vertex, &s_Shaders[row.pair].fragment});
    QexProgram_Delete({&none, &s_Shaders[kPlainWater].vertex, &s_Shaders[kPlainWater].fragment});
}

void QexSkyBox_ForgetPrograms() {
    for (const auto& row : kPrograms) *row.program = 0;
    for (auto& shaders : s_Shaders) shaders = {};
}
