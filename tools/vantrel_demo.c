/* The main job on sample data, as a host runs it through vantrel.h. */
#include <stdio.h>
#include <stdlib.h>
#include <sys/stat.h>

#include "vantrel.h"

static int VANTREL_CALL Report(const char* text, int step, int steps) {
    printf("  progress: %s (%d/%d)\n", text, step, steps);
    return 0;
}

int main(int argc, char** argv) {
    static const char* const names[] = {"neutral.3cc", "cmyk2cmyk5neutral.mcc", "cmykog2cmykog5neutral.mcc",
                                        "cmykrgb2cmykrgb5neutral.mcc"};
    char dir[] = "/tmp/vantrel-demo-XXXXXX";
    char path[4096];
    void* tool = NULL;
    (void)argc, (void)argv;

    if (!mkdtemp(dir)) return 1;
    printf("Creating a tool object in %s/\n", dir);
    snprintf(path, sizeof path, "%s/", dir);
    if (dllInit(Report, &tool, path) != 0) {
        fprintf(stderr, "dllInit failed\n");
        return 1;
    }
    printf("Identity profiles written:\n");
    for (int i = 0; i < 4; ++i) {
        struct stat st;
        snprintf(path, sizeof path, "%s/%s", dir, names[i]);
        if (stat(path, &st) == 0)
            printf("  %-30s %8lld bytes\n", names[i], (long long)st.st_size);
        else
            printf("  %-30s missing\n", names[i]);
    }
    dllFree(tool);
    return 0;
}
