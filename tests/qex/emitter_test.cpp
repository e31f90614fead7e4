// qex emitter writes the fields where the engine has them, shows what reads back the same, and names what is
// wrong.
#include <cfloat>
#include <cstring>

#include "qex/QexCommandTest.h"

namespace {

class QexEmitter : public QexCommandTest {
  protected:
    std::string Output(const std::vector<std::string>& arguments) const {
        const CommandResult result = Run(arguments);
        EXPECT_EQ(result.err, "");
        return result.out;
    }
    Bytes Written(const std::string& description, const std::string& name) const {
        WriteText(Path(name), description);
        Output({"emitter", Path(name), "-o", Path("out.emitter")});
        return ReadBytes(Path("out.emitter"));
    }
};

float FloatAt(const Bytes& file, size_t offset) {
    float value;
    memcpy(&value, &file[offset], sizeof value);
    return value;
}

// Every field, each value different; -0.1 and 16777217 are no floats.
const char kDescription[] = R"(// a remark
{"emitting": false, "emitDuration": 1.5, "emissionRate": [2, 3], "lifetime": [-4, 5],
"color": [[0.1, 0.2, 0.3, 0.4], [0.5, 0.6, 0.7, 0.8]], "startOpacity": 0.9, "endOpacity": 0.25,
"scaleMin": [10, 11, 12], "scaleMax": [13, 14, 15], "scaleFactor": 1.01,
"rotationMin": [20, 21, 22], "rotationMax": [23, 24, 25],
"angularVelocityMin": [30, 31, 32], "angularVelocityMax": [33, 34, 35],
"angularAccelerationMin": [40, 41, 42], "angularAccelerationMax": [43, 44, 45],
"position": [50, 51, 52], "positionSpread": [53, 54, 55],
"velocityMin": [-0.1, 61, 62], "velocityMax": [63, 64, 16777217],
"accelerationMin": [70, 71, 72], "accelerationMax": [73, 74, 3.4028235e38],
"animation": [[2, 0.5, 1], [3, 0.75, 0]], "currentRate": 2.5, "accumulator": 0.125})";

}  // namespace

TEST_F(QexEmitter, FieldsLieWhereTheEngineHasThem) {
    const Bytes file = Written(kDescription, "all.json");
    ASSERT_EQ(file.size(), 45304u);
    // Offsets of the record, and the values from there on.
    const std::vector<std::pair<size_t, std::vector<float>>> floats = {
        {4, {1.5f, 2, 3, -4, 5, 0.1f, 0.2f, 0.3f, 0.4f, 0.5f, 0.6f, 0.7f, 0.8f, 0}},
        {188, {0.9f, 0.25f, 10, 11, 12, 13, 14, 15, 1.01f}},
        {224, {20, 21, 22, 23, 24, 25, 30, 31, 32, 33, 34, 35, 40, 41, 42, 43, 44, 45}},
        {296, {50, 51, 52, 53, 54, 55, -0.1f, 61, 62, 63, 64, 16777216, 70, 71, 72, 73, 74, FLT_MAX}},
        {412, {0.5f}},
        {464, {0.75f}},
        {45296, {2.5f, 0.125f}}};
    for (const auto& [offset, values] : floats)
        for (size_t i = 0; i < values.size(); ++i)
            EXPECT_EQ(FloatAt(file, offset + 4 * i), values[i]) << offset + 4 * i;
    const std::pair<size_t, uint32_t> words[] = {{0, 0},   {184, 2}, {408, 2}, {416, 1},
                                                 {460, 3}, {468, 0}, {888, 2}, {45292, 0}};
    for (const auto& [offset, value] : words) EXPECT_EQ(GetWord(file, offset), value) << offset;
    // What is not named is the engine's default, and the rate begins with the least.
    const Bytes some = Written("{\"emissionRate\": [4, 5], \"emitting\": true}", "some.json");
    EXPECT_EQ(Written("# remark\n\nemissionRate 4, 5 # rate\n  emitting 1", "some.txt"), some);
    EXPECT_EQ(Written("color 1 1 1 1\ncolor 2 2 2 2", "rows.txt"),
              Written("{\"color\": [[1, 1, 1, 1], [2, 2, 2, 2]]}", "rows.json"));
    for (const size_t offset : {8, 45296}) EXPECT_EQ(FloatAt(some, offset), 4);
    EXPECT_EQ(FloatAt(some, 324), 300) << "default velocity";
    Output({"emitter", "-o", Path("out.emitter"), "--set", "emissionRate=4,5"});
    EXPECT_EQ(ReadBytes(Path("out.emitter")), some);
}

TEST_F(QexEmitter, WhatIsShownReadsBackTheSame) {
    const Bytes file = Written(kDescription, "all.json");
    WriteBytes(Path("all.emitter"), file);
    Output({"emitter", Path("all.emitter"), "-o", Path("shown.json")});
    EXPECT_EQ(Written(ReadText(Path("shown.json")), "again.json"), file);
    EXPECT_EQ(Output({"emitter", Path("all.emitter")}), ReadText(Path("shown.json")));
    // Edits take the place of all rows of a field.
    const std::string edited = Output({"emitter", Path("all.emitter"), "--set", "position=1 2 3", "--set",
                                       "color=1,1,1,1;2,2,2,2;3,3,3,3", "--set", "animation=0,0,0"});
    for (const char* part :
         {"position\": [1.0,2.0,3.0]", "color\": [[1.0,1.0,1.0,1.0],[2.0,2.0,2.0,2.0],[3.0,3.0,3.0,3.0]]",
          "animation\": [[0,0.0,0]]", "scaleFactor\": 1.01"})
        EXPECT_TRUE(Contains(edited, part)) << part << edited;
    EXPECT_TRUE(Contains(Run({"info", Path("all.emitter")}).err, "qex emitter"));
}

