// An emitter file of any bytes, without a driver: it is refused, or it runs, draws, and is written as it was
// read. Short inputs, which would be cut files, are also spread over a whole one: settings and counts first,
// then the particles, which matter least.
#include <fstream>
#include <iterator>

#include "gltap.h"
#include "Qex.h"
#include "support/Capture.h"

namespace {

using Bytes = std::vector<uint8_t>;
constexpr size_t kParticles = 892, kCounts = 45292;  // offsets

void Require(bool condition, const char* what) {
    if (condition) return;
    fprintf(stderr, "%s\n", what);
    abort();
}

Bytes Written(const QexParticleEmitter* emitter) {
    const MemoryFile file({});
    Require(QexParticleEmitter_WriteToBinFile(emitter, file.Path()) == 0, "an emitter is not written");
    std::ifstream stream(file.Path(), std::ios::binary);
    return Bytes((std::istreambuf_iterator<char>(stream)), {});
}

QexParticleEmitter* Read(const Bytes& bytes) {
    return QexParticleEmitter_CreateFromBinFile(MemoryFile(bytes).Path());
}

void Try(const Bytes& bytes) {
    gltapReset();
    gltapSetMode(GLTAP_NULL);
    QexParticleEmitter* emitter = Read(bytes);
    if (!emitter) return;
    Require(emitter->particleCount == 0, "particles without billboards came out of a file");
    const Bytes written = Written(emitter);
    QexParticleEmitter* again = Read(written);
    Require(again && Written(again) == written, "an emitter changes when it is written and read");
    QexParticleEmitter_Release(again);
    QexCamera camera;
    QexCamera_Create(&camera, 0);
    const QexVec3 eye = {0, 1, 9}, target = {0, 0, 0};
    QexCamera_LookAt(&camera, &eye, &target, nullptr);
    QexCamera_Project(&camera, 1, 1.5f, 1, 100);
    for (const float elapsed : {0.02f, 1.0f, 1e9f}) {
        QexParticleEmitter_Update(emitter, elapsed, nullptr);
        Require(emitter->particleCount <= QEX_EMITTER_MAX_PARTICLES, "more particles than may live");
        QexParticleEmitter_Draw(emitter, &camera);
    }
    QexParticleEmitter_Release(emitter);
    Require(gltapLiveObjects(GLTAP_PROGRAM, nullptr, 0) == 0 && g_BillboardCount == 0,
            "an emitter left billboards behind");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const Bytes input(data, data + size);
    Try(input);
    if (size >= QEX_EMITTER_FILE_SIZE) return 0;
    Bytes whole(QEX_EMITTER_FILE_SIZE);
    for (size_t i = 0; i < size; ++i) {
        const size_t counts = QEX_EMITTER_FILE_SIZE - kCounts;
        whole[i < kParticles ? i : i < kParticles + counts ? i - kParticles + kCounts : i - counts] = data[i];
    }
    Try(whole);
    return 0;
}
