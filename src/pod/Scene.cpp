#include "pod/Scene.h"

#include <cstring>

#include "base/Memory.h"

namespace {

// ---- Vertex elements ----

template <class T>
T Load(const void* source, int32_t i) {
    T value;
    memcpy(&value, static_cast<const uint8_t*>(source) + static_cast<size_t>(i) * sizeof(T), sizeof(T));
    return value;
}

template <class T>
void Store(void* destination, int32_t i, T value) {
    memcpy(static_cast<uint8_t*>(destination) + static_cast<size_t>(i) * sizeof(T), &value, sizeof(T));
}

template <class T>
void ReadComponents(float* out, const void* source, int32_t count, float divisor) {
    for (int32_t i = 0; i < count; ++i) out[i] = static_cast<float>(Load<T>(source, i)) / divisor;
}

// Truncates toward zero; what does not fit becomes the nearest value that does, NaN becomes 0. The product is
// rounded to a float first: k / divisor * divisor is k again then, and truncation does not make it k - 1.
template <class T>
void WriteComponents(void* destination, int32_t count, const float* values, float factor, double low,
                     double high) {
    for (int32_t i = 0; i < count; ++i) {
        const float product = values[i] * factor;
        double value = static_cast<double>(product);
        if (!(value == value)) value = 0;
        value = value < low ? low : value > high ? high : value;
        Store(destination, i, static_cast<T>(static_cast<int64_t>(value)));
    }
}

// Shifts of the four values of a colour word.
const uint8_t kRGBAShifts[4] = {24, 16, 8, 0};
const uint8_t kARGBShifts[4] = {16, 8, 0, 24};

const uint8_t* ColourShifts(uint32_t type) {
    return type == QEX_POD_RGBA ? kRGBAShifts : kARGBShifts;
}

void WriteColour(void* destination, const uint8_t* shifts, const float* values) {
    uint32_t word = 0;
    for (int i = 0; i < 4; ++i) {
        const float clamped = values[i] > 0 ? values[i] < 1 ? values[i] : 1.0f : 0.0f;
        word |= static_cast<uint32_t>(clamped * 255.0f) << shifts[i];
    }
    Store(destination, 0, word);
}

void WriteDec3N(void* destination, const float* values) {
    uint32_t word = 0;
    for (int i = 0; i < 3; ++i) {
        float value = values[i] * 511.0f;
        value = value > -512.0f ? value < 511.0f ? value : 511.0f : -512.0f;
        word |= (static_cast<uint32_t>(static_cast<int32_t>(value)) & 0x3FFu) << (10 * i);
    }
    Store(destination, 0, word);
}

// ---- Release ----

void ReleaseMesh(QexPODMesh* mesh) {
    CPODData_Reset(&mesh->faces);
    CPODData* const elements[] = {&mesh->vertices, &mesh->normals,     &mesh->tangents,   &mesh->binormals,
                                  &mesh->colours,  &mesh->boneIndices, &mesh->boneWeights};
    if (!mesh->interleaved) {
        for (CPODData* element : elements) CPODData_Reset(element);
        for (uint32_t i = 0; i < mesh->uvwChannelCount; ++i) CPODData_Reset(&mesh->uvws[i]);
    }
    QexMemory_FreeArray(mesh->uvws);
    QexMemory_FreeArray(mesh->stripLengths);
    QexMemory_FreeArray(mesh->interleaved);
    QexBoneBatches_Release(&mesh->boneBatches);
}

void FreeKeys(float*& keys, uint32_t ownership, uint32_t sharedBit) {
    if (!(ownership & sharedBit)) QexMemory_Free(keys);
    keys = nullptr;
}

void ReleaseNode(QexPODNode* node) {
    QexMemory_FreeArray(node->name);
    QexMemory_FreeArray(node->positionIndex);
    QexMemory_FreeArray(node->rotationIndex);
    QexMemory_FreeArray(node->scaleIndex);
    QexMemory_FreeArray(node->matrixIndex);
    FreeKeys(node->position, node->ownershipFlags, QEX_NODE_SHARED_POSITION);
    FreeKeys(node->rotation, 0, 0);
    FreeKeys(node->scale, node->ownershipFlags, QEX_NODE_SHARED_SCALE);
    FreeKeys(node->matrix, node->ownershipFlags, QEX_NODE_SHARED_MATRIX);
}

void ReleaseImpl(QexPODModel* scene) {
    if (!scene->runtime) return;
    SPVRTPODImpl_Destructor(scene->runtime);
    QexMemory_FreeArray(scene->runtime);
}

void SetBox(QexBoundingBox* box, const QexVec3& low, const QexVec3& high) {
    for (int i = 0; i < 8; ++i) {
        box->corners[i].x = i & 4 ? high.x : low.x;
        box->corners[i].y = i & 2 ? high.y : low.y;
        box->corners[i].z = i & 1 ? high.z : low.z;
    }
    box->centre = {(low.x + high.x) / 2, (low.y + high.y) / 2, (low.z + high.z) / 2};
    QexVec3_Subtract(&box->halfExtent, &high, &box->centre);
}

}  // namespace

