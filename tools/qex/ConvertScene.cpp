#include "ConvertScene.h"

#include <assimp/scene.h>
#include <algorithm>
#include <map>

#include "ConvertAnimation.h"
#include "ConvertMaterials.h"
#include "ConvertMeshes.h"

namespace {

std::string Plural(unsigned count, const char* noun) {
    return std::to_string(count) + " " + noun + (count == 1 ? "" : "s");
}

bool IsTriangles(const aiMesh& mesh) {
    return (mesh.mPrimitiveTypes & aiPrimitiveType_TRIANGLE) != 0;
}

void WarnAboutWhatIsLost(const aiScene& source, const SceneSettings& settings, ConvertLog* log) {
    unsigned loose = 0, morphed = 0;
    for (unsigned i = 0; i < source.mNumMeshes; ++i) {
        const aiMesh& mesh = *source.mMeshes[i];
        if (!IsTriangles(mesh)) loose += mesh.mNumFaces;
        morphed += mesh.mNumAnimMeshes > 0;
    }
    if (loose) log->Warn(Plural(loose, "point, line or degenerate triangle") + " dropped");
    if (morphed) log->Warn(Plural(morphed, "mesh part") + " with morph targets converted without them");
    if (source.mNumAnimations > 1 && !settings.clip) {
        log->Warn(std::string("the first of ") + std::to_string(source.mNumAnimations) +
                  " animations is converted (" + source.mAnimations[0]->mName.C_Str() +
                  "); --clip chooses another");
    }
}

// Materials that meshes use, converted at first use; the importer adds others that nothing needs.
class MaterialSet {
  public:
    MaterialSet(const aiScene& source, const SceneSettings& settings, TextureSet* textures, ConvertLog* log,
                std::vector<pod::Material>* out)
        : source_(source), settings_(settings), textures_(textures), log_(log), out_(out) {}

    int Add(unsigned index, MeshContent* content) {
        if (index >= source_.mNumMaterials) return -1;
        const auto [entry, isNew] = known_.emplace(index, Known{});
        if (isNew) {
            const MaterialResult result =
                ConvertMaterial(*source_.mMaterials[index], settings_.textureReplacesColour, textures_, log_);
            entry->second.index = static_cast<int>(out_->size());
            entry->second.content.uvChannel = result.uvChannel;
            entry->second.content.tangents = result.material.bumpTexture >= 0;
            out_->push_back(result.material);
        }
        *content = entry->second.content;
        return entry->second.index;
    }

  private:
    struct Known {
        int index = -1;
        MeshContent content;
    };
    const aiScene& source_;
    const SceneSettings& settings_;
    TextureSet* textures_;
    ConvertLog* log_;
    std::vector<pod::Material>* out_;
    std::map<unsigned, Known> known_;
};

// A mesh whose bones do not fit leaves the reason in `error`.
std::vector<std::vector<MeshPart>> ConvertMeshes(const aiScene& source, const SkinSet& skins, int maxBones,
                                                 MaterialSet* materials, std::vector<pod::Mesh>* out,
                                                 std::string* error) {
    std::vector<std::vector<MeshPart>> parts(source.mNumMeshes);
    for (unsigned i = 0; i < source.mNumMeshes; ++i) {
        if (!IsTriangles(*source.mMeshes[i])) continue;
        MeshContent content;
        const int material = materials->Add(source.mMeshes[i]->mMaterialIndex, &content);
        const MeshSkin* skin = skins.Of(i).vertices.empty() ? nullptr : &skins.Of(i);
        for (pod::Mesh& mesh :
             skin ? ConvertSkinnedMesh(*source.mMeshes[i], content, skin->vertices, maxBones, error)
                  : ConvertMesh(*source.mMeshes[i], content)) {
            parts[i].push_back({static_cast<int>(out->size()), material, skin});
            out->push_back(std::move(mesh));
        }
    }
    return parts;
}

FrameTimes PlanSceneFrames(const aiScene& source, const SceneSettings& settings, bool skinned,
                           ConvertLog* log) {
    FrameTimes frames;
    bool truncated = false;
    if (source.mNumAnimations > 0) {
        frames = PlanFrames(*source.mAnimations[settings.clip.value_or(0)], settings.fps, &truncated);
    }
    if (truncated) log->Warn("the animation is cut after " + std::to_string(frames.count) + " frames");
    if (skinned) {
        // The bind pose, then the clip: two frames at the least, as the engine never stands at the last one.
        frames.lead = 1;
        frames.count = std::max(frames.count, 2u) + frames.lead;
    }
    return frames;
}

}  // namespace

ExitStatus ConvertScene(const aiScene& source, const SceneSettings& settings, TextureSet* textures,
                        ConvertLog* log, pod::Scene* out, std::string* error) {
    const SkinSet skins(source, log);
    MaterialSet materials(source, settings, textures, log, &out->materials);
    const auto parts = ConvertMeshes(source, skins, settings.maxBones, &materials, &out->meshes, error);
    if (!error->empty()) return kBadArgument;
    if (out->meshes.empty()) {
        *error = "holds no triangles; a scene with at least one mesh is expected";
        return kBadInput;
    }
    WarnAboutWhatIsLost(source, settings, log);
    const FrameTimes frames = PlanSceneFrames(source, settings, skins.Any(), log);
    ConvertNodes(source, parts, skins, frames, settings.cameras, log, out);
    out->textures = textures->Names();
    out->fps = static_cast<uint32_t>(settings.fps);
    const bool animated = std::any_of(out->nodes.begin(), out->nodes.end(),
                                      [](const pod::Node& n) { return n.animationFlags.value_or(0) != 0; });
    out->frameCount = animated ? frames.count : 0;
    return kDone;
}
