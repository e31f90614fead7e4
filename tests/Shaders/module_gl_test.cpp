// The texture modules: alpha, textures, and every way in which a mesh may be laid out.
#include "support/RenderScenes.h"

namespace {

struct ModuleTest : RenderTest {
    void SetUp() override {
        RenderTest::SetUp();
        texture = QexShaders_CreateShaderProgram(QEX_SHADER_TEXTURE);
        noAlpha = QexShaders_CreateShaderProgram(QEX_SHADER_TEXTURE_NOALPHA);
        EXPECT_EQ(QexShaders_CreateShaderProgram(~0u), nullptr);
        simple = QexSimpleShader_CreateProgram();
    }
    void TearDown() override {
        QexShaders_ReleaseShaderProgram(texture, QEX_SHADER_TEXTURE);
        QexShaders_ReleaseShaderProgram(noAlpha, QEX_SHADER_TEXTURE_NOALPHA);
        QexSimpleShader_Release(&simple);
        RenderTest::TearDown();
    }

    QexShaderModule *texture, *noAlpha, *simple;
};

pod::Mesh Quad() {
    return pod::BuildMesh(Rectangle(16, 16, 80, 64));
}

// The fragment is always written; alpha is opacity times its source where that lies above the threshold.
TEST_F(ModuleTest, AlphaRuleAndPassOfTheNode) {
    ScopedTexture red({153, 255, 255, 0}), diffuse({10, 20, 30, 153});
    LoadedModel model(SceneOf(Quad()));
    model.model.textures[0] = &diffuse;
    const struct {
        QexShaderModule* module;
        QexTexture* alpha;
        float opacity, threshold;
        int expected;
        bool opaque;
    } cases[] = {
        {texture, &red, 1, 0.5f, 153, false},   {texture, &red, 1, 0.6f, 0, false},
        {texture, &red, 0.5f, 0.5f, 0, false},  {texture, &red, 0.5f, 0.25f, 77, false},
        {texture, nullptr, 1, 0.5f, 255, true}, {texture, nullptr, 0.5f, 0.5f, 0, true},
        {noAlpha, &red, 1, 0.5f, 153, true},    {noAlpha, nullptr, 1, 0.6f, 0, true},
        {simple, &red, 0.5f, 0, 255, true},
    };
    QexRenderer_SetGlobalAlpha(0.5f);
    for (const auto& c : cases) {
        model.model.alphaTextures[0] = c.alpha;
        model.Material().opacity = 2 * c.opacity;
        model.Node().blendFlags = QEX_NODE_OPAQUE;
        if (c.module == texture) QexTextureShader_SetAlphaThreshold(texture, c.threshold);
        if (c.module == noAlpha) QexTextureNoAlphaShader_SetAlphaThreshold(noAlpha, c.threshold);
        Clear(1, 1, 0, 0.2f);
        model.DrawNode(c.module);
        const Rgba colour = c.module == simple ? Rgba{255, 255, 255, 255} : Rgba{10, 20, 30, c.expected};
        EXPECT_TRUE(Near(Read().Pixel(50, 50), colour, 1)) << c.opacity << " " << c.threshold;
        EXPECT_EQ(model.Node().blendFlags, c.opaque ? QEX_NODE_OPAQUE : 0u);
    }
    QexRenderer_SetGlobalAlpha(1);
}

// By half a picture.
TEST_F(ModuleTest, TexelsAreDisplaced) {
    const uint8_t texels[] = {255, 0, 0, 255, 0, 255, 0, 100};
    ScopedTexture twoColours(2, 1, texels);
    QexTexture_SetWrapping(&twoColours, QEX_WRAP_REPEAT);
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(0, 0, 128, 96))));
    model.model.textures[0] = &twoColours;
    static int hooked;
    model.model.bindTextureHook = [](QexModel*, uint32_t) { return ++hooked, 0; };
    for (const bool withAlpha : {true, false}) {
#define EITHER(name) (withAlpha ? QexUVDisplacementShader_##name : QexUVDisplacementNoAlphaShader_##name)
        QexShaderModule* module = EITHER(CreateProgram)();
        EITHER(SetDisplacement)(module, 0.5f, 0.25f);
        hooked = 0;
        model.DrawNode(module);
        EXPECT_EQ(hooked, 1);
        EXPECT_EQ(Read().Pixel(20, 40), (Rgba{0, 255, 0, withAlpha ? 255 : 0}));
        EXPECT_EQ(Read().Pixel(100, 40), (Rgba{255, 0, 0, 255}));
        float u = 0, v = 0;
        EITHER(GetDisplacement)(module, &u, &v);
        EXPECT_EQ(u, 0.5f);
        EXPECT_EQ(v, 0.25f);
        EITHER(Release)(&module);
    }
    model.model.textures[0] = nullptr;
}

