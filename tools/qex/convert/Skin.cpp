// Bones and weights of the vertices, at most four each.
#include "convert/Skin.h"

#include <assimp/scene.h>
#include <algorithm>
#include <cmath>

namespace {

aiMatrix4x4 WorldMatrix(const aiNode* node) {
    aiMatrix4x4 world = node->mTransformation;
    while ((node = node->mParent) != nullptr) world = node->mTransformation * world;
    return world;
}

unsigned Depth(const aiNode* node) {
    unsigned depth = 0;
    while ((node = node->mParent) != nullptr) ++depth;
    return depth;
}

float LargestEntry(const aiMatrix4x4& m, unsigned firstColumn, unsigned endColumn) {
    float largest = 0;
    for (unsigned r = 0; r < 3; ++r) {
        for (unsigned c = firstColumn; c < endColumn; ++c) largest = std::max(largest, std::fabs(m[r][c]));
    }
    return largest;
}

bool IsInTriangle(const aiMesh& mesh) {
    return (mesh.mPrimitiveTypes & aiPrimitiveType_TRIANGLE) != 0;
}

}  // namespace

// A bone of one mesh.
struct SkinSet::Source {
    const aiBone* bone;
    const aiNode* node;
};

bool IsSamePlace(const aiMatrix4x4& a, const aiMatrix4x4& b, float reach) {
    const float axes = std::max(LargestEntry(a, 0, 3), LargestEntry(b, 0, 3));
    const float position = std::max({reach, LargestEntry(a, 3, 4), LargestEntry(b, 3, 4)});
    for (unsigned r = 0; r < 3; ++r) {
        for (unsigned c = 0; c < 4; ++c) {
            if (!(std::fabs(a[r][c] - b[r][c]) <= 1e-5f * (c < 3 ? axes : position))) return false;
        }
    }
    return true;
}

bool IsInvertible(const aiMatrix4x4& m) {
    const float determinant = m.Determinant();
    return determinant != 0 && std::isfinite(determinant) && std::isfinite(1 / determinant);
}

SkinSet::SkinSet(const aiScene& scene, ConvertLog* log) : skins_(scene.mNumMeshes) {
    if (scene.mRootNode) ListNodes(*scene.mRootNode);
    for (unsigned i = 0; i < scene.mNumMeshes; ++i) {
        const aiMesh& mesh = *scene.mMeshes[i];
        // A mesh that several nodes draw follows its bones to one and the same place.
        if (IsInTriangle(mesh) && mesh.HasBones() && skins_[i].holder) AddMesh(mesh, &skins_[i]);
    }
    WarnAboutLosses(log);
}

void SkinSet::ListNodes(const aiNode& node) {
    nodes_.emplace(node.mName.C_Str(), &node);
    for (unsigned i = 0; i < node.mNumMeshes; ++i) {
        if (node.mMeshes[i] >= skins_.size()) continue;
        const aiNode*& holder = skins_[node.mMeshes[i]].holder;
        if (!holder) holder = &node;
    }
    for (unsigned i = 0; i < node.mNumChildren; ++i) {
        if (node.mChildren[i]) ListNodes(*node.mChildren[i]);
    }
}

void SkinSet::AddMesh(const aiMesh& mesh, MeshSkin* skin) {
    std::vector<Source> sources;
    for (unsigned i = 0; i < mesh.mNumBones; ++i) {
        const aiBone* bone = mesh.mBones[i];
        if (bone->mNumWeights == 0) continue;
        const auto node = nodes_.find(bone->mName.C_Str());
        if (node != nodes_.end() && IsInvertible(bone->mOffsetMatrix)) {
            sources.push_back({bone, node->second});
        } else {
            ++losses_.bones;
        }
    }
    if (sources.empty()) return;

    skin->place = FindPlace(sources);
    float reach = 0;
    for (unsigned v = 0; v < mesh.mNumVertices; ++v) {
        reach = std::max(reach, (skin->place * mesh.mVertices[v]).Length());
    }
    std::vector<std::vector<Influence>> influences(mesh.mNumVertices);
    for (const Source& source : sources) {
        aiMatrix4x4 toMesh = source.bone->mOffsetMatrix;
        const uint32_t bone = AddBone(source.node, skin->place * toMesh.Inverse(), reach);
        for (unsigned k = 0; k < source.bone->mNumWeights; ++k) {
            const aiVertexWeight& w = source.bone->mWeights[k];
            if (w.mVertexId < mesh.mNumVertices && w.mWeight > 0 && std::isfinite(w.mWeight)) {
                influences[w.mVertexId].push_back({bone, w.mWeight});
            } else if (w.mWeight != 0) {
                ++losses_.weights;
            }
        }
    }
    skin->vertices.reserve(mesh.mNumVertices);
    for (auto& list : influences) {
        if (list.empty()) {
            ++losses_.loose;
            list.push_back({AddBone(skin->holder, skin->place, reach), 1});
        }
        skin->vertices.push_back(ToBytes(&list));
    }
}

