#pragma once

namespace vantrel {

class CProfil;

// Searches for device values that reproduce a target colour through the direction-0 table of
// a loaded profile, under rules of good separation. Targets are L*, a*, b* with L* unscaled;
// differences are CIE 1976 ΔE. Device vectors are on 0..255: seven channels (3 is black for
// CMYK-based spaces, 4..6 used by five- to seven-colourant profiles) or four.
//
// A candidate is accepted when it beats the best difference so far strictly, keeps to the
// lightness rule (when on and the start is not dark, L* < 35: the candidate is not darker than
// the target, unless it is not darker than the last accepted colour and the target is not
// darker than that either) and stays closer to the start colour than the start's own error.

// The two phases of the coordinate descents here and of the inverse search: the step, the bounds
// a channel must be below (to step up) or above (to step down), and the difference a round must
// stay above for another round to start.
struct DescentPhase {
    double step, high, low, enough;
};
constexpr DescentPhase kDescentPhases[2] = {{1.0, 254.0, 1.0, 0.2}, {0.1, 254.9, 0.1, 0.1}};

// The round loop every descent shares: `round` runs again while it lowered `best` and `best`
// stays above the phase's `enough`.
template <typename Round>
void RepeatRounds(const DescentPhase& phase, const double& best, Round&& round) {
    for (;;) {
        const double roundStart = best;
        round();
        if (!(best < roundStart && best > phase.enough)) return;
    }
}

// What the grid search looks for and under which rules.
struct GridSearchRequest {
    const double* target = nullptr;  // L*, a*, b*
    const double* start = nullptr;   // 7 device values; their colour bounds the answer's drift
    double blackLow = 0.0;           // black runs from blackLow up to blackHigh
    double blackHigh = 255.0;
    double step = 1.0;               // lattice step on 0..255
    int limit = 4;                   // most colourants in use (value > 0) at once
    const int* flags = nullptr;      // 7 flags: channels that may move
    bool lightnessRule = true;
};

// Every lattice point of the request's step: channels 0..2 (and 4..6) from 0 up to 255 where
// their flag is set, black from blackLow up to blackHigh (flag 3 set); at most `limit` channels
// in use at once; for five or more colourants, pairs and triples of chromatic colourants that
// must not print together are refused. `bestDelta` comes in as the error to beat and goes out as
// the error of the answer, written to `best` (7).
void ConstrainedGridSearch(CProfil& profile, const GridSearchRequest& request, double& bestDelta, double* best);

// Coordinate descent over all seven channels (steps 1.0, then 0.1) under the same rules;
// channels whose flag is 0 never move. The answer goes to `best` (7), its error to `deltaE`.
void ConstrainedDescent(CProfil& profile, const double* target, const double* start, double& deltaE, int limit,
                        const int* flags, bool lightnessRule, double* best);

// Coordinate descent over four channels inside (flag x low, flag x high), one step per channel
// and direction per round, accepting any strict improvement. `deltaE` goes out as the error of
// the answer, written to `best` (4).
void RangedDescent(CProfil& profile, const double* target, const double* start, double low, double high,
                   double& deltaE, const int* flags, double* best);

// Descents alternated with coarse channel scans while they help, all four channels free inside
// the bounds. Writes the answer to `best` (4) and its error to `deltaE`.
void RangedSearch(CProfil& profile, const double* target, const double* start, double low, double high,
                  double& deltaE, double* best);

// The best value of channel c of `values` (4) with the others fixed: channels 0..2 try 0, 3, ..,
// 255, channel 3 tries low, low + 3, .. up to high. Among equal errors the later value wins.
double ScanChannel(CProfil& profile, const double* target, const double* values, int c, double low, double high);

}  // namespace vantrel
