// The two programs that applications draw their own meshes with: textured with vertex colours, or lit.
#include "base/Memory.h"
#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/Program.h"
#include "Qex/renderer.h"

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

const QexProgramSource kSources[] = {
    {"QexShaderProgram_Create", kColourVertexSource, kColourFragmentSource, kColourAttributes, 4},
    {"QexShaderProgram_Create", kLightVertexSource, kLightFragmentSource, kLightAttributes, 3}};

// The application's records, which stay where they are until they are released.
struct Made {
    Made* next;
    QexShaderProgram* record;
};
Made* s_Made;

bool Note(QexShaderProgram* record);
void Drop(const QexShaderProgram* record);

// The shaders of the program created last.
GLuint s_VertexShader;
GLuint s_FragmentShader;

// A linked program keeps working without them.
void DeleteShaders() {
    if (s_VertexShader) glDeleteShader(s_VertexShader);
    if (s_FragmentShader) glDeleteShader(s_FragmentShader);
    s_VertexShader = s_FragmentShader = 0;
}

// Makes a record's program; without one after an error that was handled.
bool Build(QexShaderProgram* record) {
    const bool lit = record->type == QEX_PROGRAM_TEXTURE_LIGHT;
    const QexMaking making;
    DeleteShaders();
    record->program = 0;
    QexProgram_Compile(kSources[lit], {&record->program, &s_VertexShader, &s_FragmentShader});
    if (making.Failed()) return false;
    const QexProgramLookup lookup = {QEX_MODULE, record->program};
    record->mvpMatrixLoc = lookup.Uniform("MVPMatrix");
    if (lit)
        lookup.Uniforms({{&record->lightDirectionLoc, "LightDirection"},
                         {&record->lightColorLoc, "LightColor"},
                         {&record->globalAlphaLoc, "GlobalAlpha"}});
    lookup.SetSampler({"sTexture", kDiffuseUnit});
    if (!making.Failed()) return true;
    if (record->program) glDeleteProgram(record->program);
    record->program = 0;
    return false;
}

}  // namespace

extern "C" {

int32_t QexShaderProgram_Create(QexShaderProgram* record, uint32_t type) {
    record->type = type;
    if (type != QEX_PROGRAM_TEXTURE_LIGHT && type != QEX_PROGRAM_TEXTURE_COLOUR) return -1;
    if (Build(record) && Note(record)) return 0;
    QexShaderProgram_Release(record);
    record->program = 0;
    return -1;
}

void QexShaderProgram_Apply(const QexShaderProgram* record) {
    QexRenderState_UseProgram(record ? record->program : 0);
}

void QexShaderProgram_Release(QexShaderProgram* record) {
    QexRenderState_UseProgram(0);
    if (record->program) glDeleteProgram(record->program);
    Drop(record);
    DeleteShaders();
}

}  // extern "C"

namespace {

void Forget() {
    for (Made* made = s_Made; made; made = made->next) made->record->program = 0;
    s_VertexShader = s_FragmentShader = 0;
}
bool Restore() {
    bool whole = true;
    for (Made* made = s_Made; made; made = made->next) whole &= Build(made->record);
    return whole;
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, Restore, nullptr, false};

bool Note(QexShaderProgram* record) {
    for (const Made* made = s_Made; made; made = made->next)
        if (made->record == record) return true;
    Made* made = QexMemory_AllocZeroed<Made>(1);
    if (!made) return false;
    QexContext_Register(&s_Part);
    *made = {s_Made, record};
    s_Made = made;
    return true;
}

void Drop(const QexShaderProgram* record) {
    Made** at = &s_Made;
    while (*at && (*at)->record != record) at = &(*at)->next;
    Made* made = *at;
    if (made) *at = made->next;
    QexMemory_Free(made);
}

}  // namespace
