// Reading a scene from memory against copying its bytes once into a block of its own.
#include <cstdlib>
#include <cstring>

#include "Qex.h"
#include "Ratio.h"
#include "Scenes.h"
#include "Silence.h"

int main(int argc, char** argv) {
    RatioBench bench(&argc, argv);
    const std::vector<uint8_t> file = pod::WritePod(scenes::Large(10u << 20));
    const uint32_t size = static_cast<uint32_t>(file.size());
    bench.Compare(
        "read a 10 MB POD / memcpy to a new block", 4.0,
        [&] {
            const Silence silence;
            QexPODModel scene;
            QexPODModel_ReadFromMemory(&scene, file.data(), size, 0, 0, 0, 0);
            if (!scene.runtime) abort();
            QexPODModel_Release(&scene);
        },
        [&] {
            void* copy = malloc(file.size());
            memcpy(copy, file.data(), file.size());
            KeepValue(copy);
            free(copy);
        });
    return bench.Result();
}
