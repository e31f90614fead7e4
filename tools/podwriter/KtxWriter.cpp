// The header and the levels of a KTX 1.1 file.
#include "KtxWriter.h"

#include <algorithm>

namespace pod {
namespace {

using Bytes = std::vector<uint8_t>;

void PutWord(Bytes* bytes, size_t word) {
    for (int shift = 0; shift < 32; shift += 8) bytes->push_back(static_cast<uint8_t>(word >> shift));
}

void PadToWord(Bytes* bytes) {
    bytes->resize((bytes->size() + 3) / 4 * 4);
}

Bytes WriteKeyValues(const KtxImage& image) {
    Bytes bytes;
    for (const auto& [key, value] : image.keyValues) {
        PutWord(&bytes, key.size() + value.size() + 2);
        for (const std::string& text : {key, value}) {
            bytes.insert(bytes.end(), text.begin(), text.end());
            bytes.push_back(0);
        }
        PadToWord(&bytes);
    }
    return bytes;
}

Bytes PadRows(const Bytes& level, size_t rowBytes) {
    if (!rowBytes || rowBytes % 4 == 0) return level;
    Bytes padded;
    padded.reserve(level.size() / rowBytes * (rowBytes + 3));
    for (size_t at = 0; at + rowBytes <= level.size(); at += rowBytes) {
        const auto row = level.begin() + static_cast<std::ptrdiff_t>(at);
        padded.insert(padded.end(), row, row + static_cast<std::ptrdiff_t>(rowBytes));
        PadToWord(&padded);
    }
    return padded;
}

}  // namespace

std::vector<uint8_t> WriteKtx(const KtxImage& image) {
    const bool words = image.pixelBytes == 2;  // the 16 bits are the unit of the other byte order
    const Bytes keyValues = WriteKeyValues(image);
    const size_t levels = image.surfaces.empty() ? 0 : image.surfaces[0].size();
    Bytes file = {0xAB, 'K', 'T', 'X', ' ', '1', '1', 0xBB, '\r', '\n', 0x1A, '\n'};
    const size_t header[13] = {0x04030201,
                               image.glType,
                               words ? 2u : 1u,
                               image.glFormat,
                               image.glInternalFormat,
                               image.glBaseInternalFormat,
                               image.width,
                               image.height,
                               0,  // depth
                               0,  // array elements
                               image.surfaces.size(),
                               levels,
                               keyValues.size()};
    for (const size_t word : header) PutWord(&file, word);
    file.insert(file.end(), keyValues.begin(), keyValues.end());
    for (size_t level = 0; level < levels; ++level) {
        const size_t rowBytes = size_t{std::max(image.width >> level, 1u)} * image.pixelBytes;
        for (const auto& surface : image.surfaces) {
            const Bytes pixels = PadRows(surface[level], rowBytes);
            // The size of one face stands before them all.
            if (&surface == &image.surfaces[0]) PutWord(&file, pixels.size());
            file.insert(file.end(), pixels.begin(), pixels.end());
        }
    }
    return file;
}

}  // namespace pod