// Meshes that share a bone stand where it stands in the same place for both. Otherwise the mesh stands where
// the file's own pose carries it by its topmost bone.
aiMatrix4x4 SkinSet::FindPlace(const std::vector<Source>& sources) const {
    aiMatrix4x4 place;
    bool foundShared = false;
    unsigned foundDepth = ~0u;
    for (const Source& source : sources) {
        const SkinBone* known = BoneOf(source.node);
        const unsigned depth = Depth(source.node);
        const bool isShared = known != nullptr;
        const bool isBetter = isShared == foundShared ? depth < foundDepth : isShared;
        if (!isBetter) continue;
        const aiMatrix4x4 candidate =
            (known ? known->bind : WorldMatrix(source.node)) * source.bone->mOffsetMatrix;
        if (!IsInvertible(candidate)) continue;
        place = candidate;
        foundShared = isShared;
        foundDepth = depth;
    }
    return place;
}

const SkinBone* SkinSet::BoneOf(const aiNode* node) const {
    for (const SkinBone& bone : bones_) {
        if (bone.node == node) return &bone;
    }
    return nullptr;
}

uint32_t SkinSet::AddBone(const aiNode* node, const aiMatrix4x4& bind, float reach) {
    for (size_t i = 0; i < bones_.size(); ++i) {
        if (bones_[i].node == node && IsSamePlace(bones_[i].bind, bind, reach))
            return static_cast<uint32_t>(i);
    }
    bones_.push_back({node, bind, reach});
    return static_cast<uint32_t>(bones_.size()) - 1;
}

VertexBones SkinSet::ToBytes(std::vector<Influence>* influences) {
    std::vector<Influence> joined;
    std::sort(influences->begin(), influences->end(),
              [](const Influence& a, const Influence& b) { return a.bone < b.bone; });
    for (const Influence& influence : *influences) {
        if (!joined.empty() && joined.back().bone == influence.bone) {
            joined.back().weight += influence.weight;
        } else {
            joined.push_back(influence);
        }
    }
    std::stable_sort(joined.begin(), joined.end(),
                     [](const Influence& a, const Influence& b) { return a.weight > b.weight; });
    if (joined.size() > 4) {
        ++losses_.crowded;
        joined.resize(4);
    }
    double sum = 0;
    for (const Influence& influence : joined) sum += influence.weight;

    // Rounded down first; what is missing from 255 goes to those who lost most.
    VertexBones out;
    std::array<double, 4> lost{};
    int missing = 255;
    for (size_t i = 0; i < joined.size(); ++i) {
        const double exact = joined[i].weight / sum * 255;
        out.bones[i] = joined[i].bone;
        out.weights[i] = static_cast<uint8_t>(exact);
        lost[i] = exact - out.weights[i];
        missing -= out.weights[i];
    }
    for (; missing > 0; --missing) {
        const auto most = static_cast<size_t>(std::max_element(lost.begin(), lost.end()) - lost.begin());
        ++out.weights[most];
        lost[most] = -1;
    }
    for (size_t i = 0; i < 4; ++i) {
        if (out.weights[i] == 0) out.bones[i] = 0;
    }
    return out;
}

void SkinSet::WarnAboutLosses(ConvertLog* log) const {
    const struct {
        unsigned count;
        const char *one, *many, *what;
    } rows[] = {
        {losses_.bones, "bone", "bones", " without a node, or that cannot be inverted, dropped"},
        {losses_.weights, "bone weight", "bone weights",
         " that are negative, no number or of no vertex dropped"},
        {losses_.crowded, "vertex", "vertices",
         " of more than four bones: the four largest weights are kept"},
        {losses_.loose, "vertex", "vertices",
         " of skinned meshes without weights: the mesh's node moves them"},
    };
    for (const auto& row : rows) {
        if (row.count)
            log->Warn(std::to_string(row.count) + " " + (row.count == 1 ? row.one : row.many) + row.what);
    }
}
