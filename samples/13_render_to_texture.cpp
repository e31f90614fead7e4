// Sample 13: a picture within the picture. The scene is drawn into a texture first, that texture onto a cube,
// and the cube's picture into the corner of the screen.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel cubes(scenes::Grid(9));
    cubes.SetChequers(0, 0xF0D890, 0x3070A0);
    SampleModel screen(scenes::Still({{"screen", scenes::Cube(), {0, 0, 0}}}));

    // Drawing into one target inside drawing into another: the end of the inner one goes back to the outer.
    QexRenderTarget picture, corner;
    QexRenderTarget_Create(&picture, 128, 128, 0);
    QexRenderTarget_Create(&corner, 96, 72, 0);
    QexTexture_SetFilter(&picture.colorTexture, QEX_FILTER_LINEAR);
    sample.Clear();
    QexRenderer_SetBackFaceCulling(1);

    QexRenderTarget_BeginScene(&corner);
    glClearColor(0.1f, 0.1f, 0.1f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexRenderTarget_BeginScene(&picture);
    glClearColor(0.6f, 0.3f, 0.3f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexCamera camera = sample.Camera({2.5f, 2.2f, 3}, {1, 1, 0});
    QexCamera_Project(&camera, 0.8f, 1, 0.1f, 100);
    QexModel_RenderWithCamera(&cubes.model, nullptr, &camera, nullptr, 0);
    QexRenderTarget_EndScene(&picture);

    // The cube shows it, small in the corner and large on the screen.
    QexTexture* before = QexModel_ReplaceTextureByIdx(&screen.model, &picture.colorTexture, 0);
    camera = sample.Camera({3, 2, 4}, {0, 0, 0});
    QexModel_RenderWithCamera(&screen.model, nullptr, &camera, nullptr, 0);
    QexRenderTarget_EndScene(&corner);
    QexModel_RenderWithCamera(&screen.model, nullptr, &camera, nullptr, 0);
    QexModel_ReplaceTextureByIdx(&screen.model, before, 0);

    QexRenderer_SetZTestFunc(7);
    QexTexture_Draw(&sample.engine, &corner.colorTexture, 8, 8, nullptr, 1, 1, 0xFFFFFFFF);
    QexRenderTarget_Release(&corner);
    QexRenderTarget_Release(&picture);
    return sample.Finish();
}
