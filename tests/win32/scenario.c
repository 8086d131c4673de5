/* The scenario both builds run; see scenario.h. Output is plain text, integers only, so
 * that the two transcripts compare byte for byte whatever the platform's C library. */
#include "scenario.h"

#include <stdint.h>
#include <stdlib.h>
#include <string.h>

const char* const kVantrelExportNames[VANTREL_EXPORT_COUNT] = {
    "dllInit",   "dllFree",        "analyse1",           "optimize1", "analyse2",       "optimize2",
    "analyse3",  "optimize3",      "Cmyk2Lab_Double",    "analyse4",  "Cmykrgb2Lab_Double", "optimize4",
    "RGB2Lab_Double", "mergeMCHintoCMYK"};

const char* const kVantrelIdentityFiles[VANTREL_IDENTITY_FILE_COUNT] = {
    "neutral.3cc", "cmyk2cmyk5neutral.mcc", "cmykog2cmykog5neutral.mcc", "cmykrgb2cmykrgb5neutral.mcc"};

/* Outputs are filled with this before a call, so that a value the library left alone shows. */
#define UNTOUCHED (-777)
/* Most records one conversion call of the scenario passes. */
#define MAX_RECORDS 32

typedef struct Digest {
    uint64_t hash;
    unsigned long count;
} Digest;

static void DigestBytes(Digest* d, const void* data, size_t n) {
    const unsigned char* p = (const unsigned char*)data;
    for (size_t i = 0; i < n; ++i) {
        d->hash ^= p[i];
        d->hash *= 1099511628211u; /* FNV-1a, 64 bit */
    }
}

static void DigestReset(Digest* d) {
    d->hash = 14695981039346656037u;
    d->count = 0;
}

static void PrintDigest(FILE* out, const Digest* d) {
    fprintf(out, "%08lx%08lx", (unsigned long)(d->hash >> 32), (unsigned long)(d->hash & 0xFFFFFFFFu));
}

/* Progress calls during one export: how many, and a digest of their texts and steps. The
 * callback has no context argument, so the scenario keeps the tally here. */
static Digest g_progress;

static int VANTREL_CALL OnProgress(const char* text, int step, int steps) {
    ++g_progress.count;
    if (text) DigestBytes(&g_progress, text, strlen(text) + 1);
    DigestBytes(&g_progress, &step, sizeof step);
    DigestBytes(&g_progress, &steps, sizeof steps);
    return 0;
}

static void ProgressLine(FILE* out) {
    fprintf(out, "  progress calls=%lu digest=", g_progress.count);
    PrintDigest(out, &g_progress);
    fputc('\n', out);
    DigestReset(&g_progress);
}

static int g_failures;

static void Check(int ok, const char* what) {
    if (!ok) {
        fprintf(stderr, "FAILED: %s\n", what);
        ++g_failures;
    }
}

static char* Join(const char* dir, const char* name) {
    size_t n = strlen(dir) + strlen(name) + 1;
    char* path = (char*)malloc(n);
    if (path) snprintf(path, n, "%s%s", dir, name);
    return path;
}

/* Size and digest of a file, or "missing". Returns the size, -1 when missing. A text file
 * is digested without its carriage returns: Windows writes its lines with CR LF. */
static long DigestFileLine(FILE* out, const char* dir, const char* name, int text) {
    char* path = Join(dir, name);
    FILE* f = path ? fopen(path, "rb") : NULL;
    free(path);
    if (!f) {
        fprintf(out, "file %s missing\n", name);
        return -1;
    }
    Digest d;
    DigestReset(&d);
    unsigned char buffer[65536];
    long size = 0;
    size_t got;
    while ((got = fread(buffer, 1, sizeof buffer, f)) > 0) {
        if (text) {
            size_t kept = 0;
            for (size_t i = 0; i < got; ++i)
                if (buffer[i] != '\r') buffer[kept++] = buffer[i];
            got = kept;
        }
        DigestBytes(&d, buffer, got);
        size += (long)got;
    }
    fclose(f);
    fprintf(out, "file %s size=%ld fnv1a=", name, size);
    PrintDigest(out, &d);
    fputc('\n', out);
    return size;
}

