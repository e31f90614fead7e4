// Nodes, cameras and lights in the engine's conventions: where they look, how wide they see.
#include "convert/Nodes.h"

#include <assimp/scene.h>
#include <algorithm>
#include <cmath>
#include <map>

namespace {

constexpr float kDefaultFov = 0.785f;
constexpr float kWideScreenAspect = 16.0f / 9.0f;
constexpr float kDefaultFar = 1000.0f;
constexpr float kDefaultDepthRange = 10000.0f;  // far : near where only one of them is known

// The order of the nodes in the file.
enum NodeKind { kMeshNode, kLightNode, kCameraNode, kOtherNode };

struct Draft {
    NodeKind kind;
    pod::Node node;
    int parent;  // index among the drafts, -1 for a root
};

aiVector3D Normalized(aiVector3D v, const aiVector3D& otherwise) {
    const float length = v.Length();
    return length > 0 && std::isfinite(length) ? v / length : otherwise;
}

// A direction at right angles to `axis`: `wish` where it is not parallel to it.
aiVector3D Perpendicular(const aiVector3D& axis, const aiVector3D& wish) {
    const aiVector3D other = std::fabs(axis.y) < 0.9f ? aiVector3D(0, 1, 0) : aiVector3D(1, 0, 0);
    const aiVector3D side = wish - axis * (wish * axis);
    return Normalized(side.Length() > 1e-4f ? side : other - axis * (other * axis), {1, 0, 0});
}

aiQuaternion FromAxes(const aiVector3D& x, const aiVector3D& y, const aiVector3D& z) {
    return aiQuaternion(aiMatrix3x3(x.x, y.x, z.x, x.y, y.y, z.y, x.z, y.z, z.z)).Normalize();
}

// Some importers give the position both in the node and again within it.
aiVector3D PositionInNode(const aiVector3D& position, const aiNode* node) {
    if (!node) return position;
    const aiMatrix4x4& m = node->mTransformation;
    return position == aiVector3D(m.a4, m.b4, m.c4) ? aiVector3D() : position;
}

Pose CameraPose(const aiCamera& camera, const aiNode* node, bool looksAlongMinusZ) {
    const aiVector3D ahead(0, 0, -1);
    const aiVector3D look = looksAlongMinusZ ? ahead : Normalized(camera.mLookAt, ahead);
    const aiVector3D up = Perpendicular(look, camera.mUp);
    Pose pose;
    pose.position = PositionInNode(camera.mPosition, node);
    pose.rotation = FromAxes(look ^ up, -look, -up);
    return pose;
}

Pose LightPose(const aiLight& light, const aiNode* node) {
    const aiVector3D z = -Normalized(light.mDirection, {0, 0, -1});
    const aiVector3D y = Perpendicular(z, light.mUp);
    Pose pose;
    pose.position = PositionInNode(light.mPosition, node);
    pose.rotation = FromAxes(y ^ z, y, z);
    return pose;
}

float HorizontalFov(const aiCamera& camera, bool isScaledHeight) {
    const float fov = camera.mHorizontalFOV;
    if (!(fov > 0 && fov < 3.1415f)) return kDefaultFov;
    if (!isScaledHeight) return fov;
    // Without an aspect the angle is the height's.
    const float aspect = camera.mAspect > 0 ? camera.mAspect : kWideScreenAspect;
    const float height = camera.mAspect > 0 ? fov / aspect : fov;
    return 2 * std::atan(std::tan(height / 2) * aspect);
}

pod::Camera ConvertCamera(const aiCamera& source, bool fovIsScaledHeight) {
    pod::Camera camera;
    camera.fov = HorizontalFov(source, fovIsScaledHeight);
    const bool hasFar = source.mClipPlaneFar > 0 && std::isfinite(source.mClipPlaneFar);
    camera.farPlane = hasFar ? source.mClipPlaneFar : kDefaultFar;
    const bool hasNear = source.mClipPlaneNear > 0 && std::isfinite(source.mClipPlaneNear);
    camera.nearPlane = hasNear ? source.mClipPlaneNear : camera.farPlane / kDefaultDepthRange;
    if (camera.farPlane <= camera.nearPlane) camera.farPlane = camera.nearPlane * kDefaultDepthRange;
    return camera;
}

pod::Light ConvertLight(const aiLight& source) {
    pod::Light light;
    const bool far = source.mType == aiLightSource_DIRECTIONAL;
    const bool cone = source.mType == aiLightSource_SPOT;
    light.type = far ? pod::kDirectionalLight : cone ? pod::kSpotLight : pod::kPointLight;
    const aiColor3D& c = source.mColorDiffuse;
    // Physical intensities go far above 1; the engine's lights do not.
    const float scale = 1.0f / std::max({1.0f, c.r, c.g, c.b});
    light.colour = {c.r * scale, c.g * scale, c.b * scale};
    light.constantAttenuation = source.mAttenuationConstant;
    light.linearAttenuation = source.mAttenuationLinear;
    light.quadraticAttenuation = source.mAttenuationQuadratic;
    if (cone) light.falloffAngle = source.mAngleOuterCone;
    return light;
}

class NodeBuilder {
  public:
    NodeBuilder(const aiScene& source, const std::vector<std::vector<MeshPart>>& meshParts,
                const SkinSet& skins, const FrameTimes& frames, const CameraQuirks& quirks, ConvertLog* log,
                pod::Scene* out)
        : source_(source),
          meshParts_(meshParts),
          skins_(skins),
          frames_(frames),
          quirks_(quirks),
          log_(log),
          out_(out),
          boneDrafts_(skins.Bones().size(), -1) {
        for (size_t i = 0; i < skins.Bones().size(); ++i) bonesOf_[skins.Bones()[i].node].push_back(i);
        for (unsigned i = 0; frames.clip && i < frames.clip->mNumChannels; ++i) {
            const aiNodeAnim* channel = frames.clip->mChannels[i];
            channels_.emplace(channel->mNodeName.C_Str(), channel);
        }
    }

