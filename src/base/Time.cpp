// The millisecond clock, the frame-rate meter, and animations of a few floats.
#include "base/Time.h"

#include <sys/time.h>
#include <time.h>

#include <cmath>
#include <cstring>

#include "base/Diagnostics.h"
#include "Qex/base.h"

namespace {

constexpr uint32_t kMeterPeriod = 5000;  // milliseconds
constexpr uint32_t kMaxValues = 16;

// All 0 until QexTime_Init and the first frame.
struct Clock {
    uint32_t baseSeconds, baseMilliseconds;
    uint32_t elapsedReference;
    uint32_t meterStart, meterFrames;
} g_clock;

const float* KeyAt(const QexFloatKeyFrameSequence& sequence, uint32_t key) {
    return sequence.keys + size_t{key} * (1 + sequence.valuesPerKey);
}

bool IsPlayable(const QexFloatKeyFrameSequence* sequence) {
    return sequence && sequence->keys && sequence->keyCount >= 2 && sequence->valuesPerKey <= kMaxValues;
}

void LoadKeys(QexFloatAnimation* animation) {
    const QexFloatKeyFrameSequence& sequence = *animation->sequence;
    const float* from = KeyAt(sequence, animation->fromKey);
    const float* to = KeyAt(sequence, animation->toKey);
    animation->fromTime = from[0];
    animation->toTime = to[0];
    memcpy(animation->fromValues, from + 1, sequence.valuesPerKey * sizeof(float));
    memcpy(animation->toValues, to + 1, sequence.valuesPerKey * sizeof(float));
}

void WriteValue(const QexFloatAnimation* animation, uint32_t index, float value) {
    char* output = static_cast<char*>(animation->output);
    memcpy(output + size_t{index} * animation->sequence->outputStride, &value, sizeof value);
}

uint32_t Finish(QexFloatAnimation* animation) {
    const QexFloatKeyFrameSequence& sequence = *animation->sequence;
    const uint32_t last = sequence.keyCount - 1;
    const float* key = KeyAt(sequence, animation->endMode == QEX_FLOAT_ANIMATION_HOLD ? last : 0);
    for (uint32_t i = 0; i < sequence.valuesPerKey; ++i) WriteValue(animation, i, key[1 + i]);
    animation->playing = 0;
    return 0;
}

// Goes back to the start of the next pass and returns how far into it the step reaches.
float WrapStep(QexFloatAnimation* animation, float delta) {
    const QexFloatKeyFrameSequence& sequence = *animation->sequence;
    const float length = KeyAt(sequence, sequence.keyCount - 1)[0];
    float overshoot = delta + animation->position - length;
    if (animation->loopCount != 0) {
        --animation->passesLeft;
    } else if (!(overshoot <= length)) {
        // Whole passes are dropped at once. A step that ends with a pass stays at its end; a step of no end,
        // or passes of no length, restart.
        const float rest = fmodf(overshoot, length);
        overshoot = !std::isfinite(rest) ? 0 : rest > 0 ? rest : length;
    }
    animation->position = 0;
    return overshoot;
}

}  // namespace

uint64_t QexTime_Monotonic() {
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<uint64_t>(now.tv_sec) * 1000000000 + static_cast<uint64_t>(now.tv_nsec);
}

uint64_t QexTime_In(float milliseconds) {
    const uint64_t now = QexTime_Monotonic();
    if (!(milliseconds > 0)) return now;
    return milliseconds < 1e9f ? now + static_cast<uint64_t>(static_cast<double>(milliseconds) * 1e6)
                               : kQexNever;
}

uint32_t QexTime_Init() {
    timeval now;
    if (gettimeofday(&now, nullptr) == 0) {
        g_clock.baseSeconds = static_cast<uint32_t>(now.tv_sec);
        g_clock.baseMilliseconds = static_cast<uint32_t>(now.tv_usec / 1000);
    }
    g_clock.elapsedReference = 0;
    return g_clock.baseMilliseconds;
}

