// Sample 2: what is under a pixel? Works out where each node is on the screen, picks at a point, brings the
// nearest node that was hit forward and writes its name above the point.
#include "Sample.h"

constexpr int kMostHits = 9;

int main(int argc, char** argv) {
    Sample sample(argc, argv);
    if (!sample.Started()) return 1;
    SampleModel cubes(scenes::Grid(9));
    QexModel* model = &cubes.model;
    const QexCamera camera = sample.Camera({3, 2, 4}, {1, 1, 0});

    // The boxes in the world, from them those on the screen, and among these the ones around the point.
    const QexVec2 point = {240, 130};
    uint32_t hits[kMostHits];
    int32_t count;
    QexModel_UpdateModelBoundingBox(model, nullptr);
    QexModel_CalcScreenBBox(&sample.engine, model, &camera);
    QexModel_Pick(model, nullptr, &point, &count, hits, kMostHits);
    const QexBoundingBox* boxes = model->screenBoxes;
    uint32_t nearest = count ? hits[0] : 0;
    for (int32_t i = 1; i < count; ++i)
        if (boxes[hits[i]].centre.z < boxes[nearest].centre.z) nearest = hits[i];

    sample.Clear();
    if (count) QexModel_SetNodePosition(model, nearest, 0, 0, 0.7f);
    QexModel_RenderWithCamera(model, nullptr, &camera, nullptr, 0);
    const char* name = count ? QexModel_GetNodeName(model, nearest) : "nothing";
    QexFont_DrawTempString(&sample.engine, static_cast<int32_t>(point.x), static_cast<int32_t>(point.y), name,
                           0xFFFF4040);
    printf("%d boxes around %.0f, %.0f; nearest: %s\n", count, static_cast<double>(point.x),
           static_cast<double>(point.y), name);
    const int status = sample.Finish();
    return count ? status : 1;
}
