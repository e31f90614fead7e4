// Puts the parts of a converted scene together: nodes, meshes, materials, animation.
#include "convert/Scene.h"

#include <assimp/scene.h>
#include <algorithm>
#include <map>

#include "convert/Animation.h"
#include "convert/Colours.h"
#include "convert/Materials.h"
#include "convert/Meshes.h"

namespace {

constexpr float kLeastOpacity = 0.5f;  // the modules draw what is above it

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
    // The importer's own, for files of motion or cameras alone.
    if (source.mNumMaterials == 1 && source.mMaterials[0]->GetName() == aiString("SkeletonMaterial"))
        log->Warn("the file has no meshes; pointed bodies show where its nodes are");
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
    MaterialSet(const aiScene& source, const MaterialSettings& settings, TextureSet* textures,
                ConvertLog* log, std::vector<pod::Material>* out)
        : source_(source), settings_(settings), textures_(textures), log_(log), out_(out) {}

    const MaterialResult& Convert(unsigned index) {
        static const MaterialResult none;
        if (index >= source_.mNumMaterials) return none;
        const auto [entry, isNew] = converted_.emplace(index, MaterialResult{});
        if (isNew) entry->second = ConvertMaterial(*source_.mMaterials[index], settings_, textures_, log_);
        return entry->second;
    }

    // Its number in the scene. With a texture of vertex colours (not -1) it is another one.
    int Place(unsigned index, int colourTexture) {
        if (index >= source_.mNumMaterials && colourTexture < 0) return -1;
        const auto [entry, isNew] =
            placed_.emplace(std::make_pair(index, colourTexture), static_cast<int>(out_->size()));
        if (isNew) {
            out_->push_back(Convert(index).material);
            if (colourTexture >= 0) UseColourTexture(colourTexture, *textures_, &out_->back());
        }
        return entry->second;
    }

  private:
    const aiScene& source_;
    const MaterialSettings& settings_;
    TextureSet* textures_;
    ConvertLog* log_;
    std::vector<pod::Material>* out_;
    std::map<unsigned, MaterialResult> converted_;
    std::map<std::pair<unsigned, int>, int> placed_;
};

// Collects the colours of vertices whose materials leave room for them. In linear files they multiply the
// material's colour, in others they stand in its place.
void CollectColours(const aiScene& source, bool linear, MaterialSet* materials, ConvertLog* log,
                    ColourAtlas* atlas) {
    unsigned lost = 0;
    for (unsigned i = 0; i < source.mNumMeshes; ++i) {
        const aiMesh& mesh = *source.mMeshes[i];
        if (!IsTriangles(mesh)) continue;
        const MaterialResult& material = materials->Convert(mesh.mMaterialIndex);
        if (!HasColours(mesh, linear)) continue;
        ColourRules rules{linear, material.alphaCounts, {1, 1, 1}};
        if (linear) rules.tint = material.material.diffuse;
        lost += material.textured;
        if (!material.textured) atlas->Add(i, mesh, rules);
    }
    if (lost) log->Warn("vertex colours of " + Plural(lost, "mesh part") + " with textures are not drawn");
    if (atlas->Fits()) return;
    log->Warn("there are too many vertex colours for a texture; they are not drawn");
    *atlas = {};
}

// A mesh whose bones do not fit leaves the reason in `error`.
std::vector<std::vector<MeshPart>> ConvertMeshes(const aiScene& source, const SkinSet& skins, int maxBones,
                                                 const ColourAtlas& atlas, int colourTexture,
                                                 MaterialSet* materials, std::vector<pod::Mesh>* out,
                                                 std::string* error) {
    std::vector<std::vector<MeshPart>> parts(source.mNumMeshes);
    for (unsigned i = 0; i < source.mNumMeshes; ++i) {
        const aiMesh& from = *source.mMeshes[i];
        if (!IsTriangles(from)) continue;
        const MaterialResult& result = materials->Convert(from.mMaterialIndex);
        MeshContent content{result.material.bumpTexture >= 0, result.uvChannel, {}};
        if (atlas.Has(i)) content.cornerUvs = atlas.Uvs(i);
        const int material = materials->Place(from.mMaterialIndex, atlas.Has(i) ? colourTexture : -1);
        const MeshSkin* skin = skins.Of(i).vertices.empty() ? nullptr : &skins.Of(i);
        for (pod::Mesh& mesh : skin ? ConvertSkinnedMesh(from, content, skin->vertices, maxBones, error)
                                    : ConvertMesh(from, content)) {
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
    MaterialSet materials(source, settings.materials, textures, log, &out->materials);
    ColourAtlas atlas;
    CollectColours(source, settings.materials.linearColours, &materials, log, &atlas);
    const int colourTexture = atlas.Empty() ? -1 : textures->AddPlain("colours", atlas.Draw());
    const auto parts = ConvertMeshes(source, skins, settings.maxBones, atlas, colourTexture, &materials,
                                     &out->meshes, error);
    if (!error->empty()) return kBadArgument;
    if (out->meshes.empty()) {
        *error = "holds no triangles; a scene with at least one mesh is expected";
        return kBadInput;
    }
    WarnAboutWhatIsLost(source, settings, log);
    const auto faint = std::count_if(out->materials.begin(), out->materials.end(),
                                     [](const pod::Material& m) { return !(m.opacity > kLeastOpacity); });
    if (faint)
        log->Warn(Plural(static_cast<unsigned>(faint), "material") + " of an opacity up to 0.5: not drawn");
    const FrameTimes frames = PlanSceneFrames(source, settings, skins.Any(), log);
    ConvertNodes(source, parts, skins, frames, settings.cameras, log, out);
    out->textures = textures->Names();
    out->fps = static_cast<uint32_t>(settings.fps);
    const bool animated = std::any_of(out->nodes.begin(), out->nodes.end(),
                                      [](const pod::Node& n) { return n.animationFlags.value_or(0) != 0; });
    out->frameCount = animated ? frames.count : 0;
    return kDone;
}
