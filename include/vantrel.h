/* Vantrel: colour management for proofing.
 *
 * A host loads the library (libvantrel.so, vantrel.dll) and drives it through
 * these fourteen functions. dllInit creates a tool object and hands back its
 * handle; every other function takes that handle first; dllFree destroys it.
 * Numbers cross the boundary as ints scaled by 1000. Calls on one handle must
 * not overlap; the library starts no threads.
 */
#ifndef VANTREL_H
#define VANTREL_H

#if defined(_WIN32)
#define VANTREL_CALL __cdecl
#else
#define VANTREL_CALL
#endif

#if defined(VANTREL_BUILDING) && !defined(_WIN32)
#define VANTREL_API __attribute__((visibility("default")))
#else
#define VANTREL_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* Progress reports: a text, a step and the step count. A non-zero answer asks
 * the measurement scans and the optimisation loops to stop. */
typedef int(VANTREL_CALL* ProgressCallback)(const char* text, int step, int steps);

VANTREL_API int VANTREL_CALL dllInit(ProgressCallback progress, void** handleOut, const char* dir);
VANTREL_API int VANTREL_CALL dllFree(void* handle);

VANTREL_API int VANTREL_CALL analyse1(void* handle, const char* paperProfile, int* lab, int* values);
VANTREL_API int VANTREL_CALL analyse2(void* handle, const char* isdProfile, const char* outIT8,
                                      const char* measIT8, int* out1, int* out2);
VANTREL_API int VANTREL_CALL analyse3(void* handle, const char* paperProfile, const char* outprof3CC,
                                      const char* referenceIT8, const char* measIT8, int* out1, int* out2);
VANTREL_API int VANTREL_CALL analyse4(void* handle, const char* paperProfile, const char* refProfile,
                                      const char* referenceIT8, const char* measIT8, int* out1, int* out2,
                                      int* out3, int* out4);

VANTREL_API int VANTREL_CALL optimize1(void* handle, const char* paperProfile, int* out1, int* out2);
VANTREL_API int VANTREL_CALL optimize2(void* handle, const char* outProfile, int* out1, int* out2, int option);
VANTREL_API int VANTREL_CALL optimize3(void* handle, const char* outprof3CC, int* out1, int* out2, int option);
VANTREL_API int VANTREL_CALL optimize4(void* handle, const char* outprof3CC, int* out1, int* out2,
                                       unsigned short* table, const char* paperProfile, int option);

VANTREL_API int VANTREL_CALL mergeMCHintoCMYK(void* handle, const char* refProfile, const char* paperProfile,
                                              const char* outProfile);

/* count records of 4 (C, M, Y, K in percent), 3 (R, G, B, 0..255) or 7 (CMYK plus
 * three further channels, percent) ints in; 3 ints of Lab and 3 of XYZ (x 1000)
 * out per record. The two unnamed ints are not read. */
VANTREL_API int VANTREL_CALL Cmyk2Lab_Double(void* handle, const char* profile, int count, const int* cmyk,
                                             int, int* lab, int, int* xyz);
VANTREL_API int VANTREL_CALL RGB2Lab_Double(void* handle, const char* profile, int count, const int* rgb,
                                            int, int* lab, int, int* xyz);
VANTREL_API int VANTREL_CALL Cmykrgb2Lab_Double(void* handle, const char* profile, int count, const int* values,
                                                int, int* lab, int, int* xyz);

#ifdef __cplusplus
}
#endif

#endif /* VANTREL_H */
