// Names of parts, and changes of them.
#include "scene/Changes.h"

#include <algorithm>
#include <cstdlib>

const ChangeWord kNodeChanges[5] = {{"hide", 0}, {"move:", 3}, {"rotate:", 3}, {"face:", 3}, {"shader:", 0}};
const ChangeWord kMaterialChanges[4] = {
    {"diffuse:", 3}, {"specular:", 3}, {"shininess:", 1}, {"opacity:", 1}};

namespace {

bool SameValue(const QexVec3& a, const QexVec3& b) {
    return a.x == b.x && a.y == b.y && a.z == b.z;
}

// A kind of part of a scene.
struct Parts {
    const char* what;
    uint32_t count;
    const char* (*name)(const QexPODModel&, uint32_t);
    const QexPODModel& scene;

    std::string Name(uint32_t i) const {
        const char* found = name(scene, i);
        return found ? found : "";
    }
    uint32_t First(const std::string& wanted) const {
        uint32_t i = 0;
        while (i < count && Name(i) != wanted) ++i;
        return i;
    }
};

Parts NodesOf(const QexPODModel& scene) {
    return {"node", scene.nodeCount,
            [](const QexPODModel& s, uint32_t i) -> const char* { return s.nodes[i].name; }, scene};
}

Parts MaterialsOf(const QexPODModel& scene) {
    return {"material", scene.materialCount,
            [](const QexPODModel& s, uint32_t i) -> const char* { return s.materials[i].name; }, scene};
}

// The names, as many as a line may hold.
std::string NamesOf(const Parts& parts) {
    std::string names;
    for (uint32_t i = 0; i < parts.count; ++i) {
        const std::string name = parts.Name(i);
        if (name.empty()) continue;
        if (names.size() > 400) return names + ", ...";
        names += (names.empty() ? "" : ", ") + name;
    }
    return names.empty() ? "none with a name" : names;
}

std::string WordOf(const Parts& parts, uint32_t index) {
    const std::string name = parts.Name(index);
    return name.empty() || parts.First(name) != index ? "#" + std::to_string(index) : name;
}

int32_t Find(const Parts& parts, const std::string& word, std::string* problem) {
    const uint32_t first = parts.First(word);
    if (first < parts.count) return static_cast<int32_t>(first);
    char* end = nullptr;
    const unsigned long index = word.size() > 1 && word[0] == '#' ? strtoul(&word[1], &end, 10) : parts.count;
    if (end && !*end && index < parts.count) return static_cast<int32_t>(index);
    *problem = std::string("no ") + parts.what + " '" + word + "'; the scene has " + NamesOf(parts);
    return -1;
}

}  // namespace

bool NodeChange::operator==(const NodeChange& o) const {
    return node == o.node && what == o.what && SameValue(value, o.value) && shader == o.shader;
}

bool MaterialChange::operator==(const MaterialChange& o) const {
    return material == o.material && what == o.what && SameValue(value, o.value);
}

std::string NodeWord(const QexPODModel& scene, uint32_t index) {
    return WordOf(NodesOf(scene), index);
}

std::string MaterialWord(const QexPODModel& scene, uint32_t index) {
    return WordOf(MaterialsOf(scene), index);
}

int32_t FindNode(const QexModel& model, const std::string& word, std::string* problem) {
    return Find(NodesOf(model.scene), word, problem);
}

int32_t FindMaterial(const QexModel& model, const std::string& word, std::string* problem) {
    return Find(MaterialsOf(model.scene), word, problem);
}

void TakeBack(std::vector<NodeChange>* changes, NodeChange::What what, const std::string& node) {
    const auto taken = [&](const NodeChange& c) {
        return c.what == what && (node.empty() || c.node == node);
    };
    changes->erase(std::remove_if(changes->begin(), changes->end(), taken), changes->end());
}

void SetShader(std::vector<NodeChange>* changes, const std::string& node, const std::string& shader) {
    TakeBack(changes, NodeChange::kShader, node);
    if (!shader.empty()) changes->push_back({node, NodeChange::kShader, {0, 0, 0}, shader});
}

const NodeChange* FindChange(const std::vector<NodeChange>& changes, const std::string& node,
                             NodeChange::What what) {
    const auto found = std::find_if(changes.begin(), changes.end(),
                                    [&](const NodeChange& c) { return c.node == node && c.what == what; });
    return found == changes.end() ? nullptr : &*found;
}

std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes) {
    std::string problem;
    for (const NodeChange& change : changes) {
        const int32_t found = FindNode(*model, change.node, &problem);
        if (found < 0) return problem;
        const uint32_t node = static_cast<uint32_t>(found);
        const QexVec3& v = change.value;
        if (change.what == NodeChange::kHide) QexModel_EnableNodeRenderingR(model, node, 0);
        if (change.what == NodeChange::kMove) QexModel_SetNodePosition(model, node, v.x, v.y, v.z);
        if (change.what == NodeChange::kRotate) QexModel_SetNodeRotation(model, node, v.x, v.y, v.z);
        if (change.what == NodeChange::kFace) QexModel_SetNodeFaceTo(model, node, &v);
    }
    return "";
}

std::string ChangeMaterials(QexModel* model, const std::vector<MaterialChange>& changes) {
    std::string problem;
    for (const MaterialChange& change : changes) {
        const int32_t found = FindMaterial(*model, change.material, &problem);
        if (found < 0) return problem;
        QexPODMaterial& material = model->scene.materials[found];
        const float values[3] = {change.value.x, change.value.y, change.value.z};
        float* const places[] = {material.diffuse, material.specular, &material.shininess, &material.opacity};
        for (size_t i = 0; i < kMaterialChanges[change.what].numbers; ++i) places[change.what][i] = values[i];
    }
    return "";
}
