// The values of a record's blocks. What reads returns false, with a line in the log, where the file is
// broken.
#pragma once

#include "pod/Reader.h"

// Whether that many bytes are left.
bool QexPODReader_CheckLength(QexPODReader& reader, uint32_t id, uint32_t length);

bool QexPODReader_Skip(QexPODReader& reader, uint32_t id, uint32_t length);

// Bytes that the file holds, the first piece now and the others in the next steps. `rotations`: w changes its
// sign.
bool QexPODReader_ReadBytes(QexPODReader& reader, void* target, uint32_t count, bool rotations = false);
bool QexPODReader_ReadPending(QexPODReader& reader);

// Words of a block into `target`; a longer block's rest is passed over.
bool QexPODReader_ReadWords(QexPODReader& reader, const QexPODField& field, uint32_t length, void* target);

// A block into the field of a record, and its length into the record's extents.
bool QexPODReader_ReadField(QexPODReader& reader, const QexPODField& field, uint32_t length, void* record,
                            uint32_t* extents);
