// The lit modules against their formulas: a triangle with its own normals, drawn and evaluated on the CPU;
// and what every module binds and leaves behind.
#include <GLES2/gl2.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <glm/gtc/quaternion.hpp>

#include "support/RenderScenes.h"

namespace {

constexpr glm::vec3 kCamera = {64, 48, 40};
const glm::vec4 kTexel = glm::vec4(200, 180, 220, 230) / 255.0f;
constexpr uint8_t kMapTexel[] = {150, 100, 220, 255};

// Influence i of corner c is bone (c + i) mod 4; weights are in 255ths, and the last influence that is kept
// takes what the others leave.
struct Corner {
    glm::vec3 position, normal, tangent, binormal;
    std::array<uint8_t, 4> bones;
    int weights[3];
};
const Corner kCorners[] = {
    {{-54, -38, 0}, {0.3f, 0.1f, 1}, {1, 0, -0.3f}, {0, 1, 0.1f}, {0, 1, 2, 3}, {60, 50, 40}},
    {{56, -30, 6}, {-0.4f, 0.2f, 1}, {1, 0.2f, 0.3f}, {0.1f, 1, 0}, {1, 2, 3, 0}, {40, 60, 50}},
    {{-20, 40, -8}, {0.1f, -0.6f, 1}, {1, 0, 0}, {0, 1, 0.5f}, {2, 3, 0, 1}, {30, 70, 55}}};

std::array<uint8_t, 4> Weights(const Corner& c, uint32_t influences) {
    std::array<uint8_t, 4> weights = {};
    int rest = 255;
    for (uint32_t i = 0; i < influences; ++i) {
        const int weight = i + 1 < influences ? c.weights[i] : rest;
        weights[i] = static_cast<uint8_t>(weight);
        rest -= weight;
    }
    return weights;
}

// Influences of a vertex, none for meshes that stand still, and the type of their weights.
using Skin = std::pair<uint32_t, uint32_t>;

// Two point lights, two directional ones.
QexLightSet Lights(uint32_t count) {
    QexLightSet set = {};
    set.count = count;
    const QexLight lights[] = {{0, {40, 60, 30}, {0.6f, 0.5f, 0.3f, 1}},
                               {1, {0.3f, -0.2f, -1}, {0.2f, 0.3f, 0.5f, 1}},
                               {0, {110, 10, 25}, {0.3f, 0, 0.2f, 1}},
                               {1, {-1, 1, -0.5f}, {0.1f, 0.4f, 0.1f, 1}}};
    std::copy(lights, lights + 4, set.lights);
    return set;
}

enum Shadow { kNone, kHard, kFading };

struct Kind {
    uint32_t kind;
    bool skinned;
    size_t lights;
    bool specular, normalMap;
    Shadow shadow;
    bool lit = true;  // unlit ones keep the node's pass, too
};
const Kind kKinds[] = {{QEX_SHADER_GOURAUD, false, 3, false, false, kNone},
                       {QEX_SHADER_GOURAUD_SPECULAR, false, 3, true, false, kNone},
                       {QEX_SHADER_GOURAUD_NORMALMAP, false, 3, false, true, kNone},
                       {QEX_SHADER_GOURAUD_SHADOW, false, 3, false, false, kHard},
                       {QEX_SHADER_GOURAUD_SHADOW_EXT, false, 3, false, false, kFading},
                       {QEX_SHADER_SKINNING_TEXTURE, true, 0, false, false, kNone, false},
                       {QEX_SHADER_SKINNING_GOURAUD, true, 3, false, false, kNone},
                       {QEX_SHADER_SKINNING_GOURAUD_SPECULAR, true, 4, true, false, kNone},
                       {QEX_SHADER_SKINNING_GOURAUD_NORMALMAP, true, 4, false, true, kNone}};

pod::Scene TriangleScene(Skin skin) {
    pod::MeshArrays arrays;
    const auto store = [](std::vector<pod::Vec3>* out, glm::vec3 v) { out->push_back({v.x, v.y, v.z}); };
    for (const Corner& c : kCorners) {
        store(&arrays.positions, c.position);
        store(&arrays.normals, c.normal);
        store(&arrays.tangents, c.tangent);
        store(&arrays.binormals, c.binormal);
        arrays.uvs.push_back({0.5f, 0.5f});
        if (!skin.first) continue;
        arrays.boneIndices.push_back(c.bones);
        arrays.boneWeights.push_back(Weights(c, skin.first));
    }
    arrays.indices = {0, 1, 2};
    const pod::Mesh mesh =
        skin.first ? SkinnedMesh(arrays, skin.first, skin.second, {1, 2, 3, 4}) : pod::BuildMesh(arrays);
    // A turn by 0.3 about Z, then the place; the scale is uneven, so that normals need their own matrix.
    pod::Scene scene = SceneOf(mesh, {{{60, 46, 2}}, {{0, 0, 0.14944f, 0.98877f}}, {{0.9f, 1.1f, 2}}, {}});
    pod::Material& material = scene.materials[0];
    material.ambient = {0.1f, 0.2f, 0.05f};
    material.diffuse = {0.7f, 0.8f, 0.9f};
    material.specular = {0.4f, 0.5f, 0.3f};
    material.shininess = 0.05f;
    material.opacity = 0.8f;
    for (const char* bone : {"a", "b", "c", "d"}) scene.nodes.push_back(pod::BuildNode(bone, {}));
    return scene;
}

glm::mat4 NodeMatrix() {
    const glm::quat turn(0.98877f, 0, 0, 0.14944f);
    return glm::translate(glm::mat4(1), {60, 46, 2}) * glm::mat4_cast(turn) *
           glm::scale(glm::mat4(1), {0.9f, 1.1f, 2});
}

const glm::mat4 kExtra = glm::rotate(glm::translate(glm::mat4(1), {1, -2, 3}), 0.05f, {0, 0, 1});
const glm::mat4 kBones[] = {
    glm::rotate(glm::translate(glm::mat4(1), {2, 1, 0}), 0.1f, {0, 0, 1}),
    glm::scale(glm::rotate(glm::translate(glm::mat4(1), {3, 4, 1}), -0.12f, {1, 1, 0}), {1, 0.9f, 1}),
    glm::rotate(glm::translate(glm::mat4(1), {-6, 2, 1}), 0.5f, {1, 0, 0}),
    glm::rotate(glm::translate(glm::mat4(1), {1, -5, 0}), -0.6f, {0, 1, 1})};

// World to shadow map: x from 20 to 100, y from 5 to 80; depth rises along both.
const glm::mat4 kShadowSpace = {
    {1 / 80.0f, 0, 0.003f, 0}, {0, 1 / 75.0f, 0.004f, 0}, {0, 0, 0.002f, 0}, {-0.25f, -1 / 15.0f, 0.2f, 1}};
constexpr int kMap = 4;
const uint8_t kMapDepths[kMap * kMap] = {255, 60,  200, 10,  120, 0,   255, 90,
                                         30,  150, 80,  140, 254, 100, 20,  60};

// What the vertex stage hands on; kLight and kHalf are the first of four.
// clang-format off
enum { kWorld, kNormal, kTangent, kBinormal, kDiffuse, kShadowAt, kFacing, kLight, kHalf = kLight + 4, kCount = kHalf + 4 };
// clang-format on
using Varyings = std::array<glm::vec3, kCount>;

glm::vec3 Towards(const QexLight& light, glm::vec3 point) {
    const glm::vec3 v = glm::make_vec3(light.vector);
    return glm::normalize(light.type == 0 ? v - point : -v);
}
glm::vec3 Colour(const QexLight& light) {
    return glm::make_vec3(light.colour);
}

struct Setting {
    Kind kind;
    uint32_t influences;
    QexLightSet lights;
    glm::vec3 shadowDirection;
    const QexPODMaterial* material;
    float alpha;  // as it should come out, before the texture's

