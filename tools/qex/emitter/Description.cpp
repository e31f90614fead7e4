#include "emitter/Description.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <set>
#include <vector>

#include "common/EngineOutput.h"
#include "common/TextureFiles.h"
#include "info/Info.h"

namespace {

using Row = std::vector<double>;

enum Kind { kInteger, kFloat };

struct Column {
    Kind kind;
    double low, high;
};

constexpr double kNone = FLT_MAX;
constexpr Column kSwitch = {kInteger, 0, 1}, kAny = {kFloat, -kNone, kNone}, kFromZero = {kFloat, 0, kNone},
                 kFrames = {kInteger, 0, QEX_ANIMATION_MAX_FRAMES};

// A field: one row of values, or, with a count of rows in use, up to ten.
struct Field {
    const char* name;
    size_t offset;
    std::vector<Column> columns;
    const char* remark;
    size_t rowBytes = 0;     // from row to row
    size_t countOffset = 0;  // of the number of rows; 0: one row

    bool HasRows() const { return countOffset; }
};

constexpr size_t kMaxRows = 10;
static_assert(QEX_EMITTER_MAX_COLORS == kMaxRows && QEX_EMITTER_MAX_ANIMATIONS == kMaxRows,
              "one limit for both");

std::vector<Column> Three(const Column& column) {
    return {column, column, column};
}

#define AT(member) #member, offsetof(QexParticleEmitter, member)
const Field kFields[] = {
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

std::vector<Row> Get(const QexParticleEmitter& emitter, const Field& field) {
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
            rows[r].push_back(field.columns[c].kind == kInteger ? whole : atof(Number(number).c_str()));
        }
    return rows;
}

std::string Range(const Column& column) {
    const auto text = [](double bound) { return Number(static_cast<float>(bound)); };
    const std::string what = column.kind == kInteger ? "a whole number" : "a number";
    return what + (column.low != -kNone && column.high == kNone
                       ? " from " + text(column.low) + " on"
                       : " from " + text(column.low) + " to " + text(column.high));
}

std::string Decimal(double value) {
    return std::fabs(value) <= kNone ? Number(static_cast<float>(value)) : Json(value).dump();
}

// What is wrong with rows of values for a field, or an empty text.
std::string Fault(const Field& field, const std::vector<Row>& rows) {
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
            const bool fits = column.kind == kFloat && std::fabs(row[c]) < 1.0001 * kNone;
            const double value = fits ? static_cast<float>(row[c]) : row[c];
            const bool whole = column.kind == kFloat || value == std::floor(value);
            if (!whole || !(value >= column.low && value <= column.high))
                return Decimal(row[c]) + " is not " + Range(column);
        }
    }
    return "";
}

void Set(QexParticleEmitter* emitter, const Field& field, const std::vector<Row>& rows) {
    for (size_t r = 0; r < rows.size(); ++r)
        for (size_t c = 0; c < rows[r].size(); ++c) {
            const auto whole = static_cast<int32_t>(field.columns[c].kind == kInteger ? rows[r][c] : 0);
            const auto number = static_cast<float>(rows[r][c]);
            const void* value = &number;
            if (field.columns[c].kind == kInteger) value = &whole;
            memcpy(At(emitter, field, r, c), value, 4);
        }
    const auto count = static_cast<int32_t>(rows.size());
    if (field.HasRows()) memcpy(reinterpret_cast<char*>(emitter) + field.countOffset, &count, sizeof count);
}

const Field* FindField(const std::string& name) {
    const auto field = std::find_if(std::begin(kFields), std::end(kFields),
                                    [&](const Field& candidate) { return name == candidate.name; });
    return field == std::end(kFields) ? nullptr : field;
}

std::string UnknownField(const std::string& name) {
    std::string text = "unknown field '" + CleanText(name.substr(0, 40)) + "'; expected one of ";
    for (const Field& field : kFields) text += (&field == kFields ? "" : ", ") + std::string(field.name);
    return text;
}

// What a description gives, before it is checked and set as a whole.
class Values {
  public:
    // An error text, empty when all is well.
    std::string Add(const Field& field, const std::vector<Row>& rows) {
        std::vector<Row>& all = rows_[&field - kFields];
        all.insert(all.end(), rows.begin(), rows.end());
        const std::string fault = Fault(field, all);
        return fault.empty() ? "" : field.name + (": " + fault);
    }