    void Build() {
        AddLightAndCameraRecords();
        if (source_.mRootNode) Visit(*source_.mRootNode, {-1, aiMatrix4x4()});
        AddOrphans();
        Finish();
    }

  private:
    // A light or camera, waiting for the node of its name.
    struct Attachment {
        NodeKind kind;
        std::string name;
        Pose pose;
        bool placed;
        pod::Light light;
        pod::Camera camera;
    };

    void AddLightAndCameraRecords() {
        for (unsigned i = 0; i < source_.mNumLights; ++i) {
            const aiLight& light = *source_.mLights[i];
            if (light.mType == aiLightSource_AMBIENT) {
                const aiColor3D& c =
                    light.mColorAmbient.IsBlack() ? light.mColorDiffuse : light.mColorAmbient;
                out_->ambient = {out_->ambient[0] + c.r, out_->ambient[1] + c.g, out_->ambient[2] + c.b};
                continue;
            }
            if (light.mType == aiLightSource_AREA) {
                log_->Warn(std::string("area light ") + light.mName.C_Str() + " becomes a point light");
            }
            const aiNode* node = source_.mRootNode->FindNode(light.mName);
            attachments_.push_back(
                {kLightNode, light.mName.C_Str(), LightPose(light, node), false, ConvertLight(light), {}});
        }
        for (unsigned i = 0; i < source_.mNumCameras; ++i) {
            const aiCamera& camera = *source_.mCameras[i];
            const aiNode* node = source_.mRootNode->FindNode(camera.mName);
            if (quirks_.directionIsLost) {
                log_->Warn(std::string("the importer does not tell where camera ") + camera.mName.C_Str() +
                           " looks; check it");
            }
            if (camera.mOrthographicWidth > 0) {
                log_->Warn(std::string("orthographic camera ") + camera.mName.C_Str() +
                           " becomes perspective");
            }
            attachments_.push_back({kCameraNode,
                                    camera.mName.C_Str(),
                                    CameraPose(camera, node, quirks_.looksAlongMinusZ),
                                    false,
                                    {},
                                    ConvertCamera(camera, quirks_.fovIsScaledHeight)});
        }
    }

    const aiNodeAnim* ChannelOf(const aiNode& node) const {
        const auto found = channels_.find(node.mName.C_Str());
        return found == channels_.end() ? nullptr : found->second;
    }

    // A node that others hang on.
    struct Parent {
        int draft;
        aiMatrix4x4 first;  // node to world at frame 0
    };

    // How a node moves.
    struct Motion {
        pod::Transform transform;
        aiMatrix4x4 first;  // node to world at frame 0
        bool holdsBind;     // it has the bind pose of the first bone that it is
    };

