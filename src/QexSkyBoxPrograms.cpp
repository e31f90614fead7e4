#include "QexSkyBoxPrograms.h"

#include "Qex.h"

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

const char* const kSkyVertexSource = R"(
attribute mediump vec3 inVertex;
uniform mediump mat4 MVPMatrix;
uniform mediump mat4 ModelMatrix;
uniform mediump mat4 ModelViewMatrix;
varying mediump vec3 EyeDir;
void main() {
    EyeDir = -inVertex;
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
// What the water's stages may ask for; they do not yet.
const char* const kWaterDefines[] = {"ENABLE_REFRACTION", "ENABLE_FRESNEL", "ENABLE_DISTORTION"};

// The shader objects, a vertex and a fragment shader each. The plain water pair is not linked.
enum { kPlainWater, kSky, kTex2D, kPlaneTex, kWater, kPairs };
constexpr int kShaders = 2 * kPairs;
const struct {
    const char *vertex, *fragment;
    uint32_t defines;
} kSources[kPairs] = {{kWaterVertexSource, kWaterFragmentSource, 0},
                      {kSkyVertexSource, kSkyFragmentSource, 0},
                      {kTex2DVertexSource, kTex2DFragmentSource, 0},
                      {kPlaneTexVertexSource, kPlaneTexFragmentSource, 0},
                      {kWaterVertexSource, kWaterFragmentSource, 3}};

GLuint s_Shaders[kShaders];

GLint Location(GLuint program, const char* name) {
    GLint location;
    QEX_GL(location = glGetUniformLocation(program, name));
    return location;
}

void SetSampler(GLuint program, const char* name, GLint unit) {
    QEX_GL(glUniform1i(Location(program, name), unit));
}

void CompileShaders() {
    for (int i = 0; i < kPairs; ++i) {
        QexShader_CreateFromMemEx(&s_Shaders[2 * i], kSources[i].vertex, GL_VERTEX_SHADER, kWaterDefines,
                                  kSources[i].defines);
        QexShader_CreateFromMemEx(&s_Shaders[2 * i + 1], kSources[i].fragment, GL_FRAGMENT_SHADER,
                                  kWaterDefines, kSources[i].defines);
    }
}

// Links a pair; says `message` with the log when that fails.
bool Link(GLuint* program, int pair, int32_t attributeCount, const char* message) {
    char log[QEX_SHADER_LOG_SIZE];
    if (QexShader_CreateProgram(program, s_Shaders[2 * pair], s_Shaders[2 * pair + 1], kAttributes,
                                attributeCount, log) == 0)
        return true;
    QexSystem_Printf(message, log);
    return false;
}

bool LinkWater() {
    if (!Link(&g_QexWaterProgram.program, kWater, 1,
              "ERROR:< LoadWaterShader> link program failed because %s!\n"))
        return false;
    static const char* const samplers[] = {"NormalTex", "ReflectionTex", "RefractionTex",
                                           "NormalisationCubeMap"};
    for (GLint unit = 0; unit < 4; ++unit) SetSampler(g_QexWaterProgram.program, samplers[unit], unit);
    const struct {
        GLint* location;
        const char* name;
    } uniforms[] = {{&g_QexWaterProgram.modelViewMatrix, "ModelViewMatrix"},
                    {&g_QexWaterProgram.mvpMatrix, "MVPMatrix"},
                    {&g_QexWaterProgram.eyePosition, "EyePosition"},
                    {&g_QexWaterProgram.bumpTranslation[0], "BumpTranslation0"},
                    {&g_QexWaterProgram.bumpScale[0], "BumpScale0"},
                    {&g_QexWaterProgram.bumpTranslation[1], "BumpTranslation1"},
                    {&g_QexWaterProgram.bumpScale[1], "BumpScale1"},
                    {&g_QexWaterProgram.waterColour, "WaterColour"},
                    {&g_QexWaterProgram.waveDistortion, "WaveDistortion"},
                    {&g_QexWaterProgram.rcpWindowSize, "RcpWindowSize"}};
    for (const auto& uniform : uniforms)
        *uniform.location = Location(g_QexWaterProgram.program, uniform.name);
    return true;
}

// Links one program after the other, up to the first that fails.
bool LinkPrograms() {
    const char* const message = "ERROR:<LoadShaders> %s\n";
    if (!LinkWater() || !Link(&g_QexSkyProgram.program, kSky, 1, message)) return false;
    SetSampler(g_QexSkyProgram.program, "CubeMap", 0);
    g_QexSkyProgram.mvpMatrix = Location(g_QexSkyProgram.program, "MVPMatrix");
    g_QexSkyProgram.modelMatrix = Location(g_QexSkyProgram.program, "ModelMatrix");
    if (!Link(&m_Tex2DShader.program, kTex2D, 3, message)) return false;
    SetSampler(m_Tex2DShader.program, "Texture", 0);
    m_Tex2DShader.mvpMatrixLoc = Location(m_Tex2DShader.program, "MVPMatrix");
    if (!Link(&m_PlaneTexShader.program, kPlaneTex, 1, message)) return false;
    SetSampler(m_PlaneTexShader.program, "Texture", 0);
    m_PlaneTexShader.mvpMatrixLoc = Location(m_PlaneTexShader.program, "MVPMatrix");
    m_PlaneTexShader.rcpWindowSizeLoc = Location(m_PlaneTexShader.program, "RcpWindowSize");
    return true;
}

}  // namespace

QexSkyProgram g_QexSkyProgram;
QexWaterProgram g_QexWaterProgram;

extern "C" {

QexTex2DProgram m_Tex2DShader = {0, -1};
QexPlaneTexProgram m_PlaneTexShader = {0, -1, -1};

}  // extern "C"

bool QexSkyBox_CreatePrograms() {
    CompileShaders();
    return LinkPrograms();
}

void QexSkyBox_ReleasePrograms() {
    uint32_t* const programs[] = {&g_QexWaterProgram.program, &g_QexSkyProgram.program,
                                  &m_Tex2DShader.program, &m_PlaneTexShader.program};
    QexRenderState_UseProgram(0);
    for (uint32_t* program : programs) {
        if (*program) QEX_GL(glDeleteProgram(*program));
        *program = 0;
    }
    for (GLuint& shader : s_Shaders) {
        if (shader) QEX_GL(glDeleteShader(shader));
        shader = 0;
    }
}
