// The lit modules against their formulas: a triangle with its own normals, drawn and evaluated on the CPU.
#include <GLES2/gl2.h>

#include <algorithm>
#include <cmath>
#include <glm/gtc/quaternion.hpp>

#include "Scenes.h"

namespace {

constexpr glm::vec3 kCamera = {64, 48, 40};
const glm::vec4 kTexel = glm::vec4(200, 180, 220, 230) / 255.0f;
constexpr uint8_t kMapTexel[] = {150, 100, 220, 255};

struct Corner {
    glm::vec3 position, normal, tangent, binormal;
    float weights[2];  // of the two bones
};
const Corner kCorners[3] = {{{-54, -38, 0}, {0.3f, 0.1f, 1}, {1, 0, -0.3f}, {0, 1, 0.1f}, {1, 0}},
                            {{56, -30, 6}, {-0.4f, 0.2f, 1}, {1, 0.2f, 0.3f}, {0.1f, 1, 0}, {0.6f, 0.4f}},
                            {{-20, 40, -8}, {0.1f, -0.6f, 1}, {1, 0, 0}, {0, 1, 0.5f}, {0.2f, 0.8f}}};

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
};
const Kind kKinds[] = {{QEX_SHADER_GOURAUD, false, 3, false, false, kNone},
                       {QEX_SHADER_GOURAUD_SPECULAR, false, 3, true, false, kNone},
                       {QEX_SHADER_GOURAUD_NORMALMAP, false, 3, false, true, kNone},
                       {QEX_SHADER_GOURAUD_SHADOW, false, 3, false, false, kHard},
                       {QEX_SHADER_GOURAUD_SHADOW_EXT, false, 3, false, false, kFading},
                       {QEX_SHADER_SKINNING_GOURAUD, true, 3, false, false, kNone},
                       {QEX_SHADER_SKINNING_GOURAUD_SPECULAR, true, 4, true, false, kNone},
                       {QEX_SHADER_SKINNING_GOURAUD_NORMALMAP, true, 4, false, true, kNone}};

pod::Scene TriangleScene(bool skinned) {
    pod::MeshArrays arrays;
    std::vector<float> weights;
    const auto store = [](std::vector<pod::Vec3>* out, glm::vec3 v) { out->push_back({v.x, v.y, v.z}); };
    for (const Corner& c : kCorners) {
        store(&arrays.positions, c.position);
        store(&arrays.normals, c.normal);
        store(&arrays.tangents, c.tangent);
        store(&arrays.binormals, c.binormal);
        arrays.uvs.push_back({0.5f, 0.5f});
        weights.insert(weights.end(), c.weights, c.weights + 2);
    }
    arrays.indices = {0, 1, 2};
    pod::Mesh mesh = pod::BuildMesh(arrays);
    const auto apart = [](const std::vector<pod::Vec3>& v) { return pod::FloatElement(v[0].data(), 9, 3); };
    if (skinned) {
        mesh.interleaved = false;
        mesh.vertexBlock.clear();
        mesh.vertices = apart(arrays.positions);
        mesh.normals = apart(arrays.normals);
        mesh.tangents = apart(arrays.tangents);
        mesh.binormals = apart(arrays.binormals);
        mesh.uvw = {pod::FloatElement(arrays.uvs[0].data(), 6, 2)};
        mesh.boneIndices = IntegerElement(pod::kUint8, 2, {0, 1, 0, 1, 0, 1});
        mesh.boneWeights = pod::FloatElement(weights.data(), 6, 2);
        mesh.batchBones = {1, 2};
        mesh.bonesPerBatch = {2};
        mesh.batchOffsets = {0};
        mesh.batchBoneMax = 2;
        mesh.batchCount = 1;
    }
    // A turn by 0.3 about Z, then the place; the scale is uneven, so that normals need their own matrix.
    pod::Scene scene = SceneOf(mesh, {{{60, 46, 2}}, {{0, 0, 0.14944f, 0.98877f}}, {{0.9f, 1.1f, 2}}, {}});
    scene.nodes.push_back(pod::BuildNode("a", {}));
    scene.nodes.push_back(pod::BuildNode("b", {}));
    return scene;
}

