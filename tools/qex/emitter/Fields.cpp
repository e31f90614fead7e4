// Where the fields lie in the record, and which values they may have.
#include "emitter/Fields.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <cstring>

#include "info/Info.h"

namespace {

constexpr double kNone = FLT_MAX;
constexpr Column kSwitch = {true, 0, 1}, kAny = {false, -kNone, kNone}, kFromZero = {false, 0, kNone},
                 kFrames = {true, 0, QEX_ANIMATION_MAX_FRAMES};

constexpr size_t kMaxRows = 10;
static_assert(QEX_EMITTER_MAX_COLORS == kMaxRows && QEX_EMITTER_MAX_ANIMATIONS == kMaxRows,
              "one limit for both");

std::vector<Column> Three(const Column& column) {
    return {column, column, column};
}

#define AT(member) #member, offsetof(QexParticleEmitter, member)
const std::vector<Field> kFields = {
    {AT(emitting), {kSwitch}, "1 while new particles are spawned"},
    {AT(emitDuration), {kAny}, "seconds left to emit; 0 stops at the next update, negative never"},
    {AT(emissionRate), {kFromZero, kFromZero}, "particles an update, least and most"},
    {AT(lifetime), {kAny, kAny}, "seconds, least and most; negative: endless"},
    {"color",
     offsetof(QexParticleEmitter, colors),
     {kFromZero, kFromZero, kFromZero, kFromZero},
     "red, green, blue, alpha of a particle, one of up to 10; drawing takes the texture's",
     sizeof(QexVec4),
     offsetof(QexParticleEmitter, colorCount)},
    {AT(startOpacity), {kFromZero}, "factor of the texture's alpha at the begin of a lifetime"},
    {AT(endOpacity), {kFromZero}, "and at its end"},
    {AT(scaleMin), Three(kAny), "units a pixel of the texture: across, up, and one not used"},
    {AT(scaleMax), Three(kAny), "units a pixel"},
    {AT(scaleFactor), {kAny}, "multiplies the scale at every update"},
    {AT(rotationMin), Three(kAny), "degrees about x, y and z"},
    {AT(rotationMax), Three(kAny), "degrees"},
    {AT(angularVelocityMin), Three(kAny), "degrees a second"},
    {AT(angularVelocityMax), Three(kAny), "degrees a second"},
    {AT(angularAccelerationMin), Three(kAny), "degrees a second, a second"},
    {AT(angularAccelerationMax), Three(kAny), "degrees a second, a second"},
    {AT(position), Three(kAny), "of the emitter, units"},
    {AT(positionSpread), Three(kFromZero), "units to either side"},
    {AT(velocityMin), Three(kAny), "units a second"},
    {AT(velocityMax), Three(kAny), "units a second"},
    {AT(accelerationMin), Three(kAny), "units a second, a second"},
    {AT(accelerationMax), Three(kAny), "units a second, a second"},
    {"animation",
     offsetof(QexParticleEmitter, animations) + offsetof(QexParticleAnimation, frameCount),
     {kFrames, kFromZero, kSwitch},
     "textures, seconds for each, 1 to begin again; one of up to 10",
     sizeof(QexParticleAnimation),
     offsetof(QexParticleEmitter, animationCount)},
    {AT(currentRate), {kFromZero}, "particles an update, at present"},
    {AT(accumulator), {kFromZero}, "particles due"}};
#undef AT

char* At(QexParticleEmitter* emitter, const Field& field, size_t row, size_t column) {
    return reinterpret_cast<char*>(emitter) + field.offset + row * field.rowBytes + 4 * column;
}

// The shortest decimal that is read as that float.
std::string Number(float value) {
    std::string shortest;
    for (int digits = 1; digits <= 9; ++digits) {
        char text[32];
        snprintf(text, sizeof text, "%.*g", digits, static_cast<double>(value));
        if (static_cast<float>(strtod(text, nullptr)) == value &&
            (shortest.empty() || strlen(text) < shortest.size()))
            shortest = text;
    }
    return shortest;
}

std::string Range(const Column& column) {
    const auto text = [](double bound) { return Number(static_cast<float>(bound)); };
    const std::string what = column.whole ? "a whole number" : "a number";
    return what + (column.low != -kNone && column.high == kNone
                       ? " from " + text(column.low) + " on"
                       : " from " + text(column.low) + " to " + text(column.high));
}

std::string Decimal(double value) {
    return std::fabs(value) <= kNone ? Number(static_cast<float>(value)) : Json(value).dump();
}

void Set(QexParticleEmitter* emitter, const Field& field, const std::vector<Row>& rows) {
    for (size_t r = 0; r < rows.size(); ++r)
        for (size_t c = 0; c < rows[r].size(); ++c) {
            const auto whole = static_cast<int32_t>(field.columns[c].whole ? rows[r][c] : 0);
            const auto number = static_cast<float>(rows[r][c]);
            const void* value = &number;
            if (field.columns[c].whole) value = &whole;
            memcpy(At(emitter, field, r, c), value, 4);
        }
    const auto count = static_cast<int32_t>(rows.size());
    if (field.HasRows()) memcpy(reinterpret_cast<char*>(emitter) + field.countOffset, &count, sizeof count);
}

const Field* FindField(const std::string& name) {
    for (const Field& field : kFields)
        if (name == field.name) return &field;
    return nullptr;
}

std::string UnknownField(const std::string& name) {
    std::string text = "unknown field '" + CleanText(name.substr(0, 40)) + "'; expected one of ";
    for (const Field& field : kFields) text += (&field == &kFields[0] ? "" : ", ") + std::string(field.name);
    return text;
}

}  // namespace

