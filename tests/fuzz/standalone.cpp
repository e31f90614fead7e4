// Runs a fuzz target without libFuzzer: every file of a folder, each followed by a number of damaged copies.
// The damage depends on the file alone, so that a failure comes back.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);

namespace {

using Bytes = std::vector<uint8_t>;

using Random = std::minstd_rand;

// One to four changes: a byte, a telling word, a piece lost or a piece doubled.
Bytes Damaged(Bytes file, Random* random) {
    static const uint32_t words[] = {0, 1, 0x7FFFFFFF, 0x80000000u, UINT32_MAX, 0xFFFF, 16, 4};
    const auto below = [&](size_t limit) { return static_cast<uint32_t>((*random)() % limit); };
    for (uint32_t change = 0; change <= below(4) && file.size() >= 8; ++change) {
        const size_t at = below(file.size() - 4);
        const auto from = file.begin() + static_cast<long>(at);
        const auto to = from + static_cast<long>(below(std::min<size_t>(64, file.size() - at)));
        const Bytes piece(from, to);
        switch (below(4)) {
            case 0: *from = static_cast<uint8_t>(*from ^ (below(2) ? 1 << below(8) : below(256))); break;
            case 1: memcpy(&*from, &words[below(8)], 4); break;
            case 2: file.erase(from, to); break;
            default: file.insert(from, piece.begin(), piece.end());
        }
    }
    return file;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2 || !std::filesystem::is_directory(argv[1])) {
        fprintf(stderr, "usage: %s FOLDER [DAMAGED COPIES OF EACH FILE]\n", argv[0]);
        return 2;
    }
    // The engine's lines would be gigabytes. What a sanitizer says goes the same way; it is seen in a run
    // without the variable.
    const int errors = dup(STDERR_FILENO), nowhere = open("/dev/null", O_WRONLY);
    dup2(nowhere, STDOUT_FILENO);
    if (getenv("QEX_FUZZ_QUIET")) dup2(nowhere, STDERR_FILENO);
    std::vector<std::filesystem::path> paths;
    for (const auto& entry : std::filesystem::directory_iterator(argv[1])) paths.push_back(entry.path());
    std::sort(paths.begin(), paths.end());
    const long copies = argc > 2 ? atol(argv[2]) : 0;
    for (const auto& path : paths) {
        std::ifstream stream(path, std::ios::binary);
        const Bytes file((std::istreambuf_iterator<char>(stream)), {});
        Random random;
        LLVMFuzzerTestOneInput(file.data(), file.size());
        for (long i = 0; i < copies; ++i) {
            const Bytes damaged = Damaged(file, &random);
            LLVMFuzzerTestOneInput(damaged.data(), damaged.size());
        }
    }
    dprintf(errors, "%zu files, %ld damaged copies of each\n", paths.size(), copies);
    return paths.empty() ? 1 : 0;
}
