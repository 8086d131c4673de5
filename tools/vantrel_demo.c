/* The main job on sample data, as a host runs it through vantrel.h:
 *   vantrel_demo PROFILE.icc CHART.ti3
 * creates a tool object in a temporary folder, converts the chart's CMYK values
 * through the profile and compares them with the measured Lab, then finds the
 * inks for a few measured colours with analyse1. */
#include <math.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>

#include "vantrel.h"

#define MAX_PATCHES 4000

typedef struct {
    int count;
    double cmyk[MAX_PATCHES][4];
    double lab[MAX_PATCHES][3];
} Chart;

static int VANTREL_CALL Report(const char* text, int step, int steps) {
    (void)text, (void)step, (void)steps;
    return 0;
}

/* Reads the CMYK_C..K and LAB_L..B columns of a CGATS chart. */
static int ReadChart(const char* path, Chart* chart) {
    char line[4096];
    int column[7] = {-1, -1, -1, -1, -1, -1, -1};
    static const char* const names[7] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A", "LAB_B"};
    int inFormat = 0, inData = 0;
    FILE* f = fopen(path, "r");
    if (!f) return 0;
    chart->count = 0;
    while (fgets(line, sizeof line, f)) {
        if (strncmp(line, "BEGIN_DATA_FORMAT", 17) == 0) { inFormat = 1; continue; }
        if (strncmp(line, "END_DATA_FORMAT", 15) == 0) { inFormat = 0; continue; }
        if (strncmp(line, "BEGIN_DATA", 10) == 0) { inData = 1; continue; }
        if (strncmp(line, "END_DATA", 8) == 0) { inData = 0; continue; }
        if (inFormat) {
            int index = 0;
            for (char* tok = strtok(line, " \t\r\n"); tok; tok = strtok(NULL, " \t\r\n"), ++index)
                for (int k = 0; k < 7; ++k)
                    if (strcmp(tok, names[k]) == 0) column[k] = index;
        } else if (inData && chart->count < MAX_PATCHES) {
            double v[64];
            int n = 0;
            for (char* tok = strtok(line, " \t\r\n"); tok && n < 64; tok = strtok(NULL, " \t\r\n")) v[n++] = atof(tok);
            int ok = 1;
            for (int k = 0; k < 7; ++k) ok = ok && column[k] >= 0 && column[k] < n;
            if (!ok) continue;
            for (int k = 0; k < 4; ++k) chart->cmyk[chart->count][k] = v[column[k]];
            for (int k = 0; k < 3; ++k) chart->lab[chart->count][k] = v[column[4 + k]];
            ++chart->count;
        }
    }
    fclose(f);
    return chart->count > 0;
}

int main(int argc, char** argv) {
    static Chart chart;
    static int cmyk[MAX_PATCHES * 4], lab[MAX_PATCHES * 3], xyz[MAX_PATCHES * 3];
    char dir[] = "/tmp/vantrel-demo-XXXXXX";
    char work[4096];
    void* tool = NULL;

    if (argc < 3) {
        fprintf(stderr, "usage: %s PROFILE.icc CHART.ti3\n", argv[0]);
        return 2;
    }
    if (!ReadChart(argv[2], &chart)) {
        fprintf(stderr, "cannot read the chart %s\n", argv[2]);
        return 1;
    }
    if (!mkdtemp(dir)) return 1;
    snprintf(work, sizeof work, "%s/", dir);
    if (dllInit(Report, &tool, work) != 0) {
        fprintf(stderr, "dllInit failed\n");
        return 1;
    }
    printf("Tool object in %s (identity profiles written there)\n\n", work);

    for (int i = 0; i < chart.count; ++i)
        for (int k = 0; k < 4; ++k) cmyk[4 * i + k] = (int)floor(chart.cmyk[i][k] + 0.5);
    if (Cmyk2Lab_Double(tool, argv[1], chart.count, cmyk, 0, lab, 0, xyz) != 0) {
        fprintf(stderr, "Cmyk2Lab_Double failed\n");
        dllFree(tool);
        return 1;
    }
    printf("%s through %s\n", argv[2], argv[1]);
    printf("  #     C    M    Y    K |  measured L*     a*     b* |   library L*     a*     b* |   dE76\n");
    double sum = 0, worst = 0;
    int exact = 0;
    for (int i = 0; i < chart.count; ++i) {
        double L = lab[3 * i] / 1000.0, a = lab[3 * i + 1] / 1000.0, b = lab[3 * i + 2] / 1000.0;
        double dL = L - chart.lab[i][0], da = a - chart.lab[i][1], db = b - chart.lab[i][2];
        double de = sqrt(dL * dL + da * da + db * db);
        /* the chart's device values are whole percentages; others were rounded */
        int whole = 1;
        for (int k = 0; k < 4; ++k) whole = whole && fabs(chart.cmyk[i][k] - cmyk[4 * i + k]) < 1e-9;
        if (!whole) continue;
        ++exact;
        sum += de;
        if (de > worst) worst = de;
        if (i < 12 || i % 200 == 0)
            printf("%4d %4d %4d %4d %4d | %10.2f %6.2f %6.2f | %12.2f %6.2f %6.2f | %6.2f\n", i + 1, cmyk[4 * i],
                   cmyk[4 * i + 1], cmyk[4 * i + 2], cmyk[4 * i + 3], chart.lab[i][0], chart.lab[i][1],
                   chart.lab[i][2], L, a, b, de);
    }
    printf("  %d patches: mean dE76 %.2f, max %.2f\n\n", exact, exact ? sum / exact : 0.0, worst);

    printf("Inks for measured colours (analyse1, start C M Y K = 10 %% each)\n");
    static const int picks[] = {9, 81, 800, 1200};
    for (size_t p = 0; p < sizeof picks / sizeof picks[0]; ++p) {
        int i = picks[p] - 1;
        if (i >= chart.count) continue;
        int target[3], values[7] = {25500, 25500, 25500, 25500, 0, 0, 0};
        for (int k = 0; k < 3; ++k) target[k] = (int)floor(chart.lab[i][k] * 1000 + 0.5);
        analyse1(tool, argv[1], target, values);
        printf("  Lab %6.2f %6.2f %6.2f (printed with %3.0f %3.0f %3.0f %3.0f %%): found %5.1f %5.1f %5.1f %5.1f %%\n",
               chart.lab[i][0], chart.lab[i][1], chart.lab[i][2], chart.cmyk[i][0], chart.cmyk[i][1],
               chart.cmyk[i][2], chart.cmyk[i][3], values[0] / 2550.0, values[1] / 2550.0, values[2] / 2550.0,
               values[3] / 2550.0);
    }
    dllFree(tool);
    return 0;
}
