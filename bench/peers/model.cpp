// Writes the model that the loaders read as a binary glTF: two spheres of 90,000 triangles each, with normals
// and texture coordinates, beside each other. `qex convert` makes the POD of it.
#include <cstdio>

#include <assimp/scene.h>
#include <assimp/Exporter.hpp>

#include "Scenes.h"

namespace {

aiMesh* MakeMesh(const pod::MeshArrays& arrays) {
    aiMesh* mesh = new aiMesh;
    const size_t count = arrays.positions.size();
    mesh->mPrimitiveTypes = aiPrimitiveType_TRIANGLE;
    mesh->mNumVertices = static_cast<unsigned>(count);
    mesh->mVertices = new aiVector3D[count];
    mesh->mNormals = new aiVector3D[count];
    mesh->mTextureCoords[0] = new aiVector3D[count];
    mesh->mNumUVComponents[0] = 2;
    for (size_t i = 0; i < count; ++i) {
        const auto [x, y, z] = arrays.positions[i];
        const auto [nx, ny, nz] = arrays.normals[i];
        mesh->mVertices[i] = {x, y, z};
        mesh->mNormals[i] = {nx, ny, nz};
        mesh->mTextureCoords[0][i] = {arrays.uvs[i][0], arrays.uvs[i][1], 0};
    }
    mesh->mNumFaces = static_cast<unsigned>(arrays.indices.size() / 3);
    mesh->mFaces = new aiFace[mesh->mNumFaces];
    for (unsigned i = 0; i < mesh->mNumFaces; ++i) {
        mesh->mFaces[i].mNumIndices = 3;
        mesh->mFaces[i].mIndices = new unsigned[3];
        for (unsigned k = 0; k < 3; ++k) mesh->mFaces[i].mIndices[k] = arrays.indices[3 * i + k];
    }
    return mesh;
}

}  // namespace

int main(int argc, char** argv) {
    constexpr unsigned kMeshes = 2, kSegments = 150;  // a sphere of 4 * 150 * 150 triangles
    if (argc != 2) return fprintf(stderr, "usage: %s OUT.glb\n", argv[0]), 2;
    aiScene scene;
    scene.mNumMaterials = 1;
    scene.mMaterials = new aiMaterial* [1] { new aiMaterial };
    scene.mNumMeshes = kMeshes;
    scene.mMeshes = new aiMesh*[kMeshes];
    scene.mRootNode = new aiNode("root");
    aiNode* children[kMeshes];
    for (unsigned i = 0; i < kMeshes; ++i) {
        scene.mMeshes[i] = MakeMesh(scenes::Sphere(kSegments));
        children[i] = new aiNode("sphere" + std::to_string(i));
        children[i]->mTransformation.a4 = 2.5f * static_cast<float>(i);
        children[i]->mNumMeshes = 1;
        children[i]->mMeshes = new unsigned[1]{i};
    }
    scene.mRootNode->addChildren(kMeshes, children);
    Assimp::Exporter exporter;
    if (exporter.Export(&scene, "glb2", argv[1]) == aiReturn_SUCCESS) return 0;
    fprintf(stderr, "%s: %s\n", argv[1], exporter.GetErrorString());
    return 1;
}