TEST_F(ModuleTest, HookMaterialAndMissingTextures) {
    // What the first set-up made is gone; the end of each test finds what is left.
    EXPECT_EQ(QexTextureShader_SetupProgram(texture), 0);
    const Rgba white = {255, 255, 255, 255}, isBlue = {0, 0, 255, 255}, isGreen = {0, 255, 0, 255};
    const Rgba asBefore = {9, 9, 9, 255};
    ScopedTexture blue(isBlue), green(isGreen), grey(asBefore);
    LoadedModel model(SceneOf(Quad()));
    static QexTexture* s_bound;
    static int32_t s_result;
    s_bound = &green;
    const QexBindTextureHook hook = [](QexModel*, uint32_t) { return QexTexture_Set(s_bound, 0), s_result; };
    const struct {
        QexShaderModule* module;
        QexBindTextureHook hook;
        int32_t hookResult, material;
        QexTexture* diffuse;
        Rgba expected;
    } cases[] = {
        {texture, nullptr, 0, 0, &blue, isBlue},    {texture, nullptr, 0, 0, nullptr, white},
        {texture, nullptr, 0, -1, &blue, white},    {texture, hook, 1, 0, &blue, isGreen},
        {texture, hook, 0, 0, &blue, isBlue},       {texture, hook, 1, -1, &blue, isGreen},
        {noAlpha, hook, 1, 0, &blue, isGreen},      {noAlpha, hook, 0, 0, &blue, isBlue},
        {noAlpha, nullptr, 0, -1, &blue, asBefore},
    };
    for (const auto& c : cases) {
        QexTexture_Set(&grey, 0);
        s_result = c.hookResult;
        model.model.bindTextureHook = c.hook;
        model.model.textures[0] = c.diffuse;
        model.Node().materialIndex = c.material;
        model.DrawNode(c.module);
        EXPECT_EQ(Read().Pixel(50, 50), c.expected) << c.hookResult << " " << c.material;
    }
}

TEST_F(ModuleTest, StripsWithAndWithoutIndices) {
    // Strips of two and three triangles over 4 + 5 vertices.
    pod::MeshArrays arrays;
    arrays.positions.resize(9);
    pod::Mesh mesh = pod::BuildMesh(arrays);
    mesh.faceCount = 5;
    mesh.stripLengths = {2, 3};
    for (const bool indexed : {false, true}) {
        mesh.faces = indexed ? pod::IndexElement({0, 1, 2, 3, 4, 5, 6, 7, 8}) : pod::Element();
        LoadedModel model(SceneOf(mesh));
        EXPECT_EQ(GLCalls([&] { model.Draw(); }).Text({"glDrawArrays", "glDrawElements"}),
                  indexed ? "glDrawElements(GL_TRIANGLE_STRIP, 4, GL_UNSIGNED_SHORT, NULL)\n"
                            "glDrawElements(GL_TRIANGLE_STRIP, 5, GL_UNSIGNED_SHORT, 0x8)\n"
                          : "glDrawArrays(GL_TRIANGLE_STRIP, 0, 4)\nglDrawArrays(GL_TRIANGLE_STRIP, 4, 5)\n");
    }
}

