#include <gtest/gtest.h>
#include <sys/time.h>

#include <cmath>
#include <ctime>
#include <limits>
#include <string>

#include "Qex.h"
#include "support/Capture.h"

namespace {

// Wall-clock time in milliseconds that the library sees while a test has set one; -2 makes reading fail.
constexpr int64_t kRealClock = -1, kBrokenClock = -2;
int64_t g_wallClock = kRealClock;

}  // namespace

// Takes the place of the C library's function for the whole test program.
extern "C" int gettimeofday(timeval* now, void*) noexcept {
    if (g_wallClock == kBrokenClock) return -1;
    timespec real;
    clock_gettime(CLOCK_REALTIME, &real);
    const int64_t microseconds =
        g_wallClock == kRealClock ? int64_t{real.tv_sec} * 1000000 + real.tv_nsec / 1000 : g_wallClock * 1000;
    now->tv_sec = static_cast<time_t>(microseconds / 1000000);
    now->tv_usec = static_cast<suseconds_t>(microseconds % 1000000);
    return 0;
}

namespace {

struct Time : testing::Test {
    ~Time() override { g_wallClock = kRealClock; }
};

TEST_F(Time, CountsMillisecondsSinceInitAcrossSecondsAndWrap) {
    g_wallClock = 1700000000750;
    EXPECT_EQ(QexTime_Init(), 750u);
    g_wallClock += 1300;
    EXPECT_EQ(QexTime_Get(), 1300u);
    EXPECT_EQ(QexTime_GetElapsed(), 1300u);
    g_wallClock += 20;
    EXPECT_EQ(QexTime_GetElapsed(), 20u);
    g_wallClock += 5000000000;
    EXPECT_EQ(QexTime_Get(), static_cast<uint32_t>(5000001320ull));
    g_wallClock = kBrokenClock;
    EXPECT_EQ(QexTime_Get(), UINT32_MAX);
    EXPECT_EQ(QexTime_Init(), 750u) << "the base stays when the clock cannot be read";
}

TEST_F(Time, MeterReportsEveryFiveSeconds) {
    g_wallClock = 1700000000000;
    QexTime_Init();
    g_wallClock += 1;
    QexFrameRate earlier = {}, meter = {};
    Capture errors(STDERR_FILENO);
    // One meter serves the process: end the period that an earlier test may have begun.
    QexTime_UpdateFPS(&earlier);
    g_wallClock += 10000;
    QexTime_UpdateFPS(&earlier);
    for (const auto& [step, rate] : {std::pair{4998, 0.0f}, {1, 0.0f}, {1, 0.6f}}) {
        g_wallClock += step;
        QexTime_UpdateFPS(&meter);  // 3 frames in 5000 ms
        EXPECT_FLOAT_EQ(meter.rate, rate);
    }
    EXPECT_NE(errors.Text().find("<QexTime_UpdateFPS>FPS=  0.600\n"), std::string::npos);
}

// Two values a key: times 0, 1, 3; the second value is minus ten times the first.
struct Ramp {
    float keys[9] = {0, 0, 0, 1, 1, -10, 3, 7, -70};
    float output[4] = {99, 99, 99, 99};
    QexFloatKeyFrameSequence sequence;
    QexFloatAnimation animation;

    explicit Ramp(uint32_t loops) {
        QexFloatKeyFrameSequence_Setup(&sequence, 3, 2, 8, keys);
        QexFloatAnimation_Setup(&animation, output, &sequence, 5, loops);
        QexFloatAnimation_Start(&animation);
    }
    uint32_t Step(float delta) { return QexFloatAnimation_Animate(&animation, delta); }
};

TEST(FloatAnimation, InterpolatesBetweenTheKeysAroundThePosition) {
    Ramp ramp(1);
    for (const auto& [delta, value] : {std::pair{0.25f, 0.25f}, {0.75f, 1.0f}, {0.5f, 2.5f}, {1.5f, 7.0f}}) {
        ASSERT_EQ(ramp.Step(delta), 1u);
        EXPECT_FLOAT_EQ(ramp.output[0], value);
        EXPECT_FLOAT_EQ(ramp.output[2], -10 * value);
    }
    EXPECT_EQ(ramp.output[1], 99) << "the stride leaves what lies between";
    Ramp leap(1);
    leap.Step(2);
    EXPECT_FLOAT_EQ(leap.output[0], 4) << "keys passed over within a step are skipped";
}

TEST(FloatAnimation, EndsAfterItsPassesOrNever) {
    for (const uint32_t mode : {0u, 1u, 2u}) {
        Ramp ramp(1);
        ramp.animation.endMode = mode;
        EXPECT_EQ(ramp.Step(3.5f), 0u);
        EXPECT_EQ(ramp.output[0], mode == QEX_FLOAT_ANIMATION_HOLD ? 7 : 0);
        EXPECT_EQ(ramp.Step(0.5f), 0u);
    }
    Ramp thrice(3);
    EXPECT_EQ(thrice.Step(2.75f), 1u);
    EXPECT_EQ(thrice.Step(0.5f), 1u);
    EXPECT_FLOAT_EQ(thrice.output[0], 0.25f) << "the overshoot starts the next pass";
    EXPECT_EQ(thrice.Step(5.5f), 1u);
    EXPECT_FLOAT_EQ(thrice.output[0], 6.25f) << "third pass, time 2.75";
    EXPECT_EQ(thrice.Step(0.5f), 0u);

    Ramp endless(0);
    for (const float delta : {0.5f, 300.0f, 3e9f, std::numeric_limits<float>::infinity()}) {
        EXPECT_EQ(endless.Step(delta), 1u);
        EXPECT_TRUE(std::isfinite(endless.output[0]));
    }
    Ramp whole(0);
    whole.Step(6);
    EXPECT_FLOAT_EQ(whole.output[0], 7) << "a step of two whole passes stays at the end";
}

TEST(FloatAnimation, StopsOnSequencesThatCannotBePlayed) {
    for (const auto& [count, values] : {std::pair{0u, 1u}, {1u, 1u}, {2u, 17u}}) {
        Ramp ramp(0);
        ramp.sequence.keyCount = count;
        ramp.sequence.valuesPerKey = values;
        EXPECT_EQ(ramp.Step(1), 0u);
        EXPECT_EQ(ramp.output[0], 99);
    }
}

}  // namespace
