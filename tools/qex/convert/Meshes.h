// Meshes of a converted scene: triangles only, interleaved vertices, 16-bit indices.
#pragma once

#include <string>
#include <vector>

#include "convert/Batches.h"
#include "PodBuild.h"

struct aiMesh;

struct MeshContent {
    bool tangents = false;                        // also tangents and binormals, for a normal map
    unsigned uvChannel = 0;                       // the channel that the diffuse texture uses
    std::vector<std::array<float, 2>> cornerUvs;  // of the triangles, in place of the mesh's UVs and colours
};

// The most vertices that a mesh of 16-bit indices takes.
constexpr uint32_t kMaxMeshVertices = 65535;

// The corners of all triangles, three each, that a mesh has vertices for.
std::vector<uint32_t> TrianglesOf(const aiMesh& mesh);

// Cuts a mesh, in the order of its triangles, into pieces of at most `maxVertices` vertices. Vertices on a
// cut are repeated; a mesh that fits comes back whole and unchanged.
std::vector<pod::MeshArrays> SplitMesh(pod::MeshArrays mesh, uint32_t maxVertices);

// The triangles of an assimp mesh, in one piece or several. Values that are not finite become 0.
std::vector<pod::Mesh> ConvertMesh(const aiMesh& mesh, const MeshContent& content);

// The same for a mesh that follows bones, in batches of at most `maxBones`. Until the nodes have their
// numbers the batches hold the scene's bones. Empty, with the reason in `error`, when a triangle follows more
// bones.
std::vector<pod::Mesh> ConvertSkinnedMesh(const aiMesh& mesh, const MeshContent& content,
                                          std::vector<VertexBones> bones, int maxBones, std::string* error);
