/* A 32-bit Windows host: it loads vantrel.dll the way the real host does, resolves every
 * export by name and by ordinal, reads the embedded profiles as resources, runs the
 * scenario and compares what it sees with the Linux build's run of the same scenario.
 *   vantrel_win32_host EXPECTED LINUXWORK/ WORK/ FIXTUREDIR/ COLOURDIR/ TRANSCRIPT
 * EXPECTED is the Linux transcript and LINUXWORK/ the folder the Linux run wrote into. */
#define WIN32_LEAN_AND_MEAN
#include <windows.h>

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "scenario.h"

static int g_passed, g_failed;

static void Expect(int ok, const char* what, const char* detail) {
    if (ok) {
        ++g_passed;
    } else {
        ++g_failed;
        printf("FAILED: %s%s%s\n", what, detail ? ": " : "", detail ? detail : "");
    }
}

/* A whole file in memory; NULL when it cannot be read. */
static char* ReadAll(const char* path, long* size) {
    FILE* f = fopen(path, "rb");
    if (!f) return NULL;
    long n = 0;
    char* bytes = NULL;
    if (fseek(f, 0, SEEK_END) == 0 && (n = ftell(f)) >= 0 && fseek(f, 0, SEEK_SET) == 0 &&
        (bytes = (char*)malloc((size_t)n + 1)) != NULL) {
        if (fread(bytes, 1, (size_t)n, f) != (size_t)n) {
            free(bytes);
            bytes = NULL;
        } else {
            bytes[n] = '\0';
        }
    }
    fclose(f);
    *size = n;
    return bytes;
}

static char* Join(const char* dir, const char* name) {
    size_t n = strlen(dir) + strlen(name) + 1;
    char* path = (char*)malloc(n);
    if (path) snprintf(path, n, "%s%s", dir, name);
    return path;
}

/* Fills the function table; every export must be found under its name and under its
 * ordinal, and both must give the same address. */
static int ResolveExports(HMODULE module, VantrelApi* api) {
    FARPROC procs[VANTREL_EXPORT_COUNT];
    int complete = 1;
    for (int i = 0; i < VANTREL_EXPORT_COUNT; ++i) {
        char detail[96];
        FARPROC byName = GetProcAddress(module, kVantrelExportNames[i]);
        FARPROC byOrdinal = GetProcAddress(module, MAKEINTRESOURCEA(i + 1));
        snprintf(detail, sizeof detail, "%s, ordinal %d", kVantrelExportNames[i], i + 1);
        Expect(byName != NULL, "export found by name", detail);
        Expect(byOrdinal != NULL && byOrdinal == byName, "ordinal gives the named export", detail);
        procs[i] = byName;
        complete = complete && byName != NULL;
    }
    Expect(GetProcAddress(module, MAKEINTRESOURCEA(VANTREL_EXPORT_COUNT + 1)) == NULL,
           "no export past the fourteenth ordinal", NULL);
    /* Plain names only: no leading underscore, no stdcall @N suffix. */
    Expect(GetProcAddress(module, "_dllInit") == NULL && GetProcAddress(module, "dllInit@12") == NULL &&
               GetProcAddress(module, "_dllInit@12") == NULL,
           "no decorated export names", NULL);
    if (!complete) return 0;

#define TAKE(field, index) memcpy(&api->field, &procs[index], sizeof api->field)
    TAKE(dllInit, 0);
    TAKE(dllFree, 1);
    TAKE(analyse1, 2);
    TAKE(optimize1, 3);
    TAKE(analyse2, 4);
    TAKE(optimize2, 5);
    TAKE(analyse3, 6);
    TAKE(optimize3, 7);
    TAKE(Cmyk2Lab_Double, 8);
    TAKE(analyse4, 9);
    TAKE(Cmykrgb2Lab_Double, 10);
    TAKE(optimize4, 11);
    TAKE(RGB2Lab_Double, 12);
    TAKE(mergeMCHintoCMYK, 13);
#undef TAKE
    return 1;
}

/* The identity profiles are real resources of type "ICCPROFILE", ids 102..105, holding
 * the bytes the Linux build writes. */
static void CheckResources(HMODULE module, const char* linuxWork) {
    for (int i = 0; i < VANTREL_IDENTITY_FILE_COUNT; ++i) {
        const char* name = kVantrelIdentityFiles[i];
        HRSRC resource = FindResourceW(module, MAKEINTRESOURCEW(102 + i), L"ICCPROFILE");
        HGLOBAL loaded = resource ? LoadResource(module, resource) : NULL;
        const void* data = loaded ? LockResource(loaded) : NULL;
        DWORD size = resource ? SizeofResource(module, resource) : 0;
        Expect(data != NULL && size > 0, "identity profile present as a resource", name);
        char* path = Join(linuxWork, name);
        long expectedSize = 0;
        char* expected = path ? ReadAll(path, &expectedSize) : NULL;
        free(path);
        Expect(expected != NULL, "Linux copy of the identity profile readable", name);
        if (data && expected)
            Expect((long)size == expectedSize && memcmp(data, expected, (size_t)size) == 0,
                   "resource bytes equal the Linux build's file", name);
        free(expected);
    }
}

