// The lit modules on a patch so small that all of it is lit alike, against colours worked out by hand; and
// what every module binds and leaves behind.
#include <GLES2/gl2.h>

#include <algorithm>
#include <cstring>

#include "support/RenderScenes.h"

namespace {

// Where the patch lies in the world, moved by kExtra; the camera looks down on it from 40 above.
constexpr glm::vec3 kPatch = {30, 20, 5}, kExtra = {1, 2, 3};
const glm::vec3 kPlace = kPatch - kExtra;

// The shares of one to four bones, in 255ths.
constexpr std::array<uint8_t, 4> kWeights[] = {
    {255, 0, 0, 0}, {155, 100, 0, 0}, {100, 115, 40, 0}, {90, 40, 100, 25}};

// A quarter turn about Z, and scales that are uneven: in the world the normal is (0.6, 0, 0.8), the tangent
// (0.8, 0, -0.6) and the binormal (0, 1, 0).
pod::Scene PatchScene(uint32_t influences) {
    pod::MeshArrays arrays = Rectangle(8, 18, 12, 22);
    arrays.normals.assign(4, {0, -3, 8});
    arrays.tangents.assign(4, {0, -4, -6});
    arrays.binormals.assign(4, {3, 0, 0});
    if (influences) arrays.boneIndices.assign(4, {0, 1, 2, 3});
    if (influences) arrays.boneWeights.assign(4, kWeights[influences - 1]);
    const uint32_t type = influences < 3 ? pod::kUint8 : pod::kUint8Norm;
    const pod::Transform place = {
        {{kPlace.x + 20, kPlace.y - 10, kPlace.z}}, {{0, 0, 0.70711f, 0.70711f}}, {{1, 1, 2}}, {}};
    pod::Scene scene = SceneOf(
        influences ? SkinnedMesh(arrays, influences, type, {1, 2, 3, 4}) : pod::BuildMesh(arrays), place);
    pod::Material& material = scene.materials[0];
    material.ambient = {0.1f, 0.2f, 0.05f};
    material.diffuse = {0.5f, 0.8f, 1};
    material.specular = {0.5f, 0.5f, 0.5f};
    material.shininess = 2 / 256.0f;
    material.opacity = 0.8f;
    for (const char* bone : {"a", "b", "c", "d"}) scene.nodes.push_back(pod::BuildNode(bone, {}));
    return scene;
}

// Above the patch, behind it, at (0, 0.6, 0.8) from it, and along X.
QexLightSet Lights(uint32_t count) {
    return {count,
            {{QEX_LIGHT_POINT, {30, 20, 65}, {0.4f, 0, 0, 1}},
             {QEX_LIGHT_DIRECTIONAL, {1, 0, 0}, {0, 0, 0.5f, 1}},
             {QEX_LIGHT_POINT, {30, 50, 45}, {0, 0.5f, 0, 1}},
             {QEX_LIGHT_DIRECTIONAL, {-1, 0, 0}, {0.2f, 0, 0.4f, 1}}}};
}

class LitTest : public RenderTest {
  protected:
    // The colour of the patch under that many lights.
    Rgba Draw(uint32_t kind, uint32_t influences, uint32_t lightCount, float threshold,
              const QexShadowInfo* shadow = nullptr) {
        static const uint8_t kMapTexel[] = {182, 164, 237, 255};  // normal (2, 3, 6) / 7, as green, red, blue
        static QexTexture* s_map;
        ScopedTexture diffuse({204, 153, 255, 230}), white({255, 255, 255, 255}), map(1, 1, kMapTexel);
        s_map = &map;
        LoadedModel model(PatchScene(influences));
        EXPECT_EQ(model.log, "");
        // Each bone turns the patch about Z.
        for (uint32_t b = 0; influences && b < 4; ++b) {
            const float angle = glm::radians(std::array{0.0f, 60.0f, 120.0f, -60.0f}[b]);
            const glm::mat4 turn = glm::rotate(glm::translate(glm::mat4(1), kPlace), angle, {0, 0, 1});
            const QexMatrix bone = ToQex(glm::translate(turn, -kPlace));
            QexPODModel_SetNodeMatrix(&model.model.scene, 1 + b, &bone);
        }
        model.model.textures[0] = &diffuse;
        model.model.alphaTextures[0] = &white;
        model.model.bindTextureHook = [](QexModel*, uint32_t) { return QexTexture_Set(s_map, 1), 0; };
        model.Node().blendFlags = QEX_NODE_OPAQUE;
        QexShaderModule* module = QexShaders_CreateShaderProgram(kind);
        QexShaders_SetShaderAlphaThreshold(module, kind, threshold);
        if (kind == QEX_SHADER_GOURAUD_SHADOW_EXT) QexGouraudShadowExtShader_SetShadowFade(module, 1.5f);
        const QexLightSet lights = Lights(lightCount);
        const QexMatrix extra = ToQex(glm::translate(glm::mat4(1), kExtra));
        const QexMatrix view = ToQex(glm::translate(glm::mat4(1), -kPatch - glm::vec3(0, 0, 40)));
        const QexMatrix projection = ToQex(glm::ortho(-64.0f, 64.0f, -48.0f, 48.0f, -200.0f, 200.0f));
        QexRenderer_SetGlobalAlpha(0.5f);
        Clear();
        module->render(module, &model.model, 0, &lights, &extra, &view, &projection, shadow);
        QexRenderer_SetGlobalAlpha(1);
        EXPECT_EQ(model.Node().blendFlags, kind == QEX_SHADER_SKINNING_TEXTURE ? QEX_NODE_OPAQUE : 0u)
            << "an alpha texture takes the node of a lit module out of the opaque pass";
        model.model.textures[0] = model.model.alphaTextures[0] = nullptr;
        QexShaders_ReleaseShaderProgram(module, kind);
        return Read().Pixel(kWidth / 2, kHeight / 2);
    }
};

TEST_F(LitTest, EveryModuleFollowsItsFormula) {
    const Rgba texel = {204, 153, 255, 102};
    const struct {
        uint32_t kind, influences;
        Rgba lit, unlit = {20, 31, 13, 92};  // in four lights, and in none
    } cases[] = {
        // Of static modules and of QEX_SHADER_SKINNING_GOURAUD the fourth light is none.
        {QEX_SHADER_GOURAUD, 0, {53, 70, 13, 92}},
        {QEX_SHADER_GOURAUD_SPECULAR, 0, {86, 106, 14, 92}},
        {QEX_SHADER_GOURAUD_NORMALMAP, 0, {41, 71, 13, 92}},
        {QEX_SHADER_GOURAUD_SHADOW, 0, {53, 70, 13, 92}},
        {QEX_SHADER_GOURAUD_SHADOW_EXT, 0, {53, 70, 13, 92}},
        {QEX_SHADER_SKINNING_TEXTURE, 2, texel, texel},
        {QEX_SHADER_SKINNING_GOURAUD, 1, {53, 70, 13, 92}},
        {QEX_SHADER_SKINNING_GOURAUD, 2, {55, 79, 13, 92}},
        {QEX_SHADER_SKINNING_GOURAUD, 3, {56, 86, 13, 92}},
        {QEX_SHADER_SKINNING_GOURAUD, 4, {59, 87, 13, 92}},
        {QEX_SHADER_SKINNING_GOURAUD_SPECULAR, 2, {112, 108, 114, 92}},
        {QEX_SHADER_SKINNING_GOURAUD_NORMALMAP, 2, {52, 81, 60, 92}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(std::to_string(c.kind) + ", influences: " + std::to_string(c.influences));
        // The alpha is 0.4, times that of the texture.
        EXPECT_TRUE(Near(Draw(c.kind, c.influences, 4, 0.39f), c.lit, 2));
        EXPECT_TRUE(Near(Draw(c.kind, c.influences, 0, 0.39f), c.unlit, 2));
        EXPECT_EQ(Draw(c.kind, c.influences, 0, 0.41f)[3], 0);
    }
}

// A map of two by two depths; what it says of a place counts as far as the surface faces the light.
TEST_F(LitTest, ShadowsWhereTheMapHoldsSomethingNearer) {
    const uint8_t depths[] = {51, 51, 51, 255, 0, 0, 0, 255, 126, 126, 126, 255, 255, 255, 255, 255};
    ScopedTexture map(2, 2, depths);
    const QexVec3 towards = {0.3f, 0.5f, -1}, away = {0.2f, 0.1f, 1};
    const Rgba lit = {53, 70, 13, 92}, hard = {30, 42, 13, 92}, faded = {44, 59, 13, 92};
    const struct {
        glm::vec3 at;  // in the map
        QexVec3 direction;
        Rgba hard, fading;
    } cases[] = {
        {{0.25f, 0.25f, 0.5f}, towards, hard, faded}, {{0.25f, 0.25f, 0.5f}, away, lit, lit},
        {{0.25f, 0.25f, 0.15f}, towards, lit, lit},   {{0.75f, 0.25f, 0.9f}, towards, hard, lit},
        {{0.25f, 0.75f, 0.5f}, towards, lit, lit},  // as near as the bias
        {{0.75f, 0.75f, 1.2f}, towards, lit, lit},  // nothing in the map
        {{-0.1f, 0.25f, 0.5f}, towards, lit, lit},    {{1.1f, 0.25f, 0.5f}, towards, lit, lit},
        {{0.75f, -0.1f, 0.5f}, towards, lit, lit},    {{0.25f, 1.1f, 0.6f}, towards, lit, lit},
    };
    for (const auto& [at, direction, hardColour, fading] : cases) {
        // Over the world a depth of 0.01 and a width of 1 / 64 a unit.
        const glm::mat4 scale = glm::scale(glm::translate(glm::mat4(1), at), {1 / 64.0f, 1 / 64.0f, 0.01f});
        QexShadowInfo shadow = {};
        shadow.shadowSpaceMatrix = ToQex(glm::translate(scale, -kPatch));
        shadow.shadowTexture = map.glName;
        shadow.shadowIntensity = 0.3f;
        shadow.biasValue = 0.01f;
        shadow.lightDir = direction;
        EXPECT_TRUE(Near(Draw(QEX_SHADER_GOURAUD_SHADOW, 0, 4, 0, &shadow), hardColour, 2)) << at.x << at.y;
        EXPECT_TRUE(Near(Draw(QEX_SHADER_GOURAUD_SHADOW_EXT, 0, 4, 0, &shadow), fading, 2)) << at.x << at.y;
    }
}

// The names of the uniforms that a program has at those locations.
std::string Names(uint32_t program, const std::vector<int64_t>& locations) {
    std::string text;
    GLint count = 0, size;
    GLenum type;
    glGetProgramiv(program, GL_ACTIVE_UNIFORMS, &count);
    for (const int64_t location : locations)
        for (GLint i = 0; i < count; ++i) {
            char name[64];
            glGetActiveUniform(program, static_cast<GLuint>(i), sizeof name, nullptr, &size, &type, name);
            if (glGetUniformLocation(program, name) == location)
                text += std::string(name, std::strcspn(name, "[")) + " ";
        }
    return text;
}

const std::string kLights = "lightCount lightType lightPosDir lightColor sceneAmbient sceneDiffuse ";
const std::string kSpecular = "sceneSpecular shininess ", kAlpha = "opacity alphaThreshold ";
const std::string kMatrices = "transMatrix normalMatrix mvpMatrix ";
const std::string kBoneSlots = "viewProjMatrix boneCount boneMatrixArray boneVecMatrixArray ";

// The order of a module's slots, which applications read.
struct Order {
    QexShaderModule* (*create)();
    void (*release)(QexShaderModule**);
    bool skinned;
    std::string slots, textures = "03";  // units that are bound
};
#define MODULE(Name) Name##_CreateProgram, Name##_Release
const std::string kShadow = "shadowLightDir shadowSpaceMatrix biasValue shadowIntensity ";
const std::string kLit = kLights + kAlpha, kHighlight = "cameraPos " + kLights + kSpecular + kAlpha;
const std::string kSkinned = "boneCount boneMatrixArray viewProjMatrix " + kAlpha;
const Order kOrders[] = {
    {MODULE(QexGouraudShader), false, kMatrices + kLit},
    {MODULE(QexGouraudNormalMapShader), false, kMatrices + kLit, "013"},
    {MODULE(QexGouraudSpecularShader), false, kMatrices + kHighlight},
    {MODULE(QexGouraudShadowShader), false, kMatrices + kLit + kShadow, "023"},
    {MODULE(QexGouraudShadowExtShader), false, kMatrices + kLit + kShadow + "shadowFade ", "023"},
    {MODULE(QexTextureShader), false, "mvpMatrix " + kAlpha},
    {MODULE(QexTextureNoAlphaShader), false, "mvpMatrix " + kAlpha},
    {MODULE(QexSimpleShader), false, "mvpMatrix ", ""},
    {MODULE(QexSkinningTextureShader), true, kSkinned},
    {MODULE(QexSkinningTextureNoAlphaShader), true, kSkinned},
    {MODULE(QexSkinningGouraudShader), true, kBoneSlots + kLit},
    {MODULE(QexSkinningGouraudNormalMapShader), true, kBoneSlots + kLit, "013"},
    {MODULE(QexSkinningGouraudSpecularShader), true, kBoneSlots + kHighlight},
    {MODULE(QexUVDisplacementShader), false, "displacement mvpMatrix " + kAlpha},
    {MODULE(QexUVDisplacementNoAlphaShader), false, "displacement mvpMatrix " + kAlpha},
    {MODULE(QexDepthShader), false, "near far mvpMatrix "},
    {MODULE(QexSkinningDepthShader), true, "near far " + kSkinned},
};

void DrawNode(QexShaderModule* module, LoadedModel& model, uint32_t node = 0) {
    const QexLightSet lights = Lights(4);
    const QexShadowInfo shadow = {};
    module->render(module, &model.model, node, &lights, nullptr, &g_sMatIdentity, &g_sMatIdentity, &shadow);
}

TEST_F(LitTest, SlotsAndStateOfEveryModule) {
    for (const Order& order : kOrders) {
        LoadedModel model(PatchScene(order.skinned ? 2 : 0));
        QexShaderModule* module = order.create();
        SCOPED_TRACE(order.slots);
        std::vector<int64_t> slots;
        const auto slotCount = std::count(order.slots.begin(), order.slots.end(), ' ');
        for (long i = 0; i < slotCount; ++i) slots.push_back(module->slots[i].location);
        EXPECT_EQ(Names(module->program, slots), order.slots);
        for (const GLenum unit : {3, 2, 1, 0}) {
            QexRenderState_ActiveTexture(GL_TEXTURE0 + unit);
            glBindTexture(GL_TEXTURE_2D, 0);
        }
        QexRenderState_UseProgram(0);
        const std::string change = StateChange([&] { DrawNode(module, model); });
        EXPECT_EQ(change.find("program: 0 -> " + std::to_string(module->program) + "\n"), 0u);
        for (const char unit : std::string("0123"))
            EXPECT_EQ(change.find(std::string("texture2D[") + unit) != std::string::npos,
                      order.textures.find(unit) != std::string::npos)
                << unit;
        const size_t lines = 1 + order.textures.size() + (change.find("activeUnit") != std::string::npos);
        EXPECT_EQ(size_t(std::count(change.begin(), change.end(), '\n')), lines) << change;
        // No mesh node, and one that is hidden.
        model.Node().stateFlags &= ~QEX_NODE_RENDERING_ENABLED;
        for (const uint32_t node : {0u, 1u, 7u})
            EXPECT_EQ(GLCalls([&] { DrawNode(module, model, node); }).Size(), 0u);
        order.release(&module);
        order.release(&module);
    }
}

class SteadyModuleTest : public NullRenderTest {};

TEST_F(SteadyModuleTest, NoModuleAllocatesOrCreates) {
    for (const Order& order : kOrders) {
        LoadedModel model(PatchScene(order.skinned ? 2 : 0));
        QexShaderModule* module = order.create();
        const std::string live = LiveObjects();
        gltapResetCounts();
        EXPECT_EQ(CountAllocations([&] { DrawNode(module, model); }).made, 0) << order.slots;
        EXPECT_EQ(gltapCount("glDrawElements"), 1u) << order.slots;
        EXPECT_EQ(LiveObjects(), live) << order.slots;
        order.release(&module);
    }
}

TEST_F(LitTest, DepthOfFlatTriangles) {
    for (const bool skinned : {false, true}) {
        LoadedModel model(PatchScene(skinned ? 2 : 0));
        QexShaderModule* module =
            skinned ? QexSkinningDepthShader_CreateProgram() : QexDepthShader_CreateProgram();
        QexRenderState_UseProgram(module->program);
        (skinned ? QexSkinningDepthShader_SetParameters : QexDepthShader_SetParameters)(module, 0.1f, 0.9f);
        // Every vertex at that depth of clip space.
        const auto draw = [&](float z) {
            glm::mat4 projection = glm::ortho(0.0f, float{kWidth}, 0.0f, float{kHeight}, -1.0f, 1.0f);
            for (int c = 0; c < 4; ++c) projection[c][2] = c == 3 ? z : 0;
            const QexMatrix matrix = ToQex(projection);
            Clear(1, 1, 1, 0.25f);
            module->render(module, &model.model, 0, nullptr, nullptr, &g_sMatIdentity, &matrix, nullptr);
            return Read().Pixel(int(kPlace.x), kHeight - 1 - int(kPlace.y));
        };
        for (const auto& [z, grey] : {std::pair{0.05f, 0}, {1.0f, 255}, {0.4f, 128}, {0.2f, 64}})
            EXPECT_TRUE(Near(draw(z), {grey, grey, grey, 255}, 1)) << z;
        // What the threshold cuts off is clear, the rest is opaque, whatever its opacity.
        for (const auto& [opacity, alpha] : {std::pair{0.8f, 255}, {0.4f, skinned ? 0 : 255}}) {
            model.Material().opacity = opacity;
            EXPECT_EQ(draw(0)[3], alpha) << opacity;
        }
        (skinned ? QexSkinningDepthShader_Release : QexDepthShader_Release)(&module);
    }
}

}  // namespace
