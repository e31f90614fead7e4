#include <cmath>

#include "support/LoaderSupport.h"

namespace {

using BuiltInTextures = LoaderTest;

TEST_F(BuiltInTextures, AreMadeOnceOfTwelveLevels) {
    ASSERT_EQ(QexTexture_IsETCSupported(), 1);
    std::string log;
    const Recorded calls([&] {
        BothOutputs outputs;
        QexTexture_CreateDefault();
        QexTexture_CreateDefault();
        log = outputs.Errors();
    });
    EXPECT_EQ(
        log,
        "I/Qex: <QexTexture_CreateDefault> Created.\nI/Qex: <QexTexture_CreateDefault> Already created.\n");
    // Twelve levels, that are drawn with the other textures.
    EXPECT_EQ(calls.Of({"glCompressedTexImage2D"}).size(), 12u);
    EXPECT_EQ(calls.Parameter(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER), GLenum(GL_LINEAR_MIPMAP_NEAREST));
    EXPECT_EQ(calls.Parameter(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S), GLenum(GL_REPEAT));
    EXPECT_EQ(LiveTextures(), 2u);

    QexTexture_ReleaseDefault();
    QexTexture_ReleaseDefault();
    EXPECT_EQ(LiveTextures(), 0u);
    EXPECT_EQ(Qextexture_GetDefault()->glName, 0u);
}

TEST_F(BuiltInTextures, TheNormalisationCubeMapHoldsDirections) {
    QexTexture texture = {};
    // Texel (i, j) of a face looks along GL's direction for its middle.
    const int size = 4;
    const Recorded four([&] { QexTexture_GenerateNormalisationCubeMap(&texture, size); });
    const auto uploads = four.Uploads();
    for (uint32_t face = 0; face < 6; ++face)
        for (int j = 0; j < size; ++j)
            for (int i = 0; i < size; ++i) {
                const double s = (i + 0.5) / size * 2 - 1, t = (j + 0.5) / size * 2 - 1;
                const double directions[6][3] = {{1, -t, -s}, {-1, -t, s}, {s, 1, t},
                                                 {s, -1, -t}, {s, -t, 1},  {-s, -t, -1}};
                const double length = std::sqrt(1 + s * s + t * t);
                const uint8_t* texel = &uploads[face].data[static_cast<size_t>(3 * (size * j + i))];
                for (int c = 0; c < 3; ++c)
                    EXPECT_NEAR(texel[c], std::max(0.0, std::floor(directions[face][c] / length * 255)), 1)
                        << face << " " << i << " " << j;
            }
    EXPECT_EQ(texture.flags, QEX_TEXFLAG_CUBEMAP);
    EXPECT_EQ(four.Parameter(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_WRAP_T), GLenum(GL_CLAMP_TO_EDGE));
    QexTexture_Release(&texture);
}

}  // namespace
