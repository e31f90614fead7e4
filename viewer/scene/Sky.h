// The sky that is drawn around a scene, and still water in it.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "common/ImageFile.h"
#include "Qex.h"

class Sky {
  public:
    Sky() = default;
    ~Sky();
    Sky(const Sky&) = delete;
    Sky& operator=(const Sky&) = delete;

    // Takes one picture of a cross, 4 x 3 or 3 x 4 squares around the one towards -Z, or six squares, looks
    // towards +X, -X, +Y, -Y, +Z and -Z; those up and down continue the one towards -Z. Makes a sky for a
    // scene of about that size and a camera like the first one, with water if there is a height. False, and
    // what is wrong, when the pictures are not that.
    bool Load(const std::vector<std::string>& files, const QexCamera& first, float sceneSize,
              std::optional<float> waterHeight, std::string* problem);

    // Draws the scene within the sky and over the water. The camera is given the matrices of the sky's units:
    // `drawOpaque` is called with it before the sky is drawn, and before that, for the reflection, with a
    // mirrored one; `drawBlended` at the end.
    using DrawScene = std::function<void(const QexCamera& camera)>;
    void Draw(QexRuntimeContext* engine, const QexCamera& camera, const DrawScene& drawOpaque,
              const DrawScene& drawBlended);

  private:
    // The record with what its callback needs.
    struct Box : QexSkyBox {
        QexCamera largeCamera;  // the camera in the sky's units
        QexCamera sceneCamera;  // with the matrices of the last drawing
        float scale;            // of them to the scene's
        const DrawScene* draw;
    };
    bool LoadTexture(const std::vector<std::string>& files, std::string* problem);
    void SetCamera(const QexCamera& camera);
    static void CallDrawScene(QexSkyBox* record, const QexMatrix* view, const QexMatrix* projection);

    QexTexture texture_ = {};
    QexTexture* waves_ = nullptr;
    Box box_ = {};
};
