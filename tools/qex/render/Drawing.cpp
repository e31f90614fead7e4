// One picture: drawn, with its line of text.
#include "common/ImageFile.h"
#include "render/Renderer.h"

void Renderer::DrawNumber(size_t index) {
    const double turns = options_.turn ? static_cast<double>(index) / options_.turn : 0;
    view_->SetFrame(FrameAt(index));
    view_->Draw(static_cast<float>(360 * turns));
}

void Renderer::DrawText() {
    // The first line: its glyphs touch the upper edge at 32.
    QexFont_ReplaceString(&engine_, 8, 40, options_.text.c_str(), 255, 255, 255, 255);
    QexFont_Draw();
}

// The picture that was drawn, the line of text on it.
std::vector<uint8_t> Renderer::Pixels(bool text) {
    if (text && scale_ == 1) DrawText();
    std::vector<uint8_t> pixels = context_->ReadPixels();
    if (scale_ > 1) pixels = ShrinkPixels(pixels, options_.width, options_.height, scale_);
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    if (!text || scale_ == 1) return pixels;
    // Letters have the size that they have in other pictures: they are drawn by themselves and laid over it.
    view_->Clear(0);
    DrawText();
    BlendWhite(context_->ReadPixels(), context_->Width(), &pixels, options_.width);
    return pixels;
}
