// The node tree of a converted scene, with the cameras and lights that hang in it.
#pragma once

#include <vector>

#include "convert/Animation.h"
#include "convert/Log.h"
#include "convert/Skin.h"

struct aiScene;

// One POD mesh that an imported mesh has become, and its material.
struct MeshPart {
    int mesh;
    int material;
    const MeshSkin* skin;  // null for one that follows no bones
};

// What importers get wrong about cameras.
struct CameraQuirks {
    bool fovIsScaledHeight = false;  // the height's angle times the aspect stands for the width's angle
    bool looksAlongMinusZ = false;   // the view direction is not that of the record but the node's -Z
    bool directionIsLost = false;
};

// Fills the nodes, cameras and lights of `out`. The nodes are ordered as the format asks: those with a mesh,
// then lights, then cameras, then the rest. A POD node carries one thing only, so an imported node with
// several becomes several: its meshes share its transform and parent, lights and cameras become children.
// Light nodes shine along their -Z axis. Camera nodes look along -Y with -Z up.
//
// Frame 0 is the bind pose of `skins`: bones have it as their first key. Where a node cannot hold it (two
// meshes want it in two places, or it shears) a bone node of its own hangs below it, which is nothing from
// frame 1 on. A skinned mesh hangs on no other node. The batches of `out`, which hold the numbers of bones,
// get those of nodes.
void ConvertNodes(const aiScene& source, const std::vector<std::vector<MeshPart>>& meshParts,
                  const SkinSet& skins, const FrameTimes& frames, const CameraQuirks& quirks, ConvertLog* log,
                  pod::Scene* out);
