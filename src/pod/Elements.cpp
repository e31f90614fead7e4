// The vertex data of a mesh: its interleaved block, or each element's own bytes.
#include "pod/Elements.h"

#include "base/Diagnostics.h"
#include "base/Memory.h"
#include "pod/Values.h"
#include "Qex/base.h"
#include "Qex/pod.h"
#include "Qex/resources.h"

namespace {

// An element's own bytes; what is left behind its last whole component does not count.
bool ReadElementData(QexPODReader& reader, uint32_t length, CPODData* element, uint32_t& extent) {
    const uint32_t size = QexPODType_Of(element->type).componentSize;
    if (!size || length < size) return QexPODReader_Skip(reader, 9003, length);
    if (!QexPODReader_CheckLength(reader, 9003, length)) return false;
    QexMemory_Free(element->data);
    element->data = static_cast<uint8_t*>(QexMemory_Alloc(length));
    if (!element->data) return QexPODReader_OutOfMemory(__LINE__);
    extent = length / size * size;
    return QexPODReader_ReadBytes(reader, element->data, length);
}

}  // namespace

bool QexPODReader_ReadInterleaved(QexPODReader& reader, const QexPODField& field, uint32_t length,
                                  QexPODMesh* mesh, const uint32_t* extents) {
    if (!QexPODReader_CheckLength(reader, field.id, length)) return false;
    if (mesh->interleaved) return QexPODReader_Fail(reader, "a mesh has two interleaved blocks");
    for (uint32_t i = kPODFaces + 1; i < kPODMaxElements; ++i)
        if (extents[kExtentElements + i])
            return QexPODReader_Fail(reader, "a mesh's interleaved block comes after its elements");
    if (!length) return true;
    mesh->interleaved = static_cast<uint8_t*>(QexMemory_Alloc(length));
    if (!mesh->interleaved) return QexPODReader_OutOfMemory(__LINE__);
    mesh->interleavedBytes = length;
    QexSystem_Printf(field.line, length);
    return QexPODReader_ReadBytes(reader, mesh->interleaved, length);
}

bool QexPODReader_ReadUVWCount(QexPODReader& reader, const QexPODField& field, uint32_t length,
                               QexPODMesh* mesh) {
    if (mesh->uvws) return QexPODReader_Fail(reader, "a mesh counts its UV channels twice");
    uint32_t count = 0;
    if (!QexPODReader_ReadWords(reader, field, length, &count)) return false;
    if (count > kPODMaxUVChannels)
        return QexPODReader_Fail(reader, "a mesh has %u UV channels, at most %u are possible", count,
                                 kPODMaxUVChannels);
    if (!count) return true;
    mesh->uvws = static_cast<CPODData*>(QexMemory_Alloc(count * static_cast<uint32_t>(sizeof(CPODData))));
    if (!mesh->uvws) return QexPODReader_OutOfMemory(__LINE__);
    memset(mesh->uvws, 0, count * sizeof(CPODData));
    mesh->uvwChannelCount = count;
    return true;
}

bool QexPODReader_BeginElement(QexPODReader& reader, uint32_t number, QexPODMesh* mesh, uint32_t* extents) {
    if (number == kPODUVWs) {
        if (reader.uvwRead >= mesh->uvwChannelCount)
            return QexPODReader_Fail(reader, "a mesh has more UV channels than the %u it counts",
                                     mesh->uvwChannelCount);
        number += reader.uvwRead++;
    }
    reader.level = QexPODLevel::Element;
    reader.elementBlock = QexPODElement_Of(number).block;
    reader.element = QexPODMesh_Element(mesh, number);
    reader.elementInterleaved = mesh->interleaved && number != kPODFaces;
    reader.elementExtent = &extents[kExtentElements + number];
    return true;
}

bool QexPODReader_ReadElementBlock(QexPODReader& reader, uint32_t id, uint32_t length) {
    CPODData* element = reader.element;
    uint32_t* word = id == 9000   ? &element->type
                     : id == 9001 ? &element->componentCount
                     : id == 9002 ? &element->stride
                                  : nullptr;
    const QexPODField field = {id, QexPODFieldKind::Words, 1, 0, -1, 0, nullptr, nullptr};
    if (word) return QexPODReader_ReadWords(reader, field, length, word);
    if (id == 9003 && !reader.elementInterleaved)
        return ReadElementData(reader, length, element, *reader.elementExtent);
    if (id == 9003) {
        uint32_t offset = 0;
        const bool read = QexPODReader_ReadWords(reader, field, length, &offset);
        element->data = reinterpret_cast<uint8_t*>(static_cast<uintptr_t>(offset));
        return read;
    }
    if (id == (reader.elementBlock | kPODEndMark)) reader.level = QexPODLevel::Record;
    return QexPODReader_Skip(reader, id, length);
}

void QexPODMesh_CompleteElements(QexPODMesh* mesh) {
    if (mesh->interleaved || !mesh->vertexCount) return;
    for (uint32_t i = kPODVertices; i < QexPODMesh_ElementCount(mesh); ++i) {
        CPODData* element = QexPODMesh_Element(mesh, i);
        if (!element->data) element->componentCount = 0;
        if (element->componentCount && !element->stride) element->stride = QexPODData_ElementSize(*element);
    }
}