static long FileLine(FILE* out, const char* dir, const char* name) { return DigestFileLine(out, dir, name, 0); }
static long TextFileLine(FILE* out, const char* dir, const char* name) { return DigestFileLine(out, dir, name, 1); }

static int Exists(const char* dir, const char* name) {
    char* path = Join(dir, name);
    FILE* f = path ? fopen(path, "rb") : NULL;
    free(path);
    if (f) fclose(f);
    return f != NULL;
}

static void InitWithDirectory(const VantrelApi* api, const char* label, const char* dir, FILE* out) {
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, dir);
    fprintf(out, "dllInit(%s) = %d handle=%s\n", label, rc, handle ? "set" : "null");
    ProgressLine(out);
    Check(rc == 0 && handle != NULL, "dllInit gives a handle");
    if (handle) fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

static void IdentityFiles(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    InitWithDirectory(api, "null dir", NULL, out);
    InitWithDirectory(api, "empty dir", "", out);

    InitWithDirectory(api, "work dir", paths->work, out);
    for (int i = 0; i < VANTREL_IDENTITY_FILE_COUNT; ++i) {
        long size = FileLine(out, paths->work, kVantrelIdentityFiles[i]);
        Check(size > 0, "an identity profile is written");
        if (i == 0) Check(size == 714612, "neutral.3cc has its size");
    }

    /* The directory is a prefix: without a trailing separator the names run on. */
    char* prefix = Join(paths->work, "prefix-");
    if (!prefix) return;
    InitWithDirectory(api, "work dir + \"prefix-\"", prefix, out);
    free(prefix);
    for (int i = 0; i < VANTREL_IDENTITY_FILE_COUNT; ++i) {
        char* name = Join("prefix-", kVantrelIdentityFiles[i]);
        if (name) FileLine(out, paths->work, name);
        free(name);
    }
}

static void NullHandles(const VantrelApi* api, FILE* out) {
    int a = UNTOUCHED, b = UNTOUCHED, c = UNTOUCHED, d = UNTOUCHED;
    int lab[3] = {0, 0, 0}, values[7] = {0, 0, 0, 0, 0, 0, 0};
    unsigned short table[8] = {0};
    fprintf(out, "null handle: dllFree=%d analyse1=%d optimize1=%d analyse2=%d optimize2=%d\n",
            api->dllFree(NULL), api->analyse1(NULL, "p.icc", lab, values), api->optimize1(NULL, "p.icc", &a, &b),
            api->analyse2(NULL, "i.isd", "o.it8", "m.it8", &a, &b), api->optimize2(NULL, "o.icc", &a, &b, 0));
    fprintf(out, "null handle: optimize3=%d analyse4=%d optimize4=%d mergeMCHintoCMYK=%d\n",
            api->optimize3(NULL, "o.3cc", &a, &b, 0),
            api->analyse4(NULL, "p.icc", "r.icc", "r.it8", "m.it8", &a, &b, &c, &d),
            api->optimize4(NULL, "o.mcc", &a, &b, table, "", 0),
            api->mergeMCHintoCMYK(NULL, "r.icc", "p.icc", "o.icc"));
    fprintf(out, "null handle outputs: %d %d %d %d\n", a, b, c, d);
    Check(a == UNTOUCHED && b == UNTOUCHED && c == UNTOUCHED && d == UNTOUCHED,
          "a null handle leaves the outputs alone");
}

typedef int(VANTREL_CALL* ConversionFn)(void*, const char*, int, const int*, int, int*, int, int*);

