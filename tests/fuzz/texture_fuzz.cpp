// One image file of any bytes through the loader of QEX_FUZZ_LOAD, without a driver: the tap stands for GL,
// and copies what GL would have read. Aborts when a refused file leaves a texture behind.
#include "gltap.h"
#include "Qex.h"
#include "support/Capture.h"

namespace {

[[maybe_unused]] void LoadPvr(QexTexture* texture, const char* path) {
    QexTexture_LoadPVRFromFile(texture, path, nullptr, 1, 0);
}
[[maybe_unused]] void LoadKtx(QexTexture* texture, const char* path) {
    QexTexture_LoadKTXFromFile(texture, path, nullptr, 1, 0);
}
[[maybe_unused]] void LoadTga(QexTexture* texture, const char* path) {
    QexTexture_CreateTGAFromFile(texture, 0, 0, QEX_FILTER_LINEAR, QEX_WRAP_CLAMP, path);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    gltapReset();
    gltapSetMode(GLTAP_NULL);
    const MemoryFile file(std::vector<uint8_t>(data, data + size));
    QexTexture texture = {};
    gltapBeginRecording();
    QEX_FUZZ_LOAD(&texture, file.Path());
    gltapReleaseRecording(gltapEndRecording());
    if (texture.glName) QexTexture_Release(&texture);
    if (gltapLiveObjects(GLTAP_TEXTURE, nullptr, 0) == 0) return 0;
    fprintf(stderr, "a refused image left a texture behind\n");
    abort();
}
