// The sky that qex render draws around a scene, and still water in it.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "ImageFile.h"
#include "Qex.h"

class Sky {
  public:
    Sky() = default;
    ~Sky();
    Sky(const Sky&) = delete;
    Sky& operator=(const Sky&) = delete;

    // Takes one picture of a cross, 4 x 3 or 3 x 4 squares around the one towards -Z, or six squares, looks
    // towards +X, -X, +Y, -Y, +Z and -Z; those up and down continue the one towards -Z. False, and what is
    // wrong, when they are not that.
    bool Load(const std::vector<std::string>& files, std::string* problem);

    // Draws a scene of about that size within the sky and, with a height, over the water. The camera is given
    // the matrices of the sky's units: `drawOpaque` is called with it before the sky is drawn, and before,
    // for the reflection, with a mirrored one; `drawBlended` at the end.
    using DrawScene = std::function<void(const QexCamera& camera)>;
    void Draw(QexRuntimeContext* engine, const QexCamera& camera, std::optional<float> waterHeight,
              float sceneSize, const DrawScene& drawOpaque, const DrawScene& drawBlended);

  private:
    // The record with what its callback needs.
    struct Box : QexSkyBox {
        QexCamera largeCamera;  // the camera in the sky's units
        QexCamera sceneCamera;  // with the matrices of the last drawing
        float scale;            // of them to the scene's
        const DrawScene* draw;
    };
    static void CallDrawScene(QexSkyBox* record, const QexMatrix* view, const QexMatrix* projection);

    QexTexture texture_ = {};
    QexTexture* waves_ = nullptr;
    Box box_ = {};
    bool created_ = false;
};
