// Cuts pictures into the squares of a cube map, and draws the scene in units that suit the water.
#include "scene/Sky.h"

#include <algorithm>
#include <cmath>

#include <GLES2/gl2.h>

#include "Paint.h"
#include "scene/Textures.h"

namespace {

// Far enough for the water to reach the horizon, nearly.
constexpr float kFarDistance = 50;  // times the camera's
// Waves have a size in units, so a scene is drawn this large.
constexpr float kSceneSize = 150;
constexpr int kWaves = 256;  // pixels of their texture

// How a look is seen in its picture: the axes that run to the right and up, and their signs; in which square
// of a cross it lies, across and down, four squares wide or four high.
struct Look {
    size_t right, up;
    float rightSign, upSign;
    int wide[2], high[2];
};
const Look kLooks[6] = {{2, 1, 1, 1, {2, 1}, {2, 1}},  {2, 1, -1, 1, {0, 1}, {0, 1}},
                        {0, 2, 1, 1, {1, 0}, {1, 0}},  {0, 2, 1, -1, {1, 2}, {1, 2}},
                        {0, 1, -1, 1, {3, 1}, {1, 3}}, {0, 1, 1, 1, {1, 1}, {1, 1}}};

// A square part of a picture.
struct Square {
    const Image* image;
    int left, top, size;
    bool turned;  // by half a turn

    std::array<uint8_t, 4> At(float s, float t) const {
        if (turned) s = -s, t = -t;
        const auto texel = [this](float along) {
            return std::clamp(static_cast<int>((along + 1) / 2 * static_cast<float>(size)), 0, size - 1);
        };
        const uint8_t* pixel = image->Pixel(left + texel(s), top + texel(-t));
        return {pixel[0], pixel[1], pixel[2], 255};
    }
};

// The looks' squares in one cross or in six pictures.
bool Arrange(const std::vector<Image>& images, Square squares[6], std::string* problem) {
    const Image& first = images[0];
    const int across = images.size() == 6 ? 1 : first.width > first.height ? 4 : 3;
    const int down = images.size() == 6 ? 1 : 7 - across;
    for (size_t i = 0; i < 6; ++i) {
        const Image& image = images[images.size() == 6 ? i : 0];
        const int size = image.width / across;
        if (image.width != size * across || image.height != size * down) {
            *problem = std::to_string(image.width) + " x " + std::to_string(image.height) +
                       " pixels are not " + (images.size() == 6 ? "a square" : "4 x 3 or 3 x 4 squares");
            return false;
        }
        const int* cell = across == 4 ? kLooks[i].wide : kLooks[i].high;
        squares[i] = {&image, 0, 0, size, false};
        if (images.size() == 6) continue;
        squares[i].left = cell[0] * size;
        squares[i].top = cell[1] * size;
        // Below the look down, the one back stands on its head.
        squares[i].turned = cell[1] == 3;
    }
    return true;
}

}  // namespace

void Sky::CallDrawScene(QexSkyBox* record, const QexMatrix* view, const QexMatrix* projection) {
    Box& box = *static_cast<Box*>(record);
    QexMatrix scale;
    QexMatrix_Scale(&scale, box.scale, box.scale, box.scale);
    QexMatrix_Multiply(&box.sceneCamera.viewMatrix, view, &scale);
    box.sceneCamera.projectionMatrix = *projection;
    (*box.draw)(box.sceneCamera);
}

Sky::~Sky() {
    QexSkyBox_Release();
    if (waves_) QexTexture_Release(waves_);
    QexMemory_Free(waves_);
    if (texture_.glName) QexTexture_Release(&texture_);
}

bool Sky::LoadTexture(const std::vector<std::string>& files, std::string* problem) {
    std::vector<Image> images(files.size());
    for (size_t i = 0; i < files.size(); ++i)
        if (!LoadImage(files[i], &images[i], problem)) {
            *problem = files[i] + ": " + *problem;
            return false;
        }
    Square squares[6];
    if (!Arrange(images, squares, problem)) {
        *problem = files[0] + ": " + *problem;
        return false;
    }
    GLint most = 0;
    glGetIntegerv(GL_MAX_CUBE_MAP_TEXTURE_SIZE, &most);
    const auto paint = [&squares](const pod::Vec3& look) {
        size_t axis = 0;
        for (size_t i = 1; i < 3; ++i)
            if (std::fabs(look[i]) > std::fabs(look[axis])) axis = i;
        const size_t index = 2 * axis + (look[axis] < 0);
        const Look& l = kLooks[index];
        return squares[index].At(l.rightSign * look[l.right], l.upSign * look[l.up]);
    };
    const std::vector<uint8_t> file =
        pod::WritePvr(pod::SkyCube(static_cast<uint32_t>(std::min(squares[0].size, most)), paint));
    if (QexTexture_LoadPVRFromMemSized(&texture_, file.data(), static_cast<uint32_t>(file.size()), nullptr, 0,
                                       0, nullptr) != 0) {
        *problem = files[0] + ": the GL does not take a cube map of it";
        return false;
    }
    QexTexture_SetFilter(&texture_, QEX_FILTER_LINEAR);
    QexTexture_SetWrapping(&texture_, QEX_WRAP_CLAMP);
    return true;
}

bool Sky::Load(const std::vector<std::string>& files, const QexCamera& first, float sceneSize,
               std::optional<float> waterHeight, std::string* problem) {
    if (!LoadTexture(files, problem)) return false;
    waves_ = NewPictureTexture({kWaves, kWaves, pod::Waves(kWaves)}, "waves");
    box_.scale = kSceneSize / sceneSize;
    box_.size = kFarDistance * first.farPlane * box_.scale;
    box_.skyTexture = &texture_;
    box_.waterNormalTexture = waves_;
    box_.waterEnabled = waterHeight.has_value();
    box_.waterHeight = -waterHeight.value_or(0) * box_.scale;
    box_.camera = &box_.largeCamera;
    box_.drawScene = CallDrawScene;
    SetCamera(first);
    *problem = "the GL cannot draw the sky";
    if (QexSkyBox_Create(&box_) != 0 || !m_PlaneTexShader.program) return false;
    problem->clear();
    return true;
}

void Sky::SetCamera(const QexCamera& camera) {
    QexVec3 eye, target;
    QexVec3_Scale(&eye, &camera.eye, box_.scale);
    QexVec3_Scale(&target, &camera.target, box_.scale);
    QexCamera_LookAt(&box_.largeCamera, &eye, &target, &camera.up);
    // The automatic camera's near plane is for the scene; water may come nearer.
    const float above = box_.waterEnabled ? eye.y + box_.waterHeight : 0;
    const float zNear = camera.nearPlane * box_.scale;
    QexCamera_Project(&box_.largeCamera, camera.fov, camera.aspect,
                      above > 0 ? std::min(zNear, above / 2) : zNear, box_.size);
    box_.centre = eye;
    box_.sceneCamera = camera;
}

void Sky::Draw(QexRuntimeContext* engine, const QexCamera& camera, const DrawScene& drawOpaque,
               const DrawScene& drawBlended) {
    SetCamera(camera);
    box_.draw = &drawOpaque;
    QexSkyBox_Update(engine, &box_, 0);
    drawBlended(box_.sceneCamera);
}
