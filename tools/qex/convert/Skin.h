// Skins of a converted scene: which bones each vertex follows, and where the bones stand in the bind pose.
#pragma once

#include <assimp/matrix4x4.h>
#include <map>
#include <string>
#include <vector>

#include "convert/Batches.h"
#include "convert/Log.h"

struct aiMesh;
struct aiNode;
struct aiScene;

// A node that vertices follow. One node may be several bones, when meshes do not agree on its bind pose.
struct SkinBone {
    const aiNode* node;
    aiMatrix4x4 bind;  // node to world
    float reach;       // of the mesh, from the origin
};

struct MeshSkin {
    const aiNode* holder = nullptr;     // the node that draws the mesh
    aiMatrix4x4 place;                  // mesh to world in the bind pose
    std::vector<VertexBones> vertices;  // empty for a mesh that follows no bones
};

// Whether two placements are the same, but for rounding. `reach` is how far from the origin things are.
bool IsSamePlace(const aiMatrix4x4& a, const aiMatrix4x4& b, float reach);

bool IsInvertible(const aiMatrix4x4& m);

// The skins of all meshes. Weights become bytes that add up to 255, four to a vertex: the largest are kept. A
// vertex without a weight follows the mesh's own node. What is lost is told in one line for each kind of
// loss.
class SkinSet {
  public:
    SkinSet(const aiScene& scene, ConvertLog* log);

    bool Any() const { return !bones_.empty(); }
    const MeshSkin& Of(unsigned mesh) const { return skins_[mesh]; }
    const std::vector<SkinBone>& Bones() const { return bones_; }

  private:
    struct Influence {
        uint32_t bone;
        double weight;
    };
    struct Source;
    struct Losses {
        unsigned bones = 0, weights = 0, crowded = 0, loose = 0;
    };

    void ListNodes(const aiNode& node);
    void AddMesh(const aiMesh& mesh, MeshSkin* skin);
    aiMatrix4x4 FindPlace(const std::vector<Source>& sources) const;
    const SkinBone* BoneOf(const aiNode* node) const;
    uint32_t AddBone(const aiNode* node, const aiMatrix4x4& bind, float reach);
    VertexBones ToBytes(std::vector<Influence>* influences);
    void WarnAboutLosses(ConvertLog* log) const;

    std::map<std::string, const aiNode*> nodes_;
    std::vector<MeshSkin> skins_;
    std::vector<SkinBone> bones_;
    Losses losses_;
};
