// glmark2's horse as its scene `build` shows it, in lean drawing: 800 x 600, a white model lit per vertex
// that turns once in ten seconds, every frame finished. The camera stands where the model's ball fits the
// height.
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include <GLES2/gl2.h>

#include "BenchEngine.h"
#include "common/ImageFile.h"
#include "Headless.h"

namespace {

constexpr int kWidth = 800, kHeight = 600;

double Seconds() {
    using namespace std::chrono;
    return duration<double>(steady_clock::now().time_since_epoch()).count();
}

QexAABB Box(QexModel* model) {
    QexAABB all, one;
    QexModel_UpdateModelBoundingBox(model, nullptr);
    QexBoundingBox_InitAABB(&all);
    for (uint32_t i = 0; i < QexModel_GetNumMeshNodes(model); ++i) {
        QexBoundingBox_GetAABB(&model->nodeBoxes[i], &one);
        QexBoundingBox_UnionAAABB(&all, &all, &one);
    }
    return all;
}

class Horse {
  public:
    explicit Horse(const char* file) {
        QexModel_Create(&model_);
        if (QexModel_LoadContent(&model_, "", file) != 0) exit(1);
        lit_ = QexGouraudShader_CreateProgram();
        QexModel_SetShaderProgramForAllNode(&model_, lit_, nullptr);
        for (uint32_t i = 0; i < model_.scene.materialCount; ++i) MakeWhite(&model_.scene.materials[i]);
        const QexAABB box = Box(&model_);
        QexVec3 size, centre;
        QexMatrix toMiddle;
        QexVec3_Subtract(&size, &box.max, &box.min);
        QexVec3_Lerp(&centre, &box.min, &box.max, 0.5f);
        QexMatrix_Translate(&toMiddle, -centre.x, -centre.y, -centre.z);
        QexMatrixRotateX(&upright_, 90);
        QexMatrix_Multiply(&upright_, &upright_, &toMiddle);
        const float radius = std::sqrt(QexVec3_DotProduct(&size, &size)) / 2, distance = radius + 2;
        const QexVec3 eye = {0, 0, distance}, target = {0, 0, 0};
        const float aspect = static_cast<float>(kWidth) / kHeight;
        QexCamera_Create(&camera_, 0);
        QexCamera_LookAt(&camera_, &eye, &target, nullptr);
        QexCamera_Project(&camera_, 2 * std::atan(aspect * radius / distance), aspect, 2, 2 + 2 * radius);
    }
    ~Horse() {
        QexModel_Unload(&model_);
        QexGouraudShader_Release(&lit_);
    }
    Horse(const Horse&) = delete;
    Horse& operator=(const Horse&) = delete;

    void Draw(double seconds) {
        static const QexLightSet lights = {1, {{QEX_LIGHT_DIRECTIONAL, {-2, -2, -1}, {1, 1, 1, 1}}}};
        QexMatrix turn;
        QexMatrix_RotateY(&turn, static_cast<float>(36 * seconds));
        QexMatrix_Multiply(&turn, &turn, &upright_);
        // The peer has no stencil; one beside the depth that is not cleared with it makes drivers keep it.
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
        QexModel_RenderWithCamera(&model_, &lights, &camera_, &turn, 0);
        glFinish();
    }

  private:
    static void MakeWhite(QexPODMaterial* material) {
        for (float& value : material->diffuse) value = 1;
        for (float& value : material->ambient) value = 0;
    }

    QexModel model_;
    QexShaderModule* lit_;
    QexMatrix upright_;  // the converter lays down what has its Y axis up in a 3DS file
    QexCamera camera_;
};

int Run(const qex::HeadlessContext& context, const char* file, double length, const char* picture) {
    BenchEngine engine(kWidth, kHeight);
    QexLog_SetLevel(QEX_LOG_WARNING);
    QexRenderer_SetDrawing(QEX_DRAWING_LEAN);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_BACK);
    Horse horse(file);
    glViewport(0, 0, kWidth, kHeight);
    glClearColor(0, 0, 0, 0.5f);
    if (picture) {
        std::string error;
        horse.Draw(length);
        if (SavePicture(picture, kWidth, kHeight, context.ReadPixels().data(), &error)) return 0;
        return fprintf(stderr, "%s: %s\n", picture, error.c_str()), 1;
    }
    int frames = 0;
    const double start = Seconds();
    double now = start;
    for (; now < start + length; now = Seconds(), ++frames) horse.Draw(now - start);
    QexRenderer_CheckErrors();
    printf("%s\n%.1f\n", context.Renderer().c_str(), frames / (now - start));
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 3)
        return fprintf(
                   stderr,
                   "usage: %s HORSE.pod SECONDS [PICTURE.png]\nframes a second, or a picture at that time\n",
                   argv[0]),
               2;
    std::string error;
    const auto context = qex::HeadlessContext::Create(kWidth, kHeight, &error);
    if (!context) return fprintf(stderr, "%s\n", error.c_str()), 1;
    return Run(*context, argv[1], atof(argv[2]), argc > 3 ? argv[3] : nullptr);
}