    size_t Used() const { return std::min<size_t>(lights.count, kind.lights); }

    Varyings Vertex(const Corner& c) const {
        Varyings v = {};
        for (uint32_t i = 0; i < std::max(influences, 1u); ++i) {
            const glm::mat4 m = kExtra * (influences ? kBones[c.bones[i]] : glm::mat4(1)) * NodeMatrix();
            const glm::mat3 n = glm::transpose(glm::inverse(glm::mat3(m)));
            const float weight = influences ? Weights(c, influences)[i] / 255.0f : 1;
            v[kWorld] += glm::vec3(m * glm::vec4(c.position, 1) * weight);
            v[kNormal] += n * c.normal * weight;
            v[kTangent] += n * c.tangent * weight;
            v[kBinormal] += n * c.binormal * weight;
        }
        for (const int i : {kNormal, kTangent, kBinormal}) v[i] = glm::normalize(v[i]);
        for (size_t i = 0; i < Used(); ++i) {
            const glm::vec3 light = Towards(lights.lights[i], v[kWorld]);
            v[kLight + i] = light;
            v[kHalf + i] = glm::normalize(glm::normalize(kCamera - v[kWorld]) + light);
            v[kDiffuse] += glm::clamp(glm::dot(v[kNormal], light), 0.0f, 1.0f) * Colour(lights.lights[i]);
        }
        // The shadow matrix is applied to the world position of the vertex.
        v[kShadowAt] = glm::vec3(kShadowSpace * glm::vec4(v[kWorld], 1)) - glm::vec3(0, 0, 0.01f);
        v[kFacing].x = glm::dot(v[kNormal], glm::normalize(-shadowDirection));
        return v;
    }

