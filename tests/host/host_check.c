/* A host program in C: it includes only vantrel.h and links the shared library. */
#include <stdio.h>
#include <string.h>
#include <sys/stat.h>

#include "vantrel.h"

static int calls;
static int VANTREL_CALL OnProgress(const char* text, int step, int steps) {
    (void)text, (void)step, (void)steps;
    ++calls;
    return 0;
}

static int failures;
static void Expect(int ok, const char* what) {
    if (!ok) {
        fprintf(stderr, "FAILED: %s\n", what);
        ++failures;
    }
}

int main(int argc, char** argv) {
    const char* dir = argc > 1 ? argv[1] : "/tmp/vantrel-host-check/";
    char path[4096];
    void* handle = NULL;
    struct stat st;
    int out1 = 0, out2 = 0;

    mkdir(dir, 0755);
    Expect(dllInit(OnProgress, &handle, dir) == 0 && handle != NULL, "dllInit gives a handle");
    snprintf(path, sizeof path, "%sneutral.3cc", dir);
    Expect(stat(path, &st) == 0 && st.st_size == 714612, "neutral.3cc written with its size");
    snprintf(path, sizeof path, "%scmykrgb2cmykrgb5neutral.mcc", dir);
    Expect(stat(path, &st) == 0, "seven-channel link written");
    Expect(optimize1(NULL, "x.icc", &out1, &out2) == 1, "optimize1 refuses a null handle");
    Expect(dllFree(handle) == 0, "dllFree");
    Expect(dllFree(NULL) == 0, "dllFree of null");
    printf("host check: %d failures\n", failures);
    return failures ? 1 : 0;
}