TEST_F(QexEmitter, NonsenseIsNamedWithFieldAndRange) {
    const std::pair<const char*, const char*> nonsense[] = {
        {R"({"velocity": [1, 2, 3]})", "unknown field 'velocity'; expected one of emitting, "},
        {R"({"a\nb": "c"})", "unknown field 'a b'"},
        {R"({"position": [1, 2]})", "position: expected 3 values, not 2"},
        {R"({"position": [1, "2", 3]})", "position: is neither a number nor"},
        {R"({"position": {}})", "position: is neither a number nor"},
        {R"({"velocityMin": [1, 2, 1e39]})", "velocityMin: 1e+39 is not a number from -3.4"},
        {R"({"startOpacity": -0.5})", "startOpacity: -0.5 is not a number from 0 on"},
        {R"({"animation": [[2.5, 1, 1]]})", "animation: 2.5 is not a whole number from 0 to 10"},
        {R"({"animation": [2, 1, 2]})", "animation: 2 is not a whole number from 0 to 1"},
        {R"({"color": []})", "color: expected 4 values, not 0"},
        {R"({"startOpacity": 1, "startOpacity": 1})", "startOpacity: expected once"},
        {"{\n\"position\": [1, 2, 3]", "line 2: is not JSON"},
        {"# remark\nvelocityMin 1 2 three", "line 2: velocityMin: 'three' is not a number"},
        {"velocityMin 1 2 nan", "line 1: velocityMin: 'nan' is not a number"},
        {"emitting 1\nposition", "line 2: position: expected 3 values, not 0"},
        {"startOpacity 1\nstartOpacity 1\nlifetime 1 1", "line 2: startOpacity: expected once"}};
    for (const auto& [text, problem] : nonsense) {
        WriteText(Path("bad.json"), text);
        ExpectRefused({"emitter", Path("bad.json"), "-o", Path("no.emitter")}, 1,
                      "bad.json: " + std::string(problem));
    }
    std::string rows;
    for (int i = 0; i < 11; ++i) rows += "color 1 1 1 1\n";
    WriteText(Path("bad.txt"), rows);
    ExpectRefused({"emitter", Path("bad.txt")}, 1, "line 11: color: expected 1 to 10 times");
    WriteText(Path("bad.json"), "{\"color\": " + std::string(300000, '[') + std::string(300000, ']') + "}");
    ExpectRefused({"emitter", Path("bad.json")}, 1, "color: is neither a number nor an array of numbers");
    ExpectRefused({"emitter", "--set", "lifetime=1"}, 2, "lifetime: expected 2 values, not 1");
    ExpectRefused({"emitter", "--set", "a\nb"}, 2, "'a b' is no setting");
    ExpectRefused({"emitter", "-o", Path("no.txt")}, 2, "its name ends in .json");
    ExpectRefused({"emitter", "--set", "lifetime"}, 2, "expected FIELD=VALUE");
    ExpectRefused({"emitter", Path("none.txt")}, 1, "none.txt");
    Bytes file = Written("{}", "default.json");
    PutWord(&file, 16, 0x7FC00000);  // a lifetime that is no number
    WriteBytes(Path("nan.emitter"), file);
    ExpectRefused({"emitter", Path("nan.emitter")}, 1, "a setting is not a finite number");
    file.pop_back();
    WriteBytes(Path("cut.emitter"), file);
    ExpectRefused({"emitter", Path("cut.emitter")}, 1, "neither an emitter file, which has 45304 bytes, nor");
}

// The engine takes them; they are shown as they are, with a warning where no description may say the same.
TEST_F(QexEmitter, FilesOfOtherProgramsMayHoldOddValues) {
    const struct {
        size_t offset;
        uint32_t value;
        const char *warning, *line;
    } cases[] = {{0, 16777217, "emitting: ", "\"emitting\": 16777217"},
                 {8, 0xBF800000, "emissionRate: -1 is not", "\"emissionRate\": [-1.0,0.8]"},
                 {416, 2, "animation: 2 is not", "\"animation\": [[1,0.0,2]]"},
                 {45292, 3, "3 living particles are left out", "\"accumulator\": 0.0"},
                 {184, 0, "", "\"color\": [[1.0,1.0,1.0,1.0]]"},
                 {888, 0, "", "\"animation\": [[1,0.0,0]]"}};
    const Bytes file = Written("{}", "default.json");
    for (const auto& c : cases) {
        Bytes odd = file;
        PutWord(&odd, c.offset, c.value);
        WriteBytes(Path("odd.emitter"), odd);
        const CommandResult result = Run({"emitter", Path("odd.emitter")});
        EXPECT_EQ(result.status, 0) << c.offset;
        EXPECT_TRUE(Contains(result.out, c.line)) << result.out;
        EXPECT_TRUE(Contains(result.err, c.warning)) << result.err;
        EXPECT_EQ(CountLines(result.err), *c.warning != 0) << result.err;
    }
}
