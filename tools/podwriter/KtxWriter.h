// KTX 1.1 textures: the header, key and value pairs, and the levels behind them.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace pod {

struct KtxImage {
    uint32_t glType = 0;  // this and glFormat are 0 for compressed data
    uint32_t glFormat = 0;
    uint32_t glInternalFormat = 0;
    uint32_t glBaseInternalFormat = 0;
    uint32_t pixelBytes = 0;  // of uncompressed data; 0 when compressed
    uint32_t width = 0;
    uint32_t height = 0;
    std::vector<std::pair<std::string, std::string>> keyValues;
    std::vector<std::vector<std::vector<uint8_t>>> surfaces;  // [face][level] pixel data, six for a cube
};

// Rows come without padding and are written with it. The header's figures come from the image as it is given;
// nothing is checked.
std::vector<uint8_t> WriteKtx(const KtxImage& image);

}  // namespace pod