glm::mat4 NodeMatrix() {
    const glm::quat turn(0.98877f, 0, 0, 0.14944f);
    return glm::translate(glm::mat4(1), {60, 46, 2}) * glm::mat4_cast(turn) *
           glm::scale(glm::mat4(1), {0.9f, 1.1f, 2});
}

const glm::mat4 kExtra = glm::rotate(glm::translate(glm::mat4(1), {1, -2, 3}), 0.05f, {0, 0, 1});
const glm::mat4 kBones[2] = {
    glm::rotate(glm::translate(glm::mat4(1), {2, 1, 0}), 0.1f, {0, 0, 1}),
    glm::scale(glm::rotate(glm::translate(glm::mat4(1), {3, 4, 1}), -0.12f, {1, 1, 0}), {1, 0.9f, 1})};

// World to shadow map: x from 20 to 100, y from 5 to 80; depth rises along both.
const glm::mat4 kShadowSpace = {
    {1 / 80.0f, 0, 0.003f, 0}, {0, 1 / 75.0f, 0.004f, 0}, {0, 0, 0.002f, 0}, {-0.25f, -1 / 15.0f, 0.2f, 1}};
constexpr int kMap = 4;
const uint8_t kMapDepths[kMap * kMap] = {255, 60,  200, 10,  120, 0,   255, 90,
                                         30,  150, 80,  140, 254, 100, 20,  60};

// What the vertex stage hands on.
struct Varyings {
    glm::vec3 screen, world, normal, tangent, binormal, diffuse, shadow;
    glm::vec3 light[4], half[4];
    float facing;

    friend Varyings operator*(float f, Varyings v) {
        for (float& x : v.Floats()) x *= f;
        return v;
    }
    friend Varyings operator+(Varyings a, Varyings b) {
        for (size_t i = 0; i < a.Floats().size(); ++i) a.Floats()[i] += b.Floats()[i];
        return a;
    }
    std::array<float, sizeof(glm::vec3) / 4 * 15 + 1>& Floats() {
        return reinterpret_cast<std::array<float, 46>&>(*this);
    }
};
static_assert(sizeof(Varyings) == 46 * 4, "a row of floats");

glm::vec3 Towards(const QexLight& light, glm::vec3 point) {
    const glm::vec3 v = glm::make_vec3(light.vector);
    return glm::normalize(light.type == 0 ? v - point : -v);
}
glm::vec3 Colour(const QexLight& light) {
    return glm::make_vec3(light.colour);
}

struct Setting {
    Kind kind;
    QexLightSet lights;
    glm::vec3 shadowDirection;
    const QexPODMaterial* material;
    float alpha;  // as it should come out, before the texture's

    size_t Used() const { return std::min<size_t>(lights.count, kind.lights); }

    Varyings Vertex(const Corner& c) const {
        glm::vec4 world(0);
        glm::vec3 directions[3] = {};  // normal, tangent, binormal
        for (int b = 0; b < (kind.skinned ? 2 : 1); ++b) {
            const glm::mat4 m = kExtra * (kind.skinned ? kBones[b] : glm::mat4(1)) * NodeMatrix();
            const glm::mat3 n = glm::transpose(glm::inverse(glm::mat3(m)));
            const float weight = kind.skinned ? c.weights[b] : 1;
            world += m * glm::vec4(c.position, 1) * weight;
            const glm::vec3 in[] = {c.normal, c.tangent, c.binormal};
            for (int i = 0; i < 3; ++i) directions[i] += n * in[i] * weight;
        }
        Varyings v = {};
        v.world = world;
        v.screen = v.world;  // the view only moves the camera back
        v.normal = glm::normalize(directions[0]);
        v.tangent = glm::normalize(directions[1]);
        v.binormal = glm::normalize(directions[2]);
        for (size_t i = 0; i < Used(); ++i) {
            v.light[i] = Towards(lights.lights[i], v.world);
            v.half[i] = glm::normalize(glm::normalize(kCamera - v.world) + v.light[i]);
            v.diffuse += glm::clamp(glm::dot(v.normal, v.light[i]), 0.0f, 1.0f) * Colour(lights.lights[i]);
        }
        // The shadow matrix is applied to the world position of the vertex.
        v.shadow = glm::vec3(kShadowSpace * world) - glm::vec3(0, 0, 0.01f);
        v.facing = glm::dot(v.normal, glm::normalize(-shadowDirection));
        return v;
    }

