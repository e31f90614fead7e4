#include <GLES2/gl2.h>
#include <unistd.h>

#include <climits>
#include <cmath>

#include "support/Capture.h"
#include "support/RenderScenes.h"

namespace {

const Rgba kBackground = {20, 40, 60, 80};

// Character c lies in column (c - 32) mod 32 and row (c - 32) / 32 of cells of 8 x 16 texels; at y = 32 its
// cell touches the upper edge.
void Stamp(Picture* picture, int x, int y, const std::string& text, Rgba colour) {
    for (int i = 0; i < static_cast<int>(text.size()) * 128; ++i) {
        const int cell = text[static_cast<size_t>(i / 128)] - 32, column = i % 8, row = i / 8 % 16;
        const int s = cell % 32 * 8 + column, t = cell / 32 * 16 + row;
        const int px = x + i / 128 * 8 + column, py = y - 32 + row;
        if (!fontdata[(t * 256 + s) * 4 + 3] || px < 0 || py < 0 || px >= kWidth || py >= kHeight) continue;
        // Source alpha over, in all four channels.
        Rgba out = picture->Pixel(px, py);
        for (size_t c = 0; c < 4; ++c)
            out[c] = static_cast<int>(std::lround(out[c] + (colour[c] - out[c]) * (colour[3] / 255.0)));
        picture->Fill(px, py, px + 1, py + 1, out);
    }
}

class FontTest : public RenderTest {
  protected:
    void SetUp() override {
        RenderTest::SetUp();
        background_.Fill(0, 0, kWidth, kHeight, kBackground);
    }
    Picture Drawn(const std::function<void()>& draw) {
        Clear(20 / 255.0f, 40 / 255.0f, 60 / 255.0f, 80 / 255.0f);
        draw();
        return Read();
    }
    Picture Temporary(int x, int y, const std::string& text, uint32_t colour = ~0u) {
        return Drawn([&] { QexFont_DrawTempString(&runtime_, x, y, text.c_str(), colour); });
    }
    int32_t Add(int x, int y, const char* text) {
        return QexFont_AddString(&runtime_, x, y, text, 255, 128, 0, 255);
    }

