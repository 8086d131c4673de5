#include "proof_report.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <map>
#include <numeric>
#include <sstream>

#include "cli_support.h"
#include "it8/measured_it8.h"

namespace vantrel::cli {

namespace {

constexpr double kPi = 3.14159265358979323846;
double Rad(double degrees) { return degrees * kPi / 180.0; }
double Deg(double radians) { return radians * 180.0 / kPi; }

std::string Fixed(double value, int decimals = 2) {
    char buf[32];
    std::snprintf(buf, sizeof buf, "%.*f", decimals, value);
    return buf;
}

std::string Escape(const std::string& text) {
    std::string out;
    for (char c : text) {
        if (c == '<') out += "&lt;";
        else if (c == '>') out += "&gt;";
        else if (c == '&') out += "&amp;";
        else if (c == '"') out += "&quot;";
        else out += c;
    }
    return out;
}

}  // namespace

double DeltaE76(const Lab3& x, const Lab3& y) {
    return std::sqrt((x.L - y.L) * (x.L - y.L) + (x.a - y.a) * (x.a - y.a) + (x.b - y.b) * (x.b - y.b));
}

double DeltaHue(const Lab3& x, const Lab3& y) {
    const double dE2 = (x.L - y.L) * (x.L - y.L) + (x.a - y.a) * (x.a - y.a) + (x.b - y.b) * (x.b - y.b);
    const double dC = std::hypot(x.a, x.b) - std::hypot(y.a, y.b);
    const double dL = x.L - y.L;
    return std::sqrt(std::max(0.0, dE2 - dL * dL - dC * dC));
}

// CIEDE2000 with kL = kC = kH = 1.
double DeltaE2000(const Lab3& x, const Lab3& y) {
    const double C1 = std::hypot(x.a, x.b), C2 = std::hypot(y.a, y.b);
    const double Cbar = (C1 + C2) / 2;
    const double Cbar7 = std::pow(Cbar, 7);
    const double G = 0.5 * (1 - std::sqrt(Cbar7 / (Cbar7 + std::pow(25.0, 7))));
    const double a1 = (1 + G) * x.a, a2 = (1 + G) * y.a;
    const double C1p = std::hypot(a1, x.b), C2p = std::hypot(a2, y.b);
    auto hue = [](double b, double a) {
        if (a == 0 && b == 0) return 0.0;
        const double h = Deg(std::atan2(b, a));
        return h < 0 ? h + 360 : h;
    };
    const double h1 = hue(x.b, a1), h2 = hue(y.b, a2);
    const double dLp = y.L - x.L, dCp = C2p - C1p;
    double dhp = 0;
    if (C1p * C2p != 0) {
        dhp = h2 - h1;
        if (dhp > 180) dhp -= 360;
        else if (dhp < -180) dhp += 360;
    }
    const double dHp = 2 * std::sqrt(C1p * C2p) * std::sin(Rad(dhp / 2));
    const double Lbarp = (x.L + y.L) / 2, Cbarp = (C1p + C2p) / 2;
    double hbarp = h1 + h2;
    if (C1p * C2p != 0) {
        if (std::fabs(h1 - h2) <= 180) hbarp = (h1 + h2) / 2;
        else hbarp = (h1 + h2 < 360) ? (h1 + h2 + 360) / 2 : (h1 + h2 - 360) / 2;
    }
    const double T = 1 - 0.17 * std::cos(Rad(hbarp - 30)) + 0.24 * std::cos(Rad(2 * hbarp)) +
                     0.32 * std::cos(Rad(3 * hbarp + 6)) - 0.20 * std::cos(Rad(4 * hbarp - 63));
    const double dTheta = 30 * std::exp(-((hbarp - 275) / 25) * ((hbarp - 275) / 25));
    const double Cbarp7 = std::pow(Cbarp, 7);
    const double RC = 2 * std::sqrt(Cbarp7 / (Cbarp7 + std::pow(25.0, 7)));
    const double L50 = (Lbarp - 50) * (Lbarp - 50);
    const double SL = 1 + 0.015 * L50 / std::sqrt(20 + L50);
    const double SC = 1 + 0.045 * Cbarp;
    const double SH = 1 + 0.015 * Cbarp * T;
    const double RT = -std::sin(Rad(2 * dTheta)) * RC;
    const double l = dLp / SL, c = dCp / SC, h = dHp / SH;
    return std::sqrt(l * l + c * c + h * h + RT * c * h);
}

// The patches each check takes, by CMYK device values in percent: paper is no ink at all, the
// primary solids are one of C, M, Y, K at 100 % alone, and grey balance the CMY greys without
// black in the ratios the printing conditions use (cyan 0 to 12 points above equal magenta and
// yellow, cyan between 20 and 80 %).
bool InSet(PatchSet set, const std::vector<double>& cmyk) {
    if (set == PatchSet::All) return true;
    if (cmyk.size() < 4) return false;
    const double c = cmyk[0], m = cmyk[1], y = cmyk[2], k = cmyk[3];
    switch (set) {
        case PatchSet::Paper: return c == 0 && m == 0 && y == 0 && k == 0;
        case PatchSet::PrimarySolids: {
            int solids = 0, blank = 0;
            for (int i = 0; i < 4; ++i) {
                solids += cmyk[i] >= 100;
                blank += cmyk[i] == 0;
            }
            return solids == 1 && blank == 3;
        }
        case PatchSet::GreyBalance:
            return k == 0 && m == y && c >= 20 && c <= 80 && c - m >= 0 && c - m <= 12;
        default: return false;
    }
}

const char* const kToleranceSource =
    "Tolerances for a proof with a media wedge as widely quoted for ISO 12647-7:2013 (third-party summaries of "
    "the standard; the standard's own table was not at hand). The 2016 edition states its tolerances in dE2000; "
    "its figures could not be confirmed from a source at hand, so they are not shown and the dE2000 column gives "
    "this proof's own figures for comparison only.";

const std::vector<Tolerance>& ProofTolerances() {
    static const std::vector<Tolerance> table = {
        {"Paper white", PatchSet::Paper, Tolerance::MaxDE76, 3.0, "not confirmed"},
        {"All patches, mean", PatchSet::All, Tolerance::MeanDE76, 3.0, "not confirmed"},
        {"All patches, maximum", PatchSet::All, Tolerance::MaxDE76, 6.0, "not confirmed"},
        {"Primary solids, dE", PatchSet::PrimarySolids, Tolerance::MaxDE76, 5.0, "not confirmed"},
        {"Primary solids, dH", PatchSet::PrimarySolids, Tolerance::MaxDH, 2.5, "not confirmed"},
        {"Grey balance, mean dH", PatchSet::GreyBalance, Tolerance::MeanDH, 1.5, "not confirmed"},
    };
    return table;
}

std::vector<CheckResult> RunChecks(const std::vector<ReportPatch>& patches) {
    std::vector<CheckResult> results;
    for (const Tolerance& t : ProofTolerances()) {
        CheckResult r{&t};
        double sum = 0, sum2000 = 0, top = 0, top2000 = 0;
        for (const ReportPatch& p : patches) {
            if (!InSet(t.patches, p.device)) continue;
            const double v = (t.measure == Tolerance::MaxDH || t.measure == Tolerance::MeanDH) ? p.dH : p.dE76;
            ++r.count;
            sum += v;
            sum2000 += p.dE2000;
            top = std::max(top, v);
            top2000 = std::max(top2000, p.dE2000);
        }
        const bool mean = t.measure == Tolerance::MeanDE76 || t.measure == Tolerance::MeanDH;
        if (r.count) {
            r.value = mean ? sum / r.count : top;
            r.value2000 = mean ? sum2000 / r.count : top2000;
        }
        r.pass = r.count > 0 && r.value <= t.limit2013;
        results.push_back(r);
    }
    return results;
}

std::vector<ReportPatch> PairPatches(const std::string& referenceIt8, const std::string& proofIt8) {
    RequireChart(referenceIt8, true, true);
    RequireChart(proofIt8, true, true);
    Measured_IT8 ref, proof;
    ref.ReadIt8(referenceIt8);
    proof.ReadIt8(proofIt8);
    auto device = [](const Measured_IT8& chart, int set) {
        std::vector<double> values;
        if (chart.Column(kColCyan) >= 0)
            for (int c = 0; c < 4; ++c) values.push_back(chart.GetCmyk(set, c));
        else if (chart.Column(kColRgbR) >= 0)
            for (int c = 0; c < 3; ++c) values.push_back(chart.GetRgb(set, c));
        else
            for (int c = 0; c < 7 && chart.Column(It8Column(kColChannel1 + c)) >= 0; ++c)
                values.push_back(chart.GetChannel(set, c));
        return values;
    };
    // The reference's patches by device values; a value seen again takes the next one in order.
    std::map<std::vector<double>, std::vector<int>> byDevice;
    for (int i = ref.PatchCount() - 1; i >= 0; --i) byDevice[device(ref, i)].push_back(i);
    std::vector<ReportPatch> patches;
    for (int i = 0; i < proof.PatchCount(); ++i) {
        ReportPatch p;
        p.index = i + 1;
        p.device = device(proof, i);
        auto found = byDevice.find(p.device);
        if (found == byDevice.end() || found->second.empty()) continue;
        const int r = found->second.back();
        found->second.pop_back();
        p.reference = {ref.GetLab(r, 0), ref.GetLab(r, 1), ref.GetLab(r, 2)};
        p.proof = {proof.GetLab(i, 0), proof.GetLab(i, 1), proof.GetLab(i, 2)};
        p.dE76 = DeltaE76(p.reference, p.proof);
        p.dE2000 = DeltaE2000(p.reference, p.proof);
        p.dH = DeltaHue(p.reference, p.proof);
        patches.push_back(std::move(p));
    }
    if (patches.empty())
        Fail(proofIt8 + ": no patch has the device values of a patch in " + referenceIt8);
    return patches;
}

namespace {

// The a*b* plane: reference points and the error vectors to the proof.
std::string AbPlot(const std::vector<ReportPatch>& patches) {
    const double size = 420, half = size / 2, range = 100;
    auto X = [&](double a) { return Fixed(half + std::clamp(a, -range, range) * half / range, 1); };
    auto Y = [&](double b) { return Fixed(half - std::clamp(b, -range, range) * half / range, 1); };
    std::ostringstream s;
    s << "<svg id=\"ab-plot\" xmlns=\"http://www.w3.org/2000/svg\" width=\"" << size << "\" height=\"" << size
      << "\" viewBox=\"0 0 " << size << ' ' << size << "\" role=\"img\" aria-label=\"a*b* plot\">\n"
      << "<rect width=\"100%\" height=\"100%\" fill=\"#fafafa\" stroke=\"#999\"/>\n"
      << "<line x1=\"0\" y1=\"" << half << "\" x2=\"" << size << "\" y2=\"" << half << "\" stroke=\"#bbb\"/>"
      << "<line x1=\"" << half << "\" y1=\"0\" x2=\"" << half << "\" y2=\"" << size << "\" stroke=\"#bbb\"/>\n"
      << "<text x=\"" << size - 30 << "\" y=\"" << half - 4 << "\" font-size=\"11\">a*</text>"
      << "<text x=\"" << half + 4 << "\" y=\"12\" font-size=\"11\">b*</text>\n";
    for (const ReportPatch& p : patches) {
        // Error vectors are drawn five times longer than they are, so that small errors show.
        const double ea = p.reference.a + 5 * (p.proof.a - p.reference.a);
        const double eb = p.reference.b + 5 * (p.proof.b - p.reference.b);
        s << "<line class=\"error-vector\" x1=\"" << X(p.reference.a) << "\" y1=\"" << Y(p.reference.b) << "\" x2=\""
          << X(ea) << "\" y2=\"" << Y(eb) << "\" stroke=\"#c0392b\" stroke-width=\"0.8\"/>"
          << "<circle class=\"reference\" cx=\"" << X(p.reference.a) << "\" cy=\"" << Y(p.reference.b)
          << "\" r=\"1.6\" fill=\"#2c3e50\"/>\n";
    }
    s << "</svg>";
    return s.str();
}

std::string Histogram(const std::vector<ReportPatch>& patches) {
    const double bin = 0.5;
    double top = 0;
    for (const auto& p : patches) top = std::max(top, p.dE76);
    const int bins = std::max(1, static_cast<int>(std::ceil(top / bin + 1e-9)));
    std::vector<int> counts(bins, 0);
    for (const auto& p : patches) counts[std::min(bins - 1, static_cast<int>(p.dE76 / bin))]++;
    const int most = *std::max_element(counts.begin(), counts.end());
    const double width = 420, height = 200, barWidth = (width - 40) / bins;
    std::ostringstream s;
    s << "<svg id=\"de-histogram\" xmlns=\"http://www.w3.org/2000/svg\" width=\"" << width << "\" height=\""
      << height + 30 << "\" role=\"img\" aria-label=\"dE histogram\">\n";
    for (int i = 0; i < bins; ++i) {
        const double h = most ? counts[i] * height / most : 0;
        s << "<rect class=\"bar\" x=\"" << Fixed(30 + i * barWidth, 1) << "\" y=\"" << Fixed(height - h, 1)
          << "\" width=\"" << Fixed(std::max(1.0, barWidth - 1), 1) << "\" height=\"" << Fixed(h, 1)
          << "\" fill=\"#2980b9\"><title>" << Fixed(i * bin, 1) << "-" << Fixed((i + 1) * bin, 1) << ": "
          << counts[i] << "</title></rect>\n";
    }
    s << "<line x1=\"30\" y1=\"" << height << "\" x2=\"" << width << "\" y2=\"" << height << "\" stroke=\"#333\"/>"
      << "<text x=\"30\" y=\"" << height + 15 << "\" font-size=\"11\">0</text>"
      << "<text x=\"" << width - 60 << "\" y=\"" << height + 15 << "\" font-size=\"11\">dE76 " << Fixed(bins * bin, 1)
      << "</text><text x=\"0\" y=\"12\" font-size=\"11\">" << most << "</text>\n</svg>";
    return s.str();
}

std::string LoopPlot(const std::vector<LoopPass>& passes) {
    const double width = 420, height = 200, left = 40;
    double top = 0;
    for (const auto& p : passes) top = std::max(top, p.mean);
    top = std::max(1.0, std::ceil(top));
    const double step = passes.size() > 1 ? (width - left - 20) / (passes.size() - 1) : 0;
    std::ostringstream s, points;
    for (size_t i = 0; i < passes.size(); ++i)
        points << (i ? " " : "") << Fixed(left + i * step, 1) << ',' << Fixed(height - passes[i].mean * height / top, 1);
    s << "<svg id=\"loop-plot\" xmlns=\"http://www.w3.org/2000/svg\" width=\"" << width << "\" height=\""
      << height + 30 << "\" role=\"img\" aria-label=\"mean dE by pass\">\n"
      << "<line x1=\"" << left << "\" y1=\"" << height << "\" x2=\"" << width << "\" y2=\"" << height
      << "\" stroke=\"#333\"/><line x1=\"" << left << "\" y1=\"0\" x2=\"" << left << "\" y2=\"" << height
      << "\" stroke=\"#333\"/>\n<text x=\"0\" y=\"12\" font-size=\"11\">" << Fixed(top, 0) << "</text>"
      << "<text x=\"" << width - 60 << "\" y=\"" << height + 15 << "\" font-size=\"11\">pass</text>\n"
      << "<polyline class=\"mean-by-pass\" points=\"" << points.str() << "\" fill=\"none\" stroke=\"#27ae60\" stroke-width=\"2\"/>\n";
    for (size_t i = 0; i < passes.size(); ++i)
        s << "<circle cx=\"" << Fixed(left + i * step, 1) << "\" cy=\"" << Fixed(height - passes[i].mean * height / top, 1)
          << "\" r=\"3\" fill=\"#27ae60\"><title>pass " << passes[i].pass << ": " << Fixed(passes[i].mean) << "</title></circle>"
          << "<text x=\"" << Fixed(left + i * step - 3, 1) << "\" y=\"" << height + 15 << "\" font-size=\"11\">"
          << passes[i].pass << "</text>\n";
    s << "</svg>";
    return s.str();
}

std::string DeviceText(const std::vector<double>& device) {
    std::string out;
    for (size_t i = 0; i < device.size(); ++i) out += (i ? " " : "") + Fixed(device[i], 1);
    return out;
}

std::string LabText(const Lab3& lab) { return Fixed(lab.L) + " " + Fixed(lab.a) + " " + Fixed(lab.b); }

}  // namespace

std::string RenderReport(const ReportInput& in) {
    std::ostringstream h;
    h << "<!DOCTYPE html>\n<html lang=\"en\"><head><meta charset=\"utf-8\"><title>" << Escape(in.title)
      << "</title>\n<style>body{font-family:sans-serif;margin:2em;max-width:60em}table{border-collapse:collapse;"
         "margin:1em 0}td,th{border:1px solid #bbb;padding:.2em .6em;text-align:right}th{background:#eee}"
         "td.l,th.l{text-align:left}.pass{color:#1e8449;font-weight:bold}.fail{color:#c0392b;font-weight:bold}"
         "figure{display:inline-block;margin:1em}</style></head><body>\n"
      << "<h1>" << Escape(in.title) << "</h1>\n<p>Reference: <code>" << Escape(in.referenceName)
      << "</code><br>Proof: <code>" << Escape(in.proofName) << "</code><br>Patches compared: " << in.patches.size()
      << "</p>\n";

    if (!in.passes.empty() || !in.loopNote.empty()) {
        h << "<h2>Proof loop</h2>\n";
        if (!in.loopNote.empty()) h << "<p id=\"loop-note\">" << Escape(in.loopNote) << "</p>\n";
        h << "<table id=\"passes\"><tr><th>Pass</th><th>Mean dE76</th><th>p95</th><th>Maximum</th><th>Paper</th>"
             "<th>Correction (s)</th></tr>\n";
        for (const LoopPass& p : in.passes)
            h << "<tr><td>" << p.pass << "</td><td>" << Fixed(p.mean) << "</td><td>" << Fixed(p.p95) << "</td><td>"
              << Fixed(p.maximum) << "</td><td>" << Fixed(p.paper) << "</td><td>"
              << (p.seconds < 0 ? "-" : Fixed(p.seconds, 1)) << "</td></tr>\n";
        h << "</table>\n";
        if (!in.passes.empty()) h << "<figure>" << LoopPlot(in.passes) << "<figcaption>Mean dE76 by pass</figcaption></figure>\n";
    }
    if (in.figures.present) {
        h << "<h2>The four figures</h2>\n<table id=\"figures\"><tr><th class=\"l\">Figure</th><th>Value</th></tr>\n"
          << "<tr><td class=\"l\">Mean colour difference</td><td>" << Fixed(in.figures.mean) << "</td></tr>\n"
          << "<tr><td class=\"l\">Maximum colour difference</td><td>" << Fixed(in.figures.maximum) << "</td></tr>\n"
          << "<tr><td class=\"l\">Paper white difference</td><td>" << Fixed(in.figures.paperWhite) << "</td></tr>\n"
          << "<tr><td class=\"l\">Reference colours in the proofer's gamut</td><td>" << Fixed(in.figures.inGamut, 1)
          << " %</td></tr>\n</table>\n<p>As the library computes them.</p>\n";
    }

    const auto checks = RunChecks(in.patches);
    const bool allPass = std::all_of(checks.begin(), checks.end(), [](const CheckResult& c) { return c.pass || !c.count; });
    h << "<h2>Proof tolerances</h2>\n<p id=\"verdict\" class=\"" << (allPass ? "pass\">PASS" : "fail\">FAIL")
      << "</p>\n<table id=\"tolerances\"><tr><th class=\"l\">Check</th><th class=\"l\">Patches (device values)</th>"
         "<th>Count</th><th>Measured</th><th>Limit (2013, dE*ab / dH*ab)</th><th>Result</th>"
         "<th>Measured dE2000</th><th>Limit (2016, dE2000)</th></tr>\n";
    for (const CheckResult& c : checks) {
        static const char* kSets[] = {"all", "C=M=Y=K=0", "one of C, M, Y, K at 100, others 0",
                                      "K=0, M=Y, C 20..80 and 0..12 above M"};
        const bool dH = c.tolerance->measure == Tolerance::MaxDH || c.tolerance->measure == Tolerance::MeanDH;
        h << "<tr><td class=\"l\">" << c.tolerance->check << "</td><td class=\"l\">"
          << kSets[static_cast<int>(c.tolerance->patches)] << "</td><td>" << c.count << "</td><td>"
          << (c.count ? Fixed(c.value) : "-") << "</td><td>" << Fixed(c.tolerance->limit2013, 1) << "</td><td class=\""
          << (c.count ? (c.pass ? "pass\">pass" : "fail\">fail") : "l\">no such patches") << "</td><td>"
          << (c.count && !dH ? Fixed(c.value2000) : "-") << "</td><td>" << c.tolerance->limit2016 << "</td></tr>\n";
    }
    h << "</table>\n<p><small>" << kToleranceSource << "</small></p>\n";

    h << "<h2>Plots</h2>\n<figure>" << AbPlot(in.patches)
      << "<figcaption>a*b*: reference (dots) and the error to the proof (lines, drawn 5&times; long)</figcaption></figure>\n"
      << "<figure>" << Histogram(in.patches) << "<figcaption>dE76 histogram (bins of 0.5)</figcaption></figure>\n";

    std::vector<const ReportPatch*> worst;
    for (const auto& p : in.patches) worst.push_back(&p);
    std::sort(worst.begin(), worst.end(), [](auto* x, auto* y) { return x->dE76 > y->dE76; });
    worst.resize(std::min<size_t>(worst.size(), 10));
    h << "<h2>Worst patches</h2>\n<table id=\"worst\"><tr><th>Patch</th><th class=\"l\">Device values</th>"
         "<th class=\"l\">Reference Lab</th><th class=\"l\">Proof Lab</th><th>dE76</th><th>dE2000</th><th>dH</th></tr>\n";
    for (const ReportPatch* p : worst)
        h << "<tr><td>" << p->index << "</td><td class=\"l\">" << DeviceText(p->device) << "</td><td class=\"l\">"
          << LabText(p->reference) << "</td><td class=\"l\">" << LabText(p->proof) << "</td><td>" << Fixed(p->dE76)
          << "</td><td>" << Fixed(p->dE2000) << "</td><td>" << Fixed(p->dH) << "</td></tr>\n";
    h << "</table>\n";

    h << "</body></html>\n";
    return h.str();
}

void WriteReport(const std::string& path, const ReportInput& input) {
    std::ofstream out(path, std::ios::binary);
    if (!out) Fail(path + ": cannot write the report");
    out << RenderReport(input);
    if (!out.flush()) Fail(path + ": cannot write the report");
}

}  // namespace vantrel::cli
