#include "support/Everything.h"

#include <GLES2/gl2.h>

#include <cstdio>

#include "PodWriter.h"
#include "PvrWriter.h"
#include "Scenes.h"
#include "support/ImageFiles.h"

namespace {

void WriteBytes(const std::string& path, const std::vector<uint8_t>& bytes) {
    FILE* file = fopen(path.c_str(), "wb");
    ASSERT_NE(file, nullptr) << path;
    EXPECT_EQ(fwrite(bytes.data(), 1, bytes.size(), file), bytes.size());
    fclose(file);
}

constexpr float kFrame = 7;

Everything* s_Drawn;  // the depth pass hands nothing on

}  // namespace

Everything::Everything(const std::string& folder)
    : folder_(folder),
      wood_(pod::WritePvr(PvrNoise(0x12, 8, 8, 4, 1))),
      sky_(CubeKtx().File()),
      tga_(TgaFile(4, 4, 24, Noise(48))) {
    pod::Scene scene = scenes::Worm(20, 60);
    scene.textures = {"noise.pvr", "etc.pvr"};
    scene.materials[0].diffuseTexture = 0;
    scene.materials[1].diffuseTexture = 1;
    worm_ = pod::WritePod(scene);
    WriteBytes(folder_ + "worm.pod", worm_);
    WriteBytes(folder_ + "noise.pvr", wood_);
    WriteBytes(folder_ + "etc.pvr", pod::WritePvr(PvrNoise(0x36, 16, 16, 5, 1)));
    WriteBytes(folder_ + "etc_a.pvr", wood_);
}

bool Everything::LoadTextures() {
    bool all = QexNameCache_Create(&cache_, 1, sizeof(QexTexture)) == 0;
    for (const char* name : {"noise.pvr", "etc.pvr"}) {
        QexTexture texture = {};  // the cache has a copy
        const bool loaded =
            QexTexture_LoadPVRFromFile(&texture, (folder_ + name).c_str(), nullptr, 1, 0) == 0;
        if (loaded && QexNameCache_Add(&cache_, name, &texture) != 0)
            QexTexture_Release(&texture), all = false;
        all &= loaded;
    }
    static uint8_t pixels[] = {255, 0, 0, 255, 0, 255, 0, 255, 0, 0, 255, 255, 255, 255, 255, 128};
    all &= QexTexture_CreateFromPixels(&painted_, 2, 2, QEX_TEXFMT_RGBA8888, 0, 0, QEX_FILTER_LINEAR,
                                       QEX_WRAP_CLAMP, pixels) == 0;
    painted_.pixels = nullptr;
    all &= QexTexture_CreateTGAFromMemSized(&inMemory_, 0, 0, QEX_FILTER_NEAREST, QEX_WRAP_REPEAT,
                                            tga_.data(), static_cast<uint32_t>(tga_.size())) == 0;
    return all & (QexTexture_LoadKTXFromMemSized(&skyCube_, sky_.data(), static_cast<uint32_t>(sky_.size()),
                                                 nullptr, 0, 0, nullptr) == 0);
}

bool Everything::LoadModels() {
    QexMesh box = {};
    bool all = QexModel_LoadContent(&fromFile_, folder_.c_str(), "worm.pod") == 0;
    all &= QexModel_LoadContentFromCache(&fromCache_, worm_.data(), static_cast<uint32_t>(worm_.size()),
                                         &cache_) == 0 &&
           fromCache_.scene.meshNodeCount;
    all &= QexMesh_CreateBox(&box, 1, 1, 1) == 0 &&
           QexModel_CreateFromMesh(&fromMesh_, &box, painted_.glName ? &painted_ : nullptr) == 0;
    QexMesh_Release(&box);
    lit_ = QexSkinningGouraudShader_CreateProgram();
    shadowed_ = QexGouraudShadowShader_CreateProgram();
    if (lit_ && fromCache_.scene.meshNodeCount)
        QexModel_SetShaderProgramForAllNode(&fromCache_, nullptr, lit_);
    if (shadowed_ && fromCache_.scene.meshNodeCount) fromCache_.scene.nodes[0].shader = shadowed_;
    QexShadowCaster caster = {&fromFile_, 1, nullptr, 0};
    const QexVec3 down = {0.3f, -1, 0.2f};
    shadow_ = QexModel_InitShadowInfo(&camera_, &down, &caster, 1, 0.5f, 0.01f);
    return all & (lit_ && shadowed_ && shadow_);
}