    Picture background_;
};

// Index count of each draw, "28 10 ".
std::string IndexCounts(const std::function<void()>& draw) {
    const GLCalls calls(draw);
    std::string text;
    for (const gltapCall* call : calls.Of({"glDrawElements"}))
        text += std::to_string(call->argument[1].i) + " ";
    return text;
}

TEST_F(FontTest, EveryGlyphLandsOnItsPixels) {
    struct Text {
        int x, y;
        std::string text;
        uint32_t colour;
    };
    std::vector<Text> strings = {{10, 92, "AB", 0x80FF0000}, {-3, 24, "Clipped", 0x40FFFF00}};
    std::string all;
    for (int c = 32; c < 128; ++c) all += static_cast<char>(c);
    for (size_t i = 0; i < all.size(); i += 16) strings.push_back({0, 112, all.substr(i, 16), 0xFF20C0FF});
    for (const auto& s : strings) {
        Picture expected = background_;
        const uint32_t argb = s.colour;
        const Rgba colour = {int(argb >> 16 & 255), int(argb >> 8 & 255), int(argb & 255), int(argb >> 24)};
        Stamp(&expected, s.x, s.y, s.text, colour);
        EXPECT_TRUE(SamePicture(Temporary(s.x, s.y, s.text, s.colour), expected, 1)) << s.text;
        EXPECT_EQ(QexFont_ReplaceString(&runtime_, s.x, s.y, s.text.c_str(), colour[0], colour[1], colour[2],
                                        colour[3]),
                  static_cast<int32_t>(s.text.size()));
        EXPECT_TRUE(SamePicture(Drawn(QexFont_Draw), expected, 1)) << s.text;
    }
}

// Nothing shows between the glyphs that one strip joins.
TEST_F(FontTest, PersistentTextIsBuiltUp) {
    EXPECT_EQ(IndexCounts(QexFont_Draw), "");
    EXPECT_EQ(Add(8, 40, "abc"), 3);
    EXPECT_EQ(Add(70, 100, "de"), 2);
    Picture expected = background_;
    Stamp(&expected, 8, 40, "abc", {255, 128, 0, 255});
    Stamp(&expected, 70, 100, "de", {255, 128, 0, 255});
    EXPECT_TRUE(SamePicture(Drawn(QexFont_Draw), expected, 1));
    EXPECT_EQ(IndexCounts(QexFont_Draw), "28 ");
    EXPECT_EQ(QexFont_ReplaceString(&runtime_, 0, 32, "Hi", 255, 255, 255, 255), 2);
    EXPECT_EQ(IndexCounts(QexFont_Draw), "10 ");
    QexFont_ClearString();
    EXPECT_EQ(Add(0, 32, ""), 0);
    EXPECT_EQ(IndexCounts(QexFont_Draw), "");

    const std::string seventy(70, 'o');
    EXPECT_EQ(Add(-500, 40, seventy.c_str()), 70);
    expected = background_;
    Stamp(&expected, -500, 40, seventy, {255, 128, 0, 255});
    EXPECT_TRUE(SamePicture(Drawn(QexFont_Draw), expected, 1));
    EXPECT_EQ(IndexCounts(QexFont_Draw), "382 34 ");
    EXPECT_EQ(IndexCounts([&] { Temporary(-500, 40, seventy); }), "382 34 ");
    EXPECT_EQ(IndexCounts([&] { Temporary(0, 32, ""); }), "");
}

// Arrays are off again and the depth test is at its usual function; of the rest, what the header says.
TEST_F(FontTest, StateLeftBehind) {
    Temporary(0, 32, "a");
    Add(0, 32, "a");
    GLint before = 0;
    glGetIntegerv(GL_CURRENT_PROGRAM, &before);
    const std::function<void()> draws[] = {QexFont_Draw,
                                           [&] { QexFont_DrawTempString(&runtime_, 0, 32, "b", ~0u); }};
    for (const auto& draw : draws) {
        QexRenderState_UseProgram(0);
        QexRenderState_ActiveTexture(GL_TEXTURE2);
        QexRenderer_SetAlphaBlendMode(QEX_BLEND_NONE);
        QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
        EXPECT_EQ(StateChange(draw), "program: 0 -> " + std::to_string(before) +
                                         "\nactiveUnit: 2 -> 3\n"
                                         "blend: 0 -> 1\ndepthFunc: GL_ALWAYS -> GL_LEQUAL\n");
    }
}

TEST_F(FontTest, NumbersAndUnknownCharacters) {
    for (const int32_t number : {-120, 0, INT_MAX, INT_MIN})
        EXPECT_TRUE(SamePicture(Drawn([&] { QexFont_DrawNum(&runtime_, 4, 60, number, ~0u); }),
                                Temporary(4, 60, std::to_string(number))));
    Picture expected = background_;
    Stamp(&expected, 4, 60, "a\x7F\x7F\x7F\x7F\x7Fz", {255, 255, 255, 255});
    EXPECT_TRUE(SamePicture(Temporary(4, 60, "a\x01\x80\xFF\u20AC\U0001F600z"), expected, 1));
}

TEST_F(FontTest, LinesScaleAndLatin) {
    Picture expected = background_;
    Stamp(&expected, 4, 40, "ab", {255, 255, 255, 255});
    Stamp(&expected, 4, 72, "c", {255, 255, 255, 255});
    EXPECT_TRUE(SamePicture(Temporary(4, 40, "ab\n\nc"), expected, 1));
    // Twice as large, the upper left corner where it was.
    const Picture small = Temporary(0, 32, "L");
    EXPECT_EQ(QexFont_SetScale(2), 0);
    const Picture large = Temporary(0, 32, "L\nL");
    float width = 0, height = 0;
    QexFont_MeasureString("ab\n\u00E4bc\n", &width, &height);
    EXPECT_EQ(width, 48);
    EXPECT_EQ(height, 96);
    for (const float scale : {0.0f, -1.0f, NAN, INFINITY}) EXPECT_EQ(QexFont_SetScale(scale), -1);
    for (int line = 0; line < 2; ++line)
        for (int y = 0; y < 16; ++y)
            for (int x = 0; x < 8; ++x)  // what the filter leaves of the middle of a pixel
                EXPECT_EQ(large.Pixel(2 * x, 2 * y + 32 * line)[0] > 137, small.Pixel(x, y)[0] == 255)
                    << x << " " << y;
    QexFont_SetScale(1);
    // A letter with a mark is the letter, and the mark above it; the sheet of these is made once.
    const std::string before = LiveObjects();
    const Picture plain = Temporary(4, 60, "A e u"), marked = Temporary(4, 60, "\u00C4 \u00E9 \u00FC");
    const std::string after = LiveObjects();
    EXPECT_NE(before, after);
    EXPECT_FALSE(SamePicture(plain, marked));
    for (int y = 33; y < 44; ++y)
        for (int x = 0; x < 60; ++x) EXPECT_EQ(plain.Pixel(x, y), marked.Pixel(x, y)) << x << " " << y;
    EXPECT_EQ(IndexCounts([&] { Temporary(4, 60, "a\u00C4\u00C4b"); }), "4 10 4 ");
    EXPECT_EQ(LiveObjects(), after);
}

// Text that is added piece by piece does not move everything for each piece.
TEST_F(FontTest, GrowsWithSlack) {
    if (!kAllocationsAreCounted) GTEST_SKIP() << "allocations are not counted here";
    const Allocations made = CountAllocations([&] {
        for (int i = 0; i < 2000; ++i) Add(0, 40, "ten glyphs");
    });
    EXPECT_LT(made.made, 100);
}

TEST_F(FontTest, ProgramsComeAndGoWithoutTheFont) {
    ScopedTexture red({255, 0, 0, 255});
    const auto draw = [&] {
        return Drawn([&] { QexTexture_Draw(&runtime_, &red, 10, 10, nullptr, 8, 8, ~0u); });
    };
    const Picture whole = draw();
    ASSERT_EQ(whole.Pixel(12, 12), (Rgba{255, 0, 0, 255}));
    for (int round = 0; round < 2; ++round) {
        QexFont_ReleaseShader(1);
        Capture log(STDERR_FILENO);
        Add(0, 40, "text");
        EXPECT_TRUE(SamePicture(Drawn(QexFont_Draw), background_));
        EXPECT_TRUE(SamePicture(draw(), background_));
        EXPECT_EQ(log.Text(),
                  "E/Qex: <QexFont_Draw> the font's program was released: nothing is drawn before "
                  "QexFont_CreateShader\n");
        EXPECT_EQ(QexFont_CreateShader(), 0);
        EXPECT_TRUE(SamePicture(draw(), whole));
    }
}

}  // namespace
