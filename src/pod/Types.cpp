// The tables of what a POD scene is made of, and what follows from a row of them.
#include "pod/Types.h"

#include "Qex/pod.h"

// clang-format off
static const QexPODType kTypes[] = {
    // storage       bytes  packed  components  plain                  divisor
    {kPODNoStorage,  0,     false,  0,          0,                      1},
    {kPODFloat,      4,     false,  0,          QEX_POD_FLOAT,          1},
    {kPODInt32,      4,     false,  0,          QEX_POD_INT,            1},
    {kPODUint16,     2,     false,  0,          QEX_POD_UNSIGNED_SHORT, 1},
    {kPODColour,     4,     true,   0,          QEX_POD_RGBA,           255},
    {kPODColour,     4,     true,   0,          QEX_POD_ARGB,           255},
    {kPODColour,     4,     true,   0,          QEX_POD_D3DCOLOR,       255},
    {kPODUint8,      4,     true,   4,          QEX_POD_UBYTE4,         1},
    {kPODFields,     4,     true,   3,          QEX_POD_DEC3N,          511},
    {kPODFixed,      4,     false,  0,          QEX_POD_FIXED16_16,     65536},
    {kPODUint8,      1,     false,  0,          QEX_POD_UNSIGNED_BYTE,  1},
    {kPODInt16,      2,     false,  0,          QEX_POD_SHORT,          1},
    {kPODInt16,      2,     false,  0,          QEX_POD_SHORT,          32767},
    {kPODInt8,       1,     false,  0,          QEX_POD_BYTE,           1},
    {kPODInt8,       1,     false,  0,          QEX_POD_BYTE,           127},
    {kPODUint8,      1,     false,  0,          QEX_POD_UNSIGNED_BYTE,  255},
    {kPODUint16,     2,     false,  0,          QEX_POD_UNSIGNED_SHORT, 65535},
    {kPODUint32,     4,     false,  0,          QEX_POD_UNSIGNED_INT,   1},
};

const QexPODElement kPODElements[] = {
    {6003, "face indices",        &QexPODMesh::faces,       -1},
    {6006, "positions",           &QexPODMesh::vertices,    QEX_ELEMENT_POSITION},
    {6007, "normals",             &QexPODMesh::normals,     QEX_ELEMENT_NORMAL},
    {6008, "tangents",            &QexPODMesh::tangents,    QEX_ELEMENT_TANGENT},
    {6009, "binormals",           &QexPODMesh::binormals,   QEX_ELEMENT_BINORMAL},
    {6011, "colours",             &QexPODMesh::colours,     -1},
    {6012, "bone indices",        &QexPODMesh::boneIndices, QEX_ELEMENT_BONE_INDEX},
    {6013, "bone weights",        &QexPODMesh::boneWeights, QEX_ELEMENT_BONE_WEIGHT},
    {6010, "texture coordinates", nullptr,                  QEX_ELEMENT_UV0},
};
// clang-format on

const QexPODType& QexPODType_Of(uint32_t type) {
    return kTypes[type < sizeof kTypes / sizeof *kTypes ? type : 0];
}

uint32_t QexPODData_Components(const CPODData& element) {
    const uint32_t always = QexPODType_Of(element.type).components;
    return element.componentCount && always ? always : element.componentCount;
}

uint32_t QexPODData_ElementSize(uint32_t type, uint32_t componentCount) {
    const QexPODType& row = QexPODType_Of(type);
    return row.componentSize * (row.packed ? 1 : componentCount);
}

uint32_t QexPODElement_Find(uint32_t block) {
    for (uint32_t i = kPODFaces; i <= kPODUVWs; ++i)
        if (kPODElements[i].block == block) return i;
    return kPODMaxElements;
}
