// Where a loaded scene's vertices are in the world at its current frame, worked out on the CPU.
#pragma once

#include <vector>

#include "Qex.h"

struct Bounds {
    QexVec3 low, high;
    bool empty = true;

    void Add(const QexVec3& point);
    float LongestEdge() const;
};

// One vertex's value of an element that the mesh has.
QexVec4 ReadElement(const QexPODMesh& mesh, const CPODData& element, uint32_t vertex);

// World positions of a mesh node's vertices as they are drawn: skinned vertices follow their bones. At most
// `limit` of them, evenly chosen; those that are not finite are left out.
void CollectPoints(QexPODModel* scene, uint32_t meshNode, size_t limit, std::vector<QexVec3>* points);

Bounds BoundsOf(const std::vector<QexVec3>& points);
