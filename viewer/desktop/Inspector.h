// The panel beside the picture: everything about a scene that can be seen and changed.
#pragma once

#include <string>

#include "front/Viewer.h"

// What the panel asks the window for.
struct InspectorWishes {
    std::string open;  // a file
    bool screenshot = false, turntable = false, copyLine = false;
};

class Inspector {
  public:
    static constexpr int kWidth = 340;  // points

    explicit Inspector(Viewer* viewer) : viewer_(viewer) {}

    // Between ImGui::NewFrame and ImGui::Render.
    InspectorWishes Show(const std::vector<std::string>& recent);

  private:
    void ShowPlayback();
    void ShowView();
    void ShowNodes();
    void ShowNode(uint32_t index, const std::vector<std::vector<uint32_t>>& children);
    void ShowMaterials();
    void ShowLights();
    void ShowEffects();
    void ShowEmitters();
    void ShowStatistics();

    Viewer* viewer_;
    SceneOptions edited_;
};
