// One ETC1 level of any size and bytes: a byte of width, a byte of height, then the blocks.
#include "DecoderFuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 2) return 0;
    const int32_t width = data[0], height = data[1];
    const size_t blocks = size_t{8} * ((data[0] + 3u) / 4) * ((data[1] + 3u) / 4);
    const LevelToDecode level(data + 2, size - 2, blocks, width, height);
    const int32_t used = QexDecompressETC(level.source.get(), width, height, level.pixels.get(), 0);
    if (static_cast<size_t>(used) == blocks && level.IsOpaque()) return 0;
    fprintf(stderr, "%d x %d pixels: %d bytes used, not %zu, or not opaque\n", width, height, used, blocks);
    abort();
}