    Motion MotionOf(const aiNode& node, const aiMatrix4x4& parentFirst) const {
        const aiNodeAnim* channel = ChannelOf(node);
        TransformExtras extras;
        Pose rest, bind;
        const auto bones = bonesOf_.find(&node);
        if (bones != bonesOf_.end() && IsInvertible(parentFirst)) {
            aiMatrix4x4 fromWorld = parentFirst;
            fromWorld.Inverse();
            const aiMatrix4x4 wanted = fromWorld * skins_.Bones()[bones->second[0]].bind;
            const bool holdsPoses = channel || DecomposeMatrix(node.mTransformation, &rest);
            if (holdsPoses && DecomposeMatrix(wanted, &bind)) extras.lead = &bind;
        }
        const aiMatrix4x4 first =
            extras.lead ? Compose(bind) : FirstMatrix(node.mTransformation, channel, frames_);
        return {BuildTransform(node.mTransformation, channel, frames_, extras), parentFirst * first,
                extras.lead != nullptr};
    }

    std::vector<MeshPart> PartsOf(const aiNode& node) const {
        std::vector<MeshPart> parts;
        for (unsigned i = 0; i < node.mNumMeshes; ++i) {
            if (node.mMeshes[i] >= meshParts_.size()) continue;
            for (const MeshPart& part : meshParts_[node.mMeshes[i]]) {
                if (!part.skin || part.skin->holder == &node) parts.push_back(part);
            }
        }
        // Those that stay with the node come first.
        std::stable_partition(parts.begin(), parts.end(), [](const MeshPart& part) { return !part.skin; });
        return parts;
    }

    std::vector<Attachment*> AttachmentsOf(const aiNode& node) {
        std::vector<Attachment*> found;
        for (Attachment& a : attachments_) {
            if (!a.placed && a.name == node.mName.C_Str()) found.push_back(&a);
        }
        return found;
    }

    int AddDraft(NodeKind kind, pod::Node node, int parent) {
        drafts_.push_back({kind, std::move(node), parent});
        return static_cast<int>(drafts_.size()) - 1;
    }

    // Adds the record too: the k-th light or camera node belongs to the k-th record.
    void Place(Attachment* a, const std::string& name, const pod::Transform& transform, int parent) {
        a->placed = true;
        int object;
        if (a->kind == kLightNode) {
            object = static_cast<int>(out_->lights.size());
            out_->lights.push_back(a->light);
        } else {
            object = static_cast<int>(out_->cameras.size());
            out_->cameras.push_back(a->camera);
        }
        AddDraft(a->kind, pod::BuildNode(name, transform, -1, object), parent);
    }

    pod::Transform Fixed(const Pose& pose) const {
        TransformExtras extras;
        extras.attachment = &pose;
        return BuildTransform(aiMatrix4x4(), nullptr, frames_, extras);
    }

    void Visit(const aiNode& node, const Parent& parent) {
        const std::vector<MeshPart> parts = PartsOf(node);
        const std::vector<Attachment*> attached = AttachmentsOf(node);
        const bool isBone = bonesOf_.count(&node) != 0;
        if (parts.empty() && attached.size() == 1 && node.mNumChildren == 0 && !isBone) {
            TransformExtras extras;
            extras.attachment = &attached[0]->pose;
            Place(attached[0], attached[0]->name,
                  BuildTransform(node.mTransformation, ChannelOf(node), frames_, extras), parent.draft);
            return;
        }
        const Motion motion = MotionOf(node, parent.first);
        const bool isNeeded = isBone || !attached.empty() || node.mNumChildren > 0;
        const int self = AddCarrier(node, motion, parts, parent.draft, isNeeded);
        if (isBone) AddBones(node, motion, self);
        for (Attachment* a : attached) {
            const char* suffix = a->kind == kLightNode ? "_light" : "_camera";
            Place(a, a->name + suffix, Fixed(a->pose), self);
        }
        visited_.insert({&node, {self, motion.first}});
        for (unsigned i = 0; i < node.mNumChildren; ++i) {
            // Some importers leave holes in the list of children, or list all bones as children of one node.
            if (!node.mChildren[i]) continue;
            const auto known = visited_.find(node.mChildren[i]->mParent);
            Visit(*node.mChildren[i], known == visited_.end() ? visited_.at(&node) : known->second);
        }
    }

    // The node itself and its meshes; returns the draft that its children hang on. A node whose meshes are
    // all skinned carries none of them, and may not be needed.
    int AddCarrier(const aiNode& node, const Motion& motion, const std::vector<MeshPart>& parts, int parent,
                   bool isNeeded) {
        const std::string name = node.mName.C_Str();
        int carrier = parent;
        size_t number = 0;
        if (parts.empty() || (parts[0].skin && isNeeded)) {
            // Importers put a root above everything that does nothing.
            const bool idle = !node.mParent && node.mTransformation == aiMatrix4x4() && !ChannelOf(node);
            if (!idle || bonesOf_.count(&node)) {
                carrier = AddDraft(kOtherNode, pod::BuildNode(name, motion.transform), parent);
                ++number;
            }
        }
        for (const MeshPart& part : parts) {
            const std::string partName = number == 0 ? name : name + "_" + std::to_string(number + 1);
            const pod::Transform transform =
                part.skin ? BuildTransform(part.skin->place, nullptr, frames_, {}) : motion.transform;
            const int draft =
                AddDraft(kMeshNode, pod::BuildNode(partName, transform, -1, part.mesh, part.material),
                         part.skin ? -1 : parent);
            if (number == 0 && !part.skin) carrier = draft;
            ++number;
        }
        return carrier;
    }

