/* The calls that the Linux library and vantrel.dll must answer alike.
 *
 * Both builds run the same scenario through a table of the fourteen functions and
 * write what they observe, one line per observation, into a transcript. The Linux
 * run's transcript is the expected one; the Windows host compares its own with it
 * line by line. A new export is covered in both builds by adding its calls here.
 */
#ifndef VANTREL_TESTS_WIN32_SCENARIO_H
#define VANTREL_TESTS_WIN32_SCENARIO_H

#include <stdio.h>

#include "vantrel.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct VantrelApi {
    int(VANTREL_CALL* dllInit)(ProgressCallback progress, void** handleOut, const char* dir);
    int(VANTREL_CALL* dllFree)(void* handle);
    int(VANTREL_CALL* analyse1)(void* handle, const char* paperProfile, int* lab, int* values);
    int(VANTREL_CALL* optimize1)(void* handle, const char* paperProfile, int* out1, int* out2);
    int(VANTREL_CALL* analyse2)(void* handle, const char* isdProfile, const char* outIT8, const char* measIT8,
                                int* out1, int* out2);
    int(VANTREL_CALL* optimize2)(void* handle, const char* outProfile, int* out1, int* out2, int option);
    int(VANTREL_CALL* analyse3)(void* handle, const char* paperProfile, const char* outprof3CC,
                                const char* referenceIT8, const char* measIT8, int* out1, int* out2);
    int(VANTREL_CALL* optimize3)(void* handle, const char* outprof3CC, int* out1, int* out2, int option);
    int(VANTREL_CALL* Cmyk2Lab_Double)(void* handle, const char* profile, int count, const int* cmyk, int,
                                       int* lab, int, int* xyz);
    int(VANTREL_CALL* analyse4)(void* handle, const char* paperProfile, const char* refProfile,
                                const char* referenceIT8, const char* measIT8, int* out1, int* out2, int* out3,
                                int* out4);
    int(VANTREL_CALL* Cmykrgb2Lab_Double)(void* handle, const char* profile, int count, const int* values, int,
                                          int* lab, int, int* xyz);
    int(VANTREL_CALL* optimize4)(void* handle, const char* outprof3CC, int* out1, int* out2,
                                 unsigned short* table, const char* paperProfile, int option);
    int(VANTREL_CALL* RGB2Lab_Double)(void* handle, const char* profile, int count, const int* rgb, int,
                                      int* lab, int, int* xyz);
    int(VANTREL_CALL* mergeMCHintoCMYK)(void* handle, const char* refProfile, const char* paperProfile,
                                        const char* outProfile);
} VantrelApi;

/* The exports in ordinal order: entry i has ordinal i + 1. */
#define VANTREL_EXPORT_COUNT 14
extern const char* const kVantrelExportNames[VANTREL_EXPORT_COUNT];

/* The files dllInit writes into its directory. */
#define VANTREL_IDENTITY_FILE_COUNT 4
extern const char* const kVantrelIdentityFiles[VANTREL_IDENTITY_FILE_COUNT];

/* Where a scenario run reads and writes. Every folder is given with its trailing separator,
 * in the form the platform's C library opens. */
typedef struct ScenarioPaths {
    const char* work;      /* an empty folder of this run's own */
    const char* fixtures;  /* the Argyll-built test profiles (FOGRA39L.icc, TR003.icc) */
    const char* colour;    /* the system's ICC folder (sRGB.icc) */
} ScenarioPaths;

/* Runs every call and writes the transcript to out. Returns the number of checks that
 * failed on this side alone (a crash-free run of a build answers its own invariants). */
int RunScenario(const VantrelApi* api, const ScenarioPaths* paths, FILE* out);

#ifdef __cplusplus
}
#endif

#endif