bool Everything::LoadEffects() {
    hasTarget_ = QexRenderTarget_Create(&target_, 16, 16, 0) == 0;
    hasProgram_ = QexShaderProgram_Create(&program_, QEX_PROGRAM_TEXTURE_COLOUR) == 0;
    effects_ = QexPostProcessing_Initialize(&runtime_) == 0;
    billboard_ = QexBillboard_Create(&inMemory_);
    emitter_ = QexParticleEmitter_Create();
    const bool set = QexParticleSet_Create(&particles_, &painted_, nullptr, 2, 9, 10) == 0;
    for (uint32_t i = 0; set && i < 2; ++i)
        particles_.buffer[i] = {9, {0.2f, 0.1f, 0}, {static_cast<float>(i), 1, 0}};
    if (emitter_) {
        emitter_->velocityMin = emitter_->velocityMax = {0, 1, 0};
        emitter_->lifetime[0] = emitter_->lifetime[1] = -1;
        emitter_->emissionRate[0] = emitter_->emissionRate[1] = 3;
        emitter_->scaleMin = emitter_->scaleMax = {0.01f, 0.01f, 0.01f};
        emitter_->animations[0].frames[0] = &painted_;
        emitter_->animations[0].frameCount = 1;
    }
    box_ = {};
    box_.skyTexture = &skyCube_;
    box_.waterNormalTexture = &painted_;
    box_.size = 40;
    box_.waterEnabled = 1;
    box_.waterHeight = 0.5f;
    box_.camera = &camera_;
    box_.waterColour[2] = 0.5f;
    hasSky_ = QexSkyBox_Create(&box_) == 0;
    return hasTarget_ && hasProgram_ && effects_ && billboard_ && emitter_ && set && hasSky_;
}

bool Everything::Load() {
    camera_ = {};
    const QexVec3 eye = {0, 2.5f, 9}, target = {0, 1.5f, 0}, up = {0, 1, 0};
    QexCamera_LookAt(&camera_, &eye, &target, &up);
    QexCamera_Project(&camera_, 0.9f, float{kWidth} / kHeight, 0.5f, 60);
    lights_ = {};
    lights_.count = 1;
    lights_.lights[0] = {QEX_LIGHT_DIRECTIONAL, {-0.4f, -0.8f, -0.3f}, {1, 1, 1, 1}};
    inMemory_ = painted_ = skyCube_ = {};
    particles_ = {};
    target_ = {};
    program_ = {};
    runtime_ = {};
    cache_ = {};
    QexModel_Create(&fromFile_);
    QexModel_Create(&fromCache_);
    QexModel_Create(&fromMesh_);
    QexEngineConfig config = SurfaceConfig();
    started_ = QexEngine_Init(&runtime_, sizeof config, &config) == 0;
    if (!started_) return false;
    // Without && each part is tried whatever the others came to.
    bool all = LoadTextures();
    all &= LoadModels();
    all &= LoadEffects();
    QexFont_ReplaceString(&runtime_, 4, 40, "text \xC3\xA9", 255, 255, 0, 255);
    for (int i = 0; i < 2; ++i) QexParticleEmitter_Update(emitter_, 0.1f, nullptr);
    QexParticleSet_Trigger(&particles_);
    return all;
}

void Everything::DrawScene(const QexCamera& camera) {
    for (QexModel* model : {&fromFile_, &fromCache_, &fromMesh_}) {
        if (!model->scene.meshNodeCount) continue;
        QexPODModel_SetFrame(&model->scene, kFrame);
        QexMatrix place;
        QexMatrix_Translate(&place, model == &fromCache_ ? 2.5f : -1.5f, model == &fromMesh_ ? 2.0f : 0, 0);
        QexModel_RenderFromCameraWithShadow(model, &lights_, &camera, &place, shadow_, 0);
    }
}

