#pragma once
// The Argyll programs the proof loop runs as its independent parts: xicclu for the RIP and the
// printer, colprof for the model profiles, refine for the peer correction.

#include <array>
#include <string>
#include <vector>

namespace vantrel::proofloop {

struct ArgyllTools {
    std::string xicclu, colprof, refine;  // full paths; empty when not on PATH

    bool Complete() const { return !xicclu.empty() && !colprof.empty() && !refine.empty(); }
    // "xicclu, refine" for the ones missing; empty when all are there.
    std::string Missing() const;
};

// Looks the three programs up on PATH.
ArgyllTools FindArgyllTools();

// Runs a program (no shell) with stdin and stdout from and to the given files (empty: inherit,
// stdout empty: discarded). Returns the exit status, or -1 when it could not start.
int RunProgram(const std::vector<std::string>& argv, const std::string& stdinFile = "",
               const std::string& stdoutFile = "");

using Triple = std::array<double, 3>;
using Quad = std::array<double, 4>;

// Batch look-ups through xicclu: -v0, -pl, device values in percent. flags are the direction and
// intent switches, e.g. {"-ff", "-ia"}. Each answers an empty vector when xicclu failed or
// printed fewer rows than it was given.
std::vector<Triple> LookUpLab(const std::string& xicclu, const std::string& profile,
                              const std::vector<std::string>& flags, const std::vector<Quad>& cmyk,
                              const std::string& scratchDir);
std::vector<Quad> LookUpCmyk(const std::string& xicclu, const std::string& profile,
                             const std::vector<std::string>& flags, const std::vector<Triple>& lab,
                             const std::string& scratchDir);
std::vector<Triple> LookUpLabToLab(const std::string& xicclu, const std::string& profile,
                                   const std::vector<std::string>& flags, const std::vector<Triple>& lab,
                                   const std::string& scratchDir);

}  // namespace vantrel::proofloop