const std::vector<Field>& EmitterFields() {
    return kFields;
}

std::vector<Row> GetRows(const QexParticleEmitter& emitter, const Field& field) {
    auto* e = const_cast<QexParticleEmitter*>(&emitter);
    int32_t count = 1;
    if (field.HasRows()) memcpy(&count, reinterpret_cast<const char*>(e) + field.countOffset, sizeof count);
    // Particles take the first row where none is in use.
    std::vector<Row> rows(static_cast<size_t>(std::max(count, 1)));
    for (size_t r = 0; r < rows.size(); ++r)
        for (size_t c = 0; c < field.columns.size(); ++c) {
            int32_t whole;
            float number;
            memcpy(&whole, At(e, field, r, c), sizeof whole);
            memcpy(&number, &whole, sizeof number);
            rows[r].push_back(field.columns[c].whole ? whole : atof(Number(number).c_str()));
        }
    return rows;
}

std::string FaultOf(const Field& field, const std::vector<Row>& rows) {
    const size_t most = field.HasRows() ? kMaxRows : 1;
    if (rows.empty() || rows.size() > most)
        return most == 1 ? "expected once" : "expected 1 to " + std::to_string(most) + " times";
    for (const Row& row : rows) {
        if (row.size() != field.columns.size())
            return "expected " + std::to_string(field.columns.size()) + " values, not " +
                   std::to_string(row.size());
        for (size_t c = 0; c < row.size(); ++c) {
            const Column& column = field.columns[c];
            // The decimal of the largest float is a little above it.
            const bool fits = !column.whole && std::fabs(row[c]) < 1.0001 * kNone;
            const double value = fits ? static_cast<float>(row[c]) : row[c];
            const bool whole = !column.whole || value == std::floor(value);
            if (!whole || !(value >= column.low && value <= column.high))
                return Decimal(row[c]) + " is not " + Range(column);
        }
    }
    return "";
}

std::string FieldValues::Add(const std::string& name, const std::vector<Row>& rows,
                             const std::string& fault) {
    const Field* field = FindField(name);
    if (!field) return UnknownField(name);
    std::vector<Row>& all = rows_[field];
    all.insert(all.end(), rows.begin(), rows.end());
    const std::string text = fault.empty() ? FaultOf(*field, all) : fault;
    return text.empty() ? "" : name + ": " + text;
}

void FieldValues::Apply(QexParticleEmitter* emitter) const {
    for (const auto& [field, rows] : rows_) Set(emitter, *field, rows);
    // The rate at present is one of the new rate's, unless it is given.
    if (rows_.count(FindField("emissionRate")) && !rows_.count(FindField("currentRate")))
        emitter->currentRate = emitter->emissionRate[0];
}
