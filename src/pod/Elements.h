// The vertex data of a mesh. What reads returns false, with a line in the log, where the file is broken.
#pragma once

#include "pod/Reader.h"
#include "Qex/pod.h"

// The block that the elements of a mesh lie in, if they have none of their own. It comes before them.
bool QexPODReader_ReadInterleaved(QexPODReader& reader, const QexPODField& field, uint32_t length,
                                  QexPODMesh* mesh, const uint32_t* extents);

bool QexPODReader_ReadUVWCount(QexPODReader& reader, const QexPODField& field, uint32_t length,
                               QexPODMesh* mesh);

// Goes down to the element of a number as the table has it; the UV channels share one and come in their
// order.
bool QexPODReader_BeginElement(QexPODReader& reader, uint32_t number, QexPODMesh* mesh, uint32_t* extents);

// A block of the element, or its end.
bool QexPODReader_ReadElementBlock(QexPODReader& reader, uint32_t id, uint32_t length);

// Elements that were declared without data are none; those without a stride are tightly packed.
void QexPODMesh_CompleteElements(QexPODMesh* mesh);
