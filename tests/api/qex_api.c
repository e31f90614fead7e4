/* The library from C: every exported symbol, and a call. */
#include <stdio.h>

#include "Qex.h"

typedef struct Symbol {
    const char* name;
    uintptr_t address;
} Symbol;

/* Compiles only when the header declares every symbol, and links only when the library has it. */
int main(void) {
#define QEX_EXPORT(name) {#name, (uintptr_t)&name},
    const Symbol symbols[] = {
#include "qex_exports.inc"
    };
#undef QEX_EXPORT
    const size_t count = sizeof symbols / sizeof symbols[0];
    int failures = count < 300;
    QexEngineConfig config = {0};
    size_t i, j;
    for (i = 0; i < count; ++i)
        for (j = 0; j < i; ++j)
            if (symbols[i].address == symbols[j].address) {
                fprintf(stderr, "%s is %s\n", symbols[i].name, symbols[j].name);
                ++failures;
            }
    failures += QexEngine_Init(NULL, QEX_ENGINE_CONFIG_SIZE, &config) != -1;
    return failures != 0;
}