    // The brightness of the shadow there; negative where rounding decides.
    float ShadowAt(const Varyings& v) const {
        const glm::vec2 texel = glm::vec2(v.shadow) * float{kMap};
        const glm::vec2 edge = glm::abs(texel - glm::round(texel));
        if (std::min(edge.x, edge.y) < 0.05f || std::abs(v.facing) < 0.01f) return -1;
        if (texel.x < 0 || texel.y < 0 || texel.x > kMap || texel.y > kMap || v.facing <= 0) return 1;
        const float depth = kMapDepths[int(texel.y) * kMap + int(texel.x)] / 255.0f;
        if (std::abs(depth - v.shadow.z) < 0.01f) return -1;
        if (depth >= 1 || depth >= v.shadow.z) return 1;
        if (kind.shadow == kHard) return 0.3f;
        return glm::clamp(0.3f + (v.shadow.z - depth) * 1.5f, 0.0f, 1.0f);
    }

    glm::vec4 Fragment(const Varyings& v, float shadow) const {
        glm::vec3 diffuse = v.diffuse, highlight(0);
        if (kind.normalMap) {
            const glm::vec3 map = glm::vec3(kMapTexel[1], kMapTexel[0], kMapTexel[2]) / 255.0f;
            const glm::vec3 n =
                glm::mat3(v.tangent, v.binormal, v.normal) * glm::normalize((map - 0.5f) * 2.0f);
            diffuse = glm::vec3(0);
            for (size_t i = 0; i < Used(); ++i)
                diffuse += glm::clamp(glm::dot(n, v.light[i]), 0.0f, 1.0f) * Colour(lights.lights[i]);
        }
        for (size_t i = 0; i < Used(); ++i) {
            const float cosine = glm::clamp(glm::dot(v.normal, v.half[i]), 0.0f, 1.0f);
            highlight += std::pow(cosine, material->shininess * 256) * Colour(lights.lights[i]);
        }
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
        const Varyings v[] = {setting.Vertex(kCorners[0]), setting.Vertex(kCorners[1]),
                              setting.Vertex(kCorners[2])};
        const glm::mat3 toBarycentric = glm::inverse(glm::mat3(glm::vec3(v[0].screen.x, v[0].screen.y, 1),
                                                               glm::vec3(v[1].screen.x, v[1].screen.y, 1),
                                                               glm::vec3(v[2].screen.x, v[2].screen.y, 1)));
        int compared = 0;
        for (int y = 2; y < kHeight; y += 3)
            for (int x = 1; x < kWidth; x += 3) {
                const glm::vec3 b = toBarycentric * glm::vec3(float(x) + 0.5f, float(kHeight - y) - 0.5f, 1);
                if (std::min({b.x, b.y, b.z}) < 0.01f) continue;
                const Varyings at = b.x * v[0] + b.y * v[1] + b.z * v[2];
                const float shade = setting.kind.shadow == kNone || !shadow ? 1 : setting.ShadowAt(at);
                if (shade < 0) continue;
                const glm::vec4 c = glm::clamp(setting.Fragment(at, shade), 0.0f, 1.0f) * 255.0f + 0.5f;
                EXPECT_TRUE(Near(picture.Pixel(x, y), {int(c.x), int(c.y), int(c.z), int(c.w)}, 2))
                    << "kind " << setting.kind.kind << ", " << setting.lights.count << " lights at " << x
                    << " " << y;
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
    for (const Kind& kind : kKinds) {
        LoadedModel model(TriangleScene(kind.skinned));
        ASSERT_EQ(model.log, "");
        for (int b = 0; kind.skinned && b < 2; ++b) {
            const QexMatrix bone = ToQex(kBones[b]);
            QexPODModel_SetNodeMatrix(&model.model.scene, static_cast<uint32_t>(1 + b), &bone);
        }
        QexPODMaterial& material = model.Material();
        std::copy_n(std::array<float, 3>{0.1f, 0.2f, 0.05f}.begin(), 3, material.ambient);
        std::copy_n(std::array<float, 3>{0.7f, 0.8f, 0.9f}.begin(), 3, material.diffuse);
        std::copy_n(std::array<float, 3>{0.4f, 0.5f, 0.3f}.begin(), 3, material.specular);
        material.shininess = 0.05f;
        model.model.textures[0] = &diffuse;
        model.model.alphaTextures[0] = &white;
        if (kind.normalMap) model.model.bindTextureHook = BindNormalMap;
        QexShaderModule* module = QexShaders_CreateShaderProgram(kind.kind);
        if (kind.shadow == kFading) QexGouraudShadowExtShader_SetShadowFade(module, 1.5f);
        // The alpha is 0.4: above, at and below the threshold.
        material.opacity = 0.8f;
        QexRenderer_SetGlobalAlpha(0.5f);
        for (uint32_t lights = 0; lights <= 4; ++lights) {
            const float threshold = lights == 1 ? 0.8f * 0.5f : lights == 2 ? 0.41f : 0.39f;
            QexShaders_SetShaderAlphaThreshold(module, kind.kind, threshold);
            const glm::vec3 direction = lights == 4 ? glm::vec3(0.2f, 0.1f, 1) : glm::vec3(0.3f, 0.5f, -1);
            shadow.lightDir = {direction.x, direction.y, direction.z};
            const float alpha = lights == 1 || lights == 2 ? 0 : 0.4f;
            const Setting setting = {kind, Lights(lights), direction, &material, alpha};
            model.Node().blendFlags = QEX_NODE_OPAQUE;
            ExpectAsComputed(model, module, setting, &shadow);
            EXPECT_EQ(model.Node().blendFlags, 0u)
                << "an alpha texture takes the node out of the opaque pass";
            if (kind.shadow != kNone && lights == 3) ExpectAsComputed(model, module, setting, nullptr);
        }
        QexRenderer_SetGlobalAlpha(1);
        model.model.textures[0] = model.model.alphaTextures[0] = nullptr;
        QexShaders_ReleaseShaderProgram(module, kind.kind);
    }
}

// The names of the uniforms that a program has at those locations.
std::string Names(uint32_t program, const std::vector<int64_t>& locations) {
    std::string text;
    GLint count = 0;
    glGetProgramiv(program, GL_ACTIVE_UNIFORMS, &count);
    for (const int64_t location : locations)
        for (GLint i = 0; i < count; ++i) {
            char name[64];
            GLint size;
            GLenum type;
            glGetActiveUniform(program, static_cast<GLuint>(i), sizeof name, nullptr, &size, &type, name);
            if (glGetUniformLocation(program, name) != location) continue;
            const std::string whole = name;
            text += whole.substr(0, whole.find('[')) + " ";
        }
    return text;
}

const std::string kLights = "lightCount lightType lightPosDir lightColor sceneAmbient sceneDiffuse ";
const std::string kSpecular = "sceneSpecular shininess ", kAlpha = "opacity alphaThreshold ";
const std::string kMatrices = "transMatrix normalMatrix mvpMatrix ";
const std::string kBoneSlots = "viewProjMatrix boneCount boneMatrixArray boneVecMatrixArray ";
const std::string kBatch = "viewProjMatrix boneCount boneMatrixArray ", kVectors = "boneVecMatrixArray ";
const std::string kDepthBatch = kAlpha + kBatch;

// The order of a module's slots and that of its uploads; both are fixed.
struct Order {
    QexShaderModule* (*create)();
    void (*release)(QexShaderModule**);
    bool skinned;
    std::string slots, uploads, textures;  // units that are bound
};
#define ORDER(Name, ...) \
    { Name##_CreateProgram, Name##_Release, __VA_ARGS__ }
const Order kOrders[] = {
    ORDER(QexGouraudShader, false, kMatrices + kLights + kAlpha, kLights + kAlpha + kMatrices, "03"),
    ORDER(QexGouraudNormalMapShader, false, kMatrices + kLights + kAlpha, kLights + kAlpha + kMatrices,
          "013"),
    ORDER(QexGouraudSpecularShader, false, kMatrices + "cameraPos " + kLights + kSpecular + kAlpha,
          "cameraPos " + kLights + kSpecular + kAlpha + kMatrices, "03"),
    ORDER(QexGouraudShadowShader, false,
          kMatrices + kLights + kAlpha + "shadowLightDir shadowSpaceMatrix biasValue shadowIntensity ",
          kLights + kAlpha + kMatrices + "shadowLightDir shadowSpaceMatrix shadowIntensity biasValue ",
          "023"),
    ORDER(QexGouraudShadowExtShader, false,
          kMatrices + kLights + kAlpha +
              "shadowLightDir shadowSpaceMatrix biasValue shadowIntensity shadowFade ",
          kLights + kAlpha + kMatrices +
              "shadowLightDir shadowSpaceMatrix shadowIntensity biasValue shadowFade ",
          "023"),
    ORDER(QexSkinningTextureNoAlphaShader, true, "boneCount boneMatrixArray viewProjMatrix " + kAlpha,
          kAlpha + kBatch, "03"),
    ORDER(QexSkinningGouraudShader, true, kBoneSlots + kLights + kAlpha, kLights + kAlpha + kBatch + kVectors,
          "03"),
    ORDER(QexSkinningGouraudNormalMapShader, true, kBoneSlots + kLights + kAlpha,
          kLights + kAlpha + kBatch + kVectors, "013"),
    ORDER(QexSkinningGouraudSpecularShader, true, kBoneSlots + "cameraPos " + kLights + kSpecular + kAlpha,
          "cameraPos " + kLights + kSpecular + kAlpha + kBatch + kVectors, "03"),
    ORDER(QexUVDisplacementShader, false, "displacement mvpMatrix " + kAlpha,
          kAlpha + "displacement mvpMatrix ", "03"),
    ORDER(QexUVDisplacementNoAlphaShader, false, "displacement mvpMatrix " + kAlpha,
          kAlpha + "displacement mvpMatrix ", "03"),
    ORDER(QexDepthShader, false, "near far mvpMatrix ", "mvpMatrix ", "03"),
    ORDER(QexSkinningDepthShader, true, "near far boneCount boneMatrixArray viewProjMatrix " + kAlpha,
          kDepthBatch, "03"),
};

TEST_F(LitTest, SlotsUploadsAndStateOfEveryModule) {
    const QexLightSet lights = Lights(2);
    QexShadowInfo shadow = {};
    const std::string white = std::to_string(Qextexture_GetDefault()->glName);
    for (const Order& order : kOrders) {
        LoadedModel model(TriangleScene(order.skinned));
        QexShaderModule* module = order.create();
        std::vector<int64_t> slots, uploads;
        const auto slotCount = std::count(order.slots.begin(), order.slots.end(), ' ');
        for (long i = 0; i < slotCount; ++i) slots.push_back(module->slots[i].location);
        EXPECT_EQ(Names(module->program, slots), order.slots);
        const auto draw = [&] {
            const QexMatrix projection = PixelProjection();
            module->render(module, &model.model, 0, &lights, nullptr, &g_sMatIdentity, &projection, &shadow);
        };
        for (const GLenum unit : {3, 2, 1, 0}) {
            QexRenderState_ActiveTexture(GL_TEXTURE0 + unit);
            glBindTexture(GL_TEXTURE_2D, 0);
        }
        QexRenderState_UseProgram(0);
        std::string state = "program: 0 -> " + std::to_string(module->program) + "\n";
        const std::string change = StateChange(draw);
        EXPECT_EQ(change.substr(0, state.size()), state);
        for (const char unit : std::string("0123"))
            EXPECT_EQ(change.find(std::string("texture2D[") + unit) != std::string::npos,
                      order.textures.find(unit) != std::string::npos)
                << order.slots << unit;
        EXPECT_EQ(
            std::count(change.begin(), change.end(), '\n'),
            static_cast<long>(1 + order.textures.size() + (change.find("activeUnit") != std::string::npos)))
            << change;

        const GLCalls calls(draw);
        for (const gltapCall* call :
             calls.Of({"glUniform1f", "glUniform1i", "glUniform3f", "glUniform1iv", "glUniform2fv",
                       "glUniform3fv", "glUniform4fv", "glUniformMatrix3fv", "glUniformMatrix4fv"}))
            uploads.push_back(call->argument[0].i);
        EXPECT_EQ(Names(module->program, uploads), order.uploads);
        EXPECT_EQ(calls.Of({"glDrawElements"}).size(), 1u);
        order.release(&module);
    }
}

// One pixel wide stripes of depth, and texels shifted by half a picture.
TEST_F(LitTest, DepthAndShiftedTextures) {
    struct Row {
        QexShaderModule* module;
        void (*release)(QexShaderModule**);
    };
    const glm::mat4 flat = glm::ortho(0.0f, float{kWidth}, 0.0f, float{kHeight}, -1.0f, 1.0f);
    for (const bool skinned : {false, true}) {
        LoadedModel model(TriangleScene(skinned));
        QexShaderModule* module =
            skinned ? QexSkinningDepthShader_CreateProgram() : QexDepthShader_CreateProgram();
        QexRenderState_UseProgram(module->program);
        (skinned ? QexSkinningDepthShader_SetParameters : QexDepthShader_SetParameters)(module, 0.1f, 0.9f);
        for (const auto& [z, grey] : {std::pair{0.05f, 0}, {1.0f, 255}, {0.4f, 128}, {0.2f, 64}}) {
            // Every vertex at this depth of clip space.
            glm::mat4 projection = flat;
            for (int c = 0; c < 4; ++c) projection[c][2] = c == 3 ? z : 0;
            const QexMatrix matrix = ToQex(projection);
            Clear();
            module->render(module, &model.model, 0, nullptr, nullptr, &g_sMatIdentity, &matrix, nullptr);
            EXPECT_TRUE(Near(Read().Pixel(50, 60), {grey, grey, grey, 255}, 1)) << z;
        }
        (skinned ? QexSkinningDepthShader_Release : QexDepthShader_Release)(&module);
    }
    const uint8_t texels[] = {255, 0, 0, 255, 0, 255, 0, 100};
    ScopedTexture twoColours(2, 1, texels);
    QexTexture_SetWrapping(&twoColours, QEX_WRAP_REPEAT);
    LoadedModel model(SceneOf(pod::BuildMesh(Rectangle(0, 0, 128, 96))));
    model.model.textures[0] = &twoColours;
    const struct {
        QexShaderModule* module;
        void (*set)(QexShaderModule*, float, float);
        void (*get)(const QexShaderModule*, float*, float*);
        void (*release)(QexShaderModule**);
        int alpha;
    } rows[] = {
        {QexUVDisplacementShader_CreateProgram(), QexUVDisplacementShader_SetDisplacement,
         QexUVDisplacementShader_GetDisplacement, QexUVDisplacementShader_Release, 255},
        {QexUVDisplacementNoAlphaShader_CreateProgram(), QexUVDisplacementNoAlphaShader_SetDisplacement,
         QexUVDisplacementNoAlphaShader_GetDisplacement, QexUVDisplacementNoAlphaShader_Release, 0}};
    for (auto row : rows) {
        row.set(row.module, 0.5f, 0.25f);
        model.DrawNode(row.module);
        EXPECT_EQ(Read().Pixel(20, 40), (Rgba{0, 255, 0, row.alpha}));
        EXPECT_EQ(Read().Pixel(100, 40), (Rgba{255, 0, 0, 255}));
        float u = 0, v = 0;
        row.get(row.module, &u, &v);
        EXPECT_TRUE(u == 0.5f && v == 0.25f);
        row.release(&row.module);
    }
    model.model.textures[0] = nullptr;
}

}  // namespace
