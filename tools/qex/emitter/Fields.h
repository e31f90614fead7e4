// The fields of particle emitters: one table that is behind all that reads, shows and edits them.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "Qex.h"

using Row = std::vector<double>;

struct Column {
    bool whole;
    double low, high;
};

// One row of values, or, with a count of rows in use, up to ten.
struct Field {
    const char* name;
    size_t offset;
    std::vector<Column> columns;
    const char* remark;
    size_t rowBytes = 0;     // from row to row
    size_t countOffset = 0;  // of the number of rows; 0: one row

    bool HasRows() const { return countOffset; }
};

const std::vector<Field>& EmitterFields();

// A field's rows, one at least, floats as their shortest decimals.
std::vector<Row> GetRows(const QexParticleEmitter& emitter, const Field& field);

// What is wrong with rows of values for a field, or an empty text.
std::string FaultOf(const Field& field, const std::vector<Row>& rows);

// Values for some of the fields, which are set together.
class FieldValues {
  public:
    // Adds rows to those of the field of that name, unless there was a fault in what they were read from.
    // Returns what is wrong, or an empty text.
    std::string Add(const std::string& name, const std::vector<Row>& rows, const std::string& fault = "");

    void Apply(QexParticleEmitter* emitter) const;

  private:
    std::map<const Field*, std::vector<Row>> rows_;
};
