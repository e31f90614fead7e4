// 1,000 lit cubes, a node each: Irrlicht's scene manager on its null device, which makes no GL call at all,
// against lean drawing under the tap's null driver, which counts and follows every call.
#include <irrlicht.h>

#include <cstdlib>

#include "BenchEngine.h"
#include "gltap.h"
#include "Ratio.h"

namespace {

constexpr uint32_t kNodes = 1000, kSide = 32;
constexpr int kWidth = 640, kHeight = 480;

void Require(bool fine, const char* what) {
    if (fine) return;
    fprintf(stderr, "%s\n", what);
    exit(1);
}

// Where node i stands when it moves; the same to both.
float X(uint32_t i) {
    return static_cast<float>(i % kSide);
}
float Y(uint32_t i) {
    return static_cast<float>(i / kSide);
}
float Z(uint32_t frame) {
    return static_cast<float>(frame % 16) / 16;
}

class IrrlichtScene {
  public:
    IrrlichtScene() {
        irr::SIrrlichtCreationParameters wanted;
        wanted.DriverType = irr::video::EDT_NULL;
        wanted.WindowSize = {kWidth, kHeight};
        wanted.LoggingLevel = irr::ELL_NONE;
        device_ = irr::createDeviceEx(wanted);
        Require(device_, "Irrlicht makes no null device");
        manager_ = device_->getSceneManager();
        irr::scene::IMesh* cube = manager_->getGeometryCreator()->createCubeMesh({0.5f, 0.5f, 0.5f});
        for (uint32_t i = 0; i < kNodes; ++i)
            nodes_.push_back(manager_->addMeshSceneNode(cube, nullptr, -1, {X(i), Y(i), 0}));
        cube->drop();
        // Irrlicht's space is left-handed.
        manager_->addCameraSceneNode(nullptr, {16, 16, -60}, {16, 16, 0})->setFarValue(100);
        manager_->addLightSceneNode(nullptr, {0, 0, -60})->setLightType(irr::video::ELT_DIRECTIONAL);
    }
    ~IrrlichtScene() { device_->drop(); }
    IrrlichtScene(const IrrlichtScene&) = delete;
    IrrlichtScene& operator=(const IrrlichtScene&) = delete;

    void Move() {
        ++frame_;
        for (uint32_t i = 0; i < kNodes; ++i) nodes_[i]->setPosition({X(i), Y(i), Z(frame_)});
    }
    void Draw() {
        device_->getVideoDriver()->beginScene();
        manager_->drawAll();
        device_->getVideoDriver()->endScene();
    }
    void RequireAll() {
        Draw();
        Require(device_->getVideoDriver()->getPrimitiveCountDrawn() == 12 * kNodes,
                "Irrlicht does not draw every node");
    }

  private:
    irr::IrrlichtDevice* device_;
    irr::scene::ISceneManager* manager_;
    std::vector<irr::scene::IMeshSceneNode*> nodes_;
    uint32_t frame_ = 0;
};

class QexScene {
  public:
    QexScene() : engine_(kWidth, kHeight, scenes::Grid(kNodes)), lit_(QexGouraudShader_CreateProgram()) {
        QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
        QexModel_SetShaderProgramForAllNode(&engine_.model, lit_, nullptr);
        camera_ = BenchEngine::Camera({16, 16, 60}, {16, 16, 0}, static_cast<float>(kWidth) / kHeight);
    }
    ~QexScene() { QexGouraudShader_Release(&lit_); }
    QexScene(const QexScene&) = delete;
    QexScene& operator=(const QexScene&) = delete;

    void Move() {
        ++frame_;
        for (uint32_t i = 0; i < kNodes; ++i)
            QexModel_SetNodePosition(&engine_.model, i, X(i), Y(i), Z(frame_));
    }
    void Draw() {
        static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {0, 0, -1}, {1, 1, 1, 1}}}};
        QexModel_RenderWithCamera(&engine_.model, &lights, &camera_, nullptr, 0);
    }
    void RequireAll() {
        Draw();
        gltapResetCounts();
        Draw();
        Require(gltapCount("glDrawElements") == kNodes, "the engine does not draw every node");
    }

  private:
    BenchEngine engine_;
    QexShaderModule* lit_;
    QexCamera camera_;
    uint32_t frame_ = 0;
};

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    gltapSetMode(GLTAP_NULL);
    QexScene qex;
    IrrlichtScene irrlicht;
    qex.RequireAll();
    irrlicht.RequireAll();
    bench.Compare(
        "1,000 nodes that stand, Irrlicht", 1, [&] { qex.Draw(); }, [&] { irrlicht.Draw(); });
    bench.Compare(
        "1,000 nodes that all move, Irrlicht", 1,
        [&] {
            qex.Move();
            qex.Draw();
        },
        [&] {
            irrlicht.Move();
            irrlicht.Draw();
        });
    return bench.Result();
}