// A 2 x 2 texture over a rectangle of whole numbers: the same picture whatever the vertices are made of.
TEST_F(ModuleTest, EveryVertexLayoutDrawsTheSamePicture) {
    const uint8_t texels[] = {255, 0, 0, 255, 0, 255, 0, 255, 0, 0, 255, 255, 255, 255, 0, 255};
    ScopedTexture fourColours(2, 2, texels);
    const pod::Mesh plain = Quad();
    const auto apart = [&](uint32_t positionType, uint32_t uvType, double one) {
        pod::Mesh mesh = plain;
        mesh.interleaved = false;
        mesh.vertexBlock.clear();
        mesh.vertices = IntegerElement(positionType, 3, {16, 16, 0, 80, 16, 0, 16, 64, 0, 80, 64, 0});
        mesh.uvw = {IntegerElement(uvType, 2, {0, 0, one, 0, 0, one, one, one})};
        return mesh;
    };
    // Positions in halves, moved and doubled by the unpack matrix.
    pod::Mesh unpacked = apart(pod::kInt8, pod::kInt16, 1);
    unpacked.vertices = IntegerElement(pod::kInt8, 3, {-20, 3, 0, 12, 3, 0, -20, 27, 0, 12, 27, 0});
    unpacked.unpackMatrix = {2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 2, 0, 56, 10, 0, 1};
    pod::MeshArrays corners = Rectangle(16, 16, 80, 64), repeated;
    for (const uint32_t v : corners.indices) {
        repeated.positions.push_back(corners.positions[v]);
        repeated.uvs.push_back(corners.uvs[v]);
    }
    pod::Mesh unindexed = pod::BuildMesh(repeated);
    unindexed.faceCount = 2;
    const struct {
        const char* name;
        pod::Mesh mesh;
    } layouts[] = {
        {"interleaved floats", plain},
        {"int16 positions, int16 uvs", apart(pod::kInt16, pod::kInt16, 1)},
        {"int8 positions, uint8 norm uvs", apart(pod::kInt8, pod::kUint8Norm, 255)},
        {"uint8 positions, int8 norm uvs", apart(pod::kUint8, pod::kInt8Norm, 127)},
        {"uint16 positions, int16 norm uvs", apart(pod::kUint16, pod::kInt16Norm, 32767)},
        {"int32 positions, uint16 norm uvs", apart(pod::kInt32, pod::kUint16Norm, 65535)},
        {"fixed uvs", apart(pod::kInt16, pod::kFixed16_16, 65536)},
        {"int32 uvs", apart(pod::kInt16, pod::kInt32, 1)},
        {"unpack matrix", unpacked},
        {"no indices", unindexed},
        {"32-bit indices", pod::BuildMesh(corners, true)},
    };
    const auto draw = [&](const pod::Mesh& mesh) {
        LoadedModel model(SceneOf(mesh));
        model.model.textures[0] = &fourColours;
        Clear();
        model.Draw();
        return Read();
    };
    Picture expected, red;
    expected.Fill(16, kHeight - 64, 48, kHeight - 40, {0, 0, 255, 255});
    expected.Fill(48, kHeight - 64, 80, kHeight - 40, {255, 255, 0, 255});
    expected.Fill(16, kHeight - 40, 48, kHeight - 16, {255, 0, 0, 255});
    expected.Fill(48, kHeight - 40, 80, kHeight - 16, {0, 255, 0, 255});
    for (const auto& layout : layouts) EXPECT_TRUE(SamePicture(draw(layout.mesh), expected)) << layout.name;
    // Without coordinates every fragment takes the texel at (0, 0).
    corners.uvs.clear();
    red.Fill(16, kHeight - 64, 80, kHeight - 16, {255, 0, 0, 255});
    EXPECT_TRUE(SamePicture(draw(pod::BuildMesh(corners)), red));
}

}  // namespace
