// Pictures read and written by stb, resized, turned and laid over one another.
#include "common/ImageFile.h"

#include <stb/stb_image.h>
#include <stb/stb_image_resize.h>
#include <stb/stb_image_write.h>
#include <algorithm>
#include <cctype>
#include <cstdio>
#include <filesystem>
#include <limits>
#include <memory>

#include "common/OutputFile.h"

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

// The writers of the picture types, of 3 or 4 channels; 0 when they fail.
using Encode = int (*)(stbi_write_func* write, void* to, int width, int height, int channels,
                       const void* pixels);

int EncodePng(stbi_write_func* write, void* to, int width, int height, int channels, const void* pixels) {
    return stbi_write_png_to_func(write, to, width, height, channels, pixels, width * channels);
}

int EncodeJpeg(stbi_write_func* write, void* to, int width, int height, int channels, const void* pixels) {
    constexpr int kQuality = 92;
    return stbi_write_jpg_to_func(write, to, width, height, channels, pixels, kQuality);
}

const struct {
    const char* extension;
    Encode encode;
} kWriters[] = {{".png", EncodePng},
                {".jpg", EncodeJpeg},
                {".jpeg", EncodeJpeg},
                {".bmp", stbi_write_bmp_to_func},
                {".tga", stbi_write_tga_to_func}};

// Null for other extensions. Streams have none.
Encode FindEncode(const std::string& path) {
    std::error_code error;
    std::string extension = std::filesystem::path(path).extension().string();
    for (char& c : extension) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    for (const auto& writer : kWriters)
        if (extension == writer.extension) return writer.encode;
    const bool stream = path == "-" || std::filesystem::is_other(path, error);
    return extension.empty() && stream ? EncodePng : nullptr;
}

void Append(void* to, void* data, int size) {
    const uint8_t* bytes = static_cast<const uint8_t*>(data);
    static_cast<std::vector<uint8_t>*>(to)->insert(static_cast<std::vector<uint8_t>*>(to)->end(), bytes,
                                                   bytes + size);
}

bool Save(const std::string& path, Encode encode, int width, int height, const uint8_t* pixels,
          std::string* error) {
    const size_t size = static_cast<size_t>(width) * static_cast<size_t>(height) * 4;
    std::vector<uint8_t> bytes, rgb;
    bool opaque = true;
    for (size_t i = 3; i < size && opaque; i += 4) opaque = pixels[i] == 255;
    for (size_t i = 0; i < size && opaque; ++i)
        if (i % 4 < 3) rgb.push_back(pixels[i]);
    if (encode(Append, &bytes, width, height, opaque ? 3 : 4, opaque ? rgb.data() : pixels))
        return WriteOutput(path, bytes, error);
    *error = "cannot be written: no memory for the picture";
    return false;
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
    return Save(path, EncodePng, width, height, pixels, error);
}

bool SavePicture(const std::string& path, int width, int height, const uint8_t* pixels, std::string* error) {
    *error = WhyNoPictureName(path);
    return error->empty() && Save(path, FindEncode(path), width, height, pixels, error);
}

std::string WhyNoPictureName(const std::string& path) {
    std::error_code error;
    if (FindEncode(path)) return "";
    if (std::filesystem::is_directory(path, error)) return "is a folder; the name of a picture is expected";
    return "is no picture's name; one that ends in .png, .jpg, .bmp or .tga is expected";
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

std::vector<uint8_t> ShrinkPixels(const std::vector<uint8_t>& pixels, int width, int height, int scale) {
    const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height),
                 n = static_cast<size_t>(scale);
    std::vector<uint8_t> out(w * h * 4);
    for (size_t i = 0; i < out.size(); ++i) {
        const size_t x = i / 4 % w * n, y = i / 4 / w * n;
        size_t sum = n * n / 2;
        for (size_t k = 0; k < n * n; ++k) sum += pixels[((y + k / n) * w * n + x + k % n) * 4 + i % 4];
        out[i] = static_cast<uint8_t>(sum / (n * n));
    }
    return out;
}

void BlendWhite(const std::vector<uint8_t>& cover, int coverWidth, std::vector<uint8_t>* pixels, int width) {
    const size_t w = static_cast<size_t>(width);
    for (size_t i = 0; i < pixels->size(); ++i) {
        const size_t x = i / 4 % w, y = i / 4 / w;
        const int white = i % 4 == 3 ? 0 : cover[(y * static_cast<size_t>(coverWidth) + x) * 4];
        (*pixels)[i] = static_cast<uint8_t>((*pixels)[i] + (255 - (*pixels)[i]) * white / 255);
    }
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

Image FlipRows(const Image& image) {
    Image out = image;
    const size_t row = static_cast<size_t>(image.width) * 4;
    for (int y = 0; y < image.height; ++y)
        std::copy_n(image.Pixel(0, image.height - 1 - y), row, &out.pixels[static_cast<size_t>(y) * row]);
    return out;
}

Image AlphaAsGrey(const Image& image) {
    Image out = image;
    for (size_t i = 0; i < out.pixels.size(); i += 4) {
        std::fill_n(&out.pixels[i], 3, out.pixels[i + 3]);
        out.pixels[i + 3] = 255;
    }
    out.hasAlpha = false;
    return out;
}
