// The importer's meshes as interleaved vertices and indices.
#include "convert/Meshes.h"

#include <assimp/mesh.h>
#include <algorithm>
#include <cmath>
#include <unordered_map>

namespace {

float Finite(float value) {
    return std::isfinite(value) ? value : 0.0f;
}

std::vector<pod::Vec3> CopyVectors(const aiVector3D* source, unsigned count) {
    std::vector<pod::Vec3> out;
    if (!source) return out;
    out.reserve(count);
    for (unsigned i = 0; i < count; ++i) {
        out.push_back({Finite(source[i].x), Finite(source[i].y), Finite(source[i].z)});
    }
    return out;
}

std::array<uint8_t, 4> ToBytes(const aiColor4D& c) {
    std::array<uint8_t, 4> out;
    const float channels[4] = {c.r, c.g, c.b, c.a};
    for (size_t i = 0; i < 4; ++i) {
        out[i] = static_cast<uint8_t>(std::lround(std::clamp(Finite(channels[i]), 0.0f, 1.0f) * 255.0f));
    }
    return out;
}

template <class T>
void CopyVertex(const std::vector<T>& from, uint32_t vertex, std::vector<T>* to) {
    if (!from.empty()) to->push_back(from[vertex]);
}

void CopyVertex(const pod::MeshArrays& from, uint32_t vertex, pod::MeshArrays* to) {
    CopyVertex(from.positions, vertex, &to->positions);
    CopyVertex(from.normals, vertex, &to->normals);
    CopyVertex(from.tangents, vertex, &to->tangents);
    CopyVertex(from.binormals, vertex, &to->binormals);
    CopyVertex(from.uvs, vertex, &to->uvs);
    CopyVertex(from.colours, vertex, &to->colours);
}

pod::MeshArrays CopyMesh(const aiMesh& mesh, const MeshContent& content) {
    const unsigned count = mesh.mNumVertices;
    pod::MeshArrays out;
    out.positions = CopyVectors(mesh.mVertices, count);
    out.normals = CopyVectors(mesh.mNormals, count);
    if (content.tangents && mesh.mTangents && mesh.mBitangents) {
        out.tangents = CopyVectors(mesh.mTangents, count);
        out.binormals = CopyVectors(mesh.mBitangents, count);
    }
    const unsigned channel = mesh.HasTextureCoords(content.uvChannel) ? content.uvChannel : 0;
    for (const pod::Vec3& uv : CopyVectors(mesh.mTextureCoords[channel], count)) {
        out.uvs.push_back({uv[0], uv[1]});
    }
    if (mesh.mColors[0]) {
        for (unsigned i = 0; i < count; ++i) out.colours.push_back(ToBytes(mesh.mColors[0][i]));
    }
    out.indices = TrianglesOf(mesh);
    return out;
}

// Gives each corner of a triangle a vertex, and UVs, of its own, which take the place of the colours.
void SplitCorners(const std::vector<std::array<float, 2>>& uvs, pod::MeshArrays* mesh,
                  std::vector<VertexBones>* bones) {
    pod::MeshArrays corners;
    std::vector<VertexBones> cornerBones;
    mesh->uvs.clear();
    mesh->colours.clear();
    for (const uint32_t vertex : mesh->indices) {
        corners.indices.push_back(static_cast<uint32_t>(corners.indices.size()));
        CopyVertex(*mesh, vertex, &corners);
        CopyVertex(*bones, vertex, &cornerBones);
    }
    corners.uvs = uvs;
    *mesh = std::move(corners);
    *bones = std::move(cornerBones);
}

template <class T>
void AppendBytes(const std::vector<T>& array, uint32_t vertex, std::string* bytes) {
    if (!array.empty()) bytes->append(reinterpret_cast<const char*>(&array[vertex]), sizeof(T));
}

// Rounded: in some files the normals at one corner differ by a little.
void AppendDirection(const std::vector<pod::Vec3>& array, uint32_t vertex, std::string* bytes) {
    constexpr float kSteps = 8192;
    if (array.empty()) return;
    for (const float value : array[vertex]) {
        const float rounded = std::round(value * kSteps) + 0.0f;  // no negative zero
        bytes->append(reinterpret_cast<const char*>(&rounded), sizeof rounded);
    }
}

// Makes vertices that are the same in everything, also in their bones where there are any, one, and drops
// those that no triangle uses.
void JoinVertices(pod::MeshArrays* mesh, std::vector<VertexBones>* bones) {
    pod::MeshArrays joined;
    std::vector<VertexBones> joinedBones;
    std::unordered_map<std::string, uint32_t> known;
    std::string bytes;
    for (const uint32_t vertex : mesh->indices) {
        bytes.clear();
        AppendBytes(mesh->positions, vertex, &bytes);
        AppendDirection(mesh->normals, vertex, &bytes);
        AppendDirection(mesh->tangents, vertex, &bytes);
        AppendDirection(mesh->binormals, vertex, &bytes);
        AppendBytes(mesh->uvs, vertex, &bytes);
        AppendBytes(mesh->colours, vertex, &bytes);
        AppendBytes(*bones, vertex, &bytes);
        const auto [entry, isNew] = known.emplace(bytes, static_cast<uint32_t>(known.size()));
        joined.indices.push_back(entry->second);
        if (!isNew) continue;
        CopyVertex(*mesh, vertex, &joined);
        CopyVertex(*bones, vertex, &joinedBones);
    }
    *mesh = std::move(joined);
    *bones = std::move(joinedBones);
}

void CopyBatches(const SkinPiece& piece, pod::Mesh* mesh) {
    size_t row = 0;
    for (const auto& bones : piece.batchBones) row = std::max(row, bones.size());
    for (const auto& bones : piece.batchBones) {
        mesh->bonesPerBatch.push_back(static_cast<int32_t>(bones.size()));
        mesh->batchBones.insert(mesh->batchBones.end(), bones.begin(), bones.end());
        mesh->batchBones.resize(row * mesh->bonesPerBatch.size());
    }
    mesh->batchOffsets = piece.batchOffsets;
    mesh->batchBoneMax = static_cast<int32_t>(row);
    mesh->batchCount = static_cast<int32_t>(piece.batchBones.size());
}

}  // namespace

