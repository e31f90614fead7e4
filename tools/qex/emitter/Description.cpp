// Descriptions in JSON and of earlier versions, read and written field by field.
#include "emitter/Description.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <set>

#include "common/EngineOutput.h"
#include "common/TextureFiles.h"
#include "info/Info.h"

namespace {

constexpr char kSpace[] = " \t\r\v\f";

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

std::string AddText(const std::string& name, const std::string& text, FieldValues* values) {
    std::vector<Row> rows;
    std::string word;
    const bool numbers = ParseRows(text, &rows, &word);
    return values->Add(name, rows, numbers ? "" : "'" + CleanText(word.substr(0, 40)) + "' is not a number");
}

// "name values # remark" on each line.
bool ReadLines(const std::string& text, FieldValues* values, std::string* problem) {
    size_t number = 0;
    for (size_t at = 0; at < text.size() && problem->empty(); ++number) {
        const size_t end = std::min(text.find('\n', at), text.size());
        std::string line = text.substr(at, end - at);
        line.resize(std::min(line.find('#'), line.size()));
        at = end + 1;
        const size_t first = line.find_first_not_of(kSpace);
        if (first == line.npos) continue;
        const size_t last = std::min(line.find_first_of(kSpace, first), line.size());
        *problem = AddText(line.substr(first, last - first), line.substr(last), values);
    }
    if (!problem->empty()) *problem = "line " + std::to_string(number) + ": " + *problem;
    return problem->empty();
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

std::string AddJson(const Json& fields, FieldValues* values) {
    for (const auto& [name, value] : fields.items()) {
        std::vector<Row> rows;
        const bool numbers = JsonRows(value, &rows);
        const std::string problem =
            values->Add(name, rows, numbers ? "" : "is neither a number nor an array of numbers");
        if (!problem.empty()) return problem;
    }
    return "";
}

// Where a text is no JSON, and why.
struct JsonFault : nlohmann::json_sax<Json> {
    bool null() override { return true; }
    bool boolean(bool) override { return true; }
    bool number_integer(number_integer_t) override { return true; }
    bool number_unsigned(number_unsigned_t) override { return true; }
    bool number_float(number_float_t, const string_t&) override { return true; }
    bool string(string_t&) override { return true; }
    bool binary(binary_t&) override { return true; }
    bool start_object(std::size_t) override { return true; }
    bool key(string_t&) override { return true; }
    bool end_object() override { return true; }
    bool start_array(std::size_t) override { return true; }
    bool end_array() override { return true; }
    bool parse_error(std::size_t position, const std::string&, const Json::exception& error) override {
        at = position;
        isSyntax = error.id < 200;  // the library's numbers of parse errors
        return false;
    }

    size_t at = 0;
    bool isSyntax = true;
};

bool ReadJson(const std::string& text, FieldValues* values, std::string* problem) {
    Json document;
    std::set<std::string> names;
    std::string twice;
    const auto watch = [&](int depth, Json::parse_event_t event, const Json& parsed) {
        const bool name = event == Json::parse_event_t::key && depth == 1;
        if (name && !names.insert(parsed.get<std::string>()).second) twice = parsed.get<std::string>();
        return true;
    };
    JsonFault fault;
    if (!Json::sax_parse(text, &fault, nlohmann::detail::input_format_t::json, true, true)) {
        const auto lines = std::count(text.begin(), text.begin() + static_cast<long>(fault.at) - 1, '\n');
        *problem = fault.isSyntax ? "line " + std::to_string(lines + 1) + ": is not JSON"
                                  : "has a number that is too large";
        return false;
    }
    document = Json::parse(text, watch, false, true);
    if (!twice.empty()) {
        *problem = CleanText(twice.substr(0, 40)) + ": expected once";
        return false;
    }
    *problem = AddJson(document, values);
    return problem->empty();
}

bool IsText(const std::vector<uint8_t>& bytes) {
    for (const uint8_t byte : bytes)
        if (byte < ' ' && byte != '\n' && byte != '\r' && byte != '\t') return false;
    return true;
}

}  // namespace

std::string SetFields(const std::string& json, QexParticleEmitter* emitter) {
    FieldValues values;
    std::string problem;
    if (ReadJson(json, &values, &problem)) values.Apply(emitter);
    return problem;
}

std::string ReadSetting(const std::string& assignment, FieldValues* values) {
    const size_t equals = assignment.find('=');
    if (equals == std::string::npos)
        return "'" + CleanText(assignment.substr(0, 40)) + "' is no setting; expected FIELD=VALUE";
    return AddText(assignment.substr(0, equals), assignment.substr(equals + 1), values);
}

std::string DescribeEmitter(const QexParticleEmitter& emitter) {
    std::string text = "{";
    for (const Field& field : EmitterFields()) {
        Json rows;
        for (const Row& values : GetRows(emitter, field)) {
            Json row;
            for (size_t c = 0; c < values.size(); ++c)
                row.push_back(field.columns[c].whole ? Json(static_cast<int>(values[c])) : Json(values[c]));
            rows.push_back(row.size() == 1 ? row[0] : row);
        }
        // A field a line.
        text += std::string(text.size() > 1 ? "," : "") + "\n  \"" + field.name +
                "\": " + (field.HasRows() ? rows : rows[0]).dump();
    }
    return text + "\n}\n";
}

std::string FieldHelp() {
    std::string text;
    for (const Field& field : EmitterFields()) {
        std::string line = "  " + std::string(field.name);
        line.resize(26, ' ');
        text += line + std::to_string(field.columns.size()) + "  " + field.remark + "\n";
    }
    return text;
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
        for (const Field& field : EmitterFields()) {
            if (!emitter || !problem->empty()) break;
            *problem = FaultOf(field, GetRows(*emitter, field));
            if (!problem->empty()) *problem = field.name + (": " + *problem);
        }
        return emitter;
    }
    *problem = "is neither an emitter file, which has " + std::to_string(QEX_EMITTER_FILE_SIZE) +
               " bytes, nor a description of one";
    if (bytes.empty() || !IsText(bytes)) return nullptr;
    const std::string text(bytes.begin(), bytes.end());
    const size_t first = text.find_first_not_of(" \t\r\n");
    const bool json = first != std::string::npos && (text[first] == '{' || text[first] == '/');
    FieldValues values;
    problem->clear();
    if (!(json ? ReadJson : ReadLines)(text, &values, problem)) return nullptr;
    QexParticleEmitter* emitter = NewEmitter();
    *problem = emitter ? "" : "out of memory";
    if (emitter) values.Apply(emitter);
    return emitter;
}
