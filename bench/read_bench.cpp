// Reading a scene from memory against copying its bytes once into a block of its own, and from a file against
// Assimp's reading of the same scene as glb.
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#include <assimp/scene.h>
#include <unistd.h>
#include <assimp/Exporter.hpp>
#include <assimp/Importer.hpp>

#include "Qex.h"
#include "Ratio.h"
#include "Scenes.h"
#include "Silence.h"

namespace {

aiMesh* MakeMesh(const pod::Mesh& mesh) {
    aiMesh* out = new aiMesh;
    out->mPrimitiveTypes = aiPrimitiveType_TRIANGLE;
    out->mNumVertices = mesh.vertexCount;
    out->mVertices = new aiVector3D[mesh.vertexCount];
    out->mNormals = new aiVector3D[mesh.vertexCount];
    out->mTextureCoords[0] = new aiVector3D[mesh.vertexCount];
    out->mNumUVComponents[0] = 2;
    for (uint32_t i = 0; i < mesh.vertexCount; ++i) {
        const auto copy = [&](const pod::Element& element, aiVector3D* to, size_t bytes) {
            memcpy(to, &mesh.vertexBlock[element.offset + i * element.stride], bytes);
        };
        copy(mesh.vertices, &out->mVertices[i], 12);
        copy(mesh.normals, &out->mNormals[i], 12);
        copy(mesh.uvw[0], &out->mTextureCoords[0][i], 8);
    }
    out->mNumFaces = mesh.faceCount;
    out->mFaces = new aiFace[mesh.faceCount];
    for (uint32_t i = 0; i < mesh.faceCount; ++i) {
        uint16_t corners[3];
        memcpy(corners, &mesh.faces.data[i * sizeof corners], sizeof corners);
        out->mFaces[i].mNumIndices = 3;
        out->mFaces[i].mIndices = new unsigned[3]{corners[0], corners[1], corners[2]};
    }
    return out;
}

// The meshes of a scene, each at a node of its own.
bool WriteGlb(const pod::Scene& from, const std::string& path) {
    const auto count = static_cast<unsigned>(from.meshes.size());
    aiScene scene;
    scene.mNumMaterials = 1;
    scene.mMaterials = new aiMaterial* [1] { new aiMaterial };
    scene.mNumMeshes = count;
    scene.mMeshes = new aiMesh*[count];
    scene.mRootNode = new aiNode;
    for (unsigned i = 0; i < count; ++i) {
        scene.mMeshes[i] = MakeMesh(from.meshes[i]);
        aiNode* node = new aiNode;
        node->mNumMeshes = 1;
        node->mMeshes = new unsigned[1]{i};
        scene.mRootNode->addChildren(1, &node);
    }
    return Assimp::Exporter().Export(&scene, "glb2", path) == aiReturn_SUCCESS;
}

void CompareWithCopy(RatioBench* bench, const std::vector<uint8_t>& file) {
    bench->Compare(
        "read a 10 MB POD / memcpy to a new block", 4.0,
        [&] {
            const Silence silence;
            QexPODModel scene;
            QexPODModel_ReadFromMemory(&scene, file.data(), static_cast<uint32_t>(file.size()), 0, 0, 0, 0);
            if (!scene.runtime) abort();
            QexPODModel_Release(&scene);
        },
        [&] {
            void* copy = malloc(file.size());
            memcpy(copy, file.data(), file.size());
            KeepValue(copy);
            free(copy);
        });
}

void CompareWithAssimp(RatioBench* bench, const std::string& pod, const std::string& glb) {
    bench->Compare(
        "read 200,000 triangles from a file / Assimp, as glb", 0.1,
        [=] {
            const Silence silence;
            QexPODModel scene;
            QexPODModel_ReadFromFile(&scene, pod.c_str(), 0, 0, 0, 0);
            if (!scene.runtime) abort();
            QexPODModel_Release(&scene);
        },
        [=] {
            Assimp::Importer importer;
            if (!importer.ReadFile(glb, 0)) abort();
        });
    // What no reader can do without: the bytes in a new block.
    bench->Compare(
        "the bytes of the file alone / Assimp, as glb", 0.1,
        [=] {
            FILE* file = fopen(pod.c_str(), "rb");
            fseek(file, 0, SEEK_END);
            const auto size = static_cast<size_t>(ftell(file));
            rewind(file);
            void* block = malloc(size);
            if (fread(block, 1, size, file) != size) abort();
            KeepValue(block);
            free(block);
            fclose(file);
        },
        [=] {
            Assimp::Importer importer;
            if (!importer.ReadFile(glb, 0)) abort();
        });
}

}  // namespace

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    const std::vector<uint8_t> file = pod::WritePod(scenes::Large(10u << 20));
    CompareWithCopy(&bench, file);

    const std::string path = "/tmp/read_bench." + std::to_string(getpid()), pod = path + ".pod",
                      glb = path + ".glb";
    const pod::Scene scene = scenes::Large(4u << 20);
    const std::vector<uint8_t> bytes = pod::WritePod(scene);
    FILE* out = fopen(pod.c_str(), "wb");
    if (!out || fwrite(bytes.data(), 1, bytes.size(), out) != bytes.size() || fclose(out) != 0 ||
        !WriteGlb(scene, glb))
        abort();
    CompareWithAssimp(&bench, pod, glb);
    const int status = bench.Result();
    remove(pod.c_str());
    remove(glb.c_str());
    return status;
}
