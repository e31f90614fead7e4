// Particle emitters that are drawn with a scene.
#pragma once

#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "Qex.h"

struct EmitterScene {
    std::vector<std::string> emitters;  // files
    std::vector<std::string> textures;  // pictures of the frames of each emitter's animations, in order
    float time = 3;                     // seconds that they have run before the first picture

    bool operator==(const EmitterScene& o) const {
        return emitters == o.emitters && textures == o.textures && time == o.time;
    }
};

// Reads a file into an emitter; null, and what is wrong, when it holds none. A line beside an emitter is a
// warning.
using EmitterLoader = QexParticleEmitter* (*)(const std::string& path, std::string* problem);
// Of the engine's own files.
QexParticleEmitter* LoadEmitterFile(const std::string& path, std::string* problem);

class Emitters {
  public:
    Emitters() = default;
    ~Emitters();
    Emitters(const Emitters&) = delete;
    Emitters& operator=(const Emitters&) = delete;

    // Loads all of it, runs it for its time, and draws the same random numbers each time. False, and what is
    // wrong, when a file cannot be used; a warning for one that is used in part. Without pictures all frames
    // show a soft spot of 64 x 64 pixels; with fewer than frames the pictures begin again.
    bool Load(const EmitterScene& scene, EmitterLoader load, std::vector<std::string>* warnings,
              std::string* problem);

    void Run(float seconds);
    // Seconds that they have run, as EmitterScene has them.
    float Time() const;
    // Blended over what is there, nothing hidden by what is behind.
    void Draw(const QexCamera& camera) const;
    // To read and change; in the order of the files.
    const std::vector<QexParticleEmitter*>& All() const { return emitters_; }

  private:
    void AddTexture(const Image& image, const std::string& name);

    std::vector<QexParticleEmitter*> emitters_;
    std::vector<QexTexture*> textures_;
    double time_ = 0;  // seconds that they have run
    long updates_ = 0;
};
