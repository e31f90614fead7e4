#include "ConvertNodes.h"

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
                const FrameTimes& frames, const CameraQuirks& quirks, pod::Scene* out)
        : source_(source), meshParts_(meshParts), frames_(frames), quirks_(quirks), out_(out) {
        if (source.mNumAnimations == 0) return;
        const aiAnimation& animation = *source.mAnimations[0];
        for (unsigned i = 0; i < animation.mNumChannels; ++i) {
            channels_.emplace(animation.mChannels[i]->mNodeName.C_Str(), animation.mChannels[i]);
        }
    }

    void Build(ConvertLog* log) {
        AddLightAndCameraRecords(log);
        if (source_.mRootNode) Visit(*source_.mRootNode, -1);
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

    void AddLightAndCameraRecords(ConvertLog* log) {
        for (unsigned i = 0; i < source_.mNumLights; ++i) {
            const aiLight& light = *source_.mLights[i];
            if (light.mType == aiLightSource_AMBIENT) {
                const aiColor3D& c =
                    light.mColorAmbient.IsBlack() ? light.mColorDiffuse : light.mColorAmbient;
                out_->ambient = {out_->ambient[0] + c.r, out_->ambient[1] + c.g, out_->ambient[2] + c.b};
                continue;
            }
            if (light.mType == aiLightSource_AREA) {
                log->Warn(std::string("area light ") + light.mName.C_Str() + " becomes a point light");
            }
            const aiNode* node = source_.mRootNode->FindNode(light.mName);
            attachments_.push_back(
                {kLightNode, light.mName.C_Str(), LightPose(light, node), false, ConvertLight(light), {}});
        }
        for (unsigned i = 0; i < source_.mNumCameras; ++i) {
            const aiCamera& camera = *source_.mCameras[i];
            const aiNode* node = source_.mRootNode->FindNode(camera.mName);
            if (quirks_.directionIsLost) {
                log->Warn(std::string("the importer does not tell where camera ") + camera.mName.C_Str() +
                          " looks; check it");
            }
            if (camera.mOrthographicWidth > 0) {
                log->Warn(std::string("orthographic camera ") + camera.mName.C_Str() +
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

    pod::Transform TransformOf(const aiNode& node, const Pose* attachment) const {
        return BuildTransform(node.mTransformation, ChannelOf(node), frames_, attachment);
    }

    std::vector<MeshPart> PartsOf(const aiNode& node) const {
        std::vector<MeshPart> parts;
        for (unsigned i = 0; i < node.mNumMeshes; ++i) {
            if (node.mMeshes[i] >= meshParts_.size()) continue;
            const auto& more = meshParts_[node.mMeshes[i]];
            parts.insert(parts.end(), more.begin(), more.end());
        }
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

    void Visit(const aiNode& node, int parent) {
        const std::vector<MeshPart> parts = PartsOf(node);
        const std::vector<Attachment*> attached = AttachmentsOf(node);
        if (parts.empty() && attached.size() == 1 && node.mNumChildren == 0) {
            Place(attached[0], attached[0]->name, TransformOf(node, &attached[0]->pose), parent);
            return;
        }
        const int self = AddCarrier(node, parts, parent);
        for (Attachment* a : attached) {
            const char* suffix = a->kind == kLightNode ? "_light" : "_camera";
            Place(a, a->name + suffix, BuildTransform(aiMatrix4x4(), nullptr, frames_, &a->pose), self);
        }
        // Some importers leave holes in the list of children.
        for (unsigned i = 0; i < node.mNumChildren; ++i) {
            if (node.mChildren[i]) Visit(*node.mChildren[i], self);
        }
    }

    // The node itself; returns the draft that its children hang on.
    int AddCarrier(const aiNode& node, const std::vector<MeshPart>& parts, int parent) {
        const std::string name = node.mName.C_Str();
        if (parts.empty()) {
            // Importers put a root above everything that does nothing.
            const bool idle = !node.mParent && node.mTransformation == aiMatrix4x4() && !ChannelOf(node);
            if (idle) return parent;
            return AddDraft(kOtherNode, pod::BuildNode(name, TransformOf(node, nullptr)), parent);
        }
        const pod::Transform transform = TransformOf(node, nullptr);
        int first = -1;
        for (size_t i = 0; i < parts.size(); ++i) {
            const std::string partName = i == 0 ? name : name + "_" + std::to_string(i + 1);
            const int draft = AddDraft(
                kMeshNode, pod::BuildNode(partName, transform, -1, parts[i].mesh, parts[i].material), parent);
            if (i == 0) first = draft;
        }
        return first;
    }

    void AddOrphans() {
        for (Attachment& a : attachments_) {
            if (!a.placed) Place(&a, a.name, BuildTransform(aiMatrix4x4(), nullptr, frames_, &a.pose), -1);
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
    }

    const aiScene& source_;
    const std::vector<std::vector<MeshPart>>& meshParts_;
    const FrameTimes& frames_;
    CameraQuirks quirks_;
    pod::Scene* out_;
    std::map<std::string, const aiNodeAnim*> channels_;
    std::vector<Attachment> attachments_;
    std::vector<Draft> drafts_;
};

}  // namespace

void ConvertNodes(const aiScene& source, const std::vector<std::vector<MeshPart>>& meshParts,
                  const FrameTimes& frames, const CameraQuirks& quirks, ConvertLog* log, pod::Scene* out) {
    NodeBuilder(source, meshParts, frames, quirks, out).Build(log);
}
