// Starts of files, and planes of the view, with words for them.
#include "render/Diagnosis.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include "common/SceneBounds.h"

namespace {

struct Magic {
    const char* bytes;
    size_t size;
    const char* name;
};

const Magic kMagics[] = {
    {"\x89PNG", 4, "a PNG image"},        {"\xFF\xD8\xFF", 3, "a JPEG image"},
    {"glTF", 4, "a binary glTF scene"},   {"\xABKTX 11", 7, "a KTX texture"},
    {"\xABKTX 20", 7, "a KTX 2 texture"}, {"PVR\x03", 4, "a PVR texture of version 3"},
    {"Kaydara FBX", 11, "an FBX scene"},  {"<?xml", 5, "an XML file"},
    {"xof ", 4, "a DirectX scene"},       {"DDS ", 4, "a DDS texture"},
};

const char kNothing[] = "; there is nothing to draw (qex info shows what it holds)";

// The clip planes that all points lie beyond, in words; empty when some point is inside all of them.
std::string OutsideOf(const QexCamera& camera, const std::vector<QexVec3>& points) {
    QexMatrix transform;
    size_t left = 0, right = 0, below = 0, above = 0, close = 0, far = 0;
    QexMatrix_Multiply(&transform, &camera.projectionMatrix, &camera.viewMatrix);
    for (const QexVec3& point : points) {
        QexVec4 p = {point.x, point.y, point.z, 1};
        QexMatrix_TransformVec4(&transform, &p, &p);
        left += p.x < -p.w;
        right += p.x > p.w;
        below += p.y < -p.w;
        above += p.y > p.w;
        close += p.z < 0;
        far += p.z > p.w;
    }
    const size_t all = points.size();
    if (close == all) return "it lies behind the camera or nearer than its near plane";
    if (far == all) return "it lies beyond the camera's far plane";
    if (left == all || right == all || below == all || above == all)
        return "it lies outside the camera's view";
    return "";
}

}  // namespace

bool ShowsOnly(uint32_t background, const std::vector<uint8_t>& pixels) {
    const int want[3] = {static_cast<int>(background >> 16 & 0xFF), static_cast<int>(background >> 8 & 0xFF),
                         static_cast<int>(background & 0xFF)};
    for (size_t i = 0; i < pixels.size(); i += 4)
        for (size_t c = 0; c < 3; ++c) {
            const int difference = pixels[i + c] - want[c];
            if (difference > 1 || difference < -1) return false;
        }
    return true;
}

std::string WhyNotPod(const std::string& path, const std::string& wanted) {
    std::error_code error;
    const auto status = std::filesystem::status(path, error);
    if (status.type() == std::filesystem::file_type::not_found) return "no such file";
    if (std::filesystem::is_directory(status)) return "is a directory, not " + wanted;
    // A pipe would block until somebody writes into it.
    if (!std::filesystem::is_regular_file(status)) return "is not a regular file";
    FILE* file = fopen(path.c_str(), "rb");
    if (!file) return std::string("cannot be opened: ") + strerror(errno);
    char start[16] = {};
    const size_t size = fread(start, 1, sizeof start, file);
    fclose(file);
    if (size == 0) return "is empty, not " + wanted;
    for (const Magic& magic : kMagics)
        if (size >= magic.size && memcmp(start, magic.bytes, magic.size) == 0)
            return std::string("is ") + magic.name + ", not " + wanted;
    return "";
}

std::string WhyNothingShows(const QexModel& model, const QexCamera& camera,
                            const std::vector<QexVec3>& points) {
    const QexPODModel& scene = model.scene;
    if (!scene.meshNodeCount) return std::string("it has no mesh nodes") + kNothing;
    uint64_t faces = 0;
    bool anyOpaque = false, anyEnabled = false;
    for (uint32_t i = 0; i < scene.meshNodeCount; ++i) {
        const QexPODNode& node = scene.nodes[i];
        faces += scene.meshes[node.objectIndex].faceCount + scene.meshes[node.objectIndex].stripCount;
        anyEnabled |= (node.stateFlags & QEX_NODE_RENDERING_ENABLED) != 0;
        // The modules' threshold: what is not above it is not drawn.
        anyOpaque |= node.materialIndex < 0 || scene.materials[node.materialIndex].opacity > 0.5f;
    }
    if (!faces) return std::string("its meshes have no faces") + kNothing;
    if (points.empty())
        return std::string("its meshes have no positions, or none that are finite numbers") + kNothing;
    const Bounds bounds = BoundsOf(points);
    if (bounds.LongestEdge() == 0) return std::string("it is shrunk to a point (a scale of 0?)") + kNothing;
    if (!anyEnabled) return "all its nodes are hidden";
    if (!anyOpaque)
        return "all its materials are transparent (an opacity of at most 0.5 is not drawn); try --shader "
               "simple to see its shape";
    const std::string outside = OutsideOf(camera, points);
    if (!outside.empty()) return outside + "; try --camera auto";
    return "it has the colour of the background, or is too small to be seen; try --background or --camera "
           "auto";
}
