// Corners of billboards, placed on the screen here and streamed through one buffer.
#include "overlay/BillboardBatch.h"

#include "gl/GL.h"
#include "gl/LeanState.h"
#include "gl/Program.h"
#include "math/Float4.h"
#include "Qex/base.h"
#include "Qex/renderer.h"
#include "Qex/textures.h"

namespace {

constexpr uint32_t kMost = 300;  // billboards of a draw, as many as an emitter has

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

const QexVertexAttribute kLayout[] = {{4, GL_FLOAT, 0, sizeof(Corner), 0},
                                      {3, GL_FLOAT, 0, sizeof(Corner), offsetof(Corner, u)}};
constexpr uint32_t kBothAttributes = 3;

struct {
    GLuint program, vertexShader, fragmentShader;
    GLuint vertexBuffer, indexBuffer, vertexArray;
    bool failed;
} s_GL;

Corner s_Corners[kMost][4];
uint32_t s_Count;
QexTexture* s_Texture;

bool Create() {
    static uint16_t indices[kMost][6];
    if (s_GL.program || s_GL.failed) return !s_GL.failed;
    s_GL.failed = !QexProgram_Build({"QexBillboard_Draw", kVertexSource, kFragmentSource, kAttributes, 2},
                                    {&s_GL.program, &s_GL.vertexShader, &s_GL.fragmentShader});
    if (s_GL.failed) return false;
    QexProgramLookup{"src/QexBillboard", s_GL.program, false}.SetSampler({"sTexture", kDiffuseUnit});
    for (uint32_t i = 0; i < kMost; ++i) {
        static const uint16_t corners[] = {0, 2, 1, 1, 2, 3};
        for (int c = 0; c < 6; ++c) indices[i][c] = static_cast<uint16_t>(4 * i + corners[c]);
    }
    QexRenderState_Restore();
    glGenBuffers(1, &s_GL.vertexBuffer);
    glGenBuffers(1, &s_GL.indexBuffer);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, s_GL.indexBuffer);
    glBufferData(GL_ELEMENT_ARRAY_BUFFER, sizeof indices, indices, GL_STATIC_DRAW);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    return true;
}

}  // namespace

void QexBillboardBatch_Add(const QexBillboard& billboard, const QexMatrix& mvp) {
    if (s_Count == kMost || (s_Count && billboard.texture != s_Texture)) QexBillboardBatch_Draw();
    s_Texture = billboard.texture;
    const Float4x4 m = Load4x4(mvp.m);
    for (int i = 0; i < 4; ++i) {
        const float *p = g_BB_Vertices + 3 * i, *uv = g_BB_UVs + 2 * i;
        Corner& corner = s_Corners[s_Count][i];
        Store4(corner.position, m.x * p[0] + m.y * p[1] + m.w);
        corner.u = uv[0];
        corner.v = uv[1];
        corner.opacity = billboard.opacity;
    }
    ++s_Count;
}

void QexBillboardBatch_Draw() {
    if (!s_Count || !Create()) {
        s_Count = 0;
        return;
    }
    QexTexture* texture = s_Texture ? s_Texture : Qextexture_GetDefault();
    const GLsizei count = static_cast<GLsizei>(s_Count);
    texture->stage = kDiffuseUnit;
    QexRenderState_UseProgram(s_GL.program);
    QexLeanState_BindTexture(kDiffuseUnit, GL_TEXTURE_2D, texture->glName);
    QexLeanState_BindMesh({s_GL.vertexBuffer, s_GL.indexBuffer, kLayout, 2, &s_GL.vertexArray},
                          kBothAttributes);
    QexLeanState_Stream(s_GL.vertexBuffer, s_Corners, sizeof s_Corners[0] * s_Count);
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
    QexRenderState_Restore();
    QexLeanState_DeleteVertexArrays(1, &s_GL.vertexArray);
    glDeleteBuffers(1, &s_GL.vertexBuffer);
    glDeleteBuffers(1, &s_GL.indexBuffer);
    QexProgram_Delete({&s_GL.program, &s_GL.vertexShader, &s_GL.fragmentShader}, false);
    s_GL.vertexBuffer = s_GL.indexBuffer = s_GL.vertexArray = 0;
}
