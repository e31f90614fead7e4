// A viewer without its window: events in, a picture out. A desktop window and a page in a browser are shells
// around it.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "front/Lines.h"
#include "front/OrbitCamera.h"
#include "front/Playback.h"
#include "scene/SceneView.h"

enum Modifier : unsigned { kShift = 1, kControl = 2, kAlt = 4 };

struct ViewerEvent {
    enum Kind { kPointerDown, kPointerMove, kPointerUp, kWheel, kPinch, kKey, kDrop, kResize };
    Kind kind;
    float x = 0, y = 0;  // pixels from the upper left corner; kResize: width and height
    int button = 0;      // 1 left, 2 middle, 3 right; kPointer...
    float amount = 0;    // kWheel: notches towards the scene; kPinch: factor of the fingers' distance
    unsigned modifiers = 0;
    std::string text;  // kKey: the key's name as in Keys(); kDrop: a path
};

enum class Overlay { kGrid, kWireframe, kBoxes, kBones, kNormals, kCount };
extern const char* const kOverlayNames[static_cast<size_t>(Overlay::kCount)];

// The last frames' times and the scene's size.
struct ViewerStatistics {
    std::array<float, 120> frameTimes = {};  // milliseconds, a ring
    size_t next = 0;
    uint64_t calls = 0;  // of GL in the last picture, if they are counted
    uint64_t triangles = 0;
};

class Viewer {
  public:
    // The GL context is current as long as this lives. `calls` returns how many GL calls were made, or is
    // null.
    explicit Viewer(int width, int height, EmitterLoader loadEmitter = LoadEmitterFile,
                    uint64_t (*calls)() = nullptr);
    ~Viewer();
    Viewer(const Viewer&) = delete;
    Viewer& operator=(const Viewer&) = delete;

    // Begins to load a POD scene; the one that is shown stays until it is there, and if it fails. What is
    // shown to people as its name may be another file that it was made from.
    void Open(const std::string& path, const std::string& name = "");
    // The same from memory: bytes of scenes and of what lies beside them, kept in a folder of their own. The
    // next Tick opens a scene, shows its textures that came later, or shows a texture that is of no scene by
    // itself; emitters are drawn with what is there.
    void OpenBytes(const std::string& name, const void* bytes, size_t size);
    // Keeps bytes for what names them, the pictures of a sky for example. Where they lie, or "" where there
    // is no room for them, which is said.
    std::string KeepBytes(const std::string& name, const void* bytes, size_t size);
    // The scene again, with camera and playback as they are.
    void Reload(const std::string& path);
    bool IsLoading() const { return view_->IsLoading(); }

    // The GL context is gone; nothing is drawn until there is one again.
    void ContextLost();
    // Another one is current: all is made again, the scene from its file, as it is shown.
    void ContextRestored();

    // A scene is on its way: nothing is shown in its place.
    void SetWaiting(bool waits) { waits_ = waits; }

    void Handle(const ViewerEvent& event);
    void Tick(double seconds);
    // Draws into the framebuffer that is bound. Nothing for a surface without pixels.
    void Draw(int width, int height, bool overlays = true);
    // Fits what is around the scene to it as it is now, as pictures by the command have it.
    void FitToFrame();
    // Draws without overlays and reads it, the top row first: the picture of AsRenderOptions. `samples` are
    // those of a pixel of the surface, which is at least as large and may be drawn over.
    std::vector<uint8_t> Picture(int width, int height, int samples);

    // Whatever people look at and change.
    const SceneOptions& Options() const { return options_; }
    void SetOptions(const SceneOptions& options);
    void SetSceneCamera(int index);
    void FrameAll();
    void Turn(float yaw);  // degrees
    void Select(int node);
    int Selected() const { return selected_; }
    bool Shows(Overlay overlay) const { return overlays_[static_cast<size_t>(overlay)]; }
    void Show(Overlay overlay, bool shows) { overlays_[static_cast<size_t>(overlay)] = shows; }
    bool ShowsHelp() const { return help_; }
    OrbitCamera& Camera() { return camera_; }
    Playback& Play() { return playback_; }
    SceneView& View() { return *view_; }
    const ViewerStatistics& Statistics() const { return statistics_; }
    const std::string& Path() const { return path_; }
    const std::string& Name() const { return name_; }

    // Takes the scene's own lights over as lights that can be moved; directional ones from far away.
    void TakeSceneLights();

    // What there is to say, the newest last.
    const std::vector<std::string>& Messages() const { return messages_; }
    void Say(const std::string& text);
    size_t Said() const { return said_; }  // in all
    // Says why a scene could not be loaded.
    void Fail(const std::string& text);
    size_t FailedLoads() const { return failed_; }
    size_t Loads() const { return loads_; }  // that ended well

    // What makes this picture with qex render, with particles as emitters' files have them.
    RenderOptions AsRenderOptions(int width, int height) const;

    struct Key {
        const char* key;  // as in events
        unsigned modifiers;
        const char* help;
        void (*run)(Viewer*);
    };
    static const std::vector<Key>& Keys();
    // The table of keys and what the pointer does, a line each.
    static std::string HelpText();

  private:
    struct Touch {
        float x, y, moved;
        int button;
        unsigned modifiers;
        int held;  // a light's index, kNode or kNothing
    };
    static constexpr int kNothing = -1, kNode = -2;
    // A place as it is seen: pixels from the upper left corner, how large one is there in the world, and as
    // far to the right and down.
    struct Spot {
        float x, y, pixel;
        QexVec3 right, down;
    };
    bool See(const QexVec3& place, Spot* spot) const;
    int HeldAt(float x, float y, unsigned modifiers) const;
    void MoveHeld(int held, float dx, float dy);
    static std::vector<uint8_t> Read(int width, int height);
    void Resize(int width, int height);
    void Drag(const ViewerEvent& event);
    void Click(float x, float y, unsigned modifiers);
    void ContinueLoad();
    void OpenAdded();
    void ShowTexture(const std::string& name);
    void Loaded();
    void DrawOverlays();
    void AddMesh(uint32_t node, bool wires, bool normals);
    void DrawGreeting();
    bool IsEmpty() const;
    float Aspect() const;
    void CameraMoved();
    const SceneOptions& Moved();

    QexRuntimeContext engine_ = {};
    std::unique_ptr<SceneView> view_;
    uint64_t (*calls_)();
    SceneOptions options_;
    OrbitCamera camera_;
    Playback playback_;
    Lines inside_, over_;
    ViewerStatistics statistics_;
    std::vector<std::string> messages_;
    std::string path_, name_, loadingPath_, loadingName_, folder_, addedScene_, addedTexture_;
    std::array<bool, static_cast<size_t>(Overlay::kCount)> overlays_ = {};
    bool help_ = false, keep_ = false, waits_ = false;
    int selected_ = -1;
    size_t failed_ = 0, said_ = 0, loads_ = 0;
    std::vector<Touch> touches_;
};