/* One conversion call: its result and every record's Lab and XYZ. */
static void Convert(FILE* out, void* handle, const char* name, ConversionFn convert, const char* label,
                    const char* dir, const char* file, int channels, int count, const int* input) {
    int lab[3 * MAX_RECORDS], xyz[3 * MAX_RECORDS];
    for (int i = 0; i < 3 * MAX_RECORDS; ++i) lab[i] = xyz[i] = UNTOUCHED;
    char* path = dir ? Join(dir, file) : NULL;
    int rc = convert(handle, dir ? path : file, count, input, 0, lab, 0, xyz);
    free(path);
    fprintf(out, "%s(%s, count %d) = %d\n", name, label, count, rc);
    ProgressLine(out);
    /* One record past the count shows whether the library wrote beyond it. */
    int shown = count < 0 ? 1 : (count < MAX_RECORDS ? count + 1 : MAX_RECORDS);
    for (int r = 0; r < shown; ++r) {
        fprintf(out, "  in");
        for (int c = 0; c < channels && r < count; ++c) fprintf(out, " %d", input[r * channels + c]);
        fprintf(out, " -> lab %d %d %d xyz %d %d %d\n", lab[3 * r], lab[3 * r + 1], lab[3 * r + 2], xyz[3 * r],
                xyz[3 * r + 1], xyz[3 * r + 2]);
    }
}

static void Conversions(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, NULL);
    fprintf(out, "dllInit(null dir, for the conversions) = %d\n", rc);
    ProgressLine(out);
    Check(rc == 0 && handle != NULL, "dllInit without a directory gives a handle");
    if (!handle) return;

    static const int kCmyk[] = {0,   0,  0,   0,   100, 0,  0,   0,  0,  100, 0,  0,   0,  0,   100, 0,
                                0,   0,  0,   100, 100, 100, 100, 100, 50, 50,  50, 50,  25, 75,  10,  0,
                                100, 100, 0,  0,   0,   100, 100, 0,   100, 0,  100, 0,   30, 60,  90,  20};
    static const int kRgb[] = {0,   0,   0,   255, 255, 255, 255, 0, 0,   0,   255, 0,   0,   0,  255,
                               128, 128, 128, 255, 255, 0,   0,   255, 255, 255, 0,  255, 200, 100, 50};
    const int cmykCount = (int)(sizeof kCmyk / sizeof kCmyk[0] / 4);
    const int rgbCount = (int)(sizeof kRgb / sizeof kRgb[0] / 3);

    /* A missing profile name is refused before anything happens. */
    Convert(out, handle, "Cmyk2Lab_Double", api->Cmyk2Lab_Double, "empty name", NULL, "", 4, 1, kCmyk);
    Convert(out, handle, "RGB2Lab_Double", api->RGB2Lab_Double, "null name", NULL, NULL, 3, 1, kRgb);
    Convert(out, handle, "Cmykrgb2Lab_Double", api->Cmykrgb2Lab_Double, "empty name", NULL, "", 7, 1, kCmyk);

    static const char* const kCmykProfiles[] = {"FOGRA39L.icc", "TR003.icc"};
    for (size_t i = 0; i < sizeof kCmykProfiles / sizeof kCmykProfiles[0]; ++i) {
        if (!Exists(paths->fixtures, kCmykProfiles[i])) {
            fprintf(out, "profile %s missing\n", kCmykProfiles[i]);
            continue;
        }
        Convert(out, handle, "Cmyk2Lab_Double", api->Cmyk2Lab_Double, kCmykProfiles[i], paths->fixtures,
                kCmykProfiles[i], 4, cmykCount, kCmyk);
        Convert(out, handle, "Cmyk2Lab_Double", api->Cmyk2Lab_Double, kCmykProfiles[i], paths->fixtures,
                kCmykProfiles[i], 4, 0, kCmyk);
    }
    if (Exists(paths->colour, "sRGB.icc"))
        Convert(out, handle, "RGB2Lab_Double", api->RGB2Lab_Double, "sRGB.icc", paths->colour, "sRGB.icc", 3,
                rgbCount, kRgb);
    else
        fprintf(out, "profile sRGB.icc missing\n");

    fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

