/* The Linux side of the Windows comparison: runs the scenario against libvantrel.so and
 * writes the transcript the Windows host must reproduce.
 *   vantrel_win32_reference WORKDIR/ FIXTUREDIR/ COLOURDIR/ TRANSCRIPT */
#include <stdio.h>

#include "scenario.h"

int main(int argc, char** argv) {
    if (argc != 5) {
        fprintf(stderr, "usage: %s WORKDIR/ FIXTUREDIR/ COLOURDIR/ TRANSCRIPT\n", argv[0]);
        return 2;
    }
    /* Assigning the linked functions checks the table's types against the public header. */
    const VantrelApi api = {dllInit,  dllFree,         analyse1,  optimize1,          analyse2,
                            optimize2, analyse3,       optimize3, Cmyk2Lab_Double,    analyse4,
                            Cmykrgb2Lab_Double, optimize4, RGB2Lab_Double, mergeMCHintoCMYK};
    const ScenarioPaths paths = {argv[1], argv[2], argv[3]};
    FILE* out = fopen(argv[4], "wb");
    if (!out) {
        fprintf(stderr, "cannot write %s\n", argv[4]);
        return 2;
    }
    int failures = RunScenario(&api, &paths, out);
    fclose(out);
    if (failures) fprintf(stderr, "reference run: %d checks failed\n", failures);
    return failures ? 1 : 0;
}