int32_t Everything::DrawForEffect(QexRuntimeContext*, void*, void*, void*, QexShaderModule* still,
                                  QexShaderModule* skinned, const float* colour) {
    Everything* that = s_Drawn;
    if (colour) glClearColor(colour[0], colour[1], colour[2], 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexModel& model = that->fromFile_;
    if (!colour) that->DrawScene(that->camera_);
    if (!still || !skinned) return 0;
    for (uint32_t i = 0; i < model.scene.meshNodeCount; ++i) {
        QexShaderModule* own = model.scene.nodes[i].shader;
        const QexPODMesh& mesh = model.scene.meshes[model.scene.nodes[i].objectIndex];
        model.scene.nodes[i].shader = mesh.skinned ? skinned : still;
        QexModel_RenderNodeWithCamera(&model, i, nullptr, &that->camera_, nullptr);
        model.scene.nodes[i].shader = own;
    }
    return 0;
}

void Everything::Draw() {
    if (!started_) return;
    s_Drawn = this;
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glViewport(0, 0, kWidth, kHeight);
    glClearColor(0.1f, 0.1f, 0.2f, 1);
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
    QexRenderer_SetZWrite(1);
    QexRenderer_SetZTestFunc(QEX_DEPTH_LESS_EQUAL);
    QexRenderer_SetBackFaceCulling(QEX_CULL_NONE);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    if (shadow_) QexModel_RenderShadow(&runtime_, nullptr, shadow_);
    glDisable(GL_SCISSOR_TEST);
    if (effects_)
        QexPostProcessing_DrawDOF(&runtime_, nullptr, nullptr, nullptr, DrawForEffect, 0.5f, 0.5f,
                                  1.0f / kWidth, 1.0f / kHeight, 2, 3, 0, 0.5f, 60);
    if (hasSky_) QexSkyBox_Update(&runtime_, &box_, 0);
    DrawScene(camera_);
    if (hasTarget_) {
        QexRenderTarget_BeginScene(&target_);
        glClearColor(1, 0, 0, 1);
        glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);
        QexRenderTarget_EndScene(&target_);
        QexTexture_Draw(&runtime_, &target_.colorTexture, 4, 90, nullptr, 1, 1, 0xFFFFFFFF);
    }
    if (hasProgram_) QexShaderProgram_Apply(&program_), QexShaderProgram_Apply(nullptr);
    particles_.time = 0;
    QexParticleSet_Update(&particles_, 0.5f, &camera_, nullptr);
    QexParticleSet_Draw(&particles_);
    QexParticleEmitter_Draw(emitter_, &camera_);
    if (billboard_) {
        billboard_->scale = {0.2f, 0.2f, 0.2f};
        billboard_->position = {2, 3, 0};
        QexBillboard_Draw(billboard_, &camera_);
    }
    QexFont_Draw();
    QexFont_DrawTempString(&runtime_, 4, 60, "now", 0xFFFF8000);
    QexRenderState_Restore();
}

void Everything::Release() {
    if (!started_) return;
    if (hasSky_) QexSkyBox_Release();
    if (effects_) QexPostProcessing_Finalize();
    if (hasTarget_) QexRenderTarget_Release(&target_);
    if (hasProgram_) QexShaderProgram_Release(&program_);
    QexParticleSet_Release(&particles_);
    QexParticleEmitter_Release(emitter_);
    QexBillboard_Release(billboard_);
    QexModel_ReleaseShadowInfo(shadow_);
    QexModel_Unload(&fromFile_);
    QexModel_Unload(&fromCache_);
    QexModel_Unload(&fromMesh_);
    QexSkinningGouraudShader_Release(&lit_);
    QexGouraudShadowShader_Release(&shadowed_);
    for (uint32_t i = 0; i < QexNameCache_GetSize(&cache_); ++i)
        QexTexture_Release(static_cast<QexTexture*>(QexNameCache_GetData(&cache_, i)));
    QexNameCache_Release(&cache_);
    for (QexTexture* texture : {&inMemory_, &painted_, &skyCube_})
        if (texture->glName) QexTexture_Release(texture);
    QexEngine_Shutdown(&runtime_);
    billboard_ = nullptr;
    emitter_ = nullptr;
    shadow_ = nullptr;
    started_ = effects_ = hasSky_ = hasTarget_ = hasProgram_ = false;
}
