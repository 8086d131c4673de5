#include "commands.h"

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "cli_support.h"
#include "it8/measured_it8.h"
#include "proof_loop.h"
#include "proofer_model.h"
#include "proof_report.h"
#include "vantrel.h"

namespace fs = std::filesystem;

namespace vantrel::cli {

namespace {

const std::vector<std::string> kCommon = {"--json", "--quiet"};
// analyse1's device values: 0..255 x 1000 for 0..100 %.
constexpr double kPercentToHost = 2550.0;

std::vector<std::string> With(std::vector<std::string> options) {
    options.insert(options.end(), kCommon.begin(), kCommon.end());
    return options;
}

void Print(const std::string& text) { std::fputs(text.c_str(), stdout); }

// Splits "100,0,0,0" into numbers; a usage error for anything else.
std::vector<double> NumberList(const std::string& text) {
    std::vector<double> values;
    std::stringstream in(text);
    std::string item;
    while (std::getline(in, item, ',')) {
        char* end = nullptr;
        const double v = std::strtod(item.c_str(), &end);
        if (item.empty() || *end) UsageError("\"" + text + "\" is not a list of numbers such as 100,0,0,0");
        values.push_back(v);
    }
    return values;
}

// Writes one of the neutral profiles dllInit puts in the scratch folder: the start of a 3CC
// correction or of a link's calibration runs.
int WriteNeutral(const Args& args, const char* option, const char* name) {
    const std::string out = args.Get(option);
    Session session(true);
    CopyFile(session.Scratch() + name, out);
    if (args.Has("--json")) Print(Json().Add("output", out).Text() + "\n");
    else Print("wrote " + out + "\n");
    return kOk;
}

// ---- convert ----------------------------------------------------------------------------------

struct DeviceKind {
    int channels;
    int (*convert)(void*, const char*, int, const int*, int, int*, int, int*);
    const char* columns[7];
};
const DeviceKind kCmyk = {4, Cmyk2Lab_Double, {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"}};
const DeviceKind kRgb = {3, RGB2Lab_Double, {"RGB_R", "RGB_G", "RGB_B"}};
const DeviceKind kCmykRgb = {7, Cmykrgb2Lab_Double, {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "R", "G", "B"}};

// Device records from a CGATS file (its device columns) or a CSV file (numbers per line).
std::vector<std::vector<double>> ReadDeviceFile(const std::string& path, const DeviceKind& kind) {
    RequireFile(path);
    std::ifstream probe(path);
    std::string first;
    std::getline(probe, first);
    const bool csv = fs::path(path).extension() == ".csv" ||
                     (!first.empty() && (std::isdigit(static_cast<unsigned char>(first[0])) || first[0] == '-'));
    std::vector<std::vector<double>> records;
    if (csv) {
        std::ifstream in(path);
        std::string line;
        int number = 0;
        while (std::getline(in, line)) {
            ++number;
            if (line.empty() || !(std::isdigit(static_cast<unsigned char>(line[0])) || line[0] == '-' || line[0] == '.'))
                continue;  // headers and blank lines
            for (char& c : line) if (c == ';' || c == '\t' || c == ' ') c = ',';
            std::vector<double> values;
            std::stringstream fields(line);
            std::string item;
            while (std::getline(fields, item, ',')) if (!item.empty()) values.push_back(std::atof(item.c_str()));
            if (static_cast<int>(values.size()) < kind.channels)
                Fail(path + ": line " + std::to_string(number) + ": " + std::to_string(values.size()) +
                     " values, " + std::to_string(kind.channels) + " device values needed");
            values.resize(kind.channels);
            records.push_back(values);
        }
        if (records.empty()) Fail(path + ": no rows of device values");
        return records;
    }
    RequireChart(path, true, false);
    Measured_IT8 chart;
    chart.ReadIt8(path);
    const bool cmyk = chart.Column(kColCyan) >= 0, rgb = chart.Column(kColRgbR) >= 0;
    if ((kind.channels == 4 && !cmyk) || (kind.channels == 3 && !rgb) || (kind.channels == 7 && !(cmyk && rgb)))
        Fail(path + ": chart has no " + (kind.channels == 4 ? "CMYK" : kind.channels == 3 ? "RGB" : "CMYK and RGB") +
             " device columns");
    for (int i = 0; i < chart.PatchCount(); ++i) {
        std::vector<double> values;
        if (kind.channels != 3) for (int c = 0; c < 4; ++c) values.push_back(chart.GetCmyk(i, c));
        if (kind.channels != 4) for (int c = 0; c < 3; ++c) values.push_back(chart.GetRgb(i, c));
        records.push_back(values);
    }
    return records;
}

int Convert(int argc, char** argv) {
    Args args(argc, argv, With({"--rgb", "--cmykrgb"}));
    args.Only(With({"--rgb", "--cmykrgb", "--in", "--out"}), 1000);
    const std::string profile = args.At(0, "PROFILE");
    const DeviceKind& kind = args.Has("--cmykrgb") ? kCmykRgb : args.Has("--rgb") ? kRgb : kCmyk;
    std::vector<std::vector<double>> records;
    if (args.Has("--in")) {
        if (args.Positional().size() > 1) UsageError("give device values either as arguments or with --in");
        records = ReadDeviceFile(args.Get("--in"), kind);
    } else {
        for (size_t i = 1; i < args.Positional().size(); ++i) records.push_back(NumberList(args.Positional()[i]));
        if (records.empty()) UsageError("missing device values (such as 100,0,0,0) or --in FILE");
    }
    for (const auto& r : records)
        if (static_cast<int>(r.size()) != kind.channels)
            UsageError("each record needs " + std::to_string(kind.channels) + " device values");
    RequireProfile(profile);

    // The library takes whole percent for CMYK (and 0..255 for RGB).
    std::vector<int> in;
    for (const auto& r : records) for (double v : r) in.push_back(static_cast<int>(std::lround(v)));
    const int count = static_cast<int>(records.size());
    std::vector<int> lab(3 * count), xyz(3 * count);
    Session session(args.Has("--quiet"));
    if (kind.convert(session.Handle(), profile.c_str(), count, in.data(), 0, lab.data(), 0, xyz.data()) != 0)
        Fail(profile + ": the conversion failed");

    const std::string out = args.Get("--out");
    std::ostringstream text, json;
    json << "[";
    for (int i = 0; i < count; ++i) {
        std::ostringstream row;
        for (int c = 0; c < kind.channels; ++c) row << (c ? "," : "") << in[kind.channels * i + c];
        for (int c = 0; c < 3; ++c) row << ',' << JsonNumber(FromHost(lab[3 * i + c]));
        for (int c = 0; c < 3; ++c) row << ',' << JsonNumber(FromHost(xyz[3 * i + c]));
        text << row.str() << '\n';
        std::ostringstream device;
        for (int c = 0; c < kind.channels; ++c) device << (c ? "," : "") << in[kind.channels * i + c];
        json << (i ? ", " : "") << "{\"device\": [" << device.str() << "], \"lab\": [" << JsonNumber(FromHost(lab[3 * i]))
             << ", " << JsonNumber(FromHost(lab[3 * i + 1])) << ", " << JsonNumber(FromHost(lab[3 * i + 2]))
             << "], \"xyz\": [" << JsonNumber(FromHost(xyz[3 * i])) << ", " << JsonNumber(FromHost(xyz[3 * i + 1]))
             << ", " << JsonNumber(FromHost(xyz[3 * i + 2])) << "]}";
    }
    json << "]";
    std::string header;
    for (int c = 0; c < kind.channels; ++c) header += std::string(c ? "," : "") + kind.columns[c];
    header += ",LAB_L,LAB_A,LAB_B,XYZ_X,XYZ_Y,XYZ_Z\n";

    if (!out.empty()) {
        std::error_code error;
        if (args.Has("--in") && fs::exists(out, error) && fs::equivalent(out, args.Get("--in"), error))
            UsageError(out + ": is the input file");
        if (fs::path(out).extension() == ".csv") {
            std::ofstream file(out);
            if (!(file << header << text.str()).flush()) Fail(out + ": cannot write");
        } else {
            std::vector<PatchRecord> patches(count);
            for (int i = 0; i < count; ++i) {
                patches[i].kind = kind.channels == 3 ? 3 : kind.channels == 7 ? 7 : 4;
                patches[i].sampleNumber = i + 1;
                for (int c = 0; c < kind.channels; ++c) patches[i].device[c] = in[kind.channels * i + c];
                for (int c = 0; c < 3; ++c) {
                    patches[i].lab[c] = FromHost(lab[3 * i + c]);
                    patches[i].xyz[c] = FromHost(xyz[3 * i + c]);
                }
            }
            Measured_IT8 writer;
            const int32_t code = writer.WriteIt8(out, patches, count, 0, 0, 0);
            if (code != 0) Fail(out + ": " + It8ErrorText(code));
        }
        std::fprintf(stderr, "wrote %d records to %s\n", count, out.c_str());
    }
    if (args.Has("--json")) Print(json.str() + "\n");
    else if (out.empty()) Print(header + text.str());
    return kOk;
}

// ---- inks (analyse1) --------------------------------------------------------------------------

int Inks(int argc, char** argv) {
    Args args(argc, argv, kCommon);
    args.Only(With({"--start"}), 4);
    const std::string profile = args.At(0, "PROFILE");
    double target[3];
    for (int c = 0; c < 3; ++c) {
        const std::string& text = args.At(1 + c, "L* a* b*");
        char* end = nullptr;
        target[c] = std::strtod(text.c_str(), &end);
        if (*end) UsageError("\"" + text + "\" is not a number");
    }
    std::vector<double> start = args.Has("--start") ? NumberList(args.Get("--start")) : std::vector<double>{10, 10, 10, 10};
    if (start.size() > 7) UsageError("--start takes at most 7 values");
    RequireProfile(profile, "A2B1");
    int lab[3], values[7] = {};
    for (int c = 0; c < 3; ++c) lab[c] = static_cast<int>(std::lround(target[c] * 1000));
    // The search works on the 0..255 device scale (x 1000); the command speaks percent.
    for (size_t c = 0; c < start.size(); ++c) values[c] = static_cast<int>(std::lround(start[c] * kPercentToHost));
    Session session(args.Has("--quiet"));
    if (analyse1(session.Handle(), profile.c_str(), lab, values) != 0) Fail(profile + ": no inks found");
    if (args.Has("--json")) {
        std::string list;
        for (int c = 0; c < 4; ++c) list += (c ? ", " : "") + JsonNumber(values[c] / kPercentToHost);
        Print(Json().AddRaw("cmyk", "[" + list + "]").Text() + "\n");
    } else {
        char line[128];
        std::snprintf(line, sizeof line, "C %.1f  M %.1f  Y %.1f  K %.1f\n", values[0] / kPercentToHost,
                      values[1] / kPercentToHost, values[2] / kPercentToHost, values[3] / kPercentToHost);
        Print(line);
    }
    return kOk;
}

// ---- isd (analyse2) ---------------------------------------------------------------------------

int Isd(int argc, char** argv) {
    Args args(argc, argv, kCommon);
    args.Only(With({"--out"}), 2);
    const std::string isd = args.At(0, "ISD_PROFILE"), measurement = args.At(1, "MEASUREMENT");
    if (!args.Has("--out")) UsageError("give --out FILE for the transformed measurement");
    const std::string out = args.Get("--out");
    RequireProfile(isd);
    RequireChart(measurement, true, true);
    std::error_code error;
    if (fs::exists(out, error) && fs::equivalent(out, measurement, error)) UsageError(out + ": is the input file");
    Session session(args.Has("--quiet"));
    const std::string copy = session.CopyIn(measurement);
    int out1 = 0, out2 = 0;
    if (analyse2(session.Handle(), isd.c_str(), out.c_str(), copy.c_str(), &out1, &out2) != 0 || !fs::exists(out, error))
        Fail(measurement + ": the ISD profile could not be applied");
    if (args.Has("--json")) Print(Json().Add("output", out).Text() + "\n");
    else Print("wrote " + out + "\n");
    return kOk;
}

// ---- compare (analyse3) -----------------------------------------------------------------------

int Compare(int argc, char** argv) {
    Args args(argc, argv, kCommon);
    args.Only(With({"--profile"}), 2);
    const std::string measurement = args.At(0, "MEASUREMENT");
    const std::string reference = args.Positional().size() > 1 ? args.Positional()[1] : "";
    const std::string profile = args.Get("--profile");
    RequireChart(measurement, true, true);
    if (!reference.empty()) RequireChart(reference, true, true);
    if (!profile.empty()) RequireProfile(profile);
    Session session(args.Has("--quiet"));
    const std::string meas = session.CopyIn(measurement);
    const std::string ref = reference.empty() ? "" : session.CopyIn(reference);
    // Two charts are compared through the library's neutral link (a copy dllInit wrote in the
    // scratch folder, which the analysis may adjust); one chart gives its repeatability.
    const std::string link = reference.empty() ? "" : session.Scratch() + "neutral.3cc";
    int mean = 0, maximum = 0;
    analyse3(session.Handle(), profile.c_str(), link.c_str(), ref.c_str(), meas.c_str(), &mean, &maximum);
    session.CheckInterrupted();
    if (mean == 255000 && maximum == 300000) Fail(measurement + ": the analysis stopped before it had its figures");
    if (mean == 100000 && maximum == 100000) Fail(measurement + ": its patches cannot be paired with " + reference);
    const char* what = reference.empty() ? "repeatability" : "comparison";
    if (args.Has("--json"))
        Print(Json().Add("analysis", what).Add("mean", FromHost(mean)).Add("maximum", FromHost(maximum)).Text() + "\n");
    else {
        char line[128];
        std::snprintf(line, sizeof line, "%s: mean dE %.2f, maximum %.2f\n", what, FromHost(mean), FromHost(maximum));
        Print(line);
    }
    return kOk;
}

// ---- judge (analyse4) and correct (optimize2 / optimize3) -------------------------------------

struct Judged {
    LibraryFigures figures;
    std::string referenceIt8;  // the given reference, or the simulated one
    std::string proofIt8;      // the proof as analysed (a copy)
};

// analyse4 on copies of the files: the simulated reference and the ISD step write beside them.
Judged RunAnalyse4(Session& session, const std::string& proofProfile, const std::string& refProfile,
                   const std::string& proof, const std::string& reference) {
    RequireProfile(proofProfile, "A2B1");
    RequireProfile(refProfile, "A2B1");
    RequireChart(proof, true, true);
    if (!reference.empty()) RequireChart(reference, true, true);
    Judged judged;
    const std::string ref = session.CopyIn(refProfile);
    judged.proofIt8 = session.CopyIn(proof);
    judged.referenceIt8 = reference.empty() ? ref + ".it8" : session.CopyIn(reference);
    int out[4] = {};
    if (analyse4(session.Handle(), proofProfile.c_str(), ref.c_str(), reference.empty() ? "" : judged.referenceIt8.c_str(),
                 judged.proofIt8.c_str(), &out[0], &out[1], &out[2], &out[3]) != 0)
        Fail(proof + ": the proof could not be judged");
    session.CheckInterrupted();
    if (out[0] == 255000 && out[1] == 300000) Fail(proof + ": the analysis stopped before it had its figures");
    if (out[0] == 100000 && out[1] == 100000) Fail(proof + ": its patches cannot be paired with the reference");
    judged.figures = {true, FromHost(out[0]), FromHost(out[1]), FromHost(out[2]), FromHost(out[3])};
    return judged;
}

std::string FiguresJson(const LibraryFigures& f) {
    return Json().Add("mean", f.mean).Add("maximum", f.maximum).Add("paper_white", f.paperWhite).Add("in_gamut", f.inGamut).Text();
}

void PrintFigures(const LibraryFigures& f) {
    char text[256];
    std::snprintf(text, sizeof text, "mean dE %.2f, maximum %.2f, paper white %.2f, in gamut %.1f %%\n", f.mean,
                  f.maximum, f.paperWhite, f.inGamut);
    Print(text);
}

int Judge(int argc, char** argv) {
    Args args(argc, argv, kCommon);
    args.Only(With({"--reference", "--report"}), 3);
    const std::string proofProfile = args.At(0, "PROOFER_PROFILE"), refProfile = args.At(1, "REFERENCE_PROFILE");
    const std::string proof = args.At(2, "PROOF_MEASUREMENT");
    Session session(args.Has("--quiet"));
    const Judged judged = RunAnalyse4(session, proofProfile, refProfile, proof, args.Get("--reference"));
    const std::string report = args.Get("--report", fs::path(proof).stem().string() + "-report.html");
    ReportInput input;
    input.title = "Proof report: " + fs::path(proof).filename().string();
    input.referenceName = args.Has("--reference") ? args.Get("--reference") : refProfile + " (its predictions)";
    input.proofName = proof;
    input.figures = judged.figures;
    input.patches = PairPatches(judged.referenceIt8, judged.proofIt8);
    WriteReport(report, input);
    const auto checks = RunChecks(input.patches);
    bool pass = true;
    std::string checkJson;
    for (const CheckResult& c : checks) {
        if (c.count) pass = pass && c.pass;
        checkJson += std::string(checkJson.empty() ? "" : ", ") +
                     Json().Add("check", c.tolerance->check).Add("count", c.count).Add("value", c.value)
                         .Add("limit", c.tolerance->limit2013).AddRaw("pass", c.count ? (c.pass ? "true" : "false") : "null").Text();
    }
    if (args.Has("--json")) {
        Print(Json().AddRaw("figures", FiguresJson(judged.figures)).AddRaw("checks", "[" + checkJson + "]")
                  .AddRaw("pass", pass ? "true" : "false").Add("report", report).Text() + "\n");
    } else {
        PrintFigures(judged.figures);
        for (const CheckResult& c : checks) {
            char line[160];
            std::snprintf(line, sizeof line, "  %-24s %6.2f (limit %.1f, %d patches)  %s\n", c.tolerance->check, c.value,
                          c.tolerance->limit2013, c.count, c.count ? (c.pass ? "pass" : "FAIL") : "n/a");
            Print(line);
        }
        Print(std::string(pass ? "PASS" : "FAIL") + "\n");
        std::fprintf(stderr, "report: %s\n", report.c_str());
    }
    return kOk;
}

int Correct(int argc, char** argv) {
    Args args(argc, argv, With({"--in-place"}));
    args.Only(With({"--reference", "--out", "--in-place", "--3cc", "--option", "--write-neutral-3cc"}), 3);
    if (args.Has("--write-neutral-3cc")) return WriteNeutral(args, "--write-neutral-3cc", "neutral.3cc");
    const std::string proofProfile = args.At(0, "PROOFER_PROFILE"), refProfile = args.At(1, "REFERENCE_PROFILE");
    const std::string proof = args.At(2, "PROOF_MEASUREMENT");
    const int option = static_cast<int>(args.Number("--option", 0));
    const bool threeCc = args.Has("--3cc");
    if (threeCc) RequireProfile(args.Get("--3cc"));
    else if (args.Has("--in-place")) UsageError("correct writes a new proofer profile: give --out FILE");
    else if (!args.Has("--out")) UsageError("give --out FILE for the corrected proofer profile");
    Session session(args.Has("--quiet"));
    const Judged judged = RunAnalyse4(session, proofProfile, refProfile, proof, args.Get("--reference"));
    int out1 = 0, out2 = 0, result;
    std::error_code error;
    if (!threeCc && fs::exists(args.Get("--out"), error) && fs::equivalent(args.Get("--out"), proofProfile, error))
        UsageError(args.Get("--out") + ": is the proofer profile; write the correction to a new file");
    OutputFile output = threeCc ? OutputFile(args, args.Get("--3cc")) : OutputFile(args.Get("--out"));
    const std::string& written = output.Path();
    if (threeCc) result = optimize3(session.Handle(), written.c_str(), &out1, &out2, option);
    else result = optimize2(session.Handle(), written.c_str(), &out1, &out2, option);
    session.CheckInterrupted();
    const char* name = threeCc ? "optimize3" : "optimize2";
    if (result == -1) Fail(std::string(name) + " is not available in this build of the library");
    if (result != 0) Fail(written + ": " + name + " failed (result " + std::to_string(result) + ")");
    output.Keep();
    if (args.Has("--json"))
        Print(Json().AddRaw("before", FiguresJson(judged.figures)).Add("output", written).Text() + "\n");
    else {
        PrintFigures(judged.figures);
        Print("wrote " + written + "\n");
    }
    return kOk;
}

// ---- improve (optimize1) ----------------------------------------------------------------------

int Improve(int argc, char** argv) {
    Args args(argc, argv, With({"--in-place"}));
    args.Only(With({"--out", "--in-place"}), 1);
    const std::string profile = args.At(0, "PROFILE");
    RequireProfile(profile, "A2B1");
    RequireProfile(profile, "B2A1");
    OutputFile output(args, profile);
    const std::string& out = output.Path();
    Session session(args.Has("--quiet"));
    int mean = 0, maximum = 0;
    const int result = optimize1(session.Handle(), out.c_str(), &mean, &maximum);
    session.CheckInterrupted();
    static const char* kWhy[] = {"", "", "a table to measure is missing", "the file cannot take the table back",
                                 "a step ran out of memory"};
    if (result != 0) Fail(out + ": " + (result >= 2 && result <= 4 ? kWhy[result] : "optimize1 failed"));
    output.Keep();
    if (args.Has("--json"))
        Print(Json().Add("round_trip_mean", FromHost(mean)).Add("round_trip_maximum", FromHost(maximum)).Add("output", out).Text() + "\n");
    else {
        char line[160];
        std::snprintf(line, sizeof line, "round trip: mean dE %.2f, maximum %.2f\nwrote %s\n", FromHost(mean),
                      FromHost(maximum), out.c_str());
        Print(line);
    }
    return kOk;
}

// ---- calibrate (analyse3 + optimize4) ---------------------------------------------------------

int Calibrate(int argc, char** argv) {
    Args args(argc, argv, With({"--in-place"}));
    args.Only(With({"--out", "--in-place", "--reference", "--paper", "--option", "--write-neutral-link"}), 2);
    if (args.Has("--write-neutral-link")) return WriteNeutral(args, "--write-neutral-link", "cmyk2cmyk5neutral.mcc");
    const std::string link = args.At(0, "LINK"), measurement = args.At(1, "MEASUREMENT");
    const std::string reference = args.Get("--reference"), paper = args.Get("--paper");
    RequireProfile(link);
    RequireChart(measurement, true, true);
    if (!reference.empty()) RequireChart(reference, true, true);
    if (!paper.empty()) RequireProfile(paper);
    OutputFile output(args, link);
    const std::string& out = output.Path();
    Session session(args.Has("--quiet"));
    // The measurement's name carries the calibration run ("_cal<N>"), so the copy keeps it.
    const std::string meas = session.CopyIn(measurement);
    const std::string ref = reference.empty() ? "" : session.CopyIn(reference);
    int mean = 0, maximum = 0, out1 = 0, out2 = 0;
    analyse3(session.Handle(), paper.c_str(), out.c_str(), ref.c_str(), meas.c_str(), &mean, &maximum);
    session.CheckInterrupted();
    const int result = optimize4(session.Handle(), out.c_str(), &out1, &out2, nullptr, paper.c_str(),
                                 static_cast<int>(args.Number("--option", 1)));
    session.CheckInterrupted();
    if (result == 2) Fail(out + ": the link's table could not be loaded");
    if (result == 3) Fail(out + ": the file cannot take the corrected table back");
    if (result != 0) Fail(out + ": optimize4 failed (result " + std::to_string(result) + ")");
    output.Keep();
    if (args.Has("--json"))
        Print(Json().Add("mean", FromHost(mean)).Add("maximum", FromHost(maximum)).Add("output", out).Text() + "\n");
    else {
        char line[160];
        std::snprintf(line, sizeof line, "measured: mean dE %.2f, maximum %.2f\nwrote %s\n", FromHost(mean),
                      FromHost(maximum), out.c_str());
        Print(line);
    }
    return kOk;
}

// ---- merge (mergeMCHintoCMYK) -----------------------------------------------------------------

int Merge(int argc, char** argv) {
    Args args(argc, argv, kCommon);
    args.Only(With({"--out"}), 2);
    const std::string multi = args.At(0, "MULTICOLOUR_PROFILE"), cmyk = args.At(1, "CMYK_PROFILE");
    if (!args.Has("--out")) UsageError("give --out FILE for the merged CMYK profile");
    const std::string out = args.Get("--out");
    RequireProfile(multi);
    RequireProfile(cmyk);
    std::error_code error;
    for (const std::string& input : {multi, cmyk})
        if (fs::exists(out, error) && fs::equivalent(out, input, error)) UsageError(out + ": is an input file");
    Session session(args.Has("--quiet"));
    if (mergeMCHintoCMYK(session.Handle(), multi.c_str(), cmyk.c_str(), out.c_str()) != 0)
        Fail(multi + ": cannot be merged into " + cmyk);
    if (args.Has("--json")) Print(Json().Add("output", out).Text() + "\n");
    else Print("wrote " + out + "\n");
    return kOk;
}

// ---- loop (the simulated proof loop) ----------------------------------------------------------

int Loop(int argc, char** argv) {
    namespace pl = vantrel::proofloop;
    Args args(argc, argv, With({"--full-chart"}));
    args.Only(With({"--passes", "--corrector", "--report", "--work", "--fixtures", "--quality", "--noise", "--seed",
                    "--full-chart", "--option"}), 0);
    pl::LoopSettings settings;
    settings.passes = static_cast<int>(args.Number("--passes", 3));
    settings.noise = args.Number("--noise", 0.2);
    settings.seed = static_cast<unsigned>(args.Number("--seed", 1));
    settings.optimizeOption = static_cast<int>(args.Number("--option", 0));
    if (args.Has("--full-chart")) settings.chartStep = 1;
    if (settings.passes < 1 || settings.passes > 50) UsageError("--passes takes 1 to 50");
    if (!pl::ParseCorrector(args.Get("--corrector", "optimize2"), &settings.corrector))
        UsageError("--corrector takes optimize2, optimize3, refine or none");
    const std::string quality = args.Get("--quality", "l");
    if (quality.size() != 1 || std::string("lmh").find(quality) == std::string::npos)
        UsageError("--quality takes l, m or h");
    const std::string fixtures = args.Get("--fixtures", VANTREL_FIXTURE_DIR);
    settings.workDir = args.Get("--work", (fs::temp_directory_path() / "vantrel-loop").string());
    const std::string report = args.Get("--report", (fs::path(settings.workDir) / "proof-loop-report.html").string());
    settings.referenceProfile = fixtures + "/FOGRA39L.icc";
    RequireFile(settings.pressTi3);
    RequireProfile(settings.referenceProfile, "A2B1");

    pl::ArgyllTools tools = pl::FindArgyllTools();
    if (!tools.Complete()) Fail("Argyll's " + tools.Missing() + " not found on PATH; the proof loop needs them");
    std::fprintf(stderr, "building the simulated proofer profiles (cached in %s/proof_loop)...\n", fixtures.c_str());
    const pl::ModelProfiles model =
        pl::BuildModelProfiles(tools, settings.pressTi3, pl::ProoferModel{}, quality[0], fixtures + "/proof_loop");
    if (!model.error.empty()) Fail(model.error);
    settings.prooferProfile = model.proofer;
    settings.todayProfile = model.today;

    const bool json = args.Has("--json");
    if (!json) Print(pl::FormatHeader(std::string("proof loop, corrector ") + pl::CorrectorName(settings.corrector)));
    const pl::LoopResult result = pl::RunProofLoop(settings, tools, [&](const pl::PassFigures& f) {
        if (!json) {
            Print(pl::FormatRow(f));
            std::fflush(stdout);
        }
    });
    ReportInput input;
    input.title = std::string("Simulated proof loop (") + pl::CorrectorName(settings.corrector) + ")";
    for (const auto& f : result.passes) input.passes.push_back({f.pass, f.mean, f.p95, f.maximum, f.paper, f.correctionSeconds});
    input.loopNote = result.error;
    if (!result.passes.empty()) {
        const std::string reference = settings.workDir + "/reference.ti3";
        const std::string last = settings.workDir + "/proof-pass" + std::to_string(result.passes.back().pass) + ".ti3";
        input.referenceName = reference;
        input.proofName = last + " (the last pass)";
        input.patches = PairPatches(reference, last);
        WriteReport(report, input);
    }
    if (json) {
        std::string passes;
        for (const auto& p : input.passes)
            passes += std::string(passes.empty() ? "" : ", ") +
                      Json().Add("pass", p.pass).Add("mean", p.mean).Add("p95", p.p95).Add("maximum", p.maximum)
                          .Add("paper", p.paper).Text();
        Print(Json().AddRaw("passes", "[" + passes + "]").Add("stopped", result.error)
                  .Add("report", result.passes.empty() ? "" : report).Text() + "\n");
    }
    if (!result.error.empty()) std::fprintf(stderr, "vantrel loop: %s\n", result.error.c_str());
    if (!result.passes.empty()) std::fprintf(stderr, "report: %s\n", report.c_str());
    if (result.passes.empty()) Fail(result.error.empty() ? "no pass ran" : result.error);
    return result.error.empty() ? kOk : kFailed;
}

}  // namespace

const std::vector<Command>& Commands() {
    static const std::vector<Command> commands = {
        {"convert", "device values to Lab and XYZ through a profile",
         "usage: vantrel convert PROFILE [--rgb | --cmykrgb] VALUES... | --in FILE [--out FILE] [--json]\n"
         "  VALUES are comma lists: C,M,Y,K in whole percent; R,G,B 0..255 with --rgb; C,M,Y,K,R,G,B with --cmykrgb.\n"
         "  --in reads a CGATS chart (its device columns) or a CSV file (numbers per line); --out writes CGATS,\n"
         "  or CSV when the name ends in .csv.\n"
         "example: vantrel convert FOGRA39L.icc 100,0,0,0 0,0,0,100\n",
         Convert},
        {"inks", "the inks that print a Lab colour (analyse1)",
         "usage: vantrel inks PROFILE L a b [--start C,M,Y,K] [--json]\n"
         "example: vantrel inks FOGRA39L.icc 50 0 0\n",
         Inks},
        {"isd", "a measurement passed through an ISD profile (analyse2)",
         "usage: vantrel isd ISD_PROFILE MEASUREMENT --out FILE [--json]\n"
         "example: vantrel isd correction.isd proof.it8 --out proof-isd.it8\n",
         Isd},
        {"compare", "repeatability of one chart, or a chart against its reference (analyse3)",
         "usage: vantrel compare MEASUREMENT [REFERENCE] [--profile PAPER_PROFILE] [--json]\n"
         "example: vantrel compare /usr/share/color/icc/FOGRA39L.ti3\n",
         Compare},
        {"judge", "judge a proof against its reference and write the proof report (analyse4)",
         "usage: vantrel judge PROOFER_PROFILE REFERENCE_PROFILE PROOF_MEASUREMENT [--reference REF_MEASUREMENT]\n"
         "                     [--report FILE.html] [--json]\n"
         "  Without --reference the proof is judged against the reference profile's predictions.\n"
         "  The report (default: <proof>-report.html) is one HTML file with inline SVG plots.\n"
         "example: vantrel judge proofer.icc FOGRA39L.icc proof.ti3 --reference FOGRA39L.ti3 --report proof.html\n",
         Judge},
        {"improve", "improve a profile's B2A table so it inverts its A2B table more closely (optimize1)",
         "usage: vantrel improve PROFILE (--out FILE | --in-place) [--json]\n"
         "example: vantrel improve printer.icc --out printer-improved.icc\n",
         Improve},
        {"correct", "correct a proofer profile, or a 3CC with --3cc, from a proof measurement (optimize2/optimize3)",
         "usage: vantrel correct PROOFER_PROFILE REFERENCE_PROFILE PROOF_MEASUREMENT [--reference REF_MEASUREMENT]\n"
         "                       (--out FILE | --3cc FILE.3cc (--out FILE | --in-place)) [--option N] [--json]\n"
         "       vantrel correct --write-neutral-3cc FILE.3cc   (the library's neutral 3CC, a start for --3cc)\n"
         "example: vantrel correct proofer.icc FOGRA39L.icc proof.ti3 --reference FOGRA39L.ti3 --out proofer-2.icc\n",
         Correct},
        {"calibrate", "correct a device link from a calibration measurement (analyse3 + optimize4)",
         "usage: vantrel calibrate LINK MEASUREMENT [--reference REF] [--paper PROFILE] (--out FILE | --in-place)\n"
         "                         [--option N] [--json]\n"
         "       vantrel calibrate --write-neutral-link FILE.mcc   (the library's neutral CMYK link, a start)\n"
         "  Name calibration runs in the measurement's file name: print_cal2.it8 is run 2.\n"
         "example: vantrel calibrate link.3cc print_cal1.it8 --reference FOGRA39L.ti3 --out link-cal1.3cc\n",
         Calibrate},
        {"merge", "fold a 6/7-colour separation into a CMYK profile (mergeMCHintoCMYK)",
         "usage: vantrel merge MULTICOLOUR_PROFILE CMYK_PROFILE --out FILE [--json]\n"
         "example: vantrel merge press-7c.icc press-cmyk.icc --out press-merged.icc\n",
         Merge},
        {"loop", "the simulated proof loop: judge and correct a drifting proofer pass by pass",
         "usage: vantrel loop [--passes N] [--corrector optimize2|optimize3|refine|none] [--report FILE.html]\n"
         "                    [--work DIR] [--fixtures DIR] [--quality l|m|h] [--noise SIGMA] [--seed N]\n"
         "                    [--full-chart] [--json]\n"
         "  Needs Argyll's colprof, xicclu and refine; defaults: 3 passes, optimize2, quality l.\n"
         "example: vantrel loop --passes 3 --report loop.html\n",
         Loop},
    };
    return commands;
}

}  // namespace vantrel::cli
