#include "cli_support.h"

#include <algorithm>
#include <csignal>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <sstream>
#include <system_error>
#include <unistd.h>

#include "icc/profil.h"
#include "it8/measured_it8.h"
#include "vantrel.h"

namespace fs = std::filesystem;

namespace vantrel::cli {

namespace {

// Set by the SIGINT handler, read by the progress function: the one flag a signal may touch.
volatile std::sig_atomic_t g_interrupted = 0;
// The progress function takes no user pointer, so its display state lives here.
struct ProgressState {
    bool quiet = false;
    bool terminal = false;
    std::string lastText;
    int lastTenth = -1;
};
ProgressState g_progress;

extern "C" void OnInterrupt(int) { g_interrupted = 1; }

int VANTREL_CALL Progress(const char* text, int step, int steps) {
    ProgressState& p = g_progress;
    const std::string label = text ? text : "";
    if (!p.quiet) {
        const double share = steps > 0 ? std::min(1.0, std::max(0.0, double(step) / steps)) : 0.0;
        if (p.terminal) {
            const int width = 30, filled = static_cast<int>(share * width + 0.5);
            std::fprintf(stderr, "\r%-32.32s [%s%s] %3d%%", label.c_str(), std::string(filled, '#').c_str(),
                         std::string(width - filled, ' ').c_str(), static_cast<int>(share * 100 + 0.5));
            std::fflush(stderr);
        } else {
            // Plain lines: one when the step's text changes and one per tenth of its progress.
            const int tenth = static_cast<int>(share * 10);
            if (label != p.lastText || tenth != p.lastTenth)
                std::fprintf(stderr, "progress: %s %d/%d\n", label.c_str(), step, steps);
            p.lastTenth = tenth;
        }
    }
    p.lastText = label;
    return g_interrupted ? 1 : 0;
}

}  // namespace

void Fail(const std::string& text) { throw CommandError{kFailed, text}; }
void UsageError(const std::string& text) { throw CommandError{kUsage, text}; }

Args::Args(int argc, char** argv, const std::vector<std::string>& flags) {
    for (int i = 0; i < argc; ++i) {
        std::string arg = argv[i];
        if (arg.size() > 2 && arg.compare(0, 2, "--") == 0) {
            const size_t eq = arg.find('=');
            if (eq != std::string::npos) {
                m_Options[arg.substr(0, eq)] = arg.substr(eq + 1);
            } else if (std::find(flags.begin(), flags.end(), arg) != flags.end()) {
                m_Options[arg] = "1";
            } else {
                if (i + 1 >= argc) UsageError(arg + " needs a value");
                m_Options[arg] = argv[++i];
            }
        } else {
            m_Positional.push_back(arg);
        }
    }
}

std::string Args::Get(const std::string& name, const std::string& fallback) const {
    auto it = m_Options.find(name);
    return it == m_Options.end() ? fallback : it->second;
}

double Args::Number(const std::string& name, double fallback) const {
    if (!Has(name)) return fallback;
    const std::string text = Get(name);
    char* end = nullptr;
    const double value = std::strtod(text.c_str(), &end);
    if (text.empty() || *end) UsageError(name + " takes a number, not \"" + text + "\"");
    return value;
}

const std::string& Args::At(size_t n, const char* what) const {
    if (n >= m_Positional.size()) UsageError(std::string("missing ") + what);
    return m_Positional[n];
}

void Args::Only(const std::vector<std::string>& known, size_t maxPositional) const {
    for (const auto& option : m_Options)
        if (std::find(known.begin(), known.end(), option.first) == known.end())
            UsageError("unknown option " + option.first);
    if (m_Positional.size() > maxPositional) UsageError("unexpected argument \"" + m_Positional[maxPositional] + "\"");
}

bool Interrupted() { return g_interrupted != 0; }

Session::Session(bool quiet) {
    g_progress = ProgressState{};
    g_progress.quiet = quiet;
    g_progress.terminal = isatty(fileno(stderr)) != 0;
    std::signal(SIGINT, OnInterrupt);
    std::string pattern = (fs::temp_directory_path() / "vantrel-XXXXXX").string();
    if (!mkdtemp(pattern.data())) Fail("cannot create a scratch folder in " + fs::temp_directory_path().string());
    m_Scratch = pattern + "/";
    if (dllInit(Progress, &m_Handle, m_Scratch.c_str()) != 0 || !m_Handle) {
        m_Handle = nullptr;
        Fail("the library could not start (dllInit failed)");
    }
}

Session::~Session() {
    if (m_Handle) dllFree(m_Handle);
    if (g_progress.terminal && !g_progress.quiet && !g_progress.lastText.empty()) std::fputc('\n', stderr);
    std::error_code ignored;
    if (!std::getenv("VANTREL_KEEP_SCRATCH")) fs::remove_all(m_Scratch, ignored);
}

std::string Session::CopyIn(const std::string& path) const {
    const std::string copy = m_Scratch + fs::path(path).filename().string();
    CopyFile(path, copy);
    return copy;
}

void Session::CheckInterrupted() const {
    if (Interrupted()) Fail("interrupted");
}

void RequireFile(const std::string& path) {
    std::error_code error;
    if (!fs::exists(path, error)) Fail(path + ": no such file");
    if (!fs::is_regular_file(path, error)) Fail(path + ": not a regular file");
}

void RequireProfile(const std::string& path, const char* tag) {
    RequireFile(path);
    // Every ICC profile carries "acsp" at byte 36.
    char magic[40] = {};
    std::FILE* file = std::fopen(path.c_str(), "rb");
    const bool read = file && std::fread(magic, 1, sizeof magic, file) == sizeof magic;
    if (file) std::fclose(file);
    if (!read || std::memcmp(magic + 36, "acsp", 4) != 0) Fail(path + ": not an ICC profile");
    CProfil profile;
    profile.ReadTagTable(0, path);
    if (!profile.m_LoadFailure.empty()) Fail(path + ": profile refused: " + profile.m_LoadFailure);
    if (profile.LoadLut(0, tag, path) != 1) Fail(path + ": profile refused: " + profile.m_LoadFailure);
}

void RequireChart(const std::string& path, bool needDevice, bool needColour) {
    RequireFile(path);
    Measured_IT8 chart;
    const int32_t code = chart.ReadIt8(path);
    if (code != 0) {
        const std::string line = chart.FailureLine() > 0 ? "line " + std::to_string(chart.FailureLine()) + ": " : "";
        Fail(path + ": " + line + It8ErrorText(code));
    }
    if (chart.PatchCount() == 0) Fail(path + ": chart has no patches");
    if (needDevice && chart.Column(kColCyan) < 0 && chart.Column(kColRgbR) < 0 && chart.Column(kColChannel1) < 0)
        Fail(path + ": chart has no device columns (CMYK_C.., RGB_R.. or channel values)");
    if (needColour && chart.Column(kColLabL) < 0 && chart.Column(kColXyzX) < 0)
        Fail(path + ": chart has no measured colour (LAB_L.. or XYZ_X.. columns)");
}

void CopyFile(const std::string& from, const std::string& to) {
    std::error_code error;
    if (fs::exists(to, error) && fs::equivalent(from, to, error)) return;
    fs::copy_file(from, to, fs::copy_options::overwrite_existing, error);
    if (error) Fail(to + ": cannot write (" + error.message() + ")");
}

std::string OutputCopy(const Args& args, const std::string& input) {
    if (args.Has("--in-place")) {
        if (args.Has("--out")) UsageError("give either --out or --in-place");
        return input;
    }
    if (!args.Has("--out")) UsageError("give --out FILE (the input stays as it is) or --in-place");
    const std::string out = args.Get("--out");
    std::error_code error;
    if (fs::exists(out, error) && fs::equivalent(out, input, error))
        UsageError(out + ": is the input; use --in-place to replace it");
    CopyFile(input, out);
    return out;
}

OutputFile::OutputFile(const Args& args, const std::string& input) {
    m_Keep = args.Has("--in-place");
    m_Path = OutputCopy(args, input);
}

OutputFile::OutputFile(const std::string& path) : m_Path(path) {
    std::error_code error;
    m_Keep = fs::exists(path, error);
}

OutputFile::~OutputFile() {
    std::error_code ignored;
    if (!m_Keep) fs::remove(m_Path, ignored);
}

std::string JsonString(const std::string& text) {
    std::string out = "\"";
    for (unsigned char c : text) {
        if (c == '"' || c == '\\') { out += '\\'; out += static_cast<char>(c); }
        else if (c == '\n') out += "\\n";
        else if (c < 0x20) { char buf[8]; std::snprintf(buf, sizeof buf, "\\u%04x", c); out += buf; }
        else out += static_cast<char>(c);
    }
    return out + "\"";
}

std::string JsonNumber(double value) {
    if (!std::isfinite(value)) return "null";
    char buf[32];
    std::snprintf(buf, sizeof buf, "%.6g", value);
    return buf;
}

Json& Json::Add(const std::string& key, double value) { return AddRaw(key, JsonNumber(value)); }
Json& Json::Add(const std::string& key, const std::string& value) { return AddRaw(key, JsonString(value)); }
Json& Json::AddRaw(const std::string& key, const std::string& json) {
    m_Fields.emplace_back(key, json);
    return *this;
}

std::string Json::Text() const {
    std::string out = "{";
    for (size_t i = 0; i < m_Fields.size(); ++i)
        out += (i ? ", " : "") + JsonString(m_Fields[i].first) + ": " + m_Fields[i].second;
    return out + "}";
}

}  // namespace vantrel::cli
