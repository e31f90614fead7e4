// One program, the font's texture, and two buffers that are filled for each list.
#include "desktop/GuiDraw.h"

#include <initializer_list>

#include <GLES2/gl2.h>
#include <imgui.h>

#include "Qex.h"

namespace {

const char kVertex[] =
    "attribute vec2 place; attribute vec2 at; attribute vec4 colour; uniform vec2 scale;"
    "varying mediump vec2 texel; varying lowp vec4 tint;"
    "void main() { gl_Position = vec4(place * scale + vec2(-1.0, 1.0), 0.0, 1.0); texel = at; tint = colour; "
    "}";
const char kFragment[] =
    "uniform lowp sampler2D picture; varying mediump vec2 texel; varying lowp vec4 tint;"
    "void main() { gl_FragColor = tint * texture2D(picture, texel); }";

const void* Offset(size_t bytes) {
    return reinterpret_cast<const void*>(bytes);
}

void SetState(int program) {
    glUseProgram(static_cast<GLuint>(program));
    glEnable(GL_BLEND);
    glBlendEquation(GL_FUNC_ADD);
    glBlendFuncSeparate(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA, GL_ONE, GL_ONE_MINUS_SRC_ALPHA);
    glDisable(GL_CULL_FACE);
    glDisable(GL_DEPTH_TEST);
    glDisable(GL_STENCIL_TEST);
    glEnable(GL_SCISSOR_TEST);
    glActiveTexture(GL_TEXTURE0);
    for (GLuint i = 0; i < 3; ++i) glEnableVertexAttribArray(i);
}

}  // namespace

GuiDraw::GuiDraw() {
    const char* const names[] = {"place", "at", "colour"};
    QexShader_Create(&shaders_[0], kVertex, GL_VERTEX_SHADER);
    QexShader_Create(&shaders_[1], kFragment, GL_FRAGMENT_SHADER);
    QexShader_CreateProgram(&program_, shaders_[0], shaders_[1], names, 3, nullptr);
    scale_ = glGetUniformLocation(program_, "scale");
    glGenBuffers(2, buffers_);
    unsigned char* pixels = nullptr;
    int width = 0, height = 0;
    ImFontAtlas* fonts = ImGui::GetIO().Fonts;
    fonts->GetTexDataAsRGBA32(&pixels, &width, &height);
    glGenTextures(1, &font_);
    glBindTexture(GL_TEXTURE_2D, font_);
    for (const GLenum filter : {GL_TEXTURE_MIN_FILTER, GL_TEXTURE_MAG_FILTER})
        glTexParameteri(GL_TEXTURE_2D, filter, GL_LINEAR);
    for (const GLenum wrap : {GL_TEXTURE_WRAP_S, GL_TEXTURE_WRAP_T})
        glTexParameteri(GL_TEXTURE_2D, wrap, GL_CLAMP_TO_EDGE);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, width, height, 0, GL_RGBA, GL_UNSIGNED_BYTE, pixels);
    fonts->SetTexID(reinterpret_cast<ImTextureID>(static_cast<uintptr_t>(font_)));
    QexRenderState_Reset(nullptr);
}

GuiDraw::~GuiDraw() {
    QexRenderState_Restore();
    glDeleteTextures(1, &font_);
    glDeleteBuffers(2, buffers_);
    glDeleteProgram(program_);
    for (const uint32_t shader : shaders_) glDeleteShader(shader);
    QexRenderState_Reset(nullptr);
}

void GuiDraw::Draw(ImDrawData* data) {
    const float sx = data->FramebufferScale.x, sy = data->FramebufferScale.y;
    const int width = static_cast<int>(data->DisplaySize.x * sx),
              height = static_cast<int>(data->DisplaySize.y * sy);
    if (width < 1 || height < 1) return;
    QexRenderState_Restore();
    glViewport(0, 0, width, height);
    SetState(static_cast<int>(program_));
    glUniform2f(scale_, 2 / data->DisplaySize.x, -2 / data->DisplaySize.y);
    glBindBuffer(GL_ARRAY_BUFFER, buffers_[0]);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, buffers_[1]);
    for (int n = 0; n < data->CmdListsCount; ++n) {
        const ImDrawList* list = data->CmdLists[n];
        glBufferData(GL_ARRAY_BUFFER, list->VtxBuffer.size_in_bytes(), list->VtxBuffer.Data, GL_STREAM_DRAW);
        glBufferData(GL_ELEMENT_ARRAY_BUFFER, list->IdxBuffer.size_in_bytes(), list->IdxBuffer.Data,
                     GL_STREAM_DRAW);
        for (const ImDrawCmd& command : list->CmdBuffer) {
            if (command.UserCallback) {
                if (command.UserCallback != ImDrawCallback_ResetRenderState)
                    command.UserCallback(list, &command);
                continue;
            }
            const ImVec4& clip = command.ClipRect;
            const int left = static_cast<int>(clip.x * sx), top = static_cast<int>(clip.y * sy);
            const int right = static_cast<int>(clip.z * sx), bottom = static_cast<int>(clip.w * sy);
            if (right <= left || bottom <= top) continue;
            glScissor(left, height - bottom, right - left, bottom - top);
            const size_t base = command.VtxOffset * sizeof(ImDrawVert);
            const GLsizei stride = sizeof(ImDrawVert);
            glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, stride, Offset(base + offsetof(ImDrawVert, pos)));
            glVertexAttribPointer(1, 2, GL_FLOAT, GL_FALSE, stride, Offset(base + offsetof(ImDrawVert, uv)));
            glVertexAttribPointer(2, 4, GL_UNSIGNED_BYTE, GL_TRUE, stride,
                                  Offset(base + offsetof(ImDrawVert, col)));
            glBindTexture(GL_TEXTURE_2D,
                          static_cast<GLuint>(reinterpret_cast<uintptr_t>(command.GetTexID())));
            glDrawElements(GL_TRIANGLES, static_cast<GLsizei>(command.ElemCount),
                           sizeof(ImDrawIdx) == 2 ? GL_UNSIGNED_SHORT : GL_UNSIGNED_INT,
                           Offset(command.IdxOffset * sizeof(ImDrawIdx)));
        }
    }
    for (GLuint i = 0; i < 3; ++i) glDisableVertexAttribArray(i);
    glBindBuffer(GL_ARRAY_BUFFER, 0);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    glDisable(GL_SCISSOR_TEST);
    glDisable(GL_BLEND);
    glEnable(GL_DEPTH_TEST);
    QexRenderState_Reset(nullptr);
}
