// What is changed of a scene's parts without writing its file anew: nodes that are hidden, moved or drawn by
// another module, materials' colours. Parts are called by name, or where they have none of their own by "#"
// and their index.
#pragma once

#include <string>
#include <vector>

#include "Qex.h"

struct NodeChange {
    enum What { kHide, kMove, kRotate, kFace, kShader };

    std::string node;
    What what;
    QexVec3 value;            // a place, or degrees
    std::string shader = {};  // kShader: a name of ShaderNames

    bool operator==(const NodeChange& o) const;
};

struct MaterialChange {
    enum What { kDiffuse, kSpecular, kShininess, kOpacity };

    std::string material;
    What what;
    QexVec3 value;  // a colour from 0 to 1, or one number and zeros

    bool operator==(const MaterialChange& o) const;
};

// How changes are written, in the order of their What: a word and how many numbers follow it; a module's name
// behind that of kShader.
struct ChangeWord {
    const char* word;
    size_t numbers;
};
extern const ChangeWord kNodeChanges[5], kMaterialChanges[4];

// What a part is called.
std::string NodeWord(const QexPODModel& scene, uint32_t index);
std::string MaterialWord(const QexPODModel& scene, uint32_t index);
// The index of the part that is called so; when there is none it is -1 and `problem` names those that there
// are.
int32_t FindNode(const QexModel& model, const std::string& word, std::string* problem);
int32_t FindMaterial(const QexModel& model, const std::string& word, std::string* problem);

// Carries the changes out, but for those of modules, see SceneShaders. Returns a line that says which part
// there is not, or nothing.
std::string ChangeNodes(QexModel* model, const std::vector<NodeChange>& changes);
std::string ChangeMaterials(QexModel* model, const std::vector<MaterialChange>& changes);

// Takes changes of nodes back: all of a kind, or those of the node that is named.
void TakeBack(std::vector<NodeChange>* changes, NodeChange::What what, const std::string& node = "");

// Adds a change that takes the place of an earlier one of the same kind.
template <class Change>
void SetChange(std::vector<Change>* changes, const Change& change, std::string Change::*part) {
    for (Change& known : *changes)
        if (known.*part == change.*part && known.what == change.what) {
            known = change;
            return;
        }
    changes->push_back(change);
}
// The change of that kind of a node, or null.
const NodeChange* FindChange(const std::vector<NodeChange>& changes, const std::string& node,
                             NodeChange::What what);
inline void SetChange(std::vector<NodeChange>* changes, const NodeChange& change) {
    SetChange(changes, change, &NodeChange::node);
}
// The module of a node, or with none the one that it has without changes.
void SetShader(std::vector<NodeChange>* changes, const std::string& node, const std::string& shader);
inline void SetChange(std::vector<MaterialChange>* changes, const MaterialChange& change) {
    SetChange(changes, change, &MaterialChange::material);
}
