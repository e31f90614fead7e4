// Writes the files that fuzzing starts from: corpus FOLDER makes FOLDER/pod, pvr, ktx, tga and emitter.
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include "support/Capture.h"
#include "support/ImageFiles.h"
#include "support/PodScenes.h"

namespace {

using Entry = std::pair<const char*, Bytes>;

// The settings and counts of an emitter file, as they lie in one.
Bytes EmitterSettings() {
    QexParticleEmitter* emitter = QexParticleEmitter_Create();
    emitter->emissionRate[0] = emitter->currentRate = 3;
    emitter->colorCount = emitter->animationCount = 2;
    emitter->animations[1].frameCount = 3;
    emitter->positionSpread = {1, 2, 3};
    const MemoryFile file({});
    QexParticleEmitter_WriteToBinFile(emitter, file.Path());
    QexParticleEmitter_Release(emitter);
    std::ifstream stream(file.Path(), std::ios::binary);
    Bytes bytes((std::istreambuf_iterator<char>(stream)), {});
    bytes.erase(bytes.begin() + 892, bytes.end() - 12);  // the particles
    return bytes;
}

std::vector<Entry> Entries() {
    PodBlocks empty, swapped;
    empty.Version().Begin(1001).End(1001);
    swapped.Marker(0xE8030000u, 0x0B000000u);
    Bytes old = pod::WritePvr(PvrNoise(pod::kPvrRgb565, 5, 3, 1, 1));
    PutWord(&old, 0, 44);
    old.erase(old.begin() + 44, old.begin() + 52);
    Ktx words = SoundKtx();
    words.type = GL_UNSIGNED_SHORT_4_4_4_4;
    words.levels = {{Noise(32)}, {Noise(8)}};
    pod::Scene unbatched = everything::Scene();
    unbatched.meshes[0].batchCount = unbatched.meshes[0].batchBoneMax = 0;
    return {
        {"pod/unbatched", pod::WritePod(unbatched)},
        {"pod/everything", pod::WritePod(everything::Scene())},
        {"pod/empty", empty.bytes},
        {"pod/swapped", swapped.bytes},
        {"pvr/cube", pod::WritePvr(PvrNoise(pod::kPvrRgba4444, 4, 4, 3, 6))},
        {"pvr/etc1", pod::WritePvr(PvrNoise(pod::kPvrEtc1, 8, 8, 4, 1))},
        {"pvr/pvrtc2", pod::WritePvr(PvrNoise(pod::kPvrtc2, 16, 8, 5, 1))},
        {"pvr/pvrtc4", pod::WritePvr(PvrNoise(pod::kPvrtc4, 16, 16, 5, 6))},
        {"pvr/la88", pod::WritePvr(PvrNoise(pod::kPvrLuminanceAlpha88, 16, 8, 5, 1))},
        {"pvr/large-etc1", pod::WritePvr(PvrNoise(pod::kPvrEtc1, 301, 259, 1, 1))},
        {"pvr/large-pvrtc2", pod::WritePvr(PvrNoise(pod::kPvrtc2, 512, 256, 10, 1))},
        {"pvr/large-pvrtc4", pod::WritePvr(PvrNoise(pod::kPvrtc4, 256, 512, 1, 1))},
        {"pvr/old", old},
        {"pvr/ktx", SoundKtx().File()},
        {"ktx/levels", SoundKtx().File()},
        {"ktx/cube", CubeKtx().File()},
        {"ktx/swapped", SwappedFile(words)},
        {"ktx/etc1", Etc1Ktx().File()},
        {"tga/rgb", TgaFile(3, 2, 24, Noise(18))},
        {"tga/wide", TgaFile(700, 3, 24, Noise(6300))},
        {"tga/rgba", TgaFile(2, 2, 32, Noise(16))},
        {"tga/grey", TgaFile(2, 2, 8, Noise(4))},
        {"emitter/settings", EmitterSettings()},
    };
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "usage: %s FOLDER\n", argv[0]);
        return 2;
    }
    for (const auto& [name, file] : Entries()) {
        const std::filesystem::path path = std::filesystem::path(argv[1]) / name;
        std::filesystem::create_directories(path.parent_path());
        if (pod::WriteFile(path.string(), file)) continue;
        fprintf(stderr, "%s cannot be written\n", path.c_str());
        return 1;
    }
    return 0;
}