/* The device values that reproduce a wanted colour, from a start point. Reads the profile only. */
static void DeviceSearches(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    if (!Exists(paths->fixtures, "FOGRA39L.icc")) {
        fprintf(out, "profile FOGRA39L.icc missing\n");
        return;
    }
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, NULL);
    fprintf(out, "dllInit(null dir, for analyse1) = %d\n", rc);
    ProgressLine(out);
    if (!handle) return;
    char* profile = Join(paths->fixtures, "FOGRA39L.icc");
    /* Lab x 1000, then seven device values x 1000 on the 0..255 scale. */
    static const int kCases[][10] = {
        {50000, 0, 0, 127500, 127500, 127500, 0, 0, 0, 0},
        {60000, 40000, 20000, 0, 127500, 127500, 0, 0, 0, 0},
        {30000, -20000, -30000, 200000, 100000, 50000, 100000, 0, 0, 0},
    };
    for (size_t i = 0; profile && i < sizeof kCases / sizeof kCases[0]; ++i) {
        int lab[3], values[7];
        memcpy(lab, kCases[i], sizeof lab);
        memcpy(values, kCases[i] + 3, sizeof values);
        rc = api->analyse1(handle, profile, lab, values);
        fprintf(out, "analyse1(FOGRA39L.icc, lab %d %d %d) = %d values %d %d %d %d %d %d %d lab %d %d %d\n",
                kCases[i][0], kCases[i][1], kCases[i][2], rc, values[0], values[1], values[2], values[3], values[4],
                values[5], values[6], lab[0], lab[1], lab[2]);
        ProgressLine(out);
    }
    free(profile);
    fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

static int CopyFile(const char* from, const char* to) {
    FILE* in = from ? fopen(from, "rb") : NULL;
    FILE* out = in && to ? fopen(to, "wb") : NULL;
    int ok = in && out;
    unsigned char buffer[65536];
    size_t got;
    while (ok && (got = fread(buffer, 1, sizeof buffer, in)) > 0) ok = fwrite(buffer, 1, got, out) == got;
    if (in) fclose(in);
    if (out) fclose(out);
    return ok;
}

/* A measurement through the embedded neutral profile: the file it writes next to the
 * measurement and its copy must be the same in both builds. */
static void IsdAnalysis(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    char* source = Join(paths->colour, "TR003.ti3");
    char* meas = Join(paths->work, "meas.ti3");
    int copied = CopyFile(source, meas);
    free(source);
    if (!copied) {
        fprintf(out, "measurement TR003.ti3 missing\n");
        free(meas);
        return;
    }
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, paths->work);
    fprintf(out, "dllInit(work dir, for analyse2) = %d\n", rc);
    ProgressLine(out);
    char* isd = Join(paths->work, "neutral.3cc");
    char* result = Join(paths->work, "analyse2-out.it8");
    if (handle && isd && result) {
        int out1 = UNTOUCHED, out2 = UNTOUCHED;
        rc = api->analyse2(handle, isd, result, meas, &out1, &out2);
        fprintf(out, "analyse2(neutral.3cc, TR003.ti3) = %d out %d %d\n", rc, out1, out2);
        ProgressLine(out);
        TextFileLine(out, paths->work, "meas.ti3isd.it8");
        TextFileLine(out, paths->work, "analyse2-out.it8");
    }
    free(isd);
    free(result);
    free(meas);
    if (handle) fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

/* ---- mergeMCHintoCMYK -------------------------------------------------------------------
 * The seven-ink test reference folded into the FOGRA39L profile: the merged copy must be the
 * same file in both builds. */
static void MergeIntoCmyk(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    char* reference = Join(paths->fixtures, "ink-7CLR.icc");
    char* cmyk = Join(paths->fixtures, "FOGRA39L.icc");
    char* merged = Join(paths->work, "merged.icc");
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, NULL);
    fprintf(out, "dllInit(for mergeMCHintoCMYK) = %d\n", rc);
    ProgressLine(out);
    if (handle && reference && cmyk && merged) {
        rc = api->mergeMCHintoCMYK(handle, reference, cmyk, merged);
        fprintf(out, "mergeMCHintoCMYK(ink-7CLR.icc, FOGRA39L.icc) = %d\n", rc);
        ProgressLine(out);
        FileLine(out, paths->work, "merged.icc");
        Check(rc == 0, "mergeMCHintoCMYK on the test reference");
    }
    if (handle) fprintf(out, "dllFree = %d\n", api->dllFree(handle));
    free(reference);
    free(cmyk);
    free(merged);
}

/* ---- analyse3 and analyse4 (proof analyses) ---------------------------------------------- */

