// Particle emitters that qex render draws with a scene.
#pragma once

#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "Qex.h"

struct EmitterScene {
    std::vector<std::string> emitters;  // files, see LoadEmitter
    std::vector<std::string> textures;  // pictures of the frames of each emitter's animations, in order
    float time = 3;                     // seconds that they have run before the first picture
};

class Emitters {
  public:
    Emitters() = default;
    ~Emitters();
    Emitters(const Emitters&) = delete;
    Emitters& operator=(const Emitters&) = delete;

    // Loads all of it, runs it for its time, and draws the same random numbers each time. False, and what is
    // wrong, when a file cannot be used; a warning for one that is used in part. Without pictures all frames
    // show a soft spot of 64 x 64 pixels; with fewer than frames the pictures begin again.
    bool Load(const EmitterScene& scene, std::vector<std::string>* warnings, std::string* problem);

    void Run(float seconds);
    // Blended over what is there, nothing hidden by what is behind.
    void Draw(const QexCamera& camera) const;

  private:
    void AddTexture(const Image& image, const std::string& name);

    std::vector<QexParticleEmitter*> emitters_;
    std::vector<QexTexture*> textures_;
    double time_ = 0;  // seconds that they have run
    long updates_ = 0;
};