uint32_t QexTime_Get() {
    timeval now;
    if (gettimeofday(&now, nullptr) != 0) return UINT32_MAX;
    const uint32_t milliseconds = static_cast<uint32_t>(now.tv_usec / 1000) - g_clock.baseMilliseconds;
    return milliseconds + (static_cast<uint32_t>(now.tv_sec) - g_clock.baseSeconds) * 1000;
}

uint32_t QexTime_GetElapsed() {
    const uint32_t previous = g_clock.elapsedReference;
    g_clock.elapsedReference = QexTime_Get();
    return g_clock.elapsedReference - previous;
}

void QexTime_UpdateFPS(QexFrameRate* record) {
    if (g_clock.meterStart == 0) {
        record->frames = 0;
        g_clock.meterStart = QexTime_Get();
    }
    ++record->frames;
    const uint32_t now = QexTime_Get();
    ++g_clock.meterFrames;
    const uint32_t period = now - g_clock.meterStart;
    if (period < kMeterPeriod) return;

    record->rate = static_cast<float>(g_clock.meterFrames) / static_cast<float>(period) * 1000.0f;
    QexDiagnostics_Print(stderr, "<QexTime_UpdateFPS>FPS=%7.3f\n", static_cast<double>(record->rate));
    g_clock.meterStart = now;
    g_clock.meterFrames = 0;
}

int32_t QexFloatKeyFrameSequence_Setup(QexFloatKeyFrameSequence* sequence, uint32_t keyCount,
                                       uint32_t valuesPerKey, uint32_t outputStride, const float* keys) {
    *sequence = {keyCount, outputStride, valuesPerKey, keys};
    return 0;
}

int32_t QexFloatAnimation_Setup(QexFloatAnimation* animation, void* output,
                                const QexFloatKeyFrameSequence* sequence, uint32_t setupWord,
                                uint32_t loopCount) {
    *animation = {};
    animation->output = output;
    animation->sequence = sequence;
    animation->setupWord = setupWord;
    animation->loopCount = loopCount;
    return QexFloatAnimation_Reset(animation);
}

int32_t QexFloatAnimation_Reset(QexFloatAnimation* animation) {
    animation->passesLeft = animation->loopCount;
    animation->position = 0;
    animation->fromKey = 0;
    animation->toKey = 1;
    animation->playing = 0;
    if (IsPlayable(animation->sequence)) LoadKeys(animation);
    return 0;
}

int32_t QexFloatAnimation_Start(QexFloatAnimation* animation) {
    animation->playing = 1;
    return 1;
}

uint32_t QexFloatAnimation_Animate(QexFloatAnimation* animation, float delta) {
    if (animation->playing != 1) return animation->playing;
    if (!IsPlayable(animation->sequence)) return animation->playing = 0;

    const QexFloatKeyFrameSequence& sequence = *animation->sequence;
    uint32_t candidate = animation->fromKey;
    float past = 0;  // how far the step reaches beyond the candidate key
    do {
        ++candidate;
        if (candidate >= sequence.keyCount) {
            if (animation->passesLeft == 1) return Finish(animation);
            delta = WrapStep(animation, delta);
            candidate = 1;
        }
        past = delta + animation->position - KeyAt(sequence, candidate)[0];
    } while (past > 0);

    animation->toKey = candidate;
    animation->fromKey = candidate - 1;
    LoadKeys(animation);
    const float at = animation->toTime + past - animation->fromTime;
    const float span = animation->toTime - animation->fromTime;
    for (uint32_t i = 0; i < sequence.valuesPerKey; ++i) {
        const float from = animation->fromValues[i];
        WriteValue(animation, i, from + (animation->toValues[i] - from) * at / span);
    }
    animation->position += delta;
    return 1;
}

#if UINTPTR_MAX == UINT32_MAX
static_assert(sizeof(QexFloatAnimation) == 44 * 4, "44 words");
static_assert(sizeof(QexFloatKeyFrameSequence) == 16, "4 words");
#endif
