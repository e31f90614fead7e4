#include "gl/GL.h"
#include "gl/Program.h"

#define QEX_MODULE "src/QexRuntimeContext"

namespace {

// Both types differ in how the fragment's colour comes about: interpolated, or lit per vertex.
const char* const kColourVertexSource = R"(
attribute highp vec3 inVertex;
attribute highp vec3 inNormal;
attribute highp vec4 inColor;
attribute mediump vec2 inTexCoord;
uniform highp mat4 MVPMatrix;
varying mediump vec2 TexCoord;
varying mediump vec4 Colors;
void main() {
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
    TexCoord = inTexCoord;
    Colors = inColor;
}
)";

const char* const kColourFragmentSource = R"(
uniform sampler2D sTexture;
varying mediump vec2 TexCoord;
varying mediump vec4 Colors;
void main() {
    gl_FragColor = texture2D(sTexture, TexCoord) * Colors;
}
)";

const char* const kLightVertexSource = R"(
attribute highp vec3 inVertex;
attribute highp vec3 inNormal;
attribute mediump vec2 inTexCoord;
uniform highp mat4 MVPMatrix;
uniform mediump vec3 LightDirection;
varying lowp float LightIntensity;
varying mediump vec2 TexCoord;
void main() {
    gl_Position = MVPMatrix * vec4(inVertex, 1.0);
    TexCoord = inTexCoord;
    LightIntensity = dot(inNormal, -LightDirection);
}
)";

const char* const kLightFragmentSource = R"(
uniform sampler2D sTexture;
uniform lowp vec3 LightColor;
uniform lowp float GlobalAlpha;
varying lowp float LightIntensity;
varying mediump vec2 TexCoord;
void main() {
    gl_FragColor = texture2D(sTexture, TexCoord) * vec4(LightColor * LightIntensity, GlobalAlpha);
}
)";

const char* const kColourAttributes[] = {"inVertex", "inNormal", "inColor", "inTexCoord"};
const char* const kLightAttributes[] = {"inVertex", "inNormal", "inTexCoord"};

// The shaders of the program created last.
GLuint s_VertexShader;
GLuint s_FragmentShader;

int32_t Location(const QexShaderProgram* record, const char* name) {
    int32_t location;
    QEX_GL(location = glGetUniformLocation(record->program, name));
    return location;
}

// A linked program keeps working without them.
void DeleteShaders() {
    if (s_VertexShader) glDeleteShader(s_VertexShader);
    if (s_FragmentShader) glDeleteShader(s_FragmentShader);
    s_VertexShader = s_FragmentShader = 0;
}

}  // namespace

extern "C" {

int32_t QexShaderProgram_Create(QexShaderProgram* record, uint32_t type) {
    record->type = type;
    const bool lit = type == QEX_PROGRAM_TEXTURE_LIGHT;
    if (!lit && type != QEX_PROGRAM_TEXTURE_COLOUR) return -1;
    DeleteShaders();
    QexShader_Create(&s_VertexShader, lit ? kLightVertexSource : kColourVertexSource, GL_VERTEX_SHADER);
    QexShader_Create(&s_FragmentShader, lit ? kLightFragmentSource : kColourFragmentSource,
                     GL_FRAGMENT_SHADER);
    if (QexShader_CreateProgram(&record->program, s_VertexShader, s_FragmentShader,
                                lit ? kLightAttributes : kColourAttributes, lit ? 3 : 4, nullptr) != 0)
        QexShader_LogFailure("QexShaderProgram_Create", s_VertexShader, s_FragmentShader, record->program);
    record->mvpMatrixLoc = Location(record, "MVPMatrix");
    if (lit) {
        record->lightDirectionLoc = Location(record, "LightDirection");
        record->lightColorLoc = Location(record, "LightColor");
        record->globalAlphaLoc = Location(record, "GlobalAlpha");
    }
    QEX_GL(glUniform1i(Location(record, "sTexture"), 0));
    return 0;
}

void QexShaderProgram_Apply(const QexShaderProgram* record) {
    QexRenderState_UseProgram(record ? record->program : 0);
}

void QexShaderProgram_Release(QexShaderProgram* record) {
    QexRenderState_UseProgram(0);
    if (record->program) glDeleteProgram(record->program);
    DeleteShaders();
}

}  // extern "C"
