#include "ImageFile.h"

#include <stb/stb_image.h>
#include <stb/stb_image_resize.h>
#include <stb/stb_image_write.h>
#include <algorithm>
#include <cstdio>
#include <limits>
#include <memory>

namespace {

bool ReadWholeFile(const std::string& path, std::vector<uint8_t>* bytes) {
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "rb"), std::fclose);
    if (!file) return false;
    uint8_t chunk[65536];
    size_t got;
    while ((got = std::fread(chunk, 1, sizeof(chunk), file.get())) > 0) {
        bytes->insert(bytes->end(), chunk, chunk + got);
    }
    return std::ferror(file.get()) == 0;
}

}  // namespace

bool LoadImage(const std::string& path, Image* image, std::string* error) {
    std::vector<uint8_t> bytes;
    if (!ReadWholeFile(path, &bytes)) {
        *error = "cannot be read";
        return false;
    }
    return LoadImage(bytes.data(), bytes.size(), image, error);
}

bool LoadImage(const uint8_t* data, size_t size, Image* image, std::string* error) {
    if (size == 0 || size > static_cast<size_t>(std::numeric_limits<int>::max())) {
        *error = size == 0 ? "is empty" : "is larger than 2 GiB";
        return false;
    }
    int width = 0, height = 0, channels = 0;
    const std::unique_ptr<stbi_uc, void (*)(void*)> pixels(
        stbi_load_from_memory(data, static_cast<int>(size), &width, &height, &channels, 4), stbi_image_free);
    if (!pixels) {
        *error = std::string("is no PNG, JPEG, TGA, BMP, PSD, GIF or PNM picture that can be read (") +
                 stbi_failure_reason() + ")";
        return false;
    }
    image->width = width;
    image->height = height;
    image->pixels.assign(pixels.get(),
                         pixels.get() + static_cast<size_t>(width) * static_cast<size_t>(height) * 4);
    UpdateHasAlpha(image);
    return true;
}

void UpdateHasAlpha(Image* image) {
    image->hasAlpha = false;
    for (size_t i = 3; i < image->pixels.size() && !image->hasAlpha; i += 4) {
        image->hasAlpha = image->pixels[i] != 255;
    }
}

bool SavePng(const std::string& path, int width, int height, const uint8_t* pixels, std::string* error) {
    if (stbi_write_png(path.c_str(), width, height, 4, pixels, width * 4)) return true;
    *error = "cannot be written";
    return false;
}

Image ResizeImage(const Image& image, int width, int height) {
    Image out;
    out.width = width;
    out.height = height;
    out.pixels.resize(static_cast<size_t>(width) * static_cast<size_t>(height) * 4);
    stbir_resize_uint8(image.pixels.data(), image.width, image.height, 0, out.pixels.data(), width, height, 0,
                       4);
    UpdateHasAlpha(&out);
    return out;
}

Image HalveImage(const Image& image) {
    Image out;
    out.width = std::max(image.width / 2, 1);
    out.height = std::max(image.height / 2, 1);
    out.hasAlpha = image.hasAlpha;
    out.pixels.reserve(static_cast<size_t>(out.width) * static_cast<size_t>(out.height) * 4);
    for (int y = 0; y < out.height; ++y) {
        const int y0 = std::min(2 * y, image.height - 1), y1 = std::min(2 * y + 1, image.height - 1);
        for (int x = 0; x < out.width; ++x) {
            const int x0 = std::min(2 * x, image.width - 1), x1 = std::min(2 * x + 1, image.width - 1);
            const uint8_t* p[4] = {image.Pixel(x0, y0), image.Pixel(x1, y0), image.Pixel(x0, y1),
                                   image.Pixel(x1, y1)};
            for (int c = 0; c < 4; ++c) {
                out.pixels.push_back(static_cast<uint8_t>((p[0][c] + p[1][c] + p[2][c] + p[3][c] + 2) / 4));
            }
        }
    }
    return out;
}