/* Writes text into the work folder; returns the path (to be freed) or NULL. */
static char* WriteWork(const ScenarioPaths* paths, const char* name, const char* text) {
    char* path = Join(paths->work, name);
    FILE* f = path ? fopen(path, "wb") : NULL;
    if (f) {
        fputs(text, f);
        fclose(f);
    }
    return path;
}

/* Copies a file of folder `dir` into the work folder under `name`; returns the copy's path or NULL. */
static char* CopyToWork(const ScenarioPaths* paths, const char* dir, const char* file, const char* name) {
    char* source = Join(dir, file);
    char* copy = Join(paths->work, name);
    int ok = CopyFile(source, copy);
    free(source);
    if (!ok) {
        free(copy);
        return NULL;
    }
    return copy;
}

static void* ProofHandle(const ScenarioPaths* paths, const VantrelApi* api, const char* job, FILE* out) {
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, paths->work);
    fprintf(out, "dllInit(work dir, for %s) = %d\n", job, rc);
    ProgressLine(out);
    return handle;
}

static void Analyse3Job(const VantrelApi* api, const ScenarioPaths* paths, const char* label, const char* link,
                        const char* ref, const char* meas, FILE* out) {
    void* handle = ProofHandle(paths, api, label, out);
    if (!handle) return;
    int out1 = UNTOUCHED, out2 = UNTOUCHED;
    int rc = api->analyse3(handle, "", link ? link : "", ref ? ref : "", meas, &out1, &out2);
    fprintf(out, "analyse3(%s) = %d out %d %d\n", label, rc, out1, out2);
    ProgressLine(out);
    fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

static void Analyse4Job(const VantrelApi* api, const ScenarioPaths* paths, const char* label, const char* paper,
                        const char* refProfile, const char* ref, const char* meas, FILE* out) {
    void* handle = ProofHandle(paths, api, label, out);
    if (!handle) return;
    int o[4] = {UNTOUCHED, UNTOUCHED, UNTOUCHED, UNTOUCHED};
    int rc = api->analyse4(handle, paper ? paper : "", refProfile ? refProfile : "", ref ? ref : "", meas, &o[0],
                           &o[1], &o[2], &o[3]);
    fprintf(out, "analyse4(%s) = %d out %d %d %d %d\n", label, rc, o[0], o[1], o[2], o[3]);
    ProgressLine(out);
    fprintf(out, "dllFree = %d\n", api->dllFree(handle));
}

#define PROOF_FIELDS "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n" \
                     "END_DATA_FORMAT\nNUMBER_OF_SETS 5\nBEGIN_DATA\n"

/* A proof against its press reference, a reference simulated from a profile, charts in another
 * order, the repeatability of one chart, and two calibration runs that correct a device link. */
static void ProofAnalyses(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    char* ref = CopyToWork(paths, paths->colour, "FOGRA39L.ti3", "proof-ref.ti3");
    char* meas = CopyToWork(paths, paths->colour, "FOGRA40L.ti3", "proof-meas.ti3");
    char* paper = Join(paths->fixtures, "FOGRA39L.icc");
    char* refProfile = CopyToWork(paths, paths->fixtures, "FOGRA39L.icc", "proof-ref.icc");
    char* neutral = Join(paths->work, "neutral.3cc");
    if (!ref || !meas || !refProfile) {
        fprintf(out, "proof analyses: FOGRA data or fixture missing\n");
    } else {
        Analyse4Job(api, paths, "FOGRA39L.icc, FOGRA39L.ti3, FOGRA40L.ti3", paper, "", ref, meas, out);
        Analyse4Job(api, paths, "simulated FOGRA39L.icc, FOGRA40L.ti3", paper, refProfile, "", meas, out);
        TextFileLine(out, paths->work, "proof-ref.icc.it8");
        Analyse3Job(api, paths, "neutral.3cc, FOGRA39L.ti3, FOGRA40L.ti3", neutral, ref, meas, out);
        Analyse3Job(api, paths, "repeatability FOGRA40L.ti3", NULL, NULL, meas, out);
        /* Patches of the chart in reverse order and a subset of them. */
        char* shuffled = WriteWork(paths, "proof-shuffled.it8",
                                   PROOF_FIELDS "1 100 0 100 0 47 -65 25\n2 0 0 0 100 18 1 1\n3 0 40 0 0 76 26 -7\n"
                                                "4 0 10 0 0 91 6 -4\n5 0 0 0 0 95 0 -2\nEND_DATA\n");
        if (shuffled) Analyse4Job(api, paths, "FOGRA39L.ti3, shuffled subset", "", "", ref, shuffled, out);
        TextFileLine(out, paths->work, "proof-ref.ti3.$$$");
        free(shuffled);
    }
    free(ref);
    free(meas);
    free(paper);
    free(refProfile);
    free(neutral);

    /* Two calibration runs through a copy of the identity link: node 50/25/0/0 got worse by 0.3. */
    char* link = CopyToWork(paths, paths->work, "cmyk2cmyk5neutral.mcc", "proof-link.mcc");
    char* chart = WriteWork(paths, "proof-chart.it8",
                            PROOF_FIELDS "1 0 0 0 0 95 0 0\n2 50 25 0 0 50 0 0\n3 25 0 0 0 50 0 0\n"
                                         "4 10 0 0 0 60 0 0\n5 0 0 0 50 40 0 0\nEND_DATA\n");
    char* run1 = WriteWork(paths, "proof_cal1.it8",
                           PROOF_FIELDS "1 0 0 0 0 95 0 0\n2 48 27 0 0 50 0 0\n3 25 0 0 0 50 0 0\n"
                                        "4 10 0 0 0 60 0 0\n5 0 0 0 50 40 0 0\nEND_DATA\n");
    char* run2 = WriteWork(paths, "proof_cal2.it8",
                           PROOF_FIELDS "1 0 0 0 0 95 0 0\n2 50 25 0 0 50 0.3 0\n3 25 0 0 0 50 0.2 0\n"
                                        "4 10 0 0 0 60 0 0\n5 0 0 0 50 40 0 0\nEND_DATA\n");
    void* handle = link && chart && run1 && run2 ? ProofHandle(paths, api, "calibration runs", out) : NULL;
    if (handle) {
        const char* runs[2] = {run1, run2};
        for (int r = 0; r < 2; ++r) {
            int out1 = UNTOUCHED, out2 = UNTOUCHED;
            int rc = api->analyse3(handle, "", link, chart, runs[r], &out1, &out2);
            fprintf(out, "analyse3(proof-link.mcc, calibration run %d) = %d out %d %d\n", r + 1, rc, out1, out2);
            ProgressLine(out);
        }
        fprintf(out, "dllFree = %d\n", api->dllFree(handle));
        TextFileLine(out, paths->work, "proof_cal2.it8_merged.it8");
        FileLine(out, paths->work, "proof-link.mcc");
    } else {
        fprintf(out, "calibration runs: files could not be written\n");
    }
    free(link);
    free(chart);
    free(run1);
    free(run2);
}

/* ---- end of analyse3 and analyse4 ---------------------------------------------------------- */

/* ---- optimize1 ------------------------------------------------------------------------------
 * The output-profile optimisation on a copy of a colprof -ql profile, on a fresh handle (the
 * switches of earlier jobs would change how it measures): the table it writes back into the
 * copy must be the same bytes in both builds. */
static void OptimizeOutputProfile(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    char* source = Join(paths->fixtures, "TR003.icc");
    char* copy = Join(paths->work, "optimize1-TR003.icc");
    int copied = CopyFile(source, copy);
    free(source);
    if (!copied) {
        fprintf(out, "profile TR003.icc missing\n");
        free(copy);
        return;
    }
    void* handle = NULL;
    int rc = api->dllInit(OnProgress, &handle, NULL);
    fprintf(out, "dllInit(null dir, for optimize1) = %d\n", rc);
    ProgressLine(out);
    if (handle) {
        int out1 = UNTOUCHED, out2 = UNTOUCHED;
        rc = api->optimize1(handle, copy, &out1, &out2);
        fprintf(out, "optimize1(TR003.icc copy) = %d out %d %d\n", rc, out1, out2);
        ProgressLine(out);
        Check(rc == 0 && out1 >= 0 && out2 >= out1, "optimize1 measures and writes the copy");
        FileLine(out, paths->work, "optimize1-TR003.icc");
        fprintf(out, "dllFree = %d\n", api->dllFree(handle));
    }
    free(copy);
}
/* ---- end optimize1 -------------------------------------------------------------------------- */

/* ---- optimize4 ------------------------------------------------------------------------------
 * Two calibration runs through a copy of the identity link, each analysed by analyse3 and then
 * corrected by optimize4 with FOGRA39L as the printer model; then optimize4 on a copy of the
 * neutral Lab table, whose 33-point table also fills the host's buffer. */
static void DigestWords(FILE* out, const char* label, const unsigned short* words, size_t count) {
    Digest d;
    DigestReset(&d);
    for (size_t i = 0; i < count; ++i) {
        unsigned char be[2] = {(unsigned char)(words[i] >> 8), (unsigned char)(words[i] & 0xFF)};
        DigestBytes(&d, be, 2);
    }
    fprintf(out, "  %s words=%lu digest=", label, (unsigned long)count);
    PrintDigest(out, &d);
    fputc('\n', out);
}

static void LinkCorrection(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    enum { kBufferWords = 13 + 3 * 33 * 33 * 33 };
    unsigned short* buffer = (unsigned short*)malloc(kBufferWords * sizeof(unsigned short));
    char* link = CopyToWork(paths, paths->work, "cmyk2cmyk5neutral.mcc", "o4-link.mcc");
    char* neutral = CopyToWork(paths, paths->work, "neutral.3cc", "o4-neutral.3cc");
    char* model = Join(paths->fixtures, "FOGRA39L.icc");
    char* chart = WriteWork(paths, "o4-chart.it8",
                            PROOF_FIELDS "1 0 0 0 0 95 0 -2\n2 50 25 0 0 52 28 -20\n3 25 0 0 0 80 -15 -20\n"
                                         "4 0 100 100 0 47 68 48\n5 0 0 0 50 64 0 0\nEND_DATA\n");
    char* run1 = WriteWork(paths, "o4_cal1.it8",
                           PROOF_FIELDS "1 0 0 0 0 95 0 -2\n2 50 25 0 0 49 31 -24\n3 25 0 0 0 77 -17 -22\n"
                                        "4 0 100 100 0 45 70 45\n5 0 0 0 50 62 0 0\nEND_DATA\n");
    char* run2 = WriteWork(paths, "o4_cal2.it8",
                           PROOF_FIELDS "1 0 0 0 0 95 0 -2\n2 50 25 0 0 51 29 -21\n3 25 0 0 0 79 -16 -21\n"
                                        "4 0 100 100 0 46 69 47\n5 0 0 0 50 63 0 0\nEND_DATA\n");
    void* handle = buffer && link && neutral && model && chart && run1 && run2
                       ? ProofHandle(paths, api, "optimize4 calibration runs", out)
                       : NULL;
    if (handle) {
        const char* runs[2] = {run1, run2};
        for (int r = 0; r < 2; ++r) {
            int out1 = UNTOUCHED, out2 = UNTOUCHED;
            int rc = api->analyse3(handle, "", link, chart, runs[r], &out1, &out2);
            fprintf(out, "analyse3(o4-link.mcc, calibration run %d) = %d out %d %d\n", r + 1, rc, out1, out2);
            ProgressLine(out);
            out1 = out2 = UNTOUCHED;
            rc = api->optimize4(handle, link, &out1, &out2, buffer, model, 1);
            fprintf(out, "optimize4(o4-link.mcc, FOGRA39L.icc, run %d) = %d out %d %d\n", r + 1, rc, out1, out2);
            ProgressLine(out);
            FileLine(out, paths->work, "o4-link.mcc");
        }
        fprintf(out, "dllFree = %d\n", api->dllFree(handle));
        handle = ProofHandle(paths, api, "optimize4 on a Lab table", out);
    }
    if (handle) {
        for (int k = 0; k < kBufferWords; ++k) buffer[k] = 0xEEEE;
        int out1 = UNTOUCHED, out2 = UNTOUCHED;
        int rc = api->optimize4(handle, neutral, &out1, &out2, buffer, "", 0);
        fprintf(out, "optimize4(o4-neutral.3cc) = %d out %d %d\n", rc, out1, out2);
        ProgressLine(out);
        DigestWords(out, "buffer", buffer, kBufferWords);
        Check(rc == 0 && buffer[0] == 33, "optimize4 fills the buffer for a three-input table");
        fprintf(out, "dllFree = %d\n", api->dllFree(handle));
    }
    free(buffer);
    free(link);
    free(neutral);
    free(model);
    free(chart);
    free(run1);
    free(run2);
}

/* ---- end of optimize4 ---------------------------------------------------------------------- */
/* ---- optimize2 and optimize3 (corrections from a measured proof) ----------------------------
 * analyse4 leaves a FOGRA40L measurement against the FOGRA39L reference in the tool object, then
 * optimize2 writes a corrected copy of TR003.icc (colprof -ql) and optimize3 corrects a copy of
 * the identity 3CC. Each job has a fresh handle and works on copies. */
static void MeasuredCorrectionJob(const VantrelApi* api, const ScenarioPaths* paths, int three, FILE* out) {
    const char* job = three ? "optimize3" : "optimize2";
    char* ref = CopyToWork(paths, paths->colour, "FOGRA39L.ti3", three ? "opt3-ref.ti3" : "opt2-ref.ti3");
    char* meas = CopyToWork(paths, paths->colour, "FOGRA40L.ti3", three ? "opt3-meas.ti3" : "opt2-meas.ti3");
    char* paper = CopyToWork(paths, paths->fixtures, "TR003.icc", three ? "opt3-paper.icc" : "opt2-paper.icc");
    char* refProfile = CopyToWork(paths, paths->fixtures, "FOGRA39L.icc", three ? "opt3-ref.icc" : "opt2-ref.icc");
    void* handle = ref && meas && paper && refProfile ? ProofHandle(paths, api, job, out) : NULL;
    char* target = three ? CopyToWork(paths, paths->work, "neutral.3cc", "opt3-correction.3cc")
                         : Join(paths->work, "opt2-out.icc");
    if (!handle || !target) {
        fprintf(out, "%s: FOGRA data or fixture missing\n", job);
    } else {
        int o[4] = {UNTOUCHED, UNTOUCHED, UNTOUCHED, UNTOUCHED};
        int rc = api->analyse4(handle, paper, refProfile, ref, meas, &o[0], &o[1], &o[2], &o[3]);
        fprintf(out, "analyse4(for %s) = %d out %d %d %d %d\n", job, rc, o[0], o[1], o[2], o[3]);
        ProgressLine(out);
        int out1 = UNTOUCHED, out2 = UNTOUCHED;
        rc = three ? api->optimize3(handle, target, &out1, &out2, 0) : api->optimize2(handle, target, &out1, &out2, 0);
        fprintf(out, "%s = %d out %d %d\n", job, rc, out1, out2);
        ProgressLine(out);
        Check(rc == 0 && out1 == 255000 && out2 == 300000, three ? "optimize3 corrects the 3CC copy"
                                                                 : "optimize2 writes the corrected copy");
        FileLine(out, paths->work, three ? "opt3-correction.3cc" : "opt2-out.icc");
    }
    if (handle) fprintf(out, "dllFree = %d\n", api->dllFree(handle));
    free(ref);
    free(meas);
    free(paper);
    free(refProfile);
    free(target);
}
/* ---- end optimize2 and optimize3 ------------------------------------------------------------ */

int RunScenario(const VantrelApi* api, const ScenarioPaths* paths, FILE* out) {
    g_failures = 0;
    DigestReset(&g_progress);
    IdentityFiles(api, paths, out);
    NullHandles(api, out);
    Conversions(api, paths, out);
    DeviceSearches(api, paths, out);
    IsdAnalysis(api, paths, out);
    MergeIntoCmyk(api, paths, out);
    ProofAnalyses(api, paths, out);
    OptimizeOutputProfile(api, paths, out); /* optimize1 block */
    LinkCorrection(api, paths, out);        /* optimize4 block */
    MeasuredCorrectionJob(api, paths, 0, out); /* optimize2 and optimize3 block */
    MeasuredCorrectionJob(api, paths, 1, out);
    fflush(out);
    return g_failures;
}