    void Apply(QexParticleEmitter* emitter) const {
        for (size_t i = 0; i < std::size(kFields); ++i)
            if (!rows_[i].empty()) Set(emitter, kFields[i], rows_[i]);
        // The rate at present is one of the new rate's, unless it is given.
        if (Given("emissionRate") && !Given("currentRate")) emitter->currentRate = emitter->emissionRate[0];
    }

  private:
    bool Given(const char* name) const { return !rows_[FindField(name) - kFields].empty(); }

    std::vector<Row> rows_[std::size(kFields)];
};

// Numbers with white space or commas between them, ";" between rows. False for anything else.
bool ParseRows(const std::string& text, std::vector<Row>* rows, std::string* word) {
    rows->assign(1, {});
    for (size_t at = 0; at < text.size();) {
        if (text[at] == ';') rows->emplace_back();
        const size_t end = std::min(text.find_first_of(" \t\r,;", at), text.size());
        if (end > at) {
            *word = text.substr(at, end - at);
            char* rest;
            rows->back().push_back(strtod(word->c_str(), &rest));
            if (*rest || !std::isfinite(rows->back().back())) return false;
        }
        at = end + (end == at);
    }
    return true;
}

std::string AddText(const std::string& name, const std::string& text, Values* values) {
    const Field* field = FindField(name);
    if (!field) return UnknownField(name);
    std::vector<Row> rows;
    std::string word;
    if (ParseRows(text, &rows, &word)) return values->Add(*field, rows);
    return name + ": '" + CleanText(word.substr(0, 40)) + "' is not a number";
}

// The elements of an array, or the value itself. They are not copied: a file may nest them deeply.
std::vector<const Json*> Elements(const Json& value) {
    std::vector<const Json*> elements;
    if (!value.is_array()) return {&value};
    for (const Json& element : value) elements.push_back(&element);
    return elements;
}

// A number as a row of one value, an array as a row, an array of arrays as rows.
bool JsonRows(const Json& value, std::vector<Row>* rows) {
    const bool nested = value.is_array() && !value.empty() && value[0].is_array();
    for (const Json* row : nested ? Elements(value) : std::vector<const Json*>{&value}) {
        rows->emplace_back();
        for (const Json* number : Elements(*row)) {
            if (!number->is_number() && !number->is_boolean()) return false;
            rows->back().push_back(number->is_boolean() ? number->get<bool>() : number->get<double>());
        }
    }
    return true;
}

std::string AddJson(const std::string& name, const Json& value, Values* values) {
    const Field* field = FindField(name);
    if (!field) return UnknownField(name);
    std::vector<Row> rows;
    return JsonRows(value, &rows) ? values->Add(*field, rows)
                                  : name + ": is neither a number nor an array of numbers";
}

bool IsText(const std::vector<uint8_t>& bytes) {
    for (const uint8_t byte : bytes)
        if (byte < ' ' && byte != '\n' && byte != '\r' && byte != '\t') return false;
    return true;
}

}  // namespace

bool ReadEmitterText(const std::string& text, QexParticleEmitter* emitter, std::string* problem) {
    Values values;
    size_t line = 0;
    for (size_t at = 0; at < text.size();) {
        const size_t end = std::min(text.find('\n', at), text.size());
        std::string content = text.substr(at, end - at);
        at = end + 1;
        ++line;
        content = content.substr(0, content.find('#'));
        const size_t first = content.find_first_not_of(" \t\r");
        if (first == std::string::npos) continue;
        const size_t last = std::min(content.find_first_of(" \t\r", first), content.size());
        *problem = AddText(content.substr(first, last - first), content.substr(last), &values);
        if (problem->empty()) continue;
        *problem = "line " + std::to_string(line) + ": " + *problem;
        return false;
    }
    values.Apply(emitter);
    return true;
}

