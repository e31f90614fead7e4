// Descriptions of particle emitters that people read and write: a JSON object with the names of
// QexParticleEmitter's fields, of numbers and arrays of them, "color" and "animation" arrays of rows.
// Comments as in C++ are skipped. Those of earlier versions are read as well: text with a field a line, its
// name, its values with white space or commas between them, and "#" before a remark; a line for each row.
#pragma once

#include <string>

#include "emitter/Fields.h"

// Reads "FIELD=VALUE VALUE ...", also with commas; ";" between rows. Returns what is wrong with it, or an
// empty text.
std::string ReadSetting(const std::string& assignment, FieldValues* values);

// Sets the fields that a JSON object names. Returns what is wrong with it, and sets none then, or an empty
// text.
std::string SetFields(const std::string& json, QexParticleEmitter* emitter);

// All fields. Where they are in range, what is read again gives the same bits.
std::string DescribeEmitter(const QexParticleEmitter& emitter);

// The names of the fields, the numbers that each takes, and what these are: a line each.
std::string FieldHelp();

// Reads an emitter file, or a description over the defaults of QexParticleEmitter_Create, whichever it is. To
// be released with QexParticleEmitter_Release; null, and one line that names field and range, when it is
// neither. A line beside an emitter says what was left out.
QexParticleEmitter* LoadEmitter(const std::string& path, std::string* problem);

// An emitter of the defaults, the rate at which it begins the least. Null when memory runs out.
QexParticleEmitter* NewEmitter();