    // The brightness of the shadow there; negative where rounding decides.
    float ShadowAt(const Varyings& v) const {
        const float facing = v[kFacing].x, z = v[kShadowAt].z;
        const glm::vec2 texel = glm::vec2(v[kShadowAt]) * float{kMap};
        const glm::vec2 edge = glm::abs(texel - glm::round(texel));
        if (std::min(edge.x, edge.y) < 0.05f || std::abs(facing) < 0.01f) return -1;
        if (texel.x < 0 || texel.y < 0 || texel.x > kMap || texel.y > kMap || facing <= 0) return 1;
        const float depth = kMapDepths[int(texel.y) * kMap + int(texel.x)] / 255.0f;
        if (std::abs(depth - z) < 0.01f) return -1;
        if (depth >= 1 || depth >= z) return 1;
        return kind.shadow == kHard ? 0.3f : glm::clamp(0.3f + (z - depth) * 1.5f, 0.0f, 1.0f);
    }

    glm::vec4 Fragment(const Varyings& v, float shadow) const {
        if (!kind.lit) return glm::vec4(glm::vec3(kTexel), alpha);
        const glm::vec3 map = glm::vec3(kMapTexel[1], kMapTexel[0], kMapTexel[2]) / 255.0f;
        const glm::vec3 n =
            glm::mat3(v[kTangent], v[kBinormal], v[kNormal]) * glm::normalize((map - 0.5f) * 2.0f);
        glm::vec3 diffuse(0), highlight(0);
        for (size_t i = 0; i < Used(); ++i) {
            diffuse += glm::clamp(glm::dot(n, v[kLight + i]), 0.0f, 1.0f) * Colour(lights.lights[i]);
            const float cosine = glm::clamp(glm::dot(v[kNormal], v[kHalf + i]), 0.0f, 1.0f);
            highlight += std::pow(cosine, material->shininess * 256) * Colour(lights.lights[i]);
        }
        if (!kind.normalMap) diffuse = v[kDiffuse];
        highlight *= kind.specular ? glm::make_vec3(material->specular) : glm::vec3(0);
        const glm::vec3 lit =
            shadow * glm::make_vec3(material->diffuse) * diffuse + glm::make_vec3(material->ambient);
        if (kind.skinned) return kTexel * glm::vec4(lit + highlight, alpha);
        return kTexel * glm::vec4(lit, alpha) + glm::vec4(highlight, 0);
    }
};

QexTexture* g_normalMap;
int32_t BindNormalMap(QexModel*, uint32_t) {
    QexTexture_Set(g_normalMap, 1);
    return 0;
}

class LitTest : public RenderTest {
  protected:
    // Draws the triangle and compares a pixel in every few, where rounding does not decide.
    void ExpectAsComputed(LoadedModel& model, QexShaderModule* module, const Setting& setting,
                          const QexShadowInfo* shadow) {
        const QexMatrix extra = ToQex(kExtra), view = ToQex(glm::translate(glm::mat4(1), -kCamera));
        const QexMatrix projection = ToQex(glm::ortho(-64.0f, 64.0f, -48.0f, 48.0f, -200.0f, 200.0f));
        Clear();
        module->render(module, &model.model, 0, &setting.lights, &extra, &view, &projection, shadow);
        const Picture picture = Read();
        Varyings v[3];
        glm::mat3 fromBarycentric(1);
        for (int c = 0; c < 3; ++c) {
            v[c] = setting.Vertex(kCorners[c]);
            // The view only moves the camera back.
            fromBarycentric[c] = glm::vec3(v[c][kWorld].x, v[c][kWorld].y, 1);
        }
        const glm::mat3 toBarycentric = glm::inverse(fromBarycentric);
        int compared = 0;
        for (int y = 2; y < kHeight; y += 3)
            for (int x = 1; x < kWidth; x += 3) {
                const glm::vec3 b = toBarycentric * glm::vec3(float(x) + 0.5f, float(kHeight - y) - 0.5f, 1);
                if (std::min({b.x, b.y, b.z}) < 0.01f) continue;
                Varyings at;
                for (size_t i = 0; i < kCount; ++i) at[i] = b.x * v[0][i] + b.y * v[1][i] + b.z * v[2][i];
                const float shade = setting.kind.shadow == kNone || !shadow ? 1 : setting.ShadowAt(at);
                if (shade < 0) continue;
                const glm::vec4 c = glm::clamp(setting.Fragment(at, shade), 0.0f, 1.0f) * 255.0f + 0.5f;
                EXPECT_TRUE(Near(picture.Pixel(x, y), {int(c.x), int(c.y), int(c.z), int(c.w)}, 2))
                    << "kind " << setting.kind.kind << ", " << setting.influences << " influences, "
                    << setting.lights.count << " lights at " << x << " " << y;
                ++compared;
            }
        EXPECT_GT(compared, 100);
    }
};

TEST_F(LitTest, EveryModuleFollowsItsFormula) {
    ScopedTexture diffuse({200, 180, 220, 230}), white({255, 255, 255, 255}), map(1, 1, kMapTexel);
    std::vector<uint8_t> depths;
    for (const uint8_t d : kMapDepths) depths.insert(depths.end(), {d, d, d, 255});
    ScopedTexture shadowMap(kMap, kMap, depths.data());
    QexShadowInfo shadow = {};
    shadow.shadowSpaceMatrix = ToQex(kShadowSpace);
    shadow.shadowTexture = shadowMap.glName;
    shadow.shadowIntensity = 0.3f;
    shadow.biasValue = 0.01f;
    g_normalMap = &map;
    const auto draw = [&](const Kind& kind, Skin skin) {
        LoadedModel model(TriangleScene(skin));
        ASSERT_EQ(model.log, "");
        for (uint32_t b = 0; skin.first && b < 4; ++b) {
            const QexMatrix bone = ToQex(kBones[b]);
            QexPODModel_SetNodeMatrix(&model.model.scene, 1 + b, &bone);
        }
        const QexPODMaterial& material = model.Material();
        model.model.textures[0] = &diffuse;
        model.model.alphaTextures[0] = &white;
        if (kind.normalMap) model.model.bindTextureHook = BindNormalMap;
        QexShaderModule* module = QexShaders_CreateShaderProgram(kind.kind);
        if (kind.shadow == kFading) QexGouraudShadowExtShader_SetShadowFade(module, 1.5f);
        for (uint32_t lights = 0; lights <= 4; ++lights) {
            // The alpha is 0.4: above, at and below the threshold.
            const float threshold = lights == 1 ? 0.8f * 0.5f : lights == 2 ? 0.41f : 0.39f;
            QexShaders_SetShaderAlphaThreshold(module, kind.kind, threshold);
            const glm::vec3 direction = lights == 4 ? glm::vec3(0.2f, 0.1f, 1) : glm::vec3(0.3f, 0.5f, -1);
            shadow.lightDir = {direction.x, direction.y, direction.z};
            const float alpha = lights == 1 || lights == 2 ? 0 : 0.4f;
            const Setting setting = {kind, skin.first, Lights(lights), direction, &material, alpha};
            model.Node().blendFlags = QEX_NODE_OPAQUE;
            ExpectAsComputed(model, module, setting, &shadow);
            EXPECT_EQ(model.Node().blendFlags, kind.lit ? 0u : QEX_NODE_OPAQUE)
                << "an alpha texture takes the node of a lit module out of the opaque pass";
            if (kind.shadow != kNone && lights == 3) ExpectAsComputed(model, module, setting, nullptr);
        }
        model.model.textures[0] = model.model.alphaTextures[0] = nullptr;
        QexShaders_ReleaseShaderProgram(module, kind.kind);
    };
    QexRenderer_SetGlobalAlpha(0.5f);
    for (const Kind& kind : kKinds)
        for (const Skin& skin : {Skin(0, 0), Skin(1, pod::kUint8), Skin(2, pod::kUint8),
                                 Skin(3, pod::kUint8Norm), Skin(4, pod::kUint8Norm)})
            if (kind.skinned == (skin.first > 0)) draw(kind, skin);
    QexRenderer_SetGlobalAlpha(1);
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

const Skin kNoSkin = {0, 0}, kTwoBones = {2, pod::kUint8Norm};

TEST_F(LitTest, SlotsAndStateOfEveryModule) {
    const QexLightSet lights = Lights(2);
    const QexShadowInfo shadow = {};
    for (const Order& order : kOrders) {
        LoadedModel model(TriangleScene(order.skinned ? kTwoBones : kNoSkin));
        QexShaderModule* module = order.create();
        SCOPED_TRACE(order.slots);
        std::vector<int64_t> slots;
        const auto slotCount = std::count(order.slots.begin(), order.slots.end(), ' ');
        for (long i = 0; i < slotCount; ++i) slots.push_back(module->slots[i].location);
        EXPECT_EQ(Names(module->program, slots), order.slots);
        const auto draw = [&](uint32_t node) {
            module->render(module, &model.model, node, &lights, nullptr, &g_sMatIdentity, &g_sMatIdentity,
                           &shadow);
        };
        for (const GLenum unit : {3, 2, 1, 0}) {
            QexRenderState_ActiveTexture(GL_TEXTURE0 + unit);
            glBindTexture(GL_TEXTURE_2D, 0);
        }
        QexRenderState_UseProgram(0);
        const std::string change = StateChange([&] { draw(0); });
        EXPECT_EQ(change.find("program: 0 -> " + std::to_string(module->program) + "\n"), 0u);
        for (const char unit : std::string("0123"))
            EXPECT_EQ(change.find(std::string("texture2D[") + unit) != std::string::npos,
                      order.textures.find(unit) != std::string::npos)
                << unit;
        const size_t lines = 1 + order.textures.size() + (change.find("activeUnit") != std::string::npos);
        EXPECT_EQ(size_t(std::count(change.begin(), change.end(), '\n')), lines) << change;
        // No mesh node, and one that is hidden.
        model.Node().stateFlags &= ~QEX_NODE_RENDERING_ENABLED;
        for (const uint32_t node : {0u, 1u, 7u}) EXPECT_EQ(GLCalls([&] { draw(node); }).Size(), 0u);
        order.release(&module);
        order.release(&module);
    }
}

class SteadyModuleTest : public NullRenderTest {};

TEST_F(SteadyModuleTest, NoModuleAllocatesOrCreates) {
    const QexLightSet lights = Lights(4);
    const QexShadowInfo shadow = {};
    for (const Order& order : kOrders) {
        LoadedModel model(TriangleScene(order.skinned ? kTwoBones : kNoSkin));
        QexShaderModule* module = order.create();
        const std::string live = LiveObjects();
        gltapResetCounts();
        const auto draw = [&] {
            module->render(module, &model.model, 0, &lights, nullptr, &g_sMatIdentity, &g_sMatIdentity,
                           &shadow);
        };
        EXPECT_EQ(CountAllocations(draw).made, 0) << order.slots;
        EXPECT_EQ(gltapCount("glDrawElements"), 1u) << order.slots;
        EXPECT_EQ(LiveObjects(), live) << order.slots;
        order.release(&module);
    }
}

TEST_F(LitTest, DepthOfFlatTriangles) {
    for (const bool skinned : {false, true}) {
        LoadedModel model(TriangleScene(skinned ? kTwoBones : kNoSkin));
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
            return Read().Pixel(50, 60);
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
