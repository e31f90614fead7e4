// Draws what Dear ImGui has laid out, with OpenGL ES 2.0.
#pragma once

#include <cstdint>

struct ImDrawData;

class GuiDraw {
  public:
    // With the font of the current ImGui context. The GL context is current.
    GuiDraw();
    ~GuiDraw();
    GuiDraw(const GuiDraw&) = delete;
    GuiDraw& operator=(const GuiDraw&) = delete;

    void Draw(ImDrawData* data);

  private:
    uint32_t shaders_[2] = {0, 0}, program_ = 0, font_ = 0, buffers_[2] = {0, 0};
    int scale_ = -1;
};
