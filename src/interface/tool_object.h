#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "colour/colour_values.h"
#include "eval/gamut_record.h"
#include "icc/profil.h"
#include "it8/measured_it8.h"
#include "vantrel.h"

namespace vantrel {

// Default labels of the file names: a name holding one means nothing is selected.
inline constexpr const char* kNo3ccSelected = "-no 3CC selected-";
inline constexpr const char* kNoProfileSelected = "-no profile selected-";
inline constexpr const char* kNoIsdSelected = "-no ISD selected-";
inline constexpr const char* kNoFileSelected = "-no file selected-";

// What an analysis of measurements hands back. `differences` is false when it stopped before it
// had a mean and a maximum.
struct AnalysisFigures {
    double mean = 0;
    double maximum = 0;
    double white = 0;  // difference of the two paper whites
    double gamut = 0;  // share of reference colours inside the paper gamut, in percent
    bool differences = false;
};

// All state of one job: the tool object behind a tool handle.
class CIterativtoolDlg {
public:
    static constexpr int kParamCount = 20;

    // Creates the profile and measurement slots and, for a non-empty dir, writes the
    // embedded identity profiles into it (dir is a prefix: "dir/" or "dir" + name).
    explicit CIterativtoolDlg(const char* dir);
    virtual ~CIterativtoolDlg();
    CIterativtoolDlg(const CIterativtoolDlg&) = delete;
    CIterativtoolDlg& operator=(const CIterativtoolDlg&) = delete;

    // True when every profile and measurement slot could be created.
    bool SlotsCreated() const;
    // Writes the four identity profiles to m_WorkDir + file name, overwriting existing files.
    void WriteEmbeddedProfiles();
    // Reports progress to the host, if it gave a function; returns its answer.
    int Progress(const char* text, int step, int steps) const;

    // Measurement scans (analysis/it8_scan.cpp). Zeros mean nothing was found.
    // The colour of the first patch whose device values equal target (CMYK and multi-channel in
    // percent, RGB 0..255); a non-zero answer of the progress function cancels it.
    Lab ScanIt8ForValues(const Measured_IT8& it8, const double target[7]) const;
    // The average colour of the patches printed without ink.
    Lab ScanIt8ForWhitePoint(const Measured_IT8& it8) const;
    // Lab of a measured XYZ (white Y near 100) against the first loaded profile's illuminant
    // (m_Outprof, m_Paperprof, m_Refprof, m_ISDprof), else against D50. The one conversion for
    // measured XYZ: the scans, the analyses and the measurement-driven optimisations all use it,
    // so that a patch and the white found in the same file are converted alike.
    Lab MeasuredXyzToLab(double X, double Y, double Z) const;
    // A patch's colour, from its Lab or converted from its XYZ.
    Lab PatchLab(const Measured_IT8& it8, int patch, bool fromXyz) const;
    // The ISD analysis (analysis/analyse2.cpp): when m_ISDMode is set and an ISD profile is named,
    // writes m_MeasIT8 through the ISD profile's Lab-to-Lab table to m_MeasIT8Name + "isd.it8",
    // then makes that file the measurement (m_MeasIT8Name, m_MeasIT8, m_MeasWhite).
    void IsdAnalysis();

    // Comparing a measurement with its reference (analysis/merged_analysis.cpp). The white
    // difference is taken first; the mean and the maximum only once both files are named, of one
    // device kind, aligned and non-empty. In profiling mode (m_CorrectOutprof) each patch on a node
    // of the device link m_Outprof also corrects that node.
    AnalysisFigures MergedAnalysis();
    // How well the patches of equal device values in one file agree (analysis/repeatability.cpp).
    AnalysisFigures RepeatabilityAnalysis(const Measured_IT8& it8) const;
    // Rewrites one file in the patch order of the other, written to its name + ".$$$" and read
    // back with its white (analysis/alignment.cpp).
    void AlignReferenceToMeasurement();
    void AlignMeasurementToReference();
    // Writes the reference profile's predictions for the measured device values to
    // m_RefName + ".it8" and makes that file the reference measurement (analysis/analyse4.cpp).
    void SimulateReference();

    // ---- optimisation (src/optimise) ------------------------------------------------------------
    // Results of the output-profile optimisation and its analysis.
    static constexpr int kOptimiseDone = 1;
    static constexpr int kOptimiseFailed = 0;       // nothing measured: a table missing (or no memory at first)
    static constexpr int kOptimiseOutOfMemory = -2;

