// Corners of billboards, placed on the screen here and streamed through one buffer.
#include "overlay/BillboardBatch.h"

#include "gl/Context.h"
#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "math/Float4.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

namespace {

const char* const kVertexSource = R"(
attribute highp vec4 inVertex;
attribute mediump vec3 inTexCoord;
varying mediump vec3 fTexCoord;
void main() {
    gl_Position = inVertex;
    fTexCoord = inTexCoord;
}
)";

// The third coordinate is the opacity. What comes of both is as good as transparent up to the threshold.
const char* const kFragmentSource = R"(
precision mediump float;
uniform sampler2D sTexture;
varying vec3 fTexCoord;
void main() {
    vec4 texel = texture2D(sTexture, fTexCoord.xy);
    float alpha = fTexCoord.z * texel.a;
    gl_FragColor = vec4(texel.rgb, alpha <= 0.001 ? 0.0 : alpha);
}
)";

const char* const kAttributes[] = {"inVertex", "inTexCoord"};

struct Corner {
    float position[4];  // in clip space
    float u, v, opacity;
};

const QexFloatAttribute kLayout[] = {{0, 4, offsetof(Corner, position)}, {1, 3, offsetof(Corner, u)}};

struct {
    GLuint program, vertexShader, fragmentShader;
    bool failed;
} s_GL;

Corner s_Corners[kQuadsOfADraw][4];
uint32_t s_Count;
QexTexture* s_Texture;

void Forget() {
    s_GL = {};
    s_Count = 0;
}
QexContextPart s_Part = {kRankPrograms, Forget, nullptr, nullptr, nullptr, false};

bool Create() {
    QexContext_Register(&s_Part);
    if (s_GL.program || s_GL.failed || g_QexContextLost) return s_GL.program != 0;
    const QexMaking making;
    s_GL.failed = !QexProgram_Build({"QexBillboard_Draw", kVertexSource, kFragmentSource, kAttributes, 2},
                                    {&s_GL.program, &s_GL.vertexShader, &s_GL.fragmentShader});
    if (s_GL.failed) {
        s_GL.failed = !g_QexContextLost;
        return false;
    }
    QexProgramLookup{"src/QexBillboard", s_GL.program, false}.SetSampler({"sTexture", kDiffuseUnit});
    return true;
}

}  // namespace

void QexBillboardBatch_Add(const QexBillboard& billboard, const QexMatrix& mvp) {
    if (s_Count == kQuadsOfADraw || (s_Count && billboard.texture != s_Texture)) QexBillboardBatch_Draw();
    s_Texture = billboard.texture;
    const Float4x4 m = Load4x4(mvp.m);
    for (int i = 0; i < 4; ++i) {
        const float *p = g_BB_Vertices + 3 * g_BB_indices[i], *uv = g_BB_UVs + 2 * g_BB_indices[i];
        Corner& corner = s_Corners[s_Count][i];
        Store4(corner.position, m.x * p[0] + m.y * p[1] + m.w);
        corner.u = uv[0];
        corner.v = uv[1];
        corner.opacity = billboard.opacity;
    }
    ++s_Count;
}

void QexBillboardBatch_Draw() {
    const GLuint indices = s_Count && Create() ? QexLeanState_QuadIndices() : 0;
    if (!indices) {
        s_Count = 0;
        return;
    }
    QexTexture* texture = s_Texture ? s_Texture : Qextexture_GetDefault();
    const GLsizei count = static_cast<GLsizei>(s_Count);
    texture->stage = kDiffuseUnit;
    QexRenderState_UseProgram(s_GL.program);
    QexLeanState_BindTexture(kDiffuseUnit, GL_TEXTURE_2D, texture->glName);
    const GLuint buffer = QexLeanState_StreamBuffer();
    QexLeanState_Fill(buffer, s_Corners, sizeof s_Corners[0] * s_Count, GL_STREAM_DRAW);
    QexLeanState_BindFloats({buffer, indices, sizeof(Corner), kLayout, 2});
    glDisable(GL_CULL_FACE);
    glDrawElements(GL_TRIANGLES, 6 * count, GL_UNSIGNED_SHORT, nullptr);
    glEnable(GL_CULL_FACE);
    s_Count = 0;
}

void QexBillboardBatch_Release() {
    s_Count = 0;
    if (!s_GL.program) {
        s_GL.failed = false;
        return;
    }
    QexProgram_Delete({&s_GL.program, &s_GL.vertexShader, &s_GL.fragmentShader}, false);
}
