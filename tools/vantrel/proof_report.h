#pragma once
// The proof report: one self-contained HTML file (inline SVG, nothing fetched) that judges a
// proof's measurement against its reference, patch by patch, with the proof tolerances widely
// quoted for ISO 12647-7 and, for the proof loop, the figures of every pass.
//
// dE2000 and dH are this report's own computations; the library keeps its one colour difference.

#include <string>
#include <vector>

namespace vantrel::cli {

struct Lab3 {
    double L = 0, a = 0, b = 0;
};

double DeltaE76(const Lab3& x, const Lab3& y);
double DeltaE2000(const Lab3& reference, const Lab3& sample);
// The CIELAB hue difference dH*ab (not signed).
double DeltaHue(const Lab3& x, const Lab3& y);

// One patch found in both files.
struct ReportPatch {
    int index = 0;              // 1-based position in the proof's file
    std::vector<double> device; // the proof file's device values (CMYK in percent, or RGB, ...)
    Lab3 reference, proof;
    double dE76 = 0, dE2000 = 0, dH = 0;
};

// Which patches a check takes, by their CMYK device values in percent.
enum class PatchSet { All, Paper, PrimarySolids, GreyBalance };
bool InSet(PatchSet set, const std::vector<double>& cmyk);

// One row of the tolerance table.
struct Tolerance {
    const char* check;
    PatchSet patches;
    enum Measure { MaxDE76, MeanDE76, MaxDH, MeanDH } measure;
    double limit2013;  // dE*ab / dH*ab
    const char* limit2016;  // the 2016 edition's dE2000 figure, or why it is not shown
};
const std::vector<Tolerance>& ProofTolerances();
// Where the tolerances come from, for the report's foot.
extern const char* const kToleranceSource;

struct CheckResult {
    const Tolerance* tolerance;
    int count = 0;        // patches the check found
    double value = 0;     // dE76 / dH figure
    double value2000 = 0; // the same statistic in dE2000 (for the dE checks)
    bool pass = false;
};
std::vector<CheckResult> RunChecks(const std::vector<ReportPatch>& patches);

// Reads both CGATS files and pairs their patches by device values (by position where the device
// values repeat); fails with a one-line message naming the file.
std::vector<ReportPatch> PairPatches(const std::string& referenceIt8, const std::string& proofIt8);

struct LibraryFigures {
    bool present = false;
    double mean = 0, maximum = 0, paperWhite = 0, inGamut = 0;
};

struct LoopPass {
    int pass = 0;
    double mean = 0, p95 = 0, maximum = 0, paper = 0, seconds = -1;
};

struct ReportInput {
    std::string title;
    std::string referenceName, proofName;
    LibraryFigures figures;
    std::vector<ReportPatch> patches;
    std::vector<LoopPass> passes;  // empty: not a proof loop
    std::string loopNote;          // e.g. why the loop stopped
};

std::string RenderReport(const ReportInput& input);
// Writes the report; fails naming the file when it cannot.
void WriteReport(const std::string& path, const ReportInput& input);

}  // namespace vantrel::cli
