// A scene of any bytes: it is refused, or everything in it can be used.
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>

#include "support/WalkScene.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    // A block of its own: whoever reads beyond it is noticed.
    const std::unique_ptr<uint8_t[]> block(new uint8_t[size]);
    std::copy(data, data + size, block.get());
    QexPODModel scene;
    QexPODModel_ReadFromMemory(&scene, block.get(), static_cast<uint32_t>(size), 0, 0, 0, 0);
    const char* fault = scene.runtime ? SceneWalk(&scene).fault : nullptr;
    if (fault) {
        fprintf(stderr, "a scene was read, but not fit for use: %s\n", fault);
        abort();
    }
    QexPODModel_Release(&scene);
    return 0;
}
