// Sample 3: a tree of scene nodes, seen with two eyes. A planet goes around a sun and a moon around the
// planet, by turning nodes alone; all draw one model. The picture is for red-cyan glasses.
#include <initializer_list>

#include "window.h"

int main(int argc, char** argv) {
    Window window;
    if (Window_Open(&window, "Scene nodes", argc, argv) != 0) return 1;
    QexModel globe;
    Window_LoadModel(&window, &globe, "globe.pod");

    // A plain node turns what hangs on it; the records are the application's.
    QexNode sun, orbit, planet, moonOrbit, moon;
    QexModelNode_Create(&sun, "sun", nullptr, &globe);
    QexNode_Create(&orbit, "orbit", &sun, nullptr);
    QexModelNode_Create(&planet, "planet", &orbit, &globe);
    QexNode_Create(&moonOrbit, "moon orbit", &planet, nullptr);
    QexModelNode_Create(&moon, "moon", &moonOrbit, &globe);
    QexNode_SetPosition(&planet, 1, 0, 0);
    QexNode_SetScale(&planet, 0.6f, 0.6f, 0.6f);
    QexNode_SetPosition(&moon, 0.8f, 0, 0);
    QexNode_SetScale(&moon, 0.5f, 0.5f, 0.5f);

    Window_Run(&window, [&] {
        QexNode_SetRotation(&orbit, 0, 20 * window.seconds + 15, 20);
        QexNode_SetRotation(&moonOrbit, 0, 0, -70 * window.seconds);
        QexNode_Update(nullptr, &sun, window.elapsed);

        Window_Clear(&window, 0.01f, 0.01f, 0.03f);
        QexRenderer_EnableStereo3D(&window.engine, QEX_STEREO_RED_CYAN, 2);
        for (const bool left : {true, false}) {
            left ? QexRenderer_PrepareLeft(&window.engine) : QexRenderer_PrepareRight(&window.engine);
            const QexCamera camera =
                Window_Camera(&window, {left ? -0.05f : 0.05f, 0.9f, 2.3f}, {0.3f, 0.05f, 0});
            QexNode_RenderWithCamera(&sun, &camera);
        }
        QexRenderer_FinishStereo3D(&window.engine);
    });

    QexModel_Unload(&globe);
    return Window_Close(&window);
}
