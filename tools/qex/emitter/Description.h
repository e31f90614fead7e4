// Descriptions of particle emitters that people read and write, as text or JSON, both with the names of
// QexParticleEmitter's fields.
//
// Text has a field a line: its name, its values with white space or commas between them, and "#" before a
// remark; "color" and "animation" stand once for each row, or have ";" between rows. JSON is an object of
// numbers and of arrays of them, "color" and "animation" arrays of rows.
#pragma once

#include <string>

#include "Qex.h"

// Sets the fields that a description names and leaves the others. False, and one line that names line, field
// and range, when there is nonsense in it.
bool ReadEmitterText(const std::string& text, QexParticleEmitter* emitter, std::string* problem);
bool ReadEmitterJson(const std::string& text, QexParticleEmitter* emitter, std::string* problem);

// Sets one field: "FIELD=VALUE VALUE ...", also with commas; ";" between rows.
bool SetEmitterField(const std::string& assignment, QexParticleEmitter* emitter, std::string* problem);

// All fields. Where they are in range, what is read again gives the same bits; text has each field's unit in
// a remark.
std::string EmitterText(const QexParticleEmitter& emitter);
std::string EmitterJson(const QexParticleEmitter& emitter);

// Reads an emitter file, or a description over the defaults of QexParticleEmitter_Create, whichever it is. To
// be released with QexParticleEmitter_Release; null, and one line, when it is neither. A line beside an
// emitter says what was left out.
QexParticleEmitter* LoadEmitter(const std::string& path, std::string* problem);

// An emitter of the defaults, the rate at which it begins the least. Null when memory runs out.
QexParticleEmitter* NewEmitter();
