// The picture, and what is drawn over it.
#include <algorithm>
#include <cmath>
#include <initializer_list>

#include <GLES2/gl2.h>

#include "common/EngineOutput.h"
#include "common/ImageFile.h"
#include "common/SceneBounds.h"
#include "front/Viewer.h"

namespace {

constexpr uint32_t kSelected = 0xFFA030, kBox = 0x60C0FF, kBone = 0xFFFF60, kWire = 0x101418,
                   kNormal = 0x60FF90;
constexpr float kMark = 9;              // pixels from a light's mark's middle to its corners
constexpr int kSamples = 4;             // of a pixel of a picture
constexpr uint32_t kMostEdges = 60000;  // of wires and normals that are drawn, a node

}  // namespace

const char* const kOverlayNames[] = {"grid", "wireframe", "boxes", "bones", "normals"};

// Triangles as they are in the world, skinned ones in their meshes' own pose.
void Viewer::AddMesh(uint32_t node, bool wires, bool normals) {
    QexModel* model = view_->Model();
    const QexPODMesh& mesh = model->scene.meshes[model->scene.nodes[node].objectIndex];
    QexMatrix world, unpacked;
    QexModel_GetNodeWorldMatrix(model, node, &world);
    QexMatrix_Multiply(&unpacked, &world, &mesh.unpackMatrix);
    const auto place = [&](uint32_t vertex) {
        QexVec4 p = ReadElement(mesh, mesh.vertices, vertex);
        p.w = 1;
        QexMatrix_TransformVec4(&unpacked, &p, &p);
        return QexVec3{p.x, p.y, p.z};
    };
    if (wires && mesh.faces.data && !mesh.stripCount) {
        const uint32_t size = mesh.faces.type == QEX_POD_UNSIGNED_INT ? 4 : 2;
        for (uint32_t i = 0; i < std::min(mesh.faceCount, kMostEdges / 3); ++i) {
            uint32_t corner[3];
            for (uint32_t k = 0; k < 3; ++k)
                QexPODVertex_ReadInt(&corner[k], mesh.faces.data + (i * size_t{3} + k) * size,
                                     mesh.faces.type);
            for (int k = 0; k < 3; ++k) inside_.Add(place(corner[k]), place(corner[(k + 1) % 3]), kWire);
        }
    }
    if (!normals || !mesh.normals.componentCount) return;
    const float length = view_->Size() / 40;
    for (uint32_t i = 0; i < std::min(mesh.vertexCount, kMostEdges); ++i) {
        QexVec4 n = ReadElement(mesh, mesh.normals, i);
        n.w = 0;
        QexMatrix_TransformVec4(&world, &n, &n);
        QexVec3 along = {n.x, n.y, n.z};
        QexVec3_Normalize(&along, &along);
        const QexVec3 from = place(i);
        inside_.Add(from, {from.x + along.x * length, from.y + along.y * length, from.z + along.z * length},
                    kNormal);
    }
}

void Viewer::DrawOverlays() {
    QexModel* model = view_->Model();
    inside_.Clear();
    over_.Clear();
    if (Shows(Overlay::kGrid) || IsEmpty()) {
        const float size = model ? view_->Size() : 2;
        const float unit = std::pow(10.0f, std::round(std::log10(size)));
        inside_.AddGrid(unit * 2, 20, UpOf(camera_.Up()));
    }
    const bool wires = Shows(Overlay::kWireframe), normals = Shows(Overlay::kNormals);
    if (model && (Shows(Overlay::kBoxes) || selected_ >= 0)) QexModel_UpdateModelBoundingBox(model, nullptr);
    for (uint32_t i = 0; model && i < model->scene.nodeCount; ++i) {
        const QexPODNode& node = model->scene.nodes[i];
        const bool isMesh = i < model->scene.meshNodeCount, chosen = selected_ == static_cast<int>(i);
        if (isMesh && (chosen || Shows(Overlay::kBoxes)))
            over_.AddBox(model->nodeBoxes[i].corners, chosen ? kSelected : kBox);
        if (isMesh && (wires || normals)) AddMesh(i, wires, normals);
        QexVec3 from, to;
        if (Shows(Overlay::kBones) && !isMesh && node.parentIndex >= 0 &&
            QexModel_GetNodeWorldPos(model, i, &to) == 0 &&
            QexModel_GetNodeWorldPos(model, static_cast<uint32_t>(node.parentIndex), &from) == 0)
            over_.Add(from, to, chosen ? kSelected : kBone);
    }
    for (const QexLight& light : options_.effects.lights) {
        const QexVec3 place = {light.vector[0], light.vector[1], light.vector[2]};
        uint32_t colour = 0;
        for (const float c : light.colour)
            colour = colour << 8 | static_cast<uint32_t>(std::clamp(c, 0.2f, 1.0f) * 255);
        Spot spot;
        if (See(place, &spot)) over_.AddMark(place, kMark * spot.pixel, colour >> 8);
    }
    inside_.Draw(view_->Camera(), true);
    over_.Draw(view_->Camera(), false);
}

bool Viewer::IsEmpty() const {
    return !view_->Model() && !view_->IsLoading() && !waits_;
}

