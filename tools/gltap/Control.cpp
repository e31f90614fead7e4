// The control functions that need no module of their own, and the environment variables for a preloaded tap.

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "NullDriver.h"
#include "Recording.h"
#include "Tap.h"

namespace gltap {
namespace {

std::FILE* g_log = nullptr;
const char* g_countsFile = nullptr;

std::FILE* OpenForWriting(const char* path) {
    if (std::strcmp(path, "-") == 0) return stdout;
    std::FILE* file = std::fopen(path, "w");
    if (!file) std::fprintf(stderr, "gltap: cannot write %s: %s\n", path, std::strerror(errno));
    return file;
}

void Close(std::FILE* file) {
    if (file == stdout) {
        std::fflush(file);
    } else {
        std::fclose(file);
    }
}

// "glDrawElements:3:0x502", or several of these with commas between.
void InjectFromText(const char* text) {
    const std::string all(text);
    for (size_t begin = 0; begin <= all.size();) {
        const size_t end = std::min(all.find(',', begin), all.size());
        const std::string part = all.substr(begin, end - begin);
        begin = end + 1;
        char name[64] = "";
        unsigned nth = 0;
        int error = 0;
        int read = 0;
        const bool whole = std::sscanf(part.c_str(), "%63[^:]:%u:%i%n", name, &nth, &error, &read) == 3 &&
                           static_cast<size_t>(read) == part.size();
        if (whole && gltapInjectError(name, nth, static_cast<uint32_t>(error))) continue;
        std::fprintf(stderr, "gltap: GLTAP_FAIL: '%s' is not FUNCTION:NTH:ERROR\n", part.c_str());
    }
}

__attribute__((constructor)) void ReadEnvironment() {
    const char* mode = std::getenv("GLTAP_MODE");
    if (mode && std::strcmp(mode, "null") == 0) {
        tap.mode = GLTAP_NULL;
    } else if (mode && std::strcmp(mode, "forward") != 0) {
        std::fprintf(stderr, "gltap: GLTAP_MODE: '%s' is neither null nor forward\n", mode);
    }
    if (const char* log = std::getenv("GLTAP_LOG")) g_log = OpenForWriting(log);
    if (g_log) tap.watch |= kLog;
    if (const char* failures = std::getenv("GLTAP_FAIL")) InjectFromText(failures);
    g_countsFile = std::getenv("GLTAP_COUNTS");
}

__attribute__((destructor)) void Finish() {
    tap.watch &= ~static_cast<uint32_t>(kLog);
    if (g_log) Close(g_log);
    g_log = nullptr;
    if (!g_countsFile) return;
    std::FILE* file = OpenForWriting(g_countsFile);
    if (!file) return;
    const std::string live = LiveObjectsText();
    std::fprintf(file, "%slive objects:%s%s", CountsText().c_str(), live.empty() ? " none\n" : "\n",
                 live.c_str());
    Close(file);
}

}  // namespace

void LogLine(const std::string& line) {
    if (g_log) std::fprintf(g_log, "%s\n", line.c_str());
}

void LogCall(const gltapCall& call) {
    LogLine(CallText(call));
}

}  // namespace gltap

using namespace gltap;

void gltapSetMode(gltapMode mode) {
    tap.mode = mode;
}
gltapMode gltapGetMode(void) {
    return tap.mode;
}

void gltapReset(void) {
    gltapResetCounts();
    ForgetRecording();
    ForgetInjections();
    ForgetPoorer();
    ForgetReads();
    ForgetObjects();
    NullForgetPrograms();
    ResetState();
}

int gltapFunctionCount(void) {
    return static_cast<int>(kFunctionCount);
}

const char* gltapFunctionName(int function) {
    const bool inRange = function >= 0 && function < gltapFunctionCount();
    return inRange ? kFunctions[function].name : nullptr;
}

int gltapFunctionNumber(const char* name) {
    for (size_t i = 0; i < kFunctionCount; ++i) {
        if (std::strcmp(kFunctions[i].name, name) == 0) return static_cast<int>(i);
    }
    return -1;
}

uint64_t gltapCount(const char* name) {
    const int number = gltapFunctionNumber(name);
    return number < 0 ? 0 : tap.counts[number];
}

uint64_t gltapCountAll(void) {
    uint64_t sum = 0;
    for (const uint64_t count : tap.counts) sum += count;
    return sum;
}

void gltapResetCounts(void) {
    std::memset(tap.counts, 0, sizeof(tap.counts));
}

size_t gltapDescribeRecording(const gltapRecording* recording, char* text, size_t size) {
    std::string all;
    for (const gltapCall& call : recording->calls) all += CallText(call) + '\n';
    return CopyText(all, text, size);
}