    // Finds a draft for each bone that the node is: itself, or one below it.
    void AddBones(const aiNode& node, const Motion& motion, int self) {
        int helpers = 0;
        for (const size_t index : bonesOf_.at(&node)) {
            const SkinBone& bone = skins_.Bones()[index];
            boneDrafts_[index] = self;
            const bool isHeld = motion.holdsBind && index == bonesOf_.at(&node)[0];
            if (isHeld || IsSamePlace(motion.first, bone.bind, bone.reach)) continue;
            if (!IsInvertible(motion.first)) {
                log_->Warn(std::string("bone ") + node.mName.C_Str() +
                           " has no size at frame 0; what follows it is out of place");
                continue;
            }
            aiMatrix4x4 toNode = motion.first;
            toNode.Inverse();
            const pod::Transform transform = {
                {}, {}, {}, {ToMat4(toNode * bone.bind), ToMat4(aiMatrix4x4())}};
            const std::string suffix = ++helpers == 1 ? "_bone" : "_bone_" + std::to_string(helpers);
            pod::Node helper = pod::BuildNode(node.mName.C_Str() + suffix, transform);
            // The first matrix at frame 0, the second one, 16 floats on, at all others.
            helper.matrixIndex.assign(frames_.count, 16);
            helper.matrixIndex[0] = 0;
            boneDrafts_[index] = AddDraft(kOtherNode, std::move(helper), self);
        }
    }

    void AddOrphans() {
        for (Attachment& a : attachments_) {
            if (!a.placed) Place(&a, a.name, Fixed(a.pose), -1);
        }
    }

    void Finish() {
        std::vector<int> finalIndex(drafts_.size());
        int next = 0;
        for (const NodeKind kind : {kMeshNode, kLightNode, kCameraNode, kOtherNode}) {
            for (size_t i = 0; i < drafts_.size(); ++i) {
                if (drafts_[i].kind == kind) finalIndex[i] = next++;
            }
            if (kind == kMeshNode) out_->meshNodeCount = static_cast<uint32_t>(next);
        }
        out_->nodes.resize(drafts_.size());
        for (size_t i = 0; i < drafts_.size(); ++i) {
            pod::Node& node = out_->nodes[static_cast<size_t>(finalIndex[i])];
            node = std::move(drafts_[i].node);
            node.parent = drafts_[i].parent < 0 ? -1 : finalIndex[static_cast<size_t>(drafts_[i].parent)];
        }
        for (pod::Mesh& mesh : out_->meshes) {
            for (size_t i = 0; i < mesh.batchBones.size(); ++i) {
                const size_t row = i / static_cast<size_t>(mesh.batchBoneMax);
                const size_t column = i % static_cast<size_t>(mesh.batchBoneMax);
                if (column >= static_cast<size_t>(mesh.bonesPerBatch[row])) continue;
                const int draft = boneDrafts_[static_cast<size_t>(mesh.batchBones[i])];
                mesh.batchBones[i] = finalIndex[static_cast<size_t>(draft)];
            }
        }
    }

    const aiScene& source_;
    const std::vector<std::vector<MeshPart>>& meshParts_;
    const SkinSet& skins_;
    const FrameTimes& frames_;
    CameraQuirks quirks_;
    ConvertLog* log_;
    pod::Scene* out_;
    std::map<const aiNode*, std::vector<size_t>> bonesOf_;
    std::map<const aiNode*, Parent> visited_;
    std::map<std::string, const aiNodeAnim*> channels_;
    std::vector<Attachment> attachments_;
    std::vector<Draft> drafts_;
    std::vector<int> boneDrafts_;  // the draft that each bone is
};

}  // namespace

void ConvertNodes(const aiScene& source, const std::vector<std::vector<MeshPart>>& meshParts,
                  const SkinSet& skins, const FrameTimes& frames, const CameraQuirks& quirks, ConvertLog* log,
                  pod::Scene* out) {
    NodeBuilder(source, meshParts, skins, frames, quirks, log, out).Build();
}
