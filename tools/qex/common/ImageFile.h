// Pictures in and out for the qex command: PNG, JPEG, TGA, BMP, PSD, GIF and PNM are read, PNG, JPEG,
// BMP and TGA are written.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

struct Image {
    int width = 0;
    int height = 0;
    std::vector<uint8_t> pixels;  // RGBA, 8 bits each, the first row is the top one
    bool hasAlpha = false;        // some pixel is not opaque

    const uint8_t* Pixel(int x, int y) const {
        return &pixels[4 * (static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x))];
    }
};

// Both give false and one line in `error` when the data is no picture that can be read.
bool LoadImage(const std::string& path, Image* image, std::string* error);
bool LoadImage(const uint8_t* data, size_t size, Image* image, std::string* error);

// Looks at every pixel and sets `hasAlpha`.
void UpdateHasAlpha(Image* image);

// Writes a picture of the type that the extension names. `pixels` is top-down RGBA without padding. False,
// with the reason, when it does not get there whole.
bool SavePicture(const std::string& path, int width, int height, const uint8_t* pixels, std::string* error);
bool SavePng(const std::string& path, int width, int height, const uint8_t* pixels, std::string* error);

// What is wrong with the name of a picture that is to be written, or nothing. Standard output and devices are
// PNG.
std::string WhyNoPictureName(const std::string& path);

// Both keep the value range linear (no gamma) and filter each channel by itself.
Image ResizeImage(const Image& image, int width, int height);
// The mean of each scale x scale pixels, of RGBA that are `scale` times as wide and high.
std::vector<uint8_t> ShrinkPixels(const std::vector<uint8_t>& pixels, int width, int height, int scale);
// Lays white over RGBA pixels, as much of it as the red of others, the upper left part of wider ones.
void BlendWhite(const std::vector<uint8_t>& cover, int coverWidth, std::vector<uint8_t>* pixels, int width);
Image HalveImage(const Image& image);  // 2 x 2 box, for mipmaps; a side of 1 stays 1
Image FlipRows(const Image& image);

// A picture whose red, green and blue all hold the alpha channel.
Image AlphaAsGrey(const Image& image);
