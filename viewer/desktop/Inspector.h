// The panel beside the picture: everything about a scene that can be seen and changed.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "front/Viewer.h"

// What the panel asks the window for.
struct InspectorWishes {
    std::string open;  // a file
    std::optional<size_t> clip;
    bool screenshot = false, turntable = false, copyLine = false;
};

class Inspector {
  public:
    static constexpr int kWidth = 340;  // points

    explicit Inspector(Viewer* viewer) : viewer_(viewer) {}

    // Between ImGui::NewFrame and ImGui::Render. `clips` names the animations that the file has, of which the
    // scene has one.
    InspectorWishes Show(const std::vector<std::string>& recent, const std::vector<std::string>& clips,
                         size_t clip);
    // What is shown and a command line does not say; empty when it says all.
    std::string LeftOut() const;

  private:
    void ShowPlayback();
    std::optional<size_t> ChooseClip(const std::vector<std::string>& clips, size_t clip);
    void ShowView();
    void ShowNodes();
    void ShowNode(uint32_t index);
    void ShowSelected();
    void ShowMaterials();
    void ChangeMaterial(const std::string& name, const QexPODMaterial& before, const QexPODMaterial& after);
    void ShowLights();
    void ShowEffects();
    void ShowSky();
    void ShowEmitters();
    void SaveEmitter(size_t index, const QexParticleEmitter& emitter);
    void ShowStatistics();

    Viewer* viewer_;
    SceneOptions edited_;
    // Of the scene of that load.
    size_t loads_ = 0;
    std::vector<std::string> nodeWords_;
    std::vector<std::vector<uint32_t>> children_;
    // Emitters whose values no file has, and which record they were changed in.
    std::map<std::string, const QexParticleEmitter*> unsaved_;
};
