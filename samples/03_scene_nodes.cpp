// Sample 3: a tree of scene nodes, seen with two eyes. A planet goes around a sun and a moon around the
// planet, by turning nodes alone; all draw one model. The picture is for red-cyan glasses.
#include "Sample.h"

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel cube(scenes::Grid(1));

    // A plain node turns what hangs on it; the records are the application's.
    QexNode sun, orbit, planet, moonOrbit, moon;
    QexModelNode_Create(&sun, "sun", nullptr, &cube.model);
    QexNode_Create(&orbit, "orbit", &sun, nullptr);
    QexModelNode_Create(&planet, "planet", &orbit, &cube.model);
    QexNode_Create(&moonOrbit, "moon orbit", &planet, nullptr);
    QexModelNode_Create(&moon, "moon", &moonOrbit, &cube.model);
    QexNode_SetPosition(&planet, 1, 0, 0);
    QexNode_SetScale(&planet, 0.6f, 0.6f, 0.6f);
    QexNode_SetPosition(&moon, 0.8f, 0, 0);
    QexNode_SetScale(&moon, 0.5f, 0.5f, 0.5f);
    QexNode_SetRotation(&orbit, 0, 35, 20);
    QexNode_SetRotation(&moonOrbit, 0, 0, -70);
    QexNode_Update(nullptr, &sun, 0);

    glClearColor(0, 0, 0, 1);
    QexRenderer_SetZTestFunc(3);
    QexRenderer_EnableStereo3D(&sample.engine, QEX_STEREO_RED_CYAN, 2);
    for (const bool left : {true, false}) {
        left ? QexRenderer_PrepareLeft(&sample.engine) : QexRenderer_PrepareRight(&sample.engine);
        const QexCamera camera = sample.Camera({left ? -0.05f : 0.05f, 1, 3}, {0.3f, 0.1f, 0});
        QexNode_RenderWithCamera(&sun, &camera);
    }
    QexRenderer_FinishStereo3D(&sample.engine);
    return sample.Finish();
}