    // The paper profile's direction-1 table corrected so that it inverts its direction-0 table
    // more closely: node by node, then sample by sample, each step kept only when the round-trip
    // error falls. The best state stays in m_Paperprof, m_Score1 and m_Score2. kOptimiseFailed
    // when the first analysis cannot run (the table and scores are then untouched);
    // kOptimiseOutOfMemory when a step could not get its memory (that step is undone, the scores
    // hold the kept state).
    int OptimizeOutputProfile();
    // The mean and maximum round-trip error over a 21^4 CMYK grid (0, 12, .. 240). With
    // m_AbstractOutprof set it measures the paper profile as a device link through m_Refprof and
    // writes both sides to m_PaperName + "_inputvalues_big.it8" / "_outputvalues_big.it8"; that
    // needs m_Refprof's direction-0 table (else kOptimiseFailed). Changes no table.
    int AnalyzeOutputProfile(double& mean, double& max);
    // Every node of the direction-1 table moved toward what an inverse search finds for the colour
    // it stands for. 0 (nothing done) unless the table has three inputs and 1..100 grid points.
    int OptimizeStep1();
    // Corrections from a 21^4 CMYK sample grid, weighted and spread over the cells the samples fall
    // in. 0 as OptimizeStep1; kOptimiseOutOfMemory (nothing changed) when the accumulators
    // cannot be had.
    int OptimizeStep2();
    // The wanted paper white for the measurement-driven corrections (m_OptimizeOption 1: the
    // paper white 3 L* lighter, 2: the measured white; otherwise a target white outside the gamut
    // is replaced by the nearest of the measured white, the paper white and what the profile
    // reproduces). 1 when the caller is to stop after this (options 1 and 2), else 0.
    int ChooseTargetWhite();

    // Corrections from a measured proof: the measurements and whites that analyse4 left.
    // The direction-1 media white of the paper profile moved toward the measured paper (options
    // other than 1 and 2; sets m_WriteExtra when it moved). 0 for a table outside 1..100 points.
    int CorrectPaperWhite();
    // The paper profile's direction-1 table corrected patch by patch from the reference and the
    // measured proof. 1 when done or when the files do not pair (nothing done); 0 for a table
    // outside 1..100 points, a reference without device columns or a stop request (what was
    // applied stays); kOptimiseOutOfMemory when the accumulators cannot be had (table unchanged).
    int OptimizeFromMeasurement();
    // Every node of the 3CC's direction-1 table carried part of the way from the measured paper
    // white to the wanted one. 0 for a table outside 1..100 points or a stop request, else 1.
    int CorrectOutprofWhite();
    // The 3CC's direction-1 table corrected in Lab from the measured proof, then the nodes no patch
    // reached smoothed (cell mode). Results as OptimizeFromMeasurement.
    int OptimizeOutprof();

    // Slot loaders: each loads its slot from the name the tool object holds for it, unless the
    // name is empty or still holds its default label. They report progress and check nothing
    // else: a missing file or tag leaves the slot empty. The caller releases beforehand.
    void LoadOutprof();
    void LoadISDProfile();
    void LoadRefProfile();
    // Also sets m_PaperWhite and, with computeGamut, rebuilds m_Gamut.
    void LoadPaperProfile(bool computeGamut);
    void LoadPaperProfilePerceptual();

    // Lab (L* 0..100) to XYZ x 100 against the white of the first loaded profile among the
    // reference, paper, 3CC and ISD profiles, else against D50.
    XYZ LabToXYZ(double L, double a, double b) const;
    // A patch record's colour: its Lab and the XYZ of it by LabToXYZ.
    void SetRecordColour(PatchRecord& record, const Lab& lab) const;

    // Profile slots.
    std::unique_ptr<CProfil> m_Outprof;
    std::unique_ptr<CProfil> m_Refprof;
    std::unique_ptr<CProfil> m_Paperprof;
    std::unique_ptr<CProfil> m_ISDprof;
    std::unique_ptr<CProfil> m_PaperprofPerceptual;

    int m_UseIntent0 = 0;
    int m_RecalcFlag = 0;
    int m_CalRun = -1;

    // Measurement slots.
    std::unique_ptr<Measured_IT8> m_ReferenceIT8;
    std::unique_ptr<Measured_IT8> m_MeasIT8;
    std::unique_ptr<Measured_IT8> m_PrevMeasIT8;

    Lab m_RefWhite;
    Lab m_MeasWhite;
    Lab m_PaperWhite;

    GamutRecord m_Gamut;
    // True once m_Gamut was built from a profile holding both tables. The loader marks the record
    // valid whether or not it was built this time; this says whether it describes a gamut at all.
    bool m_GamutComputed = false;

    // A saved copy of the paper profile's table, kept by the output-profile optimisation.
    std::vector<uint16_t> m_SavedTable;

    ProgressCallback m_Progress = nullptr;

    std::string m_OutprofName = kNo3ccSelected;
    std::string m_RefName = kNoProfileSelected;
    std::string m_PaperName = kNoProfileSelected;
    std::string m_ISDName = kNoIsdSelected;
    std::string m_WorkDir;
    std::string m_ReferenceIT8Name = kNoFileSelected;
    std::string m_MeasIT8Name = kNoFileSelected;

    double m_Score1 = 0;
    double m_Score2 = 0;

    int m_OptimizeOption = 0;
    int m_OptFlagA = 1;
    int m_OptFlagB = 1;
    int m_AbstractOutprof = 0;
    int m_ISDMode = 0;
    int m_WriteExtra = 0;
    int m_CorrectOutprof = 0;

    std::array<int, kParamCount> m_Params{};
};

}  // namespace vantrel
