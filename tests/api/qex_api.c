/* The library from C: every exported symbol, and a few calls. */
#include <stdio.h>

#include "Qex.h"

typedef struct Symbol {
    const char* name;
    uintptr_t address;
} Symbol;

static int s_failures;

static void Check(int holds, const char* what) {
    if (holds) return;
    fprintf(stderr, "failed: %s\n", what);
    ++s_failures;
}

/* Compiles only when the header declares every symbol, and links only when the library has it. */
static void CheckSymbols(void) {
#define QEX_EXPORT(name) {#name, (uintptr_t)&name},
    const Symbol symbols[] = {
#include "qex_exports.inc"
    };
#undef QEX_EXPORT
    const size_t count = sizeof symbols / sizeof symbols[0];
    size_t i, j;
    Check(count > 300, "the list of exports is there");
    for (i = 0; i < count; ++i)
        for (j = 0; j < i; ++j) Check(symbols[i].address != symbols[j].address, symbols[i].name);
}

static void CheckMath(void) {
    QexMatrix translation, scale, both;
    QexMatrix_Translate(&translation, 10, 20, 30);
    QexMatrix_Scale(&scale, 2, 2, 2);
    QexMatrix_Multiply(&both, &translation, &scale);
    Check(both.m[12] == 10 && both.m[14] == 30 && both.m[5] == 2, "the right factor acts first");
    Check(g_sMatIdentity.m[0] == 1 && g_sMatIdentity.m[15] == 1, "exported data");
}

int main(void) {
    CheckSymbols();
    CheckMath();
    printf("%d failures\n", s_failures);
    return s_failures != 0;
}