bool ReadEmitterJson(const std::string& text, QexParticleEmitter* emitter, std::string* problem) {
    Json document;
    std::set<std::string> names;
    std::string twice;
    const auto watch = [&](int depth, Json::parse_event_t event, const Json& parsed) {
        const bool name = event == Json::parse_event_t::key && depth == 1;
        if (name && !names.insert(parsed.get<std::string>()).second) twice = parsed.get<std::string>();
        return true;
    };
    try {
        document = Json::parse(text, watch);
    } catch (const Json::parse_error& error) {
        const auto lines = std::count(text.begin(), text.begin() + static_cast<long>(error.byte) - 1, '\n');
        *problem = "line " + std::to_string(lines + 1) + ": is not JSON";
        return false;
    } catch (const Json::exception&) {
        *problem = "has a number that is too large";
        return false;
    }
    if (!twice.empty()) {
        *problem = CleanText(twice.substr(0, 40)) + ": expected once";
        return false;
    }
    Values values;
    for (const auto& [name, value] : document.items()) {
        *problem = AddJson(name, value, &values);
        if (!problem->empty()) return false;
    }
    values.Apply(emitter);
    return true;
}

bool SetEmitterField(const std::string& assignment, QexParticleEmitter* emitter, std::string* problem) {
    const size_t equals = assignment.find('=');
    *problem = "'" + CleanText(assignment.substr(0, 40)) + "' is no setting; expected FIELD=VALUE";
    if (equals == std::string::npos) return false;
    Values values;
    *problem = AddText(assignment.substr(0, equals), assignment.substr(equals + 1), &values);
    if (problem->empty()) values.Apply(emitter);
    return problem->empty();
}

std::string EmitterText(const QexParticleEmitter& emitter) {
    std::string text;
    for (const Field& field : kFields) {
        bool first = true;
        for (const Row& row : Get(emitter, field)) {
            std::string line = field.name;
            line.resize(std::max<size_t>(line.size(), 22), ' ');
            for (size_t c = 0; c < row.size(); ++c)
                line +=
                    " " + (field.columns[c].kind == kInteger ? std::to_string(static_cast<int32_t>(row[c]))
                                                             : Number(static_cast<float>(row[c])));
            if (first) {
                line.resize(std::max<size_t>(line.size(), 40), ' ');
                line += "  # " + std::string(field.remark);
            }
            text += line + "\n";
            first = false;
        }
    }
    return text;
}

std::string EmitterJson(const QexParticleEmitter& emitter) {
    std::string text = "{";
    for (const Field& field : kFields) {
        Json rows;
        for (const Row& values : Get(emitter, field)) {
            Json row;
            for (size_t c = 0; c < values.size(); ++c)
                row.push_back(field.columns[c].kind == kInteger ? Json(static_cast<int>(values[c]))
                                                                : Json(values[c]));
            rows.push_back(row.size() == 1 ? row[0] : row);
        }
        // A field a line.
        text += std::string(text.size() > 1 ? "," : "") + "\n  \"" + field.name +
                "\": " + (field.HasRows() ? rows : rows[0]).dump();
    }
    return text + "\n}\n";
}

QexParticleEmitter* NewEmitter() {
    QexParticleEmitter* emitter = QexParticleEmitter_Create();
    if (emitter) emitter->currentRate = emitter->emissionRate[0];
    return emitter;
}

QexParticleEmitter* LoadEmitter(const std::string& path, std::string* problem) {
    std::vector<uint8_t> bytes;
    if (!ReadFileBytes(path, SIZE_MAX, &bytes, problem)) return nullptr;
    if (bytes.size() == QEX_EMITTER_FILE_SIZE && !IsText(bytes)) {
        EngineOutput output;
        QexParticleEmitter* emitter = QexParticleEmitter_CreateFromBinFile(path.c_str());
        output.Stop();
        *problem = output.FirstError();
        for (const Field& field : kFields) {
            if (!emitter || !problem->empty()) break;
            *problem = Fault(field, Get(*emitter, field));
            if (!problem->empty()) *problem = field.name + (": " + *problem);
        }
        return emitter;
    }
    *problem = "is neither an emitter file, which has " + std::to_string(QEX_EMITTER_FILE_SIZE) +
               " bytes, nor a description of one";
    if (bytes.empty() || !IsText(bytes)) return nullptr;
    const std::string text(bytes.begin(), bytes.end());
    const size_t first = text.find_first_not_of(" \t\r\n");
    const bool json = first != std::string::npos && text[first] == '{';
    QexParticleEmitter* emitter = NewEmitter();
    *problem = "out of memory";
    if (!emitter) return nullptr;
    if ((json ? ReadEmitterJson : ReadEmitterText)(text, emitter, problem)) {
        problem->clear();
        return emitter;
    }
    QexParticleEmitter_Release(emitter);
    return nullptr;
}