// What to do where there is nothing to see.
void Viewer::DrawGreeting() {
    static const char kText[] = "Drop a scene here. ? shows the keys.";
    float width = 0, height = 0;
    QexFont_MeasureString(kText, &width, &height);
    QexRenderer_SetZTestFunc(QEX_DEPTH_ALWAYS);
    QexRenderer_SetAlphaBlendMode(QEX_BLEND_ALPHA);
    QexFont_ReplaceString(&engine_,
                          std::max(static_cast<int>((static_cast<float>(engine_.width) - width) / 2), 8),
                          engine_.height / 3, kText, 255, 255, 255, 255);
    QexFont_Draw();
    QexFont_ClearString();
}

void Viewer::Draw(int width, int height, bool overlays) {
    if (width < 1 || height < 1 || QexEngine_IsContextLost()) return;
    Resize(width, height);
    EngineOutput quiet;
    const uint64_t before = calls_ ? calls_() : 0;
    view_->Draw();
    if (calls_) statistics_.calls = calls_() - before;
    if (overlays) DrawOverlays();
    if (overlays && IsEmpty()) DrawGreeting();
}

namespace {

// A framebuffer apart from the window's, with depth and stencil; binds the one before again at its end.
class Offscreen {
  public:
    Offscreen(int width, int height) {
        QexRenderState_Restore();
        glGetIntegerv(GL_FRAMEBUFFER_BINDING, &before_);
        glGenFramebuffers(1, &framebuffer_);
        glGenTextures(1, &colour_);
        glGenRenderbuffers(1, &depth_);
        glBindTexture(GL_TEXTURE_2D, colour_);
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, width, height, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr);
        for (const GLenum filter : {GL_TEXTURE_MIN_FILTER, GL_TEXTURE_MAG_FILTER})
            glTexParameteri(GL_TEXTURE_2D, filter, GL_NEAREST);
        for (const GLenum wrap : {GL_TEXTURE_WRAP_S, GL_TEXTURE_WRAP_T})
            glTexParameteri(GL_TEXTURE_2D, wrap, GL_CLAMP_TO_EDGE);
        glBindRenderbuffer(GL_RENDERBUFFER, depth_);
        glRenderbufferStorage(GL_RENDERBUFFER, kDepthStencil, width, height);
        glBindFramebuffer(GL_FRAMEBUFFER, framebuffer_);
        glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, colour_, 0);
        for (const GLenum part : {GL_DEPTH_ATTACHMENT, GL_STENCIL_ATTACHMENT})
            glFramebufferRenderbuffer(GL_FRAMEBUFFER, part, GL_RENDERBUFFER, depth_);
        complete_ = glCheckFramebufferStatus(GL_FRAMEBUFFER) == GL_FRAMEBUFFER_COMPLETE;
        if (!complete_) Leave();
        while (glGetError() != GL_NO_ERROR) {
        }
        QexRenderState_Reset(nullptr);
    }
    ~Offscreen() {
        QexRenderState_Restore();
        Leave();
        glDeleteFramebuffers(1, &framebuffer_);
        glDeleteRenderbuffers(1, &depth_);
        glDeleteTextures(1, &colour_);
        QexRenderState_Reset(nullptr);
    }
    Offscreen(const Offscreen&) = delete;
    Offscreen& operator=(const Offscreen&) = delete;
    bool IsComplete() const { return complete_; }

  private:
    static constexpr GLenum kDepthStencil = 0x88F0;  // GL_DEPTH24_STENCIL8_OES

    void Leave() { glBindFramebuffer(GL_FRAMEBUFFER, static_cast<GLuint>(before_)); }

    GLint before_ = 0;
    GLuint framebuffer_ = 0, colour_ = 0, depth_ = 0;
    bool complete_ = false;
};

}  // namespace

std::vector<uint8_t> Viewer::Read(int width, int height) {
    const size_t row = static_cast<size_t>(width) * 4;
    std::vector<uint8_t> pixels(row * static_cast<size_t>(height));
    glPixelStorei(GL_PACK_ALIGNMENT, 4);
    glReadPixels(0, 0, width, height, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
    for (size_t y = 0; y < static_cast<size_t>(height) / 2; ++y)
        std::swap_ranges(pixels.begin() + static_cast<std::ptrdiff_t>(y * row),
                         pixels.begin() + static_cast<std::ptrdiff_t>((y + 1) * row),
                         pixels.end() - static_cast<std::ptrdiff_t>((y + 1) * row));
    return pixels;
}

void Viewer::FitToFrame() {
    std::vector<std::string> warnings;
    view_->FitTo({view_->Frame()});
    view_->Refit(&warnings);
}

std::vector<uint8_t> Viewer::Picture(int width, int height, int samples) {
    FitToFrame();
    std::vector<uint8_t> pixels;
    // As qex render: on a surface of four samples where they smooth everything, else larger.
    if (samples < kSamples || NeedsLargerDrawing(options_.effects)) {
        const Offscreen large(2 * width, 2 * height);
        if (large.IsComplete()) {
            view_->SetScale(2);
            Draw(2 * width, 2 * height, false);
            pixels = ShrinkPixels(Read(2 * width, 2 * height), width, height, 2);
            view_->SetScale(1);
        }
    }
    if (pixels.empty()) {
        Draw(width, height, false);
        pixels = Read(width, height);
    }
    Resize(width, height);
    for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 255;
    return pixels;
}

RenderOptions Viewer::AsRenderOptions(int width, int height) const {
    RenderOptions options;
    static_cast<SceneOptions&>(options) = options_;
    options.input = name_;
    options.output = "picture.png";
    options.width = width;
    options.height = height;
    options.frame = playback_.Frame();
    if (view_->Particles()) options.effects.emitters.time = view_->Particles()->Time();
    return options;
}