extern "C" {

void CPODData_Reset(CPODData* element) {
    QexMemory_Free(element->data);
    *element = {QEX_POD_FLOAT, 0, 0, nullptr};
}

void SPVRTPODImpl_Contructor(SPVRTPODImpl* impl) {
    memset(impl, 0, sizeof *impl);
}

void SPVRTPODImpl_Destructor(SPVRTPODImpl* impl) {
    QexMemory_FreeArray(impl->cacheKeys);
    QexMemory_FreeArray(impl->cachedMatrices);
    QexMemory_FreeArray(impl->bindPose);
    QexMemory_FreeArray(impl->inverseBindPose);
    QexMemory_FreeArray(impl->boneMatrices);
    QexMemory_FreeArray(impl->boneMeshNodes);
}

int32_t QexPODModel_InitImpl(QexPODModel* scene) {
    ReleaseImpl(scene);
    SPVRTPODImpl* impl = QexMemory_AllocZeroed<SPVRTPODImpl>(1);
    if (!impl) return -1;
    SPVRTPODImpl_Contructor(impl);
    scene->runtime = impl;
    impl->cacheKeys = QexMemory_AllocZeroed<float>(scene->nodeCount);
    impl->cachedMatrices = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->bindPose = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->inverseBindPose = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->boneMatrices = QexMemory_AllocZeroed<QexMatrix>(scene->nodeCount);
    impl->boneMeshNodes = QexMemory_AllocZeroed<int32_t>(scene->nodeCount);
    if (!impl->cacheKeys || !impl->cachedMatrices || !impl->bindPose || !impl->inverseBindPose ||
        !impl->boneMatrices || !impl->boneMeshNodes) {
        ReleaseImpl(scene);
        return -1;
    }
    QexPODModel_FlushCache(scene);
    return 0;
}

void QexPODModel_Release(QexPODModel* scene) {
    for (uint32_t i = 0; i < scene->cameraCount; ++i) QexMemory_FreeArray(scene->cameras[i].animatedFov);
    QexMemory_FreeArray(scene->cameras);
    for (uint32_t i = 0; i < scene->materialCount; ++i) {
        QexMemory_FreeArray(scene->materials[i].name);
        QexMemory_FreeArray(scene->materials[i].effectFile);
        QexMemory_FreeArray(scene->materials[i].effectName);
    }
    QexMemory_FreeArray(scene->materials);
    for (uint32_t i = 0; i < scene->meshCount; ++i) ReleaseMesh(&scene->meshes[i]);
    QexMemory_FreeArray(scene->meshes);
    for (uint32_t i = 0; i < scene->nodeCount; ++i) ReleaseNode(&scene->nodes[i]);
    QexMemory_FreeArray(scene->nodes);
    for (uint32_t i = 0; i < scene->textureCount; ++i) QexMemory_FreeArray(scene->textures[i].name);
    QexMemory_FreeArray(scene->textures);
    QexMemory_FreeArray(scene->lights);
    ReleaseImpl(scene);
    scene->cameraCount = scene->lightCount = scene->meshCount = scene->nodeCount = 0;
    scene->meshNodeCount = scene->textureCount = scene->materialCount = 0;
}

uint32_t QexPODModel_CountIndices(const QexPODMesh* mesh) {
    if (!mesh->stripCount) return mesh->faceCount * 3;
    uint32_t count = 0;
    for (uint32_t i = 0; i < mesh->stripCount; ++i) count += mesh->stripLengths[i] + 2;
    return count;
}

void QexPODModel_SetPassID(QexPODModel* scene, QexPODMesh* mesh, uint32_t passID) {
    mesh->passID = passID;
    if (passID > scene->highestPass) scene->highestPass = passID;
}

void QexPODVertex_ReadVec(float* out, const void* source, uint32_t type, int32_t count) {
    out[0] = out[1] = out[2] = 0;
    out[3] = 1;
    if (count > 4) count = 4;
    switch (type) {
        case QEX_POD_FLOAT: ReadComponents<float>(out, source, count, 1); break;
        case QEX_POD_INT: ReadComponents<int32_t>(out, source, count, 1); break;
        case QEX_POD_UNSIGNED_SHORT: ReadComponents<uint16_t>(out, source, count, 1); break;
        case QEX_POD_RGBA:
        case QEX_POD_ARGB:
        case QEX_POD_D3DCOLOR: {
            const uint32_t word = Load<uint32_t>(source, 0);
            for (int i = 0; i < 4; ++i)
                out[i] = static_cast<float>(word >> ColourShifts(type)[i] & 0xFF) / 255.0f;
            break;
        }
        case QEX_POD_UBYTE4: ReadComponents<uint8_t>(out, source, 4, 1); break;
        case QEX_POD_DEC3N: {
            const uint32_t word = Load<uint32_t>(source, 0);
            for (int i = 0; i < 3; ++i) {
                const int32_t field = static_cast<int32_t>(word << (22 - 10 * i)) >> 22;
                out[i] = static_cast<float>(field) / 511.0f;
            }
            break;
        }
        case QEX_POD_FIXED16_16: ReadComponents<int32_t>(out, source, count, 65536); break;
        case QEX_POD_UNSIGNED_BYTE: ReadComponents<uint8_t>(out, source, count, 1); break;
        case QEX_POD_SHORT: ReadComponents<int16_t>(out, source, count, 1); break;
        case QEX_POD_SHORT_NORM: ReadComponents<int16_t>(out, source, count, 32767); break;
        case QEX_POD_BYTE: ReadComponents<uint8_t>(out, source, count, 1); break;
        case QEX_POD_BYTE_NORM: ReadComponents<uint8_t>(out, source, count, 127); break;
        case QEX_POD_UNSIGNED_BYTE_NORM: ReadComponents<uint8_t>(out, source, count, 255); break;
        case QEX_POD_UNSIGNED_SHORT_NORM: ReadComponents<uint16_t>(out, source, count, 65535); break;
        case QEX_POD_UNSIGNED_INT: ReadComponents<uint32_t>(out, source, count, 1); break;
        default: break;
    }
}

void QexPODVertex_ReadInt(uint32_t* out, const void* source, uint32_t type) {
    if (type == QEX_POD_UNSIGNED_SHORT) *out = Load<uint16_t>(source, 0);
    if (type == QEX_POD_UNSIGNED_INT) *out = Load<uint32_t>(source, 0);
}

void QexVertexWriteVec(void* destination, uint32_t type, int32_t count, const float* values) {
    if (count > 4) count = 4;
    switch (type) {
        case QEX_POD_FLOAT:
            for (int32_t i = 0; i < count; ++i) Store(destination, i, values[i]);
            break;
        case QEX_POD_INT:
            WriteComponents<int32_t>(destination, count, values, 1, INT32_MIN, INT32_MAX);
            break;
        case QEX_POD_UNSIGNED_SHORT:
            WriteComponents<uint16_t>(destination, count, values, 1, 0, 65535);
            break;
        case QEX_POD_RGBA:
        case QEX_POD_ARGB:
        case QEX_POD_D3DCOLOR: WriteColour(destination, ColourShifts(type), values); break;
        case QEX_POD_UBYTE4: WriteComponents<uint8_t>(destination, 4, values, 1, 0, 255); break;
        case QEX_POD_DEC3N: WriteDec3N(destination, values); break;
        case QEX_POD_FIXED16_16:
            WriteComponents<int32_t>(destination, count, values, 65536, INT32_MIN, INT32_MAX);
            break;
        case QEX_POD_UNSIGNED_BYTE:
        case QEX_POD_BYTE: WriteComponents<uint8_t>(destination, count, values, 1, 0, 255); break;
        case QEX_POD_SHORT: WriteComponents<int16_t>(destination, count, values, 1, -32768, 32767); break;
        case QEX_POD_SHORT_NORM:
            WriteComponents<int16_t>(destination, count, values, 32767, -32768, 32767);
            break;
        case QEX_POD_BYTE_NORM: WriteComponents<uint8_t>(destination, count, values, 127, 0, 255); break;
        case QEX_POD_UNSIGNED_BYTE_NORM:
            WriteComponents<uint8_t>(destination, count, values, 255, 0, 255);
            break;
        case QEX_POD_UNSIGNED_SHORT_NORM:
            WriteComponents<uint16_t>(destination, count, values, 65535, 0, 65535);
            break;
        case QEX_POD_UNSIGNED_INT:
            WriteComponents<uint32_t>(destination, count, values, 1, 0, UINT32_MAX);
            break;
        default: break;
    }
}

void QexBoundingBox_ComputeInterleaved(QexBoundingBox* box, const void* data, int32_t count, uint32_t offset,
                                       uint32_t stride) {
    QexVec3 low = {0, 0, 0}, high = {0, 0, 0};
    const uint8_t* bytes = static_cast<const uint8_t*>(data) + offset;
    for (int32_t i = 0; i < count; ++i, bytes += stride) {
        QexVec3 p;
        memcpy(&p, bytes, sizeof p);
        if (i == 0) low = high = p;
        low = {p.x < low.x ? p.x : low.x, p.y < low.y ? p.y : low.y, p.z < low.z ? p.z : low.z};
        high = {p.x > high.x ? p.x : high.x, p.y > high.y ? p.y : high.y, p.z > high.z ? p.z : high.z};
    }
    SetBox(box, low, high);
}

}  // extern "C"