/* The files dllInit wrote, byte for byte against the Linux run's. */
static void CompareWrittenFiles(const char* linuxWork, const char* work) {
    for (int prefixed = 0; prefixed < 2; ++prefixed) {
        for (int i = 0; i < VANTREL_IDENTITY_FILE_COUNT; ++i) {
            char* name = Join(prefixed ? "prefix-" : "", kVantrelIdentityFiles[i]);
            char* ours = name ? Join(work, name) : NULL;
            char* theirs = name ? Join(linuxWork, name) : NULL;
            long ourSize = 0, theirSize = 0;
            char* a = ours ? ReadAll(ours, &ourSize) : NULL;
            char* b = theirs ? ReadAll(theirs, &theirSize) : NULL;
            Expect(a != NULL && b != NULL && ourSize == theirSize && memcmp(a, b, (size_t)ourSize) == 0,
                   "written file byte-identical to the Linux build's", name);
            free(a);
            free(b);
            free(ours);
            free(theirs);
            free(name);
        }
    }
}

/* Line by line; each differing line is shown with what Linux wrote. */
static void CompareTranscripts(const char* expectedPath, const char* actualPath) {
    long expectedSize = 0, actualSize = 0;
    char* expected = ReadAll(expectedPath, &expectedSize);
    char* actual = ReadAll(actualPath, &actualSize);
    Expect(expected != NULL, "Linux transcript readable", expectedPath);
    Expect(actual != NULL, "own transcript readable", actualPath);
    if (!expected || !actual) {
        free(expected);
        free(actual);
        return;
    }
    char* e = expected;
    char* a = actual;
    int line = 0;
    int shown = 0;
    while (*e || *a) {
        ++line;
        char* eEnd = strchr(e, '\n');
        char* aEnd = strchr(a, '\n');
        if (eEnd) *eEnd = '\0';
        if (aEnd) *aEnd = '\0';
        int same = strcmp(e, a) == 0;
        if (!same && shown++ < 20) printf("line %d\n  linux:   %s\n  windows: %s\n", line, e, a);
        Expect(same, "transcript line as on Linux", NULL);
        e = eEnd ? eEnd + 1 : e + strlen(e);
        a = aEnd ? aEnd + 1 : a + strlen(a);
    }
    printf("transcript: %d lines compared\n", line);
    free(expected);
    free(actual);
}

int main(int argc, char** argv) {
    if (argc != 7) {
        fprintf(stderr, "usage: %s EXPECTED LINUXWORK/ WORK/ FIXTUREDIR/ COLOURDIR/ TRANSCRIPT\n", argv[0]);
        return 2;
    }
    const char* expectedTranscript = argv[1];
    const char* linuxWork = argv[2];
    const ScenarioPaths paths = {argv[3], argv[4], argv[5]};
    const char* transcriptPath = argv[6];

    /* By its plain name, as the real host does: found beside this program. */
    HMODULE module = LoadLibraryW(L"vantrel.dll");
    Expect(module != NULL, "LoadLibraryW(\"vantrel.dll\")", NULL);
    if (!module) {
        printf("win32 host: %d passed, %d failed\n", g_passed, g_failed);
        return 1;
    }

    VantrelApi api;
    memset(&api, 0, sizeof api);
    if (ResolveExports(module, &api)) {
        CheckResources(module, linuxWork);
        FILE* out = fopen(transcriptPath, "wb");
        Expect(out != NULL, "transcript writable", transcriptPath);
        if (out) {
            int failures = RunScenario(&api, &paths, out);
            fclose(out);
            Expect(failures == 0, "scenario checks", NULL);
            CompareTranscripts(expectedTranscript, transcriptPath);
            CompareWrittenFiles(linuxWork, paths.work);
        }
    }
    /* The library's own LoadLibraryW/FreeLibrary pairs must leave one reference: ours. */
    Expect(FreeLibrary(module) != 0, "FreeLibrary", NULL);
    Expect(GetModuleHandleW(L"vantrel.dll") == NULL, "vantrel.dll unloaded after the last FreeLibrary", NULL);

    printf("win32 host: %d passed, %d failed\n", g_passed, g_failed);
    return g_failed ? 1 : 0;
}