std::vector<uint32_t> TrianglesOf(const aiMesh& mesh) {
    const unsigned count = mesh.mNumVertices;
    std::vector<uint32_t> indices;
    for (unsigned f = 0; f < mesh.mNumFaces; ++f) {
        const aiFace& face = mesh.mFaces[f];
        if (face.mNumIndices != 3) continue;
        const bool inRange = face.mIndices[0] < count && face.mIndices[1] < count && face.mIndices[2] < count;
        if (inRange) indices.insert(indices.end(), face.mIndices, face.mIndices + 3);
    }
    return indices;
}

std::vector<pod::MeshArrays> SplitMesh(pod::MeshArrays mesh, uint32_t maxVertices) {
    std::vector<pod::MeshArrays> pieces;
    if (mesh.positions.size() <= maxVertices) {
        pieces.push_back(std::move(mesh));
        return pieces;
    }
    // Where each vertex lies in the current piece; valid while `pieceOf` names that piece.
    std::vector<uint32_t> place(mesh.positions.size()), pieceOf(mesh.positions.size(), 0);
    for (size_t i = 0; i + 3 <= mesh.indices.size(); i += 3) {
        const uint32_t* triangle = &mesh.indices[i];
        // Three new vertices at the most; a piece may end up to two short of its limit.
        if (pieces.empty() || pieces.back().positions.size() + 3 > maxVertices) pieces.emplace_back();
        pod::MeshArrays& piece = pieces.back();
        const auto number = static_cast<uint32_t>(pieces.size());
        for (int corner = 0; corner < 3; ++corner) {
            const uint32_t vertex = triangle[corner];
            if (pieceOf[vertex] != number) {
                pieceOf[vertex] = number;
                place[vertex] = static_cast<uint32_t>(piece.positions.size());
                CopyVertex(mesh, vertex, &piece);
            }
            piece.indices.push_back(place[vertex]);
        }
    }
    return pieces;
}

std::vector<pod::Mesh> ConvertMesh(const aiMesh& mesh, const MeshContent& content) {
    std::vector<pod::Mesh> out;
    std::vector<VertexBones> noBones;
    pod::MeshArrays arrays = CopyMesh(mesh, content);
    if (arrays.indices.empty()) return out;
    if (!content.cornerUvs.empty()) SplitCorners(content.cornerUvs, &arrays, &noBones);
    JoinVertices(&arrays, &noBones);
    for (const pod::MeshArrays& piece : SplitMesh(std::move(arrays), kMaxMeshVertices)) {
        out.push_back(pod::BuildMesh(piece));
    }
    return out;
}

std::vector<pod::Mesh> ConvertSkinnedMesh(const aiMesh& mesh, const MeshContent& content,
                                          std::vector<VertexBones> bones, int maxBones, std::string* error) {
    std::vector<pod::Mesh> out;
    pod::MeshArrays whole = CopyMesh(mesh, content);
    if (!content.cornerUvs.empty()) SplitCorners(content.cornerUvs, &whole, &bones);
    JoinVertices(&whole, &bones);
    const int needed = MostBonesOfATriangle(bones, whole.indices);
    if (needed > maxBones) {
        *error = "a triangle of mesh '" + std::string(mesh.mName.C_Str()) + "' follows " +
                 std::to_string(needed) + " bones; --max-bones " + std::to_string(needed) +
                 " or more is expected";
        return out;
    }
    for (const SkinPiece& piece : BatchSkin(bones, whole.indices, maxBones, kMaxMeshVertices)) {
        pod::MeshArrays arrays;
        for (const uint32_t source : piece.sources) {
            CopyVertex(whole, source, &arrays);
            arrays.boneWeights.push_back(bones[source].weights);
        }
        arrays.boneIndices = piece.boneIndices;
        arrays.indices = piece.indices;
        out.push_back(pod::BuildMesh(arrays));
        CopyBatches(piece, &out.back());
    }
    return out;
}
