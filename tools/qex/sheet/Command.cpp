// Cells of one size, row by row on white.
#include "sheet/Command.h"

#include <algorithm>
#include <cstring>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/ImageFile.h"
#include "common/OutputFile.h"

namespace {

constexpr size_t kMaxPixels = size_t{1} << 28;

void Paste(const Image& image, size_t left, size_t top, size_t width, std::vector<uint8_t>* sheet) {
    const size_t row = static_cast<size_t>(image.width) * 4;
    for (size_t y = 0; y < static_cast<size_t>(image.height); ++y)
        memcpy(&(*sheet)[((top + y) * width + left) * 4], &image.pixels[y * row], row);
}

}  // namespace

void SetUpSheet(CLI::App* app, SheetOptions* options) {
    app->add_option("PICTURES", options->inputs, "pictures, row by row; - is standard input")->required();
    app->add_option("-o,--output", options->output, "PNG, JPEG, BMP or TGA file, by its extension")
        ->required();
    app->add_option("--columns", options->columns, "pictures in a row (4)")->check(WholeNumberFrom(1, 1000));
    app->add_option("--gap", options->gap, "pixels between pictures (4)")->check(WholeNumberFrom(0, 1000));
}

int RunSheet(const SheetOptions& options) {
    std::vector<Image> images(options.inputs.size());
    std::string error = WhyNoPictureName(options.output);
    if (error.empty()) error = WhyNotOutput(options.output, options.inputs);
    if (!error.empty()) return Fail("sheet", options.output + ": " + error, 2);
    size_t cellWidth = 0, cellHeight = 0;
    for (size_t i = 0; i < images.size(); ++i) {
        const InputFile input(options.inputs[i]);
        if (!LoadImage(input.Path(), &images[i], &error))
            return Fail("sheet", input.Name() + ": " + error, 1);
        cellWidth = std::max(cellWidth, static_cast<size_t>(images[i].width));
        cellHeight = std::max(cellHeight, static_cast<size_t>(images[i].height));
    }
    const size_t gap = static_cast<size_t>(options.gap);
    const size_t columns = std::min(static_cast<size_t>(options.columns), images.size());
    const size_t rows = (images.size() + columns - 1) / columns;
    const size_t width = columns * (cellWidth + gap) + gap, height = rows * (cellHeight + gap) + gap;
    if (width * height > kMaxPixels) return Fail("sheet", "the sheet would have more than 2^28 pixels", 2);
    std::vector<uint8_t> sheet(width * height * 4, 255);
    for (size_t i = 0; i < images.size(); ++i)
        Paste(images[i], gap + i % columns * (cellWidth + gap), gap + i / columns * (cellHeight + gap), width,
              &sheet);
    if (SavePicture(options.output, static_cast<int>(width), static_cast<int>(height), sheet.data(), &error))
        return 0;
    return Fail("sheet", options.output + ": " + error, 2);
}
