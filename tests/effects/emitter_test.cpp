#include <gtest/gtest.h>

#include <cstring>
#include <memory>

#include "Qex.h"
#include "support/Capture.h"
#include "support/FolderTest.h"

namespace {

using EmitterPointer = std::unique_ptr<QexParticleEmitter, decltype(&QexParticleEmitter_Release)>;

EmitterPointer NewEmitter() {
    return {QexParticleEmitter_Create(), QexParticleEmitter_Release};
}

std::vector<uint8_t> Written(const QexParticleEmitter& emitter) {
    const MemoryFile file({});
    EXPECT_EQ(QexParticleEmitter_WriteToBinFile(&emitter, file.Path()), 0);
    const std::string text = ReadText(file.Path());
    return {text.begin(), text.end()};
}

EmitterPointer ReadBack(const std::vector<uint8_t>& bytes) {
    const MemoryFile file(bytes);
    return {QexParticleEmitter_CreateFromBinFile(file.Path()), QexParticleEmitter_Release};
}

template <class T>
void Put(std::vector<uint8_t>* bytes, size_t offset, T value) {
    memcpy(&bytes->at(offset), &value, sizeof value);
}

TEST(EmitterFile, DefaultsLieAtTheirOffsets) {
    const EmitterPointer emitter = NewEmitter();
    const std::vector<uint8_t> bytes = Written(*emitter);
    ASSERT_EQ(bytes.size(), 45304u);
    const std::pair<size_t, std::vector<float>> floats[] = {
        {4, {-1, 0.5f, 0.8f, 5, 6, 1, 1, 1, 1}}, {188, {1}},   {196, {1, 1, 1, 1, 1, 1, 1}},
        {320, {-80, 300, -80, 80, 400, 80}},     {348, {-98}}, {360, {-98}},
        {45296, {emitter->currentRate}}};
    std::vector<uint8_t> expected(45304);
    for (const auto& [offset, values] : floats)
        for (size_t i = 0; i < values.size(); ++i) Put(&expected, offset + 4 * i, values[i]);
    for (const size_t offset : {0, 184, 408, 888}) Put<int32_t>(&expected, offset, 1);
    EXPECT_EQ(bytes, expected);
    EXPECT_GE(emitter->currentRate, 0.5f);
    EXPECT_LE(emitter->currentRate, 0.8f);
}

// A value of its own in every word; where the fields of a record lie is checked as it is compiled.
TEST(EmitterFile, EveryFieldKeepsItsPlace) {
    std::vector<uint8_t> bytes(45304);
    const auto isPointer = [](size_t offset) {
        if (offset >= 368 && offset < 888) return (offset - 368) % 52 < 40;
        const size_t inSlot = (offset - 892) % 148;
        return offset >= 892 && offset < 45292 && (inSlot == 128 || inSlot == 140);
    };
    for (size_t offset = 0; offset < bytes.size(); offset += 4)
        Put(&bytes, offset, isPointer(offset) ? 0.0f : static_cast<float>(offset));
    for (size_t i = 0; i < 10; ++i) Put<int32_t>(&bytes, 408 + 52 * i, static_cast<int32_t>(i));
    Put<int32_t>(&bytes, 184, 10);
    Put<int32_t>(&bytes, 888, 10);
    Put<int32_t>(&bytes, 45292, 0);
    EmitterPointer emitter = ReadBack(bytes);
    ASSERT_TRUE(emitter);
    EXPECT_EQ(Written(*emitter), bytes);

    // Fields at the far ends of what is carried.
    const QexParticleEx& p = emitter->particles[299];
    constexpr float kSlot = 892 + 299 * 148;
    EXPECT_EQ(emitter->accelerationMax.z, 364);
    EXPECT_EQ(emitter->animations[9].frameCount, 9);
    EXPECT_EQ(emitter->animations[9].frameDuration, 880);
    EXPECT_EQ(emitter->accumulator, 45300);
    EXPECT_EQ(p.acceleration.z, kSlot + 124);
    EXPECT_EQ(p.frameAge, kSlot + 136);

    // Pointers of another process are never followed.
    for (size_t offset = 0; offset < bytes.size(); offset += 4)
        if (isPointer(offset)) Put<uint32_t>(&bytes, offset, 0xDEADBEEF);
    emitter = ReadBack(bytes);
    ASSERT_TRUE(emitter);
    EXPECT_EQ(emitter->animations[3].frames[9], nullptr);
    EXPECT_EQ(emitter->particles[299].animation, nullptr);
    EXPECT_EQ(emitter->particles[299].billboard, nullptr);
}

TEST(Emitter, TheDurationCountsDownWhetherOrNotItEmits) {
    for (const int32_t emitting : {0, 1}) {
        const EmitterPointer emitter = NewEmitter();
        emitter->emitting = emitting;
        emitter->emissionRate[0] = emitter->emissionRate[1] = emitter->currentRate = 0;
        emitter->emitDuration = 1;
        for (const float left : {0.25f, -0.5f}) {
            QexParticleEmitter_Update(emitter.get(), 0.75f, nullptr);
            EXPECT_EQ(emitter->emitDuration, left);
            EXPECT_EQ(emitter->emitting, left > 0 ? emitting : 0);
        }
    }
}

TEST(EmitterFile, BrokenFilesAreRefused) {
    EXPECT_EQ(QexParticleEmitter_WriteToBinFile(nullptr, "x"), -2);
    const EmitterPointer emitter = NewEmitter();
    EXPECT_EQ(QexParticleEmitter_WriteToBinFile(emitter.get(), nullptr), -2);
    EXPECT_EQ(QexParticleEmitter_WriteToBinFile(emitter.get(), "/no/such/folder/file"), -1);
    EXPECT_EQ(QexParticleEmitter_CreateFromBinFile(nullptr), nullptr);
    EXPECT_EQ(QexParticleEmitter_CreateFromBinFile("/no/such/file"), nullptr);
    Capture full(STDERR_FILENO);
    EXPECT_EQ(QexParticleEmitter_WriteToBinFile(emitter.get(), "/dev/full"), -1);
    EXPECT_EQ(QexParticleEmitter_CreateFromBinFile("/"), nullptr);
    EXPECT_NE(full.Text().find("/dev/full cannot be written"), std::string::npos);
    const std::vector<uint8_t> whole = Written(*emitter);
    for (const int size : {0, 100, 45300, 45303}) {
        Capture log(STDERR_FILENO);
        EXPECT_FALSE(ReadBack({whole.begin(), whole.begin() + size})) << size;
        EXPECT_NE(log.Text().find(std::to_string(size) + " bytes, not 45304\n"), std::string::npos);
    }
    constexpr int32_t kNan = 0x7FC00000, kInfinity = 0x7F800000;
    std::vector<std::tuple<size_t, int32_t, bool, const char*>> cases = {
        {184, 11, false, "a colour count is not 0 to 10\n"},
        {184, -1, false, "a colour count"},
        {888, 11, false, "an animation count"},
        {888, INT32_MIN, false, "an animation count"},
        {408, 11, false, "frame count"},
        {45292, 301, false, "particle count"},
        {45292, -1, false, "particle count"},
        {45292, 300, true, "300 living particles are left out\n"},
        {412, kNan, false, "frame duration"},
        // Of an animation and a colour that are not in use, and of a dead particle.
        {408 + 52, -7, true, ""},
        {40, kNan, true, ""},
        {900, kNan, true, ""}};
    for (const size_t offset : {4, 20, 36, 188, 364, 45296, 45300})
        cases.push_back({offset, offset % 8 ? kNan : kInfinity, false, "a setting is not a finite number"});
    for (const auto& [offset, value, loads, line] : cases) {
        std::vector<uint8_t> bytes = whole;
        Put(&bytes, offset, value);
        Capture log(STDERR_FILENO);
        const EmitterPointer read = ReadBack(bytes);
        const std::string text = log.Text();
        EXPECT_EQ(read != nullptr, loads) << offset;
        EXPECT_NE(text.find(line), std::string::npos) << offset << ": " << text;
        EXPECT_EQ(text.empty(), !*line) << text;
        EXPECT_EQ(read ? read->particleCount : 0, 0);
    }
}

}  // namespace
